// The ways around ICU, one by one: the longest prefix, the same bytes as ICU's, and nothing that ICU would have an
// objection to. The private function is called directly, since from outside the rest of a text hides how much of it
// went around ICU.
#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/encoding/detail/shortcut.h>

#include <reference/icu_reference.h>
#include <support/guarded_memory.h>

#include <unicode/ucnv.h>
#include <unicode/uset.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::detail::convertFew;
using kvt::ex::detail::convertPrefix;
using kvt::ex::detail::Form;
using kvt::ex::detail::Side;

struct NamedForm {
    Form form;
    const char* name; ///< of a converter of that form
    std::size_t unit;
    const char* bad; ///< a unit that no character begins with

    bool hasTables() const { return form != Form::asciiCompatible && form < Form::utf8; }
    Side side() const {
        if (!hasTables()) {
            return {form};
        }
        const Side side = kvt::ex::detail::sideOf(kvt::ex::Encoding(name));
        EXPECT_EQ(side.form, form) << name;
        constexpr std::size_t longText = std::size_t{1} << 30;
        EXPECT_TRUE(kvt::ex::detail::canGoOn(side, side, longText)) << name;
        return side;
    }
};
std::ostream& operator<<(std::ostream& stream, const NamedForm& form) {
    return stream << form.name;
}

const NamedForm forms[] = {
    {Form::asciiCompatible, "windows-1252", 1, "\xFF"},
    {Form::asciiSingleByte, "ISO-8859-7", 1, "\xAE"},
    {Form::asciiSingleByte, "windows-1253", 1, "\xFF"},
    {Form::asciiSeveralBytes, "EUC-KR", 1, "\xFF"},
    {Form::singleByte, "IBM424", 1, "\x70"},
    {Form::severalBytes, "Shift_JIS", 1, "\xFD"},
    {Form::utf8, "UTF-8", 1, "\xFF"},
    {Form::utf16le, "UTF-16LE", 2, "\xDC\xDC"},
    {Form::utf16be, "UTF-16BE", 2, "\xDC\xDC"},
    {Form::utf32le, "UTF-32LE", 4, "\xFF\xFF\xFF\xFF"},
    {Form::utf32be, "UTF-32BE", 4, "\xFF\xFF\xFF\xFF"},
};

class ShortcutPair : public testing::TestWithParam<std::tuple<NamedForm, NamedForm>> {
public:
    NamedForm from() const { return std::get<0>(GetParam()); }
    NamedForm to() const { return std::get<1>(GetParam()); }
    bool onlyAscii() const {
        return from().form == Form::asciiCompatible || to().form == Form::asciiCompatible;
    }

    bool bothCanSay(char16_t c) const {
        const std::string bytes(reinterpret_cast<const char*>(&c), sizeof c);
        return convertWithIcu("UTF-16LE", from().name, bytes).calls == 0 &&
               convertWithIcu("UTF-16LE", to().name, bytes).calls == 0;
    }

    /// The longest prefix that ICU converts without a word, ASCII only where that is the way. Quadratic.
    std::string longestQuietPrefix(std::string_view bytes) const {
        std::string longest;
        for (std::size_t length = 1; length <= bytes.size(); ++length) {
            const std::string_view prefix = bytes.substr(0, length);
            if (convertWithIcu(from().name, to().name, prefix).calls != 0 ||
                (onlyAscii() && !isAscii(encodedAs16(prefix)))) {
                continue;
            }
            longest = prefix;
        }
        return longest;
    }

    /// The same for `ascii` ASCII characters in front of characters beyond U+FFFF, of which there is none or all.
    std::string longestQuietPrefixOf(std::size_t ascii, const std::string& bytes) const {
        if (convertWithIcu(from().name, to().name, bytes).calls == 0) {
            return bytes;
        }
        return longestQuietPrefix(std::string_view(bytes).substr(0, ascii * from().unit));
    }

    void check(std::string_view bytes) const {
        const std::string expected = longestQuietPrefix(bytes);
        std::string out = "before";
        const std::size_t taken = convertPrefix(from().side(), to().side(), bytes, out);
        EXPECT_EQ(taken, expected.size()) << hex(bytes);
        EXPECT_EQ(hex(out.substr(6)), hex(convertWithIcu(from().name, to().name, expected).bytes))
            << hex(bytes);
        EXPECT_EQ(out.substr(0, 6), "before");
    }

private:
    std::u16string encodedAs16(std::string_view bytes) const {
        const std::string text = convertWithIcu(from().name, "UTF-16LE", bytes).bytes;
        std::u16string units(text.size() / 2, u'\0');
        text.copy(reinterpret_cast<char*>(units.data()), units.size() * 2);
        return units;
    }
    static bool isAscii(const std::u16string& text) {
        return std::all_of(text.begin(), text.end(), [](char16_t c) { return c < 0x80; });
    }
};
INSTANTIATE_TEST_SUITE_P(Forms, ShortcutPair,
                         testing::Combine(testing::ValuesIn(forms), testing::ValuesIn(forms)));

TEST_P(ShortcutPair, TakesTheLongestPrefixThatIcuConvertsQuietly) {
    const std::u16string characters[] = {
        u"a",      u"\u007F", u"\u0080",     u"\u07FF",     u"\u0800",
        u"\uD7FF", u"\uE000", u"\uFDD0",     u"\uFEFF",     u"\uFFFD",
        u"\uFFFE", u"\uFFFF", u"\U00010000", u"\U0010FFFF", std::u16string(1, u'\0')};
    for (const std::u16string& first : characters) {
        for (const std::u16string& second : characters) {
            const std::string bytes = encodeWithIcu(from().name, first + second);
            check(bytes);
            check("\xFF" + bytes);
            check(bytes + "\xFF");
            for (std::size_t cut = 1; cut < bytes.size(); ++cut) {
                check(std::string_view(bytes).substr(0, cut));
            }
        }
    }
}

TEST_P(ShortcutPair, AgreesOnRandomUnits) {
    std::mt19937_64 random(11);
    // Bytes near the borders of what is well-formed, in all orders.
    const std::string_view bytes(
        "\x00\x01\x41\x7F\x80\x8F\x90\x9F\xA0\xBF\xC0\xC2\xD7\xD8\xDB\xDC\xDF\xE0\xED\xEF"
        "\xF0\xF4\xF5\xFE\xFF\x10\x11",
        27);
    for (int round = 0; round < 3000; ++round) {
        std::string text(1 + random() % 9, '\0');
        for (char& byte : text) {
            byte = random() % 4 == 0 ? '\0' : bytes[random() % bytes.size()];
        }
        check(text);
        if (HasFailure()) {
            return;
        }
    }
}

TEST_P(ShortcutPair, TakesAllOfALongTextFromAnyAlignmentToAnyLength) {
    for (const char16_t filler : {u'x', u'\u00B0', u'\u4E2D'}) {
        if (filler != u'x' && (onlyAscii() || !bothCanSay(filler))) {
            continue;
        }
        for (const std::size_t length :
             {0u, 1u, 15u, 16u, 17u, 31u, 33u, 2047u, 2048u, 4095u, 4097u, 8191u, 8192u, 8193u, 40000u}) {
            const std::string bytes = encodeWithIcu(from().name, std::u16string(length, filler));
            for (std::size_t shift = 0; shift < 3; ++shift) {
                const std::string shifted = std::string(shift, ' ') + bytes;
                std::string out;
                EXPECT_EQ(
                    convertPrefix(from().side(), to().side(), std::string_view(shifted).substr(shift), out),
                    bytes.size())
                    << length;
                EXPECT_EQ(hex(out), hex(encodeWithIcu(to().name, std::u16string(length, filler)))) << length;
            }
        }
    }
}

// The result goes into what the string has, or into a new place; the text ends where memory does.
TEST_P(ShortcutPair, TakesAShortTextOfEachLengthBehindWhatTheStringHolds) {
    std::u16string filler;
    for (const char16_t c : {u'x', u'\u00B0', u'y', u'z', u'\u4E2D', u'\u03B1', u'\u20AC'}) {
        if (c < 0x80 || (!onlyAscii() && bothCanSay(c))) {
            filler += c;
        }
    }
    const Side source = from().side();
    const Side target = to().side();
    GuardedMemory memory(1 << 12);
    for (std::size_t length = 1; length <= 131; ++length) {
        std::u16string text;
        for (std::size_t i = 0; i < length; ++i) {
            text += filler[(i * i / 5 + length) % filler.size()];
        }
        const std::string bytes = encodeWithIcu(from().name, text);
        const std::string expected = encodeWithIcu(to().name, text);
        char* const in = memory.end() - bytes.size();
        bytes.copy(in, bytes.size());
        for (const std::size_t held : {0U, 1U, 7U, 15U, 16U, 60U}) {
            std::string out(held, '!');
            out.shrink_to_fit();
            ASSERT_EQ(convertPrefix(source, target, {in, bytes.size()}, out), bytes.size()) << length;
            ASSERT_EQ(hex(out, 1000), hex(std::string(held, '!') + expected, 1000)) << length;
        }
    }
}

TEST_P(ShortcutPair, StopsAtTheFirstBadPlaceWhereverItIsInABlock) {
    for (std::size_t place = 0; place < 70; ++place) {
        std::u16string text(place, u'x');
        const std::string good = encodeWithIcu(from().name, text);
        const std::string rest = encodeWithIcu(from().name, std::u16string(40, u'y'));
        std::string out;
        const std::string bad = from().bad;
        EXPECT_EQ(convertPrefix(from().side(), to().side(), good + bad + rest, out), good.size()) << place;
        EXPECT_EQ(hex(out), hex(encodeWithIcu(to().name, text))) << place;
    }
}

TEST_P(ShortcutPair, SeesTheOneOtherCharacterInABlockOfAscii) {
    for (const char16_t other : {u'\u20AC', u'\u00B0', u'\u0080', u'\u0100', u'\u8000'}) {
        const std::string alone(reinterpret_cast<const char*>(&other), sizeof other);
        if (convertWithIcu("UTF-16LE", from().name, alone).calls != 0) {
            continue;
        }
        const bool stops = onlyAscii() || !bothCanSay(other);
        for (std::size_t place = 0; place < 66; ++place) {
            std::u16string text(48, place % 2 == 0 ? u'x' : u'\0');
            text[place / 2] = other;
            const std::string bytes = encodeWithIcu(from().name, text);
            std::string out;
            const std::size_t taken = convertPrefix(from().side(), to().side(), bytes, out);
            const std::u16string expected = stops ? text.substr(0, place / 2) : text;
            EXPECT_EQ(taken, encodeWithIcu(from().name, expected).size()) << place;
            EXPECT_EQ(hex(out), hex(encodeWithIcu(to().name, expected))) << place;
        }
    }
}

TEST_P(ShortcutPair, FillsUnitsOfTheWidthOfTheTargetAndNoOthers) {
    const std::u16string text = u"A unit is one of these 0123456789.";
    const std::string bytes = encodeWithIcu(from().name, text);
    const std::string expected = encodeWithIcu(to().name, text);
    std::u16string out16 = u"!";
    std::u32string out32 = U"!";
    EXPECT_EQ(convertPrefix(from().side(), to().side(), bytes, out16), to().unit == 2 ? bytes.size() : 0);
    EXPECT_EQ(convertPrefix(from().side(), to().side(), bytes, out32), to().unit == 4 ? bytes.size() : 0);
    out16.erase(0, 1);
    out32.erase(0, 1);
    EXPECT_EQ(hex({reinterpret_cast<const char*>(out16.data()), out16.size() * 2}, 1000),
              to().unit == 2 ? hex(expected, 1000) : "");
    EXPECT_EQ(hex({reinterpret_cast<const char*>(out32.data()), out32.size() * 4}, 1000),
              to().unit == 4 ? hex(expected, 1000) : "");
}

// More units of UTF-16 than characters; a write behind the room for these is seen by the address sanitizer.
TEST_P(ShortcutPair, CharactersOfTwoUnitsTakeOneRoom) {
    for (const std::size_t pairs : {1U, 15U, 16U, 17U, 40U, 700U, 3000U}) {
        std::u16string text;
        for (std::size_t i = 0; i < pairs; ++i) {
            text += u"\U0001F600";
        }
        for (const std::u16string& before : {std::u16string(), std::u16string(u"abc")}) {
            const std::string bytes = encodeWithIcu(from().name, before + text);
            const std::string expected = longestQuietPrefixOf(before.size(), bytes);
            std::string out;
            const std::size_t taken = convertPrefix(from().side(), to().side(), bytes, out);
            EXPECT_EQ(taken, expected.size()) << pairs;
            EXPECT_EQ(hex(out), hex(convertWithIcu(from().name, to().name, expected).bytes)) << pairs;
        }
    }
}

TEST(Shortcut, OtherFormsHaveNone) {
    for (const NamedForm& form : forms) {
        std::string out;
        EXPECT_EQ(convertPrefix(Side{}, form.side(), "abcd", out), 0U) << form;
        EXPECT_EQ(convertPrefix(form.side(), Side{}, "abcd", out), 0U) << form;
        EXPECT_EQ(out, "");
    }
}

TEST(Shortcut, EmptyTextGivesNothing) {
    for (const NamedForm& from : forms) {
        for (const NamedForm& to : forms) {
            std::string out;
            EXPECT_EQ(convertPrefix(from.side(), to.side(), {}, out), 0U);
            EXPECT_EQ(out, "");
        }
    }
}

TEST(Shortcut, AllUtf8LeadsAndTrailsAreReadAsIcuReadsThem) {
    // Each lead byte with each class of trail bytes in each of three places, in full and one short.
    const std::string_view trails("\x00\x7F\x80\x8F\x90\x9F\xA0\xBF\xC0\xFF", 10);
    for (int lead = 0; lead < 256; ++lead) {
        for (const char first : trails) {
            for (const char second : trails) {
                for (const char third : trails) {
                    const char bytes[] = {static_cast<char>(lead), first, second, third};
                    for (std::size_t length = 1; length <= 4; ++length) {
                        const std::string_view text(bytes, length);
                        std::string out;
                        const bool whole =
                            convertPrefix(Side{Form::utf8}, Side{Form::utf16le}, text, out) == length;
                        const Raw raw = convertWithIcu("UTF-8", "UTF-16LE", text);
                        ASSERT_EQ(whole, raw.calls == 0) << hex(text);
                        if (whole) {
                            ASSERT_EQ(hex(out), hex(raw.bytes)) << hex(text);
                        }
                    }
                }
            }
        }
    }
}

// The tables look at UTF-8 by themselves, near the end of a text in another way than before it.
TEST(Shortcut, TablesTakeNoUtf8ThatIcuObjectsTo) {
    const std::string_view trails("\x00\x7F\x80\x8F\x90\x9F\xA0\xBF\xC0\xFF", 10);
    for (const NamedForm& form : forms) {
        if (!form.hasTables()) {
            continue;
        }
        const Side side = form.side();
        for (int lead = 0x80; lead < 256; ++lead) {
            for (const char first : trails) {
                for (const char second : trails) {
                    const char bytes[] = {static_cast<char>(lead), first, second};
                    for (const std::string& text :
                         {std::string(bytes, 1), std::string(bytes, 2), std::string(bytes, 3),
                          std::string(bytes, 3) + "0123456789"}) {
                        std::string out;
                        if (convertPrefix(Side{Form::utf8}, side, text, out) == text.size()) {
                            const Raw raw = convertWithIcu("UTF-8", form.name, text);
                            ASSERT_EQ(raw.calls, 0) << form << ' ' << hex(text);
                            ASSERT_EQ(hex(out), hex(raw.bytes)) << form << ' ' << hex(text);
                        }
                    }
                }
            }
        }
    }
}

// Between losses: as much as convertPrefix() takes, but no more than begins in sixteen bytes.
TEST(Shortcut, AFewCharactersAreThoseOfAPrefix) {
    std::mt19937_64 random(13);
    const std::vector<std::string> pieces = {"a",      "bcd",      "0123456789", "\u00e9",     "\u07ff",
                                             "\u4e2d", "\uffff",   "\U00010000", "\U0010ffff", "\xff",
                                             "\xc3",   "\xe4\xb8", "\xed\xa0",   "\x80",       "\xf4\x90"};
    for (const Form to : {Form::utf8, kvt::ex::detail::nativeUtf16, kvt::ex::detail::nativeUtf32}) {
        for (int round = 0; round < 20000; ++round) {
            std::string text;
            for (std::size_t count = random() % 12; count > 0; --count) {
                text += pieces[random() % (random() % 3 == 0 ? pieces.size() : 9)];
            }
            std::string whole;
            const std::size_t prefix = convertPrefix(Side{Form::utf8}, Side{to}, text, whole);
            std::string out = "x";
            const std::size_t taken = convertFew(Side{Form::utf8}, Side{to}, text, out);
            ASSERT_GE(taken, std::min<std::size_t>(prefix, 16)) << hex(text);
            ASSERT_LE(taken, prefix) << hex(text);
            std::string expected = "x";
            ASSERT_EQ(convertPrefix(Side{Form::utf8}, Side{to}, text.substr(0, taken), expected), taken);
            ASSERT_EQ(hex(out), hex(expected)) << hex(text);
        }
    }
    std::string out;
    EXPECT_EQ(convertFew(Side{Form::utf8}, Side{Form::asciiCompatible}, "abc", out), 0U);
    EXPECT_EQ(convertFew(Side{kvt::ex::detail::nativeUtf16}, Side{Form::utf8}, "a", out), 0U);
    EXPECT_EQ(out, "");
}

TEST(Shortcut, AllCodePointsKeepTheirNumberOnAllWays) {
    std::string all;
    for (char32_t c = 0; c <= 0x10FFFF; ++c) {
        if (c < 0xD800 || c > 0xDFFF) {
            all.append(reinterpret_cast<const char*>(&c), sizeof c);
        }
    }
    for (const NamedForm& form : forms) {
        if (form.form == Form::asciiCompatible || form.hasTables()) {
            continue;
        }
        std::string there;
        std::string back;
        ASSERT_EQ(convertPrefix(Side{Form::utf32le}, form.side(), all, there), all.size()) << form;
        ASSERT_TRUE(there == convertWithIcu("UTF-32LE", form.name, all).bytes) << form;
        ASSERT_EQ(convertPrefix(form.side(), Side{Form::utf32le}, there, back), there.size()) << form;
        ASSERT_TRUE(back == all) << form;
    }
}

// What lets an ASCII character be taken before it is known what follows it.

struct Close {
    void operator()(UConverter* converter) const { ucnv_close(converter); }
    void operator()(USet* set) const { uset_close(set); }
};

TEST(Shortcut, NoConverterJoinsAnAsciiCharacterWithTheNext) {
    std::size_t sequences = 0;
    for (const std::string& name : availableConverters()) {
        UErrorCode error = U_ZERO_ERROR;
        const std::unique_ptr<UConverter, Close> converter(ucnv_open(name.c_str(), &error));
        const std::unique_ptr<USet, Close> set(uset_openEmpty());
        error = U_ZERO_ERROR;
        ucnv_getUnicodeSet(converter.get(), set.get(), UCNV_ROUNDTRIP_AND_FALLBACK_SET, &error);
        for (int32_t i = 0; i < uset_getItemCount(set.get()); ++i) {
            UChar32 first = 0;
            UChar32 last = 0;
            UChar text[32];
            error = U_ZERO_ERROR;
            if (uset_getItem(set.get(), i, &first, &last, text, 32, &error) >= 2) {
                ++sequences;
                EXPECT_GE(text[0], 0x80) << name;
            }
        }
    }
    // ICU 72 has some that begin with kana; without any the look at the tables would prove nothing.
    EXPECT_GT(sequences, 0U);
}

TEST(Shortcut, NoConverterThatKeepsAsciiJoinsAnAsciiByteWithTheNext) {
    std::size_t keepers = 0;
    for (const std::string& name : availableConverters()) {
        UErrorCode error = U_ZERO_ERROR;
        const std::unique_ptr<UConverter, Close> converter(ucnv_open(name.c_str(), &error));
        const auto decode = [&](std::string_view bytes) {
            UChar buffer[16];
            error = U_ZERO_ERROR;
            const int32_t length = ucnv_toUChars(converter.get(), buffer, 16, bytes.data(),
                                                 static_cast<int32_t>(bytes.size()), &error);
            return std::u16string(buffer, static_cast<std::size_t>(length));
        };
        bool keepsAscii = true;
        for (char byte = 0; byte >= 0 && keepsAscii; ++byte) {
            keepsAscii = decode({&byte, 1}) == std::u16string(1, static_cast<char16_t>(byte));
            if (byte == 127) {
                break;
            }
        }
        if (!keepsAscii) {
            continue;
        }
        ++keepers;
        for (int first = 0; first < 128; ++first) {
            for (int second = 0; second < 256; ++second) {
                // The third byte completes the character where the second begins one.
                const char bytes[] = {static_cast<char>(first), static_cast<char>(second), '\xA4'};
                ASSERT_EQ(decode({bytes, 3}), static_cast<char16_t>(first) + decode({bytes + 1, 2}))
                    << name << ' ' << hex({bytes, 3});
            }
        }
    }
    EXPECT_GT(keepers, 50U);
}

} // namespace
} // namespace kvt::test
