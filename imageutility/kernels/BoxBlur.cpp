// Box blur: the definitions and the tables of forms.
#include "imageutility/kernels/BoxBlur.h"

namespace kyv {
namespace {

template <class Sum>
void SlideColumns(Sum* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    for (size_t i = 0; i < 4 * count; ++i) {
        sums[i] = static_cast<Sum>(sums[i] + enter[i] - leave[i]);
    }
}

template <class Sum>
void Average(uint8_t* dst, const Sum* sums, size_t count, const BoxWindows& windows) {
    const auto reach = static_cast<ptrdiff_t>(windows.radius) * 4;
    uint32_t total[4] = {};
    for (ptrdiff_t i = -reach; i < reach; ++i) {
        total[i & 3] += sums[i];
    }
    for (size_t i = 0; i < count; ++i, sums += 4, dst += 4) {
        const auto area = static_cast<uint32_t>(windows.columns[i] * windows.rows);
        for (int c = 0; c < 4; ++c) {
            total[c] += sums[c + reach];
            dst[c] = static_cast<uint8_t>(total[c] / area);
            total[c] -= sums[c - reach];
        }
    }
}

} // namespace

void BoxColumns16_scalar(uint16_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    SlideColumns(sums, enter, leave, count);
}

void BoxColumns32_scalar(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    SlideColumns(sums, enter, leave, count);
}

void BoxBlur16_scalar(uint8_t* dst, uint16_t* sums, const uint8_t* enter, const uint8_t* leave,
                      size_t count, const BoxWindows& windows) {
    SlideColumns(sums, enter, leave, count);
    Average(dst, sums, count, windows);
}

void BoxBlur32_scalar(uint8_t* dst, uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                      size_t count, const BoxWindows& windows) {
    SlideColumns(sums, enter, leave, count);
    Average(dst, sums, count, windows);
}

constinit const KernelTable<BoxColumnsRow16> kBoxColumns16 = {KYV_TABLE(BoxColumns16)};

constinit const KernelTable<BoxColumnsRow32> kBoxColumns32 = {KYV_TABLE(BoxColumns32)};

constinit const KernelTable<BoxBlurRow16> kBoxBlur16 = {KYV_TABLE(BoxBlur16)};

constinit const KernelTable<BoxBlurRow32> kBoxBlur32 = {KYV_TABLE(BoxBlur32)};

} // namespace kyv
