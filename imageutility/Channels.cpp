// Moving single channels, and fills that touch only some of them.
#include <algorithm>
#include <cstdlib>

#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "imageutility/kernels/FillMasked.h"

namespace KYVImageUtility {
namespace {

constexpr uint32_t kAlphaMask = 0xFF000000;

uint32_t ColorWord(uint8_t r, uint8_t g, uint8_t b) {
    return static_cast<uint32_t>(r) << 16 | static_cast<uint32_t>(g) << 8 | b;
}

// Copies one byte of every pixel that both images have. Callers give a source at least as large as
// the destination; one that is smaller must not be read past its end.
void CopyBytes(const CImageBase& destination, int32_t toByte, int32_t toStep,
               const CImageBase& source, int32_t fromByte, int32_t fromStep) {
    if (!HasPixels(destination) || !HasPixels(source)) {
        return;
    }
    const int32_t width = std::min(destination.GetWidth(), source.GetWidth());
    const int32_t height = std::min(destination.GetHeight(), source.GetHeight());
    for (int32_t y = 0; y < height; ++y) {
        uint8_t* to = destination.Row(y) + toByte;
        const uint8_t* from = source.Row(y) + fromByte;
        for (int32_t x = 0; x < width; ++x, to += toStep, from += fromStep) {
            *to = *from;
        }
    }
}

void CopyAlpha(const CImageBase& destination, const CImageBase& source) {
    if (source.GetBytesPerPixel() == 4) {
        CopyBytes(destination, 3, 4, source, 3, 4);
    }
}

} // namespace

void CImageARGB::CopyAlphaFrom(const CImageBase& source) {
    CopyAlpha(*this, source);
}

void CImageAYUV::CopyAlphaFrom(const CImageBase& source) {
    CopyAlpha(*this, source);
}

void CImageARGB::SetChannel(const CImageByte& source, int32_t channel) {
    if (channel >= 0 && channel <= 3) {
        CopyBytes(*this, channel, 4, source, 0, 1);
    }
}

void CImageARGB::GetChannel(CImageByte& destination, int32_t channel) const {
    if (channel >= 0 && channel <= 3) {
        CopyBytes(destination, 0, 1, *this, channel, 4);
    }
}

void CImageARGB::FillColor(uint8_t r, uint8_t g, uint8_t b) {
    WalkRows(FormFor(kyv::kFillMasked, *this), *this, kAlphaMask, ColorWord(r, g, b));
}

void CImageARGB::SetAlpha(uint8_t value) {
    WalkRows(FormFor(kyv::kFillMasked, *this), *this, ~kAlphaMask,
             static_cast<uint32_t>(value) << 24);
}

void CImageARGB::FillColorKeyed(uint8_t keyR, uint8_t keyG, uint8_t keyB, uint8_t tolerance,
                                uint8_t r, uint8_t g, uint8_t b) {
    const int key[3] = {keyB, keyG, keyR};
    const uint8_t fill[3] = {b, g, r};
    const auto keyed = [&](uint8_t* pixels, size_t count) {
        for (size_t i = 0; i < count; ++i, pixels += 4) {
            int distance = 0;
            for (int c = 0; c < 3; ++c) {
                distance = std::max(distance, std::abs(pixels[c] - key[c]));
            }
            if (distance <= tolerance) {
                std::copy_n(fill, 3, pixels);
            }
        }
    };
    WalkRows(keyed, *this);
}

} // namespace KYVImageUtility
