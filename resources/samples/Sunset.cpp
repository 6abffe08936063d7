// An evening at sea. The sky is a function of the direction; the water mirrors it in waves that
// get smaller with the distance.
#include "resources/samples/Samples.h"

using namespace kyvdraw;

namespace kyvsamples {
namespace {

constexpr float kHorizon = 452, kFocus = 1100;
constexpr Vec2 kSun = {812, 398};

Vec3 Towards(Vec2 p) {
    return Normalize({p.x - kWidth / 2.0f, kHorizon - p.y, kFocus});
}

float CloudAt(Vec2 p) {
    const Vec2 bend = {Fbm(p * 0.7f, 3, 41), Fbm(p * 0.7f, 3, 47)};
    return Fbm(p + bend * 0.8f, 6, 51);
}

Colour SkyLight(Vec3 d) {
    const static std::array<std::pair<float, Colour>, 7> kSky = {{{0.0f, Hex(0xffc27a)},
                                                                  {0.035f, Hex(0xff9f58)},
                                                                  {0.10f, Hex(0xf0705a)},
                                                                  {0.19f, Hex(0xb4507a)},
                                                                  {0.30f, Hex(0x664a94)},
                                                                  {0.42f, Hex(0x35408a)},
                                                                  {0.70f, Hex(0x1b2a66)}}};
    const static Vec3 kToSun = Towards(kSun);
    const float height = std::max(d.y, 0.0f);
    const float off = std::acos(std::clamp(Dot(d, kToSun), -1.0f, 1.0f)) * kFocus;
    Colour light = Gradient(kSky, height);
    light += Hex(0xffb050) * (1.1f * std::exp(-off / 55)) +
             Hex(0xff7a3c) * (0.5f * std::exp(-off / 260));
    const float disc = SmoothStep(47, 44.5f, off);
    light = Mix(light, Colour{1.75f, 1.2f, 0.55f}, disc);

    // Clouds lie on a plane high above; near the horizon they close up to bands.
    const float reach = 1 / (height + 0.075f);
    const Vec2 plane = {d.x * reach * 1.05f + 3, reach * 0.62f};
    const float body = CloudAt(plane);
    const float cover =
        SmoothStep(0.02f, 0.36f, body + 0.12f - height * 0.15f) * SmoothStep(0.015f, 0.09f, height);
    const Vec2 toSun = {(kToSun.x - d.x) * 0.5f, 0.16f};
    const float lit = Clamp01(0.5f + (body - CloudAt(plane + toSun * 0.9f)) * 1.5f);
    const float near = std::exp(-off / 520);
    const Colour shade = Mix(Hex(0x3a3060), Hex(0x8a3c58), near);
    const Colour edge = Mix(Hex(0xf08a78), Hex(0xffc070) * 1.5f, near);
    const Colour cloud = Mix(shade, edge, lit * lit * 0.9f + 0.1f * near);
    return Mix(light, cloud, cover * 0.88f * (1 - disc));
}

// The slope of the water at a place, x across and y away, in units of the eye's height.
Vec2 WaveSlope(Vec2 p) {
    Vec2 slope;
    float size = 0.28f, strength = 0.088f;
    for (uint32_t i = 0; i < 5; ++i) {
        const Vec2 q = {p.x * size, p.y * size * 1.5f};
        slope = slope +
                Vec2{GradientNoise(q, 60 + i), GradientNoise(q + Vec2{7, 3}, 70 + i)} * strength;
        size *= 2.3f;
        strength *= 0.82f;
    }
    return slope;
}

Colour SeaLight(Vec2 p) {
    const Vec3 d = Towards(p);
    const float distance = 1 / std::max(-d.y, 1e-4f);
    const Vec2 place = {d.x * distance * 1.6f, d.z * distance * 0.8f};
    // Far away many waves share a pixel; their mean is flatter.
    const Vec2 slope = WaveSlope(place) * (1 / (1 + distance * 0.022f));
    const Vec3 normal = Normalize({-slope.x, 1, -slope.y});
    Vec3 mirrored = d - normal * (2 * Dot(d, normal));
    mirrored.y = std::fabs(mirrored.y);
    const float facing = Clamp01(-Dot(d, normal));
    const float fresnel = 0.03f + 0.97f * std::pow(1 - facing, 4.0f);
    const Colour deep = Mix(Hex(0x0c1c3c), Hex(0x1a3a58), facing);
    return Mix(deep, SkyLight(Normalize(mirrored)) * 0.93f, fresnel);
}

// The outline of the headland: how far it rises above the horizon at x.
float Headland(float x, float reach, float height, uint32_t seed) {
    const float slope = Clamp01(1 - x / reach);
    const float ragged = Fbm(Vec2{x * 0.02f, 0}, 5, seed) * 0.22f;
    return height * std::pow(slope, 0.8f) * (0.85f + ragged) + (slope > 0 ? 1.5f : -3);
}

Paint Land(Vec2 p) {
    const float far = Headland(kWidth - p.x + 20, 420, 54, 5), near = Headland(p.x, 390, 112, 3);
    const float trees =
        std::fabs(GradientNoise(Vec2{p.x * 0.16f, 0}, 8)) * 9 * Clamp01((330 - p.x) / 200);
    const float up = kHorizon - p.y;
    if (up < 0) {
        // The mirrored shore, shortened and torn by the waves.
        const float torn = GradientNoise(Vec2{p.x * 0.05f, up * 0.9f}, 12) * 12;
        const float depth = (torn - up * 1.5f) / std::max(near, 1.0f);
        return {Hex(0x3a2040), near > 0 ? 0.6f * SmoothStep(1.0f, 0.2f, depth) : 0};
    }
    if (up < near + trees) {
        const float haze = SmoothStep(120, 0, up);
        return {Mix(Hex(0x1a1430), Hex(0x50304a), haze * 0.55f), 1};
    }
    return {Mix(Hex(0x8a4a60), Hex(0xc8705c), SmoothStep(50, 0, up)), up < far ? 1.0f : 0.0f};
}

void DrawBoat(CCanvas& canvas, Vec2 at, float size) {
    const auto place = [&](float x, float y) { return at + Vec2{x, -y} * size; };
    const Colour dark = Hex(0x1c1226);
    canvas.Layer(
        [&](Vec2 p) -> Paint {
            const Vec2 q = {(p.x - at.x) / size, (at.y - p.y) / size};
            if (std::fabs(q.x) > 1.3f || q.y < -0.2f || q.y > 2.6f) {
                return {};
            }
            // The hull: a flat deck over a rounded keel line.
            const float hull = 0.9f - 0.16f * SmoothStep(0.16f, -0.06f, q.y) + 0.1f * q.y;
            if (q.y < 0.17f + 0.05f * q.x * q.x && q.y > -0.06f && q.x > -0.78f && q.x < hull) {
                return {dark, 1};
            }
            // Main sail behind the mast, jib before it; light shines through the cloth.
            const float belly = 0.10f * std::sin((q.y - 0.3f) * 1.6f);
            const bool main = q.x < 0.05f && q.y > 0.32f && q.x > -0.72f * (2.3f - q.y) / 2 - belly;
            const bool jib =
                q.x > 0.12f && q.y > 0.26f && q.x < 0.12f + 0.68f * (2.0f - q.y) / 1.75f;
            if ((main && q.y < 2.3f) || (jib && q.y < 2.0f)) {
                const float seam =
                    std::fabs(Fract(q.y * 3.2f + q.x * 0.5f) - 0.5f) < 0.02f ? 0.75f : 1;
                return {Mix(Hex(0x74303a), Hex(0xd8785a), Clamp01(0.25f + 0.3f * q.y)) * seam, 1};
            }
            return {};
        },
        4);
    canvas.Stroke(place(0.08f, 0.1f), place(0.08f, 2.45f), 3.2f, 2, dark);
    canvas.Stroke(place(-0.75f, 0.31f), place(0.08f, 0.3f), 2.4f, 2, dark);
    canvas.Stroke(place(0.08f, 2.2f), place(0.95f, 0.16f), 0.8f, 0.8f, dark);
    // Two people at the helm.
    for (const float x : {-0.5f, -0.34f}) {
        canvas.Stroke(place(x, 0.15f), place(x + 0.02f, 0.36f), 5, 4, dark);
        canvas.Stroke(place(x + 0.02f, 0.43f), place(x + 0.02f, 0.44f), 5, 5, dark);
    }
    // Its image in the water, torn by the waves.
    CScatter scatter(9);
    for (float depth = 0.05f; depth < 1.5f; depth += 0.016f) {
        const float sway = scatter.Bell() * 0.05f * (1 + depth * 2);
        const float half = depth < 0.25f ? 0.75f : 0.55f * (1.7f - depth) / 1.5f;
        const Vec2 left = place(-half + sway - 0.08f, -depth),
                   right = place(half * 0.9f + sway, -depth);
        canvas.Stroke(left, right, 2.4f, 1.4f, Mix(dark, Hex(0x5a2438), depth * 0.6f),
                      (0.62f - depth * 0.36f) * scatter.Between(0.5f, 1));
    }
}

void DrawBirds(CCanvas& canvas) {
    CScatter scatter(23);
    for (int i = 0; i < 11; ++i) {
        const Vec2 body = {scatter.Between(420, 660), scatter.Between(130, 250)};
        const float span = scatter.Between(6, 12), lift = scatter.Between(0.2f, 0.6f);
        for (const float side : {-1.0f, 1.0f}) {
            const Vec2 elbow = body + Vec2{side * span * 0.5f, -span * lift};
            const Vec2 tip = body + Vec2{side * span, -span * lift * 0.5f};
            canvas.Stroke(body, elbow, 2.2f, 1.6f, Hex(0x281c3a), 0.9f);
            canvas.Stroke(elbow, tip, 1.6f, 0.6f, Hex(0x281c3a), 0.9f);
        }
    }
}

} // namespace

CCanvas DrawSunset() {
    CCanvas canvas(kWidth, kHeight);
    canvas.Fill([](Vec2 p) { return p.y < kHorizon ? SkyLight(Towards(p)) : SeaLight(p); }, 3);
    canvas.Layer(Land, 3);
    DrawBoat(canvas, {560, 500}, 62);
    DrawBirds(canvas);
    canvas.Bloom(0.9f, 14, 0.35f);
    canvas.Bloom(0.95f, 50, 0.22f);
    canvas.Shoulder(0.75f);
    canvas.Grain(0.7f, 3);
    return canvas;
}

} // namespace kyvsamples
