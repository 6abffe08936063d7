// An instance as the command line describes it: values as text, values that move over the clip,
// stereo views and fields.
#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "host/Easing.h"
#include "host/Hosting.h"
#include "hosting/Instance.h"

namespace kyvhost {

// A frame has rows of frameWidth pixels: two views of half of it when sideBySide.
struct FrameShape {
    uint32_t frameWidth = 0;
    uint32_t height = 0;
    bool sideBySide = false;

    size_t Pixels() const { return size_t{frameWidth} * height; }
    size_t Bytes() const { return Pixels() * 4; }
};

// A parameter that changes over the clip.
struct Animation {
    uint32_t index;
    std::vector<uint8_t> from, to;
    Easing easing;
};

class CClipInstance {
public:
    // Calls InitInstance, which writes the defaults. Throws CCallError on any status but success,
    // as do all calls below.
    explicit CClipInstance(const EffectDescriptor& effect);

    const EffectDescriptor& Effect() const { return m_instance.Effect(); }

    // The context, for what does not follow from the calls below: levels, threads, preview.
    EffectContext& Context() { return m_instance.Context(); }

    // The current value of a parameter: valueSize bytes in the buffer.
    const uint8_t* Value(uint32_t index) const { return m_instance.Value(index); }
    uint8_t* Value(uint32_t index) { return m_instance.Value(index); }

    // "P3=0.8" or "Degree=0.8". Throws CUsageError.
    void Set(std::string_view assignment);

    // "P1=0:1", or "P1=0:1:in-out" with an easing of its own. Throws CUsageError.
    void Animate(std::string_view assignment, Easing easing);

    // Whether a value of the parameter has been given by Set or Animate.
    bool IsGiven(uint32_t index) const { return m_given[index]; }

    bool IsAnimated() const { return !m_animations.empty(); }

    // Gives every animated parameter its value for a fraction 0..1 of the clip.
    void ApplyAnimations(double fraction);

    // Sets size and layout and calls BeginProcessing.
    void Begin(const FrameShape& shape);

    // SetInputFrame for every input and ProcessFrame, per view of the shape and per field. The
    // fields: FieldSelector_Frame, or a set of rows to render while the others show the input.
    // frameNumber counts from 0 and only serves messages.
    void Render(const uint8_t* const inputs[2], uint8_t* output, int64_t frameNumber);

    // For Render; both fields are two calls a frame.
    void SetFields(bool first, bool second) {
        m_bFirstField = first;
        m_bSecondField = second;
    }

private:
    void RenderRows(const uint8_t* const inputs[2], uint8_t* output, int64_t frameNumber);

    CInstance m_instance;
    std::vector<bool> m_given;
    std::vector<Animation> m_animations;
    FrameShape m_shape;
    bool m_bFirstField = false;
    bool m_bSecondField = false;
};

} // namespace kyvhost
