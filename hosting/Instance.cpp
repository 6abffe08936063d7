// The calling order of an effect instance.
#include "hosting/Instance.h"

#include <cstring>

#include "hosting/ExitStatus.h"
#include "hosting/Hex.h"
#include "hosting/Names.h"
#include "hosting/Text.h"
#include "hosting/Values.h"

namespace kyvhost {
namespace {

// InitInstance wants to tell the host that it runs. There is nothing to do about it here.
void IgnoreNotification(HostNotification*) {}

const HostNotificationTable kNotificationTable = {IgnoreNotification};
HostNotification g_notification = {&kNotificationTable};

void Check(KyvStatus status, const EffectDescriptor& effect, const std::string& call) {
    if (status != KYV_OK) {
        throw CHostError(ExitStatus::RenderingFailed, std::string(effect.identifier) + ": " + call +
                                                          " failed with status " + Hex(status));
    }
}

// Splits "name=value" and finds the parameter.
uint32_t SplitAssignment(const EffectDescriptor& effect, std::string_view assignment,
                         std::string_view example, std::string_view& value) {
    const size_t equals = assignment.find('=');
    if (equals == std::string_view::npos || equals == 0) {
        throw CUsageError(Quoted(assignment) + " is not of the form " + std::string(example));
    }
    value = assignment.substr(equals + 1);
    return FindParam(effect, assignment.substr(0, equals));
}

} // namespace

CInstance::CInstance(const EffectDescriptor& effect)
    : m_effect(effect), m_data(new uint64_t[effect.instanceDataSize / 8 + 1]()) {
    size_t size = 0;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        m_offsets.push_back(size);
        size += effect.params[i].valueSize;
    }
    m_params.resize(size + 1); // never an empty buffer
    m_context.descriptor = &effect;
    m_context.notification = &g_notification;
    m_context.instanceData = m_data.get();
    m_context.params = m_params.data();
    m_context.threadCount = 1;
    m_given.resize(effect.paramCount);
    Check(effect.callbacks.InitInstance(&m_context), effect, "InitInstance");
}

CInstance::~CInstance() {
    if (m_bBegun) {
        m_effect.callbacks.EndProcessing(&m_context);
    }
    m_effect.callbacks.DestroyInstance(&m_context);
}

void CInstance::Set(std::string_view assignment) {
    std::string_view text;
    const uint32_t index = SplitAssignment(m_effect, assignment, "NAME=VALUE", text);
    const ParamDescriptor& param = m_effect.params[index];
    ParseValue(param, assignment.substr(0, assignment.find('=')), text, Value(index));
    m_given[index] = true;
}

void CInstance::Animate(std::string_view assignment, Easing easing) {
    std::string_view text;
    const uint32_t index = SplitAssignment(m_effect, assignment, "NAME=FROM:TO", text);
    const ParamDescriptor& param = m_effect.params[index];
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

void CInstance::ApplyAnimations(double fraction) {
    for (const Animation& animation : m_animations) {
        Interpolate(m_effect.params[animation.index], animation.from.data(), animation.to.data(),
                    Eased(animation.easing, fraction), Value(animation.index));
    }
}

void CInstance::Begin(const FrameShape& shape) {
    m_shape = shape;
    m_context.width = shape.sideBySide ? shape.frameWidth / 2 : shape.frameWidth;
    m_context.height = shape.height;
    m_context.stereoLayout = shape.sideBySide ? StereoLayout_LeftHalf : StereoLayout_Mono;
    Check(m_effect.callbacks.BeginProcessing(&m_context), m_effect, "BeginProcessing");
    m_bBegun = true;
}

void CInstance::Render(const uint8_t* const inputs[2], uint8_t* output, int64_t frameNumber) {
    if (!m_bFirstField && !m_bSecondField) {
        RenderRows(inputs, output, frameNumber);
        return;
    }
    std::memcpy(output, inputs[0], m_shape.Bytes());
    for (const uint32_t field : {FieldSelector_First, FieldSelector_Second}) {
        if (field == FieldSelector_First ? m_bFirstField : m_bSecondField) {
            m_context.fieldSelector = field;
            RenderRows(inputs, output, frameNumber);
        }
    }
}

void CInstance::RenderRows(const uint8_t* const inputs[2], uint8_t* output, int64_t frameNumber) {
    // Effects may prepare in the left view's call what the right view's call uses.
    const uint32_t first = m_shape.sideBySide ? StereoLayout_LeftHalf : StereoLayout_Mono;
    const uint32_t last = m_shape.sideBySide ? StereoLayout_RightHalf : StereoLayout_Mono;
    for (uint32_t layout = first; layout <= last; ++layout) {
        m_context.stereoLayout = layout;
        for (uint32_t i = 0; i < m_effect.properties.inputCount && i < 2; ++i) {
            m_context.frame = const_cast<uint8_t*>(inputs[i]); // inputs are only read
            Check(m_effect.callbacks.SetInputFrame(i, &m_context), m_effect,
                  "SetInputFrame at frame " + std::to_string(frameNumber));
        }
        m_context.frame = output;
        Check(m_effect.callbacks.ProcessFrame(&m_context), m_effect,
              "ProcessFrame at frame " + std::to_string(frameNumber));
    }
}

} // namespace kyvhost
