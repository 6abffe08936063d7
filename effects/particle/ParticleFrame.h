// What the callbacks of the particle effects share: parameters, times, and the canvas that the
// particles are drawn on.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "effects/particle/ParticleFxBase.h"
#include "effects/particle/ParticleRecord.h"
#include "effects/particle/StereoLibrary.h"
#include "imageutility/ImageUtility.h"
#include "interface/FrameGeometry.h"
#include "interface/HostInterface.h"

namespace kyv {

// Loads a picture that the module carries; one that it does not carry leaves the image empty.
// Throws std::bad_alloc when there is one and it cannot be had.
void LoadPicture(KYVImageUtility::CImageARGB& picture, const EffectContext& context, uint16_t id);

inline constexpr uint32_t kNoDepth = UINT32_MAX; // of an effect without a depth

// The parameters as simulations may have them: -1..1 for the depth, 0..1 for the others, which are
// sizes and densities, and 0 for what is not a number. True when one differs from its cached value;
// all are cached then.
bool ReadChanged(const EffectContext& context, uint32_t depth, std::span<float> cached);

StereoMode GetStereoMode(const FrameGeometry& geometry);

// The moments that a preview's fraction of 0 to 1 runs over.
struct PreviewSpan {
    int32_t startMs;
    float lengthMs;
};

struct CanvasSize {
    int32_t width;
    int32_t height;
};

// Which side of the frame stays when the canvas takes the display's aspect.
enum class CanvasRule {
    KeepShorterSide, // the width of a frame that is not wider than tall, otherwise the height
    KeepHeight,
};

// A single view is drawn on a canvas with the display's square pixels. Stereo views, and displays
// of an unknown or absurd aspect, give the frame's own size.
CanvasSize ChooseCanvasSize(const EffectContext& context, const FrameGeometry& geometry,
                            CanvasRule rule);

// Where the particles are drawn: the call's view of the output frame itself, or an image of another
// size or pixel format that is made from it and put back into it.
class CParticleCanvas {
public:
    enum class Pixels {
        AsTheyCome, // the frame's own format
        Argb,       // AYUV frames are converted
    };

    // Throws std::bad_alloc. A size that cannot be scaled from or to the frame is not taken.
    CParticleCanvas(const EffectContext& context, const FrameGeometry& geometry, CanvasSize size,
                    Pixels pixels);

    CParticleCanvas(const CParticleCanvas&) = delete;
    CParticleCanvas& operator=(const CParticleCanvas&) = delete;

    KYVImageUtility::CImageARGB& GetImage() { return m_bScaled ? m_canvas : m_frame; }

    float GetScale() const { return GetBounds().width / 720.0F; } // sizes are made for this width
    ParticleBounds GetBounds() const;

    // Fills the canvas from the frame, and puts it back. Throw std::bad_alloc.
    void Load();
    void Store();

private:
    bool m_bConverted;
    bool m_bScaled;
    KYVImageUtility::CImageAYUV m_ayuvView;
    KYVImageUtility::CImageARGB m_frame; // the view itself, or its conversion
    KYVImageUtility::CImageARGB m_canvas;
};

// Brings an animation, whose frame is set, to the call's moment, copies the input's view to the
// output and draws the particles on it. Throws std::bad_alloc.
void DrawAnimation(const EffectContext& context, const FrameGeometry& geometry,
                   const PreviewSpan& preview, const void* input, CParticleCanvas& canvas,
                   CParticleFxBase& particles);

} // namespace kyv
