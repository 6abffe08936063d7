// The calling order of an effect instance.
#include "host/ClipInstance.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <string>

#include "hosting/Error.h"
#include "hosting/Names.h"
#include "hosting/Values.h"

namespace kyvhost {
namespace {

uint32_t ParamOf(const EffectDescriptor& effect, std::string_view name) {
    return FindParam(effect, name, "kyvhost info " + ShortName(effect) + " shows all");
}

} // namespace

CClipInstance::CClipInstance(const EffectDescriptor& effect)
    : m_instance(effect), m_given(effect.paramCount) {
    Require(m_instance.Init(), effect, "InitInstance");
}

void CClipInstance::Set(std::string_view param, std::string_view value) {
    const uint32_t index = ParamOf(Effect(), param);
    ParseValue(Effect().params[index], param, value, Value(index));
    m_given[index] = true;
}

void CClipInstance::AddKeyframe(std::string_view param, const Keyframe& keyframe) {
    const uint32_t index = ParamOf(Effect(), param);
    Key key = {keyframe.time, 0, keyframe.easing,
               std::vector<uint8_t>(Effect().params[index].valueSize)};
    ParseValue(Effect().params[index], param, keyframe.value, key.value.data());
    auto track = std::find_if(m_tracks.begin(), m_tracks.end(),
                              [index](const Track& one) { return one.index == index; });
    if (track == m_tracks.end()) {
        track = m_tracks.insert(track, {index, {}});
    }
    track->keys.push_back(std::move(key));
    m_given[index] = true;
}

bool CClipInstance::NeedsLength() const {
    return std::any_of(m_tracks.begin(), m_tracks.end(), [](const Track& track) {
        return std::any_of(track.keys.begin(), track.keys.end(),
                           [](const Key& key) { return key.time.isShare; });
    });
}

void CClipInstance::PlaceKeyframes(const FrameScale& scale) {
    for (Track& track : m_tracks) {
        for (Key& key : track.keys) {
            key.frame = scale.At(key.time);
        }
        // Of two at one moment the later one given counts from there on: a jump.
        std::stable_sort(track.keys.begin(), track.keys.end(),
                         [](const Key& a, const Key& b) { return a.frame < b.frame; });
    }
}

void CClipInstance::ApplyKeyframes(double frame) {
    for (const Track& track : m_tracks) {
        const ParamDescriptor& param = Effect().params[track.index];
        const auto next = std::find_if(track.keys.begin(), track.keys.end(),
                                       [frame](const Key& key) { return key.frame > frame; });
        const Key& to = next == track.keys.end() ? track.keys.back() : *next;
        const Key& from = next == track.keys.begin() ? track.keys.front() : *std::prev(next);
        if (&from == &to || !CanAnimate(param)) {
            std::memcpy(Value(track.index), from.value.data(), from.value.size());
            continue;
        }
        Interpolate(param, from.value.data(), to.value.data(),
                    Eased(from.easing, (frame - from.frame) / (to.frame - from.frame)),
                    Value(track.index));
    }
}

void CClipInstance::Begin(const FrameShape& shape) {
    m_shape = shape;
    EffectContext& context = Context();
    context.width = shape.ViewWidth();
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
