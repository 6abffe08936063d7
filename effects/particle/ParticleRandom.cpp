// The seed table.
#include "effects/particle/ParticleRandom.h"

#include <array>
#include <cstddef>

namespace kyv {
namespace {

constexpr std::size_t kSeedCount = 100000;

using SeedTable = std::array<uint16_t, kSeedCount>; // 15-bit numbers

SeedTable BuildSeedTable() {
    SeedTable table;
    CParticleRandom random;
    random.Seed(1);
    for (uint16_t& seed : table) {
        seed = static_cast<uint16_t>(random.Next());
    }
    return table;
}

} // namespace

uint32_t StepSeed(int64_t step) {
    static const SeedTable table = BuildSeedTable();
    return table[static_cast<std::size_t>(step) % kSeedCount];
}

} // namespace kyv
