// Moving channels, filling and keying.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;
using testing::ElementsAre;

TEST(Channels, CopyAlphaFromTouchesAlphaAlone) {
    Words dst = {0x11223344, 0x55667788};
    Words src = {0xAABBCCDD, 0xEEFF0011};
    CImageAYUV ayuv(reinterpret_cast<uint8_t*>(src.data()), 2, 1, 8);
    View(dst, 2).CopyAlphaFrom(ayuv);
    EXPECT_THAT(dst, ElementsAre(0xAA223344U, 0xEE667788U));
    ayuv.CopyAlphaFrom(View(dst, 2));
    EXPECT_THAT(src, ElementsAre(0xAABBCCDDU, 0xEEFF0011U));
    // A byte image has no alpha.
    std::vector<uint8_t> bytes = {1, 2};
    View(dst, 2).CopyAlphaFrom(View(bytes, 2));
    EXPECT_THAT(dst, ElementsAre(0xAA223344U, 0xEE667788U));
}

TEST(Channels, SetAndGetMoveOneByte) {
    for (int32_t channel = 0; channel < 4; ++channel) {
        Words words = {0x11223344, 0x55667788};
        std::vector<uint8_t> bytes = {0xEE, 0xDD};
        View(words, 2).SetChannel(View(bytes, 2), channel);
        const int shift = 8 * channel;
        EXPECT_THAT(words, ElementsAre((0x11223344 & ~(0xFFU << shift)) | 0xEEU << shift,
                                       (0x55667788 & ~(0xFFU << shift)) | 0xDDU << shift));
        words = {0x11223344, 0x55667788};
        CImageByte out = View(bytes, 2);
        View(words, 2).GetChannel(out, channel);
        EXPECT_THAT(bytes, ElementsAre(0x11223344 >> shift & 255, 0x55667788 >> shift & 255));
    }
    for (const int32_t channel : {-1, 4}) {
        Words words = {0x11223344};
        std::vector<uint8_t> bytes = {0xEE};
        CImageByte out = View(bytes, 1);
        View(words, 1).GetChannel(out, channel);
        View(words, 1).SetChannel(out, channel);
        EXPECT_THAT(words, ElementsAre(0x11223344U));
        EXPECT_THAT(bytes, ElementsAre(0xEE));
    }
}

// The destination's size counts, and a source that is smaller is not read beyond its end.
TEST(Channels, SizesMayDiffer) {
    Words dst(6, 0);
    Words large(12, 0x77000000);
    View(dst, 3).CopyAlphaFrom(View(large, 4));
    EXPECT_THAT(dst, testing::Each(0x77000000U));
    std::vector<uint8_t> small(1, 9);
    View(dst, 3).SetChannel(View(small, 1), 0);
    EXPECT_THAT(dst, ElementsAre(0x77000009U, 0x77000000U, 0x77000000U, 0x77000000U, 0x77000000U,
                                 0x77000000U));
    CImageByte empty;
    View(dst, 3).GetChannel(empty, 0);
}

TEST(Channels, FillsTouchTheirBytesAlone) {
    Words words = {0x11223344, 0x55667788, 0x99AABBCC};
    View(words, 3).FillColor(1, 2, 3);
    EXPECT_THAT(words, ElementsAre(0x11010203U, 0x55010203U, 0x99010203U));
    View(words, 3).SetAlpha(0xFE);
    EXPECT_THAT(words, ElementsAre(0xFE010203U, 0xFE010203U, 0xFE010203U));
}

TEST(Channels, KeyedFillMeasuresTheLargestDifference) {
    Words words = {0x11646464, 0x226E646E, 0x33646F64, 0x445A5A5A, 0x55595A5A};
    View(words, 5).FillColorKeyed(100, 100, 100, 10, 0xAB, 0xCD, 0xEF);
    EXPECT_THAT(words,
                ElementsAre(0x11ABCDEFU, 0x22ABCDEFU, 0x33646F64U, 0x44ABCDEFU, 0x55595A5AU));
}

} // namespace
