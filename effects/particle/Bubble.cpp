// The callbacks of the bubble effects.
#include "effects/particle/Bubble.h"

#include <algorithm>
#include <iterator>
#include <memory>

#include "effects/particle/ParticleFrame.h"
#include "effects/particle/ParticleFxBubble.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;
using KYVImageUtility::CImageAYUV;

constexpr uint16_t kBodyId = 141;
constexpr uint16_t kMiniatureMaskId = 142;
constexpr uint16_t kLensMaskId = 143;

constexpr PreviewSpan kPreview = {10000, 15000.0F};

void Release(BubbleInstance& instance) {
    delete instance.mask;
    instance.mask = nullptr;
    delete instance.body;
    instance.body = nullptr;
    delete instance.particles;
    instance.particles = nullptr;
}

void Begin(EffectContext& context, BubbleInstance& instance, uint16_t maskId) {
    context.requestB = 1;
    Release(instance); // a host may prepare twice
    std::fill(std::begin(instance.params), std::end(instance.params), 0.0F);

    auto particles = std::make_unique<CParticleFxBubble>();
    auto body = std::make_unique<CImageARGB>();
    auto mask = std::make_unique<CImageARGB>();
    body->SetCpuLevel(context.cpuLevel);
    LoadPicture(*body, context, kBodyId);
    LoadPicture(*mask, context, maskId);
    if (context.pixelFormat == PixelFormat_Ayuv && body->GetBuffer()) {
        CImageAYUV converted(body->GetBuffer(), body->GetWidth(), body->GetHeight(),
                             body->GetPitch());
        body->ToAYUV(converted); // in place
    }
    instance.particles = particles.release();
    instance.body = body.release();
    instance.mask = mask.release();
}

KyvStatus Process(EffectContext& context, BubbleInstance& instance, bool isRefractive) {
    instance.output = context.frame;
    if (!instance.particles || !instance.body || !instance.body->GetBuffer() || !instance.mask ||
        !instance.mask->GetBuffer()) {
        return KYV_OK; // a picture is missing: the frame stays as the host supplied it
    }
    FrameGeometry geometry;
    if (!instance.input || !instance.output || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    CParticleFxBubble& particles = *instance.particles;
    if (ReadChanged(context, BubbleParams::Depth, instance.params)) {
        particles.ClearSnapshots();
    }
    const CanvasSize size = ChooseCanvasSize(context, geometry, CanvasRule::KeepShorterSide);
    CParticleCanvas canvas(context, geometry, size, CParticleCanvas::Pixels::AsTheyCome);
    const CImageARGB source = ViewOf(geometry, instance.input);
    const ParticleBounds bounds = canvas.GetBounds();
    particles.SetFrame(
        {
            .density = instance.params[BubbleParams::Density],
            .minSize = instance.params[BubbleParams::MinSize],
            .maxSize = instance.params[BubbleParams::MaxSize],
            .isRefractive = isRefractive,
            .displayWidth = static_cast<int32_t>(context.displayAspectX),
            .displayHeight = static_cast<int32_t>(context.displayAspectY),
            .scale = canvas.GetScale(),
            .spawn = {.x = 0.0F,
                      .y = bounds.bottom - 1.0F,
                      .z = instance.params[BubbleParams::Depth],
                      .xRange = bounds.width,
                      .yRange = 0.0F},
            .bounds = bounds,
            .canvas = &canvas.GetImage(),
            .source = &source,
            .body = instance.body,
            .mask = instance.mask,
        },
        GetStereoMode(geometry));
    DrawAnimation(context, geometry, kPreview, instance.input, canvas, particles);
    return KYV_OK;
}

} // namespace

void Bubble::Begin(EffectContext& context, Instance& instance) {
    kyv::Begin(context, instance, kMiniatureMaskId);
}

KyvStatus Bubble::Process(EffectContext& context, Instance& instance) {
    return kyv::Process(context, instance, false);
}

void Bubble::Release(EffectContext&, Instance& instance) {
    kyv::Release(instance);
}

void RefractiveBubble::Begin(EffectContext& context, Instance& instance) {
    kyv::Begin(context, instance, kLensMaskId);
}

KyvStatus RefractiveBubble::Process(EffectContext& context, Instance& instance) {
    return kyv::Process(context, instance, true);
}

void RefractiveBubble::Release(EffectContext&, Instance& instance) {
    kyv::Release(instance);
}

} // namespace kyv
