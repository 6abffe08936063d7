// The free-form picture-in-picture effect.
#include "effects/pip/Freeform.h"

#include <algorithm>
#include <cstring>

#include "effects/pip/FreeformPiP.h"
#include "effects/pip/PictureRows.h"
#include "effects/pip/PipLayers.h"
#include "imageutility/Conversion.h"
#include "imageutility/kernels/AlphaBlend.h"
#include "interface/FrameGeometry.h"
#include "interface/ParamReader.h"

namespace kyv {

// The work images, kept from frame to frame; those of a layer that has never been on have no
// pixels.
class CPipWork {
public:
    CPipLayer picture;
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
    return s;
}

// The corners' bounding box, both ends inside.
RasterWindow BoundCorners(const RasterPoint (&corners)[4]) {
    const auto capped = [](int32_t value) { return std::min(value, kFarthestInBox); };
    RasterWindow box = {kFarthestInBox, kFarthestInBox, -kFarthestPoint, -kFarthestPoint};
    for (const RasterPoint& corner : corners) {
        box.left = std::min(box.left, capped(corner.x));
        box.top = std::min(box.top, capped(corner.y));
        box.right = std::max(box.right, capped(corner.x));
        box.bottom = std::max(box.bottom, capped(corner.y));
    }
    return box;
}

// The output's rows. Those of a field that the call does not treat are left as they are.
class COutput final : public CRowSink {
public:
    COutput(const EffectContext& context, const CImageARGB& image, const CImageARGB& background)
        : m_image(image), m_background(background), m_field(context.fieldSelector),
          m_blend(kAlphaBlend.For(Resolve(context.cpuLevel))) {}

    // Copies a row of the background. Null for a row that is not treated.
    uint8_t* BeginRow(int32_t y) const {
        if (m_field == (y % 2 ? FieldSelector_First : FieldSelector_Second)) {
            return nullptr;
        }
        uint8_t* row = m_image.Row(y);
        if (row != m_background.Row(y)) {
            std::memcpy(row, m_background.Row(y), static_cast<size_t>(m_image.GetWidth()) * 4);
        }
        return row;
    }

    void CopyRows(int32_t first, int32_t end) const {
        for (int32_t y = first; y < end; ++y) {
            BeginRow(y);
        }
    }

    // Where and how the rows of a picture alone go.
    void SetPicture(const PixelBox& box, uint8_t alpha) {
        m_box = box;
        m_alpha = alpha;
    }
    void Take(int32_t y, const uint8_t* pixels) override {
        if (uint8_t* row = BeginRow(y)) {
            m_blend(row + ptrdiff_t{4} * m_box.left, pixels, static_cast<size_t>(m_box.Width()),
                    m_alpha);
        }
    }

private:
    const CImageARGB& m_image;
    const CImageARGB& m_background;
    uint32_t m_field;
    AlphaBlendRow m_blend;
    PixelBox m_box = {};
    uint8_t m_alpha = 0;
};

// One frame's work. What is drawn is the same as if every pass went over the whole frame, but for a
// picture whose box lies outside the frame: it is left out, although its quad marks the edge.
class CFrameWork {
public:
    CFrameWork(const Settings& settings, CFreeformPiP& pip, CPipWork& work, bool ayuv)
        : m_settings(settings), m_pip(pip), m_work(work), m_ayuv(ayuv) {
        const RasterWindow box = BoundCorners(settings.corners);
        m_quadBox = {box.left, box.top, box.right + 1, box.bottom + 1};
        m_gradientBox =
            PixelBox{box.left, box.top, box.right, box.bottom}.Grown(settings.borderSize);
    }

    // The output may be the frame of either input: the layers are made before it is written, and
    // what is written row by row needs a foreground of its own.
    void Render(const CImageARGB& foreground, COutput& output, bool sharesForeground) {
        const int32_t width = foreground.GetWidth();
        const int32_t height = foreground.GetHeight();
        const RasterPoint source[4] = {{0, 0}, {width, 0}, {width, height}, {0, height}};
        m_pip.SetSize(width, height, width, height);
        m_pip.SetSourcePoints(source, 4);
        m_pip.SetDestPoints(m_settings.corners, 4);
        const bool alone = m_settings.picture.enabled && m_settings.picture.blur == 0 &&
                           !m_settings.border.enabled && !m_settings.shadow.enabled;
        if (alone && !sharesForeground &&
            Resolve(foreground.GetCpuLevel()) != InstructionSet::Scalar) {
            RenderPictureAlone(foreground, output);
            return;
        }
        MakeLayers(foreground);
        for (int32_t y = 0; y < height; ++y) {
            if (uint8_t* row = output.BeginRow(y)) {
                BlendRow(row, y);
            }
        }
    }

private:
    PixelBox Frame() const { return m_work.picture.Frame(); }

    void RenderPictureAlone(const CImageARGB& foreground, COutput& output) {
        // The layer does not get what the map will have.
        m_work.picture.Outdate();
        const PixelBox frame = {0, 0, foreground.GetWidth(), foreground.GetHeight()};
        const PixelBox box = PictureBox(frame);
        if (box.IsEmpty()) {
            output.CopyRows(0, frame.bottom);
            return;
        }
        output.CopyRows(0, box.top);
        output.SetPicture(box, m_settings.picture.alpha);
        CPictureRows rows(frame.right, box, m_settings.key, m_ayuv, foreground.GetCpuLevel(),
                          output);
        m_pip.RenderRows(foreground, rows);
        rows.Finish();
        output.CopyRows(box.bottom, frame.bottom);
    }

    // Where the picture can be, with the neighbours that the key looks at; empty for a quad outside
    // the frame.
    PixelBox PictureBox(const PixelBox& frame) const {
        const PixelBox inside = m_quadBox.CutTo(frame);
        return inside.IsEmpty() ? PixelBox{} : inside.Grown(1).CutTo(frame);
    }

    void MakeLayers(const CImageARGB& foreground) {
        RenderPicture(foreground);
        if (m_settings.border.enabled) {
            m_work.border.Reset(foreground, m_ayuv, TransparentBlack(m_ayuv));
            MakeBorder();
        }
        if (m_settings.shadow.enabled) {
            m_work.shadow.Reset(foreground, m_ayuv, TransparentBlack(m_ayuv));
            MakeShadow();
        }
        // These are cut from unblurred coverage, so all blurring comes after.
        if (m_settings.border.enabled) {
            m_work.border.Blur(m_quadBox.Grown(m_settings.borderSize).CutTo(Frame()),
                               m_settings.border.blur);
        }
        if (m_settings.picture.enabled) {
            m_work.picture.Blur(m_quadBox.CutTo(Frame()), m_settings.picture.blur);
        }
    }

    void BlendRow(uint8_t* row, int32_t y) const {
        if (m_settings.shadow.enabled) {
            m_work.shadow.BlendRow(row, y, m_settings.shadow.alpha);
        }
        if (m_settings.border.enabled) {
            m_work.border.BlendRow(row, y, m_settings.border.alpha);
        }
        if (m_settings.picture.enabled) {
            m_work.picture.BlendRow(row, y, m_settings.picture.alpha);
        }
    }

    void RenderPicture(const CImageARGB& foreground) {
        CPipLayer& layer = m_work.picture;
        // Keying takes a whole AYUV frame through RGB, from where zeros come back as something
        // else.
        const bool convertsClear = m_ayuv && m_settings.key.enabled;
        // Through the same map the same pixels are drawn again, and the others are still clear.
        if (m_pip.IsDirty() || convertsClear || !layer.Fits(foreground, m_ayuv)) {
            // Beyond its box a quad is drawn outside the part in use.
            if (std::max(layer.Frame().right, layer.Frame().bottom) > kFarthestInBox) {
                layer.Use(layer.Frame());
            }
            layer.Reset(foreground, m_ayuv, 0);
        }
        const PixelBox box = PictureBox(Frame());
        if (box.IsEmpty()) {
            return;
        }
        // With all that a blur will look at.
        const int32_t margin =
            convertsClear && m_settings.picture.enabled ? 2 * m_settings.picture.blur : 0;
        layer.Use(box.Grown(margin));
        m_pip.Render(foreground, layer.Image());
        if (m_settings.key.enabled) {
            layer.ColorKey(m_settings.key);
        }
        if (convertsClear) {
            layer.Outdate();
        }
    }

    void MakeBorder() {
        const LayerSettings& settings = m_settings.border;
        CPipLayer& layer = m_work.border;
        layer.Use(m_quadBox.Grown(m_settings.borderSize));
        DrawBorder(layer, m_settings.corners, m_settings.borderSize, settings.first.Opaque());
        layer.ClearUnder(m_work.picture);
        Recolor(layer, settings, m_gradientBox);
    }

    void MakeShadow() {
        const LayerSettings& settings = m_settings.shadow;
        CPipLayer& layer = m_work.shadow;
        const int32_t dx = m_settings.shadowX;
        const int32_t dy = m_settings.shadowY;
        // Only what is in the frame casts a shadow.
        const PixelBox box =
            m_quadBox.Grown(m_settings.borderSize).CutTo(Frame()).Moved(dx, dy).CutTo(Frame());
        layer.Use(box);
        if (m_settings.picture.enabled) {
            layer.Stamp(m_work.picture, dx, dy, settings.first.Opaque());
        }
        if (m_settings.border.enabled) {
            layer.Stamp(m_work.border, dx, dy, settings.first.Opaque());
        }
        Recolor(layer, settings, m_gradientBox.Moved(dx, dy));
        layer.Blur(box, settings.blur);
    }

    static void Recolor(CPipLayer& layer, const LayerSettings& settings, const PixelBox& box) {
        if (settings.first != settings.second) {
            layer.Gradient(box, settings.direction, settings.first, settings.second);
        }
    }

    const Settings& m_settings;
    CFreeformPiP& m_pip;
    CPipWork& m_work;
    bool m_ayuv;
    PixelBox m_quadBox;     // of the corners
    PixelBox m_gradientBox; // widened by the border; its right and bottom are inside
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
    const CImageARGB output = ViewOf(context, geometry, context.frame);
    const CImageARGB background = ViewOf(context, geometry, instance.background);
    COutput rows(context, output, background);
    if (!instance.foreground) {
        rows.CopyRows(0, geometry.height);
        return KYV_OK;
    }
    const bool ayuv = context.pixelFormat == PixelFormat_Ayuv;
    const Settings settings = ReadSettings(context, geometry, ayuv);
    Prepare(instance);
    CFrameWork work(settings, *instance.pip, *instance.work, ayuv);
    work.Render(ViewOf(context, geometry, instance.foreground), rows,
                instance.foreground == context.frame);
    return KYV_OK;
}

void Freeform::Release(EffectContext&, Instance& instance) {
    delete instance.pip;
    instance.pip = nullptr;
    delete instance.work;
    instance.work = nullptr;
}

} // namespace kyv
