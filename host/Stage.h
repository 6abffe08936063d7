// One effect of a rendering as the user describes it.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include "host/ClipInstance.h"
#include "host/Keyframes.h"

namespace kyvhost {

// A parameter, however it is named, and a value as text.
struct Assignment {
    std::string param, value;
};

struct ParamKeyframe {
    std::string param;
    Keyframe keyframe;
};

// An effect, its values, and what it takes beside the picture that comes from before it.
struct StageOptions {
    std::string effect;
    std::vector<Assignment> values;
    std::vector<ParamKeyframe> keyframes;
    Easing easing = Easing::Linear; // of a transition that runs by itself
    double offset = 0;              // seconds of its animation that are left out
    uint32_t seed = 0;
    std::optional<std::filesystem::path> input2;

    // Throws CUsageError.
    void Apply(CClipInstance& instance) const;
};

// "NAME=VALUE", "NAME=FROM:TO[:EASING]" and "NAME@TIME=VALUE[:EASING]", to the end of the stage's
// values. easing: where the text has none. Throw CUsageError.
void AddValue(StageOptions& stage, std::string_view text);
void AddAnimation(StageOptions& stage, std::string_view text, Easing easing);
void AddKeyframe(StageOptions& stage, std::string_view text, Easing easing);

} // namespace kyvhost
