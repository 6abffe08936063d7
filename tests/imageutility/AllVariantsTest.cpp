// Every form of every kernel against its scalar form, byte for byte.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <memory>
#include <random>
#include <regex>
#include <set>

#include <gtest/gtest.h>

#include "tests/support/KernelCatalog.h"
#include "tests/support/SetProbe.h"

namespace kyv {

SetProbeResult SetProbe_scalar() {
    return {InstructionSet::Scalar, 0};
}

namespace {

constexpr KernelTable<SetProbeRow> kSetProbe = {KYV_TABLE(SetProbe),
                                                .passedOver = kNoneIsPassedOver};

} // namespace
} // namespace kyv

namespace {

using namespace kyvtest;
using kyv::InstructionSet;

constexpr uint8_t kGuard = 0xA5;
constexpr size_t kMargin = 96; // guard bytes before and after a destination

enum class Fill { Random, Zeros, Ones, Alternating };

// What surrounds the pixels of a run.
struct Surroundings {
    uint32_t seed;
    Fill fill;
    int padding;  // bytes after every row
    bool doubled; // every other row of a frame
    size_t shift; // bytes before the first pixel
    bool inPlace;
};

std::string Describe(const KernelEntry& entry, InstructionSet set, Size size,
                     const Surroundings& setup) {
    return entry.table + " " + NameOf(set) + " " + std::to_string(size.width) + "x" +
           std::to_string(size.height) + ", seed " + std::to_string(setup.seed) + ", fill " +
           std::to_string(static_cast<int>(setup.fill)) + ", padding " +
           std::to_string(setup.padding) + (setup.doubled ? ", doubled pitch" : "") + ", shift " +
           std::to_string(setup.shift) + (setup.inPlace ? ", in place" : "");
}

// Random bytes to cut blocks from; making them anew for every size would take longest of all.
const std::vector<uint8_t>& RandomPool() {
    static const std::vector<uint8_t> pool = [] {
        std::vector<uint8_t> bytes(1 << 18);
        std::mt19937 random(1);
        for (uint8_t& byte : bytes) {
            byte = static_cast<uint8_t>(random());
        }
        return bytes;
    }();
    return pool;
}

// A block of pixels in memory of its own. Nothing follows the last pixel when the margin is 0, so
// that a sanitizer sees a read beyond it.
class CBlock {
public:
    CBlock(Size size, int bytesPerPixel, const Surroundings& setup, size_t margin)
        : m_rowBytes(static_cast<size_t>(size.width) * bytesPerPixel), m_height(size.height),
          m_pitch((m_rowBytes + setup.padding) * (setup.doubled ? 2 : 1)),
          m_start(margin + setup.shift),
          m_size(m_start + (size.height ? m_pitch * (size.height - 1) + m_rowBytes : 0) + margin),
          m_bytes(new uint8_t[m_size]) {
        std::memset(m_bytes.get(), kGuard, m_size);
    }

    void FillPixels(Fill fill, uint32_t seed) {
        size_t offset = seed * 7919;
        for (int32_t y = 0; y < m_height; ++y) {
            uint8_t* row = Pixels() + y * m_pitch;
            switch (fill) {
            case Fill::Random:
                for (size_t x = 0; x < m_rowBytes;) {
                    const size_t from = offset % RandomPool().size();
                    const size_t count = std::min(m_rowBytes - x, RandomPool().size() - from);
                    std::memcpy(row + x, &RandomPool()[from], count);
                    x += count;
                    offset += count;
                }
                break;
            case Fill::Zeros:
                std::memset(row, 0, m_rowBytes);
                break;
            case Fill::Ones:
                std::memset(row, 255, m_rowBytes);
                break;
            case Fill::Alternating:
                for (size_t x = 0; x < m_rowBytes; ++x) {
                    row[x] = (x ^ y) & 1 ? 255 : 0;
                }
                break;
            }
        }
    }

    void CopyFrom(const CBlock& other) { std::memcpy(m_bytes.get(), other.m_bytes.get(), m_size); }

    uint8_t* Pixels() { return m_bytes.get() + m_start; }
    ptrdiff_t Pitch() const { return static_cast<ptrdiff_t>(m_pitch); }

    // The offset from the first pixel of the first byte that differs, as text; empty when equal.
    std::string FirstDifference(const CBlock& expected) const {
        if (std::memcmp(m_bytes.get(), expected.m_bytes.get(), m_size) == 0) {
            return {};
        }
        const size_t at =
            std::mismatch(m_bytes.get(), m_bytes.get() + m_size, expected.m_bytes.get()).first -
            m_bytes.get();
        return "byte " + std::to_string(static_cast<ptrdiff_t>(at - m_start)) + " of pitch " +
               std::to_string(m_pitch) + " is " + std::to_string(m_bytes[at]) + ", not " +
               std::to_string(expected.m_bytes[at]);
    }

    bool GuardsAreIntact() const {
        CBlock blank(*this, 0);
        blank.CopyFrom(*this);
        for (int32_t y = 0; y < m_height; ++y) {
            std::memset(blank.Pixels() + y * m_pitch, kGuard, m_rowBytes);
        }
        return std::all_of(blank.m_bytes.get(), blank.m_bytes.get() + m_size,
                           [](uint8_t byte) { return byte == kGuard; });
    }

private:
    CBlock(const CBlock& shape, int)
        : m_rowBytes(shape.m_rowBytes), m_height(shape.m_height), m_pitch(shape.m_pitch),
          m_start(shape.m_start), m_size(shape.m_size), m_bytes(new uint8_t[shape.m_size]) {}

    size_t m_rowBytes;
    int32_t m_height;
    size_t m_pitch;
    size_t m_start;
    size_t m_size;
    std::unique_ptr<uint8_t[]> m_bytes;
};

class CComparison {
public:
    explicit CComparison(const KernelEntry& entry) : m_entry(entry) {
        for (const InstructionSet set : kInstructionSets) {
            if (set == InstructionSet::Scalar || !entry.hasForm(set)) {
                continue;
            }
            if (set > kyv::ProcessorInstructionSet()) {
                std::cout << "skipped, not in this processor: " << entry.table << " " << NameOf(set)
                          << "\n";
            } else {
                m_forms.push_back(set);
            }
        }
    }

    // Runs every form over one block. False after a failure.
    bool Check(Size size, const Surroundings& setup) {
        const KernelRun run = m_entry.prepare(setup.seed);
        const Size sourceSize = m_entry.sourceSize ? m_entry.sourceSize(size, setup.seed) : size;
        std::vector<CBlock> sources;
        for (size_t i = 0; i < m_entry.sourceBytes.size(); ++i) {
            sources.emplace_back(sourceSize, m_entry.sourceBytes[i], setup, 0);
            sources.back().FillPixels(setup.fill, setup.seed + static_cast<uint32_t>(i) + 1);
        }
        CBlock start(size, m_entry.dstBytes, setup, kMargin);
        if (m_entry.readsDst || setup.inPlace) {
            start.FillPixels(setup.fill, setup.seed);
        }
        const auto runInto = [&](InstructionSet set, CBlock& dst) {
            KernelBuffers buffers = {dst.Pixels(), dst.Pitch(), size, {}};
            for (CBlock& source : sources) {
                buffers.sources.push_back({source.Pixels(), source.Pitch(), sourceSize});
            }
            if (setup.inPlace) {
                buffers.sources[0] = {dst.Pixels(), dst.Pitch(), size};
            }
            dst.CopyFrom(start);
            run(set, buffers);
        };
        CBlock expected(size, m_entry.dstBytes, setup, kMargin);
        runInto(InstructionSet::Scalar, expected);
        EXPECT_TRUE(expected.GuardsAreIntact())
            << Describe(m_entry, InstructionSet::Scalar, size, setup) << ": wrote outside";
        CBlock actual(size, m_entry.dstBytes, setup, kMargin);
        for (const InstructionSet set : m_forms) {
            runInto(set, actual);
            ++m_compared[static_cast<int>(set)];
            const std::string difference = actual.FirstDifference(expected);
            EXPECT_EQ(difference, "") << Describe(m_entry, set, size, setup);
        }
        return !testing::Test::HasFailure();
    }

    // Compares all inputs, a row of the last 16 bits at a time.
    void CheckEveryInput(uint32_t seed) {
        int bits = 0;
        for (const int each : m_entry.inputBits) {
            bits += each;
        }
        ASSERT_LE(bits, 24) << m_entry.table;
        const uint32_t count = 1U << std::min(bits, 16);
        const KernelRun run = m_entry.prepare(seed);
        std::vector<std::vector<uint8_t>> inputs; // the destination's, if it is read, comes first
        std::vector<int> pixelBytes = m_entry.sourceBytes;
        if (m_entry.readsDst) {
            pixelBytes.insert(pixelBytes.begin(), m_entry.dstBytes);
        }
        ASSERT_EQ(pixelBytes.size(), m_entry.inputBits.size()) << m_entry.table;
        for (const int bytes : pixelBytes) {
            inputs.emplace_back(size_t{count} * bytes);
        }
        const size_t dstSize = size_t{count} * m_entry.dstBytes;
        std::vector<uint8_t> expected(dstSize), actual(dstSize);
        for (uint32_t high = 0; high < 1U << bits; high += count) {
            for (uint32_t low = 0; low < count; ++low) {
                uint32_t value = high | low;
                for (size_t i = 0; i < inputs.size(); ++i) {
                    // Bits that do not count carry something that changes, such as alpha.
                    const uint32_t counted = (1ULL << m_entry.inputBits[i]) - 1;
                    const uint32_t pixel =
                        (value & counted) | (((low * 37) ^ (high >> 16)) << 24 & ~counted);
                    std::memcpy(&inputs[i][size_t{low} * pixelBytes[i]], &pixel, pixelBytes[i]);
                    value >>= m_entry.inputBits[i];
                }
            }
            const auto runInto = [&](InstructionSet set, std::vector<uint8_t>& dst) {
                const Size size = {static_cast<int32_t>(count), 1};
                KernelBuffers buffers = {dst.data(), 0, size, {}};
                for (size_t i = m_entry.readsDst ? 1 : 0; i < inputs.size(); ++i) {
                    buffers.sources.push_back({inputs[i].data(), 0, size});
                }
                if (m_entry.readsDst) {
                    dst = inputs[0];
                }
                run(set, buffers);
            };
            runInto(InstructionSet::Scalar, expected);
            for (const InstructionSet set : m_forms) {
                runInto(set, actual);
                if (actual != expected) {
                    const auto at = std::mismatch(actual.begin(), actual.end(), expected.begin());
                    FAIL() << m_entry.table << " " << NameOf(set) << ", seed " << seed << ", input "
                           << std::hex << (high | (at.first - actual.begin()) / m_entry.dstBytes)
                           << ": byte " << (at.first - actual.begin()) % m_entry.dstBytes << " is "
                           << +*at.first << ", not " << +*at.second;
                }
            }
        }
    }

    void ExpectAllCompared() const {
        for (const InstructionSet set : m_forms) {
            EXPECT_GT(m_compared[static_cast<int>(set)], 0) << m_entry.table << " " << NameOf(set);
        }
    }

private:
    const KernelEntry& m_entry;
    std::vector<InstructionSet> m_forms;
    int m_compared[std::size(kInstructionSets)] = {};
};

// All widths with some heights, all heights with some widths, and a scatter of both.
std::vector<Size> BlockSizes() {
    std::vector<Size> sizes;
    for (int32_t n = 0; n <= 70; ++n) {
        for (const int32_t other : {1, 2, 5}) {
            sizes.push_back({n, other});
        }
        for (const int32_t other : {7, 33}) {
            sizes.push_back({other, n});
        }
        sizes.push_back({n, n * 31 % 71});
    }
    sizes.push_back({5, 0});
    sizes.push_back({0, 5});
    sizes.push_back({70, 70});
    return sizes;
}

class AllVariants : public testing::TestWithParam<KernelEntry> {};

TEST_P(AllVariants, GiveTheBytesOfTheScalarForm) {
    CComparison comparison(GetParam());
    uint32_t seed = 0;
    for (const Size size : BlockSizes()) {
        for (const bool doubled : {false, true}) {
            ++seed;
            const Surroundings setup = {.seed = seed,
                                        .fill = seed % 3 ? Fill::Random : Fill(seed / 3 % 4),
                                        .padding = static_cast<int>(seed * 5 % 4 * 4 + seed % 2),
                                        .doubled = doubled,
                                        .shift = seed * 11 % 33,
                                        .inPlace = GetParam().inPlace && seed % 4 == 0};
            if (!comparison.Check(size, setup)) {
                return;
            }
        }
    }
    comparison.ExpectAllCompared();
}

TEST_P(AllVariants, AgreeOnEveryInput) {
    if (GetParam().inputBits.empty()) {
        GTEST_SKIP() << "too many inputs";
    }
    CComparison(GetParam()).CheckEveryInput(1);
}

INSTANTIATE_TEST_SUITE_P(Kernels, AllVariants, testing::ValuesIn(KernelCatalog()),
                         [](const auto& entry) { return entry.param.table; });

// A processor that this one may not be, and the best set for it.
struct PretendedProcessor {
    const char* name;
    kyv::ProcessorFeatures features;
    InstructionSet best;
};

const PretendedProcessor kProcessors[] = {
    {"SSE2 alone", {}, InstructionSet::Sse2},
    {"with SSSE3", {.ssse3 = true}, InstructionSet::Ssse3},
    {"with AVX2", {.ssse3 = true, .avx2 = true}, InstructionSet::Avx2},
    {"AVX-512 without bytes and words",
     {.ssse3 = true, .avx2 = true, .avx512f = true},
     InstructionSet::Avx2},
    {"AVX-512 without doublewords",
     {.ssse3 = true, .avx2 = true, .avx512f = true, .avx512bw = true, .avx512vl = true},
     InstructionSet::Avx2},
    {"AVX-512 without vector lengths",
     {.ssse3 = true, .avx2 = true, .avx512f = true, .avx512bw = true, .avx512dq = true},
     InstructionSet::Avx2},
    {"with all of AVX-512",
     {.ssse3 = true,
      .avx2 = true,
      .avx512f = true,
      .avx512bw = true,
      .avx512dq = true,
      .avx512vl = true},
     InstructionSet::Avx512},
    {"AVX-512 under a system that keeps no wide registers",
     {.ssse3 = true, .avx512bw = true, .avx512dq = true, .avx512vl = true},
     InstructionSet::Ssse3},
    {"64-bit ARM", {.neon = true}, InstructionSet::Neon},
};

// A build holds the forms of its own architecture only.
std::vector<PretendedProcessor> ProcessorsOfThisBuild() {
    std::vector<PretendedProcessor> processors;
    std::copy_if(std::begin(kProcessors), std::end(kProcessors), std::back_inserter(processors),
                 [](const PretendedProcessor& each) {
                     return each.features.neon == kyv::GetProcessorFeatures().neon;
                 });
    return processors;
}

// What a host's level comes to on a processor whose best set is given.
InstructionSet ExpectedSet(int32_t level, InstructionSet best) {
    if (level < 3) {
        return InstructionSet::Scalar;
    }
    return level == 3 && best != InstructionSet::Neon ? InstructionSet::Sse2 : best;
}

constexpr int32_t kLevels[] = {INT32_MIN, -1, 0, 1, 2, 3, 4, 5, 100, INT32_MAX};

TEST(Levels, ComeToASetOnEveryProcessor) {
    for (const PretendedProcessor& processor : kProcessors) {
        EXPECT_EQ(kyv::ProcessorInstructionSet(processor.features), processor.best)
            << processor.name;
        for (const int32_t level : kLevels) {
            EXPECT_EQ(kyv::Resolve(level, processor.features), ExpectedSet(level, processor.best))
                << processor.name << ", level " << level;
        }
    }
    for (const int32_t level : kLevels) {
        EXPECT_EQ(kyv::Resolve(level), ExpectedSet(level, kyv::ProcessorInstructionSet()))
            << "this processor, level " << level;
    }
}

#if defined(KYV_NO_VECTOR_KERNELS)
constexpr size_t kFormCount = 1;
#elif defined(__aarch64__)
constexpr size_t kFormCount = 2;
#else
constexpr size_t kFormCount = 5;
#endif

// Tables for which AVX-512 wins in a whole effect; all others stay with AVX2.
const std::set<std::string> kWideTables = {
    "kColorTemperatureRow", "kDreamyRow", "kPencilInkRow", "kRayAddRow",      "kRippleOffsetRow",
    "kRippleSampleRow",     "kToARGB",    "kToAYUV",       "kWhiteBalanceRow"};

TEST(Levels, SelectTheFormOfTheirSetInEveryTable) {
    for (const KernelEntry& entry : KernelCatalog()) {
        // No form stands for two sets.
        std::set<const void*> forms;
        for (const InstructionSet set : kInstructionSets) {
            if (entry.hasForm(set)) {
                EXPECT_TRUE(forms.insert(entry.exact(set)).second)
                    << entry.table << " " << NameOf(set);
            }
        }
        // One source gives them all. Levels below the vector forms have a table of their own.
        if (entry.table == "kAddBlendWithAlpha") {
            EXPECT_EQ(forms.size(), 1U);
        } else {
            EXPECT_EQ(forms.size(), kFormCount) << entry.table;
        }
        for (const PretendedProcessor& processor : ProcessorsOfThisBuild()) {
            for (const int32_t level : kLevels) {
                InstructionSet expected = ExpectedSet(level, processor.best);
                if (expected == InstructionSet::Avx512 && !kWideTables.contains(entry.table)) {
                    expected = InstructionSet::Avx2;
                }
                while (!entry.hasForm(expected)) {
                    expected = static_cast<InstructionSet>(static_cast<int>(expected) - 1);
                }
                EXPECT_EQ(entry.selected(kyv::Resolve(level, processor.features)),
                          entry.exact(expected))
                    << entry.table << ", " << processor.name << ", level " << level << ": not "
                    << NameOf(expected);
            }
        }
    }
}

#ifndef KYV_NO_VECTOR_KERNELS
// All tables are made by the same words, so what they hold for the probe they hold for all.
TEST(Levels, ReachTheCodeThatWasCompiledForTheirSet) {
    for (const PretendedProcessor& processor : ProcessorsOfThisBuild()) {
        for (const int32_t level : kLevels) {
            const InstructionSet expected = ExpectedSet(level, processor.best);
            const kyv::SetProbeResult probe =
                kyv::kSetProbe.For(kyv::Resolve(level, processor.features))();
            EXPECT_EQ(probe.set, expected) << processor.name << ", level " << level;
            const size_t bytes = expected == InstructionSet::Scalar   ? 0
                                 : expected == InstructionSet::Avx512 ? 64
                                 : expected == InstructionSet::Avx2   ? 32
                                                                      : 16;
            EXPECT_EQ(probe.vectorBytes, bytes) << processor.name << ", level " << level;
        }
    }
}
#endif

// A table that nobody listed would never be compared.
TEST(KernelCatalog, NamesEveryTableOfTheSources) {
    const std::regex declaration(R"(extern const (?:kyv::)?KernelTable<\w+> (k\w+);)");
    std::set<std::string> declared, listed;
    for (const char* folder : {"effects", "imageutility"}) {
        for (const auto& file : std::filesystem::recursive_directory_iterator(
                 std::filesystem::path(KYV_SOURCE_DIR) / folder)) {
            if (file.path().extension() != ".h") {
                continue;
            }
            std::ifstream stream(file.path());
            for (std::string line; std::getline(stream, line);) {
                if (std::smatch match; std::regex_search(line, match, declaration)) {
                    declared.insert(match[1]);
                }
            }
        }
    }
    for (const KernelEntry& entry : KernelCatalog()) {
        listed.insert(entry.table);
    }
    EXPECT_EQ(listed, declared);
}

} // namespace
