// The shafts of the light ray effect.
//
// The picture's lights, at a fraction of its size, are what sends out light; how bright a light is
// goes with the picture, so that a dull sky has shafts too. Each pixel is to
// get the mean of all light on its way to the light's place, the farther the less. Instead of
// walking that way, every step adds to the picture a copy of itself that is zoomed about the
// light's place, and the next step's zoom is the square of this one's, so that n steps gather 2^n
// places. Shadows that turn with the angle around the light break an even glow into shafts, as
// leaves and clouds do. How much light that gives depends on the picture, so it is brought to the
// strength that the degree asks for, within bounds, and added within the room that each pixel
// leaves.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "effects/style/SmallPicture.h"
#include "effects/style/StyleFrame.h"
#include "effects/style/Tones.h"
#include "threading/ThreadPool.h"

namespace kyv {

// Keeps its buffers and threads from frame to frame. The bytes do not depend on the threads.
class CLightRayFilter {
public:
    // degree 0..30; the light's place in fractions of the frame, numbers within 16 frames of it.
    // Throws std::bad_alloc, with nothing written.
    void Render(const StyleFrame& frame, uint32_t degree, float x, float y, uint32_t threads);

private:
    static constexpr uint32_t kLightLevels = 1024;

    // What one band of rows works with.
    struct BandRows {
        SmallPictureRows small;
        std::vector<uint8_t> source;
        std::vector<uint8_t> result;
        std::vector<uint16_t> between;
    };

    void Prepare(const StyleFrame& frame, float x, float y, uint32_t bands);
    void FillShadows(int32_t first, int32_t end);
    void PrepareStep(float zoom);

    // Runs work(first row, end row, working rows) over the rows, in bands.
    template <class Work>
    void InBands(int32_t rows, Work&& work);

    void Gather(const StyleFrame& frame, int32_t first, int32_t end, BandRows& rows);
    void Shade(int32_t first, int32_t end);
    void Step(int32_t first, int32_t end, BandRows& rows);
    void PrepareFinish(float strength);
    void Finish(int32_t first, int32_t end);
    void Compose(const StyleFrame& frame, int32_t first, int32_t end, BandRows& rows) const;

    uint16_t* LightRow(std::vector<uint16_t>& light, int32_t y) const {
        return light.data() + static_cast<size_t>(y) * m_small.GetImage().GetWidth() * 4;
    }

    CSmallPicture m_small;
    std::vector<uint16_t> m_light; // 4 words a pixel of the small picture
    std::vector<uint16_t> m_next;
    std::vector<uint16_t> m_shadows; // one word a pixel, in 1/65536
    bool m_bShadowsFilled = false;
    int32_t m_shadowWidth = 0; // for which they were made
    int32_t m_shadowHeight = 0;
    float m_lightX = 0.0F; // in small pixels
    float m_lightY = 0.0F;

    CTones m_tones;
    Highlight m_lights = {};
    uint16_t m_factors[kLightLevels] = {}; // of the light, by its strongest channel, to 8 bits

    // Of the step at hand: where the row and the columns come from.
    struct Source {
        int32_t lower;
        uint16_t fraction;
    };
    std::vector<Source> m_sourceRows;
    std::vector<int32_t> m_left;
    std::vector<uint16_t> m_fractions;
    uint16_t m_kept = 0;
    uint16_t m_brought = 0;

    std::vector<BandRows> m_bands;
    std::unique_ptr<CThreadPool> m_pool;
    InstructionSet m_set = InstructionSet::Scalar;
};

} // namespace kyv
