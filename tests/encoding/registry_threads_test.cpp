// Many threads at the registry at once.
#include <encoding/icu_oracle.h>

#include <kvt/encoding/encoding.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <map>
#include <random>
#include <set>
#include <string>
#include <thread>
#include <utility>
#include <vector>

namespace {

using kvt::ex::Encoding;
using View = kvt::future::string_view;

constexpr int threadCount = 8;

struct Seen {
    std::string spelling;
    std::uint32_t id;
    View name;
    std::string nameThen;
};

template <typename Work>
void onManyThreads(Work work) {
    std::atomic<int> ready{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < threadCount; ++t) {
        threads.emplace_back([&, t] {
            ++ready;
            while (ready < threadCount) {
                std::this_thread::yield();
            }
            work(t);
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

TEST(RegistryThreads, EveryAliasOnEveryThreadInItsOwnOrder) {
    std::vector<std::string> spellings = kvt::test::icuAliases();
    for (int i = 0; i < 100; ++i) {
        spellings.push_back("no-such-" + std::to_string(i));
    }
    for (const char* const fixed :
         {"UTF-8", "US-ASCII", "windows-1252", "zqt-wwjd", "system", "binary", ""}) {
        spellings.emplace_back(fixed);
    }
    std::vector<std::vector<Seen>> seen(threadCount);
    onManyThreads([&](int t) {
        std::vector<std::string> mine = spellings;
        std::mt19937 random(static_cast<unsigned>(t));
        std::shuffle(mine.begin(), mine.end(), random);
        for (const std::string& spelling : mine) {
            const Encoding encoding(View(spelling), kvt::ex::nothrow);
            const View name = encoding.getName();
            seen[static_cast<std::size_t>(t)].push_back({spelling, encoding.id(), name, std::string(name)});
        }
    });

    std::map<std::string, std::uint32_t> idOfSpelling;
    std::map<std::uint32_t, std::string> nameOfId;
    std::map<std::string, std::set<std::uint32_t>> idsOfCanonical;
    for (const auto& ofThread : seen) {
        for (const Seen& row : ofThread) {
            // A view from getName is still what it was when it was taken.
            ASSERT_EQ(std::string(row.name), row.nameThen) << row.spelling;
            const auto [first, isNew] = idOfSpelling.emplace(row.spelling, row.id);
            ASSERT_EQ(first->second, row.id) << row.spelling;
            const auto [name, isNewId] = nameOfId.emplace(row.id, row.nameThen);
            ASSERT_EQ(name->second, row.nameThen) << row.id;
        }
    }
    std::set<std::uint32_t> dynamic;
    for (const auto& [spelling, id] : idOfSpelling) {
        const std::string canonical = kvt::test::canonicalName(spelling);
        if (id >= 31) {
            dynamic.insert(id);
        }
        // "TIS-620" opens another converter than the one whose canonical name it is: order decides there.
        if (canonical != "TIS-620" && canonical != "windows-874-2000") {
            if (!canonical.empty()) {
                idsOfCanonical[canonical].insert(id);
            }
            if (id >= 31) {
                EXPECT_EQ(nameOfId[id], canonical) << spelling;
            }
        }
    }
    for (const auto& [canonical, ids] : idsOfCanonical) {
        EXPECT_EQ(ids.size(), 1u) << canonical;
    }
    ASSERT_FALSE(dynamic.empty());
    EXPECT_EQ(*dynamic.begin(), 31u);
    EXPECT_EQ(*dynamic.rbegin(), 30u + dynamic.size()) << "ids are not dense";
    EXPECT_GT(dynamic.size(), 150u);
}

TEST(RegistryThreads, TheFirstUseOfAllMayBeOnManyThreads) {
    // In a process of its own, as CTest runs it, this also races for the construction of the registry.
    std::vector<std::uint32_t> ids(threadCount);
    onManyThreads([&](int t) {
        const Encoding system = Encoding::System;
        ids[static_cast<std::size_t>(t)] = system.evaluate();
        EXPECT_EQ(system, Encoding(system.getName()));
        EXPECT_TRUE(Encoding::windowsCodePage<936>().supports7BitASCII());
        EXPECT_FALSE(Encoding::ibmCodePage<437>().supports7BitASCII());
        EXPECT_TRUE(Encoding::ibmCodePage<437>().isSingleByte());
    });
    EXPECT_EQ(std::set<std::uint32_t>(ids.begin(), ids.end()).size(), 1u);
}

TEST(RegistryThreads, ReadersSeeNamesWhileOthersRegister) {
    std::atomic<bool> done{false};
    const Encoding early(View("KOI8-R"));
    const View name = early.getName();
    onManyThreads([&](int t) {
        if (t % 2 == 0) {
            for (unsigned i = 0; i < 3000; ++i) {
                const std::string spelling = (i % 3 == 0   ? "no-such-"
                                              : i % 3 == 1 ? "koi8-r"
                                                           : "utf") +
                                             std::string(i % 97, '-') + (i % 3 == 2 ? "8" : "");
                (void)Encoding(View(spelling), kvt::ex::nothrow);
            }
            done = true;
        } else {
            while (!done) {
                EXPECT_EQ(early.getName(), "KOI8-R");
                EXPECT_EQ(std::string(name), "KOI8-R");
                EXPECT_EQ(Encoding(View("koi8")), early);
            }
        }
    });
}

// Names go in behind a mutex; what is in is read without one, while they do.
TEST(RegistryThreads, EachNameIsFoundBySpellingAndByIdAsSoonAsItIsIn) {
    constexpr std::uint32_t spellings = 4000;
    const auto spelling = [](std::uint32_t i) {
        return "gb-18030" + std::string(i % 50, '-') + std::string(i / 50, '_');
    };
    std::atomic<std::uint32_t> registered{0};
    onManyThreads([&](int t) {
        if (t == 0) {
            for (std::uint32_t i = 0; i < spellings; ++i) {
                (void)Encoding(View(spelling(i)), kvt::ex::nothrow);
                registered.store(i + 1, std::memory_order_release);
            }
            return;
        }
        for (std::uint32_t seen = 0; seen < spellings;) {
            seen = registered.load(std::memory_order_acquire);
            for (std::uint32_t i = seen - std::min(seen, 20U); i < seen; ++i) {
                const Encoding found(View(spelling(i)), kvt::ex::nothrow);
                if (found.id() != Encoding::Unknown) {
                    EXPECT_EQ(found.getName(), "GB18030");
                }
            }
        }
    });
}

} // namespace
