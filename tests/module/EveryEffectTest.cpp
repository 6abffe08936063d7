// What every effect of the module promises, whatever it draws.
#include <algorithm>
#include <cstring>
#include <limits>
#include <random>
#include <string>

#include <gtest/gtest.h>

#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;

constexpr uint32_t kUntouched = 0x5A5A5A5A;
constexpr int64_t kSecond = 10'000'000; // in the host's units

// A picture with edges, tones of all brightness and an alpha of its own.
Frame Scene(uint32_t width, uint32_t height, uint32_t seed) {
    Frame frame = RandomFrame(size_t{width} * height, seed);
    for (uint32_t y = 0; y < height; ++y) {
        for (uint32_t x = 0; x < width; ++x) {
            const uint32_t tone = (x * 255 / width + (y / 5 + x / 7) % 2 * 60 + seed * 40) % 256;
            uint32_t& pixel = frame[size_t{y} * width + x];
            pixel = (pixel & 0xFF0F070F) ^ (tone << 16 | (255 - tone) << 8 | tone / 2);
        }
    }
    return frame;
}

class EveryEffect : public testing::TestWithParam<uint32_t> {
protected:
    const EffectDescriptor& effect() const { return Module().effects[GetParam()]; }

    // Half way from the default to the maximum, and a colour that is no default: settings under
    // which no effect leaves the picture as it is.
    void SetAll(CTestInstance& instance) const {
        for (uint32_t i = 0; i < effect().paramCount; ++i) {
            const ParamDescriptor& param = effect().params[i];
            const auto half = [&]<class T>(T value, T maximum) {
                std::memcpy(&value, param.defaultValue, sizeof value);
                std::memcpy(&maximum, param.maximum, sizeof maximum);
                value = static_cast<T>(value + (maximum - value) / 2);
                std::memcpy(instance.Value(i), &value, sizeof value);
            };
            if (param.type == ParamType_Color) {
                const uint32_t orange = 0x2070E0;
                std::memcpy(instance.Value(i), &orange, sizeof orange);
            } else if (param.type == ParamType_Float) {
                half(0.0F, 0.0F);
            } else if (param.type == ParamType_Byte) {
                half(uint8_t{0}, uint8_t{0});
            } else if (param.type == ParamType_Int) {
                half(0, 0);
            }
        }
        instance.Context().position = 9 * kSecond;
        instance.Context().duration = 20 * kSecond;
    }

    // The output of a call, and of guards behind it, over frames that hold two views at most.
    Frame Render(CTestInstance& instance, const Frame& first, const Frame& second) const {
        Frame output(first.size() + 64, kUntouched);
        EXPECT_EQ(instance.Render(output.data(), first.data(), second.data()), KYV_OK);
        EXPECT_TRUE(std::all_of(output.end() - 64, output.end(),
                                [](uint32_t pixel) { return pixel == kUntouched; }));
        output.resize(first.size());
        return output;
    }
};

INSTANTIATE_TEST_SUITE_P(All, EveryEffect, testing::Range(0U, Module().effectCount),
                         [](const auto& entry) {
                             return std::string(Module().effects[entry.param].identifier);
                         });

TEST_P(EveryEffect, LevelsAndThreadsAgreeAtEverySizeFormatAndField) {
    for (const auto& [width, height] :
         {std::pair{1U, 1U}, {1U, 9U}, {9U, 1U}, {3U, 70U}, {67U, 41U}, {163U, 90U}}) {
        const Frame first = Scene(width, height, 1), second = Scene(width, height, 2);
        for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
            // In one instance, whose pictures take a while to prepare.
            CTestInstance instance(effect(), width, height);
            EffectContext& context = instance.Context();
            context.pixelFormat = format;
            ASSERT_EQ(instance.Begin(), KYV_OK);
            SetAll(instance);
            for (const uint32_t field : {FieldSelector_Frame, FieldSelector_Second}) {
                context.fieldSelector = field;
                context.cpuLevel = 0;
                context.threadCount = 1;
                const Frame scalar = Render(instance, first, second);
                if (width > 60 && field == FieldSelector_Frame) {
                    EXPECT_NE(scalar, first) << "the settings show nothing";
                }
                for (const auto& [level, threads] :
                     {std::pair{3, 1U}, {4, 1U}, {5, 1U}, {5, 0U}, {5, 2U}, {0, 3U}, {5, 7U}}) {
                    context.cpuLevel = level;
                    context.threadCount = threads;
                    ASSERT_EQ(Render(instance, first, second), scalar)
                        << width << " x " << height << " format " << format << " field " << field
                        << " level " << level << " threads " << threads;
                }
            }
        }
    }
}

TEST_P(EveryEffect, ViewsSideBySideAreTreatedEachAsIfAlone) {
    constexpr uint32_t kWidth = 96, kHeight = 64;
    const Frame views[2] = {Scene(kWidth, kHeight, 1), Scene(kWidth, kHeight, 2)};
    for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
        const auto render = [&](uint32_t layout, const Frame& first, const Frame& second) {
            CTestInstance instance(effect(), kWidth, kHeight);
            instance.Context().pixelFormat = format;
            instance.Context().stereoLayout = layout;
            instance.Context().cpuLevel = 5;
            EXPECT_EQ(instance.Begin(), KYV_OK);
            SetAll(instance);
            return Render(instance, first, second);
        };
        const Frame alone = render(StereoLayout_Mono, views[0], views[1]);
        for (const uint32_t layout : {StereoLayout_LeftHalf, StereoLayout_RightHalf}) {
            // The view among noise.
            const size_t shift = layout == StereoLayout_RightHalf ? kWidth : 0;
            Frame wide[2] = {RandomFrame(2 * alone.size(), 3), RandomFrame(2 * alone.size(), 4)};
            Frame expected(2 * alone.size(), kUntouched);
            for (size_t y = 0; y < kHeight; ++y) {
                const size_t at = 2 * kWidth * y + shift;
                std::copy_n(&views[0][kWidth * y], kWidth, &wide[0][at]);
                std::copy_n(&views[1][kWidth * y], kWidth, &wide[1][at]);
                std::copy_n(&alone[kWidth * y], kWidth, &expected[at]);
            }
            EXPECT_EQ(render(layout, wide[0], wide[1]), expected)
                << "format " << format << " layout " << layout;
        }
    }
}

TEST_P(EveryEffect, WorksOnItsInputsFramesAndForgetsTheFramesBefore) {
    constexpr uint32_t kWidth = 80, kHeight = 48;
    const Frame frames[2] = {Scene(kWidth, kHeight, 1), Scene(kWidth, kHeight, 2)};
    const Frame others[2] = {Scene(kWidth, kHeight, 3), Scene(kWidth, kHeight, 4)};
    for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
        CTestInstance instance(effect(), kWidth, kHeight);
        EffectContext& context = instance.Context();
        context.pixelFormat = format;
        context.cpuLevel = 5;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        SetAll(instance);
        const Frame apart = Render(instance, frames[0], frames[1]);
        for (uint32_t i = 0; i < effect().properties.inputCount; ++i) {
            Frame inPlace[2] = {frames[0], frames[1]};
            ASSERT_EQ(instance.Render(inPlace[i].data(), inPlace[0].data(), inPlace[1].data()),
                      KYV_OK);
            EXPECT_EQ(inPlace[i], apart) << "on input " << i << " format " << format;
        }
        // Other pictures, another moment and another size.
        context.position = 4 * kSecond;
        Render(instance, others[0], others[1]);
        context.width = 17;
        context.height = 9;
        Render(instance, others[1], others[0]);
        context.width = kWidth;
        context.height = kHeight;
        context.position = 9 * kSecond;
        EXPECT_EQ(Render(instance, frames[0], frames[1]), apart) << "format " << format;
    }
}

// Whatever bits a host stores: nothing crashes or hangs, and nothing is written outside the frame.
TEST_P(EveryEffect, HostileValuesAreBounded) {
    constexpr float kInf = std::numeric_limits<float>::infinity();
    constexpr float kValues[] = {
        std::numeric_limits<float>::quiet_NaN(), kInf, -kInf, 1e30F, -1e30F, 2.0F, -0.5F, 0.3F,
        std::numeric_limits<float>::denorm_min()};
    constexpr int64_t kTimes[] = {INT64_MIN,     -1, 0, 1, 9999, INT64_MAX, INT64_MAX / 3,
                                  3600 * kSecond};
    constexpr std::pair<uint32_t, uint32_t> kSizes[] = {{1, 1}, {1, 40},  {40, 1},
                                                        {2, 2}, {3, 500}, {37, 23}};
    std::mt19937 random(11 + GetParam());
    for (int round = 0; round < 16; ++round) {
        const auto& [width, height] = kSizes[random() % std::size(kSizes)];
        const Frame first = RandomFrame(size_t{2} * width * height, random());
        const Frame second = RandomFrame(first.size(), random());
        CTestInstance instance(effect(), width, height);
        EffectContext& context = instance.Context();
        context.pixelFormat = random() % 2;
        context.cpuLevel = static_cast<int32_t>(random() % 6);
        ASSERT_EQ(instance.Begin(), KYV_OK);
        for (int frame = 0; frame < 4; ++frame) {
            for (uint8_t& byte : instance.Params()) {
                byte = static_cast<uint8_t>(random() >> random() % 25);
            }
            for (uint32_t i = 0; i < effect().paramCount; ++i) {
                const size_t size = effect().params[i].valueSize;
                for (size_t at = 0; at + 4 <= size && random() % 3; at += 4) {
                    std::memcpy(instance.Value(i) + at, &kValues[random() % std::size(kValues)], 4);
                }
            }
            context.position = kTimes[random() % std::size(kTimes)];
            context.duration = random() % 2 ? 0 : kTimes[random() % std::size(kTimes)];
            context.stereoLayout = random() % 4;
            context.fieldSelector = random() % 4;
            context.threadCount = random() % 4;
            context.preview = random() % 4 == 0;
            context.previewFraction = kValues[random() % std::size(kValues)];
            context.displayAspectX = random() % 2 ? 0 : random() >> random() % 32;
            context.displayAspectY = random() % 2 ? 0 : random() >> random() % 32;
            Render(instance, first, second);
        }
    }
}

} // namespace
