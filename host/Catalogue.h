// What the module offers, as text for people and as JSON for programs.
#pragma once

#include <string>

#include "host/Hosting.h"
#include "hosting/Module.h"

namespace kyvhost {

// The effects in a table.
std::string ListText(const ModuleDescriptor& module);
std::string ListJson(const ModuleDescriptor& module);

// One effect and its parameters. The defaults are what a new instance holds.
std::string InfoText(const EffectDescriptor& effect);
std::string InfoJson(const EffectDescriptor& effect);

} // namespace kyvhost
