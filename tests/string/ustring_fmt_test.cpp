// {fmt} writes strings of all eight types: their text as UTF-8, with the optionss of text.

#include <string/formatter_rows.h>
#include <support/failure_record.h>

#include <kvt/string/ustring_array.h>
#include <kvt/string/ustring_fmt.h>

#include <fmt/ranges.h> // knows other ranges; strings are not to be taken for one
#include <gtest/gtest.h>

#include <iterator>
#include <string>
#include <type_traits>

namespace {

using namespace kvt::test;
using kvt::ex::Encoding;
using kvt::ex::UString;

template <typename... Arguments>
std::string formatted(fmt::string_view options, const Arguments&... arguments) {
    return fmt::vformat(options, fmt::make_format_args(arguments...));
}

template <std::uint32_t N>
void writesTheRows() {
    for (const FormatRow& row : formatRows) {
        EXPECT_EQ(formatted(row.options, rowText<N>()), row.ofText)
            << N << ' ' << row.options << ": " << row.why;
    }
}

TEST(UStringFmt, WritesTextAsUtf8WhateverItsType) {
    writesTheRows<0>();
    writesTheRows<2>();
    writesTheRows<3>();
    writesTheRows<27>();
    writesTheRows<29>();
    writesTheRows<30>();
}

TEST(UStringFmt, WritesAsciiAndBytes) {
    EXPECT_EQ(formatted("{:>5}", UString<1>("abc")), "  abc");
    EXPECT_EQ(formatted("{}", UString<28>("caf\xE9\n", 5)), "caf\\xE9\\x0A");
    EXPECT_EQ(formatted("{:.5}|{:>8}", UString<28>("caf\xE9"), UString<28>("\x01")), "caf\\x|    \\x01");
}

TEST(UStringFmt, WritesZerosAndLongTexts) {
    EXPECT_EQ(formatted("{}", UString<0>("a\0b", 3)), std::string("a\0b", 3));
    EXPECT_EQ(formatted("{}", UString<2>(u"a\0b", 3)), std::string("a\0b", 3));
    const std::string text(10000, 'x');
    EXPECT_EQ(formatted("{}", UString<3>(text.c_str())), text);
    EXPECT_EQ(formatted("[{}]", UString<0>()), "[]");
}

TEST(UStringFmt, TakesWidthsFromArguments) {
    EXPECT_EQ(formatted("{:>{}}|{:.{}}", UString<0>("ab"), 4, UString<0>("abcd"), 2), "  ab|ab");
    EXPECT_EQ(formatted("{1} {0}", UString<2>("world"), UString<0>("hello")), "hello world");
}

TEST(UStringFmt, ChecksSpecificationsOfTextAtCompileTime) {
    EXPECT_EQ(fmt::format("{:>6}", UString<2>(u"caf\u00e9", 4)), "  caf\u00e9");
    std::string text;
    fmt::format_to(std::back_inserter(text), "{}", UString<0>("abc"));
    EXPECT_EQ(text, "abc");
    EXPECT_THROW(formatted("{:d}", UString<0>("abc")), fmt::format_error) << "no number";
}

TEST(UStringFmt, FailsAsTheConversionToUtf8) {
    EXPECT_EQ(failureOf([] { formatted("{}", UString<2>(u"a\xD800", 2)); }),
              badEncodingFailure({"a\0\0\xD8", 4}, "UTF-16LE", "a\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([] { formatted("{}", UString<30>("a", 1, Encoding::Unknown)); }),
              invalidEncodingFailure("unknown"));
}

} // namespace
