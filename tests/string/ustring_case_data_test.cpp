// Case mapping of every single character, against the files of the Unicode Character Database.
//
// The files and ICU may be of different versions of Unicode. What is compared are the characters that both know;
// case folding of a character never changes once it is assigned.
#include <support/string_types.h>
#include <support/unicode_data.h>

#include <kvt/codec/wwjd.h>
#include <kvt/string/ustring.h>

#include <gtest/gtest.h>
#include <unicode/uchar.h>
#include <unicode/uloc.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <fstream>
#include <map>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

using Mapping = std::map<char32_t, std::u32string>;
using Version = std::array<std::uint8_t, 4>;

/// The full mappings that hold in any language and at any place.
struct CaseTables {
    Version version{};
    Mapping folded;
    Mapping upper;
    Mapping lower;
};

CaseTables readTables() {
    CaseTables tables;
    std::ifstream file(KVT_UNICODE_DATA_DIR "/CaseFolding.txt");
    std::string firstLine; // "# CaseFolding-15.0.0.txt"
    std::getline(file, firstLine);
    const std::size_t dash = firstLine.find('-');
    if (dash != std::string::npos) {
        u_versionFromString(tables.version.data(), firstLine.substr(dash + 1).c_str());
    }
    for (const auto& fields : unicodeRows("CaseFolding.txt")) {
        if (fields[1] == "C" || fields[1] == "F") {
            tables.folded[codePoints(fields[0])[0]] = codePoints(fields[2]);
        }
    }
    for (const auto& fields : unicodeRows("UnicodeData.txt")) {
        const char32_t codePoint = codePoints(fields[0])[0];
        if (!fields[12].empty()) {
            tables.upper[codePoint] = codePoints(fields[12]);
        }
        if (fields.size() > 13 && !fields[13].empty()) {
            tables.lower[codePoint] = codePoints(fields[13]);
        }
    }
    for (const auto& fields : unicodeRows("SpecialCasing.txt")) {
        const bool isConditional = fields.size() > 4 && !fields[4].empty();
        if (!isConditional) {
            tables.lower[codePoints(fields[0])[0]] = codePoints(fields[1]);
            tables.upper[codePoints(fields[0])[0]] = codePoints(fields[3]);
        }
    }
    return tables;
}

const CaseTables& tables() {
    static const CaseTables read = readTables();
    return read;
}

std::string toUtf8(const std::u32string& text) {
    std::string bytes;
    for (const char32_t c : text) {
        const auto trail = [&](unsigned shift) { return static_cast<char>(0x80 | ((c >> shift) & 0x3F)); };
        if (c < 0x80) {
            bytes += static_cast<char>(c);
        } else if (c < 0x800) {
            bytes += {static_cast<char>(0xC0 | (c >> 6)), trail(0)};
        } else if (c < 0x10000) {
            bytes += {static_cast<char>(0xE0 | (c >> 12)), trail(6), trail(0)};
        } else {
            bytes += {static_cast<char>(0xF0 | (c >> 18)), trail(12), trail(6), trail(0)};
        }
    }
    return bytes;
}

std::u16string toUtf16(const std::u32string& text) {
    std::u16string units;
    for (const char32_t c : text) {
        if (c < 0x10000) {
            units += static_cast<char16_t>(c);
        } else {
            units += {static_cast<char16_t>(0xD7C0 + (c >> 10)), static_cast<char16_t>(0xDC00 + (c & 0x3FF))};
        }
    }
    return units;
}

/// The form that a mapping has in units: as long as the source at least.
template <typename Units>
Units lengthened(Units mapped, const Units& source) {
    mapped.resize(std::max(mapped.size(), source.size()));
    return mapped;
}

/// Whether the characters of all ages up to the version of the files.
bool isKnown(char32_t codePoint) {
    Version age{};
    u_charAge(static_cast<UChar32>(codePoint), age.data());
    return age != Version{} && age <= tables().version;
}

bool isSurrogate(char32_t codePoint) {
    return codePoint >= 0xD800 && codePoint < 0xE000;
}

std::u32string mappedBy(const Mapping& mapping, const std::u32string& text) {
    std::u32string mapped;
    for (const char32_t c : text) {
        const auto found = mapping.find(c);
        mapped += found != mapping.end() ? found->second : std::u32string(1, c);
    }
    return mapped;
}

/// The three mappings: the table, the function, and the character that ICU gives for a single one, by which a version
/// of ICU can be told in which an old letter has a new partner.
struct Folding {
    static const Mapping& table() { return tables().folded; }
    template <std::uint32_t N>
    static UString<N> of(UStringView<N> text) {
        return UString<N>::getAsFoldedCase(text);
    }
    static UChar32 partner(UChar32 c) { return c; }
};
struct UpperCase {
    static const Mapping& table() { return tables().upper; }
    template <std::uint32_t N>
    static UString<N> of(UStringView<N> text) {
        return UString<N>::getAsUpperCase(text);
    }
    static UChar32 partner(UChar32 c) { return u_toupper(c); }
};
struct LowerCase {
    static const Mapping& table() { return tables().lower; }
    template <std::uint32_t N>
    static UString<N> of(UStringView<N> text) {
        return UString<N>::getAsLowerCase(text);
    }
    static UChar32 partner(UChar32 c) { return u_tolower(c); }
};

/// Collects differences, and shows the first of them.
class Differences {
public:
    template <std::uint32_t N>
    void compare(const std::u32string& text, const UString<N>& actual, const Units<N>& expected) {
        ++compared_;
        if (std::basic_string_view<Unit<N>>(actual.rawData(), actual.size()) != expected &&
            ++different_ <= 10) {
            ADD_FAILURE() << "UString<" << N << "> from " << shown<3>(text) << ": is " << shown(actual)
                          << ", wanted " << shown<N>(expected);
        }
    }
    std::size_t compared() const { return compared_; }
    ~Differences() { EXPECT_EQ(different_, 0U) << "of " << compared_; }

private:
    std::size_t compared_ = 0;
    std::size_t different_ = 0;
};

class UStringCaseData : public ::testing::Test {
protected:
    // The files give the mappings of no language.
    void SetUp() override {
        before_ = uloc_getDefault();
        UErrorCode status = U_ZERO_ERROR;
        uloc_setDefault("", &status);
    }
    void TearDown() override {
        UErrorCode status = U_ZERO_ERROR;
        uloc_setDefault(before_.c_str(), &status);
    }

private:
    std::string before_;
};

/// UTF-8 and UTF-16 of every character that both versions know, the other types of those that change and some more.
template <typename Case>
void checkAll() {
    const Mapping& mapping = Case::table();
    ASSERT_GT(mapping.size(), 1400U);
    Differences differences;
    std::size_t changing = 0;
    std::size_t characters = 0;
    for (char32_t c = 0; c <= 0x10FFFF; ++c) {
        if (!isKnown(c)) {
            continue;
        }
        const std::u32string source(1, c);
        const std::u32string mapped = mappedBy(mapping, source);
        // A letter of old may have a new partner, which only one of the two sides knows.
        if (!std::all_of(mapped.begin(), mapped.end(), isKnown) ||
            !isKnown(static_cast<char32_t>(Case::partner(static_cast<UChar32>(c))))) {
            continue;
        }
        ++characters;
        changing += mapped != source ? 1 : 0;
        const std::u16string utf16 = toUtf16(source);
        const std::u16string mapped16 = lengthened(toUtf16(mapped), utf16);
        differences.compare(source, Case::template of<2>(utf16), mapped16);
        if (isSurrogate(c)) {
            continue;
        }
        const std::string utf8 = toUtf8(source);
        differences.compare(source, Case::template of<0>(utf8), lengthened(toUtf8(mapped), utf8));
        if (mapped == source && c % 13 != 0) {
            continue;
        }
        // The others go by way of UTF-16, and keep the zeros that it leaves.
        std::u32string padded = mapped;
        padded.resize(mapped.size() + mapped16.size() - toUtf16(mapped).size());
        differences.compare(source, Case::template of<3>(source), padded);
        differences.compare(source, Case::template of<27>(utf8), toUtf8(padded));
        const std::string wwjd = kvt::ex::detail::utf16ToWwjd(utf16);
        differences.compare(source, Case::template of<29>(wwjd), kvt::ex::detail::utf16ToWwjd(mapped16));
    }
    EXPECT_GT(characters, 250000U);
    EXPECT_GT(changing, 1300U);
}

TEST_F(UStringCaseData, FoldingIsThatOfTheUnicodeData) {
    checkAll<Folding>();
}

TEST_F(UStringCaseData, UpperCaseIsThatOfTheUnicodeData) {
    checkAll<UpperCase>();
}

TEST_F(UStringCaseData, LowerCaseIsThatOfTheUnicodeData) {
    checkAll<LowerCase>();
}

// Folding looks at each character alone, so that a text folds to the foldings of its characters; whatever it gains
// or loses, zeros fill up the whole and not the parts.
TEST_F(UStringCaseData, ATextFoldsCharacterByCharacter) {
    const std::u32string letters =
        U"aBz \u00DF\u0130\u0131\u017F\u0390\u03A3\u03C2\u1E9E\u1FB7\u212A\u2126\uFB03\u01F0"
        U"\u13A0\uAB70\U00010400\U0001E900\u4E00";
    std::mt19937 random(20240611);
    Differences differences;
    for (int i = 0; i < 20000; ++i) {
        std::u32string text;
        for (std::size_t left = random() % 12; left > 0; --left) {
            text += letters[random() % letters.size()];
        }
        const std::u32string folded = mappedBy(tables().folded, text);
        const std::string utf8 = toUtf8(text);
        const std::u16string utf16 = toUtf16(text);
        const std::u16string folded16 = lengthened(toUtf16(folded), utf16);
        std::u32string padded = folded;
        padded.resize(folded.size() + folded16.size() - toUtf16(folded).size());
        differences.compare(text, UString<0>::getAsFoldedCase(utf8), lengthened(toUtf8(folded), utf8));
        differences.compare(text, UString<2>::getAsFoldedCase(utf16), folded16);
        differences.compare(text, UString<3>::getAsFoldedCase(text), padded);
        differences.compare(text, UString<27>::getAsFoldedCase(utf8), toUtf8(padded));
        differences.compare(text, UString<29>::getAsFoldedCase(kvt::ex::detail::utf16ToWwjd(utf16)),
                            kvt::ex::detail::utf16ToWwjd(folded16));
    }
    EXPECT_EQ(differences.compared(), 100000U);
}

} // namespace
} // namespace kvt::test
