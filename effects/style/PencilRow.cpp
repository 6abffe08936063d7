// The definition of the pencil's row loops.
#include "effects/style/PencilRow.h"

#include <algorithm>

#include "effects/style/StyleMath.h"

namespace kyv {
namespace {

constexpr uint32_t Mean(uint32_t a, uint32_t b) {
    return (a + b + 1) >> 1;
}

constexpr uint32_t Above(uint32_t value, uint32_t floor) {
    return value > floor ? value - floor : 0;
}

} // namespace

void SmoothRow_scalar(uint8_t* dst, const uint8_t* a, const uint8_t* b, const uint8_t* c,
                      size_t count) {
    for (size_t i = 0; i < count; ++i) {
        dst[i] = static_cast<uint8_t>(Mean(Mean(a[i], c[i]), b[i]));
    }
}

void PencilLineRow_scalar(uint8_t* dst, const uint8_t* narrow, const uint8_t* wide, size_t count,
                          const PencilLine& line) {
    for (size_t i = 0; i < count; ++i) {
        const uint32_t depth = Above(Above(wide[i], narrow[i]), line.threshold);
        dst[i] = static_cast<uint8_t>(std::min(depth * line.gain, 255U));
    }
}

void PencilInkRow_scalar(uint8_t* dst, const PencilSources& sources, size_t count,
                         const PencilTone& tone) {
    for (size_t i = 0; i < count; ++i) {
        // Halfway to the square: an artist leaves the brighter half of the range to the paper.
        const uint32_t dark = Above(235, sources.luma[i]);
        const uint32_t level = Mean(dark, StyleProduct(dark, dark));
        const uint32_t even = Mean(Mean(level, 0), StyleProduct(level, level));
        uint32_t ink = std::min((even * tone.rubbing + 64) >> 7, 255U);
        for (int k = 0; k < kHatchLayers; ++k) {
            const uint32_t rise = Above(level, tone.layers[k].start) * tone.layers[k].slope;
            const uint32_t pressure = std::min(rise >> 4, 255U);
            // Layers darken each other like ink that is laid over ink.
            const uint32_t stroke = Above(sources.layers[k][i], 255 - pressure);
            ink = 255 - StyleProduct(255 - ink, 255 - StyleProduct(stroke, 196));
        }
        const uint32_t hand = sources.hand[i];
        const uint32_t line = StyleProduct(sources.line[i], Mean(hand, 255));
        const uint32_t echo = StyleProduct(sources.echo[i], (255 - hand) >> 1);
        ink = 255 - StyleProduct(StyleProduct(255 - ink, 255 - line), 255 - echo);
        // Full ink fills the paper's valleys, faint ink leaves them white.
        const uint32_t missed = StyleProduct(sources.valleys[i], 255 - (ink * 3 >> 2));
        dst[i] = static_cast<uint8_t>(StyleProduct(ink, 255 - missed));
    }
}

void PencilPaperRow_scalar(uint8_t* dst, const uint8_t* src, const uint8_t* ink,
                           const uint8_t* valleys, size_t count) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        const uint32_t shade = valleys[i] >> 5;
        for (int c = 0; c < 3; ++c) {
            const uint32_t paper = kPaperColor[c] - shade;
            const uint32_t depth = kPaperColor[c] - kGraphiteColor[c];
            dst[c] = static_cast<uint8_t>(Above(paper, StyleProduct(ink[i], depth)));
        }
        dst[3] = src[3];
    }
}

constinit const KernelTable<SmoothRow> kSmoothRow = {KYV_TABLE(SmoothRow)};
constinit const KernelTable<PencilLineRow> kPencilLineRow = {KYV_TABLE(PencilLineRow)};
constinit const KernelTable<PencilInkRow> kPencilInkRow = {KYV_TABLE(PencilInkRow),
                                                           .passedOver = kNoneIsPassedOver};
constinit const KernelTable<PencilPaperRow> kPencilPaperRow = {KYV_TABLE(PencilPaperRow)};

} // namespace kyv
