// How sparks fly.
#include "effects/particle/ParticleFxFireworks.h"

#include <algorithm>
#include <cmath>

#include "effects/particle/ParticleMath.h"

namespace kyv {
namespace {

constexpr int kSparksPerShell = 50;
constexpr float kGravity = 50.0F; // pixels per second squared

// Sparks go while they are still fairly bright, which gives a burst its crisp end.
constexpr int32_t kFaintestAlpha = 100;

constexpr float kTrailSpacing = 3.5F; // pixels at scale 1

// Far more than a spark can leave behind in one step.
constexpr int kMostTrailSparks = 64;

// In seconds; the longest are the sum of the two.
constexpr float kShortestShellLife = 1.4F;
constexpr float kShellLifeRange = 1.0F;
constexpr float kShortestTrailLife = 0.4F;
constexpr float kTrailLifeRange = 1.0F;

// Of a spark of a burst and then of the last one that it leaves behind, with room for rounding.
constexpr int32_t kLongestLifeMs =
    static_cast<int32_t>((kShortestShellLife + kShellLifeRange) * 1000.0F) +
    static_cast<int32_t>((kShortestTrailLife + kTrailLifeRange) * 1000.0F) + 100;

constexpr float kTrailSpread = 16.0F; // pixels per second at scale 1

struct Vector {
    float x;
    float y;
};

Vector Normalise(const Vector& v) {
    const float length = std::sqrt(v.x * v.x + v.y * v.y);
    return {v.x / length, v.y / length};
}

struct Color {
    uint32_t channel[3]; // red, green, blue
};

// One strong channel, one of any strength and one weak.
Color DrawColor(CParticleRandom& random) {
    const uint32_t arrangement = random.Next() % 6;
    const uint32_t a = random.Next() % 255;
    const uint32_t b = random.Next() % 50;
    const Color colors[6] = {{{255, a, b}}, {{255, b, a}}, {{a, 255, b}},
                             {{b, 255, a}}, {{a, b, 255}}, {{b, a, 255}}};
    return colors[arrangement];
}

uint8_t Dim(uint32_t channel, uint32_t factor) {
    return static_cast<uint8_t>(factor * channel >> 8);
}

uint8_t AddHeat(uint8_t channel, uint32_t heat) {
    return static_cast<uint8_t>(std::min(channel + heat, 255U));
}

} // namespace

void CParticleFxFireworks::SpawnParticle(int32_t) {
    if (!HasRoom(m_particles.size())) {
        return;
    }
    const ParticleRecord shell = SpawnFromEmitter(m_emitter, m_random);
    const Color color = DrawColor(m_random);
    const float shellSpeed = m_random.Unit() * 180.0F + 180.0F;
    // The order of the draws decides how every firework looks.
    for (int i = 0; i < kSparksPerShell; ++i) {
        Spark spark = {};
        spark.kind = Spark::Kind::Trail;
        spark.drag = (m_random.Unit() * 0.5F + 0.75F) * m_fDragFactor;
        spark.startLife = m_random.Unit() * kShellLifeRange + kShortestShellLife;
        spark.life = spark.startLife;
        spark.size = std::max(8.0F, (m_random.Unit() * 0.3F + 1.0F) * m_fScale * 10.0F);
        Vector direction;
        direction.x = m_random.Unit() - 0.5F;
        direction.y = m_random.Unit() - 0.5F;
        direction = Normalise(direction); // never zero: 0.5 is between two random numbers
        const float distance = m_random.Unit() * 20.0F + 1.0F;
        spark.x = shell.x + direction.x * distance;
        spark.y = shell.y + direction.y * distance;
        direction.x *= m_random.Unit() + 0.5F;
        direction.y *= m_random.Unit() + 0.5F;
        direction = Normalise(direction);
        const float boost = m_random.Unit() * 0.1F + 1.0F;
        spark.vx = direction.x * boost * shellSpeed;
        spark.vy = direction.y * boost * shellSpeed;
        spark.red = Dim(color.channel[0], m_random.Next() % 150 + 100);
        spark.green = Dim(color.channel[1], m_random.Next() % 150 + 100);
        spark.blue = Dim(color.channel[2], m_random.Next() % 150 + 100);
        spark.alpha = 255;
        spark.glitter = m_random.GetState();
        m_particles.push_back(spark);
    }
}

void CParticleFxFireworks::MoveSpark(Spark& spark, float seconds) {
    const float g = 1.0F / (spark.drag * seconds + 1.0F);
    const float g2 = g * g;
    const float g6 = g2 * g2 * g2;
    spark.vx = spark.vx * g6;
    spark.vy = (spark.vy + kGravity * seconds) * g6;
    spark.x += spark.vx * seconds;
    spark.y += spark.vy * seconds;
    spark.life -= seconds;
    const float spent = (spark.startLife - spark.life) / spark.startLife;
    const float fraction = std::max(0.0F, 1.0F - spent * spent);
    spark.alpha = static_cast<int32_t>(fraction * 255.0F);
}

// A spark draws from random numbers of its own, so that it glitters the same way whatever else is
// in the air.
void CParticleFxFireworks::LeaveTrail(Spark& spark, float fromX, float fromY) {
    const float dx = spark.x - fromX;
    const float dy = spark.y - fromY;
    const float flown = std::sqrt(dx * dx + dy * dy);
    const float spacing = kTrailSpacing * m_fScale;
    CParticleRandom random;
    random.Seed(spark.glitter);
    float next = spacing - spark.path; // along the way of this step
    for (int i = 0; i < kMostTrailSparks && next <= flown; ++i, next += spacing) {
        const float part = flown > 0.0F ? next / flown : 0.0F;
        Spark left = {};
        left.kind = Spark::Kind::Plain;
        left.x = fromX + dx * part;
        left.y = fromY + dy * part;
        // Slower than the spark and a little to any side: a tail that opens and sinks.
        const float drift = random.Unit() * 0.2F + 0.05F;
        left.vx = spark.vx * drift + (random.Unit() - 0.5F) * kTrailSpread * m_fScale;
        left.vy = spark.vy * drift + (random.Unit() - 0.5F) * kTrailSpread * m_fScale;
        left.drag = spark.drag;
        left.startLife = random.Unit() * kTrailLifeRange + kShortestTrailLife;
        left.life = left.startLife;
        const float width = random.Unit();
        left.size = (width * width * 0.6F + 0.3F) * spark.size;
        // Most are faint and a few flash; white in all of them makes the head of a tail glow hot.
        const float glint = random.Unit();
        const auto brightness = static_cast<uint32_t>(glint * glint * 130.0F) + 110;
        const auto heat = static_cast<uint32_t>(glint * 100.0F);
        left.red = AddHeat(Dim(spark.red, brightness), heat);
        left.green = AddHeat(Dim(spark.green, brightness), heat);
        left.blue = AddHeat(Dim(spark.blue, brightness), heat);
        left.alpha = 255;
        left.glitter = random.GetState();
        m_newborn.push_back(left);
    }
    // What the limit left out is not made up for in the next step.
    spark.path = std::min(std::max(0.0F, flown - (next - spacing)), spacing);
    spark.glitter = random.GetState();
}

void CParticleFxFireworks::UpdateParticles(int32_t, int32_t deltaMs) {
    const float seconds = static_cast<float>(deltaMs) * 0.001F;
    m_newborn.clear();
    for (Spark& spark : m_particles) {
        const float fromX = spark.x;
        const float fromY = spark.y;
        MoveSpark(spark, seconds);
        if (spark.kind == Spark::Kind::Trail) {
            LeaveTrail(spark, fromX, fromY);
        } else if (spark.size > 5.0F) {
            CParticleRandom random;
            random.Seed(spark.glitter);
            spark.size -= (random.Unit() * 0.1F + 0.1F) * m_fScale;
            spark.glitter = random.GetState();
        }
    }
    m_particles.insert(m_particles.end(), m_newborn.begin(), m_newborn.end());
}

void CParticleFxFireworks::RetireParticles() {
    std::erase_if(m_particles, [this](const Spark& spark) {
        return spark.alpha < kFaintestAlpha ||
               !IsInBounds(spark.x, spark.y, spark.size, m_emitter.bounds);
    });
}

void CParticleFxFireworks::SetFrame(const FrameSetup& setup, StereoMode mode) {
    if (m_emitter.bounds.width != setup.bounds.width ||
        m_emitter.bounds.bottom != setup.bounds.bottom) {
        ClearSnapshots();
    }
    SetEmitInterval(TruncateToInt((1.0F - setup.density) * 2000.0F + 300.0F));
    SetMaxParticles(-1);
    SetLongestLife(kLongestLifeMs);
    m_fScale = setup.scale;
    m_fDragFactor = ((1.0F - setup.size) * 0.6F + 0.25F) / setup.scale;
    m_emitter.spawn = setup.spawn;
    m_emitter.bounds = setup.bounds;
    m_pCanvas = setup.canvas;
    m_mode = mode;
    if (mode != StereoMode::Mono) {
        // The display is the canvas here, whatever the host's is.
        const int32_t width = m_pCanvas->GetWidth();
        const int32_t height = m_pCanvas->GetHeight();
        m_stereo.Configure({
            .displayAspectWidth = width,
            .displayAspectHeight = height,
            .imageWidth = width,
            .imageHeight = height,
            .imagePitchBytes = m_pCanvas->GetPitch(),
        });
    }
}

} // namespace kyv
