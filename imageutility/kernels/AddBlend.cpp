// Saturating addition: the definitions and the tables of forms.
#include "imageutility/kernels/AddBlend.h"

#include "imageutility/kernels/BlendMath.h"

namespace kyv {
namespace {

template <int kChannels>
void AddChannels(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        const uint32_t w = BlendWeight(src[3], opacity);
        for (int c = 0; c < kChannels; ++c) {
            const uint32_t sum = dst[c] + ((src[c] * w) >> 8);
            dst[c] = static_cast<uint8_t>(sum > 255 ? 255 : sum);
        }
    }
}

} // namespace

void AddBlend_scalar(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    AddChannels<3>(dst, src, count, opacity);
}

void AddBlendWithAlpha_scalar(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    AddChannels<4>(dst, src, count, opacity);
}

constinit const KernelTable<AddBlendRow> kAddBlend = {KYV_TABLE(AddBlend)};

// Serves levels below the vector forms only.
constinit const KernelTable<AddBlendRow> kAddBlendWithAlpha = {
    .scalar = AddBlendWithAlpha_scalar,
};

} // namespace kyv
