// Box blur against the rule written out pixel by pixel.
#include <limits>

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

// Every quotient at both sides of its limits: one pixel between zeros, whose four sums are chosen.
template <class Sum, class Function>
void ExpectExactDivision(const kyv::KernelTable<Function>& table, kyv::InstructionSet set,
                         int32_t columns, int32_t rows) {
    const Function form = table.Exact(set);
    if (!form || set > kyv::ProcessorInstructionSet()) {
        return;
    }
    const auto area = static_cast<uint32_t>(columns * rows);
    const float reciprocal = 1.0F / static_cast<float>(columns);
    for (uint32_t q = 0; q < 254; ++q) {
        const uint32_t limit = area * (q + 1);
        const uint32_t totals[4] = {limit - 1, limit, limit + area - 1, limit + area / 2};
        if (totals[2] > std::numeric_limits<Sum>::max()) {
            return; // such a sum takes more than one column
        }
        Sum sums[5 * 4] = {};
        std::copy_n(totals, 4, sums + 8);
        uint8_t out[4];
        const uint8_t row[4] = {};
        form(out, sums + 8, row, row, 1, {1, rows, &columns, &reciprocal});
        ASSERT_THAT(out, testing::ElementsAre(q, q + 1, q + 1, q + 1))
            << columns << " x " << rows << ", set " << static_cast<int>(set);
    }
}

TEST(BoxBlur, DividesExactly) {
    std::mt19937 random(1);
    for (const auto set :
         {kyv::InstructionSet::Scalar, kyv::InstructionSet::Sse2, kyv::InstructionSet::Ssse3,
          kyv::InstructionSet::Avx2, kyv::InstructionSet::Avx512, kyv::InstructionSet::Neon}) {
        for (int32_t i = 1; i <= 127; ++i) {
            ExpectExactDivision<uint16_t>(kyv::kBoxBlur16, set, i, 128 - i);
            ExpectExactDivision<uint32_t>(kyv::kBoxBlur32, set, 127, i);
        }
        for (int i = 0; i < 1000; ++i) {
            constexpr int32_t kSideMax = 2 * kyv::kBoxRadiusMax + 1;
            const auto columns = static_cast<int32_t>(random() % kSideMax) + 1;
            ExpectExactDivision<uint32_t>(kyv::kBoxBlur32, set, columns,
                                          i % 8 ? static_cast<int32_t>(random() % kSideMax) + 1
                                                : kSideMax);
        }
    }
}

// The same where whole windows fit, which may divide by another way: sums that all equal a limit.
TEST(BoxBlur, DividesExactlyWhereWholeWindowsFit) {
    CImageARGB image(140, 140), out(140, 140);
    ASSERT_TRUE(image.GetBuffer() && out.GetBuffer());
    for (const int32_t radius : {1, 7, 62, 63, 64, 69}) {
        const int32_t side = 2 * radius + 1;
        for (int32_t value = 0; value < 255; value += 6) {
            // Flat but for one pixel in the middle of the windows, which lacks 1.
            image.FillBytes(static_cast<uint8_t>(value + 1));
            image.Row(70)[70 * 4] = static_cast<uint8_t>(value);
            for (const int32_t level : {0, 3, 4}) {
                image.SetCpuLevel(level);
                image.BoxBlur(out, radius);
                const uint8_t* middle = out.Row(70) + 70 * 4;
                ASSERT_EQ(middle[0], value) << "side " << side << ", level " << level;
                ASSERT_EQ(middle[1], value + 1) << "side " << side << ", level " << level;
            }
        }
    }
}

} // namespace
