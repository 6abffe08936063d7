// Parameter values: as numbers, as text, and the way from one value to another.
//
// A value is valueSize bytes as the parameter buffer holds them. As numbers it has components: one,
// two for a position (x, y), four for a mask rectangle (left, top, right, bottom), three for a
// colour (red, green, blue, 0 to 255). The text forms are
//   numbers         0.25, -3
//   switches        on, off (also true, false, yes, no, 1, 0)
//   choices         a label or its index
//   colours         #RRGGBB (the buffer has red in the lowest byte)
//   mask rectangle  left,top,right,bottom
//   position        x,y
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "interface/HostInterface.h"

namespace kyvhosting {

// Whether type and size of the record agree, so that its values can be read and set.
bool IsKnownType(const ParamDescriptor& param);

// "float", "color", ...
std::string TypeName(const ParamDescriptor& param);

// "0 to 1", "on or off", "box or circle"; what ParseValue accepts.
std::string RangeText(const ParamDescriptor& param);

// Whether minimum and maximum of the record bound the value: a number with minimum < maximum.
bool HasRange(const ParamDescriptor& param);

// A number as the record's minimum, maximum or any other value of a number type.
double NumberOf(const ParamDescriptor& param, const void* value);

// Whether the value is whole numbers: all types but floats, rectangles and positions.
bool IsWhole(const ParamDescriptor& param);

struct NumberRange {
    double least, most;
};

// What every component lies between: the record's bounds where HasRange, else all that the type
// holds. A switch has 0 and 1; the one that shows a comparison has 2 as well, side by side.
NumberRange RangeOf(const ParamDescriptor& param);

// 1 to 4; 0 for a type that is not known.
size_t ComponentCount(const ParamDescriptor& param);

double ComponentOf(const ParamDescriptor& param, const void* value, size_t component);

// Any number at all may come: one that is not finite counts as the default's, the others are
// clamped to the range, whole numbers are rounded to the nearest.
void SetComponent(const ParamDescriptor& param, void* value, size_t component, double number);

// The shortest text that ParseValue turns into the same bytes.
std::string FormatValue(const ParamDescriptor& param, const void* value);

// Writes valueSize bytes. Throws CUsageError naming the range; name is the parameter's name in it.
void ParseValue(const ParamDescriptor& param, std::string_view name, std::string_view text,
                void* value);

// Whether values between two others make sense: not for switches and labelled choices.
bool CanAnimate(const ParamDescriptor& param);

// The value a fraction 0..1 of the way, each component on its own, whole numbers rounded.
void Interpolate(const ParamDescriptor& param, const void* from, const void* to, double fraction,
                 void* value);

} // namespace kyvhosting
