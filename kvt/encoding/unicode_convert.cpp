// Well-formed text from one Unicode form to another (see detail/unicode_vectors.h): one source, compiled for each
// instruction set that Highway knows for this processor family, and chosen when it is first called.
//
// Characters beyond U+FFFF go one by one, but for those from UTF-8 to UTF-16.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/encoding/unicode_convert.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/encoding/detail/unicode_characters-inl.h>
#include <kvt/encoding/detail/unicode_from_utf8-inl.h>
#include <kvt/encoding/detail/unicode_to_utf8-inl.h>
#include <kvt/encoding/detail/unicode_vectors.h>

#include <kvt/platform/vector_targets.h>

#include <hwy/highway.h>

#include <algorithm>
#include <array>
#include <bit>
#include <iterator>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {

// ---- From UTF-8

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
