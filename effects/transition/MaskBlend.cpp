// Works the parameters out for all 256 mask values, so that no pixel divides.
#include "effects/transition/MaskBlend.h"

#include <algorithm>

namespace kyv {
namespace {

constexpr uint16_t kAllPicture0 = 0;
constexpr uint16_t kAllPicture1 = 256;

// Truncated in single precision; far beyond every mask value the exact number does not matter.
int64_t Threshold(float percentage, int64_t smoothness) {
    const float p = percentage == percentage ? percentage : 0.0F;
    const float t = p * static_cast<float>(2 * smoothness + 255) - static_cast<float>(smoothness);
    constexpr float kFar = 1e12F;
    return static_cast<int64_t>(std::clamp(t, -kFar, kFar));
}

// trunc(part / whole * 256), for 0 <= part <= whole.
int32_t Share(int64_t part, int64_t whole) {
    return static_cast<int32_t>(static_cast<float>(part) / static_cast<float>(whole) * 256.0F);
}

int32_t ClampTo(int64_t value, int32_t low, int32_t high) {
    return static_cast<int32_t>(std::clamp<int64_t>(value, low, high));
}

} // namespace

void BuildMaskBlend(MaskBlend& blend, const MaskBlendParams& params) {
    const int64_t smoothness = params.smoothness;
    const int64_t threshold = Threshold(params.percentage, smoothness);
    const int64_t low = threshold - smoothness;
    const int64_t high = threshold + smoothness;
    // The test against high comes first, which decides where both hold.
    blend.picture0From = ClampTo(high, 0, 256);
    blend.picture1UpTo = std::min(ClampTo(low, -1, 255), blend.picture0From - 1);
    blend.hasEdge = params.hasBorder;
    for (int32_t m = 0; m < 256; ++m) {
        uint16_t weight = m >= blend.picture0From ? kAllPicture0 : kAllPicture1;
        int32_t tint = 0;
        bool inBand = false;
        if (m < blend.picture0From && m > blend.picture1UpTo) {
            inBand = true;
            const int32_t share = Share(high - m, 2 * smoothness);
            weight = share >= 255 ? kAllPicture1 : static_cast<uint16_t>(share);
            const int64_t distance = threshold > m ? threshold - m : m - threshold;
            tint = std::max(255 - Share(distance, smoothness), 0);
        }
        std::fill_n(blend.weight[m], 4, weight);
        for (int byte = 0; byte < 3; ++byte) {
            blend.keep[m][byte] = static_cast<uint16_t>(inBand ? 255 - tint : 256);
            blend.edge[m][byte] = static_cast<uint16_t>(params.edge[byte] * tint);
        }
        blend.keep[m][3] = 256;
        blend.edge[m][3] = 0;
    }
}

} // namespace kyv
