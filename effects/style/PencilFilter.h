// The drawing of the pencil sketch.
//
// Contours are where the picture is darker than its surroundings: the difference of two blurs whose
// width goes with the stroke size, so that lines swell with the contrast and fade out by
// themselves. A fainter copy a little out of place redraws them where the hand rests lightly. Tone
// is hatched in four directions that come in one after the other as it darkens, over an even
// rubbing; the paper's tooth breaks whatever is not pressed hard, and bright parts stay paper.
#pragma once

#include <cstdint>
#include <vector>

#include "effects/style/PencilTexture.h"
#include "effects/style/StyleFrame.h"
#include "effects/style/StyleMask.h"

namespace kyv {

struct PencilSettings {
    int32_t strokeSize;     // 1..10
    uint32_t edgeThreshold; // 1..230
    uint32_t edgeIntensity; // 20..100
    uint32_t texture;       // frames with equal numbers have equal strokes and grain
};

// Keeps its buffers and textures from frame to frame.
class CPencilFilter {
public:
    // The mask must be a normalised one. Throws std::bad_alloc, with nothing written.
    void Render(const StyleFrame& frame, const PencilSettings& settings, const MaskShape& mask);

private:
    // A picture of one byte a pixel.
    struct Plane {
        std::vector<uint8_t> bytes;
        int32_t width = 0;
        uint8_t* Row(int32_t y) { return bytes.data() + static_cast<size_t>(y) * width; }
    };

    void Prepare(const StyleFrame& frame);
    void ReadLuma(const StyleFrame& frame);
    // Blurs the plane to and fro with the spare one.
    void Smooth(Plane*& plane, Plane*& spare, float variance);
    void SmoothOnce(Plane& from, Plane& to, int32_t distance);
    void DrawRows(const StyleFrame& frame, Plane& lines, Plane& tone, int32_t echoX, int32_t echoY);

    CPencilTexture m_texture;
    CStyleMask m_mask;
    Plane m_planes[3];
    int32_t m_width = 0;
    int32_t m_height = 0;
    InstructionSet m_set = InstructionSet::Scalar;
    std::vector<uint8_t> m_padded; // a row with room for neighbours on both sides
    std::vector<uint8_t> m_source; // rows of the frame
    std::vector<uint8_t> m_result;
    std::vector<uint8_t> m_rows; // one of every tile, of the echo, and of ink
};

} // namespace kyv
