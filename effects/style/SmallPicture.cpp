// Shrinking, blurring and enlarging.
#include "effects/style/SmallPicture.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "effects/style/ShrinkRow.h"
#include "effects/style/StyleMath.h"
#include "imageutility/kernels/Bilinear.h"

namespace kyv {
namespace {

// Enlarging reads pairs of neighbours, so there are always two columns and two rows.
int32_t Shrunk(int32_t size, int32_t bits) {
    return std::max((size + (1 << bits) - 1) >> bits, 2);
}

// The place of pixel i of the frame among the small pixels, whose centres lie in the middle of
// their squares: the nearer of two neighbours, and the way to the other in 1/128.
struct Place {
    Place(int32_t i, int32_t bits, int32_t count) {
        const int32_t at = std::clamp((2 * i + 1) * 64 - (64 << bits), 0, INT32_MAX) >> bits;
        lower = std::min(at >> 7, count - 2);
        fraction = std::min(at - (lower << 7), 127);
    }

    int32_t lower;
    int32_t fraction;
};

} // namespace

int32_t ChooseShrinkBits(int32_t width, float sigma, int32_t widest, float leastSigma) {
    int32_t bits = 0;
    while (bits < kMostShrinkBits &&
           ((width >> bits) > widest || sigma >= leastSigma * static_cast<float>(2 << bits))) {
        ++bits;
    }
    return bits;
}

void CSmallPicture::Prepare(int32_t frameWidth, int32_t frameHeight, int32_t bits,
                            const ResolvedLevel& level) {
    if (frameWidth != m_frameWidth || frameHeight != m_frameHeight || bits != m_bits) {
        m_bits = -1; // should an allocation fail
        const int32_t width = Shrunk(frameWidth, bits);
        const int32_t height = Shrunk(frameHeight, bits);
        m_image.Create(width, height);
        m_other.Create(width, height);
        m_left.resize(static_cast<size_t>(frameWidth));
        m_weights.resize(static_cast<size_t>(frameWidth) * 2);
        for (int32_t x = 0; x < frameWidth; ++x) {
            const Place place(x, bits, width);
            m_left[x] = place.lower;
            m_weights[2 * x] = static_cast<uint8_t>(128 - place.fraction);
            m_weights[2 * x + 1] = static_cast<uint8_t>(place.fraction);
        }
        m_frameWidth = frameWidth;
        m_frameHeight = frameHeight;
        m_bits = bits;
    }
    m_image.TakeCpuLevel(level);
    m_other.TakeCpuLevel(level);
}

void CSmallPicture::PrepareRows(SmallPictureRows& rows) const {
    const auto width = static_cast<size_t>(m_image.GetWidth());
    rows.sums.resize(width << m_bits << 2);
    rows.between.resize(width * 4);
    rows.enlarged.resize(static_cast<size_t>(m_frameWidth) * 4);
}

void CSmallPicture::TakeRow(int32_t y, const uint8_t* row, SmallPictureRows& rows) {
    const size_t bytes = static_cast<size_t>(m_frameWidth) * 4;
    const int32_t side = 1 << m_bits;
    // The last row and the last column stand for those that are missing in the last squares.
    const int32_t last = y + 1 == m_frameHeight ? (m_image.GetHeight() << m_bits) - 1 : y;
    for (; y <= last; ++y) {
        if ((y & (side - 1)) == 0) {
            std::fill(rows.sums.begin(), rows.sums.end(), uint16_t{0});
        }
        kAddRow.For(m_image.GetInstructionSet())(rows.sums.data(), row, bytes);
        if (((y + 1) & (side - 1)) == 0) {
            uint16_t* edge = rows.sums.data() + bytes;
            for (uint16_t* pixel = edge; pixel < rows.sums.data() + rows.sums.size(); pixel += 4) {
                std::memcpy(pixel, edge - 4, 4 * sizeof *pixel);
            }
            kAverageRow.For(m_image.GetInstructionSet())(m_image.Row(y >> m_bits), rows.sums.data(),
                                                         static_cast<size_t>(m_image.GetWidth()),
                                                         m_bits);
        }
    }
}

void CSmallPicture::Blur(float sigma) {
    // A box of radius r has the variance r (r + 1) / 3, and variances add up: the largest radius
    // that three times stays below the wanted one, and one more for as many of them as fit.
    const float small = sigma / static_cast<float>(1 << m_bits);
    const float wanted = small * small * 3.0F;
    int32_t radius = 0;
    while (static_cast<float>(3 * (radius + 1) * (radius + 2)) <= wanted) {
        ++radius;
    }
    const float missing = wanted - static_cast<float>(3 * radius * (radius + 1));
    const int32_t wider = RoundHalfUp(missing / static_cast<float>(2 * (radius + 1)));
    for (int32_t pass = 0; pass < 3; ++pass) {
        const int32_t r = radius + (pass < wider ? 1 : 0);
        if (r > 0) {
            m_window.BlurImage(m_image, m_other, r);
            m_image.Swap(m_other);
        }
    }
}

const uint8_t* CSmallPicture::Row(int32_t y, SmallPictureRows& rows) const {
    if (m_bits == 0) {
        return m_image.Row(y);
    }
    const Place place(y, m_bits, m_image.GetHeight());
    const auto width = static_cast<size_t>(m_image.GetWidth());
    kLerp.For(m_image.GetInstructionSet())(rows.between.data(), m_image.Row(place.lower),
                                           m_image.Row(place.lower + 1), width,
                                           static_cast<uint32_t>(place.fraction));
    kBilinear.For(m_image.GetInstructionSet())(
        rows.enlarged.data(), rows.between.data(), static_cast<size_t>(m_frameWidth),
        {.left = m_left.data(), .weights = m_weights.data()});
    return rows.enlarged.data();
}

} // namespace kyv
