// Search in vector registers, for each instruction set that this machine has and without any: the same results as plain
// loops, at all lengths around those of the registers, with nothing read outside of what is given.
#include <kvt/string/detail/unit_vectors.h>
#include <string/naive_units.h>
#include <support/guarded_memory.h>
#include <support/vector_targets.h>

#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <string>
#include <vector>

namespace kvt::test {
namespace {

namespace vectors = kvt::ex::detail::vectors;

template <typename Unit>
constexpr Unit highest = static_cast<Unit>(~std::make_unsigned_t<Unit>{0});

class UnitVectors : public OnEachVectorTarget {
protected:
    // The text at the end of memory that can be touched.
    template <typename Unit>
    const Unit* placed(const std::basic_string<Unit>& text) {
        Unit* const units = reinterpret_cast<Unit*>(memory_.end()) - text.size();
        std::memcpy(units, text.data(), text.size() * sizeof(Unit));
        return units;
    }

    template <typename Unit>
    void checkFind(const std::basic_string<Unit>& text, const std::basic_string<Unit>& needle) {
        const std::size_t places = text.size() - needle.size() + 1;
        const vectors::Place place =
            vectors::findSequence(placed(text), places, needle.data(), needle.size());
        const std::uint64_t expected = naive::find<Unit>(text, needle, 0);
        if (place.isSettled) {
            ASSERT_EQ(place.at, std::min<std::uint64_t>(expected, places)) << text.size();
        } else {
            ASSERT_EQ(sizeof(Unit), 1U);
            ASSERT_LE(place.at, expected) << text.size();
        }
    }

    template <typename Unit>
    void checkParts(const std::basic_string<Unit>& text, Unit delimiter) {
        std::vector<std::uint32_t> expected;
        std::size_t parts = 0;
        for (std::size_t i = 0; i < text.size(); ++i) {
            if (text[i] == delimiter) {
                expected.push_back(static_cast<std::uint32_t>(i));
            } else if (i == 0 || text[i - 1] == delimiter) {
                ++parts;
            }
        }
        const Unit* const units = placed(text);
        std::vector<std::uint32_t> places(text.size());
        places.resize(
            vectors::placesOf(units, static_cast<std::uint32_t>(text.size()), delimiter, places.data()));
        ASSERT_EQ(places, expected) << text.size();
        ASSERT_EQ(vectors::countParts(units, text.size(), delimiter, true), expected.size() + 1)
            << text.size();
        ASSERT_EQ(vectors::countParts(units, text.size(), delimiter, false), parts) << text.size();
    }

    template <typename Unit>
    void checkAll() {
        std::mt19937 random(9);
        const Unit mark = highest<Unit>;
        for (std::size_t size = 1; size <= 300; size += size < 140 ? 1 : 13) {
            for (const unsigned every : {1U, 2U, 5U, 40U}) {
                std::basic_string<Unit> text;
                while (text.size() < size) {
                    text += random() % every == 0 ? mark : static_cast<Unit>('a' + random() % 2);
                }
                checkParts(text, mark);
                checkParts(text, Unit{'a'});
                const std::size_t length = 1 + random() % std::min<std::size_t>(size, 9);
                checkFind(text, text.substr(random() % (size - length + 1), length));
                checkFind(text, std::basic_string<Unit>(length, mark));
                checkFind(text, text.substr(size - length));
                checkFind(text, text);
            }
        }
    }

    // A needle that stands once, at each place, while its ends stand often.
    template <typename Unit>
    void checkPlaces() {
        for (const std::size_t size : {8U, 17U, 33U, 64U, 66U, 129U, 260U}) {
            for (std::size_t at = 0; at + 3 <= size; ++at) {
                std::basic_string<Unit> text(size, Unit{'a'});
                text[at + 1] = highest<Unit>;
                checkFind(text, std::basic_string<Unit>{Unit{'a'}, highest<Unit>, Unit{'a'}});
            }
        }
    }

    // Needles of which all units stand but for one, that one being any.
    template <typename Unit>
    void checkUnitsBetween() {
        for (std::size_t length = 1; length <= 40; ++length) {
            std::basic_string<Unit> needle;
            while (needle.size() < length) {
                needle += static_cast<Unit>('a' + needle.size());
            }
            for (std::size_t at = 0; at < length; ++at) {
                std::basic_string<Unit> almost = needle;
                almost[at] = highest<Unit>;
                checkFind(almost + almost, needle);
                checkFind(almost + needle, needle);
            }
        }
    }

private:
    GuardedMemory memory_{1 << 12};
};

INSTANTIATE_TEST_SUITE_P(Each, UnitVectors, testing::ValuesIn(vectorTargets()), vectorTargetName);

TEST_P(UnitVectors, BytesAreFoundCountedAndListed) {
    checkAll<char>();
    checkPlaces<char>();
    checkUnitsBetween<char>();
}

TEST_P(UnitVectors, UnitsOfSixteenBitsAreFoundCountedAndListed) {
    checkAll<char16_t>();
    checkPlaces<char16_t>();
    checkUnitsBetween<char16_t>();
}

TEST_P(UnitVectors, UnitsOfThirtyTwoBitsAreFoundCountedAndListed) {
    checkAll<char32_t>();
    checkPlaces<char32_t>();
    checkUnitsBetween<char32_t>();
}

TEST_P(UnitVectors, TheSearchForBytesGivesUpWhereItsEndsStandInVain) {
    const std::string text(10000, 'a');
    const std::string needle = "ab" + std::string(50, 'a');
    const vectors::Place place =
        vectors::findSequence(text.data(), text.size() - needle.size() + 1, needle.data(), needle.size());
    EXPECT_FALSE(place.isSettled);
    EXPECT_LT(place.at, 100U);
}

} // namespace
} // namespace kvt::test
