// Blends, fills and adjustments: values worked out by hand, and what every operation on two images
// has in common.
#include <functional>
#include <limits>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;
using testing::ElementsAre;

// Blends one pixel over another.
uint32_t Blend(void (CImageARGB::*blend)(const CImageARGB&, uint8_t), uint32_t under, uint32_t over,
               uint8_t opacity, int32_t level = 0) {
    Words dst = {under};
    Words src = {over};
    CImageARGB image = View(dst, 1);
    image.SetCpuLevel(level);
    (image.*blend)(View(src, 1), opacity);
    return dst[0];
}

TEST(AlphaBlend, WeighsBySourceAlphaTimesOpacity) {
    // The weights 255 and 1 sum to 256: (255 * 255) >> 8 = 254.
    EXPECT_EQ(Blend(&CImageARGB::AlphaBlend, 0x00000000, 0xFFFFFFFF, 255), 0x00FEFEFEU);
    // w = (129 * 200) >> 8 = 100. Blue (10 * 100 + 100 * 156) >> 8 = 64, green
    // (20 * 100 + 150 * 156) >> 8 = 99, red (30 * 100 + 200 * 156) >> 8 = 133.
    EXPECT_EQ(Blend(&CImageARGB::AlphaBlend, 0x28C89664, 0xC81E140A, 128), 0x28856340U);
    EXPECT_EQ(Blend(&CImageARGB::AlphaBlend, 0x28C89664, 0x001E140A, 255), 0x28C89664U);
}

TEST(AddBlend, SaturatesAndAddsAlphaAtTwoLevelsOnly) {
    // w = 100 as above. Blue 100 + 3, green 150 + 7, red 200 + 99; alpha 40 + ((200 * 100) >> 8).
    for (const int32_t level : kLevels) {
        const bool addsAlpha = level == 1 || level == 2;
        EXPECT_EQ(Blend(&CImageARGB::AddBlend, 0x28C89664, 0xC8FF140A, 128, level),
                  addsAlpha ? 0x76FF9D67U : 0x28FF9D67U)
            << "level " << level;
        EXPECT_EQ(Blend(&CImageARGB::AddBlend, 0x28C89664, 0x00FFFFFF, 255, level), 0x28C89664U);
    }
}

TEST(ScreenBlend, LiftsBlackByOne) {
    Words dst = {0x12000000, 0x12FFFFFF, 0x12643200};
    Words src = {0x34000000, 0x34FFFFFF, 0x34C80A00};
    View(dst, 3).ScreenBlend(View(src, 3));
    // Red 255 - ((55 * 155) >> 8) = 222, green 255 - ((245 * 205) >> 8) = 59, blue 1.
    EXPECT_THAT(dst, ElementsAre(0x12010101U, 0x12FFFFFFU, 0x12DE3B01U));
}

TEST(CompositeOver, TakesCopiesOrMixes) {
    const auto over = [](uint32_t under, uint32_t source, uint8_t opacity) {
        return Blend(&CImageARGB::CompositeOver, under, source, opacity);
    };
    EXPECT_EQ(over(0x80112233, 0x00445566, 255), 0x80112233U); // nothing over it
    EXPECT_EQ(over(0x80112233, 0x01445566, 254), 0x80112233U); // a = 255 >> 8 = 0
    EXPECT_EQ(over(0x80112233, 0xFF445566, 255), 0xFF445566U);
    EXPECT_EQ(over(0x00112233, 0x64445566, 255), 0x64445566U); // over a clear pixel
    // a = 128, alpha 128 + 128 - 64 = 192, blue (200 * 128 + ((100 * 128 * 128) >> 8)) / 192
    // = 32000 / 192 = 166; green 0; red (255 * 128 + 16320) / 192 = 255.
    EXPECT_EQ(over(0x80FF0064, 0x80FF00C8, 255), 0xC0FF00A6U);
    // a = (128 * 255) >> 8 = 127 on opaque: (32385 + 32766) / 255 = 255.
    EXPECT_EQ(over(0xFFFFFFFF, 0xFFFFFFFF, 127), 0xFFFFFFFFU);
}

TEST(Contrast, ScalesAboutTheMiddle) {
    const Words start = {0x40FF8000};
    const auto contrast = [&start](float factor) {
        Words words = start;
        View(words, 1).Contrast(factor);
        return words[0];
    };
    EXPECT_EQ(contrast(1.0F), start[0]);
    EXPECT_EQ(contrast(0.0F), 0x40808080U);
    // 127 * 0.5 + 128.5 = 192, truncated; -128 * 0.5 + 128.5 = 64.
    EXPECT_EQ(contrast(0.5F), 0x40C08040U);
    EXPECT_EQ(contrast(2.0F), 0x40FF8000U);
    for (const float wrong : {2.5F, -0.1F, std::numeric_limits<float>::quiet_NaN(),
                              std::numeric_limits<float>::infinity()}) {
        EXPECT_EQ(contrast(wrong), start[0]) << wrong;
    }
}

TEST(Lightness, MovesByAPartOfTheRoom) {
    const auto lighten = [](float amount) {
        Words words = {0x40FF6400};
        View(words, 1).AdjustLightness(amount);
        return words[0];
    };
    EXPECT_EQ(lighten(0.0F), 0x40FF6400U);
    EXPECT_EQ(lighten(1.0F), 0x40FFFFFFU);
    EXPECT_EQ(lighten(-1.0F), 0x40000000U);
    // 100 + 155 / 2 and 255 / 2, halves up; 255 and 100 halved, 127.5 up.
    EXPECT_EQ(lighten(0.5F), 0x40FFB280U);
    EXPECT_EQ(lighten(-0.5F), 0x40803200U);
    EXPECT_EQ(lighten(1.5F), 0x40FF6400U);
    EXPECT_EQ(lighten(std::numeric_limits<float>::quiet_NaN()), 0x40FF6400U);
}

TEST(Saturation, ScalesTheDistanceFromGray) {
    const auto saturate = [](uint32_t word, int32_t percent) {
        Words words = {word};
        View(words, 1).AdjustSaturation(percent);
        return words[0];
    };
    EXPECT_EQ(saturate(0x40B41E00, 100), 0x40B41E00U);
    EXPECT_EQ(saturate(0x40777777, 200), 0x40777777U);
    // The grey of red 180, green 30 is (2404 * 30 + 1225 * 180 + 2048) >> 12 = 71.
    EXPECT_EQ(saturate(0x40B41E00, 0), 0x40474747U);
    // Red 71 + 218 and green 71 - 82 and blue 71 - 142 leave the range.
    EXPECT_EQ(saturate(0x40B41E00, 200), 0x40FF0000U);
    // Half: 71 + 54.5 up, 71 - 20.5 up, 71 - 35.5 up.
    EXPECT_EQ(saturate(0x40B41E00, 50), 0x407E3324U);
    EXPECT_EQ(saturate(0x40B41E00, 201), 0x40B41E00U);
    EXPECT_EQ(saturate(0x40B41E00, -1), 0x40B41E00U);
}

TEST(SubtractGray, TakesTheFirstByteOfEitherKindOff) {
    Words words = {0x40FF6410, 0x50FF6410};
    std::vector<uint8_t> gray = {100, 255};
    View(words, 2).SubtractGray(View(gray, 2));
    EXPECT_THAT(words, ElementsAre(0x409B0000U, 0x50000000U));
    Words other = {0xFFFFFF0A, 0};
    Words target = {0x40FF6410, 0x50FF6410};
    View(target, 2).SubtractGray(View(other, 2));
    EXPECT_THAT(target, ElementsAre(0x40F55A06U, 0x50FF6410U));
}

TEST(TintAYUV, ScalesRgbAndAlphaOfVisiblePixels) {
    Words words = {0x00EB8080, 0xFFEB8080, 0x80108080};
    CImageAYUV image(reinterpret_cast<uint8_t*>(words.data()), 3, 1, 12);
    image.TintAYUV(128, 128, 128, 64);
    // White (luma 219 * 4768 + 2048 >> 12 = 255) halves to 127: Y (3518 * 127 + 0x10800) >> 12
    // = 125. Alpha 255 * 64 >> 8 = 63 and 128 * 64 >> 8 = 32; black stays black.
    EXPECT_THAT(words, ElementsAre(0x00EB8080U, 0x3F7D8080U, 0x20108080U));
}

TEST(TintAYUV, KeepsTheLowByteOfWhatLeavesTheRange) {
    // Y 16, U 128, V 255: red (6537 * 127 + 2048) >> 12 = 203, green (-3330 * 127 + 2048) >> 12
    // = -103, blue 0. With factors 255, 0, 0 red is 202 and green -103 * 0 >> 8 = 0: Y
    // (1053 * 202 + 0x10800) >> 12 = 68, U (-606 * 202 + 0x80800) >> 12 = 98, V
    // (1798 * 202 + 0x80800) >> 12 = 217.
    Words words = {0xFF1080FF};
    CImageAYUV(reinterpret_cast<uint8_t*>(words.data()), 1, 1, 4).TintAYUV(255, 0, 0, 255);
    EXPECT_EQ(words[0], 0xFE4462D9U);
    // Y 255, V 255, U 0 with factor 255 for red alone: red (239 * 4768 + 6537 * 127 + 2048) >> 12
    // = 481, scaled 479; V (1798 * 479 + 0x80800) >> 12 = 338, whose low byte is 82.
    words = {0xFFFF00FF};
    CImageAYUV(reinterpret_cast<uint8_t*>(words.data()), 1, 1, 4).TintAYUV(255, 0, 0, 255);
    EXPECT_EQ(words[0] & 0xFF, 82U);
}

// --- What they share

struct PairOperation {
    const char* name;
    std::function<void(CImageARGB&, const CImageARGB&)> apply;
};

const PairOperation kPairOperations[] = {
    {"AlphaBlend", [](CImageARGB& d, const CImageARGB& s) { d.AlphaBlend(s, 200); }},
    {"AddBlend", [](CImageARGB& d, const CImageARGB& s) { d.AddBlend(s, 255); }},
    {"ScreenBlend", [](CImageARGB& d, const CImageARGB& s) { d.ScreenBlend(s); }},
    {"CompositeOver", [](CImageARGB& d, const CImageARGB& s) { d.CompositeOver(s, 180); }},
    {"SubtractGray", [](CImageARGB& d, const CImageARGB& s) { d.SubtractGray(s); }},
    {"Contrast", [](CImageARGB& d, const CImageARGB&) { d.Contrast(1.37F); }},
    {"FillColor", [](CImageARGB& d, const CImageARGB&) { d.FillColor(1, 2, 3); }},
    {"SetAlpha", [](CImageARGB& d, const CImageARGB&) { d.SetAlpha(77); }},
    {"FillColorKeyed",
     [](CImageARGB& d, const CImageARGB&) { d.FillColorKeyed(128, 128, 128, 60, 1, 2, 3); }},
    {"AdjustLightness", [](CImageARGB& d, const CImageARGB&) { d.AdjustLightness(-0.3F); }},
    {"AdjustSaturation", [](CImageARGB& d, const CImageARGB&) { d.AdjustSaturation(170); }},
    {"BoxBlur", [](CImageARGB& d, const CImageARGB& s) { s.BoxBlur(d, 3); }},
    {"Resize", [](CImageARGB& d, const CImageARGB& s) { s.Resize(d, 0); }},
    {"ResizeFourTap", [](CImageARGB& d, const CImageARGB& s) { s.Resize(d, 2); }},
};

class Operation : public testing::TestWithParam<PairOperation> {};

// A field of a frame gives what packed pixels give, at every level, and the rest of the frame
// stays.
TEST_P(Operation, WalksViewsByTheirPitch) {
    for (const int32_t level : {0, 3, 4}) {
        for (const int32_t width : {2, 7, 33}) {
            CFramed<CImageARGB> source(width, 6, 2), destination(width, 6, 2);
            source.Fill(1);
            destination.Fill(2);
            Words src = WordsOf(*source);
            Words expected = WordsOf(*destination);
            CImageARGB packed = View(expected, width);
            packed.SetCpuLevel(0);
            GetParam().apply(packed, View(src, width));
            destination->SetCpuLevel(level);
            source->SetCpuLevel(level);
            GetParam().apply(*destination, *source);
            EXPECT_EQ(WordsOf(*destination), expected) << "level " << level << ", width " << width;
            EXPECT_TRUE(destination.GuardsAreIntact());
            EXPECT_EQ(WordsOf(*source), src);
        }
    }
}

TEST_P(Operation, LeavesImagesAloneThatDoNotPair) {
    if (std::string(GetParam().name).starts_with("Resize")) {
        return; // sizes may differ
    }
    CImageARGB empty;
    GetParam().apply(empty, empty);
    Words words(6, 0x12345678);
    CImageARGB image = View(words, 3);
    CImageARGB nothing(nullptr, 3, 2, 12);
    GetParam().apply(nothing, image);
    CImageARGB negative(image.GetBuffer(), -3, -2, 12);
    GetParam().apply(negative, negative);
    EXPECT_THAT(words, testing::Each(0x12345678U));
    // Operations without a source run on the image alone.
    Words other(6, 0xFFEEDDCC);
    Words before = words;
    GetParam().apply(image, nothing);
    const bool ignoresSource = words != before;
    for (const int32_t width : {2, 6}) {
        words = before;
        GetParam().apply(image, View(other, width));
        EXPECT_EQ(words != before, ignoresSource);
    }
}

INSTANTIATE_TEST_SUITE_P(Image, Operation, testing::ValuesIn(kPairOperations),
                         [](const auto& operation) { return operation.param.name; });

} // namespace
