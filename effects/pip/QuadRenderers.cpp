// Reading a picture through map entries.
#include "effects/pip/QuadRenderers.h"

namespace kyv {
namespace {

constexpr int kTent[kGridSamples] = {1, 2, 1, 2, 4, 2, 1, 2, 1};

// The pixel at an entry, or null for none. The tests are "exceeds", so the first column past the
// width passes, and with rows end to end it is the next row's first pixel.
const uint8_t* NearestPixel(uint32_t entry, const SamplePicture& picture) {
    auto x = static_cast<int32_t>(entry >> 6 & 1023);
    auto y = static_cast<int32_t>(entry >> 22);
    if (x > picture.width || y > picture.height) {
        return nullptr;
    }
    if (x == picture.width) {
        x = 0;
        ++y;
    }
    return y < picture.height ? picture.pixels + y * picture.pitch + ptrdiff_t{4} * x : nullptr;
}

// sample(entry, bgr): false for a sample that is dropped.
template <class Sample>
void RenderGrid(uint8_t* dst, const uint32_t* map, size_t count, Sample&& sample) {
    for (size_t i = 0; i < count; ++i, dst += 4, map += kGridSamples) {
        int32_t sum[3] = {};
        for (int k = 0; k < kGridSamples; ++k) {
            uint8_t bgr[3];
            if (sample(map[k], bgr)) {
                for (int c = 0; c < 3; ++c) {
                    sum[c] += kTent[k] * bgr[c];
                }
            }
        }
        for (int c = 0; c < 3; ++c) {
            dst[c] = static_cast<uint8_t>(sum[c] / 16);
        }
    }
}

} // namespace

void RenderNearest(uint8_t* dst, const uint32_t* map, size_t count, const SamplePicture& picture) {
    for (size_t i = 0; i < count; ++i, dst += 4) {
        if (const uint8_t* pixel = NearestPixel(map[i], picture)) {
            dst[0] = pixel[0];
            dst[1] = pixel[1];
            dst[2] = pixel[2];
        }
    }
}

void RenderGridNearest(uint8_t* dst, const uint32_t* map, size_t count,
                       const SamplePicture& picture) {
    RenderGrid(dst, map, count, [&](uint32_t entry, uint8_t* bgr) {
        const uint8_t* pixel = NearestPixel(entry, picture);
        for (int c = 0; pixel && c < 3; ++c) {
            bgr[c] = pixel[c];
        }
        return pixel != nullptr;
    });
}

void RenderGridBilinear(uint8_t* dst, const uint32_t* map, size_t count,
                        const SamplePicture& picture) {
    RenderGrid(dst, map, count, [&](uint32_t entry, uint8_t* bgr) {
        const auto x = static_cast<int32_t>(entry >> 6 & 1023);
        const auto y = static_cast<int32_t>(entry >> 22);
        if (x + 1 >= picture.width || y + 1 >= picture.height) {
            return false;
        }
        const auto fx = static_cast<int32_t>(entry & 63);
        const auto fy = static_cast<int32_t>(entry >> 16 & 63);
        const uint8_t* upper = picture.pixels + y * picture.pitch + ptrdiff_t{4} * x;
        const uint8_t* lower = upper + picture.pitch;
        for (int c = 0; c < 3; ++c) {
            const int32_t top = upper[c] * 64 + (upper[c + 4] - upper[c]) * fx;
            const int32_t bottom = lower[c] * 64 + (lower[c + 4] - lower[c]) * fx;
            bgr[c] = static_cast<uint8_t>((top + ((bottom - top) * fy >> 6)) >> 6);
        }
        return true;
    });
}

void RenderFiltered(uint8_t* dst, const ContributionRecord* records, size_t count,
                    const SamplePicture& picture) {
    for (size_t i = 0; i < count; ++i, dst += 4, records += 2) {
        const float* across = records[0].get();
        const float* down = records[1].get();
        if (!across || !down) {
            continue;
        }
        const auto left = static_cast<ptrdiff_t>(across[0]);
        const auto top = static_cast<ptrdiff_t>(down[0]);
        const auto columns = static_cast<ptrdiff_t>(across[1]);
        const auto rows = static_cast<ptrdiff_t>(down[1]);
        float sum[3] = {};
        for (ptrdiff_t y = 0; y < rows; ++y) {
            const uint8_t* pixel = picture.pixels + (top + y) * picture.pitch + left * 4;
            for (ptrdiff_t x = 0; x < columns; ++x, pixel += 4) {
                const float weight = across[2 + x] * down[2 + y];
                for (int c = 0; c < 3; ++c) {
                    sum[c] += weight * static_cast<float>(pixel[c]);
                }
            }
        }
        for (int c = 0; c < 3; ++c) {
            const float value = sum[c] + 0.5F;
            dst[c] = static_cast<uint8_t>(value > 255.0F ? 255.0F : value > 0.0F ? value : 0.0F);
        }
        dst[3] = 255;
    }
}

void RenderChecker(uint8_t* dst, const uint32_t* map, size_t count) {
    for (size_t i = 0; i < count; ++i, dst += 4) {
        // Bit 5 of the whole part, which is bit 11 of either half.
        const bool odd = ((map[i] ^ map[i] >> 16) >> 11 & 1) != 0;
        dst[0] = dst[1] = dst[2] = odd ? 0 : 255;
    }
}

} // namespace kyv
