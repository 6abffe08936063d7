// From the host's context to what a particle class is given.
#include "effects/particle/ParticleFrame.h"

#include <algorithm>
#include <new>

#include "effects/particle/ParticleMath.h"
#include "imageutility/Bitmap.h"
#include "interface/ParamReader.h"
#include "platform/ImageFile.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;
using KYVImageUtility::ResizeMode_Bilinear;

constexpr int64_t kUnitsPerMs = 10000; // host times are in 100 ns units

int32_t ToMs(int64_t time) {
    return static_cast<int32_t>(std::clamp<int64_t>(time / kUnitsPerMs, INT32_MIN, INT32_MAX));
}

uint8_t* ViewStart(const FrameGeometry& geometry, void* frame) {
    return static_cast<uint8_t*>(frame) + geometry.viewOffset;
}

int32_t GetPositionMs(const EffectContext& context, const PreviewSpan& preview) {
    if (context.preview == 0) {
        return std::max(ToMs(context.position), 0);
    }
    const float fraction = context.previewFraction;
    const float inside = fraction == fraction ? std::clamp(fraction, 0.0F, 1.0F) : 0.0F;
    return preview.startMs + TruncateToInt(preview.lengthMs * inside);
}

} // namespace

void LoadPicture(CImageARGB& picture, const EffectContext& context, uint16_t id) {
    if (!context.descriptor || !context.descriptor->module) {
        return;
    }
    const KyvModuleHandle module = context.descriptor->module->ModuleHandle;
    LoadPngResource(picture, module, "PNG", id);
    if (!picture.GetBuffer() && HasResource(module, "PNG", id)) {
        throw std::bad_alloc();
    }
}

bool ReadChanged(const EffectContext& context, uint32_t depth, std::span<float> cached) {
    bool changed = false;
    for (uint32_t i = 0; i < cached.size(); ++i) {
        float read;
        ReadParam(context, i, &read, sizeof read);
        const float value = read == read ? std::clamp(read, i == depth ? -1.0F : 0.0F, 1.0F) : 0.0F;
        changed = changed || value != cached[i];
        cached[i] = value;
    }
    return changed;
}

StereoMode GetStereoMode(const FrameGeometry& geometry) {
    switch (geometry.layout) {
    case StereoLayout_LeftHalf:
        return StereoMode::LeftView;
    case StereoLayout_RightHalf:
        return StereoMode::RightView;
    default:
        return StereoMode::Mono;
    }
}

CanvasSize ChooseCanvasSize(const EffectContext& context, const FrameGeometry& geometry,
                            CanvasRule rule) {
    if (geometry.layout != StereoLayout_Mono) {
        return {geometry.width, geometry.height};
    }
    const bool keepsWidth =
        rule == CanvasRule::KeepShorterSide && geometry.width <= geometry.height;
    const DisplaySize size =
        GetDisplaySize(context, geometry, keepsWidth ? KeptSide::Width : KeptSide::Height);
    return {size.width, size.height};
}

CParticleCanvas::CParticleCanvas(const EffectContext& context, const FrameGeometry& geometry,
                                 CanvasSize size, Pixels pixels)
    : m_bConverted(pixels == Pixels::Argb && context.pixelFormat == PixelFormat_Ayuv),
      m_bScaled((size.width != geometry.width || size.height != geometry.height) &&
                geometry.width >= 2 && geometry.height >= 2 && size.width >= 2 &&
                size.height >= 2) {
    uint8_t* start = ViewStart(geometry, context.frame);
    if (m_bConverted) {
        m_ayuvView.Attach(start, geometry.width, geometry.height, geometry.pitchBytes);
        m_ayuvView.TakeCpuLevel(geometry.level);
        m_frame.Create(geometry.width, geometry.height);
    } else {
        m_frame.Attach(start, geometry.width, geometry.height, geometry.pitchBytes);
    }
    m_frame.TakeCpuLevel(geometry.level);
    if (m_bScaled) {
        m_canvas.Create(size.width, size.height);
        m_canvas.TakeCpuLevel(geometry.level);
    }
}

ParticleBounds CParticleCanvas::GetBounds() const {
    const CImageARGB& image = m_bScaled ? m_canvas : m_frame;
    return {.left = 0.0F,
            .top = 0.0F,
            .width = static_cast<float>(image.GetWidth()),
            .bottom = static_cast<float>(image.GetHeight())};
}

void CParticleCanvas::Load() {
    if (m_bConverted) {
        m_ayuvView.ToARGB(m_frame);
    }
    if (m_bScaled) {
        m_frame.Resize(m_canvas, ResizeMode_Bilinear);
    }
}

void CParticleCanvas::Store() {
    if (m_bScaled) {
        m_canvas.Resize(m_frame, ResizeMode_Bilinear);
    }
    if (m_bConverted) {
        m_frame.ToAYUV(m_ayuvView);
    }
}

void DrawAnimation(const EffectContext& context, const FrameGeometry& geometry,
                   const PreviewSpan& preview, const void* input, CParticleCanvas& canvas,
                   CParticleFxBase& particles) {
    particles.SetDuration(ToMs(context.duration));
    particles.AdvanceTo(GetPositionMs(context, preview));

    CopyView(geometry, context.frame, input);
    if (particles.IsVisible()) {
        canvas.Load();
        particles.RenderIfVisible();
        canvas.Store();
    }
}

} // namespace kyv
