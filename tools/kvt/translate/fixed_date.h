// Dates in forms of a fixed length, which nearly all are, read and written without the library, with the same results.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace host {

/// The first element of a pattern that is not empty: a flag, or a character.
std::string_view elementOf(std::string_view pattern);

class FixedDateText;

/// A pattern whose texts have a fixed length, of digits and single characters of ASCII. Whatever does not fit it is left
/// to the library.
class FixedDateForm {
public:
    /// For texts that are a date, perhaps with a time. Nothing for patterns of another kind.
    static std::optional<FixedDateForm> toRead(std::string_view pattern);
    /// For any part of a date or a time. Nothing for patterns of another kind, and for keywords.
    static std::optional<FixedDateForm> toWrite(std::string_view pattern);
    /// That of canonical texts without a time, and with one.
    static const FixedDateForm& canonicalDate();
    static const FixedDateForm& canonicalDateTime();

    /// The form of the canonical texts that are the same dates.
    const FixedDateForm& canonical() const { return given_[Hour] ? canonicalDateTime() : canonicalDate(); }
    bool isCanonical() const { return expected_ == canonical().expected_ && places_ == canonical().places_; }
    std::size_t length() const { return length_; }

private:
    friend class FixedDateText;

    enum Part : std::uint8_t { Year, Month, Day, Hour, Minute, Second };
    static constexpr std::size_t partCount = 6;
    static constexpr std::size_t longest = 64;

    static std::optional<FixedDateForm> of(std::string_view pattern);
    bool hasTime() const { return given_[Hour] || given_[Minute] || given_[Second]; }
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

/// Texts in one form, each written over the one before, of which only the digits differ.
class FixedDateText {
public:
    explicit FixedDateText(const FixedDateForm& form) : form_(form), text_(form.expected_) {}

    /// The date of `text`, which is one of the form `from`. False where it is not, or does not say what is to be written:
    /// the library has to look.
    bool take(std::string_view text, const FixedDateForm& from);
    /// Valid until the next one is taken.
    std::string_view view() const { return {text_.data(), form_.length_}; }

private:
    FixedDateForm form_;
    std::array<char, FixedDateForm::longest> text_;
};

} // namespace host
