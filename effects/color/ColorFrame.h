// What the colour corrections share: a frame of either pixel format treated as rows of B, G, R, A,
// and the comparison that leaves the left half of the picture as it was.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"
#include "interface/FrameGeometry.h"

namespace kyv {

// The rows that a call corrects: first, first + step, ...
struct RowSelection {
    int32_t first;
    int32_t step;
};

// By the context's field selector.
RowSelection SelectField(const EffectContext& context);

// No row at all.
inline constexpr RowSelection kNoRows = {INT32_MAX, 1};

// The call's view of an input and an output frame, which may be one and the same.
//
// The corrections work on ARGB. ARGB frames are corrected from frame to frame, and rows outside the
// selection are not touched. AYUV frames are converted, corrected and converted back; there every
// row takes the round trip, so that rows outside the selection carry the source as it comes back
// from RGB. The conversion goes through a block that stays in the nearest cache, so no frame is
// ever held in between and nothing is allocated.
class CColorFrame {
public:
    CColorFrame(const EffectContext& context, const FrameGeometry& geometry, void* output,
                const void* input);

    // Calls correct(dst, src, count) for runs of B, G, R, A pixels of the selected rows. The first
    // `spared` pixels of a row are left as they are. dst may be src itself.
    template <class Correct>
    void Process(RowSelection rows, int32_t spared, Correct&& correct) const {
        if (m_ayuv) {
            ProcessAyuv(rows, spared, correct);
            return;
        }
        for (int64_t y = rows.first; y < m_height; y += rows.step) {
            uint8_t* dst = Output(y);
            const uint8_t* src = Input(y);
            if (dst != src) {
                std::memcpy(dst, src, static_cast<size_t>(spared) * 4);
            }
            correct(dst + size_t{4} * spared, src + size_t{4} * spared,
                    static_cast<size_t>(m_width - spared));
        }
    }

private:
    static constexpr int32_t kBlockPixels = 1024;

    uint8_t* Output(int64_t y) const { return m_pOutput + y * m_pitch; }
    const uint8_t* Input(int64_t y) const { return m_pInput + y * m_pitch; }

    template <class Correct>
    void ProcessAyuv(RowSelection rows, int32_t spared, Correct&& correct) const {
        uint8_t block[kBlockPixels * 4];
        for (int32_t y = 0; y < m_height; ++y) {
            const bool selected = y >= rows.first && (y - rows.first) % rows.step == 0;
            for (int32_t x = 0; x < m_width; x += kBlockPixels) {
                const int32_t count = m_width - x < kBlockPixels ? m_width - x : kBlockPixels;
                const int32_t skip = spared <= x ? 0 : spared - x < count ? spared - x : count;
                m_toArgb(block, Input(y) + size_t{4} * x, static_cast<size_t>(count));
                if (selected && skip < count) {
                    uint8_t* from = block + size_t{4} * skip;
                    correct(from, from, static_cast<size_t>(count - skip));
                }
                m_toAyuv(Output(y) + size_t{4} * x, block, static_cast<size_t>(count));
            }
        }
    }

    uint8_t* m_pOutput;
    const uint8_t* m_pInput;
    int32_t m_width;
    int32_t m_height;
    int32_t m_pitch;
    bool m_ayuv;
    ToARGBRow m_toArgb;
    ToAYUVRow m_toAyuv;
};

} // namespace kyv
