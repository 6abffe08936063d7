// Writes pictures: PNG, and the uncompressed bitmaps that a resource compiler embeds.
// Every function throws std::runtime_error when the file cannot be written.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "resources/drawing/Canvas.h"

namespace kyvdraw {

// Straight-alpha bytes R, G, B, A, rows top down, no padding.
struct Sprite {
    int width = 0, height = 0;
    std::vector<uint8_t> bytes;
};

// Shades a sprite: shade(Vec2) -> Paint in pixels, samples x samples values a pixel.
template <class Shade>
Sprite ShadeSprite(int width, int height, Shade shade, int samples = 4) {
    Sprite sprite{width, height, {}};
    const auto byte = [](float x) { return static_cast<uint8_t>(Clamp01(x) * 255 + 0.5f); };
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) {
            Colour weighted, plain;
            float alpha = 0;
            for (int i = 0; i < samples * samples; ++i) {
                const float step = 1.0f / static_cast<float>(samples);
                const Paint paint = shade(
                    Vec2{static_cast<float>(x) + (static_cast<float>(i % samples) + 0.5f) * step,
                         static_cast<float>(y) + (static_cast<float>(i / samples) + 0.5f) * step});
                weighted += paint.colour * paint.alpha;
                plain += paint.colour;
                alpha += paint.alpha;
            }
            const float count = static_cast<float>(samples * samples);
            // Where nothing is drawn the colour of the surroundings is kept, so that scaling the
            // sprite brings no dark seam.
            const Colour colour = alpha > 1e-4f ? weighted * (1 / alpha) : plain * (1 / count);
            sprite.bytes.insert(sprite.bytes.end(),
                                {byte(ToEncoded(colour.r)), byte(ToEncoded(colour.g)),
                                 byte(ToEncoded(colour.b)), byte(alpha / count)});
        }
    }
    return sprite;
}

void WritePng(const std::string& path, const CCanvas& canvas);
void WritePng(const std::string& path, const Sprite& sprite);

// 32 bits a pixel, B, G, R, A, bottom up.
void WriteBmp32(const std::string& path, const Sprite& sprite);
// 8 bits a pixel, bottom up: indices top down, and the grey level of each palette entry.
void WriteBmp8(const std::string& path, int width, int height, const std::vector<uint8_t>& indices,
               const std::vector<uint8_t>& greys);

} // namespace kyvdraw
