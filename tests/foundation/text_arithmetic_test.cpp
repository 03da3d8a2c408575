// The shelf of small text helpers, over all bytes and all code points.

#include <kvt/foundation/detail/ascii.h>
#include <kvt/foundation/detail/utf.h>

#include <gtest/gtest.h>

#include <string>
#include <unicode/utf16.h>
#include <unicode/utf8.h>

namespace kvt::ex::detail {
namespace {

TEST(Ascii, CaseIsThatOfTheTwentySixLettersAlone) {
    const std::string_view upper = "ABCDEFGHIJKLMNOPQRSTUVWXYZ";
    const std::string_view lower = "abcdefghijklmnopqrstuvwxyz";
    for (int value = 0; value < 256; ++value) {
        const char byte = static_cast<char>(value);
        const auto inUpper = upper.find(byte);
        const auto inLower = lower.find(byte);
        EXPECT_EQ(asciiLower(byte), inUpper != std::string_view::npos ? lower[inUpper] : byte) << value;
        EXPECT_EQ(asciiUpper(byte), inLower != std::string_view::npos ? upper[inLower] : byte) << value;
        EXPECT_EQ(isAsciiLetter(byte), inUpper != inLower) << value;
        EXPECT_EQ(isAscii(byte), value < 128) << value;
    }
}

TEST(Ascii, TextsAreComparedWholeAndBeyondAsciiByByte) {
    EXPECT_TRUE(equalsIgnoringAsciiCase("", ""));
    EXPECT_TRUE(equalsIgnoringAsciiCase("lOcAl", "Local"));
    EXPECT_FALSE(equalsIgnoringAsciiCase("local", "locale"));
    EXPECT_FALSE(equalsIgnoringAsciiCase("[", "{"));
    EXPECT_FALSE(equalsIgnoringAsciiCase("\xC4", "\xE4"));
    EXPECT_TRUE(isAllAscii(""));
    EXPECT_TRUE(isAllAscii("a\x7F"));
    EXPECT_FALSE(isAllAscii("a\x80"));
}

TEST(Utf, EveryCodePointIsLaidOutAsByIcu) {
    for (char32_t c = 0; c <= lastCodePoint; ++c) {
        EXPECT_EQ(isSurrogate(c), U_IS_SURROGATE(c));
        EXPECT_EQ(isHighSurrogate(c), U_IS_LEAD(c));
        EXPECT_EQ(isLowSurrogate(c), U_IS_TRAIL(c));
        if (c >= firstSupplementary) {
            ASSERT_EQ(highSurrogate(c), static_cast<char16_t>(U16_LEAD(c)));
            ASSERT_EQ(lowSurrogate(c), static_cast<char16_t>(U16_TRAIL(c)));
            ASSERT_EQ(codePointOf(highSurrogate(c), lowSurrogate(c)), c);
        }
        char bytes[longestUtf8];
        const std::string_view text(bytes, encodeUtf8(c, bytes));
        if (!isSurrogate(c)) {
            char wanted[longestUtf8];
            std::size_t length = 0;
            U8_APPEND_UNSAFE(wanted, length, c);
            ASSERT_EQ(text, std::string_view(wanted, length)) << static_cast<std::uint32_t>(c);
        }
        EXPECT_FALSE(isContinuation(text[0]));
        for (const char byte : text.substr(1)) {
            EXPECT_TRUE(isContinuation(byte));
        }
        ASSERT_EQ(continuationBits(text.back()), c % 64);
    }
}

TEST(Utf, ContinuationIsEveryByteWithTheTwoLeadingBits) {
    for (int value = 0; value < 256; ++value) {
        EXPECT_EQ(isContinuation(static_cast<char>(value)), value >= 0x80 && value < 0xC0) << value;
    }
}

} // namespace
} // namespace kvt::ex::detail
