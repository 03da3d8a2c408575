// Streams against ICU's callbacks on the whole text and against ICUTranscoder, from and to every converter that ICU
// lists: the same text, the same losses with the same bytes, wherever the stream is cut.
//
// The converters are dealt out to shards, so that the cases run side by side.
#include <reference/icu_reference.h>
#include <reference/stream_reference.h>

#include <kvt/encoding/encoding.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::Encoding;
using kvt::ex::StreamTranscoder;

class StreamDifferential : public testing::TestWithParam<std::size_t> {
public:
    static constexpr std::size_t shards = 8;

    /// Calls `check` for each converter as source and as target, with another one that takes turns.
    template <typename Check>
    void forEachPair(Check check) {
        const std::vector<std::string> all = availableConverters();
        ASSERT_GT(all.size(), 100U);
        const char* const others[] = {"UTF-8", "windows-1252", "UTF-16BE", "US-ASCII", "GB18030"};
        for (std::size_t i = GetParam(); i < all.size() && !HasFailure(); i += shards) {
            const std::string name = canonicalName(all[i]);
            for (std::size_t k = 0; k < 2; ++k) {
                const std::string other = others[(i / shards + k) % std::size(others)];
                if (name != other) {
                    check(name, other, i);
                    check(other, name, i);
                }
            }
        }
    }
};
INSTANTIATE_TEST_SUITE_P(Shard, StreamDifferential,
                         testing::Range(std::size_t{0}, StreamDifferential::shards));

std::string damaged(std::string text, std::mt19937_64& random) {
    for (auto changes = random() % 4; changes > 0 && !text.empty(); --changes) {
        const std::size_t at = random() % text.size();
        switch (random() % 3) {
        case 0:
            text[at] = static_cast<char>(random());
            break;
        case 1:
            text.insert(at, 1, static_cast<char>(random()));
            break;
        default:
            text.erase(at, 1);
        }
    }
    return text;
}

std::string sampleText(const std::string& from, const std::string& to, std::mt19937_64& random) {
    if (random() % 4 == 0) {
        std::string noise(1 + random() % 8, '\0');
        std::generate(noise.begin(), noise.end(), [&] { return static_cast<char>(random()); });
        return noise;
    }
    const std::string text =
        encodeWithIcu(from, ownText(random() % 3 == 0 ? from : to, 1 + random() % 12, random()));
    const char16_t* const special = random() % 8 == 0 ? u"a\uFEFFb\uFFFDc\u3042\uFEFF\u00e9" : u"";
    return damaged(encodeWithIcu(from, special) + text, random);
}

TEST_P(StreamDifferential, ShortTextsCutAnywhere) {
    forEachPair([](const std::string& from, const std::string& to, std::size_t seed) {
        std::mt19937_64 random(seed);
        for (int round = 0; round < 40 && !HasFailure(); ++round) {
            const std::string text = sampleText(from, to, random);
            EXPECT_EQ(differenceInStream(from, to, text, {1, 2, 3, 5}), "");
        }
    });
}

// Slices of the text go through ICU as a whole, and blocks end where the caller likes: around a border of the one the
// others are put at every place.
TEST_P(StreamDifferential, EveryCutAroundTheBordersOfSlices) {
    forEachPair([](const std::string& from, const std::string& to, std::size_t seed) {
        std::mt19937_64 random(seed);
        for (const std::size_t border : {512U, 4096U}) {
            const std::string filling = encodeWithIcu(from, std::u16string(border, u'a'));
            const std::string text = sampleText(from, to, random) + filling.substr(0, border - 8) +
                                     sampleText(from, to, random) + sampleText(from, to, random);
            std::vector<std::size_t> cuts;
            for (std::size_t cut = border - 12; cut < std::min(border + 12, text.size()); ++cut) {
                cuts.push_back(cut);
            }
            EXPECT_EQ(differenceInStream(from, to, text, cuts), "");
        }
    });
}

// Long texts come before, which have the library build its tables, so that short ones go that way as well.
TEST(StreamDifferential, CodePagesOfTwoBytesByTheirTables) {
    const std::string all[] = {"Shift_JIS", "EUC-JP", "GBK",        "GB18030",
                               "Big5",      "EUC-KR", "Big5-HKSCS", "EUC-TW"};
    for (const std::string& listed : all) {
        const std::string name = canonicalName(listed);
        const std::u16string own = ownText(name, 2000, 1);
        for (const auto& [from, to] : {std::pair<std::string, std::string>(name, "UTF-8"), {"UTF-8", name}}) {
            StreamTranscoder stream{Encoding(from), Encoding(to)};
            const std::string text = encodeWithIcu(from, own);
            for (std::string out; stream.position() < std::size_t{1} << 20; out.clear()) {
                stream.convert(text, out, {});
            }
        }
        std::mt19937_64 random(9);
        for (int round = 0; round < 150 && !testing::Test::HasFailure(); ++round) {
            const std::string other = round % 3 == 0 ? "windows-1252" : round % 3 == 1 ? "UTF-8" : "UTF-16BE";
            EXPECT_EQ(differenceInStream(name, other, sampleText(name, other, random), {1, 2, 3, 7}), "");
            EXPECT_EQ(differenceInStream(other, name, sampleText(other, name, random), {1, 2, 3, 7}), "");
        }
        // Losses at about one place in twenty, and a long stretch of what is not in the tables.
        std::u16string text;
        for (std::size_t i = 0; i < 60; ++i) {
            text += ownText(name, random() % 40, random()) + (random() % 2 == 0 ? u"\u0378" : u"");
        }
        const std::u16string rare = text + std::u16string(300, u'\u0E01') + text;
        EXPECT_EQ(differenceInStream("UTF-8", name, encodeWithIcu("UTF-8", rare), {1, 5, 64, 500}), "");
        std::string bytes = encodeWithIcu(name, text);
        for (std::size_t i = 0; i < bytes.size(); i += 1 + random() % 40) {
            bytes[i] = static_cast<char>(random());
        }
        EXPECT_EQ(differenceInStream(name, "UTF-8", bytes, {1, 5, 64, 500}), "");
        EXPECT_EQ(differenceInStream(name, "windows-1252", bytes, {1, 5, 64, 500}), "");
    }
}

// Bad input of UTF-8 is told from text, and measured, without ICU.
TEST(StreamDifferential, EachBadSequenceOfUtf8) {
    // The border of each kind of byte, so of each range that a byte behind another one may be in.
    const std::string_view bytes(
        "\x41\x80\x8F\x90\x9F\xA0\xBF\xC1\xC2\xDF\xE0\xE1\xED\xEF\xF0\xF1\xF4\xF5\xFF");
    for (const std::string to : {"UTF-16LE", "UTF-16BE", "UTF-32LE", "windows-1252", "US-ASCII"}) {
        std::string text;
        for (const char first : bytes) {
            for (const char second : bytes) {
                for (const char third : bytes) {
                    text += {first, second, third, '\x80', 'a', first, second, third};
                    text += "z";
                }
            }
        }
        EXPECT_EQ(differenceInStream("UTF-8", to, text, {7, 64, 1000}), "") << to;
        for (std::size_t length = 1; length <= 4; ++length) {
            EXPECT_EQ(differenceInStream("UTF-8", to, "a" + text.substr(0, length), {1, 2}), "") << to;
        }
    }
}

// Found by a fuzzer, each with a fault of its own.
TEST(StreamDifferential, TextsThatWentWrong) {
    struct Row {
        const char* from;
        const char* to;
        std::string text;
    };
    const Row rows[] = {
        // A reset behind a loss armed the byte order mark again.
        {"UTF-8", "UTF-16BE,version=1", std::string(512, 'a') + "\xFFz"},
        {"UTF-8", "UTF-16LE,version=1", std::string(512, 'a') + "\xFFz"},
        {"UTF-16BE,version=1", "UTF-8", std::string("\0a\xDC\0\xFE\xFF\0z", 8)},
        // ICU shows no bytes of these.
        {"gsm-03.38-2009", "UTF-8", "a\x89z"},
        {"BOCU-1", "UTF-8", "\x3F\x29\x88\xF4\xE4\x27"},
        {"ISCII,version=0", "windows-1252", "a\xB3\xD8\xE0"},
        {"UTF-8", "ISCII,version=0", "\u0CD5"},
        // What was lost began where a block had ended.
        {"SCSU", "US-ASCII", "\x0c\x1e\xb2\xb0"},
        {"SCSU", "US-ASCII",
         "\x1f\x29\x40\xbb\x0f\xdb\x32\xdc\xb5\xe7\x30\x3b\x30\xd9\xed\xdd\x1f\xd9\xaf\xdd\xc9"},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(differenceInStream(row.from, row.to, row.text, {1, 2, 3, 5, 512}), "");
    }
}

} // namespace
} // namespace kvt::test
