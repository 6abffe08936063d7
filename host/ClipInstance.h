// An instance as the user describes it: values as text, values that change over the clip, stereo
// views and fields.
#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "host/Hosting.h"
#include "host/Keyframes.h"
#include "hosting/Instance.h"

namespace kyvhost {

// A frame has rows of frameWidth pixels: two views of half of it when sideBySide.
struct FrameShape {
    uint32_t frameWidth = 0;
    uint32_t height = 0;
    bool sideBySide = false;

    uint32_t ViewWidth() const { return sideBySide ? frameWidth / 2 : frameWidth; }
    size_t Pixels() const { return size_t{frameWidth} * height; }
    size_t Bytes() const { return Pixels() * 4; }
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

    // By key, name or a part of a name. Throws CUsageError.
    void Set(std::string_view param, std::string_view value);

    // A value for a moment. Between two of them the first one's easing leads from value to value;
    // what has nothing in between, such as a choice, jumps. Throws CUsageError.
    void AddKeyframe(std::string_view param, const Keyframe& keyframe);

    // Whether a value of the parameter has been given by Set or AddKeyframe.
    bool IsGiven(uint32_t index) const { return m_given[index]; }

    // Whether keyframes are there whose time depends on the length of the clip.
    bool NeedsLength() const;

    // Brings the keyframes into the order of the clip. Before ApplyKeyframes.
    void PlaceKeyframes(const FrameScale& scale);

    // Gives every parameter with keyframes its value for a frame.
    void ApplyKeyframes(double frame);

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
    struct Key {
        KeyTime time;
        double frame; // once placed
        Easing easing;
        std::vector<uint8_t> value;
    };
    struct Track {
        uint32_t index;
        std::vector<Key> keys;
    };

    void RenderRows(const uint8_t* const inputs[2], uint8_t* output, int64_t frameNumber);

    CInstance m_instance;
    std::vector<bool> m_given;
    std::vector<Track> m_tracks;
    FrameShape m_shape;
    bool m_bFirstField = false;
    bool m_bSecondField = false;
};

} // namespace kyvhost
