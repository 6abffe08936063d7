// A printed page with the finest lines that the size can carry: an engraved rosette, a band of
// guilloche, wedges, gratings, and type down to the smallest readable size.
#define STB_TRUETYPE_IMPLEMENTATION
#define STBTT_STATIC
#include <stb/stb_truetype.h>

#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string_view>

#include "resources/samples/Samples.h"

using namespace kyvdraw;

namespace kyvsamples {
namespace {

const Colour kInk = Hex(0x1d2a3c), kBlue = Hex(0x1f5a80), kRed = Hex(0xa03428),
             kGreen = Hex(0x2f6e58);
const Colour kGold = Hex(0xa87a2c);

// A font and its drawing, glyph by glyph, placed to a part of a pixel.
class CType {
public:
    explicit CType(const std::string& path) {
        std::ifstream file(path, std::ios::binary);
        m_File.assign(std::istreambuf_iterator<char>(file), {});
        if (m_File.empty() || !stbtt_InitFont(&m_Font, m_File.data(), 0)) {
            throw std::runtime_error("no font at " + path +
                                     "; install fonts-dejavu-core and fonts-dejavu-extra");
        }
    }

    float Width(std::string_view text, float size, float spacing = 0) const {
        return Run(text, size, spacing, [](int, Vec2) {}, {});
    }

    void Draw(CCanvas& canvas, Vec2 base, std::string_view text, float size, Colour colour,
              float spacing = 0) const {
        const float scale = stbtt_ScaleForPixelHeight(&m_Font, size);
        Run(
            text, size, spacing,
            [&](int glyph, Vec2 at) {
                const float sx = Fract(at.x), sy = Fract(at.y);
                int width = 0, height = 0, left = 0, top = 0;
                uint8_t* cover = stbtt_GetGlyphBitmapSubpixel(&m_Font, scale, scale, sx, sy, glyph,
                                                              &width, &height, &left, &top);
                for (int y = 0; y < height; ++y) {
                    for (int x = 0; x < width; ++x) {
                        const int px = static_cast<int>(std::floor(at.x)) + left + x;
                        const int py = static_cast<int>(std::floor(at.y)) + top + y;
                        if (px >= 0 && py >= 0 && px < kWidth && py < kHeight) {
                            const float part = static_cast<float>(cover[y * width + x]) / 255;
                            canvas.At(px, py) = Mix(canvas.At(px, py), colour, part);
                        }
                    }
                }
                stbtt_FreeBitmap(cover, nullptr);
            },
            base);
    }

    void DrawCentred(CCanvas& canvas, Vec2 base, std::string_view text, float size, Colour colour,
                     float spacing = 0) const {
        Draw(canvas, base - Vec2{(Width(text, size, spacing) - spacing) / 2, 0}, text, size, colour,
             spacing);
    }

private:
    template <class Put>
    float Run(std::string_view text, float size, float spacing, Put put, Vec2 base) const {
        const float scale = stbtt_ScaleForPixelHeight(&m_Font, size);
        float x = 0;
        int before = 0;
        for (const char c : text) {
            const int glyph = stbtt_FindGlyphIndex(&m_Font, static_cast<unsigned char>(c));
            int advance = 0, bearing = 0;
            stbtt_GetGlyphHMetrics(&m_Font, glyph, &advance, &bearing);
            x += scale *
                 static_cast<float>(before ? stbtt_GetGlyphKernAdvance(&m_Font, before, glyph) : 0);
            put(glyph, base + Vec2{x, 0});
            x += scale * static_cast<float>(advance) + spacing;
            before = glyph;
        }
        return x;
    }

    std::vector<uint8_t> m_File;
    stbtt_fontinfo m_Font{};
};

// How much of a line of the given width covers a place at this distance from its middle.
float Line(float distance, float width) {
    return Clamp01((width + 1) / 2 - std::fabs(distance)) * std::min(width, 1.0f);
}

Colour PaperLight(Vec2 p) {
    const float fibre = 0.5f * Fbm(Vec2{p.x * 0.03f, p.y * 0.25f}, 4, 3) + Fbm(p * 0.35f, 3, 5);
    const float stain = Fbm(p * 0.004f, 4, 8);
    const float edge = std::min({p.x, p.y, kWidth - p.x, kHeight - p.y});
    const float aged = 0.13f * std::exp(-edge / 90);
    return Mix(Hex(0xf3ead6), Hex(0xd8bf90), Clamp01(0.10f + 0.14f * stain + aged)) *
           (1 + 0.018f * fibre);
}

// Curves r = base + swing * cos(k * angle + phase), a full set of phases: where they cross, the
// eye sees lace.
void DrawRosette(CCanvas& canvas, Vec2 centre) {
    struct Ring {
        float base, swing;
        int lobes, curves;
        Colour colour;
        float width;
    };
    const Ring rings[] = {{170, 17, 12, 14, kBlue, 0.62f},
                          {140, 22, 9, 14, kGreen, 0.62f},
                          {104, 26, 8, 14, kRed, 0.62f},
                          {66, 24, 7, 12, kBlue, 0.6f},
                          {38, 12, 6, 8, kGold, 0.6f}};
    for (const Ring& ring : rings) {
        for (int i = 0; i < ring.curves; ++i) {
            const float phase = 2 * kPi * static_cast<float>(i) / static_cast<float>(ring.curves);
            constexpr int kParts = 900;
            Vec2 before;
            for (int part = 0; part <= kParts; ++part) {
                const float a = 2 * kPi * static_cast<float>(part) / kParts;
                const float r =
                    ring.base + ring.swing * std::cos(static_cast<float>(ring.lobes) * a + phase) *
                                    (0.75f + 0.25f * std::cos(2 * phase));
                const Vec2 at = centre + Vec2{std::cos(a), std::sin(a)} * r;
                if (part > 0) {
                    canvas.Stroke(before, at, ring.width, ring.width, ring.colour, 0.8f);
                }
                before = at;
            }
        }
    }
    canvas.Layer([&](Vec2 p) -> Paint {
        const float r = Length(p - centre);
        const float rim = std::max({Line(r - 196, 1.4f), Line(r - 191, 0.7f), Line(r - 22, 1)});
        return {kInk, rim};
    });
}

// A frame of woven waves round the page.
void DrawBorder(CCanvas& canvas) {
    canvas.Layer(
        [](Vec2 p) -> Paint {
            const float edge = std::min({p.x, p.y, kWidth - p.x, kHeight - p.y});
            if (edge > 50) {
                return {};
            }
            const bool flat = std::min(p.y, kHeight - p.y) < std::min(p.x, kWidth - p.x);
            const float along = flat ? p.x - kWidth / 2.0f : p.y - kHeight / 2.0f;
            float ink = std::max(Line(edge - 20, 1.6f), Line(edge - 46, 1.0f));
            ink = std::max(ink, Line(edge - 24, 0.6f));
            if (edge > 24 && edge < 46) {
                for (int i = 0; i < 6; ++i) {
                    const float phase = kPi / 3 * static_cast<float>(i);
                    const float wave = 9.5f * std::sin(along * 2 * kPi / 40 + phase) *
                                       std::cos(along * 2 * kPi / 240);
                    const float slope =
                        9.5f * 2 * kPi / 40 * std::cos(along * 2 * kPi / 40 + phase);
                    ink = std::max(
                        ink, 0.85f * Line((edge - 35 - wave) / std::sqrt(1 + slope * slope * 0.5f),
                                          0.7f));
                }
            }
            return {kBlue, ink};
        },
        3);
}

// Spokes that close up to the middle: they turn grey where the picture can no longer show them.
void DrawStar(CCanvas& canvas, Vec2 centre, float radius) {
    canvas.Layer(
        [&](Vec2 p) -> Paint {
            const Vec2 q = p - centre;
            const float r = Length(q);
            if (r > radius + 3) {
                return {};
            }
            const float spoke = std::sin(std::atan2(q.y, q.x) * 36) > 0 ? 1.0f : 0.0f;
            return {kInk, r > radius ? Line(r - radius - 1, 1) : spoke};
        },
        5);
}

// Bars of 6 down to 1 pixels, upright and level, exactly on pixels.
void DrawBars(CCanvas& canvas, int left, int top) {
    for (int size = 6; size >= 1; --size) {
        const int length = 34;
        for (int bar = 0; bar < (size > 3 ? 4 : 6); ++bar) {
            for (int i = 0; i < size; ++i) {
                for (int j = 0; j < length; ++j) {
                    canvas.At(left + bar * 2 * size + i, top + j) = kInk;
                    canvas.At(left + j, top + 44 + bar * 2 * size + i) = kInk;
                }
            }
        }
        left += std::max(length, size * 2 * (size > 3 ? 4 : 6)) + 9;
    }
}

// Rings whose pitch shrinks outwards, for moire and ringing.
void DrawZonePlate(CCanvas& canvas, Vec2 centre, float half) {
    canvas.Layer(
        [&](Vec2 p) -> Paint {
            const Vec2 q = p - centre;
            if (std::max(std::fabs(q.x), std::fabs(q.y)) > half) {
                return {};
            }
            // Two pixels a ring at the middle of the sides.
            return {kInk, 0.5f - 0.5f * std::cos(Dot(q, q) * kPi / (2 * half))};
        },
        4);
}

void DrawText(CCanvas& canvas, const std::string& folder) {
    const CType serif(folder + "/DejaVuSerif.ttf"), bold(folder + "/DejaVuSerif-Bold.ttf");
    const CType italic(folder + "/DejaVuSerif-Italic.ttf"), mono(folder + "/DejaVuSansMono.ttf");
    bold.Draw(canvas, {84, 132}, "KYV DSP", 74, kInk, 5);
    italic.Draw(canvas, {88, 168}, "a specimen of fine lines and small type", 27, kRed);
    canvas.Stroke({86, 184}, {640, 184}, 1.4f, 1.4f, kInk);
    canvas.Stroke({86, 188}, {640, 188}, 0.7f, 0.7f, kInk);
    constexpr std::string_view kLines[] = {
        "Every picture is a page that is read at a glance. What the",
        "eye takes in at once is tone and colour; what it comes back",
        "for is the fine print: hairs and twigs, the weave of a cloth,",
        "a name on a distant sign. An effect that is kind to the first",
        "and careless of the second has only done half of its work.",
    };
    float y = 218;
    for (const std::string_view line : kLines) {
        serif.Draw(canvas, {88, y}, line, 21.5f, kInk);
        y += 27;
    }
    y += 4;
    for (const float size : {19.0f, 16.0f, 13.5f, 11.5f, 10.0f, 8.5f, 7.0f}) {
        const int tenths = static_cast<int>(size * 10);
        const std::string label = std::to_string(tenths / 10) + "." + std::to_string(tenths % 10);
        mono.Draw(canvas, {88, y}, label, 11, kGold);
        serif.Draw(canvas, {126, y}, "Sphinx of black quartz, judge my vow. 0123456789 & fi fl",
                   size, kInk);
        y += size * 1.0f + 7;
    }
    bold.DrawCentred(canvas, {930, 321}, "12", 27, kInk);
    italic.DrawCentred(canvas, {930, 84}, "engraved rosette, sixty-two curves", 15, kInk);
    mono.Draw(canvas, {90, 668}, "6 px", 10, kInk);
    mono.Draw(canvas, {330, 668}, "1 px", 10, kInk);
    mono.DrawCentred(canvas, {528, 668}, "36 pairs", 10, kInk);
    mono.DrawCentred(canvas, {700, 668}, "zone plate", 10, kInk);
    // Two lines of the smallest type round nothing but themselves.
    std::string small;
    while (small.size() < 150) {
        small += "kyv dsp fine print ";
    }
    mono.Draw(canvas, {790, 668}, small.substr(0, 100), 7, kBlue);
    for (int i = 0; i < 26; ++i) {
        const char letter[] = {static_cast<char>('A' + i), 0};
        bold.DrawCentred(
            canvas, {802 + static_cast<float>(i % 13) * 33, 572 + static_cast<float>(i / 13) * 34},
            letter, 30,
            i % 3 == 0   ? kRed
            : i % 3 == 1 ? kBlue
                         : kGreen);
    }
}

// Tones as an engraver makes them: crossed lines of growing width.
void DrawHatching(CCanvas& canvas) {
    canvas.Layer(
        [](Vec2 p) -> Paint {
            const Vec2 q = {p.x - 790, p.y - 622};
            if (q.x < 0 || q.x > 420 || q.y < 0 || q.y > 30) {
                return {};
            }
            const float tone = q.x / 420;
            const float a = std::fabs(Fract((q.x + q.y) / 4.2f) - 0.5f) * 4.2f / 1.414f;
            const float b = std::fabs(Fract((q.x - q.y) / 4.2f) - 0.5f) * 4.2f / 1.414f;
            const float width = 0.25f + 1.9f * tone;
            return {kInk,
                    std::max(Line(a, width), tone > 0.4f ? Line(b, width * 1.2f - 0.8f) : 0.0f)};
        },
        3);
}

} // namespace

CCanvas DrawPrint(const std::string& fontFolder) {
    CCanvas canvas(kWidth, kHeight);
    canvas.Fill(PaperLight, 1);
    DrawBorder(canvas);
    DrawRosette(canvas, {930, 312});
    DrawBars(canvas, 90, 566);
    DrawStar(canvas, {528, 604}, 46);
    DrawZonePlate(canvas, {700, 604}, 48);
    DrawHatching(canvas);
    DrawText(canvas, fontFolder);
    return canvas;
}

} // namespace kyvsamples
