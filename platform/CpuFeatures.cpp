// Reads the processor's features once; the compiler's support library knows how on both systems.
#include "platform/CpuFeatures.h"

namespace kyv {
namespace {

ProcessorFeatures Detect() {
#ifdef __x86_64__
    __builtin_cpu_init();
    // The checks include the operating system's support for the wide registers.
    return {.ssse3 = __builtin_cpu_supports("ssse3") != 0,
            .avx2 = __builtin_cpu_supports("avx2") != 0,
            .avx512f = __builtin_cpu_supports("avx512f") != 0,
            .avx512bw = __builtin_cpu_supports("avx512bw") != 0,
            .avx512dq = __builtin_cpu_supports("avx512dq") != 0,
            .avx512vl = __builtin_cpu_supports("avx512vl") != 0};
#elif defined(__aarch64__)
    return {.neon = true}; // part of the architecture
#else
    return {};
#endif
}

} // namespace

const ProcessorFeatures& GetProcessorFeatures() {
    static const ProcessorFeatures detected = Detect();
    return detected;
}

InstructionSet ProcessorInstructionSet(const ProcessorFeatures& features) {
    if (features.neon) {
        return InstructionSet::Neon;
    }
    if (!features.ssse3) {
        return InstructionSet::Sse2;
    }
    if (!features.avx2) {
        return InstructionSet::Ssse3;
    }
    const bool avx512 =
        features.avx512f && features.avx512bw && features.avx512dq && features.avx512vl;
    return avx512 ? InstructionSet::Avx512 : InstructionSet::Avx2;
}

InstructionSet ProcessorInstructionSet() {
    static const InstructionSet best = ProcessorInstructionSet(GetProcessorFeatures());
    return best;
}

InstructionSet Resolve(int32_t cpuLevel, const ProcessorFeatures& features) {
    if (cpuLevel < 3) {
        return InstructionSet::Scalar;
    }
    return cpuLevel == 3 && !features.neon ? InstructionSet::Sse2
                                           : ProcessorInstructionSet(features);
}

InstructionSet Resolve(int32_t cpuLevel) {
    return Resolve(cpuLevel, GetProcessorFeatures());
}

} // namespace kyv
