// Drawing the glow. Only basic operations decide its bytes, which are the same on every target.
#include "effects/particle/GlowSprite.h"

#include <algorithm>
#include <cmath>

namespace kyv {
namespace {

constexpr float kCoreRadius = 0.26F; // of the glow's,
constexpr float kLeastCore = 0.8F;   // and in pixels at least
constexpr float kHalo = 0.55F;       // the strength of the glow round the core

// The smallest glows are a few pixels wide, where a pixel's middle says little of it.
constexpr int kSamples = 4; // each way

// At a distance in pixels from the centre of a glow of a radius.
float Brightness(float distance, float radius) {
    const float rest = std::max(0.0F, 1.0F - distance / radius);
    const float toCore = distance / std::max(kCoreRadius * radius, kLeastCore);
    const float core = 1.0F / (1.0F + toCore * toCore * toCore * toCore);
    // Both end at 0 without an edge.
    return std::min(1.0F, rest * rest * (core * 1.7F + kHalo * rest));
}

// The mean over a pixel whose top left corner is (x, y) from the centre, in pixels.
float PixelBrightness(float x, float y, float radius) {
    float sum = 0.0F;
    for (int row = 0; row < kSamples; ++row) {
        const float dy = y + (static_cast<float>(row) + 0.5F) / kSamples;
        for (int column = 0; column < kSamples; ++column) {
            const float dx = x + (static_cast<float>(column) + 0.5F) / kSamples;
            sum += Brightness(std::sqrt(dx * dx + dy * dy), radius);
        }
    }
    return sum / (kSamples * kSamples);
}

} // namespace

void DrawGlow(KYVImageUtility::CImageARGB& image, int32_t size) {
    image.Create(size, size);
    const float centre = static_cast<float>(size) / 2.0F;
    const float radius = centre + 0.5F; // where it is nothing any more
    for (int32_t y = 0; y < size; ++y) {
        uint8_t* pixel = image.Row(y);
        for (int32_t x = 0; x < size; ++x, pixel += 4) {
            const float brightness = PixelBrightness(static_cast<float>(x) - centre,
                                                     static_cast<float>(y) - centre, radius);
            std::fill_n(pixel, 3, uint8_t{255});
            pixel[3] = static_cast<uint8_t>(brightness * 255.0F);
        }
    }
}

} // namespace kyv
