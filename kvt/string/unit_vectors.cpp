// Search by vector registers (see detail/unit_vectors.h): one source, compiled for each instruction set that Highway
// knows for this processor family, and chosen when it is first called.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/string/unit_vectors.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/string/detail/unit_vectors.h>

#include <kvt/platform/vector_targets.h>

#include <hwy/highway.h>

#include <bit>
#include <cstring>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

template <std::size_t size>
using NumberOf =
    std::conditional_t<size == 1, std::uint8_t, std::conditional_t<size == 2, std::uint16_t, std::uint32_t>>;

/// A text as numbers that registers hold, and the number of one unit.
template <typename Unit>
HWY_INLINE const NumberOf<sizeof(Unit)>* numbers(const Unit* text) {
    return reinterpret_cast<const NumberOf<sizeof(Unit)>*>(text);
}
template <typename Unit>
HWY_INLINE NumberOf<sizeof(Unit)> number(Unit unit) {
    return static_cast<NumberOf<sizeof(Unit)>>(unit);
}

template <typename Number>
HWY_INLINE bool areSame(const char* left, const char* right) {
    Number l;
    Number r;
    std::memcpy(&l, left, sizeof l);
    std::memcpy(&r, right, sizeof r);
    return l == r;
}

/// Whether `count` units, of which the first and the last are the same, are all so. Without a call for the short needles
/// of most searches, and for most places of the others.
template <typename T>
HWY_INLINE bool areSameBetween(const T* left, const T* right, std::size_t count) {
    const auto* const l = reinterpret_cast<const char*>(left);
    const auto* const r = reinterpret_cast<const char*>(right);
    const std::size_t bytes = count * sizeof(T);
    if (bytes > 16) {
        return areSame<std::uint64_t>(l, r) && std::memcmp(l + 8, r + 8, bytes - 8) == 0;
    }
    if (bytes >= 8) {
        return areSame<std::uint64_t>(l, r) && areSame<std::uint64_t>(l + (bytes - 8), r + (bytes - 8));
    }
    if (bytes >= 4) {
        return areSame<std::uint32_t>(l, r) && areSame<std::uint32_t>(l + (bytes - 4), r + (bytes - 4));
    }
    return count <= 2 || left[1] == right[1];
}

/// The needle, and how often its ends stood at places that were no match.
template <typename T>
struct Sought {
    const T* needle;
    std::size_t length;
    std::size_t inVain = 0;

    /// Whether the needle stands at a place where its first and last unit do.
    HWY_INLINE bool standsAt(const T* place) {
        if (areSameBetween(place, needle, length)) {
            return true;
        }
        ++inVain;
        return false;
    }
    /// Whether that was so often, over `distance` units, that it does not pay to go on.
    HWY_INLINE bool isHopeless(std::size_t distance) const {
        return sizeof(T) == 1 && inVain * 32 > distance + 256;
    }
};

#if HWY_TARGET != HWY_SCALAR
// At most 64 lanes, so that what is true of each fits a number.
template <typename T, std::size_t bytes>
using Register = hn::CappedTag<T, (bytes < 64 ? bytes : 64) / sizeof(T)>;

template <class D, class M>
HWY_INLINE std::uint64_t bitsOf(D d, M mask) {
    // A number of just the bytes that are stored, since one that is half old is slow to load.
    constexpr std::size_t lanes = hn::MaxLanes(D());
    std::conditional_t<(lanes > 32), std::uint64_t, NumberOf<(lanes > 16 ? 4 : lanes > 8 ? 2 : 1)>> bits = 0;
    hn::StoreMaskBits(d, mask, reinterpret_cast<std::uint8_t*>(&bits));
    return bits;
}

/// Searches by registers of so many bytes, of which one at least fits the places.
template <std::size_t bytes, typename T>
HWY_INLINE Place findInRegisters(const T* text, std::size_t places, Sought<T> sought) {
    const Register<T, bytes> d;
    const std::size_t N = hn::Lanes(d);
    const auto front = hn::Set(d, sought.needle[0]);
    const auto back = hn::Set(d, sought.needle[sought.length - 1]);
    const T* const ends = text + (sought.length - 1);
    for (std::size_t at = 0; at < places; at += N) {
        // The last register takes places that were looked at before.
        at = at <= places - N ? at : places - N;
        const auto standing =
            hn::And(hn::Eq(hn::LoadU(d, text + at), front), hn::Eq(hn::LoadU(d, ends + at), back));
        if (HWY_LIKELY(hn::AllFalse(d, standing))) {
            continue;
        }
        for (std::uint64_t bits = bitsOf(d, standing); bits != 0; bits &= bits - 1) {
            const std::size_t candidate = at + static_cast<std::size_t>(std::countr_zero(bits));
            if (sought.standsAt(text + candidate)) {
                return {candidate, true};
            }
            if (sought.isHopeless(candidate)) {
                return {candidate, false};
            }
        }
    }
    return {places, true};
}
#endif

template <typename T>
HWY_INLINE Place findOneByOne(const T* text, std::size_t places, Sought<T> sought) {
    for (std::size_t at = 0; at < places; ++at) {
        if (text[at] == sought.needle[0] &&
            text[at + sought.length - 1] == sought.needle[sought.length - 1]) {
            if (sought.standsAt(text + at)) {
                return {at, true};
            }
            if (sought.isHopeless(at)) {
                return {at, false};
            }
        }
    }
    return {places, true};
}

template <typename Unit>
HWY_INLINE Place findUnits(const Unit* units, std::size_t places, const Unit* needle, std::size_t length) {
    using T = NumberOf<sizeof(Unit)>;
    const T* const text = numbers(units);
    const Sought<T> sought{numbers(needle), length};
#if HWY_TARGET != HWY_SCALAR
    const std::size_t bytes = places * sizeof(T);
    if (bytes >= 64) {
        return findInRegisters<64>(text, places, sought);
    }
    if (bytes >= 32) {
        return findInRegisters<32>(text, places, sought);
    }
    if (bytes >= 16) {
        return findInRegisters<16>(text, places, sought);
    }
    if (bytes >= 8) {
        return findInRegisters<8>(text, places, sought);
    }
#endif
    return findOneByOne(text, places, sought);
}

template <typename Unit>
HWY_INLINE std::size_t countPartsOf(const Unit* units, std::size_t size, Unit delimiter, bool withEmpty) {
    using T = NumberOf<sizeof(Unit)>;
    const T* const text = numbers(units);
    std::size_t at = 0;
    std::size_t delimiters = 0;
    std::size_t beginnings = 0;     // units that are not delimiters and stand behind one
    std::uint64_t wasDelimiter = 1; // the beginning is as good as one
#if HWY_TARGET != HWY_SCALAR
    const Register<T, 64> d;
    const std::size_t N = hn::Lanes(d);
    const auto wanted = hn::Set(d, number(delimiter));
    for (; size - at >= N; at += N) {
        const std::uint64_t bits = bitsOf(d, hn::Eq(hn::LoadU(d, text + at), wanted));
        delimiters += static_cast<std::size_t>(std::popcount(bits));
        const std::uint64_t all = ~std::uint64_t{0} >> (64 - N);
        beginnings += static_cast<std::size_t>(std::popcount(~bits & (bits << 1 | wasDelimiter) & all));
        wasDelimiter = bits >> (N - 1);
    }
#endif
    for (; at < size; ++at) {
        const bool isDelimiter = text[at] == number(delimiter);
        delimiters += isDelimiter ? 1 : 0;
        beginnings += !isDelimiter && wasDelimiter != 0 ? 1 : 0;
        wasDelimiter = isDelimiter ? 1 : 0;
    }
    return withEmpty ? delimiters + 1 : beginnings;
}

template <typename Unit>
HWY_INLINE std::size_t placesOfUnit(const Unit* units, std::uint32_t size, Unit unit, std::uint32_t* places) {
    using T = NumberOf<sizeof(Unit)>;
    const T* const text = numbers(units);
    std::uint32_t at = 0;
    std::uint32_t* next = places;
#if HWY_TARGET != HWY_SCALAR
    const Register<T, 64> d;
    const auto N = static_cast<std::uint32_t>(hn::Lanes(d));
    const auto wanted = hn::Set(d, number(unit));
    for (; size - at >= N; at += N) {
        for (std::uint64_t bits = bitsOf(d, hn::Eq(hn::LoadU(d, text + at), wanted)); bits != 0;
             bits &= bits - 1) {
            *next++ = at + static_cast<std::uint32_t>(std::countr_zero(bits));
        }
    }
#endif
    for (; at < size; ++at) {
        if (text[at] == number(unit)) {
            *next++ = at;
        }
    }
    return static_cast<std::size_t>(next - places);
}

#define KVT_FOR_WIDTH(bits, Unit)                                                                            \
    Place find##bits(const Unit* text, std::size_t places, const Unit* needle, std::size_t length) {         \
        return findUnits(text, places, needle, length);                                                      \
    }                                                                                                        \
    std::size_t parts##bits(const Unit* text, std::size_t size, Unit delimiter, bool withEmpty) {            \
        return countPartsOf(text, size, delimiter, withEmpty);                                               \
    }                                                                                                        \
    std::size_t places##bits(const Unit* text, std::uint32_t size, Unit unit, std::uint32_t* places) {       \
        return placesOfUnit(text, size, unit, places);                                                       \
    }
KVT_FOR_WIDTH(8, char)
KVT_FOR_WIDTH(16, char16_t)
KVT_FOR_WIDTH(32, char32_t)
#undef KVT_FOR_WIDTH

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail::vectors {

#define KVT_FOR_WIDTH(bits, Unit)                                                                            \
    KVT_VECTOR_TABLE(find##bits);                                                                            \
    KVT_VECTOR_TABLE(parts##bits);                                                                           \
    KVT_VECTOR_TABLE(places##bits);                                                                          \
    Place findSequence(const Unit* text, std::size_t places, const Unit* needle, std::size_t length) {       \
        return KVT_VECTOR_CALL(find##bits)(text, places, needle, length);                                    \
    }                                                                                                        \
    std::size_t countParts(const Unit* text, std::size_t size, Unit delimiter, bool withEmpty) {             \
        return KVT_VECTOR_CALL(parts##bits)(text, size, delimiter, withEmpty);                               \
    }                                                                                                        \
    std::size_t placesOf(const Unit* text, std::uint32_t size, Unit unit, std::uint32_t* places) {           \
        return KVT_VECTOR_CALL(places##bits)(text, size, unit, places);                                      \
    }
KVT_FOR_WIDTH(8, char)
KVT_FOR_WIDTH(16, char16_t)
KVT_FOR_WIDTH(32, char32_t)
#undef KVT_FOR_WIDTH

} // namespace kvt::ex::detail::vectors
#endif // HWY_ONCE
