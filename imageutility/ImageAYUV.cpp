// V, U, Y, alpha images.
#include "imageutility/ImageUtility.h"

namespace KYVImageUtility {
namespace {

constexpr int32_t kBytesPerPixel = 4;

} // namespace

CImageAYUV::CImageAYUV(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch)
    : CImageBase(pixels, width, height, pitch, kBytesPerPixel) {}

CImageAYUV::CImageAYUV(int32_t width, int32_t height)
    : CImageBase(width, height, PackedPitch(width, kBytesPerPixel), kBytesPerPixel) {}

void CImageAYUV::Create(int32_t width, int32_t height) {
    CreateBuffer(width, height, kBytesPerPixel);
}

void CImageAYUV::Attach(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch) {
    AttachBuffer(pixels, width, height, pitch, kBytesPerPixel);
}

void CImageAYUV::CopyFrom(const CImageAYUV& source) {
    CopyRowsFrom(source);
}

int32_t CImageAYUV::GetSubImage(CImageAYUV& view, int32_t x, int32_t y, int32_t w,
                                int32_t h) const {
    return MakeView(view, x, y, w, h);
}

} // namespace KYVImageUtility
