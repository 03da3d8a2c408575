// The two kinds of opaque implementation: one owned alone and copied deeply, one shared by counted handles.
#include <support/allocations.h>

#include <kvt/foundation/pimpl.h>

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <mutex>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

namespace {

using kvt::ex::detail::PimplBase;
using kvt::ex::detail::PimplShared;
using kvt::ex::detail::SharedDataT;

struct Account {
    int value = 0;

    static inline int living = 0;
    static inline bool refuseCopies = false;

    Account() { ++living; }
    explicit Account(int v) : value(v) { ++living; }
    Account(const Account& other) : value(other.value) {
        if (refuseCopies) {
            throw std::runtime_error("no copy");
        }
        ++living;
    }
    Account& operator=(const Account&) = default;
    ~Account() { --living; }
};

class Owner : public PimplBase<Account> {
public:
    Owner() = default;
    explicit Owner(int value) : PimplBase(new Account(value)) {}
    using PimplBase::d;
};

TEST(PimplBase, HoldsOnePointerAndNothingElse) {
    static_assert(sizeof(PimplBase<Account>) == sizeof(void*));
    static_assert(std::is_nothrow_move_constructible_v<Owner>);
    static_assert(std::is_nothrow_move_assignable_v<Owner>);
    SUCCEED();
}

TEST(PimplBase, GivesConstAndMutableAccess) {
    Owner owner(4);
    static_assert(std::is_same_v<decltype(owner.d()), Account&>);
    static_assert(std::is_same_v<decltype(std::as_const(owner).d()), const Account&>);
    owner.d().value = 5;
    EXPECT_EQ(std::as_const(owner).d().value, 5);
    EXPECT_EQ(Owner().d().value, 0);
}

TEST(PimplBase, CopiesAreDeep) {
    Owner original(1);
    Owner copy(original);
    EXPECT_NE(&copy.d(), &original.d());
    copy.d().value = 2;
    EXPECT_EQ(original.d().value, 1);
    Owner assigned(3);
    assigned = original;
    EXPECT_NE(&assigned.d(), &original.d());
    assigned.d().value = 4;
    EXPECT_EQ(original.d().value, 1);
    EXPECT_EQ(Account::living, 3);
}

TEST(PimplBase, DestructionAndAssignmentReleaseTheImplementation) {
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    {
        Owner a(1);
        Owner b(2);
        b = a;
        EXPECT_EQ(Account::living, 2);
        b = Owner(3);
        EXPECT_EQ(Account::living, 2);
        EXPECT_EQ(b.d().value, 3);
    }
    EXPECT_EQ(Account::living, 0);
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

TEST(PimplBase, AMoveTakesThePointer) {
    Owner source(7);
    const Account* const impl = &source.d();
    Owner target(std::move(source));
    EXPECT_EQ(&target.d(), impl);
    Owner assigned(8);
    assigned = std::move(target);
    EXPECT_EQ(&assigned.d(), impl);
    EXPECT_EQ(Account::living, 1);
}

TEST(PimplBase, AMovedFromObjectMayBeDestroyedAndAssignedTo) {
    Owner source(7);
    { Owner taken(std::move(source)); }
    EXPECT_EQ(Account::living, 0);
    const Owner other(9);
    source = other;
    EXPECT_EQ(source.d().value, 9);
    Owner taken(std::move(source));
    source = Owner(10);
    EXPECT_EQ(source.d().value, 10);
}

TEST(PimplBase, SelfAssignmentKeepsTheValue) {
    Owner owner(5);
    Owner& self = owner;
    owner = self;
    EXPECT_EQ(owner.d().value, 5);
    owner = std::move(self);
    EXPECT_EQ(owner.d().value, 5);
    EXPECT_EQ(Account::living, 1);
}

TEST(PimplBase, AFailingCopyLeavesTheTargetAsItWas) {
    Owner target(1);
    const Owner source(2);
    const Account* const impl = &target.d();
    Account::refuseCopies = true;
    EXPECT_THROW(target = source, std::runtime_error);
    EXPECT_THROW(Owner{source}, std::runtime_error);
    Account::refuseCopies = false;
    EXPECT_EQ(&target.d(), impl);
    EXPECT_EQ(target.d().value, 1);
    EXPECT_EQ(Account::living, 2);
}

// The events of a block's end, in order.
struct Record {
    static inline std::vector<std::string> events;
};

struct NotedMutex {
    NotedMutex() = default;
    NotedMutex(const NotedMutex&) = delete;
    NotedMutex& operator=(const NotedMutex&) = delete;
    ~NotedMutex() { Record::events.emplace_back("mutex"); }
};

struct NotedImpl {
    std::string name;
    std::function<void()> atEnd;

    NotedImpl() = default;
    explicit NotedImpl(std::string n) : name(std::move(n)) {}
    NotedImpl(NotedImpl&& other) noexcept : name(std::move(other.name)), atEnd(std::move(other.atEnd)) {
        other.name.clear();
    }
    ~NotedImpl() {
        if (!name.empty()) {
            if (atEnd) {
                atEnd();
            }
            Record::events.push_back(name);
        }
    }
};

class Handle : public PimplShared<NotedImpl, NotedMutex> {
public:
    Handle() = default;
    explicit Handle(const char* name) : PimplShared(NotedImpl(name)) { Record::events.clear(); }
    using PimplShared::d;
    std::uint64_t count() const { return d().handles.load(); }
};

TEST(PimplShared, HoldsOnePointerToABlockWithImplMutexAndA64BitCount) {
    static_assert(sizeof(PimplShared<NotedImpl, NotedMutex>) == sizeof(void*));
    static_assert(std::is_same_v<decltype(std::declval<Handle&>().d()), SharedDataT<NotedImpl, NotedMutex>&>);
    static_assert(std::is_same_v<decltype(std::declval<const Handle&>().d()),
                                 const SharedDataT<NotedImpl, NotedMutex>&>);
    static_assert(
        std::is_same_v<decltype(SharedDataT<NotedImpl, NotedMutex>::handles), std::atomic<std::uint64_t>>);
    EXPECT_EQ(Handle().count(), 1u);
}

TEST(PimplShared, CopiesShareTheBlockAndMovesHandItOn) {
    Handle first("first");
    Handle second(first);
    EXPECT_EQ(&first.d(), &second.d());
    EXPECT_EQ(first.count(), 2u);
    Handle third(std::move(second));
    EXPECT_EQ(&third.d(), &first.d());
    EXPECT_EQ(first.count(), 2u);
    { const Handle fourth(third); }
    EXPECT_EQ(first.count(), 2u);
    EXPECT_TRUE(Record::events.empty());
}

TEST(PimplShared, TheLastHandleDestroysMutexImplAndBlock) {
    std::vector<std::string>().swap(Record::events);
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    {
        Handle first("impl");
        {
            Handle second(first);
            Handle third(second);
        }
        EXPECT_TRUE(Record::events.empty());
    }
    EXPECT_EQ(Record::events, (std::vector<std::string>{"mutex", "impl"}));
    std::vector<std::string>().swap(Record::events);
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

TEST(PimplShared, CopyAssignmentLetsGoOfTheOldBlockFirst) {
    Handle old("old");
    const Handle fresh("fresh");
    std::uint64_t countAtEnd = 0;
    old.d().impl.atEnd = [&] { countAtEnd = fresh.count(); };
    old = fresh;
    EXPECT_EQ(countAtEnd, 1u) << "the new block was taken before the old one was dropped";
    EXPECT_EQ(Record::events, (std::vector<std::string>{"mutex", "old"}));
    EXPECT_EQ(fresh.count(), 2u);
    EXPECT_EQ(&old.d(), &fresh.d());
}

TEST(PimplShared, MoveAssignmentLetsGoOfTheOldBlockFirst) {
    Handle old("old");
    Handle fresh("fresh");
    const auto* const block = &fresh.d();
    const void* seenAtEnd = nullptr;
    old.d().impl.atEnd = [&] { seenAtEnd = &fresh.d(); };
    old = std::move(fresh);
    EXPECT_EQ(seenAtEnd, block) << "the source was emptied before the old block was dropped";
    EXPECT_EQ(&old.d(), block);
    EXPECT_EQ(old.count(), 1u);
}

TEST(PimplShared, SelfAssignmentOfAHandleThatIsNotTheLastKeepsTheBlock) {
    Handle first("impl");
    const Handle second(first);
    Handle& self = first;
    first = self;
    EXPECT_EQ(second.count(), 2u);
    EXPECT_EQ(&first.d(), &second.d());
    EXPECT_TRUE(Record::events.empty());
}

TEST(PimplShared, AMovedFromHandleMayBeDestroyedAndAssignedTo) {
    Handle first("impl");
    { Handle taken(std::move(first)); }
    EXPECT_EQ(Record::events, (std::vector<std::string>{"mutex", "impl"}));
    const Handle other("other");
    first = other;
    EXPECT_EQ(other.count(), 2u);
    Handle taken(std::move(first));
    first = Handle("third");
    EXPECT_EQ(first.d().impl.name, "third");
}

struct Shared {
    static inline std::atomic<int> destroyed{0};

    Shared() = default;
    Shared(Shared&& other) noexcept : total(other.total), armed(std::exchange(other.armed, false)) {}
    ~Shared() {
        if (armed) {
            // Read without the mutex: what every thread wrote must be visible to the one that destroys.
            seen = total;
            ++destroyed;
        }
    }

    static inline long seen = 0;
    long total = 0;
    bool armed = true;
};

class SharedHandle : public PimplShared<Shared, std::mutex> {
public:
    using PimplShared::d;
};

TEST(PimplShared, UnderContentionTheLastHandleReleasesTheBlockOnce) {
    constexpr int rounds = 200;
    constexpr int threadCount = 8;
    constexpr int copiesOfEach = 25;
    for (int round = 0; round < rounds; ++round) {
        Shared::destroyed = 0;
        Shared::seen = 0;
        std::atomic<bool> go{false};
        std::vector<std::thread> threads;
        {
            const SharedHandle origin;
            for (int t = 0; t < threadCount; ++t) {
                threads.emplace_back([handle = origin, &go]() mutable {
                    while (!go) {
                        std::this_thread::yield();
                    }
                    for (int i = 0; i < copiesOfEach; ++i) {
                        SharedHandle copy(handle);
                        SharedHandle moved(std::move(copy));
                        const std::lock_guard lock(moved.d().mutex);
                        ++moved.d().impl.total;
                        copy = handle;
                    }
                    // Ends this thread's part in the block; one of the threads is the last.
                    const SharedHandle last(std::move(handle));
                });
            }
        }
        go = true;
        for (std::thread& thread : threads) {
            thread.join();
        }
        threads.clear();
        ASSERT_EQ(Shared::destroyed.load(), 1) << "round " << round;
        ASSERT_EQ(Shared::seen, threadCount * copiesOfEach) << "round " << round;
    }
}

} // namespace
