// How particles are drawn: the ripple's bending against a slow form, the sine that decides it, the
// sprite layer's geometry, lenses and glows.
#include <algorithm>
#include <climits>
#include <cmath>
#include <filesystem>
#include <limits>

#include <gtest/gtest.h>

#include "effects/particle/GlowSprite.h"
#include "effects/particle/ParticleFxBubble.h"
#include "effects/particle/ParticleFxFireworks.h"
#include "effects/particle/ParticleFxWaterripple.h"
#include "effects/particle/RippleOffsetRow.h"
#include "effects/particle/StereoSpriteLayer.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyv;
using KYVImageUtility::CImageARGB;
using kyvtest::Frame;

CImageARGB Wrap(Frame& frame, int width) {
    return {reinterpret_cast<uint8_t*>(frame.data()), width, static_cast<int>(frame.size()) / width,
            width * 4};
}

TEST(RippleSine, IsTheSineRoundedToSinglePrecision) {
    int64_t count = 0;
    for (float angle = -40.0F; angle < 400.0F; angle += 0.00037F) {
        ASSERT_EQ(RippleSine(angle), static_cast<float>(std::sin(double{angle}))) << angle;
        ++count;
    }
    EXPECT_GT(count, 1000000);
    EXPECT_EQ(RippleSine(0.0F), 0.0F);
    EXPECT_LE(std::fabs(RippleSine(1e6F)), 1.0F);
}

// ------------------------------------------------------------------------------- ripples

class CRippleProbe : public CParticleFxWaterripple {
public:
    void Take(std::vector<Ripple> ripples) { m_particles = std::move(ripples); }
};

// Pixel by pixel, through the library's own sampling, into a second picture.
void SlowRipples(Frame& picture, int width, int height, const std::vector<Ripple>& ripples) {
    for (const Ripple& ripple : ripples) {
        const int cx = static_cast<int>(ripple.x);
        const int cy = static_cast<int>(ripple.y);
        const int radius = static_cast<int>(ripple.radius);
        const auto rf = static_cast<float>(radius);
        Frame bent = picture;
        const CImageARGB from = Wrap(picture, width);
        for (int y = std::max(cy - radius, 0); y < std::min(cy + radius, height); ++y) {
            for (int x = std::max(cx - radius, 0); x < std::min(cx + radius, width); ++x) {
                const float d =
                    std::sqrt(static_cast<float>((x - cx) * (x - cx) + (y - cy) * (y - cy)));
                const float weight = std::max(rf - d, 0.0F);
                const float angle = d / ripple.wavelength * 6.2831855F + ripple.phase;
                const float offset =
                    weight / rf * ripple.amplitude * static_cast<float>(std::sin(double{angle}));
                const float sx = std::max(
                    std::min(static_cast<float>(x) + offset, static_cast<float>(width - 1)), 0.0F);
                const float sy = std::max(
                    std::min(static_cast<float>(y) + offset, static_cast<float>(height - 1)), 0.0F);
                from.SampleBilinear(static_cast<int>(sx * 65536.0F),
                                    static_cast<int>(sy * 65536.0F),
                                    reinterpret_cast<uint8_t*>(&bent[y * width + x]));
            }
        }
        picture = bent;
    }
}

TEST(RippleDrawing, BendsLikeTheSlowFormAtEveryLevel) {
    struct Case {
        int width;
        int height;
        std::vector<Ripple> ripples;
    };
    const Case cases[] = {
        {90, 70, {{45.9F, 35.2F, 9.0F, 12.0F, 30.7F, 0.0F}}},
        // over the edges, one over the other, in and out of step
        {120,
         64,
         {{0.0F, 0.0F, 16.0F, 30.0F, 60.0F, 0.0F},
          {119.0F, 63.5F, 20.0F, 22.0F, 80.0F, -3.0F},
          {60.0F, 30.0F, 31.0F, 2.0F, 250.0F, -20.0F},
          {61.0F, 31.0F, 11.0F, 29.0F, 40.0F, -1.0F}}},
        {1, 1, {{0.0F, 0.0F, 2.0F, 3.0F, 5.0F, 0.0F}}},
        {9, 2, {{9.0F, 2.0F, 2.0F, 3.0F, 1.0F, 0.0F}, {4.0F, 1.0F, 0.5F, 0.3F, 0.9F, 0.0F}}},
    };
    for (const Case& c : cases) {
        for (const int level : {0, 3, 4, 5}) {
            Frame input = kyvtest::RandomFrame(static_cast<size_t>(c.width) * c.height, 1);
            for (uint32_t& pixel : input) {
                pixel |= 0xFF000000;
            }
            Frame expected = input;
            SlowRipples(expected, c.width, c.height, c.ripples);

            Frame output = input;
            CImageARGB canvas = Wrap(output, c.width);
            canvas.SetCpuLevel(level);
            CImageARGB noSheen; // stays clear: adds nothing
            noSheen.Create(2, 2);
            noSheen.FillBytes(0);
            CRippleProbe probe;
            probe.SetFrame({&canvas, &noSheen, 1.0F, 0.5F});
            probe.Take(c.ripples);
            probe.RenderParticles();
            ASSERT_EQ(output, expected) << c.width << "x" << c.height << " level " << level;
            if (c.width > 80) {
                EXPECT_NE(output, input);
            }
        }
    }
}

TEST(RippleDrawing, AddsTheSheenFadesItAndKeepsItsFirstSize) {
    Frame input(8 * 8, 0x20102030);
    Frame output = input;
    CImageARGB canvas = Wrap(output, 8);
    CImageARGB sheen(4, 4);
    sheen.FillBytes(64); // 64 of each colour at alpha 64: (64 * 64) >> 8 = 16 more
    CRippleProbe probe;
    probe.SetFrame({&canvas, &sheen, 1.0F, 0.0F});
    probe.SetDuration(1000);
    probe.AdvanceTo(500);
    probe.Take({});
    probe.RenderIfVisible();
    EXPECT_EQ(output, Frame(64, 0xFF203040)); // the alpha of water is 255

    // Half-way into the opening fade: (0x40 * 128 + 0x30 * 128) >> 8 = 0x38; alpha is the source's.
    output = input;
    probe.AdvanceTo(125);
    probe.Take({});
    probe.RenderIfVisible();
    EXPECT_EQ(output[0], 0x20182838U);

    // A larger canvas later is water only where the sheen reaches.
    Frame largeInput(10 * 12, 0x20102030);
    Frame largeOutput = largeInput;
    CImageARGB largeCanvas = Wrap(largeOutput, 10);
    probe.SetFrame({&largeCanvas, &sheen, 1.0F, 0.0F});
    probe.AdvanceTo(500);
    probe.Take({});
    probe.RenderIfVisible();
    for (int y = 0; y < 12; ++y) {
        for (int x = 0; x < 10; ++x) {
            EXPECT_EQ(largeOutput[static_cast<size_t>(y * 10 + x)],
                      x < 8 && y < 8 ? 0xFF203040U : 0x20102030U);
        }
    }
}

// -------------------------------------------------------------------------- sprite layers

NativeString StereoFile() {
    return std::filesystem::path(KYV_STEREO_FILE).native();
}

// The smallest rectangle that is not background.
struct Box {
    int left, top, right, bottom;
    bool operator==(const Box&) const = default;
};

Box BoxOf(const Frame& frame, int width, uint32_t background) {
    Box box = {INT_MAX, INT_MAX, 0, 0};
    for (int i = 0; i < static_cast<int>(frame.size()); ++i) {
        if (frame[static_cast<size_t>(i)] != background) {
            box = {std::min(box.left, i % width), std::min(box.top, i / width),
                   std::max(box.right, i % width + 1), std::max(box.bottom, i / width + 1)};
        }
    }
    return box;
}

class SpriteLayer : public testing::Test {
protected:
    SpriteLayer() : sprite(4, 4) {
        sprite.FillBytes(255);
        particle.x = 40.0F;
        particle.y = 20.0F;
        particle.size = 10.0F;
        particle.alpha = 255;
    }

    Box Draw(StereoSpriteLayer& layer, StereoMode mode, int displayWidth = 0,
             int displayHeight = 0) {
        frame.assign(200 * 60, 0);
        CImageARGB target = Wrap(frame, 200);
        layer.BindTarget(target, displayWidth, displayHeight, mode);
        layer.SetSprite(sprite);
        layer.DrawParticle(particle);
        return BoxOf(frame, 200, 0);
    }

    CImageARGB sprite;
    ParticleRecord particle = {};
    Frame frame;
};

TEST_F(SpriteLayer, PlacesTheSpriteByItsCornerOrCentreInTheDisplaysPixels) {
    StereoSpriteLayer layer;
    EXPECT_EQ(Draw(layer, StereoMode::Mono), (Box{40, 20, 50, 30}));
    // 200 x 60 shown at 20 : 3 has pixels of aspect (60 * 20 / 3) / 200 = 2.
    EXPECT_EQ(Draw(layer, StereoMode::Mono, 20, 3), (Box{40, 20, 50, 40}));
    layer.SetAnchor(StereoSpriteLayer::Anchor::Centre);
    EXPECT_EQ(Draw(layer, StereoMode::Mono), (Box{35, 15, 45, 25}));
    layer.SetScale(2.0F, 0.5F);
    EXPECT_EQ(Draw(layer, StereoMode::Mono), (Box{30, 17, 50, 22})); // y 17.5 and height 5
    EXPECT_EQ(Draw(layer, StereoMode::HalfWidth), (Box{INT_MAX, INT_MAX, 0, 0}));
}

TEST_F(SpriteLayer, WeighsTheLayersAlphaWithTheParticlesAndAddsOnRequest) {
    StereoSpriteLayer layer;
    Draw(layer, StereoMode::Mono);
    // (255 * 255) >> 8 = 254; w = (255 * 255) >> 8 = 254; (255 * 254) >> 8 = 253
    EXPECT_EQ(frame[20 * 200 + 40], 0x00FDFDFDU);
    layer.SetAlpha(128);
    particle.alpha = 128; // 64; w = (65 * 255) >> 8 = 64; (255 * 64) >> 8 = 63
    Draw(layer, StereoMode::Mono);
    EXPECT_EQ(frame[20 * 200 + 40], 0x003F3F3FU);
    frame.assign(200 * 60, 0x00101010);
    CImageARGB target = Wrap(frame, 200);
    target.SetCpuLevel(3); // which keeps alpha
    layer.BindTarget(target, 0, 0, StereoMode::Mono);
    layer.SetBlend(StereoSpriteLayer::Blend::Additive);
    layer.DrawParticle(particle);
    EXPECT_EQ(frame[20 * 200 + 40], 0x004F4F4FU);
}

TEST_F(SpriteLayer, MovesTheViewsApartWithTheHelperAlone) {
    StereoSpriteLayer without;
    particle.z = 1.0F;
    EXPECT_EQ(Draw(without, StereoMode::LeftView), (Box{40, 20, 50, 30}));
    EXPECT_EQ(without.GetParallax(particle), 0.0F);
    StereoSpriteLayer layer(StereoFile());
    EXPECT_EQ(Draw(layer, StereoMode::LeftView), (Box{38, 20, 48, 30})); // 1 % of 200
    EXPECT_EQ(Draw(layer, StereoMode::RightView), (Box{42, 20, 52, 30}));
    EXPECT_EQ(Draw(layer, StereoMode::Mono), (Box{40, 20, 50, 30}));
    particle.z = -1.0F; // 1.5 % the other way
    EXPECT_EQ(Draw(layer, StereoMode::LeftView), (Box{43, 20, 53, 30}));
}

// -------------------------------------------------------------------------------- bubbles

class CBubbleProbe : public CParticleFxBubble {
public:
    void Take(std::vector<ParticleRecord> bubbles) { m_particles = std::move(bubbles); }
};

ParticleRecord BubbleAt(float x, float y, float size) {
    ParticleRecord bubble = {};
    bubble.x = x;
    bubble.y = y;
    bubble.size = size;
    bubble.alpha = 255;
    return bubble;
}

// A body that is not seen and a mask that lets all of the lens picture through.
struct LensRig {
    LensRig() : frame(100 * 80), body(40, 40), mask(40, 40) {
        body.FillBytes(0);
        mask.FillBytes(255);
    }

    // Columns of a colour each: red is x.
    void Render(const std::vector<ParticleRecord>& bubbles) {
        for (int i = 0; i < 100 * 80; ++i) {
            frame[static_cast<size_t>(i)] = 0xFF000000 | static_cast<uint32_t>(i % 100 * 2) << 16;
        }
        CImageARGB canvas = Wrap(frame, 100);
        CParticleFxBubble::FrameSetup setup = {};
        setup.isRefractive = true;
        setup.scale = 1.0F;
        setup.bounds = {0.0F, 0.0F, 100.0F, 80.0F};
        setup.canvas = &canvas;
        setup.source = &canvas;
        setup.body = &body;
        setup.mask = &mask;
        particles.SetFrame(setup, StereoMode::Mono);
        particles.Take(bubbles);
        particles.RenderParticles();
    }

    int Red(int x, int y) const {
        return static_cast<int>(frame[static_cast<size_t>(y * 100 + x)] >> 16 & 255);
    }

    Frame frame;
    CImageARGB body;
    CImageARGB mask;
    CBubbleProbe particles;
};

TEST(BubbleDrawing, ALensShowsAnAreaOneFifthLarger) {
    LensRig rig;
    rig.Render({BubbleAt(30.0F, 20.0F, 40.0F)});
    // Box 30..69 shows columns 26..73 (30 - trunc(4.0), 48 wide): column 50 stays about where it
    // is, the ends show what lies 4 pixels outside.
    EXPECT_NEAR(rig.Red(30, 40), 26 * 2, 2);
    EXPECT_NEAR(rig.Red(50, 40), 50 * 2, 2);
    EXPECT_NEAR(rig.Red(69, 40), 73 * 2, 4);
    EXPECT_EQ(rig.Red(29, 40), 58);
    EXPECT_EQ(rig.Red(70, 40), 140);
    EXPECT_EQ(rig.Red(50, 19), 100);
    EXPECT_EQ(rig.Red(50, 60), 100);
}

TEST(BubbleDrawing, AFrameDoesNotDependOnTheFramesBefore) {
    const std::vector<ParticleRecord> bubbles = {BubbleAt(-20.0F, 20.0F, 40.0F),
                                                 BubbleAt(85.0F, 60.0F, 37.0F),
                                                 BubbleAt(10.0F, -9.0F, 13.0F)};
    LensRig fresh;
    fresh.Render(bubbles);
    LensRig used;
    used.Render({BubbleAt(50.0F, 30.0F, 40.0F)});
    used.Render(bubbles);
    EXPECT_EQ(used.frame, fresh.frame);
    // At the left edge the lens shows what is inside: columns 0..23 squeezed into 0..19.
    EXPECT_NEAR(fresh.Red(0, 40), 0, 2);
    EXPECT_NEAR(fresh.Red(19, 40), 23 * 2, 4);
}

TEST(BubbleDrawing, LensesOfNoSizeOrOutsideDrawNothing) {
    LensRig rig;
    rig.Render({});
    const Frame untouched = rig.frame;
    constexpr float kHuge = 1e30F;
    rig.Render({BubbleAt(30.0F, 30.0F, 1.9F), BubbleAt(-50.0F, 20.0F, 40.0F),
                BubbleAt(99.0F, 79.0F, 40.0F), BubbleAt(kHuge, -kHuge, 40.0F),
                BubbleAt(std::numeric_limits<float>::quiet_NaN(), 0.0F, 40.0F)});
    EXPECT_EQ(rig.frame, untouched);
}

// ----------------------------------------------------------------------------- fireworks

class CFireworksProbe : public CParticleFxFireworks {
public:
    void Take(std::vector<Spark> sparks) { m_particles = std::move(sparks); }
};

TEST(FireworksDrawing, AddsACentredGlowOfTheSparksColour) {
    for (const int level : {0, 3, 5}) {
        for (const int size : {8, 9, 300}) {
            Frame frame(400 * 320, 0xFF101010);
            CImageARGB canvas = Wrap(frame, 400);
            canvas.SetCpuLevel(level);
            CFireworksProbe probe;
            probe.SetFrame({0.5F, 0.5F, 1.0F, {}, {0.0F, 0.0F, 400.0F, 320.0F}, &canvas},
                           StereoMode::Mono);
            Spark spark = {};
            spark.x = 200.5F;
            spark.y = 160.5F;
            spark.size = static_cast<float>(size) + 0.7F;
            spark.alpha = 255;
            spark.red = 200;
            spark.green = 100;
            probe.Take({spark});
            probe.RenderParticles();
            const Box box = BoxOf(frame, 400, 0xFF101010);
            const int half = size / 2 + 1;
            EXPECT_GE(box.left, 200 - half);
            EXPECT_GE(box.top, 160 - half);
            EXPECT_LE(box.right, 200 + half);
            EXPECT_LE(box.bottom, 160 + half);
            EXPECT_GT(box.right - box.left, size / 2);
            const uint32_t hot = frame[160 * 400 + 200];
            EXPECT_NEAR(static_cast<int>(hot >> 16 & 255), 16 + 198, 20);
            EXPECT_NEAR(static_cast<int>(hot >> 8 & 255), 16 + 99, 10);
            EXPECT_EQ(hot & 255, 16U); // no blue
            EXPECT_EQ(hot >> 24, 255U);

            // Half outside it is cut, not moved.
            Frame edge(400 * 320, 0xFF101010);
            CImageARGB edgeCanvas = Wrap(edge, 400);
            edgeCanvas.SetCpuLevel(level);
            probe.SetFrame({0.5F, 0.5F, 1.0F, {}, {0.0F, 0.0F, 400.0F, 320.0F}, &edgeCanvas},
                           StereoMode::Mono);
            spark.x = 0.5F;
            probe.Take({spark});
            probe.RenderParticles();
            if (size < 256) {
                for (int x = 0; x < half; ++x) {
                    EXPECT_EQ(edge[static_cast<size_t>(160 * 400 + x)],
                              frame[static_cast<size_t>(160 * 400 + 200 + x)]);
                }
            }
        }
    }
}

TEST(FireworksDrawing, AGlowIsHotInTheMiddleSoftAroundAndRound) {
    for (const int size : {2, 5, 30, 31}) {
        CImageARGB glow;
        DrawGlow(glow, size);
        const auto alpha = [&](int x, int y) { return int{glow.Row(y)[x * 4 + 3]}; };
        EXPECT_GE(alpha(size / 2, size / 2), size < 3 ? 50 : size < 6 ? 150 : 240);
        EXPECT_LE(alpha(0, 0), size < 6 ? 110 : 3);
        for (int y = 0; y < size; ++y) {
            for (int x = 0; x < size; ++x) {
                EXPECT_NEAR(alpha(x, y), alpha(y, x), 1);
                EXPECT_NEAR(alpha(x, y), alpha(size - 1 - x, y), 1);
                if (x > size / 2) {
                    EXPECT_LE(alpha(x, y), alpha(x - 1, y));
                }
            }
        }
    }
}

} // namespace
