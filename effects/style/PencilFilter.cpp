// From a picture to its drawing.
#include "effects/style/PencilFilter.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <utility>

#include "effects/style/MaskMixRow.h"
#include "effects/style/PencilRow.h"
#include "effects/style/StyleMath.h"
#include "imageutility/kernels/ToGray.h"

namespace kyv {
namespace {

constexpr float kReferenceWidth = 720.0F;

// Lines are drawn where a blur differs from one of this many times its variance.
constexpr float kWideVariance = 2.6F;

constexpr int32_t kFarthestTap = 64; // of a smoothing pass, in pixels

constexpr PencilTone kTone = {
    .layers = {{10, 34}, {44, 34}, {84, 36}, {136, 52}},
    .rubbing = 120,
};

} // namespace

void CPencilFilter::Prepare(const StyleFrame& frame) {
    m_set = frame.level.set;
    m_width = frame.width;
    m_height = frame.height;
    const size_t pixels = static_cast<size_t>(m_width) * m_height;
    for (Plane& plane : m_planes) {
        plane.bytes.resize(pixels);
        plane.width = m_width;
    }
    const auto width = static_cast<size_t>(m_width);
    m_padded.resize(width + 2 * kFarthestTap);
    m_source.resize(width * 4);
    m_result.resize(width * 4);
    m_rows.resize(width * (CPencilTexture::kTiles + 2));
}

void CPencilFilter::ReadLuma(const StyleFrame& frame) {
    const auto gray = kToGrayBytes.For(m_set);
    for (int32_t y = 0; y < m_height; ++y) {
        gray(m_planes[0].Row(y), frame.Load(y, m_source.data()), static_cast<size_t>(m_width));
    }
}

// Weights 1, 2, 1 at a distance, down and across: the variance grows by half of its square.
void CPencilFilter::SmoothOnce(Plane& from, Plane& to, int32_t distance) {
    const SmoothRow smooth = kSmoothRow.For(m_set);
    const auto width = static_cast<size_t>(m_width);
    uint8_t* row = m_padded.data() + kFarthestTap;
    for (int32_t y = 0; y < m_height; ++y) {
        smooth(row, from.Row(std::max(y - distance, 0)), from.Row(y),
               from.Row(std::min(y + distance, m_height - 1)), width);
        std::memset(row - distance, row[0], static_cast<size_t>(distance));
        std::memset(row + width, row[width - 1], static_cast<size_t>(distance));
        smooth(to.Row(y), row - distance, row, row + distance, width);
    }
}

void CPencilFilter::Smooth(Plane*& plane, Plane*& spare, float variance) {
    // Each pass reaches at most twice as far as the one before, or it would leave gaps.
    for (int32_t distance = 1; variance >= 0.5F; distance = std::min(distance * 2, kFarthestTap)) {
        while (static_cast<float>(distance * distance) * 0.5F > variance) {
            --distance;
        }
        SmoothOnce(*plane, *spare, distance);
        std::swap(plane, spare);
        variance -= static_cast<float>(distance * distance) * 0.5F;
    }
}

void CPencilFilter::DrawRows(const StyleFrame& frame, Plane& lines, Plane& tone, int32_t echoX,
                             int32_t echoY) {
    const auto width = static_cast<size_t>(m_width);
    uint8_t* rows[CPencilTexture::kTiles];
    for (int32_t tile = 0; tile < CPencilTexture::kTiles; ++tile) {
        rows[tile] = m_rows.data() + static_cast<size_t>(tile) * width;
    }
    uint8_t* echo = m_rows.data() + CPencilTexture::kTiles * width;
    uint8_t* ink = echo + width;
    const uint8_t* valleys = rows[CPencilTexture::kValleys];
    PencilSources sources = {};
    for (int32_t k = 0; k < kHatchLayers; ++k) {
        sources.layers[k] = rows[k];
    }
    sources.echo = echo;
    sources.valleys = valleys;
    sources.hand = rows[CPencilTexture::kHand];
    const size_t shift = std::min(static_cast<size_t>(echoX), width);
    for (int32_t y = frame.firstRow; y < m_height; y += frame.rowStep) {
        for (int32_t tile = 0; tile < CPencilTexture::kTiles; ++tile) {
            m_texture.CopyRow(rows[tile], tile, y, m_width);
        }
        const uint8_t* displaced = lines.Row(std::min(y + echoY, m_height - 1));
        std::memcpy(echo, displaced + shift, width - shift);
        std::memset(echo + width - shift, 0, shift);
        sources.luma = tone.Row(y);
        sources.line = lines.Row(y);
        kPencilInkRow.For(m_set)(ink, sources, width, kTone);

        const uint8_t* source = frame.Load(y, m_source.data());
        uint8_t* target = frame.Target(y, m_result.data());
        if (m_mask.IsWhole()) {
            kPencilPaperRow.For(m_set)(target, source, ink, valleys, width);
        } else {
            kPencilPaperRow.For(m_set)(m_result.data(), source, ink, valleys, width);
            kMaskMixRow.For(m_set)(target, source, m_result.data(), m_mask.Row(y), width);
        }
        frame.Store(y, target);
    }
}

void CPencilFilter::Render(const StyleFrame& frame, const PencilSettings& settings,
                           const MaskShape& mask) {
    m_mask.Update(mask, frame.width, frame.height);
    if (m_mask.IsNothing()) {
        frame.Copy();
        return;
    }
    Prepare(frame);
    // Strokes are not to outgrow their tiles, nor to shrink to dots.
    const float scale = std::clamp(static_cast<float>(m_width) / kReferenceWidth, 0.5F, 6.0F);
    m_texture.Draw(settings.strokeSize, scale);
    m_texture.Place(settings.texture);
    ReadLuma(frame);

    const float sigma = (0.32F + 0.065F * static_cast<float>(settings.strokeSize)) * scale;
    const float variance = sigma * sigma;
    Plane* narrow = &m_planes[0];
    Plane* wide = &m_planes[1];
    Smooth(narrow, wide, variance);
    Plane* spare = &m_planes[2];
    SmoothOnce(*narrow, *wide, 1); // from here on the narrow blur stays
    Smooth(wide, spare, variance * (kWideVariance - 1.0F) - 0.5F);

    const PencilLine line = {
        .threshold = static_cast<uint8_t>(settings.edgeThreshold / 14),
        .gain = static_cast<uint8_t>(4 + settings.edgeIntensity * 3 / 10),
    };
    for (int32_t y = 0; y < m_height; ++y) {
        kPencilLineRow.For(m_set)(narrow->Row(y), narrow->Row(y), wide->Row(y),
                                  static_cast<size_t>(m_width), line);
    }
    const auto aside = RoundHalfUp(1.3F * scale);
    DrawRows(frame, *narrow, *wide, aside, aside);
}

} // namespace kyv
