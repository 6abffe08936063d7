// The definition of smearing and adding light.
#include "effects/style/RayRow.h"

#include <algorithm>

#include "effects/style/StyleMath.h"

namespace kyv {
namespace {

uint32_t Between(uint32_t a, uint32_t b, uint32_t fraction) {
    return ((a * (65535 - fraction)) >> 16) + ((b * fraction) >> 16);
}

} // namespace

void RayShadeRow_scalar(uint16_t* dst, const uint8_t* src, const uint16_t* shadows, size_t count) {
    for (size_t i = 0; i < count * 4; ++i) {
        dst[i] = static_cast<uint16_t>((src[i] * 257U * shadows[i >> 2]) >> 16);
    }
}

void RayLerpRow_scalar(uint16_t* dst, const uint16_t* upper, const uint16_t* lower, size_t count,
                       uint16_t fraction) {
    for (size_t i = 0; i < count; ++i) {
        dst[i] = static_cast<uint16_t>(Between(upper[i], lower[i], fraction));
    }
}

void RayStepRow_scalar(uint16_t* dst, const uint16_t* src, const uint16_t* row, size_t count,
                       const RayColumns& columns, const RayShares& shares) {
    for (size_t i = 0; i < count; ++i) {
        const uint16_t* pair = row + size_t{4} * static_cast<uint32_t>(columns.left[i]);
        for (size_t c = 0; c < 4; ++c) {
            const uint32_t moved = Between(pair[c], pair[c + 4], columns.fractions[i]);
            dst[i * 4 + c] =
                static_cast<uint16_t>(((uint32_t{src[i * 4 + c]} * shares.kept) >> 16) +
                                      ((moved * shares.brought) >> 16));
        }
    }
}

void RayAddRow_scalar(uint8_t* dst, const uint8_t* src, const uint8_t* light, size_t count) {
    for (size_t i = 0; i < count * 4; i += 4) {
        const uint32_t strongest = std::max({src[i], src[i + 1], src[i + 2]});
        const uint32_t taken = std::min(strongest * kTakesPerLevel + kBlackTakes, 255U);
        for (size_t c = i; c < i + 3; ++c) {
            const uint32_t room = 255 - ((src[c] + strongest + 1) >> 1);
            dst[c] =
                static_cast<uint8_t>(src[c] + StyleProduct(StyleProduct(light[c], taken), room));
        }
        dst[i + 3] = src[i + 3];
    }
}

constinit const KernelTable<RayShadeRow> kRayShadeRow = {KYV_TABLE(RayShadeRow)};
constinit const KernelTable<RayLerpRow> kRayLerpRow = {KYV_TABLE(RayLerpRow)};
constinit const KernelTable<RayStepRow> kRayStepRow = {KYV_TABLE(RayStepRow)};
constinit const KernelTable<RayAddRow> kRayAddRow = {KYV_TABLE(RayAddRow),
                                                     .passedOver = kNoneIsPassedOver};

} // namespace kyv
