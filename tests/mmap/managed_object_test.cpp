// A named object in a segment that comes and goes, and the registrar that it could be registered with.

#include "scratch.h"
#include <support/private_member.h>

#include <kvt/mmap/managed_object.h>
#include <kvt/mmap/memory_manager.h>
#include <kvt/mmap/memory_registrar.h>

#include <boost/container/deque.hpp>
#include <boost/interprocess/file_mapping.hpp>
#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <stdexcept>
#include <type_traits>
#include <utility>

namespace kvt::test {

struct GrowthSize {
    using Type = const long long*;
    friend Type memberOf(GrowthSize);
};
template struct Opens<GrowthSize, &ex::FileManager::growth_size>;
struct MaxFileSize {
    using Type = const long long*;
    friend Type memberOf(MaxFileSize);
};
template struct Opens<MaxFileSize, &ex::FileManager::max_file_size>;

namespace {

namespace ipc = boost::interprocess;
using ex::FileManager;
using ex::MemoryRegistrar;
using ex::mmap::managed_object;
using ex::mmap::mapped_region_segment;
using ex::mmap::object_mgr;
using ex::mmap::segment_allocator;

struct Ledger {
    static inline int made = 0;
    static inline bool refuse = false;

    explicit Ledger(const segment_allocator<void>& allocator) : rows(allocator) {
        if (refuse) {
            throw std::runtime_error("refused");
        }
        ++made;
    }

    boost::container::deque<std::uint64_t, segment_allocator<std::uint64_t>> rows;
    std::uint64_t total = 0;
};

class ManagedObject : public testing::Test {
protected:
    ManagedObject() {
        write(path, std::string(4 * page(), '\0'));
        mapping = ipc::file_mapping(path.c_str(), ipc::read_write);
        Ledger::made = 0;
        Ledger::refuse = false;
    }

    mapped_region_segment segment(std::uint64_t bytes) { return {&mapping, 0, bytes, ex::mmap::k_no_index}; }

    Scratch scratch;
    const std::string path = scratch.file();
    ipc::file_mapping mapping;
};

TEST_F(ManagedObject, NothingIsMappedBeforeTheFirstAccess) {
    managed_object<Ledger> ledger(segment(4 * page()));
    EXPECT_EQ(Ledger::made, 0);
    EXPECT_EQ(contentsOf(path), std::string(4 * page(), '\0'));
    EXPECT_EQ(ledger.release_memory(), 0u);
}

TEST_F(ManagedObject, FirstAccessMakesTheObjectAndLaterOnesFindIt) {
    managed_object<Ledger> ledger(segment(4 * page()));
    ledger.access();
    EXPECT_EQ(Ledger::made, 1);
    ledger.access()->total = 12;
    (*ledger.access()).rows.push_back(7);
    EXPECT_EQ(ledger.access()->total, 12u);
    EXPECT_EQ(&*ledger.access(), ledger.access().operator->());
    EXPECT_EQ(Ledger::made, 1);
}

TEST_F(ManagedObject, ObjectIsBackWithItsContentsAfterItsMemoryWasReleased) {
    managed_object<Ledger> ledger(segment(4 * page()));
    ledger.access()->rows.assign(100, 3);
    for (int round = 0; round < 3; ++round) {
        EXPECT_EQ(ledger.release_memory(), 4 * page());
        EXPECT_EQ(ledger.release_memory(), 0u);
        EXPECT_EQ(ledger.access()->rows.size(), 100u);
        EXPECT_EQ(ledger.access()->rows.back(), 3u);
    }
    EXPECT_EQ(Ledger::made, 1);
}

TEST_F(ManagedObject, ProxyHeldOverAReleaseMapsTheSegmentAnew) {
    managed_object<Ledger> ledger(segment(4 * page()));
    const auto proxy = ledger.access();
    proxy->total = 5;
    ledger.release_memory();
    EXPECT_EQ(proxy->total, 5u);
    EXPECT_EQ(ledger.release_memory(), 4 * page());
}

TEST_F(ManagedObject, ObjectStandsUnderItsNameAndOutlivesItsHolder) {
    { managed_object<Ledger>(segment(4 * page())).access()->total = 21; }
    mapped_region_segment again = segment(4 * page());
    again.load(true);
    const auto [found, count] = again.segment_manager()->find<Ledger>("segment_data");
    ASSERT_NE(found, nullptr);
    EXPECT_EQ(count, 1u);
    EXPECT_EQ(found->total, 21u);
    managed_object<Ledger> holder(std::move(again)); // one that is loaded already is taken as well
    EXPECT_EQ(holder.access()->total, 21u);
    EXPECT_EQ(Ledger::made, 1);
}

TEST_F(ManagedObject, CanBeMoved) {
    managed_object<Ledger> first(segment(4 * page()));
    first.access()->total = 8;
    managed_object<Ledger> second(std::move(first));
    EXPECT_EQ(second.access()->total, 8u);
    static_assert(!std::is_copy_constructible_v<managed_object<Ledger>>);
}

TEST_F(ManagedObject, FailedConstructionCanBeTriedAgain) {
    managed_object<Ledger> ledger(segment(4 * page()));
    Ledger::refuse = true;
    EXPECT_THROW(ledger.access(), std::runtime_error);
    Ledger::refuse = false;
    EXPECT_EQ(ledger.access()->total, 0u);
    EXPECT_EQ(Ledger::made, 1);
}

TEST_F(ManagedObject, FailuresOfTheSegmentComeThrough) {
    managed_object<Ledger> beyond(segment(5 * page()));
    expectOutsideTheFile([&] { beyond.access(); });
    EXPECT_EQ(beyond.release_memory(), 0u);

    struct Huge {
        explicit Huge(const segment_allocator<void>&) {}
        char bytes[65536]{};
    };
    managed_object<Huge> huge(segment(page()));
    EXPECT_THROW(huge.access(), ipc::bad_alloc);
}

// ---- The registrar -----------------------------------------------------------------------------------------------

class Hoarder : public object_mgr {
public:
    unsigned long long release_memory() override {
        ++asked;
        return 1000;
    }
    int asked = 0;
};

TEST(ObjectMgr, IsAnInterfaceWithAVirtualDestructor) {
    static_assert(std::is_abstract_v<object_mgr>);
    static_assert(std::has_virtual_destructor_v<object_mgr>);
    static_assert(sizeof(object_mgr) == sizeof(void*), "no data");
    Hoarder hoarder;
    object_mgr& manager = hoarder;
    EXPECT_EQ(manager.release_memory(), 1000u);
}

TEST(MemoryRegistrar, FreesNothingWhateverIsRegistered) {
    Hoarder hoarder;
    for (int round = 0; round < 2; ++round) {
        for (const std::uint64_t bytes : {std::uint64_t(0), std::uint64_t(1), std::uint64_t(16777216),
                                          std::numeric_limits<std::uint64_t>::max()}) {
            EXPECT_EQ(MemoryRegistrar::freeMemory(bytes), 0u) << bytes;
        }
        MemoryRegistrar::registerManager(&hoarder);
    }
    MemoryRegistrar::deregisterManager(&hoarder);
    EXPECT_EQ(hoarder.asked, 0);
}

TEST(MemoryRegistrar, AnyPointerIsHarmless) {
    MemoryRegistrar::registerManager(nullptr);
    MemoryRegistrar::deregisterManager(nullptr);
    Hoarder never;
    MemoryRegistrar::deregisterManager(&never);
    {
        Hoarder brief;
        MemoryRegistrar::registerManager(&brief);
    }
    EXPECT_EQ(MemoryRegistrar::freeMemory(1),
              0u); // would reach for the one that is gone, if it had been kept
    EXPECT_EQ(never.asked, 0);
}

TEST(MemoryRegistrar, AssignmentGivesTheObject) {
    static_assert(std::is_empty_v<MemoryRegistrar>);
    MemoryRegistrar left;
    MemoryRegistrar right;
    EXPECT_EQ(&(left = right), &left);
    EXPECT_EQ(&(left = std::move(right)), &left);
}

TEST(FileManager, HasItsConstants) {
    static_assert(std::is_same_v<decltype(FileManager::npos), const long long>);
    static_assert(std::is_same_v<decltype(FileManager::alignment), const unsigned long long>);
    const auto read = [](const auto& constant) { return constant; }; // by address, from the library
    EXPECT_EQ(read(FileManager::npos), -1);
    EXPECT_EQ(read(FileManager::alignment), 16u);
    EXPECT_EQ(*memberOf(GrowthSize()), 16777216);
    EXPECT_EQ(static_cast<std::uint64_t>(*memberOf(GrowthSize())),
              read(ex::mmap::manager_options::k_default_segment_size));
    const std::int64_t growth = *memberOf(GrowthSize());
    EXPECT_EQ(*memberOf(MaxFileSize()), 9223372036837998592);
    EXPECT_EQ(*memberOf(MaxFileSize()), std::numeric_limits<std::int64_t>::max() / growth * growth);
}

} // namespace
} // namespace kvt::test
