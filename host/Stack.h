// The effects that a frame goes through, one after the other.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "host/ClipInstance.h"
#include "host/FrameQueue.h"
#include "host/Render.h"
#include "host/VideoProbe.h"

namespace kyvhost {

// The moment of a clip that a frame shows.
struct Moment {
    int64_t position = 0;    // 100 ns
    int64_t laterField = 0;  // 100 ns that the second field comes later
    double fraction = 0;     // 0..1 of the clip
    int64_t frameNumber = 0; // from 0, for messages
};

class CStack {
public:
    // Throws CHostError for what the options ask in vain.
    CStack(const ModuleDescriptor& module, const RenderOptions& options);

    // The first input, and one more for every effect that takes two.
    size_t Inputs() const { return m_nInputs; }

    const EffectDescriptor& First() const { return m_instances.front()->Effect(); }

    // Whether a parameter of any effect changes over the clip.
    bool IsAnimated() const;

    // Lets transitions run from one input to the other unless the user has said otherwise.
    void RunTransitions();

    // A value of the first effect, "P1=0.5".
    void SetFirst(const std::string& assignment) { m_instances.front()->Set(assignment); }

    // For each context, before Begin.
    void SetDuration(int64_t duration);
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
