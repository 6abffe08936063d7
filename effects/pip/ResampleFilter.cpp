// The resampling kernels.
#include "effects/pip/ResampleFilter.h"

#include <algorithm>
#include <cmath>
#include <vector>

namespace kyv {
namespace {

constexpr float kPi = 3.1415927F;

// The sine of 0 .. 3 pi. The C libraries differ in the last bit and weights decide pixels, so it is
// worked out here: reduced by multiples of pi to a quarter turn either side and summed as a power
// series, in double precision, which rounds to the nearest single in all but some 1e-7 of cases.
float Sine(float angle) {
    constexpr double kPiHigh = 0x1.921fb54442d18p+1;
    constexpr double kPiLow = 0x1.1a62633145c07p-53;
    const int turns = static_cast<int>(std::floor(angle / kPiHigh + 0.5));
    const double x = (angle - turns * kPiHigh) - turns * kPiLow;
    const double x2 = x * x;
    double term = x;
    double sum = x;
    for (int n = 2; n <= 22; n += 2) {
        term = -term * x2 / (n * (n + 1));
        sum += term;
    }
    return static_cast<float>(turns % 2 ? -sum : sum);
}

constinit const ResampleFilterPoint g_point;
constinit const ResampleFilterBox g_box;
constinit const ResampleFilterTriangle g_triangle;
// The seven coefficients of B = C = 1/3, already divided by 6.
constinit const ResampleFilterMitchell g_mitchell(8.0F / 9.0F, -2.0F, 7.0F / 6.0F, 16.0F / 9.0F,
                                                  -10.0F / 3.0F, 2.0F, -7.0F / 18.0F);
constinit const ResampleFilterLanczos3 g_lanczos3;

} // namespace

float ResampleFilterPoint::Evaluate(float distance) const {
    const float t = std::fabs(distance);
    return t < 1.0F ? t : 0.0F;
}

float ResampleFilterBox::Evaluate(float distance) const {
    return distance > -0.5F && distance <= 0.5F ? 1.0F : 0.0F;
}

float ResampleFilterTriangle::Evaluate(float distance) const {
    const float t = std::fabs(distance);
    return t < 1.0F ? 1.0F - t : 0.0F;
}

float ResampleFilterMitchell::Evaluate(float distance) const {
    const float t = std::fabs(distance);
    if (t < 1.0F) {
        return t * t * (t * m_fP3 + m_fP2) + m_fP0;
    }
    return t < 2.0F ? t * ((m_fQ3 * t + m_fQ2) * t + m_fQ1) + m_fQ0 : 0.0F;
}

float ResampleFilterLanczos3::Evaluate(float distance) const {
    const float t = std::fabs(distance);
    if (!(t < 3.0F)) {
        return 0.0F;
    }
    // The order of the operations decides the last bit.
    const float angle = kPi * t;
    const float first = t == 0.0F ? 1.0F : Sine(angle) / angle;
    const float wideAngle = angle / 3.0F;
    return t / 3.0F == 0.0F ? first : first * Sine(wideAngle) / wideAngle;
}

const ResampleFilter* SelectResampleFilter(int32_t index, const ResampleFilter* otherwise) {
    switch (index) {
    case 0:
        return &g_point;
    case 1:
        return &g_box;
    case 2:
        return &g_triangle;
    case 3:
        return &g_mitchell;
    case 4:
        return &g_lanczos3;
    default:
        return otherwise;
    }
}

ContributionRecord MakeContribution(const ResampleFilter& filter, float position, float scale,
                                    int32_t size) {
    const auto last = static_cast<float>(size - 1);
    const float width = filter.GetSupport() / scale;
    // Clamped before they become integers: the ends may be anything.
    const float from = std::clamp(std::ceil(position - width), 0.0F, last);
    const float to = std::clamp(std::floor(position + width), 0.0F, last);
    std::vector<float> weights;
    float sum = 0.0F;
    int32_t left = 0;
    if (position - width <= last && position + width >= 0.0F && from <= to) {
        left = static_cast<int32_t>(from);
        const auto right = static_cast<int32_t>(to);
        for (int32_t i = left; i <= right; ++i) {
            weights.push_back(filter.Evaluate((static_cast<float>(i) - position) * scale) * scale);
            sum += weights.back();
        }
    }
    if (weights.empty() || sum == 0.0F || !std::isfinite(sum)) {
        const float nearest = std::clamp(std::floor(position + 0.5F), 0.0F, last);
        left = nearest > 0.0F ? static_cast<int32_t>(nearest) : 0;
        weights.assign(1, 1.0F);
        sum = 1.0F;
    }
    ContributionRecord record(new float[weights.size() + 2]);
    record[0] = static_cast<float>(left);
    record[1] = static_cast<float>(weights.size());
    for (size_t i = 0; i < weights.size(); ++i) {
        record[i + 2] = weights[i] / sum;
    }
    return record;
}

} // namespace kyv
