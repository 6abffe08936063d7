// Easing curves.
#include "host/Easing.h"

#include <algorithm>
#include <array>
#include <string>

#include "host/ExitStatus.h"
#include "hosting/Text.h"

namespace kyvhost {

Easing ParseEasing(std::string_view text) {
    constexpr std::array<std::string_view, 4> kNames = {"linear", "in", "out", "in-out"};
    const auto name = std::find(kNames.begin(), kNames.end(), text);
    if (name == kNames.end()) {
        throw CUsageError("no easing " + Quoted(text) + "; there are linear, in, out and in-out");
    }
    return static_cast<Easing>(name - kNames.begin());
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
    default:
        return t;
    }
}

} // namespace kyvhost
