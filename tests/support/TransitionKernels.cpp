// The catalogue's entries of the transitions.
#include <memory>
#include <random>

#include "effects/transition/MaskBlend.h"
#include "tests/support/KernelRows.h"

namespace kyvtest {
namespace {

// Hard cuts, soft bands as hosts set them and wider ones than all mask values, with border and
// without, at moments from before the beginning to after the end.
auto BindBlend(uint32_t seed) {
    std::mt19937 random(seed);
    const int32_t smoothness[] = {0, 20, static_cast<int32_t>(random() % 41), 400};
    const auto blend = std::make_shared<kyv::MaskBlend>();
    kyv::BuildMaskBlend(*blend,
                        {.percentage = static_cast<float>(random() % 111) / 100.0F - 0.05F,
                         .smoothness = smoothness[seed % 4],
                         .hasBorder = random() % 2 != 0,
                         .edge = {static_cast<uint8_t>(random()), static_cast<uint8_t>(random()),
                                  static_cast<uint8_t>(random())}});
    return [blend](kyv::MaskBlendRow form, const KernelBuffers& buffers) {
        const auto row = [&buffers](size_t source, int32_t y) {
            return buffers.sources[source].pixels + y * buffers.sources[source].pitch;
        };
        for (int32_t y = 0; y < buffers.size.height; ++y) {
            form(buffers.dst + y * buffers.dstPitch, row(0, y), row(1, y), row(2, y),
                 static_cast<size_t>(buffers.size.width), *blend);
        }
    };
}

} // namespace

void AddTransitions(std::vector<KernelEntry>& list) {
    list.push_back(Blocks(kyv::kMaskBlendRow,
                          {.table = "kMaskBlendRow", .inPlace = true, .sourceBytes = {4, 4, 1}},
                          BindBlend));
}

} // namespace kyvtest
