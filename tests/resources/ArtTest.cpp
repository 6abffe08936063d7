// The committed pictures of the module: what the effects rely on when they draw with them.
#include <algorithm>
#include <array>
#include <fstream>
#include <iterator>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#define STB_IMAGE_IMPLEMENTATION
#define STB_IMAGE_STATIC
#define STBI_ONLY_PNG
#include <stb/stb_image.h>

namespace {

using Bytes = std::vector<uint8_t>;

Bytes ReadArt(const std::string& name) {
    std::ifstream file(std::string(KYV_ART_DIR "/") + name, std::ios::binary);
    EXPECT_TRUE(file) << name;
    return {std::istreambuf_iterator<char>(file), {}};
}

uint32_t Little(const Bytes& bytes, size_t at, int count = 4) {
    uint32_t value = 0;
    for (int i = count; i-- > 0;) {
        value = value << 8 | bytes.at(at + static_cast<size_t>(i));
    }
    return value;
}

// Straight-alpha R, G, B, A, rows top down.
struct Picture {
    int width = 0, height = 0;
    Bytes rgba;
    const uint8_t* At(int x, int y) const {
        return &rgba.at(static_cast<size_t>(y * width + x) * 4);
    }
};

Picture ReadPng(const std::string& name) {
    const Bytes file = ReadArt(name);
    // Bit depth 8 and colour type 6 (RGBA), as the file itself states them.
    EXPECT_EQ(file.at(24), 8) << name;
    EXPECT_EQ(file.at(25), 6) << name;
    Picture picture;
    int channels = 0;
    stbi_uc* pixels = stbi_load_from_memory(file.data(), static_cast<int>(file.size()),
                                            &picture.width, &picture.height, &channels, 4);
    EXPECT_NE(pixels, nullptr) << name;
    if (pixels) {
        picture.rgba.assign(pixels, pixels + picture.width * picture.height * 4);
        stbi_image_free(pixels);
    }
    return picture;
}

// A bitmap file that a resource compiler takes unchanged; the rows as they are stored.
struct Bmp {
    uint32_t width, height, bits, colours;
    Bytes palette, rows;
};

Bmp ReadBmp(const std::string& name) {
    const Bytes file = ReadArt(name);
    Bmp bmp{Little(file, 18), Little(file, 22), Little(file, 28, 2), Little(file, 46), {}, {}};
    EXPECT_EQ(Little(file, 0, 2), 0x4D42u) << name;
    EXPECT_EQ(Little(file, 2), file.size()) << name;
    EXPECT_EQ(Little(file, 14), 40u) << name;
    EXPECT_EQ(Little(file, 26, 2), 1u) << name;
    EXPECT_EQ(Little(file, 30), 0u) << name << " is compressed";
    const uint32_t offset = 54 + bmp.colours * 4;
    EXPECT_EQ(Little(file, 10), offset) << name;
    EXPECT_EQ(file.size() - offset, bmp.width * bmp.height * bmp.bits / 8) << name;
    bmp.palette.assign(file.begin() + 54, file.begin() + offset);
    bmp.rows.assign(file.begin() + offset, file.end());
    return bmp;
}

Picture ReadBmp32(const std::string& name) {
    const Bmp bmp = ReadBmp(name);
    EXPECT_EQ(bmp.bits, 32u) << name;
    Picture picture{static_cast<int>(bmp.width), static_cast<int>(bmp.height), {}};
    for (size_t y = bmp.height; y-- > 0;) {
        for (size_t x = 0; x < bmp.width; ++x) {
            const uint8_t* p = &bmp.rows.at((y * bmp.width + x) * 4);
            picture.rgba.insert(picture.rgba.end(), {p[2], p[1], p[0], p[3]});
        }
    }
    return picture;
}

// Over a background of the given grey.
int Blend(const uint8_t* rgba, int channel, int background) {
    return (rgba[channel] * rgba[3] + background * (255 - rgba[3])) / 255;
}

TEST(Art, SpritesHaveTheirSizesAndStraightAlpha) {
    struct Case {
        const char* name;
        int size;
    };
    for (const Case& c :
         {Case{"Png141.png", 200}, Case{"Png142.png", 200}, Case{"Png143.png", 200},
          Case{"Png145.png", 64}, Case{"Bitmap101.bmp", 50}, Case{"Bitmap135.bmp", 50},
          Case{"Bitmap126.bmp", 200}, Case{"Bitmap127.bmp", 200}, Case{"Bitmap128.bmp", 200},
          Case{"Bitmap129.bmp", 200}, Case{"Bitmap130.bmp", 64}}) {
        SCOPED_TRACE(c.name);
        const Picture picture = c.name[0] == 'P' ? ReadPng(c.name) : ReadBmp32(c.name);
        ASSERT_EQ(picture.width, c.size);
        ASSERT_EQ(picture.height, c.size);
        // Premultiplied pixels never have a colour above their alpha. These must: a thin veil of a
        // light colour is what most of them are made of.
        int straight = 0, drawn = 0;
        for (size_t i = 0; i < picture.rgba.size(); i += 4) {
            const uint8_t* p = &picture.rgba[i];
            const bool veil = p[3] >= 4 && p[3] < 200;
            drawn += veil;
            straight += veil && std::max({p[0], p[1], p[2]}) > p[3];
        }
        EXPECT_GT(drawn, c.size);
        EXPECT_GT(straight, drawn / 2);
    }
}

TEST(Art, BubbleReadsOnDarkAndOnBright) {
    const Picture body = ReadPng("Png141.png");
    ASSERT_EQ(body.rgba.size(), 160000u);
    for (const auto& [x, y] : {std::pair{0, 0}, {199, 0}, {0, 199}, {199, 199}}) {
        EXPECT_EQ(body.At(x, y)[3], 0);
    }
    EXPECT_LT(body.At(100, 100)[3], 64) << "the middle is nearly clear";
    // Along a spoke the rim is somewhere clearly lighter than black and darker than white.
    for (const auto& [dx, dy] : {std::pair{1, 0}, {-1, 0}, {0, 1}, {0, -1}}) {
        int lightest = 0, darkest = 255;
        for (int r = 80; r < 100; ++r) {
            const uint8_t* p = body.At(100 + dx * r, 100 + dy * r);
            lightest = std::max(lightest, Blend(p, 1, 0));
            darkest = std::min(darkest, Blend(p, 1, 255));
        }
        EXPECT_GT(lightest, 100) << dx << ',' << dy;
        EXPECT_LT(darkest, 170) << dx << ',' << dy;
    }
}

TEST(Art, MasksOfTheBubbleFitItsOutline) {
    const Picture body = ReadPng("Png141.png"), miniature = ReadPng("Png142.png"),
                  lens = ReadPng("Png143.png");
    ASSERT_EQ(lens.rgba.size(), body.rgba.size());
    ASSERT_EQ(miniature.rgba.size(), body.rgba.size());
    for (size_t i = 3; i < body.rgba.size(); i += 4) {
        if (body.rgba[i] == 0) {
            ASSERT_EQ(lens.rgba[i], 0) << "outside the bubble, pixel " << i / 4;
            ASSERT_EQ(miniature.rgba[i], 0) << "outside the bubble, pixel " << i / 4;
        }
    }
    // A lens is solid under the clear middle; the miniature lets the body shine through, and does
    // not touch the rim, which would vanish under it.
    EXPECT_EQ(lens.At(100, 100)[3], 255);
    EXPECT_EQ(lens.At(100, 20)[3], 255);
    EXPECT_GT(miniature.At(100, 110)[3], 120);
    EXPECT_LT(miniature.At(100, 110)[3], 220);
    EXPECT_LT(miniature.At(100, 5)[3], 8);
}

TEST(Art, SheenAddsSoftLight) {
    const Picture sheen = ReadPng("Png145.png");
    ASSERT_EQ(sheen.rgba.size(), 64u * 64 * 4);
    const auto light = [&](int x, int y) {
        const uint8_t* p = sheen.At(x & 63, y & 63);
        return p[1] * p[3] >> 8;
    };
    int brightest = 0, steepest = 0, dark = 0;
    for (int y = 0; y < 64; ++y) {
        for (int x = 0; x < 64; ++x) {
            brightest = std::max(brightest, light(x, y));
            dark += light(x, y) <= 4;
            // Neighbours across the edges count too: the pattern tiles.
            steepest = std::max({steepest, std::abs(light(x, y) - light(x + 1, y)),
                                 std::abs(light(x, y) - light(x, y + 1))});
        }
    }
    EXPECT_GT(brightest, 40);
    EXPECT_LT(brightest, 100);
    EXPECT_GT(dark, 2048) << "a picture under the sheen keeps its blacks";
    EXPECT_LT(steepest, 40) << "at 1920 x 1080, more than 2 levels a row would show as a step";
}

TEST(Art, WipesUncoverEvenly) {
    struct Case {
        const char* name;
        uint32_t entries, drawn;
    };
    for (const Case& c : {Case{"Bitmap140.bmp", 133, 133}, Case{"Bitmap113.bmp", 256, 255}}) {
        SCOPED_TRACE(c.name);
        const Bmp bmp = ReadBmp(c.name);
        EXPECT_EQ(bmp.width, 640u);
        EXPECT_EQ(bmp.height, 480u);
        ASSERT_EQ(bmp.bits, 8u);
        ASSERT_EQ(bmp.colours, c.entries);
        std::set<uint8_t> greys;
        for (size_t i = 0; i < bmp.palette.size(); i += 4) {
            greys.insert(bmp.palette[i + 2]);
            EXPECT_EQ(bmp.palette[i], bmp.palette[i + 1]);
            EXPECT_EQ(bmp.palette[i], bmp.palette[i + 2]);
            EXPECT_EQ(bmp.palette[i + 3], 0);
        }
        EXPECT_EQ(greys.size(), c.entries);

        std::array<int, 256> area{};
        for (const uint8_t index : bmp.rows) {
            ASSERT_LT(index, bmp.colours);
            ++area[bmp.palette[index * 4u + 2]];
        }
        // Level 255 would never change with smoothness 0.
        EXPECT_EQ(area[255], 0);
        EXPECT_GT(area[0], 0);
        EXPECT_GT(area[254], 0);
        // The uncovered share runs with the threshold, never more than one level's area off, and
        // no level takes more than its part.
        const double total = 640.0 * 480, part = 1.0 / c.drawn;
        int used = 0;
        double uncovered = 0;
        for (int level = 0; level < 255; ++level) {
            used += area[static_cast<size_t>(level)] > 0;
            EXPECT_LT(area[static_cast<size_t>(level)] / total, part * 1.01) << level;
            uncovered += area[static_cast<size_t>(level)] / total;
            EXPECT_NEAR(uncovered, (level + 1) / 255.0, part * 1.01) << level;
        }
        EXPECT_EQ(used, static_cast<int>(c.drawn));
        // The edge of a wipe is a line and not dust: neighbours are mostly close in their turn.
        size_t jumps = 0;
        for (size_t i = 1; i < bmp.rows.size(); ++i) {
            const int step = bmp.palette[bmp.rows[i] * 4u] - bmp.palette[bmp.rows[i - 1] * 4u];
            jumps += i % 640 != 0 && std::abs(step) > 24;
        }
        EXPECT_LT(jumps, bmp.rows.size() / 50);
    }
}

} // namespace
