// The scan for a prefix (see detail/prefix_scan.h): one source, compiled for each instruction set that Highway knows
// for this processor family, and chosen when it is first called.
//
// A set of bytes is told by two look-ups, by the upper and by the lower half of a byte. Each of up to eight different
// rows of the set has a bit; the upper half gives the bit of its row, the lower one the bits of all rows that it is in.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kvt/regex/prefix_scan.cpp"
#include <hwy/foreach_target.h> // must come before highway.h

#include <kvt/platform/vector_targets.h>
#include <kvt/regex/detail/prefix_scan.h>

#include <hwy/highway.h>

#include <algorithm>
#include <bit>
#include <functional>
#include <numeric>
#include <string_view>
#include <utility>

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

HWY_INLINE bool saysYes(const PrefixScan::Probe& probe, const std::uint8_t* place) {
    const std::uint8_t byte = place[probe.offset];
    return (probe.low[byte & 0xFU] & probe.high[byte >> 4U]) != 0;
}

#if HWY_TARGET != HWY_SCALAR
/// Asks by registers of so many bytes, of which one at least fits the places.
template <bool areBytes, std::size_t bytes>
HWY_INLINE std::size_t findByRegisters(const std::array<PrefixScan::Probe, 3>& probes,
                                       const std::uint8_t* text, std::size_t places) {
    const hn::CappedTag<std::uint8_t, bytes> d;
    const std::size_t N = hn::Lanes(d);
    const auto byte0 = hn::Set(d, probes[0].byte);
    const auto byte1 = hn::Set(d, probes[1].byte);
    const auto low0 = hn::LoadDup128(d, probes[0].low.data());
    const auto low1 = hn::LoadDup128(d, probes[1].low.data());
    const auto low2 = hn::LoadDup128(d, probes[2].low.data());
    const auto high0 = hn::LoadDup128(d, probes[0].high.data());
    const auto high1 = hn::LoadDup128(d, probes[1].high.data());
    const auto high2 = hn::LoadDup128(d, probes[2].high.data());
    const auto half = hn::Set(d, 0x0F);
    const auto ask = [&](auto low, auto high, const std::uint8_t* place) HWY_ATTR {
        const auto v = hn::LoadU(d, place);
        return hn::Ne(hn::And(hn::TableLookupBytes(low, hn::And(v, half)),
                              hn::TableLookupBytes(high, hn::ShiftRight<4>(v))),
                      hn::Zero(d));
    };
    for (std::size_t at = 0; at < places; at += N) {
        // The last register takes places that were asked before.
        at = at <= places - N ? at : places - N;
        const std::uint8_t* const begin = text + at;
        auto yes = areBytes ? hn::And(hn::Eq(hn::LoadU(d, begin + probes[0].offset), byte0),
                                      hn::Eq(hn::LoadU(d, begin + probes[1].offset), byte1))
                            : ask(low0, high0, begin + probes[0].offset);
        if (hn::AllFalse(d, yes)) {
            continue;
        }
        if (!areBytes) {
            yes = hn::And(yes, ask(low1, high1, begin + probes[1].offset));
        }
        yes = hn::And(yes, ask(low2, high2, begin + probes[2].offset));
        if (HWY_UNLIKELY(!hn::AllFalse(d, yes))) {
            return at + static_cast<std::size_t>(hn::FindFirstTrue(d, yes));
        }
    }
    return places;
}
#endif

template <bool areBytes>
HWY_INLINE std::size_t findThree(const std::array<PrefixScan::Probe, 3>& probes, const std::uint8_t* text,
                                 std::size_t places) {
#if HWY_TARGET != HWY_SCALAR
    if (places >= 64) {
        return findByRegisters<areBytes, 64>(probes, text, places);
    }
    if (places >= 32) {
        return findByRegisters<areBytes, 32>(probes, text, places);
    }
    if (places >= 16) {
        return findByRegisters<areBytes, 16>(probes, text, places);
    }
#endif
    std::size_t at = 0;
    while (at < places && !(saysYes(probes[0], text + at) && saysYes(probes[1], text + at) &&
                            saysYes(probes[2], text + at))) {
        ++at;
    }
    return at;
}

std::size_t findProbesIn(const PrefixScan::Probes& probes, const char* text, std::size_t places) {
    const auto* const begin = reinterpret_cast<const std::uint8_t*>(text);
    return probes.areBytes ? findThree<true>(probes.probes, begin, places)
                           : findThree<false>(probes.probes, begin, places);
}

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace kvt::ex::detail {
namespace vectors {

KVT_VECTOR_TABLE(findProbesIn);

std::size_t findProbes(const PrefixScan::Probes& probes, const char* text, std::size_t places) {
    return KVT_VECTOR_CALL(findProbesIn)(probes, text, places);
}

} // namespace vectors

std::size_t ByteSet::count() const {
    return std::accumulate(rows.begin(), rows.end(), std::size_t{0}, [](std::size_t sum, std::uint16_t row) {
        return sum + static_cast<std::size_t>(std::popcount(row));
    });
}

namespace {

/// How often a byte stands in texts, as a multiple of how often the rare ones do.
constexpr std::array<std::uint8_t, 256> weights = [] {
    std::array<std::uint8_t, 256> weight{};
    weight.fill(1);
    const auto set = [&](std::string_view bytes, std::uint8_t value) {
        for (const char byte : bytes) {
            weight[static_cast<unsigned char>(byte)] = value;
        }
    };
    set(".,-_/:\n", 2);
    set("0123456789", 3);
    set("abcdefghijklmnopqrstuvwxyz", 4);
    set(" etaoinsrhld", 8);
    return weight;
}();

PrefixScan::Probe probeOf(const ByteSet& set, std::size_t offset) {
    PrefixScan::Probe probe;
    probe.offset = offset;
    while (probe.byte < 255 && !set.contains(probe.byte)) {
        ++probe.byte;
    }
    std::array<std::uint16_t, 8> rows{}; // the last one takes all that are left over
    std::size_t used = 0;
    for (std::size_t high = 0; high < 16; ++high) {
        const std::uint16_t row = set.rows[high];
        if (row == 0) {
            continue;
        }
        std::size_t number = 0;
        while (number < used && number + 1 < rows.size() && rows[number] != row) {
            ++number;
        }
        used = std::max(used, number + 1);
        rows[number] |= row;
        probe.high[high] = static_cast<std::uint8_t>(1U << number);
    }
    for (std::size_t low = 0; low < 16; ++low) {
        for (std::size_t number = 0; number < used; ++number) {
            probe.low[low] |= static_cast<std::uint8_t>((rows[number] >> low & 1U) << number);
        }
    }
    return probe;
}

} // namespace

double ByteSet::frequency() const {
    constexpr unsigned ofAll = std::accumulate(weights.begin(), weights.end(), 0U);
    unsigned sum = 0;
    for (std::size_t upper = 0; upper < rows.size(); ++upper) {
        for (unsigned row = rows[upper]; row != 0; row &= row - 1) {
            sum += weights[16 * upper + static_cast<std::size_t>(std::countr_zero(row))];
        }
    }
    return static_cast<double>(sum) / ofAll;
}

PrefixScan::PrefixScan(std::vector<ByteSet> sets) : sets_(std::move(sets)) {
    if (sets_.empty()) {
        return;
    }
    // The rarest sets say most; among equal ones those that are far from each other. Those of one byte are asked first,
    // since that is done in one step.
    std::vector<std::size_t> places(sets_.size());
    std::iota(places.begin(), places.end(), std::size_t{0});
    std::swap(places.back(), places[places.size() > 1 ? 1 : 0]);
    std::vector<double> frequencies(sets_.size());
    std::transform(sets_.begin(), sets_.end(), frequencies.begin(), std::mem_fn(&ByteSet::frequency));
    std::stable_sort(places.begin(), places.end(),
                     [&](std::size_t a, std::size_t b) { return frequencies[a] < frequencies[b]; });
    const auto others = std::stable_partition(places.begin(), places.end(),
                                              [&](std::size_t place) { return sets_[place].count() == 1; });
    const auto bytes = static_cast<std::size_t>(others - places.begin());
    probes_.areBytes = bytes > 0;
    const std::size_t chosen[] = {0, probes_.areBytes ? std::min<std::size_t>(1, bytes - 1) : 1, 2};
    for (std::size_t i = 0; i < probes_.probes.size(); ++i) {
        const std::size_t place = places[std::min(chosen[i], places.size() - 1)];
        probes_.probes[i] = probeOf(sets_[place], place);
    }
}

bool PrefixScan::standsAt(const char* place) const {
    return std::all_of(sets_.begin(), sets_.end(), [&place](const ByteSet& set) {
        return set.contains(static_cast<unsigned char>(*place++));
    });
}

std::size_t PrefixScan::find(const char* text, std::size_t size, std::size_t from) const {
    if (size - from < sets_.size()) {
        return size;
    }
    for (const std::size_t end = size - sets_.size() + 1; from < end; ++from) {
        from += vectors::findProbes(probes_, text + from, end - from);
        if (from == end) {
            break;
        }
        if (standsAt(text + from)) {
            return from;
        }
    }
    return size;
}

} // namespace kvt::ex::detail
#endif // HWY_ONCE
