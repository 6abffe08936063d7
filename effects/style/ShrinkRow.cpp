// The definition of shrinking.
#include "effects/style/ShrinkRow.h"

namespace kyv {

void AddRow_scalar(uint16_t* sums, const uint8_t* src, size_t count) {
    for (size_t i = 0; i < count; ++i) {
        sums[i] = static_cast<uint16_t>(sums[i] + src[i]);
    }
}

void AverageRow_scalar(uint8_t* dst, const uint16_t* sums, size_t count, int32_t bits) {
    const uint32_t half = (1U << (2 * bits)) >> 1;
    for (size_t i = 0; i < count; ++i) {
        for (int c = 0; c < 4; ++c) {
            uint32_t sum = half;
            for (size_t k = 0; k < size_t{1} << bits; ++k) {
                sum += sums[((i << bits) + k) * 4 + c];
            }
            dst[i * 4 + c] = static_cast<uint8_t>(sum >> (2 * bits));
        }
    }
}

constinit const KernelTable<AddRow> kAddRow = {KYV_TABLE(AddRow)};
constinit const KernelTable<AverageRow> kAverageRow = {KYV_TABLE(AverageRow)};

} // namespace kyv
