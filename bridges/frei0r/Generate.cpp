// Reads the module's records and its English texts and writes what the plug-ins and editors need:
//   OUT/tables/kyv_bubble.h                      the plug-in's table (Tables.h)
//   OUT/kdenlive/effects/frei0r_kyv_bubble.xml   names, ranges and labels for Kdenlive;
//   OUT/kdenlive/transitions/...                 mixers
//   OUT/presets/...                              melt: a whole wipe, forwards and backwards
//
//   generate MODULE ENGLISH OUT PLUGIN...        PLUGIN...: the plug-ins that the build makes
#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "bridges/frei0r/Tables.h"
#include "hosting/Module.h"
#include "hosting/Names.h"
#include "hosting/Text.h"
#include "hosting/Values.h"
#include "interface/LanguageLibrary.h"
#include "platform/Library.h"

namespace {

namespace fs = std::filesystem;
using kyvfrei0r::Mapping;

struct PluginName {
    const char* file;
    const char* effect;
    bool isCornerPin = false;
};

// The effects that are not here yet are an error: nobody would look for them.
constexpr PluginName kPlugins[] = {
    {"kyv_refractive_bubble", "Kyv_Dsp_Pfx_RefractiveBubble"},
    {"kyv_water_ripple", "Kyv_Dsp_Pfx_WaterRipple"},
    {"kyv_bubble", "Kyv_Dsp_Pfx_Bubble"},
    {"kyv_fireworks", "Kyv_Dsp_Pfx_Fireworks"},
    {"kyv_picture_in_picture", "Kyv_Dsp_Pi_Freeform"},
    {"kyv_corner_pin", "Kyv_Dsp_Pi_Freeform", true},
    {"kyv_test_alpha_transition", "DSP_TR_TestAlpha"},
    {"kyv_alpha_transition", "DSP_TR_AlphaTransition"},
    {"kyv_dreamy", "Kyv_Dsp_Vi_Dreamy"},
    {"kyv_light_ray", "Kyv_Dsp_Vi_LightRay"},
    {"kyv_pencil_sketch", "Dsp_Vi_PencilSketch2"},
    {"kyv_color_temperature", "Kyv_Dsp_Co_Temperature"},
    {"kyv_white_balance", "Kyv_Dsp_Co_WhiteBalance"},
};

// A corner pin fills the frame and has no frills until it is asked for them.
const std::map<std::string, double> kCornerPinDefaults = {
    {"P0", 0}, {"P1", 0}, {"P2", 1}, {"P3", 0},  {"P4", 1}, {"P5", 1},
    {"P6", 0}, {"P7", 1}, {"P8", 0}, {"P15", 0}, {"P23", 0}};

struct Param {
    std::string name, explanation;
    Mapping mapping;
    uint32_t index = 0, component = 0;
    const ParamDescriptor* record = nullptr; // null for the plug-in's own
    bool ownDefault = false;
    double initial = 0;
    std::vector<std::string> choices;
};

struct Plugin {
    std::string file, name, explanation;
    const PluginName* source;
    const EffectDescriptor* effect;
    std::vector<Param> params;
    int wipe = -1;

    bool IsMixer() const { return effect->properties.inputCount > 1 && !source->isCornerPin; }
};

KyvLanguageTextFunction g_english;

std::string English(const std::string& key) {
    const char* const text = g_english(key.c_str());
    return text ? text : "";
}

// Eight digits would show a single's rounding: 0.400000006.
std::string Number(double number) {
    char text[32];
    std::snprintf(text, sizeof text, "%.7g", number);
    return text;
}

std::string NameKey(const ParamDescriptor& record) {
    return kyvhosting::Split(record.nameKey, ';').front();
}

// Commas and the like would become part of property names in some hosts.
std::string EnglishName(const ParamDescriptor& record) {
    std::string name = English(NameKey(record));
    name = name.empty() ? kyvhosting::WordsOfKey(record.nameKey) : name;
    std::erase(name, ',');
    return name;
}

std::vector<std::string> Choices(const ParamDescriptor& record) {
    if (record.type == ParamType_Bool && kyvhosting::RangeOf(record).most == 2) {
        return {"Off", "Left half", "Side by side"};
    }
    std::vector<std::string> choices = kyvhosting::ChoiceLabels(record);
    for (std::string& choice : choices) {
        const std::string text = English(NameKey(record) + ";" + choice);
        choice = text.empty() ? choice : text;
    }
    return choices;
}

Mapping MappingOf(const ParamDescriptor& record) {
    switch (record.type) {
    case ParamType_Color:
        return Mapping::Color;
    case ParamType_MaskRect:
    case ParamType_Position:
        return Mapping::Plain;
    case ParamType_Bool:
        return kyvhosting::RangeOf(record).most == 1 ? Mapping::Switch : Mapping::Unit;
    default:
        return Mapping::Unit;
    }
}

// "0 is 1, 1 is 40"; "0 is Top, 0.143 is Bottom, ...".
std::string Scale(const Param& param) {
    std::string text;
    if (!param.choices.empty()) {
        for (size_t i = 0; i < param.choices.size(); ++i) {
            char value[16];
            std::snprintf(value, sizeof value, "%.3g",
                          double(i) / double(param.choices.size() - 1));
            text += (i ? ", " : "") + std::string(value) + " is " + param.choices[i];
        }
        return text;
    }
    const kyvhosting::NumberRange range = kyvhosting::RangeOf(*param.record);
    if (param.mapping != Mapping::Unit || (range.least == 0 && range.most == 1)) {
        return "";
    }
    return "0 is " + Number(static_cast<float>(range.least)) + ", 1 is " +
           Number(static_cast<float>(range.most));
}

void AddParam(Plugin& plugin, uint32_t index, const std::string& section) {
    const ParamDescriptor& record = plugin.effect->params[index];
    // frei0r has no stereo frames: a depth would do nothing.
    if (record.control == ParamControl_DepthSlider) {
        return;
    }
    static const std::vector<std::string> kSides = {"left", "top", "right", "bottom"};
    static const std::vector<std::string> kAxes = {"X", "Y"};
    Param param;
    param.record = &record;
    param.index = index;
    param.mapping = MappingOf(record);
    param.choices = param.mapping == Mapping::Unit ? Choices(record) : std::vector<std::string>();
    const std::string name = EnglishName(record);
    const std::string lower = kyvhosting::Lower(name.substr(0, 1)) + name.substr(1);
    const bool isPrefixed =
        section.empty() || kyvhosting::Lower(name).starts_with(kyvhosting::Lower(section));
    param.name = isPrefixed ? name : section + " " + lower;
    std::string text =
        record.descKey && NameKey(record) != record.descKey ? English(record.descKey) : "";
    const std::string scale = Scale(param);
    param.explanation = text.empty() || scale.empty() ? text + scale : text + ": " + scale;
    if (plugin.source->isCornerPin) {
        const auto own = kCornerPinDefaults.find(record.key);
        param.ownDefault = own != kCornerPinDefaults.end();
        param.initial = param.ownDefault ? own->second : 0;
    }
    const size_t parts = param.mapping == Mapping::Plain ? kyvhosting::ComponentCount(record) : 1;
    for (size_t i = 0; i < parts; ++i) {
        Param part = param;
        part.component = static_cast<uint32_t>(i);
        if (parts > 1) {
            part.name += " " + (parts == 2 ? kAxes : kSides)[i];
            part.explanation += std::string(part.explanation.empty() ? "" : ": ") +
                                (i % 2 ? "a fraction of the height" : "a fraction of the width");
        }
        plugin.params.push_back(part);
    }
}

// Twice the same name is two parameters that a user cannot tell apart.
void MakeNamesUnique(Plugin& plugin) {
    std::map<std::string, int> count;
    for (Param& param : plugin.params) {
        const int n = ++count[param.name];
        param.name += n > 1 ? " " + std::to_string(n) : "";
    }
}

Plugin MakePlugin(const ModuleDescriptor& module, const PluginName& source) {
    Plugin plugin;
    plugin.source = &source;
    plugin.effect = kyvhosting::EffectOf(module, source.effect);
    if (!plugin.effect) {
        throw std::runtime_error(std::string("the module has no effect ") + source.effect);
    }
    const EffectDescriptor& effect = *plugin.effect;
    plugin.file = source.file;
    plugin.name = "KYV " + (source.isCornerPin ? "Corner pin" : English(effect.nameKey));
    plugin.explanation = effect.descKey ? English(effect.descKey) : "";
    if (plugin.explanation == English(effect.nameKey)) {
        plugin.explanation = "";
    }
    if (source.isCornerPin) {
        plugin.explanation =
            "Pins the picture to four free corners, over a transparent or colored background";
    }
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        if (source.isCornerPin && i == 8) {
            Param color, opacity;
            color.name = "Background color";
            color.mapping = Mapping::BackgroundColor;
            color.explanation = "What is seen beside the picture";
            opacity.name = "Background opacity";
            opacity.mapping = Mapping::BackgroundOpacity;
            opacity.explanation = "0 leaves the outside transparent, 1 fills it with the color";
            plugin.params.push_back(color);
            plugin.params.push_back(opacity);
        }
        AddParam(plugin, i, kyvhosting::SectionOf(effect, i));
        if (effect.properties.isTransition &&
            kyvhosting::WordsOfKey(effect.params[i].nameKey) == "Percentage") {
            plugin.wipe = static_cast<int>(i);
        }
    }
    if (std::string_view(effect.subclass) == "DSP_SUBCLASS_V_EF_PARTICLE") {
        Param length;
        length.name = "Clip length";
        length.mapping = Mapping::ClipLength;
        length.explanation = "The particles fade in and out with the clip. Seconds divided by "
                             "3600: 1 is an hour, 0 is without fades";
        plugin.params.push_back(length);
    }
    MakeNamesUnique(plugin);
    return plugin;
}

std::string Literal(const std::string& text) {
    std::string literal = "\"";
    for (const char c : text) {
        literal += c == '"' || c == '\\' ? "\\" : "";
        literal += c;
    }
    return literal + "\"";
}

const char* NameOf(Mapping mapping) {
    constexpr const char* kNames[] = {"Unit",       "Plain",           "Switch",           "Color",
                                      "ClipLength", "BackgroundColor", "BackgroundOpacity"};
    return kNames[static_cast<size_t>(mapping)];
}

std::string TableText(const Plugin& plugin) {
    const EffectDescriptor& effect = *plugin.effect;
    uint32_t sizes = effect.paramCount << 16;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        sizes += effect.params[i].valueSize;
    }
    std::string text = "// Made by bridges/frei0r/Generate.cpp.\n#pragma once\n\n#include "
                       "\"bridges/frei0r/Tables.h\"\n\n"
                       "namespace kyvfrei0r {\n\ninline constexpr ParamTable kParams[] = {\n";
    for (const Param& param : plugin.params) {
        text += "    {" + Literal(param.name) + ", " + Literal(param.explanation) +
                ", Mapping::" + NameOf(param.mapping) + ", " + std::to_string(param.index) + ", " +
                std::to_string(param.component) + ", " + (param.ownDefault ? "true, " : "false, ") +
                Number(param.initial) + "},\n";
    }
    text += "};\n\ninline constexpr PluginTable kTable = {\n    " + Literal(plugin.file) + ", " +
            Literal(effect.identifier) + ",\n    " + Literal(plugin.name) + ",\n    " +
            Literal(plugin.explanation) + ",\n    " + (plugin.IsMixer() ? "true" : "false") + ", " +
            (plugin.source->isCornerPin ? "true" : "false") + ", " + std::to_string(plugin.wipe) +
            ", " + std::to_string(sizes) + ", kParams, " + std::to_string(plugin.params.size()) +
            "};\n\n} // namespace kyvfrei0r\n";
    return text;
}

std::string Escaped(const std::string& text) {
    std::string escaped;
    for (const char c : text) {
        escaped += c == '&' ? "&amp;" : c == '<' ? "&lt;" : c == '"' ? "&quot;" : std::string(1, c);
    }
    return escaped;
}

// The value as MLT has it: what a new instance has.
double Initial(const Param& param) {
    if (param.ownDefault || !param.record) {
        return param.initial;
    }
    const double number =
        kyvhosting::ComponentOf(*param.record, param.record->defaultValue, param.component);
    const kyvhosting::NumberRange range = kyvhosting::RangeOf(*param.record);
    return param.mapping == Mapping::Unit ? (number - range.least) / (range.most - range.least)
                                          : number;
}

// Kdenlive shows the MLT value times the factor, between minimum and maximum.
std::string Slider(const std::string& index, const char* type, double initial, double least,
                   double most, double factor, const std::string& suffix) {
    return "    <parameter type=\"" + std::string(type) + "\" name=\"" + index + "\" default=\"" +
           Number(initial) + "\" min=\"" + Number(least) + "\" max=\"" + Number(most) +
           "\" factor=\"" + Number(factor) + "\"" +
           (suffix.empty() ? "" : " suffix=\"" + suffix + "\"") + ">\n";
}

std::string KdenliveColor(const Param& param, const std::string& index) {
    char color[16] = "0x000000ff";
    if (param.record) {
        const auto part = [&](size_t k) {
            return unsigned(kyvhosting::ComponentOf(*param.record, param.record->defaultValue, k));
        };
        std::snprintf(color, sizeof color, "0x%02x%02x%02xff", part(0), part(1), part(2));
    }
    return "    <parameter type=\"color\" name=\"" + index + "\" default=\"" + color + "\">\n";
}

// A list where the values have names, else a slider: over the whole numbers that count something,
// over percents of the range otherwise.
std::string KdenliveRange(const Param& param, const std::string& index) {
    if (param.choices.empty()) {
        const kyvhosting::NumberRange range = kyvhosting::RangeOf(*param.record);
        const bool isCount = kyvhosting::IsWhole(*param.record) && range.least == 0;
        const double most = isCount ? range.most : 100;
        return Slider(index, "animated", Initial(param), 0, most, most, isCount ? "" : "%");
    }
    std::string values, names;
    for (size_t k = 0; k < param.choices.size(); ++k) {
        values += (k ? ";" : "") + Number(double(k) / double(param.choices.size() - 1));
        names += (k ? "," : "") + Escaped(param.choices[k]);
    }
    return "    <parameter type=\"list\" name=\"" + index + "\" default=\"" +
           Number(Initial(param)) + "\" paramlist=\"" + values + "\">\n        <paramlistdisplay>" +
           names + "</paramlistdisplay>\n";
}

std::string KdenliveParam(const Plugin& plugin, size_t i) {
    const Param& param = plugin.params[i];
    const std::string index = std::to_string(i);
    if (plugin.wipe >= 0 && param.record && int(param.index) == plugin.wipe) {
        return "    <parameter type=\"switch\" name=\"" + index +
               "\" default=\"0=0;-1=1\" min=\"0=0;-1=1\" max=\"0=1;-1=0\">\n        "
               "<name>Reverse</name>\n"
               "    </parameter>\n";
    }
    std::string text;
    switch (param.mapping) {
    case Mapping::Switch:
        text = "    <parameter type=\"bool\" name=\"" + index + "\" default=\"" +
               Number(Initial(param)) + "\">\n";
        break;
    case Mapping::Color:
    case Mapping::BackgroundColor:
        text = KdenliveColor(param, index);
        break;
    case Mapping::Plain:
        text = Slider(index, "animated", Initial(param), -100, 200, 100, "%");
        break;
    case Mapping::ClipLength:
        text = Slider(index, "constant", 0, 0, 3600, 3600, "s");
        break;
    case Mapping::BackgroundOpacity:
        text = Slider(index, "animated", 0, 0, 100, 100, "%");
        break;
    case Mapping::Unit:
        text = KdenliveRange(param, index);
        break;
    }
    text += "        <name>" + Escaped(param.name) + "</name>\n";
    if (!param.explanation.empty()) {
        text += "        <comment>" + Escaped(param.explanation) + "</comment>\n";
    }
    return text + "    </parameter>\n";
}

std::string KdenliveText(const Plugin& plugin) {
    const std::string kind = plugin.IsMixer() ? "transition" : "effect";
    const std::string id = "frei0r." + plugin.file;
    std::string text =
        "<?xml version=\"1.0\"?>\n<!DOCTYPE kpartgui>\n<" + kind + " LC_NUMERIC=\"C\" tag=\"" + id +
        "\" id=\"" + id + "\"" + (plugin.wipe >= 0 ? " type=\"short\"" : "") + ">\n    <name>" +
        Escaped(plugin.name) + "</name>\n    <description>" + Escaped(plugin.explanation) +
        "</description>\n    <author>KYV DSP</author>\n";
    for (size_t i = 0; i < plugin.params.size(); ++i) {
        text += KdenliveParam(plugin, i);
    }
    return text + "</" + kind + ">\n";
}

void Write(const fs::path& file, const std::string& text) {
    fs::create_directories(file.parent_path());
    std::ofstream stream(file, std::ios::binary);
    stream << text;
    stream.close();
    if (!stream) {
        throw std::runtime_error("cannot write " + kyvhosting::TextOf(file));
    }
}

void WritePlugin(const fs::path& out, const Plugin& plugin) {
    Write(out / "tables" / (plugin.file + ".h"), TableText(plugin));
    Write(out / "kdenlive" / (plugin.IsMixer() ? "transitions" : "effects") /
              ("frei0r_" + plugin.file + ".xml"),
          KdenliveText(plugin));
    for (size_t i = 0; i < plugin.params.size(); ++i) {
        if (plugin.wipe >= 0 && int(plugin.params[i].index) == plugin.wipe) {
            const fs::path folder = out / "presets/transition" / ("frei0r." + plugin.file);
            Write(folder / "forwards", std::to_string(i) + "=0=0;-1=1\n");
            Write(folder / "backwards", std::to_string(i) + "=0=1;-1=0\n");
        }
    }
}

void Generate(const std::vector<std::string>& arguments) {
    if (arguments.size() < 3) {
        throw std::runtime_error("generate MODULE ENGLISH OUT PLUGIN...");
    }
    const kyvhosting::CModule module(kyvhosting::PathOf(arguments[0]));
    const kyv::LibraryHandle library = kyv::OpenLibrary(kyvhosting::PathOf(arguments[1]).native());
    g_english =
        reinterpret_cast<KyvLanguageTextFunction>(kyv::FindSymbol(library, KYV_LANGUAGE_TEXT_NAME));
    if (!g_english) {
        throw std::runtime_error(arguments[1] + " is no language library");
    }
    std::vector<std::string> wanted(arguments.begin() + 3, arguments.end()), made, effects;
    for (const PluginName& name : kPlugins) {
        WritePlugin(kyvhosting::PathOf(arguments[2]), MakePlugin(module.Descriptor(), name));
        made.emplace_back(name.file);
        effects.emplace_back(name.effect);
    }
    std::sort(wanted.begin(), wanted.end());
    std::sort(made.begin(), made.end());
    if (wanted != made) {
        throw std::runtime_error("the build makes other plug-ins than are known here");
    }
    for (uint32_t i = 0; i < module.Descriptor().effectCount; ++i) {
        const std::string effect = module.Descriptor().effects[i].identifier;
        if (std::find(effects.begin(), effects.end(), effect) == effects.end()) {
            throw std::runtime_error("there is no plug-in for " + effect);
        }
    }
}

} // namespace

int main(int argc, char** argv) {
    try {
        Generate(std::vector<std::string>(argv + 1, argv + argc));
        return 0;
    } catch (const std::exception& error) {
        std::fprintf(stderr, "generate: %s\n", error.what());
        return 1;
    }
}
