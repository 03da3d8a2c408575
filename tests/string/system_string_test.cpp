// The row and the column of the system encoding, in a process whose locale names it: CTest runs this program
// once under each of the locales below. How a string of the system converts depends on two things, whether
// the encoding keeps ASCII and whether its characters are single bytes.

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <string/string_samples.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

namespace {

using namespace kvt::test;

struct System {
    const char* name;
    std::uint32_t evaluated;
    const char* text;  ///< UTF-8
    const char* bytes; ///< the same in the encoding
    const char* ascii; ///< what is left of it in ASCII
    const char* substitute;
    const char* trusted; ///< "a\xE9" of a UString<1>, or null when ICU looks at it and refuses
};

constexpr System systems[] = {
    {"windows-1252", 20, "a\u20ac", "a\x80", "a\x1A", "\x1A", "a\xE9"},
    {"KOI8-R", 27, "a\u0430", "a\xC1", "a\x1A", "\x1A", "a\xE9"},
    {"EUC-JP", 27, "a\u3042", "a\xA4\xA2", "a?", "?", "a\xE9"},
    {"Shift_JIS", 27, "a\u3042", "a\x82\xA0", "a?", "?", nullptr},
};

const System& system() {
    const std::string name(Encoding(Encoding::System).getName());
    for (const System& row : systems) {
        if (row.name == name) {
            return row;
        }
    }
    ADD_FAILURE() << "no row for " << name;
    std::abort();
}

TEST(SystemString, IsOfTheLocaleThatWasAskedFor) {
    const char* const wanted = std::getenv("KVT_WANTED_SYSTEM");
    ASSERT_NE(wanted, nullptr);
    EXPECT_STREQ(system().name, wanted);
    EXPECT_EQ(Encoding(Encoding::System).evaluate(), system().evaluated);
}

TEST(SystemString, ConvertsToEachType) {
    const UString<27> source = stringOf<27>(system().bytes);
    const UString<0> text(system().text);
    EXPECT_EQ(UString<0>(source), text);
    EXPECT_EQ(UString<2>(source), UString<2>(text));
    EXPECT_EQ(UString<3>(source), UString<3>(text));
    EXPECT_EQ(UString<28>(source).toStdString(), system().bytes);
    EXPECT_EQ(UString<29>(source), UString<29>(text));
    const UString<30> any(source);
    EXPECT_EQ(any.toStdString(), system().bytes);
    EXPECT_EQ(any.encoding().id(), Encoding::System);
    EXPECT_EQ(UString<0>(any), text);
}

TEST(SystemString, IsMadeFromEachType) {
    const UString<0> text(system().text);
    const UString<27> expected = stringOf<27>(system().bytes);
    EXPECT_EQ(UString<27>(text), expected);
    EXPECT_EQ(UString<27>(UString<2>(text)), expected);
    EXPECT_EQ(UString<27>(UString<3>(text)), expected);
    EXPECT_EQ(UString<27>(UString<29>(text)), expected);
    EXPECT_EQ(UString<27>(UString<30>(text)), expected);
    EXPECT_EQ(text.getAsSystem(), expected);
    EXPECT_EQ(text.getAsEncoding(Encoding::System).toStdString(), system().bytes);
    EXPECT_EQ(UString<27>(UString<1>("abc")).toStdString(), "abc");
}

TEST(SystemString, ToAsciiIsCheckedByBytesOrByIcu) {
    UString<1> ascii;
    const auto expected =
        transcodingFailure(system().text, system().name, "US-ASCII", system().ascii, system().substitute);
    EXPECT_EQ(failureOf([&] { ascii.assign(stringOf<27>(system().bytes)); }), expected);
    EXPECT_EQ(ascii.toStdString(), system().ascii);
    EXPECT_EQ(
        failureOf([&] { UString<1>(system().bytes, std::string(system().bytes).size(), Encoding::System); }),
        expected);
    EXPECT_EQ(UString<1>(UString<27>("abc")).toStdString(), "abc");
}

TEST(SystemString, AsciiIsTrustedWhereTheSystemKeepsIt) {
    UString<27> target;
    const FailureRecord failure = failureOf([&] { target.assign(stringOf<1>("a\xE9")); });
    if (system().trusted != nullptr) {
        EXPECT_EQ(failure, noFailure());
        EXPECT_EQ(target.toStdString(), system().trusted);
    } else {
        EXPECT_EQ(failure, badEncodingFailure("a\xE9", "US-ASCII", "a?", "?"));
        EXPECT_EQ(target.toStdString(), "a?");
    }
}

TEST(SystemString, WhatTheSystemLacksIsLost) {
    UString<27> target;
    EXPECT_EQ(failureOf([&] { target.assign(UString<0>("z\U0001F600")); }),
              transcodingFailure("z\U0001F600", "UTF-8", system().name, "z?", "?"));
    EXPECT_EQ(target.toStdString(), "z?");
    EXPECT_EQ(failureOf([&] { target.assign(UString<2>(u"z\xD800", 2)); }),
              badEncodingFailure({"z\0\0\xD8", 4}, "UTF-16LE", "z?", "?"));
}

TEST(SystemString, BytesOfTheSystemAreCopiedUnseen) {
    const std::string bytes = "\xFF\x82\x20\xA0";
    EXPECT_EQ(UString<27>(bytes.data(), bytes.size(), Encoding::System).toStdString(), bytes);
    EXPECT_EQ(UString<27>(bytes.data(), bytes.size(), Encoding(system().name)).toStdString(), bytes);
}

} // namespace
