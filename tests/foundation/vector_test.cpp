// kvt::ex::vector: who owns the array, how elements move, and what is left when something throws.
#include "tracked.h"
#include <support/allocations.h>

#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <array>
#include <cstring>
#include <functional>
#include <iterator>
#include <memory>
#include <numeric>
#include <sstream>
#include <string>
#include <type_traits>
#include <utility>

namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;
using kvt::ex::vector;
using kvt::test::failEachAllocation;
using kvt::test::livingBlocks;
using kvt::test::Tracked;
using kvt::test::TrackedFailure;
using kvt::test::TrackedThrowingMove;

std::vector<int> values(const vector<Tracked>& v) {
    std::vector<int> result;
    for (const Tracked& element : v) {
        EXPECT_TRUE(element.intact());
        result.push_back(element.value());
    }
    return result;
}

vector<Tracked> numbered(int count) {
    vector<Tracked> v;
    for (int i = 0; i < count; ++i) {
        v.emplace_back(i);
    }
    return v;
}

std::vector<int> iota(int count, int from = 0) {
    std::vector<int> result(static_cast<std::size_t>(count));
    std::iota(result.begin(), result.end(), from);
    return result;
}

class VectorTest : public testing::Test {
protected:
    void SetUp() override { Tracked::counts = {}; }
    void TearDown() override { EXPECT_EQ(Tracked::counts.living, 0); }
};

TEST(VectorType, DerivesFromTheTypedAllocatorAndHasAVirtualDestructor) {
    static_assert(std::is_base_of_v<kvt::ex::TypedAllocator<char>, vector<char>>);
    static_assert(std::has_virtual_destructor_v<vector<char>>);
    static_assert(std::has_virtual_destructor_v<UStringArray<0>>);
    static_assert(std::is_base_of_v<vector<UString<0>>, UStringArray<0>>);
    static_assert(std::is_nothrow_move_constructible_v<vector<Tracked>>);
    static_assert(std::is_nothrow_move_assignable_v<vector<Tracked>>);
    SUCCEED();
}

// Modules that were compiled apart read each other's vectors.
TEST(VectorType, FieldsAreSizeCapacityDeleterData) {
    using Deleter = std::function<void(std::uint64_t*)>;
    vector<std::uint64_t> v;
    v.reserve(7);
    v.push_back(1);
    v.push_back(2);
    constexpr std::size_t sizeAt = sizeof(void*);
    constexpr std::size_t capacityAt = sizeAt + sizeof(std::uint64_t);
    constexpr std::size_t dataAt = capacityAt + sizeof(std::uint64_t) + sizeof(Deleter);
    static_assert(sizeof(v) == dataAt + sizeof(void*));
    const auto* const bytes = reinterpret_cast<const unsigned char*>(&v);
    std::uint64_t size = 0;
    std::uint64_t capacity = 0;
    const std::uint64_t* data = nullptr;
    std::memcpy(&size, bytes + sizeAt, sizeof size);
    std::memcpy(&capacity, bytes + capacityAt, sizeof capacity);
    std::memcpy(&data, bytes + dataAt, sizeof data);
    EXPECT_EQ(size, 2u);
    EXPECT_EQ(capacity, v.capacity());
    EXPECT_EQ(data, v.data());
}

template <typename T>
class VectorOfEachElementType : public testing::Test {};

using ElementTypes =
    testing::Types<char, std::uint64_t, std::pair<std::size_t, std::size_t>, UString<0>, UString<1>,
                   UString<2>, UString<3>, UString<27>, UString<28>, UString<29>, UString<30>>;
TYPED_TEST_SUITE(VectorOfEachElementType, ElementTypes);

TYPED_TEST(VectorOfEachElementType, GrowsShrinksCopiesAndMoves) {
    vector<TypeParam> v;
    for (int i = 0; i < 100; ++i) {
        v.emplace_back();
    }
    v.resize(120);
    v.erase(v.begin(), v.begin() + 20);
    v.insert(v.begin(), TypeParam());
    EXPECT_EQ(v.size(), 101u);
    const vector<TypeParam> copy(v);
    EXPECT_TRUE(copy == v);
    const vector<TypeParam> moved(std::move(v));
    EXPECT_TRUE(copy == moved);
    EXPECT_TRUE(moved[100] == TypeParam());
}

TEST_F(VectorTest, WithoutCapacityThereIsNoArrayAndNoDeleter) {
    const std::ptrdiff_t before = livingBlocks();
    {
        vector<UString<0>> v;
        EXPECT_EQ(v.size(), 0u);
        EXPECT_EQ(v.capacity(), 0u);
        EXPECT_EQ(v.data(), nullptr);
        EXPECT_TRUE(v.empty());
        EXPECT_FALSE(v.deleter());
        v.reserve(0);
        v.resize(0);
        v.clear();
        v.insert(v.begin(), v.begin(), v.end());
        v.erase(v.begin(), v.end());
        const vector<UString<0>> copy(v);
        const vector<UString<0>> none(0);
        const vector<UString<0>> list(std::initializer_list<UString<0>>{});
        EXPECT_EQ(v.data(), nullptr);
        EXPECT_EQ(copy.data(), nullptr);
        EXPECT_EQ(none.data(), nullptr);
        EXPECT_EQ(list.data(), nullptr);
        EXPECT_FALSE(copy.deleter());
        // A call of an empty deleter would throw out of a destructor and end the program.
    }
    EXPECT_EQ(livingBlocks(), before);
}

TEST_F(VectorTest, TheArrayHasTheSizeOfItsCapacity) {
    vector<std::uint64_t> v;
    v.reserve(37);
    EXPECT_EQ(v.capacity(), 37u);
    EXPECT_EQ(kvt::test::lastRequest(), 37 * sizeof(std::uint64_t));
    while (v.size() < v.capacity()) {
        v.push_back(1);
    }
    v.push_back(2);
    EXPECT_GT(v.capacity(), 37u);
    EXPECT_EQ(kvt::test::lastRequest(), v.capacity() * sizeof(std::uint64_t));
}

TEST_F(VectorTest, TheDeleterIsSetWithTheArrayAndReleasesIt) {
    vector<std::uint64_t> v;
    v.reserve(8);
    ASSERT_TRUE(v.deleter());
    const std::ptrdiff_t before = livingBlocks();
    {
        vector<std::uint64_t> other;
        other.reserve(8);
        // The deleter is a complete way of releasing an array that the same module allocated.
        vector<std::uint64_t> third(std::move(other));
        EXPECT_EQ(livingBlocks(), before + 1);
        EXPECT_EQ(third.deleter().target_type(), v.deleter().target_type());
    }
    EXPECT_EQ(livingBlocks(), before);
}

TEST_F(VectorTest, AMoveTakesArrayAndDeleterAndLeavesNothing) {
    vector<Tracked> source = numbered(5);
    const Tracked* const data = source.data();
    const auto capacity = source.capacity();
    Tracked::counts.moves = 0;
    const std::ptrdiff_t before = livingBlocks();

    vector<Tracked> target(std::move(source));
    EXPECT_EQ(livingBlocks(), before);
    EXPECT_EQ(target.data(), data);
    EXPECT_EQ(target.capacity(), capacity);
    EXPECT_TRUE(target.deleter());
    EXPECT_EQ(values(target), iota(5));
    EXPECT_EQ(Tracked::counts.moves, 0);
    EXPECT_EQ(source.data(), nullptr);
    EXPECT_EQ(source.size(), 0u);
    EXPECT_EQ(source.capacity(), 0u);
    EXPECT_FALSE(source.deleter());

    source.push_back(Tracked(9)); // usable again
    EXPECT_EQ(values(source), iota(1, 9));
}

TEST_F(VectorTest, MoveAssignmentReleasesWhatTheTargetHeld) {
    const std::ptrdiff_t before = livingBlocks();
    {
        vector<Tracked> source = numbered(3);
        vector<Tracked> target = numbered(50);
        target = std::move(source);
        EXPECT_EQ(Tracked::counts.living, 3);
        EXPECT_EQ(values(target), iota(3));
        EXPECT_EQ(source.data(), nullptr);
        vector<Tracked>& self = target;
        target = std::move(self);
        EXPECT_EQ(values(target), iota(3));
    }
    std::vector<int>().swap(Tracked::counts.destroyed);
    EXPECT_EQ(livingBlocks(), before);
}

TEST_F(VectorTest, ElementsAreDestroyedInOrder) {
    auto v = std::make_unique<vector<Tracked>>(numbered(6));
    Tracked::counts.destroyed.clear();
    v.reset();
    EXPECT_EQ(Tracked::counts.destroyed, iota(6));
}

TEST_F(VectorTest, ADerivedArrayIsDestroyedThroughItsBase) {
    const std::ptrdiff_t before = livingBlocks();
    std::unique_ptr<vector<UString<0>>> base = std::make_unique<UStringArray<0>>(
        std::initializer_list<UString<0>>{"a text that is too long for the small-string buffer", "b"});
    EXPECT_EQ(base->size(), 2u);
    base.reset();
    EXPECT_EQ(livingBlocks(), before);
}

TEST_F(VectorTest, GrowthMovesEachElementOnceAndCopiesNone) {
    vector<Tracked> v = numbered(8);
    v.reserve(8);
    while (v.size() < v.capacity()) {
        v.emplace_back(static_cast<int>(v.size()));
    }
    const long size = static_cast<long>(v.size());
    Tracked::counts.moves = 0;
    Tracked::counts.copies = 0;
    v.reserve(v.capacity() + 1);
    EXPECT_EQ(Tracked::counts.moves, size);
    EXPECT_EQ(Tracked::counts.copies, 0);
    EXPECT_EQ(values(v), iota(static_cast<int>(size)));
}

TEST_F(VectorTest, MoveOnlyElementsAreEnough) {
    vector<std::unique_ptr<int>> v;
    for (int i = 0; i < 40; ++i) {
        v.push_back(std::make_unique<int>(i));
    }
    v.insert(v.begin(), std::make_unique<int>(-1));
    v.erase(v.begin() + 1);
    v.resize(45);
    const vector<std::unique_ptr<int>> moved(std::move(v));
    ASSERT_EQ(moved.size(), 45u);
    EXPECT_EQ(*moved[0], -1);
    EXPECT_EQ(*moved[39], 39);
    EXPECT_EQ(moved[44], nullptr);
}

TEST_F(VectorTest, GrowthFromAnElementOfItsOwn) {
    for (int spare = 0; spare <= 1; ++spare) {
        SCOPED_TRACE(spare);
        const auto full = [spare] {
            vector<Tracked> v = numbered(3);
            v.reserve(4);
            while (v.size() + static_cast<unsigned>(spare) < v.capacity()) {
                v.emplace_back(7);
            }
            return v;
        };
        const std::vector<int> content = values(full());
        const auto with = [&content](std::ptrdiff_t at, std::size_t count, int value) {
            std::vector<int> expected = content;
            expected.insert(expected.begin() + at, count, value);
            return expected;
        };
        vector<Tracked> v = full();
        const auto end = static_cast<std::ptrdiff_t>(content.size());
        v.push_back(v[1]);
        EXPECT_EQ(values(v), with(end, 1, 1));
        v = full();
        v.emplace_back(v.front());
        EXPECT_EQ(values(v), with(end, 1, 0));
        v = full();
        v.insert(v.begin(), v[2]);
        EXPECT_EQ(values(v), with(0, 1, 2));
        v = full();
        v.insert(v.begin() + 1, 5, v[2]);
        EXPECT_EQ(values(v), with(1, 5, 2));
        v = full();
        v.resize(v.size() + 6, v[1]);
        EXPECT_EQ(values(v), with(end, 6, 1));
    }
}

TEST_F(VectorTest, AtChecksItsIndexAndSubscriptDoesNot) {
    vector<Tracked> v = numbered(3);
    const vector<Tracked>& fixed = v;
    EXPECT_EQ(v.at(2).value(), 2);
    EXPECT_EQ(fixed.at(0).value(), 0);
    for (const std::uint64_t index : {std::uint64_t{3}, ~std::uint64_t{0}}) {
        EXPECT_THROW(v.at(index), std::out_of_range) << index;
        EXPECT_THROW(fixed.at(index), std::out_of_range) << index;
    }
    EXPECT_THROW(vector<Tracked>().at(0), std::out_of_range);
    EXPECT_EQ(v.front().value(), 0);
    EXPECT_EQ(v.back().value(), 2);
    EXPECT_EQ(&fixed[1], fixed.data() + 1);
}

TEST_F(VectorTest, ConstructorsMakeWhatTheyName) {
    const std::array<int, 3> source{4, 5, 6};
    EXPECT_EQ(values(vector<Tracked>(4)), (std::vector<int>{0, 0, 0, 0}));
    EXPECT_EQ(values(vector<Tracked>(3, Tracked(8))), (std::vector<int>{8, 8, 8}));
    EXPECT_EQ(values(vector<Tracked>{1, 2, 3}), (std::vector<int>{1, 2, 3}));
    EXPECT_EQ(values(vector<Tracked>(source.begin(), source.end())), (std::vector<int>{4, 5, 6}));
    std::istringstream stream("7 8 9 10"); // a range that can be walked once
    EXPECT_EQ(values(vector<Tracked>(std::istream_iterator<int>(stream), std::istream_iterator<int>())),
              (std::vector<int>{7, 8, 9, 10}));
    EXPECT_EQ(vector<std::uint64_t>(3, 5), (vector<std::uint64_t>{5, 5, 5})); // not two iterators
    vector<Tracked> assigned = numbered(9);
    assigned = {Tracked(1), Tracked(2)};
    EXPECT_EQ(values(assigned), (std::vector<int>{1, 2}));
}

TEST_F(VectorTest, EqualityIsThatOfTheElements) {
    EXPECT_TRUE(numbered(3) == numbered(3));
    EXPECT_FALSE(numbered(3) == numbered(4));
    EXPECT_TRUE(numbered(3) != (vector<Tracked>{0, 1, 9}));
    EXPECT_TRUE(vector<Tracked>() == vector<Tracked>());
    vector<Tracked> reserved = numbered(3);
    reserved.reserve(100);
    EXPECT_TRUE(reserved == numbered(3));
}

TEST_F(VectorTest, AbsurdSizesAreRefused) {
    vector<std::uint64_t> v{1, 2, 3};
    const auto most = vector<std::uint64_t>::max_size();
    EXPECT_THROW(v.reserve(most + 1), std::length_error);
    EXPECT_THROW(v.resize(most + 1), std::length_error);
    EXPECT_THROW(v.resize(~std::uint64_t{0}, 1), std::length_error);
    EXPECT_THROW(v.insert(v.begin(), most, 1), std::length_error);
    EXPECT_THROW(v.insert(v.begin(), ~std::uint64_t{0}, 1), std::length_error);
    EXPECT_THROW(vector<std::uint64_t>(~std::uint64_t{0}), std::length_error);
    EXPECT_THROW(v.reserve(most), std::bad_alloc);
    EXPECT_EQ(v, (vector<std::uint64_t>{1, 2, 3}));
}

TEST_F(VectorTest, AFailingCopyLeavesNothingBehind) {
    const vector<Tracked> five = numbered(5);
    const Tracked nine(9);
    const long living = Tracked::counts.living;
    for (long budget = 0; budget < 5; ++budget) {
        SCOPED_TRACE(budget);
        Tracked::counts.budget = budget;
        EXPECT_THROW(vector<Tracked>{five}, TrackedFailure);
        Tracked::counts.budget = budget;
        EXPECT_THROW(vector<Tracked>(five.begin(), five.end()), TrackedFailure);
        Tracked::counts.budget = budget;
        EXPECT_THROW(vector<Tracked>(5, nine), TrackedFailure);
        Tracked::counts.budget = -1;
        EXPECT_EQ(Tracked::counts.living, living);
    }
}

TEST_F(VectorTest, AFailingCopyInAnAssignmentOrAnAppendChangesNothing) {
    const vector<Tracked> five = numbered(5);
    const Tracked nine(9);
    for (const bool full : {false, true}) {
        SCOPED_TRACE(full);
        vector<Tracked> v = numbered(4);
        v.reserve(8);
        while (full && v.size() < v.capacity()) {
            v.emplace_back(static_cast<int>(v.size()));
        }
        const std::vector<int> content = values(v);
        Tracked::counts.budget = 0;
        EXPECT_THROW(v.push_back(nine), TrackedFailure);
        EXPECT_THROW(v.emplace_back(nine), TrackedFailure);
        EXPECT_THROW(v.insert(v.begin(), nine), TrackedFailure);
        Tracked::counts.budget = 3;
        EXPECT_THROW(v = five, TrackedFailure);
        Tracked::counts.budget = 3; // one for the value set aside
        EXPECT_THROW(v.resize(v.size() + 10, nine), TrackedFailure);
        Tracked::counts.budget = -1;
        EXPECT_EQ(values(v), content);
    }
}

TEST_F(VectorTest, AFailingAllocationChangesNothing) {
    const Tracked nine(9);
    struct Row {
        const char* name;
        std::function<void(vector<Tracked>&)> operation;
    };
    const vector<Tracked> five = numbered(5);
    const std::array rows{
        Row{"push_back", [&](vector<Tracked>& v) { v.push_back(nine); }},
        Row{"push_back own", [](vector<Tracked>& v) { v.push_back(v[0]); }},
        Row{"insert", [&](vector<Tracked>& v) { v.insert(v.begin(), nine); }},
        Row{"insert count", [&](vector<Tracked>& v) { v.insert(v.begin(), 20, nine); }},
        Row{"insert range", [&](vector<Tracked>& v) { v.insert(v.begin(), five.begin(), five.end()); }},
        Row{"reserve", [](vector<Tracked>& v) { v.reserve(1000); }},
        Row{"resize", [](vector<Tracked>& v) { v.resize(1000); }},
        Row{"resize value", [&](vector<Tracked>& v) { v.resize(1000, nine); }},
        Row{"copy assignment", [&](vector<Tracked>& v) { v = five; }},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        vector<Tracked> v = numbered(4);
        while (v.size() < v.capacity()) {
            v.emplace_back(static_cast<int>(v.size()));
        }
        Tracked::counts.destroyed.clear();
        Tracked::counts.destroyed.reserve(10000); // its own growth must not fail
        const std::vector<int> content = values(v);
        const std::ptrdiff_t before = livingBlocks();
        const std::size_t failures = failEachAllocation([&] { row.operation(v); },
                                                        [&](std::size_t) {
                                                            EXPECT_EQ(livingBlocks(), before);
                                                            EXPECT_EQ(values(v), content);
                                                        });
        EXPECT_GE(failures, 1u);
    }
}

TEST_F(VectorTest, StringsSurviveEveryFailingAllocation) {
    const UString<0> text("a text that is too long for the small-string buffer");
    const std::ptrdiff_t before = livingBlocks();
    const std::size_t failures = failEachAllocation(
        [&] {
            UStringArray<0> array;
            array.push_back(text);
            array.insert(array.begin(), 3, text);
            UStringArray<0> copy(array);
            copy.resize(9, copy[1]);
            array = copy;
        },
        [&](std::size_t succeeding) { EXPECT_EQ(livingBlocks(), before) << succeeding; });
    EXPECT_GE(failures, 10u);
    EXPECT_EQ(livingBlocks(), before);
}

// Relocation is the one place where elements are half here and half there.
TEST(VectorThrowingMove, NoElementIsLostOrLeftOverWhenRelocationThrows) {
    using Counts = kvt::test::TrackedCounts;
    TrackedThrowingMove::counts = Counts{};
    struct Row {
        const char* name;
        std::function<void(vector<TrackedThrowingMove>&)> operation;
    };
    const std::array rows{
        Row{"reserve", [](auto& v) { v.reserve(v.capacity() + 1); }},
        Row{"emplace_back", [](auto& v) { v.emplace_back(5); }},
        Row{"resize", [](auto& v) { v.resize(v.capacity() + 1); }},
        Row{"insert", [](auto& v) { v.insert(v.begin(), TrackedThrowingMove(3)); }},
        Row{"erase", [](auto& v) { v.erase(v.begin()); }},
    };
    for (const Row& row : rows) {
        for (long budget = 0; budget < 4; ++budget) {
            SCOPED_TRACE(row.name + std::string(" ") + std::to_string(budget));
            {
                vector<TrackedThrowingMove> v;
                v.reserve(6);
                while (v.size() < v.capacity()) {
                    v.emplace_back(static_cast<int>(v.size()));
                }
                TrackedThrowingMove::counts.budget = budget;
                EXPECT_THROW(row.operation(v), TrackedFailure);
                TrackedThrowingMove::counts.budget = -1;
                EXPECT_EQ(TrackedThrowingMove::counts.living, static_cast<long>(v.size()));
            }
            EXPECT_EQ(TrackedThrowingMove::counts.living, 0);
            TrackedThrowingMove::counts = Counts{};
        }
    }
}

template <typename S>
class VectorOfStrings : public testing::Test {};

using StringTypes = testing::Types<UString<0>, UString<1>, UString<2>, UString<3>, UString<27>, UString<28>,
                                   UString<29>, UString<30>>;
TYPED_TEST_SUITE(VectorOfStrings, StringTypes);

// The adaptor of a string holds a pointer to its own string.
TYPED_TEST(VectorOfStrings, AfterGrowthEachAdaptorStandsForItsOwnElement) {
    UStringArray<TypeParam::encodingType> array;
    std::vector<TypeParam> expected;
    const std::string longTail(40, 'x');
    for (int i = 0; i < 70; ++i) {
        const std::string ascii = std::to_string(i) + (i % 2 == 0 ? longTail : "");
        TypeParam text(ascii.c_str());
        expected.push_back(text);
        if (i % 3 == 0) {
            array.insert(array.begin() + i / 2, text);
            expected.pop_back();
            expected.insert(expected.begin() + i / 2, text);
        } else {
            array.push_back(text);
        }
    }
    UStringArray<TypeParam::encodingType> moved(std::move(array));
    moved.erase(moved.begin() + 3);
    expected.erase(expected.begin() + 3);
    ASSERT_EQ(moved.size(), expected.size());
    for (std::size_t i = 0; i < expected.size(); ++i) {
        const auto& adaptor = moved[i].getAsIZQTString();
        const auto bytes =
            static_cast<std::uint32_t>(expected[i].size() * sizeof(typename TypeParam::value_type));
        EXPECT_EQ(static_cast<const void*>(adaptor.data()), static_cast<const void*>(moved[i].rawData()))
            << i;
        EXPECT_EQ(adaptor.byteLength(), bytes) << i;
        EXPECT_TRUE(moved[i] == expected[i]) << i;
    }
    const char unit[8] = {'Z', 0, 0, 0, 0, 0, 0, 0};
    moved[5].getAsIZQTString().assignBytes(unit, sizeof(typename TypeParam::value_type));
    EXPECT_TRUE(moved[5] == TypeParam("Z"));
    EXPECT_TRUE(moved[6] == expected[6]);
}

} // namespace
