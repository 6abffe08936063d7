// Easing curves.
#include "host/Easing.h"

#include <algorithm>
#include <array>
#include <string>

#include "host/ExitStatus.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

constexpr std::array<const char*, 5> kNames = {"linear", "in", "out", "in-out", "hold"};

} // namespace

std::optional<Easing> FindEasing(std::string_view text) {
    const auto name = std::find(kNames.begin(), kNames.end(), text);
    return name == kNames.end() ? std::nullopt
                                : std::optional(static_cast<Easing>(name - kNames.begin()));
}

Easing ParseEasing(std::string_view text) {
    const std::optional<Easing> easing = FindEasing(text);
    if (!easing) {
        throw CUsageError("no easing " + Quoted(text) +
                          "; there are linear, in, out, in-out and hold");
    }
    return *easing;
}

const char* EasingName(Easing easing) {
    return kNames[static_cast<size_t>(easing)];
}

double Eased(Easing easing, double fraction) {
    const double t = std::clamp(fraction, 0.0, 1.0);
    const double rest = 1 - t;
    switch (easing) {
    case Easing::In:
        return t * t * t;
    case Easing::Out:
        return 1 - rest * rest * rest;
    case Easing::InOut:
        return t < 0.5 ? 4 * t * t * t : 1 - 4 * rest * rest * rest;
    case Easing::Hold:
        return 0;
    default:
        return t;
    }
}

} // namespace kyvhost
