// kyvhost speaks the names of hosting/ as its own, and says where its user finds all of them.
#pragma once

namespace kyvhosting {}

namespace kyvhost {
using namespace kyvhosting;

inline constexpr char kAllEffects[] = "kyvhost list shows all";
} // namespace kyvhost
