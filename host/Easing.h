// How an animated value moves between its ends.
#pragma once

#include <string_view>

namespace kyvhost {

enum class Easing {
    Linear,
    In,    // starts slowly
    Out,   // ends slowly
    InOut, // both
};

// "linear", "in", "out", "in-out". Throws CUsageError.
Easing ParseEasing(std::string_view text);

// Cubic curves from 0 to 1. fraction is clamped to 0..1; both ends and, but for In and Out, the
// middle stay where they are.
double Eased(Easing easing, double fraction);

} // namespace kyvhost
