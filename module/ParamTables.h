// The parameter tables of all effects, one row a parameter: what the effect calls it, key, name
// key, description key, the control where the type leaves a choice, flag, group, and the six
// values.
//
// Some rows look like slips and are not: hosts match on these records, so they stay as they are.
#pragma once

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
#include "module/ParamRow.h"

namespace kyv::rows {

// clang-format off

inline constexpr ParamRow<RefractiveBubble::Param> kRefractiveBubbleRows[] = {
    Float(RefractiveBubble::MinSize, "P1", "IDS_Vi_Param_BubbleMinSize_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.2F, 0.2F, 0.2F, 0.2F}),
    Float(RefractiveBubble::MaxSize, "P2", "IDS_Vi_Param_BubbleMaxSize_Name", nullptr, Slider, 0, 1, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float(RefractiveBubble::Density, "P3", "IDS_Vi_Param_BubbleDensity_Name", nullptr, Slider, 0, 2, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float(RefractiveBubble::Depth, "P4", "IDS_Vi_Param_3DDepth_Name", nullptr, DepthSlider, 0, 3, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

inline constexpr ParamRow<WaterRipple::Param> kWaterRippleRows[] = {
    Float(WaterRipple::Density, "P1", "IDS_Vi_Param_RippleDensity_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
};

inline constexpr ParamRow<Bubble::Param> kBubbleRows[] = {
    Float(Bubble::MinSize, "P1", "IDS_Vi_Param_BubbleMinSize_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.2F, 0.2F, 0.2F, 0.2F}),
    Float(Bubble::MaxSize, "P2", "IDS_Vi_Param_BubbleMaxSize_Name", nullptr, Slider, 0, 1, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float(Bubble::Density, "P3", "IDS_Vi_Param_BubbleDensity_Name", nullptr, Slider, 0, 2, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float(Bubble::Depth, "P4", "IDS_Vi_Param_3DDepth_Name", nullptr, DepthSlider, 0, 3, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

inline constexpr ParamRow<Fireworks::Param> kFireworksRows[] = {
    Float(Fireworks::Size, "P1", "IDS_Vi_Param_FireworksSize_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float(Fireworks::Density, "P2", "IDS_Vi_Param_FireworksDensity_Name", nullptr, Slider, 0, 1, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float(Fireworks::Depth, "P3", "IDS_Vi_Param_3DDepth_Name", nullptr, DepthSlider, 0, 2, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

inline constexpr ParamRow<Freeform::Param> kFreeformRows[] = {
    Float(Freeform::PointAX, "P0", "IDS_Pi_Param_PointA_X_Name", "IDS_Pi_Param_PointA_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float(Freeform::PointAY, "P1", "IDS_Pi_Param_PointA_Y_Name", "IDS_Pi_Param_PointA_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float(Freeform::PointBX, "P2", "IDS_Pi_Param_PointB_X_Name", "IDS_Pi_Param_PointB_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Float(Freeform::PointBY, "P3", "IDS_Pi_Param_PointB_Y_Name", "IDS_Pi_Param_PointB_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float(Freeform::PointCX, "P4", "IDS_Pi_Param_PointC_X_Name", "IDS_Pi_Param_PointC_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Float(Freeform::PointCY, "P5", "IDS_Pi_Param_PointC_Y_Name", "IDS_Pi_Param_PointC_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Float(Freeform::PointDX, "P6", "IDS_Pi_Param_PointD_X_Name", "IDS_Pi_Param_PointD_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float(Freeform::PointDY, "P7", "IDS_Pi_Param_PointD_Y_Name", "IDS_Pi_Param_PointD_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Bool(Freeform::KeyEnable, "P8", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Name", 0, 3, {0, 0, 1, 0, 1, 1}),
    Color(Freeform::KeyColor, "P9", "IDS_Pi_Param_ColorKey_Name", "IDS_Pi_Param_ColorKey_Desc", ColorPicker, 1, 4, {0x000000, 0x000000, 0xFF00FF, 0xFF00FF, 0xFF00FF, 0xFF00FF}),
    Byte(Freeform::KeyTolerance, "P10", "IDS_Pi_Param_Tolerance_Name", "IDS_Pi_Param_Tolerance_Desc", 1, 5, {0, 127, 0, 0, 0, 0}),
    Byte(Freeform::KeyAlpha, "P11", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 6, {0, 255, 255, 0, 0, 255}),
    Bool(Freeform::PictureEnable, "P12", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Desc", 0, 7, {0, 0, 1, 0, 1, 1}),
    Byte(Freeform::PictureAlpha, "P13", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 8, {0, 255, 255, 0, 0, 255}),
    Int(Freeform::PictureBlur, "P14", "IDS_Pi_Param_BlurRadius_Name", "IDS_Pi_Param_BlurRadius_Desc", 1, 9, {0, 10, 0, 0, 0, 0}),
    Bool(Freeform::ShadowEnable, "P15", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Desc", 0, 10, {0, 0, 1, 0, 1, 1}),
    Color(Freeform::ShadowColor1, "P16", "IDS_Pi_Param_Color1_Name", "IDS_Pi_Param_Color1_Desc", ColorButton, 1, 11, {0x000000, 0x000000, 0x000000, 0x000000, 0x000000, 0x000000}),
    Color(Freeform::ShadowColor2, "P17", "IDS_Pi_Param_Color2_Name", "IDS_Pi_Param_Color2_Desc", ColorButton, 1, 12, {0x000000, 0x000000, 0x000000, 0x000000, 0x000000, 0x000000}),
    Choice(Freeform::ShadowType, "P18", "IDS_Pi_Param_ShadowType_Name;Up;Dn;L;R;UL;UR;LL;LR", "IDS_Pi_Param_ShadowType_Desc", ChoiceList, 1, 13, {0, 7, 0, 0, 0, 0}),
    Byte(Freeform::ShadowAlpha, "P19", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 14, {0, 255, 128, 0, 0, 128}),
    Int(Freeform::ShadowBlur, "P20", "IDS_Pi_Param_BlurRadius_Name", "IDS_Pi_Param_BlurRadius_Desc", 1, 15, {0, 10, 1, 0, 1, 1}),
    Float(Freeform::ShadowOffsetX, "P21", "IDS_Pi_Param_OffsetX_Name", "IDS_Pi_Param_OffsetX_Desc", Slider, 1, 16, {-1.0F, 1.0F, 0.01F, 0.01F, 0.01F, 0.01F}),
    Float(Freeform::ShadowOffsetY, "P22", "IDS_Pi_Param_OffsetY_Name", "IDS_Pi_Param_OffsetY_Desc", Slider, 1, 17, {-1.0F, 1.0F, 0.01F, 0.01F, 0.01F, 0.01F}),
    Bool(Freeform::BorderEnable, "P23", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Desc", 0, 18, {0, 0, 1, 0, 1, 1}),
    Int(Freeform::BorderSize, "P24", "IDS_Pi_Param_Size_Name", "IDS_Pi_Param_Size_Desc", 1, 19, {0, 10, 5, 0, 5, 5}),
    Color(Freeform::BorderColor1, "P25", "IDS_Pi_Param_Color1_Name", "IDS_Pi_Param_Color1_Desc", ColorButton, 1, 20, {0x000000, 0x000000, 0x0000FF, 0x0000FF, 0x0000FF, 0x0000FF}),
    Color(Freeform::BorderColor2, "P26", "IDS_Pi_Param_Color2_Name", "IDS_Pi_Param_Color2_Desc", ColorButton, 1, 21, {0x000000, 0x000000, 0x0000FF, 0x0000FF, 0x0000FF, 0x0000FF}),
    Choice(Freeform::BorderType, "P27", "IDS_Pi_Param_BorderType_Name;Up;Dn;L;R;UL;UR;LL;LR", "IDS_Pi_Param_BorderType_Desc", ChoiceList, 1, 22, {0, 7, 0, 0, 0, 0}),
    Byte(Freeform::BorderAlpha, "P28", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 23, {0, 255, 255, 0, 0, 255}),
    Int(Freeform::BorderBlur, "P29", "IDS_Pi_Param_BlurRadius_Name", "IDS_Pi_Param_BlurRadius_Desc", 1, 24, {0, 5, 0, 0, 0, 0}),
};

inline constexpr ParamRow<TestAlpha::Param> kTestAlphaRows[] = {
    Float(TestAlpha::Percentage, "P1", "IDS_Tr_Param_Percentage_Name", nullptr, Slider, 1, 0, {0.0F, 1.0F, 0.3F, 0.0F, 0.0F, 1.0F}),
    Int(TestAlpha::Smoothness, "P2", "IDS_Tr_Param_Smoothness_Name", nullptr, 1, 1, {0, 40, 20, 20, 20, 20}),
    Color(TestAlpha::BorderColor, "P3", "IDS_Tr_Param_Color_Name", nullptr, ColorPicker, 1, 2, {0x000000, 0x000000, 0x0000FF, 0x0000FF, 0x0000FF, 0x0000FF}),
    ByteBool(TestAlpha::Border, "P4", "IDS_Tr_Param_Border_Name", nullptr, 1, 3, {0, 0, 1, 1, 1, 1}),
};

inline constexpr ParamRow<AlphaTransition::Param> kAlphaTransitionRows[] = {
    Float(AlphaTransition::Percentage, "P1", "IDS_Tr_Param_Percentage_Name", nullptr, Slider, 1, 0, {0.0F, 1.0F, 0.3F, 0.0F, 0.0F, 1.0F}),
    Int(AlphaTransition::Smoothness, "P2", "IDS_Tr_Param_Smoothness_Name", nullptr, 1, 1, {0, 40, 20, 20, 20, 20}),
    Color(AlphaTransition::BorderColor, "P3", "IDS_Tr_Param_Color_Name", nullptr, ColorPicker, 1, 2, {0x000000, 0x000000, 0x19C878, 0x19C878, 0x19C878, 0x19C878}),
    ByteBool(AlphaTransition::Border, "P4", "IDS_Tr_Param_Border_Name", nullptr, 1, 3, {0, 0, 0, 0, 0, 0}),
};

inline constexpr ParamRow<Dreamy::Param> kDreamyRows[] = {
    Byte(Dreamy::Degree, "P1", "IDS_Vi_Param_Degree_Name", nullptr, 1, 0, {1, 40, 5, 1, 1, 10}),
    MaskRect(Dreamy::MaskRect, "P2", "IDS_Vi_Param_Mask_Name", "IDS_Vi_Param_Mask_Desc", 1, 1),
    Choice(Dreamy::MaskType, "P3", "IDS_Vi_Param_MaskType_Name;box;circle", "IDS_Vi_Param_MaskType_Desc", ChoiceList, 0, 2, {0, 1, 0, 0, 0, 0}),
    Float(Dreamy::MaskDepth, "P4", "IDS_Vi_Param_Depth_Name", "IDS_Vi_Param_Depth_Desc", Slider, 1, 3, {0.0F, 0.4F, 0.0F, 0.0F, 0.0F, 0.0F}),
    Bool(Dreamy::MaskInverse, "P5", "IDS_Vi_Param_InverseEffectArea_Name", nullptr, 0, 4, {0, 0, 0, 0, 0, 0}),
};

inline constexpr ParamRow<LightRay::Param> kLightRayRows[] = {
    Byte(LightRay::Degree, "P1", "IDS_Vi_Param_Degree_Name", nullptr, 1, 0, {0, 30, 15, 0, 0, 15}),
    Position(LightRay::Position, "P2", "IDS_Vi_Param_Position_Name", "IDS_Vi_Param_Position_Desc", 1, 1),
};

inline constexpr ParamRow<PencilSketch::Param> kPencilSketchRows[] = {
    Choice(PencilSketch::StrokeSize, "P1", "IDS_Vi_Param_Size_Name", nullptr, Slider, 1, 0, {1, 10, 5, 5, 5, 5}),
    Byte(PencilSketch::EdgeThreshold, "P2", "IDS_Vi_Param_Edge_Name", nullptr, 1, 1, {1, 230, 60, 60, 200, 200}),
    Byte(PencilSketch::EdgeIntensity, "P3", "IDS_Vi_Param_EdgeInten_Name", nullptr, 1, 2, {20, 100, 50, 50, 100, 100}),
    MaskRect(PencilSketch::MaskRect, "P4", "IDS_Vi_Param_Mask_Name", "IDS_Vi_Param_Mask_Desc", 1, 3),
    Choice(PencilSketch::MaskType, "P5", "IDS_Vi_Param_MaskType_Name;box;circle", "IDS_Vi_Param_MaskType_Desc", ChoiceList, 0, 4, {0, 1, 0, 0, 0, 0}),
    Float(PencilSketch::MaskDepth, "P6", "IDS_Vi_Param_Depth_Name", "IDS_Vi_Param_Depth_Desc", Slider, 1, 5, {0.0F, 0.4F, 0.0F, 0.0F, 0.0F, 0.0F}),
    Bool(PencilSketch::MaskInverse, "P7", "IDS_Vi_Param_InverseEffectArea_Name", nullptr, 0, 6, {0, 0, 0, 0, 0, 0}),
    Bool(PencilSketch::Random, "P8", "IDS_Vi_Param_Random_Name", nullptr, 0, 7, {0, 0, 0, 0, 0, 0}),
};

inline constexpr ParamRow<ColorTemperature::Param> kColorTemperatureRows[] = {
    Float(ColorTemperature::Temperature, "P1", "IDS_Vi_Param_Degree_Name", "none", Slider, 1, 0, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
    Bool(ColorTemperature::Comparison, "P2", "IDS_Co_Param_CompareImage_Name", "none", 0, 1, {0, 0, 0, 0, 0, 0}),
    Float(ColorTemperature::Tint, "P3", "IDS_Vi_Param_Degree_Name", "none", Slider, 1, 0, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

inline constexpr ParamRow<WhiteBalance::Param> kWhiteBalanceRows[] = {
    Color(WhiteBalance::ReferencePoint, "P1", "IDS_Vi_Param_ReferencePoint_Name", "none", ColorPicker, 0, 0, {0x000000, 0x000000, 0xFFFFFF, 0xFFFFFF, 0xFFFFFF, 0xFFFFFF}),
    Bool(WhiteBalance::Comparison, "P2", "IDS_Co_Param_CompareImage_Name", "none", 0, 1, {0, 0, 0, 0, 0, 0}),
};

// clang-format on

} // namespace kyv::rows
