// Tables and JSON of effects and parameters.
#include "host/Catalogue.h"

#include <algorithm>

#include <nlohmann/json.hpp>

#include "host/ClipInstance.h"
#include "hosting/Names.h"
#include "hosting/Text.h"
#include "hosting/Values.h"

namespace kyvhost {
namespace {

using json = nlohmann::ordered_json;
using Row = std::vector<std::string>;

// Of UTF-8 text: every byte but those that continue a letter.
size_t LetterCount(const std::string& text) {
    return static_cast<size_t>(std::count_if(text.begin(), text.end(), [](char unit) {
        return (static_cast<unsigned char>(unit) & 0xC0) != 0x80;
    }));
}

// Columns as wide as their widest cell, two blanks between.
std::string TableText(const std::vector<Row>& rows) {
    std::vector<size_t> widths;
    for (const Row& row : rows) {
        widths.resize(std::max(widths.size(), row.size()));
        for (size_t i = 0; i < row.size(); ++i) {
            widths[i] = std::max(widths[i], LetterCount(row[i]));
        }
    }
    std::string text;
    for (const Row& row : rows) {
        std::string line;
        for (size_t i = 0; i < row.size(); ++i) {
            line += row[i] + std::string(widths[i] - LetterCount(row[i]) + 2, ' ');
        }
        text += line.substr(0, line.find_last_not_of(' ') + 1) + '\n';
    }
    return text;
}

std::string Text(const char* text) {
    return text ? text : "";
}

std::string Inputs(const EffectDescriptor& effect) {
    return std::to_string(effect.properties.inputCount);
}

std::string Category(const EffectDescriptor& effect) {
    const std::string text = LanguageText(effect, effect.subclass);
    return text.empty() ? Text(effect.subclass) : text;
}

// An effect that has no sentence of its own repeats its name there.
std::string Description(const EffectDescriptor& effect) {
    const std::string text = LanguageText(effect, effect.descKey);
    return text == EffectName(effect) ? "" : text;
}

// The range; for a choice the labels, which --set takes, each with its name where that says more.
std::string Range(const EffectDescriptor& effect, const ParamDescriptor& param) {
    std::vector<std::string> labels = ChoiceLabels(param);
    if (param.type != ParamType_Choice || labels.empty()) {
        return RangeText(param);
    }
    const std::vector<std::string> names = ChoiceNames(effect, param);
    for (size_t i = 0; i < labels.size(); ++i) {
        labels[i] += Normalized(labels[i]) == Normalized(names[i]) ? "" : " (" + names[i] + ")";
    }
    return "one of " + Join(labels, ", ");
}

json EffectJson(const EffectDescriptor& effect) {
    return {{"identifier", effect.identifier},
            {"name", EffectName(effect)},
            {"shortName", ShortName(effect)},
            {"description", Description(effect)},
            {"subclass", Text(effect.subclass)},
            {"category", Category(effect)},
            {"author", Text(effect.author)},
            {"vendor", Text(effect.vendor)},
            {"inputs", effect.properties.inputCount},
            {"transition", effect.properties.isTransition != 0}};
}

// A number as a number, anything else as the text that --set takes.
json ValueJson(const ParamDescriptor& param, const void* value) {
    if (param.type == ParamType_Float && IsKnownType(param)) {
        // Through its shortest text, so that 0.2 stays 0.2.
        return json::parse(FormatValue(param, value), nullptr, false);
    }
    if (HasRange(param) && ChoiceLabels(param).empty()) {
        return static_cast<int64_t>(NumberOf(param, value));
    }
    return FormatValue(param, value);
}

json ParamJson(const EffectDescriptor& effect, const ParamDescriptor& param, const void* value) {
    json entry = {{"key", param.key},
                  {"name", ParamName(effect, param)},
                  {"description", LanguageText(effect, param.descKey)},
                  {"type", TypeName(param)},
                  {"default", ValueJson(param, value)}};
    const std::vector<std::string> labels = ChoiceLabels(param);
    if (!labels.empty()) {
        entry["choices"] = labels;
        entry["choiceNames"] = ChoiceNames(effect, param);
    } else if (HasRange(param)) {
        entry["minimum"] = ValueJson(param, param.minimum);
        entry["maximum"] = ValueJson(param, param.maximum);
    }
    entry["canAnimate"] = CanAnimate(param);
    return entry;
}

} // namespace

std::string ListText(const ModuleDescriptor& module) {
    std::vector<Row> rows = {{"#", "EFFECT", "NAME", "INPUTS", "PARAMETERS", "IDENTIFIER"}};
    for (uint32_t i = 0; i < module.effectCount; ++i) {
        const EffectDescriptor& effect = module.effects[i];
        rows.push_back({std::to_string(i), ShortName(effect), EffectName(effect), Inputs(effect),
                        std::to_string(effect.paramCount), effect.identifier});
    }
    return TableText(rows);
}

std::string ListJson(const ModuleDescriptor& module) {
    json effects = json::array();
    for (uint32_t i = 0; i < module.effectCount; ++i) {
        json entry = EffectJson(module.effects[i]);
        entry["parameters"] = module.effects[i].paramCount;
        effects.push_back(std::move(entry));
    }
    return json{{"formatNumber", module.formatNumber}, {"effects", effects}}.dump(2) + '\n';
}

std::string InfoText(const EffectDescriptor& effect) {
    const CClipInstance instance(effect);
    const std::string description = Description(effect);
    std::string text = EffectName(effect) + " (" + ShortName(effect) + ")\n" +
                       (description.empty() ? "" : description + ".\n") +
                       TableText({{"  identifier", effect.identifier},
                                  {"  category", Category(effect)},
                                  {"  author", Text(effect.author)},
                                  {"  vendor", Text(effect.vendor)},
                                  {"  inputs", Inputs(effect)}}) +
                       '\n';
    std::vector<Row> rows = {{"KEY", "NAME", "TYPE", "DEFAULT", "RANGE"}};
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        const ParamDescriptor& param = effect.params[i];
        rows.push_back({param.key, ParamName(effect, param), TypeName(param),
                        FormatValue(param, instance.Value(i)), Range(effect, param)});
    }
    return text + TableText(rows);
}

std::string InfoJson(const EffectDescriptor& effect) {
    const CClipInstance instance(effect);
    json entry = EffectJson(effect);
    entry["parameters"] = json::array();
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        entry["parameters"].push_back(ParamJson(effect, effect.params[i], instance.Value(i)));
    }
    return entry.dump(2) + '\n';
}

} // namespace kyvhost
