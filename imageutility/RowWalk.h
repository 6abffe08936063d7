// Applies row loops to whole images: checks once, then every row by its own pitch.
#pragma once

#include "imageutility/ImageUtility.h"
#include "imageutility/kernels/KernelTable.h"

namespace KYVImageUtility {

inline bool HasPixels(const CImageBase& image) {
    return image.GetBuffer() && image.GetWidth() > 0 && image.GetHeight() > 0;
}

inline bool CanPair(const CImageBase& a, const CImageBase& b) {
    return HasPixels(a) && HasPixels(b) && a.IsSameSize(b);
}

// row(pixels, count, arguments...) for every row.
template <class Row, class... Arguments>
void WalkRows(Row row, const CImageBase& image, Arguments... arguments) {
    if (!HasPixels(image)) {
        return;
    }
    const auto count = static_cast<size_t>(image.GetWidth());
    for (int32_t y = 0; y < image.GetHeight(); ++y) {
        row(image.Row(y), count, arguments...);
    }
}

// row(destination, source, count, arguments...) for every row of two images of the same size.
template <class Row, class... Arguments>
void WalkRowPairs(Row row, const CImageBase& destination, const CImageBase& source,
                  Arguments... arguments) {
    if (!CanPair(destination, source)) {
        return;
    }
    const auto count = static_cast<size_t>(destination.GetWidth());
    for (int32_t y = 0; y < destination.GetHeight(); ++y) {
        row(destination.Row(y), source.Row(y), count, arguments...);
    }
}

// The form of an operation that an image's level asks for.
template <class Function>
Function FormFor(const kyv::KernelTable<Function>& table, const CImageBase& image) {
    return table.For(image.GetInstructionSet());
}

} // namespace KYVImageUtility
