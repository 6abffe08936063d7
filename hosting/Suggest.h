// "Did you mean": the nearest of a list of names.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace kyvhosting {

// The number of letters to insert, delete, change or swap with their neighbour.
size_t EditDistance(std::string_view a, std::string_view b);

// The candidate with the least share of letters to change to make it text, both Normalized; the
// first of several, empty when none is near.
std::string Nearest(std::string_view text, const std::vector<std::string>& candidates);

} // namespace kyvhosting
