// Finding the module, and the tables as frei0r wants them.
#include "bridges/frei0r/Bridge.h"

#include <cstdio>
#include <exception>
#include <filesystem>
#include <new>
#include <string>
#include <vector>

#include "bridges/frei0r/CornerPin.h"
#include "bridges/frei0r/EffectPlugin.h"
#include "hosting/Error.h"
#include "hosting/Names.h"
#include "hosting/Plugin.h"
#include "hosting/Text.h"

namespace kyvfrei0r {
namespace {

// Beside the plug-in or in the folder above, where the build tree has it, or where it was
// installed.
const kyvhosting::CModule& Module() {
    return kyvhosting::PluginsModule(
        {".", "..", "../../../module", kyvhosting::PathOf(KYV_MODULE_FOLDER)});
}

uint32_t ParamSizes(const EffectDescriptor& effect) {
    uint32_t bytes = 0;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        bytes += effect.params[i].valueSize;
    }
    return effect.paramCount << 16 | bytes;
}

const EffectDescriptor& EffectFor(const PluginTable& table) {
    const EffectDescriptor* const effect =
        kyvhosting::EffectOf(Module().Descriptor(), table.effect);
    if (!effect || ParamSizes(*effect) != table.paramSizes) {
        throw kyvhosting::CModuleError(kyvhosting::TextOf(Module().File()) +
                                       " does not belong to this plug-in: its effect " +
                                       table.effect + (effect ? " is another one" : " is missing"));
    }
    return *effect;
}

} // namespace

std::unique_ptr<CPluginInstance> Construct(const PluginTable& table, unsigned width,
                                           unsigned height) noexcept {
    if (!kyvhosting::IsPossibleFrame(width, height)) {
        std::fprintf(stderr, "%s: cannot render frames of %u x %u pixels\n", table.file, width,
                     height);
        return nullptr;
    }
    try {
        const EffectDescriptor& effect = EffectFor(table);
        if (table.isCornerPin) {
            return std::make_unique<CCornerPin>(table, effect, width, height);
        }
        return std::make_unique<CEffectPlugin>(table, effect, width, height);
    } catch (const std::bad_alloc&) {
        std::fprintf(stderr, "%s: there is not enough memory\n", table.file);
    } catch (const std::exception& error) {
        std::fprintf(stderr, "%s: %s\n", table.file, error.what());
    } catch (...) {
        std::fprintf(stderr, "%s: cannot start\n", table.file);
    }
    return nullptr;
}

void FillPluginInfo(const PluginTable& table, Frei0rPluginInfo* info) noexcept {
    if (!info) {
        return;
    }
    info->name = table.name;
    info->author = "KYV DSP";
    info->pluginType = table.isMixer ? Frei0rPlugin_Mixer2 : Frei0rPlugin_Filter;
    info->colorModel = Frei0rColorModel_Bgra8888;
    info->frei0rVersion = kFrei0rMajorVersion;
    info->majorVersion = KYV_VERSION_MAJOR;
    info->minorVersion = KYV_VERSION_MINOR;
    info->paramCount = table.paramCount;
    info->explanation = table.explanation;
}

void FillParamInfo(const PluginTable& table, Frei0rParamInfo* info, int index) noexcept {
    if (!info || index < 0 || index >= table.paramCount) {
        return;
    }
    const ParamTable& param = table.params[index];
    info->name = param.name;
    info->explanation = param.explanation;
    switch (param.mapping) {
    case Mapping::Switch:
        info->type = Frei0rParam_Bool;
        break;
    case Mapping::Color:
    case Mapping::BackgroundColor:
        info->type = Frei0rParam_Color;
        break;
    default:
        info->type = Frei0rParam_Double;
        break;
    }
}

} // namespace kyvfrei0r
