// Splitting and joining, the same for all string types but for the labels of UString<30>.
//
// The reference of the property tests walks the text unit by unit; the library jumps from one delimiter to the next.
#include <support/allocations.h>
#include <support/string_types.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <new>
#include <random>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;
using kvt::ex::UStringView;

using Texts = std::vector<std::string>;

constexpr std::uint64_t npos = UString<0>::npos;

template <typename Type>
class UStringSplit : public ::testing::Test {
public:
    static constexpr std::uint32_t number = Type::value;
    using String = UString<number>;
    using View = UStringView<number>;
    using Set = kvt::ex::vector<Unit<number>>;

    static Set set(std::string_view ascii) {
        const Units<number> units = asciiUnits<number>(ascii);
        return Set(units.begin(), units.end());
    }
    static auto behaviour(bool keep) { return keep ? String::KeepEmptyParts : String::SkipEmptyParts; }
};
TYPED_TEST_SUITE(UStringSplit, StringTypes, StringTypeNames);

/// A delimiter of one unit, so that all four overloads have to give the same.
struct UnitRow {
    const char* reason;
    const char* text;
    bool keep;
    std::uint64_t maxCount;
    Texts pieces;
};

const std::vector<UnitRow> unitRows = {
    {"nothing is one empty piece", "", true, npos, {""}},
    {"an empty piece is skipped", "", false, npos, {}},
    {"two pieces", "a,b", true, npos, {"a", "b"}},
    {"two pieces, nothing to skip", "a,b", false, npos, {"a", "b"}},
    {"a delimiter at the end", "a,", true, npos, {"a", ""}},
    {"a delimiter at the beginning", ",a", true, npos, {"", "a"}},
    {"a delimiter only", ",", true, npos, {"", ""}},
    {"a delimiter only, skipped", ",", false, npos, {}},
    {"no delimiter", "abc", true, npos, {"abc"}},
    {"many empty pieces", ",,a,,b,,", true, npos, {"", "", "a", "", "b", "", ""}},
    {"many empty pieces, skipped", ",,a,,b,,", false, npos, {"a", "b"}},
    {"one cut leaves the rest", "a,b,c", true, 1, {"a", "b,c"}},
    {"two cuts leave the rest", "a,b,c,d", true, 2, {"a", "b", "c,d"}},
    {"no cut", "a,b,c", true, 0, {"a,b,c"}},
    {"no cut, skipping", "a,b,c", false, 0, {"a,b,c"}},
    {"no cut of nothing is one piece", "", true, 0, {""}},
    {"also where empty pieces are skipped", "", false, 0, {""}},
    {"the rest is empty", "a,", true, 1, {"a", ""}},
    {"the rest is added though it is empty", "a,", false, 1, {"a", ""}},
    {"the rest begins with delimiters", "a,,,b", false, 1, {"a", ",,b"}},
    {"skipped pieces do not count", ",,a,,b,,c", false, 2, {"a", "b", ",c"}},
    {"kept ones do", ",,a", true, 2, {"", "", "a"}},
    {"as many as there are", "a,b", true, 2, {"a", "b"}},
    {"the last cut at the end", "a,b,", true, 2, {"a", "b", ""}},
    {"the last cut at the end, skipping", "a,b,", false, 2, {"a", "b", ""}},
    {"more than there are", "a,b", true, 3, {"a", "b"}},
    {"one piece of one", "a", true, 1, {"a"}},
    {"an empty piece of one", "", true, 1, {""}},
};

TYPED_TEST(UStringSplit, AllFourKindsOfDelimiterFollowTheTable) {
    using F = TestFixture;
    constexpr auto N = F::number;
    const Units<N> comma = asciiUnits<N>(",");
    for (const UnitRow& row : unitRows) {
        SCOPED_TRACE(std::string(row.reason) + ": " + row.text);
        const auto text = plain<N>(row.text);
        const auto behaviour = F::behaviour(row.keep);
        EXPECT_EQ(shown(text.split(comma[0], behaviour, row.maxCount)), row.pieces);
        EXPECT_EQ(shown(text.split(F::set(","), behaviour, row.maxCount)), row.pieces);
        EXPECT_EQ(shown(text.split(F::set(";,|,"), behaviour, row.maxCount)), row.pieces);
        EXPECT_EQ(shown(text.split(typename F::View(comma), behaviour, row.maxCount)), row.pieces);
        EXPECT_EQ(shown(text.split(plainArray<N>({","}), behaviour, row.maxCount)), row.pieces);
        EXPECT_EQ(shown(text.split(plainArray<N>({"no", ",", ",,"}), behaviour, row.maxCount)), row.pieces);
        EXPECT_EQ(text, plain<N>(row.text));
    }
}

TYPED_TEST(UStringSplit, KeepsEmptyPiecesAndCutsEverywhereUnlessToldOtherwise) {
    using F = TestFixture;
    constexpr auto N = F::number;
    const Units<N> comma = asciiUnits<N>(",");
    const auto text = plain<N>(",a,,b");
    const Texts expected = {"", "a", "", "b"};
    EXPECT_EQ(shown(text.split(comma[0])), expected);
    EXPECT_EQ(shown(text.split(F::set(","))), expected);
    EXPECT_EQ(shown(text.split(typename F::View(comma))), expected);
    EXPECT_EQ(shown(text.split(plainArray<N>({","}))), expected);
    EXPECT_EQ(shown(text.split(plain<N>(","))), expected) << "a string serves as view";
}

TYPED_TEST(UStringSplit, AnyBehaviourButZeroSkips) {
    using F = TestFixture;
    constexpr auto N = F::number;
    static_assert(static_cast<int>(F::String::KeepEmptyParts) == 0);
    static_assert(static_cast<int>(F::String::SkipEmptyParts) == 1);
    const auto text = plain<N>(",a,,b");
    const Texts expected = {"a", "b"};
    const Units<N> comma = asciiUnits<N>(",");
    for (const unsigned value : {1U, 2U, 256U, 0xFFFFFFFFU}) {
        SCOPED_TRACE(value);
        const auto behaviour = static_cast<typename F::String::SplitBehaviour>(value);
        EXPECT_EQ(shown(text.split(comma[0], behaviour)), expected);
        EXPECT_EQ(shown(text.split(F::set(","), behaviour)), expected);
        EXPECT_EQ(shown(text.split(typename F::View(comma), behaviour)), expected);
        EXPECT_EQ(shown(text.split(plainArray<N>({","}), behaviour)), expected);
    }
}

TYPED_TEST(UStringSplit, OfALongDelimiterOnlyTheFirstUnitGoes) {
    using F = TestFixture;
    constexpr auto N = F::number;
    struct Row {
        const char* text;
        const char* delimiter;
        bool keep;
        std::uint64_t maxCount;
        Texts pieces;
    };
    for (const Row& row : {
             Row{"axyb", "xy", true, npos, {"a", "yb"}},
             Row{"axybxyc", "xy", true, npos, {"a", "yb", "yc"}},
             Row{"xyxy", "xy", true, npos, {"", "y", "y"}},
             Row{"aaa", "aa", true, npos, {"", "", "a"}},
             Row{"aaa", "aa", false, npos, {"a"}},
             Row{"axybxyc", "xy", true, 1, {"a", "ybxyc"}},
             Row{"axy", "xy", false, 1, {"a", "y"}},
             Row{"ax", "xy", true, npos, {"ax"}},
         }) {
        SCOPED_TRACE(std::string(row.text) + " at " + row.delimiter);
        const Units<N> delimiter = asciiUnits<N>(row.delimiter);
        EXPECT_EQ(shown(plain<N>(row.text).split(typename F::View(delimiter), F::behaviour(row.keep),
                                                 row.maxCount)),
                  row.pieces);
        EXPECT_EQ(shown(plain<N>(row.text).split(plainArray<N>({row.delimiter}), F::behaviour(row.keep),
                                                 row.maxCount)),
                  row.pieces);
    }
}

TYPED_TEST(UStringSplit, TheEarliestOfSeveralStringsCuts) {
    using F = TestFixture;
    constexpr auto N = F::number;
    EXPECT_EQ(shown(plain<N>("a--b;c").split(plainArray<N>({";", "--"}))), (Texts{"a", "-b", "c"}));
    EXPECT_EQ(shown(plain<N>("a--b").split(plainArray<N>({"-", "--"}))), (Texts{"a", "", "b"}));
}

TYPED_TEST(UStringSplit, AnEmptyDelimiterCutsAtEveryUnit) {
    using F = TestFixture;
    constexpr auto N = F::number;
    const auto text = plain<N>("ab");
    EXPECT_EQ(shown(text.split(typename F::View())), (Texts{"", "", ""}));
    EXPECT_EQ(shown(text.split(plainArray<N>({""}))), (Texts{"", "", ""}));
    EXPECT_EQ(shown(text.split(plainArray<N>({"b", ""}))), (Texts{"", "", ""}));
    EXPECT_EQ(shown(text.split(typename F::View(), F::String::SkipEmptyParts)), Texts{});
    EXPECT_EQ(shown(text.split(typename F::View(), F::String::KeepEmptyParts, 1)), (Texts{"", "b"}));
    EXPECT_EQ(shown(text.split(typename F::View(), F::String::KeepEmptyParts, 2)), (Texts{"", "", ""}));
    EXPECT_EQ(shown(text.split(typename F::View(), F::String::KeepEmptyParts, 3)), (Texts{"", "", ""}));
    EXPECT_EQ(shown(plain<N>("").split(typename F::View())), Texts{""});
    EXPECT_EQ(shown(plain<N>("").split(plainArray<N>({""}))), Texts{""});
}

TYPED_TEST(UStringSplit, NoDelimiterAtAllNeverCuts) {
    using F = TestFixture;
    constexpr auto N = F::number;
    EXPECT_EQ(shown(plain<N>("ab").split(F::set(""))), Texts{"ab"});
    EXPECT_EQ(shown(plain<N>("ab").split(UStringArray<N>())), Texts{"ab"});
}

TYPED_TEST(UStringSplit, ZerosAreUnitsLikeAnyOther) {
    using F = TestFixture;
    constexpr auto N = F::number;
    const auto text = fromUnits<N>(asciiUnits<N>(std::string_view("a\0b\0", 4)));
    EXPECT_EQ(shown(text.split(Unit<N>())), (Texts{"a", "b", ""}));
    EXPECT_EQ(shown(text.split(asciiUnits<N>("b")[0])), (Texts{"a{0}", "{0}"}));
}

TYPED_TEST(UStringSplit, UnitsBeyondAsciiAreComparedWhole) {
    using F = TestFixture;
    constexpr auto N = F::number;
    // The last units share their low byte.
    Units<N> units = asciiUnits<N>("a?b");
    units[1] = static_cast<Unit<N>>(sizeof(Unit<N>) == 1 ? 0xE9 : 0x2C);
    Units<N> other = asciiUnits<N>("?");
    other[0] = static_cast<Unit<N>>(sizeof(Unit<N>) == 1 ? 0x69 : 0x12C);
    EXPECT_EQ(fromUnits<N>(units).split(units[1]).size(), 2U);
    EXPECT_EQ(fromUnits<N>(units).split(other[0]).size(), 1U);
    EXPECT_EQ(fromUnits<N>(units).split(typename F::Set{units[1]}).size(), 2U);
    EXPECT_EQ(fromUnits<N>(units).split(typename F::Set{other[0]}).size(), 1U);
}

// ---- Property: every short text over two letters, every delimiter of some length, every count

/// What splitting gives, with `delimiterAt` telling where a delimiter begins.
template <typename Text, typename DelimiterAt>
std::vector<Text> referenceSplit(const Text& text, bool keep, std::uint64_t maxCount,
                                 DelimiterAt delimiterAt) {
    if (maxCount == 0) {
        return {text};
    }
    std::vector<Text> pieces;
    Text piece;
    for (std::size_t i = 0; i <= text.size(); ++i) {
        if (i < text.size() && !delimiterAt(i)) {
            piece += text[i];
            continue;
        }
        if (keep || !piece.empty()) {
            pieces.push_back(piece);
            --maxCount;
        }
        piece.clear();
        if (maxCount == 0 && i < text.size()) {
            pieces.push_back(text.substr(i + 1));
            break;
        }
    }
    return pieces;
}

Texts wordsUpTo(std::size_t longest) {
    Texts words = {""};
    for (std::size_t i = 0; i < words.size() && words[i].size() < longest; ++i) {
        words.push_back(words[i] + 'a');
        words.push_back(words[i] + 'b');
    }
    return words;
}

template <std::uint32_t N>
bool sameUnits(const UStringArray<N>& actual, const std::vector<Units<N>>& expected) {
    return std::equal(actual.begin(), actual.end(), expected.begin(), expected.end(),
                      [](const UString<N>& a, const Units<N>& b) { return unitsOf(a) == b; });
}

/// Compares `split(text, behaviour, count)` with the reference for all texts, behaviours and counts.
template <std::uint32_t N, typename Split, typename DelimiterAt>
void compareAll(const std::string& what, Split split, DelimiterAt delimiterAt) {
    static const Texts words = wordsUpTo(6);
    for (const std::string& word : words) {
        const Units<N> units = asciiUnits<N>(word);
        const auto text = fromUnits<N>(units);
        for (const bool keep : {true, false}) {
            const auto behaviour = keep ? UString<N>::KeepEmptyParts : UString<N>::SkipEmptyParts;
            for (std::uint64_t i = 0; i <= word.size() + 3; ++i) {
                const std::uint64_t count = i <= word.size() + 2 ? i : npos;
                const auto actual = split(text, behaviour, count);
                const auto expected = referenceSplit(units, keep, count, [&](std::size_t at) {
                    return delimiterAt(std::string_view(word), at);
                });
                if (!sameUnits<N>(actual, expected)) {
                    ADD_FAILURE() << '"' << word << "\" at " << what
                                  << (keep ? ", keeping, " : ", skipping, ") << count << ": "
                                  << ::testing::PrintToString(shown(actual));
                    return;
                }
            }
        }
    }
}

bool beginsAt(std::string_view text, std::size_t at, std::string_view delimiter) {
    return text.substr(at, delimiter.size()) == delimiter;
}

TYPED_TEST(UStringSplit, AgreesWithTheReferenceOnUnits) {
    constexpr auto N = TestFixture::number;
    for (const char unit : {'a', 'b', 'c'}) {
        compareAll<N>(
            std::string(1, unit),
            [&](const auto& text, auto behaviour, std::uint64_t count) {
                return text.split(static_cast<Unit<N>>(unit), behaviour, count);
            },
            [&](std::string_view word, std::size_t at) { return word[at] == unit; });
    }
}

// Texts of several blocks, pieces of each length about that of what is copied in one step, and counts that end anywhere.
TYPED_TEST(UStringSplit, AgreesWithTheReferenceOnUnitsOfLongTexts) {
    constexpr auto N = TestFixture::number;
    const auto delimiter = static_cast<Unit<N>>('b');
    std::mt19937 random(17);
    for (const unsigned longest : {1U, 3U, 20U, 40U, 3000U}) {
        std::string text;
        while (text.size() < 5000) {
            text += std::string(random() % longest, 'a') + std::string(random() % 3, 'b');
        }
        const Units<N> units = asciiUnits<N>(text);
        for (const bool keep : {true, false}) {
            const auto behaviour = keep ? UString<N>::KeepEmptyParts : UString<N>::SkipEmptyParts;
            for (const std::uint64_t count :
                 {std::uint64_t{1}, std::uint64_t{50}, std::uint64_t{1000}, npos}) {
                EXPECT_TRUE(sameUnits<N>(
                    fromUnits<N>(units).split(delimiter, behaviour, count),
                    referenceSplit(units, keep, count, [&](std::size_t at) { return text[at] == 'b'; })))
                    << longest << (keep ? ", keeping, " : ", skipping, ") << count;
            }
        }
    }
}

TYPED_TEST(UStringSplit, AgreesWithTheReferenceOnSets) {
    using F = TestFixture;
    constexpr auto N = F::number;
    for (const std::string set : {"", "a", "b", "c", "ab", "ba", "bc", "aab", "abc"}) {
        const auto units = F::set(set);
        compareAll<N>(
            "set " + set,
            [&](const auto& text, auto behaviour, std::uint64_t count) {
                return text.split(units, behaviour, count);
            },
            [&](std::string_view word, std::size_t at) { return set.find(word[at]) != std::string::npos; });
    }
}

TYPED_TEST(UStringSplit, AgreesWithTheReferenceOnViews) {
    using F = TestFixture;
    constexpr auto N = F::number;
    for (const std::string& delimiter : wordsUpTo(3)) {
        const Units<N> units = asciiUnits<N>(delimiter);
        compareAll<N>(
            "view " + delimiter,
            [&](const auto& text, auto behaviour, std::uint64_t count) {
                return text.split(typename F::View(units), behaviour, count);
            },
            [&](std::string_view word, std::size_t at) { return beginsAt(word, at, delimiter); });
    }
}

TYPED_TEST(UStringSplit, AgreesWithTheReferenceOnArrays) {
    constexpr auto N = TestFixture::number;
    for (const std::string& first : wordsUpTo(2)) {
        for (const std::string& second : wordsUpTo(2)) {
            const auto array = plainArray<N>({first, second});
            compareAll<N>(
                "array of " + first + " and " + second,
                [&](const auto& text, auto behaviour, std::uint64_t count) {
                    return text.split(array, behaviour, count);
                },
                [&](std::string_view word, std::size_t at) {
                    return beginsAt(word, at, first) || beginsAt(word, at, second);
                });
        }
    }
}

// ---- Join

TYPED_TEST(UStringSplit, JoinPutsTheSeparatorBetween) {
    constexpr auto N = TestFixture::number;
    struct Row {
        Texts elements;
        const char* byComma;
        const char* byText;
    };
    for (const Row& row : {
             Row{{}, "", ""},
             Row{{"a"}, "a", "a"},
             Row{{""}, "", ""},
             Row{{"", ""}, ",", "<->"},
             Row{{"a", "", "b"}, "a,,b", "a<-><->b"},
             Row{{"", "a", ""}, ",a,", "<->a<->"},
             Row{{"x,y", "z"}, "x,y,z", "x,y<->z"},
         }) {
        const auto array = plainArray<N>(row.elements);
        EXPECT_EQ(shown(array.join(asciiUnits<N>(",")[0])), row.byComma);
        EXPECT_EQ(shown(array.join(plain<N>("<->"))), row.byText);
        std::string withoutSeparator;
        for (const std::string& element : row.elements) {
            withoutSeparator += element;
        }
        EXPECT_EQ(shown(array.join(plain<N>(""))), withoutSeparator);
        EXPECT_EQ(shown(array), row.elements);
    }
}

TYPED_TEST(UStringSplit, JoinCopiesUnitsWithoutALookAtThem) {
    constexpr auto N = TestFixture::number;
    // Neither is text in any encoding but the binary one.
    Units<N> bad = asciiUnits<N>("a?");
    bad[1] = static_cast<Unit<N>>(sizeof(Unit<N>) == 1 ? 0xFF : 0xD800);
    UStringArray<N> array;
    array.push_back(fromUnits<N>(bad));
    array.push_back(fromUnits<N>(bad));
    const std::string shownBad = sizeof(Unit<N>) == 1 ? "{FF}" : "{D800}";
    EXPECT_EQ(shown(array.join(bad[1])), "a" + shownBad + shownBad + "a" + shownBad);
    EXPECT_EQ(shown(array.join(Unit<N>())), "a" + shownBad + "{0}a" + shownBad);
    EXPECT_EQ(shown(array.join(fromUnits<N>(bad))), "a" + shownBad + "a" + shownBad + "a" + shownBad);
}

TYPED_TEST(UStringSplit, JoiningThePiecesAtTheDelimiterGivesTheText) {
    constexpr auto N = TestFixture::number;
    for (const std::string& word : wordsUpTo(6)) {
        const auto text = plain<N>(word);
        const Unit<N> delimiter = asciiUnits<N>("b")[0];
        for (const std::uint64_t count : {std::uint64_t(0), std::uint64_t(1), std::uint64_t(3), npos}) {
            EXPECT_EQ(shown(text.split(delimiter, UString<N>::KeepEmptyParts, count).join(delimiter)), word);
        }
    }
}

TYPED_TEST(UStringSplit, PiecesAreStringsOfTheirOwn) {
    using F = TestFixture;
    constexpr auto N = F::number;
    auto text = plain<N>("first piece that is long,second piece that is long");
    auto pieces = text.split(asciiUnits<N>(",")[0]);
    text.clear();
    EXPECT_EQ(shown(pieces), (Texts{"first piece that is long", "second piece that is long"}));
    EXPECT_EQ(pieces.getAsIZQTStringArray().entries(), 2U);
}

TYPED_TEST(UStringSplit, LackOfMemoryIsReportedAndLeavesNothingBehind) {
    using F = TestFixture;
    constexpr auto N = F::number;
    const std::string element(60, 'x');
    const auto text = plain<N>(element + "," + element + "," + element);
    std::size_t failures = 0;
    for (std::size_t index = 0;; ++index) {
        try {
            const FailingAllocations failing(index, 1);
            const auto pieces = text.split(asciiUnits<N>(",")[0]);
            const auto joined = pieces.join(plain<N>(","));
            if (!FailingAllocations::happened()) {
                EXPECT_EQ(joined, text);
                break;
            }
            ADD_FAILURE() << "allocation " << index << " was let pass";
        } catch (const std::bad_alloc&) {
            ++failures;
        }
        ASSERT_LT(index, 1000U);
    }
    EXPECT_GT(failures, 6U);
}

TYPED_TEST(UStringSplit, AnArrayBeyondItsLargestSizeIsRefused) {
    constexpr auto N = TestFixture::number;
    UStringArray<N> array = plainArray<N>({"a", "b"});
    try {
        array.resize(UStringArray<N>::max_size() + 1);
        ADD_FAILURE() << "nothing was thrown";
    } catch (const std::length_error& failure) {
        EXPECT_STREQ(failure.what(), "vector<T> too long");
    }
    EXPECT_EQ(shown(array), (Texts{"a", "b"}));
}

// ---- UString<30>

TEST(UStringSplitAny, PiecesHaveNoEncoding) {
    const Encoding latin1(kvt::future::string_view("ISO-8859-1"));
    const UString<30> text("a,b,c", 5, latin1);
    UStringArray<30> commas;
    commas.push_back(UString<30>(",", 1, latin1));
    for (const auto& pieces :
         {text.split(','), text.split(kvt::ex::vector<char>{','}), text.split(UStringView<30>(",")),
          text.split(commas), text.split(',', UString<30>::SkipEmptyParts, 1),
          text.split(',', UString<30>::KeepEmptyParts, 0)}) {
        EXPECT_GT(pieces.size(), 0U);
        for (const UString<30>& piece : pieces) {
            EXPECT_EQ(piece.encoding().id(), Encoding::Unknown) << shown(piece);
        }
    }
    EXPECT_EQ(text.encoding(), latin1);
}

TEST(UStringSplitAny, JoinedByAUnitTheFirstElementGivesTheEncoding) {
    UStringArray<30> array;
    EXPECT_EQ(array.join(',').encoding().id(), Encoding::Unknown);
    array.push_back(UString<30>("\xE9", 1, Encoding(kvt::future::string_view("ISO-8859-1"))));
    array.push_back(UString<30>("\xC3\xA9", 2, Encoding::Utf8));
    EXPECT_EQ(array.join(',').encoding(), Encoding(kvt::future::string_view("ISO-8859-1")));
    EXPECT_EQ(shown(array.join(',')), "{E9},{C3}{A9}") << "nothing is converted";
    std::swap(array[0], array[1]);
    EXPECT_EQ(array.join(',').encoding().id(), Encoding::Utf8);
    array[0].setEncoding(Encoding::Unknown);
    EXPECT_EQ(array.join(',').encoding().id(), Encoding::Unknown);
}

TEST(UStringSplitAny, JoinedByAStringItIsTheSeparatorThatGivesIt) {
    const UString<30> separator("; ", 2, Encoding(kvt::future::string_view("ISO-8859-1")));
    UStringArray<30> array;
    EXPECT_EQ(array.join(separator).encoding(), separator.encoding());
    array.push_back(UString<30>("a", 1, Encoding::Utf8));
    EXPECT_EQ(array.join(separator).encoding(), separator.encoding());
    array.push_back(UString<30>("b", 1, Encoding::Binary));
    EXPECT_EQ(array.join(separator).encoding(), separator.encoding());
    EXPECT_EQ(shown(array.join(separator)), "a; b");
    EXPECT_EQ(array.join(UString<30>()).encoding().id(), Encoding::Unknown);
}

} // namespace
} // namespace kvt::test
