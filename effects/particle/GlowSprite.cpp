// Drawing the glow. Only basic operations decide its bytes, which are the same on every target.
#include "effects/particle/GlowSprite.h"

#include <algorithm>
#include <cmath>

namespace kyv {
namespace {

constexpr float kCoreRadius = 0.26F; // of the glow's
constexpr float kHalo = 0.55F;       // the strength of the glow round the core

// distance 0 in the centre, 1 where the glow ends.
float Brightness(float distance) {
    const float rest = std::max(0.0F, 1.0F - distance);
    const float toCore = distance / kCoreRadius;
    const float core = 1.0F / (1.0F + toCore * toCore * toCore * toCore);
    // Both end at 0 without an edge.
    return std::min(1.0F, rest * rest * (core * 1.7F + kHalo * rest));
}

} // namespace

void DrawGlow(KYVImageUtility::CImageARGB& image, int32_t size) {
    image.Create(size, size);
    const float radius = static_cast<float>(size) / 2.0F;
    for (int32_t y = 0; y < size; ++y) {
        uint8_t* pixel = image.Row(y);
        const float dy = static_cast<float>(y) + 0.5F - radius;
        for (int32_t x = 0; x < size; ++x, pixel += 4) {
            const float dx = static_cast<float>(x) + 0.5F - radius;
            const float brightness = Brightness(std::sqrt(dx * dx + dy * dy) / radius);
            std::fill_n(pixel, 3, uint8_t{255});
            pixel[3] = static_cast<uint8_t>(brightness * 255.0F);
        }
    }
}

} // namespace kyv
