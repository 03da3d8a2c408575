// Short texts from one Unicode form to another (see detail/unicode_vectors.h): one source, compiled for each instruction
// set that Highway knows for this processor family, and chosen when it is first called.
//
// What hardly counts in a long text is most of the time of a short one: the pass that measures it, and the ends that fill
// no register. Here a text is made whole registers, with zeros around it, and is checked and converted at once.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/encoding/unicode_short.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/encoding/detail/copy_short.h>
#include <kvt/encoding/detail/unicode_characters-inl.h>
#include <kvt/encoding/detail/unicode_from_utf8-inl.h>
#include <kvt/encoding/detail/unicode_to_utf8-inl.h>
#include <kvt/encoding/detail/unicode_vectors.h>
#include <kvt/encoding/detail/utf8_check-inl.h>

#include <kvt/platform/vector_targets.h>

#include <hwy/highway.h>

#include <algorithm>
#include <atomic>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {

#if KVT_HAS_VECTORS
/// A short text among zeros.
class Padded {
public:
    Padded(const char* text, std::size_t bytes) {
        const hn::CappedTag<std::uint8_t, 32> d;
        static_assert(sizeof bytes_ % hn::MaxLanes(d) == 0);
        for (std::size_t i = 0; i < sizeof bytes_; i += hn::Lanes(d)) {
            hn::Store(hn::Zero(d), d, bytes_ + i);
            // Without this the loop would become one instruction that stores a string, which takes long to begin.
            std::atomic_signal_fence(std::memory_order_seq_cst);
        }
        copyShort(text, bytes, bytes_ + before);
    }
    const std::uint8_t* begin() const { return bytes_ + before; }

private:
    static constexpr std::size_t before = 16;
    // Behind the text, what a register may read.
    alignas(64) std::uint8_t bytes_[before + shortText + HWY_MAX_BYTES + 16];
};

/// The next eight units, or as many as there are and zeros behind them.
HWY_INLINE hn::Vec<Eight16> loadUpToEight(const std::uint16_t* p, const std::uint16_t* end) {
    const Eight16 d;
    const auto left = static_cast<std::size_t>(end - p);
    if (left >= 8) {
        return hn::LoadU(d, p);
    }
#if HWY_TARGET <= HWY_AVX3
    return hn::MaskedLoad(hn::FirstN(d, left), d, p);
#else
    alignas(16) std::uint8_t padded[16] = {};
    copyShort(p, 2 * left, padded);
    return hn::BitCast(d, hn::Load(Sixteen8(), padded));
#endif
}
#endif

#if KVT_HAS_VECTORS && HWY_TARGET <= HWY_AVX3
constexpr std::size_t registerBytes = 64;

/// A text in one register, of which only the bytes are read that there are: to read what was just written in
/// other portions would wait for it.
class InRegister {
public:
    using V = hn::Vec<Bytes>;

    InRegister(const char* text, std::size_t bytes)
        : text_(reinterpret_cast<const std::uint8_t*>(text)), bits_(~std::uint64_t{0} >> (64 - bytes)) {}

    /// The bytes so many places before each, or behind; zeros where there are none.
    V before(int places) const { return load(text_ - places, bits_ << places); }
    V behind(int places) const { return load(text_ + places, bits_ >> places); }
    std::uint64_t bits() const { return bits_; }

private:
    static HWY_INLINE V load(const std::uint8_t* from, std::uint64_t bits) {
        const Bytes d;
        return hn::MaskedLoad(hn::LoadMaskBits(d, reinterpret_cast<const std::uint8_t*>(&bits)), d, from);
    }

    const std::uint8_t* text_;
    std::uint64_t bits_; // of the bytes that there are
};

template <Longest longest, typename Unit>
HWY_INLINE void putWhole(const InRegister& text, std::uint64_t mask, Unit*& q) {
    const Units16 d;
    const hn::Rebind<std::uint8_t, Units16> narrow;
    const auto b0 = text.before(0);
    const auto b1 = text.behind(1);
    const auto b2 = longest == Longest::two ? b1 : text.behind(2);
    const auto before = longest == Longest::four ? text.before(1) : b0;
    const auto lower = [&](InRegister::V v) { return hn::PromoteTo(d, hn::LowerHalf(narrow, v)); };
    const auto upper = [&](InRegister::V v) { return hn::PromoteTo(d, hn::UpperHalf(narrow, v)); };
    storeSome(d, unitsOf<longest>(d, lower(b0), lower(b1), lower(b2), lower(before)), mask, q);
    if (mask >> 32 != 0) {
        storeSome(d, unitsOf<longest>(d, upper(b0), upper(b1), upper(b2), upper(before)), mask >> 32, q);
    }
}

/// A text of up to a register. Returns `notWhole` too where the result would be UTF-32 beyond U+FFFF.
template <typename Unit>
HWY_INLINE std::size_t fromOneRegister(const char* text, std::size_t bytes, Unit* begin) {
    const Bytes d;
    const hn::RebindToSigned<Bytes> isSigned;
    const InRegister whole(text, bytes);
    const auto v = whole.before(0);
    const auto errors = Utf8Check::errors(d, v, whole.before(1), whole.before(2), whole.before(3));
    // Where zeros follow, an open character is one of the errors.
    const auto last = [=](std::size_t i) { return static_cast<std::uint8_t>(text[bytes - i]); };
    const bool isOpen = bytes == registerBytes && (last(1) >= 0xC0 || last(2) >= 0xE0 || last(3) >= 0xF0);
    if (isOpen || !hn::AllTrue(d, hn::Eq(errors, hn::Zero(d)))) {
        return notWhole;
    }
    const std::uint64_t begins =
        maskOf(isSigned, hn::Gt(hn::BitCast(isSigned, v), hn::Set(isSigned, -65))) & whole.bits();
    const std::uint64_t threes = maskOf(d, hn::Gt(v, hn::Set(d, 0xDF)));
    Unit* q = begin;
    if (threes == 0) {
        putWhole<Longest::two>(whole, begins, q);
    } else if (const std::uint64_t fours = maskOf(d, hn::Gt(v, hn::Set(d, 0xEF))); fours == 0) {
        putWhole<Longest::three>(whole, begins, q);
    } else if (sizeof(Unit) == 2) {
        putWhole<Longest::four>(whole, begins | fours << 1, q);
    } else {
        return notWhole;
    }
    return static_cast<std::size_t>(q - begin);
}

template <typename Unit>
HWY_INLINE std::size_t fromRegisters(const char* text, std::size_t bytes, Unit* begin) {
    static_assert(HWY_MAX_BYTES == registerBytes);
    Unit* q = begin;
    while (bytes != 0) {
        std::size_t length = std::min(bytes, registerBytes);
        // Up to a character, if this is text.
        for (int i = 0; i < 3 && length < bytes && isTrail(static_cast<std::uint8_t>(text[length])); ++i) {
            --length;
        }
        const std::size_t written = fromOneRegister(text, length, q);
        if (written == notWhole) {
            return notWhole;
        }
        q += written;
        text += length;
        bytes -= length;
    }
    return static_cast<std::size_t>(q - begin);
}
#endif

template <typename Unit>
HWY_INLINE std::size_t fromShortUtf8(const char* text, std::size_t bytes, char* out) {
    auto* const begin = reinterpret_cast<Unit*>(out);
    Unit* q = begin;
#if KVT_HAS_VECTORS && HWY_TARGET <= HWY_AVX3
    const std::size_t written = fromRegisters(text, bytes, begin);
    if (written != notWhole || sizeof(Unit) == 2) {
        return written;
    }
#endif
#if KVT_HAS_VECTORS
    const Padded padded(text, bytes);
    const std::uint8_t* p = padded.begin();
    const std::uint8_t* const end = p + bytes;
    const Bytes d;
    const std::size_t N = hn::Lanes(d);
    auto errors = hn::Zero(d);
    const std::uint8_t* stop = p;
    for (; stop < end; stop += N) {
        errors = hn::Or(errors, Utf8Check::errors(d, stop, hn::LoadU(d, stop)));
    }
    const bool isOpen = end[-1] >= 0xC0 || end[-2] >= 0xE0 || end[-3] >= 0xF0;
    if (isOpen || !hn::AllTrue(d, hn::Eq(errors, hn::Zero(d)))) {
        return notWhole;
    }
    // The byte before the first one is a zero, and nothing that it had to be told apart from.
    fromUtf8Blocks(Units16(), p - 1, p, stop + 2, q, begin + shortRoom);
    // A character beyond U+FFFF may have taken the place of a register.
    while (p < end) {
        if (isTrail(*p)) {
            ++p;
        } else {
            put(q, takeUtf8(p));
        }
    }
    return static_cast<std::size_t>(q - begin) - static_cast<std::size_t>(p - end);
#else
    const auto* p = reinterpret_cast<const std::uint8_t*>(text);
    const std::uint8_t* const end = p + bytes;
    while (p < end) {
        if (wellFormedLength(p, end) == 0) {
            return notWhole;
        }
        put(q, takeUtf8(p));
    }
    return static_cast<std::size_t>(q - begin);
#endif
}

std::size_t shortUtf8ToUtf16(const char* text, std::size_t bytes, char* out) {
    return fromShortUtf8<std::uint16_t>(text, bytes, out);
}
std::size_t shortUtf8ToUtf32(const char* text, std::size_t bytes, char* out) {
    return fromShortUtf8<std::uint32_t>(text, bytes, out);
}

std::size_t shortUtf16ToUtf8(const char* text, std::size_t units, char* out) {
    auto* const begin = reinterpret_cast<std::uint8_t*>(out);
    std::uint8_t* q = begin;
#if KVT_HAS_VECTORS
    const Eight16 d;
    const auto* p = reinterpret_cast<const std::uint16_t*>(text);
    const std::uint16_t* const end = p + units;
    for (; p < end; p += 8) {
        const auto v = loadUpToEight(p, end);
        if (hn::AllFalse(d, hn::Gt(v, hn::Set(d, 0x7FF)))) {
            putEightTwos(v, q);
        } else if (hn::AllFalse(d, hn::Eq(hn::And(v, hn::Set(d, 0xF800)), hn::Set(d, 0xD800)))) {
            putEightThrees(v, q);
        } else {
            return notWhole;
        }
    }
    return static_cast<std::size_t>(q - begin) - static_cast<std::size_t>(p - end);
#else
    const auto* p = reinterpret_cast<const std::uint16_t*>(text);
    for (std::size_t i = 0; i < units; ++i) {
        const std::uint32_t unit = loadUnit(p + i);
        if (isSurrogate(unit)) {
            return notWhole;
        }
        putUtf8(q, unit);
    }
    return static_cast<std::size_t>(q - begin);
#endif
}

std::size_t shortUtf16ToUtf32(const char* text, std::size_t units, char* out) {
    const auto* p = reinterpret_cast<const std::uint16_t*>(text);
    const std::uint16_t* const end = p + units;
    auto* q = reinterpret_cast<std::uint32_t*>(out);
#if KVT_HAS_VECTORS
    const Eight16 d;
    for (; end - p >= 8; p += 8, q += 8) {
        const auto v = hn::LoadU(d, p);
        if (!hn::AllFalse(d, hn::Eq(hn::And(v, hn::Set(d, 0xF800)), hn::Set(d, 0xD800)))) {
            return notWhole;
        }
        storeUnits(d, v, q);
    }
#endif
    for (; p < end; ++p) {
        const std::uint32_t unit = loadUnit(p);
        if (isSurrogate(unit)) {
            return notWhole;
        }
        storeUnit(q++, unit);
    }
    return units;
}

std::size_t shortUtf32ToUtf16(const char* text, std::size_t units, char* out) {
    const auto* p = reinterpret_cast<const std::uint32_t*>(text);
    const std::uint32_t* const end = p + units;
    auto* q = reinterpret_cast<std::uint16_t*>(out);
#if KVT_HAS_VECTORS
    const hn::FixedTag<std::uint32_t, 4> d;
    const hn::FixedTag<std::int32_t, 4> isSigned;
    const hn::FixedTag<std::uint16_t, 4> narrow;
    for (; end - p >= 4; p += 4, q += 4) {
        const auto v = hn::LoadU(d, p);
        const auto isBad = hn::Or(hn::Gt(v, hn::Set(d, 0xFFFF)),
                                  hn::Eq(hn::And(v, hn::Set(d, 0xFFFFF800)), hn::Set(d, 0xD800)));
        if (!hn::AllFalse(d, isBad)) {
            return notWhole;
        }
        hn::StoreU(hn::DemoteTo(narrow, hn::BitCast(isSigned, v)), narrow, q);
    }
#endif
    for (; p < end; ++p) {
        const std::uint32_t c = loadUnit(p);
        if (c >= firstSupplementary || isSurrogate(c)) {
            return notWhole;
        }
        storeUnit(q++, static_cast<std::uint16_t>(c));
    }
    return units;
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail::vectors {

KVT_VECTOR_TABLE(shortUtf8ToUtf16);
KVT_VECTOR_TABLE(shortUtf8ToUtf32);
KVT_VECTOR_TABLE(shortUtf16ToUtf8);
KVT_VECTOR_TABLE(shortUtf16ToUtf32);
KVT_VECTOR_TABLE(shortUtf32ToUtf16);

std::size_t shortUtf8ToUtf16(const char* text, std::size_t bytes, char* out) {
    return KVT_VECTOR_CALL(shortUtf8ToUtf16)(text, bytes, out);
}
std::size_t shortUtf8ToUtf32(const char* text, std::size_t bytes, char* out) {
    return KVT_VECTOR_CALL(shortUtf8ToUtf32)(text, bytes, out);
}
std::size_t shortUtf16ToUtf8(const char* text, std::size_t units, char* out) {
    return KVT_VECTOR_CALL(shortUtf16ToUtf8)(text, units, out);
}
std::size_t shortUtf16ToUtf32(const char* text, std::size_t units, char* out) {
    return KVT_VECTOR_CALL(shortUtf16ToUtf32)(text, units, out);
}
std::size_t shortUtf32ToUtf16(const char* text, std::size_t units, char* out) {
    return KVT_VECTOR_CALL(shortUtf32ToUtf16)(text, units, out);
}

} // namespace kvt::ex::detail::vectors
#endif // HWY_ONCE
