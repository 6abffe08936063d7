// The same picture whatever the circumstances, and not a byte beside it: sizes, places in memory,
// levels, threads, orders of frames, hostile parameters, compilers and targets.
#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <memory>
#include <numeric>
#include <sstream>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "tests/platform/GuardedMemory.h"
#include "tests/support/Scenes.h"

namespace {

using namespace kyvtest;

class Renders : public testing::TestWithParam<const EffectDescriptor*> {};

INSTANTIATE_TEST_SUITE_P(AllEffects, Renders, testing::ValuesIn(AllEffects()),
                         [](const auto& entry) { return EffectName(*entry.param); });

// Of how many cases a short run takes one.
size_t Stride(const EffectDescriptor& effect) {
    return std::getenv("KYV_LONG") ? 1 : size_t{KYV_STRIDE} * Slowness(effect);
}

// A scene's frames between pages that nobody may touch. The inputs cannot be written; the output
// starts somewhere else in a vector's width with every slack.
class CGuardedFrames {
public:
    CGuardedFrames(const Scene& scene, size_t slack)
        : m_scene(scene), m_inputs{{{scene.FramePixels() * 4, slack / 4 * 4},
                                    {scene.FramePixels() * 4, (slack + 8) % 16}}},
          m_output(scene.FramePixels() * 4, slack) {
        for (uint32_t i = 0; i < 2; ++i) {
            const Frame pixels = scene.Input(i);
            std::memcpy(m_inputs[i].Data(), pixels.data(), m_inputs[i].Size());
            m_inputs[i].SetReadOnly();
        }
    }

    KyvStatus Render(CSceneInstance& instance) {
        std::memset(m_output.Data(), 0xA5, m_output.Size());
        const KyvStatus status =
            instance.Render(m_output.Data(), m_inputs[0].Data(), m_inputs[1].Data());
        EXPECT_TRUE(m_output.IsIntact()) << m_scene;
        return status;
    }

    Frame Output() const {
        Frame output(m_output.Size() / 4);
        std::memcpy(output.data(), m_output.Data(), m_output.Size());
        return output;
    }

private:
    const Scene& m_scene;
    std::array<CGuardedMemory, 2> m_inputs;
    CGuardedMemory m_output;
};

Frame RenderGuarded(const Scene& scene, size_t slack) {
    CGuardedFrames frames(scene, slack);
    CSceneInstance instance(scene);
    EXPECT_EQ(instance.Begin(), KYV_OK) << scene;
    EXPECT_EQ(frames.Render(instance), KYV_OK) << scene;
    return frames.Output();
}

// Another level and number of threads that are to give the same bytes. Levels 1 and 2 add alpha
// where all others keep it, and from two threads on a transition leaves the display's shape alone.
Scene Otherwise(Scene scene, Random& random) {
    constexpr int32_t kLevels[] = {-1, 0, 3, 4, 5, 6};
    constexpr uint32_t kThreads[] = {2, 3, 8, 64, 1000};
    int32_t& level = scene.context.cpuLevel;
    level = level == 1 || level == 2 ? 3 - level : kLevels[random() % std::size(kLevels)];
    uint32_t& threads = scene.context.threadCount;
    threads = threads < 2 ? 1 - threads : kThreads[random() % std::size(kThreads)];
    return scene;
}

TEST_P(Renders, OfEverySizeAgreeAtAnyLevelPlaceAndNumberOfThreads) {
    constexpr uint32_t kSides[] = {1, 2, 3, 7, 8, 15, 16, 17, 33, 64};
    std::vector<std::pair<uint32_t, uint32_t>> sizes = {
        {1, 4096}, {4096, 1}, {16384, 8}, {8, 16384}};
    for (const uint32_t width : kSides) {
        for (const uint32_t height : kSides) {
            sizes.emplace_back(width, height);
        }
    }
    for (const uint32_t seed : Seeds(1, 40)) {
        Random random(seed);
        for (size_t i = 0; i < sizes.size(); i += Stride(*GetParam())) {
            Scene scene = RandomScene(*GetParam(), seed * 1000 + static_cast<uint32_t>(i));
            std::tie(scene.context.width, scene.context.height) = sizes[i];
            const Frame expected = RenderGuarded(scene, 0);
            const Scene other = Otherwise(scene, random);
            ASSERT_EQ(RenderGuarded(other, 1 + i % 15), expected) << "run " << seed << "\n"
                                                                  << scene << "\n"
                                                                  << other;
        }
    }
}

// The bits of what no slider gives.
constexpr uint32_t kHostile[] = {
    0x7FC00000, 0xFFC00000, 0x7F800001, 0x7F800000, 0xFF800000, // not numbers, infinities
    0x00000001, 0x80000001, 0x007FFFFF, 0x80000000,             // denormals, minus zero
    0x7F7FFFFF, 0xFF7FFFFF, 0x4F000000, 0xCF000000, 0x5F000000, // as large as can be, 2^31, 2^63
    0x3F800001, 0xBF800001, 0x3F7FFFFF, 0x447A0000, 0xC47A0000, // about 1, and 1000
    0x7FFFFFFF, 0xFFFFFFFF, 0x80000080, 0x0000FFFF, 0xFFFF0000, 0xDEADBEEF, 0x41414141};

TEST_P(Renders, WithOneHostileParameterAgreeAtTheLowestAndTheHighestLevel) {
    for (uint32_t i = 0, offset = 0; i < GetParam()->paramCount; ++i) {
        const uint32_t size = GetParam()->params[i].valueSize;
        for (size_t which = i % Stride(*GetParam()); which < std::size(kHostile);
             which += Stride(*GetParam())) {
            const uint32_t bits = kHostile[which];
            for (uint32_t format = 0; format < 2; ++format) {
                Scene scene = RandomScene(*GetParam(), i);
                scene.context.width = 65;
                scene.context.height = 48;
                scene.context.pixelFormat = format;
                for (uint32_t at = 0; at < size; ++at) {
                    scene.params[offset + at] = static_cast<uint8_t>(bits >> 8 * (at & 3));
                }
                scene.context.cpuLevel = 0;
                const Frame expected = RenderGuarded(scene, 4);
                scene.context.cpuLevel = 5;
                ASSERT_EQ(RenderGuarded(scene, 8), expected)
                    << GetParam()->params[i].key << " of the bits " << std::hex << bits << std::dec
                    << ", " << scene;
            }
        }
        offset += size;
    }
}

TEST_P(Renders, WithParametersOfAnyBitsAgreeFrameAfterFrame) {
    for (const uint32_t seed : Seeds(Stride(*GetParam()) == 1 ? 20 : 2, 20000)) {
        Random random(seed);
        Scene scene = RandomScene(*GetParam(), seed);
        std::unique_ptr<CSceneInstance> instances[2];
        const Scene other = Otherwise(scene, random);
        CGuardedFrames frames[2] = {{scene, seed % 16}, {other, 0}};
        for (int which = 0; which < 2; ++which) {
            instances[which] = std::make_unique<CSceneInstance>(which == 0 ? scene : other);
            ASSERT_EQ(instances[which]->Begin(), KYV_OK);
        }
        for (int frame = 0; frame < 5; ++frame) {
            for (uint8_t& byte : scene.params) {
                byte = static_cast<uint8_t>(random());
            }
            const int64_t position = scene.context.position + frame * 400000;
            for (int which = 0; which < 2; ++which) {
                instances[which]->Params() = scene.params;
                instances[which]->Context().position = position;
                ASSERT_EQ(frames[which].Render(*instances[which]), KYV_OK) << scene;
            }
            ASSERT_EQ(frames[0].Output(), frames[1].Output())
                << "run " << seed << ", frame " << frame << "\n"
                << scene << "\n"
                << other;
        }
    }
}

TEST_P(Renders, InAnyOrderAreThoseOfAFreshInstance) {
    for (const uint32_t seed : Seeds(1, 100)) {
        Random random(seed);
        const Scene scene = RandomScene(*GetParam(), seed);
        std::vector<int64_t> positions(200 / Stride(*GetParam()));
        for (int64_t& position : positions) {
            position = static_cast<int64_t>(random() % 30000) * 10000;
        }
        std::sort(positions.begin(), positions.end());
        const Frame input = scene.Input(0);
        const Frame second = scene.Input(1);
        std::vector<Frame> fresh;
        for (const int64_t position : positions) {
            Scene moment = scene;
            moment.context.position = position;
            fresh.push_back(RenderScene(moment));
        }
        std::vector<size_t> order(positions.size());
        std::iota(order.begin(), order.end(), size_t{0});
        for (const char* name : {"forward", "backward", "shuffled"}) {
            if (*name == 'b') {
                std::reverse(order.begin(), order.end());
            } else if (*name == 's') {
                std::shuffle(order.begin(), order.end(), random);
            }
            CSceneInstance instance(scene);
            ASSERT_EQ(instance.Begin(), KYV_OK);
            for (const size_t i : order) {
                instance.Context().position = positions[i];
                Frame output(input.size(), 0xA5A5A5A5);
                ASSERT_EQ(instance.Render(output.data(), input.data(), second.data()), KYV_OK);
                ASSERT_EQ(output, fresh[i]) << name << ", at " << positions[i] << ", " << scene;
            }
        }
    }
}

uint64_t HashOf(const Frame& frame) {
    uint64_t hash = 0xCBF29CE484222325U; // FNV-1a, a pixel a step
    for (const uint32_t pixel : frame) {
        hash = (hash ^ pixel) * 0x100000001B3U;
    }
    return hash;
}

// One list for every compiler, target and level. After a change that is meant to be seen it is
// written anew with KYV_WRITE=1 in the environment.
TEST(RenderList, IsTheSameEverywhere) {
    std::ostringstream list;
    for (const EffectDescriptor* effect : AllEffects()) {
        for (uint32_t seed = 0; seed < 40; ++seed) {
            list << effect->identifier << ' ' << seed << ' ' << std::hex
                 << HashOf(RenderScene(RandomScene(*effect, seed))) << std::dec << '\n';
        }
    }
    if (std::getenv("KYV_WRITE")) {
        std::ofstream(KYV_RENDERS_FILE) << list.str();
    }
    std::ifstream file(KYV_RENDERS_FILE);
    std::istringstream actual(list.str());
    std::string expected;
    std::string line;
    int differing = 0;
    while (std::getline(actual, line)) {
        std::getline(file, expected);
        differing += line != expected;
        EXPECT_TRUE(line == expected || differing > 5) << line << " instead of " << expected;
    }
    EXPECT_EQ(differing, 0);
}

} // namespace
