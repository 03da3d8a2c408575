// Numbers become digits and digits numbers without streams and locales. Where doubles come in, they are part of what is
// stated: the fraction of a second is the nearest double of its digits, and a sum of seconds is shown as one.
#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <bit>
#include <charconv>
#include <cstring>
#include <limits>
#include <system_error>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::uint64_t nanosPerSecond = 1'000'000'000;

// Powers of ten that a double holds exactly and that divide an exact integer with one rounding.
constexpr double powersOfTen[] = {1e0, 1e1, 1e2,  1e3,  1e4,  1e5,  1e6,  1e7,
                                  1e8, 1e9, 1e10, 1e11, 1e12, 1e13, 1e14, 1e15};
constexpr std::size_t exactDigits = 15; // 10^15 is below 2^53

// What makes nanoseconds of a fraction with so many digits.
constexpr std::uint64_t scaleOfDigits[] = {1'000'000'000, 100'000'000, 10'000'000, 1'000'000, 100'000,
                                           10'000,        1'000,       100,        10,        1};

// "." and more digits than the short way takes. What decides between two doubles from 2^-34 on, below which there is
// not half a nanosecond, is known after 34 + 53 digits, but for whether anything follows.
double longFraction(std::string_view digits) noexcept {
    constexpr std::size_t deciding = 100;
    std::array<char, deciding + 2> text;
    const std::string_view first = digits.substr(0, deciding);
    const bool more = digits.find_first_not_of('0', first.size()) != std::string_view::npos;
    text[0] = '.';
    std::copy(first.begin(), first.end(), text.begin() + 1);
    text[first.size() + 1] = more ? '1' : '0';
    double value = 0.0;
    std::from_chars(text.data(), text.data() + first.size() + 2, value);
    return value;
}

} // namespace

std::size_t countDigits(std::string_view text) noexcept {
    std::size_t count = 0;
    // Eight bytes at once: a byte is a digit if it differs from '0' by at most 9.
    for (; text.size() - count >= sizeof(std::uint64_t); count += sizeof(std::uint64_t)) {
        constexpr std::uint64_t everyByte = 0x0101010101010101;
        std::uint64_t bytes = 0;
        std::memcpy(&bytes, text.data() + count, sizeof bytes);
        const std::uint64_t differences = bytes ^ everyByte * '0';
        const std::uint64_t others =
            (differences | ((differences & everyByte * 0x7F) + everyByte * (0x7F - 9))) & everyByte * 0x80;
        if (others != 0) {
            if constexpr (std::endian::native == std::endian::little) {
                return count + static_cast<std::size_t>(std::countr_zero(others)) / 8;
            }
            break;
        }
    }
    while (count < text.size() && isDigit(text[count])) {
        ++count;
    }
    return count;
}

std::uint64_t digitsValue(std::string_view digits) noexcept {
    std::uint64_t value = 0;
    for (; digits.size() >= 8; digits.remove_prefix(8)) {
        // Two pairs are below 10,000, so that no sum reaches the one beside it.
        const std::uint64_t pairs = pairsOf(digits.data());
        const std::uint64_t quarters = (pairs * 100 + (pairs >> 16)) & 0x0000FFFF0000FFFF;
        value = value * 100'000'000 + (quarters & 0xFFFF) * 10'000 + (quarters >> 32);
    }
    for (const char c : digits) {
        value = value * 10 + static_cast<std::uint64_t>(c - '0');
    }
    return value;
}

double decimalValue(std::string_view digits) noexcept {
    double value = 0.0;
    const auto read =
        std::from_chars(digits.data(), digits.data() + digits.size(), value, std::chars_format::fixed);
    if (read.ec == std::errc::result_out_of_range) {
        // Too large, or so small that nothing but zero is near.
        const std::string_view whole = digits.substr(0, digits.find('.'));
        const bool large = whole.find_first_not_of('0') != std::string_view::npos;
        return large ? std::numeric_limits<double>::infinity() : 0.0;
    }
    return value;
}

std::uint64_t fractionNanoseconds(std::string_view digits) noexcept {
    // Up to nine digits are whole nanoseconds, and the double below would be off by far less than half of one.
    if (digits.size() <= nanosecondDigits) {
        return digitsValue(digits) * scaleOfDigits[digits.size()];
    }
    const double fraction = digits.size() <= exactDigits
                                ? static_cast<double>(digitsValue(digits)) / powersOfTen[digits.size()]
                                : longFraction(digits);
    return static_cast<std::uint64_t>(fraction * 1e9 + 0.5);
}

SplitSeconds splitSeconds(double seconds) noexcept {
    if (!(seconds >= 0.0)) {
        return {0, 0};
    }
    constexpr double beyondAnyField = 18446744073709551616.0; // 2^64
    if (seconds >= beyondAnyField) {
        return {static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max()), 0};
    }
    const auto whole = static_cast<std::uint64_t>(seconds);
    const double rest = seconds - static_cast<double>(whole);
    return {whole, static_cast<std::uint64_t>(rest * 1e9 + 0.5)};
}

// ---- Writing

ShortText::ShortText(std::string_view text) noexcept : size_(static_cast<std::uint8_t>(text.size())) {
    std::copy(text.begin(), text.end(), data_.begin());
}

char* writeFixed(char* first, char* last, double value) noexcept {
    char* end = std::to_chars(first, last, value, std::chars_format::fixed, 9).ptr;
    while (end != first && end[-1] == '0') {
        --end;
    }
    if (end != first && end[-1] == '.') {
        --end;
    }
    return end;
}

void TextBuffer::grow(std::size_t count) {
    const std::size_t capacity = 2 * (size_ + count);
    std::unique_ptr<char[]> larger(new char[capacity]);
    std::memcpy(larger.get(), data_, size_);
    long_ = std::move(larger);
    data_ = long_.get();
    capacity_ = capacity;
}

void TextBuffer::putDigits(std::uint64_t number, unsigned width) {
    unsigned count = 1;
    for (std::uint64_t rest = number / 10; rest != 0 || count < width; rest /= 10) {
        ++count;
    }
    char* const first = room(count);
    for (char* place = first + count; place != first; number /= 10) {
        *--place = static_cast<char>('0' + number % 10);
    }
}

void TextBuffer::putFraction(std::uint64_t nanoseconds) {
    if (nanoseconds == 0) {
        return;
    }
    const auto number = static_cast<std::uint32_t>(nanoseconds);
    const std::uint32_t rest = number % 100'000'000;
    char* place = room(rest == 0 ? 2 : 1 + nanosecondDigits); // many fractions have but one digit
    *place++ = '.';
    *place++ = static_cast<char>('0' + number / 100'000'000);
    if (rest == 0) {
        return;
    }
    const std::uint32_t high = rest / 10'000;
    const std::uint32_t low = rest % 10'000;
    place = writePair(writePair(place, high / 100), high % 100);
    writePair(writePair(place, low / 100), low % 100);
    while (data_[size_ - 1] == '0') {
        --size_;
    }
}

void TextBuffer::putSeconds(std::uint64_t seconds, std::uint64_t nanoseconds) {
    // Up to here the sum as a double is off by less than half of the ninth decimal, so that its digits are exact.
    constexpr std::uint64_t exactSeconds = 1 << 20;
    if (seconds < exactSeconds && nanoseconds < nanosPerSecond) {
        putNumber(seconds);
        putFraction(nanoseconds);
        return;
    }
    double value = static_cast<double>(seconds);
    if (nanoseconds != 0) {
        value += static_cast<double>(nanoseconds) / 1e9;
    }
    std::array<char, longestFixedDouble> digits;
    const char* const end = writeFixed(digits.data(), digits.data() + digits.size(), value);
    put(std::string_view(digits.data(), static_cast<std::size_t>(end - digits.data())));
}

void writeDate(TextBuffer& text, std::int64_t year, std::uint64_t month, std::uint64_t day, bool extended) {
    text.putSigned(year, 4);
    if (extended) {
        text.put('-');
    }
    text.putNumber(month, 2);
    if (extended) {
        text.put('-');
    }
    text.putNumber(day, 2);
}

void writeTime(TextBuffer& text, std::uint64_t hours, std::uint64_t minutes, std::uint64_t seconds,
               std::uint64_t nanoseconds, bool extended) {
    text.putNumber(hours, 2);
    if (extended) {
        text.put(':');
    }
    text.putNumber(minutes, 2);
    if (extended) {
        text.put(':');
    }
    if (seconds < 10) {
        text.put('0');
    }
    text.putSeconds(seconds, nanoseconds);
}

} // namespace kvt::ex::datetime::detail
