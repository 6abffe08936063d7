// How the processor computes: rounding, exceptions, denormal numbers. A host may have it set to
// anything, and the bytes of a picture must not depend on it.
#pragma once

#include <cfenv>
#include <cstdint>

namespace kyv {

// While this lives, its thread computes as every program does when it starts: to nearest, without
// traps, denormal numbers and all, string instructions running forward. Then the thread has its own
// settings back, and no exception flag shows what was computed.
class CFloatEnvironment {
public:
#if defined(__x86_64__)
    CFloatEnvironment()
        : m_nControl(__builtin_ia32_stmxcsr()), m_nFlags(__builtin_ia32_readeflags_u64()) {
        if (m_nFlags & kBackward) {
            __builtin_ia32_writeeflags_u64(m_nFlags & ~kBackward);
        }
        // The C library of one target still computes powers and angles with the old unit.
        __asm__ volatile("fnstenv %0\n\tfninit" : "=m"(m_x87));
        __builtin_ia32_ldmxcsr(kDefaultControl);
    }
    ~CFloatEnvironment() {
        __builtin_ia32_ldmxcsr(m_nControl);
        __asm__ volatile("fldenv %0" : : "m"(m_x87));
        if (m_nFlags & kBackward) {
            __builtin_ia32_writeeflags_u64(__builtin_ia32_readeflags_u64() | kBackward);
        }
    }
#else
    CFloatEnvironment() {
        std::fegetenv(&m_environment);
        std::fesetenv(FE_DFL_ENV);
    }
    ~CFloatEnvironment() {
        std::fesetenv(&m_environment);
    }
#endif
    CFloatEnvironment(const CFloatEnvironment&) = delete;
    CFloatEnvironment& operator=(const CFloatEnvironment&) = delete;

private:
#if defined(__x86_64__)
    static constexpr uint32_t kDefaultControl = 0x1F80;
    static constexpr uint64_t kBackward = 0x400; // the direction flag

    uint32_t m_nControl;
    uint64_t m_nFlags;
    uint8_t m_x87[28];
#else
    std::fenv_t m_environment;
#endif
};

} // namespace kyv
