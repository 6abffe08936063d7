// The style effects and a GPU helper library, through the callbacks.
#include <algorithm>
#include <cmath>
#include <filesystem>
#include <limits>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/Library.h"
#include "tests/effects/gpu_helper.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;

constexpr uint32_t kWidth = 5;
constexpr uint32_t kHeight = 4;

struct Helper {
    explicit Helper(const char* file)
        : library(kyv::OpenLibrary(std::filesystem::path(file).native())) {
        const auto get =
            reinterpret_cast<GetHelperLogFunction>(kyv::FindSymbol(library, "GetHelperLog"));
        log = get ? get() : nullptr;
        if (log) {
            *log = {};
        }
    }
    ~Helper() { kyv::CloseLibrary(library); }
    Helper(const Helper&) = delete;
    Helper& operator=(const Helper&) = delete;

    kyv::LibraryHandle library;
    GpuHelperLog* log;
};

Frame Flipped(Frame frame) {
    for (uint32_t& pixel : frame) {
        pixel = ~pixel;
    }
    return frame;
}

class GpuPath : public testing::TestWithParam<const char*> {
protected:
    void SetUp() override { ASSERT_NE(m_helper.log, nullptr) << KYV_GPU_HELPER_FILE; }

    // What the processor gives for the same settings.
    Frame OnProcessor(const Frame& input) const {
        CTestInstance instance(Effect(GetParam()), kWidth, kHeight);
        Frame output(input.size());
        EXPECT_EQ(instance.Begin(), KYV_OK);
        EXPECT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
        return output;
    }

    Helper m_helper{KYV_GPU_HELPER_FILE};
    Frame m_input = RandomFrame(size_t{kWidth} * kHeight, 7);
};

INSTANTIATE_TEST_SUITE_P(StyleEffects, GpuPath,
                         testing::Values("Kyv_Dsp_Vi_Dreamy", "Kyv_Dsp_Vi_LightRay",
                                         "Dsp_Vi_PencilSketch2"),
                         [](const auto& entry) {
                             const std::string name = entry.param;
                             return name.substr(name.rfind('_') + 1);
                         });

TEST_P(GpuPath, EachModeRendersThroughItsObject) {
    static uint32_t deviceCalls;
    static GpuDeviceTable table = {};
    table.Render = [](void*, const void*, void* output, const GpuFrame* frame,
                      const void*) -> uint32_t {
        ++deviceCalls;
        std::fill_n(static_cast<uint32_t*>(output), frame->width * frame->height, 0x12345678U);
        return 99; // not looked at
    };
    GpuDevice device = {&table};
    const Frame onProcessor = OnProcessor(m_input);
    struct Case {
        uint32_t mode, cudart, brook, device;
    };
    for (const Case& c : {Case{0, 0, 0, 0},
                          {1, 0, 0, 0},
                          {2, 1, 0, 0},
                          {3, 0, 0, 0},
                          {4, 1, 0, 0},
                          {6, 0, 0, 0},
                          {8, 0, 1, 0},
                          {16, 0, 1, 0},
                          {24, 0, 0, 0},
                          {256, 0, 0, 0},
                          {512, 0, 0, 1},
                          {1024, 0, 0, 1},
                          {0xFFFFFFFF, 0, 0, 0}}) {
        SCOPED_TRACE(c.mode);
        *m_helper.log = {};
        deviceCalls = 0;
        CTestInstance instance(Effect(GetParam()), kWidth, kHeight);
        instance.Context().gpuLibrary = m_helper.library;
        instance.Context().gpuDevice = &device;
        instance.Context().gpuMode = c.mode;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        Frame output(m_input.size());
        ASSERT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
        EXPECT_EQ(m_helper.log->cudart.count, c.cudart);
        EXPECT_EQ(m_helper.log->brook.count, c.brook);
        EXPECT_EQ(deviceCalls, c.device);
        EXPECT_EQ(instance.Context().gpuMode, c.mode);
        EXPECT_EQ(output, c.device              ? Frame(output.size(), 0x12345678)
                          : c.cudart || c.brook ? Flipped(m_input)
                                                : onProcessor);
    }
}

TEST_P(GpuPath, WrappersAreAskedForOnceAndHandedBackAtEveryRelease) {
    {
        CTestInstance instance(Effect(GetParam()), kWidth, kHeight);
        instance.Context().gpuLibrary = m_helper.library;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        EXPECT_EQ(m_helper.log->gotCudart, 1U);
        EXPECT_EQ(m_helper.log->gotBrook, 1U);
        EXPECT_EQ(m_helper.log->arguments, 0U);
        EXPECT_EQ(m_helper.log->releasedCudart, 0U);
        for (uint32_t time = 1; time <= 3; ++time) {
            EXPECT_EQ(instance.End(), KYV_OK);
            EXPECT_EQ(m_helper.log->releasedCudart, time);
            EXPECT_EQ(m_helper.log->releasedBrook, time);
        }
        // What was handed back renders no more.
        instance.Context().gpuMode = GpuMode_CudartB;
        Frame output(m_input.size());
        EXPECT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
        EXPECT_EQ(m_helper.log->cudart.count, 0U);
        // Nor does it after a preparation without the library, though the pointer is still there
        // for the release.
        instance.Context().gpuLibrary = nullptr;
        EXPECT_EQ(instance.Begin(), KYV_OK);
        EXPECT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
        EXPECT_EQ(m_helper.log->cudart.count, 0U);
        EXPECT_EQ(instance.End(), KYV_OK);
        EXPECT_EQ(m_helper.log->releasedCudart, 3U);
        instance.Context().gpuLibrary = m_helper.library;
    } // DestroyInstance
    EXPECT_EQ(m_helper.log->releasedCudart, 4U);
    EXPECT_EQ(m_helper.log->releasedBrook, 4U);
    EXPECT_EQ(m_helper.log->strangers, 0U);
}

TEST_P(GpuPath, FailingCudartRenderFallsBackForGoodAndFailingBrookIsIgnored) {
    const Frame onProcessor = OnProcessor(m_input);
    CTestInstance instance(Effect(GetParam()), kWidth, kHeight);
    EffectContext& context = instance.Context();
    context.gpuLibrary = m_helper.library;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    m_helper.log->result = 0x80004005;
    context.gpuMode = GpuMode_BrookA;
    Frame untouched(m_input.size(), 5);
    EXPECT_EQ(instance.Render(untouched.data(), m_input.data()), KYV_OK);
    EXPECT_EQ(context.gpuMode, 8U);
    EXPECT_EQ(m_helper.log->brook.count, 1U);
    EXPECT_THAT(untouched, testing::Each(5U));

    context.gpuMode = GpuMode_CudartB;
    Frame output(m_input.size());
    EXPECT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
    EXPECT_EQ(context.gpuMode, 1U);
    EXPECT_EQ(output, onProcessor);
    EXPECT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
    EXPECT_EQ(m_helper.log->cudart.count, 1U);
    // Until the host selects the path again.
    m_helper.log->result = 0;
    context.gpuMode = GpuMode_CudartA;
    EXPECT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
    EXPECT_EQ(output, Flipped(m_input));
}

TEST_P(GpuPath, ModesWithoutAnObjectRenderOnTheProcessor) {
    const Frame onProcessor = OnProcessor(m_input);
    const Helper cudartOnly(KYV_GPU_HELPER_CUDART_FILE);
    ASSERT_NE(cudartOnly.log, nullptr);
    m_helper.log->withholdCudart = 1;
    GpuDevice noTable = {};
    const GpuDeviceTable emptyTable = {};
    GpuDevice noOperation = {&emptyTable};
    struct Case {
        const char* what;
        void* library;
        void* device;
        uint32_t modes[6];
    };
    for (const Case& c : {
             Case{"no library", nullptr, nullptr, {2, 4, 8, 16, 512, 1024}},
             Case{"a getter that has nothing", m_helper.library, nullptr, {2, 4, 512, 1024}},
             Case{"a library with one half", cudartOnly.library, &noTable, {8, 16, 512}},
             Case{"a device without the operation", nullptr, &noOperation, {2, 8, 512}},
             Case{"another library", kyv::OwnLibrary(), nullptr, {2, 8}},
         }) {
        CTestInstance instance(Effect(GetParam()), kWidth, kHeight);
        instance.Context().gpuLibrary = c.library;
        instance.Context().gpuDevice = c.device;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        for (const uint32_t mode : c.modes) {
            instance.Context().gpuMode = mode;
            Frame output(m_input.size());
            EXPECT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
            EXPECT_EQ(output, onProcessor) << c.what << ", mode " << mode;
            EXPECT_EQ(instance.Context().gpuMode, mode);
        }
    }
}

TEST_P(GpuPath, WrapperStaysInUseWhenTheNextLibraryLacksTheEntry) {
    const Helper cudartOnly(KYV_GPU_HELPER_CUDART_FILE);
    ASSERT_NE(cudartOnly.log, nullptr);
    CTestInstance instance(Effect(GetParam()), kWidth, kHeight);
    for (void* library : {m_helper.library, cudartOnly.library, kyv::LibraryHandle{}}) {
        instance.Context().gpuLibrary = library;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        *m_helper.log = {};
        instance.Context().gpuMode = GpuMode_BrookA;
        Frame output(m_input.size());
        ASSERT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
        EXPECT_EQ(m_helper.log->brook.count, 1U);
        EXPECT_EQ(output, Flipped(m_input));
    }
    // A library whose entry has nothing to give takes the object out of use.
    instance.Context().gpuLibrary = m_helper.library;
    m_helper.log->withholdCudart = 1;
    instance.Context().gpuMode = GpuMode_CudartA;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    Frame output(m_input.size());
    ASSERT_EQ(instance.Render(output.data(), m_input.data()), KYV_OK);
    EXPECT_EQ(output, OnProcessor(m_input));
}

TEST_P(GpuPath, HelperIsToldTheGeometry) {
    const Frame input = RandomFrame(size_t{2} * kWidth * kHeight, 8);
    Frame output(input.size(), 3);
    CTestInstance instance(Effect(GetParam()), kWidth, kHeight);
    EffectContext& context = instance.Context();
    int device = 0; // never called, only handed through
    context.gpuDevice = &device;
    context.gpuLibrary = m_helper.library;
    context.gpuMode = GpuMode_BrookB;
    context.stereoLayout = StereoLayout_RightHalf;
    context.pixelFormat = PixelFormat_Ayuv;
    context.fieldSelector = FieldSelector_Second;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    context.gpuDevice = nullptr;
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    const GpuRenderCall& call = m_helper.log->brook;
    EXPECT_NE(call.self, nullptr);
    EXPECT_EQ(call.input, input.data() + kWidth);
    EXPECT_EQ(call.output, output.data() + kWidth);
    EXPECT_EQ(call.frame.byteCount, 48U);
    EXPECT_EQ(call.frame.width, kWidth);
    EXPECT_EQ(call.frame.height, kHeight);
    EXPECT_EQ(call.frame.pitchBytes, kWidth * 8);
    EXPECT_EQ(call.frame.pixelFormat, 1U);
    EXPECT_EQ(call.frame.fieldSelector, 2U);
    EXPECT_EQ(call.frame.gpuMode, 16U);
    EXPECT_EQ(call.frame.device, &device);
    for (uint32_t y = 0; y < kHeight; ++y) {
        for (uint32_t x = 0; x < 2 * kWidth; ++x) {
            const size_t at = size_t{y} * 2 * kWidth + x;
            EXPECT_EQ(output[at], x < kWidth ? 3 : ~input[at]) << x << ", " << y;
        }
    }
}

// A render on the helper with what the host stored, within the declared ranges or not.
template <class Change>
const GpuRenderCall& Ask(const Helper& helper, const char* effect, Change&& change) {
    CTestInstance instance(Effect(effect), kWidth, kHeight);
    instance.Context().gpuLibrary = helper.library;
    instance.Context().gpuMode = GpuMode_CudartA;
    change(instance);
    EXPECT_EQ(instance.Begin(), KYV_OK);
    const Frame input(size_t{kWidth} * kHeight);
    Frame output(input.size());
    EXPECT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    return helper.log->cudart;
}

struct Rect {
    float left, top, right, bottom;
};
constexpr float kNan = std::numeric_limits<float>::quiet_NaN();

TEST(GpuSettings, AreWithinTheirRanges) {
    const Helper helper(KYV_GPU_HELPER_FILE);
    ASSERT_NE(helper.log, nullptr);

    const auto& dreamy = Ask(helper, "Kyv_Dsp_Vi_Dreamy", [](CTestInstance& instance) {
                             instance.Set("P1", uint8_t{200});
                             instance.Set("P2", Rect{0.75F, kNan, 0.25F, 1e30F});
                             instance.Set("P3", int32_t{1});
                             instance.Set("P4", 7.0F);
                             instance.Set("P5", uint32_t{1});
                             instance.Context().gpuVariant = 3;
                         }).settings.dreamy;
    EXPECT_EQ(helper.log->cudart.frame.effect, GpuEffect_Dreamy);
    EXPECT_EQ(helper.log->cudart.frame.settingsBytes, sizeof dreamy);
    EXPECT_EQ(dreamy.degree, 40U);
    EXPECT_EQ(dreamy.variant, 3U);
    EXPECT_EQ(dreamy.mask.left, 0.25F);
    EXPECT_EQ(dreamy.mask.right, 0.75F);
    EXPECT_EQ(dreamy.mask.top, 0.0F);
    EXPECT_EQ(dreamy.mask.bottom, 16.0F);
    EXPECT_EQ(dreamy.mask.ellipse, 1U);
    EXPECT_EQ(dreamy.mask.depth, 0.4F);
    EXPECT_EQ(dreamy.mask.outside, 1U);

    const auto& ray = Ask(helper, "Kyv_Dsp_Vi_LightRay", [](CTestInstance& instance) {
                          instance.Set("P1", uint8_t{31});
                          instance.Set("P2", std::pair{kNan, -0.5F});
                      }).settings.lightRay;
    EXPECT_EQ(helper.log->cudart.frame.effect, GpuEffect_LightRay);
    EXPECT_EQ(ray.degree, 30U);
    EXPECT_EQ(ray.x, 0.0F);
    EXPECT_EQ(ray.y, -0.5F);

    const auto sketch = [&](uint32_t random, uint32_t seed, int64_t position) {
        const GpuRenderCall& call = Ask(helper, "Dsp_Vi_PencilSketch2", [&](CTestInstance& i) {
            i.Set("P1", int32_t{-4});
            i.Set("P2", uint8_t{0});
            i.Set("P3", uint8_t{255});
            i.Set("P8", random);
            i.Context().randomSeed = seed;
            i.Context().position = position;
        });
        return call.settings.pencil;
    };
    EXPECT_EQ(sketch(0, 1, 2).strokeSize, 1U);
    EXPECT_EQ(helper.log->cudart.frame.effect, GpuEffect_PencilSketch);
    EXPECT_EQ(sketch(0, 1, 2).edgeThreshold, 1U);
    EXPECT_EQ(sketch(0, 1, 2).edgeIntensity, 100U);
    // The texture stands still, or follows seed and position and nothing else.
    EXPECT_EQ(sketch(0, 1, 2).texture, 0U);
    EXPECT_EQ(sketch(1, 1, 2).texture, sketch(1, 1, 2).texture);
    EXPECT_NE(sketch(1, 1, 2).texture, sketch(1, 1, 3).texture);
    EXPECT_NE(sketch(1, 1, 2).texture, sketch(1, 2, 2).texture);
    EXPECT_NE(sketch(1, 1, 2).texture, 0U);
}

} // namespace
