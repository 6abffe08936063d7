// One record an effect. Identifiers, keys, authors and vendors are what hosts match on and are
// kept to the letter, slips of the pen included.
#include "module/EffectTable.h"

#include "effects/color/ColorTemperature.h"
#include "effects/color/WhiteBalance.h"
#include "effects/particle/Bubble.h"
#include "effects/particle/Fireworks.h"
#include "effects/particle/WaterRipple.h"
#include "effects/pip/Freeform.h"
#include "effects/style/Dreamy.h"
#include "effects/style/LightRay.h"
#include "effects/style/PencilSketch.h"
#include "effects/transition/TransitionEffects.h"
#include "interface/EffectGlue.h"
#include "module/Module.h"
#include "module/ParamTables.h"

namespace kyv {
namespace {

struct EffectTexts {
    const char* identifier;
    const char* nameKey;
    const char* descKey;
    const char* author;
    const char* vendor;
    const char* subclass;
};

template <class Effect, size_t N>
consteval EffectDescriptor Describe(const EffectTexts& texts, const EffectProperties& properties,
                                    const ParamTable<N>& params) {
    return {
        .identifier = texts.identifier,
        .nameKey = texts.nameKey,
        .descKey = texts.descKey,
        .author = texts.author,
        .vendor = texts.vendor,
        .properties = properties,
        .paramCount = N,
        .params = params.data(),
        .module = &g_module,
        .instanceDataSize = sizeof(typename Effect::Instance),
        .reserved84 = 0,
        .callbacks = EffectGlue<Effect>::kCallbacks,
        .subclass = texts.subclass,
    };
}

} // namespace

// clang-format off
constinit const EffectDescriptor kEffects[kEffectCount] = {
    Describe<RefractiveBubble>(
        {"Kyv_Dsp_Pfx_RefractiveBubble", "IDS_DSP_Vi_RefractiveBubble_Name", "IDS_DSP_Vi_RefractiveBubble_Desc",
         "qmt", "quorbixel", "DSP_SUBCLASS_V_EF_PARTICLE"},
        {10, 4, 2, 1, 1, 0, 1, 1, 1, 0, 1, 0, 0, 2, 2, 1, 3}, kRefractiveBubbleParams),
    Describe<WaterRipple>(
        {"Kyv_Dsp_Pfx_WaterRipple", "IDS_DSP_Vi_WaterRipple_Name", "IDS_DSP_Vi_WaterRipple_Desc",
         "qmt", "quorbixel", "DSP_SUBCLASS_V_EF_PARTICLE"},
        {10, 4, 2, 1, 1, 0, 1, 1, 0, 0, 1, 0, 0, 2, 2, 1, 3}, kWaterRippleParams),
    Describe<Bubble>(
        {"Kyv_Dsp_Pfx_Bubble", "IDS_DSP_Vi_Bubble_Name", "IDS_DSP_Vi_Bubble_Desc",
         "qmt", "quorbixel", "DSP_SUBCLASS_V_EF_PARTICLE"},
        {10, 4, 2, 1, 1, 0, 1, 1, 1, 0, 1, 0, 0, 2, 2, 1, 3}, kBubbleParams),
    Describe<Fireworks>(
        {"Kyv_Dsp_Pfx_Fireworks", "IDS_DSP_Vi_Fireworks_Name", "IDS_DSP_Vi_Fireworks_Desc",
         "qmt", "quorbixel", "DSP_SUBCLASS_V_EF_PARTICLE"},
        {10, 4, 2, 1, 1, 0, 1, 1, 1, 0, 1, 0, 0, 2, 2, 1, 3}, kFireworksParams),
    Describe<Freeform>(
        {"Kyv_Dsp_Pi_Freeform", "IDS_DSP_Pi_Freeform_Name", "IDS_DSP_Pi_Freeform_Desc",
         "qmt", "quorbixel", "DSP_SUBCLASS_V_PI_DEFAULT"},
        {40, 150, 1, 1, 2, 0, 1, 1, 0, 0, 1, 0, 0, 2, 2, 1, 3}, kFreeformParams),
    Describe<TestAlpha>(
        {"DSP_TR_TestAlpha", "IDS_DSP_Tr_TestAlpha_Name", "IDS_DSP_Tr_TestAlpha_Desc",
         "DSP TR_TestAlpha Author", "DSP TR_TestAlpha Vendor", "DSP_SUBCLASS_V_TR_ALPHA"},
        {20, 58, 1, 1, 2, 0, 0, 1, 0, 1, 1, 0, 0, 2, 2, 1, 3}, kTestAlphaParams),
    Describe<AlphaTransition>(
        {"DSP_TR_AlphaTransition", "IDS_DSP_Tr_AlphaTransition", "IDS_DSP_Tr_AlphaTransition",
         "DSP TR_TestAlpha Author", "DSP TR_TestAlpha Vendor", "DSP_SUBCLASS_V_TR_ALPHA"},
        {20, 58, 2, 1, 2, 0, 0, 1, 0, 1, 1, 0, 0, 2, 2, 1, 3}, kAlphaTransitionParams),
    Describe<Dreamy>(
        {"Kyv_Dsp_Vi_Dreamy", "IDS_DSP_Vi_Dreamy_Name", "IDS_DSP_Vi_Dreamy_Desc",
         "DSP Vi_Dreamy Author", "DSP Vi_Dreamy Vendor", "DSP_SUBCLASS_V_EF_STYLE"},
        {10, 1, 2, 1, 1, 0, 1, 1, 0, 0, 1045, 0, 0, 2, 2, 1, 2}, kDreamyParams),
    Describe<LightRay>(
        {"Kyv_Dsp_Vi_LightRay", "IDS_DSP_Vi_LightRay_Name", "IDS_DSP_Vi_LightRay_Desc",
         "DSP Vi_LightRay Author", "DSP Vi_LightRay Vendor", "DSP_SUBCLASS_V_EF_STYLE"},
        {10, 1, 1, 1, 1, 0, 1, 1, 0, 0, 1301, 0, 0, 2, 2, 1, 2}, kLightRayParams),
    Describe<PencilSketch>(
        {"Dsp_Vi_PencilSketch2", "IDS_DSP_Vi_PencilSketch2_Name", "IDS_DSP_Vi_PencilSketch2_Desc",
         "DSP Vi_PencilSketch2 Author", "DSP Vi_PencilSketch2 Vendor", "DSP_SUBCLASS_V_EF_STYLE"},
        {10, 1, 1, 1, 1, 0, 1, 1, 0, 0, 1045, 0, 0, 2, 2, 1, 2}, kPencilSketchParams),
    Describe<ColorTemperature>(
        {"Kyv_Dsp_Co_Temperature", "IDS_DSP_Co_Temperature_Name", "IDS_DSP_Co_Temperature_Desc",
         "DSP Vi_Temperaturet Author", "DSP Vi_Temperature Vendor", "DSP_SUBCLASS_V_CO_DEFAULT"},
        {50, 200, 1, 1, 1, 0, 1, 1, 0, 0, 1, 0, 0, 2, 2, 1, 2}, kColorTemperatureParams),
    Describe<WhiteBalance>(
        {"Kyv_Dsp_Co_WhiteBalance", "IDS_DSP_Co_WhiteBalance_Name", "none",
         "DSP Vi_ColorAdjust Author", "DSP Vi_ColorAdjust Vendor", "DSP_SUBCLASS_V_CO_DEFAULT"},
        {50, 200, 1, 1, 1, 0, 1, 1, 0, 0, 1, 0, 0, 2, 2, 1, 2}, kWhiteBalanceParams),
};
// clang-format on

} // namespace kyv
