// UTF-8 to ASCII. The conversion does not decode: it looks at lead bytes and counts, and that decides which
// of two failures comes, so every short byte string is tried against a plain count.

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <reference/conversion_reference.h>
#include <string/string_samples.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace {

using namespace kvt::test;

void expectAsReference(const std::string& text) {
    const reference::Conversion expected = reference::asciiChecked(text);
    UString<1> target("old text");
    ASSERT_EQ(failureOf([&] { target.assign(stringOf<0>(text)); }), expected.failure) << printable(text);
    ASSERT_EQ(printable(target.toStdString()), printable(expected.bytes)) << printable(text);
}

// One byte of each kind of lead byte, at both ends of its range, and trailing bytes.
constexpr std::string_view kinds(
    "\0A\x7F\x80\x8F\x90\x9F\xA0\xBF\xC0\xC2\xC3\xDF\xE0\xE2\xED\xEF\xF0\xF4\xF5\xF7\xF8\xFB\xFC\xFD\xFE\xFF",
    27);

TEST(AsciiCheck, AgreesWithAPlainCountOnEveryShortString) {
    expectAsReference("");
    for (const char first : kinds) {
        expectAsReference({first});
        for (const char second : kinds) {
            expectAsReference({first, second});
            for (const char third : kinds) {
                expectAsReference({first, second, third});
                if (HasFatalFailure()) {
                    return;
                }
            }
        }
    }
}

TEST(AsciiCheck, AgreesWithAPlainCountOnRandomStrings) {
    std::mt19937 random(26);
    for (int round = 0; round < 20000 && !HasFatalFailure(); ++round) {
        std::string text;
        for (auto count = random() % 14; count > 0; --count) {
            // Half of the bytes trail, so that long characters come out whole at times.
            text +=
                random() % 2 == 0 ? kinds[random() % kinds.size()] : static_cast<char>(0x80 + random() % 64);
        }
        expectAsReference(text);
    }
}

struct Row {
    const char* reason;
    std::string_view in;
    std::string_view out;
    bool malformed;
};

constexpr Row rows[] = {
    {"one substitute for two bytes", "\xC3\xA9", "\x1A", false},
    {"for three", "a\xE2\x82\xACz", "a\x1Az", false},
    {"for four", "\xF0\x9F\x98\x80", "\x1A", false},
    {"for the old form of five", "\xF8\x88\x80\x80\x80z", "\x1Az", false},
    {"overlong forms are not looked into", "\xC0\x80", "\x1A", false},
    {"nor are surrogates", "\xED\xA0\x80", "\x1A", false},
    {"nor the end of the code space", "\xF7\xBF\xBF\xBF", "\x1A", false},
    {"cut off at the end", "ab\xC3", "ab\x1A", true},
    {"cut off after one of two trailing bytes", "\xE2\x82", "\x1A", true},
    {"cut off after three of four", "\xF8\x88\x80\x80", "\x1A", true},
    {"a trailing byte of its own", "\x80", "\x1A", true},
    {"each trailing byte of its own", "\x80\xBF", "\x1A\x1A", true},
    {"FF is no mark",
     "a\xFF"
     "b",
     "a\x1A"
     "b",
     true},
    {"FF in a trailing place is no mark",
     "\xC3\xFF"
     "b",
     "\x1A\x1A"
     "b",
     true},
    {"FE", "\xFE", "\x1A", true},
    {"the old form of six", "\xFC\x84\x80\x80\x80\x80", "\x1A\x1A\x1A\x1A\x1A\x1A", true},
    {"ASCII in a trailing place counts as one",
     "\xE2"
     "ab\xC3\xA9",
     "\x1A\x1A\x1A\x1A", true},
    {"a lead byte in a trailing place is not read as one", "\xE2\xE2\x82\xAC", "\x1A\x1A\x1A", true},
};

TEST(AsciiCheck, TellsForeignTextFromMalformedText) {
    for (const Row& row : rows) {
        SCOPED_TRACE(row.reason);
        const auto expected = row.malformed
                                  ? badEncodingFailure(row.in, "UTF-8", row.out, "\x1A")
                                  : transcodingFailure(row.in, "UTF-8", "US-ASCII", row.out, "\x1A");
        UString<1> target;
        EXPECT_EQ(failureOf([&] { target.assign(stringOf<0>(row.in)); }), expected);
        EXPECT_EQ(target.toStdString(), row.out);
        EXPECT_EQ(failureOf([&] { UString<1>(stringOf<0>(row.in)); }), expected);
        EXPECT_EQ(failureOf([&] { UString<1>(stringOf<27>(row.in)); }), expected);
        EXPECT_EQ(failureOf([&] { UString<1>(row.in.data(), row.in.size()); }), expected);
        EXPECT_EQ(failureOf([&] { UString<1>(stringOf<30>(row.in, Encoding::Utf8)); }), expected);
        EXPECT_EQ(failureOf([&] { stringOf<0>(row.in).getAsEncoding(Encoding::UsAscii); }), expected);
    }
}

TEST(AsciiCheck, AsciiTextIsCopied) {
    std::string ascii;
    for (int byte = 0; byte < 128; ++byte) {
        ascii += static_cast<char>(byte);
    }
    EXPECT_EQ(UString<1>(stringOf<0>(ascii)).toStdString(), ascii);
    EXPECT_EQ(UString<1>(stringOf<27>(ascii)).toStdString(), ascii);
}

TEST(AsciiCheck, FailureGivesTheSubstitutedTextAndTheSubstitute) {
    try {
        UString<1>(UString<0>("caf\u00e9"));
        FAIL() << "nothing was thrown";
    } catch (const kvt::ex::UStringTranscodingException& failure) {
        EXPECT_EQ(failure.getLossyConversion(), UString<0>("caf\x1A"));
        EXPECT_EQ(failure.getSubstitutionCharacters(), UString<0>("\x1A"));
    }
}

} // namespace
