// The definition of a ripple's offsets.
#include "effects/particle/RippleOffsetRow.h"

#include <bit>
#include <cmath>

#include "effects/particle/RippleSine.h"

namespace kyv {

using namespace ripple_sine;

float RippleSine(float angle) {
    const double x = angle;
    const double rounded = x * kOneOverPi + kRounder;
    const double n = rounded - kRounder;
    const double rest = x - n * kPiHigh - n * kPiLow;
    const double square = rest * rest;
    double sum = kTerms[kTermCount - 1];
    for (int i = kTermCount - 2; i >= 0; --i) {
        sum = sum * square + kTerms[i];
    }
    const double sine = rest + rest * (square * sum);
    // An odd multiple of pi turns the sign.
    const bool isOdd = (std::bit_cast<uint64_t>(rounded) & 1) != 0;
    return static_cast<float>(isOdd ? -sine : sine);
}

void RippleOffsetRow_scalar(float* offsets, size_t count, int32_t dy, const RippleShape& shape) {
    for (size_t i = 0; i < count; ++i) {
        const auto dx = static_cast<int32_t>(i);
        const float distance = std::sqrt(static_cast<float>(dx * dx + dy * dy));
        const float inside = shape.radius - distance;
        const float weight = inside > 0.0F ? inside : 0.0F;
        const float angle = distance / shape.wavelength * 6.2831855F + shape.phase;
        offsets[i] = weight / shape.radius * shape.amplitude * RippleSine(angle);
    }
}

constinit const KernelTable<RippleOffsetRow> kRippleOffsetRow = {KYV_TABLE(RippleOffsetRow),
                                                                 .passedOver = kNoneIsPassedOver};

} // namespace kyv
