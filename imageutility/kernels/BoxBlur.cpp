// Box blur: the definitions and the tables of forms.
#include "imageutility/kernels/BoxBlur.h"

namespace kyv {

void BoxColumns_scalar(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    for (size_t i = 0; i < 4 * count; ++i) {
        // Unsigned, so that the order of adding and taking off does not matter.
        sums[i] += (enter ? enter[i] : 0U) - (leave ? leave[i] : 0U);
    }
}

void BoxAverage_scalar(uint8_t* dst, const uint32_t* sums, size_t count,
                       const BoxWindows& windows) {
    const auto reach = static_cast<ptrdiff_t>(windows.radius) * 4;
    uint32_t total[4] = {};
    for (ptrdiff_t i = -reach; i < reach; ++i) {
        total[i & 3] += sums[i];
    }
    for (size_t i = 0; i < count; ++i, sums += 4, dst += 4) {
        const auto area = static_cast<uint32_t>(windows.areas[i]);
        for (int c = 0; c < 4; ++c) {
            total[c] += sums[c + reach];
            dst[c] = static_cast<uint8_t>(total[c] / area);
            total[c] -= sums[c - reach];
        }
    }
}

constinit const KernelTable<BoxColumnsRow> kBoxColumns = {
    .scalar = BoxColumns_scalar,
    .avx2 = KYV_VECTOR_FORM(BoxColumns_avx2),
};

constinit const KernelTable<BoxAverageRow> kBoxAverage = {
    .scalar = BoxAverage_scalar,
    .avx2 = KYV_VECTOR_FORM(BoxAverage_avx2),
};

} // namespace kyv
