// Box blur against the rule written out pixel by pixel.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "imageutility/kernels/BoxBlur.h"
#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;

Words SlowBlur(const Words& words, int32_t width, int32_t radius) {
    const int32_t height = static_cast<int32_t>(words.size()) / width;
    if (std::min(width, height) <= 2 * radius) {
        radius = (std::min(width, height) - 1) / 2;
    }
    Words out;
    for (int32_t y = 0; y < height; ++y) {
        for (int32_t x = 0; x < width; ++x) {
            uint32_t sum[4] = {};
            uint32_t inside = 0;
            for (int32_t v = std::max(y - radius, 0); v <= std::min(y + radius, height - 1); ++v) {
                for (int32_t u = std::max(x - radius, 0); u <= std::min(x + radius, width - 1);
                     ++u, ++inside) {
                    for (int c = 0; c < 4; ++c) {
                        sum[c] += words[static_cast<size_t>(v * width + u)] >> 8 * c & 255;
                    }
                }
            }
            out.push_back(sum[0] / inside | sum[1] / inside << 8 | sum[2] / inside << 16 |
                          sum[3] / inside << 24);
        }
    }
    return out;
}

TEST(BoxBlur, AveragesTheWindowInsideTheImage) {
    const struct {
        int32_t width;
        int32_t height;
        int32_t radius;
    } cases[] = {{1, 1, 1},    {1, 9, 3},     {2, 2, 1},   {3, 3, 1},    {3, 3, 2},    {7, 4, 1},
                 {16, 9, 2},   {9, 16, 4},    {33, 21, 7}, {33, 21, 10}, {40, 41, 3},  {41, 40, 19},
                 {41, 40, 20}, {20, 20, 500}, {70, 5, 2},  {5, 70, 2},   {64, 64, 31}, {67, 13, 6}};
    uint32_t seed = 0;
    for (const auto& [width, height, radius] : cases) {
        for (const int pitchFactor : {1, 2}) {
            CFramed<CImageARGB> source(width, height, pitchFactor);
            source.Fill(++seed);
            const Words expected = SlowBlur(WordsOf(*source), width, radius);
            for (const int32_t level : {0, 3, 4}) {
                CFramed<CImageARGB> destination(width, height, 3 - pitchFactor);
                source->SetCpuLevel(level);
                source->BoxBlur(*destination, radius);
                ASSERT_EQ(WordsOf(*destination), expected)
                    << width << "x" << height << ", radius " << radius << ", level " << level;
                EXPECT_TRUE(destination.GuardsAreIntact());
            }
            source->BoxBlur(*source, radius);
            EXPECT_EQ(WordsOf(*source), expected) << "in place";
            EXPECT_TRUE(source.GuardsAreIntact());
        }
    }
}

TEST(BoxBlur, TreatsTheBytesOfAYUVAlike) {
    CFramed<CImageAYUV> source(19, 12), destination(19, 12);
    source.Fill(5);
    source->BoxBlur(*destination, 3);
    EXPECT_EQ(WordsOf(*destination), SlowBlur(WordsOf(*source), 19, 3));
}

TEST(BoxBlur, CopiesAtRadiusZeroAndIgnoresNegativeOnes) {
    CFramed<CImageARGB> source(6, 5), destination(6, 5);
    source.Fill(1);
    destination.Fill(2);
    const Words before = WordsOf(*destination);
    for (const int32_t radius : {-1, INT32_MIN}) {
        source->BoxBlur(*destination, radius);
        EXPECT_EQ(WordsOf(*destination), before);
    }
    source->BoxBlur(*destination, 0);
    EXPECT_EQ(WordsOf(*destination), WordsOf(*source));
    EXPECT_TRUE(destination.GuardsAreIntact());
}

// A radius whose windows need more than 32 bits, in an image just high enough for it.
TEST(BoxBlur, HugeWindowsDoNotOverflow) {
    constexpr int32_t kSide = 4120;
    CImageARGB image(kSide, kSide);
    ASSERT_NE(image.GetBuffer(), nullptr);
    image.FillBytes(255);
    image.Row(kSide - 1)[0] = 0;
    for (const int32_t radius : {2059, 1451, kyv::kBoxRadiusMax}) {
        CImageARGB out(kSide, kSide);
        ASSERT_NE(out.GetBuffer(), nullptr);
        image.SetCpuLevel(4);
        image.BoxBlur(out, radius);
        // The middle's window holds the dark byte only where it reaches the corner.
        const int32_t middle = kSide / 2 - 1;
        EXPECT_EQ(out.Row(middle)[middle * 4 + 1], 255);
        EXPECT_EQ(out.Row(middle)[middle * 4], 255);
        EXPECT_EQ(out.Row(kSide - 1)[0], 254);
        EXPECT_EQ(out.Row(kSide - 1)[3], 255);
    }
}

// Every quotient at both sides of its limits, for areas of every size.
TEST(BoxBlur, DividesExactly) {
    constexpr int32_t kAreaMax = (2 * kyv::kBoxRadiusMax + 1) * (2 * kyv::kBoxRadiusMax + 1);
    std::vector<int32_t> areas = {1, 2, 3, 4095, 4096, 4097, 16128, 16129, 16130, 65535, kAreaMax};
    std::mt19937 random(1);
    for (int i = 0; i < 3000; ++i) {
        areas.push_back(static_cast<int32_t>(random() >> (8 + random() % 23)) % kAreaMax + 1);
    }
    for (const auto set : {kyv::InstructionSet::Scalar, kyv::InstructionSet::Sse2,
                           kyv::InstructionSet::Ssse3, kyv::InstructionSet::Avx2}) {
        const kyv::BoxAverageRow form = kyv::kBoxAverage.Exact(set);
        if (!form || set > kyv::ProcessorInstructionSet()) {
            continue;
        }
        for (const int32_t area : areas) {
            // One pixel between the zeros around it, whose four sums are two limits.
            for (uint32_t q = 0; q < 255; q += 1 + random() % 3) {
                uint32_t sums[5 * 4] = {};
                const auto limit = static_cast<uint32_t>(area) * (q + 1);
                const uint32_t totals[4] = {limit - 1, limit, limit + area - 1, limit + area / 2U};
                std::copy_n(totals, 4, sums + 8);
                const float scale = kyv::AverageScale(area);
                uint8_t out[4];
                form(out, sums + 8, 1, {1, &area, &scale});
                ASSERT_THAT(out, testing::ElementsAre(q, q + 1, q + 1, q + 1))
                    << "area " << area << ", set " << static_cast<int>(set);
            }
        }
    }
}

} // namespace
