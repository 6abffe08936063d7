// Gradient noise that repeats.
#include "resources/drawing/Noise.h"

namespace kyvdraw {
namespace {

float Fade(float t) {
    return t * t * t * (t * (t * 6 - 15) + 10);
}

int32_t Wrap(int32_t i, int32_t period) {
    return period == 0 ? i : (i % period + period) % period;
}

float Corner(int32_t x, int32_t y, Vec2 d, uint32_t seed, int32_t period) {
    const float angle = Hash01(Wrap(x, period), Wrap(y, period), seed) * 2 * kPi;
    return std::cos(angle) * d.x + std::sin(angle) * d.y;
}

float Corner(int32_t x, int32_t y, int32_t z, Vec3 d, uint32_t seed) {
    const uint32_t h = Hash(x, y, seed + static_cast<uint32_t>(z) * 0x9E3779B9u);
    const Vec3 g = {static_cast<float>(h & 1023) / 511.5f - 1,
                    static_cast<float>(h >> 10 & 1023) / 511.5f - 1,
                    static_cast<float>(h >> 20 & 1023) / 511.5f - 1};
    return Dot(g, d);
}

} // namespace

float GradientNoise(Vec2 p, uint32_t seed, int32_t period) {
    const int32_t x = static_cast<int32_t>(std::floor(p.x));
    const int32_t y = static_cast<int32_t>(std::floor(p.y));
    const Vec2 d = {p.x - static_cast<float>(x), p.y - static_cast<float>(y)};
    const float u = Fade(d.x), v = Fade(d.y);
    const float top =
        Mix(Corner(x, y, d, seed, period), Corner(x + 1, y, d - Vec2{1, 0}, seed, period), u);
    const float bottom = Mix(Corner(x, y + 1, d - Vec2{0, 1}, seed, period),
                             Corner(x + 1, y + 1, d - Vec2{1, 1}, seed, period), u);
    return Mix(top, bottom, v) * 1.5f;
}

float Fbm(Vec2 p, int octaves, uint32_t seed, int32_t period) {
    float sum = 0, strength = 0.55f;
    for (int i = 0; i < octaves; ++i) {
        sum += strength * GradientNoise(p, seed + static_cast<uint32_t>(i), period);
        p = period == 0 ? Rotate(p * 2.03f, 0.5f) : p * 2;
        period *= 2;
        strength *= 0.5f;
    }
    return sum;
}

float GradientNoise(Vec3 p, uint32_t seed) {
    const int32_t x = static_cast<int32_t>(std::floor(p.x));
    const int32_t y = static_cast<int32_t>(std::floor(p.y));
    const int32_t z = static_cast<int32_t>(std::floor(p.z));
    const Vec3 d = {p.x - static_cast<float>(x), p.y - static_cast<float>(y),
                    p.z - static_cast<float>(z)};
    const float u = Fade(d.x), v = Fade(d.y), w = Fade(d.z);
    float planes[2];
    for (int32_t k = 0; k < 2; ++k) {
        const auto at = [&](int32_t i, int32_t j) {
            const Vec3 shift = {static_cast<float>(i), static_cast<float>(j),
                                static_cast<float>(k)};
            return Corner(x + i, y + j, z + k, d - shift, seed);
        };
        planes[k] = Mix(Mix(at(0, 0), at(1, 0), u), Mix(at(0, 1), at(1, 1), u), v);
    }
    return Mix(planes[0], planes[1], w);
}

float Fbm(Vec3 p, int octaves, uint32_t seed) {
    float sum = 0, strength = 0.55f;
    for (int i = 0; i < octaves; ++i) {
        sum += strength * GradientNoise(p, seed + static_cast<uint32_t>(i));
        p = p * 2.03f;
        strength *= 0.5f;
    }
    return sum;
}

CellDistances CellNoise(Vec2 p, uint32_t seed, int32_t period) {
    const int32_t x = static_cast<int32_t>(std::floor(p.x));
    const int32_t y = static_cast<int32_t>(std::floor(p.y));
    CellDistances found = {9, 9, 0};
    for (int32_t j = y - 2; j <= y + 2; ++j) {
        for (int32_t i = x - 2; i <= x + 2; ++i) {
            const int32_t wi = Wrap(i, period), wj = Wrap(j, period);
            const Vec2 point = {static_cast<float>(i) + Hash01(wi, wj, seed),
                                static_cast<float>(j) + Hash01(wi, wj, seed + 1)};
            const float distance = Length(point - p);
            if (distance < found.nearest) {
                found = {distance, found.nearest, Hash(wi, wj, seed + 2)};
            } else {
                found.second = std::min(found.second, distance);
            }
        }
    }
    return found;
}

} // namespace kyvdraw
