// The probe of one instruction set.
#include "imageutility/kernels/Vector.h"
#include "tests/support/SetProbe.h"

namespace kyv::KYV_VECTOR_SET {

SetProbeResult SetProbe() {
#if defined(__AVX512BW__) && defined(__AVX512DQ__) && defined(__AVX512VL__)
    constexpr InstructionSet kSet = InstructionSet::Avx512;
#elif defined(__AVX2__)
    constexpr InstructionSet kSet = InstructionSet::Avx2;
#elif defined(__SSSE3__)
    constexpr InstructionSet kSet = InstructionSet::Ssse3;
#elif defined(__ARM_NEON)
    constexpr InstructionSet kSet = InstructionSet::Neon;
#else
    constexpr InstructionSet kSet = InstructionSet::Sse2;
#endif
    return {kSet, kBytes};
}

} // namespace kyv::KYV_VECTOR_SET
