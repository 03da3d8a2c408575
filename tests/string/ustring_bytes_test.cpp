// Strings from bytes and an encoding: what is copied without a look, what is converted, what becomes of an
// incomplete unit, and the label of a UString<30>.

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <string/string_samples.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace kvt::test;

TEST(UStringFromBytes, OfItsOwnEncodingAreCopiedUnseen) {
    using namespace std::string_literals;
    const std::string bytes = "\xFF\0\xC3\x80\x00\xD8\x00\x00\x11\x22\x33\xFF"s;
    ASSERT_EQ(bytes.size() % 4, 0u);
    forEachType([&]<std::uint32_t N>() {
        SCOPED_TRACE(N);
        EXPECT_EQ(bytesOf(stringOf<N>(bytes)), bytes);
    });
    // The same encoding by another name, and by way of the system's.
    EXPECT_EQ(bytesOf(UString<0>(bytes.data(), bytes.size(), Encoding("utf8"))), bytes);
    EXPECT_EQ(bytesOf(UString<2>(bytes.data(), bytes.size(), Encoding("UTF-16"))), bytes);
    EXPECT_EQ(bytesOf(UString<3>(bytes.data(), bytes.size(), Encoding("UTF-32"))), bytes);
    EXPECT_EQ(bytesOf(UString<0>(bytes.data(), bytes.size(), Encoding::System)), bytes);
    EXPECT_EQ(bytesOf(UString<27>(bytes.data(), bytes.size(), Encoding::Utf8)), bytes);
    EXPECT_EQ(bytesOf(UString<27>(bytes.data(), bytes.size(), Encoding("ANSI"))), bytes);
}

TEST(UStringFromBytes, AnIncompleteLastUnitIsDropped) {
    const std::string bytes = "abcdefghijkl";
    for (std::size_t length = 0; length <= bytes.size(); ++length) {
        const UString<2> utf16(bytes.data(), length, Encoding::Utf16LE);
        EXPECT_EQ(bytesOf(utf16), bytes.substr(0, length / 2 * 2));
        EXPECT_EQ(utf16.size(), length / 2);
        const UString<3> utf32(bytes.data(), length, Encoding::Utf32LE);
        EXPECT_EQ(bytesOf(utf32), bytes.substr(0, length / 4 * 4));
        EXPECT_EQ(utf32.size(), length / 4);
    }
}

TEST(UStringFromBytes, AnIncompleteUnitOfAnotherEncodingIsBadInput) {
    EXPECT_EQ(failureOf([] { UString<0>("a\0b", 3, Encoding::Utf16LE); }),
              badEncodingFailure({"a\0b", 3}, "UTF-16LE", "a\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([] { UString<2>("\0ab", 3, Encoding::Utf16BE); }),
              badEncodingFailure({"\0ab", 3}, "UTF-16BE", "a\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([] { UString<3>("\0\0\0ab", 5, Encoding::Utf32BE); }),
              badEncodingFailure({"\0\0\0ab", 5}, "UTF-32BE", "a\uFFFD", "\uFFFD"));
}

TEST(UStringFromBytes, OfAnotherEncodingAreConverted) {
    struct Row {
        std::string_view bytes;
        Encoding from;
        const char* text;
    };
    using namespace std::string_view_literals;
    const Row rows[] = {
        {"caf\xE9", Encoding::Iso8859_1, "caf\u00e9"},
        {"\x80", Encoding::Windows1252, "\u20ac"},
        {"\x20\xAC"sv, Encoding::Utf16BE, "\u20ac"},
        {"\0\1\xF6\0"sv, Encoding::Utf32BE, "\U0001F600"},
        {"\x82\xA0", Encoding("Shift_JIS"), "\u3042"},
        {"\xC1", Encoding("KOI8-R"), "\u0430"},
        {"<u20ac><space>", Encoding::Wwjd, "\u20ac "},
        {"+AOk-", Encoding("UTF-7"), "\u00e9"},
        {"", Encoding("Shift_JIS"), ""},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(printable(row.bytes));
        const UString<0> text(row.text);
        const char* const data = row.bytes.data();
        const std::size_t size = row.bytes.size();
        EXPECT_EQ(UString<0>(data, size, row.from), text);
        EXPECT_EQ(UString<2>(data, size, row.from), UString<2>(text));
        EXPECT_EQ(UString<3>(data, size, row.from), UString<3>(text));
        EXPECT_EQ(UString<27>(data, size, row.from), UString<27>(text));
        EXPECT_EQ(UString<29>(data, size, row.from), UString<29>(text));
        EXPECT_EQ(UString<28>(data, size, row.from).toStdString(), row.bytes);
        EXPECT_EQ(UString<30>(data, size, row.from).toStdString(), row.bytes);
    }
}

TEST(UStringFromBytes, BinaryStringsNeverConvertAndNeverFail) {
    for (const Encoding from :
         {Encoding(Encoding::Utf8), Encoding(Encoding::Binary), Encoding(Encoding::Unknown),
          Encoding(Encoding::Wwjd), Encoding(Encoding::Utf16LE), Encoding("Shift_JIS")}) {
        EXPECT_EQ(bytesOf(UString<28>("\xFF\0<uzzzz>", 9, from)), std::string("\xFF\0<uzzzz>", 9));
    }
}

TEST(UStringFromBytes, AnAnyStringCarriesTheLabelAsItIsGiven) {
    for (const std::uint32_t id : {0u, 2u, 4u, 20u, 27u, 28u, 29u, 30u}) {
        const UString<30> string("\xFF\xD8z", 3, encodingOf(id));
        EXPECT_EQ(string.encoding().id(), id) << "not evaluated";
        EXPECT_EQ(string.toStdString(), "\xFF\xD8z");
    }
    const Encoding shiftJis("Shift_JIS");
    EXPECT_EQ(UString<30>("\x82", 1, shiftJis).encoding().id(), shiftJis.id());
}

TEST(UStringFromBytes, BytesWithoutATextMeaningAreNoText) {
    const auto check = []<std::uint32_t N>() {
        SCOPED_TRACE(N);
        EXPECT_EQ(failureOf([] { UString<N>("a\x01\xE9\\", 4, Encoding::Binary); }),
                  binaryFailure("a\x01\xE9\\"));
        EXPECT_EQ(failureOf([] { UString<N>("", 0, Encoding::Binary); }), binaryFailure(""));
        EXPECT_EQ(failureOf([] { UString<N>("a", 1, Encoding::Unknown); }),
                  invalidEncodingFailure("unknown"));
    };
    check.operator()<0>();
    check.operator()<1>();
    check.operator()<2>();
    check.operator()<3>();
    check.operator()<27>();
    check.operator()<29>();
}

TEST(UStringFromBytes, AsciiIsTrustedWhereTheTargetKeepsIt) {
    EXPECT_EQ(UString<0>("caf\xE9", 4, Encoding::UsAscii).toStdString(), "caf\xE9");
    EXPECT_EQ(UString<27>("caf\xE9", 4, Encoding::UsAscii).toStdString(), "caf\xE9");
    EXPECT_EQ(failureOf([] { UString<2>("caf\xE9", 4, Encoding::UsAscii); }),
              badEncodingFailure("caf\xE9", "US-ASCII", "caf\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([] { UString<29>("caf\xE9", 4, Encoding::UsAscii); }),
              badEncodingFailure("caf\xE9", "US-ASCII", "caf\uFFFD", "\uFFFD"));
}

TEST(UStringFromLiteral, IsUtf8) {
    EXPECT_EQ(UString<0>("caf\u00e9").toStdString(), "caf\u00e9");
    EXPECT_EQ(UString<2>("caf\u00e9"), UString<2>(u"caf\u00e9", 4));
    EXPECT_EQ(UString<3>("\U0001F600"), UString<3>(U"\U0001F600", 1));
    EXPECT_EQ(UString<29>("caf\u00e9 ").toStdString(), "caf<u00e9><space>");
    EXPECT_EQ(UString<28>("caf\u00e9").toStdString(), "caf\u00e9");
    EXPECT_EQ(UString<30>("caf\u00e9").toStdString(), "caf\u00e9");
    EXPECT_EQ(UString<30>("caf\u00e9").encoding().id(), Encoding::Utf8);
    EXPECT_EQ(failureOf([] { UString<1>("caf\u00e9"); }),
              transcodingFailure("caf\u00e9", "UTF-8", "US-ASCII", "caf\x1A", "\x1A"));
    EXPECT_EQ(failureOf([] { UString<2>("\xFF"); }), badEncodingFailure("\xFF", "UTF-8", "\uFFFD", "\uFFFD"));
    EXPECT_EQ(UString<0>("\xFF").toStdString(), "\xFF");
}

TEST(UStringFromBytes, LengthIsAnIntegerAndUtf8IsTheDefault) {
    EXPECT_EQ(UString<0>("abc", 0).toStdString(), "");
    EXPECT_EQ(UString<0>("abc", 2).toStdString(), "ab");
    EXPECT_EQ(UString<2>("\u00e9", 2).size(), 1u);
    EXPECT_EQ(UString<30>("abc", 2u).encoding().id(), Encoding::Utf8);
    EXPECT_TRUE(UString<0>(nullptr, 0).isEmpty());
}

} // namespace
