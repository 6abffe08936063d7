// The rasterizer's pixel streams, against hand-made lists and slow forms of the same shapes.
#include <algorithm>
#include <cstdlib>
#include <limits>
#include <random>
#include <set>
#include <tuple>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "effects/pip/Coverage.h"
#include "effects/pip/Rasterizer.h"
#include "effects/pip/SpanRows.h"
#include "effects/pip/SpanWalk.h"

namespace {

using namespace kyv;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

using Stream = std::vector<std::pair<int, int>>;
using Shape = std::set<std::pair<int, int>>;

std::vector<RasterPixel> g_records;

// What a primitive hands to the callback.
template <class Draw>
Stream Emitted(Draw draw) {
    g_records.clear();
    CRasterizer::SetPixelCallback([](const RasterPixel* pixel) { g_records.push_back(*pixel); });
    draw();
    CRasterizer::SetPixelCallback(nullptr);
    Stream stream;
    for (const RasterPixel& pixel : g_records) {
        stream.emplace_back(pixel.x, pixel.y);
    }
    return stream;
}

Shape Positions(const Stream& stream) {
    return {stream.begin(), stream.end()};
}

Stream Triangle(RasterPoint a, RasterPoint b, RasterPoint c) {
    return Emitted([&] { CRasterizer::FillTriangle(&a, &b, &c); });
}

// Rows of columns between two sides, with the vertices sorted and rational numbers truncated the
// long way.
Stream SlowTriangle(const RasterPoint (&v)[3]) {
    std::vector<RasterPoint> sorted(v, v + 3);
    std::stable_sort(sorted.begin(), sorted.end(),
                     [](RasterPoint p, RasterPoint q) { return p.y < q.y; });
    const auto column = [](RasterPoint p, RasterPoint q, int y) {
        if (p.y == q.y) {
            return p.x;
        }
        // p.x + (q.x - p.x) * (y - p.y) / (q.y - p.y), by counting away from zero.
        const long height = q.y - p.y;
        const long target = long{p.x} * height + long{q.x - p.x} * (y - p.y);
        int x = 0;
        while (std::labs(target) >= (std::abs(x) + 1) * height) {
            x += target < 0 ? -1 : 1;
        }
        return x;
    };
    Stream stream;
    for (int y = sorted[0].y; y <= sorted[2].y; ++y) {
        int a = v[0].x, b = v[1].x; // without height: the first two of the caller's
        if (sorted[0].y != sorted[2].y) {
            const bool upper = y <= sorted[1].y;
            a = upper ? column(sorted[0], sorted[1], y) : column(sorted[1], sorted[2], y);
            b = column(sorted[0], sorted[2], y);
            if (upper && sorted[0].y == sorted[1].y) {
                a = sorted[1].x;
                b = sorted[0].x;
            }
        }
        for (int x = std::min(a, b); x <= std::max(a, b); ++x) {
            stream.emplace_back(x, y);
        }
    }
    return stream;
}

RasterPoint RandomPoint(std::mt19937& random, int range) {
    const auto one = [&] {
        return static_cast<int>(random() % static_cast<unsigned>(2 * range + 1)) - range;
    };
    const int x = one();
    return {x, one()};
}

TEST(Rasterizer, LinesFollowTheNearestPixels) {
    std::mt19937 random(1);
    for (int i = 0; i < 400; ++i) {
        const RasterPoint p = RandomPoint(random, 12);
        const RasterPoint q = i % 5 ? RandomPoint(random, 12) : p;
        const int dx = std::abs(q.x - p.x);
        const int dy = std::abs(q.y - p.y);
        const int length = std::max(dx, dy);
        Stream expected;
        for (int k = 0; k <= length; ++k) {
            // The minor axis is rounded, halves away from the start.
            const int minor = length ? (2 * k * std::min(dx, dy) + length) / (2 * length) : 0;
            const int alongX = dx < dy ? minor : k;
            const int alongY = dx < dy ? k : minor;
            expected.emplace_back(p.x + (q.x < p.x ? -alongX : alongX),
                                  p.y + (q.y < p.y ? -alongY : alongY));
        }
        EXPECT_EQ(Emitted([&] { CRasterizer::DrawLine(p.x, p.y, q.x, q.y); }), expected);
    }
}

TEST(Rasterizer, TrianglesMatchTheSlowForm) {
    std::mt19937 random(2);
    for (int i = 0; i < 3000; ++i) {
        const int range = i % 3 ? 4 : 25; // small ones meet in height often
        const RasterPoint v[3] = {RandomPoint(random, range), RandomPoint(random, range),
                                  RandomPoint(random, range)};
        ASSERT_EQ(Triangle(v[0], v[1], v[2]), SlowTriangle(v))
            << v[0].x << ',' << v[0].y << ' ' << v[1].x << ',' << v[1].y << ' ' << v[2].x << ','
            << v[2].y;
    }
}

TEST(Rasterizer, TrianglesWithoutHeightAndRecords) {
    // The third vertex does not count, wherever it is.
    EXPECT_THAT(Triangle({3, 7}, {1, 7}, {9, 7}), ElementsAre(Pair(1, 7), Pair(2, 7), Pair(3, 7)));
    EXPECT_THAT(Triangle({1, 7}, {1, 7}, {9, 7}), ElementsAre(Pair(1, 7)));
    const RasterPixel& record = g_records[0];
    EXPECT_EQ(record.vertices[2].x, 9);
    EXPECT_EQ(record.vertices[0].y, 7);
    EXPECT_THAT(record.attributes, testing::Each(0U));
    EXPECT_THAT(Emitted([] { CRasterizer::PlotPixel(-5, 6); }), ElementsAre(Pair(-5, 6)));
    EXPECT_EQ(g_records[0].vertices[0].x, 0);
    const RasterPoint p = {0, 0};
    EXPECT_THAT(Emitted([&] { CRasterizer::FillTriangle(&p, nullptr, &p); }), IsEmpty());
    CRasterizer::PlotPixel(0, 0); // no callback: nothing happens
}

TEST(Rasterizer, ProductsWrapAt32Bits) {
    // Side (0, 0) to (x, 3) with x = 2^31 - 1: in row 2 the product 2 x wraps to -2, column 0, and
    // in row 3 the product 3 x to 2^31 - 3.
    const int x = std::numeric_limits<int>::max();
    std::vector<std::tuple<int, int, int>> spans;
    WalkTriangle({{0, 0}, {x, 3}, {0, 3}},
                 [&](int32_t y, int32_t a, int32_t b) { spans.emplace_back(y, a, b); });
    EXPECT_THAT(spans, ElementsAre(std::tuple(0, 0, 0), std::tuple(1, 0, x / 3),
                                   std::tuple(2, 0, 0), std::tuple(3, 0, (x - 2) / 3)));
    // Heights beyond 32 bits, and the one quotient that does not fit, neither trap nor hang.
    int rows = 0;
    WalkTriangle({{5, x - 1}, {-x - 1, x}, {x, x}}, [&](int32_t, int32_t, int32_t) { ++rows; });
    EXPECT_EQ(rows, 2);
}

TEST(Rasterizer, QuadsEmitTheDiagonalTwice) {
    const RasterPoint a = {0, 0}, b = {1, 0}, c = {1, 1}, d = {0, 1};
    EXPECT_THAT(
        Emitted([&] { CRasterizer::FillQuad(&a, &b, &c, &d); }),
        ElementsAre(Pair(0, 0), Pair(1, 0), Pair(1, 1), Pair(0, 0), Pair(0, 1), Pair(1, 1)));
    EXPECT_EQ(Emitted([&] { CRasterizer::FillQuad(&a, &b, &c, nullptr); }), Triangle(a, b, c));
    EXPECT_EQ(Emitted([&] { CRasterizer::FillQuad(&a, nullptr, &c, &d); }), Triangle(a, c, d));
    EXPECT_THAT(Emitted([&] { CRasterizer::FillQuad(&a, &b, nullptr, &d); }), IsEmpty());
    EXPECT_THAT(Emitted([&] { CRasterizer::FillQuad(nullptr, &b, &c, &d); }), IsEmpty());
}

// A callback that is installed in the middle of a primitive waits for the next one.
TEST(Rasterizer, PrimitivesKeepTheCallbackTheyStartedWith) {
    static int first, second;
    first = second = 0;
    const auto install = [] {
        CRasterizer::SetPixelCallback([](const RasterPixel*) {
            ++first;
            CRasterizer::SetPixelCallback([](const RasterPixel*) { ++second; });
        });
    };
    const RasterPoint a = {0, 0}, b = {1, 0}, c = {1, 1}, d = {0, 1};
    install();
    CRasterizer::FillQuad(&a, &b, &c, &d);
    EXPECT_EQ(first, 6);
    EXPECT_EQ(second, 0);
    CRasterizer::DrawLine(0, 0, 3, 1);
    EXPECT_EQ(second, 4);
    install();
    CRasterizer::FillCircle(0, 0, 1);
    EXPECT_EQ(first, 14);
    EXPECT_EQ(second, 4);
    CRasterizer::SetPixelCallback(nullptr);
}

TEST(Rasterizer, FloatPointsAreTruncatedAndMayBeMissing) {
    const RasterPointF a = {-0.7F, -0.7F}, b = {2.9F, 0.9F}, c = {2.1F, 1.9F}, d = {-0.9F, 1.9F};
    const RasterPoint ia = {0, 0}, ib = {2, 0}, ic = {2, 1}, id = {0, 1};
    const Stream whole = Emitted([&] { CRasterizer::FillQuad(&ia, &ib, &ic, &id); });
    const Stream first = Triangle(ia, ib, ic);
    const Stream second = Triangle(ia, ic, id);
    EXPECT_EQ(Emitted([&] { CRasterizer::FillQuadF(&a, &b, &c, &d); }), whole);
    EXPECT_EQ(Emitted([&] { CRasterizer::FillQuadF(&a, &b, &c, nullptr); }), first);
    EXPECT_EQ(Emitted([&] { CRasterizer::FillQuadF(&a, nullptr, &c, &d); }), second);
    EXPECT_THAT(Emitted([&] { CRasterizer::FillQuadF(nullptr, &b, &c, &d); }), IsEmpty());
    EXPECT_THAT(Emitted([&] { CRasterizer::FillQuadF(&a, &b, nullptr, &d); }), IsEmpty());

    EXPECT_EQ(TruncateToInt(std::numeric_limits<float>::quiet_NaN()), 0);
    EXPECT_EQ(TruncateToInt(-std::numeric_limits<float>::infinity()), INT32_MIN);
    EXPECT_EQ(TruncateToInt(3e9F), INT32_MAX);
}

// The column v of a circle at u, chosen by the sum of the two candidates' distances.
std::vector<std::pair<int, int>> SlowOctant(int radius) {
    std::vector<std::pair<int, int>> points;
    const auto distance = [&](int u, int v) { return u * u + v * v - radius * radius; };
    for (int u = 0, v = radius; u <= v; ++u) {
        points.emplace_back(u, v);
        v -= distance(u + 1, v) + distance(u + 1, v - 1) >= 0;
    }
    return points;
}

TEST(Rasterizer, Circles) {
    const auto fill = [](int radius) {
        return Emitted([&] { CRasterizer::FillCircle(10, 20, radius); });
    };
    EXPECT_THAT(fill(0), IsEmpty());
    EXPECT_THAT(fill(-3), IsEmpty());
    // u 0, v 1: column 10 of the rows 21 and 19, then columns 9 to 11 of row 20 twice.
    EXPECT_THAT(fill(1), ElementsAre(Pair(10, 21), Pair(10, 19), Pair(9, 20), Pair(9, 20),
                                     Pair(10, 20), Pair(10, 20), Pair(11, 20), Pair(11, 20)));
    for (int radius = 2; radius < 40; ++radius) {
        Stream expected;
        const auto pairOfSpans = [&](int reach, int rows) {
            for (int x = 10 - reach; x <= 10 + reach; ++x) {
                expected.emplace_back(x, 20 + rows);
                expected.emplace_back(x, 20 - rows);
            }
        };
        Shape rim;
        for (const auto& [u, v] : SlowOctant(radius)) {
            pairOfSpans(u, v);
            pairOfSpans(v, u);
            for (const auto& [x, y] : {std::pair(u, v), std::pair(v, u)}) {
                rim.insert(
                    {{10 + x, 20 + y}, {10 - x, 20 + y}, {10 + x, 20 - y}, {10 - x, 20 - y}});
            }
        }
        EXPECT_EQ(fill(radius), expected) << radius;
        EXPECT_EQ(Positions(Emitted([&] { CRasterizer::DrawCircle(10, 20, radius); })), rim);
        EXPECT_EQ(Emitted([&] { CRasterizer::DrawCircle(10, 20, radius); }).size() % 8, 0U);
    }
}

TEST(Rasterizer, EllipsesAreClosedAndStayWithinHalfAPixel) {
    for (int a = 1; a < 30; a += 3) {
        for (int b = 1; b < 30; b += 4) {
            const Shape rim = Positions(Emitted([&] { CRasterizer::DrawEllipse(0, 0, a, b); }));
            for (const auto& tip :
                 {std::pair(a, 0), std::pair(-a, 0), std::pair(0, b), std::pair(0, -b)}) {
                EXPECT_TRUE(rim.count(tip)) << a << ' ' << b;
            }
            for (const auto& [x, y] : rim) {
                // The curve passes between the pixel's corners nearest to and farthest from the
                // centre.
                const auto reach = [&](double u, double v) {
                    return u * u / (a * a) + v * v / (b * b);
                };
                const double u = std::abs(x), v = std::abs(y);
                EXPECT_LT(reach(std::max(u - 1, 0.0), std::max(v - 1, 0.0)), 1.0);
                EXPECT_GT(reach(u + 1, v + 1), 1.0);
                EXPECT_TRUE(rim.count({-x, y}) && rim.count({x, -y}));
                // Every pixel has a neighbour on either side along the rim, but for the tips of the
                // thinnest.
                int neighbours = 0;
                for (int dx = -1; dx <= 1; ++dx) {
                    for (int dy = -1; dy <= 1; ++dy) {
                        neighbours += (dx || dy) && rim.count({x + dx, y + dy});
                    }
                }
                EXPECT_GE(neighbours, std::min(a, b) == 1 ? 1 : 2) << a << ' ' << b;
            }
        }
    }
    EXPECT_THAT(Emitted([] { CRasterizer::DrawEllipse(0, 0, -1, 5); }), IsEmpty());
    EXPECT_EQ(Positions(Emitted([] { CRasterizer::DrawEllipse(3, 3, 0, 2); })),
              (Shape{{3, 1}, {3, 2}, {3, 3}, {3, 4}, {3, 5}}));
}

TEST(Rasterizer, WindowsClampQuadsAndCutShapes) {
    std::mt19937 random(4);
    for (int i = 0; i < 4000; ++i) {
        const int width = 1 + static_cast<int>(random() % 9);
        const PixelBox window = {-2, 3, -2 + width, 4 + static_cast<int>(random() % 6)};
        const int range = i % 2 ? 14 : 60;
        RasterPoint quad[4];
        for (RasterPoint& corner : quad) {
            corner = RandomPoint(random, range);
            if (i % 3 == 0) {
                corner.y /= 8; // flat slivers leave gaps between their rows
            }
        }
        const CWindowWalk walk(window);
        const auto walked = [](auto take) {
            Shape shape;
            take([&](int y, int first, int last) {
                for (int x = first; x <= last; ++x) {
                    shape.emplace(x, y);
                }
            });
            return shape;
        };
        Shape clamped;
        for (const auto& [x, y] :
             Emitted([&] { CRasterizer::FillQuad(&quad[0], &quad[1], &quad[2], &quad[3]); })) {
            clamped.emplace(std::clamp(x, window.left, window.right - 1),
                            std::clamp(y, window.top, window.bottom - 1));
        }
        ASSERT_EQ(walked([&](auto add) { walk.ClampQuad(quad, add); }), clamped) << "quad " << i;

        const auto inside = [&](const Stream& stream) {
            Shape shape;
            for (const auto& [x, y] : stream) {
                if (x >= window.left && x < window.right && y >= window.top && y < window.bottom) {
                    shape.emplace(x, y);
                }
            }
            return shape;
        };
        EXPECT_EQ(walked([&](auto add) {
                      walk.ClipTriangle({quad[0], quad[1], quad[2]}, add);
                  }),
                  inside(Triangle(quad[0], quad[1], quad[2])));
        EXPECT_EQ(walked([&](auto add) { walk.ClipCircle(quad[0], i % 20, add); }),
                  inside(Emitted([&] { CRasterizer::FillCircle(quad[0].x, quad[0].y, i % 20); })));
    }
}

TEST(Rasterizer, DistanceCostsNothing) {
    // Spans are counted, not timed: a frame's worth of them, however far the corners are.
    constexpr int kFar = 1 << 30;
    const PixelBox window = {0, 0, 100, 50};
    const RasterPoint quads[][4] = {
        {{-kFar, -kFar}, {kFar, -kFar}, {kFar, kFar}, {-kFar, kFar}},
        {{-kFar, -kFar}, {kFar, kFar - 1}, {kFar, kFar}, {-kFar, -kFar + 7}},
        {{0, -kFar}, {50, kFar}, {3, kFar}, {60, -kFar}},
        {{-kFar, 5}, {kFar, 6}, {kFar, 7}, {-kFar, 8}},
    };
    for (const auto& quad : quads) {
        int spans = 0;
        CWindowWalk(window).ClampQuad(quad, [&](int32_t y, int32_t first, int32_t last) {
            ASSERT_TRUE(0 <= first && first <= last && last < 100 && 0 <= y && y < 50);
            ++spans;
        });
        EXPECT_GT(spans, 0);
        EXPECT_LT(spans, 2 * (50 + 4 * 101));
    }
}

// Rows that end up on one another share pixels by the width of the window each.
TEST(Rasterizer, RowsBeyondTheWindowCostItsWidthTogether) {
    for (const int width : {50, 20000, 1 << 20}) {
        const RasterPoint corners[4] = {{0, 1 - width}, {width, 0}, {0, 0}, {0, 0}};
        for (const int turn : {1, -1}) { // above the window, below it
            RasterPoint quad[4];
            std::transform(corners, corners + 4, quad, [&](RasterPoint p) {
                return RasterPoint{p.x, p.y * turn};
            });
            int64_t pixels = 0;
            CWindowWalk({0, 0, width, 1}).ClampQuad(quad, [&](int, int first, int last) {
                pixels += last - first + 1;
            });
            EXPECT_GE(pixels, width);
            EXPECT_LT(pixels, 12 * int64_t{width});
        }
    }
}

// Every half between small triangles' vertices, onto windows of every width, against the rows one
// by one.
TEST(SpanCollapse, IsTheUnionOfTheRows) {
    const auto check = [](const TriangleHalf& half, Columns window) {
        Shape rows, collapsed;
        for (int64_t y = half.top; y <= half.bottom; ++y) {
            const Columns row = half.Hull(y, y, window);
            for (int x = row.first; x <= row.last; ++x) {
                rows.emplace(x, 0);
            }
        }
        int spans = 0;
        Collapse(half, half.top, half.bottom, window, [&](Columns columns) {
            ++spans;
            for (int x = columns.first; x <= columns.last; ++x) {
                EXPECT_TRUE(collapsed.emplace(x, 0).second) << "twice";
            }
        });
        ASSERT_EQ(collapsed, rows);
        EXPECT_LE(spans, window.last - window.first + 1);
    };
    for (int height = 1; height <= 5; ++height) {
        for (int middle = 1; middle <= height; ++middle) {
            for (int left = -11; left <= 11; ++left) {
                for (int right = -11; right <= 11; ++right) {
                    const CTriangleSide side({2, 0}, {left, middle});
                    const CTriangleSide other({2, 0}, {right, height});
                    const CTriangleSide lower({left, middle}, {right, height});
                    for (const int last : {0, 3, 9}) {
                        check({side, other, 0, middle}, {0, last});
                        check({lower, other, middle + 1, height}, {0, last});
                    }
                }
            }
        }
    }
}

TEST(SpanRows, MergeAndCombineAsSetsOfColumnsDo) {
    std::mt19937 random(9);
    const auto columns = [](std::span<const kyv::Run> runs) {
        std::set<int> set;
        int end = -1000;
        for (const kyv::Run& run : runs) {
            EXPECT_TRUE(run.first < run.end && run.first > end); // apart and in order
            end = run.end;
            for (int x = run.first; x < run.end; ++x) {
                set.insert(x);
            }
        }
        return set;
    };
    CSpanRows spans;
    for (int round = 0; round < 300; ++round) {
        constexpr int kRows = 6;
        std::set<int> expected[kRows];
        spans.Begin(kRows);
        for (uint32_t i = random() % 30; i > 0; --i) {
            const int y = static_cast<int>(random() % kRows),
                      first = static_cast<int>(random() % 40);
            const int last = first + static_cast<int>(random() % 8);
            spans.Add(y, first, last);
            for (int x = first; x <= last; ++x) {
                expected[y].insert(x);
            }
        }
        PixelBox bounds = {};
        Runs combined;
        for (int y = 0; y < kRows; ++y) {
            const std::set<int>& here = expected[y];
            const std::set<int>& next = expected[(y + 1) % kRows];
            const auto a = spans.Row(y), b = spans.Row((y + 1) % kRows);
            ASSERT_EQ(columns(a), here);
            std::set<int> both = here, rest;
            both.insert(next.begin(), next.end());
            std::set_difference(here.begin(), here.end(), next.begin(), next.end(),
                                std::inserter(rest, rest.end()));
            Unite(a, b, combined);
            ASSERT_EQ(columns(combined), both);
            Subtract(a, b, combined);
            ASSERT_EQ(columns(combined), rest);
            if (!here.empty()) {
                bounds = bounds.About({*here.begin(), y, *here.rbegin() + 1, y + 1});
            }
        }
        EXPECT_EQ(spans.Bounds(), bounds);
        EXPECT_TRUE(spans.Row(-1).empty() && spans.Row(kRows).empty());
    }
}

TEST(Coverage, KeepsRunsAndTellsOfChanges) {
    std::mt19937 random(10);
    CCoverage coverage;
    for (int round = 0; round < 60; ++round) {
        const int width = 1 + static_cast<int>(random() % 300);
        const int left = static_cast<int>(random() % static_cast<unsigned>(width));
        const PixelBox box = {
            left, 1, left + 1 + static_cast<int>(random() % static_cast<unsigned>(width - left)),
            3};
        std::vector<uint32_t> pixels(static_cast<size_t>(width));
        const auto take = [&](int y) {
            coverage.Take(y, reinterpret_cast<const uint8_t*>(pixels.data()));
        };
        for (uint32_t& pixel : pixels) { // long runs, and lone pixels of any alpha
            const bool rare = random() % 16 == 0;
            pixel = (&pixel - pixels.data()) / 37 % 2 ? 0xFF000000 : 0x00FFFFFF;
            pixel = rare ? static_cast<uint32_t>(random()) & 0x80FFFFFF : pixel;
        }
        coverage.Begin(4, box);
        take(1);
        take(2);
        const auto row = [&](int y) {
            return Runs(coverage.Row(y).begin(), coverage.Row(y).end());
        };
        Runs expected;
        for (int x = box.left; x < box.right; ++x) {
            if (pixels[static_cast<size_t>(x)] >> 24) {
                if (expected.empty() || expected.back().end != x) {
                    expected.push_back({x, x});
                }
                expected.back().end = x + 1;
            }
        }
        for (const int y : {1, 2}) {
            ASSERT_EQ(row(y), expected)
                << width << " wide, from " << box.left << " to " << box.right;
        }
        for (const int y : {-1, 0, 3, 4}) {
            EXPECT_TRUE(row(y).empty());
        }
        const uint64_t serial = coverage.Serial();
        coverage.Begin(4, box);
        take(1);
        EXPECT_EQ(coverage.LastChanged(), -1);
        EXPECT_EQ(coverage.Serial(), serial);
        pixels[static_cast<size_t>(box.right - 1)] ^=
            0x40000000; // 0 or 128 to 64 or 192, 255 to 191
        take(2);
        const bool changed = expected.empty() || expected.back().end != box.right;
        EXPECT_EQ(coverage.LastChanged(), changed ? 2 : -1);
        EXPECT_EQ(coverage.Serial() != serial, changed);
        coverage.Begin(5, box);
        EXPECT_NE(coverage.Serial(), serial);
    }
}

} // namespace
