// Files of effects.
#include "host/EffectFile.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <iterator>
#include <memory>
#include <span>

#include <nlohmann/json.hpp>

#include "host/Arguments.h"
#include "host/ExitStatus.h"
#include "host/JsonLines.h"
#include "hosting/Names.h"
#include "hosting/Suggest.h"
#include "hosting/Text.h"
#include "hosting/Values.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;
using Kind = JsonNode::Kind;
using json = nlohmann::ordered_json;

constexpr int kVersion = 1;
constexpr size_t kMostBytes = 16 << 20;

std::string ReadText(const fs::path& file) {
    std::ifstream stream(file, std::ios::binary);
    std::string text(std::istreambuf_iterator<char>(stream), {});
    std::error_code error;
    if (!stream || fs::is_directory(file, error)) {
        throw CHostError(ExitStatus::InputUnreadable, TextOf(file) + " cannot be read");
    }
    if (text.size() > kMostBytes) {
        throw CHostError(ExitStatus::InputUnreadable, TextOf(file) + " is no file of effects");
    }
    return text;
}

class CReader {
public:
    CReader(const ModuleDescriptor& module, const fs::path& file)
        : m_module(module), m_file(file), m_name(TextOf(file)) {}

    std::vector<StageOptions> Read() {
        const JsonNode root = ParseJson(ReadText(m_file), m_name);
        Check(root, "the file", Kind::Object);
        CheckMembers(root, std::array{"kyv", "name", "effects"});
        const JsonNode& version = Need(root, "kyv", Kind::Number);
        if (version.text != std::to_string(kVersion)) {
            Refuse(version, "kyv", "is " + version.text + "; this program reads version 1");
        }
        if (const JsonNode* name = root.Find("name")) {
            Check(*name, "name", Kind::Text);
        }
        const JsonNode& effects = Need(root, "effects", Kind::List);
        std::vector<StageOptions> stages;
        for (const JsonNode& effect : effects.items) {
            stages.push_back(ReadStage(effect));
        }
        if (stages.empty()) {
            Refuse(effects, "effects", "is empty");
        }
        return stages;
    }

private:
    [[noreturn]] void Refuse(const JsonNode& node, std::string_view key, const std::string& why) {
        RefuseAt(m_name, node.line, Quoted(key) + " " + why);
    }

    void Check(const JsonNode& node, std::string_view key, Kind kind) {
        constexpr std::array kNames = {"null",   "true or false", "a number",
                                       "a text", "a list",        "an object"};
        if (node.kind != kind) {
            Refuse(node, key,
                   std::string("is ") + kNames[static_cast<size_t>(node.kind)] + ", not " +
                       kNames[static_cast<size_t>(kind)]);
        }
    }

    const JsonNode& Need(const JsonNode& object, const char* key, Kind kind) {
        const JsonNode* const node = object.Find(key);
        if (!node) {
            RefuseAt(m_name, object.line, Quoted(key) + " is missing");
        }
        Check(*node, key, kind);
        return *node;
    }

    // A mistyped member would be lost without a word.
    void CheckMembers(const JsonNode& object, std::span<const char* const> known) {
        for (size_t i = 0; i < object.names.size(); ++i) {
            const std::string& name = object.names[i];
            if (std::find(known.begin(), known.end(), name) == known.end()) {
                const std::vector<std::string> names(known.begin(), known.end());
                const std::string nearest = Nearest(name, names);
                Refuse(object.items[i], name,
                       "is not known here; " + (nearest.empty() ? "there are " + Join(names, ", ")
                                                                : "the nearest is " + nearest));
            }
        }
    }

    // Errors of what the text stands for get the line, too.
    template <class Work>
    auto At(const JsonNode& node, Work&& work) {
        try {
            return work();
        } catch (const CUsageError& error) {
            RefuseAt(m_name, node.line, error.what());
        }
    }

    std::string ValueText(const JsonNode& node, const std::string& key) {
        if (node.kind != Kind::List) {
            if (node.kind == Kind::Null || node.kind == Kind::Object) {
                Refuse(node, key, "is no value");
            }
            return node.text;
        }
        std::vector<std::string> numbers;
        for (const JsonNode& item : node.items) {
            Check(item, key, Kind::Number);
            numbers.push_back(item.text);
        }
        return Join(numbers, ",");
    }

    ParamKeyframe ReadKeyframe(const JsonNode& node, const std::string& param) {
        Check(node, param, Kind::Object);
        CheckMembers(node, std::array{"time", "value", "easing"});
        ParamKeyframe one = {param, {}};
        const JsonNode* const time = node.Find("time");
        const JsonNode* const value = node.Find("value");
        if (!time || !value) {
            Refuse(node, param, "has a keyframe without \"time\" or \"value\"");
        }
        if (time->kind != Kind::Number && time->kind != Kind::Text) {
            Refuse(*time, "time", "is neither seconds nor a text such as \"50%\" or \"2.5s\"");
        }
        one.keyframe.time = At(*time, [&] { return ParseKeyTime("\"time\"", time->text); });
        one.keyframe.value = ValueText(*value, "value");
        one.keyframe.easing = ReadEasing(node);
        return one;
    }

    Easing ReadEasing(const JsonNode& node) {
        const JsonNode* const easing = node.Find("easing");
        if (!easing) {
            return Easing::Linear;
        }
        Check(*easing, "easing", Kind::Text);
        return At(*easing, [&] { return ParseEasing(easing->text); });
    }

    void ReadValue(const JsonNode& node, const std::string& param, CClipInstance& trial,
                   StageOptions& stage) {
        if (node.kind != Kind::List || node.items.empty() ||
            node.items.front().kind != Kind::Object) {
            stage.values.push_back({param, ValueText(node, param)});
            At(node, [&] { trial.Set(param, stage.values.back().value); });
            return;
        }
        for (const JsonNode& item : node.items) {
            stage.keyframes.push_back(ReadKeyframe(item, param));
            At(*item.Find("value"),
               [&] { trial.AddKeyframe(param, stage.keyframes.back().keyframe); });
        }
    }

    StageOptions ReadStage(const JsonNode& node) {
        Check(node, "effects", Kind::Object);
        CheckMembers(node, std::array{"effect", "values", "easing", "offset", "seed", "input2"});
        StageOptions stage;
        const JsonNode& effect = Need(node, "effect", Kind::Text);
        stage.effect = effect.text;
        const EffectDescriptor& descriptor =
            At(effect, [&] { return std::cref(FindEffect(m_module, effect.text, kAllEffects)); });
        CClipInstance trial(descriptor);
        if (node.Find("values")) {
            const JsonNode& values = Need(node, "values", Kind::Object);
            for (size_t i = 0; i < values.names.size(); ++i) {
                ReadValue(values.items[i], values.names[i], trial, stage);
            }
        }
        stage.easing = ReadEasing(node);
        if (const JsonNode* offset = node.Find("offset")) {
            stage.offset = At(*offset, [&] { return ParseTime("\"offset\"", offset->text); });
        }
        if (const JsonNode* seed = node.Find("seed")) {
            const char* const end = seed->text.data() + seed->text.size();
            const auto [stop, error] = std::from_chars(seed->text.data(), end, stage.seed);
            if (seed->kind != Kind::Number || error != std::errc() || stop != end) {
                Refuse(*seed, "seed", "is no whole number from 0 to 4294967295");
            }
        }
        if (node.Find("input2")) {
            const fs::path name = PathOf(Need(node, "input2", Kind::Text).text);
            stage.input2 = name == "-" ? name : m_file.parent_path() / name;
        }
        return stage;
    }

    const ModuleDescriptor& m_module;
    fs::path m_file;
    std::string m_name;
};

// A value as JSON writes it: numbers as numbers, switches as such, lists of numbers, other texts.
json ValueJson(const ParamDescriptor& param, const std::string& name, const std::string& text) {
    std::vector<uint8_t> value(param.valueSize);
    ParseValue(param, name, text, value.data());
    const std::string plain = FormatValue(param, value.data());
    const auto number = [](const std::string& digits) -> json {
        const double amount = std::strtod(digits.c_str(), nullptr);
        if (IsWholeNumber(digits)) {
            return static_cast<int64_t>(amount);
        }
        return amount;
    };
    if (plain == "on" || plain == "off") {
        return plain == "on";
    }
    if (param.type == ParamType_Position || param.type == ParamType_MaskRect) {
        json list = json::array();
        for (const std::string& part : Split(plain, ',')) {
            list.push_back(number(part));
        }
        return list;
    }
    const bool isText =
        param.type == ParamType_Color || (param.type == ParamType_Choice && !IsWholeNumber(plain));
    return isText ? json(plain) : number(plain);
}

json StageJson(const ModuleDescriptor& module, const StageOptions& stage, const fs::path& folder) {
    const EffectDescriptor& effect = FindEffect(module, stage.effect, kAllEffects);
    json object = {{"effect", ShortName(effect)}};
    json values = json::object();
    for (const Assignment& one : stage.values) {
        const ParamDescriptor& param = effect.params[FindParam(effect, one.param)];
        values[param.key] = ValueJson(param, one.param, one.value);
    }
    for (const ParamKeyframe& one : stage.keyframes) {
        const ParamDescriptor& param = effect.params[FindParam(effect, one.param)];
        json& list = values[param.key];
        if (!list.is_array() || list.empty() || !list.front().is_object()) {
            list = json::array(); // what changes has no value besides
        }
        json keyframe = {{"time", KeyTimeText(one.keyframe.time)},
                         {"value", ValueJson(param, one.param, one.keyframe.value)}};
        if (one.keyframe.easing != Easing::Linear) {
            keyframe["easing"] = EasingName(one.keyframe.easing);
        }
        list.push_back(std::move(keyframe));
    }
    if (!values.empty()) {
        object["values"] = std::move(values);
    }
    if (stage.easing != Easing::Linear && effect.properties.isTransition) {
        object["easing"] = EasingName(stage.easing);
    }
    if (stage.offset != 0) {
        object["offset"] = stage.offset;
    }
    if (stage.seed != 0) {
        object["seed"] = stage.seed;
    }
    if (stage.input2) {
        const bool isDash = *stage.input2 == "-";
        const fs::path name =
            isDash ? *stage.input2 : fs::absolute(*stage.input2).lexically_proximate(folder);
        object["input2"] = TextOf(name.generic_u8string());
    }
    return object;
}

} // namespace

bool IsEffectFileName(std::string_view name) {
    return Lower(name).ends_with(".json");
}

std::vector<StageOptions> ReadEffectFile(const ModuleDescriptor& module, const fs::path& file) {
    return CReader(module, file).Read();
}

std::string EffectFileText(const ModuleDescriptor& module, const std::vector<StageOptions>& stages,
                           const fs::path& file) {
    json effects = json::array();
    for (const StageOptions& stage : stages) {
        effects.push_back(StageJson(module, stage, fs::absolute(file).parent_path()));
    }
    return json({{"kyv", kVersion}, {"effects", std::move(effects)}})
               .dump(2, ' ', false, json::error_handler_t::replace) +
           "\n";
}

} // namespace kyvhost
