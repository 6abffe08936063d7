// A picture at a fraction of the frame's size, for everything that is blurred: made from the
// frame's rows while they pass, and read back as rows of the frame's width.
#pragma once

#include <cstdint>
#include <vector>

#include "imageutility/BoxBlurRows.h"
#include "imageutility/ImageUtility.h"
#include "platform/CpuFeatures.h"

namespace kyv {

// How far a picture may shrink for a blur of a standard deviation in pixels: as long as that is
// leastSigma small pixels, and at least until it is not wider than the given width, which bounds
// the work.
int32_t ChooseShrinkBits(int32_t width, float sigma, int32_t widest, float leastSigma = 2.0F);

// Working rows, one set a thread.
struct SmallPictureRows {
    std::vector<uint16_t> sums;    // of the rows of a square, 4 channels
    std::vector<uint8_t> between;  // a row between two of the small picture
    std::vector<uint8_t> enlarged; // and the same at the frame's width
};

class CSmallPicture {
public:
    // Prepares for frames of a size and squares of 1 << bits pixels, 0 <= bits <= kMostShrinkBits.
    // Buffers are kept as long as nothing changes. Throws std::bad_alloc.
    void Prepare(int32_t frameWidth, int32_t frameHeight, int32_t bits, const ResolvedLevel& level);

    void PrepareRows(SmallPictureRows& rows) const;

    // Takes row y of the frame. The rows of a square are to be taken from top to bottom with the
    // same working rows; different squares may be filled on different threads.
    void TakeRow(int32_t y, const uint8_t* row, SmallPictureRows& rows);

    // Three box blurs one after the other are close to a Gaussian of this standard deviation, in
    // pixels of the frame.
    void Blur(float sigma);

    KYVImageUtility::CImageARGB& GetImage() { return m_image; }
    const KYVImageUtility::CImageARGB& GetImage() const { return m_image; }
    int32_t GetBits() const { return m_bits; }

    // Row y of the frame, smoothly enlarged. Valid until the next call with the same working rows.
    const uint8_t* Row(int32_t y, SmallPictureRows& rows) const;

private:
    KYVImageUtility::CImageARGB m_image;
    KYVImageUtility::CImageARGB m_other; // the blur goes back and forth
    CBoxBlurRows m_window;
    int32_t m_frameWidth = 0;
    int32_t m_frameHeight = 0;
    int32_t m_bits = -1;
    std::vector<int32_t> m_left; // for enlarging: BilinearColumns
    std::vector<uint8_t> m_weights;
};

} // namespace kyv
