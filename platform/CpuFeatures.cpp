// Reads the processor's features once; the compiler's support library knows how on both targets.
#include "platform/CpuFeatures.h"

#include <algorithm>

namespace kyv {
namespace {

InstructionSet Detect() {
    __builtin_cpu_init();
    // The check for AVX2 includes the operating system's support for the wide registers.
    if (__builtin_cpu_supports("avx2")) {
        return InstructionSet::Avx2;
    }
    if (__builtin_cpu_supports("ssse3")) {
        return InstructionSet::Ssse3;
    }
    return InstructionSet::Sse2; // part of x86-64
}

InstructionSet Ceiling(int32_t cpuLevel) {
    if (cpuLevel < 3) {
        return InstructionSet::Scalar;
    }
    return cpuLevel == 3 ? InstructionSet::Sse2 : InstructionSet::Avx2;
}

} // namespace

InstructionSet ProcessorInstructionSet() {
    static const InstructionSet detected = Detect();
    return detected;
}

InstructionSet Resolve(int32_t cpuLevel) {
    return std::min(Ceiling(cpuLevel), ProcessorInstructionSet());
}

} // namespace kyv
