// The tables of every single-byte converter that the installed ICU lists, for all bytes and all units of UTF-16, on all
// ways that use them: what they take is what ICU makes of it without an objection, and they take all that some byte is.
#include <kvt/encoding/detail/icu.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/encoding/detail/single_byte_table.h>

#include <reference/icu_reference.h>

#include <unicode/ucnv.h>

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::Encoding;
using kvt::ex::detail::convertPrefix;
using kvt::ex::detail::Form;
using kvt::ex::detail::Side;
using kvt::ex::detail::SingleByteTable;

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

/// One encoding on all ways.
class Subject {
public:
    explicit Subject(const std::string& itsName)
        : name(itsName), icu(itsName), form_(kvt::ex::detail::icu::Converter(Encoding(itsName)).form()),
          table_(Encoding(itsName)) {}

    bool isSingleByte() const { return form_ == Form::asciiSingleByte || form_ == Form::singleByte; }
    bool keepsAscii() const { return form_ == Form::asciiSingleByte; }
    Side side() { return {form_, &table_}; }
    const SingleByteTable& table() const { return table_; }

    const std::string name;
    Icu icu;

private:
    Form form_;
    SingleByteTable table_;
};

template <typename Check>
void forEachSingleByteConverter(Check check) {
    std::size_t count = 0;
    std::set<std::string> names;
    for (const std::string& listed : availableConverters()) {
        const std::string name = canonicalName(listed);
        if (!names.insert(name).second) {
            continue;
        }
        Subject subject(name);
        if (!subject.isSingleByte()) {
            continue;
        }
        ++count;
        check(subject);
        if (testing::Test::HasFailure()) {
            return; // one converter's failures are enough to read
        }
    }
    EXPECT_GT(count, 100U);
}

std::string asBytes(std::u16string_view text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char16_t)};
}

/// What the way gives for the text as a whole; nothing when it takes less.
std::optional<std::string> wayOf(Side from, Side to, std::string_view text) {
    std::string out;
    const std::size_t taken = convertPrefix(from, to, text, out);
    EXPECT_TRUE(taken == text.size() || (taken == 0 && out.empty())) << taken;
    return taken == text.size() ? std::optional(out) : std::nullopt;
}

const Side utf8{Form::utf8};
const Side utf16{Form::utf16le};
const Side utf32{Form::utf32le};

TEST(SingleByteTables, AreUsedForAllConvertersOfOneByteButAscii) {
    std::set<std::string> singleByte;
    forEachSingleByteConverter([&](Subject& subject) { singleByte.insert(subject.name); });
    for (const std::string& listed : availableConverters()) {
        const std::string name = canonicalName(listed);
        UErrorCode error = U_ZERO_ERROR;
        UConverter* const converter = ucnv_open(name.c_str(), &error);
        const bool hasOneByte = ucnv_getMaxCharSize(converter) == 1;
        ucnv_close(converter);
        EXPECT_EQ(singleByte.count(name) == 1, hasOneByte && name != "US-ASCII") << name;
    }
}

TEST(SingleByteTables, ReadEachByteAsIcuDoes) {
    forEachSingleByteConverter([](Subject& subject) {
        for (int i = 0; i < 256; ++i) {
            const std::string byte(1, static_cast<char>(i));
            const std::optional<std::u16string> text = subject.icu.decode(byte);
            const std::optional<std::string> way16 = wayOf(subject.side(), utf16, byte);
            ASSERT_EQ(way16.has_value(), text.has_value()) << subject.name << ' ' << hex(byte);
            ASSERT_EQ(wayOf(subject.side(), utf8, byte).has_value(), text.has_value())
                << subject.name << ' ' << i;
            if (!text) {
                continue;
            }
            ASSERT_EQ(hex(*way16), hex(asBytes(*text))) << subject.name << ' ' << hex(byte);
            ASSERT_EQ(hex(*wayOf(subject.side(), utf8, byte)), hex(encodeWithIcu("UTF-8", *text)))
                << subject.name << ' ' << hex(byte);
            ASSERT_EQ(hex(*wayOf(subject.side(), utf32, byte)), hex(encodeWithIcu("UTF-32LE", *text)))
                << subject.name << ' ' << hex(byte);
        }
    });
}

TEST(SingleByteTables, WriteEachUnitAsIcuDoesWhereSomeByteIsThatUnit) {
    forEachSingleByteConverter([](Subject& subject) {
        std::set<std::u16string> own;
        for (int i = 0; i < 256; ++i) {
            own.insert(subject.icu.decode(std::string(1, static_cast<char>(i))).value_or(u""));
        }
        std::size_t taken = 0;
        for (char32_t c = 0; c < 0x10000; ++c) {
            const std::u16string text(1, static_cast<char16_t>(c));
            const bool isSurrogate = c >= 0xD800 && c < 0xE000;
            const std::optional<std::string> bytes = isSurrogate ? std::nullopt : subject.icu.encode(text);
            const std::optional<std::string> way = wayOf(utf16, subject.side(), asBytes(text));
            // What ICU makes of a character that is no byte's own is left to ICU, whatever it is.
            ASSERT_EQ(way.has_value(), bytes.has_value() && own.count(text) == 1)
                << subject.name << ' ' << hex(asBytes(text));
            if (way) {
                ++taken;
                ASSERT_EQ(hex(*way), hex(*bytes)) << subject.name << ' ' << hex(asBytes(text));
            }
            if (isSurrogate) {
                continue;
            }
            ASSERT_EQ(wayOf(utf32, subject.side(), {reinterpret_cast<const char*>(&c), sizeof c}), way)
                << subject.name << ' ' << hex(asBytes(text));
        }
        ASSERT_GT(taken, 60U) << subject.name;
    });
}

// UTF-8 has a way of its own for blocks, and in ICU too; so each character stands alone, in a block, and at its end.
TEST(SingleByteTables, AgreeWithIcuOnAllOfUtf8AtAllPlaces) {
    std::vector<std::string> characters;
    for (char32_t c = 1; c < 0x10000; ++c) {
        if (c < 0xD800 || c > 0xDFFF) {
            characters.push_back(encodeWithIcu("UTF-8", std::u16string(1, static_cast<char16_t>(c))));
        }
    }
    forEachSingleByteConverter([&](Subject& subject) {
        std::string text;
        for (const std::string& character : characters) {
            const std::optional<std::string> way = wayOf(utf8, subject.side(), character);
            if (way) {
                text += character;
            } else {
                std::string out;
                // In a block the character is where the way ends as well.
                const std::string block = "0123456789" + character + std::string(80, '0');
                ASSERT_EQ(convertPrefix(utf8, subject.side(), block, out), 10U)
                    << subject.name << ' ' << character;
            }
        }
        for (std::size_t shift = 0; shift < 70; ++shift) {
            const std::string shifted = std::string(shift, '1') + text + std::string(70 - shift, '2');
            const Raw raw = convertWithIcu("UTF-8", subject.name, shifted);
            ASSERT_EQ(raw.calls, 0) << subject.name;
            const std::optional<std::string> way = wayOf(utf8, subject.side(), shifted);
            ASSERT_TRUE(way.has_value()) << subject.name << ' ' << shift;
            ASSERT_EQ(*way, raw.bytes) << subject.name << ' ' << shift;
            ASSERT_EQ(wayOf(subject.side(), utf8, raw.bytes),
                      convertWithIcu(subject.name, "UTF-8", raw.bytes).bytes)
                << subject.name << ' ' << shift;
        }
    });
}

TEST(SingleByteTables, ConvertBetweenEachOther) {
    std::vector<std::unique_ptr<Subject>> others;
    for (const char* name : {"windows-1252", "windows-1251", "IBM037", "IBM424"}) {
        others.push_back(std::make_unique<Subject>(name));
    }
    forEachSingleByteConverter([&](Subject& subject) {
        for (const std::unique_ptr<Subject>& other : others) {
            for (int i = 0; i < 256 && other->name != subject.name; ++i) {
                const std::string byte(1, static_cast<char>(i));
                const std::optional<std::string> way = wayOf(subject.side(), other->side(), byte);
                const Raw raw = convertWithIcu(subject.name, other->name, byte);
                ASSERT_EQ(way.has_value(), raw.calls == 0) << subject.name << ' ' << other->name << ' ' << i;
                if (way) {
                    ASSERT_EQ(hex(*way), hex(raw.bytes)) << subject.name << ' ' << other->name << ' ' << i;
                }
            }
        }
    });
}

TEST(SingleByteTables, AreNotBuiltForAscii) {
    forEachSingleByteConverter([](Subject& subject) {
        const std::string ascii = "No more than this was ever met, 0123456789 times.";
        if (!subject.keepsAscii()) {
            return;
        }
        EXPECT_EQ(wayOf(subject.side(), utf8, ascii), ascii);
        EXPECT_EQ(wayOf(utf8, subject.side(), ascii), ascii);
        EXPECT_EQ(wayOf(subject.side(), utf16, ascii).value_or("").size(), 2 * ascii.size());
        EXPECT_FALSE(subject.table().isBuilt()) << subject.name;
        EXPECT_EQ(wayOf(subject.side(), utf16, "\xC0").has_value(), subject.icu.decode("\xC0").has_value());
        EXPECT_TRUE(subject.table().isBuilt()) << subject.name;
    });
}

TEST(SingleByteTables, OfAnEncodingThatIcuLacksAreEmpty) {
    SingleByteTable table{Encoding(Encoding::Unknown)};
    const Side side{Form::singleByte, &table};
    EXPECT_EQ(wayOf(side, utf16, "a"), std::nullopt);
    EXPECT_EQ(wayOf(utf8, side, "a"), std::nullopt);
}

} // namespace
} // namespace kvt::test
