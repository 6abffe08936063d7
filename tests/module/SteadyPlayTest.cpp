// Steady play takes no memory: neither allocations nor fresh pages, frame by frame, in any effect.
#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <new>

#include <gtest/gtest.h>

#include "tests/platform/ProcessUse.h"
#include "tests/support/TestHost.h"

namespace {

std::atomic<size_t> g_allocatedBytes = 0;

void* Allocate(size_t bytes) {
    g_allocatedBytes += bytes;
    void* memory = std::malloc(bytes ? bytes : 1);
    if (!memory) {
        throw std::bad_alloc();
    }
    return memory;
}

} // namespace

// The module's allocations too come through these.
void* operator new(size_t bytes) {
    return Allocate(bytes);
}
void* operator new[](size_t bytes) {
    return Allocate(bytes);
}
void* operator new(size_t bytes, const std::nothrow_t&) noexcept {
    g_allocatedBytes += bytes;
    return std::malloc(bytes ? bytes : 1);
}
void* operator new[](size_t bytes, const std::nothrow_t&) noexcept {
    g_allocatedBytes += bytes;
    return std::malloc(bytes ? bytes : 1);
}
void operator delete(void* memory) noexcept {
    std::free(memory);
}
void operator delete[](void* memory) noexcept {
    std::free(memory);
}
void operator delete(void* memory, size_t) noexcept {
    std::free(memory);
}
void operator delete[](void* memory, size_t) noexcept {
    std::free(memory);
}

namespace {

using namespace kyvtest;

constexpr uint32_t kWidth = 400, kHeight = 300;
constexpr int kWarmFrames = 24, kFrames = 20;

// How many of the frames take memory.
struct Taking {
    int allocating = 0;
    int faulting = 0;

    // Neither a busy system nor a swarm that grows disturbs now and then.
    bool IsSteady() const { return allocating <= kFrames / 4 && faulting <= kFrames / 4; }
};

// Plays a clip that changes from frame to frame; `animate` may change parameters.
template <class Animate>
Taking Play(const EffectDescriptor& effect, uint32_t format, int32_t level, Animate animate) {
    CTestInstance instance(effect, kWidth, kHeight);
    instance.Context().pixelFormat = format;
    instance.Context().cpuLevel = level;
    instance.Context().duration = int64_t{60} * 10'000'000;
    instance.Context().position = int64_t{10} * 10'000'000;
    EXPECT_EQ(instance.Begin(), KYV_OK);
    const Frame inputs[2] = {RandomFrame(kWidth * kHeight, 1), RandomFrame(kWidth * kHeight, 2)};
    Frame output(kWidth * kHeight);
    Taking taking;
    for (int i = 0; i < kWarmFrames + kFrames; ++i) {
        animate(instance, i);
        const size_t bytes = g_allocatedBytes;
        const int64_t faults = GetPageFaults();
        EXPECT_EQ(instance.Render(output.data(), inputs[i % 2].data(), inputs[(i + 1) % 2].data()),
                  KYV_OK);
        if (i >= kWarmFrames) {
            taking.faulting += GetPageFaults() != faults;
            taking.allocating += g_allocatedBytes != bytes;
        }
        instance.Context().position += 10'000'000 / 30;
    }
    return taking;
}

class SteadyPlay : public testing::TestWithParam<uint32_t> {};

INSTANTIATE_TEST_SUITE_P(AllEffects, SteadyPlay, testing::Range(0U, Module().effectCount),
                         [](const auto& entry) {
                             return std::string(Module().effects[entry.param].identifier);
                         });

TEST_P(SteadyPlay, TakesNoMemory) {
    // Those that do not hold it yet; one that does must leave the list.
    struct Excuse {
        const char* effect;
        bool onlyAyuv;
    };
    constexpr Excuse kExcuses[] = {
        {"Kyv_Dsp_Pfx_Bubble", false},           // scales a picture into every bubble
        {"Kyv_Dsp_Pfx_RefractiveBubble", false}, // the same
        {"Kyv_Dsp_Pfx_WaterRipple", false},      // makes its water anew
        {"Kyv_Dsp_Pfx_Fireworks", true},         // converts a canvas that it does not keep
    };
    const EffectDescriptor& effect = Module().effects[GetParam()];
    for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
        const bool excused =
            std::any_of(std::begin(kExcuses), std::end(kExcuses), [&](const Excuse& excuse) {
                return std::string(excuse.effect) == effect.identifier &&
                       (!excuse.onlyAyuv || format == PixelFormat_Ayuv);
            });
        for (const int32_t level : {0, 5}) {
            const Taking taking = Play(effect, format, level, [](CTestInstance&, int) {});
            EXPECT_EQ(taking.IsSteady(), !excused)
                << "format " << format << " level " << level << ": of " << kFrames << " frames "
                << taking.allocating << " allocate and " << taking.faulting << " fault";
        }
    }
}

// The picture-in-picture with everything on, its corners on the move: nothing can be kept, and
// still nothing is taken.
TEST(SteadyPlay, MovingPicturesTakeNoMemory) {
    const EffectDescriptor& effect = Effect("Kyv_Dsp_Pi_Freeform");
    for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
        const Taking taking = Play(effect, format, 5, [](CTestInstance& instance, int i) {
            instance.Set("P0", 0.2F + 0.01F * static_cast<float>(i % 7));
            instance.Set("P10", uint8_t{60});
            instance.Set("P14", 1);
            instance.Set("P17", 0x800000U);
            instance.Set("P20", 4);
            instance.Set("P26", 0x00FFFFU);
            instance.Set("P29", 1);
        });
        EXPECT_TRUE(taking.IsSteady())
            << taking.allocating << " allocate, " << taking.faulting << " fault";
    }
}

} // namespace
