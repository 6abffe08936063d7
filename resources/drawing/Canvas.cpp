// Strokes and lights, and what a drawn picture goes through: blur, bloom, tone, grain.
#include "resources/drawing/Canvas.h"

namespace kyvdraw {

void CCanvas::Stroke(Vec2 a, Vec2 b, float width0, float width1, Colour colour, float alpha) {
    const float reach = std::max(width0, width1) / 2 + 1;
    const int left = std::max(0, static_cast<int>(std::floor(std::min(a.x, b.x) - reach)));
    const int top = std::max(0, static_cast<int>(std::floor(std::min(a.y, b.y) - reach)));
    const int right = std::min(m_nWidth - 1, static_cast<int>(std::max(a.x, b.x) + reach));
    const int bottom = std::min(m_nHeight - 1, static_cast<int>(std::max(a.y, b.y) + reach));
    const Vec2 along = b - a;
    const float length2 = std::max(Dot(along, along), 1e-6f);
    for (int y = top; y <= bottom; ++y) {
        for (int x = left; x <= right; ++x) {
            const Vec2 p = {static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f};
            const float t = Clamp01(Dot(p - a, along) / length2);
            const float width = Mix(width0, width1, t);
            const float distance = Length(p - (a + along * t));
            // A line thinner than a pixel fades instead of breaking up.
            const float cover =
                Clamp01(std::max(width, 1.0f) / 2 + 0.5f - distance) * std::min(width, 1.0f);
            At(x, y) = Mix(At(x, y), colour, cover * alpha);
        }
    }
}

void CCanvas::Blade(Vec2 root, Vec2 bend, Vec2 tip, float width, Colour rootColour,
                    Colour tipColour) {
    constexpr int kParts = 7;
    Vec2 from = root;
    for (int i = 1; i <= kParts; ++i) {
        const float t = static_cast<float>(i) / kParts;
        const Vec2 to = root * ((1 - t) * (1 - t)) + bend * (2 * t * (1 - t)) + tip * (t * t);
        const float before = t - 1.0f / kParts;
        Stroke(from, to, width * (1 - before * before), width * (1 - t * t),
               Mix(rootColour, tipColour, t));
        from = to;
    }
}

void CCanvas::AddGlow(Vec2 centre, float radius, Colour light) {
    const int left = std::max(0, static_cast<int>(centre.x - radius * 3));
    const int top = std::max(0, static_cast<int>(centre.y - radius * 3));
    const int right = std::min(m_nWidth - 1, static_cast<int>(centre.x + radius * 3));
    const int bottom = std::min(m_nHeight - 1, static_cast<int>(centre.y + radius * 3));
    for (int y = top; y <= bottom; ++y) {
        for (int x = left; x <= right; ++x) {
            const Vec2 p = {static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f};
            At(x, y) += light * Gauss(Length(p - centre), radius);
        }
    }
}

CCanvas CCanvas::Blurred(float sigma) const {
    const int radius = std::max(1, static_cast<int>(sigma + 0.5f));
    CCanvas result = *this, scratch = *this;
    const auto pass = [radius](const CCanvas& from, CCanvas& to, bool rows) {
        const int length = rows ? from.m_nWidth : from.m_nHeight;
        ForRows(rows ? from.m_nHeight : from.m_nWidth, [&](int line) {
            const auto at = [&](int i) {
                i = std::clamp(i, 0, length - 1);
                return rows ? from.At(i, line) : from.At(line, i);
            };
            Colour sum;
            for (int i = -radius; i <= radius; ++i) {
                sum += at(i);
            }
            for (int i = 0; i < length; ++i) {
                (rows ? to.At(i, line) : to.At(line, i)) =
                    sum * (1.0f / static_cast<float>(2 * radius + 1));
                sum = sum + at(i + radius + 1) - at(i - radius);
            }
        });
    };
    for (int i = 0; i < 3; ++i) {
        pass(result, scratch, true);
        pass(scratch, result, false);
    }
    return result;
}

void CCanvas::Bloom(float threshold, float sigma, float strength) {
    CCanvas bright = *this;
    for (Colour& c : bright.m_Pixels) {
        const float level = std::max({c.r, c.g, c.b});
        c *= Clamp01((level - threshold) / std::max(level, 1e-6f));
    }
    const CCanvas soft = bright.Blurred(sigma);
    for (size_t i = 0; i < m_Pixels.size(); ++i) {
        m_Pixels[i] += soft.m_Pixels[i] * strength;
    }
}

void CCanvas::Shoulder(float knee) {
    const auto roll = [knee](float x) {
        return x <= knee ? x : 1 - (1 - knee) * std::exp(-(x - knee) / (1 - knee));
    };
    for (Colour& c : m_Pixels) {
        c = {roll(c.r), roll(c.g), roll(c.b)};
    }
}

void CCanvas::Grain(float deviation, uint32_t seed) {
    CScatter scatter(seed);
    for (Colour& c : m_Pixels) {
        const float tone = ToEncoded(Luminance(c));
        const float offset = scatter.Bell() * deviation / 255 * (0.35f + 2.6f * tone * (1 - tone));
        c = {ToLinear(std::max(0.0f, ToEncoded(c.r) + offset)),
             ToLinear(std::max(0.0f, ToEncoded(c.g) + offset)),
             ToLinear(std::max(0.0f, ToEncoded(c.b) + offset))};
    }
}

} // namespace kyvdraw
