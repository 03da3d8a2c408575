// Search against plain loops: every small text and needle over two units from every position, and random texts that
// are long enough for matches to lie across the blocks in which the library looks.
#include <string/naive_units.h>
#include <support/string_types.h>

#include <random>

namespace {

using namespace kvt::test;

template <typename Number>
class UStringSearchProperty : public StringTest<Number> {
public:
    using typename StringTest<Number>::Units;
    using typename StringTest<Number>::Unit;
    using typename StringTest<Number>::Array;
    using Needles = std::vector<Units>;

    /// Every position that a text of that size has, some beyond it, and those where additions wrap.
    static std::vector<std::uint64_t> positionsFor(std::size_t size) {
        std::vector<std::uint64_t> positions;
        for (std::uint64_t pos = 0; pos <= size + 3; ++pos) {
            positions.push_back(pos);
        }
        for (const std::uint64_t pos : {std::uint64_t{1} << 32, (std::uint64_t{1} << 63) - 1,
                                        std::uint64_t{1} << 63, npos - 2, npos - 1, npos}) {
            positions.push_back(pos);
        }
        return positions;
    }

    static Units randomText(std::mt19937& random, std::size_t size, const Units& alphabet) {
        Units text;
        while (text.size() < size) {
            text += alphabet[random() % alphabet.size()];
        }
        return text;
    }

    static Array arrayOf(const Needles& needles) {
        Array array;
        for (const Units& needle : needles) {
            array.push_back(StringTest<Number>::make(needle));
        }
        return array;
    }

    /// All searches for one needle, from every position.
    static void searchEverywhere(const Units& text, const Units& needle) {
        const auto string = StringTest<Number>::make(text);
        const auto sought = StringTest<Number>::make(needle);
        for (const std::uint64_t pos : positionsFor(text.size())) {
            const auto where = [&] {
                return shown(needle) + " in " + shown(text) + " from " + std::to_string(pos);
            };
            ASSERT_EQ(string.find(sought, pos), naive::find(text, needle, pos)) << where();
            ASSERT_EQ(string.rfind(sought, pos), naive::rfind(text, needle, pos)) << where();
            if (needle.size() == 1) {
                ASSERT_EQ(string.find(needle[0], pos), naive::find(text, needle, pos)) << where();
                ASSERT_EQ(string.rfind(needle[0], pos), naive::rfind(text, needle, pos)) << where();
            }
        }
        const bool begins = naive::standsAt(text, 0, needle);
        const bool ends =
            needle.size() <= text.size() && naive::standsAt(text, text.size() - needle.size(), needle);
        ASSERT_EQ(string.beginsWith(sought), begins) << shown(needle) << " and " << shown(text);
        ASSERT_EQ(string.endsWith(sought), ends) << shown(needle) << " and " << shown(text);
        ASSERT_EQ(string.contains(sought), naive::find(text, needle, 0) != npos)
            << shown(needle) << " in " << shown(text);
    }

    static void searchSetEverywhere(const Units& text, const Units& members) {
        const auto string = StringTest<Number>::make(text);
        const auto set = StringTest<Number>::set(members);
        for (const std::uint64_t pos : positionsFor(text.size())) {
            const auto where = [&] {
                return shown(members) + " in " + shown(text) + " from " + std::to_string(pos);
            };
            ASSERT_EQ(string.findFirstOf(set, pos), naive::findFirstOf(text, members, pos)) << where();
            ASSERT_EQ(string.findLastOf(set, pos), naive::findLastOf(text, members, pos)) << where();
        }
    }

    static void searchArrayEverywhere(const Units& text, const Needles& needles) {
        const auto string = StringTest<Number>::make(text);
        const Array array = arrayOf(needles);
        for (const std::uint64_t pos : positionsFor(text.size())) {
            const auto where = [&] {
                std::string row;
                for (const Units& needle : needles) {
                    row += shown(needle) + ' ';
                }
                return row + "in " + shown(text) + " from " + std::to_string(pos);
            };
            ASSERT_EQ(string.findFirstOf(array, pos), naive::findFirstOf(text, needles, pos)) << where();
            ASSERT_EQ(string.findLastOf(array, pos), naive::findLastOf(text, needles, pos)) << where();
        }
    }
};
TYPED_TEST_SUITE(UStringSearchProperty, StringTypes, StringTypeNames);

// An ordinary unit, and the one that is lowest or highest as signs are read.
template <typename Test>
typename Test::Units twoUnits() {
    return {Test::unit('a'), Test::highest};
}

TYPED_TEST(UStringSearchProperty, FindsEachSmallNeedleInEachSmallText) {
    for (const auto& text : naive::textsUpTo(7, twoUnits<TestFixture>())) {
        for (const auto& needle : naive::textsUpTo(3, twoUnits<TestFixture>())) {
            ASSERT_NO_FATAL_FAILURE(this->searchEverywhere(text, needle));
        }
    }
    // Needles longer than the text, and the text itself.
    for (const auto& text : naive::textsUpTo(4, twoUnits<TestFixture>())) {
        for (const auto& needle : naive::textsUpTo(5, twoUnits<TestFixture>())) {
            ASSERT_NO_FATAL_FAILURE(this->searchEverywhere(text, needle));
        }
    }
}

TYPED_TEST(UStringSearchProperty, FindsTheUnitsOfEachSmallSet) {
    const typename TestFixture::Units alphabet{TestFixture::unit('a'), TestFixture::unit('\0'),
                                               TestFixture::highest};
    for (const auto& text : naive::textsUpTo(5, alphabet)) {
        for (const auto& members : naive::textsUpTo(2, alphabet)) {
            ASSERT_NO_FATAL_FAILURE(this->searchSetEverywhere(text, members));
        }
    }
}

TYPED_TEST(UStringSearchProperty, FindsTheStringsOfEachSmallArray) {
    const auto needles = naive::textsUpTo(2, twoUnits<TestFixture>());
    for (const auto& text : naive::textsUpTo(5, twoUnits<TestFixture>())) {
        ASSERT_NO_FATAL_FAILURE(this->searchArrayEverywhere(text, {}));
        for (const auto& one : needles) {
            ASSERT_NO_FATAL_FAILURE(this->searchArrayEverywhere(text, {one}));
            for (const auto& other : needles) {
                ASSERT_NO_FATAL_FAILURE(this->searchArrayEverywhere(text, {one, other}));
            }
        }
    }
}

TYPED_TEST(UStringSearchProperty, FindsNeedlesAtEachPlaceOfLongTexts) {
    const auto filler = TestFixture::unit('.');
    for (const std::size_t size : {31u, 32u, 33u, 63u, 64u, 65u, 95u, 97u}) {
        for (std::size_t at = 0; at < size; ++at) {
            auto text = typename TestFixture::Units(size, filler);
            text[at] = TestFixture::highest;
            const auto string = this->make(text);
            ASSERT_EQ(string.find(TestFixture::highest), at) << size;
            ASSERT_EQ(string.rfind(TestFixture::highest), at) << size;
            ASSERT_EQ(string.find(TestFixture::highest, at + 1), npos) << size;
            if (at > 0) {
                ASSERT_EQ(string.rfind(TestFixture::highest, at - 1), npos) << size;
            }
            for (std::size_t length = 2; at + length <= size && length < 5; ++length) {
                const auto needle = this->make(text.substr(at, length));
                ASSERT_EQ(string.find(needle), at) << size << ' ' << length;
                ASSERT_EQ(string.rfind(needle), at) << size << ' ' << length;
            }
            // One unit too long for what is left.
            auto beyond = text.substr(at);
            beyond += filler;
            ASSERT_EQ(string.find(this->make(beyond)), npos) << size << " at " << at;
            ASSERT_EQ(string.rfind(this->make(beyond)), npos) << size << " at " << at;
        }
    }
}

TYPED_TEST(UStringSearchProperty, FindsNeedlesInRandomLongTexts) {
    std::mt19937 random(20240611);
    const auto alphabet = twoUnits<TestFixture>() + TestFixture::unit('b');
    for (int round = 0; round < 60; ++round) {
        // Mostly the first unit, so that long needles come close to matching.
        const auto text =
            this->randomText(random, random() % 140, random() % 2 == 0 ? alphabet : alphabet.substr(0, 2));
        auto needle = text.substr(text.empty() ? 0 : random() % text.size(), random() % 40);
        if (!needle.empty() && random() % 2 == 0) {
            needle[random() % needle.size()] = alphabet[random() % 3];
        }
        ASSERT_NO_FATAL_FAILURE(this->searchEverywhere(text, needle));
        ASSERT_NO_FATAL_FAILURE(this->searchSetEverywhere(text, needle.substr(0, random() % 3)));
        ASSERT_NO_FATAL_FAILURE(
            this->searchArrayEverywhere(text, {needle, this->randomText(random, 1 + random() % 8, alphabet),
                                               this->randomText(random, 6, alphabet)}));
    }
}

TYPED_TEST(UStringSearchProperty, FindsANeedleBehindManyThatAlmostMatch) {
    // The first unit of the needle stands everywhere, so that the search by first units gives way to another one.
    for (const std::size_t size : {100u, 600u, 3000u}) {
        for (const std::size_t needleSize : {2u, 3u, 20u, 70u}) {
            const auto a = TestFixture::unit('a');
            auto needle = typename TestFixture::Units(needleSize, a);
            needle.back() = TestFixture::highest;
            auto text = typename TestFixture::Units(size, a);
            EXPECT_EQ(this->make(text).find(this->make(needle)), npos);
            EXPECT_EQ(this->make(text).rfind(this->make(needle)), npos);
            for (const std::size_t at : {std::size_t{80}, size / 2, size - 1}) {
                text.assign(size, a);
                text[at] = TestFixture::highest;
                const std::uint64_t expected = naive::find(text, needle, 0);
                EXPECT_EQ(this->make(text).find(this->make(needle)), expected) << size << ' ' << at;
                EXPECT_EQ(this->make(text).find(this->make(needle), at), npos) << size << ' ' << at;
                EXPECT_EQ(this->make(text).rfind(this->make(needle)), expected) << size << ' ' << at;
            }
        }
    }
}

TYPED_TEST(UStringSearchProperty, ComparesAndHashesEachPairOfSmallTexts) {
    const typename TestFixture::Units alphabet{TestFixture::unit('a'), TestFixture::unit('\0'),
                                               TestFixture::highest};
    const auto texts = naive::textsUpTo(4, alphabet);
    for (const auto& left : texts) {
        const auto string = this->make(left);
        ASSERT_EQ(string.hash(), naive::hash(left)) << shown(left);
        for (const auto& right : texts) {
            const auto other = this->make(right);
            const int expected = naive::compare(left, right);
            const int compared = string.compare(other);
            ASSERT_EQ((compared > 0) - (compared < 0), expected) << shown(left) << ' ' << shown(right);
            if (!TestFixture::narrow) {
                ASSERT_EQ(compared, expected) << shown(left) << ' ' << shown(right);
            }
            ASSERT_EQ(string == other, expected == 0) << shown(left) << ' ' << shown(right);
            ASSERT_EQ(string < other, expected < 0) << shown(left) << ' ' << shown(right);
        }
    }
}

TYPED_TEST(UStringSearchProperty, HashesRandomUnits) {
    std::mt19937 random(7);
    for (int round = 0; round < 200; ++round) {
        typename TestFixture::Units text;
        for (std::size_t size = random() % 50; text.size() < size;) {
            text += static_cast<typename TestFixture::Unit>(random());
        }
        ASSERT_EQ(this->make(text).hash(), naive::hash(text)) << shown(text);
    }
}

// Every text over letters that differ in case only: the search runs on the folded copies, with the position as given.
TYPED_TEST(UStringSearchProperty, WithoutRegardToCaseIsSearchInFoldedText) {
    if constexpr (TestFixture::folds) {
        const kvt::ex::detail::case_insensitive_t tag;
        const auto fold = [](typename TestFixture::Units text) {
            for (auto& unit : text) {
                unit = unit == TestFixture::unit('A') ? TestFixture::unit('a') : unit;
            }
            return text;
        };
        const auto alphabet = TestFixture::units("aAb");
        for (const auto& text : naive::textsUpTo(4, alphabet)) {
            const auto string = this->make(text);
            for (const auto& needle : naive::textsUpTo(2, alphabet)) {
                const auto sought = this->make(needle);
                const auto foldedText = fold(text);
                const auto foldedNeedle = fold(needle);
                for (const std::uint64_t pos : {std::uint64_t{0}, std::uint64_t{1}, std::uint64_t{4}, npos}) {
                    ASSERT_EQ(string.find(sought, pos, tag), naive::find(foldedText, foldedNeedle, pos))
                        << shown(needle) << " in " << shown(text) << " from " << pos;
                    ASSERT_EQ(string.rfind(sought, pos, tag), naive::rfind(foldedText, foldedNeedle, pos))
                        << shown(needle) << " in " << shown(text) << " from " << pos;
                }
                const int compared = string.compare(sought, tag);
                ASSERT_EQ((compared > 0) - (compared < 0), naive::compare(foldedText, foldedNeedle))
                    << shown(needle) << " and " << shown(text);
                ASSERT_EQ(string.beginsWith(sought, tag), naive::standsAt(foldedText, 0, foldedNeedle));
                ASSERT_EQ(string.endsWith(sought, tag),
                          needle.size() <= text.size() &&
                              naive::standsAt(foldedText, text.size() - needle.size(), foldedNeedle));
                ASSERT_EQ(string.contains(sought, tag), naive::find(foldedText, foldedNeedle, 0) != npos);
            }
        }
    }
}

// The same with characters whose folded form has another length: U+0149 grows, and the Kelvin sign shrinks in UTF-8.
TYPED_TEST(UStringSearchProperty, PositionsAreThoseOfTheFoldedText) {
    if constexpr (TestFixture::folds && TestFixture::number != Encoding::UsAscii) {
        const kvt::ex::detail::case_insensitive_t tag;
        const std::vector<std::string> characters{"k", "N", "\u0149", "\u212A", "\u00DF"};
        std::mt19937 random(5);
        for (int round = 0; round < 300; ++round) {
            std::string text;
            std::string needle;
            for (std::size_t count = random() % 6; count > 0; --count) {
                text += characters[random() % characters.size()];
            }
            for (std::size_t count = random() % 2; count < 2; ++count) {
                needle += characters[random() % characters.size()];
            }
            const auto string = this->converted(text);
            const auto sought = this->converted(needle);
            const auto foldedText = this->textOf(string.getAsFoldedCase());
            const auto foldedNeedle = this->textOf(sought.getAsFoldedCase());
            for (const std::uint64_t pos : this->positionsFor(foldedText.size())) {
                ASSERT_EQ(string.find(sought, pos, tag), naive::find(foldedText, foldedNeedle, pos))
                    << needle << " in " << text << " from " << pos;
                ASSERT_EQ(string.rfind(sought, pos, tag), naive::rfind(foldedText, foldedNeedle, pos))
                    << needle << " in " << text << " from " << pos;
            }
        }
    }
}

} // namespace
