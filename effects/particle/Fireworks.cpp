// The callbacks of the fireworks.
#include "effects/particle/Fireworks.h"

#include <algorithm>
#include <iterator>

#include "effects/particle/ParticleFrame.h"
#include "effects/particle/ParticleFxFireworks.h"

namespace kyv {
namespace {

constexpr PreviewSpan kPreview = {2000, 7000.0F};
constexpr CanvasSize kPreviewCanvas = {320, 240};

} // namespace

void Fireworks::Begin(EffectContext& context, Instance& instance) {
    context.requestB = 1;
    Release(context, instance); // a host may prepare twice
    std::fill(std::begin(instance.params), std::end(instance.params), 0.0F);
    instance.particles = new CParticleFxFireworks;
}

KyvStatus Fireworks::Process(EffectContext& context, Instance& instance) {
    instance.output = context.frame;
    if (!instance.particles) {
        return KYV_OK; // not prepared: the frame stays as the host supplied it
    }
    FrameGeometry geometry;
    if (!instance.input || !instance.output || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    CParticleFxFireworks& particles = *instance.particles;
    if (ReadChanged(context, Depth, instance.params)) {
        particles.ClearSnapshots();
    }
    // A preview is drawn small and scaled up.
    const CanvasSize size = context.preview != 0
                                ? kPreviewCanvas
                                : ChooseCanvasSize(context, geometry, CanvasRule::KeepHeight);
    CParticleCanvas canvas(context, geometry, size, CParticleCanvas::Pixels::Argb);
    const ParticleBounds bounds = canvas.GetBounds();
    particles.SetFrame(
        {
            .size = instance.params[Size],
            .density = instance.params[Density],
            .scale = canvas.GetScale(),
            .spawn = {.x = 0.0F,
                      .y = 0.0F,
                      .z = instance.params[Depth],
                      .xRange = bounds.width,
                      .yRange = bounds.bottom},
            .bounds = bounds,
            .canvas = &canvas.GetImage(),
        },
        GetStereoMode(geometry));
    DrawAnimation(context, geometry, kPreview, instance.input, canvas, particles);
    return KYV_OK;
}

void Fireworks::Release(EffectContext&, Instance& instance) {
    delete instance.particles;
    instance.particles = nullptr;
}

} // namespace kyv
