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

bool ReadParams(const EffectContext& context, Fireworks::Instance& instance) {
    const CParamReader reader(context);
    const float params[] = {
        ReadWithin(reader, 0, 0.0F, 1.0F),
        ReadWithin(reader, 1, 0.0F, 1.0F),
        ReadWithin(reader, 2, -1.0F, 1.0F),
    };
    const bool changed =
        !std::equal(std::begin(params), std::end(params), std::begin(instance.params));
    std::copy(std::begin(params), std::end(params), std::begin(instance.params));
    return changed;
}

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
    if (ReadParams(context, instance)) {
        particles.ClearSnapshots();
    }
    // A preview is drawn small and scaled up.
    const CanvasSize size = context.preview != 0
                                ? kPreviewCanvas
                                : ChooseCanvasSize(context, geometry, CanvasRule::KeepHeight);
    CParticleCanvas canvas(context, geometry, size, CParticleCanvas::Pixels::Argb);
    const auto width = static_cast<float>(canvas.GetImage().GetWidth());
    const auto height = static_cast<float>(canvas.GetImage().GetHeight());
    particles.SetFrame(
        {
            .size = instance.params[0],
            .density = instance.params[1],
            .scale = width / 720.0F,
            .spawn =
                {.x = 0.0F, .y = 0.0F, .z = instance.params[2], .xRange = width, .yRange = height},
            .bounds = {.left = 0.0F, .top = 0.0F, .width = width, .bottom = height},
            .canvas = &canvas.GetImage(),
            .cpuLevel = context.cpuLevel,
        },
        GetStereoMode(geometry));
    particles.SetDuration(GetDurationMs(context));
    particles.AdvanceTo(GetPositionMs(context, kPreview));

    CopyView(geometry, instance.output, instance.input);
    if (particles.IsVisible()) {
        canvas.Load();
        particles.RenderIfVisible();
        canvas.Store();
    }
    return KYV_OK;
}

void Fireworks::Release(EffectContext&, Instance& instance) {
    delete instance.particles;
    instance.particles = nullptr;
}

} // namespace kyv
