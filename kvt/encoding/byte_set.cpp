// Sets of bytes (see detail/byte_set.h): one source, compiled for each instruction set that Highway knows for this
// processor family, and chosen when it is first called.
//
// Each half of a byte chooses one byte of a table: the lower half those upper halves that are in the set with it, the
// upper half its own bit.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/encoding/byte_set.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/encoding/detail/byte_set.h>

#include <kvt/platform/vector_targets.h>

#include <hwy/highway.h>

#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

std::uint64_t bitsOfSet(const ByteSet::Rows& rows, const std::uint8_t* bytes) {
    std::uint64_t bits = 0;
#if HWY_TARGET != HWY_SCALAR
    // No wider than the block, and no wider than what one number holds the bits of.
    const hn::CappedTag<std::uint8_t, ByteSet::block> d;
    alignas(16) static constexpr std::uint8_t ownBit[16] = {1, 2, 4, 8, 16, 32, 64, 128,
                                                            1, 2, 4, 8, 16, 32, 64, 128};
    const auto low = hn::LoadDup128(d, rows[0].data());
    const auto high = hn::LoadDup128(d, rows[1].data());
    const auto own = hn::LoadDup128(d, ownBit);
    for (std::size_t i = 0; i < ByteSet::block; i += hn::Lanes(d)) {
        const auto v = hn::LoadU(d, bytes + i);
        const auto half = hn::And(v, hn::Set(d, 0x0F));
        const auto isHigh = hn::Gt(v, hn::Set(d, 0x7F));
        const auto row =
            hn::IfThenElse(isHigh, hn::TableLookupBytes(high, half), hn::TableLookupBytes(low, half));
        const auto bit = hn::TableLookupBytes(own, hn::ShiftRight<4>(v));
        std::uint8_t stored[8] = {};
        hn::StoreMaskBits(d, hn::Ne(hn::And(row, bit), hn::Zero(d)), stored);
        std::uint64_t found;
        std::memcpy(&found, stored, sizeof found);
        bits |= found << i;
    }
#else
    for (std::size_t i = 0; i < ByteSet::block; ++i) {
        const unsigned row = rows[bytes[i] / 128][bytes[i] % 16];
        bits |= std::uint64_t{row >> bytes[i] / 16 % 8 & 1} << i;
    }
#endif
    return bits;
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail::vectors {

KVT_VECTOR_TABLE(bitsOfSet);

std::uint64_t ByteSet::bitsOf(const std::uint8_t* bytes) const {
    return KVT_VECTOR_CALL(bitsOfSet)(rows_, bytes);
}

} // namespace kvt::ex::detail::vectors
#endif // HWY_ONCE
