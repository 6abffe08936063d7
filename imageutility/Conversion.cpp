// Pixel format conversion of images and of single colours.
#include "imageutility/Conversion.h"

#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "imageutility/kernels/ColorMath.h"
#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"
#include "imageutility/kernels/ToGray.h"

namespace KYVImageUtility {

void CImageARGB::ToAYUV(CImageAYUV& destination) const {
    WalkRowPairs(FormFor(kyv::kToAYUV, *this), destination, *this);
}

void CImageAYUV::ToARGB(CImageARGB& destination) const {
    WalkRowPairs(FormFor(kyv::kToARGB, *this), destination, *this);
}

void CImageARGB::ToGray(CImageByte& destination) const {
    WalkRowPairs(FormFor(kyv::kToGrayBytes, *this), destination, *this);
}

void CImageARGB::ToGray() {
    WalkRows(FormFor(kyv::kToGray, *this), *this);
}

void RgbToLuma(uint8_t r, uint8_t g, uint8_t b, uint8_t* luma) {
    *luma = static_cast<uint8_t>(kyv::LumaOf(r, g, b));
}

void RgbToYuv(uint32_t r, uint32_t g, uint32_t b, uint32_t* y, uint32_t* u, uint32_t* v) {
    const kyv::YuvTriple yuv = kyv::YuvOf(r, g, b);
    *y = static_cast<uint32_t>(yuv.y);
    *u = static_cast<uint32_t>(yuv.u);
    *v = static_cast<uint32_t>(yuv.v);
}

void YuvToRgb(uint32_t y, uint32_t u, uint32_t v, uint32_t* r, uint32_t* g, uint32_t* b) {
    const kyv::RgbTriple rgb = kyv::RgbOf(y, u, v);
    *r = static_cast<uint32_t>(rgb.r);
    *g = static_cast<uint32_t>(rgb.g);
    *b = static_cast<uint32_t>(rgb.b);
}

} // namespace KYVImageUtility
