// What each effect is to an OpenFX host: its identifier, clips and controls, derived from the
// module's records and texts.
//
// Names of plug-ins, clips and controls are stored in projects, so they come from keys and are the
// same in every language; labels and hints follow the user's language.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

#include "interface/HostInterface.h"

namespace kyvofx {

enum class ControlKind {
    Integer,    // bytes, whole numbers, counts
    Double,     // over the record's range
    Percentage, // the transition's standard parameter, 0 to 1
    Boolean,
    Choice,
    Rgb,   // 0 to 1
    Point, // canonical coordinates, y upwards; the module's are fractions of the frame, y down
    Seed,  // the context's random seed, which is no parameter of the effect
};

struct Control {
    ControlKind kind;
    std::string name, label, hint;
    std::string group;                   // "Border", or empty
    uint32_t index = 0, component = 0;   // of the value, or of a point's x
    uint32_t yIndex = 0, yComponent = 0; // of a point's y
    std::vector<std::string> choices;
};

struct Plan {
    const EffectDescriptor* effect;
    std::string identifier, label, description;
    const char* context;
    std::vector<const char*> clips; // as inputs of the effect, in order
    std::vector<Control> controls;

    bool IsTransition() const { return effect->properties.isTransition != 0; }
    bool IsParticle() const {
        return effect->properties.familyVariant == EffectFamilyVariant_Particle;
    }
    bool IsPictureInPicture() const {
        return effect->properties.family == EffectFamily_PictureInPicture;
    }
};

// The second clip of the picture-in-picture.
inline constexpr char kPictureClip[] = "Picture";

// One for each of the module's effects. Loads the module at the first call and keeps it. Empty when
// there is no module, which is told in one line on standard error. Never throws.
const std::vector<Plan>& Plans() noexcept;

} // namespace kyvofx
