// The particle simulations without a picture: against slow forms that play every step from 0, and
// against themselves, reached on other ways.
#include <algorithm>
#include <bit>
#include <cmath>
#include <cstring>
#include <limits>
#include <random>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "effects/particle/ParticleFxBubble.h"
#include "effects/particle/ParticleFxFireworks.h"
#include "effects/particle/ParticleFxWaterripple.h"
#include "effects/particle/ParticleRandom.h"

namespace {

using namespace kyv;
using KYVImageUtility::CImageARGB;
using testing::ElementsAre;

// The generator of the runtime library, written down once more.
struct SlowRandom {
    uint32_t state = 1;
    int Next() {
        state = state * 214013 + 2531011;
        return static_cast<int>(state >> 16 & 32767);
    }
    float Unit() { return static_cast<float>(Next()) / 32767.0F; }
};

std::vector<uint32_t> SlowSeeds() {
    std::vector<uint32_t> seeds(100000);
    SlowRandom random;
    for (uint32_t& seed : seeds) {
        seed = static_cast<uint32_t>(random.Next());
    }
    return seeds;
}

TEST(ParticleRandom, DrawsTheWellKnownSequence) {
    CParticleRandom random;
    random.Seed(1);
    EXPECT_EQ(random.Next(), 41U);
    EXPECT_EQ(random.Next(), 18467U);
    EXPECT_EQ(random.Next(), 6334U);
}

TEST(ParticleRandom, StepsTakeTheTableOverAndOver) {
    const std::vector<uint32_t> seeds = SlowSeeds();
    for (const int64_t step : {0, 1, 99999, 100000, 123456789}) {
        EXPECT_EQ(StepSeed(step), seeds[static_cast<size_t>(step % 100000)]) << step;
    }
}

// Counts what the base calls.
class CProbe : public CParticleFx<int> {
public:
    std::vector<int32_t> births;
    int32_t steps = 0;
    int32_t renders = 0;
    std::vector<int32_t> saved;

    void SpawnParticle(int32_t timeMs) override { births.push_back(timeMs); }
    void UpdateParticles(int32_t timeMs, int32_t deltaMs) override {
        EXPECT_EQ(deltaMs, timeMs == 0 ? 0 : 33);
        ++steps;
    }
    void RetireParticles() override {}
    void RenderParticles() override { ++renders; }
    void SaveSnapshot(int32_t index) override {
        saved.push_back(index);
        CParticleFx<int>::SaveSnapshot(index);
    }
};

TEST(ParticleFramework, EmitsAtZeroAndInTheFirstStepAfterEveryInterval) {
    // Steps are at multiples of 33: 1683 is the first beyond 1650, 3333 the first beyond 3300.
    CProbe probe;
    probe.SetEmitInterval(1650);
    probe.AdvanceTo(3400);
    EXPECT_THAT(probe.births, ElementsAre(0, 1683, 3333));

    CProbe dense; // several births in one step carry its time
    dense.SetEmitInterval(10);
    dense.AdvanceTo(66);
    EXPECT_THAT(dense.births, ElementsAre(0, 33, 33, 33, 66, 66, 66));

    for (const int32_t interval : {0, -5, INT32_MIN}) {
        CProbe none;
        none.SetEmitInterval(interval);
        none.AdvanceTo(5000);
        EXPECT_TRUE(none.births.empty());
    }
}

TEST(ParticleFramework, StepsEachTimeOnceAndKeepsEveryHundredthState) {
    CProbe probe;
    for (int32_t time = 0; time <= 10000; time += 20) {
        probe.AdvanceTo(time);
    }
    EXPECT_EQ(probe.steps, 10000 / 33 + 1);
    EXPECT_THAT(probe.saved, ElementsAre(0, 1, 2, 3));
    probe.AdvanceTo(3400); // from step 100 to step 103
    EXPECT_EQ(probe.steps, 304 + 4);
    probe.AdvanceTo(-7);
    EXPECT_EQ(probe.steps, 304 + 4 + 1);
    probe.ClearSnapshots();
    probe.AdvanceTo(3300);
    EXPECT_EQ(probe.steps, 304 + 4 + 1 + 101);
}

TEST(ParticleFramework, FadesOverAQuarterOfTheClipAndAtMostTwoSeconds) {
    struct Case {
        int32_t duration;
        int32_t time;
        int in;
        int out;
    };
    constexpr Case kCases[] = {
        {1000, 0, 0, 255},        {1000, 125, 128, 255},     {1000, 250, 255, 255},
        {1000, 750, 255, 255},    {1000, 751, 255, 254}, // 249 * 256 / 250
        {1000, 875, 255, 128},    {1000, 1000, 255, 0},      {100000, 1000, 128, 255},
        {100000, 2000, 255, 255}, {100000, 99000, 255, 128}, {3, 0, 255, 255},
        {3, 3, 255, 255}, // no fade length at all
        {1, 1, 255, 255},
    };
    for (const Case& c : kCases) {
        CProbe probe;
        probe.SetDuration(c.duration);
        probe.AdvanceTo(c.time);
        EXPECT_EQ(probe.GetFadeInAlpha(), c.in) << c.duration << " at " << c.time;
        EXPECT_EQ(probe.GetFadeOutAlpha(), c.out) << c.duration << " at " << c.time;
    }
}

TEST(ParticleFramework, NothingIsSimulatedOrDrawnBeyondTheClip) {
    CProbe probe;
    probe.SetDuration(1000);
    probe.AdvanceTo(1001);
    probe.RenderIfVisible();
    EXPECT_EQ(probe.steps, 0);
    EXPECT_EQ(probe.renders, 0);
    probe.AdvanceTo(1000); // simulated, but faded out
    probe.RenderIfVisible();
    EXPECT_EQ(probe.steps, 31);
    EXPECT_EQ(probe.renders, 0);
    probe.AdvanceTo(500);
    probe.RenderIfVisible();
    EXPECT_EQ(probe.renders, 1);
    probe.SetDuration(0); // the fades stay as they were
    probe.AdvanceTo(100000);
    EXPECT_EQ(probe.GetFadeOutAlpha(), 255);
}

// ------------------------------------------------------------------------------- bubbles

struct BubbleRig {
    BubbleRig(int32_t width, int32_t height) : canvas(width, height), picture(4, 4) {
        setup.density = 0.5F;
        setup.minSize = 0.2F;
        setup.maxSize = 0.5F;
        setup.isRefractive = false;
        setup.displayWidth = setup.displayHeight = 0;
        const auto w = static_cast<float>(width);
        const auto h = static_cast<float>(height);
        setup.scale = w / 720.0F;
        setup.spawn = {0.0F, h - 1.0F, 0.0F, w, 0.0F};
        setup.bounds = {0.0F, 0.0F, w, h};
        setup.canvas = &canvas;
        setup.source = &canvas;
        setup.body = &picture;
        setup.mask = &picture;
    }

    void GoTo(int32_t timeMs) {
        particles.SetFrame(setup, StereoMode::Mono);
        particles.AdvanceTo(timeMs);
    }

    CImageARGB canvas;
    CImageARGB picture;
    CParticleFxBubble::FrameSetup setup;
    CParticleFxBubble particles;
};

struct SlowBubble {
    float x, y, vx, vy, ax, size, sway, angle;
    bool operator==(const SlowBubble&) const = default;
};

// Every step from 0, with a list of its own.
std::vector<SlowBubble> PlayBubbles(const CParticleFxBubble::FrameSetup& setup, int32_t timeMs) {
    static const std::vector<uint32_t> seeds = SlowSeeds();
    const float s = setup.scale;
    const float w = setup.bounds.width;
    const float h = setup.bounds.bottom;
    const auto interval = static_cast<int>((1.0F - setup.density) * 2700.0F + 300.0F);
    const float smallest = (setup.minSize * 250.0F + 20.0F) * s;
    const float range = std::max(smallest, (setup.maxSize * 250.0F + 20.0F) * s) - smallest;
    std::vector<SlowBubble> list;
    int lastEmit = 0;
    for (int t = 0, n = 0; t <= timeMs; t += 33, ++n) {
        SlowRandom random{seeds[static_cast<size_t>(n) % 100000]};
        const auto spawn = [&] {
            SlowBubble b = {};
            b.x = static_cast<float>(
                static_cast<int>(static_cast<float>(static_cast<int>(w)) * random.Unit()));
            random.Unit();
            b.y = static_cast<float>(static_cast<int>(h - 1.0F));
            random.Unit();
            b.vy = -0.025F * s + random.Unit() * (-0.03F * s);
            b.ax = -0.00003F * s + random.Unit() * (0.00006F * s);
            random.Unit();
            b.size = smallest + random.Unit() * range;
            b.sway = (random.Unit() + 3.0F) * (0.01F * s);
            list.push_back(b);
        };
        if (t == 0) {
            spawn();
        }
        for (; t > lastEmit + interval; lastEmit += interval) {
            spawn();
        }
        std::vector<SlowBubble> alive;
        for (SlowBubble b : list) {
            if (t > 0) {
                if (std::fabs(b.vx) > b.sway) {
                    b.ax = -b.ax;
                }
                b.vx += b.ax * 33.0F;
                b.x += b.vx * 33.0F;
                b.y += b.vy * 33.0F;
                b.angle += 0.04F * 33.0F;
                b.angle = b.angle >= 360.0F ? b.angle - 360.0F : b.angle;
            }
            const auto size = static_cast<float>(static_cast<int>(b.size));
            if (b.x + size > 0 && w > b.x && b.y + size > 0 && b.y < h) {
                alive.push_back(b);
            }
        }
        list = alive;
    }
    return list;
}

std::vector<SlowBubble> Bubbles(const CParticleFxBubble& particles) {
    std::vector<SlowBubble> list;
    for (const ParticleRecord& b : particles.GetParticles()) {
        list.push_back({b.x, b.y, b.vx, b.vy, b.ax, b.size, b.swayLimit, b.angle});
    }
    return list;
}

TEST(BubbleSimulation, AnyPositionMatchesTheSlowFormThatPlaysFromZero) {
    for (const auto& [width, height] : {std::pair{320, 180}, {1440, 810}, {90, 300}}) {
        for (const float density : {0.0F, 0.3F, 1.0F}) {
            BubbleRig rig(width, height);
            rig.setup.density = density;
            rig.setup.maxSize = density; // below the smallest size in one case
            for (const int32_t time : {0, 32, 33, 400000, 5000, 3299, 3300, 60000, 60033, 59000}) {
                rig.GoTo(time);
                const std::vector<SlowBubble> expected = PlayBubbles(rig.setup, time);
                ASSERT_EQ(Bubbles(rig.particles), expected)
                    << width << "x" << height << " density " << density << " at " << time;
            }
            EXPECT_FALSE(rig.particles.GetParticles().empty());
        }
    }
}

TEST(BubbleSimulation, AnHourInMatchesTheSlowForm) {
    BubbleRig rig(720, 405);
    rig.GoTo(3600000);
    EXPECT_EQ(Bubbles(rig.particles), PlayBubbles(rig.setup, 3600000));
}

TEST(BubbleSimulation, AWiderCanvasScalesSizesAndSpeeds) {
    BubbleRig small(720, 400);
    BubbleRig large(1440, 800);
    small.GoTo(0);
    large.GoTo(0);
    const ParticleRecord& a = small.particles.GetParticles().at(0);
    const ParticleRecord& b = large.particles.GetParticles().at(0);
    EXPECT_FLOAT_EQ(b.size, 2 * a.size);
    EXPECT_FLOAT_EQ(b.vy, 2 * a.vy);
    EXPECT_FLOAT_EQ(b.ax, 2 * a.ax);
    EXPECT_FLOAT_EQ(b.swayLimit, 2 * a.swayLimit);
}

TEST(BubbleSimulation, BubblesThatCannotRiseDoNotPileUp) {
    // In single precision a step upwards is nothing at this height.
    BubbleRig rig(1, 1 << 20);
    rig.setup.density = 1.0F;
    rig.GoTo(INT32_MAX);
    EXPECT_LE(rig.particles.GetParticles().size(), 2001U);
}

// ------------------------------------------------------------------------ fireworks, ripples

struct FireworksRig {
    FireworksRig(int32_t width, int32_t height, float size, float density) : canvas(width, height) {
        const auto w = static_cast<float>(width);
        const auto h = static_cast<float>(height);
        setup = {size, density, w / 720.0F, {0.0F, 0.0F, 0.0F, w, h}, {0.0F, 0.0F, w, h}, &canvas};
        particles.SetFrame(setup, StereoMode::Mono);
    }

    CImageARGB canvas;
    CParticleFxFireworks::FrameSetup setup;
    CParticleFxFireworks particles;
};

struct RippleRig {
    RippleRig(int32_t width, int32_t height, float density) : canvas(width, height), sheen(4, 4) {
        sheen.FillBytes(0);
        particles.SetFrame({&canvas, &sheen, static_cast<float>(width) / 720.0F, density});
    }

    CImageARGB canvas;
    CImageARGB sheen;
    CParticleFxWaterripple particles;
};

template <class Particles>
std::vector<uint8_t> StateOf(const Particles& particles) {
    const auto& list = particles.GetParticles();
    std::vector<uint8_t> bytes(list.size() * sizeof(list[0]));
    std::memcpy(bytes.data(), list.data(), bytes.size());
    return bytes;
}

// Jumps to random positions and compares with one that plays every frame.
template <class Particles>
void ExpectSeekingEqualsPlaying(Particles& played, Particles& sought, int32_t lengthMs) {
    std::mt19937 random(1);
    std::vector<int32_t> times;
    std::vector<std::vector<uint8_t>> states;
    for (int32_t time = 0; time <= lengthMs; time += 40) {
        played.AdvanceTo(time);
        if (random() % 16 == 0) {
            times.push_back(time);
            states.push_back(StateOf(played));
        }
    }
    for (int visit = 0; visit < 60; ++visit) {
        const size_t i = random() % times.size();
        if (visit % 20 == 19) {
            sought.ClearSnapshots();
        }
        sought.AdvanceTo(times[i]);
        ASSERT_EQ(StateOf(sought), states[i]) << "at " << times[i];
    }
}

TEST(FireworksSimulation, SeekingGivesTheStateOfPlaying) {
    for (const auto& [width, height] : {std::pair{1920, 1080}, {320, 240}, {5, 7}}) {
        FireworksRig played(width, height, 0.7F, 1.0F);
        FireworksRig sought(width, height, 0.7F, 1.0F);
        ExpectSeekingEqualsPlaying(played.particles, sought.particles, 8000);
    }
}

TEST(FireworksSimulation, AShellIsFiftyColouredSparksThatObeyTheRules) {
    FireworksRig rig(1440, 810, 0.25F, 0.5F); // scale 2
    rig.particles.AdvanceTo(0);
    // The same shell, drawn once more in the order that decides how it looks.
    SlowRandom random{SlowSeeds()[0]};
    const auto x = static_cast<float>(static_cast<int>(1440.0F * random.Unit()));
    const auto y = static_cast<float>(static_cast<int>(810.0F * random.Unit()));
    for (int i = 0; i < 5; ++i) {
        random.Next();
    }
    const int q = random.Next() % 6;
    const int a = random.Next() % 255;
    const int b = random.Next() % 50;
    const int colors[6][3] = {{255, a, b}, {255, b, a}, {a, 255, b},
                              {b, 255, a}, {a, b, 255}, {b, a, 255}};
    const float speed = random.Unit() * 180.0F + 180.0F;
    const float dragFactor = ((1.0F - 0.25F) * 0.6F + 0.25F) / 2.0F;
    const auto& sparks = rig.particles.GetParticles();
    ASSERT_EQ(sparks.size(), 50U);
    for (const Spark& spark : sparks) {
        EXPECT_EQ(spark.drag, (random.Unit() * 0.5F + 0.75F) * dragFactor);
        EXPECT_EQ(spark.startLife, random.Unit() + 1.4F);
        EXPECT_EQ(spark.size, std::max(8.0F, (random.Unit() * 0.3F + 1.0F) * 2.0F * 10.0F));
        float dx = random.Unit() - 0.5F;
        float dy = random.Unit() - 0.5F;
        float length = std::sqrt(dx * dx + dy * dy);
        dx /= length;
        dy /= length;
        const float distance = random.Unit() * 20.0F + 1.0F;
        EXPECT_EQ(spark.x, x + dx * distance);
        EXPECT_EQ(spark.y, y + dy * distance);
        dx *= random.Unit() + 0.5F;
        dy *= random.Unit() + 0.5F;
        length = std::sqrt(dx * dx + dy * dy);
        const float boost = random.Unit() * 0.1F + 1.0F;
        EXPECT_FLOAT_EQ(spark.vx, dx / length * boost * speed);
        EXPECT_FLOAT_EQ(spark.vy, dy / length * boost * speed);
        EXPECT_EQ(spark.red, (random.Next() % 150 + 100) * colors[q][0] >> 8);
        EXPECT_EQ(spark.green, (random.Next() % 150 + 100) * colors[q][1] >> 8);
        EXPECT_EQ(spark.blue, (random.Next() % 150 + 100) * colors[q][2] >> 8);
        EXPECT_EQ(spark.kind, Spark::Kind::Trail);
        EXPECT_EQ(spark.alpha, 255);
    }

    const Spark before = sparks[7];
    rig.particles.AdvanceTo(33);
    const Spark after = rig.particles.GetParticles()[7];
    const double g6 = std::pow(1.0 / (before.drag * 0.033 + 1.0), 6);
    EXPECT_NEAR(after.vx, before.vx * g6, 1e-3);
    EXPECT_NEAR(after.vy, (before.vy + 50 * 0.033) * g6, 1e-3);
    EXPECT_NEAR(after.x, before.x + after.vx * 0.033, 1e-3);
    EXPECT_NEAR(after.y, before.y + after.vy * 0.033, 1e-3);
}

TEST(FireworksSimulation, SparksGoWhileTheyAreBrightAndTrailsKeepTheirSpacing) {
    FireworksRig rig(720, 405, 1.0F, 0.0F); // one shell in 2300 ms, scale 1
    rig.particles.AdvanceTo(0);
    // One that flies towards the middle and so stays in the picture.
    const auto& sparks = rig.particles.GetParticles();
    const auto missesMiddle = [](const Spark& spark) {
        return std::hypot(spark.x + spark.vx - 360.0F, spark.y + spark.vy - 202.0F);
    };
    Spark last = *std::min_element(sparks.begin(), sparks.end(), [&](const auto& a, const auto& b) {
        return missesMiddle(a) < missesMiddle(b);
    });
    float flown = 0.0F;
    size_t left = 0;
    for (int32_t time = 33; time <= 330; time += 33) {
        rig.particles.AdvanceTo(time);
        const Spark now = *std::find_if(sparks.begin(), sparks.end(), [&](const Spark& spark) {
            return spark.startLife == last.startLife && spark.drag == last.drag;
        });
        flown += std::hypot(now.x - last.x, now.y - last.y);
        left = static_cast<size_t>(flown / 3.5F);
        EXPECT_NEAR(now.path, flown - 3.5F * static_cast<float>(left), 0.01F);
        last = now;
    }
    EXPECT_GT(left, 10U);
    size_t trails = 0;
    for (int32_t time = 330; time <= 2000; time += 33) {
        rig.particles.AdvanceTo(time);
        for (const Spark& spark : rig.particles.GetParticles()) {
            ASSERT_GE(spark.alpha, 100);
            // alpha 100 is reached at 78 % of a life of at most 2.4 seconds
            ASSERT_GT(spark.life, 0.2F * spark.startLife);
            trails += spark.kind == Spark::Kind::Plain ? 1 : 0;
        }
    }
    EXPECT_GT(trails, 1000U);
}

// Sparks that fly farther in a step than they may leave others behind for.
TEST(FireworksSimulation, WhatASparkDidNotLeaveBehindIsNotMadeUpFor) {
    FireworksRig rig(720, 405, 1.0F, 0.0F);
    rig.setup.size = 1.4F; // hardly any drag
    rig.setup.scale = 0.02F;
    const float spacing = 3.5F * 0.02F; // 64 of them are 4.5 pixels, and a step is 6 to 12
    rig.particles.SetFrame(rig.setup, StereoMode::Mono);
    float farthest = 0.0F;
    for (int32_t time = 0; time <= 99; time += 33) {
        rig.particles.AdvanceTo(time);
        for (const Spark& spark : rig.particles.GetParticles()) {
            farthest = std::max(farthest, spark.path);
        }
    }
    EXPECT_EQ(farthest, spacing);
}

TEST(FireworksSimulation, TheSparksInTheAirStayBoundedOverTenMinutes) {
    FireworksRig rig(1920, 1080, 1.0F, 1.0F);
    size_t most = 0;
    for (int32_t time = 0; time <= 600000; time += 33) {
        rig.particles.AdvanceTo(time);
        most = std::max(most, rig.particles.GetParticles().size());
    }
    EXPECT_GT(most, 1000U);
    EXPECT_LT(most, 12000U);
}

TEST(RippleSimulation, SeekingGivesTheStateOfPlaying) {
    for (const auto& [width, height] : {std::pair{1920, 1080}, {3, 2}}) {
        RippleRig played(width, height, 0.8F);
        RippleRig sought(width, height, 0.8F);
        played.particles.SetDuration(60000);
        sought.particles.SetDuration(60000);
        ExpectSeekingEqualsPlaying(played.particles, sought.particles, 60000);
    }
}

TEST(RippleSimulation, RipplesSpreadForFiveSecondsAndAreNotBornInTheClosingFade) {
    RippleRig rig(1440, 810, 1.0F); // scale 2, one every 500 ms
    rig.particles.AdvanceTo(0);
    ASSERT_EQ(rig.particles.GetParticles().size(), 1U);
    const Ripple born = rig.particles.GetParticles()[0];
    SlowRandom random{SlowSeeds()[0]};
    EXPECT_EQ(born.x, random.Unit() * 1440.0F);
    EXPECT_EQ(born.y, random.Unit() * 810.0F);
    EXPECT_EQ(born.wavelength, 32.0F);
    EXPECT_EQ(born.amplitude, 60.0F);
    EXPECT_EQ(born.radius, 200.0F);
    rig.particles.AdvanceTo(990); // 30 steps of 33 ms
    const Ripple& now = rig.particles.GetParticles()[0];
    EXPECT_NEAR(now.phase, -4.95F, 1e-4);
    EXPECT_NEAR(now.amplitude, 60.0F - 2 * 5.94F, 1e-3);
    EXPECT_NEAR(now.radius, 200.0F + 2 * 39.6F, 1e-3);
    EXPECT_NEAR(now.wavelength, 32.0F + 2 * 3.96F, 1e-3);
    EXPECT_EQ(rig.particles.GetParticles().size(), 2U); // born at 0 and 528
    rig.particles.AdvanceTo(4950);
    EXPECT_EQ(rig.particles.GetParticles().size(), 10U); // the last at 4521; the first has 0.6 left
    rig.particles.AdvanceTo(5049);
    EXPECT_EQ(rig.particles.GetParticles().size(), 10U); // one more at 5016, the first is gone

    // Births at or before 8000 only: the last one then is gone 5000 ms later.
    rig.particles.SetDuration(10000);
    rig.particles.AdvanceTo(8000);
    const size_t atFade = rig.particles.GetParticles().size();
    const float youngest = rig.particles.GetParticles().back().radius;
    rig.particles.AdvanceTo(9999);
    EXPECT_LT(rig.particles.GetParticles().size(), atFade);
    EXPECT_GT(rig.particles.GetParticles().back().radius, youngest + 100.0F);
}

// Nothing may hang at a far position, and what a first visit leaves out is gone for certain.
TEST(FarPositions, AFirstVisitGivesTheStateOfPlayingOn) {
    constexpr int32_t kHourMs = 3600000;
    FireworksRig played(640, 360, 1.0F, 1.0F);
    FireworksRig visited(640, 360, 1.0F, 1.0F);
    for (int32_t time = kHourMs - 20000; time <= kHourMs; time += 33) {
        played.particles.AdvanceTo(time);
    }
    played.particles.AdvanceTo(kHourMs);
    visited.particles.AdvanceTo(kHourMs);
    EXPECT_GT(visited.particles.GetParticles().size(), 500U);
    EXPECT_EQ(StateOf(visited.particles), StateOf(played.particles));

    RippleRig playedRipple(640, 360, 1.0F);
    RippleRig visitedRipple(640, 360, 1.0F);
    for (int32_t time = 0; time <= kHourMs; time += 3300) {
        playedRipple.particles.AdvanceTo(time);
    }
    playedRipple.particles.AdvanceTo(kHourMs);
    visitedRipple.particles.AdvanceTo(kHourMs);
    EXPECT_EQ(StateOf(visitedRipple.particles), StateOf(playedRipple.particles));

    visited.particles.AdvanceTo(INT32_MAX);
    visitedRipple.particles.AdvanceTo(INT32_MAX);
    EXPECT_FALSE(visited.particles.GetParticles().empty());
    EXPECT_FALSE(visitedRipple.particles.GetParticles().empty());
}

} // namespace
