// Counting brightness.
#include "effects/style/Tones.h"

#include <algorithm>
#include <iterator>

#include "effects/style/StyleMath.h"

namespace kyv {
namespace {

// The share of a picture that may shine at all, and the share that may do so in full.
constexpr float kShining = 0.30F;
constexpr float kInFull = 0.02F;

// Noise and faint structure in a flat picture are no lights: the weight does not rise faster.
constexpr uint32_t kShortestRise = 40;

} // namespace

void CTones::Count(const KYVImageUtility::CImageARGB& image) {
    std::fill(std::begin(m_counts), std::end(m_counts), 0U);
    m_total = 0;
    for (int32_t y = 0; y < image.GetHeight(); y += 2) {
        const uint8_t* pixel = image.Row(y);
        for (int32_t x = 0; x < image.GetWidth(); x += 2, pixel += 8) {
            ++m_counts[StyleBrightness(pixel[0], pixel[1], pixel[2])];
            ++m_total;
        }
    }
}

uint32_t CTones::ReachedBy(float share) const {
    const auto wanted = static_cast<uint32_t>(share * static_cast<float>(m_total));
    uint32_t level = 255;
    for (uint32_t count = m_counts[255]; count <= wanted && level > 0; count += m_counts[level]) {
        --level;
    }
    return level;
}

Highlight LightsOf(const CTones& tones, uint32_t lowest) {
    // Below that level, since a flat sky may be larger than the share, and of a bright picture no
    // more than its upper range.
    const uint32_t floor = std::clamp(tones.ReachedBy(kShining) * 13 / 16, lowest, 190U);
    const uint32_t full = std::max(tones.ReachedBy(kInFull), floor + kShortestRise);
    return {
        .floor = static_cast<uint8_t>(floor),
        .slope = static_cast<uint16_t>(std::clamp(255 * 16 / (full - floor), 1U, 256U)),
    };
}

} // namespace kyv
