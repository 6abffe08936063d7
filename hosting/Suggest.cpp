// The nearest name.
#include "hosting/Suggest.h"

#include <algorithm>

#include "hosting/Names.h"

namespace kyvhosting {

size_t EditDistance(std::string_view a, std::string_view b) {
    // Three rows of the usual table; a swap looks two rows back.
    std::vector<size_t> before, above(b.size() + 1), row(b.size() + 1);
    for (size_t j = 0; j <= b.size(); ++j) {
        row[j] = j;
    }
    for (size_t i = 1; i <= a.size(); ++i) {
        before = std::move(above);
        above = std::move(row);
        row.assign(b.size() + 1, i);
        for (size_t j = 1; j <= b.size(); ++j) {
            row[j] = std::min(
                {above[j] + 1, row[j - 1] + 1, above[j - 1] + (a[i - 1] == b[j - 1] ? 0 : 1)});
            if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1]) {
                row[j] = std::min(row[j], before[j - 2] + 1);
            }
        }
    }
    return row[b.size()];
}

namespace {

// Of the letters, how many may differ: beyond half of them a name is another name.
constexpr double kFarthest = 0.5;

} // namespace

std::string Nearest(std::string_view text, const std::vector<std::string>& candidates) {
    const std::string wanted = Normalized(text);
    std::string nearest;
    double best = kFarthest;
    for (const std::string& candidate : candidates) {
        // Against the length, or short keys would be near to everything.
        const std::string name = Normalized(candidate);
        const size_t length = std::max({wanted.size(), name.size(), size_t{1}});
        const double distance =
            static_cast<double>(EditDistance(wanted, name)) / static_cast<double>(length);
        if (distance < best || (distance == best && nearest.empty())) {
            best = distance;
            nearest = candidate;
        }
    }
    return nearest;
}

} // namespace kyvhosting
