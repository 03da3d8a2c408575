// The tables of every code page that the installed ICU lists, for all bytes, all pairs of bytes and all code points, on
// all ways that use them: what they take is what ICU makes of it without an objection, and they take all that is one
// byte or two for one unit of UTF-16.
//
// The converters are dealt out to shards, so that the cases run side by side.
#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/encoding/detail/shortcut.h>

#include <reference/icu_reference.h>
#include <support/guarded_memory.h>

#include <unicode/ucnv.h>

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <random>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::Encoding;
using kvt::ex::detail::canGoOn;
using kvt::ex::detail::convertPrefix;
using kvt::ex::detail::EncodingProfile;
using kvt::ex::detail::Form;
using kvt::ex::detail::profileOf;
using kvt::ex::detail::Side;
using kvt::ex::detail::sideOf;

/// ICU's converter without the library, that stops at what it would lose. What it holds back counts as lost.
class Icu {
public:
    explicit Icu(const std::string& name) {
        UErrorCode error = U_ZERO_ERROR;
        converter_.reset(ucnv_open(name.c_str(), &error));
        ucnv_setToUCallBack(converter_.get(), onBadInput, this, nullptr, nullptr, &error);
        ucnv_setFromUCallBack(converter_.get(), onNotRepresentable, this, nullptr, nullptr, &error);
        EXPECT_TRUE(U_SUCCESS(error)) << name;
    }

    std::optional<std::u16string> decode(std::string_view bytes) {
        char16_t units[64];
        char16_t* target = units;
        const char* source = bytes.data();
        UErrorCode error = U_ZERO_ERROR;
        losses_ = 0;
        ucnv_toUnicode(converter_.get(), &target, units + 64, &source, bytes.data() + bytes.size(), nullptr,
                       0, &error);
        if (losses_ != 0 || U_FAILURE(error) || ucnv_toUCountPending(converter_.get(), &error) != 0) {
            ucnv_reset(converter_.get());
            return std::nullopt;
        }
        return std::u16string(units, target);
    }

    std::optional<std::string> encode(std::u16string_view text) {
        char bytes[64];
        char* target = bytes;
        const char16_t* source = text.data();
        UErrorCode error = U_ZERO_ERROR;
        losses_ = 0;
        ucnv_fromUnicode(converter_.get(), &target, bytes + 64, &source, text.data() + text.size(), nullptr,
                         0, &error);
        if (losses_ != 0 || U_FAILURE(error) || ucnv_fromUCountPending(converter_.get(), &error) != 0) {
            ucnv_reset(converter_.get());
            return std::nullopt;
        }
        return std::string(bytes, target);
    }

private:
    struct Close {
        void operator()(UConverter* converter) const { ucnv_close(converter); }
    };

    static void onBadInput(const void* context, UConverterToUnicodeArgs*, const char*, int32_t,
                           UConverterCallbackReason reason, UErrorCode*) {
        note(context, reason);
    }
    static void onNotRepresentable(const void* context, UConverterFromUnicodeArgs*, const UChar*, int32_t,
                                   UChar32, UConverterCallbackReason reason, UErrorCode*) {
        note(context, reason);
    }
    static void note(const void* context, UConverterCallbackReason reason) {
        static_cast<Icu*>(const_cast<void*>(context))->losses_ += reason <= UCNV_IRREGULAR ? 1 : 0;
    }

    std::unique_ptr<UConverter, Close> converter_;
    int losses_ = 0;
};

const Side utf8{Form::utf8};
const Side utf16{Form::utf16le};
const Side utf32{Form::utf32le};

// More than any table needs to be worth it.
constexpr std::size_t longText = std::size_t{1} << 30;

/// One encoding on all ways.
class Subject {
public:
    explicit Subject(const std::string& itsName)
        : name(itsName), icu(itsName), side(sideOf(Encoding(itsName))) {}

    bool hasSeveralBytes() const {
        return side.form == Form::asciiSeveralBytes || side.form == Form::severalBytes;
    }
    bool hasTables() const {
        return hasSeveralBytes() || side.form == Form::asciiSingleByte || side.form == Form::singleByte;
    }
    void build() const {
        EXPECT_TRUE(canGoOn(side, utf8, longText)) << name;
        EXPECT_TRUE(canGoOn(utf8, side, longText)) << name;
    }

    const std::string name;
    Icu icu;
    const Side side;
};

std::vector<std::string> canonicalNames() {
    std::set<std::string> names;
    for (const std::string& listed : availableConverters()) {
        names.insert(canonicalName(listed));
    }
    return {names.begin(), names.end()};
}

class ConversionTables : public testing::TestWithParam<std::size_t> {
public:
    static constexpr std::size_t shards = 8;

    template <typename Check>
    void forEachCodePage(Check check) {
        const std::vector<std::string> names = canonicalNames();
        std::size_t count = 0;
        for (std::size_t i = GetParam(); i < names.size(); i += shards) {
            Subject subject(names[i]);
            if (!subject.hasTables()) {
                continue;
            }
            subject.build();
            ++count;
            check(subject);
            if (HasFailure()) {
                return; // one converter's failures are enough to read
            }
        }
        EXPECT_GT(count, 15U);
    }
};
INSTANTIATE_TEST_SUITE_P(Shard, ConversionTables, testing::Range(std::size_t{0}, ConversionTables::shards));

std::string asBytes(std::u16string_view text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char16_t)};
}

struct Taken {
    std::size_t bytes;
    std::string out;
};
Taken take(Side from, Side to, std::string_view text) {
    std::string out;
    const std::size_t taken = convertPrefix(from, to, text, out);
    return {taken, out};
}

/// What the way gives for the text as a whole; nothing when it takes less.
std::optional<std::string> wayOf(Side from, Side to, std::string_view text) {
    const auto [taken, out] = take(from, to, text);
    return taken == text.size() ? std::optional(out) : std::nullopt;
}

TEST(ConversionTable, IsUsedForAllConvertersOfATableWithoutAState) {
    std::size_t single = 0;
    std::size_t several = 0;
    for (const std::string& name : canonicalNames()) {
        UErrorCode error = U_ZERO_ERROR;
        UConverter* const converter = ucnv_open(name.c_str(), &error);
        const bool hasOneByte = ucnv_getMaxCharSize(converter) == 1;
        const UConverterType type = ucnv_getType(converter);
        ucnv_close(converter);
        const Form form = sideOf(Encoding(name)).form;
        const bool isSingle = form == Form::asciiSingleByte || form == Form::singleByte;
        const bool isSeveral = form == Form::asciiSeveralBytes || form == Form::severalBytes;
        EXPECT_EQ(isSingle, hasOneByte && name != "US-ASCII") << name;
        EXPECT_EQ(isSeveral, type == UCNV_MBCS || type == UCNV_DBCS) << name;
        single += isSingle ? 1 : 0;
        several += isSeveral ? 1 : 0;
    }
    EXPECT_GT(single, 100U);
    EXPECT_GT(several, 20U);
}

// What ICU makes of a pair as far as it is characters of one byte, or one of two.
Taken expectedOf(Icu& icu, const std::vector<std::optional<std::u16string>>& alone, std::string_view pair) {
    Taken expected{0, ""};
    for (const char byte : pair) {
        const auto& unit = alone[static_cast<unsigned char>(byte)];
        if (!unit) {
            break;
        }
        expected.bytes += 1;
        expected.out += asBytes(*unit);
    }
    if (expected.bytes == 0) {
        const std::optional<std::u16string> both = icu.decode(pair);
        if (both && both->size() == 1 && (both->front() & 0xF800) != 0xD800) {
            return {2, asBytes(*both)};
        }
    }
    return expected;
}

TEST_P(ConversionTables, ReadEachByteAndEachPairAsIcuDoes) {
    forEachCodePage([](Subject& subject) {
        std::vector<std::optional<std::u16string>> alone;
        for (int first = 0; first < 256; ++first) {
            alone.push_back(subject.icu.decode(std::string(1, static_cast<char>(first))));
        }
        std::size_t taken = 0;
        for (int first = 0; first < 256; ++first) {
            // Where no character has two, each stands before a text of all others.
            if (!subject.hasSeveralBytes() && alone[static_cast<std::size_t>(first)]) {
                std::string text;
                std::u16string units;
                for (std::size_t second = 0; second < 256; ++second) {
                    if (alone[second]) {
                        text += {static_cast<char>(first), static_cast<char>(second)};
                        units += *alone[static_cast<std::size_t>(first)] + *alone[second];
                    }
                }
                ASSERT_EQ(wayOf(subject.side, utf16, text), asBytes(units)) << subject.name << ' ' << first;
                taken += text.size();
                continue;
            }
            for (int second = 0; second < 256; ++second) {
                const char pair[] = {static_cast<char>(first), static_cast<char>(second)};
                const Taken expected = expectedOf(subject.icu, alone, {pair, 2});
                const Taken way = take(subject.side, utf16, {pair, 2});
                ASSERT_EQ(way.bytes, expected.bytes) << subject.name << ' ' << hex({pair, 2});
                ASSERT_EQ(hex(way.out), hex(expected.out)) << subject.name << ' ' << hex({pair, 2});
                taken += way.bytes;
            }
        }
        EXPECT_GT(taken, 2000U) << subject.name;
    });
}

TEST_P(ConversionTables, WriteEachCodePointAsIcuDoes) {
    forEachCodePage([](Subject& subject) {
        std::size_t taken = 0;
        for (char32_t c = 0; c < 0x10000; ++c) {
            const std::u16string text(1, static_cast<char16_t>(c));
            const bool isSurrogate = c >= 0xD800 && c < 0xE000;
            const std::optional<std::string> bytes = isSurrogate ? std::nullopt : subject.icu.encode(text);
            const std::optional<std::string> way = wayOf(utf16, subject.side, asBytes(text));
            // Two bytes of which the first is 0 are left to ICU, as are longer characters.
            const bool isTaken =
                bytes && !bytes->empty() && bytes->size() <= 2 && (bytes->size() == 1 || bytes->front() != 0);
            ASSERT_EQ(way.has_value(), isTaken) << subject.name << ' ' << hex(asBytes(text));
            if (way) {
                ++taken;
                ASSERT_EQ(hex(*way), hex(*bytes)) << subject.name << ' ' << hex(asBytes(text));
            }
        }
        EXPECT_GT(taken, 60U) << subject.name;
        // Beyond these there are two units, which no table has.
        const char32_t step = subject.hasSeveralBytes() ? 1 : 61;
        for (char32_t c = 0x10000; c <= 0x10FFFF; c += step) {
            std::string out;
            ASSERT_EQ(convertPrefix(utf32, subject.side, {reinterpret_cast<const char*>(&c), sizeof c}, out),
                      0U)
                << subject.name << ' ' << static_cast<std::uint32_t>(c);
        }
    });
}

// Each character stands alone, in a text of all that the table has, and where a text ends.
TEST_P(ConversionTables, AgreeWithIcuOnTextsOfAllTheirCharacters) {
    std::vector<std::string> characters;
    for (char32_t c = 1; c < 0x10000; ++c) {
        if (c < 0xD800 || c > 0xDFFF) {
            characters.push_back(encodeWithIcu("UTF-8", std::u16string(1, static_cast<char16_t>(c))));
        }
    }
    const std::vector<std::string> forms = {"UTF-8", "UTF-16LE", "UTF-16BE", "UTF-32LE", "UTF-32BE"};
    forEachCodePage([&](Subject& subject) {
        const bool hasAscii = subject.icu.encode(u"0129").has_value();
        const std::string digits = hasAscii ? "0123456789" : "";
        std::string text;
        for (const std::string& character : characters) {
            if (wayOf(utf8, subject.side, character)) {
                text += character;
            } else {
                // In a block the character is where the way ends as well.
                ASSERT_EQ(take(utf8, subject.side, digits + character + std::string(80, '0')).bytes,
                          digits.size())
                    << subject.name << ' ' << hex(character);
            }
        }
        for (const std::size_t shift : {0U, 1U, 3U, 8U, 15U, 17U}) {
            const std::string shifted =
                hasAscii ? std::string(shift, '1') + text + std::string(33 - shift, '2') : text;
            const Raw raw = convertWithIcu("UTF-8", subject.name, shifted);
            ASSERT_EQ(raw.calls, 0) << subject.name;
            const std::optional<std::string> way = wayOf(utf8, subject.side, shifted);
            ASSERT_TRUE(way.has_value()) << subject.name << ' ' << shift;
            ASSERT_TRUE(*way == raw.bytes) << subject.name << ' ' << shift;
            const std::string& form = forms[shift % forms.size()];
            const Side other = sideOf(Encoding(form));
            // What some character is written as may be read as another one, or be more than the tables read.
            const Raw back = convertWithIcu(subject.name, form, raw.bytes);
            if (const std::optional<std::string> read = wayOf(subject.side, other, raw.bytes)) {
                ASSERT_TRUE(*read == back.bytes) << subject.name << ' ' << form << ' ' << shift;
            }
            ASSERT_TRUE(wayOf(other, subject.side, convertWithIcu("UTF-8", form, shifted).bytes) == raw.bytes)
                << subject.name << ' ' << form << ' ' << shift;
        }
    });
}

// What is a pair's second byte depends on all bytes before it, a block of them at a time; so characters of one byte and
// of two in any order, with one that is not known somewhere, at the end of memory that can be touched.
TEST_P(ConversionTables, FindTheCharactersOfEachLengthInAnyOrder) {
    GuardedMemory memory(1 << 14);
    forEachCodePage([&](Subject& subject) {
        std::mt19937_64 random(3);
        for (int round = 0; round < 60; ++round) {
            std::string text = encodeWithIcu(subject.name, ownText(subject.name, random() % 400, random()));
            if (round % 3 == 0 && !text.empty()) {
                text[random() % text.size()] = static_cast<char>(random());
            }
            text.resize(text.size() - std::min<std::size_t>(text.size(), random() % 2));
            char* const in = memory.end() - text.size();
            text.copy(in, text.size());
            const Taken way = take(subject.side, utf16, {in, text.size()});
            const Raw raw =
                convertWithIcu(subject.name, "UTF-16LE", std::string_view(text).substr(0, way.bytes));
            ASSERT_EQ(raw.calls, 0) << subject.name << ' ' << hex(text, 1000);
            ASSERT_EQ(hex(way.out, 2000), hex(raw.bytes, 2000)) << subject.name << ' ' << hex(text, 1000);
            // Nothing that could be taken is left.
            const std::string_view rest = std::string_view(text).substr(way.bytes, 2);
            ASSERT_EQ(take(subject.side, utf16, rest).bytes, 0U) << subject.name << ' ' << hex(text, 1000);
        }
    });
}

TEST_P(ConversionTables, ConvertBetweenEachOther) {
    std::vector<std::unique_ptr<Subject>> others;
    for (const char* name : {"windows-1252", "IBM037", "IBM424", "Shift_JIS", "EUC-JP", "GB18030"}) {
        others.push_back(std::make_unique<Subject>(name));
        others.back()->build();
    }
    forEachCodePage([&](Subject& subject) {
        const std::string own = encodeWithIcu(subject.name, ownText(subject.name, 300, 5));
        for (const std::unique_ptr<Subject>& other : others) {
            if (other->name == subject.name) {
                continue;
            }
            for (std::size_t begin = 0; begin < own.size(); begin += 3) {
                const std::string_view text = std::string_view(own).substr(begin, 40);
                const Taken way = take(subject.side, other->side, text);
                const Raw raw = convertWithIcu(subject.name, other->name, text.substr(0, way.bytes));
                ASSERT_EQ(raw.calls, 0) << subject.name << ' ' << other->name << ' ' << hex(text);
                ASSERT_EQ(hex(way.out), hex(raw.bytes))
                    << subject.name << ' ' << other->name << ' ' << hex(text);
            }
        }
    });
}

TEST(ConversionTable, IsNotBuiltForAscii) {
    const Side side = sideOf(Encoding("ISO-8859-10"));
    const std::string ascii = "No more than this was ever met, 0123456789 times.";
    EXPECT_EQ(wayOf(side, utf8, ascii), ascii);
    EXPECT_EQ(wayOf(utf8, side, ascii), ascii);
    EXPECT_EQ(wayOf(side, utf16, ascii).value_or("").size(), 2 * ascii.size());
    EXPECT_EQ(side.profile->decoding(), nullptr);
    EXPECT_EQ(side.profile->encoding(), nullptr);
    EXPECT_EQ(wayOf(side, utf16, "\xC0"), std::nullopt);
    EXPECT_TRUE(canGoOn(side, utf16, 1));
    EXPECT_EQ(wayOf(side, utf16, "\xC0"), std::string("\x00\x01", 2));
    EXPECT_EQ(side.profile->encoding(), nullptr) << "nothing was converted that way";
}

// One that nothing else in this program converts.
TEST(ConversionTable, OfSeveralBytesIsBuiltWhenEnoughTextWouldHaveUsedIt) {
    const Side side = sideOf(Encoding("ibm-33722_P12A_P12A-2009_U2"));
    ASSERT_EQ(side.form, Form::asciiSeveralBytes);
    const std::string text = "a\xA4\xA2";
    std::size_t noted = 0;
    while (!canGoOn(side, utf8, 10000)) {
        noted += 10000;
        ASSERT_EQ(take(side, utf8, text).bytes, 1U) << "ASCII needs no table";
        ASSERT_LT(noted, std::size_t{1} << 21);
    }
    EXPECT_GT(noted, 100000U);
    EXPECT_EQ(wayOf(side, utf8, text), "a\xE3\x81\x82");
    EXPECT_EQ(side.profile->encoding(), nullptr);
    EXPECT_TRUE(canGoOn(side, utf8, 1));
    EXPECT_TRUE(canGoOn(utf8, side, longText)) << "a long text is enough";
    EXPECT_EQ(wayOf(utf8, side, "a\xE3\x81\x82"), text);
}

// Again one that nothing else in this program converts.
TEST(ConversionTable, OfSeveralBytesIsBuiltForManyShortTextsToo) {
    const Side side = sideOf(Encoding("EUC-TW"));
    ASSERT_EQ(side.form, Form::asciiSeveralBytes);
    std::size_t texts = 1;
    while (!canGoOn(side, utf8, 2)) {
        ++texts;
        ASSERT_LT(texts, 20000U);
    }
    EXPECT_GT(texts, 1000U);
}

TEST(ConversionTable, OfAnEncodingThatNobodyHasIsNone) {
    for (const auto id : {static_cast<Encoding::Type>(0x7FFFFFFF), Encoding::Unknown, Encoding::Binary}) {
        EXPECT_EQ(sideOf(id).form, Form::other);
        EXPECT_FALSE(canGoOn(sideOf(id), utf8, longText));
        EXPECT_EQ(wayOf(sideOf(id), utf16, "a"), std::nullopt);
        EXPECT_EQ(wayOf(utf8, sideOf(id), "a"), std::nullopt);
    }
}

} // namespace
} // namespace kvt::test
