// The free-form picture-in-picture effect.
#include "effects/pip/Freeform.h"

#include <algorithm>
#include <cstring>
#include <optional>

#include "effects/pip/FreeformPiP.h"
#include "effects/pip/PictureLayer.h"
#include "effects/pip/ShapeLayer.h"
#include "imageutility/Conversion.h"
#include "interface/FrameGeometry.h"
#include "interface/ParamReader.h"

namespace kyv {

namespace {

using KYVImageUtility::CImageARGB;

// The frame for which sizes in pixels are authored.
constexpr float ReferenceWidth = 320.0F;
constexpr float ReferenceHeight = 240.0F;

static_assert(kWideMapOption == CpuLevelOption_WideMap);

struct LayerSettings {
    bool enabled;
    uint8_t alpha;
    LayerStyle style; // of the picture the blur alone
};

struct Settings {
    RasterPoint corners[4];
    PictureKey key;
    LayerSettings picture;
    LayerSettings shadow;
    int32_t shadowX, shadowY;
    LayerSettings border;
    int32_t borderSize;
    bool ayuv;
    bool wideMap; // for pictures beyond 1024 columns or rows

    bool HasLayers() const { return border.enabled || shadow.enabled; }
};

int32_t ToPixels(float part, int32_t length) {
    return std::clamp(TruncateToInt(part * static_cast<float>(length)), -kFarthestPoint,
                      kFarthestPoint);
}

// A size or a radius, scaled; no frame has use for one beyond its own longest side.
int32_t Scale(int32_t size, float scale) {
    return std::clamp(TruncateToInt(static_cast<float>(size) * scale), 0,
                      static_cast<int32_t>(kMaxFrameSide));
}

LayerColor ToLayerColor(uint32_t color, bool ayuv) {
    uint32_t r = color & 255;
    uint32_t g = color >> 8 & 255;
    uint32_t b = color >> 16 & 255;
    if (ayuv) {
        // Y, U and V take the places of R, G and B.
        KYVImageUtility::RgbToYuv(r, g, b, &r, &g, &b);
    }
    return {{static_cast<uint8_t>(b), static_cast<uint8_t>(g), static_cast<uint8_t>(r)}};
}

Settings ReadSettings(const EffectContext& context, const FrameGeometry& geometry) {
    using Param = Freeform::Param;
    const CParamReader<Param> params(context);
    const float scaleX = static_cast<float>(geometry.width) / ReferenceWidth;
    const float scaleY = static_cast<float>(geometry.height) / ReferenceHeight;
    // Less than half of the frame, as a window of the blur is.
    const int32_t longestBlur = (std::min(geometry.width, geometry.height) - 1) / 2;
    Settings s = {};
    s.ayuv = context.pixelFormat == PixelFormat_Ayuv;
    s.wideMap = HasWideMapOption(context.cpuLevel);
    const auto layer = [&](Param enable, Param alpha, Param blur) -> LayerSettings {
        return {.enabled = params.Int(enable) != 0,
                .alpha = params.Byte(alpha),
                .style = {.blur = std::min(Scale(params.Int(blur), (scaleX + scaleY) / 2.0F),
                                           longestBlur)}};
    };
    const auto color = [&](Param param) { return ToLayerColor(params.Color(param), s.ayuv); };
    for (uint32_t i = 0; i < 4; ++i) {
        s.corners[i] = {ToPixels(params.Float(Param{Param::PointAX + 2 * i}), geometry.width),
                        ToPixels(params.Float(Param{Param::PointAY + 2 * i}), geometry.height)};
    }
    const uint32_t key = params.Color(Param::KeyColor);
    s.key = {params.Int(Param::KeyEnable) != 0,
             (key & 255) << 16 | (key & 0xFF00) | (key >> 16 & 255),
             params.Byte(Param::KeyTolerance)};
    s.picture = layer(Param::PictureEnable, Param::PictureAlpha, Param::PictureBlur);
    s.shadow = layer(Param::ShadowEnable, Param::ShadowAlpha, Param::ShadowBlur);
    s.shadow.style.first = color(Param::ShadowColor1);
    s.shadow.style.second = color(Param::ShadowColor2);
    s.shadow.style.direction = params.Int(Param::ShadowType);
    s.shadowX = ToPixels(params.Float(Param::ShadowOffsetX), geometry.width);
    s.shadowY = ToPixels(params.Float(Param::ShadowOffsetY), geometry.height);
    s.border = layer(Param::BorderEnable, Param::BorderAlpha, Param::BorderBlur);
    s.border.style.first = color(Param::BorderColor1);
    s.border.style.second = color(Param::BorderColor2);
    s.border.style.direction = params.Int(Param::BorderType);
    s.borderSize = s.border.enabled ? Scale(params.Int(Param::BorderSize), scaleX) : -1;
    return s;
}

// Copies a row of the background; null for one of a field that the call does not treat.
uint8_t* CopyRow(uint32_t field, const CImageARGB& background, const CImageARGB& output,
                 int32_t y) {
    if (field == (y % 2 ? FieldSelector_First : FieldSelector_Second)) {
        return nullptr;
    }
    uint8_t* row = output.Row(y);
    if (row != background.Row(y)) {
        std::memcpy(row, background.Row(y), static_cast<size_t>(output.GetWidth()) * 4);
    }
    return row;
}

} // namespace

// One frame: a single pass over its rows. Every layer makes its rows in order and asks those before
// it for as many as it looks at:
//
//   picture    foreground, through the map and the key; coverage is taken from it
//   border     the quad's shape less the coverage
//   shadow     coverage and shape, moved
//   output     background, and over it shadow, border and picture, each blurred on the way
//
// What comes out is the same as if every layer went over the whole frame before the next, but for
// a picture whose box lies outside the frame: it is left out, although its quad marks the edge.
//
// What is kept from frame to frame is compared with what it was made from.
class CPipWork {
public:
    // The output may be the frame of either input. Rows of a field that the call does not treat
    // are left as they are.
    void Render(const Settings& settings, CFreeformPiP& pip, uint32_t field,
                const CImageARGB& foreground, const CImageARGB& background,
                const CImageARGB& output) {
        const int32_t lead =
            Begin(settings, pip, foreground, foreground.GetBuffer() == output.GetBuffer());
        for (int32_t y = 0; y < output.GetHeight(); ++y) {
            m_picture.MakeTo(y + lead);
            uint8_t* row = CopyRow(field, background, output, y);
            if (settings.shadow.enabled) {
                m_shadow.Blend(y, row, settings.shadow.alpha);
            }
            if (settings.border.enabled) {
                m_border.Blend(y, row, settings.border.alpha);
            }
            if (settings.picture.enabled) {
                m_picture.Blend(y, row, settings.picture.alpha);
            }
        }
        pip.EndRows();
        if (settings.shadow.enabled) {
            m_shadow.End();
        }
        if (settings.border.enabled) {
            m_border.End();
        }
    }

private:
    // How many rows ahead of the output the picture is made.
    int32_t Begin(const Settings& settings, CFreeformPiP& pip, const CImageARGB& foreground,
                  bool isOverwritten) {
        const int32_t width = foreground.GetWidth();
        const int32_t height = foreground.GetHeight();
        const RasterPoint source[4] = {{0, 0}, {width, 0}, {width, height}, {0, height}};
        pip.SetSize(width, height, width, height);
        pip.SetWide(settings.wideMap);
        pip.SetSourcePoints(source, 4);
        pip.SetDestPoints(settings.corners, 4);

        BorderShape shape = {width, height, {}, settings.borderSize};
        std::copy(settings.corners, settings.corners + 4, shape.corners);
        int32_t lead = 0;
        if (settings.border.enabled) {
            lead = std::max(lead, settings.border.style.blur);
        }
        if (settings.shadow.enabled) {
            lead = std::max(lead, settings.shadow.style.blur - settings.shadowY);
        }
        lead = isOverwritten ? height : std::min(lead, height);
        const int32_t blur = settings.picture.enabled ? settings.picture.style.blur : 0;
        m_picture.Begin(pip, foreground,
                        {.key = settings.key,
                         .blur = blur,
                         .ayuv = settings.ayuv,
                         .box = shape.Box(),
                         .lead = std::max(lead, blur),
                         .coverage = settings.HasLayers() ? &m_coverage : nullptr});
        if (!settings.HasLayers()) {
            return lead;
        }
        m_coverage.Begin(height, m_picture.Content());
        if (m_borderShape != shape) {
            m_borderShape.reset();
            m_borderSpans.Begin(height);
            AddBorderShape(m_borderSpans, shape);
            m_borderShape = shape;
        }
        const InstructionSet set = foreground.GetInstructionSet();
        if (settings.border.enabled) {
            m_border.Begin({.shape = shape,
                            .ayuv = settings.ayuv,
                            .style = settings.border.style,
                            .takesBorder = true,
                            .cutsPicture = true},
                           pip.Spans(), m_borderSpans, m_coverage, set);
        }
        if (settings.shadow.enabled) {
            m_shadow.Begin({.shape = shape,
                            .ayuv = settings.ayuv,
                            .style = settings.shadow.style,
                            .takesPicture = settings.picture.enabled,
                            .takesBorder = settings.border.enabled,
                            .dx = settings.shadowX,
                            .dy = settings.shadowY},
                           pip.Spans(), m_borderSpans, m_coverage, set);
        }
        return lead;
    }

    CPictureLayer m_picture;
    CCoverage m_coverage;
    CSpanRows m_borderSpans;
    std::optional<BorderShape> m_borderShape; // of the spans
    CShapeLayer m_border;
    CShapeLayer m_shadow;
};

namespace {

void Prepare(Freeform::Instance& instance) {
    if (!instance.pip) {
        instance.pip = new CFreeformPiP;
    }
    if (!instance.work) {
        instance.work = new CPipWork;
    }
}

} // namespace

void Freeform::Begin(EffectContext&, Instance& instance) {
    Prepare(instance);
}

KyvStatus Freeform::Process(EffectContext& context, Instance& instance) {
    FrameGeometry geometry;
    if (!instance.background || !context.frame || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    const CImageARGB output = ViewOf(geometry, context.frame);
    const CImageARGB background = ViewOf(geometry, instance.background);
    const Settings settings = ReadSettings(context, geometry);
    if (!instance.foreground || (!settings.picture.enabled && !settings.HasLayers())) {
        for (int32_t y = 0; y < geometry.height; ++y) {
            CopyRow(context.fieldSelector, background, output, y);
        }
        return KYV_OK;
    }
    Prepare(instance);
    instance.work->Render(settings, *instance.pip, context.fieldSelector,
                          ViewOf(geometry, instance.foreground), background, output);
    return KYV_OK;
}

void Freeform::Release(EffectContext&, Instance& instance) {
    delete instance.pip;
    instance.pip = nullptr;
    delete instance.work;
    instance.work = nullptr;
}

} // namespace kyv
