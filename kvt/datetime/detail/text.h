// Bytes and digits: reading runs of digits from text and writing numbers into a buffer. The compact and extended
// forms of a date and a time are written here and nowhere else.
#pragma once

#include <kvt/string/ustring.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace kvt::ex::datetime::detail {

inline std::string_view viewOf(const UString<0>& text) noexcept {
    return {text.rawData(), text.size()};
}

/// The text without the white space at both ends: space, tab, carriage return, line feed, form feed, vertical tab.
std::string_view trimmed(std::string_view text) noexcept;

constexpr bool isDigit(char c) noexcept {
    return c >= '0' && c <= '9';
}

/// True for the empty text.
bool allDigits(std::string_view text) noexcept;

/// The number of a text that holds digits only, at most 18 of them; 0 for the empty text.
std::uint64_t digitsValue(std::string_view digits) noexcept;

/// The nearest double of digits with at most one "." among, before or behind them.
double decimalValue(std::string_view digits) noexcept;

/// "." and the digits read as a double, in nanoseconds, rounded half up: 1,000,000,000 for "9999999999".
std::uint64_t fractionNanoseconds(std::string_view digits) noexcept;

/// The two fields of a number of seconds. Negative numbers and NaN give zeros; from 2^64 on, which no field holds,
/// the seconds are the largest signed number. The nanoseconds are rounded and may be 1,000,000,000.
struct SplitSeconds {
    std::uint64_t seconds;
    std::uint64_t nanoseconds;
};
SplitSeconds splitSeconds(double seconds) noexcept;

/// The chars of the longest double in fixed notation with nine decimals.
inline constexpr std::size_t longestFixedDouble = 1 + 309 + 1 + 9;

/// Writes a double in fixed notation with at most nine decimals and without zeros at the end, and returns where it
/// ends.
char* writeFixed(char* first, char* last, double value) noexcept;

/// A copy of a text of up to 40 bytes that needs no memory: a number in a failure.
class ShortText {
public:
    ShortText() = default;
    explicit ShortText(std::string_view text) noexcept;

    std::string_view view() const noexcept { return {data_.data(), size_}; }

private:
    std::array<char, 40> data_{};
    std::uint8_t size_ = 0;
};

/// Text in the making, in place. The capacity suffices for each field of a value or an interval with 20 digits, and
/// the caller writes no more than that.
class TextBuffer {
public:
    void put(char c) noexcept { data_[size_++] = c; }
    void put(std::string_view text) noexcept;
    /// In decimal, with leading zeros up to `width`.
    void putNumber(std::uint64_t number, unsigned width = 1) noexcept;
    /// Two digits; the number is below 100.
    void putPair(unsigned number) noexcept {
        data_[size_] = static_cast<char>('0' + number / 10);
        data_[size_ + 1] = static_cast<char>('0' + number % 10);
        size_ += 2;
    }
    /// The same with "-" in front of a negative number, which counts as one of the `width`.
    void putSigned(std::int64_t number, unsigned width = 1) noexcept;
    /// "." and nine digits without the zeros at their end; nothing for zero. Below 1,000,000,000.
    void putFraction(std::uint64_t nanoseconds) noexcept;
    /// Seconds and fraction as secondsFractionalToString(double) words their sum as a double.
    void putSeconds(std::uint64_t seconds, std::uint64_t nanoseconds) noexcept;

    std::string_view view() const noexcept { return {data_.data(), size_}; }
    UString<0> toString() const { return UString<0>(UStringView<0>(view())); }

private:
    std::array<char, 224> data_;
    std::size_t size_ = 0;
};

/// Writes "20200102", or "2020-01-02" in extended form.
void writeDate(TextBuffer& text, std::int64_t year, std::uint64_t month, std::uint64_t day,
               bool extended) noexcept;

/// Writes "030405.25", or "03:04:05.25" in extended form.
void writeTime(TextBuffer& text, std::uint64_t hours, std::uint64_t minutes, std::uint64_t seconds,
               std::uint64_t nanoseconds, bool extended) noexcept;

/// Writes "+01:00" for 60.
void writeOffset(TextBuffer& text, std::int32_t minutes) noexcept;

} // namespace kvt::ex::datetime::detail
