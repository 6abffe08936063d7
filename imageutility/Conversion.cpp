// Pixel format conversion of images and of single colours.
#include "imageutility/Conversion.h"

#include "imageutility/ImageUtility.h"
#include "imageutility/kernels/ColorMath.h"
#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"
#include "imageutility/kernels/ToGray.h"

namespace KYVImageUtility {
namespace {

bool CanConvert(const CImageBase& source, const CImageBase& destination) {
    return source.GetBuffer() && destination.GetBuffer() && source.IsSameSize(destination) &&
           source.GetWidth() > 0;
}

// Applies a row loop to every row of two images, each walked by its own pitch.
template <class Row>
void ConvertRows(const kyv::KernelTable<Row>& table, const CImageBase& source,
                 const CImageBase& destination) {
    if (!CanConvert(source, destination)) {
        return;
    }
    const Row convert = table.For(kyv::Resolve(source.GetCpuLevel()));
    const auto count = static_cast<size_t>(source.GetWidth());
    for (int32_t y = 0; y < source.GetHeight(); ++y) {
        convert(destination.Row(y), source.Row(y), count);
    }
}

} // namespace

void CImageARGB::ToAYUV(CImageAYUV& destination) const {
    ConvertRows(kyv::kToAYUV, *this, destination);
}

void CImageAYUV::ToARGB(CImageARGB& destination) const {
    ConvertRows(kyv::kToARGB, *this, destination);
}

void CImageARGB::ToGray(CImageByte& destination) const {
    ConvertRows(kyv::kToGrayBytes, *this, destination);
}

void CImageARGB::ToGray() {
    if (!GetBuffer() || GetWidth() <= 0) {
        return;
    }
    const kyv::ToGrayRow convert = kyv::kToGray.For(kyv::Resolve(GetCpuLevel()));
    for (int32_t y = 0; y < GetHeight(); ++y) {
        convert(Row(y), static_cast<size_t>(GetWidth()));
    }
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
