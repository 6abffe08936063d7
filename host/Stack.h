// The effects that a frame goes through, one after the other.
#pragma once

#include <cmath>
#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "host/ClipInstance.h"
#include "host/FrameQueue.h"
#include "host/Render.h"
#include "host/VideoProbe.h"

namespace kyvhost {

// 100 ns
inline int64_t UnitsOf(double seconds) {
    return std::llround(seconds * 1e7);
}

// The moment of a clip that a frame shows.
struct Moment {
    int64_t position = 0;    // 100 ns
    int64_t laterField = 0;  // 100 ns that the second field comes later
    double frame = 0;        // on the clip's scale
    int64_t frameNumber = 0; // from 0, for messages
};

class CStack {
public:
    // Throws CHostError for what the options ask in vain.
    CStack(const ModuleDescriptor& module, const RenderOptions& options);

    // The first input, and one more for every effect that takes two.
    size_t Inputs() const { return m_nInputs; }

    const EffectDescriptor& First() const { return m_instances.front()->Effect(); }

    // Whether one of the effects shows its second input inside the first.
    bool HasInnerPicture() const;

    // Whether a parameter of any effect changes with the length of the clip.
    bool NeedsLength() const;

    // Lets transitions run from one input to the other unless the user has said otherwise.
    void RunTransitions();

    // A value of the first effect.
    void SetFirst(const Assignment& assignment) {
        m_instances.front()->Set(assignment.param, assignment.value);
    }

    // The clip's length in 100 ns, and its frames. Before Begin.
    void SetClip(int64_t duration, const FrameScale& scale);
    void SetDefaultAspect(uint32_t width, uint32_t height);

    // Frames of two fields are rendered field by field, each as a picture of its own time.
    void Begin(const FrameShape& shape, FieldOrder fields);

    // inputs: one for each of Inputs(). The output has the size of the shape.
    void Render(std::span<const uint8_t* const> inputs, const Moment& moment, uint8_t* output);

private:
    void RenderFrame(std::span<const uint8_t* const> inputs, int64_t position, const Moment& moment,
                     uint32_t field, uint8_t* output);
    void RenderFields(std::span<const uint8_t* const> inputs, const Moment& moment,
                      uint8_t* output);

    const RenderOptions& m_options;
    std::vector<std::unique_ptr<CClipInstance>> m_instances;
    size_t m_nInputs = 1;
    FrameShape m_shape;
    FieldOrder m_fields = FieldOrder::Progressive;
    Frame m_between[2], m_woven; // frames from effect to effect, and of a field
    std::vector<Frame> m_single; // the inputs with one field alone
};

} // namespace kyvhost
