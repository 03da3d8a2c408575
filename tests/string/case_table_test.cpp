// Long texts of UTF-8, which are mapped by tables in vector registers: for each instruction set that this machine has
// and without any the same as ICU's case map gives for the whole, with nothing read outside of the text.
#include <kvt/string/ustring.h>

#include <support/guarded_memory.h>
#include <support/vector_targets.h>

#include <gtest/gtest.h>
#include <unicode/ucasemap.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::UString;
using kvt::ex::UStringView;

using CaseFunction = std::int32_t (*)(const UCaseMap*, char*, std::int32_t, const char*, std::int32_t,
                                      UErrorCode*);

struct Mapping {
    const char* name;
    CaseFunction icu;
    UString<0> (*library)(UStringView<0>);
};

const Mapping mappings[] = {
    {"upper", ucasemap_utf8ToUpper, [](UStringView<0> text) { return UString<0>::getAsUpperCase(text); }},
    {"lower", ucasemap_utf8ToLower, [](UStringView<0> text) { return UString<0>::getAsLowerCase(text); }},
    {"folded", ucasemap_utf8FoldCase, [](UStringView<0> text) { return UString<0>::getAsFoldedCase(text); }},
};

std::string utf8(char32_t c) {
    const auto trail = [c](unsigned shift) { return static_cast<char>(0x80 | (c >> shift & 0x3F)); };
    if (c < 0x80) {
        return {static_cast<char>(c)};
    }
    if (c < 0x800) {
        return {static_cast<char>(0xC0 | c >> 6), trail(0)};
    }
    if (c < 0x10000) {
        return {static_cast<char>(0xE0 | c >> 12), trail(6), trail(0)};
    }
    return {static_cast<char>(0xF0 | c >> 18), trail(12), trail(6), trail(0)};
}

constexpr std::size_t longEnough = 1024;

class CaseTable : public OnEachVectorTarget {
protected:
    // What ICU gives; never shorter than the text.
    std::string byIcu(CaseFunction function, std::string_view text) {
        std::string mapped(3 * text.size(), '\0');
        UErrorCode status = U_ZERO_ERROR;
        const std::int32_t size =
            function(map_.get(), mapped.data(), static_cast<std::int32_t>(mapped.size()), text.data(),
                     static_cast<std::int32_t>(text.size()), &status);
        EXPECT_TRUE(U_SUCCESS(status));
        mapped.resize(static_cast<std::size_t>(size));
        mapped.resize(std::max(mapped.size(), text.size()));
        return mapped;
    }

    void check(std::string_view text) {
        ASSERT_GE(text.size(), longEnough);
        char* const units = memory_.end() - text.size();
        std::memcpy(units, text.data(), text.size());
        for (const Mapping& mapping : mappings) {
            const UString<0> mapped = mapping.library(UStringView<0>(units, text.size()));
            const std::string expected = byIcu(mapping.icu, text);
            const std::string_view actual(mapped.rawData(), mapped.size());
            if (actual != expected) {
                const auto place =
                    std::mismatch(actual.begin(), actual.end(), expected.begin(), expected.end());
                const auto at = static_cast<std::size_t>(place.first - actual.begin());
                FAIL() << mapping.name << " of " << text.size() << " bytes: " << actual.size()
                       << " instead of " << expected.size() << " bytes; from " << at << " on "
                       << testing::PrintToString(std::string(actual.substr(at, 16))) << " instead of "
                       << testing::PrintToString(expected.substr(at, 16));
            }
        }
        checkFolding(text);
    }

    // Folding of UTF-16, which goes the same way. Where the text is not UTF-8 there are lone surrogates.
    static void checkFolding(std::string_view text) {
        constexpr char16_t substitute = 0xE000;
        std::u16string units(text.size(), u'\0');
        UErrorCode status = U_ZERO_ERROR;
        std::int32_t count = 0;
        u_strFromUTF8WithSub(units.data(), static_cast<std::int32_t>(units.size()), &count, text.data(),
                             static_cast<std::int32_t>(text.size()), substitute, nullptr, &status);
        units.resize(static_cast<std::size_t>(count));
        std::replace(units.begin(), units.end(), substitute, char16_t{0xD812});
        std::u16string expected(3 * units.size(), u'\0');
        const std::int32_t size =
            u_strFoldCase(expected.data(), static_cast<std::int32_t>(expected.size()), units.data(),
                          static_cast<std::int32_t>(units.size()), U_FOLD_CASE_DEFAULT, &status);
        expected.resize(static_cast<std::size_t>(size));
        expected.resize(std::max(expected.size(), units.size()));
        const UString<2> folded = UString<2>::getAsFoldedCase(UStringView<2>(units));
        ASSERT_TRUE(std::u16string_view(folded.rawData(), folded.size()) == expected) << units.size();
    }

private:
    UErrorCode status_ = U_ZERO_ERROR;
    std::unique_ptr<UCaseMap, decltype(&ucasemap_close)> map_{ucasemap_open("", 0, &status_),
                                                              &ucasemap_close};
    GuardedMemory memory_{1 << 16};
};

INSTANTIATE_TEST_SUITE_P(Each, CaseTable, testing::ValuesIn(vectorTargets()), vectorTargetName);

TEST_P(CaseTable, AllCodePoints) {
    std::string text;
    for (char32_t c = 0; c <= 0x10FFFF; ++c) {
        text += utf8(c); // surrogates as well, which are not characters then
        if (text.size() > 20000) {
            check(text);
            text.clear();
        }
    }
    check(text + std::string(longEnough, 'A'));
}

TEST_P(CaseTable, EachCharacterThatChangesAmongOthers) {
    std::mt19937 random(31);
    std::string text;
    const std::string_view neighbours[] = {"a",      "B",      " ",      "\u00E9", "\u00C9",
                                           "\u3042", "\u0391", "\u03A3", "\u0301", "."};
    const auto neighbour = [&] { return neighbours[random() % std::size(neighbours)]; };
    for (char32_t c = 0x80; c <= 0x1FFFF; ++c) {
        const std::string character = utf8(c);
        const bool changes = byIcu(ucasemap_utf8ToUpper, character) != character ||
                             byIcu(ucasemap_utf8FoldCase, character) != character;
        if (!changes && c % 97 != 0) {
            continue;
        }
        for (int i = 0; i < 4; ++i) {
            text.append(neighbour()).append(character).append(neighbour());
        }
        if (text.size() > 20000) {
            check(text);
            text.clear();
        }
    }
    check(text + std::string(longEnough, 'z'));
}

std::string randomText(std::mt19937& random, std::size_t size, bool isUtf8 = false) {
    // Runs of a kind, as texts have them; bytes that are not UTF-8 are one of the kinds.
    const std::vector<std::vector<std::string>> kinds = {
        {"a", "Z", " ", "[", "@", "`", "{", "0"},
        {"\u00DF", "\u00E9", "\u00C9", "\u00D7", "\u00F7", "\u00FF", "\u00B5", "\u00DE", "\u00FE", "a", "S"},
        {"\u3042", "\u4E00", "\u3001", "\uAC00", "\U0001F600", "\U00020000"},
        {"\u03A3", "\u03C3", "\u03C2", "\u0391", "\u03B1", "\u0301", "\u00AD", " ", "'", ".", "1"},
        {"\u0130", "\u0131", "\u0390", "\u1F52", "\u1FB7", "\uFB03", "\u212A", "\u1E9E", "\u0149", "\u0345"},
        {"\u0416", "\u0436", "\u10D0", "\u13A0", "\uAB70", "\U00010400", "\U0001E900", "\u2C6F"},
        {"\xC3", "\xE1", "\xE1\xBA", "\x80", "\xBF", "\xFF", "\xF0\x90", "\xC0\x80", "\xED\xA0\x80",
         "\xF4\x90\x80\x80", "A"},
    };
    std::string text;
    while (text.size() < size) {
        const auto& kind = kinds[random() % (kinds.size() - (isUtf8 ? 1 : 0))];
        for (std::size_t run = random() % 60; run-- > 0 && text.size() < size;) {
            text += kind[random() % kind.size()];
        }
    }
    text.resize(isUtf8 ? text.size() : size);
    return text;
}

TEST_P(CaseTable, RandomTextOfEachLength) {
    std::mt19937 random(32);
    for (std::size_t size = longEnough; size < longEnough + 600; ++size) {
        check(randomText(random, size));
        check(randomText(random, 2 * size, true));
    }
    for (int round = 0; round < 100; ++round) {
        check(randomText(random, longEnough + random() % 20000));
    }
}

TEST_P(CaseTable, TextsThatGrowOrShrinkAllTheWay) {
    for (const char* grows :
         {"\u0390", "\u1FB7", "\u0130", "\uFB03", "\u212A", "\u1E9E", "\u03A3", "\u0149", "\xC3\xA9"}) {
        for (std::size_t size = longEnough; size < longEnough + 70; ++size) {
            std::string text;
            while (text.size() < size) {
                text += grows;
            }
            check(text);
            check(std::string(size / 2, 'x') + text);
        }
    }
}

} // namespace
} // namespace kvt::test
