// The soap bubble and the two masks that go with it. All three share one outline.
#include "resources/generator/Art.h"

using namespace kyvdraw;

namespace kyvart {
namespace {

constexpr int kSize = 200;
// Half a pixel of the rim lies inside the edge of the sprite, so that scaling never cuts it.
constexpr float kRadius = 0.975f;
constexpr float kPixel = 2.0f / kSize;

// The sprite's square as -1..1, y down.
Vec2 Unit(Vec2 pixel) {
    return {pixel.x * kPixel - 1, pixel.y * kPixel - 1};
}

float DiscCover(float r) {
    return SmoothStep(kRadius + kPixel * 0.6f, kRadius - kPixel * 0.6f, r);
}

// Light reflected by a film of the given thickness (nm): the two faces' waves cancel or add,
// a different wavelength in each channel.
Colour FilmColour(float thickness, float cosine, float hueShift) {
    const auto channel = [&](float wavelength) {
        const float phase = 2 * kPi * 1.33f * thickness * cosine / wavelength;
        return 0.5f - 0.5f * std::cos(2 * phase + hueShift);
    };
    return {channel(640), channel(545), channel(450)};
}

// A window pane bent along the sphere: centre given by angle and radius, two by two panes.
float Window(Vec2 p, float angle, float radius, Vec2 half, float soft, float bar) {
    const float r = Length(p);
    float turn = std::atan2(p.y, p.x) - angle;
    turn -= std::round(turn / (2 * kPi)) * 2 * kPi;
    // Sides fan out from the centre a little less than rays do.
    const Vec2 q = {turn * Mix(radius, r, 0.75f), r - radius};
    const float frame = RoundBoxDistance(q, half, 0.035f);
    const float cross = bar - std::min(std::fabs(q.x), std::fabs(q.y + half.y * 0.1f));
    return SmoothStep(soft, -soft, frame) * SmoothStep(soft * 0.7f, -soft * 0.7f, cross);
}

} // namespace

Sprite DrawBubbleBody(float hueShift) {
    const auto shade = [hueShift](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel);
        const float r = Length(p);
        const float inside = std::min(r / kRadius, 0.999f);
        // Slope of the sphere: 1 in the middle, 0 at the rim.
        const float cosine = std::sqrt(1 - inside * inside);
        const float fresnel = std::pow(1 - cosine, 2.4f);

        // The film drains downwards and is stirred by the air.
        const Vec2 swirl = {Fbm(p * 1.7f, 3, 11), Fbm(p * 1.7f + Vec2{5, 3}, 3, 12)};
        const float stirred = Fbm(p * 1.5f + swirl * 0.9f, 4, 13);
        const float thickness = 330 + 130 * p.y + 150 * stirred + 260 * (inside * inside);
        const Colour film = FilmColour(thickness, std::sqrt(1 - inside * inside / 1.77f), hueShift);
        const Colour tint = Mix(Colour{0.75f, 0.85f, 1.0f}, film * 1.35f, 0.82f);

        // The body: almost clear in the middle, a coloured band towards the rim.
        const float band = SmoothStep(0.50f, 0.93f, inside) * SmoothStep(1.01f, 0.94f, inside);
        Paint paint = {tint, 0.035f + 0.10f * Luminance(film) * SmoothStep(0.1f, 0.7f, inside) +
                                 0.46f * band * (0.55f + 0.45f * Luminance(film))};

        // Shade just inside the bright band and a dark outline: these carry it on bright pictures.
        const float low = Clamp01(0.5f + 0.5f * p.y);
        paint = Over({Hex(0x2A3C78), 0.30f * Gauss(inside - 0.80f, 0.08f) * (0.5f + 0.5f * low)},
                     paint);
        paint = Over({Mix(tint, Colour{1, 1, 1}, 0.55f),
                      0.78f * Gauss(inside - 0.945f, 0.017f) *
                          (0.45f + 0.55f * SmoothStep(-0.2f, 0.9f, -Dot(p, {0.6f, 0.8f})) +
                           0.55f * SmoothStep(0.3f, 0.95f, Dot(p, {0.55f, 0.83f})))},
                     paint);
        paint = Over({Hex(0x1B2450), 0.62f * SmoothStep(0.958f, 0.992f, inside)}, paint);
        paint.alpha = Clamp01(paint.alpha + 0.10f * fresnel);

        // Light: the window, its upside-down image on the far wall, soft bounces.
        const Colour white = {1, 1, 1};
        paint = Over({white, 0.20f * Gauss(Length(p - Vec2{-0.36f, -0.44f}), 0.26f)}, paint);
        paint =
            Over({Hex(0xF4FBFF), 0.93f * Window(p, -2.26f, 0.66f, {0.27f, 0.135f}, 0.012f, 0.016f)},
                 paint);
        paint =
            Over({Hex(0xE4F2FF), 0.55f * Window(p, 0.85f, 0.745f, {0.17f, 0.062f}, 0.022f, 0.009f)},
                 paint);
        paint = Over({white, 0.85f * Gauss(Length(p - Vec2{0.30f, -0.70f}), 0.026f)}, paint);
        const float bounce = Gauss(r - 0.86f, 0.035f) * SmoothStep(0.5f, 0.98f, p.y / (r + 1e-5f));
        paint = Over({Hex(0xFFF3DC), 0.32f * bounce}, paint);

        paint.alpha *= DiscCover(r);
        return paint;
    };
    return ShadeSprite(kSize, kSize, shade);
}

// The miniature is laid over the body, so this mask lets the rim and the highlights show: clear at
// the rim, thin over the window, densest low in the middle. Only alpha is read by the effect; the
// colour repeats it on grey for whoever opens the file.
Sprite DrawMiniatureMask() {
    const auto shade = [](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel);
        const float r = Length(p) / kRadius;
        float alpha = SmoothStep(0.93f, 0.52f, r) * 0.68f;
        alpha *= 0.86f + 0.14f * SmoothStep(-0.8f, 0.6f, p.y);
        alpha *= 1 - 0.85f * Window(p, -2.26f, 0.66f, {0.27f, 0.135f}, 0.03f, 0.0f);
        alpha *= 1 - 0.70f * Window(p, 0.85f, 0.745f, {0.17f, 0.062f}, 0.05f, 0.0f);
        const float tone = ToLinear(0.25f + alpha);
        return {{tone, tone, tone}, alpha};
    };
    return ShadeSprite(kSize, kSize, shade);
}

// The lens picture lies under the body: solid up to the rim, softening over its last pixels so
// that the bent picture runs into the straight one below the dark outline.
Sprite DrawLensMask() {
    const auto shade = [](Vec2 pixel) -> Paint {
        const float r = Length(Unit(pixel)) / kRadius;
        const float alpha = SmoothStep(0.995f, 0.90f, r);
        const float bulge = std::sqrt(std::max(0.0f, 1 - r * r));
        const float tone = ToLinear(0.2f + 0.8f * bulge);
        return {{tone, tone, tone}, alpha};
    };
    return ShadeSprite(kSize, kSize, shade);
}

} // namespace kyvart
