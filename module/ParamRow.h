// What the rows of a parameter table are made of, and the records that hosts read.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "interface/HostInterface.h"

namespace kyv::rows {

using Key = const char*;
using MaskSides = std::array<float, 4>;
using Place = std::array<float, 2>;

// Storage for one value of any type; the value starts at its first byte.
union ParamValue {
    uint8_t byte;
    int32_t integer;
    uint32_t color;
    float real;
    MaskSides sides;
    Place place;

    constexpr ParamValue(uint8_t value) : byte(value) {}
    constexpr ParamValue(int32_t value) : integer(value) {}
    constexpr ParamValue(uint32_t value) : color(value) {}
    constexpr ParamValue(float value) : real(value) {}
    constexpr ParamValue(const MaskSides& value) : sides(value) {}
    constexpr ParamValue(const Place& value) : place(value) {}
};

// The six values of a row; the host interprets the last three.
template <class T>
struct Six {
    T minimum, maximum, defaultValue, value4, value5, value6;
};

template <class Param>
struct ParamRow {
    Key key, nameKey, descKey;
    Param param; // where its effect expects it
    ParamType type;
    ParamControl control;
    uint32_t valueSize, flag, group;
    Six<ParamValue> values;
};

constexpr auto Slider = ParamControl_Slider;
constexpr auto DepthSlider = ParamControl_DepthSlider;
constexpr auto ChoiceList = ParamControl_ChoiceList;
constexpr auto ColorButton = ParamControl_ColorButton;
constexpr auto ColorPicker = ParamControl_ColorPicker;

template <class Param, class T>
consteval ParamRow<Param> Row(ParamType type, ParamControl control, Param param, Key key, Key name,
                              Key desc, uint32_t flag, uint32_t group, const Six<T>& six) {
    return {key,
            name,
            desc,
            param,
            type,
            control,
            sizeof(T),
            flag,
            group,
            {six.minimum, six.maximum, six.defaultValue, six.value4, six.value5, six.value6}};
}

// The kinds of rows.

template <class Param>
consteval auto Byte(Param param, Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                    Six<uint8_t> six) {
    return Row(ParamType_Byte, Slider, param, key, name, desc, flag, group, six);
}

template <class Param>
consteval auto Int(Param param, Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                   Six<int32_t> six) {
    return Row(ParamType_Int, Slider, param, key, name, desc, flag, group, six);
}

template <class Param>
consteval auto Choice(Param param, Key key, Key name, Key desc, ParamControl control, uint32_t flag,
                      uint32_t group, Six<int32_t> six) {
    return Row(ParamType_Choice, control, param, key, name, desc, flag, group, six);
}

template <class Param>
consteval auto Bool(Param param, Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                    Six<int32_t> six) {
    return Row(ParamType_Bool, ParamControl_CheckBox, param, key, name, desc, flag, group, six);
}

template <class Param>
consteval auto ByteBool(Param param, Key key, Key name, Key desc, uint32_t flag, uint32_t group,
                        Six<uint8_t> six) {
    return Row(ParamType_Bool, ParamControl_CheckBox, param, key, name, desc, flag, group, six);
}

template <class Param>
consteval auto Float(Param param, Key key, Key name, Key desc, ParamControl control, uint32_t flag,
                     uint32_t group, Six<float> six) {
    return Row(ParamType_Float, control, param, key, name, desc, flag, group, six);
}

template <class Param>
consteval auto Color(Param param, Key key, Key name, Key desc, ParamControl control, uint32_t flag,
                     uint32_t group, Six<uint32_t> six) {
    return Row(ParamType_Color, control, param, key, name, desc, flag, group, six);
}

// All six values of these two are zero throughout.

template <class Param>
consteval auto MaskRect(Param param, Key key, Key name, Key desc, uint32_t flag, uint32_t group) {
    return Row(ParamType_MaskRect, ParamControl_MaskRect, param, key, name, desc, flag, group,
               Six<MaskSides>{});
}

template <class Param>
consteval auto Position(Param param, Key key, Key name, Key desc, uint32_t flag, uint32_t group) {
    return Row(ParamType_Position, ParamControl_Position, param, key, name, desc, flag, group,
               Six<Place>{});
}

// Whether the rows are the parameters of the effect, each at its place.
template <class Param, size_t kCount>
consteval bool InOrder(const ParamRow<Param> (&rows)[kCount]) {
    for (size_t i = 0; i < kCount; ++i) {
        if (rows[i].param != i) {
            return false;
        }
    }
    return kCount == Param::ParamCount;
}

// The records of a table. Their value pointers lead into the rows, to a place of its own each.
template <const auto& kRows>
inline constexpr auto kRecords = [] {
    std::array<ParamDescriptor, std::size(kRows)> records = {};
    for (size_t i = 0; i < records.size(); ++i) {
        const auto& row = kRows[i];
        records[i] = {
            .key = row.key,
            .nameKey = row.nameKey,
            .descKey = row.descKey,
            .minimum = &row.values.minimum,
            .maximum = &row.values.maximum,
            .defaultValue = &row.values.defaultValue,
            .value4 = &row.values.value4,
            .value5 = &row.values.value5,
            .value6 = &row.values.value6,
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
}();

} // namespace kyv::rows
