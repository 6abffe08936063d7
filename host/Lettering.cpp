// Text on pictures, from the outlines of the embedded font.
#include "host/Lettering.h"

#include <cmath>
#include <stdexcept>
#include <vector>

#include <stb/stb_truetype.h>

#include "host/Hosting.h"
#include "hosting/Text.h"

extern "C" const unsigned char kyvhost_font[]; // Font.S

namespace kyvhost {
namespace {

const stbtt_fontinfo& Font() {
    static const stbtt_fontinfo font = [] {
        stbtt_fontinfo info;
        if (!stbtt_InitFont(&info, kyvhost_font, 0)) {
            throw std::runtime_error("the font is broken");
        }
        return info;
    }();
    return font;
}

// Calls visit(code point, x in pixels) for every letter and gives the width of all.
template <class Visit>
double WalkText(std::string_view text, double size, Visit&& visit) {
    const double scale = stbtt_ScaleForPixelHeight(&Font(), static_cast<float>(size));
    const std::u32string letters = PathOf(text).u32string();
    double x = 0;
    for (size_t i = 0; i < letters.size(); ++i) {
        const auto letter = static_cast<int>(letters[i]);
        visit(letter, x);
        int advance = 0, bearing = 0;
        stbtt_GetCodepointHMetrics(&Font(), letter, &advance, &bearing);
        const int next = i + 1 < letters.size() ? static_cast<int>(letters[i + 1]) : 0;
        x += scale * (advance + (next ? stbtt_GetCodepointKernAdvance(&Font(), letter, next) : 0));
    }
    return x;
}

void Blend(uint8_t* pixel, uint32_t color, uint32_t coverage) {
    for (int i = 0; i < 3; ++i) {
        const uint32_t channel = color >> (8 * i) & 0xFF;
        pixel[i] =
            static_cast<uint8_t>((channel * coverage + pixel[i] * (255 - coverage) + 127) / 255);
    }
    pixel[3] = 255;
}

} // namespace

double TextWidth(std::string_view text, double size) {
    return WalkText(text, size, [](int, double) {});
}

void DrawText(Picture& picture, double x, double y, double size, uint32_t color,
              std::string_view text) {
    const float scale = stbtt_ScaleForPixelHeight(&Font(), static_cast<float>(size));
    std::vector<uint8_t> coverage;
    WalkText(text, size, [&](int letter, double offset) {
        const double left = x + offset;
        const auto shift = static_cast<float>(left - std::floor(left));
        int x0 = 0, y0 = 0, x1 = 0, y1 = 0;
        stbtt_GetCodepointBitmapBoxSubpixel(&Font(), letter, scale, scale, shift, 0, &x0, &y0, &x1,
                                            &y1);
        const int width = x1 - x0, height = y1 - y0;
        if (width <= 0 || height <= 0) {
            return;
        }
        coverage.assign(static_cast<size_t>(width) * height, 0);
        stbtt_MakeCodepointBitmapSubpixel(&Font(), coverage.data(), width, height, width, scale,
                                          scale, shift, 0, letter);
        for (int row = 0; row < height; ++row) {
            const int64_t py = std::lround(y) + y0 + row;
            for (int column = 0; column < width; ++column) {
                const int64_t px = static_cast<int64_t>(std::floor(left)) + x0 + column;
                if (px >= 0 && py >= 0 && px < picture.width && py < picture.height) {
                    Blend(&picture.pixels[(static_cast<size_t>(py) * picture.width + px) * 4],
                          color, coverage[static_cast<size_t>(row) * width + column]);
                }
            }
        }
    });
}

} // namespace kyvhost
