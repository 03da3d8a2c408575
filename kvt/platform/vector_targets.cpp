// The C library knows what the processor has and what the system lets programs use of it; each target of Highway takes
// the instruction sets that it is compiled with (hwy/ops/set_macros-inl.h).
#include <kvt/platform/vector_targets.h>

#if HWY_ARCH_X86 && __has_include(<sys/platform/x86.h>)
#ifdef __clang__
#define _Bool bool // as the header of the C library calls it
#endif
#include <sys/platform/x86.h>
#endif

namespace kvt::platform {

namespace {

std::int64_t detectedTargets() noexcept {
#if HWY_ARCH_X86 && __has_include(<sys/platform/x86.h>)
    std::int64_t targets = HWY_STATIC_TARGET;
    if (!CPU_FEATURE_ACTIVE(SSSE3)) {
        return targets;
    }
    targets |= HWY_SSSE3;
    if (!CPU_FEATURE_ACTIVE(SSE4_1) || !CPU_FEATURE_ACTIVE(SSE4_2) || !CPU_FEATURE_ACTIVE(PCLMULQDQ) ||
        !CPU_FEATURE_ACTIVE(AES)) {
        return targets;
    }
    targets |= HWY_SSE4;
    if (!CPU_FEATURE_ACTIVE(AVX) || !CPU_FEATURE_ACTIVE(AVX2) || !CPU_FEATURE_ACTIVE(BMI1) ||
        !CPU_FEATURE_ACTIVE(BMI2) || !CPU_FEATURE_ACTIVE(FMA) || !CPU_FEATURE_ACTIVE(F16C) ||
        !CPU_FEATURE_ACTIVE(LZCNT)) {
        return targets;
    }
    targets |= HWY_AVX2;
    if (!CPU_FEATURE_ACTIVE(AVX512F) || !CPU_FEATURE_ACTIVE(AVX512VL) || !CPU_FEATURE_ACTIVE(AVX512DQ) ||
        !CPU_FEATURE_ACTIVE(AVX512BW) || !CPU_FEATURE_ACTIVE(AVX512CD)) {
        return targets;
    }
    targets |= HWY_AVX3;
    if (CPU_FEATURE_ACTIVE(VPCLMULQDQ) && CPU_FEATURE_ACTIVE(AVX512_VBMI) &&
        CPU_FEATURE_ACTIVE(AVX512_VBMI2) && CPU_FEATURE_ACTIVE(VAES) && CPU_FEATURE_ACTIVE(AVX512_VNNI) &&
        CPU_FEATURE_ACTIVE(AVX_VNNI) && CPU_FEATURE_ACTIVE(AVX512_BITALG) &&
        CPU_FEATURE_ACTIVE(AVX512_VPOPCNTDQ) && CPU_FEATURE_ACTIVE(GFNI)) {
        targets |= HWY_AVX3_DL;
    }
    return targets;
#else
    return HWY_STATIC_TARGET; // what the compiler takes every processor to have
#endif
}

} // namespace

constinit std::atomic<std::int64_t> knownTargets = 0;

std::int64_t detectProcessorTargets() noexcept {
    const std::int64_t targets = detectedTargets();
    knownTargets.store(targets, std::memory_order_relaxed);
    return targets;
}

void forceProcessorTargets(std::int64_t targets) noexcept {
    knownTargets.store(targets, std::memory_order_relaxed);
}

} // namespace kvt::platform
