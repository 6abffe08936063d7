// The callbacks of the water ripple.
#include "effects/particle/WaterRipple.h"

#include <memory>

#include "effects/particle/ParticleFrame.h"
#include "effects/particle/ParticleFxWaterripple.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;

constexpr uint16_t kSheenId = 145;

constexpr PreviewSpan kPreview = {12000, 8000.0F};

} // namespace

void WaterRipple::Begin(EffectContext& context, Instance& instance) {
    Release(context, instance); // a host may prepare twice
    instance.params[Density] = 0.0F;
    auto particles = std::make_unique<CParticleFxWaterripple>();
    auto sheen = std::make_unique<CImageARGB>();
    LoadPicture(*sheen, context, kSheenId);
    instance.particles = particles.release();
    instance.sheen = sheen.release();
}

KyvStatus WaterRipple::Process(EffectContext& context, Instance& instance) {
    instance.output = context.frame;
    if (!instance.particles || !instance.sheen || !instance.sheen->GetBuffer()) {
        return KYV_OK; // the picture is missing: the frame stays as the host supplied it
    }
    FrameGeometry geometry;
    if (!instance.input || !instance.output || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    CParticleFxWaterripple& particles = *instance.particles;
    if (ReadChanged(context, kNoDepth, instance.params)) {
        particles.ClearSnapshots();
    }
    const CanvasSize size = ChooseCanvasSize(context, geometry, CanvasRule::KeepShorterSide);
    CParticleCanvas canvas(context, geometry, size, CParticleCanvas::Pixels::Argb);
    instance.sheen->TakeCpuLevel(geometry.level);
    particles.SetFrame({
        .canvas = &canvas.GetImage(),
        .sheen = instance.sheen,
        .scale = canvas.GetScale(),
        .density = instance.params[Density],
    });
    DrawAnimation(context, geometry, kPreview, instance.input, canvas, particles);
    return KYV_OK;
}

void WaterRipple::Release(EffectContext&, Instance& instance) {
    delete instance.sheen;
    instance.sheen = nullptr;
    delete instance.particles;
    instance.particles = nullptr;
}

} // namespace kyv
