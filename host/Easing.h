// How an animated value moves between its ends.
#pragma once

#include <optional>
#include <string_view>

namespace kyvhost {

enum class Easing {
    Linear,
    In,    // starts slowly
    Out,   // ends slowly
    InOut, // both
    Hold,  // stays, and jumps at the end
};

// "linear", "in", "out", "in-out", "hold". None, and an exception CUsageError, for another word.
std::optional<Easing> FindEasing(std::string_view text);
Easing ParseEasing(std::string_view text);

const char* EasingName(Easing easing);

// Cubic curves from 0 to 1. fraction is clamped to 0..1; both ends and, but for In and Out, the
// middle stay where they are. Hold is 0 all the way.
double Eased(Easing easing, double fraction);

} // namespace kyvhost
