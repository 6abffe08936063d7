// The box blur row by row, for callers that make their rows as they go.
#pragma once

#include <cstdint>
#include <memory>

#include "imageutility/ImageUtility.h"
#include "imageutility/kernels/BoxBlur.h"
#include "platform/PageMemory.h"

namespace kyv {

// A window of 2 * radius + 1 rows that moves down an image of `height` rows of `width` pixels, 4
// channels each. For every row in turn Blur is given the row that enters below and the one that
// leaves above. Averages are over the part of a window that is inside the image, truncated.
//
// Memory is kept, so that the next image of the same size or a smaller one takes none.
class CBoxBlurRows {
public:
    // Starts with an empty window. radius is at least 1 and less than half of the height; the
    // shape counts for the next Blurs. Throws std::bad_alloc.
    void Begin(int32_t width, int32_t height, int32_t radius, InstructionSet set);

    // CImageARGB::BoxBlur with memory that is kept; radius is not negative, and the images, which
    // have one size, must not overlap. Throws std::bad_alloc, with nothing written.
    void BlurImage(const KYVImageUtility::CImageBase& source,
                   const KYVImageUtility::CImageBase& destination, int32_t radius);

    // Takes a row into the window or out of it. Null for one outside the image.
    void Slide(const uint8_t* enter, const uint8_t* leave);

    // Slides, and writes the averages of row y, which must not overlap the two rows.
    void Blur(uint8_t* dst, int32_t y, const uint8_t* enter, const uint8_t* leave);

    // Writes, after Slide, the averages of the columns from first to before end alone, to their
    // places in row y. The radius + 1 columns to either side of them must hold zeros all down the
    // window, where they are inside the image.
    void Average(uint8_t* dst, int32_t y, int32_t first, int32_t end);

private:
    void BlurPart(uint8_t* dst, int32_t y, int32_t first, int32_t end, const uint8_t* enter,
                  const uint8_t* leave);

    std::unique_ptr<CPageBlock> m_pBlock;
    size_t m_nBytes = 0;
    int32_t m_nWidth = 0;
    int32_t m_nHeight = 0;
    int32_t m_nRadius = 0;
    bool m_bWide = false; // sums of 32 bits
    InstructionSet m_set = InstructionSet::Scalar;
    void* m_pSums = nullptr; // of the first pixel's column; zeros lie around the columns
    int32_t* m_pColumns = nullptr;
    float* m_pReciprocals = nullptr;
    uint8_t* m_pNoRow = nullptr; // zeros
};

} // namespace kyv
