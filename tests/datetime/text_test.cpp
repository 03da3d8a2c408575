#include <kvt/datetime/detail/text.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <limits>
#include <random>
#include <string>

namespace {

using namespace kvt::ex::datetime::detail;

TEST(Trimmed, TakesSixCharactersFromBothEnds) {
    const struct {
        const char* text;
        const char* trimmed;
    } rows[] = {
        {"", ""},           {" \t\r\n\f\v", ""},      {" \t\r\n\f\va b\v\f\n\r\t ", "a b"},
        {"a", "a"},         {"\xC2\xA0", "\xC2\xA0"}, {"\x08x\x0E", "\x08x\x0E"},
        {"\x1Fx", "\x1Fx"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(trimmed(row.text), row.trimmed);
    }
    EXPECT_EQ(trimmed(std::string_view("\0x", 2)), std::string_view("\0x", 2));
}

TEST(CountDigits, StopsAtTheFirstByteThatIsNone) {
    EXPECT_EQ(countDigits(""), 0u);
    for (std::size_t digits = 0; digits < 20; ++digits) {
        for (int byte = 0; byte < 256; ++byte) {
            const bool isDigit = byte >= '0' && byte <= '9';
            const std::string text =
                std::string(digits, '9') + static_cast<char>(byte) + std::string("0123456789abcdef");
            EXPECT_EQ(countDigits(text), isDigit ? digits + 11 : digits) << digits << " and " << byte;
        }
    }
}

TEST(FractionNanoseconds, IsThatOfTheNearestDouble) {
    std::mt19937_64 random(15);
    for (int i = 0; i < 200'000; ++i) {
        std::string digits;
        for (auto size = random() % (i % 10 == 0 ? 150 : 22); size > 0; --size) {
            digits += static_cast<char>('0' + (random() % 4 == 0 ? 9 * (random() % 2) : random() % 10));
        }
        const double value = std::strtod(("0." + digits).c_str(), nullptr);
        ASSERT_EQ(fractionNanoseconds(digits), static_cast<std::uint64_t>(value * 1e9 + 0.5)) << digits;
    }
}

// Half way between two doubles of which only one is another nanosecond, and just above: the digit that decides may
// stand far behind.
TEST(FractionNanoseconds, LooksAtAllDigits) {
    std::mt19937_64 random(16);
    for (int i = 0; i < 20'000; ++i) {
        const auto nanoseconds = static_cast<double>(random() % 1'000'000'000);
        const double near = (nanoseconds + 0.5) / 1e9;
        for (double value : {std::nextafter(near, 0.0), near, std::nextafter(near, 1.0)}) {
            // A long double holds the middle itself, and 90 digits all of it.
            const long double middleValue =
                (static_cast<long double>(value) + std::nextafter(value, 1.0)) / 2;
            char text[128];
            std::snprintf(text, sizeof text, "%.90Lf", middleValue);
            const std::string middle = std::string(text).substr(2);
            for (const std::string& digits :
                 {middle, middle + std::string(50, '0') + "1", middle.substr(0, 60)}) {
                const double read = std::strtod(("0." + digits).c_str(), nullptr);
                ASSERT_EQ(fractionNanoseconds(digits), static_cast<std::uint64_t>(read * 1e9 + 0.5))
                    << digits;
            }
        }
    }
}

TEST(DecimalValue, IsTheNearestDouble) {
    std::mt19937_64 random(17);
    for (int i = 0; i < 100'000; ++i) {
        std::string digits = std::to_string(random() >> (random() % 64));
        digits.insert(1 + random() % digits.size(), ".");
        ASSERT_EQ(decimalValue(digits), std::strtod(digits.c_str(), nullptr)) << digits;
    }
    EXPECT_EQ(decimalValue("1."), 1.0);
    EXPECT_EQ(decimalValue(".5"), 0.5);
    EXPECT_EQ(decimalValue(std::string(400, '9') + ".0"), std::numeric_limits<double>::infinity());
    EXPECT_EQ(decimalValue("0." + std::string(400, '0') + "1"), 0.0);
    EXPECT_EQ(decimalValue("000." + std::string(400, '0') + "1"), 0.0);
}

TEST(TextBuffer, PadsNumbers) {
    TextBuffer text;
    text.putNumber(0);
    text.put('|');
    text.putNumber(7, 3);
    text.put('|');
    text.putNumber(1234, 3);
    text.put('|');
    text.putSigned(-5, 4);
    text.put('|');
    text.putSigned(std::numeric_limits<std::int64_t>::min());
    EXPECT_EQ(text.view(), "0|007|1234|-005|-9223372036854775808");
}

TEST(TextBuffer, WritesFractionsWithoutZerosAtTheEnd) {
    std::mt19937_64 random(18);
    for (int i = 0; i < 20'000; ++i) {
        std::uint64_t nanoseconds = random() % 1'000'000'000;
        for (auto zeros = random() % 9; zeros > 0; --zeros) {
            nanoseconds = nanoseconds / 10 * 10 % 1'000'000'000;
            nanoseconds -= nanoseconds % 1000;
        }
        char digits[16];
        std::snprintf(digits, sizeof digits, ".%09u", static_cast<unsigned>(nanoseconds));
        std::string expected = digits;
        expected.erase(expected.find_last_not_of('0') + 1);
        TextBuffer text;
        text.putFraction(nanoseconds);
        ASSERT_EQ(text.view(), expected == "." ? "" : expected);
    }
}

} // namespace
