// The parameter tables of all effects: one row a parameter, in buffer order.
//
// Some rows look like slips and are not: hosts match on these records, so they stay as they are.
#include "module/ParamTables.h"

namespace kyv {
namespace {

// Storage for one value of any type; the value starts at its first byte.
union ParamValue {
    uint8_t byte;
    int32_t integer;
    uint32_t color;
    float real;
    float reals[4];
};

// A parameter with its six values in pointer order: minimum, maximum, default, value 4 to 6.
struct ParamRow {
    const char* key;
    const char* nameKey;
    const char* descKey;
    ParamType type;
    ParamControl control;
    uint32_t valueSize;
    uint32_t flag;
    uint32_t group;
    ParamValue values[6];
};

constexpr auto Slider = ParamControl_Slider;
constexpr auto DepthSlider = ParamControl_DepthSlider;
constexpr auto ChoiceList = ParamControl_ChoiceList;
constexpr auto ColorButton = ParamControl_ColorButton;
constexpr auto ColorPicker = ParamControl_ColorPicker;

using Key = const char*;

template <class T>
struct Six {
    T values[6];
};

// The row kinds. The arguments are key, name key, description key, the control where the type
// leaves a choice, flag, group and the six values.

consteval ParamRow Byte(Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                        Six<uint8_t> six) {
    ParamRow row = {key, name, desc, ParamType_Byte, Slider, 1, flag, group, {}};
    for (size_t i = 0; i < 6; ++i) {
        row.values[i].byte = six.values[i];
    }
    return row;
}

consteval ParamRow Integer(ParamType type, ParamControl control, Key key, Key name, Key desc,
                           uint32_t flag, uint32_t group, Six<int32_t> six) {
    ParamRow row = {key, name, desc, type, control, 4, flag, group, {}};
    for (size_t i = 0; i < 6; ++i) {
        row.values[i].integer = six.values[i];
    }
    return row;
}

consteval ParamRow Int(Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                       Six<int32_t> six) {
    return Integer(ParamType_Int, Slider, key, name, desc, flag, group, six);
}

consteval ParamRow Choice(Key key, Key name, Key desc, ParamControl control, uint32_t flag,
                          uint32_t group, Six<int32_t> six) {
    return Integer(ParamType_Choice, control, key, name, desc, flag, group, six);
}

consteval ParamRow Bool(Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                        Six<int32_t> six) {
    return Integer(ParamType_Bool, ParamControl_CheckBox, key, name, desc, flag, group, six);
}

consteval ParamRow ByteBool(Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                            Six<uint8_t> six) {
    ParamRow row = Byte(key, name, desc, flag, group, six);
    row.type = ParamType_Bool;
    row.control = ParamControl_CheckBox;
    return row;
}

consteval ParamRow Float(Key key, Key name, Key desc, ParamControl control, uint32_t flag,
                         uint32_t group, Six<float> six) {
    ParamRow row = {key, name, desc, ParamType_Float, control, 4, flag, group, {}};
    for (size_t i = 0; i < 6; ++i) {
        row.values[i].real = six.values[i];
    }
    return row;
}

consteval ParamRow Color(Key key, Key name, Key desc, ParamControl control, uint32_t flag,
                         uint32_t group, Six<uint32_t> six) {
    ParamRow row = {key, name, desc, ParamType_Color, control, 4, flag, group, {}};
    for (size_t i = 0; i < 6; ++i) {
        row.values[i].color = six.values[i];
    }
    return row;
}

// All six values of these two are zero throughout.
consteval ParamRow MaskRect(Key key, Key name, Key desc, uint32_t flag, uint32_t group) {
    ParamRow row = {key,  name,  desc, ParamType_MaskRect, ParamControl_MaskRect, 16,
                    flag, group, {}};
    for (ParamValue& value : row.values) {
        value.reals[0] = value.reals[1] = value.reals[2] = value.reals[3] = 0.0F;
    }
    return row;
}

consteval ParamRow Position(Key key, Key name, Key desc, uint32_t flag, uint32_t group) {
    ParamRow row = MaskRect(key, name, desc, flag, group);
    row.type = ParamType_Position;
    row.control = ParamControl_Position;
    row.valueSize = 8;
    return row;
}

// clang-format off

constexpr ParamRow kRefractiveBubbleRows[] = {
    Float("P1", "IDS_Vi_Param_BubbleMinSize_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.2F, 0.2F, 0.2F, 0.2F}),
    Float("P2", "IDS_Vi_Param_BubbleMaxSize_Name", nullptr, Slider, 0, 1, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float("P3", "IDS_Vi_Param_BubbleDensity_Name", nullptr, Slider, 0, 2, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float("P4", "IDS_Vi_Param_3DDepth_Name", nullptr, DepthSlider, 0, 3, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

constexpr ParamRow kWaterRippleRows[] = {
    Float("P1", "IDS_Vi_Param_RippleDensity_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
};

constexpr ParamRow kBubbleRows[] = {
    Float("P1", "IDS_Vi_Param_BubbleMinSize_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.2F, 0.2F, 0.2F, 0.2F}),
    Float("P2", "IDS_Vi_Param_BubbleMaxSize_Name", nullptr, Slider, 0, 1, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float("P3", "IDS_Vi_Param_BubbleDensity_Name", nullptr, Slider, 0, 2, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float("P4", "IDS_Vi_Param_3DDepth_Name", nullptr, DepthSlider, 0, 3, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

constexpr ParamRow kFireworksRows[] = {
    Float("P1", "IDS_Vi_Param_FireworksSize_Name", nullptr, Slider, 0, 0, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float("P2", "IDS_Vi_Param_FireworksDensity_Name", nullptr, Slider, 0, 1, {0.0F, 1.0F, 0.5F, 0.5F, 0.5F, 0.5F}),
    Float("P3", "IDS_Vi_Param_3DDepth_Name", nullptr, DepthSlider, 0, 2, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

constexpr ParamRow kFreeformRows[] = {
    Float("P0", "IDS_Pi_Param_PointA_X_Name", "IDS_Pi_Param_PointA_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float("P1", "IDS_Pi_Param_PointA_Y_Name", "IDS_Pi_Param_PointA_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float("P2", "IDS_Pi_Param_PointB_X_Name", "IDS_Pi_Param_PointB_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Float("P3", "IDS_Pi_Param_PointB_Y_Name", "IDS_Pi_Param_PointB_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float("P4", "IDS_Pi_Param_PointC_X_Name", "IDS_Pi_Param_PointC_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Float("P5", "IDS_Pi_Param_PointC_Y_Name", "IDS_Pi_Param_PointC_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Float("P6", "IDS_Pi_Param_PointD_X_Name", "IDS_Pi_Param_PointD_X_Name", Slider, 1, 0, {0.0F, 1.0F, 0.25F, 0.25F, 0.25F, 0.25F}),
    Float("P7", "IDS_Pi_Param_PointD_Y_Name", "IDS_Pi_Param_PointD_Y_Name", Slider, 1, 0, {0.0F, 1.0F, 0.75F, 0.25F, 0.25F, 0.25F}),
    Bool("P8", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Name", 0, 3, {0, 0, 1, 0, 1, 1}),
    Color("P9", "IDS_Pi_Param_ColorKey_Name", "IDS_Pi_Param_ColorKey_Desc", ColorPicker, 1, 4, {0x000000, 0x000000, 0xFF00FF, 0xFF00FF, 0xFF00FF, 0xFF00FF}),
    Byte("P10", "IDS_Pi_Param_Tolerance_Name", "IDS_Pi_Param_Tolerance_Desc", 1, 5, {0, 127, 0, 0, 0, 0}),
    Byte("P11", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 6, {0, 255, 255, 0, 0, 255}),
    Bool("P12", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Desc", 0, 7, {0, 0, 1, 0, 1, 1}),
    Byte("P13", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 8, {0, 255, 255, 0, 0, 255}),
    Int("P14", "IDS_Pi_Param_BlurRadius_Name", "IDS_Pi_Param_BlurRadius_Desc", 1, 9, {0, 10, 0, 0, 0, 0}),
    Bool("P15", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Desc", 0, 10, {0, 0, 1, 0, 1, 1}),
    Color("P16", "IDS_Pi_Param_Color1_Name", "IDS_Pi_Param_Color1_Desc", ColorButton, 1, 11, {0x000000, 0x000000, 0x000000, 0x000000, 0x000000, 0x000000}),
    Color("P17", "IDS_Pi_Param_Color2_Name", "IDS_Pi_Param_Color2_Desc", ColorButton, 1, 12, {0x000000, 0x000000, 0x000000, 0x000000, 0x000000, 0x000000}),
    Choice("P18", "IDS_Pi_Param_ShadowType_Name;Up;Dn;L;R;UL;UR;LL;LR", "IDS_Pi_Param_ShadowType_Desc", ChoiceList, 1, 13, {0, 7, 0, 0, 0, 0}),
    Byte("P19", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 14, {0, 255, 128, 0, 0, 128}),
    Int("P20", "IDS_Pi_Param_BlurRadius_Name", "IDS_Pi_Param_BlurRadius_Desc", 1, 15, {0, 10, 1, 0, 1, 1}),
    Float("P21", "IDS_Pi_Param_OffsetX_Name", "IDS_Pi_Param_OffsetX_Desc", Slider, 1, 16, {-1.0F, 1.0F, 0.01F, 0.01F, 0.01F, 0.01F}),
    Float("P22", "IDS_Pi_Param_OffsetY_Name", "IDS_Pi_Param_OffsetY_Desc", Slider, 1, 17, {-1.0F, 1.0F, 0.01F, 0.01F, 0.01F, 0.01F}),
    Bool("P23", "IDS_Pi_Param_Enable_Name", "IDS_Pi_Param_Enable_Desc", 0, 18, {0, 0, 1, 0, 1, 1}),
    Int("P24", "IDS_Pi_Param_Size_Name", "IDS_Pi_Param_Size_Desc", 1, 19, {0, 10, 5, 0, 5, 5}),
    Color("P25", "IDS_Pi_Param_Color1_Name", "IDS_Pi_Param_Color1_Desc", ColorButton, 1, 20, {0x000000, 0x000000, 0x0000FF, 0x0000FF, 0x0000FF, 0x0000FF}),
    Color("P26", "IDS_Pi_Param_Color2_Name", "IDS_Pi_Param_Color2_Desc", ColorButton, 1, 21, {0x000000, 0x000000, 0x0000FF, 0x0000FF, 0x0000FF, 0x0000FF}),
    Choice("P27", "IDS_Pi_Param_BorderType_Name;Up;Dn;L;R;UL;UR;LL;LR", "IDS_Pi_Param_BorderType_Desc", ChoiceList, 1, 22, {0, 7, 0, 0, 0, 0}),
    Byte("P28", "IDS_Pi_Param_Alpha_Name", "IDS_Pi_Param_Alpha_Desc", 1, 23, {0, 255, 255, 0, 0, 255}),
    Int("P29", "IDS_Pi_Param_BlurRadius_Name", "IDS_Pi_Param_BlurRadius_Desc", 1, 24, {0, 5, 0, 0, 0, 0}),
};

constexpr ParamRow kTestAlphaRows[] = {
    Float("P1", "IDS_Tr_Param_Percentage_Name", nullptr, Slider, 1, 0, {0.0F, 1.0F, 0.3F, 0.0F, 0.0F, 1.0F}),
    Int("P2", "IDS_Tr_Param_Smoothness_Name", nullptr, 1, 1, {0, 40, 20, 20, 20, 20}),
    Color("P3", "IDS_Tr_Param_Color_Name", nullptr, ColorPicker, 1, 2, {0x000000, 0x000000, 0x0000FF, 0x0000FF, 0x0000FF, 0x0000FF}),
    ByteBool("P4", "IDS_Tr_Param_Border_Name", nullptr, 1, 3, {0, 0, 1, 1, 1, 1}),
};

constexpr ParamRow kAlphaTransitionRows[] = {
    Float("P1", "IDS_Tr_Param_Percentage_Name", nullptr, Slider, 1, 0, {0.0F, 1.0F, 0.3F, 0.0F, 0.0F, 1.0F}),
    Int("P2", "IDS_Tr_Param_Smoothness_Name", nullptr, 1, 1, {0, 40, 20, 20, 20, 20}),
    Color("P3", "IDS_Tr_Param_Color_Name", nullptr, ColorPicker, 1, 2, {0x000000, 0x000000, 0x19C878, 0x19C878, 0x19C878, 0x19C878}),
    ByteBool("P4", "IDS_Tr_Param_Border_Name", nullptr, 1, 3, {0, 0, 0, 0, 0, 0}),
};

constexpr ParamRow kDreamyRows[] = {
    Byte("P1", "IDS_Vi_Param_Degree_Name", nullptr, 1, 0, {1, 40, 5, 1, 1, 10}),
    MaskRect("P2", "IDS_Vi_Param_Mask_Name", "IDS_Vi_Param_Mask_Desc", 1, 1),
    Choice("P3", "IDS_Vi_Param_MaskType_Name;box;circle", "IDS_Vi_Param_MaskType_Desc", ChoiceList, 0, 2, {0, 1, 0, 0, 0, 0}),
    Float("P4", "IDS_Vi_Param_Depth_Name", "IDS_Vi_Param_Depth_Desc", Slider, 1, 3, {0.0F, 0.4F, 0.0F, 0.0F, 0.0F, 0.0F}),
    Bool("P5", "IDS_Vi_Param_InverseEffectArea_Name", nullptr, 0, 4, {0, 0, 0, 0, 0, 0}),
};

constexpr ParamRow kLightRayRows[] = {
    Byte("P1", "IDS_Vi_Param_Degree_Name", nullptr, 1, 0, {0, 30, 15, 0, 0, 15}),
    Position("P2", "IDS_Vi_Param_Position_Name", "IDS_Vi_Param_Position_Desc", 1, 1),
};

constexpr ParamRow kPencilSketchRows[] = {
    Choice("P1", "IDS_Vi_Param_Size_Name", nullptr, Slider, 1, 0, {1, 10, 5, 5, 5, 5}),
    Byte("P2", "IDS_Vi_Param_Edge_Name", nullptr, 1, 1, {1, 230, 60, 60, 200, 200}),
    Byte("P3", "IDS_Vi_Param_EdgeInten_Name", nullptr, 1, 2, {20, 100, 50, 50, 100, 100}),
    MaskRect("P4", "IDS_Vi_Param_Mask_Name", "IDS_Vi_Param_Mask_Desc", 1, 3),
    Choice("P5", "IDS_Vi_Param_MaskType_Name;box;circle", "IDS_Vi_Param_MaskType_Desc", ChoiceList, 0, 4, {0, 1, 0, 0, 0, 0}),
    Float("P6", "IDS_Vi_Param_Depth_Name", "IDS_Vi_Param_Depth_Desc", Slider, 1, 5, {0.0F, 0.4F, 0.0F, 0.0F, 0.0F, 0.0F}),
    Bool("P7", "IDS_Vi_Param_InverseEffectArea_Name", nullptr, 0, 6, {0, 0, 0, 0, 0, 0}),
    Bool("P8", "IDS_Vi_Param_Random_Name", nullptr, 0, 7, {0, 0, 0, 0, 0, 0}),
};

constexpr ParamRow kColorTemperatureRows[] = {
    Float("P1", "IDS_Vi_Param_Degree_Name", "none", Slider, 1, 0, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
    Bool("P2", "IDS_Co_Param_CompareImage_Name", "none", 0, 1, {0, 0, 0, 0, 0, 0}),
    Float("P3", "IDS_Vi_Param_Degree_Name", "none", Slider, 1, 0, {-1.0F, 1.0F, 0.0F, 0.0F, 0.0F, 0.0F}),
};

constexpr ParamRow kWhiteBalanceRows[] = {
    Color("P1", "IDS_Vi_Param_ReferencePoint_Name", "none", ColorPicker, 0, 0, {0x000000, 0x000000, 0xFFFFFF, 0xFFFFFF, 0xFFFFFF, 0xFFFFFF}),
    Bool("P2", "IDS_Co_Param_CompareImage_Name", "none", 0, 1, {0, 0, 0, 0, 0, 0}),
};

// clang-format on

// The values of a table, where the records point, and the records themselves.
template <const auto& Rows>
struct Table {
    static constexpr size_t kCount = std::size(Rows);

    struct Values {
        ParamValue values[6];
    };

    static constexpr std::array<Values, kCount> CopyValues() {
        std::array<Values, kCount> all = {};
        for (size_t i = 0; i < kCount; ++i) {
            for (size_t j = 0; j < 6; ++j) {
                all[i].values[j] = Rows[i].values[j];
            }
        }
        return all;
    }

    static constexpr std::array<Values, kCount> kValues = CopyValues();

    static constexpr std::array<ParamDescriptor, kCount> MakeRecords() {
        std::array<ParamDescriptor, kCount> records = {};
        for (size_t i = 0; i < kCount; ++i) {
            const ParamRow& row = Rows[i];
            const ParamValue* values = kValues[i].values;
            records[i] = {
                .key = row.key,
                .nameKey = row.nameKey,
                .descKey = row.descKey,
                .minimum = &values[0],
                .maximum = &values[1],
                .defaultValue = &values[2],
                .value4 = &values[3],
                .value5 = &values[4],
                .value6 = &values[5],
                .reserved48 = 0,
                .reserved50 = 0,
                .type = row.type,
                .control = row.control,
                .valueSize = row.valueSize,
                .flag = row.flag,
                .reserved64 = 0,
                .reserved68 = 0,
                .group = row.group,
                .reserved74 = 0,
            };
        }
        return records;
    }
};

} // namespace

constinit const ParamTable<std::size(kRefractiveBubbleRows)> kRefractiveBubbleParams =
    Table<kRefractiveBubbleRows>::MakeRecords();
constinit const ParamTable<std::size(kWaterRippleRows)> kWaterRippleParams =
    Table<kWaterRippleRows>::MakeRecords();
constinit const ParamTable<std::size(kBubbleRows)> kBubbleParams =
    Table<kBubbleRows>::MakeRecords();
constinit const ParamTable<std::size(kFireworksRows)> kFireworksParams =
    Table<kFireworksRows>::MakeRecords();
constinit const ParamTable<std::size(kFreeformRows)> kFreeformParams =
    Table<kFreeformRows>::MakeRecords();
constinit const ParamTable<std::size(kTestAlphaRows)> kTestAlphaParams =
    Table<kTestAlphaRows>::MakeRecords();
constinit const ParamTable<std::size(kAlphaTransitionRows)> kAlphaTransitionParams =
    Table<kAlphaTransitionRows>::MakeRecords();
constinit const ParamTable<std::size(kDreamyRows)> kDreamyParams =
    Table<kDreamyRows>::MakeRecords();
constinit const ParamTable<std::size(kLightRayRows)> kLightRayParams =
    Table<kLightRayRows>::MakeRecords();
constinit const ParamTable<std::size(kPencilSketchRows)> kPencilSketchParams =
    Table<kPencilSketchRows>::MakeRecords();
constinit const ParamTable<std::size(kColorTemperatureRows)> kColorTemperatureParams =
    Table<kColorTemperatureRows>::MakeRecords();
constinit const ParamTable<std::size(kWhiteBalanceRows)> kWhiteBalanceParams =
    Table<kWhiteBalanceRows>::MakeRecords();

} // namespace kyv
