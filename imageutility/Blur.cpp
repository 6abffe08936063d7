// Box blur: running sums down the columns, then along the rows, so that the radius costs nothing.
#include <algorithm>
#include <cstring>

#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "imageutility/kernels/BoxBlur.h"
#include "platform/PageMemory.h"

namespace KYVImageUtility {
namespace {

// The windows of a length are radius pixels to either side, less what lies outside.
int32_t WindowLength(int32_t position, int32_t length, int32_t radius) {
    return std::min(position + radius, length - 1) - std::max(position - radius, 0) + 1;
}

struct BlurScratch {
    BlurScratch(uint8_t* data, const CImageBase& image, int32_t radius, bool copiesSource)
        : layout(data) {
        const auto width = static_cast<size_t>(image.GetWidth());
        const size_t border = static_cast<size_t>(radius) + 1;
        uint32_t* padded = layout.Take<uint32_t>((width + 2 * border) * 4);
        sums = data ? padded + border * 4 : nullptr;
        areas = layout.Take<int32_t>(width);
        scales = layout.Take<float>(width);
        if (copiesSource) {
            source = layout.Take<uint8_t>(width * 4 * static_cast<size_t>(image.GetHeight()));
        }
    }

    kyv::CScratchLayout layout;
    uint32_t* sums; // of the first pixel's column; zeros lie around the columns
    int32_t* areas;
    float* scales;
    uint8_t* source = nullptr; // packed rows
};

// For windows whose sum needs more than 32 bits; so large a radius is rare.
void AverageLargeRow(uint8_t* dst, const uint32_t* sums, size_t count,
                     const kyv::BoxWindows& windows) {
    const auto reach = static_cast<ptrdiff_t>(windows.radius) * 4;
    uint64_t total[4] = {};
    for (ptrdiff_t i = -reach; i < reach; ++i) {
        total[i & 3] += sums[i];
    }
    for (size_t i = 0; i < count; ++i, sums += 4, dst += 4) {
        for (int c = 0; c < 4; ++c) {
            total[c] += sums[c + reach];
            dst[c] = static_cast<uint8_t>(total[c] / static_cast<uint32_t>(windows.areas[i]));
            total[c] -= sums[c - reach];
        }
    }
}

void CopyPackedRows(uint8_t* dst, const CImageBase& source) {
    const size_t rowBytes = static_cast<size_t>(source.GetWidth()) * 4;
    for (int32_t y = 0; y < source.GetHeight(); ++y, dst += rowBytes) {
        std::memcpy(dst, source.Row(y), rowBytes);
    }
}

void BlurRows(const CImageBase& source, const CImageBase& destination, int32_t radius,
              const BlurScratch& scratch) {
    const int32_t width = source.GetWidth();
    const int32_t height = source.GetHeight();
    const auto count = static_cast<size_t>(width);
    const kyv::BoxColumnsRow slide = FormFor(kyv::kBoxColumns, destination);
    const kyv::BoxAverageRow average =
        radius <= kyv::kBoxRadiusMax ? FormFor(kyv::kBoxAverage, destination) : AverageLargeRow;
    const kyv::BoxWindows windows = {radius, scratch.areas, scratch.scales};
    for (int32_t y = 0; y < radius; ++y) {
        slide(scratch.sums, source.Row(y), nullptr, count);
    }
    int32_t rows = 0;
    for (int32_t y = 0; y < height; ++y) {
        const uint8_t* enter = y + radius < height ? source.Row(y + radius) : nullptr;
        const uint8_t* leave = y > radius ? source.Row(y - radius - 1) : nullptr;
        slide(scratch.sums, enter, leave, count);
        if (rows != WindowLength(y, height, radius)) {
            rows = WindowLength(y, height, radius);
            for (int32_t x = 0; x < width; ++x) {
                scratch.areas[x] = WindowLength(x, width, radius) * rows;
                scratch.scales[x] = kyv::AverageScale(scratch.areas[x]);
            }
        }
        average(destination.Row(y), scratch.sums, count, windows);
    }
}

template <class Image>
void Blur(const Image& image, Image& destination, int32_t radius) {
    if (!CanPair(image, destination) || radius < 0) {
        return;
    }
    const int32_t shorter = std::min(image.GetWidth(), image.GetHeight());
    if (shorter <= int64_t{2} * radius) {
        radius = (shorter - 1) / 2;
    }
    if (radius == 0) {
        destination.CopyFrom(image);
        return;
    }
    // Rows are read again after those above them have been written.
    const bool inPlace = image.GetBuffer() == destination.GetBuffer();
    const kyv::CPageBlock block(BlurScratch(nullptr, image, radius, inPlace).layout.GetBytes());
    if (!block.GetData()) {
        return;
    }
    const BlurScratch scratch(block.GetData(), image, radius, inPlace);
    Image source(image.GetBuffer(), image.GetWidth(), image.GetHeight(), image.GetPitch());
    if (inPlace) {
        CopyPackedRows(scratch.source, image);
        source.Attach(scratch.source, image.GetWidth(), image.GetHeight(), image.GetWidth() * 4);
    }
    Image target(destination.GetBuffer(), destination.GetWidth(), destination.GetHeight(),
                 destination.GetPitch());
    target.SetCpuLevel(image.GetCpuLevel());
    BlurRows(source, target, radius, scratch);
}

} // namespace

void CImageARGB::BoxBlur(CImageARGB& destination, int32_t radius) const {
    Blur(*this, destination, radius);
}

void CImageAYUV::BoxBlur(CImageAYUV& destination, int32_t radius) const {
    Blur(*this, destination, radius);
}

} // namespace KYVImageUtility
