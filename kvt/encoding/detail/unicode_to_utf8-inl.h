// Eight units of UTF-16 to UTF-8, compiled for each instruction set that has vectors.
//
// The bytes of each character are laid out in a lane of their own, and one shuffle from a table, chosen by the lengths,
// moves them together.
#if defined(KVT_UNICODE_TO_UTF8_INL_H) == defined(HWY_TARGET_TOGGLE) // once for each instruction set
#ifdef KVT_UNICODE_TO_UTF8_INL_H
#undef KVT_UNICODE_TO_UTF8_INL_H
#else
#define KVT_UNICODE_TO_UTF8_INL_H
#endif

#include <kvt/encoding/detail/unicode_characters-inl.h>

#include <hwy/highway.h>

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>

// What does not depend on the instruction set.
#ifndef KVT_UNICODE_TO_UTF8_ONCE
#define KVT_UNICODE_TO_UTF8_ONCE
namespace kvt::ex::detail::vectors {

/// For each set of lanes that have two bytes of two, the order that moves the bytes of eight lanes together.
inline constexpr auto shufflesOfTwo = [] {
    std::array<std::array<std::uint8_t, 16>, 256> table{};
    for (std::size_t mask = 0; mask < table.size(); ++mask) {
        std::size_t length = 0;
        for (std::size_t lane = 0; lane < 8; ++lane) {
            table[mask][length++] = static_cast<std::uint8_t>(2 * lane);
            if ((mask >> lane & 1) != 0) {
                table[mask][length++] = static_cast<std::uint8_t>(2 * lane + 1);
            }
        }
    }
    return table;
}();

/// The same for four lanes of four bytes, which hold the last byte of the character first: the lower half of the
/// index says which lanes have at least two bytes, the upper half which have three.
inline constexpr auto shufflesOfThree = [] {
    std::array<std::array<std::uint8_t, 16>, 256> table{};
    for (std::size_t mask = 0; mask < table.size(); ++mask) {
        std::size_t length = 0;
        for (std::size_t lane = 0; lane < 4; ++lane) {
            const std::size_t bytes = 1 + (mask >> lane & 1) + (mask >> (lane + 4) & 1);
            for (std::size_t i = bytes; i-- > 0;) {
                table[mask][length++] = static_cast<std::uint8_t>(4 * lane + i);
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

/// Eight units below U+0800. Sixteen bytes are written.
HWY_INLINE void putEightTwos(hn::Vec<Eight16> units, std::uint8_t*& q) {
    const Eight16 d;
    const Sixteen8 bytes;
    const auto isTwo = hn::Gt(units, hn::Set(d, 0x7F));
    const auto lead = hn::Or(hn::ShiftRight<6>(units), hn::Set(d, 0x80C0));
    const auto two = hn::Or(lead, hn::ShiftLeft<8>(hn::And(units, hn::Set(d, 0x3F))));
    const auto mask = static_cast<unsigned>(maskOf(d, isTwo));
    const auto laid = hn::BitCast(bytes, hn::IfThenElse(isTwo, two, units));
    hn::StoreU(hn::TableLookupBytes(laid, hn::LoadU(bytes, shufflesOfTwo[mask].data())), bytes, q);
    q += 8 + std::popcount(mask);
}

/// Eight units none of which is a surrogate. Up to 28 bytes are written, 24 of them kept.
HWY_INLINE void putEightThrees(hn::Vec<Eight16> units, std::uint8_t*& q) {
    const Eight16 d;
    const Sixteen8 bytes;
    const auto isTwo = hn::Gt(units, hn::Set(d, 0x7F));
    const auto isThree = hn::Gt(units, hn::Set(d, 0x7FF));
    const auto two = static_cast<unsigned>(maskOf(d, isTwo));
    const auto three = static_cast<unsigned>(maskOf(d, isThree));
    const auto middle = hn::ShiftRight<6>(units);
    const auto last =
        hn::IfThenElse(isTwo, hn::Or(hn::And(units, hn::Set(d, 0x3F)), hn::Set(d, 0x80)), units);
    const auto second = hn::IfThenElse(isThree, hn::Or(hn::And(middle, hn::Set(d, 0x3F)), hn::Set(d, 0x80)),
                                       hn::Or(middle, hn::Set(d, 0xC0)));
    const auto lower = hn::Or(last, hn::ShiftLeft<8>(second));
    const auto upper = hn::Or(hn::ShiftRight<12>(units), hn::Set(d, 0xE0));
    const auto first = hn::BitCast(bytes, hn::InterleaveLower(d, lower, upper));
    const auto rest = hn::BitCast(bytes, hn::InterleaveUpper(d, lower, upper));
    const unsigned firstKey = (two & 0x0F) | (three & 0x0F) << 4;
    const unsigned restKey = two >> 4 | (three & 0xF0);
    hn::StoreU(hn::TableLookupBytes(first, hn::LoadU(bytes, shufflesOfThree[firstKey].data())), bytes, q);
    q += 4 + std::popcount(firstKey);
    hn::StoreU(hn::TableLookupBytes(rest, hn::LoadU(bytes, shufflesOfThree[restKey].data())), bytes, q);
    q += 4 + std::popcount(restKey);
}

// Bytes that may be written behind the last one of a block of eight.
constexpr std::size_t blockRoom = 32;

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif

#endif
