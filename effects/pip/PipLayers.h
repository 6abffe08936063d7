// The layers of the picture-in-picture: work images of the frame's size whose alpha marks what is
// covered, and the passes over them.
//
// A layer is clear outside the part in use, so every pass and every blend touches that part alone.
#pragma once

#include <algorithm>
#include <cstdint>
#include <vector>

#include "effects/pip/ColorKeyPass.h"
#include "effects/pip/Rasterizer.h"
#include "imageutility/ImageUtility.h"
#include "imageutility/kernels/AlphaBlend.h"

namespace kyv {

// A rectangle of pixels; the right column and the bottom row are not part of it.
struct PixelBox {
    int32_t left;
    int32_t top;
    int32_t right;
    int32_t bottom;

    bool IsEmpty() const { return left >= right || top >= bottom; }
    int32_t Width() const { return right - left; }
    int32_t Height() const { return bottom - top; }
    PixelBox Grown(int32_t by) const { return {left - by, top - by, right + by, bottom + by}; }
    PixelBox Moved(int32_t dx, int32_t dy) const {
        return {left + dx, top + dy, right + dx, bottom + dy};
    }
    // Empty where the two do not meet.
    PixelBox CutTo(const PixelBox& other) const {
        return {std::max(left, other.left), std::max(top, other.top), std::min(right, other.right),
                std::min(bottom, other.bottom)};
    }
};

// B, G and R of an ARGB frame, V, U and Y of an AYUV frame.
struct LayerColor {
    uint8_t channel[3];

    uint32_t Opaque() const {
        return 0xFF000000U | static_cast<uint32_t>(channel[2]) << 16 |
               static_cast<uint32_t>(channel[1]) << 8 | channel[0];
    }
    bool operator==(const LayerColor&) const = default;
};

// Transparent black. Zeros in an AYUV layer would be a green that a blur draws into every rim; the
// picture starts from zeros all the same, and so does what it takes out of the border.
constexpr uint32_t TransparentBlack(bool ayuv) {
    return ayuv ? 0x00108080 : 0;
}

class CPipLayer {
public:
    // Gives the layer the form of a frame and fills it with what is clear. Throws std::bad_alloc.
    void Reset(const KYVImageUtility::CImageARGB& frame, bool ayuv, uint32_t clear);
    // True when the layer has that form already and shows nothing but what has been drawn since it
    // was cleared: to draw at the same places again then needs no clearing before.
    bool Fits(const KYVImageUtility::CImageARGB& frame, bool ayuv) const;
    // The places have changed without a drawing, or what is not covered is no longer clear.
    void Outdate() { m_bFresh = false; }

    KYVImageUtility::CImageARGB& Image() { return m_image; }
    PixelBox Frame() const { return {0, 0, m_image.GetWidth(), m_image.GetHeight()}; }

    // The part that may not be clear; what is drawn goes into it.
    const PixelBox& Used() const { return m_used; }
    void Use(const PixelBox& box) { m_used = box.CutTo(Frame()); }

    // Zeros all four bytes wherever another layer is covered.
    void ClearUnder(const CPipLayer& layer) { Stamp(layer, 0, 0, 0); }

    // Writes a pixel wherever another layer, moved by (dx, dy), is covered. Only what falls into
    // the part in use is written.
    void Stamp(const CPipLayer& layer, int32_t dx, int32_t dy, uint32_t pixel);

    // Recolours what is covered between two colours. `direction` names the side or corner of the
    // rectangle where the second one lies: 0 up, 1 down, 2 left, 3 right, 4 upper left, 5 upper
    // right, 6 lower left, 7 lower right; any other value is up. The rectangle's right and bottom
    // count as inside here; one without width or height keeps the first colour.
    void Gradient(const PixelBox& rectangle, int32_t direction, const LayerColor& first,
                  const LayerColor& second);

    // Keys a colour out of the part in use. An AYUV layer is converted for it and back.
    void ColorKey(const PictureKey& key);

    // The box blur of all four channels over the frame, worked out where it can be anything but
    // clear. `content` is the part within which pixels are covered.
    void Blur(const PixelBox& content, int32_t radius);

    // Blends a row of the part in use over the same row of a frame.
    void BlendRow(uint8_t* frameRow, int32_t y, uint8_t opacity) const;

private:
    KYVImageUtility::CImageARGB m_image;
    bool m_bAyuv = false;
    bool m_bFresh = false;
    AlphaBlendRow m_pBlendRow = nullptr;
    PixelBox m_used = {};
    std::vector<float> m_columns; // of gradients
};

// Draws the border of a quad with corners A, B, C, D: a band of `size` pixels about every side,
// wedges on the outer side of every corner and discs that round it. Below level 3 through the
// rasterizer's callback. Drawn is what falls into the part in use.
void DrawBorder(CPipLayer& layer, const RasterPoint (&quad)[4], int32_t size, uint32_t pixel);

} // namespace kyv
