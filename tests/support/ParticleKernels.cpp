// The catalogue's entries of the particle effects.
#include <cstring>
#include <random>

#include "effects/particle/RippleOffsetRow.h"
#include "effects/particle/RippleSampleRow.h"
#include "tests/support/KernelRows.h"

namespace kyvtest {
namespace {

// Rows through a young, an old or a small ripple, near its centre and far from it.
auto BindOffsets(uint32_t seed) {
    std::mt19937 random(seed);
    const float scale = seed % 3 == 0 ? 0.2F : 2.6F;
    const float age = static_cast<float>(random() % 1000) / 1000.0F;
    const kyv::RippleShape shape = {
        static_cast<float>(static_cast<int32_t>((100.0F + 200.0F * age) * scale)),
        (16.0F + 20.0F * age) * scale, (30.0F - 30.0F * age) * scale, -25.0F * age};
    return [shape, start = static_cast<int32_t>(random() % 200)](kyv::RippleOffsetRow form,
                                                                 const KernelBuffers& buffers) {
        const auto count = static_cast<size_t>(buffers.size.width);
        // Floats are aligned; the bytes around them are the test's guards.
        std::vector<float> offsets(count + 1, -1234.5F);
        for (int32_t y = 0; y < buffers.size.height; ++y) {
            form(offsets.data(), count, start + y, shape);
            std::memcpy(buffers.dst + y * buffers.dstPitch, offsets.data(),
                        offsets[count] == -1234.5F ? count * 4 : 0);
        }
    };
}

// Offsets of up to 80 pixels, as ripples have them, of fractions of a pixel, and none at all.
auto BindSamples(uint32_t seed) {
    const float reach = seed % 3 == 0 ? 80.0F : seed % 3 == 1 ? 1.0F : 0.0F;
    return [seed, reach](kyv::RippleSampleRow form, const KernelBuffers& buffers) {
        const kyv::RipplePicture picture = {buffers.sources[0].pixels, buffers.sources[0].pitch,
                                            buffers.size.width, buffers.size.height};
        uint32_t random = seed;
        std::vector<float> offsets(static_cast<size_t>(buffers.size.width));
        for (int32_t y = 0; y < buffers.size.height; ++y) {
            for (float& offset : offsets) {
                random = random * 1664525U + 1013904223U;
                offset = static_cast<float>(static_cast<int32_t>(random)) / 2147483648.0F * reach;
            }
            form(buffers.dst + y * buffers.dstPitch, picture, 0, y, offsets.data(), offsets.size());
        }
    };
}

} // namespace

void AddParticles(std::vector<KernelEntry>& list) {
    list.push_back(Blocks(kyv::kRippleOffsetRow, {.table = "kRippleOffsetRow", .sourceBytes = {}},
                          BindOffsets));
    // The picture has one more column and row than are shown.
    list.push_back(Blocks(kyv::kRippleSampleRow,
                          {.table = "kRippleSampleRow",
                           .sourceSize =
                               [](Size dst, uint32_t) {
                                   return Size{dst.width + 1, dst.height + 1};
                               }},
                          BindSamples));
}

} // namespace kyvtest
