// Conversion between encodings that are known at run time only, through UString<30>: the encodings without a
// string type of their own, and the order in which the rules apply.

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <string/string_samples.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace kvt::test;
using namespace std::string_view_literals;

struct Row {
    const char* from;
    std::string_view in;
    const char* to;
    std::string_view out; ///< also what a failed assign leaves
    FailureRecord failure = noFailure();
};

UString<30> labelled(std::string_view bytes, const char* encoding) {
    return {bytes.data(), bytes.size(), Encoding(encoding)};
}

void check(const Row& row) {
    SCOPED_TRACE(std::string(row.from) + " to " + row.to + ": " + printable(row.in));
    const UString<30> source = labelled(row.in, row.from);
    UString<30> target = labelled("old text", row.to);
    EXPECT_EQ(failureOf([&] { target.assign(source); }), row.failure);
    EXPECT_EQ(printable(target.toStdString()), printable(row.out));
    EXPECT_TRUE(target.encoding() == Encoding(row.to));

    UString<30> copy;
    EXPECT_EQ(failureOf([&] { copy = source.getAsEncoding(Encoding(row.to)); }), row.failure);
    if (row.failure.type.empty()) {
        EXPECT_EQ(printable(copy.toStdString()), printable(row.out));
        EXPECT_TRUE(copy.encoding() == Encoding(row.to));
    }
}

FailureRecord lost(std::string_view text, const char* from, const char* to, std::string_view lossy,
                   std::string_view substitution = "?") {
    return transcodingFailure(text, from, to, lossy, substitution);
}

TEST(AnyString, ConvertsBetweenTextEncodings) {
    const Row rows[] = {
        {"windows-1252", "caf\xE9 \x80", "UTF-8", "caf\u00e9 \u20ac"},
        {"windows-1252", "\x80", "UTF-16BE", "\x20\xAC"},
        {"windows-1252", "a", "UTF-32BE", "\0\0\0a"sv},
        {"UTF-16BE", "\xD8\x3D\xDE\x00"sv, "UTF-8", "\U0001F600"},
        {"UTF-16BE", "\x20\xAC", "UTF-16LE", "\xAC\x20"},
        {"UTF-16", "\xAC\x20", "UTF-16BE", "\x20\xAC"},
        {"Shift_JIS", "\x82\xA0", "UTF-8", "\u3042"},
        {"Shift_JIS", "\x82\xA0", "EUC-JP", "\xA4\xA2"},
        {"UTF-8", "\u3042", "Shift_JIS", "\x82\xA0"},
        {"KOI8-R", "\xC1", "windows-1251", "\xE0"},
        {"UTF-8", "\uFFFD", "ISO-8859-1", "?"},
        {"windows-1252", "", "Shift_JIS", ""},
        {"HZ-GB-2312", "~{VPND~}", "UTF-8", "\u4e2d\u6587"},
        {"UTF-8", "\u00e9", "UTF-7", "+AOk-"},
    };
    for (const Row& row : rows) {
        check(row);
    }
}

TEST(AnyString, SubstitutesWhatTheTargetLacks) {
    const Row rows[] = {
        {"UTF-8", "a\u00e9z", "Shift_JIS", "a?z", lost("a\u00e9z", "UTF-8", "Shift_JIS", "a?z")},
        {"windows-1252", "\x80", "ISO-8859-1", "?", lost("\u20ac", "windows-1252", "ISO-8859-1", "?")},
        {"Shift_JIS", "\x82\xA0", "windows-1252", "?", lost("\u3042", "Shift_JIS", "windows-1252", "?")},
        // Nothing stands in the place of a character that shows nothing, but it is lost all the same.
        {"UTF-8", "a\u200Bz", "ISO-8859-1", "az", lost("a\u200Bz", "UTF-8", "ISO-8859-1", "az")},
        {"UTF-16BE", "\xD8\x3D\xDE\x00"sv, "KOI8-R", "?", lost("\U0001F600", "UTF-16BE", "KOI8-R", "?")},
    };
    for (const Row& row : rows) {
        check(row);
    }
}

TEST(AnyString, SubstitutesBadInputFirst) {
    const Row rows[] = {
        {"UTF-16BE", "\xD8\0"sv, "UTF-8", "\uFFFD",
         badEncodingFailure("\xD8\0"sv, "UTF-16BE", "\uFFFD", "\uFFFD")},
        {"UTF-16BE", "\0ab"sv, "UTF-8", "a\uFFFD",
         badEncodingFailure("\0ab"sv, "UTF-16BE", "a\uFFFD", "\uFFFD")},
        {"UTF-8", "\u3042\xFF", "windows-1252", "??", badEncodingFailure("\u3042\xFF", "UTF-8", "??", "?")},
        {"Shift_JIS", "a\x82", "UTF-8", "a\uFFFD",
         badEncodingFailure("a\x82", "Shift_JIS", "a\uFFFD", "\uFFFD")},
        {"UTF-8", "\xFF", "UTF-16BE", "\xFF\xFD", badEncodingFailure("\xFF", "UTF-8", "\uFFFD", "\uFFFD")},
        {"ISO-8859-3", "a\xA5", "UTF-8", "a\uFFFD",
         badEncodingFailure("a\xA5", "ISO-8859-3", "a\uFFFD", "\uFFFD")},
    };
    for (const Row& row : rows) {
        check(row);
    }
}

TEST(AnyString, ToAsciiDependsOnWhatIsKnownOfTheSource) {
    const Row rows[] = {
        // UTF-8 is counted, not decoded.
        {"UTF-8", "\u00e9", "US-ASCII", "\x1A", lost("\u00e9", "UTF-8", "US-ASCII", "\x1A", "\x1A")},
        {"zqt-system", "\u00e9", "US-ASCII", "\x1A", lost("\u00e9", "UTF-8", "US-ASCII", "\x1A", "\x1A")},
        // Single bytes that keep ASCII are replaced one by one.
        {"windows-1252", "caf\xE9", "US-ASCII", "caf\x1A",
         lost("caf\u00e9", "windows-1252", "US-ASCII", "caf\x1A", "\x1A")},
        {"ISO-8859-1", "\x7F\x80\xFF", "US-ASCII", "\x7F\x1A\x1A",
         lost("\x7F\u0080\u00ff", "ISO-8859-1", "US-ASCII", "\x7F\x1A\x1A", "\x1A")},
        {"KOI8-R", "\xC1", "US-ASCII", "\x1A", lost("\u0430", "KOI8-R", "US-ASCII", "\x1A", "\x1A")},
        {"windows-1252", "abc", "US-ASCII", "abc"},
        {"windows-1252", "", "US-ASCII", ""},
        // The parameter of the failure is not valid text itself.
        {"ISO-8859-3", "a\xA5", "US-ASCII", "a\x1A",
         lost("a\uFFFD", "ISO-8859-3", "US-ASCII", "a\x1A", "\x1A")},
        // Several bytes to a character, or not known to keep ASCII: ICU converts.
        {"EUC-JP", "a\xA4\xA2", "US-ASCII", "a?", lost("a\u3042", "EUC-JP", "US-ASCII", "a?")},
        {"Shift_JIS", "\x82\xA0", "US-ASCII", "?", lost("\u3042", "Shift_JIS", "US-ASCII", "?")},
        {"IBM437", "\x82", "US-ASCII", "?", lost("\u00e9", "IBM437", "US-ASCII", "?")},
        {"UTF-16BE", "\0\xE9"sv, "US-ASCII", "?", lost("\u00e9", "UTF-16BE", "US-ASCII", "?")},
        {"UTF-16LE", "\xE9\0"sv, "US-ASCII", "?", lost("\u00e9", "UTF-16LE", "US-ASCII", "?")},
        {"zqt-wwjd", "<u00e9>", "US-ASCII", "?", lost("\u00e9", "UTF-16LE", "US-ASCII", "?")},
    };
    for (const Row& row : rows) {
        check(row);
        // A string of type 1 is such a target as well.
        UString<1> ascii("old text");
        EXPECT_EQ(failureOf([&] { ascii.assign(labelled(row.in, row.from)); }), row.failure) << row.from;
        EXPECT_EQ(printable(ascii.toStdString()), printable(row.out)) << row.from;
    }
}

TEST(AnyString, FromAsciiDependsOnWhatIsKnownOfTheTarget) {
    const Row rows[] = {
        {"US-ASCII", "caf\xE9", "UTF-8", "caf\xE9"},
        {"US-ASCII", "caf\xE9", "windows-1252", "caf\xE9"},
        {"US-ASCII", "caf\xE9", "KOI8-R", "caf\xE9"},
        {"US-ASCII", "caf\xE9", "EUC-JP", "caf\xE9"},
        {"US-ASCII", "caf\xE9", "zqt-system", "caf\xE9"},
        {"US-ASCII", "caf\xE9", "Shift_JIS", "caf?", badEncodingFailure("caf\xE9", "US-ASCII", "caf?", "?")},
        {"US-ASCII", "\xE9", "IBM437", "?", badEncodingFailure("\xE9", "US-ASCII", "?", "?")},
        {"US-ASCII", "a", "UTF-16BE", "\0a"sv},
        {"US-ASCII", "\xE9", "UTF-16LE", "\xFD\xFF",
         badEncodingFailure("\xE9", "US-ASCII", "\uFFFD", "\uFFFD")},
        {"US-ASCII", "abc", "IBM037", "\x81\x82\x83"},
        {"US-ASCII", "\x80\xFF", "US-ASCII", "\x80\xFF"},
    };
    for (const Row& row : rows) {
        check(row);
        // A string of type 1 is such a source as well.
        UString<30> target = labelled("old text", row.to);
        EXPECT_EQ(failureOf([&] { target.assign(stringOf<1>(row.in)); }), row.failure) << row.to;
        EXPECT_EQ(printable(target.toStdString()), printable(row.out)) << row.to;
    }
}

TEST(AnyString, WwjdGoesThroughUtf16) {
    const Row rows[] = {
        {"zqt-wwjd", "<u20ac><space>", "windows-1252", "\x80 "},
        {"zqt-wwjd", "<u3042>", "windows-1252", "?", lost("\u3042", "UTF-16LE", "windows-1252", "?")},
        {"zqt-wwjd", "<ud800>", "UTF-16BE", "\xFF\xFD",
         badEncodingFailure("\0\xD8"sv, "UTF-16LE", "\uFFFD", "\uFFFD")},
        {"zqt-wwjd", "<ud800>", "UTF-16LE", "\0\xD8"sv},
        {"zqt-wwjd", "<u0041>\xE9", "zqt-wwjd", "<u0041>\xE9"},
        {"windows-1252", "a b\x80", "zqt-wwjd", "a<space>b<u20ac>"},
        {"UTF-16LE", "\0\xD8"sv, "zqt-wwjd", "<ud800>"},
        {"UTF-16LE", "\0\xD8z"sv, "zqt-wwjd", "<ud800>"},
        {"US-ASCII", "a b", "zqt-wwjd", "a<space>b"},
    };
    for (const Row& row : rows) {
        check(row);
    }
    UString<30> target = labelled("", "zqt-wwjd");
    EXPECT_EQ(failureOf([&] { target.assign(labelled("\xD8\0"sv, "UTF-16BE")); }),
              badEncodingFailure("\xD8\0"sv, "UTF-16BE", "\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([&] { target.assign(labelled("\xE9", "US-ASCII")); }),
              badEncodingFailure("\xE9", "US-ASCII", "\uFFFD", "\uFFFD"));
    target = labelled("", "windows-1252");
    EXPECT_EQ(failureOf([&] { target.assign(labelled("<lt>\xE9", "zqt-wwjd")); }),
              badEncodingFailure("\xE9", "zqt-wwjd", "<\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([&] { target.assign(labelled("<uzzzz>", "zqt-wwjd")); }),
              invalidArgument("invalid stoi argument"));
}

TEST(AnyString, BinaryTakesEverythingAndGivesNothing) {
    const Row rows[] = {
        {"zqt-binary", "\xFF\x01", "zqt-binary", "\xFF\x01"}, {"UTF-8", "\xFF\x01", "BINARY", "\xFF\x01"},
        {"zqt-wwjd", "<uzzzz>\xE9", "binary", "<uzzzz>\xE9"}, {"", "\xFF", "zqt-binary", "\xFF"},
        {"Shift_JIS", "\x82", "zqt-binary", "\x82"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(printable(row.in));
        UString<30> target = UString<30>(Encoding(row.to));
        target.assign(UString<30>(row.in.data(), row.in.size(), Encoding(row.from, kvt::ex::nothrow)));
        EXPECT_EQ(target.toStdString(), row.out);
    }
    const UString<30> bytes = labelled("a\x01\xE9\0\\"sv, "binary");
    for (const char* const to : {"UTF-8", "US-ASCII", "UTF-16LE", "zqt-wwjd", "Shift_JIS", "zqt-system"}) {
        EXPECT_EQ(failureOf([&] { bytes.getAsEncoding(Encoding(to)); }), binaryFailure("a\x01\xE9\0\\"sv))
            << to;
    }
    EXPECT_EQ(failureOf([&] { bytes.getAsEncoding(Encoding::Unknown); }), binaryFailure("a\x01\xE9\0\\"sv));
    UString<30> target(Encoding::Binary);
    EXPECT_EQ(failureOf([&] { target.assign(UString<28>("a")); }), binaryFailure("a"))
        << "a binary string converts to nothing, whatever the label";
}

TEST(AnyString, UnknownDoesNotConvert) {
    const UString<30> unknown("abc", 3, Encoding::Unknown);
    const auto invalid = invalidEncodingFailure("unknown");
    EXPECT_EQ(failureOf([&] { unknown.getAsUtf8(); }), invalid);
    EXPECT_EQ(failureOf([&] { unknown.getAsUtf16(); }), invalid);
    EXPECT_EQ(failureOf([&] { unknown.getAsUtf32(); }), invalid);
    EXPECT_EQ(failureOf([&] { unknown.getAsSystem(); }), invalid);
    EXPECT_EQ(failureOf([&] { UString<1>{unknown}; }), invalid);
    EXPECT_EQ(failureOf([&] { UString<29>{unknown}; }), invalid);
    EXPECT_EQ(failureOf([&] { unknown.getAsEncoding(Encoding::Windows1252); }), invalid);
    EXPECT_EQ(failureOf([&] { UString<0>("abc").getAsEncoding(Encoding::Unknown); }), invalid);
    EXPECT_EQ(failureOf([&] { UString<1>("abc").getAsEncoding(Encoding::Unknown); }), invalid);
    EXPECT_EQ(failureOf([&] { UString<29>("abc").getAsEncoding(Encoding::Unknown); }), invalid);
    // Empty text goes the same way.
    EXPECT_EQ(failureOf([&] { UString<0>{UString<30>()}; }), invalid);
    EXPECT_EQ(UString<28>(unknown).toStdString(), "abc");
    EXPECT_EQ(unknown.getAsEncoding(Encoding::Unknown).toStdString(), "abc");
    EXPECT_EQ(UString<30>(unknown).toStdString(), "abc");
}

TEST(AnyString, NextConversionStartsCleanAfterAFailure) {
    for (const char* const encoding : {"Shift_JIS", "ISO-2022-JP", "windows-1252", "UTF-16BE"}) {
        SCOPED_TRACE(encoding);
        UString<30> target{Encoding(encoding)};
        EXPECT_EQ(failureOf([&] { target.assign(UString<0>("a\xC3")); }).number, 910002u);
        EXPECT_EQ(failureOf([&] { target.assign(UString<0>("abc")); }), noFailure());
        EXPECT_EQ(UString<0>(target).toStdString(), "abc");
    }
}

TEST(AnyString, GivesAndTakesWideUnitsAsBytes) {
    EXPECT_EQ(labelled("a\0b\0c"sv, "UTF-16LE").getAsUtf16(), UString<2>(u"ab", 2))
        << "an incomplete unit is dropped";
    EXPECT_EQ(labelled("a\0\0\0b"sv, "UTF-32LE").getAsUtf32(), UString<3>(U"a", 1));
    EXPECT_EQ(UString<2>(u"\xD800", 1).getAsEncoding(Encoding::Utf16LE).toStdString(),
              std::string("\0\xD8", 2));
    EXPECT_EQ(UString<2>(u"a", 1).getAsEncoding(Encoding::Utf16BE).toStdString(), std::string("\0a", 2));
    EXPECT_EQ(UString<3>(U"a", 1).getAsEncoding(Encoding::Utf32BE).toStdString(), std::string("\0\0\0a", 4));
}

} // namespace
