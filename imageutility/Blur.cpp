// The box blur of whole images.
#include <cstring>

#include "imageutility/BoxBlurRows.h"
#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "platform/PageMemory.h"

namespace KYVImageUtility {
namespace {

// Rows are read again after those above them have been written, so a copy is blurred.
void BlurInPlace(const CImageBase& image, int32_t radius) {
    if (radius == 0) {
        return;
    }
    const size_t rowBytes = static_cast<size_t>(image.GetWidth()) * 4;
    const kyv::CPageBlock block(rowBytes * static_cast<size_t>(image.GetHeight()));
    CImageARGB copy(block.GetData(), image.GetWidth(), image.GetHeight(),
                    static_cast<int32_t>(rowBytes));
    copy.TakeCpuLevel(image);
    for (int32_t y = 0; y < image.GetHeight(); ++y) {
        std::memcpy(copy.Row(y), image.Row(y), rowBytes);
    }
    kyv::CBoxBlurRows().BlurImage(copy, image, radius);
}

template <class Image>
void BlurOrCopy(const Image& image, Image& destination, int32_t radius) {
    if (!CanPair(image, destination) || radius < 0) {
        return;
    }
    if (image.GetBuffer() == destination.GetBuffer()) {
        BlurInPlace(image, radius);
    } else {
        kyv::CBoxBlurRows().BlurImage(image, destination, radius);
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
