// The Unicode forms in vector registers, for each instruction set that this machine has and without any: the same
// results as a plain loop over characters, at all lengths around those of the registers, from any address, with nothing
// read or written outside of what is given.
#include <kvt/encoding/detail/byte_set.h>
#include <kvt/encoding/detail/unicode_vectors.h>

#include <reference/icu_reference.h>
#include <reference/plain_unicode.h>
#include <support/guarded_memory.h>
#include <support/vector_targets.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <optional>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

namespace vectors = kvt::ex::detail::vectors;
using vectors::Extent;

template <typename Unit>
std::string_view bytesOf(const std::basic_string<Unit>& units) {
    return {reinterpret_cast<const char*>(units.data()), units.size() * sizeof(Unit)};
}

// ---- Each instruction set ----------------------------------------------------------------------------------------

class UnicodeVectors : public OnEachVectorTarget {
protected:
    // Text and result stand at the end of memory that can be touched, so that a step beyond it ends the test.
    template <typename Unit, typename Convert>
    void checkConversion(std::string_view from, std::size_t units, const std::basic_string<Unit>& expected,
                         Convert convert) {
        char* const in = input_.end() - from.size();
        std::memcpy(in, from.data(), from.size());
        const std::string_view wanted = bytesOf(expected);
        char* const out = output_.end() - wanted.size();
        std::memset(out, '#', wanted.size());
        const std::size_t written = convert(in, units, out, expected.size());
        ASSERT_EQ(written, expected.size()) << hex(from);
        ASSERT_TRUE(std::string_view(out, wanted.size()) == wanted) << hex(from, 400);
    }

    // Of a short text all is converted, or nothing: `expected` is empty then.
    template <typename Unit, typename Convert>
    void checkShort(std::string_view from, std::size_t units,
                    const std::optional<std::basic_string<Unit>>& expected, Convert convert) {
        if (units > vectors::shortText) {
            return;
        }
        char* const in = input_.end() - from.size();
        std::memcpy(in, from.data(), from.size());
        char* const out = output_.end() - vectors::shortRoom * sizeof(Unit);
        const std::size_t written = convert(in, units, out);
        ASSERT_EQ(written, expected ? expected->size() : vectors::notWhole) << hex(from);
        ASSERT_TRUE(!expected || std::string_view(out, written * sizeof(Unit)) == bytesOf(*expected))
            << hex(from, 400);
    }

    template <typename Unit>
    static std::optional<std::basic_string<Unit>> ifWhole(bool isWhole, std::basic_string<Unit> text) {
        return isWhole ? std::optional(std::move(text)) : std::nullopt;
    }
    static bool hasOnlyUnits(const std::u32string& text) {
        return std::all_of(text.begin(), text.end(), [](char32_t c) { return c < 0x10000; });
    }

    static void checkExtent(const Extent& extent, const Decoded& decoded, std::string_view from) {
        ASSERT_EQ(extent.taken, decoded.taken) << hex(from, 400);
        ASSERT_EQ(extent.utf8, encodeUtf8(decoded.text).size()) << hex(from, 400);
        ASSERT_EQ(extent.utf16, encodeUtf16(decoded.text).size()) << hex(from, 400);
        ASSERT_EQ(extent.utf32, decoded.text.size()) << hex(from, 400);
    }

    void checkUtf8(std::string_view text) {
        char* const in = input_.end() - text.size();
        std::memcpy(in, text.data(), text.size());
        const Decoded decoded = decodeUtf8(text);
        checkExtent(vectors::measureUtf8(in, text.size()), decoded, text);
        const std::string_view good = text.substr(0, decoded.taken);
        checkConversion(good, good.size(), encodeUtf16(decoded.text), vectors::utf8ToUtf16);
        checkConversion(good, good.size(), decoded.text, vectors::utf8ToUtf32);
        const bool isWhole = decoded.taken == text.size();
        checkShort(text, text.size(), ifWhole(isWhole, encodeUtf16(decoded.text)), vectors::shortUtf8ToUtf16);
        checkShort(text, text.size(), ifWhole(isWhole, decoded.text), vectors::shortUtf8ToUtf32);
    }

    void checkUtf16(const std::u16string& text) {
        const std::string_view bytes = bytesOf(text);
        char* const in = input_.end() - bytes.size();
        std::memcpy(in, bytes.data(), bytes.size());
        const Decoded decoded = decodeUtf16(text);
        checkExtent(vectors::measureUtf16(in, text.size()), decoded, bytes);
        const std::string_view good = bytes.substr(0, decoded.taken * 2);
        checkConversion(good, decoded.taken, encodeUtf8(decoded.text), vectors::utf16ToUtf8);
        checkConversion(good, decoded.taken, decoded.text, vectors::utf16ToUtf32);
        const bool isWhole = decoded.taken == text.size() && hasOnlyUnits(decoded.text);
        checkShort(bytes, text.size(), ifWhole(isWhole, encodeUtf8(decoded.text)), vectors::shortUtf16ToUtf8);
        checkShort(bytes, text.size(), ifWhole(isWhole, decoded.text), vectors::shortUtf16ToUtf32);
    }

    void checkUtf32(const std::u32string& text) {
        const std::string_view bytes = bytesOf(text);
        char* const in = input_.end() - bytes.size();
        std::memcpy(in, bytes.data(), bytes.size());
        const Decoded decoded = decodeUtf32(text);
        checkExtent(vectors::measureUtf32(in, text.size()), decoded, bytes);
        const std::string_view good = bytes.substr(0, decoded.taken * 4);
        checkConversion(good, decoded.taken, encodeUtf8(decoded.text), vectors::utf32ToUtf8);
        checkConversion(good, decoded.taken, encodeUtf16(decoded.text), vectors::utf32ToUtf16);
        const bool isWhole = decoded.taken == text.size() && hasOnlyUnits(decoded.text);
        checkShort(bytes, text.size(), ifWhole(isWhole, encodeUtf16(decoded.text)),
                   vectors::shortUtf32ToUtf16);
    }

    void checkAll(const std::u32string& text) {
        checkUtf8(encodeUtf8(text));
        checkUtf16(encodeUtf16(text));
        checkUtf32(text);
    }

private:
    GuardedMemory input_{1 << 16};
    GuardedMemory output_{1 << 17};
};

INSTANTIATE_TEST_SUITE_P(Each, UnicodeVectors, testing::ValuesIn(vectorTargets()), vectorTargetName);

// Characters of one to four bytes, at the borders of each length.
constexpr char32_t samples[] = {0,      'a',    0x7F,   0x80,   0xE9,    0x7FF,   0x800,   0x3042,
                                0xD7FF, 0xE000, 0xFFFD, 0xFFFF, 0x10000, 0x1F600, 0x10FFFF};

std::u32string randomText(std::mt19937_64& random, std::size_t length) {
    // Runs of a kind, as texts have them, of any length.
    std::u32string text;
    while (text.size() < length) {
        const std::size_t kinds[][2] = {{0, 3}, {3, 6}, {6, 12}, {12, 15}, {0, 15}, {0, 6}};
        const auto& kind = kinds[random() % std::size(kinds)];
        for (std::size_t run = random() % 70; run-- > 0 && text.size() < length;) {
            text += samples[kind[0] + random() % (kind[1] - kind[0])];
        }
    }
    return text;
}

TEST_P(UnicodeVectors, EachCharacterAtEachPlaceOfEachLength) {
    for (const char32_t c : samples) {
        for (const char32_t filler : {U'a', U'\u00E9', U'\u3042', U'\U0001F600'}) {
            for (std::size_t length = 0; length <= 140; length += length < 70 ? 1 : 7) {
                std::u32string text(length, filler);
                for (std::size_t place = 0; place < length; place += 1 + length / 8) {
                    text[place] = c;
                    checkAll(text);
                    text[place] = filler;
                }
            }
        }
    }
}

TEST_P(UnicodeVectors, AllCodePoints) {
    std::u32string text;
    for (char32_t c = 0; c <= 0x10FFFF; ++c) {
        if (c < 0xD800 || c > 0xDFFF) {
            text += c;
        }
        if (text.size() == 4000) {
            checkAll(text);
            text.clear();
        }
    }
    checkAll(text);
}

TEST_P(UnicodeVectors, RandomText) {
    std::mt19937_64 random(20);
    for (int round = 0; round < 1500; ++round) {
        checkAll(randomText(random, random() % 300));
    }
}

TEST_P(UnicodeVectors, UnitsThatAreNotWellFormedEndTheText) {
    std::mt19937_64 random(21);
    const std::string_view bytes("\x80\xBF\xC0\xC1\xC2\xDF\xE0\xED\xEF\xF0\xF4\xF5\xFF\x41\x9F\xA0\x8F\x90");
    const char16_t units[] = {0xD800, 0xDBFF, 0xDC00, 0xDFFF};
    const char32_t numbers[] = {0xD800, 0xDFFF, 0x110000, 0x7FFFFFFF, 0xFFFFFFFF};
    for (int round = 0; round < 2500; ++round) {
        const std::u32string text = randomText(random, 1 + random() % 200);
        std::string utf8 = encodeUtf8(text);
        std::u16string utf16 = encodeUtf16(text);
        std::u32string utf32 = text;
        for (std::size_t faults = 1 + random() % 2; faults-- > 0;) {
            utf8[random() % utf8.size()] = bytes[random() % bytes.size()];
            utf16[random() % utf16.size()] = units[random() % std::size(units)];
            utf32[random() % utf32.size()] = numbers[random() % std::size(numbers)];
        }
        checkUtf8(utf8);
        checkUtf8(std::string_view(utf8).substr(0, random() % utf8.size()));
        checkUtf16(utf16);
        checkUtf32(utf32);
    }
}

TEST_P(UnicodeVectors, AsciiEndsWhereItEnds) {
    std::mt19937_64 random(22);
    GuardedMemory in(4096);
    GuardedMemory out(8192);
    for (std::size_t length = 0; length <= 300; ++length) {
        for (const std::size_t ascii : {std::size_t{0}, length / 3, random() % (length + 1), length}) {
            std::string text(length, 'x');
            std::u16string wide(length, u'x');
            if (ascii < length) {
                text[ascii] = '\x80';
                wide[ascii] = u'\x80';
            }
            char* const bytes = in.end() - length;
            std::memcpy(bytes, text.data(), length);
            EXPECT_EQ(vectors::asciiPrefix(bytes, length), ascii);
            char* const widened = out.end() - 2 * length;
            EXPECT_EQ(vectors::widenAscii(bytes, length, widened), ascii);
            EXPECT_TRUE(std::memcmp(widened, wide.data(), 2 * ascii) == 0);
            std::memcpy(widened, wide.data(), 2 * length);
            EXPECT_EQ(vectors::narrowAscii(widened, length, bytes), ascii);
            EXPECT_TRUE(std::memcmp(bytes, text.data(), ascii) == 0);
        }
    }
}

TEST_P(UnicodeVectors, SetsOfBytesKnowWhichOfABlockAreTheirs) {
    std::mt19937_64 random(23);
    GuardedMemory in(4096);
    for (int round = 0; round < 300; ++round) {
        vectors::ByteSet set;
        std::vector<bool> isMember(256);
        for (auto members = random() % 256; members-- > 0;) {
            const auto byte = static_cast<std::uint8_t>(random());
            set.add(byte);
            isMember[byte] = true;
        }
        auto* const bytes =
            reinterpret_cast<std::uint8_t*>(in.end() - vectors::ByteSet::block - random() % 3);
        std::uint64_t expected = 0;
        for (std::size_t i = 0; i < vectors::ByteSet::block; ++i) {
            bytes[i] =
                static_cast<std::uint8_t>(round < 4 ? static_cast<std::size_t>(round) * 64 + i : random());
            expected |= std::uint64_t{isMember[bytes[i]]} << i;
        }
        ASSERT_EQ(set.bitsOf(bytes), expected) << round;
    }
}

} // namespace
} // namespace kvt::test
