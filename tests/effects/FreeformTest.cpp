// The free-form picture-in-picture through the callbacks, against a slow form that takes every pass
// over the whole frame.
#include <algorithm>
#include <cmath>
#include <cstring>
#include <functional>
#include <limits>
#include <random>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "effects/pip/BorderShape.h"
#include "effects/pip/Rasterizer.h"
#include "imageutility/Conversion.h"
#include "imageutility/ImageUtility.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;
using namespace kyv;
using namespace KYVImageUtility;

const EffectDescriptor& Pip() {
    return Effect("Kyv_Dsp_Pi_Freeform");
}

struct Params {
    float corners[8] = {0.25F, 0.25F, 0.75F, 0.25F, 0.75F, 0.75F, 0.25F, 0.75F};
    int32_t key = 1;
    uint32_t keyColor = 0xFF00FF;
    uint8_t tolerance = 0;
    int32_t picture = 1;
    uint8_t pictureAlpha = 255;
    int32_t pictureBlur = 0;
    int32_t shadow = 1;
    uint32_t shadowColors[2] = {0, 0};
    int32_t shadowType = 0;
    uint8_t shadowAlpha = 128;
    int32_t shadowBlur = 1;
    float offset[2] = {0.01F, 0.01F};
    int32_t border = 1;
    int32_t borderSize = 5;
    uint32_t borderColors[2] = {0x0000FF, 0x0000FF};
    int32_t borderType = 0;
    uint8_t borderAlpha = 255;
    int32_t borderBlur = 0;
};

Params PictureOnly() {
    Params params;
    params.key = params.shadow = params.border = 0;
    return params;
}

void Store(const Params& p, CTestInstance& instance) {
    const char* const keys[] = {"P0", "P1", "P2", "P3", "P4", "P5", "P6", "P7"};
    for (int i = 0; i < 8; ++i) {
        instance.Set(keys[i], p.corners[i]);
    }
    instance.Set("P8", p.key);
    instance.Set("P9", p.keyColor);
    instance.Set("P10", p.tolerance);
    instance.Set("P12", p.picture);
    instance.Set("P13", p.pictureAlpha);
    instance.Set("P14", p.pictureBlur);
    instance.Set("P15", p.shadow);
    instance.Set("P16", p.shadowColors[0]);
    instance.Set("P17", p.shadowColors[1]);
    instance.Set("P18", p.shadowType);
    instance.Set("P19", p.shadowAlpha);
    instance.Set("P20", p.shadowBlur);
    instance.Set("P21", p.offset[0]);
    instance.Set("P22", p.offset[1]);
    instance.Set("P23", p.border);
    instance.Set("P24", p.borderSize);
    instance.Set("P25", p.borderColors[0]);
    instance.Set("P26", p.borderColors[1]);
    instance.Set("P27", p.borderType);
    instance.Set("P28", p.borderAlpha);
    instance.Set("P29", p.borderBlur);
}

struct Bounds {
    int left, top, right, bottom; // inside

    bool Has(int x, int y) const { return x >= left && x <= right && y >= top && y <= bottom; }
};

class CSlowFrame {
public:
    CSlowFrame(const Params& params, int width, int height, bool ayuv, bool wide = false)
        : m_p(params), m_width(width), m_height(height), m_ayuv(ayuv), m_wide(wide) {
        m_box = {99999, 99999, -99999, -99999};
        for (int i = 0; i < 4; ++i) {
            m_x[i] = static_cast<int>(params.corners[2 * i] * static_cast<float>(width));
            m_y[i] = static_cast<int>(params.corners[2 * i + 1] * static_cast<float>(height));
            m_box = {std::min(m_box.left, m_x[i]), std::min(m_box.top, m_y[i]),
                     std::max(m_box.right, m_x[i]), std::max(m_box.bottom, m_y[i])};
        }
    }

    Frame Render(const Frame& background, const Frame& foreground) {
        const float sx = static_cast<float>(m_width) / 320.0F;
        const float sy = static_cast<float>(m_height) / 240.0F;
        const float mean = (sx + sy) / 2.0F;
        const auto blur = [&](Frame& layer, int radius) {
            Blur(layer, static_cast<int>(static_cast<float>(radius) * mean));
        };
        const int size = m_p.border ? static_cast<int>(static_cast<float>(m_p.borderSize) * sx) : 0;
        const int dx = static_cast<int>(m_p.offset[0] * static_cast<float>(m_width));
        const int dy = static_cast<int>(m_p.offset[1] * static_cast<float>(m_height));
        const Bounds wide = {m_box.left - size, m_box.top - size, m_box.right + size,
                             m_box.bottom + size};

        Frame picture = Picture(foreground);
        if (m_p.key) {
            Key(picture);
        }
        Frame border(picture.size(), Black()), shadow(picture.size(), Black());
        if (m_p.border) {
            DrawBorder(border, size);
            for (size_t i = 0; i < border.size(); ++i) {
                if (picture[i] >> 24) {
                    border[i] = 0;
                }
            }
            Gradient(border, wide, m_p.borderType, m_p.borderColors);
        }
        if (m_p.shadow) {
            if (m_p.picture) {
                Stamp(picture, dx, dy, shadow);
            }
            Stamp(border, dx, dy, shadow);
            Gradient(shadow, {wide.left + dx, wide.top + dy, wide.right + dx, wide.bottom + dy},
                     m_p.shadowType, m_p.shadowColors);
            blur(shadow, m_p.shadowBlur);
        }
        blur(border, m_p.borderBlur);
        blur(picture, m_p.pictureBlur);

        Frame output = background;
        if (m_p.shadow) {
            Blend(shadow, m_p.shadowAlpha, output);
        }
        if (m_p.border) {
            Blend(border, m_p.borderAlpha, output);
        }
        if (m_p.picture) {
            Blend(picture, m_p.pictureAlpha, output);
        }
        return output;
    }

private:
    size_t At(int x, int y) const { return static_cast<size_t>(y * m_width + x); }
    uint32_t Black() const { return m_ayuv ? 0x00108080 : 0; } // transparent

    // Where a layer is, (dx, dy) from there the shadow is too.
    void Stamp(const Frame& layer, int dx, int dy, Frame& shadow) const {
        for (int y = 0; y < m_height; ++y) {
            for (int x = 0; x < m_width; ++x) {
                const int tx = x + dx, ty = y + dy;
                if (layer[At(x, y)] >> 24 && tx >= 0 && ty >= 0 && tx < m_width && ty < m_height) {
                    shadow[At(tx, ty)] = 0xFF000000 | Color(m_p.shadowColors[0]);
                }
            }
        }
    }

    static void Blend(const Frame& layer, uint32_t opacity, Frame& output) {
        for (size_t i = 0; i < output.size(); ++i) {
            const uint32_t a = layer[i] >> 24;
            const uint32_t w = opacity < 255 ? ((opacity + 1) * a) >> 8 : a;
            uint32_t pixel = output[i] & 0xFF000000;
            for (int shift = 0; shift < 24; shift += 8) {
                const uint32_t s = layer[i] >> shift & 255, d = output[i] >> shift & 255;
                pixel |= (s * w + d * (256 - w)) >> 8 << shift;
            }
            output[i] = pixel;
        }
    }

    // A parameter's colour as the low 24 bits of a pixel.
    uint32_t Color(uint32_t color) const {
        uint32_t r = color & 255, g = color >> 8 & 255, b = color >> 16 & 255;
        if (m_ayuv) {
            RgbToYuv(r, g, b, &r, &g, &b);
        }
        return r << 16 | g << 8 | b;
    }

    // The positions that the rasterizer emits.
    template <class Draw>
    static std::vector<std::pair<int, int>> Emitted(Draw draw) {
        static std::vector<std::pair<int, int>> stream;
        stream.clear();
        CRasterizer::SetPixelCallback(
            [](const RasterPixel* p) { stream.emplace_back(p->x, p->y); });
        draw();
        return stream;
    }

    // One unknown of the inverse bilinear map: a z^2 + b z + c = 0.
    static double Solve(double a, double b, double c) {
        const double d = std::max(b * b - 4 * a * c, 0.0);
        double z = a == 0 ? -c / b : (-b - std::sqrt(d)) / (2 * a);
        z = z > 0 ? z : 0;
        return z >= 1 ? 0.999 : z;
    }

    Frame Picture(const Frame& source) const {
        Frame layer(source.size());
        const RasterPoint q[4] = {
            {m_x[0], m_y[0]}, {m_x[1], m_y[1]}, {m_x[2], m_y[2]}, {m_x[3], m_y[3]}};
        const double ex = q[1].x - q[0].x, ey = q[1].y - q[0].y;
        const double fx = q[3].x - q[0].x, fy = q[3].y - q[0].y;
        const double gx = q[0].x - q[1].x + q[2].x - q[3].x;
        const double gy = q[0].y - q[1].y + q[2].y - q[3].y;
        double area = 0;
        for (int i = 0; i < 4; ++i) {
            const RasterPoint& r = q[(i + 1) % 4];
            area += static_cast<double>(q[i].x) * r.y - static_cast<double>(q[i].y) * r.x;
        }
        const double o = area < 0 ? -1 : 1;
        for (const auto& [px, py] :
             Emitted([&] { CRasterizer::FillQuad(&q[0], &q[1], &q[2], &q[3]); })) {
            const int x = std::clamp(px, 0, m_width - 1), y = std::clamp(py, 0, m_height - 1);
            if (!m_box.Has(x, y)) {
                continue; // a quad outside the frame
            }
            const double hx = x - q[0].x, hy = y - q[0].y;
            const double hg = hx * gy - hy * gx, ef = ex * fy - ey * fx;
            const double s = Solve(o * (gx * ey - gy * ex), o * (hg - ef), o * (hx * fy - hy * fx));
            const double t =
                Solve(-o * (gx * fy - gy * fx), -o * (hg + ef), -o * (hx * ey - hy * ex));
            const int reached = m_wide ? ~0 : 0xFFFF; // 1024 columns and rows
            const int u = static_cast<int>(s * m_width * 64) & reached;
            const int v = static_cast<int>(t * m_height * 64) & reached;
            if ((u >> 6) + 1 >= m_width || (v >> 6) + 1 >= m_height) {
                continue;
            }
            uint32_t pixel = 0xFF000000;
            for (int shift = 0; shift < 24; shift += 8) {
                const auto at = [&](int dx, int dy) {
                    return static_cast<int>(source[At((u >> 6) + dx, (v >> 6) + dy)] >> shift &
                                            255);
                };
                const int fu = ((u & 63) << 10) >> 1, fv = ((v & 63) << 10) >> 1;
                const int top = at(0, 0) + (fu * (at(1, 0) - at(0, 0)) >> 16);
                const int bottom = at(0, 1) + (fu * (at(1, 1) - at(0, 1)) >> 16);
                pixel |= static_cast<uint32_t>(top + (fv * (bottom - top) >> 16)) << shift;
            }
            layer[At(x, y)] = pixel;
        }
        return layer;
    }

    CImageARGB View(Frame& frame) const {
        return {reinterpret_cast<uint8_t*>(frame.data()), m_width, m_height, m_width * 4};
    }
    CImageAYUV AyuvView(Frame& frame) const {
        return {reinterpret_cast<uint8_t*>(frame.data()), m_width, m_height, m_width * 4};
    }

    void Key(Frame& layer) const {
        Frame rgb = layer;
        CImageARGB view = View(rgb);
        if (m_ayuv) {
            AyuvView(layer).ToARGB(view);
        }
        const auto mismatch = [&](int x, int y) {
            const uint32_t pixel = rgb[At(std::min(x, m_width - 1), std::min(y, m_height - 1))];
            for (int c = 0; c < 3; ++c) {
                const int value = static_cast<int>(pixel >> (8 * c) & 255);
                const int key = static_cast<int>(m_p.keyColor >> (16 - 8 * c) & 255);
                if (std::abs(value - key) > m_p.tolerance) {
                    return 64;
                }
            }
            return 0;
        };
        for (int y = 0; y < m_height; ++y) {
            for (int x = 0; x < m_width; ++x) {
                uint32_t& pixel = rgb[At(x, y)];
                if (pixel >> 24) {
                    const int sum = mismatch(x, y) + mismatch(x + 1, y) + mismatch(x, y + 1) +
                                    mismatch(x + 1, y + 1);
                    pixel = (pixel & 0xFFFFFF) | static_cast<uint32_t>(std::min(sum, 255)) << 24;
                }
            }
        }
        layer = rgb;
        if (m_ayuv) {
            CImageAYUV target = AyuvView(layer);
            view.ToAYUV(target);
        }
    }

    void DrawBorder(Frame& layer, int size) const {
        const float h = static_cast<float>(size / 2);
        RasterPointF corner[4], normal[4];
        for (int i = 0; i < 4; ++i) {
            corner[i] = {static_cast<float>(m_x[i]), static_cast<float>(m_y[i])};
        }
        for (int i = 0; i < 4; ++i) {
            const RasterPointF d = {corner[(i + 1) % 4].x - corner[i].x,
                                    corner[(i + 1) % 4].y - corner[i].y};
            const float x = d.x * d.x + d.y * d.y;
            float r = x > 0 ? 1 / std::sqrt(x) : 0;
            r = r * (x * r * r - 3.0F) * -0.5F;
            normal[i] = {d.y * r, -d.x * r};
        }
        // A side without length has no normal: the next one that has takes its place in joins.
        const auto facing = [&](int side, int step) {
            for (int i = 0; i < 4 && normal[side].x == 0 && normal[side].y == 0; ++i) {
                side = (side + step + 4) % 4;
            }
            return side;
        };
        const auto moved = [&](int i, int n, float by) {
            return RasterPointF{corner[i].x + normal[n].x * by, corner[i].y + normal[n].y * by};
        };
        const auto stream = Emitted([&] {
            for (int i = 0; i < 4; ++i) {
                const int next = (i + 1) % 4, before = (i + 3) % 4;
                const RasterPointF a = moved(i, i, h), b = moved(next, i, h),
                                   c = moved(next, i, -h), d = moved(i, i, -h);
                CRasterizer::FillQuadF(&a, &b, &c, &d);
                const int in = facing(before, -1), out = facing(i, 1);
                const float turn = normal[in].x * normal[out].y - normal[in].y * normal[out].x;
                const float side = turn < 0 ? -h : h;
                const RasterPointF from = moved(i, in, side), to = moved(i, out, side);
                CRasterizer::FillTriangleF(&corner[i], &from, &to);
                CRasterizer::FillCircle(m_x[i], m_y[i], size / 2 - 1);
            }
        });
        const uint32_t color = 0xFF000000 | Color(m_p.borderColors[0]);
        for (const auto& [x, y] : stream) {
            if (x >= 0 && y >= 0 && x < m_width && y < m_height) {
                layer[At(x, y)] = color;
            }
        }
    }

    void Gradient(Frame& layer, const Bounds& box, int type, const uint32_t (&colors)[2]) const {
        const uint32_t c1 = Color(colors[0]), c2 = Color(colors[1]);
        if (c1 == c2 || box.left >= box.right || box.top >= box.bottom) {
            return;
        }
        // Where the second colour lies, and how far the corners are from it: 0, 1 or 2 halves.
        constexpr int kFar[8][4] = {{0, 0, 2, 2}, {2, 2, 0, 0}, {0, 2, 0, 2}, {2, 0, 2, 0},
                                    {0, 1, 1, 2}, {1, 0, 2, 1}, {1, 2, 0, 1}, {2, 1, 1, 0}};
        const int* far = kFar[type >= 0 && type < 8 ? type : 0];
        for (int y = 0; y < m_height; ++y) {
            for (int x = 0; x < m_width; ++x) {
                uint32_t& pixel = layer[At(x, y)];
                if (pixel >> 24 == 0) {
                    continue;
                }
                const float fx =
                    static_cast<float>(x - box.left) / static_cast<float>(box.right - box.left);
                const float fy =
                    static_cast<float>(y - box.top) / static_cast<float>(box.bottom - box.top);
                uint32_t result = pixel & 0xFF000000;
                for (int shift = 0; shift < 24; shift += 8) {
                    const int a = static_cast<int>(c2 >> shift & 255);
                    const int b = static_cast<int>(c1 >> shift & 255);
                    const int values[3] = {a, (a + b) >> 1, b};
                    const auto mix = [](int from, int to, float part) {
                        return static_cast<int>(static_cast<float>(from) +
                                                static_cast<float>(to - from) * part);
                    };
                    const int top = mix(values[far[0]], values[far[1]], fx);
                    const int bottom = mix(values[far[2]], values[far[3]], fx);
                    const int value = std::clamp(mix(top, bottom, fy), 0, 255);
                    result |= static_cast<uint32_t>(value) << shift;
                }
                pixel = result;
            }
        }
    }

    void Blur(Frame& layer, int radius) const {
        if (radius > 0) {
            CImageARGB view = View(layer);
            view.BoxBlur(view, radius);
        }
    }

    Params m_p;
    int m_width, m_height;
    bool m_ayuv;
    bool m_wide;
    int m_x[4], m_y[4];
    Bounds m_box;
};

Frame RenderEffect(const Params& params, const Frame& background, const Frame& foreground,
                   int width, int height, uint32_t format, int32_t level) {
    CTestInstance instance(Pip(), static_cast<uint32_t>(width), static_cast<uint32_t>(height));
    instance.Context().cpuLevel = level;
    instance.Context().pixelFormat = format;
    EXPECT_EQ(instance.Begin(), KYV_OK);
    Store(params, instance);
    Frame output(background.size(), 0x55555555);
    EXPECT_EQ(instance.Render(output.data(), background.data(), foreground.data()), KYV_OK);
    return output;
}

// Mostly sensible settings, with every switch and list.
Params RandomParams(std::mt19937& random, float reach) {
    const auto part = [&](float from, float to) {
        return from + (to - from) * static_cast<float>(random() % 10001) / 10000.0F;
    };
    const auto number = [&](uint32_t most) { return static_cast<int32_t>(random() % (most + 1)); };
    Params p;
    for (float& corner : p.corners) {
        corner = part(0.5F - reach, 0.5F + reach);
    }
    if (random() % 4 == 0) { // a rectangle
        p.corners[3] = p.corners[1];
        p.corners[4] = p.corners[2];
        p.corners[6] = p.corners[0];
        p.corners[7] = p.corners[5];
    }
    if (random() % 6 == 0) { // a triangle
        const size_t corner = random() % 4, next = (corner + 1) % 4;
        p.corners[2 * next] = p.corners[2 * corner];
        p.corners[2 * next + 1] = p.corners[2 * corner + 1];
    }
    const auto color = [&] { return static_cast<uint32_t>(random()) & 0xFFFFFF; };
    p.key = number(1);
    p.keyColor = color();
    p.tolerance = static_cast<uint8_t>(random() % 128);
    p.picture = random() % 5 != 0;
    p.pictureAlpha = static_cast<uint8_t>(random() % 3 ? 255 : random());
    p.pictureBlur = random() % 3 ? 0 : number(10);
    p.shadow = number(1);
    p.shadowColors[0] = color();
    p.shadowColors[1] = random() % 2 ? color() : p.shadowColors[0];
    p.shadowType = number(8);
    p.shadowAlpha = static_cast<uint8_t>(random());
    p.shadowBlur = number(10);
    p.offset[0] = part(-0.3F, 0.3F);
    p.offset[1] = part(-0.3F, 0.3F);
    p.border = number(1);
    p.borderSize = number(10);
    p.borderColors[0] = color();
    p.borderColors[1] = random() % 2 ? color() : p.borderColors[0];
    p.borderType = number(8);
    p.borderAlpha = static_cast<uint8_t>(random());
    p.borderBlur = random() % 2 ? 0 : number(5);
    return p;
}

// A picture of few colours in patches, so that keys match.
Frame PatchedFrame(int width, int height, uint32_t seed, uint32_t keyColor) {
    std::mt19937 random(seed);
    const uint32_t key = (keyColor & 255) << 16 | (keyColor & 0xFF00) | keyColor >> 16;
    Frame frame = RandomFrame(static_cast<size_t>(width * height), seed);
    for (int i = 0; i < 12; ++i) {
        const int left = static_cast<int>(random()) % width,
                  top = static_cast<int>(random()) % height;
        for (int y = std::abs(top); y < std::min(std::abs(top) + 9, height); ++y) {
            for (int x = std::abs(left); x < std::min(std::abs(left) + 11, width); ++x) {
                frame[static_cast<size_t>(y * width + x)] = key ^ (random() % 4 * 0x030507);
            }
        }
    }
    return frame;
}

TEST(Freeform, EveryLevelMatchesTheSlowForm) {
    std::mt19937 random(1);
    for (uint32_t i = 0; i < 160; ++i) {
        const int width = 1 + static_cast<int>(random() % (i % 8 ? 150 : 500));
        const int height = 1 + static_cast<int>(random() % 120);
        const Params params = RandomParams(random, i % 3 ? 0.5F : 1.2F);
        const uint32_t format = i % 2;
        const Frame background = RandomFrame(static_cast<size_t>(width * height), i);
        const Frame foreground = PatchedFrame(width, height, i + 1000, params.keyColor);
        const Frame expected = CSlowFrame(params, width, height, format == PixelFormat_Ayuv)
                                   .Render(background, foreground);
        for (const int32_t level : {0, 3, 4, 5}) {
            const Frame actual =
                RenderEffect(params, background, foreground, width, height, format, level);
            const auto at = std::mismatch(actual.begin(), actual.end(), expected.begin());
            ASSERT_EQ(at.first - actual.begin(), width * height)
                << "case " << i << ", level " << level << ", " << width << "x" << height << ": "
                << std::hex << *at.first << ", not " << *at.second;
        }
    }
}

TEST(Freeform, DefaultCornersAreTheMiddleHalf) {
    // Picture 200 over background 100 at full weight: (200 * 255 + 100) >> 8 = 199. The last column
    // and row of a picture up to 1000 wide stay empty.
    const Frame background(640 * 480, 0x80646464), foreground(640 * 480, 0x00C8C8C8);
    const Frame output = RenderEffect(PictureOnly(), background, foreground, 640, 480, 0, 5);
    for (int y = 0; y < 480; ++y) {
        for (int x = 0; x < 640; ++x) {
            const bool inside = x >= 160 && x < 480 && y >= 120 && y < 360;
            ASSERT_EQ(output[static_cast<size_t>(y * 640 + x)], inside ? 0x80C7C7C7 : 0x80646464)
                << x << ',' << y;
        }
    }
}

TEST(Freeform, KeyCountsTheTwoByTwoBlock) {
    // A 4 x 2 picture on a 4 x 2 frame; columns 0 to 2 are drawn, and row 0. Magenta in column 1
    // leaves two of four at column 0 and at column 1.
    Params params = PictureOnly();
    const float all[8] = {0, 0, 1, 0, 1, 1, 0, 1};
    std::copy(all, all + 8, params.corners);
    params.key = 1;
    const Frame background(8, 0x00000000);
    Frame foreground(8, 0xFF808080);
    foreground[1] = foreground[5] = 0xFFFF00FF;
    const Frame output = RenderEffect(params, background, foreground, 4, 2, 0, 0);
    // Row 1 is empty and black, so it does not match: column 0 has 3 of 4, column 1 too.
    // 128 * 192 >> 8 = 96 and 255 * 192 >> 8 = 191; column 2 has 128 * 255 >> 8 = 127.
    EXPECT_THAT(output, testing::ElementsAre(0x606060U, 0xBF00BFU, 0x7F7F7FU, 0U, 0U, 0U, 0U, 0U));
}

TEST(Freeform, WithoutASecondInputTheBackgroundIsCopied) {
    const Frame background = RandomFrame(20 * 10, 3);
    CTestInstance instance(Pip(), 20, 10);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    Frame output(200);
    EXPECT_EQ(instance.Render(output.data(), background.data()), KYV_OK);
    EXPECT_EQ(output, background);
    EXPECT_EQ(instance.Render(output.data(), nullptr, background.data()), KYV_FAIL);
    EXPECT_EQ(instance.Render(nullptr, background.data(), background.data()), KYV_FAIL);
    instance.Context().width = 0;
    EXPECT_EQ(instance.Render(output.data(), background.data(), background.data()), KYV_FAIL);
}

// Some rows of the picture are keyed away, or there again.
void KeyRows(std::mt19937& random, uint32_t key, int width, Frame& foreground) {
    const int height = static_cast<int>(foreground.size()) / width;
    const int y = static_cast<int>(random() % static_cast<uint32_t>(height));
    const uint32_t pixel = (key & 255) << 16 | (key & 0xFF00) | key >> 16;
    const auto from = foreground.begin() + y * width;
    const int rows = std::min(1 + static_cast<int>(random() % 4), height - y);
    std::fill(from, from + rows * width, random() % 2 ? pixel : ~pixel);
}

// One thing changes from frame to frame, or nothing: a parameter, a few rows of the keyed picture,
// the level, the frame. A fresh instance tells what each frame must be.
TEST(Freeform, WhatIsKeptIsOutdatedByEveryChange) {
    std::mt19937 random(11);
    for (int round = 0; round < 12; ++round) {
        CTestInstance instance(Pip(), 96, 70);
        EffectContext& context = instance.Context();
        context.pixelFormat = static_cast<uint32_t>(round) % 2;
        ASSERT_EQ(instance.Begin(), KYV_OK);
        int width = 96, height = 70;
        Params params = RandomParams(random, 0.4F), other;
        params.picture = params.border = params.shadow = params.key = 1;
        params.pictureBlur = params.borderBlur = params.shadowBlur = round % 4;
        Frame background, foreground;
        const auto anotherFrame = [&] {
            context.width = static_cast<uint32_t>(width);
            context.height = static_cast<uint32_t>(height);
            background = RandomFrame(static_cast<size_t>(width * height), random());
            foreground = PatchedFrame(width, height, random(), params.keyColor);
        };
        anotherFrame();
        const auto keyRows = [&] { KeyRows(random, params.keyColor, width, foreground); };
        const std::function<void()> changes[] = {
            [&] { std::copy(other.corners, other.corners + 8, params.corners); },
            [&] { params.keyColor = other.keyColor; },
            [&] { params.tolerance = other.tolerance; },
            [&] { params.key = other.key; },
            [&] { params.picture = other.picture; },
            [&] { params.pictureBlur = other.pictureBlur; },
            [&] { params.shadow = other.shadow; },
            [&] { params.shadowColors[random() % 2] = other.shadowColors[0]; },
            [&] { params.shadowType = other.shadowType; },
            [&] { params.shadowBlur = other.shadowBlur; },
            [&] { params.offset[random() % 2] = other.offset[0]; },
            [&] { params.border = other.border; },
            [&] { params.borderSize = other.borderSize; },
            [&] { params.borderColors[random() % 2] = other.borderColors[0]; },
            [&] { params.borderType = other.borderType; },
            [&] { params.borderBlur = other.borderBlur; },
            [&] {
                params.shadowAlpha = params.borderAlpha = params.pictureAlpha = other.tolerance;
            },
            keyRows,
            keyRows,
            keyRows,
            [&] { foreground = PatchedFrame(width, height, random(), params.keyColor); },
            [&] { context.pixelFormat ^= 1; },
            [&] { width = 96 + 25 - width % 96, anotherFrame(); },
            [&] { height = 70 + 33 - height % 70, anotherFrame(); },
            [&] { EXPECT_EQ(instance.End(), KYV_OK); }, // and the next frame works all the same
            [] {},
            [] {},
        };
        for (int i = 0; i < 50; ++i) {
            other = RandomParams(random, 0.4F);
            changes[random() % std::size(changes)]();
            Store(params, instance);
            Frame output(background.size());
            ASSERT_EQ(instance.Render(output.data(), background.data(), foreground.data()), KYV_OK);
            ASSERT_EQ(output, RenderEffect(params, background, foreground, width, height,
                                           context.pixelFormat, context.cpuLevel))
                << "round " << round << " frame " << i;
            context.cpuLevel = static_cast<int32_t>(random() % 6);
        }
    }
}

// With the option a picture of any size is seen whole; without it an instance goes back to what
// it was.
TEST(Freeform, WideMapsReachEveryColumnAndRow) {
    constexpr std::pair<int, int> kSizes[] = {{2600, 40}, {40, 2600}, {1300, 1100}, {64, 48}};
    std::mt19937 random(13);
    for (const auto& [width, height] : kSizes) {
        const auto pixels = static_cast<size_t>(width * height);
        const Frame background = RandomFrame(pixels, 1), foreground = RandomFrame(pixels, 2);
        CTestInstance instance(Pip(), static_cast<uint32_t>(width), static_cast<uint32_t>(height));
        ASSERT_EQ(instance.Begin(), KYV_OK);
        for (int i = 0; i < (pixels > 1'000'000 ? 2 : 8); ++i) {
            Params params = RandomParams(random, 0.55F);
            params.picture = 1;
            params.pictureBlur = params.borderBlur = params.shadowBlur = 0;
            if (i == 0) {
                const float whole[8] = {0, 0, 1, 0, 1, 1, 0, 1};
                std::copy(whole, whole + 8, params.corners);
            }
            Store(params, instance);
            for (const bool wide : {true, false, true}) {
                const int32_t level = static_cast<int32_t>(random() % 6);
                instance.Context().cpuLevel = level + (wide ? CpuLevelOption_WideMap : 0);
                Frame output(pixels);
                ASSERT_EQ(instance.Render(output.data(), background.data(), foreground.data()),
                          KYV_OK);
                ASSERT_TRUE(
                    output ==
                    CSlowFrame(params, width, height, false, wide).Render(background, foreground))
                    << width << " x " << height << ", case " << i << ", wide " << wide << ", level "
                    << level;
            }
        }
    }
}

// A triangle's border is the same whichever of its corners is the double one.
TEST(Freeform, BordersJoinAtDoubledCorners) {
    const RasterPoint points[3] = {{30, 30}, {80, 40}, {125, 70}};
    std::vector<Runs> rows[3]; // a wide border, of which a wide turn leaves some to its wedge alone
    for (size_t twice = 0; twice < 3; ++twice) {
        BorderShape shape = {160, 100, {}, 40};
        for (size_t i = 0; i < 4; ++i) {
            shape.corners[i] = points[i <= twice ? i : i - 1];
        }
        CSpanRows spans;
        spans.Begin(100);
        AddBorderShape(spans, shape);
        for (int y = 0; y < 100; ++y) {
            rows[twice].emplace_back(spans.Row(y).begin(), spans.Row(y).end());
        }
    }
    EXPECT_EQ(rows[0], rows[1]);
    EXPECT_EQ(rows[0], rows[2]);
}

// Bytes of whole sequences, every layout, field, level and output, as they have been since the
// effect was written.
TEST(Freeform, SequencesKeepTheirBytes) {
    constexpr std::pair<int, int> kSizes[] = {{64, 48}, {161, 120}, {33, 90}, {200, 3}, {1100, 20}};
    std::mt19937 random(12);
    uint64_t hash = 14695981039346656037U; // FNV-1a over pixels
    for (const auto& [width, height] : kSizes) {
        for (int sequence = 0; sequence < 12; ++sequence) {
            CTestInstance instance(Pip(), static_cast<uint32_t>(width),
                                   static_cast<uint32_t>(height));
            EffectContext& context = instance.Context();
            context.pixelFormat = random() % 2;
            context.stereoLayout = random() % 3;
            const int views = context.stereoLayout == StereoLayout_Mono ? 1 : 2;
            ASSERT_EQ(instance.Begin(), KYV_OK);
            Params params = RandomParams(random, 0.6F);
            for (uint32_t i = 0; i < 6; ++i) {
                if (random() % 2) {
                    const Params other = RandomParams(random, 0.6F);
                    std::copy(other.corners, other.corners + 8, params.corners);
                    params.key = other.key;
                    params.borderBlur = other.borderBlur;
                }
                context.cpuLevel = static_cast<int32_t>(random() % 6);
                context.fieldSelector = random() % 4 == 0 ? random() % 3 : 0;
                Store(params, instance);
                Frame background = RandomFrame(static_cast<size_t>(width * views * height), i);
                Frame foreground = PatchedFrame(width * views, height, i, params.keyColor);
                Frame apart(background.size());
                Frame* const outputs[] = {&apart, &background, &foreground};
                Frame& output = *outputs[random() % 3];
                ASSERT_EQ(instance.Render(output.data(), background.data(), foreground.data()),
                          KYV_OK);
                for (const uint32_t pixel : output) {
                    hash = (hash ^ pixel) * 1099511628211U;
                }
            }
        }
    }
    EXPECT_EQ(hash, 7943080034623530523U);
}

// An AYUV picture that is keyed is no longer clear where it is not covered, which only a blur of a
// later frame shows.
TEST(Freeform, KeyedAyuvPicturesLeaveNothingBehind) {
    constexpr int kWidth = 640, kHeight = 48;
    const Frame background = RandomFrame(kWidth * kHeight, 1);
    const Frame foreground = RandomFrame(kWidth * kHeight, 2);
    Params keyed = PictureOnly(), ringed = keyed, blurred = keyed, bordered = keyed;
    keyed.key = keyed.border = 1;
    ringed.key = 1;
    ringed.picture = 0;
    ringed.pictureBlur = 4;
    blurred.pictureBlur = 4;
    bordered.border = 1;
    const std::vector<Params> sequences[] = {{keyed, blurred}, {ringed, bordered, blurred}};
    for (const auto& sequence : sequences) {
        for (const int32_t level : {0, 3}) {
            CTestInstance instance(Pip(), kWidth, kHeight);
            instance.Context().cpuLevel = level;
            instance.Context().pixelFormat = PixelFormat_Ayuv;
            ASSERT_EQ(instance.Begin(), KYV_OK);
            for (const Params& params : sequence) {
                Store(params, instance);
                Frame output(background.size());
                ASSERT_EQ(instance.Render(output.data(), background.data(), foreground.data()),
                          KYV_OK);
                EXPECT_EQ(output, RenderEffect(params, background, foreground, kWidth, kHeight,
                                               PixelFormat_Ayuv, level))
                    << (&params - sequence.data()) << " at level " << level;
            }
        }
    }
}

// The bounding box ends at 99999, the quad does not.
TEST(Freeform, FramesBeyondTheBoxAreDrawnUpToItsEnd) {
    for (const auto& [width, height] : {std::pair(3, 110000), std::pair(110000, 3)}) {
        const auto pixels = static_cast<size_t>(width * height);
        const Frame background = RandomFrame(pixels, 1), foreground = RandomFrame(pixels, 2);
        const float right = width > height ? 0.909086F : 1.0F; // column 99999
        const float bottom = width > height ? 1.0F : 0.909086F;
        Params whole = PictureOnly(), layered, blurred = whole;
        const float all[8] = {0, 0, 1, 0, 1, 1, 0, 1};
        const float boxed[8] = {0, 0, right, 0, right, bottom, 0, bottom};
        std::copy(all, all + 8, whole.corners);
        std::copy(boxed, boxed + 8, blurred.corners);
        blurred.pictureBlur = 1;
        layered = whole;
        layered.border = 1;
        const Frame expected = RenderEffect(whole, background, foreground, width, height, 0, 0);
        EXPECT_NE(expected, background);
        for (const int32_t level : {0, 5}) {
            CTestInstance instance(Pip(), static_cast<uint32_t>(width),
                                   static_cast<uint32_t>(height));
            instance.Context().cpuLevel = level;
            ASSERT_EQ(instance.Begin(), KYV_OK);
            Store(whole, instance);
            Frame output = background; // in place, where nothing that is drawn twice is put right
            ASSERT_EQ(instance.Render(output.data(), output.data(), foreground.data()), KYV_OK);
            EXPECT_TRUE(output == expected) << width << " wide, level " << level;
            // A blur looks beyond the end, to where the quad of a frame before has been.
            for (const Params& params : {layered, blurred}) {
                Store(params, instance);
                ASSERT_EQ(instance.Render(output.data(), background.data(), foreground.data()),
                          KYV_OK);
            }
            EXPECT_TRUE(output ==
                        RenderEffect(blurred, background, foreground, width, height, 0, level))
                << width << " wide, blurred, level " << level;
        }
    }
}

TEST(Freeform, SurvivesAnyParameters) {
    std::mt19937 random(8);
    constexpr float kInfinity = std::numeric_limits<float>::infinity();
    const float floats[] = {NAN,   kInfinity, -kInfinity, 1e30F, -1e30F, 1e6F, -1e6F,
                            60.0F, -3.5F,     0.0F,       -0.0F, 0.5F,   1.0F, 1e-40F};
    constexpr std::pair<int, int> kSizes[] = {{1, 1},  {1, 40},   {40, 1},   {2, 2},    {64, 48},
                                              {33, 7}, {1100, 3}, {3, 1100}, {8200, 2}, {2, 8200}};
    for (int i = 0; i < 150; ++i) {
        const auto [width, height] = kSizes[static_cast<size_t>(i) % std::size(kSizes)];
        const auto pixels = static_cast<size_t>(width) * static_cast<size_t>(height);
        // Corners from the list, some equal or collinear; everything else any bits at all.
        Params params = RandomParams(random, 0.5F);
        for (float& corner : params.corners) {
            if (random() % 3) {
                corner = floats[random() % std::size(floats)];
            }
        }
        if (i % 2) {
            const auto any = [&] { return static_cast<int32_t>(random() << 16 ^ random()); };
            params.pictureBlur = random() % 2 ? any() : 40;
            params.shadowBlur = random() % 2 ? any() : 1000;
            params.borderBlur = random() % 2 ? any() : -1;
            params.borderSize = random() % 2 ? any() : 300;
            params.shadowType = any();
            params.borderType = any();
            params.key = params.picture = params.shadow = params.border = any();
            params.keyColor = static_cast<uint32_t>(any());
            params.tolerance = static_cast<uint8_t>(any());
            params.shadowColors[0] = static_cast<uint32_t>(any());
            params.offset[0] = floats[random() % std::size(floats)];
            params.offset[1] = floats[random() % std::size(floats)];
        }
        const Frame background = RandomFrame(pixels, 1), foreground = RandomFrame(pixels, 2);
        const uint32_t format = static_cast<uint32_t>(i) / 2 % 2;
        EXPECT_EQ(RenderEffect(params, background, foreground, width, height, format, 0),
                  RenderEffect(params, background, foreground, width, height, format, 5))
            << "case " << i;
    }
}

} // namespace
