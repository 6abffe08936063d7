// Mountains behind a lake on a clear morning: a height field, seen by following each ray until it
// meets the ground or the water. Lengths are in kilometres.
#include <optional>

#include "resources/samples/Samples.h"

using namespace kyvdraw;

namespace kyvsamples {
namespace {

constexpr Vec3 kEye = {0, 0.22f, 0};
constexpr float kFocus = 980, kHorizon = 402, kReach = 34;
const Vec3 kToSun = Normalize({-0.78f, 0.52f, -0.30f});

// Sharp ridges: folded noise whose finer octaves show only where the coarse ones are high.
float Ridges(Vec2 p) {
    float sum = 0, strength = 0.6f, weight = 1;
    for (uint32_t i = 0; i < 8; ++i) {
        const float fold = 1 - std::fabs(GradientNoise(p, 100 + i));
        const float ridge = fold * fold * weight;
        sum += ridge * strength;
        weight = Clamp01(ridge * 1.7f);
        strength *= 0.42f;
        p = Rotate(p * 2.05f, 0.6f);
    }
    return sum;
}

float GroundHeight(Vec2 p) {
    const float bend = Fbm(p * 0.11f, 2, 30) * 2.2f;
    const float side = std::fabs(p.x + bend * 0.8f);
    // The lake lies in a trough that opens towards the eye and ends before the range.
    const float trough = SmoothStep(2.2f + 0.14f * p.y, 6.5f + 0.30f * p.y, side);
    const float range = SmoothStep(13.0f, 22.0f, p.y + bend);
    const float rise = std::max(trough * SmoothStep(1.5f, 8, p.y), range);
    const float peaks = Ridges(p * 0.125f + Vec2{4.3f, 7.7f});
    const float shore = Fbm(p * 0.5f, 4, 22) * 0.10f;
    return -0.16f + shore +
           rise * (0.25f + 5.9f * std::pow(peaks, 1.15f) * (0.7f + 0.5f * Fbm(p * 0.06f, 2, 35))) +
           0.22f * SmoothStep(9, 13, p.y + bend * 0.7f);
}

// The field sampled once; reading it is cheap.
class CGround {
public:
    CGround() : m_Heights(static_cast<size_t>(kCells) * kCells) {
        ForRows(kCells, [&](int j) {
            for (int i = 0; i < kCells; ++i) {
                m_Heights[Index(i, j)] = GroundHeight(
                    {(static_cast<float>(i) / kPerKm) - kSpan / 2, static_cast<float>(j) / kPerKm});
            }
        });
    }

    float Height(Vec2 p) const {
        const float x = std::clamp((p.x + kSpan / 2) * kPerKm, 0.0f, kCells - 2.001f);
        const float y = std::clamp(p.y * kPerKm, 0.0f, kCells - 2.001f);
        const int i = static_cast<int>(x), j = static_cast<int>(y);
        const float u = x - static_cast<float>(i), v = y - static_cast<float>(j);
        return Mix(Mix(m_Heights[Index(i, j)], m_Heights[Index(i + 1, j)], u),
                   Mix(m_Heights[Index(i, j + 1)], m_Heights[Index(i + 1, j + 1)], u), v);
    }

    Vec3 Normal(Vec2 p, float step) const {
        return Normalize({Height({p.x - step, p.y}) - Height({p.x + step, p.y}), 2 * step,
                          Height({p.x, p.y - step}) - Height({p.x, p.y + step})});
    }

    // The way along a ray until it is under the ground; nothing when it leaves.
    std::optional<float> Meet(Vec3 from, Vec3 d, float start) const {
        float before = start;
        for (float t = start; t < kReach;) {
            const Vec3 p = from + d * t;
            const float over = p.y - Height({p.x, p.z});
            if (over < 0) {
                for (int i = 0; i < 7; ++i) {
                    const float middle = (before + t) / 2;
                    const Vec3 q = from + d * middle;
                    (q.y < Height({q.x, q.z}) ? t : before) = middle;
                }
                return t;
            }
            if (p.y > 7.0f && d.y > 0) {
                break;
            }
            before = t;
            t += std::max(0.008f + t * 0.0012f, over * 0.30f);
        }
        return std::nullopt;
    }

    // 1 in the sun, 0 in the shadow, with a soft edge.
    float Sunlit(Vec3 p) const {
        float free = 1;
        for (float t = 0.06f; t < 7; t *= 1.22f) {
            const Vec3 q = p + kToSun * t;
            free = std::min(free, (q.y - Height({q.x, q.z})) / t * 22 + 0.5f);
            if (free <= 0) {
                return 0;
            }
        }
        return Clamp01(free);
    }

private:
    static constexpr int kCells = 2000;
    static constexpr float kSpan = 38, kPerKm = kCells / kSpan;
    static size_t Index(int i, int j) {
        return static_cast<size_t>(j) * kCells + static_cast<size_t>(i);
    }
    std::vector<float> m_Heights;
};

Colour SkyLight(Vec3 d) {
    const float height = std::max(d.y, 0.0f);
    Colour light = Mix(Hex(0xc4e0f2), Hex(0x2a6cc0), std::pow(Clamp01(height * 2.3f), 0.62f));
    light = Mix(light, Hex(0xffe6c4),
                0.5f * std::pow(Clamp01(0.35f - d.x), 2.0f) * (1 - Clamp01(height * 3)));
    // Fair-weather clouds: flat below, lit from the left.
    const float reach = 1 / (height + 0.11f);
    const Vec2 plane = {d.x * reach * 0.9f + 2.1f, reach * 0.72f + 0.4f};
    const auto body = [](Vec2 p) { return Fbm(p, 6, 200) + 0.35f * Fbm(p * 0.4f, 2, 210); };
    const float thick = body(plane);
    const float cover = SmoothStep(0.06f, 0.34f, thick) * SmoothStep(0.03f, 0.12f, height);
    const float lit = Clamp01(0.62f + (thick - body(plane + Vec2{-0.13f, 0.10f})) * 1.7f);
    return Mix(light, Mix(Hex(0x9cb0cc), Hex(0xffffff) * 1.08f, lit), cover * 0.93f);
}

Colour Haze(Colour light, float way, Vec3 d) {
    const float thin = std::exp(-way * 0.024f);
    const Colour air = Mix(Hex(0x9cc4ea), Hex(0xd8dce4), Clamp01(0.1f - d.x * 0.6f));
    return Mix(air * 0.95f, light, thin);
}

Colour GroundLight(const CGround& ground, Vec3 p, Vec3 d, float way) {
    const Vec2 place = {p.x, p.z};
    const Vec3 normal = ground.Normal(place, 0.03f);
    const float rough = Fbm(place * 5.5f, 5, 310), fine = Fbm(place * 22, 4, 320);
    const Vec3 bumpy =
        Normalize(normal + Vec3{rough * 0.35f + fine * 0.35f, 0, Fbm(place * 20, 3, 330) * 0.4f});
    const float layers = 0.5f + 0.5f * std::sin((p.y + rough * 0.12f) * 38 + p.x);
    Colour albedo = Mix(Hex(0x6a625c), Hex(0x8e8478), layers * 0.6f) * (0.85f + 0.5f * fine);
    const float grass = SmoothStep(0.60f, 0.78f, normal.y + rough * 0.12f) *
                        SmoothStep(1.7f, 0.9f, p.y + rough * 0.5f);
    albedo = Mix(albedo, Mix(Hex(0x6f8a3c), Hex(0x8a9a48), 0.5f + rough), grass);
    const float wood = SmoothStep(0.0f, 0.14f, Fbm(place * 1.6f, 4, 340) + 0.24f - p.y * 0.20f) *
                       SmoothStep(0.48f, 0.62f, normal.y) * SmoothStep(0.02f, 0.05f, p.y);
    albedo = Mix(albedo, Hex(0x2c4a2a) * (0.75f + 0.8f * std::fabs(fine)), wood);
    albedo = Mix(albedo, Hex(0xb8ac90), SmoothStep(0.035f, 0.012f, p.y));
    const float snow = SmoothStep(0.42f, 0.58f, normal.y + rough * 0.2f) *
                       SmoothStep(1.5f, 2.3f, p.y + rough * 0.8f);
    albedo = Mix(albedo, Hex(0xf6f9ff), snow);

    const float sun = std::max(0.0f, Dot(bumpy, kToSun)) * ground.Sunlit(p);
    const float sky = 0.5f + 0.5f * bumpy.y;
    const Colour light =
        Hex(0xffe8c4) * (2.1f * sun) + Hex(0x86aee6) * (0.42f * sky) + Hex(0x8a7a60) * 0.07f;
    return Haze(albedo * light, way, d);
}

Colour SceneLight(const CGround& ground, Vec3 from, Vec3 d, float start) {
    if (const std::optional<float> way = ground.Meet(from, d, start)) {
        return GroundLight(ground, from + d * *way, d, *way);
    }
    return SkyLight(d);
}

Colour WaterLight(const CGround& ground, Vec3 d, float way) {
    const Vec3 p = kEye + d * way;
    const float calm = 1 / (1 + way * 0.55f);
    const Vec2 q = {p.x * 7, p.z * 11};
    const float breeze = 0.4f + SmoothStep(-0.1f, 0.25f, Fbm(Vec2{p.x * 0.5f, p.z * 0.9f}, 3, 410));
    const Vec2 slope = Vec2{Fbm(q, 4, 400), Fbm(q + Vec2{9, 4}, 4, 405)} * (0.05f * calm * breeze);
    const Vec3 normal = Normalize({-slope.x, 1, -slope.y});
    Vec3 mirrored = d - normal * (2 * Dot(d, normal));
    mirrored.y = std::fabs(mirrored.y) + 1e-4f;
    const float fresnel = 0.04f + 0.96f * std::pow(1 - Clamp01(-Dot(d, normal)), 3.6f);
    const float shallow = SmoothStep(-0.14f, 0.0f, ground.Height({p.x, p.z}));
    const Colour body = Mix(Hex(0x0f4858), Hex(0x3f8a80), shallow) * 0.8f;
    const Colour image = SceneLight(ground, {p.x, 0.002f, p.z}, Normalize(mirrored), 0.03f);
    return Mix(body, image * 0.92f, 0.12f + 0.88f * fresnel);
}

Colour Look(const CGround& ground, Vec2 pixel) {
    const Vec3 d = Normalize({pixel.x - kWidth / 2.0f, kHorizon - pixel.y, kFocus});
    const std::optional<float> way = ground.Meet(kEye, d, 0.3f);
    const float water = d.y < 0 ? kEye.y / -d.y : kReach;
    if (water < kReach && (!way || water < *way)) {
        return Haze(WaterLight(ground, d, water), water * 0.5f, d);
    }
    return way ? GroundLight(ground, kEye + d * *way, d, *way) : SkyLight(d);
}

// A spruce: whorls of hanging boughs, each with a bright upper and a dark lower side.
void DrawSpruce(CCanvas& canvas, CScatter& scatter, Vec2 foot, float height) {
    canvas.Stroke(foot, foot - Vec2{0, height * 0.97f}, height * 0.028f, 1, Hex(0x2c2018));
    const int whorls = static_cast<int>(height / 5.2f);
    for (int i = whorls; i >= 0; --i) {
        const float t = static_cast<float>(i) / static_cast<float>(whorls);
        const float y = foot.y - height * (1 - t * 0.9f);
        const float reach = height * 0.19f * std::pow(t, 0.82f) + 2;
        const int boughs = 7 + static_cast<int>(t * 10);
        for (int k = 0; k < boughs; ++k) {
            const float side = scatter.Between(-1, 1);
            const float length = reach * scatter.Between(0.65f, 1.1f);
            const Vec2 root = {foot.x + side * length * 0.1f, y - height * 0.012f};
            const Vec2 tip = {foot.x + side * length,
                              y + height * (0.035f + 0.035f * (1 - std::fabs(side))) * (0.4f + t)};
            const Vec2 bend = {(root.x + tip.x) / 2, y - height * 0.006f};
            // The sun stands on the left.
            const float light = Clamp01(0.5f - side * 0.55f) * scatter.Between(0.4f, 1);
            canvas.Blade(root, bend, tip, std::max(1.6f, height * 0.015f), Hex(0x0f2018),
                         Mix(Hex(0x1c3a26), Hex(0x8aa048), light * light));
        }
    }
}

// The near bank with grass and flowers, from the lower edge up to the line of Bank(x).
float Bank(float x) {
    const float left = SmoothStep(560, 0, x), right = SmoothStep(820, kWidth, x);
    return 712 - 92 * left - 66 * right - 9 * Fbm(Vec2{x * 0.012f, 0}, 3, 500);
}

void DrawMeadow(CCanvas& canvas) {
    canvas.Layer([](Vec2 p) -> Paint {
        return {Hex(0x2e4020) * (0.8f + 0.4f * Fbm(p * 0.06f, 3, 510)),
                p.y > Bank(p.x) ? 1.0f : 0.0f};
    });
    CScatter scatter(61);
    for (int row = 0; row < 62; ++row) {
        for (int i = 0; i < 520; ++i) {
            const float x = scatter.Between(-10, kWidth + 10), down = static_cast<float>(row) * 2;
            const Vec2 root = {x, Bank(x) + down + scatter.Between(-1, 2)};
            if (root.y > kHeight + 30) {
                continue;
            }
            const float tall = scatter.Between(8, 17) + down * 0.24f;
            const float lean = scatter.Bell() * 3.5f + 3 + 4 * GradientNoise(root * 0.012f, 520);
            const Colour tip = Mix(Hex(0x86a038), Hex(0xd8d878), scatter.Next() * scatter.Next());
            canvas.Blade(root, root + Vec2{lean * 0.2f, -tall * 0.6f}, root + Vec2{lean, -tall},
                         1.5f + down * 0.012f, Hex(0x2a3f18), tip * scatter.Between(0.55f, 1.05f));
        }
        for (int i = 0; i < 9; ++i) {
            const float x = scatter.Between(0, kWidth), down = static_cast<float>(row) * 2;
            const Vec2 head = {x, Bank(x) + down - scatter.Between(9, 20) - down * 0.2f};
            const float patch = GradientNoise(Vec2{x * 0.007f, down * 0.02f}, 530);
            if (head.y > kHeight || patch < -0.1f) {
                continue;
            }
            const std::array<Colour, 4> tints = {Hex(0xf4f0ff), Hex(0xf4c430), Hex(0xc85ac0),
                                                 Hex(0xe84838)};
            const Colour tint = tints[Hash(row, i, 540) % 4] * 0.95f;
            const float size = 1.5f + down * 0.016f + scatter.Next();
            for (int petal = 0; petal < 5; ++petal) {
                const Vec2 out = Rotate({size, 0}, static_cast<float>(petal) * 1.2566f + patch);
                canvas.Stroke(head, head + Vec2{out.x, out.y * 0.7f}, size * 0.9f, size, tint);
            }
            canvas.Stroke(head, head, size * 0.8f, size * 0.8f, Hex(0xf0b020) * 0.9f);
        }
    }
}

} // namespace

CCanvas DrawLandscape() {
    CCanvas canvas(kWidth, kHeight);
    const CGround ground;
    canvas.Fill([&](Vec2 p) { return Look(ground, p); }, 2);
    CScatter scatter(11);
    for (const auto& [x, height] : {std::pair{118.0f, 250.0f},
                                    {236.0f, 190.0f},
                                    {176.0f, 330.0f},
                                    {18.0f, 420.0f},
                                    {78.0f, 510.0f},
                                    {1122.0f, 230.0f},
                                    {1172.0f, 320.0f},
                                    {1258.0f, 440.0f}}) {
        DrawSpruce(canvas, scatter, {x, Bank(x) + 6}, height);
    }
    DrawMeadow(canvas);
    canvas.Bloom(0.9f, 18, 0.12f);
    canvas.Shoulder(0.72f);
    return canvas;
}

} // namespace kyvsamples
