// Shells that burst at random places into coloured sparks. The sparks fly outward, slow down, fall,
// fade, and leave glittering trails; everything is added to the picture.
#pragma once

#include <cstdint>
#include <map>
#include <vector>

#include "effects/particle/ParticleFxBase.h"
#include "effects/particle/ParticleRecord.h"
#include "effects/particle/StereoLibrary.h"
#include "imageutility/ImageUtility.h"

namespace kyv {

// Of a spark only what sparks use: no acceleration of its own, no angle, no memory of its birth.
struct Spark {
    enum class Kind : uint8_t {
        Plain, // left behind by a trail spark
        Trail,
    };

    float x; // the centre, in canvas pixels
    float y;
    float vx; // pixels per second, as are all speeds of the fireworks
    float vy;
    float drag;
    float startLife; // seconds
    float life;
    float size;
    float path;       // pixels flown since it left the last spark behind
    uint32_t glitter; // the state of its own random numbers
    int32_t alpha;
    uint8_t red;
    uint8_t green;
    uint8_t blue;
    Kind kind;
};

class CParticleFxFireworks : public CParticleFx<Spark> {
public:
    struct FrameSetup {
        float size; // 0..1, as is the density
        float density;
        float scale; // canvas width / 720
        SpawnArea spawn;
        ParticleBounds bounds;
        // B, G, R, A; stays the caller's and is used until the picture is drawn.
        KYVImageUtility::CImageARGB* canvas;
    };

    CParticleFxFireworks() = default;
    // With another stereo helper than the usual one.
    explicit CParticleFxFireworks(const NativeString& stereoLibrary) : m_stereo(stereoLibrary) {}

    // To be called before AdvanceTo. Another canvas size than before is another animation.
    void SetFrame(const FrameSetup& setup, StereoMode mode);

    void SpawnParticle(int32_t timeMs) override;
    void UpdateParticles(int32_t timeMs, int32_t deltaMs) override;
    void RetireParticles() override;
    void RenderParticles() override;

private:
    void MoveSpark(Spark& spark, float seconds);
    void LeaveTrail(Spark& spark, float fromX, float fromY);
    void DrawSpark(const Spark& spark, float shift);
    KYVImageUtility::CImageARGB& GlowOfSize(int32_t size);

    EmitterSpec m_emitter = {};
    float m_fScale = 1.0F;
    float m_fDragFactor = 0.0F;
    StereoMode m_mode = StereoMode::Mono;
    CStereoLibrary m_stereo;
    KYVImageUtility::CImageARGB* m_pCanvas = nullptr;
    std::map<int32_t, KYVImageUtility::CImageARGB> m_glows; // by size
    std::vector<Spark> m_newborn;                           // left behind in the present step
};

} // namespace kyv
