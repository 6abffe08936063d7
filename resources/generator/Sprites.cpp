// The water sheen and the spare sprites of the family.
#include "resources/generator/Art.h"

using namespace kyvdraw;

namespace kyvart {
namespace {

Vec2 Unit(Vec2 pixel, int size) {
    const float scale = 2 / static_cast<float>(size);
    return {pixel.x * scale - 1, pixel.y * scale - 1};
}

} // namespace

// Stretched over the whole frame with bilinear filtering and added to it, so: nothing between the
// lines, which leaves the picture its blacks; lines a few texels wide that look right when
// stretched sideways; no more than a third of full light at the brightest. It tiles.
//
// A net of caustics, as sunlight draws it on the floor of a pool: bright where threads meet,
// thinning out between, and here and there lost.
Sprite DrawSheen() {
    constexpr int kSize = 64;
    const auto lightAt = [](Vec2 pixel) {
        const Vec2 tile = pixel * (1.0f / kSize);
        const auto net = [tile](int32_t cells, uint32_t seed, float width) {
            const Vec2 place = tile * static_cast<float>(cells);
            const Vec2 bend = {Fbm(place, 2, seed, cells), Fbm(place, 2, seed + 7, cells)};
            const CellDistances cell = CellNoise(place + bend * 0.45f, seed + 20, cells);
            const float gap = cell.second - cell.nearest;
            // Where three cells meet, all distances are long: there the light gathers.
            const float gathered = SmoothStep(0.30f, 0.75f, cell.nearest);
            return Gauss(gap, width) * (0.35f + 0.9f * gathered);
        };
        const float wander = 0.5f + 0.5f * GradientNoise(tile * 3.0f, 5, 3);
        return net(5, 40, 0.055f) * (0.15f + 1.0f * wander) +
               0.30f * net(9, 90, 0.07f) * (1.0f - wander);
    };
    return ShadeSprite(kSize, kSize, [lightAt](Vec2 pixel) -> Paint {
        float light = 0;
        for (int i = 0; i < 49; ++i) { // over a little more than a texel on each side
            const Vec2 shift = {static_cast<float>(i % 7 - 3) * 0.4f,
                                static_cast<float>(i / 7 - 3) * 0.4f};
            light += lightAt(pixel + shift) / 49;
        }
        const float bright = 1 - std::exp(-2.6f * light * SmoothStep(0.0f, 0.35f, light));
        return {Mix(Hex(0xA8DCF4), Hex(0xFFFFF0), bright), 0.25f * bright};
    });
}

// A spark of a firework: a hot core, a warm halo, four faint rays.
Sprite DrawSpark() {
    constexpr int kSize = 50;
    return ShadeSprite(kSize, kSize, [](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel, kSize);
        const float r = Length(p);
        const float rays = Gauss(p.x * p.y, 0.012f) * SmoothStep(0.95f, 0.0f, r);
        const float core = Gauss(r, 0.13f);
        const float halo = Gauss(r, 0.33f) * SmoothStep(1.0f, 0.6f, r);
        const Colour colour = Mix(Hex(0xFF8A2A), Hex(0xFFF6DC), Clamp01(core * 1.2f + rays * 0.4f));
        return {colour, Clamp01(core + 0.55f * halo + 0.45f * rays)};
    });
}

// A five-pointed star with bevelled facets.
Sprite DrawStar() {
    constexpr int kSize = 50;
    return ShadeSprite(kSize, kSize, [](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel, kSize) + Vec2{0, -0.05f};
        const float sector = 2 * kPi / 5;
        const float turn = std::atan2(p.x, -p.y);
        const float fold = turn - std::round(turn / sector) * sector;
        const Vec2 q = Vec2{std::fabs(std::sin(fold)), std::cos(fold)} * Length(p);
        // The edge from the tip to the notch between two arms.
        const Vec2 tip = {0, 0.95f};
        const Vec2 notch = Vec2{std::sin(sector / 2), std::cos(sector / 2)} * 0.40f;
        const Vec2 along = notch - tip;
        const Vec2 normal = Vec2{-along.y, along.x} * (1 / Length(along));
        const float distance = Dot(q - tip, normal);
        const bool lit = fold < 0;
        const Colour face = lit ? Hex(0xFFE27A) : Hex(0xE09A1E);
        const Colour colour = Mix(face, Hex(0xFFF9E0), Gauss(distance + 0.07f, 0.03f) * 0.8f);
        return {colour, SmoothStep(0.03f, -0.03f, distance)};
    });
}

// A ball of clear glass: dark refracted rim, bright focus opposite to the light.
Sprite DrawLens() {
    constexpr int kSize = 200;
    return ShadeSprite(kSize, kSize, [](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel, kSize);
        const float r = Length(p) / 0.97f;
        const float inside = std::min(r, 0.999f);
        Paint paint = {Hex(0xBFE0F2), 0.10f + 0.18f * inside * inside};
        paint = Over({Hex(0x16283C), 0.75f * std::pow(inside, 7.0f)}, paint);
        paint = Over({Hex(0xFFFFFF), 0.70f * Gauss(Length(p - Vec2{0.36f, 0.42f}), 0.24f)}, paint);
        paint = Over({Hex(0xFFFFFF), 0.8f * Gauss(inside - 0.88f, 0.03f) *
                                         SmoothStep(0.4f, 0.95f, Dot(p, {0.6f, 0.8f}))},
                     paint);
        const Vec2 h = Rotate(p - Vec2{-0.38f, -0.46f}, 0.85f);
        paint = Over({Hex(0xFFFFFF),
                      0.95f * SmoothStep(1.15f, 0.75f, Length(Vec2{h.x / 0.26f, h.y / 0.15f}))},
                     paint);
        paint.alpha *= SmoothStep(1.008f, 0.99f, r);
        return paint;
    });
}

// A drop of water, hanging, lit from the upper left.
Sprite DrawDrop() {
    constexpr int kSize = 200;
    return ShadeSprite(kSize, kSize, [](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel, kSize);
        // A ball below and the cone that touches it above: the outline is the same curve for
        // every shell between the middle (0) and the surface (1).
        constexpr float kBall = 0.58f;
        const Vec2 centre = {0, 0.36f};
        const float rise = std::max(0.0f, centre.y - p.y);
        const float narrow = 1 - std::pow(Clamp01(rise / 1.30f), 1.7f);
        const float sink = std::max(0.0f, p.y - centre.y);
        const float d =
            rise >= 1.30f ? 2 : Length(Vec2{p.x / std::max(narrow, 0.01f), sink}) / kBall;
        const float inside = std::min(d, 0.999f);
        const float down = Clamp01((p.y + 0.9f) / 1.8f);
        Paint paint = {Mix(Hex(0x3C7FB4), Hex(0xC4ECFF), down * down), 0.34f + 0.30f * inside};
        paint = Over({Hex(0x12304E), 0.65f * std::pow(inside, 6.0f) * (1.1f - 0.6f * down)}, paint);
        paint = Over({Hex(0xF2FCFF), 0.75f * Gauss(Length(p - Vec2{0.20f, 0.56f}), 0.17f)}, paint);
        const Vec2 h = Rotate(p - Vec2{-0.27f, 0.08f}, 0.25f);
        paint = Over({Hex(0xFFFFFF),
                      0.95f * SmoothStep(1.2f, 0.7f, Length(Vec2{h.x / 0.075f, h.y / 0.21f}))},
                     paint);
        paint.alpha *= SmoothStep(1.012f, 0.988f, d);
        return paint;
    });
}

// A lens flare: core, coloured halo, fine rays.
Sprite DrawFlare() {
    constexpr int kSize = 200;
    return ShadeSprite(kSize, kSize, [](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel, kSize);
        const float r = Length(p);
        const float turn = std::atan2(p.y, p.x);
        const float comb = GradientNoise(Vec2{turn / (2 * kPi) * 48, 0.5f}, 31, 48);
        const float rays = std::pow(Clamp01(0.5f + 0.8f * comb), 2.0f) * Gauss(r, 0.40f);
        const float core = Gauss(r, 0.10f);
        const float halo = Gauss(r, 0.26f);
        const float ring = Gauss(r - 0.68f, 0.025f) * (0.6f + 0.4f * comb);
        const Colour rainbow = Hsv(0.75f - (r - 0.60f) * 4.5f, 0.8f, 1.0f);
        Paint paint = {Mix(Hex(0xFF9A50), Hex(0xFFFBEA), Clamp01(core + halo * 0.8f)),
                       Clamp01(core + 0.5f * halo + 0.55f * rays)};
        paint = Over({rainbow, 0.30f * ring}, paint);
        paint.alpha *= SmoothStep(1.0f, 0.72f, r);
        return paint;
    });
}

// Ripples running out from a drop: light and dark rings.
Sprite DrawRings() {
    constexpr int kSize = 64;
    return ShadeSprite(kSize, kSize, [](Vec2 pixel) -> Paint {
        const Vec2 p = Unit(pixel, kSize);
        const float r = Length(p);
        const float wave = std::sin(r * 2 * kPi * 3.2f - 0.6f);
        const float slope = wave * (0.65f - 0.35f * Dot(p, {0.6f, 0.8f}) / (r + 0.05f));
        const Colour colour = slope > 0 ? Hex(0xE6F8FF) : Hex(0x1D4A6C);
        return {colour, Clamp01(std::fabs(slope) * 0.85f) * SmoothStep(0.98f, 0.30f, r)};
    });
}

} // namespace kyvart
