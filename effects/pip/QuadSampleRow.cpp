// Bilinear reading through map entries: the definition and the table of forms.
#include "effects/pip/QuadSampleRow.h"

namespace kyv {

void QuadSampleRow_scalar(uint8_t* dst, const uint32_t* map, size_t count,
                          const SamplePicture& picture) {
    for (size_t i = 0; i < count; ++i, dst += 4) {
        const uint32_t u = map[i] & 0xFFFF;
        const uint32_t v = map[i] >> 16;
        const auto x = static_cast<int32_t>(u >> 6);
        const auto y = static_cast<int32_t>(v >> 6);
        if (x + 1 >= picture.width || y + 1 >= picture.height) {
            continue;
        }
        const auto fu = static_cast<int32_t>((u & 63) << 10 >> 1);
        const auto fv = static_cast<int32_t>((v & 63) << 10 >> 1);
        const uint8_t* upper = picture.pixels + y * picture.pitch + ptrdiff_t{4} * x;
        const uint8_t* lower = upper + picture.pitch;
        for (int c = 0; c < 3; ++c) {
            const int32_t top = upper[c] + (fu * (upper[c + 4] - upper[c]) >> 16);
            const int32_t bottom = lower[c] + (fu * (lower[c + 4] - lower[c]) >> 16);
            dst[c] = static_cast<uint8_t>(top + (fv * (bottom - top) >> 16));
        }
        dst[3] = 255;
    }
}

constinit const KernelTable<QuadSampleRow> kQuadSampleRow = {KYV_TABLE(QuadSampleRow)};

} // namespace kyv
