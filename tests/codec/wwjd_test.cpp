// The wwjd codec: the table of names both ways, every string of a small alphabet against a plain decoder,
// what a token of four odd characters means, the failure, and the decoder for bytes with its storage for each
// thread.

#include <kvt/codec/wwjd.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <reference/wwjd_reference.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <chrono>
#include <random>
#include <string>
#include <thread>
#include <vector>

namespace {

using namespace kvt::test;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::detail::utf16ToWwjd;
using kvt::ex::detail::wwjdDecode;
using kvt::ex::detail::wwjdToBytes;
using kvt::ex::detail::wwjdToUtf16;

std::u16string units(const UString<2>& string) {
    return {string.begin(), string.end()};
}

std::u16string decoded(std::string_view text) {
    return units(wwjdToUtf16(text));
}

constexpr std::string_view replacement = "\xEF\xBF\xBD";

struct NamedToken {
    const char* token;
    int unit;
};

constexpr NamedToken namedTokens[] = {
    {"<lt>", 60},          {"<gt>", 62},          {"<quote>", 34},        {"<amp>", 38},
    {"<backslash>", 92},   {"<solidus>", 47},     {"<apos>", 39},         {"<dollar>", 36},
    {"<at>", 64},          {"<space>", 32},       {"<comma>", 44},        {"<openparen>", 40},
    {"<closeparen>", 41},  {"<openbracket>", 91}, {"<closebracket>", 93}, {"<opencurly>", 123},
    {"<closecurly>", 125}, {"<semicolon>", 59},   {"<lf>", 10},           {"<cr>", 13},
    {"<tab>", 9},          {"<bell>", 7},         {"<backspace>", 8},     {"<verttab>", 11},
    {"<formfeed>", 12},
};
static_assert(std::size(namedTokens) == 25);

TEST(WwjdNames, EachStandsForItsCharacterBothWays) {
    for (const NamedToken& row : namedTokens) {
        SCOPED_TRACE(row.token);
        const std::u16string unit(1, static_cast<char16_t>(row.unit));
        EXPECT_EQ(utf16ToWwjd(unit), row.token);
        EXPECT_EQ(decoded(row.token), unit);
        EXPECT_EQ(wwjdToBytes(row.token), std::string(1, static_cast<char>(row.unit)));
        EXPECT_EQ(decoded('x' + std::string(row.token) + 'y'), u"x" + unit + u"y");
    }
}

TEST(WwjdNames, AreMatchedByExactBytes) {
    for (const NamedToken& row : namedTokens) {
        std::string token = row.token;
        for (const std::string& other :
             {token.substr(0, 1) + static_cast<char>(token[1] - 32) + token.substr(2), "< " + token.substr(1),
              token.substr(0, token.size() - 1) + " >", token.substr(0, 1) + token.substr(2),
              token.substr(0, token.size() - 1) + std::string(1, '\0') + ">"}) {
            SCOPED_TRACE(printable(other));
            EXPECT_EQ(decoded(other), std::u16string(other.begin(), other.end()));
            EXPECT_EQ(wwjdToBytes(other), other);
        }
    }
}

TEST(WwjdEncode, EveryUnitIsNamedSpelledOrItself) {
    for (unsigned value = 0; value <= 0xFFFF; ++value) {
        const std::u16string unit(1, static_cast<char16_t>(value));
        const std::string encoded = utf16ToWwjd(unit);
        ASSERT_EQ(encoded, reference::wwjdEncoded(unit)) << "unit " << value;
        ASSERT_EQ(decoded(encoded), unit) << "unit " << value;
    }
}

TEST(WwjdEncode, WritesWhatIsStated) {
    using namespace std::string_literals;
    EXPECT_EQ(utf16ToWwjd(u"a b"), "a<space>b");
    EXPECT_EQ(utf16ToWwjd(u"\u00e9"), "<u00e9>");
    EXPECT_EQ(utf16ToWwjd(u"<"), "<lt>");
    EXPECT_EQ(utf16ToWwjd(u"\x7F\u0080"), "\x7F<u0080>");
    EXPECT_EQ(utf16ToWwjd(u"\U0001F600"), "<ud83d><ude00>");
    EXPECT_EQ(utf16ToWwjd(std::u16string_view(u"\0\x01\x1F", 3)), "\0\x01\x1F"s);
    EXPECT_EQ(utf16ToWwjd({}), "");
}

TEST(WwjdEncode, NeedsNoPairedSurrogates) {
    EXPECT_EQ(utf16ToWwjd(std::u16string{0xDC00, u'a', 0xD800}), "<udc00>a<ud800>");
}

TEST(WwjdEncode, GivesBackTheMemoryOfALongText) {
    const std::string encoded = utf16ToWwjd(std::u16string(100000, u'a'));
    EXPECT_EQ(encoded, std::string(100000, 'a'));
    EXPECT_LT(encoded.capacity(), 110000u);
}

TEST(WwjdDecode, EdgeCases) {
    using namespace std::string_view_literals;
    struct Row {
        std::string_view in;
        std::u16string_view out;
    };
    const Row rows[] = {
        {"", u""},
        {"<unknown>", u"<unknown>"},
        {"<lt", u"<lt"},
        {"<<lt>>", u"<<>"},
        {"<", u"<"},
        {">", u">"},
        {"<>", u"<>"},
        {"><", u"><"},
        {"<<>>", u"<<>>"},
        {"<lt><", u"<<"},
        {"<lt>>", u"<>"},
        {"<lt<gt>", u"<lt>"},
        {"<unknown<lt>x>", u"<unknown<x>"},
        {"a<u>b", u"ab"},
        {"<u>", u""},
        {"<u><u><u>", u""},
        {"<U>", u"<U>"},
        {"<u12>", u"<u12>"},
        {"<u1>", u"<u1>"},
        {"<u123>", u"<u123>"},
        {"<u12345>", u"<u12345>"},
        {"<u00e9>", u"\u00e9"},
        {"<u00E9>", u"\u00e9"},
        {"<U00e9>", u"<U00e9>"},
        {"<ud83d><ude00>", u"\U0001F600"},
        {"<u0041><u0042>", u"AB"},
        {"<u0000>", u"\0"sv},
        {"a\0b"sv, u"a\0b"sv},
        {"<amp>lt<semicolon>", u"&lt;"},
        {"<lt>space<gt>", u"<space>"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(printable(row.in));
        EXPECT_EQ(decoded(row.in), row.out);
    }
}

TEST(WwjdDecode, ATokenOfFourOddCharactersIsReadAsStoiReadsIt) {
    using namespace std::string_view_literals;
    struct Row {
        std::string_view token;
        unsigned unit;
    };
    const Row rows[] = {
        {"<u12zz>", 0x0012},    {"<u1zzz>", 0x0001},     {"<u-001>", 0xFFFF}, {"<u-fff>", 0xF001},
        {"<u+0fF>", 0x00FF},    {"<u 12a>", 0x012A},     {"<u   f>", 0x000F}, {"<u\t12a>", 0x012A},
        {"<u\n\v\f1>", 0x0001}, {"<u0x1f>", 0x001F},     {"<u0XaB>", 0x00AB}, {"<u0xzz>", 0x0000},
        {"<u-0x1>", 0xFFFF},    {"<u12 3>", 0x0012},     {"<u-0zz>", 0x0000}, {"<u1<2a>", 0x0001},
        {"<u1\0\0\0>"sv, 1},    {"<u1\xE9\xE9\xE9>", 1}, {"<uffff>", 0xFFFF}, {"<uFFFE>", 0xFFFE},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(printable(row.token));
        EXPECT_EQ(decoded(row.token), std::u16string(1, static_cast<char16_t>(row.unit)));
    }
}

TEST(WwjdDecode, ATokenWithoutANumberIsAnInvalidArgument) {
    using namespace std::string_view_literals;
    for (const std::string_view token :
         {"<uzzzz>"sv, "<u    >"sv, "<u-+12>"sv, "<u - 1>"sv, "<ux123>"sv, "<ug000>"sv,
          "<u\0"
          "001>"sv,
          "<u\xE9\xE9\xE9\xE9>"sv, "<u<<<<>"sv}) {
        ASSERT_EQ(token.size(), 7u) << printable(token);
        SCOPED_TRACE(printable(token));
        EXPECT_EQ(failureOf([&] { wwjdToUtf16(token); }), invalidArgument("invalid stoi argument"));
        const std::string later = "\xE9<lt>" + std::string(token) + "x";
        EXPECT_EQ(failureOf([&] { wwjdToUtf16(later); }), invalidArgument("invalid stoi argument"));
        EXPECT_EQ(failureOf([&] { UString<2>(UString<29>(token.data(), token.size(), Encoding::Wwjd)); }),
                  invalidArgument("invalid stoi argument"));
        EXPECT_EQ(wwjdToBytes(token), token);
    }
}

TEST(WwjdDecode, BytesBeyondAsciiFailWhenAllIsDecoded) {
    struct Row {
        std::string_view in;
        std::string_view tail;
        std::string lossy;
    };
    const std::string fffd(replacement);
    const Row rows[] = {
        {"\xE9", "\xE9", fffd},
        {"a\xC3\xA9 b", "a\xC3\xA9 b", "a" + fffd + fffd + " b"},
        {"\xE9<lt>tail", "tail", fffd + "<tail"},
        {"<lt>\xE9", "\xE9", "<" + fffd},
        {"\xE9<lt>", "", fffd + "<"},
        {"\x80<space>\xFF<u00e9>x", "x", fffd + " " + fffd + "\u00e9x"},
        {"\xE9<unknown>x", "unknown>x", fffd + "<unknown>x"},
        {"\xE9<open", "\xE9<open", fffd + "<open"},
        {"a<lt>b\xE9<open", "b\xE9<open", "a<b" + fffd + "<open"},
        {"<x\xE9>", "x\xE9>", "<x" + fffd + ">"},
        {"\xE9<u>\x01", "\x01", fffd + "\x01"},
        // The decoded text goes into the failure as UTF-8, which has no form for an unpaired surrogate.
        {"\xE9<ud800>", "", fffd + fffd},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(printable(row.in));
        EXPECT_EQ(failureOf([&] { wwjdToUtf16(row.in); }),
                  badEncodingFailure(row.tail, "zqt-wwjd", row.lossy, replacement));
    }
}

TEST(WwjdDecode, BytesBeyondAsciiInsideATokenAreNoFailure) {
    EXPECT_EQ(decoded("<u1\xE9\xE9\xE9>"), u"\x01");
    EXPECT_EQ(wwjdToBytes("<u1\xE9\xE9\xE9>"), "<u1\xE9\xE9\xE9>");
}

/// Calls `check` with each string of up to `longest` characters of `alphabet`.
template <typename Check>
void forEachString(std::string_view alphabet, std::size_t longest, Check check) {
    std::vector<std::size_t> digits;
    while (digits.size() <= longest) {
        std::string text;
        for (const std::size_t digit : digits) {
            text += alphabet[digit];
        }
        check(text);
        std::size_t at = 0;
        while (at < digits.size() && ++digits[at] == alphabet.size()) {
            digits[at++] = 0;
        }
        if (at == digits.size()) {
            digits.assign(digits.size() + 1, 0);
        }
    }
}

void expectAsReference(const std::string& text) {
    reference::WwjdDecoded expected;
    const FailureRecord numberFailure = failureOf([&] { expected = reference::wwjdDecoded(text); });
    std::u16string actual;
    const FailureRecord failure = failureOf([&] { actual = decoded(text); });
    if (!numberFailure.type.empty()) {
        ASSERT_EQ(failure, numberFailure) << printable(text);
    } else if (expected.bad) {
        const std::string lossy =
            UString<0>(UString<2>(expected.text.data(), expected.text.size())).toStdString();
        ASSERT_EQ(failure, badEncodingFailure(expected.tail, "zqt-wwjd", lossy, replacement))
            << printable(text);
    } else {
        ASSERT_EQ(failure, noFailure()) << printable(text);
        ASSERT_EQ(actual, expected.text) << printable(text);
    }
    ASSERT_EQ(wwjdToBytes(text), reference::wwjdDecodedBytes(text)) << printable(text);
}

TEST(WwjdDecode, AgreesWithAPlainDecoderOnEveryShortString) {
    forEachString("<>ult0", 6, [](const std::string& text) {
        if (!HasFatalFailure()) {
            expectAsReference(text);
        }
    });
    forEachString("<>a\xE9", 6, [](const std::string& text) {
        if (!HasFatalFailure()) {
            expectAsReference(text);
        }
    });
}

TEST(WwjdDecode, AgreesWithAPlainDecoderOnEveryFourCharactersOfAToken) {
    forEachString("0fx- z\xE9", 4, [](const std::string& text) {
        if (!HasFatalFailure()) {
            expectAsReference("a<u" + text + ">b");
        }
    });
}

TEST(WwjdDecode, AgreesWithAPlainDecoderOnRandomTokens) {
    const std::vector<std::string> pieces = {"<",  ">",   "<lt>",           "<space>",  "u",
                                             "<u", "<u>", "<u00e9>",        "<ud800>",  "a",
                                             "lt", "12",  "<closebracket>", "<unknown>"};
    std::mt19937 random(20240501);
    for (int round = 0; round < 20000 && !HasFatalFailure(); ++round) {
        std::string text;
        for (auto count = random() % 12; count > 0; --count) {
            text += pieces[random() % pieces.size()];
        }
        expectAsReference(text);
    }
}

TEST(WwjdRoundTrip, EveryTextOfUnitsSurvives) {
    std::mt19937 random(7);
    for (int round = 0; round < 3000; ++round) {
        std::u16string text;
        for (auto count = random() % 40; count > 0; --count) {
            const unsigned kind = random() % 4;
            const auto unit = static_cast<unsigned>(random());
            text += static_cast<char16_t>(kind == 0   ? unit & 0xFFFF
                                          : kind == 1 ? 0xD800 + (unit & 0x7FF)
                                          : kind == 2 ? unit & 0x7F
                                                      : u"<>ult0 "[unit % 7]);
        }
        const std::string encoded = utf16ToWwjd(text);
        ASSERT_EQ(encoded, reference::wwjdEncoded(text));
        ASSERT_EQ(encoded.find_first_of(" ,;\"'&\\/$@()[]{}\n\r\t"), std::string::npos);
        ASSERT_EQ(decoded(encoded), text) << encoded;
    }
}

TEST(WwjdDecode, TakesTimeInProportionToTheTextWhateverBracketsStandInIt) {
    const std::size_t length = std::size_t{1} << 22;
    const auto repeated = [&](std::string_view piece) {
        std::string text;
        while (text.size() < length) {
            text += piece;
        }
        return text;
    };
    const std::string texts[] = {
        repeated("<") + ">",  repeated("<"),         repeated("<a") + ">",
        repeated("<v") + ">", repeated("<lt") + ">", repeated("<>"),
    };
    for (const std::string& text : texts) {
        SCOPED_TRACE(text.substr(0, 12));
        const auto start = std::chrono::steady_clock::now();
        const std::u16string expected(text.begin(), text.end());
        // A search to the closing bracket from each opening one would take minutes.
        if (text.substr(0, 3) == "<lt") {
            EXPECT_EQ(decoded(text), expected.substr(0, expected.size() - 4) + u"<");
        } else {
            EXPECT_EQ(decoded(text), expected);
            EXPECT_EQ(wwjdToBytes(text), text);
        }
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(20));
    }
}

TEST(WwjdToBytes, ReplacesNamesAndCopiesEverythingElse) {
    using namespace std::string_view_literals;
    struct Row {
        std::string_view in;
        std::string_view out;
    };
    const Row rows[] = {
        {"", ""},
        {"<quote>x<comma>", "\"x,"},
        {"<u0041>", "<u0041>"},
        {"<u>", "<u>"},
        {"<uzzzz>", "<uzzzz>"},
        {"\xE9<lt>\xFF", "\xE9<\xFF"},
        {"<unknown>", "<unknown>"},
        {"<lt", "<lt"},
        {"<<lt>>", "<<>"},
        {"<u<lt>x", "<u<x"},
        {"a\0<tab>\0"sv, "a\0\t\0"sv},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(printable(row.in));
        EXPECT_EQ(wwjdToBytes(row.in), row.out);
    }
}

std::string decodedView(std::string_view text) {
    const char* data = nullptr;
    std::uint64_t size = 0;
    wwjdDecode<char>(text, data, size);
    return {data, size};
}

TEST(WwjdDecodeView, GivesTheDecodedBytes) {
    EXPECT_EQ(decodedView("<quote>x<comma>"), "\"x,");
    EXPECT_EQ(decodedView(""), "");
    EXPECT_EQ(decodedView("<u0041>\xE9"), "<u0041>\xE9");
    EXPECT_EQ(decodedView(std::string(100000, 'x') + "<lt>"), std::string(100000, 'x') + "<");
}

TEST(WwjdDecodeView, ResultStaysWhileOtherThreadsDecode) {
    const char* data = nullptr;
    std::uint64_t size = 0;
    wwjdDecode<char>("mine<comma>", data, size);
    std::vector<std::thread> threads;
    for (int number = 0; number < 4; ++number) {
        threads.emplace_back([number, data] {
            for (int round = 0; round < 500; ++round) {
                const std::string text = std::to_string(number) + "<at>" + std::to_string(round);
                const char* own = nullptr;
                std::uint64_t ownSize = 0;
                wwjdDecode<char>(text, own, ownSize);
                EXPECT_NE(own, data);
                std::this_thread::yield();
                EXPECT_EQ(std::string(own, ownSize), std::to_string(number) + "@" + std::to_string(round));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(std::string(data, size), "mine,");
}

TEST(WwjdString, ConversionsGoThroughTheCodec) {
    EXPECT_EQ(UString<29>(UString<0>("caf\u00e9 <x>")).toStdString(), "caf<u00e9><space><lt>x<gt>");
    EXPECT_EQ(UString<0>(UString<29>("caf<u00e9><u>", 13, Encoding::Wwjd)).toStdString(), "caf\u00e9");
    EXPECT_EQ(UString<29>("\U0001F600").toStdString(), "<ud83d><ude00>");
}

} // namespace
