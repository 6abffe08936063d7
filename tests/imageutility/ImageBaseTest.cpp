// Ownership, views and copies of the image classes.
#include <cstring>
#include <limits>
#include <new>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/Status.h"
#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;
using testing::ElementsAre;

constexpr int32_t kHuge = std::numeric_limits<int32_t>::max();

TEST(ImageBase, ConstructorsGiveSizePitchAndLevel) {
    const CImageBase empty;
    EXPECT_EQ(empty.GetBuffer(), nullptr);
    EXPECT_EQ(empty.GetPixelCount(), 0);
    EXPECT_EQ(empty.GetCpuLevel(), 1);
    EXPECT_EQ(empty.GetDecodeOption(), 0);
    EXPECT_EQ(empty.GetPixelAddress(3, 4), nullptr);

    uint8_t pixels[64] = {};
    const CImageBase view(pixels, 3, 2, 20, 4);
    EXPECT_EQ(view.GetBuffer(), pixels);
    EXPECT_EQ(view.GetPixelCount(), 6);
    EXPECT_EQ(view.GetPixelAddress(2, 1), pixels + 28);

    uint32_t result = 1;
    const CImageBase padded(3, 2, 20, 4, &result);
    EXPECT_EQ(result, kyv::kOk);
    EXPECT_NE(padded.GetBuffer(), nullptr);
    EXPECT_EQ(padded.GetPitch(), 20);

    EXPECT_EQ(CImageARGB(7, 2).GetPitch(), 28);
    EXPECT_EQ(CImageAYUV(7, 2).GetPitch(), 28);
    EXPECT_EQ(CImageByte(7, 2).GetPitch(), 7);
}

TEST(ImageBase, SizesThatCannotBeAllocatedLeaveANullBuffer) {
    for (const auto& [pitch, height] : {std::pair{kHuge, 2}, {-4, 3}, {4, -3}, {kHuge, kHuge}}) {
        uint32_t result = 0;
        const CImageBase image(1, height, pitch, 4, &result);
        EXPECT_EQ(image.GetBuffer(), nullptr);
        EXPECT_EQ(result, kyv::kOutOfMemory);
        EXPECT_EQ(image.GetHeight(), height);
        const CImageBase copy(image, &result); // of an owner without memory
        EXPECT_EQ(copy.GetBuffer(), nullptr);
    }
    EXPECT_EQ(CImageARGB(kHuge / 2, 1).GetBuffer(), nullptr);
    EXPECT_EQ(CImageARGB(-1, 1).GetBuffer(), nullptr);

    CImageARGB image(2, 2);
    EXPECT_THROW(image.Create(kHuge / 2, 1), std::bad_alloc);
    EXPECT_EQ(image.GetBuffer(), nullptr);
    EXPECT_EQ(image.GetPixelCount(), 0);
    image.Create(3, 1);
    EXPECT_EQ(image.GetPixelCount(), 3);
}

TEST(ImageBase, CopyOfAnOwnerIsDeepAndOfAViewIsAView) {
    CImageBase owner(2, 2, 12, 4); // with padding, which is copied too
    std::memset(owner.GetBuffer(), 7, 24);
    owner.SetCpuLevel(5);
    owner.SetDecodeOption(9);
    uint32_t result = 1;
    const CImageBase copy(owner, &result);
    EXPECT_EQ(result, kyv::kOk);
    EXPECT_EQ(copy.GetCpuLevel(), 1);
    EXPECT_EQ(copy.GetDecodeOption(), 0);
    owner.FillBytes(8);
    EXPECT_EQ(std::vector<uint8_t>(copy.GetBuffer(), copy.GetBuffer() + 24),
              std::vector<uint8_t>(24, 7));

    Words words = {1, 2};
    const CImageARGB view = View(words, 2);
    const CImageARGB again(view);
    *again.GetPixelAddress(1, 0) = 9; // writes the host's frame
    EXPECT_THAT(words, ElementsAre(1, 9));
}

TEST(ImageBase, CreateAndAttachReleaseWhatWasOwned) {
    Words words = {1, 2, 3, 4};
    auto* pixels = reinterpret_cast<uint8_t*>(words.data());
    CImageAYUV image(5, 5);
    image.Attach(pixels, 1, 2, 8);
    EXPECT_EQ(image.GetPixelAddress(0, 1), pixels + 8);
    image.Create(3, 2); // the view's memory stays
    EXPECT_EQ(image.GetPitch(), 12);
    image.FillBytes(0);
    EXPECT_THAT(words, ElementsAre(1, 2, 3, 4));
}

TEST(ImageBase, CopyFromStepsEachSideByItsPitch) {
    CFramed<CImageARGB> from(5, 3, 2), to(5, 3, 1);
    from.Fill(1);
    to->CopyFrom(*from);
    EXPECT_EQ(WordsOf(*to), WordsOf(*from));
    EXPECT_TRUE(to.GuardsAreIntact());

    CFramed<CImageARGB> turned(3, 5); // as many bytes, but another shape
    turned.Fill(2);
    const Words before = WordsOf(*turned);
    turned->CopyFrom(*from);
    turned->CopyFrom(CImageARGB());
    EXPECT_EQ(WordsOf(*turned), before);
    EXPECT_TRUE(CImageARGB(4, 2).IsSameSize(CImageByte(4, 2)));
    EXPECT_FALSE(CImageARGB(4, 2).IsSameSize(CImageARGB(2, 4)));
}

TEST(ImageBase, FillBytesSetsThePaddingToo) {
    uint8_t bytes[16] = {};
    CImageByte(bytes, 2, 3, 5).FillBytes(6);
    EXPECT_EQ(std::count(bytes, bytes + 15, 6), 15);
    EXPECT_EQ(bytes[15], 0);
}

TEST(ImageBase, SubImagesAreClippedAndOneThatMissesIsTheWhole) {
    struct Case {
        int32_t x, y, w, h;
        int32_t result, left, top, width, height;
    };
    // Of an image of 10 x 6.
    const Case cases[] = {
        {2, 1, 3, 4, 1, 2, 1, 3, 4},
        {-2, -3, 5, 5, 1, 0, 0, 3, 2},
        {8, 4, 5, 5, 1, 8, 4, 2, 2},
        {-5, -5, 100, 100, 1, 0, 0, 10, 6},
        {9, 5, kHuge, kHuge, 1, 9, 5, 1, 1},
        {10, 0, 1, 1, 0, 0, 0, 10, 6},
        {0, 6, 1, 1, 0, 0, 0, 10, 6},
        {-3, 0, 3, 1, 0, 0, 0, 10, 6},
        {0, -3, 1, 3, 0, 0, 0, 10, 6},
        {5, 2, -1, -1, 1, 5, 2, 0, 0}, // never a negative size
        {-kHuge, -kHuge, -5, -5, 0, 0, 0, 10, 6},
    };
    CImageByte image(10, 6);
    for (const Case& c : cases) {
        CImageByte view;
        view.SetCpuLevel(3);
        EXPECT_EQ(image.GetSubImage(view, c.x, c.y, c.w, c.h), c.result);
        EXPECT_EQ(view.GetBuffer(), image.GetBuffer() + c.top * 10 + c.left)
            << c.x << "," << c.y << " " << c.w << "x" << c.h;
        EXPECT_EQ(view.GetWidth(), c.width);
        EXPECT_EQ(view.GetHeight(), c.height);
        EXPECT_EQ(view.GetPitch(), 10);
        EXPECT_EQ(view.GetCpuLevel(), 3);
    }
    uint8_t pixel = 0;
    CImageByte untouched(&pixel, 1, 1, 1);
    EXPECT_EQ(CImageByte().GetSubImage(untouched, 0, 0, 1, 1), 0);
    EXPECT_EQ(untouched.GetBuffer(), &pixel);
}

} // namespace
