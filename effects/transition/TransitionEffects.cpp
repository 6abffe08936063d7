// The callbacks of the mask transitions.
#include "effects/transition/TransitionEffects.h"

#include <memory>

#include "effects/transition/MaskTransition.h"
#include "threading/ThreadPool.h"

namespace kyv {
namespace {

constexpr uint16_t kTestAlphaMaskId = 113;
constexpr uint16_t kAlphaTransitionMaskId = 140;

} // namespace

KyvStatus TestAlpha::Begin(EffectContext& context, Instance& instance) {
    context.requestA = 1;
    Release(context, instance); // a host may prepare twice
    auto mask = std::make_unique<CMaskTransition>();
    if (!mask->LoadMask(context, kTestAlphaMaskId)) {
        return KYV_FAIL;
    }
    instance.mask = mask.release();
    return KYV_OK;
}

KyvStatus TestAlpha::Process(EffectContext& context, Instance& instance) {
    instance.output = context.frame;
    if (instance.mask) {
        instance.mask->Render(context, instance.output, instance.inputs, nullptr);
    }
    return KYV_OK;
}

void TestAlpha::Release(EffectContext&, Instance& instance) {
    delete instance.mask;
    instance.mask = nullptr;
}

KyvStatus AlphaTransition::Begin(EffectContext& context, Instance& instance) {
    context.requestA = 1;
    Release(context, instance); // a host may prepare twice
    auto pool = std::make_unique<CThreadPool>();
    auto mask = std::make_unique<CMaskTransition>();
    if (!mask->LoadMask(context, kAlphaTransitionMaskId)) {
        return KYV_FAIL;
    }
    instance.mask = mask.release();
    instance.pool = pool.release();
    return KYV_OK;
}

KyvStatus AlphaTransition::Process(EffectContext& context, Instance& instance) {
    instance.output = context.frame;
    if (instance.mask) {
        instance.mask->Render(context, instance.output, instance.inputs, instance.pool);
    }
    return KYV_OK;
}

void AlphaTransition::Release(EffectContext&, Instance& instance) {
    delete instance.pool;
    instance.pool = nullptr;
    delete instance.mask;
    instance.mask = nullptr;
}

} // namespace kyv
