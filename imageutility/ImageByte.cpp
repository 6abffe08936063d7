// Single-byte images.
#include "imageutility/ImageUtility.h"

namespace KYVImageUtility {
namespace {

constexpr int32_t kBytesPerPixel = 1;

} // namespace

CImageByte::CImageByte(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch)
    : CImageBase(pixels, width, height, pitch, kBytesPerPixel) {}

CImageByte::CImageByte(int32_t width, int32_t height)
    : CImageBase(width, height, PackedPitch(width, kBytesPerPixel), kBytesPerPixel) {}

void CImageByte::Create(int32_t width, int32_t height) {
    CreateBuffer(width, height, kBytesPerPixel);
}

void CImageByte::CopyFrom(const CImageByte& source) {
    CopyRowsFrom(source);
}

int32_t CImageByte::GetSubImage(CImageByte& view, int32_t x, int32_t y, int32_t w,
                                int32_t h) const {
    return MakeView(view, x, y, w, h);
}

} // namespace KYVImageUtility
