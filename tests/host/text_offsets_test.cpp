// The way back from UTF-8 to the bytes of a file, in every encoding in which a text is its characters' bytes one after the
// other.

#include "text/text_offsets.h"

#include <reference/icu_reference.h>

#include <kvt/encoding/encoding.h>

#include <gtest/gtest.h>

#include <random>

namespace kvt::test {

namespace {

using host::TextOffsets;
using kvt::ex::Encoding;

struct Sample {
    std::string bytes;
    std::vector<std::uint64_t> begins; ///< of each character
    std::vector<std::uint64_t> utf8;   ///< bytes of UTF-8 before each
};

/// Nothing where the bytes of a character depend on its neighbours, or do not come back.
std::optional<Sample> sampleOf(const std::string& name, std::size_t count, std::uint64_t seed) {
    const std::u16string text = ownText(name, count, seed);
    Sample sample;
    std::uint64_t utf8 = 0;
    for (std::size_t index = 0; index < text.size();) {
        const bool isPair = (text[index] & 0xFC00) == 0xD800;
        const std::u16string_view character = std::u16string_view(text).substr(index, isPair ? 2 : 1);
        sample.begins.push_back(sample.bytes.size());
        sample.utf8.push_back(utf8);
        sample.bytes += encodeWithIcu(name, character);
        utf8 += encodeWithIcu("UTF-8", character).size();
        index += character.size();
    }
    const bool isWhole = sample.bytes == encodeWithIcu(name, text) &&
                         convertWithIcu(name, "UTF-8", sample.bytes).bytes == encodeWithIcu("UTF-8", text);
    return isWhole ? std::optional(std::move(sample)) : std::nullopt;
}

/// Lines of random length are passed, and in each some places are asked for.
void expectOffsets(const std::string& name, const Sample& sample, std::size_t block, std::uint64_t seed) {
    std::mt19937_64 random(seed);
    TextOffsets offsets{Encoding(name)};
    std::size_t given = 0;
    std::size_t character = 0;
    while (character < sample.begins.size()) {
        const std::size_t line = std::min<std::size_t>(character + 1 + random() % 400, sample.begins.size());
        // As a reader does: a line is decoded before it is given out.
        for (; given < sample.bytes.size() &&
               (line == sample.begins.size() || given <= sample.begins[line] + 16);
             given += block) {
            offsets.add(std::string_view(sample.bytes).substr(given, block));
        }
        if (given >= sample.bytes.size()) {
            offsets.add({});
        }
        if (random() % 3 != 0) {
            offsets.passTo(sample.utf8[character]);
            for (int asked = 0; asked < 3; ++asked) {
                const std::size_t at = character + random() % (line - character);
                ASSERT_EQ(offsets.offsetOf(at - character), sample.begins[at])
                    << name << ", character " << at;
            }
            if (line == sample.begins.size()) {
                ASSERT_EQ(offsets.offsetOf(line - character), sample.bytes.size()) << name;
            }
        }
        character = line;
    }
}

} // namespace

TEST(TextOffsets, AreThoseOfTheCharactersInEveryEncoding) {
    std::size_t tried = 0;
    for (const std::string& listed : availableConverters()) {
        const std::string name = canonicalName(listed);
        const std::optional<Sample> sample =
            name.empty() ? std::nullopt : sampleOf(name, 600, std::hash<std::string>()(name));
        if (sample) {
            ++tried;
            expectOffsets(name, *sample, 64 * 1024, tried);
            expectOffsets(name, *sample, 1 + tried % 700, tried);
        }
    }
    EXPECT_GT(tried, 150u);
}

TEST(TextOffsets, GoOnInLongTexts) {
    for (const char* const name : {"UTF-16LE", "Shift_JIS", "GB18030", "windows-1252"}) {
        const std::optional<Sample> sample = sampleOf(name, 20000, 7);
        ASSERT_TRUE(sample) << name;
        expectOffsets(name, *sample, 10000, 1);
    }
}

} // namespace kvt::test
