// How ripples bend the picture.
#include <algorithm>
#include <cmath>
#include <cstring>
#include <vector>

#include "effects/particle/ParticleFxWaterripple.h"
#include "effects/particle/ParticleMath.h"
#include "effects/particle/RippleOffsetRow.h"
#include "effects/particle/RippleSampleRow.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;

// Squares of distances stay within 32 bits up to here; only canvases beyond 78000 pixels have
// larger ripples, which end there.
constexpr int32_t kFarthest = 32767;

// Bends a picture ripple by ripple, in place.
//
// The offset of a pixel depends on its distance from the centre alone, so one quarter of a row of
// offsets serves both halves of the rows above and below the centre. Rows are bent from the centre
// outwards, a pair at a time. A bent row may replace the original only when no row to come reads
// it any more; until then it waits. No pixel is moved farther than the amplitude, so few wait.
class CRippleBender {
public:
    // The picture has one more column and row than width and height say, all of them written.
    CRippleBender(CImageARGB& picture, int32_t width, int32_t height)
        : m_picture(picture), m_nWidth(width), m_nHeight(height),
          m_offsetRow(kRippleOffsetRow.For(picture.GetInstructionSet())),
          m_sampleRow(kRippleSampleRow.For(picture.GetInstructionSet())) {}

    void Bend(const Ripple& ripple);

private:
    // A bent row that has not replaced the original yet.
    struct WaitingRow {
        int32_t y;
        int32_t x;
        int32_t count; // 0: none
        std::vector<uint8_t> pixels;
    };

    int32_t MakeOffsets(int32_t dy, int32_t radius, const RippleShape& shape);
    void BendRow(WaitingRow& waiting, int32_t y, int32_t centreX, int32_t reach);
    void Replace(WaitingRow& waiting);

    CImageARGB& m_picture;
    int32_t m_nWidth;
    int32_t m_nHeight;
    RippleOffsetRow m_offsetRow;
    RippleSampleRow m_sampleRow;
    std::vector<float> m_offsets; // of a whole row, from the left end of the ripple to its right
    std::vector<WaitingRow> m_above;
    std::vector<WaitingRow> m_below;
};

// How many columns at the centre and on one side of it are inside the ripple.
int32_t ReachOf(int32_t radius, int32_t dy) {
    const double square = double{static_cast<double>(radius)} * radius - double(dy) * dy;
    return std::min({static_cast<int32_t>(std::sqrt(square)) + 1, radius, kFarthest + 1});
}

int32_t CRippleBender::MakeOffsets(int32_t dy, int32_t radius, const RippleShape& shape) {
    const int32_t reach = ReachOf(radius, dy);
    m_offsets.resize(static_cast<size_t>(reach) * 2 - 1);
    float* centre = m_offsets.data() + (reach - 1);
    m_offsetRow(centre, static_cast<size_t>(reach), dy, shape);
    std::reverse_copy(centre + 1, centre + reach, m_offsets.data());
    return reach;
}

void CRippleBender::BendRow(WaitingRow& waiting, int32_t y, int32_t centreX, int32_t reach) {
    waiting.count = 0;
    const int32_t left = centreX - reach + 1;
    const int32_t first = std::max(left, 0);
    const int32_t last = std::min(centreX + reach, m_nWidth);
    if (y < 0 || y >= m_nHeight || first >= last) {
        return;
    }
    waiting.y = y;
    waiting.x = first;
    waiting.count = last - first;
    waiting.pixels.resize(static_cast<size_t>(waiting.count) * 4);
    const RipplePicture picture = {m_picture.GetBuffer(), m_picture.GetPitch(), m_nWidth,
                                   m_nHeight};
    m_sampleRow(waiting.pixels.data(), picture, first, y, m_offsets.data() + (first - left),
                static_cast<size_t>(waiting.count));
}

void CRippleBender::Replace(WaitingRow& waiting) {
    if (waiting.count > 0) {
        std::memcpy(m_picture.Row(waiting.y) + ptrdiff_t{waiting.x} * 4, waiting.pixels.data(),
                    static_cast<size_t>(waiting.count) * 4);
        waiting.count = 0;
    }
}

void CRippleBender::Bend(const Ripple& ripple) {
    const int32_t radius = TruncateToInt(ripple.radius);
    if (radius < 1) {
        return;
    }
    const int32_t centreX = TruncateToInt(ripple.x);
    const int32_t centreY = TruncateToInt(ripple.y);
    const RippleShape shape = {static_cast<float>(radius), ripple.wavelength, ripple.amplitude,
                               ripple.phase};
    // Row y reads no farther than the amplitude, and one row for what lies between two.
    const int32_t wait = TruncateToInt(ripple.amplitude) + 3;
    m_above.resize(static_cast<size_t>(wait));
    m_below.resize(static_cast<size_t>(wait));
    const int32_t farthest =
        std::min({radius - 1, kFarthest, std::max(centreY, m_nHeight - 1 - centreY)});
    for (int32_t dy = 0; dy <= farthest; ++dy) {
        const int32_t reach = MakeOffsets(dy, radius, shape);
        const auto slot = static_cast<size_t>(dy % wait);
        Replace(m_above[slot]);
        Replace(m_below[slot]);
        BendRow(m_below[slot], centreY + dy, centreX, reach);
        if (dy > 0) {
            BendRow(m_above[slot], centreY - dy, centreX, reach);
        }
    }
    std::for_each(m_above.begin(), m_above.end(), [this](WaitingRow& row) { Replace(row); });
    std::for_each(m_below.begin(), m_below.end(), [this](WaitingRow& row) { Replace(row); });
}

} // namespace

void CParticleFxWaterripple::RenderParticles() {
    // The canvas may have another size than the sheen; the rest of it stays as it is.
    const int32_t width = std::min(m_nWidth, m_sheen.GetWidth());
    const int32_t height = std::min(m_nHeight, m_sheen.GetHeight());
    CImageARGB canvas;
    CImageARGB sheen;
    m_pCanvas->GetSubImage(canvas, 0, 0, width, height);
    m_sheen.GetSubImage(sheen, 0, 0, width, height);

    CImageARGB picture;
    picture.Create(width + 1, height + 1); // the margin is read with weight 0
    std::memset(picture.Row(height), 0, static_cast<size_t>(picture.GetPitch()));
    for (int32_t y = 0; y < height; ++y) {
        std::memset(picture.Row(y) + ptrdiff_t{width} * 4, 0, 4);
    }
    CImageARGB water;
    picture.GetSubImage(water, 0, 0, width, height);
    water.TakeCpuLevel(*m_pCanvas);
    water.CopyFrom(canvas);
    water.AddBlend(sheen, 255);
    water.SetAlpha(255);

    picture.TakeCpuLevel(*m_pCanvas);
    CRippleBender bender(picture, width, height);
    for (const Ripple& ripple : m_particles) {
        bender.Bend(ripple);
    }

    // The closing fade rules where both are active.
    const uint8_t fade = GetFadeOutAlpha() < 255 ? GetFadeOutAlpha() : GetFadeInAlpha();
    if (fade == 255) {
        canvas.CopyFrom(water);
        return;
    }
    canvas.TakeCpuLevel(*m_pCanvas);
    canvas.AlphaBlend(water, fade);
}

} // namespace kyv
