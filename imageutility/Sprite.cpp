// Drawing sprites on a canvas and reading it between pixels.
#include <algorithm>
#include <cmath>

#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "platform/Truncate.h"

namespace KYVImageUtility {
namespace {

struct SpriteRect {
    int32_t x;
    int32_t y;
    int32_t w;
    int32_t h;
};

// trunc(pixels / length * spriteLength) in single precision; pixels is 0..length.
int32_t InSprite(float pixels, int32_t length, int32_t spriteLength) {
    return kyv::TruncateToInt(pixels / static_cast<float>(length) *
                              static_cast<float>(spriteLength));
}

// How far a rectangle begins outside, left of or above the canvas.
float Outside(int32_t position) {
    return -static_cast<float>(std::min(position, 0));
}

// The part of the sprite that shows in the view, when only part of the rectangle is inside. False
// when it is too small to be drawn.
bool TakeVisiblePart(CImageARGB& part, const CImageARGB& sprite, const SpriteRect& rect,
                     const CImageARGB& view) {
    if (view.GetWidth() < 3 || view.GetHeight() < 3) {
        return false;
    }
    const int32_t spriteW = sprite.GetWidth();
    const int32_t spriteH = sprite.GetHeight();
    const int32_t w = InSprite(static_cast<float>(view.GetWidth()), rect.w, spriteW);
    const int32_t h = InSprite(static_cast<float>(view.GetHeight()), rect.h, spriteH);
    if (w <= 2 || h <= 2) {
        return false;
    }
    return sprite.GetSubImage(part, InSprite(Outside(rect.x), rect.w, spriteW),
                              InSprite(Outside(rect.y), rect.h, spriteH), w, h) == 1;
}

bool IsBlendMode(int32_t mode) {
    return mode == SpriteMode_AlphaBlend || mode == SpriteMode_AddBlend ||
           mode == SpriteMode_CompositeOver || mode == SpriteMode_CompositeOpaque;
}

void BlendSprite(CImageARGB& view, const CImageARGB& image, int32_t mode, uint8_t opacity) {
    switch (mode) {
    case SpriteMode_AlphaBlend:
        view.AlphaBlend(image, opacity);
        break;
    case SpriteMode_AddBlend:
        view.AddBlend(image, opacity);
        break;
    case SpriteMode_CompositeOver:
        view.CompositeOver(image, opacity);
        break;
    case SpriteMode_CompositeOpaque:
        view.CompositeOver(image, opacity);
        view.SetAlpha(255);
        break;
    default:
        view.FillColor(255, 0, 0);
        view.SetAlpha(255);
        break;
    }
}

int32_t Between(int32_t a, int32_t b, int32_t fraction) {
    return ((a << 16) + (b - a) * fraction) >> 16;
}

} // namespace

void CImageARGB::DrawSprite(const CImageARGB& sprite, int32_t mode, float x, float y, float w,
                            float h, uint8_t opacity) {
    if (!HasPixels(*this) || !HasPixels(sprite) || std::isnan(x) || std::isnan(y) ||
        std::isnan(w) || std::isnan(h)) {
        return;
    }
    const SpriteRect rect = {kyv::TruncateToInt(x), kyv::TruncateToInt(y), kyv::TruncateToInt(w),
                             kyv::TruncateToInt(h)};
    CImageARGB view;
    if (GetSubImage(view, rect.x, rect.y, rect.w, rect.h) == 0 || !HasPixels(view)) {
        return;
    }
    view.TakeCpuLevel(*this);
    CImageARGB part;
    if (view.GetWidth() == rect.w && view.GetHeight() == rect.h) {
        sprite.GetSubImage(part, 0, 0, sprite.GetWidth(), sprite.GetHeight());
    } else if (!TakeVisiblePart(part, sprite, rect, view)) {
        return;
    }
    part.TakeCpuLevel(*this);
    CImageARGB scaled;
    scaled.Create(view.GetWidth(), view.GetHeight());
    // When nothing could be scaled, what was allocated has never been written. The sign of an
    // unknown mode needs no picture.
    if (part.TryResize(scaled, ResizeMode_Bilinear) || !IsBlendMode(mode)) {
        BlendSprite(view, scaled, mode, opacity);
    }
}

void CImageARGB::SampleBilinear(int32_t x, int32_t y, uint8_t* bgr) const {
    if (!GetBuffer()) {
        return;
    }
    const int32_t column = x >> 16;
    const int32_t row = y >> 16;
    const int32_t fx = x & 0xFFFF;
    const int32_t fy = y & 0xFFFF;
    const bool lastRow = row + 1 == GetHeight();
    const uint8_t* p00 = Row(row) + static_cast<ptrdiff_t>(column) * 4;
    const uint8_t* p10 = p00;
    const uint8_t* p01 = lastRow ? p00 : p00 + GetPitch();
    const uint8_t* p11 = p01;
    if (column + 1 != GetWidth()) {
        p10 = p00 + 4;
        // In the last row the lower right is the pixel itself too, not its right neighbour.
        // Intended.
        p11 = lastRow ? p00 : p01 + 4;
    }
    for (int c = 0; c < 3; ++c) {
        const int32_t top = Between(p00[c], p10[c], fx);
        const int32_t bottom = Between(p01[c], p11[c], fx);
        bgr[c] = static_cast<uint8_t>(Between(top, bottom, fy));
    }
}

} // namespace KYVImageUtility
