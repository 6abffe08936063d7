// Blue, green, red, alpha images.
#include "imageutility/ImageUtility.h"

namespace KYVImageUtility {
namespace {

constexpr int32_t kBytesPerPixel = 4;

} // namespace

CImageARGB::CImageARGB(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch)
    : CImageBase(pixels, width, height, pitch, kBytesPerPixel) {}

CImageARGB::CImageARGB(int32_t width, int32_t height)
    : CImageBase(width, height, PackedPitch(width, kBytesPerPixel), kBytesPerPixel) {}

void CImageARGB::Create(int32_t width, int32_t height) {
    CreateBuffer(width, height, kBytesPerPixel);
}

void CImageARGB::Attach(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch) {
    AttachBuffer(pixels, width, height, pitch, kBytesPerPixel);
}

void CImageARGB::CopyFrom(const CImageARGB& source) {
    CopyRowsFrom(source);
}

int32_t CImageARGB::GetSubImage(CImageARGB& view, int32_t x, int32_t y, int32_t w,
                                int32_t h) const {
    return MakeView(view, x, y, w, h);
}

void CImageARGB::Swap(CImageARGB& other) {
    SwapBuffers(other);
}

} // namespace KYVImageUtility
