// The calling order of an effect instance.
#include "host/ClipInstance.h"

#include <cstring>
#include <string>

#include "hosting/Error.h"
#include "hosting/Names.h"
#include "hosting/Text.h"
#include "hosting/Values.h"

namespace kyvhost {
namespace {

// Splits "name=value" and finds the parameter.
uint32_t SplitAssignment(const EffectDescriptor& effect, std::string_view assignment,
                         std::string_view example, std::string_view& value) {
    const size_t equals = assignment.find('=');
    if (equals == std::string_view::npos || equals == 0) {
        throw CUsageError(Quoted(assignment) + " is not of the form " + std::string(example));
    }
    value = assignment.substr(equals + 1);
    return FindParam(effect, assignment.substr(0, equals),
                     "kyvhost info " + ShortName(effect) + " shows all");
}

} // namespace

CClipInstance::CClipInstance(const EffectDescriptor& effect)
    : m_instance(effect), m_given(effect.paramCount) {
    Require(m_instance.Init(), effect, "InitInstance");
}

void CClipInstance::Set(std::string_view assignment) {
    std::string_view text;
    const uint32_t index = SplitAssignment(Effect(), assignment, "NAME=VALUE", text);
    const ParamDescriptor& param = Effect().params[index];
    ParseValue(param, assignment.substr(0, assignment.find('=')), text, Value(index));
    m_given[index] = true;
}

void CClipInstance::Animate(std::string_view assignment, Easing easing) {
    std::string_view text;
    const uint32_t index = SplitAssignment(Effect(), assignment, "NAME=FROM:TO", text);
    const ParamDescriptor& param = Effect().params[index];
    const std::string_view name = assignment.substr(0, assignment.find('='));
    if (!CanAnimate(param)) {
        throw CUsageError(std::string(name) + " is a " + TypeName(param) +
                          " and has no values in between; use --set");
    }
    const std::vector<std::string> parts = Split(text, ':');
    if (parts.size() != 2 && parts.size() != 3) {
        throw CUsageError(Quoted(assignment) +
                          " is not of the form NAME=FROM:TO or NAME=FROM:TO:EASING");
    }
    Animation animation = {index, std::vector<uint8_t>(param.valueSize),
                           std::vector<uint8_t>(param.valueSize),
                           parts.size() == 3 ? ParseEasing(parts[2]) : easing};
    ParseValue(param, name, parts[0], animation.from.data());
    ParseValue(param, name, parts[1], animation.to.data());
    m_animations.push_back(std::move(animation));
    m_given[index] = true;
}

void CClipInstance::ApplyAnimations(double fraction) {
    for (const Animation& animation : m_animations) {
        Interpolate(Effect().params[animation.index], animation.from.data(), animation.to.data(),
                    Eased(animation.easing, fraction), Value(animation.index));
    }
}

void CClipInstance::Begin(const FrameShape& shape) {
    m_shape = shape;
    EffectContext& context = Context();
    context.width = shape.sideBySide ? shape.frameWidth / 2 : shape.frameWidth;
    context.height = shape.height;
    context.stereoLayout = shape.sideBySide ? StereoLayout_LeftHalf : StereoLayout_Mono;
    Require(m_instance.Begin(), Effect(), "BeginProcessing");
}

void CClipInstance::Render(const uint8_t* const inputs[2], uint8_t* output, int64_t frameNumber) {
    if (!m_bFirstField && !m_bSecondField) {
        RenderRows(inputs, output, frameNumber);
        return;
    }
    std::memcpy(output, inputs[0], m_shape.Bytes());
    for (const uint32_t field : {FieldSelector_First, FieldSelector_Second}) {
        if (field == FieldSelector_First ? m_bFirstField : m_bSecondField) {
            Context().fieldSelector = field;
            RenderRows(inputs, output, frameNumber);
        }
    }
}

void CClipInstance::RenderRows(const uint8_t* const inputs[2], uint8_t* output,
                               int64_t frameNumber) {
    // Effects may prepare in the left view's call what the right view's call uses.
    const uint32_t first = m_shape.sideBySide ? StereoLayout_LeftHalf : StereoLayout_Mono;
    const uint32_t last = m_shape.sideBySide ? StereoLayout_RightHalf : StereoLayout_Mono;
    for (uint32_t layout = first; layout <= last; ++layout) {
        Context().stereoLayout = layout;
        for (uint32_t i = 0; i < Effect().properties.inputCount && i < 2; ++i) {
            Require(m_instance.SetInput(i, inputs[i]), Effect(),
                    "SetInputFrame at frame " + std::to_string(frameNumber));
        }
        Require(m_instance.Process(output), Effect(),
                "ProcessFrame at frame " + std::to_string(frameNumber));
    }
}

} // namespace kyvhost
