// The hash table of names: what it finds, how it grows, and the primes and the hash behind it.
#include <support/allocations.h>

#include <kvt/encoding/detail/name_table.h>
#include <kvt/foundation/detail/fnv.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <map>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace {

using kvt::ex::detail::fnv1a;
using kvt::ex::detail::NameTable;
using kvt::ex::detail::nextPrime;

std::vector<std::uint32_t> allPrimes() {
    std::vector<std::uint32_t> primes;
    std::uint32_t n = 0;
    do {
        primes.push_back(nextPrime(n));
        n = primes.back() + 1;
    } while (primes.back() != 4294967291u && primes.size() < 1000);
    return primes;
}

bool isPrime(std::uint32_t n) {
    for (std::uint64_t d = 2; d * d <= n; ++d) {
        if (n % d == 0) {
            return false;
        }
    }
    return n > 1;
}

TEST(NextPrime, TakesFromATableOf159AscendingPrimes) {
    const std::vector<std::uint32_t> primes = allPrimes();
    EXPECT_EQ(primes.size(), 159u);
    EXPECT_TRUE(std::is_sorted(primes.begin(), primes.end()));
    for (const std::uint32_t prime : primes) {
        EXPECT_TRUE(isPrime(prime)) << prime;
    }
}

TEST(NextPrime, IsDenseUpTo127AndDoublesAtTheEnd) {
    const std::vector<std::uint32_t> primes = allPrimes();
    std::vector<std::uint32_t> dense;
    for (std::uint32_t n = 5; n <= 127; ++n) {
        if (isPrime(n)) {
            dense.push_back(n);
        }
    }
    ASSERT_GT(primes.size(), dense.size());
    EXPECT_TRUE(std::equal(dense.begin(), dense.end(), primes.begin()));
    for (const std::uint32_t prime :
         {137u,       149u,        157u,        167u,       179u,      191u,      197u,       211u,
          1019u,      1087u,       1153u,       1181u,      1297u,     3911u,     4729u,      6067u,
          8039u,      10009u,      12037u,      14083u,     16073u,    18917u,    20089u,     25111u,
          30071u,     100129u,     150011u,     200063u,    250253u,   302723u,   354073u,    1210897u,
          2421817u,   4843637u,    9687281u,    19374587u,  38749211u, 77498429u, 154996859u, 309993727u,
          619987483u, 1239974993u, 2479950001u, 4294967291u}) {
        EXPECT_EQ(nextPrime(prime), prime);
    }
    for (std::size_t i = 1; i < primes.size(); ++i) {
        EXPECT_LT(static_cast<double>(primes[i]) / primes[i - 1], 2.1) << primes[i];
    }
}

TEST(NextPrime, IsTheFirstNotBelow) {
    const std::vector<std::uint32_t> primes = allPrimes();
    EXPECT_EQ(nextPrime(0), 5u);
    EXPECT_EQ(nextPrime(5), 5u);
    EXPECT_EQ(nextPrime(6), 7u);
    EXPECT_EQ(nextPrime(51), 53u);
    EXPECT_EQ(nextPrime(128), 137u);
    EXPECT_EQ(nextPrime(2479950002u), 4294967291u);
    for (std::size_t i = 1; i < primes.size(); ++i) {
        EXPECT_EQ(nextPrime(primes[i] - 1), primes[i] - 1 == primes[i - 1] ? primes[i - 1] : primes[i]);
        EXPECT_EQ(nextPrime(primes[i - 1] + 1), primes[i]);
    }
}

// Vectors of the authors of the hash.
TEST(Fnv1a, GivesThePublishedValues) {
    EXPECT_EQ(fnv1a(""), 0xcbf29ce484222325u);
    EXPECT_EQ(fnv1a("a"), 0xaf63dc4c8601ec8cu);
    EXPECT_EQ(fnv1a("b"), 0xaf63df4c8601f1a5u);
    EXPECT_EQ(fnv1a("foobar"), 0x85944171f73967e8u);
    // Bytes are unsigned: a signed one would change all the higher bits.
    EXPECT_EQ(fnv1a("\xFF"), (0xcbf29ce484222325u ^ 0xFFu) * 0x100000001b3u);
    EXPECT_EQ(fnv1a(std::string_view("\0", 1)), 0xcbf29ce484222325u * 0x100000001b3u);
}

TEST(NameTable, IsEmptyWithoutMemory) {
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    const NameTable table;
    EXPECT_EQ(kvt::test::livingBlocks(), before);
    EXPECT_EQ(table.size(), 0u);
    EXPECT_EQ(table.buckets(), 0u);
    EXPECT_EQ(table.threshold(), 0u);
    EXPECT_FALSE(table.find(""));
    EXPECT_FALSE(table.find("a"));
}

TEST(NameTable, TheFirstInsertionOfAKeyWins) {
    NameTable table;
    EXPECT_TRUE(table.insert("key", 1));
    EXPECT_FALSE(table.insert("key", 2));
    EXPECT_EQ(table.find("key"), 1u);
    EXPECT_EQ(table.size(), 1u);
    const NameTable range{{"a", 20}, {"b", 1}, {"a", 27}};
    EXPECT_EQ(range.find("a"), 20u);
    EXPECT_EQ(range.size(), 2u);
}

TEST(NameTable, KeysAreBytesOfAnyKind) {
    NameTable table;
    const std::array<std::string, 7> keys{
        "", "a", "A", std::string("\0", 1), std::string("a\0b", 3), "\xFF", std::string(5000, 'k')};
    for (std::uint32_t i = 0; i < keys.size(); ++i) {
        EXPECT_TRUE(table.insert(keys[i], i));
    }
    for (std::uint32_t i = 0; i < keys.size(); ++i) {
        EXPECT_EQ(table.find(keys[i]), i);
    }
    EXPECT_FALSE(table.find("b"));
}

TEST(NameTable, AKeyIsACopy) {
    NameTable table;
    std::string key = "UTF-8";
    table.insert(key, 4);
    key = "xxxxx";
    EXPECT_EQ(table.find("UTF-8"), 4u);
    EXPECT_FALSE(table.find("xxxxx"));
}

TEST(NameTable, GrowsToTheNextPrimeOfTwiceItsSize) {
    NameTable table;
    const auto state = [&table] { return std::array{table.size(), table.buckets(), table.threshold()}; };
    const auto fill = [&table](std::uint32_t count) {
        while (table.size() < count) {
            table.insert("key " + std::to_string(table.size()), table.size());
        }
    };
    fill(1);
    EXPECT_EQ(state(), (std::array{1u, 5u, 3u}));
    fill(3);
    EXPECT_EQ(state(), (std::array{3u, 5u, 3u}));
    EXPECT_FALSE(table.insert("key 0", 9)); // an existing key needs no room
    EXPECT_EQ(state(), (std::array{3u, 5u, 3u}));
    fill(4);
    EXPECT_EQ(state(), (std::array{4u, 11u, 8u}));
    fill(8);
    EXPECT_EQ(table.buckets(), 11u);
    fill(9);
    EXPECT_EQ(state(), (std::array{9u, 23u, 17u}));
    fill(18);
    EXPECT_EQ(state(), (std::array{18u, 47u, 35u}));
    fill(36);
    EXPECT_EQ(state(), (std::array{36u, 97u, 72u}));
    fill(73);
    EXPECT_EQ(state(), (std::array{73u, 197u, 147u}));
    for (std::uint32_t i = 0; i < 73; ++i) {
        EXPECT_EQ(table.find("key " + std::to_string(i)), i);
    }
}

TEST(NameTable, ARangeIsSizedForOnce) {
    const auto shape = [](const NameTable& table) { return std::array{table.buckets(), table.threshold()}; };
    EXPECT_EQ(shape(NameTable{}), (std::array{0u, 0u}));
    EXPECT_EQ(shape(NameTable{{"a", 1}}), (std::array{5u, 3u}));                     // ceil(1.33) + 1
    EXPECT_EQ(shape(NameTable{{"a", 1}, {"b", 2}, {"c", 3}}), (std::array{5u, 3u})); // 4 + 1
    EXPECT_EQ(shape(NameTable{{"a", 1}, {"b", 2}, {"c", 3}, {"d", 4}}), (std::array{7u, 5u})); // 6 + 1
    // As many as the registry knows by heart: ceil(49.33) + 1 = 51.
    const NameTable table{{"0", 0},   {"1", 1},   {"2", 2},   {"3", 3},   {"4", 4},   {"5", 5},   {"6", 6},
                          {"7", 7},   {"8", 8},   {"9", 9},   {"10", 10}, {"11", 11}, {"12", 12}, {"13", 13},
                          {"14", 14}, {"15", 15}, {"16", 16}, {"17", 17}, {"18", 18}, {"19", 19}, {"20", 20},
                          {"21", 21}, {"22", 22}, {"23", 23}, {"24", 24}, {"25", 25}, {"26", 26}, {"27", 27},
                          {"28", 28}, {"29", 29}, {"30", 30}, {"31", 31}, {"32", 32}, {"33", 33}, {"34", 34},
                          {"35", 35}, {"36", 36}};
    EXPECT_EQ(shape(table), (std::array{53u, 39u}));
    EXPECT_EQ(table.size(), 37u);
    for (std::uint32_t i = 0; i < 37; ++i) {
        EXPECT_EQ(table.find(std::to_string(i)), i);
    }
}

TEST(NameTable, CollidingKeysWrapAroundTheEnd) {
    // Keys whose slot is the last one of five: all but the first have to go on from the start.
    std::vector<std::string> keys;
    for (int i = 0; keys.size() < 3; ++i) {
        if (const std::string key = std::to_string(i); static_cast<std::uint32_t>(fnv1a(key)) % 5 == 4) {
            keys.push_back(key);
        }
    }
    NameTable table;
    for (std::uint32_t i = 0; i < keys.size(); ++i) {
        EXPECT_TRUE(table.insert(keys[i], i));
    }
    EXPECT_EQ(table.buckets(), 5u);
    for (std::uint32_t i = 0; i < keys.size(); ++i) {
        EXPECT_EQ(table.find(keys[i]), i);
        EXPECT_FALSE(table.insert(keys[i], 9));
    }
    EXPECT_FALSE(table.find("no such key"));
}

TEST(NameTable, BehavesAsAMap) {
    std::mt19937 random(5);
    NameTable table;
    std::map<std::string, std::uint32_t> model;
    std::uint32_t buckets = 0;
    for (int i = 0; i < 40000; ++i) {
        std::string key(random() % 4, ' ');
        for (char& c : key) {
            c = static_cast<char>(random() % 25);
        }
        const auto id = static_cast<std::uint32_t>(random());
        // The stated growth check, on a model of the numbers alone.
        const bool isNew = model.count(key) == 0;
        const auto used = static_cast<float>(model.size());
        if (isNew && used >= std::floor(static_cast<float>(buckets) * 0.75F)) {
            buckets = nextPrime(buckets * 2);
        }
        ASSERT_EQ(table.insert(key, id), model.emplace(key, id).second);
        ASSERT_EQ(table.size(), model.size());
        ASSERT_EQ(table.buckets(), buckets);
    }
    EXPECT_GT(model.size(), 5000u);
    for (const auto& [key, id] : model) {
        EXPECT_EQ(table.find(key), id);
    }
    EXPECT_FALSE(table.find("longer than any"));
}

TEST(NameTable, AFailingAllocationLosesNothing) {
    NameTable table;
    const std::string tail = " and more than a small-string buffer can hold";
    for (std::uint32_t i = 0; i < 100; ++i) {
        const std::string key = std::to_string(i) + tail;
        kvt::test::failEachAllocation([&] { table.insert(key, i); },
                                      [&](std::size_t) {
                                          EXPECT_FALSE(table.find(key)) << i;
                                          EXPECT_EQ(table.size(), i);
                                          for (std::uint32_t k = 0; k < i; ++k) {
                                              EXPECT_EQ(table.find(std::to_string(k) + tail), k);
                                          }
                                      });
        EXPECT_EQ(table.find(key), i);
    }
}

} // namespace
