// The random numbers of the particle animations.
#pragma once

#include <cstdint>

namespace kyv {

// The linear congruential generator that the animations are written for. Each simulation owns one
// and seeds it anew in every step, so instances on different threads cannot disturb each other.
class CParticleRandom {
public:
    static constexpr uint32_t kLargest = 32767;

    void Seed(uint32_t seed) { m_nState = seed; }

    // 0..kLargest
    uint32_t Next() {
        m_nState = m_nState * 214013U + 2531011U;
        return m_nState >> 16 & kLargest;
    }

    // 0..1, both included
    float Unit() { return static_cast<float>(Next()) / static_cast<float>(kLargest); }

    // Differs after every draw; looking at it draws nothing.
    uint32_t GetState() const { return m_nState; }

private:
    uint32_t m_nState = 1;
};

// The seed of a simulation step: the first 100000 numbers drawn from seed 1, over and over. Every
// instance uses the same table. step is not negative.
uint32_t StepSeed(int64_t step);

} // namespace kyv
