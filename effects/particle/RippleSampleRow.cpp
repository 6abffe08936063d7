// The definition of reading a bent row.
#include "effects/particle/RippleSampleRow.h"

#include <algorithm>

namespace kyv {
namespace {

// A coordinate as a whole pixel and a fraction of 16 bits.
struct Place {
    Place(int32_t pixel, float offset, int32_t length) {
        const float last = static_cast<float>(length - 1);
        const float moved = std::max(std::min(static_cast<float>(pixel) + offset, last), 0.0F);
        whole = static_cast<int32_t>(moved);
        fraction = static_cast<int32_t>((moved - static_cast<float>(whole)) * 65536.0F);
    }

    int32_t whole;
    int32_t fraction;
};

int32_t Between(int32_t a, int32_t b, int32_t fraction) {
    return a + (((b - a) * fraction) >> 16);
}

} // namespace

void RippleSampleRow_scalar(uint8_t* dst, const RipplePicture& picture, int32_t x, int32_t y,
                            const float* offsets, size_t count) {
    for (size_t i = 0; i < count; ++i, dst += 4) {
        const Place column(x + static_cast<int32_t>(i), offsets[i], picture.width);
        const Place row(y, offsets[i], picture.height);
        const uint8_t* upper =
            picture.pixels + row.whole * picture.pitchBytes + ptrdiff_t{column.whole} * 4;
        const uint8_t* lower = upper + picture.pitchBytes;
        for (int c = 0; c < 3; ++c) {
            const int32_t top = Between(upper[c], upper[c + 4], column.fraction);
            const int32_t bottom = Between(lower[c], lower[c + 4], column.fraction);
            dst[c] = static_cast<uint8_t>(Between(top, bottom, row.fraction));
        }
        dst[3] = 255;
    }
}

constinit const KernelTable<RippleSampleRow> kRippleSampleRow = {KYV_TABLE(RippleSampleRow),
                                                                 .passedOver = kNoneIsPassedOver};

} // namespace kyv
