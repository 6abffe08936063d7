// Pictures from resources and files.
#include "imageutility/Bitmap.h"

#include <gtest/gtest.h>

namespace {

using namespace KYVImageUtility;

TEST(BitmapResource, MasksComeAsGreyPixelsWithAlphaZero) {
    for (const uint16_t id : {140, 113}) {
        CImageARGB image;
        LoadBitmapResource(image, kyv::OwnLibrary(), id);
        ASSERT_NE(image.GetBuffer(), nullptr) << id;
        EXPECT_EQ(image.GetWidth(), 640);
        EXPECT_EQ(image.GetHeight(), 480);
        for (int32_t i = 0; i < image.GetPixelCount(); ++i) {
            ASSERT_EQ(image.GetBuffer()[i * 4 + 3], 0) << id << " pixel " << i;
        }
    }
}

TEST(BitmapResource, PngResourcesHaveTheirSizes) {
    for (const uint16_t id : {141, 142, 143, 145}) {
        CImageARGB image;
        LoadPngResource(image, kyv::OwnLibrary(), "PNG", id);
        ASSERT_NE(image.GetBuffer(), nullptr) << id;
        EXPECT_EQ(image.GetWidth(), id == 145 ? 64 : 200);
        EXPECT_EQ(image.GetHeight(), id == 145 ? 64 : 200);
        EXPECT_EQ(image.GetPitch(), id == 145 ? 256 : 800);
    }
}

} // namespace
