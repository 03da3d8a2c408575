// Well-formed text from one Unicode form to another (see detail/unicode_vectors.h): one source, compiled for each
// instruction set that Highway knows for this processor family, and chosen when it is first called.
//
// Reading UTF-8 computes, at each byte, what a character that begins there would be, and then drops the places where
// none begins. Writing UTF-8 lays out the bytes of each character in a lane of their own, and one shuffle from a table,
// chosen by the lengths, moves them together. Characters beyond U+FFFF go one by one, but for those from UTF-8 to
// UTF-16.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/encoding/unicode_convert.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/encoding/detail/unicode_characters-inl.h>
#include <kvt/encoding/detail/unicode_vectors.h>

#include <kvt/platform/vector_targets.h>

#include <hwy/highway.h>

#include <algorithm>
#include <array>
#include <bit>
#include <iterator>

// What does not depend on the instruction set.
#ifndef KVT_UNICODE_CONVERT_ONCE
#define KVT_UNICODE_CONVERT_ONCE
namespace kvt::ex::detail::vectors {

/// For each set of eight lanes of two bytes, the order that moves the lanes of the set to the front.
constexpr auto shufflesOfLanes = [] {
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

/// For each set of lanes that have two bytes of two, the order that moves the bytes of eight lanes together.
constexpr auto shufflesOfTwo = [] {
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
constexpr auto shufflesOfThree = [] {
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

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {

// ---- From UTF-8

#if KVT_HAS_VECTORS
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

using Eight16 = hn::FixedTag<std::uint16_t, 8>;
using Sixteen8 = hn::FixedTag<std::uint8_t, 16>;

/// The lanes of a mask as bits, the first one lowest.
template <class D>
HWY_INLINE std::uint64_t maskOf(D d, hn::Mask<D> mask) {
    std::uint8_t bytes[8] = {};
    hn::StoreMaskBits(d, mask, bytes);
    std::uint64_t bits;
    std::memcpy(&bits, bytes, sizeof bits);
    return bits;
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

/// The unit of UTF-16 that belongs to each of the bytes from `p` on: to the first byte of a character, and of one of
/// four bytes to the second as well.
template <Longest longest, class D>
HWY_INLINE hn::Vec<D> unitsAt(D d, const std::uint8_t* p) {
    const hn::Rebind<std::uint8_t, D> narrow;
    const hn::RebindToSigned<D> isSigned;
    const auto b0 = hn::PromoteTo(d, hn::LoadU(narrow, p));
    const auto b1 = hn::And(hn::PromoteTo(d, hn::LoadU(narrow, p + 1)), hn::Set(d, 0x3F));
    const auto isAscii = hn::RebindMask(d, hn::Lt(hn::BitCast(isSigned, b0), hn::Set(isSigned, 0x80)));
    const auto two = hn::Or(hn::And(hn::ShiftLeft<6>(b0), hn::Set(d, 0x7C0)), b1);
    if constexpr (longest == Longest::two) {
        return hn::IfThenElse(isAscii, b0, two);
    } else {
        const auto b2 = hn::And(hn::PromoteTo(d, hn::LoadU(narrow, p + 2)), hn::Set(d, 0x3F));
        const auto three = hn::Or(hn::Or(hn::ShiftLeft<12>(b0), hn::ShiftLeft<6>(b1)), b2);
        const auto isThree = hn::RebindMask(d, hn::Gt(hn::BitCast(isSigned, b0), hn::Set(isSigned, 0xDF)));
        const auto upToThree = hn::IfThenElse(isAscii, b0, hn::IfThenElse(isThree, three, two));
        if constexpr (longest == Longest::three) {
            return upToThree;
        } else {
            // The halves of a surrogate pair, from bits 20 to 10 and 9 to 0 of the code point without 0x10000.
            const auto before = hn::PromoteTo(d, hn::LoadU(narrow, p - 1));
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
#endif

#if KVT_HAS_VECTORS
/// Converts the last bytes of a text, fewer than two narrow registers, as a register or two with zeros behind them.
/// They may begin with trail bytes of a character that is done.
template <typename Unit>
HWY_INLINE void fromUtf8End(const std::uint8_t*& p, const std::uint8_t* end, Unit*& q) {
    const Eight16 d;
    constexpr std::size_t block = 16;
    const auto left = static_cast<std::size_t>(end - p);
    const std::size_t bytes = left <= block ? block : 2 * block;
    std::uint8_t padded[2 * block + 2] = {};
    std::memcpy(padded, p, left);
    Unit units[3 * block];
    const std::uint8_t* from = padded;
    Unit* to = units;
    fromUtf8Blocks(d, from, from, padded + bytes + 2, to, units + std::size(units));
    // A character of four bytes may have taken the place of the second register.
    while (from < padded + left) {
        if (isTrail(*from)) {
            ++from;
        } else {
            put(to, takeUtf8(from));
        }
    }
    const std::size_t written = static_cast<std::size_t>((to - units) - (from - (padded + left)));
    std::memcpy(q, units, written * sizeof(Unit));
    p = end;
    q += written;
}
#endif

template <typename Unit>
HWY_INLINE std::size_t fromUtf8(const char* text, std::size_t bytes, char* out, std::size_t room) {
    const auto* const first = reinterpret_cast<const std::uint8_t*>(text);
    const std::uint8_t* p = first;
    const std::uint8_t* const end = p + bytes;
    auto* const begin = reinterpret_cast<Unit*>(out);
    Unit* q = begin;
#if KVT_HAS_VECTORS
    // What the widest registers leave over is worth narrower ones.
    fromUtf8Blocks(Units16(), first, p, end, q, begin + room);
    fromUtf8Blocks(Eight16(), first, p, end, q, begin + room);
    if (sizeof(Unit) == 2 && p != first && p[-1] >= 0xF0) {
        --p;
        storeUnit(q++, static_cast<Unit>(lowSurrogate(takeUtf8(p))));
    }
    if (const auto left = static_cast<std::size_t>(end - p); left > 1 && left < 32) {
        fromUtf8End(p, end, q);
    }
#else
    static_cast<void>(room);
#endif
    while (p < end) {
        if (isTrail(*p)) {
            ++p;
        } else {
            put(q, takeUtf8(p));
        }
    }
    return static_cast<std::size_t>(q - begin);
}

std::size_t utf8ToUtf16(const char* text, std::size_t bytes, char* out, std::size_t room) {
    return fromUtf8<std::uint16_t>(text, bytes, out, room);
}
std::size_t utf8ToUtf32(const char* text, std::size_t bytes, char* out, std::size_t room) {
    return fromUtf8<std::uint32_t>(text, bytes, out, room);
}

// ---- To UTF-8

#if KVT_HAS_VECTORS
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

#endif

std::size_t utf16ToUtf8(const char* text, std::size_t units, char* out, std::size_t room) {
    const auto* p = reinterpret_cast<const std::uint16_t*>(text);
    const std::uint16_t* const end = p + units;
    auto* const begin = reinterpret_cast<std::uint8_t*>(out);
    std::uint8_t* q = begin;
    const std::uint8_t* const outEnd = q + room;
#if KVT_HAS_VECTORS
    const Units16 wide;
    const hn::Rebind<std::uint8_t, Units16> narrow;
    const std::size_t N = hn::Lanes(wide);
    const Eight16 d;
    while (static_cast<std::size_t>(end - p) >= 8 && static_cast<std::size_t>(outEnd - q) >= blockRoom) {
        while (static_cast<std::size_t>(end - p) >= 2 * N && static_cast<std::size_t>(outEnd - q) >= 2 * N) {
            const auto v0 = hn::LoadU(wide, p);
            const auto v1 = hn::LoadU(wide, p + N);
            const auto beyond = hn::And(hn::Or(v0, v1), hn::Set(wide, 0xFF80));
            if (!hn::AllTrue(wide, hn::Eq(beyond, hn::Zero(wide)))) {
                break;
            }
            const hn::RebindToSigned<Units16> isSigned;
            hn::StoreU(hn::DemoteTo(narrow, hn::BitCast(isSigned, v0)), narrow, q);
            hn::StoreU(hn::DemoteTo(narrow, hn::BitCast(isSigned, v1)), narrow, q + N);
            p += 2 * N;
            q += 2 * N;
        }
        // Some blocks more are likely to be of the kind that ended the run.
        for (int i = 0; i < 8 && static_cast<std::size_t>(end - p) >= 8 &&
                        static_cast<std::size_t>(outEnd - q) >= blockRoom;
             ++i) {
            const auto v = hn::LoadU(d, p);
            const auto isBeyondTwo = hn::Gt(v, hn::Set(d, 0x7FF));
            if (hn::AllFalse(d, isBeyondTwo)) {
                putEightTwos(v, q);
                p += 8;
                continue;
            }
            const auto isSurrogate = hn::Eq(hn::And(v, hn::Set(d, 0xF800)), hn::Set(d, 0xD800));
            if (HWY_LIKELY(hn::AllFalse(d, isSurrogate))) {
                putEightThrees(v, q);
                p += 8;
                continue;
            }
            const std::uint16_t* const stop = p + 8;
            while (p < stop) {
                putUtf8(q, takeUtf16(p));
            }
        }
    }
    // The last ones, where less room is left than a block may overwrite, by way of a buffer.
    while (end - p > 1) {
        const std::size_t count = std::min<std::size_t>(8, static_cast<std::size_t>(end - p));
        std::uint16_t padded[8] = {};
        std::memcpy(padded, p, count * sizeof *p);
        const auto v = hn::LoadU(d, padded);
        if (!hn::AllFalse(d, hn::Eq(hn::And(v, hn::Set(d, 0xF800)), hn::Set(d, 0xD800)))) {
            break;
        }
        std::uint8_t bytes[blockRoom];
        std::uint8_t* to = bytes;
        if (hn::AllFalse(d, hn::Gt(v, hn::Set(d, 0x7FF)))) {
            putEightTwos(v, to);
        } else {
            putEightThrees(v, to);
        }
        const std::size_t written = static_cast<std::size_t>(to - bytes) - (8 - count);
        std::memcpy(q, bytes, written);
        p += count;
        q += written;
    }
#else
    static_cast<void>(outEnd);
#endif
    while (p < end) {
        putUtf8(q, takeUtf16(p));
    }
    return static_cast<std::size_t>(q - begin);
}

// ---- UTF-16 and UTF-32 ----------------------------------------------------------------------------------------------

#if KVT_HAS_VECTORS
template <class D>
HWY_INLINE void widenUnits(D d, const std::uint16_t*& p, const std::uint16_t* end, std::uint32_t*& q,
                           const std::uint32_t* outEnd) {
    const std::size_t N = hn::Lanes(d);
    while (static_cast<std::size_t>(end - p) >= N && static_cast<std::size_t>(outEnd - q) >= N) {
        const auto v = hn::LoadU(d, p);
        if (HWY_LIKELY(hn::AllFalse(d, hn::Eq(hn::And(v, hn::Set(d, 0xF800)), hn::Set(d, 0xD800))))) {
            storeUnits(d, v, q);
            p += N;
            q += N;
            continue;
        }
        const std::uint16_t* const stop = p + N;
        while (p < stop) {
            putUtf32(q, takeUtf16(p));
        }
    }
}

template <class D>
HWY_INLINE void narrowUnits(D d, const std::uint32_t*& p, const std::uint32_t* end, std::uint16_t*& q,
                            const std::uint16_t* outEnd) {
    const hn::Rebind<std::uint16_t, D> narrow;
    const std::size_t N = hn::Lanes(d);
    while (static_cast<std::size_t>(end - p) >= N && static_cast<std::size_t>(outEnd - q) >= N) {
        const auto v = hn::LoadU(d, p);
        if (HWY_LIKELY(hn::AllTrue(d, hn::Eq(hn::ShiftRight<16>(v), hn::Zero(d))))) {
            hn::StoreU(hn::DemoteTo(narrow, hn::BitCast(hn::RebindToSigned<D>(), v)), narrow, q);
            p += N;
            q += N;
            continue;
        }
        for (std::size_t i = 0; i < N; ++i) {
            putUtf16(q, loadUnit(p++));
        }
    }
}
#endif

std::size_t utf16ToUtf32(const char* text, std::size_t units, char* out, std::size_t room) {
    const auto* p = reinterpret_cast<const std::uint16_t*>(text);
    const std::uint16_t* const end = p + units;
    auto* const begin = reinterpret_cast<std::uint32_t*>(out);
    std::uint32_t* q = begin;
#if KVT_HAS_VECTORS
    // What the widest registers leave over is worth narrower ones.
    widenUnits(Units16(), p, end, q, begin + room);
    widenUnits(Eight16(), p, end, q, begin + room);
#else
    static_cast<void>(room);
#endif
    while (p < end) {
        putUtf32(q, takeUtf16(p));
    }
    return static_cast<std::size_t>(q - begin);
}

std::size_t utf32ToUtf16(const char* text, std::size_t units, char* out, std::size_t room) {
    const auto* p = reinterpret_cast<const std::uint32_t*>(text);
    const std::uint32_t* const end = p + units;
    auto* const begin = reinterpret_cast<std::uint16_t*>(out);
    std::uint16_t* q = begin;
#if KVT_HAS_VECTORS
    narrowUnits(Units32(), p, end, q, begin + room);
    narrowUnits(hn::FixedTag<std::uint32_t, 4>(), p, end, q, begin + room);
#else
    static_cast<void>(room);
#endif
    while (p < end) {
        putUtf16(q, loadUnit(p++));
    }
    return static_cast<std::size_t>(q - begin);
}

std::size_t utf32ToUtf8(const char* text, std::size_t units, char* out, std::size_t room) {
    const auto* p = reinterpret_cast<const std::uint32_t*>(text);
    const std::uint32_t* const end = p + units;
    auto* const begin = reinterpret_cast<std::uint8_t*>(out);
    std::uint8_t* q = begin;
    const std::uint8_t* const outEnd = q + room;
#if KVT_HAS_VECTORS
    const hn::FixedTag<std::uint32_t, 4> four;
    const hn::FixedTag<std::int32_t, 4> fourSigned;
    const hn::FixedTag<std::uint16_t, 4> fourNarrow;
    const Eight16 d;
    while (static_cast<std::size_t>(end - p) >= 8 && static_cast<std::size_t>(outEnd - q) >= blockRoom) {
        const auto v0 = hn::LoadU(four, p);
        const auto v1 = hn::LoadU(four, p + 4);
        const auto both = hn::Or(v0, v1);
        if (HWY_UNLIKELY(!hn::AllTrue(four, hn::Eq(hn::ShiftRight<16>(both), hn::Zero(four))))) {
            for (int i = 0; i < 8; ++i) {
                putUtf8(q, loadUnit(p++));
            }
            continue;
        }
        const auto v = hn::Combine(d, hn::DemoteTo(fourNarrow, hn::BitCast(fourSigned, v1)),
                                   hn::DemoteTo(fourNarrow, hn::BitCast(fourSigned, v0)));
        p += 8;
        if (hn::AllTrue(fourSigned, hn::Lt(hn::BitCast(fourSigned, both), hn::Set(fourSigned, 0x80)))) {
            const hn::FixedTag<std::uint8_t, 8> bytes;
            hn::StoreU(hn::DemoteTo(bytes, hn::BitCast(hn::FixedTag<std::int16_t, 8>(), v)), bytes, q);
            q += 8;
        } else if (hn::AllTrue(fourSigned,
                               hn::Lt(hn::BitCast(fourSigned, both), hn::Set(fourSigned, 0x800)))) {
            putEightTwos(v, q);
        } else {
            putEightThrees(v, q);
        }
    }
#else
    static_cast<void>(outEnd);
#endif
    while (p < end) {
        putUtf8(q, loadUnit(p++));
    }
    return static_cast<std::size_t>(q - begin);
}

// ---- ASCII ----------------------------------------------------------------------------------------------------------

std::size_t widenAscii(const char* text, std::size_t bytes, char* out) {
    const auto* const begin = reinterpret_cast<const std::uint8_t*>(text);
    const std::uint8_t* const end = begin + bytes;
    const std::uint8_t* p = begin;
    auto* q = reinterpret_cast<std::uint16_t*>(out);
#if KVT_HAS_VECTORS
    const Units16 d;
    const hn::Rebind<std::uint8_t, Units16> narrow;
    const Bytes dBytes;
    const std::size_t N = hn::Lanes(d);
    while (static_cast<std::size_t>(end - p) >= 2 * N) {
        const auto v = hn::LoadU(dBytes, p);
        if (!hn::AllTrue(dBytes, hn::Lt(v, hn::Set(dBytes, 0x80)))) {
            break;
        }
        hn::StoreU(hn::PromoteTo(d, hn::LowerHalf(v)), d, q);
        hn::StoreU(hn::PromoteTo(d, hn::UpperHalf(narrow, v)), d, q + N);
        p += 2 * N;
        q += 2 * N;
    }
#endif
    while (p < end && *p < 0x80) {
        storeUnit(q++, static_cast<std::uint16_t>(*p++));
    }
    return static_cast<std::size_t>(p - begin);
}

std::size_t narrowAscii(const char* text, std::size_t units, char* out) {
    const auto* const begin = reinterpret_cast<const std::uint16_t*>(text);
    const std::uint16_t* const end = begin + units;
    const std::uint16_t* p = begin;
    auto* q = reinterpret_cast<std::uint8_t*>(out);
#if KVT_HAS_VECTORS
    const Units16 d;
    const hn::RebindToSigned<Units16> isSigned;
    const hn::Rebind<std::uint8_t, Units16> narrow;
    const std::size_t N = hn::Lanes(d);
    while (static_cast<std::size_t>(end - p) >= N) {
        const auto v = hn::LoadU(d, p);
        if (!hn::AllTrue(d, hn::Eq(hn::And(v, hn::Set(d, 0xFF80)), hn::Zero(d)))) {
            break;
        }
        hn::StoreU(hn::DemoteTo(narrow, hn::BitCast(isSigned, v)), narrow, q);
        p += N;
        q += N;
    }
#endif
    while (p < end && loadUnit(p) < 0x80) {
        *q++ = static_cast<std::uint8_t>(loadUnit(p++));
    }
    return static_cast<std::size_t>(p - begin);
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail::vectors {

KVT_VECTOR_TABLE(utf8ToUtf16);
KVT_VECTOR_TABLE(utf8ToUtf32);
KVT_VECTOR_TABLE(utf16ToUtf8);
KVT_VECTOR_TABLE(utf16ToUtf32);
KVT_VECTOR_TABLE(utf32ToUtf8);
KVT_VECTOR_TABLE(utf32ToUtf16);
KVT_VECTOR_TABLE(widenAscii);
KVT_VECTOR_TABLE(narrowAscii);

std::size_t utf8ToUtf16(const char* text, std::size_t bytes, char* out, std::size_t room) {
    return KVT_VECTOR_CALL(utf8ToUtf16)(text, bytes, out, room);
}
std::size_t utf8ToUtf32(const char* text, std::size_t bytes, char* out, std::size_t room) {
    return KVT_VECTOR_CALL(utf8ToUtf32)(text, bytes, out, room);
}
std::size_t utf16ToUtf8(const char* text, std::size_t units, char* out, std::size_t room) {
    return KVT_VECTOR_CALL(utf16ToUtf8)(text, units, out, room);
}
std::size_t utf16ToUtf32(const char* text, std::size_t units, char* out, std::size_t room) {
    return KVT_VECTOR_CALL(utf16ToUtf32)(text, units, out, room);
}
std::size_t utf32ToUtf8(const char* text, std::size_t units, char* out, std::size_t room) {
    return KVT_VECTOR_CALL(utf32ToUtf8)(text, units, out, room);
}
std::size_t utf32ToUtf16(const char* text, std::size_t units, char* out, std::size_t room) {
    return KVT_VECTOR_CALL(utf32ToUtf16)(text, units, out, room);
}
std::size_t widenAscii(const char* text, std::size_t bytes, char* out) {
    return KVT_VECTOR_CALL(widenAscii)(text, bytes, out);
}
std::size_t narrowAscii(const char* text, std::size_t units, char* out) {
    return KVT_VECTOR_CALL(narrowAscii)(text, units, out);
}

} // namespace kvt::ex::detail::vectors
#endif // HWY_ONCE
