// The box blur of whole images.
#include <algorithm>
#include <cstring>

#include "imageutility/BoxBlurRows.h"
#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "platform/PageMemory.h"

namespace KYVImageUtility {
namespace {

void BlurRows(const CImageBase& source, const CImageBase& destination, int32_t radius) {
    kyv::CBoxBlurRows window;
    const int32_t height = source.GetHeight();
    if (!window.Begin(source.GetWidth(), height, radius, kyv::Resolve(source.GetCpuLevel()))) {
        return;
    }
    for (int32_t y = 0; y < radius; ++y) {
        window.Slide(source.Row(y), nullptr);
    }
    for (int32_t y = 0; y < height; ++y) {
        window.Blur(destination.Row(y), y, y + radius < height ? source.Row(y + radius) : nullptr,
                    y > radius ? source.Row(y - radius - 1) : nullptr);
    }
}

// Rows are read again after those above them have been written, so a copy is blurred.
void BlurInPlace(const CImageBase& image, int32_t radius) {
    const size_t rowBytes = static_cast<size_t>(image.GetWidth()) * 4;
    const kyv::CPageBlock block(rowBytes * static_cast<size_t>(image.GetHeight()));
    if (!block.GetData()) {
        return;
    }
    CImageARGB copy(block.GetData(), image.GetWidth(), image.GetHeight(),
                    static_cast<int32_t>(rowBytes));
    copy.SetCpuLevel(image.GetCpuLevel());
    for (int32_t y = 0; y < image.GetHeight(); ++y) {
        std::memcpy(copy.Row(y), image.Row(y), rowBytes);
    }
    BlurRows(copy, image, radius);
}

template <class Image>
void BlurOrCopy(const Image& image, Image& destination, int32_t radius) {
    if (!CanPair(image, destination) || radius < 0) {
        return;
    }
    const int32_t shorter = std::min(image.GetWidth(), image.GetHeight());
    if (shorter <= int64_t{2} * radius) {
        radius = (shorter - 1) / 2;
    }
    if (radius == 0) {
        destination.CopyFrom(image);
    } else if (image.GetBuffer() == destination.GetBuffer()) {
        BlurInPlace(image, radius);
    } else {
        BlurRows(image, destination, radius);
    }
}

} // namespace

void CImageARGB::BoxBlur(CImageARGB& destination, int32_t radius) const {
    BlurOrCopy(*this, destination, radius);
}

void CImageAYUV::BoxBlur(CImageAYUV& destination, int32_t radius) const {
    BlurOrCopy(*this, destination, radius);
}

} // namespace KYVImageUtility
