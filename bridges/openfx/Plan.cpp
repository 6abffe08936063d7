// Effects as OpenFX plug-ins.
#include "bridges/openfx/Plan.h"

#include <cstdio>
#include <exception>
#include <memory>

#include "bridges/openfx/OpenFx.h"
#include "hosting/Names.h"
#include "hosting/Plugin.h"
#include "hosting/Text.h"
#include "hosting/Values.h"

namespace kyvofx {
namespace {

constexpr const char* kLossNote =
    "Works with 8 bits a channel: pictures of more are rounded to the nearest of 256 values and "
    "clamped to 0 to 1, and what is finer or brighter is lost.";

bool HasThreeModes(const ParamDescriptor& param) {
    return param.type == ParamType_Bool && kyvhosting::RangeOf(param).most == 2;
}

ControlKind KindOf(const ParamDescriptor& param) {
    switch (param.type) {
    case ParamType_Bool:
        return HasThreeModes(param) ? ControlKind::Choice : ControlKind::Boolean;
    case ParamType_Choice:
        return kyvhosting::ChoiceLabels(param).empty() ? ControlKind::Integer : ControlKind::Choice;
    case ParamType_Color:
        return ControlKind::Rgb;
    case ParamType_Float:
        return ControlKind::Double;
    case ParamType_MaskRect:
    case ParamType_Position:
        return ControlKind::Point;
    default:
        return ControlKind::Integer;
    }
}

// "Corner A" for "Corner A, X".
std::string BeforeComma(const std::string& name) {
    return name.substr(0, name.find(','));
}

void AddControl(Plan& plan, uint32_t index) {
    const EffectDescriptor& effect = *plan.effect;
    const ParamDescriptor& param = effect.params[index];
    if (param.control == ParamControl_DepthSlider || !kyvhosting::IsKnownType(param)) {
        return; // there are no stereo frames here
    }
    Control control;
    control.kind = KindOf(param);
    control.name = param.key;
    control.label = kyvhosting::ParamName(effect, param);
    control.hint = kyvhosting::LanguageText(effect, param.descKey);
    control.group = kyvhosting::SectionOf(effect, index);
    control.index = control.yIndex = index;
    if (HasThreeModes(param)) {
        control.choices = {"Off", "Left half", "Side by side"};
    } else if (control.kind == ControlKind::Choice) {
        control.choices = kyvhosting::ChoiceNames(effect, param);
    }
    constexpr uint32_t kCornerNumbers = 8; // x and y in turns
    if (plan.IsPictureInPicture() && index < kCornerNumbers) {
        if (index % 2) {
            return;
        }
        control.kind = ControlKind::Point;
        control.label = BeforeComma(control.label);
        control.yIndex = index + 1;
    } else if (param.type == ParamType_Position) {
        control.yComponent = 1;
    } else if (param.type == ParamType_MaskRect) {
        Control second = control;
        control.name += "TopLeft";
        control.label += ", top left";
        control.yComponent = 1;
        second.name += "BottomRight";
        second.label += ", bottom right";
        second.component = 2;
        second.yComponent = 3;
        plan.controls.push_back(control);
        plan.controls.push_back(second);
        return;
    } else if (plan.IsTransition() && kyvhosting::WordsOfKey(param.nameKey) == "Percentage") {
        control.kind = ControlKind::Percentage;
        control.name = kTransitionParam;
    }
    plan.controls.push_back(control);
}

Plan MakePlan(const EffectDescriptor& effect) {
    Plan plan;
    plan.effect = &effect;
    plan.identifier = "kyv.dsp." + kyvhosting::ShortName(effect);
    plan.label = "KYV " + kyvhosting::EffectName(effect);
    const std::string text = kyvhosting::LanguageText(effect, effect.descKey);
    plan.description = text + (text.empty() ? "" : "\n") + kLossNote;
    if (plan.IsTransition()) {
        plan.context = context::kTransition;
        plan.clips = {clip::kFrom, clip::kTo};
    } else if (effect.properties.inputCount > 1) {
        plan.context = context::kGeneral;
        plan.clips = {clip::kSource, kPictureClip};
    } else {
        plan.context = context::kFilter;
        plan.clips = {clip::kSource};
    }
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        AddControl(plan, i);
    }
    if (kyvhosting::ShortName(effect) == "pencil-sketch") {
        Control seed;
        seed.kind = ControlKind::Seed;
        seed.name = "Seed";
        seed.label = "Random seed";
        seed.hint = "Another number, other strokes";
        plan.controls.push_back(seed);
    }
    return plan;
}

// Never given back: hosts may still call while the program ends.
const std::vector<Plan>* MakePlans() noexcept {
    try {
        auto plans = std::make_unique<std::vector<Plan>>();
        const kyvhosting::CModule& module = kyvhosting::PluginsModule(
            {".", "..", "../../../../../module", kyvhosting::PathOf(KYV_MODULE_FOLDER)});
        kyvhosting::UseTextsBeside(module.File());
        const ModuleDescriptor& descriptor = module.Descriptor();
        for (uint32_t i = 0; i < descriptor.effectCount; ++i) {
            plans->push_back(MakePlan(descriptor.effects[i]));
        }
        return plans.release();
    } catch (const std::exception& error) {
        std::fprintf(stderr, "KyvDsp.ofx: %s\n", error.what());
    } catch (...) {
        std::fprintf(stderr, "KyvDsp.ofx: cannot start\n");
    }
    static const std::vector<Plan> none;
    return &none;
}

} // namespace

const std::vector<Plan>& Plans() noexcept {
    static const std::vector<Plan>* const plans = MakePlans();
    return *plans;
}

} // namespace kyvofx
