// Dates in forms of a fixed length, which nearly all are, read and written without the library, with the same results.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace host {

/// The first element of a pattern that is not empty: a flag, or a character.
std::string_view elementOf(std::string_view pattern);

/// A pattern whose texts have a fixed length, of digits and single characters of ASCII. Whatever does not fit it is left
/// to the library.
class FixedDateForm {
public:
    /// For texts that are a date, perhaps with a time. Nothing for patterns of another kind.
    static std::optional<FixedDateForm> toRead(std::string_view pattern);
    /// For any part of a date or a time. Nothing for patterns of another kind, and for keywords.
    static std::optional<FixedDateForm> toWrite(std::string_view pattern);

    /// The canonical text in `out`. False where the library has to look.
    bool read(std::string_view text, std::string& out) const;
    /// A canonical text in this form. False where the library has to look.
    bool write(std::string_view canonical, std::string& out) const;

private:
    enum Part : std::uint8_t { Year, Month, Day, Hour, Minute, Second };
    static constexpr std::size_t partCount = 6;
    static constexpr std::size_t longest = 64;

    static std::optional<FixedDateForm> of(std::string_view pattern);
    static std::size_t widthOf(std::size_t part) { return part == Year ? 4 : 2; }
    bool fitsShape(const char* text) const;
    bool isValid(std::string_view text) const;

    std::size_t length_ = 0;
    std::array<std::uint8_t, partCount> places_{}; ///< of the parts in the text
    std::array<bool, partCount> given_{};
    // For each byte of the text: what it is, with "0" for any digit, and by how much it may be more, as the distance to
    // the highest number of seven bits.
    std::array<char, longest> expected_{};
    std::array<char, longest> room_{};
};

} // namespace host
