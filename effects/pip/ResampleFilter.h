// The kernels of filtered resampling, and the weights they give to a span of source pixels.
//
// Some of them are odd on purpose: the point kernel returns the distance itself and reaches twice
// as far as its support says; the box is open on its left and closed on its right.
#pragma once

#include <cstdint>
#include <memory>

namespace kyv {

// Slot 0 is Evaluate, slot 1 GetSupport. Kernels hold no state that changes and are never
// destroyed through this class, which therefore has no destructor of its own.
class ResampleFilter {
public:
    // The weight at a distance in source pixels.
    virtual float Evaluate(float distance) const = 0;
    // The distance beyond which weights are taken as zero; it sizes a span.
    virtual float GetSupport() const = 0;

protected:
    constexpr ResampleFilter() = default;
    ~ResampleFilter() = default;
};

// |x| below 1.
class ResampleFilterPoint final : public ResampleFilter {
public:
    float Evaluate(float distance) const override;
    float GetSupport() const override { return 0.5F; }
};

// 1 for -0.5 < x <= 0.5.
class ResampleFilterBox final : public ResampleFilter {
public:
    float Evaluate(float distance) const override;
    float GetSupport() const override { return 0.5F; }
};

// 1 - |x| below 1.
class ResampleFilterTriangle final : public ResampleFilter {
public:
    float Evaluate(float distance) const override;
    float GetSupport() const override { return 1.0F; }
};

// Two cubics: (p3 t + p2) t^2 + p0 below 1, q3 t^3 + q2 t^2 + q1 t + q0 below 2.
class ResampleFilterMitchell final : public ResampleFilter {
public:
    constexpr ResampleFilterMitchell(float p0, float p2, float p3, float q0, float q1, float q2,
                                     float q3)
        : m_fP0(p0), m_fP2(p2), m_fP3(p3), m_fQ0(q0), m_fQ1(q1), m_fQ2(q2), m_fQ3(q3) {}

    float Evaluate(float distance) const override;
    float GetSupport() const override { return 2.0F; }

private:
    float m_fP0, m_fP2, m_fP3;
    float m_fQ0, m_fQ1, m_fQ2, m_fQ3;
};

// sinc(x) sinc(x / 3) below 3, in single precision.
class ResampleFilterLanczos3 final : public ResampleFilter {
public:
    float Evaluate(float distance) const override;
    float GetSupport() const override { return 3.0F; }
};

// The process-wide kernel of an index: 0 point, 1 box, 2 triangle, 3 Mitchell (B and C both 1/3),
// 4 Lanczos3. Any other index gives `otherwise`.
const ResampleFilter* SelectResampleFilter(int32_t index, const ResampleFilter* otherwise);

// A contribution record: the index of the first source pixel, their number n, and n weights that
// sum to 1.
using ContributionRecord = std::unique_ptr<float[]>;

// The source pixels that make up one destination pixel in one direction: those within
// support / scale of the position, which is in source pixels. scale is the local ratio of
// destination to source size, at most 1; at 0 everything is within reach. Weights that sum to zero
// choose no pixel: the nearest then counts alone, with weight 1, and so it does when the position
// is not a number (the first). size is at least 1.
ContributionRecord MakeContribution(const ResampleFilter& filter, float position, float scale,
                                    int32_t size);

} // namespace kyv
