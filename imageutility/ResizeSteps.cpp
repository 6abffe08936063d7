// Building the step tables of Resize.
#include "imageutility/ResizeSteps.h"

#include <algorithm>

namespace KYVImageUtility {
namespace {

// Shrinking by more than 255 leaves the reader behind the true position, never beyond it.
uint32_t Advance(int64_t from, int64_t to) {
    return static_cast<uint32_t>(std::min<int64_t>(to - from, 255));
}

} // namespace

void BuildResizeSteps(uint32_t* entries, int32_t source, int32_t destination) {
    int64_t lastLower = 0;
    int64_t lastNearest = 0;
    for (int32_t i = 0; i < destination; ++i) {
        // (i * source * 256) / destination in two parts, so that no size overflows.
        const int64_t product = int64_t{i} * source;
        int64_t lower = product / destination;
        auto fraction = static_cast<uint32_t>(product % destination * 256 / destination) >> 1 & 127;
        if (lower == source - 1) {
            --lower;
            fraction = 127;
        }
        const int64_t nearest = lower + (fraction >= 64 ? 1 : 0);
        entries[i] = PackStep({Advance(lastLower, lower), Advance(lastNearest, nearest), fraction});
        lastLower = lower;
        lastNearest = nearest;
    }
    const int64_t end = source - 1;
    entries[destination] = PackStep({Advance(lastLower, end), Advance(lastNearest, end), 127});
}

void ExpandResizeSteps(int32_t* left, uint8_t* weights, const uint32_t* entries, int32_t count) {
    int32_t position = 0;
    for (int32_t i = 0; i < count; ++i) {
        const ResizeStep step = UnpackStep(entries[i]);
        position += static_cast<int32_t>(step.lower);
        left[i] = position;
        weights[2 * i] = static_cast<uint8_t>(128 - step.fraction);
        weights[2 * i + 1] = static_cast<uint8_t>(step.fraction);
    }
}

size_t BuildResizeShuffles(uint8_t* shuffles, const int32_t* left, int32_t count, int32_t source) {
    int32_t i = 0;
    for (; i + 2 <= count; i += 2) {
        const int32_t gap = left[i + 1] - left[i];
        if (gap > 2 || left[i] + 4 > source) {
            break;
        }
        for (const int32_t first : {0, gap * 4}) {
            for (int32_t c = first; c < first + 4; ++c) {
                *shuffles++ = static_cast<uint8_t>(c);
                *shuffles++ = static_cast<uint8_t>(c + 4);
            }
        }
    }
    return static_cast<size_t>(i);
}

} // namespace KYVImageUtility
