// Allocation on the library's side of the border, and the names behind which it stands.
#include <support/allocations.h>

#include <kvt/foundation/memory.h>
#include <kvt/foundation/optional.h>
#include <kvt/foundation/string_view.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <limits>
#include <new>
#include <optional>
#include <string_view>
#include <type_traits>
#include <utility>

namespace {

using kvt::ex::BasicDllAllocator;
using kvt::ex::DefaultAllocator;
using kvt::ex::TypedAllocator;

// allocate and deallocate are protected.
class Allocator : public BasicDllAllocator<DefaultAllocator> {
public:
    using BasicDllAllocator::allocate;
    using BasicDllAllocator::deallocate;
};

template <typename T>
concept HasPublicAllocate = requires(T t) {
    t.allocate(std::size_t{1});
};
template <typename T>
concept HasPublicDeallocate = requires(T t) {
    t.deallocate(nullptr, std::size_t{1});
};

TEST(Memory, ClassesFormOneStatelessLine) {
    static_assert(std::is_empty_v<DefaultAllocator>);
    static_assert(std::is_base_of_v<DefaultAllocator, BasicDllAllocator<DefaultAllocator>>);
    static_assert(std::is_base_of_v<BasicDllAllocator<DefaultAllocator>,
                                    TypedAllocator<int, BasicDllAllocator<DefaultAllocator>>>);
    static_assert(std::is_empty_v<TypedAllocator<int>>);
    static_assert(std::is_same_v<TypedAllocator<int>::value_type, int>);
    static_assert(
        std::is_same_v<TypedAllocator<int>, TypedAllocator<int, BasicDllAllocator<DefaultAllocator>>>);
    SUCCEED();
}

TEST(Memory, AllocateAndDeallocateAreProtected) {
    static_assert(HasPublicAllocate<Allocator> && HasPublicDeallocate<Allocator>);
    static_assert(!HasPublicAllocate<BasicDllAllocator<DefaultAllocator>>);
    static_assert(!HasPublicDeallocate<BasicDllAllocator<DefaultAllocator>>);
    static_assert(std::is_same_v<decltype(Allocator::allocate(std::size_t{1})), void*>);
    SUCCEED();
}

TEST(Memory, AllocateTakesTheBytesFromTheGlobalFunction) {
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    void* const p = Allocator::allocate(12345);
    EXPECT_EQ(kvt::test::lastRequest(), 12345u);
    EXPECT_EQ(kvt::test::livingBlocks(), before + 1);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(p) % alignof(std::max_align_t), 0u);
    std::memset(p, 0xA5, 12345);
    Allocator::deallocate(p, 12345);
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

TEST(Memory, DeallocateDoesNotLookAtTheSize) {
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    for (const std::size_t claimed :
         {std::size_t{0}, std::size_t{1}, std::numeric_limits<std::size_t>::max()}) {
        Allocator::deallocate(Allocator::allocate(64), claimed);
    }
    Allocator::deallocate(nullptr, 64);
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

TEST(Memory, ZeroBytesAreABlockToo) {
    void* const p = Allocator::allocate(0);
    EXPECT_NE(p, nullptr);
    Allocator::deallocate(p, 0);
}

TEST(Memory, WhenMemoryRunsOutAllocateThrowsBadAlloc) {
    for (const std::size_t bytes :
         {std::numeric_limits<std::size_t>::max(), std::numeric_limits<std::size_t>::max() - 64,
          static_cast<std::size_t>(std::numeric_limits<std::ptrdiff_t>::max())}) {
        EXPECT_THROW(Allocator::allocate(bytes), std::bad_alloc) << bytes;
    }
    const kvt::test::FailingAllocations failing(0);
    EXPECT_THROW(Allocator::allocate(16), std::bad_alloc);
}

TEST(Memory, AssignmentsDoNothingAndReturnTheObject) {
    Allocator target;
    Allocator source;
    BasicDllAllocator<DefaultAllocator>& base = target;
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    EXPECT_EQ(&(base = static_cast<const BasicDllAllocator<DefaultAllocator>&>(source)), &base);
    EXPECT_EQ(&(base = std::move(static_cast<BasicDllAllocator<DefaultAllocator>&>(source))), &base);
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

TEST(FutureTypes, AreTheStandardOnes) {
    static_assert(std::is_same_v<kvt::future::string_view, std::string_view>);
    static_assert(std::is_same_v<kvt::future::basic_string_view<char16_t>, std::u16string_view>);
    static_assert(
        std::is_same_v<kvt::future::basic_string_view<char, std::char_traits<char>>, std::string_view>);
    static_assert(std::is_same_v<kvt::future::optional<int>, std::optional<int>>);
    static_assert(kvt::future::detail::basic_string_view_constants::npos ==
                  std::numeric_limits<std::uint64_t>::max());
    SUCCEED();
}

} // namespace
