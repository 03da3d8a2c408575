// The scan for a prefix, for each instruction set that this machine has and without any: the same places as a plain
// loop finds, with nothing read outside of the text.
#include <kvt/regex/detail/prefix_scan.h>

#include <support/guarded_memory.h>
#include <support/vector_targets.h>

#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <string>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::detail::ByteSet;
using kvt::ex::detail::PrefixScan;

class PrefixScanOn : public OnEachVectorTarget {
protected:
    static bool standsAt(const std::vector<ByteSet>& sets, const std::string& text, std::size_t place) {
        for (std::size_t i = 0; i < sets.size(); ++i) {
            if (place + i >= text.size() || !sets[i].contains(static_cast<unsigned char>(text[place + i]))) {
                return false;
            }
        }
        return true;
    }

    void check(const std::vector<ByteSet>& sets, const std::string& text) {
        const PrefixScan scan(sets);
        char* const bytes = memory_.end() - text.size();
        std::memcpy(bytes, text.data(), text.size());
        std::size_t expected = text.size();
        for (std::size_t from = text.size() + 1; from-- > 0;) {
            if (from < text.size() && standsAt(sets, text, from)) {
                expected = from;
            }
            ASSERT_EQ(scan.find(bytes, text.size(), from), expected) << from << " of " << text.size();
        }
    }

private:
    GuardedMemory memory_{1 << 12};
};

INSTANTIATE_TEST_SUITE_P(Each, PrefixScanOn, testing::ValuesIn(vectorTargets()), vectorTargetName);

ByteSet setOf(const std::string& bytes) {
    ByteSet set;
    for (const char byte : bytes) {
        set.add(static_cast<unsigned char>(byte));
    }
    return set;
}

TEST_P(PrefixScanOn, FindsEachPlaceFromEachStart) {
    std::mt19937 random(41);
    const std::vector<ByteSet> date = {setOf("0123456789"), setOf("0123456789"), setOf("-"),
                                       setOf("0123456789")};
    const std::vector<std::vector<ByteSet>> prefixes = {date, {setOf("-")}, {setOf("-"), setOf("01")}};
    for (std::size_t size = 0; size < 300; size += size < 150 ? 1 : 17) {
        std::string text;
        while (text.size() < size) {
            text += "0a-1-z"[random() % 6];
        }
        for (const auto& prefix : prefixes) {
            check(prefix, text);
        }
    }
}

// Sets with more than eight different rows are told apart in two steps.
TEST_P(PrefixScanOn, TakesAnySets) {
    std::mt19937 random(42);
    for (int round = 0; round < 200; ++round) {
        std::vector<ByteSet> sets(1 + random() % 5);
        for (ByteSet& set : sets) {
            for (std::size_t count = 1 + random() % 200; count > 0; --count) {
                set.add(static_cast<unsigned char>(random()));
            }
        }
        std::string text;
        for (std::size_t size = random() % 200; text.size() < size;) {
            text += static_cast<char>(random());
        }
        check(sets, text);
    }
}

TEST(PrefixScan, ASetHoldsItsBytes) {
    const ByteSet set = setOf(std::string("\0\x7F\x80\xFF"
                                          "a",
                                          5));
    EXPECT_EQ(set.count(), 5U);
    for (unsigned byte = 0; byte < 256; ++byte) {
        const bool isMember = byte == 0 || byte == 0x7F || byte == 0x80 || byte == 0xFF || byte == 'a';
        EXPECT_EQ(set.contains(static_cast<unsigned char>(byte)), isMember) << byte;
    }
}

} // namespace
} // namespace kvt::test
