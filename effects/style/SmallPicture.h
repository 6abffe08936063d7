// A picture at a fraction of the frame's size, for everything that is blurred: made from the
// frame's rows while they pass, and read back as rows of the frame's width.
#pragma once

#include <cstdint>
#include <vector>

#include "imageutility/ImageUtility.h"
#include "platform/CpuFeatures.h"

namespace kyv {

class CSmallPicture {
public:
    // Prepares for frames of a size and squares of 1 << bits pixels, 0 <= bits <= kMostShrinkBits.
    // Buffers are kept as long as nothing changes. Throws std::bad_alloc.
    void Prepare(int32_t frameWidth, int32_t frameHeight, int32_t bits, int32_t cpuLevel);

    // Takes the frame's next row, from top to bottom, each once.
    void TakeRow(const uint8_t* row);

    // Three box blurs one after the other are close to a Gaussian of this standard deviation, in
    // pixels of the frame.
    void Blur(float sigma);

    KYVImageUtility::CImageARGB& GetImage() { return m_image; }

    // Row y of the frame, smoothly enlarged. Valid until the next call.
    const uint8_t* Row(int32_t y);

private:
    void Finish();

    KYVImageUtility::CImageARGB m_image;
    KYVImageUtility::CImageARGB m_other; // the blur goes back and forth
    InstructionSet m_set = InstructionSet::Scalar;
    int32_t m_frameWidth = 0;
    int32_t m_frameHeight = 0;
    int32_t m_bits = -1;
    int32_t m_taken = 0;          // rows of the frame
    std::vector<uint16_t> m_sums; // of the rows of a square, 4 channels
    std::vector<int32_t> m_left;  // for enlarging: BilinearColumns
    std::vector<uint8_t> m_weights;
    std::vector<uint8_t> m_between;  // a row between two of the image
    std::vector<uint8_t> m_enlarged; // and the same at the frame's width
};

} // namespace kyv
