// The two wipe masks. A continuous field gives each pixel its turn; the turns are then ranked, so
// that every level covers the same area and equal steps of the percentage uncover equal areas.
#include <algorithm>
#include <numeric>

#include "resources/generator/Art.h"

using namespace kyvdraw;

namespace kyvart {
namespace {

// 255 is left out: with a smoothness of 0 the wipe tests against 255 last of all and a pixel of
// that level would keep the old picture at the end.
constexpr int kHighestGrey = 254;

template <class Field>
std::vector<uint8_t> RankedLevels(Field field, int levels) {
    constexpr size_t kCount = static_cast<size_t>(kMaskWidth) * kMaskHeight;
    std::vector<float> turn(kCount);
    ForRows(kMaskHeight, [&](int y) {
        for (int x = 0; x < kMaskWidth; ++x) {
            turn[static_cast<size_t>(y * kMaskWidth + x)] =
                field(Vec2{static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f});
        }
    });
    std::vector<uint32_t> order(kCount);
    std::iota(order.begin(), order.end(), 0u);
    std::stable_sort(order.begin(), order.end(),
                     [&](uint32_t a, uint32_t b) { return turn[a] < turn[b]; });
    std::vector<uint8_t> indices(kCount);
    for (size_t rank = 0; rank < kCount; ++rank) {
        indices[order[rank]] = static_cast<uint8_t>(rank * static_cast<size_t>(levels) / kCount);
    }
    return indices;
}

} // namespace

// Ink let into water: three blots bloom at different moments, run into each other with feathered,
// curling edges and fill the frame.
WipeMask DrawInkMask() {
    constexpr int kLevels = 133;
    struct Blot {
        Vec2 centre;
        float delay;
    };
    const auto field = [](Vec2 pixel) {
        constexpr Blot kBlots[] = {{{0.42f, 0.40f}, 0.0f},
                                   {{1.02f, 0.62f}, 0.10f},
                                   {{0.30f, 0.86f}, 0.20f},
                                   {{1.15f, 0.12f}, 0.22f}};
        const Vec2 p = pixel * (1.0f / kMaskHeight);
        const Vec2 drift = {Fbm(p * 2.3f, 4, 3), Fbm(p * 2.3f + Vec2{7, 2}, 4, 4)};
        const Vec2 curl = {Fbm(p * 4.5f + drift * 1.8f, 4, 5), Fbm(p * 4.5f + drift * 1.8f, 4, 6)};
        const Vec2 q = p + drift * 0.16f + curl * 0.085f;
        float turn = 9;
        for (const Blot& blot : kBlots) {
            turn = SmoothMin(turn, Length(q - blot.centre) + blot.delay, 0.08f);
        }
        return turn + 0.075f * Fbm(q * 6.0f + curl * 1.5f, 4, 9);
    };
    WipeMask mask{RankedLevels(field, kLevels), {}};
    for (int i = 0; i < kLevels; ++i) {
        mask.greys.push_back(
            static_cast<uint8_t>((i * kHighestGrey + (kLevels - 1) / 2) / (kLevels - 1)));
    }
    return mask;
}

// A field of rounded diamonds that grow from points until they close, in a soft wave from the
// upper left to the lower right. Cells are square on a 16:9 frame.
WipeMask DrawDiamondMask() {
    const auto field = [](Vec2 pixel) {
        const Vec2 p = {pixel.x / kMaskWidth * 16, pixel.y / kMaskHeight * 9};
        constexpr float kCell = 1.6f;
        const auto turnOf = [&](int i, int j, float shift) {
            const Vec2 centre = {(static_cast<float>(i) + shift) * kCell,
                                 (static_cast<float>(j) + shift) * kCell};
            const float ripple = 0.25f * GradientNoise(centre * 0.35f, 21);
            const float delay = (centre.x * 0.75f + centre.y * 0.9f) / 5.2f + ripple;
            const Vec2 d = p - centre;
            const float round = std::pow(std::pow(std::fabs(d.x) / kCell, 1.3f) +
                                             std::pow(std::fabs(d.y) / kCell, 1.3f),
                                         1 / 1.3f);
            return delay + round * 2.1f;
        };
        float turn = 99;
        const int i0 = static_cast<int>(std::floor(p.x / kCell));
        const int j0 = static_cast<int>(std::floor(p.y / kCell));
        for (int j = j0 - 2; j <= j0 + 2; ++j) {
            for (int i = i0 - 2; i <= i0 + 2; ++i) {
                turn = std::min({turn, turnOf(i, j, 0.0f), turnOf(i, j, 0.5f)});
            }
        }
        return turn;
    };
    WipeMask mask{RankedLevels(field, kHighestGrey + 1), {}};
    for (int i = 0; i < 256; ++i) {
        mask.greys.push_back(static_cast<uint8_t>(i));
    }
    return mask;
}

} // namespace kyvart
