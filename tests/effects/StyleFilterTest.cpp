// What the style filters promise, through the callbacks.
#include <algorithm>
#include <array>
#include <cstdlib>
#include <functional>
#include <limits>
#include <map>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "imageutility/ImageUtility.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;

struct Rect {
    float left, top, right, bottom;
};
constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
constexpr float kInf = std::numeric_limits<float>::infinity();

// A picture with edges, a bright disc and a gradient.
Frame Scene(uint32_t width, uint32_t height) {
    Frame frame(size_t{width} * height);
    for (uint32_t y = 0; y < height; ++y) {
        for (uint32_t x = 0; x < width; ++x) {
            const int dx = static_cast<int>(3 * x) - static_cast<int>(width);
            const int dy = static_cast<int>(3 * y) - static_cast<int>(height);
            const uint32_t base = 20 + x * 60 / width + (y * 4 / height % 2) * 70;
            const uint32_t pixel = dx * dx + dy * dy < static_cast<int>(height * height) / 4
                                       ? 0xFFF0E0
                                       : base << 16 | (base + 30) << 8 | base / 2;
            frame[size_t{y} * width + x] = pixel | (x * 7 + y) << 24;
        }
    }
    return frame;
}

using Prepare = std::function<void(CTestInstance&)>;

Frame Render(const char* effect, const Frame& input, uint32_t width, const Prepare& prepare = {}) {
    CTestInstance instance(Effect(effect), width, static_cast<uint32_t>(input.size()) / width);
    instance.Context().cpuLevel = 5;
    if (prepare) {
        prepare(instance);
    }
    Frame result(input.size(), 0x5A5A5A5A);
    EXPECT_EQ(instance.Begin(), KYV_OK);
    EXPECT_EQ(instance.Render(result.data(), input.data()), KYV_OK);
    return result;
}

class StyleFilter : public testing::TestWithParam<const char*> {
protected:
    Frame On(const Frame& input, uint32_t width, const Prepare& prepare = {}) const {
        return Render(GetParam(), input, width, prepare);
    }
};

INSTANTIATE_TEST_SUITE_P(All, StyleFilter,
                         testing::Values("Kyv_Dsp_Vi_Dreamy", "Kyv_Dsp_Vi_LightRay",
                                         "Dsp_Vi_PencilSketch2"),
                         [](const auto& entry) {
                             const std::string name = entry.param;
                             return name.substr(name.rfind('_') + 1);
                         });

// What the other tests compare with is made by the same build; this is what holds every build, on
// either target, to the same bytes. A change that is meant to show needs new numbers here.
TEST_P(StyleFilter, BytesAreTheSameInEveryBuild) {
    const std::map<std::string, uint64_t> expected = {
        {"Kyv_Dsp_Vi_Dreamy", 0x61B8A39198D3563F},
        {"Kyv_Dsp_Vi_LightRay", 0x1F6466D5FD76A047},
        {"Dsp_Vi_PencilSketch2", 0xCE6F71D14EC68B07},
    };
    uint64_t hash = 0xCBF29CE484222325; // FNV-1a
    for (const uint32_t width : {240U, 720U}) {
        for (const uint32_t pixel : On(Scene(width, 160), width)) {
            hash = (hash ^ pixel) * 0x100000001B3;
        }
    }
    EXPECT_EQ(hash, expected.at(GetParam())) << std::hex << "0x" << hash;
}

TEST_P(StyleFilter, FieldsMakeUpTheFrameAndLeaveTheOtherRowsAlone) {
    constexpr uint32_t kWidth = 60, kHeight = 41;
    const Frame input = Scene(kWidth, kHeight);
    for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
        const auto whole = [&](uint32_t field) {
            return On(input, kWidth, [&](CTestInstance& instance) {
                instance.Context().pixelFormat = format;
                instance.Context().fieldSelector = field;
            });
        };
        const Frame frame = whole(0), first = whole(1), second = whole(2);
        for (size_t i = 0; i < frame.size(); ++i) {
            const bool even = i / kWidth % 2 == 0;
            ASSERT_EQ(first[i], even ? frame[i] : 0x5A5A5A5A) << i;
            ASSERT_EQ(second[i], even ? 0x5A5A5A5A : frame[i]) << i;
        }
    }
}

TEST_P(StyleFilter, AyuvFramesGiveTheSamePictureAndAlphaIsTheSources) {
    using namespace KYVImageUtility;
    constexpr int32_t kWidth = 50, kHeight = 30;
    Frame argb = Scene(kWidth, kHeight);
    Frame ayuv(argb.size());
    CImageARGB a(reinterpret_cast<uint8_t*>(argb.data()), kWidth, kHeight, kWidth * 4);
    CImageAYUV v(reinterpret_cast<uint8_t*>(ayuv.data()), kWidth, kHeight, kWidth * 4);
    a.ToAYUV(v);
    v.ToARGB(a); // what the filter gets to see
    Frame expected = On(argb, kWidth);
    for (size_t i = 0; i < argb.size(); ++i) {
        ASSERT_EQ(expected[i] >> 24, argb[i] >> 24) << i;
    }
    Frame converted(expected.size());
    CImageARGB expectedView(reinterpret_cast<uint8_t*>(expected.data()), kWidth, kHeight,
                            kWidth * 4);
    CImageAYUV convertedView(reinterpret_cast<uint8_t*>(converted.data()), kWidth, kHeight,
                             kWidth * 4);
    expectedView.ToAYUV(convertedView);
    const auto asAyuv = [](CTestInstance& instance) {
        instance.Context().pixelFormat = PixelFormat_Ayuv;
    };
    EXPECT_EQ(On(ayuv, kWidth, asAyuv), converted);
}

// The mask is one piece of code for both.
struct Masked {
    const char* effect;
    const char* rect;
    const char* shape;
    const char* depth;
    const char* inverse;
};

class StyleMask : public testing::TestWithParam<Masked> {
protected:
    Frame Mask(const Rect& rect, int32_t shape, float depth, uint32_t inverse) const {
        return Render(GetParam().effect, m_input, kWidth, [&](CTestInstance& instance) {
            instance.Set(GetParam().rect, rect);
            instance.Set(GetParam().shape, shape);
            instance.Set(GetParam().depth, depth);
            instance.Set(GetParam().inverse, inverse);
        });
    }

    static constexpr uint32_t kWidth = 80, kHeight = 60;
    Frame m_input = Scene(kWidth, kHeight);
    Frame m_whole = Render(GetParam().effect, m_input, kWidth);
};

INSTANTIATE_TEST_SUITE_P(All, StyleMask,
                         testing::Values(Masked{"Kyv_Dsp_Vi_Dreamy", "P2", "P3", "P4", "P5"},
                                         Masked{"Dsp_Vi_PencilSketch2", "P4", "P5", "P6", "P7"}),
                         [](const auto& entry) {
                             return std::string(entry.param.effect).substr(8, 6);
                         });

TEST_P(StyleMask, SharpBoxTreatsItsPixelsAndTheInverseAllOthers) {
    // 0.25 and 0.75 of 80 are 20 and 60, 0.5 and 1 of 60 are 30 and 60.
    const Frame box = Mask({0.25F, 0.5F, 0.75F, 1.0F}, 0, 0.0F, 0);
    const Frame inverse = Mask({0.25F, 0.5F, 0.75F, 1.0F}, 0, 0.0F, 1);
    for (uint32_t y = 0; y < kHeight; ++y) {
        for (uint32_t x = 0; x < kWidth; ++x) {
            const size_t i = size_t{y} * kWidth + x;
            const bool inside = x >= 20 && x < 60 && y >= 30;
            ASSERT_EQ(box[i], (inside ? m_whole : m_input)[i]) << x << ", " << y;
            ASSERT_EQ(inverse[i], (inside ? m_input : m_whole)[i]) << x << ", " << y;
        }
    }
    EXPECT_EQ(Mask({0.75F, 1.0F, 0.25F, 0.5F}, 0, 0.0F, 0), box) << "inverted";
    EXPECT_EQ(Mask({0.25F, 0.5F, 0.75F, 9.0F}, 7, -1.0F, 0), box) << "beyond the frame";
}

TEST_P(StyleMask, WholeFrameAndNothing) {
    EXPECT_EQ(Mask({0, 0, 0, 0}, 1, 0.4F, 0), m_whole);
    EXPECT_EQ(Mask({kNan, kNan, kNan, kNan}, 1, kNan, 0), m_whole);
    EXPECT_EQ(Mask({0, 0, 0, 0}, 0, 0.1F, 1), m_input);
    EXPECT_EQ(Mask({2, 2, 3, 3}, 0, 0, 0), m_input);
    EXPECT_EQ(Mask({2, 2, 3, 3}, 1, 0, 1), m_whole);
    EXPECT_EQ(Mask({0.5F, 0.5F, 0.5F, 0.9F}, 0, 0, 0), m_input) << "empty";
    EXPECT_EQ(Mask({-kInf, -kInf, kInf, kInf}, 0, kInf, 0), m_whole);
}

TEST_P(StyleMask, EllipseLeavesTheCornersAndTheRimIsSoft) {
    const Frame ellipse = Mask({0.0F, 0.0F, 1.0F, 1.0F}, 1, 0.0F, 0);
    const auto at = [&](uint32_t x, uint32_t y) { return size_t{y} * kWidth + x; };
    for (const auto& [x, y] : {std::pair{0U, 0U}, {79U, 0U}, {0U, 59U}, {79U, 59U}, {8U, 6U}}) {
        EXPECT_EQ(ellipse[at(x, y)], m_input[at(x, y)]);
    }
    for (const auto& [x, y] : {std::pair{40U, 30U}, {40U, 1U}, {1U, 30U}, {78U, 30U}, {15U, 12U}}) {
        EXPECT_EQ(ellipse[at(x, y)], m_whole[at(x, y)]);
    }
    // Between the source at the border and the effect in the middle lies neither's step: along the
    // rim the result's distance from the source never falls.
    const Frame soft = Mask({0.0F, 0.0F, 1.0F, 1.0F}, 0, 0.4F, 0);
    int between = 0;
    for (uint32_t x = 0; x < kWidth; ++x) {
        for (int c = 0; c < 24; c += 8) {
            const int s = m_input[at(x, 30)] >> c & 255, e = m_whole[at(x, 30)] >> c & 255,
                      r = soft[at(x, 30)] >> c & 255;
            EXPECT_GE(r, std::min(s, e));
            EXPECT_LE(r, std::max(s, e));
            between += r != s && r != e;
        }
    }
    EXPECT_GT(between, 10);
    EXPECT_EQ(soft[at(40, 30)], m_whole[at(40, 30)]);
}

TEST(Dreamy, FlatAreasKeepTheirPlaceAndLightsBloomIntoTheirSurroundings) {
    constexpr uint32_t kSize = 120;
    Frame input(kSize * kSize, 0xFF000000);
    EXPECT_EQ(Render("Kyv_Dsp_Vi_Dreamy", input, kSize), input) << "black stays";
    const Frame white(input.size(), 0xFFFFFFFF);
    EXPECT_EQ(Render("Kyv_Dsp_Vi_Dreamy", white, kSize), white) << "white stays";

    for (uint32_t y = 50; y < 70; ++y) {
        std::fill_n(&input[y * kSize + 50], 20, 0xFFFFFFFF);
    }
    const auto green = [&](uint8_t degree, uint32_t x) {
        return Render(
                   "Kyv_Dsp_Vi_Dreamy", input, kSize,
                   [&](CTestInstance& instance) { instance.Set("P1", degree); })[60 * kSize + x] >>
                   8 &
               255;
    };
    // The bloom falls off with the distance and grows with the degree; the light does not dim.
    EXPECT_GT(green(40, 72), green(40, 76));
    EXPECT_GT(green(40, 76), green(40, 80));
    EXPECT_GT(green(40, 76), green(5, 76));
    EXPECT_EQ(green(5, 110), 0U);
    EXPECT_GE(green(40, 60), 250U);
    EXPECT_EQ(green(0, 72), green(1, 72)) << "degrees are kept within 1 to 40";
    EXPECT_EQ(green(255, 72), green(40, 72));
}

TEST(LightRay, StreamsAwayFromItsPlaceAndOnlyBrightens) {
    constexpr uint32_t kWidth = 160, kHeight = 90;
    Frame input(size_t{kWidth} * kHeight, 0xFF202020);
    for (uint32_t y = 40; y < 50; ++y) {
        std::fill_n(&input[size_t{y} * kWidth + 75], 10, 0xFFFFFFFF);
    }
    const auto render = [&](uint8_t degree, float x, float y) {
        return Render("Kyv_Dsp_Vi_LightRay", input, kWidth, [&](CTestInstance& instance) {
            instance.Set("P1", degree);
            instance.Set("P2", std::pair{x, y});
        });
    };
    EXPECT_EQ(render(0, 0.1F, 0.1F), input) << "degree 0 changes nothing";
    EXPECT_EQ(render(200, -9.0F, 3.0F), render(30, -9.0F, 3.0F));
    EXPECT_EQ(render(30, kNan, kNan), render(30, 0.0F, 0.0F));
    EXPECT_EQ(render(30, kInf, -kInf), render(30, 16.0F, -16.0F));

    // From the right the block's light falls to the left, from the left to the right. Over all of
    // its rows, since dark gaps lie between the shafts.
    const auto gain = [&](const Frame& frame, uint32_t x) {
        int sum = 0;
        for (uint32_t row = 36; row < 54; ++row) {
            sum += static_cast<int>(frame[size_t{row} * kWidth + x] & 255) - 0x20;
        }
        return sum;
    };
    const Frame fromRight = render(30, 1.0F, 0.5F);
    EXPECT_GT(gain(fromRight, 64), 180);
    EXPECT_GT(gain(fromRight, 64), gain(fromRight, 8));
    EXPECT_GT(gain(fromRight, 8), 0);
    EXPECT_EQ(gain(fromRight, 104), 0);
    EXPECT_GT(gain(render(5, 1.0F, 0.5F), 71), 0);
    EXPECT_LT(gain(render(5, 1.0F, 0.5F), 64), gain(fromRight, 64));
    const Frame fromLeft = render(30, -0.2F, 0.5F);
    EXPECT_GT(gain(fromLeft, 104), 50);
    EXPECT_EQ(gain(fromLeft, 49), 0);
    for (size_t i = 0; i < input.size(); ++i) {
        for (int c = 0; c < 24; c += 8) {
            ASSERT_GE(fromRight[i] >> c & 255, input[i] >> c & 255) << i;
        }
    }
}

TEST(LightRay, ShaftsComeFromWhatIsBrightInItsPictureAndSpareDarkForegrounds) {
    constexpr uint32_t kWidth = 160, kHeight = 90;
    // A sky over a black bar at x = 100 and a ground, from the top: once bright, once dull.
    const auto gains = [&](uint32_t sky, uint32_t ground) {
        Frame input(size_t{kWidth} * kHeight, 0xFF000000 | ground * 0x10101);
        std::fill_n(input.begin(), kWidth * 30, 0xFF000000 | sky * 0x10101);
        for (uint32_t y = 30; y < kHeight; ++y) {
            std::fill_n(&input[size_t{y} * kWidth + 60], 40, 0xFF000000);
        }
        const Frame lit = Render("Kyv_Dsp_Vi_LightRay", input, kWidth, [&](CTestInstance& light) {
            light.Set("P1", uint8_t{30});
            light.Set("P2", std::pair{0.5F, -0.5F});
        });
        std::array<uint32_t, 2> sums = {}; // on the ground left of the bar, and on the bar
        for (uint32_t y = 30; y < 60; ++y) {
            for (uint32_t x = 30; x < 100; ++x) {
                const size_t i = size_t{y} * kWidth + x;
                sums[x >= 60] += (lit[i] & 255) - (input[i] & 255);
            }
        }
        return std::array{sums[0] / (30 * 30), sums[1] / (30 * 40)};
    };
    const auto [bright, onBar] = gains(230, 90);
    EXPECT_GT(bright, 10U);
    EXPECT_LT(onBar, bright / 2);
    EXPECT_GT(gains(110, 50)[0], 10U) << "a dull sky is the light of a dull picture";
    EXPECT_EQ(gains(40, 20)[0], 0U) << "the dark sends out none";
}

TEST(Dreamy, DeepShadowsHoldBesideALight) {
    constexpr uint32_t kSize = 120;
    Frame input(kSize * kSize, 0xFF101010);
    for (uint32_t y = 0; y < kSize; ++y) {
        std::fill_n(&input[y * kSize + 60], 60, 0xFFFFE0C0);
    }
    for (const uint8_t degree : {5, 20, 40}) {
        const Frame glow = Render("Kyv_Dsp_Vi_Dreamy", input, kSize,
                                  [&](CTestInstance& instance) { instance.Set("P1", degree); });
        // Black does not rise far from the light and little beside it, and the light keeps its own
        // strength and colour.
        EXPECT_LE(glow[60 * kSize + 4] & 255, 0x10U);
        EXPECT_LE(glow[60 * kSize + 57] & 255, 0x10U + 80);
        const uint32_t light = glow[60 * kSize + 110];
        EXPECT_GE(light >> 16 & 255, 250U);
        EXPECT_NEAR(light & 255, 0xC0, 24);
    }
}

TEST(PencilSketch, DrawsContoursAndDarkerToneOnPaper) {
    constexpr uint32_t kWidth = 200, kHeight = 120;
    const auto render = [&](const Frame& input, const Prepare& prepare = {}) {
        return Render("Dsp_Vi_PencilSketch2", input, kWidth, prepare);
    };
    const auto mean = [&](const Frame& frame, uint32_t left, uint32_t right) {
        uint32_t sum = 0;
        for (uint32_t y = 0; y < kHeight; ++y) {
            for (uint32_t x = left; x < right; ++x) {
                sum += frame[size_t{y} * kWidth + x] >> 8 & 255;
            }
        }
        return sum / kHeight / (right - left);
    };
    // White stays paper but for its tooth; the darker the tone, the darker the drawing.
    uint32_t last = 256;
    for (const uint32_t gray : {255U, 190U, 130U, 70U, 0U}) {
        const uint32_t tone =
            mean(render(Frame(size_t{kWidth} * kHeight, gray * 0x10101)), 0, kWidth);
        EXPECT_LT(tone, last) << gray;
        last = tone;
    }
    EXPECT_GE(mean(render(Frame(size_t{kWidth} * kHeight, 0xFFFFFF)), 0, kWidth), 232U);
    EXPECT_LE(last, 110U);

    // A step between two bright greys: a line on its darker side, which a higher threshold or a
    // lower intensity takes away or pales.
    Frame step(size_t{kWidth} * kHeight, 0xFFFFFF);
    for (size_t i = 0; i < step.size(); ++i) {
        step[i] = i % kWidth < 100 ? 0xFFFFFF : 0xC8C8C8;
    }
    const auto line = [&](uint8_t threshold, uint8_t intensity) {
        const Frame drawn = render(step, [&](CTestInstance& instance) {
            instance.Set("P2", threshold);
            instance.Set("P3", intensity);
        });
        return static_cast<int>(mean(drawn, 110, 190)) - static_cast<int>(mean(drawn, 100, 102));
    };
    EXPECT_GT(line(10, 100), 40);
    EXPECT_GT(line(10, 100), line(10, 20) + 10);
    EXPECT_GT(line(10, 100), line(230, 100) + 10);
}

TEST(PencilSketch, RandomStrokesFollowSeedAndPositionAlone) {
    const Frame input = Scene(120, 80);
    const auto at = [&](uint32_t random, uint32_t seed, int64_t position) {
        return Render("Dsp_Vi_PencilSketch2", input, 120, [&](CTestInstance& instance) {
            instance.Set("P8", random);
            instance.Context().randomSeed = seed;
            instance.Context().position = position;
        });
    };
    EXPECT_EQ(at(0, 1, 0), at(0, 2, 400000)) << "the texture stands still";
    EXPECT_NE(at(1, 1, 0), at(0, 1, 0));
    EXPECT_NE(at(1, 1, 0), at(1, 1, 400000));
    EXPECT_NE(at(1, 1, 0), at(1, 2, 0));
    EXPECT_EQ(at(1, 1, 400000), at(1, 1, 400000));

    // The seed counts as it was when the instance was prepared.
    CTestInstance instance(Effect("Dsp_Vi_PencilSketch2"), 120, 80);
    instance.Set("P8", 1U);
    instance.Context().randomSeed = 1;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    instance.Context().randomSeed = 2;
    Frame output(input.size());
    for (const int64_t position : {900000, 0, 400000}) { // a seek repeats what playing showed
        instance.Context().position = position;
        ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
        EXPECT_EQ(output, at(1, 1, position));
    }
}

} // namespace
