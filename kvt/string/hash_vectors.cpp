// FNV-1a, 64 bytes in one step: one source, compiled for each instruction set that Highway knows for this processor
// family, and chosen when it is first called.
//
// A byte b makes (h ^ b) * p of the hash h. The exclusive or touches the lowest byte l of h alone, so that it is the
// addition of d = (l ^ b) - l, and a block of n bytes makes
//
//     h * p^n + d[0] * p^n + d[1] * p^(n - 1) + ... + d[n - 1] * p
//
// whose products do not wait for each other. What is left in sequence are the low bytes: l[i + 1] is the low byte of
// (l[i] ^ b[i]) * 0xB3. They are found for the whole block, bit by bit from the lowest one: bit k of the product is bit
// k of l ^ b, changed where bits below it carry into it, so that bit k of all l is a running sum without carries of
// known bits. That is a product without carries by a number of nothing but ones.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/string/hash_vectors.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/platform/vector_targets.h>
#include <kvt/string/detail/hash_vectors.h>

#include <hwy/highway.h>

#include <array>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

constexpr std::uint64_t prime = 0x100000001b3;

// Where products without carries are instructions.
#undef KVT_HAS_CARRYLESS
#define KVT_HAS_CARRYLESS (HWY_ARCH_X86_64 && HWY_TARGET <= HWY_AVX2)

#if KVT_HAS_CARRYLESS
constexpr std::size_t blockSize = 64;

/// p to the power of 64, 63, ..., 1.
constexpr std::array<std::uint64_t, blockSize> powers = [] {
    std::array<std::uint64_t, blockSize> numbers{};
    std::uint64_t power = 1;
    for (std::size_t i = blockSize; i-- > 0;) {
        power *= prime;
        numbers[i] = power;
    }
    return numbers;
}();

/// One bit of each byte of a block, the first byte's lowest.
using Slices = std::array<std::uint64_t, 8>;

/// The bits of the low bytes of the hash before each byte of a block.
struct LowBytes {
    Slices slices{};
    /// The bits of the low byte before the next block, each as nothing but zeros or ones. They stand alone, so that a
    /// bit of the next block waits for that bit only.
    Slices next{};

    /// Makes one bit of them from the bits of the bytes and what is carried into it; returns that bit of both together.
    template <int bit>
    HWY_INLINE std::uint64_t make(const Slices& bytes, std::uint64_t carried) {
        const hn::FixedTag<std::uint64_t, 2> d;
        const auto flips = hn::Set(d, bytes[bit] ^ carried);
        const std::uint64_t sums = hn::GetLane(hn::CLMulLower(flips, hn::Set(d, ~std::uint64_t{0})));
        slices[bit] = sums << 1U ^ next[bit];
        next[bit] = std::uint64_t{0} - ((sums ^ next[bit]) >> 63U);
        return slices[bit] ^ bytes[bit];
    }
};

HWY_INLINE std::uint64_t majority(std::uint64_t a, std::uint64_t b, std::uint64_t c) {
    return (a & b) | ((a | b) & c);
}

// 0xB3 has the bits 0, 1, 4, 5 and 7: each bit of the product is the sum of five bits of the factor at most, and of
// what the sums before it carry, of which there are up to three.
HWY_INLINE void makeLowBytes(const Slices& b, LowBytes& l) {
    const std::uint64_t x0 = l.make<0>(b, 0);
    const std::uint64_t x1 = l.make<1>(b, x0);
    const std::uint64_t c2 = x0 & x1;
    const std::uint64_t x2 = l.make<2>(b, x1 ^ c2);
    const std::uint64_t c3 = majority(x2, x1, c2);
    const std::uint64_t x3 = l.make<3>(b, x2 ^ c3);
    const std::uint64_t c4 = majority(x3, x2, c3);
    const std::uint64_t s4 = x3 ^ x0 ^ c4;
    const std::uint64_t x4 = l.make<4>(b, s4);
    const std::uint64_t c5a = majority(x3, x0, c4);
    const std::uint64_t c5b = s4 & x4;
    const std::uint64_t s5a = x4 ^ x1 ^ x0;
    const std::uint64_t s5 = s5a ^ c5a ^ c5b;
    const std::uint64_t x5 = l.make<5>(b, s5);
    const std::uint64_t c6a = majority(x4, x1, x0);
    const std::uint64_t c6b = majority(s5a, c5a, c5b);
    const std::uint64_t c6c = s5 & x5;
    const std::uint64_t s6a = x5 ^ x2 ^ x1;
    const std::uint64_t s6b = s6a ^ c6a ^ c6b;
    const std::uint64_t x6 = l.make<6>(b, s6b ^ c6c);
    const std::uint64_t c7a = majority(x5, x2, x1);
    const std::uint64_t c7b = majority(s6a, c6a, c6b);
    const std::uint64_t c7c = majority(s6b, c6c, x6);
    l.make<7>(b, x6 ^ x3 ^ x2 ^ x0 ^ c7a ^ c7b ^ c7c);
}

HWY_INLINE Slices slicesOf(const std::uint8_t* bytes) {
    const hn::CappedTag<std::uint8_t, blockSize> d;
    Slices slices;
    for (std::size_t bit = 0; bit < slices.size(); ++bit) {
        const auto wanted = hn::Set(d, static_cast<std::uint8_t>(1U << bit));
        for (std::size_t at = 0; at < blockSize; at += hn::Lanes(d)) {
            hn::StoreMaskBits(d, hn::TestBit(hn::LoadU(d, bytes + at), wanted),
                              reinterpret_cast<std::uint8_t*>(&slices[bit]) + at / 8);
        }
    }
    return slices;
}

/// The bytes of such bits.
HWY_INLINE void join(const Slices& slices, std::uint8_t* bytes) {
    const hn::CappedTag<std::uint8_t, blockSize> d;
    for (std::size_t at = 0; at < blockSize; at += hn::Lanes(d)) {
        auto joined = hn::Zero(d);
        for (std::size_t bit = 0; bit < slices.size(); ++bit) {
            const auto mask =
                hn::LoadMaskBits(d, reinterpret_cast<const std::uint8_t*>(&slices[bit]) + at / 8);
            joined =
                hn::Or(joined, hn::IfThenElseZero(mask, hn::Set(d, static_cast<std::uint8_t>(1U << bit))));
        }
        hn::StoreU(joined, d, bytes + at);
    }
}
#endif

std::uint64_t fnv1aBytes(std::uint64_t hash, const char* text, std::size_t size) {
    const auto* bytes = reinterpret_cast<const std::uint8_t*>(text);
#if KVT_HAS_CARRYLESS
    LowBytes low;
    for (std::size_t bit = 0; bit < low.next.size(); ++bit) {
        low.next[bit] = std::uint64_t{0} - (hash >> bit & 1U);
    }
    for (; size >= blockSize; size -= blockSize, bytes += blockSize) {
        makeLowBytes(slicesOf(bytes), low);
        alignas(64) std::uint8_t before[blockSize];
        join(low.slices, before);
        std::uint64_t sum = hash * powers[0];
        for (std::size_t i = 0; i < blockSize; ++i) {
            const auto added = static_cast<std::int64_t>(before[i] ^ bytes[i]) - before[i];
            sum += static_cast<std::uint64_t>(added) * powers[i];
        }
        hash = sum;
    }
#endif
    for (; size != 0; --size) {
        hash = (hash ^ *bytes++) * prime;
    }
    return hash;
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail::vectors {

KVT_VECTOR_TABLE(fnv1aBytes);

std::uint64_t fnv1a(std::uint64_t hash, const char* bytes, std::size_t size) noexcept {
    return KVT_VECTOR_CALL(fnv1aBytes)(hash, bytes, size);
}

} // namespace kvt::ex::detail::vectors
#endif // HWY_ONCE
