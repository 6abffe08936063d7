// The particle effects through the callbacks, as a host drives them.
#include <algorithm>
#include <cmath>
#include <filesystem>
#include <map>
#include <memory>
#include <random>

#include <gtest/gtest.h>

#include "effects/particle/ParticleFrame.h"
#include "imageutility/ImageUtility.h"
#include "platform/Library.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;
using KYVImageUtility::CImageARGB;

constexpr const char* kEffects[] = {"Kyv_Dsp_Pfx_Bubble", "Kyv_Dsp_Pfx_RefractiveBubble",
                                    "Kyv_Dsp_Pfx_Fireworks", "Kyv_Dsp_Pfx_WaterRipple"};

constexpr int64_t kMs = 10000; // in the host's units

class ParticleEffects : public testing::TestWithParam<const char*> {
protected:
    const EffectDescriptor& effect() const { return Effect(GetParam()); }
    bool Is(const char* name) const { return std::string(GetParam()).ends_with(name); }
};

INSTANTIATE_TEST_SUITE_P(All, ParticleEffects, testing::ValuesIn(kEffects),
                         [](const auto& entry) { return std::string(entry.param).substr(12); });

// A smooth opaque picture that no effect leaves alone, of either format.
Frame Gradient(int width, int height) {
    Frame frame(static_cast<size_t>(width) * height);
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) {
            const auto r = static_cast<uint32_t>(16 + x * 200 / width);
            const auto g = static_cast<uint32_t>(16 + y * 200 / height);
            frame[static_cast<size_t>(y) * width + x] =
                0xFF000000 | r << 16 | g << 8 | ((x / 8 + y / 8) % 2 ? 60 : 160);
        }
    }
    return frame;
}

class CClip {
public:
    CClip(const EffectDescriptor& effect, int width, int height)
        : input(Gradient(width, height)), instance(effect, width, height) {
        instance.Context().duration = 20000 * kMs;
    }

    Frame At(int64_t positionMs) {
        instance.Context().position = positionMs * kMs;
        Frame output(input.size(), 0x01020304);
        EXPECT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
        return output;
    }

    Frame input;
    CTestInstance instance;
};

TEST_P(ParticleEffects, SeekingGivesTheBytesOfPlayingInBothFormatsAtEveryLevel) {
    constexpr int kWidth = 110;
    constexpr int kHeight = 66;
    for (const uint32_t format : {0U, 1U}) {
        const auto open = [&](int32_t level) {
            auto clip = std::make_unique<CClip>(effect(), kWidth, kHeight);
            clip->instance.Context().pixelFormat = format;
            clip->instance.Context().cpuLevel = level;
            EXPECT_EQ(clip->instance.Begin(), KYV_OK);
            return clip;
        };
        std::map<int64_t, Frame> played;
        const auto player = open(0);
        for (int64_t time = 0; time <= 20040; time += 120) {
            const Frame frame = player->At(time);
            if (time % 1200 == 0 || time > 19800) {
                played[time] = frame;
            }
        }
        EXPECT_NE(played[12000], player->input); // something is to be seen
        EXPECT_NE(played[12000], played[13200]);

        std::vector<int64_t> times;
        for (const auto& [time, frame] : played) {
            times.push_back(time);
        }
        for (const int32_t level : {0, 1, 3, 4, 5}) {
            std::mt19937 random(static_cast<uint32_t>(level));
            std::shuffle(times.begin(), times.end(), random);
            const auto seeker = open(level);
            for (const int64_t time : times) {
                ASSERT_EQ(seeker->At(time), played[time])
                    << "format " << format << " level " << level << " at " << time;
            }
        }
    }
}

TEST_P(ParticleEffects, ChangedParametersSizesAndLengthsStartAnew) {
    CClip clip(effect(), 120, 80);
    ASSERT_EQ(clip.instance.Begin(), KYV_OK);
    const Frame first = clip.At(9000);
    clip.instance.Set("P1", 0.9F);
    const Frame changed = clip.At(9000);
    EXPECT_NE(changed, first);
    clip.instance.Set("P1", Is("Fireworks") || Is("Ripple") ? 0.5F : 0.2F);
    EXPECT_EQ(clip.At(9000), first);
    // A smaller frame for a while, within the same memory; the ripple's sheen is of the first one.
    clip.instance.Context().width = 60;
    clip.instance.Context().height = 40;
    clip.At(9000);
    clip.instance.Context().width = 120;
    clip.instance.Context().height = 80;
    EXPECT_EQ(clip.At(9000), first);
    clip.instance.Context().duration = 9500 * kMs;
    clip.At(9000);
    clip.instance.Context().duration = 20000 * kMs;
    EXPECT_EQ(clip.At(9000), first);
}

TEST_P(ParticleEffects, PastTheEndTheInputIsCopied) {
    const Frame any = RandomFrame(64 * 48, 3); // AYUV that no conversion gives back
    for (const uint32_t format : {0U, 1U}) {
        for (const int64_t time : {20000, 20001, 999999}) {
            CClip clip(effect(), 64, 48);
            clip.input = any;
            clip.instance.Context().pixelFormat = format;
            clip.instance.Context().displayAspectX = 2; // nor a scaling
            clip.instance.Context().displayAspectY = 3;
            ASSERT_EQ(clip.instance.Begin(), KYV_OK);
            EXPECT_EQ(clip.At(time), any) << time;
        }
    }
}

TEST_P(ParticleEffects, ADisplayOfAnotherAspectStretchesTheParticles) {
    // On a display twice as wide as the frame's pixels say, the canvas is 160 x 60: what is drawn
    // is that of a frame of this size, squeezed to 80.
    CClip narrow(effect(), 80, 60);
    narrow.instance.Context().displayAspectX = 160;
    narrow.instance.Context().displayAspectY = 60;
    narrow.instance.Context().cpuLevel = 5;
    ASSERT_EQ(narrow.instance.Begin(), KYV_OK);
    const Frame output = narrow.At(9000);

    const auto wrap = [](Frame& frame, int width) {
        return CImageARGB(reinterpret_cast<uint8_t*>(frame.data()), width, 60, width * 4);
    };
    CClip wide(effect(), 160, 60);
    wide.instance.Context().cpuLevel = 5;
    ASSERT_EQ(wide.instance.Begin(), KYV_OK);
    CImageARGB stretched = wrap(wide.input, 160);
    wrap(narrow.input, 80).Resize(stretched, 0);
    Frame canvas = wide.At(9000);
    Frame expected(80 * 60);
    CImageARGB squeezed = wrap(expected, 80);
    wrap(canvas, 160).Resize(squeezed, 0);
    if (Is("_Bubble")) {
        // The miniature shows the frame as it came, not stretched and back: compare the places.
        size_t different = 0;
        for (size_t i = 0; i < output.size(); ++i) {
            different += output[i] != expected[i] ? 1 : 0;
        }
        EXPECT_LT(different, output.size() / 4);
    } else {
        EXPECT_EQ(output, expected);
    }
}

TEST(ParticleCanvas, TakesTheDisplaysAspectFromFramesOfAnyShape) {
    using kyv::CanvasRule;
    struct Case {
        uint32_t width, height, displayX, displayY;
        CanvasRule rule;
        int32_t canvasWidth, canvasHeight;
    };
    constexpr auto kShorter = CanvasRule::KeepShorterSide;
    constexpr auto kHeight = CanvasRule::KeepHeight;
    for (const Case& c : {
             Case{720, 576, 16, 9, kShorter, 1024, 576}, Case{576, 720, 9, 16, kShorter, 576, 1024},
             Case{576, 720, 9, 16, kHeight, 405, 720}, Case{720, 576, 0, 0, kShorter, 720, 576},
             // frames much narrower or lower than their display
             Case{64, 2048, 1, 1, kShorter, 64, 64}, Case{2048, 64, 1, 1, kShorter, 64, 64},
             Case{32, 1080, 16, 9, kHeight, 1920, 1080}, Case{2, 4096, 2, 1, kHeight, 8192, 4096},
             Case{4096, 64, 1, 32, kShorter, 2, 64},
             // no picture could be made: the frame's own size
             Case{4096, 64, 1, 64, kShorter, 4096, 64},
             Case{30, 20, 0xFFFFFFFF, 1, kHeight, 30, 20},
             Case{30, 20, 1, 0xFFFFFFFF, kHeight, 30, 20},
             Case{20, 30, 1, 0xFFFFFFFF, kShorter, 20, 30},
             Case{2, 1 << 20, 1, 128, kHeight, 2, 1 << 20}, // 8192 wide
         }) {
        EffectContext context = {};
        context.width = c.width;
        context.height = c.height;
        context.displayAspectX = c.displayX;
        context.displayAspectY = c.displayY;
        kyv::FrameGeometry geometry;
        ASSERT_TRUE(kyv::GetFrameGeometry(context, geometry));
        const kyv::CanvasSize size = kyv::ChooseCanvasSize(context, geometry, c.rule);
        EXPECT_EQ(std::pair(size.width, size.height), std::pair(c.canvasWidth, c.canvasHeight))
            << c.width << "x" << c.height << " on " << c.displayX << ":" << c.displayY;
    }
}

TEST_P(ParticleEffects, APreviewShowsAMomentOfItsOwnSpan) {
    CClip clip(effect(), 320, 240);
    clip.instance.Context().duration = 0;
    ASSERT_EQ(clip.instance.Begin(), KYV_OK);
    const int64_t moment = Is("Fireworks") ? 2000 + 3500 : Is("Ripple") ? 12000 + 4000 : 17500;
    Frame expected = clip.At(moment);
    clip.instance.Context().preview = 1;
    clip.instance.Context().previewFraction = 0.5F;
    EXPECT_EQ(clip.At(77), expected);
    if (!Is("Fireworks")) {
        return;
    }
    // Whatever the frame, it is drawn on 320 x 240 and scaled.
    CClip large(effect(), 640, 360);
    large.input.assign(large.input.size(), 0xFF000000);
    large.instance.Context().preview = 1;
    large.instance.Context().previewFraction = 0.5F;
    large.instance.Context().duration = 0;
    ASSERT_EQ(large.instance.Begin(), KYV_OK);
    clip.input.assign(clip.input.size(), 0xFF000000);
    expected = clip.At(77);
    Frame scaled(large.input.size());
    CImageARGB target(reinterpret_cast<uint8_t*>(scaled.data()), 640, 360, 640 * 4);
    CImageARGB(reinterpret_cast<uint8_t*>(expected.data()), 320, 240, 320 * 4)
        .Resize(target, KYVImageUtility::ResizeMode_Bilinear);
    EXPECT_EQ(large.At(123), scaled);
}

TEST_P(ParticleEffects, UnpreparedOrWithoutItsPicturesTheFrameStaysAsItIs) {
    CClip clip(effect(), 20, 20);
    EXPECT_EQ(clip.At(0), Frame(400, 0x01020304));
    if (Is("Fireworks")) {
        return; // has no pictures
    }
    // A module without resources.
    ModuleDescriptor module = *effect().module;
    module.ModuleHandle = kyv::OpenLibrary(std::filesystem::path(KYV_STEREO_FILE).native());
    ASSERT_NE(module.ModuleHandle, nullptr);
    EffectDescriptor descriptor = effect();
    descriptor.module = &module;
    clip.instance.Context().descriptor = &descriptor;
    ASSERT_EQ(clip.instance.Begin(), KYV_OK);
    EXPECT_EQ(clip.At(0), Frame(400, 0x01020304));
    clip.instance.Context().descriptor = &effect();
    kyv::CloseLibrary(module.ModuleHandle);
}

// The helper is found by its name once it is loaded.
class StereoDepth : public testing::Test {
protected:
    // The left view's frame at a depth, the right view's, and the one without any depth.
    struct Views {
        Frame left;
        Frame right;
        Frame flat;
    };

    static constexpr int kWidth = 400;
    static constexpr int kHeight = 150;

    static Views Render(const char* identifier, const char* depthKey) {
        const auto render = [&](uint32_t layout, float depth) {
            CTestInstance instance(Effect(identifier), kWidth, kHeight);
            instance.Context().stereoLayout = layout;
            instance.Context().position = 9000 * kMs;
            EXPECT_EQ(instance.Begin(), KYV_OK);
            instance.Set(depthKey, depth);
            const Frame input(2 * kWidth * kHeight, 0xFF404040);
            Frame output(input.size(), 0);
            EXPECT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
            Frame view;
            for (int y = 0; y < kHeight; ++y) {
                const auto row = output.begin() + y * 2 * kWidth + (layout == 2 ? kWidth : 0);
                view.insert(view.end(), row, row + kWidth);
            }
            return view;
        };
        return {render(1, 1.0F), render(2, 1.0F), render(1, 0.0F)};
    }

    // How many rows of the middle of a are those of b moved to the right.
    static bool IsMoved(const Frame& a, const Frame& b, int shift) {
        for (int y = 0; y < kHeight; ++y) {
            for (int x = 40; x < kWidth - 40; ++x) {
                if (a[static_cast<size_t>(y * kWidth + x)] !=
                    b[static_cast<size_t>(y * kWidth + x - shift)]) {
                    return false;
                }
            }
        }
        return true;
    }
};

TEST_F(StereoDepth, WithoutTheHelperBothViewsAreTheSame) {
    for (const auto& [effect, key] :
         {std::pair{"Kyv_Dsp_Pfx_Bubble", "P4"}, {"Kyv_Dsp_Pfx_Fireworks", "P3"}}) {
        const Views views = Render(effect, key);
        EXPECT_EQ(views.left, views.right);
        EXPECT_EQ(views.left, views.flat);
    }
}

TEST_F(StereoDepth, WithTheHelperTheViewsMoveApart) {
    const kyv::LibraryHandle helper =
        kyv::OpenLibrary(std::filesystem::path(KYV_STEREO_FILE).native());
    ASSERT_NE(helper, nullptr);
    // Depth 1 moves each view by 1 % of its 400 pixels.
    for (const auto& [effect, key] :
         {std::pair{"Kyv_Dsp_Pfx_Bubble", "P4"}, {"Kyv_Dsp_Pfx_Fireworks", "P3"}}) {
        const Views views = Render(effect, key);
        EXPECT_TRUE(IsMoved(views.left, views.flat, -4)) << effect;
        EXPECT_TRUE(IsMoved(views.right, views.flat, 4)) << effect;
    }
    const Views lenses = Render("Kyv_Dsp_Pfx_RefractiveBubble", "P4");
    EXPECT_NE(lenses.left, lenses.right);
    kyv::CloseLibrary(helper);
}

} // namespace
