// Every form of every kernel in the catalogue of the tests.
#include "bench/Bench.h"

#include <iterator>

#include "tests/support/KernelCatalog.h"

namespace kyvbench {
namespace {

using namespace kyvtest;
using kyv::InstructionSet;

constexpr uint32_t kSeed = 1; // chooses the kernels' parameters

// A source of that many bytes. What a frame does not hold comes from memory that large sources
// share.
const uint8_t* SourceOf(Frames& frames, size_t index, size_t bytes) {
    const std::vector<uint8_t>& frame = frames.source[index % std::size(frames.source)];
    if (bytes <= frame.size()) {
        return frame.data();
    }
    while (frames.large.size() < bytes) {
        frames.large.insert(frames.large.end(), frame.begin(), frame.end());
    }
    return frames.large.data();
}

// One run over a frame. Kernels that scale get a source of another size.
std::function<void()> MakeRun(const KernelEntry& entry, InstructionSet set) {
    Frames& frames = SharedFrames();
    const Size frame = {kWidth, kHeight};
    const size_t needed = kPixels * static_cast<size_t>(entry.dstBytes);
    if (frames.target.size() < needed) {
        frames.target.resize(needed);
    }
    KernelBuffers buffers = {frames.target.data(), ptrdiff_t{kWidth} * entry.dstBytes, frame, {}};
    const Size size = entry.sourceSize ? entry.sourceSize(frame, kSeed) : frame;
    for (size_t i = 0; i < entry.sourceBytes.size(); ++i) {
        const ptrdiff_t pitch = ptrdiff_t{size.width} * entry.sourceBytes[i];
        buffers.sources.push_back(
            {SourceOf(frames, i, static_cast<size_t>(pitch) * size.height), pitch, size});
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
