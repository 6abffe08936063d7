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

template <class Sum>
struct BlurScratch {
    BlurScratch(uint8_t* data, const CImageBase& image, int32_t radius, bool copiesSource)
        : layout(data) {
        const auto width = static_cast<size_t>(image.GetWidth());
        const size_t border = static_cast<size_t>(radius) + 1;
        Sum* padded = layout.Take<Sum>((width + 2 * border) * 4);
        sums = data ? padded + border * 4 : nullptr;
        columns = layout.Take<int32_t>(width);
        reciprocals = layout.Take<float>(width);
        noRow = layout.Take<uint8_t>(width * 4);
        if (copiesSource) {
            source = layout.Take<uint8_t>(width * 4 * static_cast<size_t>(image.GetHeight()));
        }
    }

    kyv::CScratchLayout layout;
    Sum* sums; // of the first pixel's column; zeros lie around the columns
    int32_t* columns;
    float* reciprocals;
    uint8_t* noRow;            // zeros, for a row outside
    uint8_t* source = nullptr; // packed rows
};

// For windows whose sum needs more than 31 bits; so large a radius is rare.
void BlurHugeRow(uint8_t* dst, uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                 size_t count, const kyv::BoxWindows& windows) {
    kyv::BoxColumns32_scalar(sums, enter, leave, count);
    const auto reach = static_cast<ptrdiff_t>(windows.radius) * 4;
    uint64_t total[4] = {};
    for (ptrdiff_t i = -reach; i < reach; ++i) {
        total[i & 3] += sums[i];
    }
    for (size_t i = 0; i < count; ++i, sums += 4, dst += 4) {
        const auto area =
            static_cast<uint64_t>(windows.columns[i]) * static_cast<uint64_t>(windows.rows);
        for (int c = 0; c < 4; ++c) {
            total[c] += sums[c + reach];
            dst[c] = static_cast<uint8_t>(total[c] / area);
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

template <class Sum>
struct BlurForms {
    void (*slide)(Sum* sums, const uint8_t* enter, const uint8_t* leave, size_t count);
    void (*blur)(uint8_t* dst, Sum* sums, const uint8_t* enter, const uint8_t* leave, size_t count,
                 const kyv::BoxWindows& windows);
};

template <class Sum>
void BlurRows(const CImageBase& source, const CImageBase& destination, int32_t radius,
              const BlurForms<Sum>& forms, const BlurScratch<Sum>& scratch) {
    const int32_t width = source.GetWidth();
    const int32_t height = source.GetHeight();
    for (int32_t x = 0; x < width; ++x) {
        scratch.columns[x] = WindowLength(x, width, radius);
        scratch.reciprocals[x] = 1.0F / static_cast<float>(scratch.columns[x]);
    }
    const auto count = static_cast<size_t>(width);
    for (int32_t y = 0; y < radius; ++y) {
        forms.slide(scratch.sums, source.Row(y), scratch.noRow, count);
    }
    for (int32_t y = 0; y < height; ++y) {
        const uint8_t* enter = y + radius < height ? source.Row(y + radius) : scratch.noRow;
        const uint8_t* leave = y > radius ? source.Row(y - radius - 1) : scratch.noRow;
        forms.blur(destination.Row(y), scratch.sums, enter, leave, count,
                   {.radius = radius,
                    .rows = WindowLength(y, height, radius),
                    .columns = scratch.columns,
                    .reciprocals = scratch.reciprocals});
    }
}

template <class Sum>
void Blur(const CImageBase& image, const CImageBase& destination, int32_t radius,
          const BlurForms<Sum>& forms) {
    // Rows are read again after those above them have been written.
    const bool inPlace = image.GetBuffer() == destination.GetBuffer();
    const kyv::CPageBlock block(
        BlurScratch<Sum>(nullptr, image, radius, inPlace).layout.GetBytes());
    if (!block.GetData()) {
        return;
    }
    const BlurScratch<Sum> scratch(block.GetData(), image, radius, inPlace);
    if (inPlace) {
        CopyPackedRows(scratch.source, image);
        const CImageARGB copy(scratch.source, image.GetWidth(), image.GetHeight(),
                              image.GetWidth() * 4);
        BlurRows(copy, destination, radius, forms, scratch);
    } else {
        BlurRows(image, destination, radius, forms, scratch);
    }
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
    } else if (radius <= kyv::kBoxRadiusMax16) {
        Blur<uint16_t>(image, destination, radius,
                       {FormFor(kyv::kBoxColumns16, image), FormFor(kyv::kBoxBlur16, image)});
    } else {
        Blur<uint32_t>(image, destination, radius,
                       {FormFor(kyv::kBoxColumns32, image), radius <= kyv::kBoxRadiusMax
                                                                ? FormFor(kyv::kBoxBlur32, image)
                                                                : BlurHugeRow});
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
