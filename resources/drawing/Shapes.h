// Points, colours in linear light, and the small shaping functions of the picture generators.
// Colours are only turned into bytes at the very end, so mixing and supersampling are those of
// light.
#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>

namespace kyvdraw {

constexpr float kPi = 3.14159265f;

struct Vec2 {
    float x = 0, y = 0;
};

constexpr Vec2 operator+(Vec2 a, Vec2 b) {
    return {a.x + b.x, a.y + b.y};
}
constexpr Vec2 operator-(Vec2 a, Vec2 b) {
    return {a.x - b.x, a.y - b.y};
}
constexpr Vec2 operator*(Vec2 a, float k) {
    return {a.x * k, a.y * k};
}
constexpr float Dot(Vec2 a, Vec2 b) {
    return a.x * b.x + a.y * b.y;
}
inline float Length(Vec2 a) {
    return std::sqrt(Dot(a, a));
}
inline Vec2 Rotate(Vec2 a, float radians) {
    const float c = std::cos(radians), s = std::sin(radians);
    return {a.x * c - a.y * s, a.x * s + a.y * c};
}

struct Vec3 {
    float x = 0, y = 0, z = 0;
};

constexpr Vec3 operator+(Vec3 a, Vec3 b) {
    return {a.x + b.x, a.y + b.y, a.z + b.z};
}
constexpr Vec3 operator-(Vec3 a, Vec3 b) {
    return {a.x - b.x, a.y - b.y, a.z - b.z};
}
constexpr Vec3 operator*(Vec3 a, float k) {
    return {a.x * k, a.y * k, a.z * k};
}
constexpr float Dot(Vec3 a, Vec3 b) {
    return a.x * b.x + a.y * b.y + a.z * b.z;
}
inline float Length(Vec3 a) {
    return std::sqrt(Dot(a, a));
}
inline Vec3 Normalize(Vec3 a) {
    return a * (1 / Length(a));
}

// Linear light, 1 is the white of the picture; values above it are clipped on output.
struct Colour {
    float r = 0, g = 0, b = 0;
};

constexpr Colour operator+(Colour a, Colour b) {
    return {a.r + b.r, a.g + b.g, a.b + b.b};
}
constexpr Colour operator-(Colour a, Colour b) {
    return {a.r - b.r, a.g - b.g, a.b - b.b};
}
constexpr Colour operator*(Colour a, Colour b) {
    return {a.r * b.r, a.g * b.g, a.b * b.b};
}
constexpr Colour operator*(Colour a, float k) {
    return {a.r * k, a.g * k, a.b * k};
}
constexpr Colour& operator+=(Colour& a, Colour b) {
    return a = a + b;
}
constexpr Colour& operator*=(Colour& a, float k) {
    return a = a * k;
}
constexpr float Luminance(Colour c) {
    return 0.2126f * c.r + 0.7152f * c.g + 0.0722f * c.b;
}

// Straight alpha: the colour of a transparent place is meaningful, because the module interpolates
// colour and alpha separately when it scales a sprite.
struct Paint {
    Colour colour;
    float alpha = 0;
};

constexpr float Clamp01(float x) {
    return x < 0 ? 0 : x > 1 ? 1 : x;
}
constexpr float Mix(float a, float b, float t) {
    return a + (b - a) * t;
}
constexpr Colour Mix(Colour a, Colour b, float t) {
    return a + (b - a) * t;
}
// 0 below edge a, 1 above edge b, smooth between; a may be the larger one.
constexpr float SmoothStep(float a, float b, float x) {
    const float t = Clamp01((x - a) / (b - a));
    return t * t * (3 - 2 * t);
}
inline float Gauss(float x, float sigma) {
    return std::exp(-x * x / (2 * sigma * sigma));
}
inline float Fract(float x) {
    return x - std::floor(x);
}

inline float ToLinear(float encoded) {
    return encoded <= 0.04045f ? encoded / 12.92f : std::pow((encoded + 0.055f) / 1.055f, 2.4f);
}
inline float ToEncoded(float linear) {
    const float x = Clamp01(linear);
    return x <= 0.0031308f ? x * 12.92f : 1.055f * std::pow(x, 1 / 2.4f) - 0.055f;
}
// A colour as it is written on screens: 0xRRGGBB.
inline Colour Hex(uint32_t rgb) {
    return {ToLinear((rgb >> 16 & 255) / 255.0f), ToLinear((rgb >> 8 & 255) / 255.0f),
            ToLinear((rgb & 255) / 255.0f)};
}
// Hue 0..1, saturation and value of the encoded colour 0..1.
inline Colour Hsv(float hue, float saturation, float value) {
    const auto channel = [&](float shift) {
        const float k = Fract(hue + shift) * 6;
        const float ramp = Clamp01(std::fabs(k - 3) - 1);
        return ToLinear(value * Mix(1, ramp, saturation));
    };
    return {channel(0), channel(2 / 3.0f), channel(1 / 3.0f)};
}

// A colour run through stops at given positions, in linear light.
template <size_t N>
Colour Gradient(const std::array<std::pair<float, Colour>, N>& stops, float t) {
    for (size_t i = 1; i < N; ++i) {
        if (t < stops[i].first) {
            const float span = stops[i].first - stops[i - 1].first;
            return Mix(stops[i - 1].second, stops[i].second,
                       Clamp01((t - stops[i - 1].first) / span));
        }
    }
    return stops[N - 1].second;
}

// top over bottom, both with straight alpha.
constexpr Paint Over(Paint top, Paint bottom) {
    const float alpha = top.alpha + bottom.alpha * (1 - top.alpha);
    if (alpha <= 0) {
        return {bottom.colour, 0};
    }
    const float share = top.alpha / alpha;
    return {Mix(bottom.colour, top.colour, share), alpha};
}

// Signed distances: negative inside.
inline float RoundBoxDistance(Vec2 p, Vec2 half, float radius) {
    const Vec2 q = {std::fabs(p.x) - half.x + radius, std::fabs(p.y) - half.y + radius};
    const Vec2 outside = {std::max(q.x, 0.0f), std::max(q.y, 0.0f)};
    return Length(outside) + std::min(std::max(q.x, q.y), 0.0f) - radius;
}
inline float SegmentDistance(Vec2 p, Vec2 a, Vec2 b) {
    const Vec2 pa = p - a, ba = b - a;
    return Length(pa - ba * Clamp01(Dot(pa, ba) / std::max(Dot(ba, ba), 1e-9f)));
}
// The smooth union of two distances; k is the width of the blend.
constexpr float SmoothMin(float a, float b, float k) {
    const float h = Clamp01(0.5f + 0.5f * (b - a) / k);
    return Mix(b, a, h) - k * h * (1 - h);
}
constexpr float SmoothMax(float a, float b, float k) {
    return -SmoothMin(-a, -b, k);
}

} // namespace kyvdraw
