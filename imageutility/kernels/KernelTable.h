// The forms of one pixel operation, indexed by instruction set.
#pragma once

#include <type_traits>

#include "platform/CpuFeatures.h"

// KYV_FORMS(Row, X) declares all forms of an operation X from its type, a pointer to a function:
// X_scalar, and X in the namespace of every instruction set that this build has. KYV_TABLE(X) names
// them in the operation's table. A new set of an architecture is a word here for all operations.
#if defined(KYV_NO_VECTOR_KERNELS)
#define KYV_FORMS(Row, name) std::remove_pointer_t<Row> name##_scalar;
#define KYV_TABLE(name) .scalar = name##_scalar
#elif defined(__x86_64__)
#define KYV_FORMS(Row, name)                                                                       \
    std::remove_pointer_t<Row> name##_scalar;                                                      \
    namespace sse2 {                                                                               \
    std::remove_pointer_t<Row> name;                                                               \
    }                                                                                              \
    namespace ssse3 {                                                                              \
    std::remove_pointer_t<Row> name;                                                               \
    }                                                                                              \
    namespace avx2 {                                                                               \
    std::remove_pointer_t<Row> name;                                                               \
    }                                                                                              \
    namespace avx512 {                                                                             \
    std::remove_pointer_t<Row> name;                                                               \
    }
#define KYV_TABLE(name)                                                                            \
    .scalar = name##_scalar, .sse2 = sse2::name, .ssse3 = ssse3::name, .avx2 = avx2::name,         \
    .avx512 = avx512::name
#elif defined(__aarch64__)
#define KYV_FORMS(Row, name)                                                                       \
    std::remove_pointer_t<Row> name##_scalar;                                                      \
    namespace neon {                                                                               \
    std::remove_pointer_t<Row> name;                                                               \
    }
#define KYV_TABLE(name) .scalar = name##_scalar, .neon = neon::name
#endif

namespace kyv {

// One bit a set, for KernelTable::passedOver.
constexpr uint32_t SetBit(InstructionSet set) {
    return 1U << static_cast<int>(set);
}

inline constexpr uint32_t kNoneIsPassedOver = 0;

// Function is a pointer to a row loop. The scalar form is the definition; every other form gives
// the same bytes. A form that is left out or passed over falls back to the next lower one.
template <class Function>
struct KernelTable {
    Function scalar;
    Function sse2 = nullptr;
    Function ssse3 = nullptr;
    Function avx2 = nullptr;
    Function avx512 = nullptr;
    Function neon = nullptr;
    // Sets whose form exists, is tested and timed, but serves no effect better than the next lower
    // one: SetBit of each. Twice the width of AVX2 gains little on pixels that come from memory,
    // so a table for which it does gain, in a whole effect, says so with kNoneIsPassedOver.
    uint32_t passedOver = SetBit(InstructionSet::Avx512);

    // The form written for exactly this set, or null.
    constexpr Function Exact(InstructionSet set) const {
        switch (set) {
        case InstructionSet::Scalar:
            return scalar;
        case InstructionSet::Sse2:
            return sse2;
        case InstructionSet::Ssse3:
            return ssse3;
        case InstructionSet::Avx2:
            return avx2;
        case InstructionSet::Avx512:
            return avx512;
        case InstructionSet::Neon:
            return neon;
        }
        return nullptr;
    }

    // The set whose form serves best within the given one.
    constexpr InstructionSet Best(InstructionSet set) const {
        for (int each = static_cast<int>(set); each > 0; --each) {
            const auto candidate = static_cast<InstructionSet>(each);
            if (Exact(candidate) && (passedOver & SetBit(candidate)) == 0) {
                return candidate;
            }
        }
        return InstructionSet::Scalar;
    }

    // The best form within the set.
    constexpr Function For(InstructionSet set) const { return Exact(Best(set)); }
};

} // namespace kyv
