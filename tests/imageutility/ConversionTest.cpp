// Conversions between the pixel formats, against sums worked out by hand.
#include <array>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "imageutility/Conversion.h"
#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;
using namespace KYVImageUtility;
using testing::Each;
using testing::ElementsAre;
using testing::ElementsAreArray;

struct Pair {
    uint32_t from;
    uint32_t to;
};

// Converts a row that is a multiple of the cases long, so that whole vector steps and remainders
// both see every case, at every level.
template <class From, class To>
void ExpectConversion(const std::vector<Pair>& cases, void (From::*convert)(To&) const) {
    for (const size_t length : {cases.size(), cases.size() * 5 + 3}) {
        Words from, expected;
        for (size_t i = 0; i < length; ++i) {
            from.push_back(cases[i % cases.size()].from);
            expected.push_back(cases[i % cases.size()].to);
        }
        const auto width = static_cast<int32_t>(length);
        From source(reinterpret_cast<uint8_t*>(from.data()), width, 1, width * 4);
        To destination(width, 1);
        for (const int32_t level : kLevels) {
            source.SetCpuLevel(level);
            destination.FillBytes(0x55);
            (source.*convert)(destination);
            EXPECT_THAT(WordsOf(destination), ElementsAreArray(expected)) << "level " << level;
        }
    }
}

TEST(Conversion, PrimariesToAyuv) {
    ExpectConversion<CImageARGB, CImageAYUV>(
        {
            {0xFF000000, 0xFF108080},
            {0x00FFFFFF, 0x00EB8080},
            // Y (268515 + 67584) / 4096 = 82, U (526336 - 154530) / 4096 = 90, V 984826 / 4096
            {0x80FF0000, 0x80525AF0},
            // Y 593904 / 4096 = 144, U 222376 / 4096 = 54, V 142051 / 4096 = 34
            {0x0100FF00, 0x01903622},
            // Y 169839 / 4096 = 41, U 984826 / 4096 = 240, V 452131 / 4096 = 110
            {0xFE0000FF, 0xFE29F06E},
        },
        &CImageARGB::ToAYUV);
}

TEST(Conversion, AyuvToArgbIsClamped) {
    ExpectConversion<CImageAYUV, CImageARGB>(
        {
            {0xFF108080, 0xFF000000},
            {0x00EB8080, 0x00FFFFFF}, // 1046240 / 4096 = 255
            {0x12008080, 0x12000000}, // below black: -74240
            {0x34FF8080, 0x34FFFFFF}, // above white: 278
            // The red of above: R 1048880 / 4096 = 256, G 4652 / 4096 = 1, B 2628 / 4096 = 0
            {0x80525AF0, 0x80FF0100},
            // Y 255, U 0, V 255: R 481, G 923746 / 4096 = 225, B 83552 / 4096 = 20
            {0x00FF00FF, 0x00FFE114},
            // Y 100, U 200, V 50: R below 0, G 546956 / 4096 = 133, B 997712 / 4096 = 243
            {0xFF64C832, 0xFF0085F3},
        },
        &CImageAYUV::ToARGB);
}

TEST(Conversion, GreyIsTheLuma) {
    Words words = {0x80FF0000, 0x0000FF00, 0xFF0000FF, 0x12FFFFFF, 0xFF000000};
    CImageARGB image = View(words, 5);
    for (const int32_t level : kLevels) {
        image.SetCpuLevel(level);
        CImageByte gray(5, 1);
        image.ToGray(gray);
        EXPECT_THAT(BytesOf(gray), ElementsAre(82, 144, 41, 235, 16)) << "level " << level;
        CImageARGB inPlace(5, 1);
        inPlace.CopyFrom(image);
        inPlace.SetCpuLevel(level);
        inPlace.ToGray();
        EXPECT_THAT(WordsOf(inPlace),
                    ElementsAre(0x80525252, 0x00909090, 0xFF292929, 0x12EBEBEB, 0xFF101010))
            << "level " << level;
    }
}

TEST(Conversion, SingleColoursMatchTheImagesButAreNotClamped) {
    // The extremes of sums of products are at the corners of the cube.
    for (uint32_t corner = 0; corner < 8; ++corner) {
        const uint32_t r = corner & 1 ? 255 : 0, g = corner & 2 ? 255 : 0, b = corner & 4 ? 255 : 0;
        uint32_t y = 0, u = 0, v = 0;
        RgbToYuv(r, g, b, &y, &u, &v);
        Words words = {r << 16 | g << 8 | b};
        CImageAYUV ayuv(1, 1);
        View(words, 1).ToAYUV(ayuv);
        EXPECT_THAT(WordsOf(ayuv), ElementsAre(y << 16 | u << 8 | v));
        uint8_t luma = 0;
        RgbToLuma(static_cast<uint8_t>(r), static_cast<uint8_t>(g), static_cast<uint8_t>(b), &luma);
        EXPECT_EQ(luma, y);
    }
    uint32_t r = 0, g = 0, b = 0;
    YuvToRgb(0, 128, 128, &r, &g, &b); // -74240 / 4096, downwards
    EXPECT_THAT((std::array{r, g, b}), Each(static_cast<uint32_t>(-19)));
    YuvToRgb(255, 0, 255, &r, &g, &b);
    EXPECT_THAT((std::array{r, g, b}), ElementsAre(481, 225, 20));
    // Sums wrap: 1053 x 2^31 leaves 2^31, and 0x80010800 is shifted as a negative number.
    RgbToYuv(0x80000000, 0, 0, &r, &g, &b);
    EXPECT_EQ(r, 0xFFF80010);
    YuvToRgb(0x7FFFFFFF, 0x80000000, 0x7FFFFFFF, &r, &g, &b);
}

TEST(Conversion, ViewsAreWalkedByTheirOwnPitch) {
    for (const int32_t level : {0, 3, 4}) {
        CFramed<CImageARGB> source(37, 5, 2); // one field of a frame
        CFramed<CImageAYUV> target(37, 5, 1);
        CFramed<CImageByte> gray(37, 5, 2);
        source.Fill(3);
        source->SetCpuLevel(level);
        source->ToAYUV(*target);
        source->ToGray(*gray);
        Words expected;
        std::vector<uint8_t> expectedGray;
        for (const uint32_t word : WordsOf(*source)) {
            uint32_t y = 0, u = 0, v = 0;
            RgbToYuv(word >> 16 & 255, word >> 8 & 255, word & 255, &y, &u, &v);
            expected.push_back((word & 0xFF000000) | y << 16 | u << 8 | v);
            expectedGray.push_back(static_cast<uint8_t>(y));
        }
        EXPECT_EQ(WordsOf(*target), expected) << "level " << level;
        EXPECT_EQ(BytesOf(*gray), expectedGray) << "level " << level;
        EXPECT_TRUE(target.GuardsAreIntact());
        EXPECT_TRUE(gray.GuardsAreIntact());
    }
}

TEST(Conversion, SizesThatDifferAndNullBuffersWriteNothing) {
    Words words(12, 0x01020304), other(12, 7);
    const CImageARGB source = View(words, 4);
    CImageAYUV turned(reinterpret_cast<uint8_t*>(other.data()), 3, 4, 12);
    source.ToAYUV(turned);
    CImageARGB().ToAYUV(turned);
    std::vector<uint8_t> bytes(12, 7);
    CImageByte plane = View(bytes, 3);
    source.ToGray(plane);
    CImageByte h(4, 3), s(4, 3);
    source.ToHSL(h, s, plane);
    CImageByte none;
    source.ToGray(none);
    CImageAYUV empty;
    source.ToAYUV(empty);
    CImageARGB().ToGray();
    EXPECT_THAT(other, Each(7U));
    EXPECT_THAT(bytes, Each(7));
}

TEST(Conversion, HslOfColours) {
    struct Case {
        uint32_t rgb;
        uint8_t h, s, l;
    };
    const Case cases[] = {
        {0x808080, 170, 0, 128}, // no hue: 43688 / 256
        {0xFF0000, 0, 255, 127}, // lightness 32766, just not above half
        {0x00FF00, 85, 255, 127},
        {0x0000FF, 170, 255, 127},
        {0xFFFF00, 42, 255, 127},  // red goes first: 10922
        {0x00FFFF, 127, 255, 127}, // then green: 21844 + 10922
        // -2784983 / 255 = -10921, towards zero; 65532 - 10921 = 54611
        {0xFF00FF, 213, 255, 127},
        // Light: L 26540715 / 510 = 52040, t = 105, H 546152 / 105 = 5201
        {0xFFC896, 20, 255, 203},
        // Dark: L 8995, S 3276635 / 70 = 46809, H -109195 / 50 = -2183 and 43688
        {0x0A143C, 162, 182, 35},
    };
    for (const Case& c : cases) {
        Words words = {c.rgb | 0x77000000};
        CImageARGB image = View(words, 1);
        CImageByte h(1, 1), s(1, 1), l(1, 1);
        for (const int32_t level : kLevels) {
            image.SetCpuLevel(level);
            image.ToHSL(h, s, l);
            EXPECT_THAT((std::array{*h.Row(0), *s.Row(0), *l.Row(0)}), ElementsAre(c.h, c.s, c.l))
                << std::hex << c.rgb;
        }
    }
}

TEST(Conversion, ColoursOfHsl) {
    struct Case {
        uint8_t h, s, l;
        uint32_t rgb;
    };
    const Case cases[] = {
        {170, 0, 128, 0x7F7F7F}, // 32768 x 255 / 65532 = 127.5
        {0, 0, 255, 0xFEFEFE},   // 254.02
        {0, 0, 0, 0x000000},
        // m2 = 4252992510 / 65532 = 64899, m1 = 125: 253.03 and 0.98
        {0, 255, 127, 0xFD0000},
        // m2 = 83968 - 25602 = 58366, m1 = 44034; green 44034 + 73385301 / 10922 = 50753
        {20, 128, 200, 0xE3C5AB},
    };
    for (const Case& c : cases) {
        uint8_t bytes[3] = {c.h, c.s, c.l};
        Words words = {0x66123456};
        View(words, 1).FromHSL(CImageByte(bytes, 1, 1, 1), CImageByte(bytes + 1, 1, 1, 1),
                               CImageByte(bytes + 2, 1, 1, 1));
        EXPECT_THAT(words, ElementsAre(0x66000000 | c.rgb)) << +c.h << " " << +c.s << " " << +c.l;
    }
}

} // namespace
