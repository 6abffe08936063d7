// Three wooden figures of different complexion beside a colour chart, in soft studio light: skin
// tones, saturated patches and a grey scale, as a portrait photographer shoots them first.
// The scene is solids given by their distance; rays step along by it.
#include "resources/samples/Samples.h"

using namespace kyvdraw;

namespace kyvsamples {
namespace {

constexpr float kFloor = 0;
constexpr Vec3 kEye = {0.25f, 1.55f, -6.6f};
const Vec3 kToKey = Normalize({-0.62f, 0.74f, -0.52f});

struct Figure {
    float x, z, turn;
    Colour skin, hair, cloth, pattern;
    int style; // of the hair and of the pattern
};

const Figure kFigures[] = {
    {-1.78f, 0.10f, -0.24f, Hex(0x8d5a3c), Hex(0x17110f), Hex(0x1f6f78), Hex(0xf2c14e), 0},
    {-0.30f, -0.25f, 0.05f, Hex(0xf0c4a4), Hex(0x8c3a1c), Hex(0xb83a4b), Hex(0xf6ead8), 1},
    {1.10f, 0.15f, 0.20f, Hex(0xcf9468), Hex(0x35231a), Hex(0x35508c), Hex(0xe9eef6), 2},
};

enum class Stuff : uint8_t { Floor, Skin, Hair, Cloth, Scarf, Chart };

struct Hit {
    float distance = 1e9f;
    Stuff stuff = Stuff::Floor;
    const Figure* figure = nullptr;
    Vec3 at; // in the figure's or the chart's own axes
};

void Closer(Hit& best, float distance, Stuff stuff, const Figure* figure, Vec3 at) {
    if (distance < best.distance) {
        best = {distance, stuff, figure, at};
    }
}

// A turned body: its radius as a smooth function of the height.
float BodyDistance(Vec3 q) {
    const float h = Clamp01(q.y / 1.32f);
    const float radius = Mix(0.56f, 0.25f, SmoothStep(0.05f, 1.05f, h)) + 0.05f * std::sin(h * kPi);
    const float around = std::sqrt(q.x * q.x + q.z * q.z) - radius;
    const float above = std::max(q.y - 1.26f, 0.04f - q.y);
    return SmoothMax(around * 0.86f, above, 0.12f);
}

float HairDistance(const Figure& figure, Vec3 h) {
    const float skull = Length(Vec3{h.x, h.y - 0.03f, h.z - 0.03f}) - 0.505f;
    // The hairline is a tilted plane; hair grows behind and above it.
    const float part = figure.style == 1 ? 0.10f * h.x : 0.06f * std::fabs(h.x);
    const float line = -(h.y - 0.17f + part + h.z * (figure.style == 1 ? 0.80f : 0.50f));
    const float strands = 0.008f * std::sin(std::atan2(h.x, h.y + 0.6f) * 46);
    float cap = SmoothMax(skull + strands, line, 0.05f);
    if (figure.style == 0) {
        const float curls = 0.014f * std::sin(h.x * 42) * std::sin(h.y * 42) * std::sin(h.z * 42);
        cap = SmoothMin(cap, Length(h - Vec3{0, 0.56f, 0.10f}) - 0.23f, 0.07f) + curls;
    } else if (figure.style == 1) {
        for (const float side : {-1.0f, 1.0f}) {
            const Vec3 bunch = {h.x - side * 0.53f, (h.y + 0.30f) * 0.62f, h.z - 0.12f};
            cap = SmoothMin(cap, Length(bunch) - 0.15f, 0.09f);
        }
    }
    return cap;
}

Hit Scene(Vec3 p) {
    Hit best;
    // The floor turns up into the backdrop in a wide bend.
    const float wall = 3.4f - p.z;
    Closer(best, SmoothMin(p.y - kFloor, wall, 1.6f), Stuff::Floor, nullptr, p);
    for (const Figure& figure : kFigures) {
        const Vec3 local = {p.x - figure.x, p.y, p.z - figure.z};
        const float bound = Length(local - Vec3{0, 1.1f, 0}) - 1.35f;
        if (bound > 0.3f) {
            Closer(best, bound, Stuff::Floor, nullptr, p);
            continue;
        }
        const Vec2 flat = Rotate(Vec2{local.x, local.z}, figure.turn);
        const Vec3 q = {flat.x, local.y, flat.y};
        Closer(best, BodyDistance(q), Stuff::Cloth, &figure, q);
        const Vec3 head = q - Vec3{0, 1.66f, 0};
        Closer(best, Length(head) - 0.48f, Stuff::Skin, &figure, head);
        Closer(best, HairDistance(figure, head) * 0.8f, Stuff::Hair, &figure, head);
        // A scarf: a ring round the neck, and its end in front.
        const Vec2 ring = {Length(Vec2{q.x, q.z}) - 0.27f, (q.y - 1.24f) * 0.92f};
        const float knit = 0.010f * std::sin(std::atan2(q.x, q.z) * 40 + q.y * 30);
        Closer(best, (Length(ring) - 0.105f + knit) * 0.85f, Stuff::Scarf, &figure, q);
    }
    // The chart leans back a little.
    const Vec2 turned = Rotate(Vec2{p.x - 2.62f, p.z - 0.45f}, -0.22f);
    const Vec2 tilted = Rotate(Vec2{p.y - 0.02f, turned.y}, 0.10f);
    const Vec3 c = {turned.x, tilted.x - 1.02f, tilted.y};
    const Vec3 over = {std::fabs(c.x) - 0.70f, std::fabs(c.y) - 1.0f, std::fabs(c.z) - 0.02f};
    const Vec3 out = {std::max(over.x, 0.0f), std::max(over.y, 0.0f), std::max(over.z, 0.0f)};
    Closer(best, Length(out) + std::min(std::max({over.x, over.y, over.z}), 0.0f) - 0.02f,
           Stuff::Chart, nullptr, c);
    return best;
}

// The face, painted on the front of the head, about x and y of -0.5..0.5.
Colour FaceColour(const Figure& figure, Vec3 h) {
    const float grain =
        0.5f + 0.5f * std::sin((h.y + 0.03f * Fbm(h * 2.0f, 3, 4)) * 70 + 5 * Fbm(h * 3.0f, 3, 7));
    Colour skin = figure.skin * (0.95f + 0.07f * grain);
    if (h.z > 0) {
        return skin;
    }
    const Vec2 f = {h.x, h.y};
    for (const float side : {-1.0f, 1.0f}) {
        const float blush = Gauss(Length(f - Vec2{side * 0.27f, -0.10f}), 0.075f);
        skin = Mix(skin, skin * 0.4f + Hex(0xe0503c) * 0.6f, 0.55f * blush);
        const Vec2 eye = f - Vec2{side * 0.165f, 0.03f};
        const float ball = Length(Vec2{eye.x * 1.25f, eye.y}) - 0.050f;
        skin = Mix(skin, Hex(0x1c1210), SmoothStep(0.004f, -0.004f, ball));
        skin = Mix(skin, Colour{1.3f, 1.3f, 1.3f},
                   SmoothStep(0.017f, 0.012f, Length(eye - Vec2{-0.014f, 0.018f})));
        const Vec2 brow = f - Vec2{side * 0.17f, 0.125f - 1.6f * (std::fabs(f.x) - 0.17f) *
                                                              (std::fabs(f.x) - 0.17f)};
        const bool inBrow = std::fabs(brow.x) < 0.062f;
        skin = Mix(skin, figure.hair,
                   inBrow ? 0.85f * SmoothStep(0.014f, 0.006f, std::fabs(brow.y)) : 0);
    }
    const float nose = Gauss(f.x, 0.03f) * Gauss(f.y + 0.055f, 0.022f);
    skin = Mix(skin, skin * Hex(0xe07a60), 0.7f * nose);
    const float curve = f.y + 0.175f - 1.9f * f.x * f.x;
    const float mouth = std::fabs(f.x) < 0.105f ? SmoothStep(0.016f, 0.008f, std::fabs(curve)) : 0;
    return Mix(skin, Hex(0x8c2a28), 0.9f * mouth);
}

Colour ClothColour(const Figure& figure, Vec3 q) {
    const float around = std::atan2(q.x, -q.z) * 5.73f; // 36 units a turn
    if (figure.style == 0) {
        // Triangles in rows.
        const float row = q.y * 6, v = Fract(row);
        const float u = std::fabs(Fract(around * 0.5f + 0.5f * std::floor(row)) - 0.5f);
        return Mix(figure.cloth, figure.pattern,
                   u < 0.42f * (1 - v) && v > 0.12f && Fract(row * 0.5f) < 0.5f ? 1.0f : 0.0f);
    }
    if (figure.style == 1) {
        // Dots, every other row shifted.
        const float row = std::floor(q.y * 7);
        const Vec2 cell = {Fract(around * 0.9f + row * 0.5f) - 0.5f, Fract(q.y * 7) - 0.5f};
        return Mix(figure.cloth, figure.pattern, SmoothStep(0.27f, 0.22f, Length(cell)));
    }
    const float stripe = Fract(q.y * 8);
    return Mix(figure.cloth, figure.pattern,
               SmoothStep(0.03f, 0.05f, stripe) * SmoothStep(0.40f, 0.38f, stripe));
}

Colour ChartColour(Vec3 c) {
    static const std::array<Colour, 20> kPatches = {
        Hex(0x6a4634), Hex(0xd09a7c), Hex(0xf1cdb4), Hex(0x51759e), Hex(0x56703c),
        Hex(0x7f7cb8), Hex(0x5cb9ac), Hex(0xd97b2c), Hex(0x405aa8), Hex(0xc24a5c),
        Hex(0x5c3564), Hex(0x9fbc3e), Hex(0xe3a32c), Hex(0x283f94), Hex(0x3f9248),
        Hex(0xb03038), Hex(0xe9cd22), Hex(0xb84c92), Hex(0x1b86a4), Hex(0xef8a9a)};
    const Vec2 p = {(c.x + 0.62f) / 1.24f, (0.92f - c.y) / 1.84f};
    if (c.z > 0 || p.x < 0 || p.x > 1 || p.y < 0 || p.y > 1) {
        return Hex(0x1a1a1c);
    }
    const float u = p.x * 4, v = p.y * 6;
    const bool gap = std::fabs(Fract(u) - 0.5f) > 0.45f || std::fabs(Fract(v) - 0.5f) > 0.45f;
    const size_t column = static_cast<size_t>(u), row = static_cast<size_t>(v);
    if (v >= 5) {
        // Eight greys, evenly spaced as the eye sees them.
        const float step = std::floor(p.x * 8) / 7;
        const float grey = ToLinear(0.08f + 0.87f * step);
        return std::fabs(Fract(v) - 0.5f) > 0.45f ? Hex(0x1a1a1c) : Colour{grey, grey, grey};
    }
    return gap ? Hex(0x1a1a1c) : kPatches[row * 4 + column];
}

Vec3 NormalAt(Vec3 p) {
    constexpr float e = 0.0015f;
    const auto at = [&](float x, float y, float z) { return Scene(p + Vec3{x, y, z}).distance; };
    return Normalize(
        {at(e, 0, 0) - at(-e, 0, 0), at(0, e, 0) - at(0, -e, 0), at(0, 0, e) - at(0, 0, -e)});
}

float SoftShadow(Vec3 p, Vec3 to) {
    float free = 1;
    for (float t = 0.04f; t < 5;) {
        const float near = Scene(p + to * t).distance;
        free = std::min(free, 0.5f + 4.5f * near / t);
        if (free < 0.02f) {
            return 0;
        }
        t += std::clamp(near, 0.02f, 0.4f);
    }
    return SmoothStep(0, 1, free);
}

float Openness(Vec3 p, Vec3 normal) {
    float closed = 0, weight = 1;
    for (int i = 1; i <= 5; ++i) {
        const float away = 0.07f * static_cast<float>(i * i) * 0.5f + 0.01f;
        closed += weight * (away - Scene(p + normal * away).distance);
        weight *= 0.55f;
    }
    return Clamp01(1 - 1.3f * closed);
}

Colour Shade(const Hit& hit, Vec3 p, Vec3 d) {
    Vec3 normal = NormalAt(p);
    Colour albedo;
    float gloss = 0.2f, sharp = 30;
    switch (hit.stuff) {
    case Stuff::Floor: {
        const float high = Clamp01(p.y / 4.5f);
        albedo = Mix(Hex(0xd9c9b4), Hex(0x8fa3a0), SmoothStep(0, 0.7f, high)) * 0.95f;
        gloss = 0.02f;
        break;
    }
    case Stuff::Skin:
        albedo = FaceColour(*hit.figure, hit.at);
        gloss = 0.30f;
        sharp = 60;
        break;
    case Stuff::Hair:
        albedo = hit.figure->hair;
        gloss = 0.28f;
        sharp = 24;
        break;
    case Stuff::Cloth: {
        const float weave =
            std::sin(hit.at.y * 190) * std::sin(std::atan2(hit.at.x, hit.at.z) * 76);
        albedo = ClothColour(*hit.figure, hit.at) * (0.94f + 0.09f * weave);
        gloss = 0.10f;
        break;
    }
    case Stuff::Scarf:
        albedo = Mix(hit.figure->pattern, hit.figure->cloth, 0.18f);
        gloss = 0.03f;
        break;
    case Stuff::Chart:
        albedo = ChartColour(hit.at);
        gloss = 0.04f;
        break;
    }
    const float open = Openness(p, normal);
    const float key = std::max(0.0f, Dot(normal, kToKey) * 0.92f + 0.08f) *
                      SoftShadow(p + normal * 0.01f, kToKey);
    const float fill = 0.5f + 0.5f * Dot(normal, Normalize({0.9f, 0.25f, -0.5f}));
    const float top = 0.5f + 0.5f * normal.y;
    const float rim = std::pow(1 - Clamp01(-Dot(normal, d)), 3.5f) *
                      Clamp01(0.5f + normal.x * 0.6f + normal.y * 0.3f);
    Colour light = Hex(0xffeedd) * (1.50f * key) + Hex(0xbcd0f0) * (0.20f * fill * open) +
                   Hex(0xfff4e8) * (0.28f * top * open);
    Colour sum = albedo * light;
    if (hit.stuff == Stuff::Skin) {
        // Light that has gone through the surface comes back redder.
        sum += albedo * Hex(0xff7050) * (0.10f * open * (1 - key));
    }
    if (hit.stuff != Stuff::Floor) {
        const Vec3 half = Normalize(kToKey - d);
        sum += Hex(0xfff2e0) *
               (gloss * std::pow(std::max(0.0f, Dot(normal, half)), sharp) * key * 1.6f);
        sum += Hex(0xdce8ff) * (0.30f * gloss * 2 * rim * open);
    }
    return sum;
}

Colour Look(Vec2 pixel) {
    const Vec2 q = {(pixel.x - kWidth / 2.0f) / kHeight, (kHeight / 2.0f - pixel.y) / kHeight};
    const Vec3 d = Normalize({q.x, q.y - 0.06f, 1.82f});
    float t = 3;
    for (int i = 0; i < 130 && t < 16; ++i) {
        const Hit hit = Scene(kEye + d * t);
        if (hit.distance < 0.0006f * t) {
            const Vec3 p = kEye + d * t;
            const float vignette = 1 - 0.32f * Dot(q, q);
            // The backdrop is lit by a lamp of its own behind the figures.
            const float halo =
                hit.stuff == Stuff::Floor
                    ? 0.40f * Gauss(Length(q - Vec2{-0.05f, 0.10f}), 0.42f) * Clamp01(p.z * 0.5f)
                    : 0;
            return (Shade(hit, p, d) + Hex(0xe8dcc8) * halo) * vignette;
        }
        t += hit.distance * 0.9f;
    }
    return Hex(0x8fa3a0);
}

} // namespace

CCanvas DrawPortrait() {
    CCanvas canvas(kWidth, kHeight);
    canvas.Fill(Look, 2);
    canvas.Bloom(0.9f, 10, 0.15f);
    canvas.Shoulder(0.75f);
    canvas.Grain(0.6f, 21);
    return canvas;
}

} // namespace kyvsamples
