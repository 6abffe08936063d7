// A picture being drawn: linear light in floats, shaded by functions of the place or by strokes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <thread>
#include <vector>

#include "resources/drawing/Noise.h"
#include "resources/drawing/Shapes.h"

namespace kyvdraw {

// Calls work(row) for every row, on two threads. Rows must not depend on each other.
template <class Work>
void ForRows(int height, Work work) {
    const auto half = [&](int first) {
        for (int y = first; y < height; y += 2) {
            work(y);
        }
    };
    std::thread odd(half, 1);
    half(0);
    odd.join();
}

class CCanvas {
public:
    CCanvas(int width, int height)
        : m_nWidth(width), m_nHeight(height),
          m_Pixels(static_cast<size_t>(width) * static_cast<size_t>(height)) {}

    int Width() const { return m_nWidth; }
    int Height() const { return m_nHeight; }
    Colour& At(int x, int y) {
        return m_Pixels[static_cast<size_t>(y) * static_cast<size_t>(m_nWidth) +
                        static_cast<size_t>(x)];
    }
    const Colour& At(int x, int y) const { return const_cast<CCanvas*>(this)->At(x, y); }

    // Sets every pixel to the mean of samples x samples values of shade(Vec2), in pixels.
    template <class Shade>
    void Fill(Shade shade, int samples = 2) {
        ForRows(m_nHeight, [&](int y) {
            for (int x = 0; x < m_nWidth; ++x) {
                Colour sum;
                for (int i = 0; i < samples * samples; ++i) {
                    sum += shade(Sample(x, y, i, samples));
                }
                At(x, y) = sum * (1.0f / static_cast<float>(samples * samples));
            }
        });
    }

    // Paints the mean of samples x samples values of shade(Vec2) -> Paint over the picture.
    template <class Shade>
    void Layer(Shade shade, int samples = 2) {
        ForRows(m_nHeight, [&](int y) {
            for (int x = 0; x < m_nWidth; ++x) {
                Colour sum;
                float alpha = 0;
                for (int i = 0; i < samples * samples; ++i) {
                    const Paint paint = shade(Sample(x, y, i, samples));
                    sum += paint.colour * paint.alpha;
                    alpha += paint.alpha;
                }
                const float share = 1.0f / static_cast<float>(samples * samples);
                At(x, y) = At(x, y) * (1 - alpha * share) + sum * share;
            }
        });
    }

    // A line from a to b that tapers from width0 to width1 (pixels), with soft edges.
    void Stroke(Vec2 a, Vec2 b, float width0, float width1, Colour colour, float alpha = 1);
    // A bent, tapering blade: from root along a curve through bend to tip.
    void Blade(Vec2 root, Vec2 bend, Vec2 tip, float width, Colour rootColour, Colour tipColour);
    // Adds light round a centre, falling off as a bell of the given radius.
    void AddGlow(Vec2 centre, float radius, Colour light);

    // The picture averaged by three box passes, close to a bell of the given deviation.
    CCanvas Blurred(float sigma) const;
    // Lets bright light bleed into its surroundings, as a lens does.
    void Bloom(float threshold, float sigma, float strength);
    // Rolls values above the knee off towards 1 instead of clipping them.
    void Shoulder(float knee);
    // Film grain of about deviation levels of 255, equal in all channels, weaker in white and
    // black.
    void Grain(float deviation, uint32_t seed);

private:
    static Vec2 Sample(int x, int y, int i, int samples) {
        const float step = 1.0f / static_cast<float>(samples);
        return {static_cast<float>(x) + (static_cast<float>(i % samples) + 0.5f) * step,
                static_cast<float>(y) + (static_cast<float>(i / samples) + 0.5f) * step};
    }

    int m_nWidth, m_nHeight;
    std::vector<Colour> m_Pixels;
};

} // namespace kyvdraw
