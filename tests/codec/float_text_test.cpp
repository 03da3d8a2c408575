// The shortest text of floating-point numbers: its rows, the borders of its three forms, and samples of all numbers
// against a naive reference. float_text_exhaustive_test.cpp goes through every float.
#include <codec/float_text_reference.h>
#include <support/allocations.h>

#include <kvt/codec/float_text.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cfloat>
#include <clocale>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::double_to_string;
using kvt::ex::double_to_string_xml;
using kvt::ex::float_to_string;
using kvt::ex::floatTextBuffer;

static_assert(floatTextBuffer == 100);

/// The text that a function writes, with a look at what it does to its buffer.
template <typename Number>
std::string written(std::uint64_t (*function)(Number, char*), Number value) {
    constexpr char untouched = '\x5A';
    std::array<char, floatTextBuffer + 64> memory;
    memory.fill(untouched);
    char* const buffer = memory.data() + 32;
    const std::uint64_t length = function(value, buffer);
    EXPECT_LT(length, static_cast<std::uint64_t>(floatTextBuffer));
    EXPECT_EQ(buffer[length], '\0');
    EXPECT_EQ(std::strlen(buffer), length);
    EXPECT_TRUE(std::all_of(memory.data(), buffer, [](char c) { return c == untouched; }))
        << "written before it";
    EXPECT_TRUE(std::all_of(buffer + floatTextBuffer, memory.data() + memory.size(), [](char c) {
        return c == untouched;
    })) << "written behind it";
    return {buffer, length};
}

std::string text(double value) {
    return written(&double_to_string, value);
}
std::string xmlText(double value) {
    return written(&double_to_string_xml, value);
}
std::string text(float value) {
    return written(&float_to_string, value);
}

double doubleOf(std::uint64_t bits) {
    return std::bit_cast<double>(bits);
}
float floatOf(std::uint32_t bits) {
    return std::bit_cast<float>(bits);
}

struct Row {
    double value;
    const char* asDouble;
    const char* asFloat; ///< of the float nearest to the value; null where there is none
};

const std::vector<Row> rows = {
    {1, "1", "1"},
    {0.5, "0.5", "0.5"},
    {100, "100", "100"},
    {123.456, "123.456", "123.456"},
    {0.0001, "0.0001", "0.0001"},
    {0.00001, "1e-5", "1e-5"},
    {1e8, "100000000", "100000000"},
    {1e9, "1000000000", "1e+9"},
    {1.5e9, "1500000000", "1.5e+9"},
    {1e16, "10000000000000000", "1e+16"},
    {1e17, "1e+17", "1e+17"},
    {123456789012345680000.0, "1.2345678901234568e+20", nullptr},
    {DBL_MAX, "1.7976931348623157e+308", nullptr},
    {5e-324, "5e-324", nullptr},
    // the borders of the forms
    {12345678901234567.0, "12345678901234568", nullptr},
    {99999999999999984.0, "99999999999999980", nullptr},
    {1.5e16, "15000000000000000", "1.5e+16"},
    {1.5e17, "1.5e+17", "1.5e+17"},
    {1234567.0, "1234567", "1234567"},
    {1234567.5, "1234567.5", "1234567.5"},
    {123456789.0, "123456789", "123456790"},
    {987654321.0, "987654321", "987654340"},
    {1.25e9, "1250000000", "1.25e+9"},
    {99999.5, "99999.5", "99999.5"},
    {0.001, "0.001", "0.001"},
    {0.00015, "0.00015", "0.00015"},
    {0.00012345, "0.00012345", "0.00012345"},
    {0.000099, "9.9e-5", "9.9e-5"},
    {0.1, "0.1", "0.1"},
    {10.5, "10.5", "10.5"},
    {1e-10, "1e-10", "1e-10"},
    {1.25e-7, "1.25e-7", "1.25e-7"},
    {1e100, "1e+100", nullptr},
    {1e-100, "1e-100", nullptr},
    {1e22, "1e+22", "1e+22"},
    {1e23, "1e+23", "1e+23"},
    {1.0 / 3, "0.3333333333333333", "0.33333334"},
    {2.0 / 3, "0.6666666666666666", "0.6666667"},
    // where digits are hard to find
    {DBL_MIN, "2.2250738585072014e-308", nullptr},
    {2.225073858507201e-308, "2.225073858507201e-308", nullptr},
    {DBL_TRUE_MIN * 2, "1e-323", nullptr},
    {9007199254740992.0, "9007199254740992", nullptr},
    {9007199254740993.0, "9007199254740992", nullptr},
    {FLT_MAX, "3.4028234663852886e+38", "3.4028235e+38"},
    {FLT_MIN, "1.1754943508222875e-38", "1.1754944e-38"},
    {FLT_TRUE_MIN, "1.401298464324817e-45", "1e-45"},
    {16777216, "16777216", "16777216"},
    {33554432, "33554432", "33554432"},
    // half-way between two texts of eight digits
    {0.000244140625, "0.000244140625", "0.00024414062"},
};

TEST(FloatText, FollowsTheTable) {
    for (const Row& row : rows) {
        SCOPED_TRACE(row.asDouble);
        EXPECT_EQ(text(row.value), row.asDouble);
        EXPECT_EQ(xmlText(row.value), row.asDouble);
        EXPECT_EQ(text(-row.value), std::string("-") + row.asDouble);
        EXPECT_EQ(xmlText(-row.value), std::string("-") + row.asDouble);
        if (row.asFloat != nullptr) {
            EXPECT_EQ(text(static_cast<float>(row.value)), row.asFloat);
            EXPECT_EQ(text(static_cast<float>(-row.value)), std::string("-") + row.asFloat);
        }
    }
}

TEST(FloatText, SpecialValuesHaveTheirOwnSpelling) {
    constexpr std::uint64_t sign = 1ULL << 63;
    constexpr std::uint64_t infinity = 0x7FFULL << 52;
    struct SpecialRow {
        std::uint64_t bits;
        const char* plain;
        const char* xml;
    };
    for (const SpecialRow& row : {
             SpecialRow{0, "0", "0"},
             SpecialRow{sign, "-0", "-0"},
             SpecialRow{infinity, "inf", "INF"},
             SpecialRow{sign | infinity, "-inf", "-INF"},
             SpecialRow{infinity | 1, "nan", "NaN"},
             SpecialRow{infinity | 1ULL << 51, "nan", "NaN"},
             SpecialRow{infinity | ((1ULL << 52) - 1), "nan", "NaN"},
             SpecialRow{sign | infinity | 1, "-nan", "NaN"},
             SpecialRow{sign | infinity | 1ULL << 51, "-nan", "NaN"},
             SpecialRow{~0ULL, "-nan", "NaN"},
         }) {
        EXPECT_EQ(text(doubleOf(row.bits)), row.plain);
        EXPECT_EQ(xmlText(doubleOf(row.bits)), row.xml);
    }
    EXPECT_EQ(text(0.0F), "0");
    EXPECT_EQ(text(-0.0F), "-0");
    EXPECT_EQ(text(floatOf(0x7F800000)), "inf");
    EXPECT_EQ(text(floatOf(0xFF800000)), "-inf");
    EXPECT_EQ(text(floatOf(0x7F800001)), "nan");
    EXPECT_EQ(text(floatOf(0x7FC00000)), "nan");
    EXPECT_EQ(text(floatOf(0xFF800001)), "-nan");
    EXPECT_EQ(text(floatOf(0xFFFFFFFF)), "-nan");
}

// Each number of digits with each place of the point.
TEST(FloatText, TheFormFollowsFromTheDigitsAndTheirPoint) {
    const std::string allDigits = "12345678901234567";
    for (std::size_t length = 1; length <= 15; ++length) {
        std::string digits = allDigits.substr(0, length);
        digits.back() = digits.back() == '0' ? '7' : digits.back();
        for (int point = -30; point <= 30; ++point) {
            const std::string source = "0." + digits + 'e' + std::to_string(point);
            EXPECT_EQ(text(std::strtod(source.c_str(), nullptr)), referenceLayout(digits, point, 17))
                << source;
            if (length <= 6) {
                EXPECT_EQ(text(std::strtof(source.c_str(), nullptr)), referenceLayout(digits, point, 9))
                    << source;
            }
        }
    }
}

TEST(FloatText, PowersOfTen) {
    for (int exponent = -323; exponent <= 308; ++exponent) {
        const double value = std::strtod(("1e" + std::to_string(exponent)).c_str(), nullptr);
        EXPECT_EQ(text(value), referenceLayout("1", exponent + 1, 17)) << exponent;
    }
    for (int exponent = -44; exponent <= 38; ++exponent) {
        const float value = std::strtof(("1e" + std::to_string(exponent)).c_str(), nullptr);
        EXPECT_EQ(text(value), referenceText(value)) << exponent;
    }
}

// The gap below a power of two is half as wide as the one above.
TEST(FloatText, PowersOfTwoAndTheirNeighbours) {
    for (std::uint64_t exponent = 0; exponent <= 2046; ++exponent) {
        for (const std::uint64_t mantissa : {0ULL, 1ULL, 2ULL, (1ULL << 52) - 2, (1ULL << 52) - 1}) {
            const double value = doubleOf(exponent << 52 | mantissa);
            EXPECT_EQ(text(value), referenceText(value));
            EXPECT_EQ(std::strtod(text(value).c_str(), nullptr), value);
        }
    }
    for (std::uint32_t exponent = 0; exponent <= 254; ++exponent) {
        for (const std::uint32_t mantissa : {0U, 1U, 2U, (1U << 23) - 2, (1U << 23) - 1}) {
            const float value = floatOf(exponent << 23 | mantissa);
            EXPECT_EQ(text(value), referenceText(value));
            EXPECT_EQ(std::strtof(text(value).c_str(), nullptr), value);
        }
    }
}

// Fewest means that no text of one digit less reads back to the number.
TEST(FloatText, OneDigitLessIsAnotherNumber) {
    std::mt19937_64 random(3);
    for (int i = 0; i < 20000; ++i) {
        const double value = std::abs(doubleOf(random()));
        if (!std::isfinite(value) || value == 0) {
            continue;
        }
        const std::string shortest = text(value);
        const auto digits = static_cast<int>(std::count_if(
            shortest.begin(),
            shortest.begin() + static_cast<std::ptrdiff_t>(std::min(shortest.find('e'), shortest.size())),
            [](char c) { return c >= '1' && c <= '9'; }));
        char rounded[64];
        if (digits > 1 && shortest.find('0') == std::string::npos) {
            std::snprintf(rounded, sizeof rounded, "%.*e", digits - 2, value);
            EXPECT_NE(std::strtod(rounded, nullptr), value) << shortest;
        }
    }
}

TEST(FloatText, TheLongestTextOfAFiniteNumberHas24Chars) {
    EXPECT_EQ(text(-DBL_MIN), "-2.2250738585072014e-308");
    EXPECT_EQ(text(-DBL_MIN).size(), 24U);
    EXPECT_EQ(text(-1.7976931348623157e308).size(), 24U);
}

TEST(FloatText, NothingIsAllocated) {
    std::mt19937_64 random(5);
    std::array<char, floatTextBuffer> buffer;
    const kvt::test::FailingAllocations failing(0);
    for (int i = 0; i < 100000; ++i) {
        const std::uint64_t bits = random();
        double_to_string(doubleOf(bits), buffer.data());
        double_to_string_xml(doubleOf(bits), buffer.data());
        float_to_string(floatOf(static_cast<std::uint32_t>(bits)), buffer.data());
    }
}

// ---- Samples. They are cut into parts, so that several processes share them.

constexpr unsigned parts = 8;

class FloatTextSample : public ::testing::TestWithParam<unsigned> {};

/// Counts differences and shows the first ones.
class Differences {
public:
    void compare(std::string_view actual, const std::string& expected) {
        if (actual != expected && ++count_ <= 10) {
            ADD_FAILURE() << "is " << actual << ", wanted " << expected;
        }
    }
    template <typename Number>
    void compareBits(std::string_view read, Number actual, Number expected) {
        if (std::memcmp(&actual, &expected, sizeof actual) != 0 && ++count_ <= 10) {
            ADD_FAILURE() << read << " reads back as another number";
        }
    }
    ~Differences() { EXPECT_EQ(count_, 0U); }

private:
    std::size_t count_ = 0;
};

TEST_P(FloatTextSample, RandomDoublesHaveShortestDigitsAndReadBack) {
    constexpr int doubles = 10'000'000 / parts;
    Differences differences;
    std::mt19937_64 random(GetParam());
    std::array<char, floatTextBuffer> buffer;
    std::size_t longest = 0;
    for (int i = 0; i < doubles; ++i) {
        const double value = doubleOf(random());
        const std::uint64_t length = double_to_string(value, buffer.data());
        differences.compare({buffer.data(), length}, referenceText(value));
        longest = std::max(longest, static_cast<std::size_t>(length));
        if (!std::isnan(value)) {
            double read = 0;
            std::from_chars(buffer.data(), buffer.data() + length, read);
            differences.compareBits(buffer.data(), read, value);
        }
        if (i % 16 == 0) {
            differences.compare({buffer.data(), double_to_string_xml(value, buffer.data())},
                                referenceText(value, xmlSpelling));
        }
    }
    EXPECT_EQ(longest, 24U);
}

// Numbers as people write them: random bits hardly ever give one of the two forms without an exponent.
TEST_P(FloatTextSample, NumbersOfFewDigitsAreWrittenAsTheyWere) {
    Differences differences;
    std::mt19937_64 random(100 + GetParam());
    std::array<char, floatTextBuffer> buffer;
    for (int i = 0; i < 100'000; ++i) {
        std::string digits = std::to_string(random() % 1'000'000'000'000'000 >> random() % 50);
        digits.erase(digits.find_last_not_of('0') + 1);
        if (digits.empty()) {
            continue;
        }
        const int point = static_cast<int>(random() % 30) - 8;
        const std::string source = "0." + digits + 'e' + std::to_string(point);
        const double value = std::strtod(source.c_str(), nullptr);
        differences.compare({buffer.data(), double_to_string(value, buffer.data())},
                            referenceLayout(digits, point, 17));
        const float single = std::strtof(source.c_str(), nullptr);
        differences.compare({buffer.data(), float_to_string(single, buffer.data())}, referenceText(single));
    }
}

// Every 1021st of the floats, from another one in each part; the number is prime, so that all bits vary.
TEST_P(FloatTextSample, FloatsHaveShortestDigitsAndReadBack) {
    constexpr std::uint64_t step = 1021;
    Differences differences;
    std::array<char, floatTextBuffer> buffer;
    std::size_t longest = 0;
    for (std::uint64_t bits = GetParam() * 127; bits <= 0xFFFFFFFF; bits += step) {
        const float value = floatOf(static_cast<std::uint32_t>(bits));
        const std::uint64_t length = float_to_string(value, buffer.data());
        differences.compare({buffer.data(), length}, referenceText(value));
        longest = std::max(longest, static_cast<std::size_t>(length));
        if (!std::isnan(value) && bits % 4 == 0) {
            differences.compareBits(buffer.data(), std::strtof(buffer.data(), nullptr), value);
        }
    }
    EXPECT_EQ(longest, 15U) << "a sign, nine digits, a point and an exponent of two digits";
}

INSTANTIATE_TEST_SUITE_P(Part, FloatTextSample, ::testing::Range(0U, parts));

} // namespace
} // namespace kvt::test
