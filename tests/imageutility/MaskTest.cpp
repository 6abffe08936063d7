// Operations on byte images, and relief.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;
using testing::Each;
using testing::ElementsAre;

// Columns 0..2 at 20 and 3..5 at 30: a step edge of height 10 between two columns.
std::vector<uint8_t> MarksOfAStep(int32_t threshold, bool upright) {
    std::vector<uint8_t> bytes;
    for (int y = 0; y < 6; ++y) {
        for (int x = 0; x < 6; ++x) {
            bytes.push_back((upright ? x : y) < 3 ? 20 : 30);
        }
    }
    std::vector<uint8_t> marks(36, 99);
    CImageByte out = View(marks, 6);
    View(bytes, 6).EdgeMask(out, threshold, 7);
    return marks;
}

TEST(EdgeMask, MarksBothSidesOfAStep) {
    // 3 * 10 = 30, and 30 * 30 > 100 * t up to t = 8.
    for (const bool upright : {true, false}) {
        const std::vector<uint8_t> marks = MarksOfAStep(8, upright);
        for (int y = 0; y < 6; ++y) {
            for (int x = 0; x < 6; ++x) {
                const int across = upright ? x : y;
                const int along = upright ? y : x;
                const bool marked = (across == 2 || across == 3) && along >= 1 && along <= 4;
                EXPECT_EQ(marks[static_cast<size_t>(y * 6 + x)], marked ? 7 : 0) << x << ", " << y;
            }
        }
        EXPECT_THAT(MarksOfAStep(9, upright), Each(0));
    }
    EXPECT_THAT(MarksOfAStep(INT32_MAX, true), Each(0));
}

TEST(EdgeMask, NeedsPackedRowsAndAThreshold) {
    EXPECT_THAT(MarksOfAStep(0, true), Each(99));
    EXPECT_THAT(MarksOfAStep(INT32_MIN, true), Each(99));
    std::vector<uint8_t> bytes(36, 5);
    std::vector<uint8_t> marks(36, 99);
    CImageByte padded(marks.data(), 5, 6, 6);
    CImageByte(bytes.data(), 5, 6, 5).EdgeMask(padded, 1, 7);
    CImageByte packed(marks.data(), 5, 6, 5);
    CImageByte(bytes.data(), 5, 6, 6).EdgeMask(packed, 1, 7);
    EXPECT_THAT(marks, Each(99));
    // Less than three pixels a side have no inner one, but the destination is cleared.
    CImageByte narrow(marks.data(), 2, 5, 2);
    CImageByte(bytes.data(), 2, 5, 2).EdgeMask(narrow, 1, 7);
    EXPECT_THAT(BytesOf(narrow), Each(0));
    EXPECT_EQ(marks[10], 99);
}

TEST(ByteImages, LiftAndSubtractSaturate) {
    std::vector<uint8_t> bytes = {0, 99, 100, 200, 255};
    View(bytes, 5).LiftAbove(100, 60);
    EXPECT_THAT(bytes, ElementsAre(0, 99, 160, 255, 255));
    std::vector<uint8_t> other = {1, 99, 50, 0, 255};
    View(bytes, 5).Subtract(View(other, 5));
    EXPECT_THAT(bytes, ElementsAre(0, 0, 110, 255, 0));
    View(bytes, 5).Subtract(CImageByte());
    EXPECT_THAT(bytes, ElementsAre(0, 0, 110, 255, 0));
}

TEST(Relief, IsTheDifferenceOfOppositeNeighbours) {
    // Lumas: black 16, white 235. One row: 16 16 235 235.
    Words words = {0, 0, 0xFFFFFFFF, 0xFFFFFFFF};
    std::vector<uint8_t> bytes(4);
    CImageByte out = View(bytes, 4);
    View(words, 4).Relief(out, 0);
    EXPECT_THAT(bytes, ElementsAre(128, 255, 255, 128)); // 128 + 219 is clamped
    View(words, 4).Relief(out, 4);
    EXPECT_THAT(bytes, ElementsAre(128, 0, 0, 128));
    View(words, 4).Relief(out, 2); // one row is its own neighbour above and below
    EXPECT_THAT(bytes, Each(128));
    // A diagonal: grey 100 has luma (3518 * 100 + 0x10800) >> 12 = 102.
    words = {0, 0, 0, 0xFF646464};
    CImageByte square(bytes.data(), 2, 2, 2);
    View(words, 2).Relief(square, 1);
    EXPECT_THAT(bytes, ElementsAre(214, 214, 214, 214));
    bytes.assign(4, 9);
    View(words, 2).Relief(square, 8);
    View(words, 2).Relief(square, -1);
    EXPECT_THAT(bytes, Each(9));
}

} // namespace
