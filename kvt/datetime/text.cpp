#include <kvt/datetime/detail/text.h>

#include <algorithm>
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

constexpr bool isSpace(char c) noexcept {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

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

std::string_view trimmed(std::string_view text) noexcept {
    while (!text.empty() && isSpace(text.front())) {
        text.remove_prefix(1);
    }
    while (!text.empty() && isSpace(text.back())) {
        text.remove_suffix(1);
    }
    return text;
}

bool allDigits(std::string_view text) noexcept {
    for (const char c : text) {
        if (!isDigit(c)) {
            return false;
        }
    }
    return true;
}

std::uint64_t digitsValue(std::string_view digits) noexcept {
    std::uint64_t value = 0;
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

void TextBuffer::put(std::string_view text) noexcept {
    std::memcpy(data_.data() + size_, text.data(), text.size());
    size_ += text.size();
}

void TextBuffer::putNumber(std::uint64_t number, unsigned width) noexcept {
    std::array<char, 20> digits;
    auto first = digits.end();
    do {
        *--first = static_cast<char>('0' + number % 10);
        number /= 10;
    } while (number != 0);
    const auto count = static_cast<unsigned>(digits.end() - first);
    for (unsigned i = count; i < width; ++i) {
        put('0');
    }
    put(std::string_view(&*first, count));
}

void TextBuffer::putSigned(std::int64_t number, unsigned width) noexcept {
    if (number < 0) {
        put('-');
        putNumber(0 - static_cast<std::uint64_t>(number), width - (width > 0 ? 1 : 0));
    } else {
        putNumber(static_cast<std::uint64_t>(number), width);
    }
}

void TextBuffer::putFraction(std::uint64_t nanoseconds) noexcept {
    if (nanoseconds == 0) {
        return;
    }
    put('.');
    for (std::uint64_t unit = nanosPerSecond / 10; nanoseconds != 0; unit /= 10) {
        put(static_cast<char>('0' + nanoseconds / unit));
        nanoseconds %= unit;
    }
}

void TextBuffer::putSeconds(std::uint64_t seconds, std::uint64_t nanoseconds) noexcept {
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
    char* const first = data_.data() + size_;
    size_ = static_cast<std::size_t>(writeFixed(first, data_.data() + data_.size(), value) - data_.data());
}

void writeDate(TextBuffer& text, std::int64_t year, std::uint64_t month, std::uint64_t day,
               bool extended) noexcept {
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
               std::uint64_t nanoseconds, bool extended) noexcept {
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

void writeOffset(TextBuffer& text, std::int32_t minutes) noexcept {
    const std::int64_t magnitude = minutes < 0 ? -std::int64_t{minutes} : std::int64_t{minutes};
    text.put(minutes < 0 ? '-' : '+');
    text.putNumber(static_cast<std::uint64_t>(magnitude / 60), 2);
    text.put(':');
    text.putNumber(static_cast<std::uint64_t>(magnitude % 60), 2);
}

} // namespace kvt::ex::datetime::detail
