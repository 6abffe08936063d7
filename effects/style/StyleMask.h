// The part of a frame that dreamy and pencil sketch treat: a box or an ellipse with a soft rim, or
// what lies outside it.
#pragma once

#include <cstdint>

#include "imageutility/ImageUtility.h"

namespace kyv {

// A shape in fractions of the frame. It may be inverted, lie outside the frame or hold values that
// are no numbers.
struct MaskShape {
    float left = 0.0F;
    float top = 0.0F;
    float right = 0.0F;
    float bottom = 0.0F;
    bool ellipse = false;
    float depth = 0.0F; // width of the rim inside the shape, as a fraction of the shorter side
    bool outside = false;

    bool operator==(const MaskShape&) const = default;
};

// The same shape in order: left <= right, top <= bottom, numbers only, none beyond 16 frames away
// and the depth 0 to 0.4. What is not a number counts as 0.
MaskShape Normalize(const MaskShape& shape);

// Weights of 0 to 255 for every pixel, kept as long as neither the shape nor the size changes.
//
// A box's weight is the product of a rise from either pair of sides, an ellipse's depends on the
// distance from its border; both rise as a smooth step over the rim, which is never wider than half
// of the shape. Without a rim the border is as sharp as the pixels allow.
class CStyleMask {
public:
    // The shape must be a normalised one. Throws std::bad_alloc.
    void Update(const MaskShape& shape, int32_t width, int32_t height);

    // Four zeros: every pixel is inside, whatever the depth.
    bool IsWhole() const { return m_kind == Kind::Whole; }
    // Nothing is treated.
    bool IsNothing() const { return m_kind == Kind::Nothing; }
    // One byte a pixel. Only for a mask that is neither whole nor nothing.
    const uint8_t* Row(int32_t y) const { return m_weights.Row(y); }

private:
    enum class Kind { Whole, Nothing, Shape };

    void FillBox();
    void FillEllipse();

    Kind m_kind = Kind::Whole;
    bool m_bFilled = false; // the weights are those of this shape
    MaskShape m_shape;
    int32_t m_width = 0;
    int32_t m_height = 0;
    KYVImageUtility::CImageByte m_weights;
};

} // namespace kyv
