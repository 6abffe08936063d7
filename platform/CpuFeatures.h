// Which vector code may run: the host's instruction-set level, limited by the processor.
#pragma once

#include <cstdint>

namespace kyv {

// In rising order; each of one architecture includes those before it. Avx512 means its foundation
// together with bytes and words, doublewords and quadwords, and vector lengths (f, bw, dq, vl).
// Neon is all that 64-bit ARM has here.
enum class InstructionSet { Scalar, Sse2, Ssse3, Avx2, Avx512, Neon };

// What a processor has and its operating system keeps across a change of threads. SSE2 is part of
// x86-64.
struct ProcessorFeatures {
    bool ssse3 = false;
    bool avx2 = false;
    bool avx512f = false;
    bool avx512bw = false;
    bool avx512dq = false;
    bool avx512vl = false;
    bool neon = false;
};

// Of this processor, read once.
const ProcessorFeatures& GetProcessorFeatures();

// The best set that a processor runs; without an argument, this one.
InstructionSet ProcessorInstructionSet(const ProcessorFeatures& features);
InstructionSet ProcessorInstructionSet();

// The set for a host level on a processor: below 3 scalar, 3 SSE2 (on ARM NEON), from 4 the best
// that it has. The level is a ceiling, so one set too high cannot reach a missing instruction.
InstructionSet Resolve(int32_t cpuLevel, const ProcessorFeatures& features);
InstructionSet Resolve(int32_t cpuLevel);

// A host's level and the set that it comes to. A callback resolves its level once, with the frame's
// geometry; from there it goes to the images, and from those to all that is made from them.
struct ResolvedLevel {
    int32_t level;
    InstructionSet set;
};

// A host may put this option, for the picture-in-picture's map, into the upper half of a level. It
// is no part of what is resolved.
inline constexpr int32_t kWideMapOption = 0x4B590000;

constexpr bool HasWideMapOption(int32_t cpuLevel) {
    return (cpuLevel & ~0xFFFF) == kWideMapOption;
}

inline ResolvedLevel ResolveLevel(int32_t cpuLevel) {
    const int32_t level = HasWideMapOption(cpuLevel) ? cpuLevel & 0xFFFF : cpuLevel;
    return {level, Resolve(level)};
}

} // namespace kyv
