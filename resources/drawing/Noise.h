// Noise without tables or state: the same place and seed always give the same value.
#pragma once

#include <cstdint>

#include "resources/drawing/Shapes.h"

namespace kyvdraw {

// A well-mixed 32-bit value of a lattice place.
constexpr uint32_t Hash(int32_t x, int32_t y, uint32_t seed) {
    uint32_t h = static_cast<uint32_t>(x) * 0x8DA6B343u ^ static_cast<uint32_t>(y) * 0xD8163841u ^
                 seed * 0xCB1AB31Fu;
    h = (h ^ h >> 15) * 0x2C1B3C6Du;
    h = (h ^ h >> 12) * 0x297A2D39u;
    return h ^ h >> 15;
}
// 0 to below 1.
constexpr float Hash01(int32_t x, int32_t y, uint32_t seed) {
    return static_cast<float>(Hash(x, y, seed) >> 8) / 16777216.0f;
}

// Gradient noise, about -1..1, smooth. With a period (in lattice cells) it tiles.
float GradientNoise(Vec2 p, uint32_t seed, int32_t period = 0);
// octaves of gradient noise, each of twice the frequency and half the strength; about -1..1.
float Fbm(Vec2 p, int octaves, uint32_t seed, int32_t period = 0);
// The same, from 3 coordinates, for the surface of solids.
float GradientNoise(Vec3 p, uint32_t seed);
float Fbm(Vec3 p, int octaves, uint32_t seed);
// Distance to the nearest and second nearest of one random point a cell.
struct CellDistances {
    float nearest, second;
    uint32_t id;
};
CellDistances CellNoise(Vec2 p, uint32_t seed, int32_t period = 0);

// A plain generator for things that are scattered. Values 0 to below 1.
class CScatter {
public:
    explicit CScatter(uint32_t seed) : m_nState(seed * 2654435761u + 1) {}
    float Next() {
        m_nState ^= m_nState << 13;
        m_nState ^= m_nState >> 17;
        m_nState ^= m_nState << 5;
        return static_cast<float>(m_nState >> 8) / 16777216.0f;
    }
    float Between(float low, float high) { return Mix(low, high, Next()); }
    // About normal with deviation 1.
    float Bell() { return (Next() + Next() + Next() + Next() - 2) * 1.7320508f; }

private:
    uint32_t m_nState;
};

} // namespace kyvdraw
