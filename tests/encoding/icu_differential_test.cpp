// The library's conversions against ICU's own functions (tests/reference), for every converter that the installed
// ICU lists: the same bytes, the same failure, the same parameters, the same lossy text.
//
// The converters are dealt out to shards, so that the cases run side by side.
#include <reference/icu_reference.h>
#include <support/outcome.h>

#include <kvt/encoding/icu_transcoder.h>
#include <kvt/string/ustring.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::AnyString;
using kvt::ex::Encoding;
using kvt::ex::ICUTranscoder;
using kvt::ex::UStringView;

// Where the insides end: pivot units, output units, and bytes of a chunk on the way around ICU.
constexpr std::size_t borders[] = {1024, 4096, 8192};

template <typename CharIn, typename CharOut>
Outcome transcode(const std::string& from, const std::string& to, std::string_view bytes) {
    std::vector<CharIn> units(bytes.size() / sizeof(CharIn));
    if (!units.empty()) {
        std::memcpy(units.data(), bytes.data(), units.size() * sizeof(CharIn));
    }
    std::basic_string<CharOut> out(3, CharOut('x')); // must not show in the result
    Outcome outcome = outcomeOf([&] {
        ICUTranscoder transcoder(Encoding{std::string_view(from)}, Encoding{std::string_view(to)});
        transcoder.transcode(kvt::future::basic_string_view<CharIn>(units.data(), units.size()), out);
    });
    outcome.bytes.assign(reinterpret_cast<const char*>(out.data()), out.size() * sizeof(CharOut));
    return outcome;
}

Outcome assign(const std::string& from, const std::string& to, std::string_view bytes) {
    const AnyString source(UStringView<30>(bytes.data(), bytes.size()), Encoding(from));
    AnyString target{Encoding(to)};
    Outcome outcome = outcomeOf([&] { target.assign(source); });
    outcome.bytes = target.toStdString();
    return outcome;
}

std::size_t unitOf(const std::string& name) {
    return name == "UTF-16LE" || name == "UTF-16BE" ? 2 : name == "UTF-32LE" || name == "UTF-32BE" ? 4 : 1;
}

/// Compares all ways that there are between two encodings, for one text.
void compare(const std::string& from, const std::string& to, std::string_view bytes,
             const std::string& what) {
    const std::string where =
        what + ": " + from + " to " + to + ", " + std::to_string(bytes.size()) + " bytes " + hex(bytes, 48);
    const Outcome expected = expectedTranscode(from, to, bytes);
    EXPECT_EQ((transcode<char, char>(from, to, bytes)), expected) << where;
    EXPECT_EQ(assign(from, to, bytes), expectedAssign(from, to, bytes)) << where << " by assign";

    const std::size_t in = unitOf(from);
    const std::size_t out = unitOf(to);
    if (bytes.size() % in != 0) {
        return;
    }
    if (out == 2) {
        EXPECT_EQ((transcode<char, char16_t>(from, to, bytes)), expected) << where << " char to char16_t";
    }
    if (out == 4) {
        EXPECT_EQ((transcode<char, char32_t>(from, to, bytes)), expected) << where << " char to char32_t";
    }
    if (in == 2) {
        EXPECT_EQ((transcode<char16_t, char>(from, to, bytes)), expected) << where << " char16_t to char";
    }
    if (in == 4) {
        EXPECT_EQ((transcode<char32_t, char>(from, to, bytes)), expected) << where << " char32_t to char";
    }
    if (in == 2 && out == 4) {
        EXPECT_EQ((transcode<char16_t, char32_t>(from, to, bytes)), expected)
            << where << " char16_t to char32_t";
    }
    if (in == 4 && out == 2) {
        EXPECT_EQ((transcode<char32_t, char16_t>(from, to, bytes)), expected)
            << where << " char32_t to char16_t";
    }
}

/// Text of many scripts, with everything that some converter treats in a way of its own: U+FEFF at the start,
/// ignorable characters, U+FFFD, noncharacters, NUL, controls, supplementary and unassigned characters.
const std::u16string mixedText =
    u"\uFEFFAbc \u00E9\u00FF\u0100 \u20AC \u0416\u0436 \u03B1\u03A9 \u05D0\u0634 \u0915\u094D\u0937 \u0E01 "
    u"\u304B\u309A\u30AB\uFF76\u4E2D\u6587\uAC00\uE000\uF8FF e\u0301 "
    u"\u00AD\u200B\u034F\uFFFD\uFDD0\uFFFE\uFFFF "
    u"\U0001F600\U00020000\U000E0100\U0010FFFF\u0378 ~{}\\[^]+&\u007F\u0080\u0085\u2028 "
    u"\x01\x0E\x0F\x1A\x1B\r\n" +
    std::u16string(1, u'\0') + u"end";

std::u16string slice(std::size_t start, std::size_t count) {
    return mixedText.substr(start % mixedText.size(), count);
}

std::string asUtf16(std::u16string_view text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * 2};
}

std::string randomBytes(std::mt19937_64& random, std::size_t length) {
    std::string bytes(length, '\0');
    // Half of the texts have ASCII between, half are noise.
    const bool tame = random() % 2 == 0;
    for (char& byte : bytes) {
        byte = static_cast<char>(tame && random() % 2 == 0 ? ' ' + random() % 95 : random());
    }
    return bytes;
}

/// Every converter, dealt out.
class IcuDifferential : public testing::TestWithParam<std::size_t> {
public:
    static constexpr std::size_t shards = 16;

    template <typename Check>
    void forEachConverter(Check check) {
        const std::vector<std::string> all = availableConverters();
        ASSERT_GT(all.size(), 100U);
        for (std::size_t i = GetParam(); i < all.size(); i += shards) {
            const std::string name = canonicalName(all[i]);
            ASSERT_FALSE(name.empty()) << all[i];
            ASSERT_EQ(Encoding(all[i]).getName(), name) << all[i];
            check(name, canonicalName(all[(i + 1) % all.size()]), i);
            if (HasFailure()) {
                return; // one converter's failures are enough to read
            }
        }
    }
};
INSTANTIATE_TEST_SUITE_P(Shard, IcuDifferential, testing::Range(std::size_t{0}, IcuDifferential::shards));

TEST_P(IcuDifferential, ValidTextOfTheConverterItself) {
    forEachConverter([](const std::string& name, const std::string& next, std::size_t seed) {
        for (const std::size_t length : {1U, 2U, 3U, 7U, 60U, 300U}) {
            const std::u16string text = ownText(name, length, seed * 100 + length);
            const std::string bytes = encodeWithIcu(name, text);
            for (const std::string& to :
                 {std::string("UTF-8"), std::string("UTF-16LE"), std::string("UTF-32BE"),
                  std::string("US-ASCII"), std::string("windows-1252"), next}) {
                compare(name, to, bytes, "own text");
            }
            for (const std::string from : {"UTF-8", "UTF-16LE", "UTF-16BE", "UTF-32LE"}) {
                compare(from, name, encodeWithIcu(from, text), "own text");
            }
        }
    });
}

TEST_P(IcuDifferential, TextOfAllScripts) {
    forEachConverter([](const std::string& name, const std::string&, std::size_t) {
        for (const char* from : {"UTF-8", "UTF-16LE", "UTF-32LE", "gb18030", "CESU-8"}) {
            const std::string source = canonicalName(from);
            compare(source, name, encodeWithIcu(source, mixedText), "all scripts");
            for (std::size_t start = 0; start < mixedText.size(); start += 3) {
                compare(source, name, encodeWithIcu(source, slice(start, 1 + start % 4)), "some scripts");
            }
        }
    });
}

TEST_P(IcuDifferential, RandomBytes) {
    forEachConverter([](const std::string& name, const std::string& next, std::size_t seed) {
        std::mt19937_64 random(seed);
        for (int round = 0; round < 60; ++round) {
            const std::string bytes = randomBytes(random, 1 + random() % (round % 10 == 0 ? 400 : 24));
            for (const std::string& to : {std::string("UTF-8"), std::string("UTF-16LE"),
                                          std::string("UTF-32LE"), std::string("US-ASCII"), next}) {
                compare(name, to, bytes, "random bytes");
            }
            compare("UTF-8", name, bytes, "random bytes");
            compare("UTF-16LE", name, bytes, "random bytes");
        }
    });
}

TEST_P(IcuDifferential, DamagedText) {
    forEachConverter([](const std::string& name, const std::string&, std::size_t seed) {
        std::mt19937_64 random(seed);
        for (int round = 0; round < 60; ++round) {
            std::string bytes = encodeWithIcu(name, ownText(name, 1 + random() % 20, random()));
            if (bytes.empty()) {
                continue;
            }
            switch (random() % 4) {
            case 0:
                bytes.pop_back();
                break;
            case 1:
                bytes.erase(random() % bytes.size(), 1);
                break;
            case 2:
                bytes[random() % bytes.size()] = static_cast<char>(random());
                break;
            default:
                bytes.insert(random() % bytes.size(), 1, static_cast<char>(random()));
                break;
            }
            compare(name, "UTF-8", bytes, "damaged text");
            compare(name, "UTF-16LE", bytes, "damaged text");
            compare(name, "US-ASCII", bytes, "damaged text");
        }
    });
}

/// Text that has a character of several bytes or units across a border: filling, then the converter's own text.
class Straddling {
public:
    enum Filling { ascii, own, lost };

    static std::u16string text(const std::string& name, std::size_t length, Filling filling,
                               std::uint64_t seed) {
        std::u16string text;
        if (filling == own) {
            text = ownText(name, length, seed);
            text.resize(std::min(text.size(), length));
            if (!text.empty() && (text.back() & 0xFC00) == 0xD800) {
                text.back() = u'a';
            }
        } else if (filling == lost) {
            // Most converters have no form for this one, and write a substitution each time.
            text.assign(length, u'\u0378');
        }
        text.resize(length, u'a');
        return text + ownText(name, 12, seed + 1);
    }
};

void compareAcrossBorders(const std::string& name, Straddling::Filling filling, std::size_t seed) {
    for (const std::size_t border : borders) {
        for (std::size_t length = border - 4; length <= border + 4; ++length) {
            const std::u16string text = Straddling::text(name, length, filling, seed);
            const std::string bytes = encodeWithIcu(name, text);
            const std::string what =
                "border " + std::to_string(border) + ", length " + std::to_string(length);
            // The border is met by units of the pivot; bytes of the source and the target meet it where they are
            // as many, so for sources and targets of one byte a character and in all texts of ASCII.
            compare(name, length % 2 == 0 ? "UTF-8" : "UTF-16LE", bytes, what);
            compare(length % 2 == 0 ? "UTF-16LE" : "UTF-8", name,
                    length % 2 == 0 ? asUtf16(text) : encodeWithIcu("UTF-8", text), what);
        }
        // Cut to a number of bytes, wherever that is in a character.
        const std::string bytes = encodeWithIcu(name, Straddling::text(name, border + 8, filling, seed));
        for (std::size_t length = border - 4; length <= std::min(border + 4, bytes.size()); length += 3) {
            compare(name, "UTF-8", std::string_view(bytes).substr(0, length), "cut at a border");
        }
    }
}

TEST_P(IcuDifferential, OwnTextBehindAsciiAcrossBorders) {
    forEachConverter([](const std::string& name, const std::string&, std::size_t seed) {
        compareAcrossBorders(name, Straddling::ascii, seed);
    });
}

TEST_P(IcuDifferential, OwnTextAcrossBorders) {
    forEachConverter([](const std::string& name, const std::string&, std::size_t seed) {
        compareAcrossBorders(name, Straddling::own, seed);
    });
}

TEST_P(IcuDifferential, SubstitutionsAcrossBorders) {
    forEachConverter([](const std::string& name, const std::string&, std::size_t seed) {
        compareAcrossBorders(name, Straddling::lost, seed);
    });
}

/// Code pages of two bytes. A long text comes before, which has the library build its tables, so that short ones go
/// that way as well.
class TableDifferential : public testing::TestWithParam<const char*> {
public:
    void SetUp() override {
        std::u16string text = ownText(name, 2000, 1);
        while (text.size() < std::size_t{1} << 19) {
            text += text;
        }
        assign(name, "UTF-8", encodeWithIcu(name, text));
        assign("UTF-8", name, encodeWithIcu("UTF-8", text));
    }
    const std::string name = canonicalName(GetParam());
};
INSTANTIATE_TEST_SUITE_P(Encoding, TableDifferential,
                         testing::Values("Shift_JIS", "EUC-JP", "GBK", "GB18030", "Big5", "EUC-KR",
                                         "KSC_5601", "Big5-HKSCS", "EUC-TW", "ibm-1390", "gsm-03.38-2009",
                                         "ibm-16684"));

TEST_P(TableDifferential, TextsWithLossesAnywhere) {
    std::mt19937_64 random(4);
    for (int round = 0; round < 250 && !HasFailure(); ++round) {
        const std::string other = round % 4 == 0   ? "windows-1252"
                                  : round % 4 == 1 ? "UTF-16BE"
                                  : round % 4 == 2 ? "UTF-16LE"
                                                   : "UTF-8";
        std::u16string text = ownText(name, 1 + random() % 90, random()) + slice(random(), random() % 12) +
                              ownText(name, random() % 90, random());
        compare(other, name, encodeWithIcu(other, text), "own text among others");
        std::string bytes = encodeWithIcu(name, text);
        for (auto faults = random() % 4; faults-- > 0 && !bytes.empty();) {
            bytes[random() % bytes.size()] = static_cast<char>(random());
        }
        bytes.resize(bytes.size() - std::min<std::size_t>(bytes.size(), random() % 3));
        compare(name, other, bytes, "damaged text");
        compare(name, "UTF-32LE", bytes, "damaged text");
    }
}

TEST_P(TableDifferential, AllCodePointsInATextOfTheirOwn) {
    std::u16string text;
    for (char32_t c = 1; c < 0x10000; ++c) {
        if (c < 0xD800 || c > 0xDFFF) {
            text += static_cast<char16_t>(c);
        }
        if (text.size() == 1000) {
            compare("UTF-16LE", name, asUtf16(text), "code points");
            text.clear();
        }
    }
    compare("UTF-16LE", name, asUtf16(text), "code points");
}

/// All pairs of the Unicode forms, whose text goes around ICU as far as it is well-formed.
class UnicodeDifferential : public testing::TestWithParam<std::tuple<std::string, std::string>> {
public:
    std::string from() const { return std::get<0>(GetParam()); }
    std::string to() const { return std::get<1>(GetParam()); }
};
const auto unicodeForms = testing::Values("UTF-8", "UTF-16LE", "UTF-16BE", "UTF-32LE", "UTF-32BE");
INSTANTIATE_TEST_SUITE_P(Pair, UnicodeDifferential, testing::Combine(unicodeForms, unicodeForms));

TEST_P(UnicodeDifferential, RandomBytesAndDamagedText) {
    std::mt19937_64 random(7);
    const std::u16string& text = mixedText;
    for (int round = 0; round < 2000; ++round) {
        std::string bytes = randomBytes(random, 1 + random() % 40);
        if (round % 2 == 0) {
            bytes = encodeWithIcu(from(), slice(random(), 1 + random() % 40));
            bytes[random() % bytes.size()] = static_cast<char>(random());
            bytes.resize(random() % 4 == 0 ? random() % bytes.size() : bytes.size());
        }
        compare(from(), to(), bytes, "round " + std::to_string(round));
        if (HasFailure()) {
            return;
        }
    }
    compare(from(), to(), encodeWithIcu(from(), text), "all scripts");
}

TEST_P(UnicodeDifferential, EachKindOfCharacterAtEachPlaceNearABorder) {
    for (const std::u16string tail :
         {u"a", u"\u00E9", u"\u20AC", u"\U0001F600", u"\uFFFD", u"\uFFFF", u"\uFEFF"}) {
        for (const char16_t filler : {u'a', u'\u00E9', u'\u4E2D'}) {
            for (const std::size_t border : borders) {
                for (std::size_t length = border - 4; length <= border + 4; ++length) {
                    const std::u16string text = std::u16string(length, filler) + tail + tail + u"z";
                    compare(from(), to(), encodeWithIcu(from(), text), "border " + std::to_string(border));
                    if (HasFailure()) {
                        return;
                    }
                }
            }
        }
    }
}

TEST_P(UnicodeDifferential, BadInputNearABorder) {
    const std::string bad = from() == "UTF-8"              ? "\xED\xA0\x80"
                            : from().starts_with("UTF-16") ? "\xD8\xD8"
                                                           : "\x11\x22\x33\x44";
    for (const std::size_t border : borders) {
        for (std::size_t length = border - 4; length <= border + 4; ++length) {
            std::string bytes = encodeWithIcu(from(), std::u16string(length, u'\u4E2D'));
            bytes += bad + encodeWithIcu(from(), u"after \u00E9");
            compare(from(), to(), bytes, "border " + std::to_string(border));
            if (HasFailure()) {
                return;
            }
        }
    }
}

} // namespace
} // namespace kvt::test
