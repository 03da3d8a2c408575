// Bytes and digits: reading runs of digits from text and writing numbers into a buffer. The compact and extended
// forms of a date and a time are written here and nowhere else.
#pragma once

#include <kvt/string/ustring.h>

#include <array>
#include <bit>
#include <charconv>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <string_view>

namespace kvt::ex::datetime::detail {

inline std::string_view viewOf(const UString<0>& text) noexcept {
    return {text.rawData(), text.size()};
}

/// Space, tab, carriage return, line feed, form feed, vertical tab.
constexpr bool isSpace(char c) noexcept {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

/// The text without the white space at both ends.
constexpr std::string_view trimmed(std::string_view text) noexcept {
    while (!text.empty() && isSpace(text.front())) {
        text.remove_prefix(1);
    }
    while (!text.empty() && isSpace(text.back())) {
        text.remove_suffix(1);
    }
    return text;
}

constexpr bool isDigit(char c) noexcept {
    return c >= '0' && c <= '9';
}

/// The number of two digits, or a negative one where they are none.
constexpr int digitPair(const char* digits) noexcept {
    return isDigit(digits[0]) && isDigit(digits[1]) ? (digits[0] - '0') * 10 + (digits[1] - '0') : -1;
}

/// Eight digits as four numbers of two digits, the first one in the lowest sixteen bits.
inline std::uint64_t pairsOf(const char* digits) noexcept {
    constexpr std::uint64_t everyPair = 0x0001000100010001;
    std::uint64_t bytes = 0;
    std::memcpy(&bytes, digits, sizeof bytes);
    if constexpr (std::endian::native == std::endian::big) {
        bytes = __builtin_bswap64(bytes);
    }
    bytes &= everyPair * 0x0F0F;
    return (bytes * 10 + (bytes >> 8)) & everyPair * 0xFF; // each byte stays below 100
}

/// How many digits a text begins with.
std::size_t countDigits(std::string_view text) noexcept;

/// The number of a text that holds digits only, at most 18 of them; 0 for the empty text.
std::uint64_t digitsValue(std::string_view digits) noexcept;

/// The nearest double of digits with at most one "." among, before or behind them.
double decimalValue(std::string_view digits) noexcept;

/// The digits of a fraction of a second that is written.
inline constexpr std::size_t nanosecondDigits = 9;

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

/// "00" to "99", one behind the other.
inline constexpr std::array<char, 200> digitPairs = [] {
    std::array<char, 200> digits{};
    for (std::size_t number = 0; number < 100; ++number) {
        digits[2 * number] = static_cast<char>('0' + number / 10);
        digits[2 * number + 1] = static_cast<char>('0' + number % 10);
    }
    return digits;
}();

/// Writes two digits and returns where they end; the number is below 100.
inline char* writePair(char* place, unsigned number) noexcept {
    std::memcpy(place, &digitPairs[2 * std::size_t{number}], 2);
    return place + 2;
}

/// Writes a number in decimal, of up to 20 digits, and returns where it ends.
inline char* writeNumber(char* place, std::uint64_t number) noexcept {
    if (number < 10) {
        *place = static_cast<char>('0' + number);
        return place + 1;
    }
    return number < 100 ? writePair(place, static_cast<unsigned>(number))
                        : std::to_chars(place, place + 20, number).ptr;
}

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

/// Text in the making: in place as long as it is short, as it is for every value and interval and for nearly every
/// pattern. Only what outgrows that throws std::bad_alloc.
class TextBuffer {
public:
    TextBuffer() = default;
    TextBuffer(const TextBuffer&) = delete;
    TextBuffer& operator=(const TextBuffer&) = delete;

    void put(char c) { *room(1) = c; }
    void put(std::string_view text) {
        if (text.size() > 1) {
            std::memcpy(room(text.size()), text.data(), text.size());
        } else if (!text.empty()) {
            put(text.front());
        }
    }
    /// In decimal, with leading zeros up to `width`.
    void putNumber(std::uint64_t number, unsigned width = 1) {
        if (width <= 1 && number < 10) {
            put(static_cast<char>('0' + number));
        } else if (width <= 2 && number < 100) {
            putPair(static_cast<unsigned>(number));
        } else if (width == 4 && number < 10'000) { // a year
            const auto year = static_cast<unsigned>(number);
            writePair(writePair(room(4), year / 100), year % 100);
        } else {
            putDigits(number, width);
        }
    }
    /// Two digits; the number is below 100.
    void putPair(unsigned number) { writePair(room(2), number); }
    /// The same with "-" in front of a negative number, which counts as one of the `width`.
    void putSigned(std::int64_t number, unsigned width = 1) {
        if (number < 0) {
            put('-');
            putNumber(0 - static_cast<std::uint64_t>(number), width - (width > 0 ? 1 : 0));
        } else {
            putNumber(static_cast<std::uint64_t>(number), width);
        }
    }
    /// Place for so many chars, which are part of the text then and the caller's to write.
    char* room(std::size_t count) {
        if (count > capacity_ - size_) {
            grow(count);
        }
        size_ += count;
        return data_ + size_ - count;
    }
    /// Ends the text at a place of the last room(), which was too much.
    void endAt(const char* place) noexcept { size_ = static_cast<std::size_t>(place - data_); }
    /// "." and nine digits without the zeros at their end; nothing for zero. Below 1,000,000,000.
    void putFraction(std::uint64_t nanoseconds);
    /// Seconds and fraction as secondsFractionalToString(double) words their sum as a double.
    void putSeconds(std::uint64_t seconds, std::uint64_t nanoseconds);

    std::string_view view() const noexcept { return {data_, size_}; }
    UString<0> toString() const { return UString<0>(UStringView<0>(view())); }

private:
    void grow(std::size_t count);
    void putDigits(std::uint64_t number, unsigned width);

    std::array<char, 224> short_;
    std::unique_ptr<char[]> long_;
    char* data_ = short_.data();
    std::size_t capacity_ = short_.size();
    std::size_t size_ = 0;
};

/// Writes "20200102", or "2020-01-02" in extended form.
void writeDate(TextBuffer& text, std::int64_t year, std::uint64_t month, std::uint64_t day, bool extended);

/// Writes "030405.25", or "03:04:05.25" in extended form.
void writeTime(TextBuffer& text, std::uint64_t hours, std::uint64_t minutes, std::uint64_t seconds,
               std::uint64_t nanoseconds, bool extended);

} // namespace kvt::ex::datetime::detail
