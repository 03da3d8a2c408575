// The algorithms on spans of units, for each width: what the strings do not show, such as reads beyond the end, starts
// that are not aligned, and the two ways of the search for bytes.
#include <kvt/string/detail/unit_search.h>
#include <string/naive_units.h>

#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <string>

namespace {

using namespace kvt::ex::detail;
namespace naive = kvt::test::naive;

template <typename Unit>
class UnitSearch : public testing::Test {
public:
    /// The units in a block of memory of their own, of just their size: a sanitizer sees each read beyond it.
    struct Exact {
        explicit Exact(const std::basic_string<Unit>& text)
            : memory(new Unit[text.size()]), view(memory.get(), text.size()) {
            std::copy(text.begin(), text.end(), memory.get());
        }
        std::unique_ptr<Unit[]> memory;
        Units<Unit> view;
    };

    static constexpr Unit highest = static_cast<Unit>(~std::make_unsigned_t<Unit>{0});
};
struct UnitNames {
    template <typename Unit>
    static std::string GetName(int) {
        return std::to_string(8 * sizeof(Unit)) + "bits";
    }
};
using UnitTypes = testing::Types<char, char16_t, char32_t>;
TYPED_TEST_SUITE(UnitSearch, UnitTypes, UnitNames);

TYPED_TEST(UnitSearch, FindsAUnitAtEachPlaceFromEachStart) {
    using Unit = TypeParam;
    for (const std::size_t size : {0u, 1u, 2u, 15u, 16u, 31u, 32u, 33u, 47u, 63u, 64u, 65u, 96u, 100u}) {
        for (std::size_t at = 0; at <= size; ++at) {
            std::basic_string<Unit> text(size, Unit{'.'});
            if (at < size) {
                text[at] = this->highest;
            }
            const typename TestFixture::Exact exact(text);
            const Unit* const first = exact.view.data();
            for (std::size_t start = 0; start <= size; ++start) {
                const Unit* const expected = at < size && start <= at ? first + at : nullptr;
                ASSERT_EQ(findUnit(first + start, first + size, this->highest), expected)
                    << size << ' ' << at << ' ' << start;
                ASSERT_EQ(rfindUnit(first + start, first + size, this->highest), expected)
                    << size << ' ' << at << ' ' << start;
            }
        }
    }
}

TYPED_TEST(UnitSearch, FindsTheNearestOfManyUnits) {
    using Unit = TypeParam;
    std::mt19937 random(3);
    for (int round = 0; round < 2000; ++round) {
        std::basic_string<Unit> text;
        for (std::size_t size = random() % 120; text.size() < size;) {
            text += random() % 40 == 0 ? this->highest : Unit{'.'};
        }
        const typename TestFixture::Exact exact(text);
        const std::size_t pos = random() % (text.size() + 2);
        const std::basic_string<Unit> needle(1, this->highest);
        ASSERT_EQ(findUnit(exact.view, this->highest, pos), naive::find(text, needle, pos));
        ASSERT_EQ(rfindUnit(exact.view, this->highest, pos), naive::rfind(text, needle, pos));
    }
}

TYPED_TEST(UnitSearch, FindsSequencesInMemoryOfTheirOwn) {
    using Unit = TypeParam;
    std::mt19937 random(4);
    for (int round = 0; round < 3000; ++round) {
        std::basic_string<Unit> text;
        for (std::size_t size = random() % 100; text.size() < size;) {
            text += random() % 3 == 0 ? this->highest : Unit{'.'};
        }
        const std::basic_string<Unit> needle =
            text.substr(text.empty() ? 0 : random() % text.size(), random() % 8) +
            std::basic_string<Unit>(random() % 2, Unit{'.'});
        const typename TestFixture::Exact exact(text);
        const typename TestFixture::Exact sought(needle);
        const std::size_t pos = random() % (text.size() + 2);
        ASSERT_EQ(findUnits(exact.view, sought.view, pos), naive::find(text, needle, pos));
        ASSERT_EQ(rfindUnits(exact.view, sought.view, pos), naive::rfind(text, needle, pos));
        ASSERT_EQ(sameUnits(exact.view.substr(0, needle.size()), sought.view),
                  naive::standsAt(text, 0, needle));
    }
}

// 16 first units in vain bring the other search for bytes; the match may lie before, at and behind that place.
TYPED_TEST(UnitSearch, FindsTheSameBeforeAndBehindTheChangeOfSearch) {
    using Unit = TypeParam;
    for (std::size_t at = 0; at < 60; ++at) {
        std::basic_string<Unit> text;
        for (std::size_t i = 0; i < 60; ++i) {
            text += i == at ? std::basic_string<Unit>{Unit{'a'}, this->highest, Unit{'b'}}
                            : std::basic_string<Unit>{Unit{'a'}, this->highest, Unit{'c'}};
        }
        const std::basic_string<Unit> needle{Unit{'a'}, this->highest, Unit{'b'}};
        const typename TestFixture::Exact exact(text);
        for (const std::size_t pos : {std::size_t{0}, at, 3 * at, 3 * at + 1}) {
            ASSERT_EQ(findUnits(exact.view, Units<Unit>(needle), pos), naive::find(text, needle, pos)) << at;
        }
        ASSERT_EQ(rfindUnits(exact.view, Units<Unit>(needle), notFound), 3 * at);
    }
}

TYPED_TEST(UnitSearch, TakesSpansWithoutAnAddress) {
    using Unit = TypeParam;
    const Units<Unit> none;
    const std::basic_string<Unit> text(3, Unit{'a'});
    EXPECT_EQ(findUnits(none, none, 0), 0u);
    EXPECT_EQ(findUnits(none, none, 1), notFound);
    EXPECT_EQ(findUnits(Units<Unit>(text), none, 3), 3u);
    EXPECT_EQ(findUnits(none, Units<Unit>(text), 0), notFound);
    EXPECT_EQ(rfindUnits(none, none, notFound), 0u);
    EXPECT_EQ(rfindUnits(Units<Unit>(text), none, notFound), 3u);
    EXPECT_EQ(rfindUnits(none, Units<Unit>(text), 0), notFound);
    EXPECT_EQ(findUnit(none, Unit{'a'}, 0), notFound);
    EXPECT_EQ(findUnit(text.data(), text.data(), Unit{'a'}), nullptr);
    EXPECT_EQ(rfindUnit(none, Unit{'a'}, notFound), notFound);
    EXPECT_TRUE(sameUnits(none, none));
    EXPECT_TRUE(sameUnits(none, Units<Unit>(text).substr(3)));
    EXPECT_FALSE(sameUnits(none, Units<Unit>(text)));
    const UnitSet<Unit> empty(nullptr, 0);
    EXPECT_EQ(empty.findFirst(none, 0), notFound);
    EXPECT_EQ(empty.findLast(none, notFound), notFound);
    EXPECT_EQ(empty.findFirst(Units<Unit>(text), 0), notFound);
    EXPECT_EQ(empty.findFirst(Units<Unit>(text), 1, false), 1u);
    EXPECT_EQ(empty.findLast(Units<Unit>(text), notFound, false), 2u);
}

TYPED_TEST(UnitSearch, SetHoldsItsUnitsAndNoOther) {
    using Unit = TypeParam;
    const std::basic_string<Unit> members{Unit{'a'}, Unit{0}, this->highest, static_cast<Unit>(0x1061),
                                          Unit{'a'}};
    const UnitSet<Unit> set(members.data(), members.size());
    for (std::uint32_t number = 0; number < 0x20000; ++number) {
        const auto unit = static_cast<Unit>(number);
        ASSERT_EQ(set.contains(unit), naive::isIn(members, unit)) << number;
    }
    EXPECT_TRUE(set.contains(this->highest));
}

} // namespace
