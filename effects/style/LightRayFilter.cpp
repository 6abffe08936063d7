// From highlights to shafts.
#include "effects/style/LightRayFilter.h"

#include <algorithm>
#include <cmath>

#include "effects/style/HighlightRow.h"
#include "effects/style/RayRow.h"
#include "effects/style/StyleMath.h"
#include "threading/RowBand.h"

namespace kyv {
namespace {

// What is darker sends out no light in any picture.
constexpr uint32_t kLowestLight = 56;

// The small picture's width is at most this. Shafts are soft, and their steps cost in proportion.
constexpr int32_t kWidestSmall = 512;

// The smallest zoom may move no pixel by more than this, or the copies could be told apart.
constexpr float kLargestFirstMove = 1.25F;
constexpr int32_t kMostSteps = 9;

// What is left of the light at the far end of a shaft.
constexpr float kFarEnd = 0.05F;

// In 8 bits. The brightest shafts leave some of the picture's room, so that it shows through.
constexpr float kFullLight = 230.0F;

// The share of the picture that the strongest shafts may take.
constexpr float kStrongest = 0.02F;

constexpr uint32_t kMostBands = 64;

float Root(float value, int32_t times) {
    for (; times > 0; --times) {
        value = std::sqrt(value);
    }
    return value;
}

// A number of 0..1 that belongs to a point of a lattice.
float LatticeValue(int32_t x, int32_t y) {
    uint32_t n = static_cast<uint32_t>(x) * 0x9E3779B1U ^ static_cast<uint32_t>(y) * 0x85EBCA77U;
    n = (n ^ n >> 15) * 0x2C1B3C6DU;
    n = (n ^ n >> 12) * 0x297A2D39U;
    return static_cast<float>((n ^ n >> 15) >> 8) / 16777216.0F;
}

// Smooth noise of 0..1.
float Noise(float x, float y) {
    const float floorX = std::floor(x);
    const float floorY = std::floor(y);
    const auto column = static_cast<int32_t>(floorX);
    const auto row = static_cast<int32_t>(floorY);
    float fx = x - floorX;
    float fy = y - floorY;
    fx = fx * fx * (3.0F - 2.0F * fx);
    fy = fy * fy * (3.0F - 2.0F * fy);
    const float top = LatticeValue(column, row) * (1.0F - fx) + LatticeValue(column + 1, row) * fx;
    const float bottom =
        LatticeValue(column, row + 1) * (1.0F - fx) + LatticeValue(column + 1, row + 1) * fx;
    return top * (1.0F - fy) + bottom * fy;
}

// How much light passes in a direction, which is a point on the unit circle: noise along the circle
// in two sizes needs no angle and closes without a seam.
float Passing(float dx, float dy) {
    const float broad = Noise(dx * 6.0F + 40.0F, dy * 6.0F + 40.0F);
    const float fine = Noise(dx * 19.0F + 90.0F, dy * 19.0F + 90.0F);
    const float level = 0.55F * broad + 0.45F * fine;
    const float contrast = std::clamp((level - 0.36F) * 2.6F, 0.0F, 1.0F);
    return 0.04F + 0.96F * contrast * contrast;
}

// Where a coordinate of the small picture comes from when it is zoomed about the light.
struct Position {
    Position(int32_t i, float light, float zoom, int32_t count) {
        const float at = std::clamp(light + (static_cast<float>(i) - light) * zoom, 0.0F,
                                    static_cast<float>(count - 1));
        lower = std::min(static_cast<int32_t>(at), count - 2);
        fraction = static_cast<uint16_t>((at - static_cast<float>(lower)) * 65535.0F);
    }

    int32_t lower;
    uint16_t fraction;
};

} // namespace

template <class Work>
void CLightRayFilter::InBands(int32_t rows, Work&& work) {
    if (m_bands.size() < 2) {
        work(0, rows, m_bands[0]);
        return;
    }
    struct Job {
        Work& work;
        std::vector<BandRows>& bands;
        int32_t rows;
    } job = {work, m_bands, rows};
    RunRowBands(
        *m_pool, static_cast<uint32_t>(m_bands.size()), rows,
        [](void* argument) -> uint32_t {
            const auto& band = *static_cast<const RowBand*>(argument);
            Job& shared = *static_cast<Job*>(band.owner);
            // Bands begin at index * rows / count, so this is the index.
            const auto count = static_cast<int64_t>(
                std::min(shared.bands.size(), static_cast<size_t>(shared.rows)));
            const int64_t index = (int64_t{band.firstRow} * count + shared.rows - 1) / shared.rows;
            shared.work(band.firstRow, band.endRow, shared.bands[static_cast<size_t>(index)]);
            return 0;
        },
        &job);
}

void CLightRayFilter::Prepare(const StyleFrame& frame, float x, float y, uint32_t bands) {
    m_set = frame.level.set;
    m_small.Prepare(frame.width, frame.height, ChooseShrinkBits(frame.width, 0.0F, kWidestSmall),
                    frame.level);
    const int32_t width = m_small.GetImage().GetWidth();
    const int32_t height = m_small.GetImage().GetHeight();
    const size_t pixels = static_cast<size_t>(width) * height;
    m_light.resize(pixels * 4);
    m_next.resize(pixels * 4);
    m_sourceRows.resize(static_cast<size_t>(height));
    m_left.resize(static_cast<size_t>(width));
    m_fractions.resize(static_cast<size_t>(width));
    m_bands.resize(bands);
    for (BandRows& band : m_bands) {
        m_small.PrepareRows(band.small);
        band.source.resize(static_cast<size_t>(frame.width) * 4);
        band.result.resize(static_cast<size_t>(frame.width) * 4);
        band.between.resize(static_cast<size_t>(width) * 4);
    }
    if (bands > 1 && !m_pool) {
        m_pool = std::make_unique<CThreadPool>();
    }
    const float lightX = x * static_cast<float>(width) - 0.5F;
    const float lightY = y * static_cast<float>(height) - 0.5F;
    if (lightX != m_lightX || lightY != m_lightY || width != m_shadowWidth ||
        height != m_shadowHeight || !m_bShadowsFilled) {
        m_bShadowsFilled = false; // should an allocation fail
        m_shadows.resize(pixels);
        m_shadowWidth = width;
        m_shadowHeight = height;
        m_lightX = lightX;
        m_lightY = lightY;
        InBands(height, [this](int32_t first, int32_t end, BandRows&) { FillShadows(first, end); });
        m_bShadowsFilled = true;
    }
}

void CLightRayFilter::FillShadows(int32_t first, int32_t end) {
    for (int32_t row = first; row < end; ++row) {
        const float dy = static_cast<float>(row) - m_lightY;
        uint16_t* shadows = m_shadows.data() + static_cast<size_t>(row) * m_shadowWidth;
        for (int32_t column = 0; column < m_shadowWidth; ++column) {
            const float dx = static_cast<float>(column) - m_lightX;
            const float distance = std::sqrt(dx * dx + dy * dy);
            const float passing = distance > 0.5F ? Passing(dx / distance, dy / distance) : 1.0F;
            shadows[column] = static_cast<uint16_t>(passing * 65535.0F);
        }
    }
}

void CLightRayFilter::PrepareStep(float zoom) {
    const int32_t width = m_small.GetImage().GetWidth();
    const int32_t height = m_small.GetImage().GetHeight();
    for (int32_t column = 0; column < width; ++column) {
        const Position position(column, m_lightX, zoom, width);
        m_left[column] = position.lower;
        m_fractions[column] = position.fraction;
    }
    for (int32_t row = 0; row < height; ++row) {
        const Position position(row, m_lightY, zoom, height);
        m_sourceRows[row] = {position.lower, position.fraction};
    }
}

void CLightRayFilter::Gather(const StyleFrame& frame, int32_t first, int32_t end, BandRows& rows) {
    const int32_t side = 1 << m_small.GetBits();
    const int32_t last = std::min(end * side, frame.height);
    for (int32_t y = std::min(first * side, last); y < last; ++y) {
        m_small.TakeRow(y, frame.Load(y, rows.source.data()), rows.small);
    }
}

// The lights alone, with shadows.
void CLightRayFilter::Shade(int32_t first, int32_t end) {
    const auto width = static_cast<size_t>(m_small.GetImage().GetWidth());
    for (int32_t row = first; row < end; ++row) {
        uint8_t* pixels = m_small.GetImage().Row(row);
        kHighlightRow.For(m_set)(pixels, pixels, width, m_lights);
        kRayShadeRow.For(m_set)(LightRow(m_light, row), pixels,
                                m_shadows.data() + static_cast<size_t>(row) * width, width);
    }
}

void CLightRayFilter::Step(int32_t first, int32_t end, BandRows& rows) {
    const auto width = static_cast<size_t>(m_small.GetImage().GetWidth());
    for (int32_t row = first; row < end; ++row) {
        const Source& source = m_sourceRows[row];
        kRayLerpRow.For(m_set)(rows.between.data(), LightRow(m_light, source.lower),
                               LightRow(m_light, source.lower + 1), width * 4, source.fraction);
        kRayStepRow.For(m_set)(LightRow(m_next, row), LightRow(m_light, row), rows.between.data(),
                               width, {m_left.data(), m_fractions.data()}, {m_kept, m_brought});
    }
}

// The gain that brings the strongest shafts to the wanted strength, with a shoulder that never
// clips: x / (1 + x).
void CLightRayFilter::PrepareFinish(float strength) {
    uint32_t counts[kLightLevels] = {};
    uint32_t total = 0;
    const int32_t width = m_small.GetImage().GetWidth();
    for (int32_t y = 0; y < m_small.GetImage().GetHeight(); y += 2) {
        const uint16_t* light = LightRow(m_light, y);
        for (int32_t x = 0; x < width; x += 2, light += 8) {
            ++counts[std::max({light[0], light[1], light[2]}) * kLightLevels >> 16];
            ++total;
        }
    }
    const auto wanted = static_cast<uint32_t>(kStrongest * static_cast<float>(total));
    uint32_t level = kLightLevels - 1;
    for (uint32_t count = counts[level]; count <= wanted && level > 0; count += counts[level]) {
        --level;
    }
    const float strongest = (static_cast<float>(level) + 1.0F) / kLightLevels;
    // The strongest shafts grow by the same amount with every degree.
    const float target = 0.10F + 0.72F * strength;
    // Few and small lights are not to become searchlights. Longer shafts are the more diluted.
    const float most = 8.0F + 40.0F * strength;
    const float gain = std::min(target / (1.0F - target) / strongest, most);
    for (uint32_t i = 0; i < kLightLevels; ++i) {
        const float reached = (static_cast<float>(i) + 0.5F) / kLightLevels * gain;
        m_factors[i] = static_cast<uint16_t>(
            RoundHalfUp(std::min(kFullLight * gain / (1.0F + reached) * 16.0F, 65535.0F)));
    }
}

// Back to 8 bits. One factor for all channels keeps the hue.
void CLightRayFilter::Finish(int32_t first, int32_t end) {
    const int32_t width = m_small.GetImage().GetWidth();
    for (int32_t row = first; row < end; ++row) {
        const uint16_t* light = LightRow(m_light, row);
        uint8_t* pixels = m_small.GetImage().Row(row);
        for (int32_t i = 0; i < width * 4; i += 4) {
            const uint32_t strongest = std::max({light[i], light[i + 1], light[i + 2]});
            const uint32_t factor = m_factors[strongest * kLightLevels >> 16];
            for (int32_t c = i; c < i + 4; ++c) {
                pixels[c] =
                    static_cast<uint8_t>(std::min((light[c] * factor + (1U << 19)) >> 20, 255U));
            }
        }
    }
}

void CLightRayFilter::Compose(const StyleFrame& frame, int32_t first, int32_t end,
                              BandRows& rows) const {
    const RayAddRow add = kRayAddRow.For(m_set);
    for (int32_t i = first; i < end; ++i) {
        const int32_t y = frame.firstRow + i * frame.rowStep;
        const uint8_t* source = frame.Load(y, rows.source.data());
        uint8_t* target = frame.Target(y, rows.result.data());
        add(target, source, m_small.Row(y, rows.small), static_cast<size_t>(frame.width));
        frame.Store(y, target);
    }
}

void CLightRayFilter::Render(const StyleFrame& frame, uint32_t degree, float x, float y,
                             uint32_t threads) {
    if (degree == 0) {
        frame.Copy();
        return;
    }
    const uint32_t bands = std::clamp(threads, 1U, kMostBands);
    Prepare(frame, x, y, bands);
    const int32_t width = m_small.GetImage().GetWidth();
    const int32_t height = m_small.GetImage().GetHeight();
    InBands(height,
            [&](int32_t first, int32_t end, BandRows& rows) { Gather(frame, first, end, rows); });
    m_tones.Count(m_small.GetImage());
    m_lights = LightsOf(m_tones, kLowestLight);
    InBands(height, [&](int32_t first, int32_t end, BandRows&) { Shade(first, end); });

    // The light of the far end comes from this near to the light's place.
    const float strength = static_cast<float>(degree) / 30.0F;
    const float reach = 1.0F - (0.30F + 0.52F * strength);
    const float farX =
        std::max(std::fabs(m_lightX), std::fabs(static_cast<float>(width) - m_lightX));
    const float farY =
        std::max(std::fabs(m_lightY), std::fabs(static_cast<float>(height) - m_lightY));
    const float farthest = std::max(farX, farY);
    int32_t steps = 1;
    while (steps < kMostSteps && farthest * (1.0F - Root(reach, steps)) > kLargestFirstMove) {
        ++steps;
    }
    float zoom = Root(reach, steps);
    float decay = Root(kFarEnd, steps);
    for (; steps > 0; --steps, zoom *= zoom, decay *= decay) {
        PrepareStep(zoom);
        m_brought = static_cast<uint16_t>(decay / (1.0F + decay) * 65536.0F);
        m_kept = static_cast<uint16_t>(65535 - m_brought);
        InBands(height,
                [&](int32_t first, int32_t end, BandRows& rows) { Step(first, end, rows); });
        m_light.swap(m_next);
    }
    PrepareFinish(strength);
    InBands(height, [&](int32_t first, int32_t end, BandRows&) { Finish(first, end); });
    const int32_t rowCount = (frame.height - frame.firstRow + frame.rowStep - 1) / frame.rowStep;
    if (rowCount > 0) {
        InBands(rowCount, [&](int32_t first, int32_t end, BandRows& rows) {
            Compose(frame, first, end, rows);
        });
    }
}

} // namespace kyv
