// The layout of floating-point text. The digits come from double-conversion.
#include <kvt/codec/float_text.h>

#include <double-conversion/double-to-string.h>

#include <charconv>
#include <cmath>
#include <cstring>
#include <string_view>

namespace kvt::ex {
namespace {

using double_conversion::DoubleToStringConverter;

/// A value as 0.d1d2d3... times 10 to the power `point`, without trailing zeros.
struct DecimalDigits {
    char buffer[DoubleToStringConverter::kBase10MaximalLength + 1];
    int length;
    int point;
};

/// The spellings of values that are not numbers.
struct SpecialTexts {
    std::string_view infinity;
    std::string_view nan;
    bool nanHasSign;
};

constexpr SpecialTexts plainTexts = {"inf", "nan", true};
constexpr SpecialTexts xmlTexts = {"INF", "NaN", false};

/// Writes to a buffer of limited size. Each text is known to fit; were it not, it would end in "...".
class OutputBuilder {
public:
    OutputBuilder(char* buffer, int capacity) : buffer_(buffer), capacity_(capacity) {}

    void add(char c) { buffer_[position_++] = c; }
    void add(std::string_view text) { add(text.data(), static_cast<int>(text.size())); }
    void add(const char* text, int count) {
        std::memcpy(buffer_ + position_, text, static_cast<std::size_t>(count));
        position_ += count;
    }
    void addRepeated(char c, int count) {
        std::memset(buffer_ + position_, c, static_cast<std::size_t>(count));
        position_ += count;
    }
    void addInteger(int value) {
        const auto result = std::to_chars(buffer_ + position_, buffer_ + capacity_, value);
        position_ = static_cast<int>(result.ptr - buffer_);
    }

    /// Writes the terminating zero and gives the number of chars before it.
    std::uint64_t finish() {
        if (position_ >= capacity_) {
            position_ = capacity_ - 1;
            if (position_ > 3) {
                std::memcpy(buffer_ + position_ - 3, "...", 3);
            }
        }
        buffer_[position_] = '\0';
        return static_cast<std::uint64_t>(position_);
    }

private:
    char* buffer_;
    int capacity_;
    int position_ = 0;
};

DecimalDigits shortestDigits(double value, DoubleToStringConverter::DtoaMode mode) {
    DecimalDigits digits{};
    bool sign = false;
    DoubleToStringConverter::DoubleToAscii(value, mode, 0, digits.buffer, sizeof digits.buffer, &sign,
                                           &digits.length, &digits.point);
    return digits;
}

// `limit` is the largest place of the decimal point that needs no exponent.
void layOut(const DecimalDigits& digits, int limit, OutputBuilder& out) {
    const int length = digits.length;
    const int point = digits.point;
    if (length <= point && point <= limit) {
        out.add(digits.buffer, length);
        out.addRepeated('0', point - length);
    } else if (point > 0 && point <= limit) {
        out.add(digits.buffer, point);
        out.add('.');
        out.add(digits.buffer + point, length - point);
    } else if (point <= 0 && point > -4) {
        out.add("0.");
        out.addRepeated('0', -point);
        out.add(digits.buffer, length);
    } else {
        out.add(digits.buffer[0]);
        if (length > 1) {
            out.add('.');
            out.add(digits.buffer + 1, length - 1);
        }
        out.add('e');
        out.add(point >= 0 ? '+' : '-');
        out.addInteger(std::abs(point - 1));
    }
}

std::uint64_t toText(double value, DoubleToStringConverter::DtoaMode mode, int limit,
                     const SpecialTexts& texts, char* buffer) {
    OutputBuilder out(buffer, floatTextBuffer);
    const bool isNan = std::isnan(value);
    if (std::signbit(value) && (!isNan || texts.nanHasSign)) {
        out.add('-');
    }
    if (isNan) {
        out.add(texts.nan);
    } else if (std::isinf(value)) {
        out.add(texts.infinity);
    } else if (value == 0) {
        out.add('0');
    } else {
        layOut(shortestDigits(std::abs(value), mode), limit, out);
    }
    return out.finish();
}

constexpr int doubleLimit = 17;
constexpr int floatLimit = 9;

} // namespace

std::uint64_t double_to_string(double value, char* const buffer) {
    return toText(value, DoubleToStringConverter::SHORTEST, doubleLimit, plainTexts, buffer);
}

std::uint64_t double_to_string_xml(double value, char* const buffer) {
    return toText(value, DoubleToStringConverter::SHORTEST, doubleLimit, xmlTexts, buffer);
}

std::uint64_t float_to_string(float value, char* const buffer) {
    return toText(value, DoubleToStringConverter::SHORTEST_SINGLE, floatLimit, plainTexts, buffer);
}

} // namespace kvt::ex
