// Colour temperature through the callbacks, against hand-computed pixels and a slow form.
#include <algorithm>
#include <cmath>
#include <limits>
#include <tuple>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "imageutility/ImageUtility.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;
using testing::ElementsAre;

const EffectDescriptor& Temperature() {
    return Effect("Kyv_Dsp_Co_Temperature");
}

// A slow form that shares nothing with the effect: tables are not kept, every pixel is worked on
// its own.
int SlowGain(int value, double degree, double positive, double negative) {
    const double amount = std::fabs(degree);
    const double gain = (degree > 0 ? positive : negative) * amount + (1 - amount);
    return std::min(static_cast<int>(gain * value), 255);
}

uint32_t SlowPixel(uint32_t pixel, double temperature, double tint) {
    constexpr double kTable[3][4] = {
        // cool, warm, magenta, green
        {1.3, 0.32, 1.68, 0.95},
        {1.06, 1.01, 0.96, 1.5},
        {0.78, 1.24, 1.3, 0.76},
    };
    const int b = pixel & 255;
    const int g = pixel >> 8 & 255;
    const int r = pixel >> 16 & 255;
    const int luma = (401 * b + 2064 * g + 1053 * r + 67584) / 4096;
    const int in[3] = {b, g, r};
    uint32_t out = pixel & 0xFF000000;
    for (int i = 0; i < 3; ++i) {
        const double* gains = kTable[i];
        int value = SlowGain(in[i], temperature, gains[0], gains[1]);
        if (luma >= 200) {
            const int w = 255 - luma;
            const int v = luma - 200;
            value = std::min((value * w + in[i] * v) / 55, 255);
            value = (SlowGain(value, tint, gains[2], gains[3]) * w + value * v) / 55;
        } else {
            value = SlowGain(value, tint, gains[2], gains[3]);
        }
        out |= static_cast<uint32_t>(value) << (8 * i);
    }
    return out;
}

Frame RoundTrip(const Frame& ayuv, int width, int height) {
    using namespace KYVImageUtility;
    Frame result = ayuv;
    CImageAYUV view(reinterpret_cast<uint8_t*>(result.data()), width, height, width * 4);
    CImageARGB argb(width, height);
    view.ToARGB(argb);
    argb.ToAYUV(view);
    return result;
}

Frame Convert(const Frame& frame, int width, int height, bool toAyuv) {
    using namespace KYVImageUtility;
    Frame result = frame;
    auto* bytes = reinterpret_cast<uint8_t*>(result.data());
    CImageAYUV ayuv(bytes, width, height, width * 4);
    CImageARGB argb(bytes, width, height, width * 4);
    toAyuv ? argb.ToAYUV(ayuv) : ayuv.ToARGB(argb);
    return result;
}

TEST(ColorTemperature, CoolAndWarmGainsOfSinglePixels) {
    CTestInstance instance(Temperature(), 4, 1);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    // Blue 200 x 1.3 = 260, capped; green 100 x 1.06 = 106; red 100 x 0.78 = 78. The second pixel
    // has luma (2064 + 1053) x 255 / 4096 + 16 = 210: w = 45, v = 10, red (198 x 45 + 255 x 10) /
    // 55 = 208, then once more through the identity. The last two pixels are black and clear.
    const Frame input = {0x806464C8, 0xFFFFFF00, 0xFF000000, 0x00000000};
    Frame output(4);
    instance.Set("P1", 1.0F);
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    EXPECT_THAT(output, ElementsAre(0x804E6AFF, 0xFFD0FF00, 0xFF000000, 0x00000000));
    // Blue 200 x 0.32 = 64; green 101; red 124. Red 255 x 1.24 and green 255 x 1.01 are capped.
    instance.Set("P1", -1.0F);
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    EXPECT_THAT(output, ElementsAre(0x807C6540, 0xFFFFFF00, 0xFF000000, 0x00000000));
}

TEST(ColorTemperature, AllFormatsLayoutsFieldsAndLevelsMatchTheSlowForm) {
    constexpr int kWidth = 67;
    constexpr int kHeight = 5;
    const Frame source = RandomFrame(2 * kWidth * kHeight, 1);
    for (const auto& [temperature, tint] :
         {std::tuple{0.7F, 0.0F}, {-0.35F, 0.9F}, {0.0F, -1.0F}, {1.0F, 1.0F}, {0.125F, -0.5F}}) {
        for (const uint32_t layout : {0U, 1U, 2U}) {
            for (const uint32_t field : {0U, 1U, 2U}) {
                for (const uint32_t compare : {0U, 1U}) {
                    for (const uint32_t format : {0U, 1U}) {
                        const int stride = layout == 0 ? kWidth : 2 * kWidth;
                        const Frame input(source.begin(), source.begin() + stride * kHeight);
                        // What the work sees: the source, or the AYUV frame made RGB.
                        const Frame rgb = format ? Convert(input, stride, kHeight, false) : input;
                        Frame expected = rgb;
                        const int left = layout == 2 ? kWidth : 0;
                        const int first = field == 2 ? 1 : 0;
                        for (int y = first; y < kHeight; y += field ? 2 : 1) {
                            for (int x = compare ? kWidth / 2 : 0; x < kWidth; ++x) {
                                uint32_t& pixel = expected[y * stride + left + x];
                                pixel = SlowPixel(pixel, temperature, tint);
                            }
                        }
                        if (format) {
                            expected = Convert(expected, stride, kHeight, true);
                        }
                        constexpr uint32_t kUntouched = 0x12345678;
                        for (int y = 0; y < kHeight; ++y) {
                            for (int x = 0; x < stride; ++x) {
                                const bool inField = field == 0 || y % 2 == first;
                                if (x < left || x >= left + kWidth || (!format && !inField)) {
                                    expected[y * stride + x] = kUntouched;
                                }
                            }
                        }
                        for (const int level : {0, 1, 3, 4, 5}) {
                            CTestInstance instance(Temperature(), kWidth, kHeight);
                            EffectContext& context = instance.Context();
                            context.stereoLayout = layout;
                            context.fieldSelector = field;
                            context.pixelFormat = format;
                            context.cpuLevel = level;
                            ASSERT_EQ(instance.Begin(), KYV_OK);
                            instance.Set("P1", temperature);
                            instance.Set("P2", compare);
                            instance.Set("P3", tint);
                            Frame output(input.size(), kUntouched);
                            ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
                            ASSERT_EQ(output, expected)
                                << "P1 " << temperature << " P3 " << tint << " layout " << layout
                                << " field " << field << " compare " << compare << " format "
                                << format << " level " << level;
                        }
                    }
                }
            }
        }
    }
}

TEST(ColorTemperature, EveryByteTripleOfEveryLevelMatchesTheSlowForm) {
    // All 2^24 colours are too slow for the slow form; every value of each channel against coarse
    // steps of the others covers every table entry on both sides of the highlight rule.
    Frame input;
    for (uint32_t a = 0; a < 256; ++a) {
        for (uint32_t b = 0; b < 256; b += 5) {
            for (uint32_t c = 0; c < 256; c += 15) {
                input.insert(input.end(), {a << 16 | b << 8 | c, a << 8 | b | c << 16,
                                           0xFF000000 | a | b << 16 | c << 8});
            }
        }
    }
    for (const auto& [temperature, tint] : {std::tuple{0.63F, -0.21F}, {-0.8F, 0.4F}}) {
        Frame expected = input;
        for (uint32_t& pixel : expected) {
            pixel = SlowPixel(pixel, temperature, tint);
        }
        for (const int level : {0, 3, 4, 5}) {
            CTestInstance instance(Temperature(), static_cast<uint32_t>(input.size()), 1);
            instance.Context().cpuLevel = level;
            ASSERT_EQ(instance.Begin(), KYV_OK);
            instance.Set("P1", temperature);
            instance.Set("P3", tint);
            Frame output(input.size());
            ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
            ASSERT_TRUE(output == expected) << temperature << " at level " << level;
        }
    }
}

TEST(ColorTemperature, IdentityCopiesWholeFramesOnceForBothViews) {
    constexpr int kPixels = 2 * 6 * 3;
    const Frame input = RandomFrame(kPixels, 2);
    for (const auto& [layout, copied] : {std::pair{0U, kPixels / 2}, {1U, kPixels}, {2U, 0}}) {
        for (const uint32_t format : {0U, 1U}) {
            CTestInstance instance(Temperature(), 6, 3);
            instance.Context().stereoLayout = layout;
            instance.Context().pixelFormat = format;
            ASSERT_EQ(instance.Begin(), KYV_OK);
            Frame expected(kPixels, 7);
            std::copy_n(input.begin(), copied, expected.begin());
            Frame output(kPixels, 7);
            ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
            EXPECT_EQ(output, expected) << "layout " << layout << " format " << format;
        }
    }
}

TEST(ColorTemperature, NotANumberIsNoIdentityAndChangesNoColour) {
    // A "P3" that is not a number takes an AYUV frame through the round trip.
    const float nan = std::numeric_limits<float>::quiet_NaN();
    const Frame input = RandomFrame(6 * 3, 3);
    CTestInstance instance(Temperature(), 6, 3);
    instance.Context().pixelFormat = PixelFormat_Ayuv;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    instance.Set("P3", nan);
    Frame output(input.size());
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    EXPECT_EQ(output, RoundTrip(input, 6, 3));
    EXPECT_NE(output, input);

    instance.Context().pixelFormat = PixelFormat_Argb;
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    EXPECT_EQ(output, input);

    // Degrees out of range stay inside the tables, and a good one afterwards is not stale.
    for (const float degree : {nan, 1e30F, -1e30F, 5.0F, std::numeric_limits<float>::infinity()}) {
        instance.Set("P1", degree);
        instance.Set("P3", degree);
        EXPECT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    }
    instance.Set("P1", 0.5F);
    instance.Set("P3", 0.0F);
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    EXPECT_EQ(output[0], SlowPixel(input[0], 0.5, 0.0));
}

TEST(ColorTemperature, SideBySideShowsTheCentreTwice) {
    // Width 8: columns 2..5 twice. Width 7: columns 1..3 twice, and column 4 continues.
    for (const auto& [width, columns] : {std::pair{8U, std::vector{2, 3, 4, 5, 2, 3, 4, 5}},
                                         {7U, {1, 2, 3, 1, 2, 3, 4}},
                                         {1U, {0}}}) {
        for (const uint32_t layout : {0U, 1U, 2U}) {
            const uint32_t stride = layout ? 2 * width : width;
            const Frame input = RandomFrame(stride * 2, 4);
            CTestInstance instance(Temperature(), width, 2);
            ASSERT_EQ(instance.Begin(), KYV_OK);
            instance.Set("P1", 0.4F);
            instance.Set("P2", 2);
            Frame output(stride * 2);
            // The right view takes the buffer that the left view's call has filled.
            for (uint32_t call = layout ? 1 : 0; call <= layout; ++call) {
                instance.Context().stereoLayout = call;
                ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
            }
            const uint32_t left = layout == 2 ? width : 0;
            for (uint32_t y = 0; y < 2; ++y) {
                for (uint32_t x = 0; x < width; ++x) {
                    const uint32_t from = input[y * stride + left + columns[x]];
                    EXPECT_EQ(output[y * stride + left + x],
                              x < width / 2 ? from : SlowPixel(from, 0.4F, 0.0))
                        << "width " << width << " layout " << layout << " at " << x << "," << y;
                }
            }
        }
    }
}

TEST(ColorTemperature, ComparisonBufferFollowsTheFrameSize) {
    CTestInstance instance(Temperature(), 4, 4);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    ASSERT_EQ(instance.Begin(), KYV_OK); // preparing twice must not lose a buffer either
    instance.Set("P1", 0.4F);
    instance.Set("P2", 2);
    for (const auto& [width, height] : {std::pair{4U, 4U}, {64U, 33U}, {3U, 2U}, {64U, 33U}}) {
        for (const uint32_t layout : {2U, 0U, 1U, 2U, 2U}) { // the right view first, too
            instance.Context().width = width;
            instance.Context().height = height;
            instance.Context().stereoLayout = layout;
            const Frame input = RandomFrame(width * height * 2, width);
            Frame output(input.size());
            EXPECT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
        }
    }
    EXPECT_EQ(instance.End(), KYV_OK);
    EXPECT_EQ(instance.End(), KYV_OK);
}

TEST(ColorTemperature, WideAyuvFramesAreSplitWithoutASeam) {
    constexpr int kWidth = 5003; // the comparison ends inside one of several blocks
    const Frame input = RandomFrame(kWidth, 7);
    Frame expected = Convert(input, kWidth, 1, false);
    for (int x = kWidth / 2; x < kWidth; ++x) {
        expected[x] = SlowPixel(expected[x], 0.25, -0.5);
    }
    expected = Convert(expected, kWidth, 1, true);

    CTestInstance instance(Temperature(), kWidth, 1);
    instance.Context().pixelFormat = PixelFormat_Ayuv;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    instance.Set("P1", 0.25F);
    instance.Set("P2", 1);
    instance.Set("P3", -0.5F);
    Frame output(kWidth);
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    EXPECT_EQ(output, expected);
}

TEST(ColorTemperature, FieldOfARowThatIsNotThereTreatsNothing) {
    CTestInstance instance(Temperature(), 3, 1);
    instance.Context().fieldSelector = FieldSelector_Second;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    instance.Set("P1", 1.0F);
    const Frame input = RandomFrame(3, 6);
    Frame output(3, 9);
    ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
    EXPECT_THAT(output, testing::Each(9U));
}

} // namespace
