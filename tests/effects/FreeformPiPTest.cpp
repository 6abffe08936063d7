// The quad mapping: its maps and its renderers.
#include <algorithm>
#include <cmath>
#include <cstring>
#include <random>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "effects/pip/FreeformPiP.h"
#include "effects/pip/SpanWalk.h"

namespace {

using namespace kyv;
using KYVImageUtility::CImageARGB;
using Pixels = std::vector<uint32_t>;

constexpr int kModes[] = {0, 1, 2, 3, 4};

// Word images with a level.
CImageARGB View(Pixels& pixels, int width, int32_t level = 0) {
    CImageARGB view(reinterpret_cast<uint8_t*>(pixels.data()), width,
                    static_cast<int32_t>(pixels.size()) / width, width * 4);
    view.SetCpuLevel(level);
    return view;
}

Pixels RandomPixels(size_t count, uint32_t seed) {
    std::mt19937 random(seed);
    Pixels pixels(count);
    for (uint32_t& pixel : pixels) {
        pixel = static_cast<uint32_t>(random());
    }
    return pixels;
}

struct Scene {
    int width, height; // of the frame
    int sourceWidth, sourceHeight;
    RasterPoint quad[4];
    int model = 1, mode = 2, filter = 4;
};

void Apply(const Scene& scene, CFreeformPiP& pip) {
    const RasterPoint corners[4] = {{0, 0},
                                    {scene.sourceWidth, 0},
                                    {scene.sourceWidth, scene.sourceHeight},
                                    {0, scene.sourceHeight}};
    pip.SetSize(scene.sourceWidth, scene.sourceHeight, scene.width, scene.height);
    EXPECT_EQ(pip.SetSourcePoints(corners, 4), 1);
    EXPECT_EQ(pip.SetDestPoints(scene.quad, 4), 1);
    pip.SetQuadModel(scene.model);
    pip.SetMapMode(scene.mode);
    pip.SetFilterIndex(scene.filter);
}

Pixels Draw(const Scene& scene, Pixels& source, int32_t level, uint32_t background = 0x11223344) {
    CFreeformPiP pip;
    Apply(scene, pip);
    Pixels frame(static_cast<size_t>(scene.width) * static_cast<size_t>(scene.height), background);
    CImageARGB destination = View(frame, scene.width, level);
    EXPECT_EQ(pip.Render(View(source, scene.sourceWidth), destination), 1);
    return frame;
}

// The same by rows, first with the map to build and then with it built.
Pixels DrawRows(const Scene& scene, Pixels& source, int32_t level, uint32_t background) {
    CFreeformPiP pip;
    Apply(scene, pip);
    Pixels frame;
    for (int i = 0; i < 2; ++i) {
        frame.assign(static_cast<size_t>(scene.width) * static_cast<size_t>(scene.height),
                     background);
        EXPECT_TRUE(pip.BeginRows(View(source, scene.sourceWidth, level)));
        for (int y = 0; y < scene.height; ++y) {
            auto* row = frame.data() + static_cast<ptrdiff_t>(y) * scene.width;
            pip.DrawRow(y, reinterpret_cast<uint8_t*>(row));
        }
        EXPECT_EQ(pip.IsDirty(), i == 0);
        pip.EndRows();
    }
    return frame;
}

TEST(FreeformPiP, RectangleMapsTheWholePicture) {
    // Two source pixels a pixel, and parts of 1/256 and 1/128 that a double holds exactly. The last
    // column and row, at s or t of 1, have no neighbour in the picture.
    Scene scene = {640, 480, 512, 256, {{160, 120}, {416, 120}, {416, 248}, {160, 248}}};
    Pixels source = RandomPixels(512 * 256, 1);
    const Pixels frame = Draw(scene, source, 0);
    for (int y = 0; y < 480; ++y) {
        for (int x = 0; x < 640; ++x) {
            const bool inside = x >= 160 && x < 416 && y >= 120 && y < 248;
            const uint32_t expected =
                inside
                    ? source[static_cast<size_t>((y - 120) * 2 * 512 + (x - 160) * 2)] | 0xFF000000
                    : 0x11223344;
            ASSERT_EQ(frame[static_cast<size_t>(y * 640 + x)], expected) << x << ',' << y;
        }
    }
    // Nearest has all of it, both ends included: 0.999 of the size is in the last column.
    scene.mode = 0;
    const Pixels nearest = Draw(scene, source, 0);
    EXPECT_EQ(nearest[248 * 640 + 416], (source[255 * 512 + 511] & 0xFFFFFF) | 0x11000000);
    EXPECT_EQ(nearest[248 * 640 + 417], 0x11223344U);
}

TEST(FreeformPiP, MapIsTheInverseOfTheBilinearImage) {
    // Convex quads of both orientations, with parallel and with nearly parallel sides.
    const RasterPoint quads[][4] = {
        {{10, 10}, {90, 10}, {90, 70}, {10, 70}}, {{90, 10}, {10, 10}, {10, 70}, {90, 70}},
        {{5, 20}, {80, 2}, {95, 75}, {20, 60}},   {{20, 60}, {95, 75}, {80, 2}, {5, 20}},
        {{10, 10}, {90, 11}, {90, 70}, {10, 70}}, {{30, 5}, {70, 5}, {95, 75}, {2, 75}},
        {{10, 10}, {90, 10}, {91, 70}, {10, 70}}, {{95, 40}, {50, 75}, {3, 40}, {50, 3}},
        {{70, 75}, {30, 75}, {2, 5}, {95, 5}},
    };
    for (const auto& quad : quads) {
        for (const int model : {1, 0}) {
            Scene scene = {100, 80, 800, 600, {}, model};
            std::copy(quad, quad + 4, scene.quad);
            CFreeformPiP pip;
            Apply(scene, pip);
            Pixels source(800 * 600), frame(100 * 80, 0);
            CImageARGB destination = View(frame, 100);
            ASSERT_EQ(pip.Render(View(source, 800), destination), 1);
            int checked = 0;
            for (int y = 0; y < 80; ++y) {
                for (int x = 0; x < 100; ++x) {
                    const uint32_t entry = pip.SourceMap()[y * 100 + x];
                    // Pixels that were drawn, away from the clamped sides.
                    const double u = (entry & 0xFFFF) / 64.0;
                    const double v = (entry >> 16) / 64.0;
                    if (frame[static_cast<size_t>(y * 100 + x)] == 0 || u < 1 || v < 1 || u > 795 ||
                        v > 595) {
                        continue;
                    }
                    ++checked;
                    if (model != 1) {
                        // Its rows are not straight lines; that it is inside is enough here, with
                        // what the next test has.
                        continue;
                    }
                    const double s = u / 800, t = v / 600;
                    const auto image = [&](int RasterPoint::*axis) {
                        return quad[0].*axis * (1 - s) * (1 - t) + quad[1].*axis * s * (1 - t) +
                               quad[2].*axis * s * t + quad[3].*axis * (1 - s) * t;
                    };
                    EXPECT_NEAR(image(&RasterPoint::x), x, 0.01);
                    EXPECT_NEAR(image(&RasterPoint::y), y, 0.01);
                }
            }
            EXPECT_GT(checked, 1000);
        }
    }
}

TEST(FreeformPiP, WachspressIsExactForParallelogramsAndMarksTheOutside) {
    // Area coordinates of a rectangle are bilinear: u = 8 (x - 10) + 0.5, and so on.
    CQuadModel model;
    model.Set({{10, 10}, {90, 10}, {90, 70}, {10, 70}}, {{0, 0}, {640, 0}, {640, 480}, {0, 480}});
    for (int y = 11; y < 70; y += 7) {
        for (int x = 11; x < 90; x += 3) {
            const QuadPoint p = model.WachspressPoint(x, y);
            ASSERT_TRUE(p.inside);
            EXPECT_NEAR(p.u, 8.0 * (x - 10) + 0.5, 1e-9);
            EXPECT_NEAR(p.v, 8.0 * (y - 10) + 0.5, 1e-9);
        }
    }
    for (const auto& [x, y] : {std::pair(10, 30), {90, 70}, {5, 30}, {50, 75}, {95, 75}}) {
        const QuadPoint p = model.WachspressPoint(x, y);
        EXPECT_FALSE(p.inside);
        EXPECT_EQ(MapEntry(p.u, p.v), (1023U << 22 | 1023U << 6)) << x << ',' << y;
    }
}

TEST(FreeformPiP, LargePicturesWrapAfter1024Columns) {
    Scene scene = {2048, 8, 2048, 8, {{0, 0}, {2048, 0}, {2048, 8}, {0, 8}}};
    Pixels source = RandomPixels(2048 * 8, 2);
    const Pixels frame = Draw(scene, source, 0);
    EXPECT_EQ(frame[1023], source[1023] | 0xFF000000);
    EXPECT_EQ(frame[1024], source[0] | 0xFF000000);
    EXPECT_EQ(frame[2000], source[2000 - 1024] | 0xFF000000);
    EXPECT_EQ(DrawRows(scene, source, 5, 0x11223344), frame);
}

// Reads one channel of a drawn pixel from its map entries.
int SlowSample(const Pixels& source, int width, int height, uint32_t entry, int mode, int shift) {
    const int x = entry >> 6 & 1023, y = static_cast<int>(entry >> 22);
    const auto at = [&](int px, int py) {
        return static_cast<int>(source[static_cast<size_t>(py * width + px)] >> shift & 255);
    };
    if (mode < 2) {
        return x > width || y > height || y * width + x >= width * height ? -1 : at(x, y);
    }
    if (x + 1 >= width || y + 1 >= height) {
        return -1;
    }
    const double scale = mode == 2 ? 128 : 64;
    const double fu = (entry & 63) / scale, fv = (entry >> 16 & 63) / scale;
    if (mode == 2) {
        const double top = at(x, y) + std::floor(fu * (at(x + 1, y) - at(x, y)));
        const double bottom = at(x, y + 1) + std::floor(fu * (at(x + 1, y + 1) - at(x, y + 1)));
        return static_cast<int>(top + std::floor(fv * (bottom - top)));
    }
    const double top = at(x, y) * (1 - fu) + at(x + 1, y) * fu;
    const double bottom = at(x, y + 1) * (1 - fu) + at(x + 1, y + 1) * fu;
    // The vertical step is rounded down to 1/64.
    return static_cast<int>(std::floor(top + std::floor((bottom - top) * fv * 64) / 64));
}

TEST(FreeformPiP, RenderersReadThroughTheMap) {
    constexpr int kTent[9] = {1, 2, 1, 2, 4, 2, 1, 2, 1};
    for (const int mode : {0, 1, 2, 3}) {
        for (const int model : {1, 0}) {
            const Scene scene = {60, 40, 37, 23, {{5, 3}, {50, 8}, {57, 37}, {2, 30}}, model, mode};
            CFreeformPiP pip;
            Apply(scene, pip);
            Pixels source = RandomPixels(37 * 23, 3);
            Pixels frame(60 * 40, 0x11223344), marked(60 * 40, 0);
            CImageARGB destination = View(frame, 60);
            ASSERT_EQ(pip.Render(View(source, 37), destination), 1);
            const int entries = mode % 2 ? 9 : 1;
            CWindowWalk({0, 0, 60, 40}).ClampQuad(scene.quad, [&](int y, int first, int last) {
                std::fill(&marked[y * 60 + first], &marked[y * 60 + last] + 1, 1);
            });
            for (size_t i = 0; i < frame.size(); ++i) {
                uint32_t expected = 0x11223344;
                const uint32_t* map = pip.SourceMap() + i * static_cast<size_t>(entries);
                for (int shift = 0; marked[i] && shift < 24; shift += 8) {
                    int value = 0;
                    for (int k = 0; k < entries; ++k) {
                        const int sample = SlowSample(source, 37, 23, map[k], mode, shift);
                        value = entries == 1 ? sample : value + std::max(sample, 0) * kTent[k];
                    }
                    if (value >= 0) {
                        expected &= ~(0xFFU << shift);
                        expected |= static_cast<uint32_t>(entries == 1 ? value : value / 16)
                                    << shift;
                        expected |= mode == 2 ? 0xFF000000U : 0;
                    }
                }
                ASSERT_EQ(frame[i], expected) << "mode " << mode << " pixel " << i;
            }
        }
    }
}

TEST(FreeformPiP, FilteredModeReducesAndKeepsFlatAreas) {
    for (int filter = 0; filter < 5; ++filter) {
        Scene scene = {40, 30, 160, 120, {{2, 2}, {38, 2}, {38, 28}, {2, 28}}, 1, 4, filter};
        Pixels flat(160 * 120, 0x00204080);
        const Pixels frame = Draw(scene, flat, 0);
        EXPECT_EQ(frame[15 * 40 + 20], 0xFF204080) << filter;
        EXPECT_EQ(frame[0], 0x11223344U);
    }
    // Fine stripes of 0 and 254 come out grey where the picture is reduced by 4 with a wide kernel.
    Scene scene = {40, 30, 160, 120, {{0, 0}, {40, 0}, {40, 30}, {0, 30}}, 1, 4, 2};
    Pixels stripes(160 * 120);
    for (size_t i = 0; i < stripes.size(); ++i) {
        stripes[i] = i % 2 ? 0x00FEFEFE : 0;
    }
    EXPECT_EQ(Draw(scene, stripes, 5)[15 * 40 + 20], 0xFF7F7F7FU);
}

TEST(FreeformPiP, RowsOfEveryLevelAreThoseOfTheWholeImage) {
    std::mt19937 random(4);
    for (int i = 0; i < 120; ++i) {
        const auto size = [&](int most) { return 1 + static_cast<int>(random() % most); };
        Scene scene = {size(70), size(50), size(90), size(60), {}};
        const int reach = i % 10 == 0 ? kFarthestPoint : 200;
        for (RasterPoint& corner : scene.quad) {
            const auto coordinate = [&](int length) {
                return i % 3
                           ? static_cast<int>(random() % static_cast<unsigned>(length + 1))
                           : static_cast<int>(random() % static_cast<unsigned>(reach)) - reach / 2;
            };
            corner = {coordinate(scene.width), coordinate(scene.height)};
        }
        Pixels source = RandomPixels(static_cast<size_t>(scene.sourceWidth) *
                                         static_cast<size_t>(scene.sourceHeight),
                                     static_cast<uint32_t>(i));
        for (const int mode : kModes) {
            scene.mode = mode;
            scene.model = static_cast<int>(random() % 2);
            scene.filter = static_cast<int>(random() % 5);
            const Pixels expected = Draw(scene, source, 0);
            for (const int level : {0, 3, 4, 5}) {
                ASSERT_EQ(DrawRows(scene, source, level, 0x11223344), expected)
                    << "case " << i << " mode " << mode << " level " << level;
            }
        }
    }
}

TEST(FreeformPiP, OnlyChangesRebuildTheMap) {
    for (const int level : {0, 5}) {
        Scene scene = {40, 30, 40, 30, {{5, 5}, {30, 6}, {33, 25}, {4, 24}}};
        CFreeformPiP pip;
        EXPECT_EQ(pip.SourceMap(), nullptr);
        Pixels source = RandomPixels(40 * 30, 5), frame(40 * 30);
        CImageARGB destination = View(frame, 40, level);
        const CImageARGB picture = View(source, 40);
        EXPECT_EQ(pip.Render(picture, destination), 0); // no size yet
        Apply(scene, pip);
        EXPECT_TRUE(pip.IsDirty());
        ASSERT_EQ(pip.Render(picture, destination), 1);
        EXPECT_FALSE(pip.IsDirty());

        const RasterPoint corners[4] = {{0, 0}, {40, 0}, {40, 30}, {0, 30}};
        pip.SetSize(40, 30, 40, 30);
        pip.SetSourcePoints(corners, 4);
        pip.SetDestPoints(scene.quad, 4);
        pip.SetOption(7);
        EXPECT_EQ(pip.GetOption(), 7);
        EXPECT_FALSE(pip.IsDirty());
        EXPECT_EQ(pip.SetDestPoints(corners, 5), 0);
        EXPECT_EQ(pip.SetSourcePoints(corners, 5), 0);
        EXPECT_EQ(pip.SetDestPoints(corners, -1), 0);
        EXPECT_EQ(pip.SetDestPoints(nullptr, 4), 0);
        EXPECT_FALSE(pip.IsDirty());

        const auto makesDirty = [&](auto change) {
            change();
            EXPECT_TRUE(pip.IsDirty());
            EXPECT_EQ(pip.Render(picture, destination), 1);
            EXPECT_FALSE(pip.IsDirty());
        };
        makesDirty([&] { pip.SetQuadModel(1); });
        makesDirty([&] { pip.SetMapMode(2); });
        makesDirty([&] { pip.SetFilterIndex(9); });
        makesDirty([&] { pip.SetDestPoints(corners, 2); });
        makesDirty([&] { pip.SetSourcePoints(scene.quad, 1); });
        EXPECT_NE(pip.SourceMap(), nullptr);
        makesDirty([&] { pip.SetMapMode(4); });
        EXPECT_EQ(pip.SourceMap(), nullptr);
        makesDirty([&] { pip.SetMapMode(2); });
        EXPECT_NE(pip.SourceMap(), nullptr);
    }
}

TEST(FreeformPiP, AnotherSizeIsAnotherMapAndTheWrongImagesDrawNothing) {
    for (const int level : {0, 5}) {
        CFreeformPiP pip;
        Pixels source = RandomPixels(40 * 30, 5), frame(40 * 30);
        CImageARGB destination = View(frame, 40, level);
        const CImageARGB picture = View(source, 40, level);
        Apply({40, 30, 40, 30, {{5, 5}, {30, 6}, {33, 25}, {4, 24}}}, pip);
        ASSERT_EQ(pip.Render(picture, destination), 1);
        pip.SetSize(40, 30, 20, 60);
        EXPECT_TRUE(pip.IsDirty());
        EXPECT_EQ(pip.Render(picture, destination), 0);
        CImageARGB tall = View(frame, 20, level);
        EXPECT_EQ(pip.Render(tall, tall), 0);
        EXPECT_EQ(pip.Render(CImageARGB(), tall), 0);
        EXPECT_EQ(pip.Render(picture, tall), 1);
        pip.SetSize(40, 30, 0, 60);
        EXPECT_EQ(pip.Render(picture, tall), 0);
        pip.SetSize(40, 30, 20, 60);
        pip.SetMapMode(5);
        const Pixels before = frame;
        EXPECT_EQ(pip.Render(picture, tall), 1);
        EXPECT_EQ(frame, before);
    }
}

TEST(FreeformPiP, CheckerboardShowsTheMap) {
    Scene scene = {128, 96, 128, 96, {{0, 0}, {128, 0}, {128, 96}, {0, 96}}};
    for (const int level : {0, 5}) {
        CFreeformPiP pip;
        Apply(scene, pip);
        Pixels frame(128 * 96, 0x44000000);
        CImageARGB destination = View(frame, 128, level);
        EXPECT_EQ(pip.RenderCheckerboard(destination), 1);
        for (const auto& [x, y] : {std::pair(0, 0), {31, 31}, {32, 31}, {32, 32}, {96, 0}}) {
            EXPECT_EQ(frame[static_cast<size_t>(y * 128 + x)],
                      (x / 32 + y / 32) % 2 ? 0x44000000 : 0x44FFFFFF);
        }
        pip.SetMapMode(1);
        EXPECT_EQ(pip.RenderCheckerboard(destination), 0);
    }
}

TEST(FreeformPiP, TheLastOneConstructedIsCurrent) {
    CFreeformPiP first;
    EXPECT_EQ(CFreeformPiP::Current(), &first);
    {
        CFreeformPiP second;
        EXPECT_EQ(CFreeformPiP::Current(), &second);
    }
    EXPECT_EQ(CFreeformPiP::Current(), nullptr);
    Scene scene = {10, 10, 10, 10, {{0, 0}, {9, 0}, {9, 9}, {0, 9}}};
    Apply(scene, first);
    Pixels source = RandomPixels(100, 6), frame(100);
    CImageARGB destination = View(frame, 10);
    EXPECT_EQ(first.Render(View(source, 10), destination), 1);
    EXPECT_EQ(CFreeformPiP::Current(), &first);
    // The callback stays, and finds nothing to draw on.
    const Pixels before = frame;
    CRasterizer::PlotPixel(3, 3);
    EXPECT_EQ(frame, before);
}

} // namespace
