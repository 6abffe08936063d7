// The one list of every pixel kernel. The test of all variants and the benchmark walk it, so a new
// operation or form is checked and timed once its table has an entry here.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "platform/CpuFeatures.h"

namespace kyvtest {

struct Size {
    int32_t width;
    int32_t height;
};

// What one run works on. Pixels are counted in units of the entry's bytes per pixel.
struct KernelBuffers {
    struct Source {
        const uint8_t* pixels;
        ptrdiff_t pitch; // bytes
        Size size;
    };
    uint8_t* dst;
    ptrdiff_t dstPitch; // bytes
    Size size;          // of the destination
    std::vector<Source> sources;
};

// Runs one form, which must exist, over a whole block.
using KernelRun = std::function<void(kyv::InstructionSet, const KernelBuffers&)>;

struct KernelEntry {
    std::string table; // the table's own name, as "kToAYUV"
    int dstBytes = 4;  // per pixel
    // The operation reads the destination before it writes it.
    bool readsDst = false;
    // The first source may be the destination itself.
    bool inPlace = false;
    std::vector<int> sourceBytes = {4}; // per pixel, for every source
    // Where a pixel depends on so few bits that all values can be tried, at most 24 in sum: the
    // number of low bits that count in a pixel of the destination, if it is read, and of every
    // source in order. Empty otherwise.
    std::vector<int> inputBits = {};
    // The size of the sources; that of the destination where this is empty.
    std::function<Size(Size dst, uint32_t seed)> sourceSize = {};

    // True when the table has a form for exactly this set.
    std::function<bool(kyv::InstructionSet)> hasForm = {};
    // Where the form for exactly this set lies, and where the one does that the table selects
    // within a set: to be told apart, not to be called.
    std::function<const void*(kyv::InstructionSet)> exact = {};
    std::function<const void*(kyv::InstructionSet)> selected = {};
    // Makes the parameters that belong to a seed and gives the loop over a block with them.
    std::function<KernelRun(uint32_t seed)> prepare = {};
};

const std::vector<KernelEntry>& KernelCatalog();

inline constexpr kyv::InstructionSet kInstructionSets[] = {
    kyv::InstructionSet::Scalar, kyv::InstructionSet::Sse2,   kyv::InstructionSet::Ssse3,
    kyv::InstructionSet::Avx2,   kyv::InstructionSet::Avx512, kyv::InstructionSet::Neon};

const char* NameOf(kyv::InstructionSet set);

} // namespace kyvtest
