// The row loops of the pencil sketch. All planes hold one byte a pixel.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// dst = mean(mean(a, c), b) for count bytes, every mean rounded up: the weights 1, 2, 1. dst may be
// any of the three but must not overlap them otherwise.
using SmoothRow = void (*)(uint8_t* dst, const uint8_t* a, const uint8_t* b, const uint8_t* c,
                           size_t count);

struct PencilLine {
    uint8_t threshold; // what is darker than its surroundings by no more gets no line
    uint8_t gain;      // ink for every level beyond that
};

// count bytes of ink, 0 none to 255 full: (wide - narrow - threshold) * gain, within 0..255. dst
// may be either.
using PencilLineRow = void (*)(uint8_t* dst, const uint8_t* narrow, const uint8_t* wide,
                               size_t count, const PencilLine& line);

inline constexpr int kHatchLayers = 4;

// When a layer of strokes begins to show, and how fast.
struct HatchTone {
    uint8_t start; // darkness, 0..219
    uint8_t slope; // pressure for every 16 levels of darkness beyond
};

struct PencilTone {
    HatchTone layers[kHatchLayers];
    uint8_t
        rubbing; // share of the square of the darkness, rubbed evenly under the strokes, in 1/256
};

// What the ink of a row is made from.
struct PencilSources {
    const uint8_t* luma;                 // 16..235, smoothed
    const uint8_t* line;                 // contours
    const uint8_t* echo;                 // the same, a little out of place
    const uint8_t* layers[kHatchLayers]; // strokes: the height of their relief, 0 beside them
    const uint8_t* valleys;              // of the paper, which take less graphite
    const uint8_t* hand;                 // how heavily the hand rests
};

// count bytes of ink. A stroke shows as far as its relief rises above the layer's pressure, so it
// begins as a thin core and grows wider as the tone darkens.
using PencilInkRow = void (*)(uint8_t* dst, const PencilSources& sources, size_t count,
                              const PencilTone& tone);

// count pixels of B, G, R, A: graphite on warm white paper whose valleys are a little darker. Alpha
// is the source's. dst may be src.
using PencilPaperRow = void (*)(uint8_t* dst, const uint8_t* src, const uint8_t* ink,
                                const uint8_t* valleys, size_t count);

KYV_FORMS(SmoothRow, SmoothRow)
KYV_FORMS(PencilLineRow, PencilLineRow)
KYV_FORMS(PencilInkRow, PencilInkRow)
KYV_FORMS(PencilPaperRow, PencilPaperRow)

extern const KernelTable<SmoothRow> kSmoothRow;
extern const KernelTable<PencilLineRow> kPencilLineRow;
extern const KernelTable<PencilInkRow> kPencilInkRow;
extern const KernelTable<PencilPaperRow> kPencilPaperRow;

// The colours of PencilPaperRow, B, G, R.
inline constexpr uint8_t kPaperColor[3] = {236, 244, 248};
inline constexpr uint8_t kGraphiteColor[3] = {58, 52, 50};

} // namespace kyv
