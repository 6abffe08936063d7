// Frames through a mask, on one thread or in bands of rows.
#include "effects/transition/MaskTransition.h"

#include <algorithm>
#include <cstring>
#include <new>

#include "effects/transition/MaskBlend.h"
#include "effects/transition/TransitionParams.h"
#include "imageutility/Bitmap.h"
#include "imageutility/Conversion.h"
#include "interface/FrameGeometry.h"
#include "interface/ParamReader.h"
#include "threading/RowBand.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;
using KYVImageUtility::CImageByte;
using KYVImageUtility::ResizeMode_Bilinear;

constexpr int32_t kRed = 2;
constexpr int32_t kLeastScalable = 2; // pixels each way

MaskBlendParams ReadParams(const EffectContext& context) {
    const CParamReader<TransitionParams::Param> reader(context);
    const uint32_t color = reader.Color(TransitionParams::BorderColor);
    uint32_t first = color & 0xFF, second = color >> 8 & 0xFF, third = color >> 16 & 0xFF;
    if (context.pixelFormat == PixelFormat_Ayuv) {
        KYVImageUtility::RgbToYuv(first, second, third, &first, &second, &third);
    }
    // Bytes run B, G, R or V, U, Y.
    return {.percentage = reader.Float(TransitionParams::Percentage),
            .smoothness = reader.Int(TransitionParams::Smoothness),
            .hasBorder = reader.Byte(TransitionParams::Border) != 0,
            .edge = {static_cast<uint8_t>(third), static_cast<uint8_t>(second),
                     static_cast<uint8_t>(first)}};
}

// One frame's blend, all that the bands share.
struct BlendJob {
    const CImageARGB& output;
    const CImageARGB& picture0;
    const CImageARGB& picture1;
    const CImageByte& mask;
    MaskBlendRow row;
    MaskBlend blend;

    static uint32_t RunBand(void* argument) noexcept {
        const auto* band = static_cast<const RowBand*>(argument);
        static_cast<const BlendJob*>(band->owner)->BlendRows(band->firstRow, band->endRow);
        return kOk;
    }

    // Where the frame is larger than the mask, the mask's last column and row go on.
    void BlendRows(int32_t first, int32_t end) const noexcept {
        const auto width = static_cast<size_t>(output.GetWidth());
        const auto known = std::min(width, static_cast<size_t>(mask.GetWidth()));
        uint8_t beyond[256];
        for (int32_t y = first; y < end; ++y) {
            const uint8_t* values = mask.Row(std::min(y, mask.GetHeight() - 1));
            BlendPart(y, 0, known, values);
            if (known < width) {
                std::memset(beyond, values[known - 1], sizeof beyond);
            }
            for (size_t x = known; x < width; x += sizeof beyond) {
                BlendPart(y, x, std::min(width - x, sizeof beyond), beyond);
            }
        }
    }

    void BlendPart(int32_t y, size_t x, size_t count, const uint8_t* values) const noexcept {
        const size_t at = x * 4;
        row(output.Row(y) + at, picture0.Row(y) + at, picture1.Row(y) + at, values, count, blend);
    }
};

void EnsureSize(CImageARGB& image, int32_t width, int32_t height) {
    if (!image.GetBuffer() || image.GetWidth() != width || image.GetHeight() != height) {
        image.Create(width, height);
    }
}

} // namespace

bool CMaskTransition::LoadMask(const EffectContext& context, uint16_t bitmapId) {
    if (!context.descriptor || !context.descriptor->module) {
        return false;
    }
    CImageARGB bitmap;
    LoadBitmapResource(bitmap, context.descriptor->module->ModuleHandle, bitmapId);
    if (!bitmap.GetBuffer()) {
        return false;
    }
    FrameGeometry geometry;
    if (!GetFrameGeometry(context, geometry)) {
        return true;
    }
    bitmap.TakeCpuLevel(geometry.level);
    const DisplaySize display = GetDisplaySize(context, geometry, KeptSide::Height);
    // A frame of one column or row uses the first of two.
    CImageARGB fitted(std::max(display.width, kLeastScalable),
                      std::max(geometry.height, kLeastScalable));
    if (!fitted.GetBuffer()) {
        throw std::bad_alloc();
    }
    bitmap.Resize(fitted, ResizeMode_Bilinear);
    // A quarter of the memory to read for every frame.
    m_mask.Create(fitted.GetWidth(), fitted.GetHeight());
    fitted.GetChannel(m_mask, kRed);
    return true;
}

void CMaskTransition::Render(const EffectContext& context, void* output, void* const* inputs,
                             CThreadPool* pool) {
    FrameGeometry geometry;
    if (!m_mask.GetBuffer() || !output || !GetFrameGeometry(context, geometry)) {
        return;
    }
    if (!inputs[0] || !inputs[1]) {
        if (const void* single = inputs[0] ? inputs[0] : inputs[1]) {
            CopyView(geometry, output, single);
        }
        return;
    }
    CImageARGB target = ViewOf(geometry, output);
    const CImageARGB pictures[2] = {ViewOf(geometry, inputs[0]), ViewOf(geometry, inputs[1])};
    const bool inBands = pool && context.threadCount >= 2;
    const DisplaySize display = GetDisplaySize(context, geometry, KeptSide::Height);
    const bool isScaled = !inBands && display.differs && geometry.width >= kLeastScalable &&
                          geometry.height >= kLeastScalable;
    for (int i = 0; isScaled && i < 2; ++i) {
        EnsureSize(m_scaled[i], display.width, geometry.height);
        m_scaled[i].SetCpuLevel(context.cpuLevel);
        pictures[i].Resize(m_scaled[i], ResizeMode_Bilinear);
    }
    BlendJob job = {
        .output = isScaled ? m_scaled[0] : target,
        .picture0 = isScaled ? m_scaled[0] : pictures[0],
        .picture1 = isScaled ? m_scaled[1] : pictures[1],
        .mask = m_mask,
        .row = kMaskBlendRow.For(geometry.level.set),
        .blend = {},
    };
    BuildMaskBlend(job.blend, ReadParams(context));
    if (inBands) {
        RunRowBands(*pool, context.threadCount, geometry.height, BlendJob::RunBand, &job);
        return;
    }
    job.BlendRows(0, geometry.height);
    if (isScaled) {
        m_scaled[0].Resize(target, ResizeMode_Bilinear);
    }
}

} // namespace kyv
