// Edges, relief and the arithmetic of byte images.
#include <algorithm>
#include <array>
#include <cstring>

#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "imageutility/kernels/ColorMath.h"

namespace KYVImageUtility {
namespace {

bool IsPacked(const CImageByte& image) {
    return image.GetPitch() == image.GetWidth();
}

// The sum of three bytes, step apart.
int32_t SumOfThree(const uint8_t* middle, ptrdiff_t step) {
    return middle[-step] + middle[0] + middle[step];
}

int32_t LumaAt(const CImageARGB& image, int32_t x, int32_t y) {
    x = std::clamp(x, 0, image.GetWidth() - 1);
    y = std::clamp(y, 0, image.GetHeight() - 1);
    const uint8_t* pixel = image.Row(y) + static_cast<ptrdiff_t>(x) * 4;
    return kyv::LumaOf(pixel[2], pixel[1], pixel[0]);
}

} // namespace

void CImageByte::EdgeMask(CImageByte& destination, int32_t threshold, uint8_t mark) const {
    if (!CanPair(*this, destination) || !IsPacked(*this) || !IsPacked(destination) ||
        threshold < 1) {
        return;
    }
    const ptrdiff_t pitch = GetPitch();
    std::memset(destination.GetBuffer(), 0, static_cast<size_t>(pitch) * GetHeight());
    const int64_t limit = int64_t{100} * threshold;
    for (int32_t y = 1; y < GetHeight() - 1; ++y) {
        const uint8_t* center = Row(y);
        uint8_t* out = destination.Row(y);
        for (int32_t x = 1; x < GetWidth() - 1; ++x) {
            const uint8_t* p = center + x;
            // All three taps weigh the same.
            const int32_t gx = SumOfThree(p + 1, pitch) - SumOfThree(p - 1, pitch);
            const int32_t gy = SumOfThree(p + pitch, 1) - SumOfThree(p - pitch, 1);
            out[x] = gx * gx + gy * gy > limit ? mark : 0;
        }
    }
}

void CImageByte::LiftAbove(uint8_t threshold, uint8_t amount) {
    const auto lift = [threshold, amount](uint8_t* values, size_t count) {
        for (size_t i = 0; i < count; ++i) {
            const int32_t lifted = std::min(values[i] + amount, 255);
            values[i] = values[i] >= threshold ? static_cast<uint8_t>(lifted) : values[i];
        }
    };
    WalkRows(lift, *this);
}

void CImageByte::Subtract(const CImageByte& other) {
    const auto subtract = [](uint8_t* values, const uint8_t* from, size_t count) {
        for (size_t i = 0; i < count; ++i) {
            values[i] = static_cast<uint8_t>(values[i] - std::min(values[i], from[i]));
        }
    };
    WalkRowPairs(subtract, *this, other);
}

void CImageARGB::Relief(CImageByte& destination, int32_t direction) const {
    struct Step {
        int32_t x;
        int32_t y;
    };
    constexpr std::array<Step, 8> kSteps = {
        {{1, 0}, {1, 1}, {0, 1}, {-1, 1}, {-1, 0}, {-1, -1}, {0, -1}, {1, -1}}};
    if (!CanPair(*this, destination) || direction < 0 || direction > 7) {
        return;
    }
    const Step step = kSteps[static_cast<size_t>(direction)];
    for (int32_t y = 0; y < GetHeight(); ++y) {
        for (int32_t x = 0; x < GetWidth(); ++x) {
            const int32_t rise =
                LumaAt(*this, x + step.x, y + step.y) - LumaAt(*this, x - step.x, y - step.y);
            destination.Row(y)[x] = kyv::ClampByte(128 + rise);
        }
    }
}

} // namespace KYVImageUtility
