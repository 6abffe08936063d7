// Effects as the command line describes them.
#include "host/Stage.h"

#include <utility>

#include "host/ExitStatus.h"
#include "hosting/Names.h"
#include "hosting/Text.h"
#include "hosting/Values.h"

namespace kyvhost {
namespace {

// "NAME=VALUE", of a form that looks like the example.
Assignment SplitAssignment(std::string_view text, std::string_view example) {
    const size_t equals = text.find('=');
    if (equals == std::string_view::npos || equals == 0) {
        throw CUsageError(Quoted(text) + " is not of the form " + std::string(example));
    }
    return {std::string(text.substr(0, equals)), std::string(text.substr(equals + 1))};
}

// Takes ":EASING" off the end of a value where it is there.
Easing TakeEasing(std::string& value, Easing usual) {
    const size_t colon = value.rfind(':');
    if (colon == std::string::npos) {
        return usual;
    }
    const Easing easing = ParseEasing(std::string_view(value).substr(colon + 1));
    value.resize(colon);
    return easing;
}

} // namespace

void StageOptions::Apply(CClipInstance& instance) const {
    for (const Assignment& assignment : values) {
        instance.Set(assignment.param, assignment.value);
    }
    for (const ParamKeyframe& one : keyframes) {
        instance.AddKeyframe(one.param, one.keyframe);
    }
    instance.Context().randomSeed = seed;
}

void AddValue(StageOptions& stage, std::string_view text) {
    stage.values.push_back(SplitAssignment(text, "NAME=VALUE"));
}

void AddAnimation(StageOptions& stage, std::string_view text, Easing easing) {
    const Assignment assignment = SplitAssignment(text, "NAME=FROM:TO");
    const std::vector<std::string> parts = Split(assignment.value, ':');
    if (parts.size() != 2 && parts.size() != 3) {
        throw CUsageError(Quoted(text) + " is not of the form NAME=FROM:TO or NAME=FROM:TO:EASING");
    }
    easing = parts.size() == 3 ? ParseEasing(parts[2]) : easing;
    stage.keyframes.push_back({assignment.param, {{0, true}, parts[0], easing}});
    stage.keyframes.push_back({assignment.param, {{100, true}, parts[1], easing}});
}

void AddKeyframe(StageOptions& stage, std::string_view text, Easing easing) {
    Assignment assignment = SplitAssignment(text, "NAME@TIME=VALUE");
    const size_t at = assignment.param.rfind('@');
    if (at == std::string::npos || at == 0) {
        throw CUsageError(Quoted(text) + " is not of the form NAME@TIME=VALUE");
    }
    Keyframe keyframe;
    keyframe.time = ParseKeyTime("--key", std::string_view(assignment.param).substr(at + 1));
    keyframe.easing = TakeEasing(assignment.value, easing);
    keyframe.value = assignment.value;
    stage.keyframes.push_back({assignment.param.substr(0, at), keyframe});
}

} // namespace kyvhost
