// The free-form picture-in-picture effect.
#include "effects/pip/Freeform.h"

#include <algorithm>
#include <cstring>
#include <optional>

#include "effects/pip/BorderShape.h"
#include "effects/pip/Coverage.h"
#include "effects/pip/FreeformPiP.h"
#include "effects/pip/PictureRows.h"
#include "effects/pip/PipLayer.h"
#include "imageutility/Conversion.h"
#include "interface/FrameGeometry.h"
#include "interface/ParamReader.h"

namespace kyv {

// What is kept from frame to frame. Each stage notes what its result was made from and compares it
// with what the next frame wants.
class CPipWork {
public:
    CPictureRows picture;
    CCoverage coverage;
    CSpanRows borderSpans;
    std::optional<BorderShape> borderShape; // of the spans
    CPipLayer border;
    CPipLayer shadow;
};

namespace {

using KYVImageUtility::CImageARGB;

// The frame for which sizes in pixels are authored.
constexpr float ReferenceWidth = 320.0F;
constexpr float ReferenceHeight = 240.0F;

// The bounding box takes no coordinate beyond this.
constexpr int32_t kFarthestInBox = 99999;

static_assert(kWideMapOption == CpuLevelOption_WideMap);

struct LayerSettings {
    bool enabled;
    uint8_t alpha;
    int32_t blur; // pixels
    LayerColor first, second;
    int32_t direction;
};

struct Settings {
    RasterPoint corners[4];
    PictureKey key;
    LayerSettings picture; // without colours
    LayerSettings shadow;
    int32_t shadowX, shadowY;
    LayerSettings border;
    int32_t borderSize;
    bool wideMap; // for pictures beyond 1024 columns or rows

    bool DrawsAnything() const { return picture.enabled || shadow.enabled || border.enabled; }
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

Settings ReadSettings(const EffectContext& context, const FrameGeometry& geometry, bool ayuv) {
    using Param = Freeform::Param;
    const CParamReader<Param> params(context);
    const float scaleX = static_cast<float>(geometry.width) / ReferenceWidth;
    const float scaleY = static_cast<float>(geometry.height) / ReferenceHeight;
    const float scaleBlur = (scaleX + scaleY) / 2.0F;
    Settings s = {};
    const auto corner = [&](Param x, Param y) -> RasterPoint {
        return {ToPixels(params.Float(x), geometry.width),
                ToPixels(params.Float(y), geometry.height)};
    };
    s.corners[0] = corner(Param::PointAX, Param::PointAY);
    s.corners[1] = corner(Param::PointBX, Param::PointBY);
    s.corners[2] = corner(Param::PointCX, Param::PointCY);
    s.corners[3] = corner(Param::PointDX, Param::PointDY);
    const uint32_t key = params.Color(Param::KeyColor);
    s.key = {params.Int(Param::KeyEnable) != 0,
             (key & 255) << 16 | (key & 0xFF00) | (key >> 16 & 255),
             params.Byte(Param::KeyTolerance)};
    s.picture.enabled = params.Int(Param::PictureEnable) != 0;
    s.picture.alpha = params.Byte(Param::PictureAlpha);
    s.picture.blur = Scale(params.Int(Param::PictureBlur), scaleBlur);
    s.shadow.enabled = params.Int(Param::ShadowEnable) != 0;
    s.shadow.first = ToLayerColor(params.Color(Param::ShadowColor1), ayuv);
    s.shadow.second = ToLayerColor(params.Color(Param::ShadowColor2), ayuv);
    s.shadow.direction = params.Int(Param::ShadowType);
    s.shadow.alpha = params.Byte(Param::ShadowAlpha);
    s.shadow.blur = Scale(params.Int(Param::ShadowBlur), scaleBlur);
    s.shadowX = ToPixels(params.Float(Param::ShadowOffsetX), geometry.width);
    s.shadowY = ToPixels(params.Float(Param::ShadowOffsetY), geometry.height);
    s.border.enabled = params.Int(Param::BorderEnable) != 0;
    s.borderSize = s.border.enabled ? Scale(params.Int(Param::BorderSize), scaleX) : 0;
    s.border.first = ToLayerColor(params.Color(Param::BorderColor1), ayuv);
    s.border.second = ToLayerColor(params.Color(Param::BorderColor2), ayuv);
    s.border.direction = params.Int(Param::BorderType);
    s.border.alpha = params.Byte(Param::BorderAlpha);
    s.border.blur = Scale(params.Int(Param::BorderBlur), scaleBlur);
    s.wideMap = HasWideMapOption(context.cpuLevel);
    return s;
}

// The corners' bounding box.
PixelBox BoundCorners(const RasterPoint (&corners)[4]) {
    PixelBox box = {kFarthestInBox, kFarthestInBox, -kFarthestPoint, -kFarthestPoint};
    for (const RasterPoint& corner : corners) {
        const int32_t x = std::min(corner.x, kFarthestInBox);
        const int32_t y = std::min(corner.y, kFarthestInBox);
        box = {std::min(box.left, x), std::min(box.top, y), std::max(box.right, x),
               std::max(box.bottom, y)};
    }
    return {box.left, box.top, box.right + 1, box.bottom + 1};
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

// One frame: a single pass over its rows. Every stage makes the rows of its result in order and
// asks the stages before it for as many as it looks at:
//
//   picture    foreground, through the map and the key; coverage is taken from it
//   border     the quad's shape less the coverage
//   shadow     coverage and shape, moved
//   output     background, and over it shadow, border and picture, each blurred on the way
//
// What comes out is the same as if every stage went over the whole frame before the next, but for
// a picture whose box lies outside the frame: it is left out, although its quad marks the edge.
class CFrameWork {
public:
    CFrameWork(const Settings& settings, CFreeformPiP& pip, CPipWork& work, bool ayuv)
        : m_settings(settings), m_pip(pip), m_work(work), m_ayuv(ayuv),
          m_quadBox(BoundCorners(settings.corners)) {}

    // The output may be the frame of either input. Rows of a field that the call does not treat
    // are left as they are.
    void Render(uint32_t field, const CImageARGB& foreground, const CImageARGB& background,
                const CImageARGB& output) {
        Begin(foreground, foreground.GetBuffer() == output.GetBuffer());
        for (int32_t y = 0; y < output.GetHeight(); ++y) {
            if (HasLayers() || m_lead > 0) {
                m_work.picture.MakeTo(y + m_lead);
            }
            uint8_t* row = CopyRow(field, background, output, y);
            if (m_settings.shadow.enabled) {
                m_work.shadow.Blend(y, row, m_settings.shadow.alpha);
            }
            if (m_settings.border.enabled) {
                m_work.border.Blend(y, row, m_settings.border.alpha);
            }
            if (m_settings.picture.enabled) {
                m_work.picture.Blend(y, row, m_settings.picture.alpha);
            }
        }
        End();
    }

private:
    bool HasLayers() const { return m_settings.border.enabled || m_settings.shadow.enabled; }

    void Begin(const CImageARGB& foreground, bool isOverwritten) {
        const int32_t width = foreground.GetWidth();
        const int32_t height = foreground.GetHeight();
        const RasterPoint source[4] = {{0, 0}, {width, 0}, {width, height}, {0, height}};
        m_pip.SetSize(width, height, width, height);
        m_pip.SetWide(m_settings.wideMap);
        m_pip.SetSourcePoints(source, 4);
        m_pip.SetDestPoints(m_settings.corners, 4);

        const int32_t longestBlur = (std::min(width, height) - 1) / 2;
        const auto blur = [&](const LayerSettings& layer) {
            return layer.enabled ? std::min(layer.blur, longestBlur) : 0;
        };
        m_lead = 0;
        if (m_settings.border.enabled) {
            m_lead = std::max(m_lead, blur(m_settings.border));
        }
        if (m_settings.shadow.enabled) {
            m_lead = std::max(m_lead, blur(m_settings.shadow) - m_settings.shadowY);
        }
        m_lead = isOverwritten ? height : std::min(m_lead, height);
        m_work.picture.Begin(m_pip, foreground,
                             {.key = m_settings.key,
                              .blur = blur(m_settings.picture),
                              .ayuv = m_ayuv,
                              .box = m_quadBox,
                              .lead = std::max(m_lead, blur(m_settings.picture)),
                              .coverage = HasLayers() ? &m_work.coverage : nullptr});
        if (!HasLayers()) {
            return;
        }
        m_work.coverage.Begin(width, height, m_work.picture.Box());
        BorderShape shape = {
            width, height, {}, m_settings.border.enabled ? m_settings.borderSize : -1};
        std::copy(m_settings.corners, m_settings.corners + 4, shape.corners);
        LayerRecipe recipe = {.shape = shape,
                              .box = DrawShape(shape)
                                         .About(m_work.picture.Box())
                                         .CutTo(m_quadBox.Grown(m_settings.borderSize)),
                              .ayuv = m_ayuv,
                              .takesBorder = m_settings.border.enabled,
                              .gradientBox = GradientBox()};
        const auto begin = [&](CPipLayer& layer, const LayerSettings& settings) {
            recipe.first = settings.first;
            recipe.second = settings.second;
            recipe.direction = settings.direction;
            recipe.blur = blur(settings);
            layer.Begin(recipe, m_pip.Spans(), m_work.borderSpans, m_work.coverage,
                        foreground.GetInstructionSet());
        };
        if (m_settings.border.enabled) {
            recipe.cutsPicture = true;
            begin(m_work.border, m_settings.border);
        }
        if (m_settings.shadow.enabled) {
            recipe.cutsPicture = false;
            recipe.takesPicture = m_settings.picture.enabled;
            recipe.dx = m_settings.shadowX;
            recipe.dy = m_settings.shadowY;
            recipe.gradientBox = recipe.gradientBox.Moved(recipe.dx, recipe.dy);
            begin(m_work.shadow, m_settings.shadow);
        }
    }

    void End() {
        m_work.picture.End();
        if (m_settings.border.enabled) {
            m_work.border.End();
        }
        if (m_settings.shadow.enabled) {
            m_work.shadow.End();
        }
    }

    // Its bounds.
    PixelBox DrawShape(const BorderShape& shape) {
        if (m_work.borderShape != shape) {
            m_work.borderShape.reset();
            m_work.borderSpans.Begin(shape.height);
            const PixelBox box =
                m_quadBox.Grown(shape.size).CutTo({0, 0, shape.width, shape.height});
            if (shape.size >= 0 && !box.IsEmpty()) {
                AddBorderShape(m_work.borderSpans,
                               {box.left, box.top, box.right - 1, box.bottom - 1}, shape.corners,
                               shape.size);
            }
            m_work.borderSpans.Finish();
            m_work.borderShape = shape;
        }
        return m_work.borderSpans.Bounds();
    }

    // The corners' box widened by the border; its right and bottom are inside.
    PixelBox GradientBox() const {
        return PixelBox{m_quadBox.left, m_quadBox.top, m_quadBox.right - 1, m_quadBox.bottom - 1}
            .Grown(m_settings.borderSize);
    }

    const Settings& m_settings;
    CFreeformPiP& m_pip;
    CPipWork& m_work;
    bool m_ayuv;
    PixelBox m_quadBox;
    int32_t m_lead = 0; // how many rows ahead of the output the picture is made
};

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
    const bool ayuv = context.pixelFormat == PixelFormat_Ayuv;
    const Settings settings = ReadSettings(context, geometry, ayuv);
    if (!instance.foreground || !settings.DrawsAnything()) {
        for (int32_t y = 0; y < geometry.height; ++y) {
            CopyRow(context.fieldSelector, background, output, y);
        }
        return KYV_OK;
    }
    Prepare(instance);
    CFrameWork work(settings, *instance.pip, *instance.work, ayuv);
    work.Render(context.fieldSelector, ViewOf(geometry, instance.foreground), background, output);
    return KYV_OK;
}

void Freeform::Release(EffectContext&, Instance& instance) {
    delete instance.pip;
    instance.pip = nullptr;
    delete instance.work;
    instance.work = nullptr;
}

} // namespace kyv
