// Sprites and sampling.
#include <limits>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/TestImages.h"

namespace {

using namespace kyvtest;
using testing::Each;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

// A canvas of 20 x 10 dark half transparent pixels in a frame of guard bytes.
class SpriteOnCanvas : public testing::Test {
protected:
    SpriteOnCanvas() : m_canvas(20, 10) { Clear(); }

    void Clear() {
        m_canvas->FillColor(10, 20, 30);
        m_canvas->SetAlpha(128);
        m_canvas->SetCpuLevel(4);
    }

    void Draw(CImageARGB& sprite, int32_t mode, float x, float y, float w, float h,
              uint8_t opacity = 255) {
        Clear();
        m_canvas->DrawSprite(sprite, mode, x, y, w, h, opacity);
        EXPECT_TRUE(m_canvas.GuardsAreIntact());
    }

    uint32_t At(int32_t x, int32_t y) {
        return WordsOf(*m_canvas)[static_cast<size_t>(y * 20 + x)];
    }

    // How many pixels differ from the empty canvas.
    int Touched() {
        const Words words = WordsOf(*m_canvas);
        return static_cast<int>(std::count_if(words.begin(), words.end(),
                                              [](uint32_t word) { return word != kEmpty; }));
    }

    static constexpr uint32_t kEmpty = 0x800A141E;
    CFramed<CImageARGB> m_canvas;
};

TEST_F(SpriteOnCanvas, WholeInsideEqualsResizeAndBlend) {
    CFramed<CImageARGB> sprite(7, 5);
    sprite.Fill(1);
    const struct {
        int32_t mode;
        void (*blend)(CImageARGB&, const CImageARGB&);
    } modes[] = {{0, [](CImageARGB& d, const CImageARGB& s) { d.AlphaBlend(s, 200); }},
                 {1, [](CImageARGB& d, const CImageARGB& s) { d.AddBlend(s, 200); }},
                 {7, [](CImageARGB& d, const CImageARGB& s) { d.CompositeOver(s, 200); }},
                 {8, [](CImageARGB& d, const CImageARGB& s) {
                      d.CompositeOver(s, 200);
                      d.SetAlpha(255);
                  }}};
    for (const auto& [mode, blend] : modes) {
        Clear();
        CImageARGB scaled(9, 6);
        sprite->Resize(scaled, 0);
        CImageARGB view;
        ASSERT_EQ(m_canvas->GetSubImage(view, 11, 4, 9, 6), 1);
        view.SetCpuLevel(4);
        blend(view, scaled);
        const Words expected = WordsOf(*m_canvas);
        Draw(*sprite, mode, 11.9F, 4.9F, 9.9F, 6.9F, 200); // truncated
        EXPECT_EQ(WordsOf(*m_canvas), expected) << "mode " << mode;
        EXPECT_GT(Touched(), 0);
    }
}

TEST_F(SpriteOnCanvas, UsesTheCanvasLevel) {
    Words words(16, 0xFF000000);
    CImageARGB sprite = View(words, 4);
    for (const int32_t level : {0, 1, 2, 3}) {
        Clear();
        m_canvas->SetCpuLevel(level);
        m_canvas->DrawSprite(sprite, 1, 0, 0, 4, 4, 255);
        // 128 + ((255 * 255) >> 8) saturates; only levels 1 and 2 add alpha.
        EXPECT_EQ(At(0, 0) >> 24, level == 1 || level == 2 ? 255U : 128U) << "level " << level;
    }
}

TEST_F(SpriteOnCanvas, PartlyOutsideShowsThatPartOfTheSprite) {
    // Eight columns of colours 1 to 8, four rows, drawn at double size.
    Words words;
    for (uint32_t i = 0; i < 32; ++i) {
        words.push_back(0xFF000000 | (i % 8 + 1));
    }
    CImageARGB sprite = View(words, 8);
    // -6 / 16 * 8 = 3 columns are cut off; 10 / 16 * 8 = 5 remain and fill 10 pixels.
    Draw(sprite, 7, -6, 1, 16, 8);
    CImageARGB part, scaled(10, 8);
    ASSERT_EQ(sprite.GetSubImage(part, 3, 0, 5, 4), 1);
    part.Resize(scaled, 0);
    for (int32_t x = 0; x < 10; ++x) {
        EXPECT_EQ(At(x, 1), WordsOf(scaled)[static_cast<size_t>(x)]) << x;
    }
    EXPECT_EQ(Touched(), 80);
    // At the right and below the sprite's start shows: 5 / 16 * 8 = 2.5 columns are too few, 6 make
    // 3; 4 / 8 * 4 = 2 rows are too few, 6 make 3.
    Draw(sprite, 7, 14, 4, 16, 8);
    EXPECT_EQ(Touched(), 36);
    EXPECT_EQ(At(14, 4), 0xFF000001U);
    Draw(sprite, 7, 15, 4, 16, 8);
    EXPECT_EQ(Touched(), 0);
    Draw(sprite, 7, 14, 6, 16, 8);
    EXPECT_EQ(Touched(), 0);
}

TEST_F(SpriteOnCanvas, OnePixelOrTwoInsideDrawNothing) {
    Words words(64 * 64, 0xFFFFFFFF);
    CImageARGB sprite = View(words, 64);
    for (const float inside : {1.0F, 2.0F}) {
        for (const int32_t mode : {0, 1, 5, 7, 8}) {
            Draw(sprite, mode, 20 - inside, 0, 6, 6);
            EXPECT_EQ(Touched(), 0);
            Draw(sprite, mode, inside - 6, 0, 6, 6);
            EXPECT_EQ(Touched(), 0);
            Draw(sprite, mode, 0, inside - 6, 6, 6);
            EXPECT_EQ(Touched(), 0);
        }
    }
    Draw(sprite, 7, 17, 0, 6, 6);
    EXPECT_EQ(Touched(), 18);
}

TEST_F(SpriteOnCanvas, WhollyOutsideDrawsNothing) {
    Words words(16, 0xFFFFFFFF);
    CImageARGB sprite = View(words, 4);
    const float places[][2] = {{20, 0}, {-4, 0}, {0, 10}, {0, -4}, {-1e9F, 0}, {0, 3e9F}};
    for (const auto& [x, y] : places) {
        for (const int32_t mode : {0, 1, 5, 7, 8}) {
            Draw(sprite, mode, x, y, 4, 4);
            EXPECT_EQ(Touched(), 0) << x << ", " << y << ", mode " << mode;
        }
    }
}

TEST_F(SpriteOnCanvas, UnknownModesPaintOpaqueRed) {
    Words words(16, 0x00FFFFFF);
    CImageARGB sprite = View(words, 4);
    for (const int32_t mode : {2, 5, 6, 9, -1}) {
        Draw(sprite, mode, 3, 4, 5, 2);
        EXPECT_EQ(Touched(), 10);
        EXPECT_EQ(At(3, 4), 0xFFFF0000U);
        EXPECT_EQ(At(7, 5), 0xFFFF0000U);
        Draw(sprite, mode, 3, 4, 1, 1); // too small to be scaled
        EXPECT_EQ(Touched(), 1);
    }
}

TEST_F(SpriteOnCanvas, HostileArguments) {
    Words words(64, 0xFFFFFFFF);
    CImageARGB sprite = View(words, 8);
    for (const float odd : {kNaN, kInfinity, -kInfinity, 2147483648.0F, -2147483648.0F, -1.0F, 0.0F,
                            1.0F, 1e38F, -1e38F, 1e-40F}) {
        for (const int32_t mode : {0, 1, 7, 8}) {
            Draw(sprite, mode, odd, 1, 5, 5);
            Draw(sprite, mode, 1, odd, 5, 5);
            Draw(sprite, mode, 1, 1, odd, 5);
            Draw(sprite, mode, 1, 1, 5, odd);
            Draw(sprite, mode, odd, odd, odd, odd);
            EXPECT_EQ(Touched(), 0) << odd << ", mode " << mode;
        }
    }
    for (const float size : {0.0F, 1.0F, -3.0F, kNaN}) {
        Draw(sprite, 0, 2, 2, size, 4);
        Draw(sprite, 8, 2, 2, 4, size);
        EXPECT_EQ(Touched(), 0) << size;
    }
    CImageARGB empty, thin(sprite.GetBuffer(), 1, 8, 32);
    for (const int32_t mode : {0, 1, 7, 8}) {
        Draw(empty, mode, 2, 2, 4, 4);
        EXPECT_EQ(Touched(), 0);
        Draw(thin, mode, 2, 2, 4, 4);
        EXPECT_EQ(Touched(), 0);
    }
    CImageARGB().DrawSprite(sprite, 0, 0, 0, 4, 4, 255);
    EXPECT_THAT(words, Each(0xFFFFFFFFU));
}

TEST(SampleBilinear, InterpolatesRoundingDown) {
    // Blue 10, 50 / 200, 40; green 0; red 255, 0 / 0, 255.
    Words words = {0xFFFF000A, 0xFF000032, 0xFF0000C8, 0xFFFF0028};
    CImageARGB image = View(words, 2);
    const auto sample = [&image](int32_t x, int32_t y) {
        uint8_t bgr[4] = {1, 1, 1, 99};
        image.SampleBilinear(x, y, bgr);
        EXPECT_EQ(bgr[3], 99);
        return std::vector<int>(bgr, bgr + 3);
    };
    using testing::ElementsAre;
    EXPECT_THAT(sample(0, 0), ElementsAre(10, 0, 255));
    // A quarter to the right: blue 10 + 10, red 255 - 63.75 down; half way down: blue between 20
    // and 200 - 40, red between 191 and 63.
    EXPECT_THAT(sample(0x4000, 0), ElementsAre(20, 0, 191));
    EXPECT_THAT(sample(0x4000, 0x8000), ElementsAre(90, 0, 127));
    EXPECT_THAT(sample(0xFFFF, 0), ElementsAre(49, 0, 0));
    // The last column is its own right neighbour, and the pixel below serves for both lower ones.
    EXPECT_THAT(sample(0x1C000, 0x8000), ElementsAre(45, 0, 127));
    // In the last row both lower ones are the pixel itself, not its right neighbour: half way
    // right blue is 120 above and 200 below, and a quarter of the way 140.
    EXPECT_THAT(sample(0x8000, 0x10000), ElementsAre(120, 0, 127));
    EXPECT_THAT(sample(0x8000, 0x14000), ElementsAre(140, 0, 95));
    EXPECT_THAT(sample(0x1FFFF, 0x1FFFF), ElementsAre(40, 0, 255));
    uint8_t untouched = 7;
    CImageARGB().SampleBilinear(0, 0, &untouched);
    EXPECT_EQ(untouched, 7);
}

} // namespace
