// Numbers as people write them, made plain decimals without any arithmetic: digit for digit, however many there are.
#pragma once

#include <array>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// Reads, in the way of one language:
///
///     1.234,50     -1 234,5     1234     +3,0     12,50-     € 12,50     12.50 EUR
///
/// that is: an optional sign before or behind, of which a typographic minus is one; a sign of a currency, or three
/// capital letters, before or behind, perhaps with blanks between; digits, either without grouping or in groups of three
/// all the way; and a fraction. Where a language groups by a space, any kind of space does, and where by an
/// apostrophe, any kind of that.
class NumberReader {
public:
    /// `language` is one that ICU knows, as "de" or "de_CH". Throws Failure for any other.
    explicit NumberReader(const std::string& language);

    /// The text as "-1234.50" in `number`, valid until the next one is read: without zeros before the others, with a digit
    /// before the point, with all of the fraction, with a sign only if it is negative. False for what is not such a number.
    bool read(std::string_view text, std::string_view& number);

private:
    bool readPlain(std::string_view text, std::string_view& number);
    bool readAny(std::string_view text, std::string& out) const;

    char plainDecimal_ = '\0'; ///< where the signs are single bytes; else no text has them
    char plainGroup_ = '\0';
    std::string decimal_;
    std::vector<std::string> groups_;
    std::array<char, 64> plain_{};
    std::string number_;
};

} // namespace host
