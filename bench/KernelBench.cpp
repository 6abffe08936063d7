// Every form of every kernel in the catalogue of the tests.
#include "bench/Bench.h"

#include <algorithm>

#include "tests/support/KernelCatalog.h"

namespace kyvbench {
namespace {

using namespace kyvtest;
using kyv::InstructionSet;

constexpr uint32_t kSeed = 1; // chooses the kernels' parameters

// One run over a frame. Kernels that scale get a source of another width, cut to what there is.
std::function<void()> MakeRun(const KernelEntry& entry, InstructionSet set) {
    Frames& frames = SharedFrames();
    const Size frame = {kWidth, kHeight};
    const size_t needed = kPixels * static_cast<size_t>(entry.dstBytes);
    if (frames.target.size() < needed) {
        frames.target.resize(needed);
    }
    KernelBuffers buffers = {frames.target.data(), ptrdiff_t{kWidth} * entry.dstBytes, frame, {}};
    Size size = entry.sourceSize ? entry.sourceSize(frame, kSeed) : frame;
    size = {std::min(size.width, kWidth), std::min(size.height, kHeight)};
    for (size_t i = 0; i < entry.sourceBytes.size(); ++i) {
        buffers.sources.push_back(
            {frames.source[i].data(), ptrdiff_t{size.width} * entry.sourceBytes[i], size});
    }
    return [run = entry.prepare(kSeed), set, buffers] { run(set, buffers); };
}

} // namespace

void AddKernels() {
    for (const KernelEntry& entry : KernelCatalog()) {
        for (const InstructionSet set : kInstructionSets) {
            if (set <= kyv::ProcessorInstructionSet() && entry.hasForm(set)) {
                AddPrepared(entry.table, NameOf(set),
                            [&entry, set] { return MakeRun(entry, set); });
            }
        }
    }
}

} // namespace kyvbench
