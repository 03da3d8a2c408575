// The hash by blocks, for each instruction set that this machine has and without any: the same as byte by byte, with
// nothing read outside of the text.
#include <kvt/foundation/detail/fnv.h>
#include <kvt/string/detail/hash_vectors.h>
#include <kvt/string/ustring.h>

#include <string/naive_units.h>
#include <support/guarded_memory.h>
#include <support/vector_targets.h>

#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <string>

namespace kvt::test {
namespace {

namespace detail = kvt::ex::detail;

class HashVectors : public OnEachVectorTarget {
protected:
    void check(const std::string& text, std::uint64_t hash) {
        char* const bytes = memory_.end() - text.size();
        std::memcpy(bytes, text.data(), text.size());
        std::uint64_t expected = hash;
        for (const char byte : text) {
            expected = (expected ^ static_cast<unsigned char>(byte)) * 0x100000001b3;
        }
        ASSERT_EQ(detail::vectors::fnv1a(hash, bytes, text.size()), expected) << text.size();
    }

private:
    GuardedMemory memory_{1 << 13};
};

INSTANTIATE_TEST_SUITE_P(Each, HashVectors, testing::ValuesIn(vectorTargets()), vectorTargetName);

TEST_P(HashVectors, EachLengthOfRandomBytes) {
    std::mt19937_64 random(51);
    for (std::size_t size = 0; size < 700; ++size) {
        std::string text(size, '\0');
        for (char& byte : text) {
            byte = static_cast<char>(random());
        }
        check(text, random());
        check(text, detail::fnv1a({}));
    }
}

TEST_P(HashVectors, EachLowByteBeforeEachByte) {
    for (unsigned low = 0; low < 256; ++low) {
        for (unsigned byte = 0; byte < 256; ++byte) {
            check(std::string(1, static_cast<char>(byte)) + std::string(127, 'x'), low);
            check(std::string(128, static_cast<char>(byte)), low);
        }
    }
}

TEST_P(HashVectors, StringsHashAlikeWhateverTheirLength) {
    for (std::size_t size = 0; size < 300; ++size) {
        const std::string text(size, 'k');
        const std::u16string wide(size, u'\u30AB');
        EXPECT_EQ(ex::UString<0>(ex::UStringView<0>(text)).hash(), naive::hash<char>(text));
        EXPECT_EQ(ex::UString<2>(ex::UStringView<2>(wide)).hash(), naive::hash<char16_t>(wide));
    }
}

} // namespace
} // namespace kvt::test
