// Resizing against the rule written out pixel by pixel.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "imageutility/ResizeSteps.h"
#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;
using testing::Each;
using testing::ElementsAre;

struct Position {
    int64_t lower;
    int32_t fraction;
};

Position PositionOf(int64_t i, int64_t source, int64_t destination) {
    const int64_t p = i * source * 256 / destination;
    Position position = {p >> 8, static_cast<int32_t>(p >> 1 & 127)};
    if (position.lower == source - 1) {
        position = {source - 2, 127};
    }
    return position;
}

int32_t Between(int32_t a, int32_t b, int32_t fraction) {
    return a + (((b - a) * fraction) >> 7);
}

Words SlowBilinear(const Words& words, int32_t srcWidth, int32_t width, int32_t height) {
    const int32_t srcHeight = static_cast<int32_t>(words.size()) / srcWidth;
    Words out;
    for (int32_t y = 0; y < height; ++y) {
        for (int32_t x = 0; x < width; ++x) {
            const Position column = PositionOf(x, srcWidth, width);
            const Position row = PositionOf(y, srcHeight, height);
            uint32_t word = 0;
            for (int shift = 0; shift < 32; shift += 8) {
                const auto at = [&](int64_t dx, int64_t dy) {
                    const int64_t index = (row.lower + dy) * srcWidth + column.lower + dx;
                    return static_cast<int32_t>(words[static_cast<size_t>(index)] >> shift & 255);
                };
                const int32_t top = Between(at(0, 0), at(1, 0), column.fraction);
                const int32_t bottom = Between(at(0, 1), at(1, 1), column.fraction);
                word |= static_cast<uint32_t>(Between(top, bottom, row.fraction)) << shift;
            }
            out.push_back(word);
        }
    }
    return out;
}

Words Resized(Words& words, int32_t srcWidth, int32_t width, int32_t height, int32_t mode,
              int32_t level = 0) {
    Words out(static_cast<size_t>(width) * static_cast<size_t>(height), 0xDEADBEEF);
    CImageARGB source = View(words, srcWidth);
    source.SetCpuLevel(level);
    CImageARGB destination = View(out, width);
    source.Resize(destination, mode);
    return out;
}

Words Noise(size_t count, uint32_t seed) {
    std::mt19937 random(seed);
    Words words(count);
    for (uint32_t& word : words) {
        word = static_cast<uint32_t>(random());
    }
    return words;
}

TEST(ResizeSteps, HoldPositionsOfSidesUpTo32768) {
    const struct {
        int32_t source;
        int32_t destination;
    } cases[] = {{2, 1},      {2, 2},         {2, 7},         {7, 2},       {720, 1080},
                 {1080, 720}, {32768, 32767}, {32767, 32768}, {32768, 129}, {2, 32768}};
    for (const auto& [source, destination] : cases) {
        std::vector<uint32_t> entries(static_cast<size_t>(destination) + 1);
        KYVImageUtility::BuildResizeSteps(entries.data(), source, destination);
        int64_t lower = 0;
        int64_t nearest = 0;
        for (int32_t i = 0; i < destination; ++i) {
            const uint32_t entry = entries[static_cast<size_t>(i)];
            const Position expected = PositionOf(i, source, destination);
            lower += entry >> 16;
            nearest += entry >> 8 & 255;
            ASSERT_EQ(lower, expected.lower) << source << " to " << destination << " at " << i;
            ASSERT_EQ(entry & 255, static_cast<uint32_t>(expected.fraction));
            ASSERT_EQ(nearest, expected.lower + (expected.fraction >= 64 ? 1 : 0));
        }
        // The closing entry leads to the end, as far as one step can.
        EXPECT_EQ(entries.back() & 255, 127U);
        EXPECT_EQ(entries.back() >> 16, std::min<int64_t>(source - 1 - lower, 255));
    }
}

TEST(ResizeSteps, StayBehindWhenTheyShrinkTooFar) {
    std::vector<uint32_t> entries(4);
    KYVImageUtility::BuildResizeSteps(entries.data(), 3000, 3);
    EXPECT_THAT(entries, ElementsAre(0U, 0x00FFFF00U, 0x00FFFF00U, 0x00FFFF7FU));
    Words words = Noise(3000 * 2, 1);
    const Words out = Resized(words, 3000, 3, 2, 0);
    EXPECT_THAT(std::vector<uint32_t>(out.begin(), out.begin() + 3),
                ElementsAre(words[0], words[255], words[510]));
}

TEST(Resize, RoundsDownBothWays) {
    // Fractions 0, 64, then the last position as 127 / 128 of the way. Blue rises, red falls:
    // 255 * 64 >> 7 = 127 and -255 * 64 >> 7 = -128; 255 * 127 >> 7 = 253 and -254.
    Words words = {0x00FF0000, 0x000000FF, 0x00FF0000, 0x000000FF};
    const Words row = Resized(words, 2, 4, 2, 0);
    EXPECT_THAT(row, ElementsAre(0x00FF0000U, 0x007F007FU, 0x000100FDU, 0x000100FDU, 0x00FF0000U,
                                 0x007F007FU, 0x000100FDU, 0x000100FDU));
}

TEST(Resize, BilinearFollowsTheRuleAtEveryLevel) {
    const int32_t sides[] = {2, 3, 5, 8, 17, 33, 64, 100};
    uint32_t seed = 0;
    for (const int32_t srcWidth : sides) {
        for (const int32_t width : sides) {
            const int32_t srcHeight = sides[++seed % 8];
            const int32_t height = sides[seed * 3 / 8 % 8];
            Words words = Noise(static_cast<size_t>(srcWidth) * srcHeight, seed);
            const Words expected = SlowBilinear(words, srcWidth, width, height);
            for (const int32_t level : {0, 3, 4, 5}) {
                ASSERT_EQ(Resized(words, srcWidth, width, height, 0, level), expected)
                    << srcWidth << "x" << srcHeight << " to " << width << "x" << height
                    << ", level " << level;
            }
        }
    }
}

TEST(Resize, RowPickCopiesNearestRowsAndClearsPadding) {
    Words words = {1, 2, 3, 4, 5, 6}; // three rows of two
    Words out(5 * 3, 0xDEADBEEF);
    CImageARGB destination(reinterpret_cast<uint8_t*>(out.data()), 2, 5, 12);
    View(words, 2).Resize(destination, 1);
    // Positions 0, 0.6, 1.2, 1.8, 2.4: the last is past the last row's start.
    EXPECT_THAT(out, ElementsAre(1, 2, 0, 3, 4, 0, 3, 4, 0, 5, 6, 0, 5, 6, 0));
    EXPECT_THAT(Resized(words, 2, 3, 5, 1), Each(0xDEADBEEFU));
}

TEST(Resize, FourTapPassesThroughSamplesAndKeepsLines) {
    Words words = Noise(9 * 7, 3);
    EXPECT_EQ(Resized(words, 9, 9, 7, 2), words);
    Words flat(20, 0x80FF0137);
    EXPECT_THAT(Resized(flat, 5, 13, 11, 2), Each(0x80FF0137U));
    // A line of slope 16 over 12 pixels; doubled, the steps are 8 away from the ends.
    Words line;
    for (int y = 0; y < 4; ++y) {
        for (uint32_t x = 0; x < 12; ++x) {
            line.push_back(x * 16);
        }
    }
    const Words doubled = Resized(line, 12, 24, 4, 2);
    for (uint32_t x = 2; x < 20; ++x) {
        EXPECT_EQ(doubled[x], x * 8) << x;
    }
    // Between 0 and 255 half way, the outer taps equal: -1/16, 9/16, 9/16, -1/16 of 255 more.
    Words edge = {0, 0, 255, 255, 0, 0, 255, 255};
    const Words halves = Resized(edge, 4, 8, 2, 2);
    EXPECT_EQ(halves[3], 128U); // 127.5 rounded up
    EXPECT_EQ(halves[5], 255U); // overshoots by 1/16 and is clamped
    EXPECT_EQ(halves[1], 0U);
}

TEST(Resize, DoesNothingWithLessThanTwoPixelsOrAnUnknownMode) {
    Words words = Noise(12, 1);
    EXPECT_THAT(Resized(words, 12, 4, 4, 0), Each(0xDEADBEEFU)); // one row
    EXPECT_THAT(Resized(words, 1, 4, 4, 0), Each(0xDEADBEEFU));
    for (const int32_t mode : {0, 1, 2}) {
        EXPECT_THAT(Resized(words, 4, 4, 1, mode), Each(0xDEADBEEFU));
        EXPECT_THAT(Resized(words, 4, 1, 4, mode), Each(0xDEADBEEFU));
        CImageARGB empty;
        CImageARGB image = View(words, 4);
        EXPECT_FALSE(empty.TryResize(image, mode));
        EXPECT_FALSE(image.TryResize(empty, mode));
    }
    for (const int32_t mode : {-1, 3, INT32_MAX}) {
        EXPECT_THAT(Resized(words, 4, 4, 4, mode), Each(0xDEADBEEFU));
    }
}

} // namespace
