// How much of a text is well-formed, and what it measures in other forms (see detail/unicode_vectors.h): one source,
// compiled for each instruction set that Highway knows for this processor family, and chosen when it is first called.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/encoding/unicode_measure.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/encoding/detail/unicode_characters-inl.h>
#include <kvt/encoding/detail/unicode_vectors.h>
#include <kvt/encoding/detail/utf8_check-inl.h>

#include <kvt/platform/vector_targets.h>

#include <hwy/highway.h>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {

/// Adds the characters of one more byte each up to `end` or the first that is not well-formed.
HWY_INLINE const std::uint8_t* measureUtf8Singly(const std::uint8_t* p, const std::uint8_t* stop,
                                                 const std::uint8_t* end, Extent& extent, bool& ended) {
    while (p < stop) {
        const std::size_t length = wellFormedLength(p, end);
        if (length == 0) {
            ended = true;
            return p;
        }
        p += length;
        extent.utf32 += 1;
        extent.utf16 += length == 4 ? 2 : 1;
    }
    return p;
}

#if KVT_HAS_VECTORS
/// Adds whole registers of bytes, of which three can be read in front of `p`. Returns whether all was well-formed; what
/// is not stands in the bytes from `p` on, or begins within the three before it.
template <class D>
HWY_INLINE bool measureUtf8Blocks(D d, const std::uint8_t*& p, const std::uint8_t* end, Extent& extent) {
    const hn::RebindToSigned<D> dSigned;
    const std::size_t N = hn::Lanes(d);
    constexpr std::size_t unrolled = 4;
    while (static_cast<std::size_t>(end - p) >= N) {
        // Blocks of nothing but ASCII, behind a complete character.
        while (static_cast<std::size_t>(end - p) >= unrolled * N) {
            const auto any = hn::Or(hn::Or(hn::LoadU(d, p), hn::LoadU(d, p + N)),
                                    hn::Or(hn::LoadU(d, p + 2 * N), hn::LoadU(d, p + 3 * N)));
            if (!hn::AllTrue(d, hn::Lt(any, hn::Set(d, 0x80))) || p[-1] >= 0xC0 || p[-2] >= 0xE0 ||
                p[-3] >= 0xF0) {
                break;
            }
            p += unrolled * N;
            extent.utf32 += unrolled * N;
            extent.utf16 += unrolled * N;
        }
        if (static_cast<std::size_t>(end - p) < N) {
            break;
        }
        const auto v = hn::LoadU(d, p);
        if (!hn::AllTrue(d, hn::Eq(Utf8Check::errors(d, p, v), hn::Zero(d)))) {
            return false;
        }
        const std::size_t leads =
            hn::CountTrue(dSigned, hn::Gt(hn::BitCast(dSigned, v), hn::Set(dSigned, -65)));
        const std::size_t fours = hn::CountTrue(d, hn::Eq(hn::Max(v, hn::Set(d, 0xF0)), v));
        extent.utf32 += leads;
        extent.utf16 += leads + fours;
        p += N;
    }
    return true;
}

/// Takes back the last character before `p` where it reaches beyond that. Three bytes can be read in front of `p`.
HWY_INLINE const std::uint8_t* withoutOpenCharacter(const std::uint8_t* p, Extent& extent) {
    for (std::ptrdiff_t back = 1; back <= 3; ++back) {
        const std::uint8_t lead = p[-back];
        if (lead >= 0xC0) {
            const std::ptrdiff_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
            if (length > back) {
                extent.utf32 -= 1;
                extent.utf16 -= length == 4 ? 2 : 1;
                return p - back;
            }
            break;
        }
    }
    return p;
}
#endif

#if KVT_HAS_VECTORS
/// Adds the last bytes of a text, fewer than two narrow registers, as a register or two with zeros around them; or
/// nothing, when that is not well-formed. They begin with a character.
template <class D>
HWY_INLINE const std::uint8_t* measureUtf8End(D narrow, const std::uint8_t* p, const std::uint8_t* end,
                                              Extent& extent) {
    const std::size_t N = hn::Lanes(narrow);
    const auto left = static_cast<std::size_t>(end - p);
    std::uint8_t padded[3 + 2 * 16] = {};
    std::memcpy(padded + 3, p, left);
    const std::size_t bytes = left <= N ? N : 2 * N;
    const std::uint8_t* q = padded + 3;
    Extent added;
    if (!measureUtf8Blocks(narrow, q, q + bytes, added)) {
        return p;
    }
    // Where zeros follow, an open character is one that is not well-formed.
    const std::uint8_t* const behind = withoutOpenCharacter(q, added);
    extent.utf32 += added.utf32 - (bytes - left);
    extent.utf16 += added.utf16 - (bytes - left);
    return end - (q - behind);
}
#endif

Extent measureUtf8(const char* text, std::size_t bytes) {
    const auto* const begin = reinterpret_cast<const std::uint8_t*>(text);
    const std::uint8_t* const end = begin + bytes;
    const std::uint8_t* p = begin;
    Extent extent;
    bool ended = false;
#if KVT_HAS_VECTORS
    const hn::FixedTag<std::uint8_t, 16> narrow;
    if (bytes >= 2 * hn::Lanes(narrow)) {
        p = measureUtf8Singly(p, begin + 3, end, extent, ended);
        if (!ended) {
            // What the widest registers leave over, or where they find a fault, is worth narrower ones.
            measureUtf8Blocks(Bytes(), p, end, extent);
            measureUtf8Blocks(narrow, p, end, extent);
            p = withoutOpenCharacter(p, extent);
        }
    }
    if (!ended && end - p > 1 && static_cast<std::size_t>(end - p) < 2 * hn::Lanes(narrow)) {
        p = measureUtf8End(narrow, p, end, extent);
    }
#endif
    if (!ended) {
        p = measureUtf8Singly(p, end, end, extent, ended);
    }
    extent.taken = static_cast<std::size_t>(p - begin);
    extent.utf8 = extent.taken;
    return extent;
}

#if KVT_HAS_VECTORS
/// The units of the first registers, four at a time, that hold nothing but ASCII.
template <class D>
HWY_INLINE std::size_t asciiBlocks(D d, const hn::TFromD<D>* p, const hn::TFromD<D>* end) {
    const std::size_t N = hn::Lanes(d);
    const auto* const begin = p;
    while (static_cast<std::size_t>(end - p) >= 4 * N) {
        const auto any = hn::Or(hn::Or(hn::LoadU(d, p), hn::LoadU(d, p + N)),
                                hn::Or(hn::LoadU(d, p + 2 * N), hn::LoadU(d, p + 3 * N)));
        if (!hn::AllTrue(d, hn::Lt(any, hn::Set(d, 0x80)))) {
            break;
        }
        p += 4 * N;
    }
    return static_cast<std::size_t>(p - begin);
}
#endif

Extent measureUtf16(const char* text, std::size_t units) {
    const auto* const begin = reinterpret_cast<const std::uint16_t*>(text);
    const std::uint16_t* const end = begin + units;
    const std::uint16_t* p = begin;
    Extent extent;
    std::size_t beyondAscii = 0; // units from U+0080 and from U+0800
    std::size_t surrogates = 0;
#if KVT_HAS_VECTORS
    const Units16 d;
    const std::size_t N = hn::Lanes(d);
    const auto surrogateMask = hn::Set(d, 0xF800);
    const auto half = hn::Set(d, 0xFC00);
    while (static_cast<std::size_t>(end - p) >= N) {
        const auto v = hn::LoadU(d, p);
        const std::size_t beyond = hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7F)));
        beyondAscii += beyond;
        beyondAscii += hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7FF)));
        const auto isSurrogate = hn::Eq(hn::And(v, surrogateMask), hn::Set(d, 0xD800));
        if (HWY_UNLIKELY(!hn::AllFalse(d, isSurrogate) ||
                         (p != begin && (loadUnit(p - 1) & 0xFC00) == 0xD800))) {
            // What stands before the first unit cannot be a high half: a block of its own is made for it.
            alignas(64) std::uint16_t before[HWY_MAX_BYTES / 2];
            if (p == begin) {
                before[0] = 0;
                std::memcpy(before + 1, p, (N - 1) * sizeof *p);
            } else {
                std::memcpy(before, p - 1, N * sizeof *p);
            }
            const auto isLow = hn::Eq(hn::And(v, half), hn::Set(d, 0xDC00));
            const auto followsHigh = hn::Eq(hn::And(hn::Load(d, before), half), hn::Set(d, 0xD800));
            if (!hn::AllFalse(d, hn::Xor(isLow, followsHigh))) {
                beyondAscii -= hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7F)));
                beyondAscii -= hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7FF)));
                break;
            }
            surrogates += hn::CountTrue(d, isSurrogate);
            extent.utf32 -= hn::CountTrue(d, isLow);
        }
        p += N;
        if (beyond == 0) {
            p += asciiBlocks(d, p, end);
        }
    }
#endif
    std::size_t taken = static_cast<std::size_t>(p - begin);
    extent.utf32 += taken;
    extent.utf8 = taken + beyondAscii - surrogates;
    if (taken != 0 && (loadUnit(p - 1) & 0xFC00) == 0xD800) {
        --p;
        extent.utf32 -= 1;
        extent.utf8 -= 2;
    }
#if KVT_HAS_VECTORS
    // What is left is a register with zeros behind it, if there is no surrogate in it.
    if (const auto left = static_cast<std::size_t>(end - p); left > 1 && left <= N) {
        alignas(64) std::uint16_t padded[HWY_MAX_BYTES / 2] = {};
        std::memcpy(padded, p, left * sizeof *p);
        const auto v = hn::Load(d, padded);
        if (hn::AllFalse(d, hn::Eq(hn::And(v, surrogateMask), hn::Set(d, 0xD800)))) {
            extent.utf32 += left;
            extent.utf8 += left + hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7F))) +
                           hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7FF)));
            p = end;
        }
    }
#endif
    while (p < end) {
        const std::uint32_t unit = loadUnit(p);
        if (isSurrogate(unit)) {
            if (isLowSurrogate(unit) || end - p < 2 || !isLowSurrogate(loadUnit(p + 1))) {
                break;
            }
            p += 2;
            extent.utf8 += 4;
        } else {
            p += 1;
            extent.utf8 += unit < 0x80 ? 1 : unit < 0x800 ? 2 : 3;
        }
        extent.utf32 += 1;
    }
    extent.taken = static_cast<std::size_t>(p - begin);
    extent.utf16 = extent.taken;
    return extent;
}

Extent measureUtf32(const char* text, std::size_t units) {
    const auto* const begin = reinterpret_cast<const std::uint32_t*>(text);
    const std::uint32_t* const end = begin + units;
    const std::uint32_t* p = begin;
    std::size_t longer2 = 0;
    std::size_t longer3 = 0;
    std::size_t longer4 = 0;
#if KVT_HAS_VECTORS
    const Units32 d;
    const std::size_t N = hn::Lanes(d);
    while (static_cast<std::size_t>(end - p) >= N) {
        const auto v = hn::LoadU(d, p);
        const auto isBad = hn::Or(hn::Gt(v, hn::Set(d, 0x10FFFF)),
                                  hn::Eq(hn::And(v, hn::Set(d, 0xFFFFF800)), hn::Set(d, 0xD800)));
        if (HWY_UNLIKELY(!hn::AllFalse(d, isBad))) {
            break;
        }
        longer2 += hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7F)));
        longer3 += hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0x7FF)));
        longer4 += hn::CountTrue(d, hn::Gt(v, hn::Set(d, 0xFFFF)));
        p += N;
    }
#endif
    for (; p < end; ++p) {
        const std::uint32_t c = loadUnit(p);
        if (c > lastCodePoint || isSurrogate(c)) {
            break;
        }
        longer2 += c > 0x7F ? 1 : 0;
        longer3 += c > 0x7FF ? 1 : 0;
        longer4 += c > 0xFFFF ? 1 : 0;
    }
    const auto taken = static_cast<std::size_t>(p - begin);
    return {taken, taken + longer2 + longer3 + longer4, taken + longer4, taken};
}

std::size_t asciiPrefix(const char* text, std::size_t bytes) {
    const auto* const begin = reinterpret_cast<const std::uint8_t*>(text);
    const std::uint8_t* const end = begin + bytes;
    const std::uint8_t* p = begin;
#if KVT_HAS_VECTORS
    p += asciiBlocks(Bytes(), p, end);
#endif
    for (std::uint64_t word = 0; static_cast<std::size_t>(end - p) >= sizeof word; p += sizeof word) {
        std::memcpy(&word, p, sizeof word);
        if ((word & 0x8080808080808080U) != 0) {
            break;
        }
    }
    while (p < end && *p < 0x80) {
        ++p;
    }
    return static_cast<std::size_t>(p - begin);
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail::vectors {

KVT_VECTOR_TABLE(measureUtf8);
KVT_VECTOR_TABLE(measureUtf16);
KVT_VECTOR_TABLE(measureUtf32);
KVT_VECTOR_TABLE(asciiPrefix);

Extent measureUtf8(const char* text, std::size_t bytes) {
    return KVT_VECTOR_CALL(measureUtf8)(text, bytes);
}
Extent measureUtf16(const char* text, std::size_t units) {
    return KVT_VECTOR_CALL(measureUtf16)(text, units);
}
Extent measureUtf32(const char* text, std::size_t units) {
    return KVT_VECTOR_CALL(measureUtf32)(text, units);
}
std::size_t asciiPrefix(const char* text, std::size_t bytes) {
    return KVT_VECTOR_CALL(asciiPrefix)(text, bytes);
}

} // namespace kvt::ex::detail::vectors
#endif // HWY_ONCE
