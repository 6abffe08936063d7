// Which vector code may run: the host's instruction-set level, limited by the processor.
#pragma once

#include <cstdint>

namespace kyv {

// In rising order; each includes those before it.
enum class InstructionSet { Scalar, Sse2, Ssse3, Avx2 };

// The best set that this processor and operating system run.
InstructionSet ProcessorInstructionSet();

// The set for a host level: below 3 scalar, 3 SSE2, from 4 SSSE3, and AVX2 where the processor
// has it. The level is a ceiling, so one set too high cannot reach a missing instruction.
InstructionSet Resolve(int32_t cpuLevel);

} // namespace kyv
