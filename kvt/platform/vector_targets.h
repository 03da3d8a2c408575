// Which of the instruction sets that Highway compiles for is used: the best that the processor has.
//
// Highway's own choice stands in its shared library. That library measures the clock when it is loaded, which takes
// some 16 milliseconds of each program. Nothing else of it is needed here, so the choice is made here, too, and the
// library is not loaded.
//
// A source that is compiled for each of them (hwy/foreach_target.h) includes this header, and in its HWY_ONCE part:
//
//     KVT_VECTOR_TABLE(count);
//     std::size_t count(const char* text, std::size_t size) { return KVT_VECTOR_CALL(count)(text, size); }
#pragma once

#include <hwy/highway.h>

#include <atomic>
#include <bit>
#include <cstddef>
#include <cstdint>

namespace kvt::platform {

/// Finds out what the processor has.
std::int64_t detectProcessorTargets() noexcept;

/// 0 until it is known.
extern std::atomic<std::int64_t> knownTargets;

/// The targets that this processor can run, a bit for each as Highway numbers them. Short texts notice what this takes.
inline std::int64_t processorTargets() noexcept {
    const std::int64_t targets = knownTargets.load(std::memory_order_relaxed);
    return targets != 0 ? targets : detectProcessorTargets();
}

/// Takes `targets` for those of the processor, for tests; 0 ends that. Not while another thread converts or searches.
void forceProcessorTargets(std::int64_t targets) noexcept;

/// The place of the best target in a table, of those that were compiled; behind all others stands what every processor
/// runs.
inline std::size_t vectorTargetIndex(std::int64_t compiled) noexcept {
    constexpr int lowestBit = HWY_HIGHEST_TARGET_BIT + 1 - HWY_MAX_DYNAMIC_TARGETS;
    constexpr std::uint64_t inTable = (std::uint64_t{1} << HWY_MAX_DYNAMIC_TARGETS) - 1;
    const std::uint64_t usable =
        static_cast<std::uint64_t>(processorTargets() & compiled) >> lowestBit & inTable;
    return usable == 0 ? HWY_MAX_DYNAMIC_TARGETS : static_cast<std::size_t>(std::countr_zero(usable));
}

} // namespace kvt::platform

/// The forms of one function for all targets.
#define KVT_VECTOR_TABLE(name)                                                                               \
    constexpr decltype(&HWY_STATIC_DISPATCH(name)) name##Targets[] = {HWY_CHOOSE_TARGET_LIST(name),          \
                                                                      HWY_CHOOSE_FALLBACK(name)}

/// The form to call.
#define KVT_VECTOR_CALL(name) (*name##Targets[kvt::platform::vectorTargetIndex(HWY_TARGETS)])
