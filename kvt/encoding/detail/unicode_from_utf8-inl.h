// Well-formed UTF-8 to UTF-16 or UTF-32, a block of bytes at a time, compiled for each instruction set that has vectors.
//
// What a character that begins there would be is computed at each byte, and then the places where none begins are
// dropped.
#if defined(KVT_UNICODE_FROM_UTF8_INL_H) == defined(HWY_TARGET_TOGGLE) // once for each instruction set
#ifdef KVT_UNICODE_FROM_UTF8_INL_H
#undef KVT_UNICODE_FROM_UTF8_INL_H
#else
#define KVT_UNICODE_FROM_UTF8_INL_H
#endif

#include <kvt/encoding/detail/unicode_characters-inl.h>

#include <hwy/highway.h>

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>

// What does not depend on the instruction set.
#ifndef KVT_UNICODE_FROM_UTF8_ONCE
#define KVT_UNICODE_FROM_UTF8_ONCE
namespace kvt::ex::detail::vectors {

/// For each set of eight lanes of two bytes, the order that moves the lanes of the set to the front.
inline constexpr auto shufflesOfLanes = [] {
    std::array<std::array<std::uint8_t, 16>, 256> table{};
    for (std::size_t mask = 0; mask < table.size(); ++mask) {
        std::size_t length = 0;
        for (std::size_t lane = 0; lane < 8; ++lane) {
            if ((mask >> lane & 1) != 0) {
                table[mask][length++] = static_cast<std::uint8_t>(2 * lane);
                table[mask][length++] = static_cast<std::uint8_t>(2 * lane + 1);
            }
        }
    }
    return table;
}();

} // namespace kvt::ex::detail::vectors
#endif

#if KVT_HAS_VECTORS

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {

/// Stores units of UTF-16 as they are, or widened.
template <class D>
HWY_INLINE void storeUnits(D d, hn::Vec<D> units, std::uint16_t* q) {
    hn::StoreU(units, d, q);
}
template <class D>
HWY_INLINE void storeUnits(D, hn::Vec<D> units, std::uint32_t* q) {
    const hn::Half<D> half;
    const hn::Rebind<std::uint32_t, hn::Half<D>> wide;
    hn::StoreU(hn::PromoteTo(wide, hn::LowerHalf(half, units)), wide, q);
    hn::StoreU(hn::PromoteTo(wide, hn::UpperHalf(half, units)), wide, q + hn::Lanes(half));
}

/// Stores the lanes of `units` whose bits are set in `mask`, and moves behind them; more may be written.
template <class D, typename Unit>
HWY_INLINE void storeSome(D d, hn::Vec<D> units, std::uint64_t mask, Unit*& q) {
    if constexpr (hn::MaxLanes(d) == 8) {
        const Sixteen8 bytes;
        const auto order = hn::LoadU(bytes, shufflesOfLanes[mask & 0xFF].data());
        storeUnits(d, hn::BitCast(d, hn::TableLookupBytes(hn::BitCast(bytes, units), order)), q);
        q += std::popcount(mask & 0xFF);
#if HWY_TARGET <= HWY_AVX3_DL
    } else if constexpr (hn::MaxLanes(d) == 32) {
        const std::uint32_t bits = static_cast<std::uint32_t>(mask);
        storeUnits(d, hn::Compress(units, hn::LoadMaskBits(d, reinterpret_cast<const std::uint8_t*>(&bits))),
                   q);
        q += std::popcount(bits);
#endif
    } else {
        const hn::Half<D> half;
        storeSome(half, hn::LowerHalf(half, units), mask, q);
        storeSome(half, hn::UpperHalf(half, units), mask >> hn::MaxLanes(half), q);
    }
}

/// What the longest character of a block is.
enum class Longest { two, three, four };

/// The unit of UTF-16 that belongs to each of some bytes: to the first byte of a character, and of one of four bytes to
/// the second as well. Beside them the bytes one and two places behind and one before each, in lanes of two bytes.
template <Longest longest, class D>
HWY_INLINE hn::Vec<D> unitsOf(D d, hn::Vec<D> b0, hn::Vec<D> behind1, hn::Vec<D> behind2, hn::Vec<D> before) {
    const hn::RebindToSigned<D> isSigned;
    const auto b1 = hn::And(behind1, hn::Set(d, 0x3F));
    const auto isAscii = hn::RebindMask(d, hn::Lt(hn::BitCast(isSigned, b0), hn::Set(isSigned, 0x80)));
    const auto two = hn::Or(hn::And(hn::ShiftLeft<6>(b0), hn::Set(d, 0x7C0)), b1);
    if constexpr (longest == Longest::two) {
        return hn::IfThenElse(isAscii, b0, two);
    } else {
        const auto b2 = hn::And(behind2, hn::Set(d, 0x3F));
        const auto three = hn::Or(hn::Or(hn::ShiftLeft<12>(b0), hn::ShiftLeft<6>(b1)), b2);
        const auto isThree = hn::RebindMask(d, hn::Gt(hn::BitCast(isSigned, b0), hn::Set(isSigned, 0xDF)));
        const auto upToThree = hn::IfThenElse(isAscii, b0, hn::IfThenElse(isThree, three, two));
        if constexpr (longest == Longest::three) {
            return upToThree;
        } else {
            // The halves of a surrogate pair, from bits 20 to 10 and 9 to 0 of the code point without 0x10000.
            const auto isFour = hn::RebindMask(d, hn::Gt(hn::BitCast(isSigned, b0), hn::Set(isSigned, 0xEF)));
            const auto followsFour =
                hn::RebindMask(d, hn::Gt(hn::BitCast(isSigned, before), hn::Set(isSigned, 0xEF)));
            const auto bits =
                hn::Or(hn::Or(hn::ShiftLeft<8>(hn::And(b0, hn::Set(d, 0x07))), hn::ShiftLeft<2>(b1)),
                       hn::ShiftRight<4>(b2));
            const auto high = hn::Add(bits, hn::Set(d, 0xD7C0));
            const auto low =
                hn::Or(hn::Or(hn::ShiftLeft<6>(hn::And(b1, hn::Set(d, 0x0F))), b2), hn::Set(d, 0xDC00));
            return hn::IfThenElse(followsFour, low, hn::IfThenElse(isFour, high, upToThree));
        }
    }
}

/// Those of the bytes from `p` on.
template <Longest longest, class D>
HWY_INLINE hn::Vec<D> unitsAt(D d, const std::uint8_t* p) {
    const hn::Rebind<std::uint8_t, D> narrow;
    const auto b0 = hn::PromoteTo(d, hn::LoadU(narrow, p));
    const auto b1 = hn::PromoteTo(d, hn::LoadU(narrow, p + 1));
    const auto b2 = longest == Longest::two ? b1 : hn::PromoteTo(d, hn::LoadU(narrow, p + 2));
    const auto before = longest == Longest::four ? hn::PromoteTo(d, hn::LoadU(narrow, p - 1)) : b0;
    return unitsOf<longest>(d, b0, b1, b2, before);
}

template <Longest longest, class D, typename Unit>
HWY_INLINE void putBlock(D d, std::uint64_t mask, const std::uint8_t*& p, Unit*& q) {
    const std::size_t N = hn::Lanes(d);
    storeSome(d, unitsAt<longest>(d, p), mask, q);
    storeSome(d, unitsAt<longest>(d, p + N), mask >> (N - 1) >> 1, q);
    p += 2 * N;
}

/// Converts blocks of twice as many bytes as there are units in a register. A block of four-byte characters may end
/// behind the first byte of one, of which only the high half has been written then.
template <class D, typename Unit>
HWY_INLINE void fromUtf8Blocks(D d, const std::uint8_t* first, const std::uint8_t*& p,
                               const std::uint8_t* end, Unit*& q, const Unit* outEnd) {
    const hn::Rebind<std::uint8_t, D> narrow;
    const hn::Repartition<std::uint8_t, D> dBytes;
    const hn::RebindToSigned<decltype(dBytes)> dSigned;
    const std::size_t N = hn::Lanes(d);
    while (static_cast<std::size_t>(end - p) >= 2 * N + 2 && static_cast<std::size_t>(outEnd - q) >= 2 * N) {
        const auto all = hn::LoadU(dBytes, p);
        if (hn::AllTrue(dBytes, hn::Lt(all, hn::Set(dBytes, 0x80)))) {
            storeUnits(d, hn::PromoteTo(d, hn::LowerHalf(narrow, all)), q);
            storeUnits(d, hn::PromoteTo(d, hn::UpperHalf(narrow, all)), q + N);
            p += 2 * N;
            q += 2 * N;
            continue;
        }
        const std::uint64_t begins =
            maskOf(dSigned, hn::Gt(hn::BitCast(dSigned, all), hn::Set(dSigned, -65)));
        const bool hasFours =
            !hn::AllTrue(dBytes, hn::Lt(all, hn::Set(dBytes, 0xF0))) || (p != first && p[-1] >= 0xF0);
        if (HWY_LIKELY(!hasFours)) {
            if (hn::AllTrue(dBytes, hn::Lt(all, hn::Set(dBytes, 0xE0)))) {
                putBlock<Longest::two>(d, begins, p, q);
            } else {
                putBlock<Longest::three>(d, begins, p, q);
            }
            continue;
        }
        if (sizeof(Unit) == 2 && p != first) {
            const auto before = hn::LoadU(dBytes, p - 1);
            const auto isFour = hn::Eq(hn::Max(before, hn::Set(dBytes, 0xF0)), before);
            putBlock<Longest::four>(d, begins | maskOf(dBytes, isFour), p, q);
            continue;
        }
        const std::uint8_t* const stop = p + 2 * N;
        while (p < stop) {
            if (isTrail(*p)) {
                ++p;
            } else {
                put(q, takeUtf8(p));
            }
        }
    }
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif

#endif
