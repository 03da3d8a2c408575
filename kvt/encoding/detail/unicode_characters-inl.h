// What measuring and converting share, compiled for each instruction set: units at any address, and characters one by
// one, for the ends of texts and for what is rare in them.
#if defined(KVT_UNICODE_CHARACTERS_INL_H) == defined(HWY_TARGET_TOGGLE) // once for each instruction set
#ifdef KVT_UNICODE_CHARACTERS_INL_H
#undef KVT_UNICODE_CHARACTERS_INL_H
#else
#define KVT_UNICODE_CHARACTERS_INL_H
#endif

#include <kvt/foundation/detail/utf.h>

#include <hwy/highway.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

// The scalar target has no vectors; only the loops over single characters are left of each function.
#undef KVT_HAS_VECTORS
#define KVT_HAS_VECTORS (HWY_TARGET != HWY_SCALAR)

template <typename Unit>
HWY_INLINE Unit loadUnit(const Unit* p) {
    Unit unit;
    std::memcpy(&unit, p, sizeof unit);
    return unit;
}
template <typename Unit>
HWY_INLINE void storeUnit(Unit* p, Unit unit) {
    std::memcpy(p, &unit, sizeof unit);
}

// ---- One character at a time, for the ends of texts and what is rare ----------------------------------------------

HWY_INLINE bool isTrail(std::uint8_t byte) {
    return isContinuation(static_cast<char>(byte));
}

/// The length of the well-formed character at `p`; 0 where there is none.
HWY_INLINE std::size_t wellFormedLength(const std::uint8_t* p, const std::uint8_t* end) {
    const std::uint8_t lead = *p;
    const auto left = static_cast<std::size_t>(end - p);
    if (lead < 0x80) {
        return 1;
    }
    if (lead < 0xE0) {
        return lead >= 0xC2 && left >= 2 && isTrail(p[1]) ? 2 : 0;
    }
    if (lead < 0xF0) {
        const bool fits = left >= 3 && isTrail(p[1]) && isTrail(p[2]) && (lead != 0xE0 || p[1] >= 0xA0) &&
                          (lead != 0xED || p[1] < 0xA0);
        return fits ? 3 : 0;
    }
    const bool fits = lead <= 0xF4 && left >= 4 && isTrail(p[1]) && isTrail(p[2]) && isTrail(p[3]) &&
                      (lead != 0xF0 || p[1] >= 0x90) && (lead != 0xF4 || p[1] < 0x90);
    return fits ? 4 : 0;
}

/// Reads the well-formed character at `p` and moves behind it.
HWY_INLINE std::uint32_t takeUtf8(const std::uint8_t*& p) {
    const std::uint32_t lead = *p;
    if (lead < 0x80) {
        p += 1;
        return lead;
    }
    if (lead < 0xE0) {
        const std::uint32_t c = (lead & 0x1F) << 6 | (p[1] & 0x3Fu);
        p += 2;
        return c;
    }
    if (lead < 0xF0) {
        const std::uint32_t c = (lead & 0x0F) << 12 | (p[1] & 0x3Fu) << 6 | (p[2] & 0x3Fu);
        p += 3;
        return c;
    }
    const std::uint32_t c = (lead & 0x07) << 18 | (p[1] & 0x3Fu) << 12 | (p[2] & 0x3Fu) << 6 | (p[3] & 0x3Fu);
    p += 4;
    return c;
}

HWY_INLINE std::uint32_t takeUtf16(const std::uint16_t*& p) {
    const std::uint32_t unit = loadUnit(p++);
    return isSurrogate(unit) ? codePointOf(static_cast<char16_t>(unit), static_cast<char16_t>(loadUnit(p++)))
                             : unit;
}

HWY_INLINE void putUtf8(std::uint8_t*& q, std::uint32_t c) {
    q += encodeUtf8(c, reinterpret_cast<char*>(q));
}

HWY_INLINE void putUtf16(std::uint16_t*& q, std::uint32_t c) {
    if (c < firstSupplementary) {
        storeUnit(q++, static_cast<std::uint16_t>(c));
        return;
    }
    storeUnit(q++, static_cast<std::uint16_t>(highSurrogate(c)));
    storeUnit(q++, static_cast<std::uint16_t>(lowSurrogate(c)));
}

HWY_INLINE void putUtf32(std::uint32_t*& q, std::uint32_t c) {
    storeUnit(q++, c);
}

HWY_INLINE void put(std::uint8_t*& q, std::uint32_t c) {
    putUtf8(q, c);
}
HWY_INLINE void put(std::uint16_t*& q, std::uint32_t c) {
    putUtf16(q, c);
}
HWY_INLINE void put(std::uint32_t*& q, std::uint32_t c) {
    putUtf32(q, c);
}

using Bytes = hn::ScalableTag<std::uint8_t>;
using Units16 = hn::ScalableTag<std::uint16_t>;
using Units32 = hn::ScalableTag<std::uint32_t>;

#if KVT_HAS_VECTORS
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
#endif

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
