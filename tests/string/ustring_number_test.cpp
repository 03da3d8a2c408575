// Numbers as text, and text as numbers.
#include <support/failure_record.h>
#include <support/string_types.h>

#include <kvt/codec/float_text.h>

#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <optional>
#include <random>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

namespace kvt::test {
namespace {

using namespace std::string_literals;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

template <typename Type>
class UStringNumber : public ::testing::Test {
public:
    static constexpr std::uint32_t number = Type::value;

    /// The text of a number, which has to be labelled where there is a label.
    template <typename Number>
    static std::string textOf(Number value) {
        const auto string = UString<number>::fromNumber(value);
        EXPECT_EQ(string.encoding().id(), number == Encoding::Unknown ? Encoding::UsAscii : number);
        return shown(string);
    }
};
TYPED_TEST_SUITE(UStringNumber, StringTypes, StringTypeNames);

template <typename F, typename Integer>
void expectIntegers() {
    using Limits = std::numeric_limits<Integer>;
    const auto text = [](Integer value) {
        return std::is_signed_v<Integer> ? std::to_string(static_cast<long long>(value))
                                         : std::to_string(static_cast<unsigned long long>(value));
    };
    for (const long long wanted :
         {0LL, 1LL, 9LL, 10LL, 99LL, 127LL, 255LL, 499LL, 500LL, 501LL, 65535LL, 1LL << 40}) {
        if (static_cast<unsigned long long>(wanted) <= static_cast<unsigned long long>(Limits::max())) {
            const auto value = static_cast<Integer>(wanted);
            EXPECT_EQ(F::textOf(value), text(value));
            if (std::is_signed_v<Integer>) {
                const auto negative = static_cast<Integer>(-wanted);
                EXPECT_EQ(F::textOf(negative), text(negative));
            }
        }
    }
    EXPECT_EQ(F::textOf(Limits::min()), text(Limits::min()));
    EXPECT_EQ(F::textOf(Limits::max()), text(Limits::max()));
}

TYPED_TEST(UStringNumber, EveryIntegerTypeGivesItsDecimalText) {
    using F = TestFixture;
    expectIntegers<F, char>();
    expectIntegers<F, signed char>();
    expectIntegers<F, unsigned char>();
    expectIntegers<F, wchar_t>();
    expectIntegers<F, char8_t>();
    expectIntegers<F, char16_t>();
    expectIntegers<F, char32_t>();
    expectIntegers<F, short>();
    expectIntegers<F, unsigned short>();
    expectIntegers<F, int>();
    expectIntegers<F, unsigned>();
    expectIntegers<F, long>();
    expectIntegers<F, unsigned long>();
    expectIntegers<F, long long>();
    expectIntegers<F, unsigned long long>();
    EXPECT_EQ(F::textOf(false), "0");
    EXPECT_EQ(F::textOf(true), "1");
    EXPECT_EQ(F::textOf('a'), "97");
}

TYPED_TEST(UStringNumber, SmallNumbersAndTheirNeighboursHavePlainText) {
    using F = TestFixture;
    EXPECT_EQ(F::textOf(std::int64_t{499}), "499");
    EXPECT_EQ(F::textOf(std::int64_t{500}), "500");
    EXPECT_EQ(F::textOf(std::int64_t{-1}), "-1");
    for (int i = -600; i <= 600; ++i) {
        EXPECT_EQ(F::textOf(static_cast<std::int64_t>(i)), std::to_string(i));
        if (i >= 0) {
            EXPECT_EQ(F::textOf(static_cast<std::uint64_t>(i)), std::to_string(i));
        }
    }
}

TYPED_TEST(UStringNumber, EachCallerHasTextOfItsOwn) {
    constexpr auto N = TestFixture::number;
    auto text = UString<N>::fromNumber(7);
    text[0] = asciiUnits<N>("x")[0];
    EXPECT_EQ(shown(UString<N>::fromNumber(7)), "7");
}

TYPED_TEST(UStringNumber, TheLimitsAre64Bits) {
    using F = TestFixture;
    EXPECT_EQ(F::textOf(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
    EXPECT_EQ(F::textOf(std::numeric_limits<std::int64_t>::max()), "9223372036854775807");
    EXPECT_EQ(F::textOf(std::numeric_limits<std::uint64_t>::max()), "18446744073709551615");
    EXPECT_EQ(F::textOf(std::uint64_t{1} << 63), "9223372036854775808");
}

TYPED_TEST(UStringNumber, RealNumbersHaveTheirShortestText) {
    using F = TestFixture;
    const double infinity = std::numeric_limits<double>::infinity();
    const std::vector<std::pair<double, const char*>> doubles = {
        {1.0, "1"},
        {-1.0, "-1"},
        {0.5, "0.5"},
        {0.1, "0.1"},
        {1e17, "1e+17"},
        {1e-5, "1e-5"},
        {0.0, "0"},
        {-0.0, "-0"},
        {infinity, "inf"},
        {-infinity, "-inf"},
        {5e-324, "5e-324"},
        {499.0, "499"},
        {1e9, "1000000000"},
        {std::bit_cast<double>(~0ULL << 51), "-nan"},
        {std::bit_cast<double>(0x7FFULL << 52 | 1ULL << 51), "nan"},
        {0.1f, "0.10000000149011612"}};
    for (const auto& [value, text] : doubles) {
        EXPECT_EQ(F::textOf(value), text);
    }
    const std::vector<std::pair<float, const char*>> floats = {
        {1.0F, "1"},         {0.1F, "0.1"}, {-0.1F, "-0.1"},  {1e9F, "1e+9"},
        {1e8F, "100000000"}, {-0.0F, "-0"}, {1e-45F, "1e-45"}};
    for (const auto& [value, text] : floats) {
        EXPECT_EQ(F::textOf(value), text);
    }
}

TYPED_TEST(UStringNumber, RealNumbersHaveTheTextOfTheirFunctions) {
    using F = TestFixture;
    std::mt19937_64 random(7);
    for (int i = 0; i < 2000; ++i) {
        std::array<char, kvt::ex::floatTextBuffer> buffer;
        const auto real = std::bit_cast<double>(random());
        kvt::ex::double_to_string(real, buffer.data());
        EXPECT_EQ(F::textOf(real), buffer.data());
        const auto single = std::bit_cast<float>(static_cast<std::uint32_t>(random()));
        kvt::ex::float_to_string(single, buffer.data());
        EXPECT_EQ(F::textOf(single), buffer.data());
    }
}

// ---- Text to numbers

struct ReadRow {
    const char* reason;
    std::string text;
    std::optional<std::int64_t> asSigned;
    std::optional<std::uint64_t> asUnsigned;
};

constexpr auto most = std::numeric_limits<std::int64_t>::max();
constexpr auto least = std::numeric_limits<std::int64_t>::min();
constexpr auto all = std::numeric_limits<std::uint64_t>::max();
constexpr auto half = std::uint64_t{1} << 63;

const std::vector<ReadRow> readRows = {
    {"a number", "42", 42, 42},
    {"zero", "0", 0, 0},
    {"minus zero", "-0", 0, 0},
    {"white space before, anything behind", " 42xyz", 42, 42},
    {"every kind of white space", " \t\n\v\f\r42", 42, 42},
    {"nothing", "", {}, {}},
    {"white space only", " \t", {}, {}},
    {"no digit", "xyz", {}, {}},
    {"plus", "+5", 5, 5},
    {"minus wraps when unsigned", "-5", -5, all - 4},
    {"minus one", "-1", -1, all},
    {"a sign only", "-", {}, {}},
    {"a plus only", "+", {}, {}},
    {"two signs", "--5", {}, {}},
    {"two different signs", "+-5", {}, {}},
    {"white space behind the sign", "- 5", {}, {}},
    {"white space before the sign", " -5", -5, all - 4},
    {"leading zeros", "0000000000000000000000000000012", 12, 12},
    {"no octal", "010", 10, 10},
    {"no hexadecimal", "0x1F", 0, 0},
    {"no hexadecimal digit", "1F", 1, 1},
    {"no fraction", "1.9", 1, 1},
    {"no exponent", "1e3", 1, 1},
    {"no grouping", "1,000", 1, 1},
    {"digits after white space", "1 2", 1, 1},
    {"the largest", "9223372036854775807", most, half - 1},
    {"one more", "9223372036854775808", {}, half},
    {"the smallest", "-9223372036854775808", least, half},
    {"one less", "-9223372036854775809", {}, half - 1},
    {"the largest unsigned", "18446744073709551615", {}, all},
    {"one more unsigned", "18446744073709551616", {}, {}},
    {"the largest that wraps", "-18446744073709551615", {}, 1},
    {"too large to wrap", "-18446744073709551616", {}, {}},
    {"far too large, with text behind", "99999999999999999999999999999999x", {}, {}},
    {"far too small", "-99999999999999999999999999999999", {}, {}},
    {"a zero unit ends the number", "12\00034"s, 12, 12},
    {"a zero unit before it", "\00034"s, {}, {}},
    {"a zero unit behind the sign", "-\0001"s, {}, {}},
    {"text with trailing zeros", "7\0\0"s, 7, 7},
};

TYPED_TEST(UStringNumber, TextIsReadAsTheTableSays) {
    constexpr auto N = TestFixture::number;
    if constexpr (N != Encoding::Binary) {
        for (const ReadRow& row : readRows) {
            const UString<N> text = plain<N>(row.text);
            EXPECT_EQ(text.asSigned(), row.asSigned) << row.reason << ": " << row.text;
            EXPECT_EQ(text.asUnsigned(), row.asUnsigned) << row.reason << ": " << row.text;
            EXPECT_EQ(text, plain<N>(row.text));
        }
    }
}

TYPED_TEST(UStringNumber, AnEarlierErrorIsNotTakenForOneOfTheText) {
    constexpr auto N = TestFixture::number;
    if constexpr (N != Encoding::Binary) {
        errno = ERANGE;
        EXPECT_EQ(plain<N>("5").asSigned(), std::optional<std::int64_t>(5));
        errno = ERANGE;
        EXPECT_EQ(plain<N>("5").asUnsigned(), std::optional<std::uint64_t>(5));
    }
}

TYPED_TEST(UStringNumber, WhatIsWrittenIsReadAgain) {
    constexpr auto N = TestFixture::number;
    if constexpr (N != Encoding::Binary) {
        std::mt19937_64 random(11);
        for (int i = 0; i < 3000; ++i) {
            const std::uint64_t value = random() >> random() % 64;
            const auto negative = static_cast<std::int64_t>(0 - value);
            EXPECT_EQ(UString<N>::fromNumber(value).asUnsigned(), std::optional(value));
            EXPECT_EQ(UString<N>::fromNumber(negative).asSigned(), std::optional(negative));
        }
    }
}

TYPED_TEST(UStringNumber, RandomTextIsReadAsTheCLibraryReadsIt) {
    constexpr auto N = TestFixture::number;
    if constexpr (N != Encoding::Binary) {
        const std::string front = " \t\n\v\f\r  +--+";
        const std::string digits = "0123456789012345678901234567890123456789x .e+-\0"s;
        std::mt19937_64 random(13);
        std::size_t engaged = 0;
        std::size_t tooLarge = 0;
        for (int i = 0; i < 20000; ++i) {
            std::string text;
            for (std::size_t left = random() % 4; left > 0; --left) {
                text += front[random() % front.size()];
            }
            for (std::size_t left = random() % 24; left > 0; --left) {
                // Every other text is long enough to be too large.
                text += digits[random() % (i % 2 == 0 ? 10 : digits.size())];
            }
            char* end = nullptr;
            errno = 0;
            const long long asSigned = std::strtoll(text.c_str(), &end, 10);
            const bool hasDigits = end != text.c_str();
            const bool signedFits = errno == 0;
            errno = 0;
            const unsigned long long asUnsigned = std::strtoull(text.c_str(), &end, 10);
            const bool unsignedFits = errno == 0;
            const UString<N> string = plain<N>(text);
            const auto readSigned = string.asSigned();
            const auto readUnsigned = string.asUnsigned();
            ASSERT_EQ(readSigned,
                      hasDigits && signedFits ? std::optional<std::int64_t>(asSigned) : std::nullopt)
                << shown<0>(text);
            ASSERT_EQ(readUnsigned,
                      hasDigits && unsignedFits ? std::optional<std::uint64_t>(asUnsigned) : std::nullopt)
                << shown<0>(text);
            engaged += readSigned ? 1 : 0;
            tooLarge += hasDigits && !signedFits ? 1 : 0;
        }
        EXPECT_GT(engaged, 5000U);
        EXPECT_GT(tooLarge, 500U);
    }
}

TEST(UStringNumberBinary, BytesAreNoNumberWhateverTheyHold) {
    for (const std::string bytes : {"", "42", "x", "\x01\xE9"}) {
        const UString<28> string{UStringView<28>(bytes)};
        EXPECT_EQ(failureOf([&] { string.asSigned(); }), binaryFailure(bytes));
        EXPECT_EQ(failureOf([&] { string.asUnsigned(); }), binaryFailure(bytes));
    }
}

TEST(UStringNumberOther, FailuresOfTheConversionComeOut) {
    const std::u16string lone = {u'4', 0xD800};
    const UString<2> utf16(lone.data(), lone.size());
    EXPECT_EQ(failureOf([&] { utf16.asSigned(); }), failureOf([&] { utf16.getAsUtf8(); }));
    EXPECT_EQ(failureOf([&] { utf16.asUnsigned(); }).number, 910002U);
    const std::u32string beyond = {U'4', 0x110000};
    EXPECT_EQ(failureOf([&] { UString<3>(beyond.data(), beyond.size()).asSigned(); }).number, 910002U);
    EXPECT_EQ(failureOf([] { UString<29>(UStringView<29>("4\xE9")).asUnsigned(); }).number, 910002U);
}

TEST(UStringNumberOther, Utf8AndAsciiAreReadWithoutALookAtTheRest) {
    EXPECT_EQ(UString<0>("42\xFF").asSigned(), std::optional<std::int64_t>(42));
    EXPECT_EQ(UString<27>(UStringView<27>("42\xFF")).asSigned(), std::optional<std::int64_t>(42))
        << "UTF-8 as well";
    EXPECT_EQ(UString<1>(UStringView<1>("42\xE9")).asUnsigned(), std::optional<std::uint64_t>(42));
}

TEST(UStringNumberOther, OnlyAsciiDigitsAndSpacesCount) {
    EXPECT_EQ(UString<2>(u"\u0664\u0662", 2).asSigned(), std::nullopt) << "Arabic-Indic digits";
    EXPECT_EQ(UString<2>(u"\u00A042", 3).asSigned(), std::nullopt) << "a no-break space";
    EXPECT_EQ(UString<3>(U"42\u0664", 3).asSigned(), std::optional<std::int64_t>(42));
    EXPECT_EQ(UString<2>(u"\u2212"
                         u"5",
                         2)
                  .asSigned(),
              std::nullopt)
        << "a minus sign that is no hyphen";
}

TEST(UStringNumberOther, WwjdIsDecodedFirst) {
    EXPECT_EQ(UString<29>(UStringView<29>("<space>42<comma>5")).asSigned(), std::optional<std::int64_t>(42));
    EXPECT_EQ(UString<29>(UStringView<29>("<u>42")).asSigned(), std::optional<std::int64_t>(42));
}

TEST(UStringNumberOther, AnEncodingAtRunTimeIsHonoured) {
    const Encoding utf16be(kvt::future::string_view("UTF-16BE"));
    EXPECT_EQ(UString<30>("\0004\0002", 4, utf16be).asSigned(), std::optional<std::int64_t>(42));
    EXPECT_EQ(UString<30>("42\xE9", 3, Encoding(kvt::future::string_view("ISO-8859-1"))).asUnsigned(),
              std::optional<std::uint64_t>(42));
    EXPECT_EQ(failureOf([] { UString<30>("42", 2, Encoding::Binary).asSigned(); }), binaryFailure("42"));
    EXPECT_EQ(failureOf([] { UString<30>("42", 2, Encoding::Unknown).asSigned(); }),
              invalidEncodingFailure("unknown"));
}

TEST(UStringNumberThreads, TheFirstUseMayBeOnManyThreads) {
    std::vector<std::thread> threads;
    std::array<bool, 8> right{};
    for (bool& result : right) {
        threads.emplace_back([&result] {
            result = true;
            for (int i = 0; i < 1000; ++i) {
                result = result && UString<0>::fromNumber(i).toStdString() == std::to_string(i);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    for (const bool result : right) {
        EXPECT_TRUE(result);
    }
}

} // namespace
} // namespace kvt::test
