// An effect behind frei0r's calls.
#include "bridges/frei0r/EffectPlugin.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>

#include "hosting/Plugin.h"
#include "hosting/Text.h"
#include "hosting/Values.h"
#include "platform/Library.h"

namespace kyvfrei0r {
namespace {

using kyvhosting::kUnitsPerSecond;

constexpr double kLongestClip = 3600; // seconds; GStreamer lets no number pass 1

// What is not finite becomes the plug-in's own default if it has one, and stays for the effect's.
double NumberIn(const void* value, const ParamTable& table) {
    double number;
    std::memcpy(&number, value, sizeof number);
    return !std::isfinite(number) && table.ownDefault ? table.initial : number;
}

void PutNumber(void* value, double number) {
    std::memcpy(value, &number, sizeof number);
}

// libavfilter hands out milliseconds, everybody else seconds. A program with libavfilter inside
// carries it in its name, or has the environment say so.
double UnitsPerTimeOf(const void* caller) {
    if (const char* const unit = std::getenv("KYV_FREI0R_TIME")) {
        if (std::strcmp(unit, "ms") == 0) {
            return kUnitsPerSecond / 1000;
        }
        if (std::strcmp(unit, "s") == 0) {
            return kUnitsPerSecond;
        }
    }
    const std::filesystem::path file = kyv::FileNameOfCode(caller);
    const std::string name = kyvhosting::Lower(kyvhosting::TextOf(file.filename()));
    const bool isFilterLibrary = name.find("avfilter") != std::string::npos ||
                                 name.starts_with("ffmpeg") || name.starts_with("ffplay");
    return isFilterLibrary ? kUnitsPerSecond / 1000 : kUnitsPerSecond;
}

} // namespace

CEffectPlugin::CEffectPlugin(const PluginTable& table, const EffectDescriptor& effect,
                             uint32_t width, uint32_t height)
    : m_table(table), m_instance(effect) {
    EffectContext& context = m_instance.Context();
    context.width = width;
    context.height = height;
    context.cpuLevel = kyvhosting::kPluginCpuLevel;
    kyvhosting::Require(m_instance.Init(), effect, "InitInstance");
    for (int i = 0; i < table.paramCount; ++i) {
        if (table.params[i].ownDefault) {
            SetValue(table.params[i], &table.params[i].initial);
        }
    }
}

size_t CEffectPlugin::Pixels() const {
    return size_t{m_instance.Context().width} * m_instance.Context().height;
}

void CEffectPlugin::SetParam(int index, const void* value) noexcept {
    if (index < 0 || index >= m_table.paramCount || !value) {
        return;
    }
    const std::lock_guard lock(m_mutex);
    const ParamTable& table = m_table.params[index];
    if (!SetValue(table, value)) {
        SetOwn(table, value);
    }
}

// False for a parameter that the effect does not have.
bool CEffectPlugin::SetValue(const ParamTable& table, const void* value) {
    const ParamDescriptor& param = m_instance.Effect().params[table.index];
    uint8_t* const bytes = m_instance.Value(table.index);
    switch (table.mapping) {
    case Mapping::Unit: {
        const double part = NumberIn(value, table);
        const kyvhosting::NumberRange range = kyvhosting::RangeOf(param);
        const double within = std::isfinite(part) ? std::clamp(part, 0.0, 1.0) : part;
        kyvhosting::SetComponent(param, bytes, table.component,
                                 range.least + within * (range.most - range.least));
        break;
    }
    case Mapping::Plain:
        kyvhosting::SetComponent(param, bytes, table.component, NumberIn(value, table));
        break;
    case Mapping::Switch: {
        const double state = NumberIn(value, table);
        kyvhosting::SetComponent(param, bytes, 0, std::isfinite(state) ? state >= 0.5 : state);
        break;
    }
    case Mapping::Color: {
        Frei0rColor color;
        std::memcpy(&color, value, sizeof color);
        const float parts[3] = {color.r, color.g, color.b};
        for (size_t i = 0; i < 3; ++i) {
            kyvhosting::SetComponent(param, bytes, i, double{parts[i]} * 255);
        }
        break;
    }
    case Mapping::ClipLength: {
        const double part = NumberIn(value, table);
        m_clipLength = std::isfinite(part) ? std::clamp(part, 0.0, 1.0) * kLongestClip : 0;
        break;
    }
    default:
        return false;
    }
    return true;
}

void CEffectPlugin::GetParam(int index, void* value) noexcept {
    if (index < 0 || index >= m_table.paramCount || !value) {
        return;
    }
    const std::lock_guard lock(m_mutex);
    const ParamTable& table = m_table.params[index];
    const ParamDescriptor& param = m_instance.Effect().params[table.index];
    const uint8_t* const bytes = m_instance.Value(table.index);
    const double number = kyvhosting::ComponentOf(param, bytes, table.component);
    switch (table.mapping) {
    case Mapping::Unit: {
        const kyvhosting::NumberRange range = kyvhosting::RangeOf(param);
        PutNumber(value, (number - range.least) / (range.most - range.least));
        break;
    }
    case Mapping::Plain:
    case Mapping::Switch:
        PutNumber(value, number);
        break;
    case Mapping::Color: {
        Frei0rColor color;
        color.r = static_cast<float>(kyvhosting::ComponentOf(param, bytes, 0) / 255);
        color.g = static_cast<float>(kyvhosting::ComponentOf(param, bytes, 1) / 255);
        color.b = static_cast<float>(kyvhosting::ComponentOf(param, bytes, 2) / 255);
        std::memcpy(value, &color, sizeof color);
        break;
    }
    case Mapping::ClipLength:
        PutNumber(value, m_clipLength / kLongestClip);
        break;
    default:
        GetOwn(table, value);
        break;
    }
}

void CEffectPlugin::SetOwn(const ParamTable&, const void*) {}
void CEffectPlugin::GetOwn(const ParamTable&, void*) const {}

void CEffectPlugin::SetTime(double time, const void* caller) {
    if (caller != m_pCaller) {
        m_unitsPerTime = UnitsPerTimeOf(caller);
        m_pCaller = caller;
    }
    m_instance.Context().position = kyvhosting::TimeUnits(time * m_unitsPerTime);
    m_instance.Context().duration = std::llround(m_clipLength * kUnitsPerSecond);
}

void CEffectPlugin::Update(double time, const void* input0, const void* input1, void* output,
                           const void* caller) noexcept {
    const bool isMixer = m_instance.Effect().properties.inputCount > 1 && !m_table.isCornerPin;
    if (!input0 || !output || (isMixer && !input1)) {
        return;
    }
    const std::lock_guard lock(m_mutex);
    try {
        if (output == input0 || output == input1) {
            m_copy.resize(Pixels());
            std::memcpy(m_copy.data(), output, Bytes());
            input0 = output == input0 ? m_copy.data() : input0;
            input1 = output == input1 ? m_copy.data() : input1;
        }
        SetTime(time, caller);
        const KyvStatus status = RenderChecked(input0, input1, output);
        if (status == KYV_OK) {
            return;
        }
        Complain("rendering a frame", status);
    } catch (const std::bad_alloc&) {
        Complain("rendering a frame", KYV_OUT_OF_MEMORY);
    } catch (...) {
        Complain("rendering a frame", KYV_FAIL);
    }
    if (output != input0) {
        std::memcpy(output, input0, Bytes());
    }
}

KyvStatus CEffectPlugin::RenderChecked(const void* input0, const void* input1, void* output) {
    if (m_table.wipe >= 0) {
        // With no smoothness the brightest parts of the mask would keep the first input to the end.
        const ParamDescriptor& param = m_instance.Effect().params[m_table.wipe];
        const double part = kyvhosting::ComponentOf(
            param, m_instance.Value(static_cast<uint32_t>(m_table.wipe)), 0);
        if (part <= 0 || part >= 1) {
            std::memcpy(output, part <= 0 ? input0 : input1, Bytes());
            return KYV_OK;
        }
    }
    if (!m_bBegun) {
        const KyvStatus status = m_instance.Begin();
        if (status != KYV_OK) {
            m_instance.End();
            return status;
        }
        m_bBegun = true;
    }
    const KyvStatus status = Render(input0, input1, output);
    if (status == KYV_OK && kyvhosting::LosesAlpha(m_instance.Effect())) {
        kyvhosting::KeepAlpha(input0, output, Pixels());
    }
    return status;
}

KyvStatus CEffectPlugin::Render(const void* input0, const void* input1, void* output) {
    return m_instance.Render(output, input0, input1);
}

// Once an instance: a host would fill the terminal with a line a frame.
void CEffectPlugin::Complain(const char* what, KyvStatus status) {
    if (!m_bComplained) {
        m_bComplained = true;
        std::fprintf(stderr, "%s: %s failed with status 0x%08X; the input is shown instead\n",
                     m_table.file, what, static_cast<unsigned>(status));
    }
}

} // namespace kyvfrei0r
