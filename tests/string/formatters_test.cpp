// {fmt} and std::format write strings of all eight types: their text as UTF-8, with the options of text. One body for
// both. Where the run-time has no <format>, the tests of std::format are skipped.
#include <support/failure_record.h>

#include <kvt/string/ustring_array.h>
#include <kvt/string/ustring_fmt.h>
#include <kvt/string/ustring_format.h>

#include <fmt/ranges.h> // knows other ranges; strings are not to be taken for one
#include <gtest/gtest.h>

#ifdef __cpp_lib_format
#include <format>
#endif

#include <iterator>
#include <string>
#include <string_view>

namespace {

using namespace kvt::test;
using kvt::ex::Encoding;
using kvt::ex::UString;

struct Fmt {
    using Error = fmt::format_error;

    template <typename... Arguments>
    static std::string format(std::string_view options, const Arguments&... arguments) {
        return fmt::vformat(options, fmt::make_format_args(arguments...));
    }
    static std::string formatCheckedByTheCompiler(const UString<2>& string) {
        return fmt::format("{:>6}", string);
    }
    static void append(std::string& text, const UString<0>& string) {
        fmt::format_to(std::back_inserter(text), "{}", string);
    }
};

#ifdef __cpp_lib_format
struct StdFormat {
    using Error = std::format_error;

    template <typename... Arguments>
    static std::string format(std::string_view options, const Arguments&... arguments) {
        return std::vformat(options, std::make_format_args(arguments...));
    }
    static std::string formatCheckedByTheCompiler(const UString<2>& string) {
        return std::format("{:>6}", string);
    }
    static void append(std::string& text, const UString<0>& string) {
        std::format_to(std::back_inserter(text), "{}", string);
    }
};
#else
TEST(UStringStdFormatter, IsTested) {
    GTEST_SKIP() << "this compiler's library has no <format>";
}
#endif

template <typename Library>
class Formatter : public testing::Test {
public:
    template <typename... Arguments>
    static std::string formatted(std::string_view options, const Arguments&... arguments) {
        return Library::format(options, arguments...);
    }

    template <std::uint32_t N>
    static void expectTheRows();
};
TYPED_TEST_SUITE_P(Formatter);

struct FormatRow {
    const char* options;
    const char* ofText; ///< for "caf\u00e9 <"
    const char* why;
};

// Options of text; all eight types write one text alike.
constexpr FormatRow formatRows[] = {
    {"{}", "caf\u00e9 <", "as it is"},
    {"{:s}", "caf\u00e9 <", "the presentation of strings"},
    {"{:>10}", "    caf\u00e9 <", "a width counts characters, not bytes"},
    {"{:<10}|", "caf\u00e9 <    |", "to the left"},
    {"{:^10}|", "  caf\u00e9 <  |", "in the middle"},
    {"{:*^10}", "**caf\u00e9 <**", "with a fill"},
    {"{:.4}", "caf\u00e9", "a precision counts characters, not bytes"},
    {"{:.0}", "", "nothing at all"},
    {"{:-<6.3}", "caf---", "all together"},
    {"{:2}", "caf\u00e9 <", "a width that is too small"},
};

// The text of the rows in each type that holds text.
template <std::uint32_t N>
UString<N> rowText() {
    if constexpr (N == Encoding::Unknown) {
        return {"caf\xE9 <", 6, Encoding::Windows1252};
    } else {
        return UString<N>("caf\u00e9 <");
    }
}

template <typename Library>
template <std::uint32_t N>
void Formatter<Library>::expectTheRows() {
    for (const FormatRow& row : formatRows) {
        EXPECT_EQ(formatted(row.options, rowText<N>()), row.ofText)
            << N << ' ' << row.options << ": " << row.why;
    }
}

TYPED_TEST_P(Formatter, WritesTextAsUtf8WhateverItsType) {
    this->template expectTheRows<0>();
    this->template expectTheRows<2>();
    this->template expectTheRows<3>();
    this->template expectTheRows<27>();
    this->template expectTheRows<29>();
    this->template expectTheRows<30>();
}

TYPED_TEST_P(Formatter, WritesAsciiAndBytes) {
    EXPECT_EQ(this->formatted("{:>5}", UString<1>("abc")), "  abc");
    EXPECT_EQ(this->formatted("{}", UString<28>("caf\xE9\n", 5)), "caf\\xE9\\x0A");
    EXPECT_EQ(this->formatted("{:.5}|{:>8}", UString<28>("caf\xE9"), UString<28>("\x01")),
              "caf\\x|    \\x01");
}

TYPED_TEST_P(Formatter, WritesZerosAndLongTexts) {
    EXPECT_EQ(this->formatted("{}", UString<0>("a\0b", 3)), std::string("a\0b", 3));
    EXPECT_EQ(this->formatted("{}", UString<2>(u"a\0b", 3)), std::string("a\0b", 3));
    const std::string text(10000, 'x');
    EXPECT_EQ(this->formatted("{}", UString<3>(text.c_str())), text);
    EXPECT_EQ(this->formatted("[{}]", UString<0>()), "[]");
}

TYPED_TEST_P(Formatter, TakesWidthsFromArguments) {
    EXPECT_EQ(this->formatted("{:>{}}|{:.{}}", UString<0>("ab"), 4, UString<0>("abcd"), 2), "  ab|ab");
    EXPECT_EQ(this->formatted("{1} {0}", UString<2>("world"), UString<0>("hello")), "hello world");
}

TYPED_TEST_P(Formatter, TakesOptionsThatTheCompilerChecks) {
    EXPECT_EQ(TypeParam::formatCheckedByTheCompiler(UString<2>(u"caf\u00e9", 4)), "  caf\u00e9");
    std::string text;
    TypeParam::append(text, UString<0>("abc"));
    EXPECT_EQ(text, "abc");
    EXPECT_THROW(this->formatted("{:d}", UString<0>("abc")), typename TypeParam::Error) << "not a number";
}

TYPED_TEST_P(Formatter, FailsAsTheConversionToUtf8) {
    EXPECT_EQ(failureOf([&] { this->formatted("{}", UString<2>(u"a\xD800", 2)); }),
              badEncodingFailure({"a\0\0\xD8", 4}, "UTF-16LE", "a\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([&] { this->formatted("{}", UString<30>("a", 1, Encoding::Unknown)); }),
              invalidEncodingFailure("unknown"));
}

REGISTER_TYPED_TEST_SUITE_P(Formatter, WritesTextAsUtf8WhateverItsType, WritesAsciiAndBytes,
                            WritesZerosAndLongTexts, TakesWidthsFromArguments,
                            TakesOptionsThatTheCompilerChecks, FailsAsTheConversionToUtf8);
INSTANTIATE_TYPED_TEST_SUITE_P(UStringFmt, Formatter, testing::Types<Fmt>);
#ifdef __cpp_lib_format
INSTANTIATE_TYPED_TEST_SUITE_P(UStringStd, Formatter, testing::Types<StdFormat>);
#endif

} // namespace
