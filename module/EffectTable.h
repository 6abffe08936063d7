// One entry an effect, in the order in which hosts enumerate them. Identifiers, keys, authors and
// vendors are what hosts match on and are kept to the letter, slips of the pen included.
#pragma once

#include "interface/EffectGlue.h"
#include "module/Module.h"
#include "module/ParamTables.h"

namespace kyv {

// What the effects of a family have in common. A transition is no filter, and the other way round.
struct FamilyTraits {
    const char* subclass;
    uint32_t number;
    uint32_t variant;
    uint32_t familyClass;
    bool isTransition = false;
};

inline constexpr FamilyTraits kParticle = {
    .subclass = "DSP_SUBCLASS_V_EF_PARTICLE",
    .number = EffectFamily_ParticleOrStyle,
    .variant = EffectFamilyVariant_Particle,
    .familyClass = EffectFamilyClass_Composed,
};
inline constexpr FamilyTraits kPictureInPicture = {
    .subclass = "DSP_SUBCLASS_V_PI_DEFAULT",
    .number = EffectFamily_PictureInPicture,
    .variant = EffectFamilyVariant_PictureInPicture,
    .familyClass = EffectFamilyClass_Composed,
};
inline constexpr FamilyTraits kTransition = {
    .subclass = "DSP_SUBCLASS_V_TR_ALPHA",
    .number = EffectFamily_Transition,
    .variant = EffectFamilyVariant_Transition,
    .familyClass = EffectFamilyClass_Composed,
    .isTransition = true,
};
inline constexpr FamilyTraits kStyle = {
    .subclass = "DSP_SUBCLASS_V_EF_STYLE",
    .number = EffectFamily_ParticleOrStyle,
    .variant = EffectFamilyVariant_Style,
    .familyClass = EffectFamilyClass_Changed,
};
inline constexpr FamilyTraits kColor = {
    .subclass = "DSP_SUBCLASS_V_CO_DEFAULT",
    .number = EffectFamily_Color,
    .variant = EffectFamilyVariant_Color,
    .familyClass = EffectFamilyClass_Changed,
};

// What an effect's record says that neither its family nor the effect itself does. A property
// stands in an entry where it is not the common one.
struct EffectEntry {
    const char* identifier;
    const char* nameKey;
    const char* descKey;
    const char* author;
    const char* vendor;
    FamilyTraits family;
    uint32_t property30 = 1;
    uint32_t property48 = 0;
    uint32_t moreCapabilities = 0; // than EffectCapability_Frames
};

template <class Effect, const auto& kRows>
consteval EffectDescriptor Describe(const EffectEntry& entry) {
    static_assert(rows::InOrder<typename Effect::Param>(kRows));
    return {
        .identifier = entry.identifier,
        .nameKey = entry.nameKey,
        .descKey = entry.descKey,
        .author = entry.author,
        .vendor = entry.vendor,
        .properties =
            {
                .family = entry.family.number,
                .familyVariant = entry.family.variant,
                .property30 = entry.property30,
                .property34 = 1,
                .inputCount = Effect::kInputCount,
                .property3c = 0,
                .isFilter = entry.family.isTransition ? 0U : 1U,
                .property44 = 1,
                .property48 = entry.property48,
                .isTransition = entry.family.isTransition ? 1U : 0U,
                .capabilities = EffectCapability_Frames | entry.moreCapabilities,
                .property54 = 0,
                .property58 = 0,
                .property5c = 2,
                .property60 = 2,
                .property64 = 1,
                .familyClass = entry.family.familyClass,
            },
        .paramCount = Effect::ParamCount,
        .params = rows::kRecords<kRows>.data(),
        .module = &g_module,
        .instanceDataSize = sizeof(typename Effect::Instance),
        .reserved84 = 0,
        .callbacks = EffectGlue<Effect>::kCallbacks,
        .subclass = entry.family.subclass,
    };
}

inline constexpr EffectDescriptor kEffects[] = {
    Describe<RefractiveBubble, rows::kRefractiveBubbleRows>({
        .identifier = "Kyv_Dsp_Pfx_RefractiveBubble",
        .nameKey = "IDS_DSP_Vi_RefractiveBubble_Name",
        .descKey = "IDS_DSP_Vi_RefractiveBubble_Desc",
        .author = "qmt",
        .vendor = "quorbixel",
        .family = kParticle,
        .property30 = 2,
        .property48 = 1,
    }),
    Describe<WaterRipple, rows::kWaterRippleRows>({
        .identifier = "Kyv_Dsp_Pfx_WaterRipple",
        .nameKey = "IDS_DSP_Vi_WaterRipple_Name",
        .descKey = "IDS_DSP_Vi_WaterRipple_Desc",
        .author = "qmt",
        .vendor = "quorbixel",
        .family = kParticle,
        .property30 = 2,
    }),
    Describe<Bubble, rows::kBubbleRows>({
        .identifier = "Kyv_Dsp_Pfx_Bubble",
        .nameKey = "IDS_DSP_Vi_Bubble_Name",
        .descKey = "IDS_DSP_Vi_Bubble_Desc",
        .author = "qmt",
        .vendor = "quorbixel",
        .family = kParticle,
        .property30 = 2,
        .property48 = 1,
    }),
    Describe<Fireworks, rows::kFireworksRows>({
        .identifier = "Kyv_Dsp_Pfx_Fireworks",
        .nameKey = "IDS_DSP_Vi_Fireworks_Name",
        .descKey = "IDS_DSP_Vi_Fireworks_Desc",
        .author = "qmt",
        .vendor = "quorbixel",
        .family = kParticle,
        .property30 = 2,
        .property48 = 1,
    }),
    Describe<Freeform, rows::kFreeformRows>({
        .identifier = "Kyv_Dsp_Pi_Freeform",
        .nameKey = "IDS_DSP_Pi_Freeform_Name",
        .descKey = "IDS_DSP_Pi_Freeform_Desc",
        .author = "qmt",
        .vendor = "quorbixel",
        .family = kPictureInPicture,
    }),
    Describe<TestAlpha, rows::kTestAlphaRows>({
        .identifier = "DSP_TR_TestAlpha",
        .nameKey = "IDS_DSP_Tr_TestAlpha_Name",
        .descKey = "IDS_DSP_Tr_TestAlpha_Desc",
        .author = "DSP TR_TestAlpha Author",
        .vendor = "DSP TR_TestAlpha Vendor",
        .family = kTransition,
    }),
    Describe<AlphaTransition, rows::kAlphaTransitionRows>({
        .identifier = "DSP_TR_AlphaTransition",
        .nameKey = "IDS_DSP_Tr_AlphaTransition",
        .descKey = "IDS_DSP_Tr_AlphaTransition",
        .author = "DSP TR_TestAlpha Author",
        .vendor = "DSP TR_TestAlpha Vendor",
        .family = kTransition,
        .property30 = 2,
    }),
    Describe<Dreamy, rows::kDreamyRows>({
        .identifier = "Kyv_Dsp_Vi_Dreamy",
        .nameKey = "IDS_DSP_Vi_Dreamy_Name",
        .descKey = "IDS_DSP_Vi_Dreamy_Desc",
        .author = "DSP Vi_Dreamy Author",
        .vendor = "DSP Vi_Dreamy Vendor",
        .family = kStyle,
        .property30 = 2,
        .moreCapabilities = EffectCapability_GpuHelper,
    }),
    Describe<LightRay, rows::kLightRayRows>({
        .identifier = "Kyv_Dsp_Vi_LightRay",
        .nameKey = "IDS_DSP_Vi_LightRay_Name",
        .descKey = "IDS_DSP_Vi_LightRay_Desc",
        .author = "DSP Vi_LightRay Author",
        .vendor = "DSP Vi_LightRay Vendor",
        .family = kStyle,
        .moreCapabilities = EffectCapability_GpuHelper | EffectCapability_WorkerPool,
    }),
    Describe<PencilSketch, rows::kPencilSketchRows>({
        .identifier = "Dsp_Vi_PencilSketch2",
        .nameKey = "IDS_DSP_Vi_PencilSketch2_Name",
        .descKey = "IDS_DSP_Vi_PencilSketch2_Desc",
        .author = "DSP Vi_PencilSketch2 Author",
        .vendor = "DSP Vi_PencilSketch2 Vendor",
        .family = kStyle,
        .moreCapabilities = EffectCapability_GpuHelper,
    }),
    Describe<ColorTemperature, rows::kColorTemperatureRows>({
        .identifier = "Kyv_Dsp_Co_Temperature",
        .nameKey = "IDS_DSP_Co_Temperature_Name",
        .descKey = "IDS_DSP_Co_Temperature_Desc",
        .author = "DSP Vi_Temperaturet Author",
        .vendor = "DSP Vi_Temperature Vendor",
        .family = kColor,
    }),
    Describe<WhiteBalance, rows::kWhiteBalanceRows>({
        .identifier = "Kyv_Dsp_Co_WhiteBalance",
        .nameKey = "IDS_DSP_Co_WhiteBalance_Name",
        .descKey = "none",
        .author = "DSP Vi_ColorAdjust Author",
        .vendor = "DSP Vi_ColorAdjust Vendor",
        .family = kColor,
    }),
};

} // namespace kyv
