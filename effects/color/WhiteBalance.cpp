// The white balance effect.
#include "effects/color/WhiteBalance.h"

#include <algorithm>
#include <cmath>

#include "effects/color/ColorFrame.h"
#include "effects/color/WhiteBalanceRow.h"
#include "interface/ParamReader.h"

namespace kyv {
namespace {

void FillIdentity(uint32_t (&table)[256]) {
    for (uint32_t i = 0; i < 256; ++i) {
        table[i] = i;
    }
}

bool IsIdentity(const uint32_t (&table)[256]) {
    for (uint32_t i = 0; i < 256; ++i) {
        if (table[i] != i) {
            return false;
        }
    }
    return true;
}

// The rounded luma of the reference, 0..255, in single precision and in this order.
uint32_t ReferenceLuma(uint32_t r, uint32_t g, uint32_t b) {
    const float sum = (static_cast<float>(r) * 0.3F + 0.5F) + static_cast<float>(g) * 0.59F +
                      static_cast<float>(b) * 0.11F;
    return static_cast<uint32_t>(std::floor(sum));
}

// Maps the reference's channel value onto its luma. Below the luma the curve runs through (0, 0),
// (value, luma) and (255, 255); above it is one line through the origin.
void BuildTable(uint32_t (&table)[256], uint32_t value, uint32_t luma) {
    if (luma > value) {
        for (uint32_t i = 0; i < value; ++i) {
            table[i] = i * luma / value;
        }
        for (uint32_t i = value; i < 256; ++i) {
            table[i] = (255 * (luma - value) + i * (255 - luma)) / (255 - value);
        }
    } else if (value == 0) {
        FillIdentity(table);
    } else {
        for (uint32_t i = 0; i < 256; ++i) {
            table[i] = std::min(i * luma / value, 255U);
        }
    }
}

} // namespace

void WhiteBalance::Begin(EffectContext& context, Instance& instance) {
    context.requestA = 1;
    context.requestB = 1;
    FillIdentity(instance.red);
    FillIdentity(instance.green);
    FillIdentity(instance.blue);
    instance.reference = 0; // black, whose tables are the identity
    instance.reserved = nullptr;
    instance.reservedSize = 0;
}

KyvStatus WhiteBalance::Process(EffectContext& context, Instance& instance) {
    instance.output = context.frame;
    FrameGeometry geometry;
    if (!instance.input || !instance.output || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    const CParamReader<Param> params(context);
    const uint32_t reference = params.Color(ReferencePoint);
    const bool compare = params.Int(Comparison) != 0;

    // Single fields are left as they are: an ARGB frame is not touched at all, an AYUV frame
    // carries the source, after its round trip when the tables would change a whole frame.
    const bool wholeFrame = context.fieldSelector != FieldSelector_First &&
                            context.fieldSelector != FieldSelector_Second;
    if (wholeFrame && reference != instance.reference) {
        instance.reference = reference;
        const uint32_t r = reference & 255;
        const uint32_t g = reference >> 8 & 255;
        const uint32_t b = reference >> 16 & 255;
        const uint32_t luma = ReferenceLuma(r, g, b);
        BuildTable(instance.red, r, luma);
        BuildTable(instance.green, g, luma);
        BuildTable(instance.blue, b, luma);
    }

    // The way through RGB and back would change an AYUV frame that is to stay as it is.
    if (context.pixelFormat == PixelFormat_Ayuv && IsIdentity(instance.red) &&
        IsIdentity(instance.green) && IsIdentity(instance.blue)) {
        CopyView(geometry, instance.output, instance.input);
        return KYV_OK;
    }
    const CColorFrame frame(context, geometry, instance.output, instance.input);
    const KneeCurves curves({instance.blue, instance.reference >> 16 & 255},
                            {instance.green, instance.reference >> 8 & 255},
                            {instance.red, instance.reference & 255});
    const WhiteBalanceRow row = kWhiteBalanceRow.For(geometry.level.set);
    frame.Process(
        wholeFrame ? SelectField(context) : kNoRows, compare ? geometry.width / 2 : 0,
        [&](uint8_t* dst, const uint8_t* src, size_t count) { row(dst, src, count, curves); });
    return KYV_OK;
}

void WhiteBalance::Release(EffectContext&, Instance&) {}

} // namespace kyv
