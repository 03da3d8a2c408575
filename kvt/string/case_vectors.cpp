// Case mapping of UTF-8 by vector registers (see detail/case_table.h): one source, compiled for each instruction set
// that Highway knows for this processor family, and chosen when it is first called.
//
// ASCII, Latin-1 and what does not change go by whole registers, other characters one by one by the table. Nothing is
// checked for being well-formed: a lead byte with its trail bytes behind it is a character wherever it stands, and
// bytes that are none are left alone, as ICU leaves them.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/string/case_vectors.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/encoding/detail/unicode_characters-inl.h>
#include <kvt/string/detail/case_table.h>

#include <kvt/platform/vector_targets.h>

#include <hwy/highway.h>

#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {

constexpr std::uint8_t latinLead = 0xC3;
constexpr std::uint8_t sharpTrail = 0x9F; // ß
constexpr std::uint8_t lastTrail = 0xBF;  // ÿ

/// What of a mapping concerns ASCII and Latin-1.
template <CaseMapping mapping>
struct Letters {
    static constexpr bool isUpper = mapping == CaseMapping::upper;
    static constexpr std::uint8_t first = isUpper ? 'a' : 'A';
    static constexpr std::uint8_t latinFirst = isUpper ? 0xA0 : 0x80; // 31 trail bytes from there on
    static constexpr std::uint8_t latinHole = isUpper ? 0xB7 : 0x97;  // ÷, ×
    static constexpr bool hasSharp = mapping != CaseMapping::lower;
    static constexpr std::uint8_t sharp = isUpper ? 'S' : 's'; // twice, in place of ß

    static HWY_INLINE std::uint8_t ascii(std::uint8_t byte) {
        return static_cast<std::uint8_t>(byte - first) < 26 ? byte ^ 0x20 : byte;
    }
};

HWY_INLINE bool beginsChanging(const CaseTable& table, std::uint8_t byte) {
    return (table.leadsLow[byte & 0xFU] & table.leadsHigh[byte >> 4U]) != 0;
}

/// Text and result, with the next byte of each.
struct CaseState {
    const std::uint8_t* p;
    const std::uint8_t* end;
    std::uint8_t* q;
    std::uint8_t* outEnd;
};

enum class Step { done, noRoom, leftToIcu };

/// Copies bytes that do not change.
HWY_INLINE Step copyBytes(CaseState& s, std::size_t size) {
    if (static_cast<std::size_t>(s.outEnd - s.q) < size) {
        return Step::noRoom;
    }
    for (std::size_t i = 0; i < size; ++i) {
        s.q[i] = s.p[i];
    }
    s.p += size;
    s.q += size;
    return Step::done;
}

template <CaseMapping mapping>
HWY_INLINE Step mapOne(const CaseTable& table, CaseState& s) {
    const std::size_t length = wellFormedLength(s.p, s.end);
    if (length <= 1) { // ASCII, or bytes that are not a character
        const Step step = copyBytes(s, 1);
        if (step == Step::done) {
            s.q[-1] = Letters<mapping>::ascii(s.q[-1]);
        }
        return step;
    }
    const std::uint8_t* next = s.p;
    const std::uint32_t c = takeUtf8(next);
    const std::size_t block = c / 64 < table.blocks.size() ? table.blocks[c / 64] : 0;
    if (block == 0) {
        return copyBytes(s, length);
    }
    const std::uint64_t entry = table.characters[block * 64 + c % 64];
    const auto size = static_cast<std::size_t>(entry >> 56U);
    if (size == 0) {
        return Step::leftToIcu;
    }
    const auto room = static_cast<std::size_t>(s.outEnd - s.q);
    if (room >= sizeof entry) {
        std::memcpy(s.q, &entry, sizeof entry);
    } else if (room >= size) {
        std::memcpy(s.q, &entry, size);
    } else {
        return Step::noRoom;
    }
    s.p = next;
    s.q += size;
    return Step::done;
}

#if KVT_HAS_VECTORS
/// Maps whole registers, of which one byte can be read in front, up to the first character for the table; returns
/// whether it stands there.
template <CaseMapping mapping>
HWY_INLINE bool mapRegisters(const CaseTable& table, CaseState& s) {
    using L = Letters<mapping>;
    const Bytes d;
    const std::size_t N = hn::Lanes(d);
    const auto leadsLow = hn::LoadDup128(d, table.leadsLow.data());
    const auto leadsHigh = hn::LoadDup128(d, table.leadsHigh.data());
    const auto change = hn::Set(d, 0x20);
    const auto isIn = [&](auto v, std::uint8_t first, std::uint8_t count)
                          HWY_ATTR { return hn::Lt(hn::Sub(v, hn::Set(d, first)), hn::Set(d, count)); };
    const std::uint8_t* const begin = s.p;
    while (static_cast<std::size_t>(s.end - s.p) > N && static_cast<std::size_t>(s.outEnd - s.q) >= N) {
        const auto v = hn::LoadU(d, s.p);
        auto mapped = hn::Xor(v, hn::IfThenElseZero(isIn(v, L::first, 26), change));
        if (hn::AllTrue(d, hn::Lt(v, hn::Set(d, 0x80)))) {
            hn::StoreU(mapped, d, s.q);
            s.p += N;
            s.q += N;
            continue;
        }
        const auto latin = hn::Set(d, latinLead);
        const auto isBehindLatin = hn::Eq(hn::LoadU(d, s.p - 1), latin);
        const auto changes = hn::And(
            isBehindLatin, hn::AndNot(hn::Eq(v, hn::Set(d, L::latinHole)), isIn(v, L::latinFirst, 31)));
        mapped = hn::Xor(mapped, hn::IfThenElseZero(changes, change));
        auto isForTable = hn::Ne(hn::And(hn::TableLookupBytes(leadsLow, hn::And(v, hn::Set(d, 0x0F))),
                                         hn::TableLookupBytes(leadsHigh, hn::ShiftRight<4>(v))),
                                 hn::Zero(d));
        if constexpr (L::hasSharp) {
            const auto next = hn::LoadU(d, s.p + 1);
            const auto isSharp = hn::Or(hn::And(hn::Eq(v, latin), hn::Eq(next, hn::Set(d, sharpTrail))),
                                        hn::And(isBehindLatin, hn::Eq(v, hn::Set(d, sharpTrail))));
            mapped = hn::IfThenElse(isSharp, hn::Set(d, L::sharp), mapped);
            if constexpr (L::isUpper) {
                isForTable =
                    hn::Or(isForTable, hn::And(hn::Eq(v, latin), hn::Eq(next, hn::Set(d, lastTrail))));
            }
        }
        hn::StoreU(mapped, d, s.q);
        const std::intptr_t place = hn::FindFirstTrue(d, isForTable);
        if (place >= 0) {
            s.p += place;
            s.q += place;
            return true;
        }
        s.p += N;
        s.q += N;
    }
    if (s.p != begin && s.p[-1] == latinLead) { // the rest is to begin with a character
        --s.p;
        --s.q;
    }
    return false;
}
#endif

template <CaseMapping mapping>
HWY_INLINE Step mapText(const CaseTable& table, CaseState& s, bool isAtBeginning) {
    Step step = Step::done;
#if KVT_HAS_VECTORS
    if (isAtBeginning && s.p < s.end) {
        step = mapOne<mapping>(table, s);
    }
    while (step == Step::done && mapRegisters<mapping>(table, s)) {
        // A single blank between words of such characters is not worth a register.
        do {
            step = mapOne<mapping>(table, s);
        } while (step == Step::done && s.end - s.p >= 2 &&
                 (beginsChanging(table, s.p[0]) || beginsChanging(table, s.p[1])));
    }
#else
    (void)isAtBeginning;
#endif
    while (step == Step::done && s.p < s.end) {
        step = mapOne<mapping>(table, s);
    }
    return step;
}

CaseProgress mapCaseBytes(const CaseTable& table, const char* text, std::size_t size, std::size_t from,
                          char* out, std::size_t room) {
    const auto* const begin = reinterpret_cast<const std::uint8_t*>(text);
    auto* const target = reinterpret_cast<std::uint8_t*>(out);
    CaseState s{begin + from, begin + size, target, target + room};
    Step step{};
    switch (table.mapping) {
    case CaseMapping::upper:
        step = mapText<CaseMapping::upper>(table, s, from == 0);
        break;
    case CaseMapping::lower:
        step = mapText<CaseMapping::lower>(table, s, from == 0);
        break;
    default:
        step = mapText<CaseMapping::folded>(table, s, from == 0);
        break;
    }
    return {static_cast<std::size_t>(s.p - begin), static_cast<std::size_t>(s.q - target),
            step == Step::leftToIcu};
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail::vectors {

KVT_VECTOR_TABLE(mapCaseBytes);

CaseProgress mapCase(const CaseTable& table, const char* text, std::size_t size, std::size_t from, char* out,
                     std::size_t room) {
    return KVT_VECTOR_CALL(mapCaseBytes)(table, text, size, from, out, room);
}

} // namespace kvt::ex::detail::vectors
#endif // HWY_ONCE
