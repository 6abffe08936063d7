// White balance through the callbacks.
#include <algorithm>
#include <cmath>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "imageutility/ImageUtility.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;
using testing::ElementsAre;

const EffectDescriptor& Balance() {
    return Effect("Kyv_Dsp_Co_WhiteBalance");
}

// Renders one row of pixels with a reference colour (red in the lowest byte).
Frame Render(const Frame& input, uint32_t reference, uint32_t compare = 0, int32_t level = 0) {
    CTestInstance instance(Balance(), static_cast<uint32_t>(input.size()), 1);
    instance.Context().cpuLevel = level;
    EXPECT_EQ(instance.Begin(), KYV_OK);
    instance.Set("P1", reference);
    instance.Set("P2", compare);
    Frame output(input.size());
    EXPECT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    return output;
}

Frame GreyRamp() {
    Frame ramp(256);
    for (uint32_t i = 0; i < 256; ++i) {
        ramp[i] = i << 24 | i * 0x010101;
    }
    return ramp;
}

TEST(WhiteBalance, CurvesOfAnOrangeReference) {
    // Red 255, green 128, blue 0: luma floor(76.5 + 0.5 + 75.52) = 152.
    const Frame ramp = GreyRamp();
    const Frame output = Render(ramp, 0x0080FF);
    for (uint32_t i = 0; i < 256; ++i) {
        const uint32_t red = i * 152 / 255;
        const uint32_t green = i < 128 ? i * 152 / 128 : (255 * 24 + i * 103) / 127;
        const uint32_t blue = (255 * 152 + i * 103) / 255;
        EXPECT_EQ(output[i], i << 24 | red << 16 | green << 8 | blue) << "at " << i;
    }
    // The reference itself turns grey, and the ends of the rising curves are fixed.
    EXPECT_THAT(Render({0x11FF8000}, 0x0080FF), ElementsAre(0x11989898));
}

TEST(WhiteBalance, WhiteAndBlackReferencesChangeNothing) {
    const Frame input = RandomFrame(300, 1);
    EXPECT_EQ(Render(input, 0xFFFFFF), input);
    EXPECT_EQ(Render(input, 0x000000), input);
    // A value above the luma, from 10 to 3, caps nothing; a value below it lifts black.
    EXPECT_THAT(Render({0xFF00000A, 0xFF000000}, 0x0A0000), ElementsAre(0xFF010101, 0xFF010100));
}

TEST(WhiteBalance, WhiteAndBlackReferencesChangeNoAyuvFrameEither) {
    const Frame input = RandomFrame(2 * 5 * 3, 4);
    for (const uint32_t reference : {0xFFFFFFU, 0x000000U}) {
        for (const uint32_t layout : {0U, 1U, 2U}) {
            for (const uint32_t field : {0U, 1U, 2U}) {
                CTestInstance instance(Balance(), 5, 3);
                instance.Context().pixelFormat = PixelFormat_Ayuv;
                instance.Context().stereoLayout = layout;
                instance.Context().fieldSelector = field;
                ASSERT_EQ(instance.Begin(), KYV_OK);
                instance.Set("P1", reference);
                instance.Set("P2", 1);
                const size_t stride = layout ? 10 : 5;
                Frame output(stride * 3, 5);
                Frame expected = output;
                for (size_t y = 0; y < 3; ++y) {
                    const size_t at = y * stride + (layout == 2 ? 5 : 0);
                    std::copy_n(&input[at], 5, &expected[at]);
                }
                ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
                EXPECT_EQ(output, expected) << reference << ' ' << layout << ' ' << field;
            }
        }
    }
}

TEST(WhiteBalance, LevelsAgreeAndTheLeftHalfIsSpared) {
    for (const size_t width : {1U, 2U, 31U, 32U, 33U, 64U, 129U}) {
        const Frame input = RandomFrame(width, static_cast<uint32_t>(width));
        for (const uint32_t reference : {0x0080FFU, 0x204060U, 0xF0C0A0U, 0x010203U}) {
            const Frame whole = Render(input, reference);
            Frame half = whole;
            std::copy_n(input.begin(), width / 2, half.begin());
            for (const int level : {0, 3, 4, 5}) {
                EXPECT_EQ(Render(input, reference, 0, level), whole) << level;
                EXPECT_EQ(Render(input, reference, 1, level), half) << level;
            }
        }
    }
}

TEST(WhiteBalance, TablesFollowTheReferenceButNotInSingleFields) {
    const Frame input = RandomFrame(5 * 2, 2);
    CTestInstance instance(Balance(), 5, 2);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    Frame first(10), second(10);
    instance.Set("P1", 0x0080FFU);
    ASSERT_EQ(instance.Render(first.data(), input.data()), KYV_OK);
    instance.Set("P1", 0x80FF00U);
    for (const uint32_t field : {1U, 2U}) {
        instance.Context().fieldSelector = field;
        Frame untouched(10, 5);
        ASSERT_EQ(instance.Render(untouched.data(), input.data()), KYV_OK);
        EXPECT_THAT(untouched, testing::Each(5U));
    }
    instance.Context().fieldSelector = 0;
    ASSERT_EQ(instance.Render(second.data(), input.data()), KYV_OK);
    EXPECT_NE(second, first);
    instance.Set("P1", 0x0080FFU);
    ASSERT_EQ(instance.Render(second.data(), input.data()), KYV_OK);
    EXPECT_EQ(second, first);
}

TEST(WhiteBalance, AyuvFramesTakeTheRoundTripInEveryLayout) {
    using namespace KYVImageUtility;
    constexpr int kWidth = 5;
    const Frame input = RandomFrame(2 * kWidth * 3, 3);
    for (const uint32_t layout : {0U, 1U, 2U}) {
        for (const uint32_t field : {0U, 1U}) {
            const int stride = layout ? 2 * kWidth : kWidth;
            const int left = layout == 2 ? kWidth : 0;
            Frame expected(input.begin(), input.begin() + stride * 3);
            CImageAYUV view(reinterpret_cast<uint8_t*>(expected.data() + left), kWidth, 3,
                            stride * 4);
            CImageARGB argb(kWidth, 3);
            view.ToARGB(argb);
            if (field == 0) {
                for (int y = 0; y < 3; ++y) {
                    auto* row = reinterpret_cast<uint32_t*>(argb.Row(y));
                    const Frame balanced = Render(Frame(row, row + kWidth), 0x2080FF);
                    std::copy(balanced.begin(), balanced.end(), row);
                }
            }
            Frame output(expected); // what lies outside the view stays
            argb.ToAYUV(view);

            CTestInstance instance(Balance(), kWidth, 3);
            instance.Context().pixelFormat = PixelFormat_Ayuv;
            instance.Context().stereoLayout = layout;
            instance.Context().fieldSelector = field;
            ASSERT_EQ(instance.Begin(), KYV_OK);
            instance.Set("P1", 0x2080FFU);
            // A single field does not build the tables.
            Frame before(input.size());
            instance.Context().fieldSelector = 0;
            ASSERT_EQ(instance.Render(before.data(), input.data()), KYV_OK);
            instance.Context().fieldSelector = field;
            ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
            EXPECT_EQ(output, expected) << "layout " << layout << " field " << field;
        }
    }
}

} // namespace
