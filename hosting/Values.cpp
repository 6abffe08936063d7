// Parameter values.
#include "hosting/Values.h"

#include <algorithm>
#include <cfloat>
#include <charconv>
#include <cmath>
#include <cstring>
#include <optional>

#include "hosting/Error.h"
#include "hosting/Names.h"
#include "hosting/Text.h"

namespace kyvhosting {
namespace {

template <class T>
T Load(const void* value, size_t index = 0) {
    T item;
    std::memcpy(&item, static_cast<const uint8_t*>(value) + index * sizeof(T), sizeof(T));
    return item;
}

template <class T>
void Store(void* value, T item, size_t index = 0) {
    std::memcpy(static_cast<uint8_t*>(value) + index * sizeof(T), &item, sizeof(T));
}

template <class T>
std::optional<T> ParseNumber(std::string_view text) {
    if (text.size() > 1 && text[0] == '+' && text[1] != '-') {
        text.remove_prefix(1);
    }
    T number;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    if (error != std::errc() || stop != end) {
        return std::nullopt;
    }
    return number;
}

std::string FormatFloat(double number) {
    char text[64];
    const auto end = std::to_chars(text, text + sizeof text, static_cast<float>(number)).ptr;
    return std::string(text, end);
}

bool IsNumber(const ParamDescriptor& param) {
    return param.type == ParamType_Byte || param.type == ParamType_Int ||
           param.type == ParamType_Choice || param.type == ParamType_Float;
}

// Floats of a compound value.
size_t FloatCount(const ParamDescriptor& param) {
    return param.type == ParamType_MaskRect ? 4 : param.type == ParamType_Position ? 2 : 0;
}

// The comparison is declared as a switch and has a further mode, side by side.
bool HasThirdMode(const ParamDescriptor& param) {
    return param.type == ParamType_Bool && param.valueSize == 4 &&
           WordsOfKey(param.nameKey) == "Compare image";
}

std::string NumberText(const ParamDescriptor& param, double number) {
    return param.type == ParamType_Float ? FormatFloat(number)
                                         : std::to_string(static_cast<int64_t>(number));
}

// What the value may be, as the end of "x is not ...".
std::string Wanted(const ParamDescriptor& param) {
    switch (param.type) {
    case ParamType_Float:
        return "a number, " + RangeText(param);
    case ParamType_Byte:
    case ParamType_Int:
        return "a whole number, " + RangeText(param);
    default:
        return RangeText(param);
    }
}

std::optional<double> ParseAnyNumber(const ParamDescriptor& param, std::string_view text) {
    if (param.type != ParamType_Float && !IsWholeNumber(text)) {
        return std::nullopt;
    }
    if (const auto number = ParseNumber<float>(text);
        number && param.type == ParamType_Float) { // rounded once
        return std::isfinite(*number) ? std::optional<double>(*number) : std::nullopt;
    }
    return ParseNumber<double>(text);
}

void StoreNumber(const ParamDescriptor& param, double number, void* value) {
    if (param.type == ParamType_Float) {
        Store(value, static_cast<float>(number));
    } else if (param.valueSize == 1) {
        Store(value, static_cast<uint8_t>(number));
    } else {
        Store(value, static_cast<int32_t>(number));
    }
}

// All that a value of the type can be.
NumberRange RangeOfType(const ParamDescriptor& param) {
    switch (param.type) {
    case ParamType_Bool:
        return {0, HasThirdMode(param) ? 2.0 : 1.0};
    case ParamType_Byte:
    case ParamType_Color:
        return {0, 255};
    case ParamType_Choice:
    case ParamType_Int:
        return {INT32_MIN, INT32_MAX};
    default:
        return {-FLT_MAX, FLT_MAX};
    }
}

// 0xRRGGBB, the order of the text, from and to the buffer's order.
uint32_t SwapRedBlue(uint32_t color) {
    return (color & 0xFF) << 16 | (color & 0xFF00) | (color >> 16 & 0xFF);
}

std::optional<uint32_t> ParseColor(std::string_view text) {
    if (text.starts_with('#')) {
        text.remove_prefix(1);
    }
    uint32_t color = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, color, 16);
    if (text.size() != 6 || error != std::errc() || stop != end) {
        return std::nullopt;
    }
    return SwapRedBlue(color);
}

std::optional<int32_t> ParseSwitch(const ParamDescriptor& param, std::string_view text) {
    const std::string word = Lower(text);
    if (word == "on" || word == "true" || word == "yes" || word == "1") {
        return 1;
    }
    if (word == "off" || word == "false" || word == "no" || word == "0") {
        return 0;
    }
    return word == "2" && HasThirdMode(param) ? std::optional(2) : std::nullopt;
}

std::optional<int32_t> FindLabel(const ParamDescriptor& param, std::string_view text) {
    const std::vector<std::string> labels = ChoiceLabels(param);
    for (size_t i = 0; i < labels.size(); ++i) {
        if (Lower(labels[i]) == Lower(text)) {
            return static_cast<int32_t>(i);
        }
    }
    return std::nullopt;
}

// Parses into value without a look at the range; false when the text has the wrong form.
bool ParseForm(const ParamDescriptor& param, std::string_view text, void* value) {
    switch (param.type) {
    case ParamType_Bool:
        if (const auto state = ParseSwitch(param, text)) {
            StoreNumber(param, *state, value);
            return true;
        }
        return false;
    case ParamType_Color:
        if (const auto color = ParseColor(text)) {
            Store(value, *color);
            return true;
        }
        return false;
    case ParamType_MaskRect:
    case ParamType_Position: {
        const std::vector<std::string> parts = Split(text, ',');
        if (parts.size() != FloatCount(param)) {
            return false;
        }
        for (size_t i = 0; i < parts.size(); ++i) {
            const auto number = ParseNumber<float>(parts[i]);
            if (!number || !std::isfinite(*number)) {
                return false;
            }
            Store(value, *number, i);
        }
        return true;
    }
    default:
        return false;
    }
}

} // namespace

bool IsKnownType(const ParamDescriptor& param) {
    switch (param.type) {
    case ParamType_Byte:
        return param.valueSize == 1;
    case ParamType_Bool:
        return param.valueSize == 1 || param.valueSize == 4;
    case ParamType_Choice:
    case ParamType_Int:
    case ParamType_Float:
    case ParamType_Color:
        return param.valueSize == 4;
    case ParamType_MaskRect:
        return param.valueSize == 16;
    case ParamType_Position:
        return param.valueSize == 8;
    default:
        return false;
    }
}

std::string TypeName(const ParamDescriptor& param) {
    if (!IsKnownType(param)) {
        return "unknown";
    }
    switch (param.type) {
    case ParamType_Byte:
        return "byte";
    case ParamType_Choice:
        return ChoiceLabels(param).empty() ? "count" : "choice";
    case ParamType_Int:
        return "integer";
    case ParamType_Float:
        return "float";
    case ParamType_Color:
        return "color";
    case ParamType_Bool:
        return "switch";
    case ParamType_MaskRect:
        return "rectangle";
    default:
        return "position";
    }
}

bool HasRange(const ParamDescriptor& param) {
    return IsKnownType(param) && IsNumber(param) && param.minimum && param.maximum &&
           NumberOf(param, param.minimum) < NumberOf(param, param.maximum);
}

std::string RangeText(const ParamDescriptor& param) {
    if (!IsKnownType(param)) {
        return "";
    }
    if (const auto labels = ChoiceLabels(param);
        param.type == ParamType_Choice && !labels.empty()) {
        return "one of " + Join(labels, ", ");
    }
    if (HasRange(param)) {
        return NumberText(param, NumberOf(param, param.minimum)) + " to " +
               NumberText(param, NumberOf(param, param.maximum));
    }
    switch (param.type) {
    case ParamType_Byte:
        return "0 to 255";
    case ParamType_Bool:
        return HasThirdMode(param) ? "on, off or mode 2" : "on or off";
    case ParamType_Color:
        return "#000000 to #FFFFFF";
    case ParamType_MaskRect:
        return "left,top,right,bottom";
    case ParamType_Position:
        return "x,y";
    default:
        return "any";
    }
}

double NumberOf(const ParamDescriptor& param, const void* value) {
    switch (param.valueSize) {
    case 1:
        return Load<uint8_t>(value);
    default:
        return param.type == ParamType_Float ? double{Load<float>(value)}
                                             : double(Load<int32_t>(value));
    }
}

bool IsWhole(const ParamDescriptor& param) {
    return IsKnownType(param) && param.type != ParamType_Float && FloatCount(param) == 0;
}

NumberRange RangeOf(const ParamDescriptor& param) {
    if (!HasRange(param)) {
        return RangeOfType(param);
    }
    return {NumberOf(param, param.minimum), NumberOf(param, param.maximum)};
}

size_t ComponentCount(const ParamDescriptor& param) {
    if (!IsKnownType(param)) {
        return 0;
    }
    return param.type == ParamType_Color ? 3 : std::max<size_t>(FloatCount(param), 1);
}

double ComponentOf(const ParamDescriptor& param, const void* value, size_t component) {
    if (param.type == ParamType_Color) {
        return Load<uint8_t>(value, component);
    }
    return FloatCount(param) ? double{Load<float>(value, component)} : NumberOf(param, value);
}

void SetComponent(const ParamDescriptor& param, void* value, size_t component, double number) {
    if (!std::isfinite(number)) {
        number = param.defaultValue ? ComponentOf(param, param.defaultValue, component) : 0;
    }
    const NumberRange range = RangeOf(param);
    number = std::clamp(number, range.least, range.most);
    number = IsWhole(param) ? std::round(number) : number;
    if (param.type == ParamType_Color) {
        Store(value, static_cast<uint8_t>(number), component);
    } else if (FloatCount(param)) {
        Store(value, static_cast<float>(number), component);
    } else {
        StoreNumber(param, number, value);
    }
}

std::string FormatValue(const ParamDescriptor& param, const void* value) {
    if (!IsKnownType(param)) {
        std::string bytes;
        for (uint32_t i = 0; i < param.valueSize; ++i) {
            constexpr char kDigits[] = "0123456789ABCDEF";
            const auto byte = Load<uint8_t>(value, i);
            bytes += {kDigits[byte >> 4], kDigits[byte & 15]};
        }
        return bytes;
    }
    switch (param.type) {
    case ParamType_Bool: {
        const double state = NumberOf(param, value);
        return state == 0 ? "off" : state == 1 ? "on" : NumberText(param, state);
    }
    case ParamType_Color: {
        char text[] = "#000000";
        const uint32_t color = SwapRedBlue(Load<uint32_t>(value));
        for (int i = 0; i < 6; ++i) {
            text[6 - i] = "0123456789ABCDEF"[color >> (4 * i) & 15];
        }
        return text;
    }
    case ParamType_MaskRect:
    case ParamType_Position: {
        std::vector<std::string> parts;
        for (size_t i = 0; i < FloatCount(param); ++i) {
            parts.push_back(FormatFloat(Load<float>(value, i)));
        }
        return Join(parts, ",");
    }
    default: {
        const double number = NumberOf(param, value);
        const std::vector<std::string> labels = ChoiceLabels(param);
        if (param.type == ParamType_Choice && number >= 0 && number < double(labels.size())) {
            return labels[static_cast<size_t>(number)];
        }
        return NumberText(param, number);
    }
    }
}

void ParseValue(const ParamDescriptor& param, std::string_view name, std::string_view text,
                void* value) {
    if (!IsKnownType(param)) {
        throw CUsageError(std::string(name) + " has a type that this host cannot set");
    }
    if (!IsNumber(param)) {
        if (!ParseForm(param, text, value)) {
            throw CUsageError(std::string(name) + ": " + Quoted(text) + " is not " + Wanted(param));
        }
        return;
    }
    const bool isChoice = param.type == ParamType_Choice;
    const auto label = isChoice ? FindLabel(param, text) : std::nullopt;
    const auto number = label ? std::optional<double>(*label) : ParseAnyNumber(param, text);
    if (!number) {
        throw CUsageError(std::string(name) + ": " + Quoted(text) + " is not " + Wanted(param));
    }
    const NumberRange range = RangeOf(param);
    if (*number < range.least || *number > range.most) {
        throw CUsageError(std::string(name) + ": " + std::string(text) +
                          " is out of range: " + RangeText(param));
    }
    StoreNumber(param, *number, value);
}

bool CanAnimate(const ParamDescriptor& param) {
    return IsKnownType(param) && param.type != ParamType_Bool && ChoiceLabels(param).empty();
}

void Interpolate(const ParamDescriptor& param, const void* from, const void* to, double fraction,
                 void* value) {
    // Exact at both ends, which from + (to - from) * fraction is not.
    const auto between = [fraction](double a, double b) {
        return a * (1 - fraction) + b * fraction;
    };
    if (param.type == ParamType_Color) {
        for (size_t i = 0; i < 4; ++i) {
            const double channel = between(Load<uint8_t>(from, i), Load<uint8_t>(to, i));
            Store(value, static_cast<uint8_t>(std::lround(channel)), i);
        }
    } else if (const size_t count = FloatCount(param)) {
        for (size_t i = 0; i < count; ++i) {
            const double number = between(Load<float>(from, i), Load<float>(to, i));
            Store(value, static_cast<float>(number), i);
        }
    } else {
        const double number = between(NumberOf(param, from), NumberOf(param, to));
        StoreNumber(param, IsWhole(param) ? std::round(number) : number, value);
    }
}

} // namespace kyvhosting
