// A town on a river by night: what stands on the bank is drawn first and then mirrored.
#include "resources/samples/Samples.h"

using namespace kyvdraw;

namespace kyvsamples {
namespace {

constexpr int kBank = 470;

Colour NightSky(Vec2 p) {
    const static std::array<std::pair<float, Colour>, 4> kSky = {{{0.0f, Hex(0x5a4668)},
                                                                  {0.25f, Hex(0x2c3060)},
                                                                  {0.6f, Hex(0x121c44)},
                                                                  {1.0f, Hex(0x080e28)}}};
    Colour light = Gradient(kSky, (kBank - p.y) / kBank);
    const float haze = SmoothStep(0.0f, 0.5f, Fbm(Vec2{p.x * 0.004f, p.y * 0.011f}, 5, 4));
    light += Hex(0x6a5478) * (0.35f * haze * SmoothStep(0, 300, p.y));
    // The moon, with its plains.
    const Vec2 m = (p - Vec2{1010, 118}) * (1 / 40.0f);
    const float off = Length(m);
    const float plains = 0.78f + 0.35f * Fbm(m * 1.7f, 4, 6);
    light = Mix(light, Hex(0xfff2d8) * (1.05f * plains), SmoothStep(1.02f, 0.98f, off));
    return light + Hex(0x8090c8) * (0.32f * std::exp(-off * 0.55f));
}

void DrawStars(CCanvas& canvas) {
    CScatter scatter(14);
    for (int i = 0; i < 420; ++i) {
        const float high = scatter.Next();
        const Vec2 place = {scatter.Between(0, kWidth), 330 * high * high};
        if (Length(place - Vec2{1010, 118}) < 75) {
            continue;
        }
        const float power = std::pow(scatter.Next(), 6.0f);
        const Colour tint = Mix(Hex(0xa8c0ff), Hex(0xffe0b8), scatter.Next());
        canvas.AddGlow(place, 0.55f + power * 0.5f, tint * (0.18f + power * 0.9f));
    }
}

// One house from the ground up, with lit windows in a grid.
void DrawTower(CCanvas& canvas, CScatter& scatter, float left, float width, float height,
               Colour wall, float lit, float brightness) {
    const float top = kBank - height, pitchX = scatter.Between(5, 8),
                pitchY = scatter.Between(6, 10);
    const uint32_t seed = static_cast<uint32_t>(scatter.Next() * 65536);
    const float crown = scatter.Next(), step = width * 0.18f;
    const bool cold = scatter.Next() < 0.3f, bands = scatter.Next() < 0.25f;
    canvas.Layer(
        [&](Vec2 p) -> Paint {
            const float x = p.x - left, y = p.y - top;
            const float inset = crown < 0.35f && y < height * 0.16f ? step : 0;
            if (x < inset || x > width - inset || y < 0 || p.y > kBank) {
                return {};
            }
            Colour colour = wall * (0.75f + 0.5f * x / width) * (0.8f + 0.4f * y / height);
            const float u = (x - 3) / pitchX, v = (y - 5) / pitchY;
            const int32_t i = static_cast<int32_t>(std::floor(u)),
                          j = static_cast<int32_t>(std::floor(v));
            const bool pane = u > 0 && x < width - 3 && v > 0 &&
                              Fract(u) < (bands ? 0.92f : 0.62f) && Fract(v) < 0.55f &&
                              y < height - 9;
            // Neighbours on a floor are often lit together.
            const float chance = 0.6f * Hash01(i, j, seed) + 0.4f * Hash01(i / 4, j, seed + 1);
            if (pane && chance < lit) {
                const Colour lamp = Mix(cold ? Hex(0xcfe4ff) : Hex(0xffc878), Hex(0xffe8c0),
                                        Hash01(i, j, seed + 2));
                colour = lamp * (brightness * (0.35f + 0.85f * Hash01(i, j, seed + 3)));
            } else if (pane) {
                colour = colour * 0.55f + Hex(0x1a2448) * 0.25f;
            }
            return {colour, 1};
        },
        2);
    if (crown > 0.72f) {
        const Vec2 tip = {left + width / 2, top - scatter.Between(18, 46)};
        canvas.Stroke({tip.x, top}, tip, 3, 1, wall * 1.2f);
        canvas.AddGlow(tip, 1.8f, Hex(0xff3020) * 2.2f);
        canvas.AddGlow(tip, 7, Hex(0xff3020) * 0.14f);
    } else if (crown > 0.55f) {
        // A crown of light round the roof.
        canvas.Stroke({left + 1, top + 1}, {left + width - 1, top + 1}, 2, 2, Hex(0x60d8ff) * 1.1f,
                      0.8f);
    }
}

void DrawTown(CCanvas& canvas) {
    struct Row {
        float low, high, minWidth, maxWidth;
        Colour wall;
        float lit, brightness;
    };
    CScatter scatter(77);
    for (const Row& row : {Row{60, 170, 18, 40, Hex(0x39386a), 0.30f, 0.30f},
                           Row{70, 265, 30, 62, Hex(0x1f2450), 0.36f, 0.62f},
                           Row{28, 150, 38, 84, Hex(0x11152f), 0.42f, 1.0f}}) {
        for (float x = -20; x < kWidth;) {
            const float width = scatter.Between(row.minWidth, row.maxWidth);
            // The centre of the town is left of the middle.
            const float centre = Gauss(x + width / 2 - 470, 250), rise = scatter.Next();
            const float height = Mix(row.low, row.high, rise * (0.25f + 0.75f * centre));
            DrawTower(canvas, scatter, std::floor(x), std::floor(width), std::floor(height),
                      row.wall, row.lit, row.brightness);
            x += width + scatter.Between(-3, 9);
        }
    }
}

// A cable bridge on the right, lit along its deck and cables.
void DrawBridge(CCanvas& canvas) {
    constexpr float kDeck = 428;
    const Colour steel = Hex(0x2a2440), warm = Hex(0xffb860);
    canvas.Layer([&](Vec2 p) -> Paint {
        if (p.x < 742) {
            return {};
        }
        const bool deck = p.y > kDeck && p.y < kDeck + 9;
        const float arch = Fract((p.x - 742) / 92) - 0.5f;
        const bool pier = p.y >= kDeck + 9 && p.y < kBank && std::fabs(arch) < 0.06f;
        return {steel * (deck ? 1.3f : 0.8f), deck || pier ? 1.0f : 0.0f};
    });
    for (const float x : {872.0f, 1148.0f}) {
        for (const float side : {-7.0f, 7.0f}) {
            canvas.Stroke({x + side * 1.3f, kBank}, {x + side * 0.6f, 250}, 6, 4,
                          Hex(0x9c6c58) * 0.8f);
        }
        for (float y = 270; y < 420; y += 38) {
            canvas.Stroke({x - 7, y}, {x + 7, y}, 4, 4, Hex(0x9c6c58) * 0.8f);
        }
        canvas.AddGlow({x, 248}, 1.6f, Hex(0xff4030) * 2.0f);
        canvas.AddGlow({x, 440}, 26, warm * 0.25f);
        for (int i = 1; i <= 11; ++i) {
            const float out = static_cast<float>(i) * 12.2f, high = 256 + static_cast<float>(i) * 3;
            for (const float side : {-1.0f, 1.0f}) {
                canvas.Stroke({x, high}, {x + side * out, kDeck}, 1.1f, 1.1f, Hex(0xe8c0a0) * 0.5f,
                              0.8f);
            }
        }
    }
    for (float x = 752; x < kWidth; x += 23) {
        canvas.AddGlow({x, kDeck - 5}, 1.5f, warm * 2.4f);
        canvas.AddGlow({x, kDeck - 3}, 8, warm * 0.16f);
    }
}

// Trees and lamps along the bank, in front of the houses.
void DrawQuay(CCanvas& canvas) {
    CScatter scatter(5);
    canvas.Layer([](Vec2 p) -> Paint {
        const float trees = 9 + 11 * std::fabs(GradientNoise(Vec2{p.x * 0.03f, 0}, 2)) +
                            3 * GradientNoise(Vec2{p.x * 0.3f, 0}, 3);
        return {Hex(0x0a1020), p.y > kBank - trees && p.y <= kBank ? 1.0f : 0.0f};
    });
    canvas.Layer([](Vec2 p) -> Paint {
        return {Hex(0x3a3040), p.y > kBank - 5 && p.y <= kBank ? 1.0f : 0.0f};
    });
    for (float x = 12; x < 740; x += scatter.Between(26, 34)) {
        const Colour lamp = Mix(Hex(0xffb050), Hex(0xffd890), scatter.Next());
        canvas.Stroke({x, kBank}, {x, kBank - 17}, 1.4f, 1, Hex(0x181420));
        canvas.AddGlow({x, kBank - 18}, 1.7f, lamp * 3);
        canvas.AddGlow({x, kBank - 16}, 11, lamp * 0.22f);
    }
}

// The river: every place shows the bank above it, shifted by waves that spread it upwards and
// downwards more the nearer they are.
void DrawRiver(CCanvas& canvas) {
    const CCanvas above = canvas;
    ForRows(kHeight - kBank, [&](int row) {
        const int y = kBank + row;
        const float depth = static_cast<float>(row) + 0.5f;
        const float zoom = 60 / (depth + 26);
        for (int x = 0; x < kWidth; ++x) {
            Colour sum;
            constexpr int kSamples = 14;
            for (int i = 0; i < kSamples; ++i) {
                const float jitter = (static_cast<float>(i) + Hash01(x, y, 31)) / kSamples - 0.5f;
                const Vec2 wave = {(static_cast<float>(x) - 640) * zoom * 0.045f,
                                   30 * zoom + jitter * 0.4f};
                const float lift = Fbm(wave, 3, 90), side = Fbm(wave + Vec2{50, 0}, 2, 95);
                const float back = kBank - 1 - depth * 1.35f - lift * (6 + depth * 0.75f) -
                                   jitter * (8 + depth * 0.55f);
                const int sx = std::clamp(
                    x + static_cast<int>(std::lround(side * (1 + depth * 0.10f))), 0, kWidth - 1);
                sum += above.At(sx, std::clamp(static_cast<int>(back), 0, kBank - 1));
            }
            const float dim = Mix(0.72f, 0.42f, depth / (kHeight - kBank));
            canvas.At(x, y) = sum * (dim / kSamples) * Colour{0.85f, 0.95f, 1.05f} + Hex(0x04081a);
        }
    });
}

// A boat with lanterns under way.
void DrawBarge(CCanvas& canvas) {
    const Vec2 at = {392, 588};
    canvas.Layer(
        [&](Vec2 p) -> Paint {
            const Vec2 q = p - at;
            const float bow = 118 + q.y * -0.9f;
            const bool hull =
                q.y > -9 && q.y < 14 && q.x > -112 + std::max(0.0f, q.y) && q.x < bow - 8;
            const bool cabin = q.y > -34 && q.y <= -9 && q.x > -86 && q.x < 52;
            const bool roof = q.y > -38 && q.y <= -34 && q.x > -93 && q.x < 60;
            if (hull) {
                return {q.y < -6 ? Hex(0xb08a60) * 0.5f : Hex(0x14101c), 1};
            }
            if (roof) {
                return {Hex(0x281e2c), 1};
            }
            if (cabin) {
                const float pane = Fract((q.x + 86) / 17.25f);
                const bool glass = pane > 0.16f && pane < 0.84f && q.y > -29 && q.y < -14;
                return {glass ? Hex(0xffb858) * 1.25f : Hex(0x4a2c22), 1};
            }
            return {};
        },
        3);
    for (int i = 0; i < 9; ++i) {
        const float t = static_cast<float>(i) / 8;
        const Vec2 lantern = at + Vec2{Mix(-90, 112, t), -52 + 12 * std::sin(t * kPi) + 22 * t * t};
        canvas.AddGlow(lantern, 1.8f, Mix(Hex(0xff7048), Hex(0xffd060), Fract(t * 4)) * 2.6f);
        canvas.AddGlow(lantern, 9, Hex(0xff9040) * 0.14f);
    }
    CScatter scatter(40);
    for (float depth = 0; depth < 70; depth += 1.6f) {
        const float fade = (1 - depth / 70) * (1 - depth / 70);
        for (int i = 0; i < 7; ++i) {
            const float x =
                at.x - 76 + static_cast<float>(i) * 19.5f + scatter.Bell() * (2 + depth * 0.07f);
            const float y = at.y + 16 + depth;
            canvas.Stroke({x - 5, y}, {x + 5, y}, 1.6f, 1.2f, Hex(0xffa040) * 1.1f,
                          fade * scatter.Between(0.2f, 0.7f));
        }
    }
}

} // namespace

CCanvas DrawNight() {
    CCanvas canvas(kWidth, kHeight);
    canvas.Fill(NightSky, 2);
    DrawStars(canvas);
    DrawTown(canvas);
    DrawBridge(canvas);
    DrawQuay(canvas);
    DrawRiver(canvas);
    DrawBarge(canvas);
    canvas.Bloom(0.6f, 4, 0.5f);
    canvas.Bloom(0.7f, 26, 0.35f);
    canvas.Shoulder(0.7f);
    canvas.Grain(0.7f, 8);
    return canvas;
}

} // namespace kyvsamples
