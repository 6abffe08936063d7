// The two mask transitions, driven as a host drives them.
#include <algorithm>
#include <cmath>
#include <limits>
#include <memory>

#include <gtest/gtest.h>

#include "imageutility/Bitmap.h"
#include "imageutility/Conversion.h"
#include "platform/Library.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;
using KYVImageUtility::CImageARGB;

constexpr char kAlpha[] = "DSP_TR_AlphaTransition";
constexpr char kTest[] = "DSP_TR_TestAlpha";

struct Settings {
    float percentage = 0.3F;
    int32_t smoothness = 20;
    uint32_t color = 0x3C78C8; // red C8, green 78, blue 3C
    bool border = false;
};

struct Mask {
    uint32_t width;
    std::vector<uint8_t> values;
    uint8_t At(uint32_t x, uint32_t y) const { return values[size_t{y} * width + x]; }
};

// The module's mask at a size, by the library's own resize.
Mask FitMask(const char* effect, uint32_t width, uint32_t height) {
    CImageARGB bitmap;
    KYVImageUtility::LoadBitmapResource(bitmap, kyv::OwnLibrary(),
                                        effect == std::string(kAlpha) ? 140 : 113);
    EXPECT_EQ(bitmap.GetWidth(), 640);
    EXPECT_EQ(bitmap.GetHeight(), 480);
    CImageARGB fitted(static_cast<int32_t>(width), static_cast<int32_t>(height));
    bitmap.Resize(fitted, 0);
    Mask mask = {width, {}};
    for (size_t i = 0; i < size_t{width} * height; ++i) {
        mask.values.push_back(fitted.GetBuffer()[i * 4 + 2]);
    }
    return mask;
}

uint32_t Byte(uint32_t pixel, int byte) {
    return pixel >> (byte * 8) & 0xFF;
}

// The rule for one pixel, as slow and plain as it can be said. The edge is a pixel.
uint32_t SlowPixel(uint32_t a, uint32_t b, int32_t m, const Settings& s, uint32_t edge) {
    const auto smooth = static_cast<float>(s.smoothness);
    const auto t = static_cast<int32_t>(s.percentage * (2.0F * smooth + 255.0F) - smooth);
    if (m >= t + s.smoothness) {
        return a;
    }
    if (m <= t - s.smoothness) {
        return b;
    }
    const auto part = static_cast<float>(t + s.smoothness - m);
    const auto k = static_cast<uint32_t>(part / (2.0F * smooth) * 256.0F);
    uint32_t x = k == 0 ? a : k >= 255 ? b : std::max(Byte(a, 3), Byte(b, 3)) << 24;
    for (int byte = 0; byte < 3 && k > 0 && k < 255; ++byte) {
        x |= (Byte(b, byte) * k + Byte(a, byte) * (255 - k)) >> 8 << (byte * 8);
    }
    if (s.border) {
        const auto away = static_cast<float>(std::abs(t - m));
        const uint32_t e = 255 - static_cast<uint32_t>(away / smooth * 256.0F);
        uint32_t tinted = x & 0xFF000000;
        for (int byte = 0; byte < 3; ++byte) {
            tinted |= (Byte(edge, byte) * e + Byte(x, byte) * (255 - e)) >> 8 << (byte * 8);
        }
        x = tinted;
    }
    return x;
}

// The colour as a pixel of either format.
uint32_t EdgePixel(uint32_t color, uint32_t format) {
    uint32_t first = color & 0xFF, second = color >> 8 & 0xFF, third = color >> 16 & 0xFF;
    if (format == PixelFormat_Ayuv) {
        KYVImageUtility::RgbToYuv(first, second, third, &first, &second, &third);
    }
    return first << 16 | second << 8 | third;
}

void Apply(CTestInstance& instance, const Settings& settings) {
    instance.Set("P1", settings.percentage);
    instance.Set("P2", settings.smoothness);
    instance.Set("P3", settings.color);
    instance.Set("P4", static_cast<uint8_t>(settings.border));
}

Frame RenderFrame(CTestInstance& instance, const Frame& a, const Frame& b) {
    Frame output(a.size(), 0x5A5A5A5A);
    EXPECT_EQ(instance.Render(output.data(), a.data(), b.data()), KYV_OK);
    return output;
}

class Transition : public testing::TestWithParam<const char*> {
protected:
    const EffectDescriptor& effect() const { return Effect(GetParam()); }
};

INSTANTIATE_TEST_SUITE_P(Both, Transition, testing::Values(kAlpha, kTest),
                         [](const auto& entry) { return std::string(entry.param).substr(7); });

// A hard cut shows where each mask value lies: picture 0 stays where it is at least T.
TEST_P(Transition, MaskIsTheModulesBitmapFittedToTheFrame) {
    constexpr uint32_t kWidth = 61, kHeight = 47;
    const Frame a(kWidth * kHeight, 0), b(kWidth * kHeight, 1);
    CTestInstance instance(effect(), kWidth, kHeight);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    std::vector<uint8_t> seen(a.size(), 0);
    for (int t = 1; t < 256; ++t) {
        Apply(instance, {.percentage = (static_cast<float>(t) + 0.5F) / 255.0F, .smoothness = 0});
        const Frame output = RenderFrame(instance, a, b);
        for (size_t i = 0; i < seen.size(); ++i) {
            seen[i] = static_cast<uint8_t>(seen[i] + (output[i] == 0));
        }
    }
    EXPECT_EQ(seen, FitMask(GetParam(), kWidth, kHeight).values);
}

// Smoothness 20 at 0.5: T = trunc(0.5 * 295 - 20) = 127, so the band is 108 to 146.
TEST_P(Transition, HandComputedPixels) {
    struct Case {
        uint8_t m;
        bool border;
        uint32_t expected;
    };
    constexpr uint32_t kA = 0x40FF80FF, kB = 0x80004010;
    constexpr Case kCases[] = {
        {147, false, kA},
        {107, false, kB},
        // k = trunc(20 / 40 * 256) = 128: R 255 * 127 >> 8 = 126, G (64 * 128 + 128 * 127) >> 8 =
        // 95, B (16 * 128 + 255 * 127) >> 8 = 134; alpha is the greater.
        {127, false, 0x807E5F86},
        // k = trunc(10 / 40 * 256) = 64: R 255 * 191 >> 8 = 190, G (64 * 64 + 128 * 191) >> 8 =
        // 111, B (16 * 64 + 255 * 191) >> 8 = 194.
        {137, false, 0x80BE6FC2},
        // The edge's own 200, 120, 60 times 255 >> 8.
        {127, true, 0x80C7773B},
        // e = 255 - trunc(10 / 20 * 256) = 127: R (200 * 127 + 190 * 128) >> 8 = 194,
        // G (120 * 127 + 111 * 128) >> 8 = 115, B (60 * 127 + 194 * 128) >> 8 = 126.
        {137, true, 0x80C2737E},
        {147, true, kA},
    };
    const Mask mask = FitMask(GetParam(), 640, 480);
    const Frame a(mask.values.size(), kA), b(mask.values.size(), kB);
    CTestInstance instance(effect(), 640, 480);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    int found = 0;
    for (const Case& entry : kCases) {
        Apply(instance, {.percentage = 0.5F, .border = entry.border});
        const Frame output = RenderFrame(instance, a, b);
        const auto at = std::find(mask.values.begin(), mask.values.end(), entry.m);
        if (at != mask.values.end()) {
            EXPECT_EQ(output[static_cast<size_t>(at - mask.values.begin())], entry.expected)
                << "mask " << int{entry.m} << " border " << entry.border;
            ++found;
        }
    }
    EXPECT_GE(found, 3); // one of the masks leaves out grey levels
}

TEST(MaskTransition, DefaultsOfTheTestAlphaShowAPureRedEdge) {
    const Mask mask = FitMask(kTest, 640, 480);
    const Frame a(mask.values.size(), 0xFF123456), b(mask.values.size(), 0xFF654321);
    CTestInstance instance(Effect(kTest), 640, 480);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    instance.Set("P1", 0.5F);
    const Frame output = RenderFrame(instance, a, b);
    const auto at = std::find(mask.values.begin(), mask.values.end(), 127);
    ASSERT_NE(at, mask.values.end());
    EXPECT_EQ(output[static_cast<size_t>(at - mask.values.begin())], 0xFFFE0000);
}

TEST_P(Transition, EveryPixelFollowsTheRuleAtEveryLevelFormatAndThreadCount) {
    constexpr uint32_t kWidth = 101, kHeight = 37;
    const Mask mask = FitMask(GetParam(), kWidth, kHeight);
    const Frame a = RandomFrame(mask.values.size(), 1), b = RandomFrame(mask.values.size(), 2);
    for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
        CTestInstance instance(effect(), kWidth, kHeight);
        instance.Context().pixelFormat = format;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        for (const Settings& settings : std::initializer_list<Settings>{
                 {.percentage = 0.0F},
                 {.percentage = 0.27F, .border = true},
                 {.percentage = 0.5F, .smoothness = 0, .border = true},
                 {.percentage = 0.61F, .smoothness = 40},
                 {.percentage = 0.5F, .smoothness = 1, .border = true},
                 {.percentage = 0.4F, .smoothness = 300, .border = true}, // k reaches 0 and 255
                 {.percentage = 1.0F, .border = true},
                 {.percentage = 1.0F, .smoothness = 0}}) {
            Apply(instance, settings);
            const uint32_t edge = EdgePixel(settings.color, format);
            Frame expected(a.size());
            for (size_t i = 0; i < a.size(); ++i) {
                expected[i] = SlowPixel(a[i], b[i], mask.values[i], settings, edge);
            }
            for (const auto& [level, threads] : {std::pair{0, 1U},
                                                 {3, 0U},
                                                 {5, 1U},
                                                 {5, 2U},
                                                 {4, 7U},
                                                 {0, 1000U},
                                                 {5, 0xFFFFFFFFU}}) {
                instance.Context().cpuLevel = level;
                instance.Context().threadCount = threads;
                EXPECT_EQ(RenderFrame(instance, a, b), expected)
                    << settings.percentage << " " << settings.smoothness << " level " << level
                    << " threads " << threads << " format " << format;
            }
        }
    }
}

TEST_P(Transition, EndsShowThePicturesUnchanged) {
    constexpr uint32_t kWidth = 640, kHeight = 480;
    const Mask mask = FitMask(GetParam(), kWidth, kHeight);
    const Frame a = RandomFrame(mask.values.size(), 3), b = RandomFrame(mask.values.size(), 4);
    CTestInstance instance(effect(), kWidth, kHeight);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    for (const int32_t smoothness : {0, 1, 20, 40}) {
        Apply(instance, {.percentage = 0.0F, .smoothness = smoothness, .border = true});
        EXPECT_EQ(RenderFrame(instance, a, b), a);
        Apply(instance, {.percentage = 1.0F, .smoothness = smoothness, .border = true});
        Frame expected = b;
        for (size_t i = 0; i < b.size() && smoothness == 0; ++i) {
            expected[i] = mask.values[i] == 255 ? a[i] : b[i]; // the cut itself stays
        }
        EXPECT_EQ(RenderFrame(instance, a, b), expected);
    }
}

// On one thread the pictures are resized to the display's shape, blended there and resized back.
Frame RenderInDisplayShape(const Frame& a, const Frame& b, uint32_t width, uint32_t height,
                           const Mask& mask, const Settings& settings) {
    CImageARGB scaled[2];
    for (int i = 0; i < 2; ++i) {
        const Frame& picture = i == 0 ? a : b;
        const CImageARGB view(reinterpret_cast<uint8_t*>(const_cast<uint32_t*>(picture.data())),
                              static_cast<int32_t>(width), static_cast<int32_t>(height),
                              static_cast<int32_t>(width) * 4);
        scaled[i].Create(static_cast<int32_t>(mask.width), static_cast<int32_t>(height));
        view.Resize(scaled[i], 0);
    }
    auto* pixels = reinterpret_cast<uint32_t*>(scaled[0].GetBuffer());
    const auto* other = reinterpret_cast<const uint32_t*>(scaled[1].GetBuffer());
    for (size_t i = 0; i < mask.values.size(); ++i) {
        pixels[i] = SlowPixel(pixels[i], other[i], mask.values[i], settings,
                              EdgePixel(settings.color, PixelFormat_Argb));
    }
    Frame output(a.size());
    CImageARGB view(reinterpret_cast<uint8_t*>(output.data()), static_cast<int32_t>(width),
                    static_cast<int32_t>(height), static_cast<int32_t>(width) * 4);
    scaled[0].Resize(view, 0);
    return output;
}

TEST_P(Transition, DisplayAspectIsCorrectedOnOneThreadAlone) {
    constexpr uint32_t kWidth = 72, kHeight = 48;
    const Frame a = RandomFrame(kWidth * kHeight, 5), b = RandomFrame(kWidth * kHeight, 6);
    const Settings settings = {.percentage = 0.45F, .smoothness = 30, .border = true};
    const bool hasPool = GetParam() == kAlpha;
    struct Case {
        uint32_t x, y, displayWidth; // 48 * x / y, a zero standing for the frame's own
    };
    for (const Case& shape :
         {Case{16, 9, 85}, Case{4, 3, 64}, Case{1, 1, 48}, Case{0, 24, 144}, Case{73, 0, 73},
          // The shape differs although the division gives the same width.
          Case{1501, 1000, 72}}) {
        CTestInstance instance(effect(), kWidth, kHeight);
        instance.Context().displayAspectX = shape.x;
        instance.Context().displayAspectY = shape.y;
        instance.Context().cpuLevel = 5;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        Apply(instance, settings);
        const Mask mask = FitMask(GetParam(), shape.displayWidth, kHeight);
        const Frame corrected = RenderInDisplayShape(a, b, kWidth, kHeight, mask, settings);
        EXPECT_EQ(RenderFrame(instance, a, b), corrected) << shape.x << ":" << shape.y;
        EXPECT_EQ(RenderFrame(instance, a, b), corrected) << "again";

        // In bands the mask is read by its own rows, and where it is narrower its last column goes
        // on. The other effect knows no bands.
        Frame banded(a.size());
        for (uint32_t i = 0; i < banded.size(); ++i) {
            const uint32_t x = std::min(i % kWidth, shape.displayWidth - 1);
            banded[i] = SlowPixel(a[i], b[i], mask.At(x, i / kWidth), settings,
                                  EdgePixel(settings.color, PixelFormat_Argb));
        }
        for (const uint32_t threads : {2U, 3U}) {
            instance.Context().threadCount = threads;
            EXPECT_EQ(RenderFrame(instance, a, b), hasPool ? banded : corrected)
                << shape.x << ":" << shape.y << " on " << threads;
        }
    }
}

// Narrow or low by a factor that no usual frame has.
TEST_P(Transition, FramesMuchUnlikeTheirDisplayAreCorrectedToo) {
    struct Case {
        uint32_t width, height, x, y, displayWidth; // height * x / y
    };
    for (const Case& c : {Case{3, 90, 16, 9, 160}, Case{160, 4, 1, 1, 4}, Case{160, 4, 1, 2, 2}}) {
        const Frame a = RandomFrame(size_t{c.width} * c.height, 17);
        const Frame b = RandomFrame(a.size(), 18);
        CTestInstance instance(effect(), c.width, c.height);
        instance.Context().displayAspectX = c.x;
        instance.Context().displayAspectY = c.y;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        const Settings settings = {.percentage = 0.5F};
        Apply(instance, settings);
        const Mask mask = FitMask(GetParam(), c.displayWidth, c.height);
        EXPECT_EQ(RenderFrame(instance, a, b),
                  RenderInDisplayShape(a, b, c.width, c.height, mask, settings))
            << c.width << "x" << c.height;
    }
}

TEST_P(Transition, NothingIsDrawnWithoutAMaskAndOneInputIsShownAlone) {
    const Frame a = RandomFrame(12 * 10, 9), b = RandomFrame(12 * 10, 10);
    const Frame untouched(a.size(), 0x5A5A5A5A);
    CTestInstance instance(effect(), 12, 10);
    EXPECT_EQ(RenderFrame(instance, a, b), untouched);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    ASSERT_EQ(instance.Begin(), KYV_OK); // frees what the first made
    EXPECT_NE(RenderFrame(instance, a, b), untouched);

    Frame output = untouched;
    EXPECT_EQ(instance.Render(output.data(), a.data(), nullptr), KYV_OK);
    EXPECT_EQ(output, a);
    EXPECT_EQ(instance.Render(output.data(), nullptr, b.data()), KYV_OK);
    EXPECT_EQ(output, b);
    output = untouched;
    EXPECT_EQ(instance.Render(output.data(), nullptr, nullptr), KYV_OK);
    EXPECT_EQ(output, untouched);
    EXPECT_EQ(instance.Render(nullptr, a.data(), b.data()), KYV_OK); // no output

    EXPECT_EQ(instance.End(), KYV_OK);
    EXPECT_EQ(RenderFrame(instance, a, b), untouched);

    EffectDescriptor orphan = effect();
    orphan.module = nullptr; // nowhere to load the bitmap from
    CTestInstance homeless(orphan, 12, 10);
    EXPECT_EQ(homeless.Begin(), KYV_FAIL);
    EXPECT_EQ(RenderFrame(homeless, a, b), untouched);
}

TEST_P(Transition, AbsurdParametersAndShapesGiveAPicture) {
    constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
    constexpr float kInfinity = std::numeric_limits<float>::infinity();
    constexpr int32_t kMost = std::numeric_limits<int32_t>::max();
    constexpr int32_t kLeast = std::numeric_limits<int32_t>::min();
    const Frame a = RandomFrame(30 * 20, 11), b = RandomFrame(30 * 20, 12);
    CTestInstance instance(effect(), 30, 20);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    struct Case {
        Settings settings;
        const Frame* expected; // or anything between the two
    };
    for (const auto& [settings, expected] : std::initializer_list<Case>{
             {{.percentage = kNan}, &a},
             {{.percentage = -0.5F}, &a},
             {{.percentage = -kInfinity, .smoothness = kMost}, &a},
             {{.percentage = 1.5F, .smoothness = 0}, &b},
             {{.percentage = kInfinity}, &b},
             {{.percentage = 1e30F, .smoothness = kMost, .border = true}, &b},
             {{.percentage = 0.5F, .smoothness = kMost, .border = true}, nullptr},
             {{.percentage = 0.5F, .smoothness = kLeast, .border = true}, nullptr},
             {{.percentage = kNan, .smoothness = -3}, nullptr}}) {
        Apply(instance, settings);
        for (const int32_t level : {0, 5}) {
            instance.Context().cpuLevel = level;
            const Frame output = RenderFrame(instance, a, b);
            if (expected) {
                EXPECT_EQ(output, *expected) << settings.percentage << " " << settings.smoothness;
            }
        }
    }
    Apply(instance, {.percentage = 0.5F});
    for (const auto& [x, y] :
         {std::pair{0xFFFFFFFFU, 1U}, {1U, 0xFFFFFFFFU}, {0xFFFFFFFFU, 0xFFFFFFFEU}}) {
        instance.Context().displayAspectX = x;
        instance.Context().displayAspectY = y;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        RenderFrame(instance, a, b);
    }
}

// A host that grows the frame or changes its shape without preparing anew.
TEST_P(Transition, FrameLargerThanTheMaskStaysInside) {
    CTestInstance instance(effect(), 8, 6);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    Apply(instance, {.percentage = 0.5F});
    const Mask mask = FitMask(GetParam(), 8, 6);
    for (const auto& [width, height] : {std::pair{50U, 40U}, {1U, 1U}, {7U, 3U}, {777U, 9U}}) {
        const Frame a = RandomFrame(size_t{width} * height, 13);
        const Frame b = RandomFrame(a.size(), 14);
        Frame expected(a.size());
        for (uint32_t i = 0; i < expected.size(); ++i) {
            const uint8_t m = mask.At(std::min(i % width, 7U), std::min(i / width, 5U));
            expected[i] = SlowPixel(a[i], b[i], m, {.percentage = 0.5F}, 0);
        }
        instance.Context().width = width;
        instance.Context().height = height;
        for (const uint32_t threads : {1U, 4U}) {
            instance.Context().threadCount = threads;
            EXPECT_EQ(RenderFrame(instance, a, b), expected);
        }
    }
}

TEST_P(Transition, FramesOfOneColumnOrRowAreBlended) {
    for (const auto& [width, height] : {std::pair{1U, 1U}, {1U, 9U}, {9U, 1U}}) {
        const Frame a(size_t{width} * height, 0), b(a.size(), 1);
        CTestInstance instance(effect(), width, height);
        instance.Context().displayAspectX = 3;
        instance.Context().displayAspectY = 2;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        Apply(instance, {.percentage = 0.0F});
        EXPECT_EQ(RenderFrame(instance, a, b), a);
        Apply(instance, {.percentage = 1.0F});
        EXPECT_EQ(RenderFrame(instance, a, b), b);
    }
}

} // namespace
