// An effect behind frei0r's calls.
#include "bridges/frei0r/EffectPlugin.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>

#include "hosting/Text.h"
#include "hosting/Values.h"
#include "platform/Library.h"

namespace kyvfrei0r {
namespace {

constexpr double kUnitsPerSecond = 1e7; // the module counts in 100 ns
constexpr double kLongestSeconds = 1e7;
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

// Gives the pixels of to the alpha of those of from. What the effect leaves there is solid or the
// same already, so where the source is solid, as most videos are, nothing needs to be written.
void KeepAlpha(const void* from, void* to, size_t pixels) {
    constexpr size_t kBlock = 1024;
    const auto* source = static_cast<const uint8_t*>(from);
    auto* target = static_cast<uint8_t*>(to);
    for (size_t first = 0; first < pixels; first += kBlock) {
        const size_t end = std::min(first + kBlock, pixels);
        uint32_t all = 0xFF000000;
        for (size_t i = first; i < end; ++i) {
            uint32_t pixel;
            std::memcpy(&pixel, source + 4 * i, sizeof pixel);
            all &= pixel;
        }
        for (size_t i = first; all != 0xFF000000 && i < end; ++i) {
            uint32_t color, alpha;
            std::memcpy(&color, target + 4 * i, sizeof color);
            std::memcpy(&alpha, source + 4 * i, sizeof alpha);
            color = (color & 0x00FFFFFF) | (alpha & 0xFF000000);
            std::memcpy(target + 4 * i, &color, sizeof color);
        }
    }
}

} // namespace

CEffectPlugin::CEffectPlugin(const PluginTable& table, const EffectDescriptor& effect,
                             uint32_t width, uint32_t height)
    : m_table(table), m_instance(effect) {
    EffectContext& context = m_instance.Context();
    context.width = width;
    context.height = height;
    // A ceiling: the processor decides below it. Pictures of any size are shown whole.
    context.cpuLevel = int32_t{CpuLevel_Avx2} | int32_t{CpuLevelOption_WideMap};
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

bool CEffectPlugin::SetTime(double time, const void* caller) {
    if (caller != m_pCaller) {
        m_unitsPerTime = UnitsPerTimeOf(caller);
        m_pCaller = caller;
    }
    const double units = time * m_unitsPerTime;
    const bool isTime = units >= 0 && units <= kLongestSeconds * kUnitsPerSecond;
    // A multiple of a frame's time comes out of floating point slightly below or above itself: the
    // hundredth of a unit keeps 1.001 s from becoming 1.0009999 s, a millisecond earlier.
    const double whole = isTime ? std::floor(units + 0.01) : 0;
    m_instance.Context().position = static_cast<int64_t>(whole);
    m_instance.Context().duration = std::llround(m_clipLength * kUnitsPerSecond);
    return isTime;
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
    if (status == KYV_OK && m_table.keepsAlpha) {
        KeepAlpha(input0, output, Pixels());
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
