// The colour temperature effect.
#include "effects/color/ColorTemperature.h"

#include <cmath>
#include <cstring>
#include <limits>

#include "effects/color/ColorFrame.h"
#include "interface/ParamReader.h"

namespace kyv {
namespace {

// Gains of blue, green and red at full degree.
struct ChannelGains {
    double gain[3];
};

constexpr ChannelGains kCool = {{1.3, 1.06, 0.78}};
constexpr ChannelGains kWarm = {{0.32, 1.01, 1.24}};
constexpr ChannelGains kMagenta = {{1.68, 0.96, 1.3}};
constexpr ChannelGains kGreen = {{0.95, 1.5, 0.76}};

constexpr int32_t kSideBySide = 2;

void FillIdentity(ColorTables& tables) {
    for (auto& table : tables.channel) {
        for (uint32_t i = 0; i < 256; ++i) {
            table[i] = i;
        }
    }
}

// The gain runs linearly from 1 at degree 0 to the full gain at degree 1 or -1. Beyond that range
// entries stay within 0..255, and a degree that is not a number changes nothing.
void BuildTables(ColorTables& tables, float degree, const ChannelGains& positive,
                 const ChannelGains& negative) {
    const bool up = degree > 0;
    const double amount = up ? degree : -degree;
    for (int channel = 0; channel < 3; ++channel) {
        double gain = (up ? positive : negative).gain[channel] * amount + (1.0 - amount);
        if (std::isnan(gain)) {
            gain = 1.0;
        }
        for (uint32_t i = 0; i < 256; ++i) {
            const double value = i == 0 ? 0.0 : gain * i;
            tables.channel[channel][i] = value >= 255.0 ? 255
                                         : value > 0.0  ? static_cast<uint32_t>(value)
                                                        : 0;
        }
    }
}

// Writes the centre half of a view twice, side by side. A column that an odd width leaves over
// continues the second half.
void RepeatCentre(uint32_t* to, const uint32_t* from, int32_t width) {
    const int32_t half = width / 2;
    const uint32_t* centre = from + width / 4;
    std::memcpy(to, centre, static_cast<size_t>(half) * 4);
    std::memcpy(to + half, centre, static_cast<size_t>(width - half) * 4);
}

// The comparison buffer, of the frame's size, as the input of the work. The call for the left view
// fills it for both views; the call for the right view takes it as it stands.
const void* ComparisonInput(ColorTemperature::Instance& instance, const FrameGeometry& geometry) {
    const size_t pixels = geometry.frameBytes / 4;
    if (geometry.layout == StereoLayout_RightHalf) {
        // Without the left call there is nothing to show but the input itself.
        return instance.comparisonPixels == pixels ? instance.comparison : instance.input;
    }
    if (pixels > std::numeric_limits<uint32_t>::max()) {
        return instance.input;
    }
    if (!instance.comparison || instance.comparisonPixels != pixels) {
        delete[] instance.comparison;
        instance.comparison = nullptr;
        instance.comparisonPixels = 0;
        instance.comparison = new uint32_t[pixels];
        instance.comparisonPixels = static_cast<uint32_t>(pixels);
    }
    const int32_t views = geometry.layout == StereoLayout_Mono ? 1 : 2;
    const auto* from = static_cast<const uint32_t*>(instance.input);
    uint32_t* to = instance.comparison;
    for (int32_t i = 0; i < geometry.height * views; ++i) {
        RepeatCentre(to, from, geometry.width);
        from += geometry.width;
        to += geometry.width;
    }
    return instance.comparison;
}

} // namespace

void ColorTemperature::Begin(EffectContext& context, Instance& instance) {
    context.requestA = 1;
    context.requestB = 1;
    FillIdentity(instance.temperature);
    FillIdentity(instance.tint);
    instance.temperatureDegree = 0.0F;
    instance.tintDegree = 0.0F;
    Release(context, instance); // a host may prepare twice
}

KyvStatus ColorTemperature::Process(EffectContext& context, Instance& instance) {
    instance.output = context.frame;
    FrameGeometry geometry;
    if (!instance.input || !instance.output || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    const CParamReader<Param> params(context);
    const float temperature = params.Float(Temperature);
    const int32_t comparison = params.Int(Comparison);
    const float tint = params.Float(Tint);

    if (temperature == 0.0F && comparison == 0 && tint == 0.0F) {
        // The call for the left view copies the right one too.
        if (geometry.layout != StereoLayout_RightHalf && instance.output != instance.input) {
            std::memcpy(instance.output, instance.input, geometry.frameBytes);
        }
        return KYV_OK;
    }
    const void* input =
        comparison == kSideBySide ? ComparisonInput(instance, geometry) : instance.input;

    // Comparing the degrees keeps the tables of a run of frames with constant parameters.
    if (temperature != instance.temperatureDegree) {
        BuildTables(instance.temperature, temperature, kCool, kWarm);
        instance.temperatureDegree = temperature;
    }
    if (tint != instance.tintDegree) {
        BuildTables(instance.tint, tint, kMagenta, kGreen);
        instance.tintDegree = tint;
    }

    const CColorFrame frame(context, geometry, instance.output, input);
    const GainCurves temperatureCurves(instance.temperature);
    const GainCurves tintCurves(instance.tint);
    const ColorTemperatureRow row = kColorTemperatureRow.For(geometry.level.set);
    frame.Process(SelectField(context), comparison != 0 ? geometry.width / 2 : 0,
                  [&](uint8_t* dst, const uint8_t* src, size_t count) {
                      row(dst, src, count, temperatureCurves, tintCurves);
                  });
    return KYV_OK;
}

void ColorTemperature::Release(EffectContext&, Instance& instance) {
    delete[] instance.comparison;
    instance.comparison = nullptr;
    instance.comparisonPixels = 0;
}

} // namespace kyv
