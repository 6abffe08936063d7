// The forms of one pixel operation, indexed by instruction set.
#pragma once

#include "platform/CpuFeatures.h"

// Wraps the name of a vector form in a table, so that a build without vector files links.
#ifdef KYV_NO_VECTOR_KERNELS
#define KYV_VECTOR_FORM(name) nullptr
#else
#define KYV_VECTOR_FORM(name) name
#endif

namespace kyv {

// Function is a pointer to a row loop. The scalar form is the definition; every other form gives
// the same bytes. A form that is left out falls back to the next lower one.
template <class Function>
struct KernelTable {
    Function scalar;
    Function sse2 = nullptr;
    Function ssse3 = nullptr;
    Function avx2 = nullptr;

    // The form written for exactly this set, or null.
    constexpr Function Exact(InstructionSet set) const {
        switch (set) {
        case InstructionSet::Avx2:
            return avx2;
        case InstructionSet::Ssse3:
            return ssse3;
        case InstructionSet::Sse2:
            return sse2;
        default:
            return scalar;
        }
    }

    // The best form within the set.
    constexpr Function For(InstructionSet set) const {
        if (set >= InstructionSet::Avx2 && avx2) {
            return avx2;
        }
        if (set >= InstructionSet::Ssse3 && ssse3) {
            return ssse3;
        }
        if (set >= InstructionSet::Sse2 && sse2) {
            return sse2;
        }
        return scalar;
    }
};

} // namespace kyv
