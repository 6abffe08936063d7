// Effects in a row.
#include "host/Stack.h"

#include <algorithm>
#include <cstring>

#include "host/ExitStatus.h"
#include "hosting/Names.h"

namespace kyvhost {
namespace {

// The one effect that leaves single fields alone. It treats every pixel by itself, so that a whole
// frame of it shows the same.
bool LeavesFieldsAlone(const EffectDescriptor& effect) {
    return std::string_view(effect.identifier) == "Kyv_Dsp_Co_WhiteBalance";
}

// A whole picture out of every second row: the rows between are the mean of their neighbours. Edges
// and motion of the other field cannot reach into it.
void FillFromField(const uint8_t* frame, const FrameShape& shape, uint32_t firstRow, Frame& to) {
    const size_t rowBytes = size_t{shape.frameWidth} * 4;
    to.resize(shape.Bytes());
    for (uint32_t y = 0; y < shape.height; ++y) {
        uint8_t* const row = to.data() + y * rowBytes;
        if (y % 2 == firstRow) {
            std::memcpy(row, frame + y * rowBytes, rowBytes);
            continue;
        }
        const uint32_t above = y > 0 ? y - 1 : std::min(y + 1, shape.height - 1);
        const uint32_t below = y + 1 < shape.height ? y + 1 : above;
        const uint8_t* const a = frame + above * rowBytes;
        const uint8_t* const b = frame + below * rowBytes;
        for (size_t i = 0; i < rowBytes; ++i) {
            row[i] = static_cast<uint8_t>((a[i] + b[i] + 1) >> 1);
        }
    }
}

} // namespace

CStack::CStack(const ModuleDescriptor& module, const RenderOptions& options) : m_options(options) {
    for (const StageOptions& stage : options.stages) {
        const EffectDescriptor& effect = FindEffect(module, stage.effect, kAllEffects);
        m_instances.push_back(std::make_unique<CClipInstance>(effect));
        CClipInstance& instance = *m_instances.back();
        options.settings.Apply(instance);
        stage.Apply(instance);
        const bool takesTwo = effect.properties.inputCount == 2;
        if (takesTwo && !stage.input2) {
            throw CUsageError(ShortName(effect) +
                              " takes two inputs: name the second with --input2");
        }
        if (!takesTwo && stage.input2) {
            throw CUsageError(ShortName(effect) + " takes one input; --input2 is not for it");
        }
        m_nInputs += takesTwo ? 1 : 0;
    }
}

bool CStack::HasInnerPicture() const {
    return std::any_of(m_instances.begin(), m_instances.end(), [](const auto& instance) {
        const EffectProperties& properties = instance->Effect().properties;
        return properties.inputCount == 2 && !properties.isTransition;
    });
}

bool CStack::NeedsLength() const {
    return std::any_of(m_instances.begin(), m_instances.end(),
                       [](const auto& instance) { return instance->NeedsLength(); });
}

void CStack::RunTransitions() {
    for (size_t i = 0; i < m_instances.size(); ++i) {
        const EffectDescriptor& effect = m_instances[i]->Effect();
        for (uint32_t k = 0; k < effect.paramCount && effect.properties.isTransition; ++k) {
            const ParamDescriptor& param = effect.params[k];
            if (WordsOfKey(param.nameKey) == "Percentage" && !m_instances[i]->IsGiven(k)) {
                const Easing easing = m_options.stages[i].easing;
                m_instances[i]->AddKeyframe(param.key, {{0, true}, "0", easing});
                m_instances[i]->AddKeyframe(param.key, {{100, true}, "1", easing});
            }
        }
    }
}

void CStack::SetClip(int64_t duration, const FrameScale& scale) {
    for (size_t i = 0; i < m_instances.size(); ++i) {
        m_instances[i]->Context().duration = duration + UnitsOf(m_options.stages[i].offset);
        m_instances[i]->PlaceKeyframes(scale);
    }
}

void CStack::SetDefaultAspect(uint32_t width, uint32_t height) {
    for (const auto& instance : m_instances) {
        if (!m_options.settings.aspect) {
            instance->Context().displayAspectX = width;
            instance->Context().displayAspectY = height;
        }
    }
}

void CStack::Begin(const FrameShape& shape, FieldOrder fields) {
    m_shape = shape;
    m_fields = fields;
    for (const auto& instance : m_instances) {
        instance->Begin(shape);
    }
}

void CStack::Render(std::span<const uint8_t* const> inputs, const Moment& moment, uint8_t* output) {
    for (const auto& instance : m_instances) {
        instance->ApplyKeyframes(moment.frame);
    }
    if (m_fields == FieldOrder::Progressive) {
        RenderFrame(inputs, moment.position, moment, FieldSelector_Frame, output);
    } else {
        RenderFields(inputs, moment, output);
    }
}

void CStack::RenderFrame(std::span<const uint8_t* const> inputs, int64_t position,
                         const Moment& moment, uint32_t field, uint8_t* output) {
    const uint8_t* first = inputs[0];
    size_t nextInput = 1;
    for (size_t i = 0; i < m_instances.size(); ++i) {
        CClipInstance& instance = *m_instances[i];
        const bool isLast = i + 1 == m_instances.size();
        uint8_t* to = output;
        if (!isLast) {
            m_between[i % 2].resize(m_shape.Bytes());
            to = m_between[i % 2].data();
        }
        const bool takesTwo = instance.Effect().properties.inputCount == 2;
        const uint8_t* const both[2] = {first, takesTwo ? inputs[nextInput++] : first};
        instance.Context().position = position + UnitsOf(m_options.stages[i].offset);
        // The effects before it make whole pictures, which a later one may look at all over.
        if (field != FieldSelector_Frame) {
            const bool alone = isLast && !LeavesFieldsAlone(instance.Effect());
            instance.SetFields(alone && field == FieldSelector_First,
                               alone && field == FieldSelector_Second);
            instance.Context().fieldSelector = FieldSelector_Frame;
        }
        instance.Render(both, to, moment.frameNumber);
        first = to;
    }
}

void CStack::RenderFields(std::span<const uint8_t* const> inputs, const Moment& moment,
                          uint8_t* output) {
    m_single.resize(inputs.size());
    m_woven.resize(m_shape.Bytes());
    const size_t rowBytes = size_t{m_shape.frameWidth} * 4;
    std::vector<const uint8_t*> singles(inputs.size());
    for (const bool later : {false, true}) {
        const bool isTop = (m_fields == FieldOrder::TopFirst) != later;
        for (size_t i = 0; i < inputs.size(); ++i) {
            FillFromField(inputs[i], m_shape, isTop ? 0 : 1, m_single[i]);
            singles[i] = m_single[i].data();
        }
        RenderFrame(singles, moment.position + (later ? moment.laterField : 0), moment,
                    isTop ? FieldSelector_First : FieldSelector_Second, m_woven.data());
        for (uint32_t y = isTop ? 0 : 1; y < m_shape.height; y += 2) {
            std::memcpy(output + y * rowBytes, m_woven.data() + y * rowBytes, rowBytes);
        }
    }
}

} // namespace kyvhost
