// Descriptions.
#include "bridges/openfx/Describe.h"

#include <algorithm>
#include <atomic>
#include <string_view>

#include "bridges/openfx/Overlay.h"
#include "bridges/openfx/Suites.h"
#include "hosting/Values.h"

namespace kyvofx {
namespace {

std::atomic<bool> g_bPointsAreCanonical = true;

void SetLabels(CProps& props, const std::string& label) {
    props.Set(prop::kLabel, label.c_str());
    props.Set(prop::kShortLabel, label.c_str());
    props.Set(prop::kLongLabel, label.c_str());
}

const char* TypeOf(ControlKind kind) {
    switch (kind) {
    case ControlKind::Double:
    case ControlKind::Percentage:
        return paramtype::kDouble;
    case ControlKind::Boolean:
        return paramtype::kBoolean;
    case ControlKind::Choice:
        return paramtype::kChoice;
    case ControlKind::Rgb:
        return paramtype::kRgb;
    case ControlKind::Point:
        return paramtype::kDouble2D;
    default:
        return paramtype::kInteger;
    }
}

template <class Number>
void SetRange(CProps& props, Number initial, Number least, Number most) {
    props.Set(prop::kDefault, initial);
    props.Set(prop::kMin, least);
    props.Set(prop::kMax, most);
    props.Set(prop::kDisplayMin, least);
    props.Set(prop::kDisplayMax, most);
}

// The module's fractions have y downwards.
void SetPoint(const Plan& plan, const Control& control, CProps& props) {
    const ParamDescriptor& x = plan.effect->params[control.index];
    const ParamDescriptor& y = plan.effect->params[control.yIndex];
    props.Set(prop::kDoubleType, value::kTypeXyAbsolute);
    const bool isCanonical = props.Set(prop::kCoordinateSystem, value::kCoordinatesNormalised);
    if (!isCanonical) {
        props.Set(prop::kDoubleType, value::kTypeNormalisedXyAbsolute);
    }
    g_bPointsAreCanonical = isCanonical;
    props.Set(prop::kDefault, kyvhosting::ComponentOf(x, x.defaultValue, control.component), 0);
    props.Set(prop::kDefault, 1 - kyvhosting::ComponentOf(y, y.defaultValue, control.yComponent),
              1);
    props.Set(prop::kUseHostHandle, 1);
}

void SetControl(const Plan& plan, const Control& control, CProps& props) {
    const ParamDescriptor& record = plan.effect->params[control.index];
    const double initial = kyvhosting::ComponentOf(record, record.defaultValue, 0);
    const kyvhosting::NumberRange range = kyvhosting::RangeOf(record);
    switch (control.kind) {
    case ControlKind::Integer:
        SetRange(props, int(initial), int(range.least), int(range.most));
        break;
    case ControlKind::Double:
        SetRange(props, initial, range.least, range.most);
        break;
    case ControlKind::Percentage:
        SetRange(props, 0.0, 0.0, 1.0);
        break;
    case ControlKind::Boolean:
        props.Set(prop::kDefault, initial != 0 ? 1 : 0);
        break;
    case ControlKind::Choice:
        for (size_t i = 0; i < control.choices.size(); ++i) {
            props.Set(prop::kChoiceOption, control.choices[i].c_str(), int(i));
        }
        props.Set(prop::kDefault, int(initial));
        break;
    case ControlKind::Rgb:
        for (int i = 0; i < 3; ++i) {
            props.Set(prop::kDefault,
                      kyvhosting::ComponentOf(record, record.defaultValue, size_t(i)) / 255, i);
        }
        break;
    case ControlKind::Point:
        SetPoint(plan, control, props);
        break;
    case ControlKind::Seed:
        SetRange(props, 0, 0, 9999);
        break;
    }
}

bool DefineClip(EffectHandle effect, const char* name) {
    PropertySetHandle set = nullptr;
    if (GetSuites().effect.load()->clipDefine(effect, name, &set) != kStatOk) {
        return false;
    }
    CProps props(set);
    props.Set(prop::kSupportedComponents, value::kRgba);
    props.Set(prop::kTemporalClipAccess, 0);
    props.Set(prop::kSupportsTiles, 0);
    props.Set(prop::kFieldExtraction, value::kFieldBoth);
    return true;
}

} // namespace

bool PointsAreCanonical() {
    return g_bPointsAreCanonical;
}

Status Describe(const Plan& plan, EffectHandle effect) {
    CProps props = PropsOf(effect);
    SetLabels(props, plan.label);
    props.Set(prop::kGrouping, "KYV DSP");
    props.Set(prop::kDescription, plan.description.c_str());
    props.Set(prop::kSupportedContexts, plan.context);
    const char* const depths[] = {value::kByte, value::kShort, value::kFloat};
    for (int i = 0; i < 3; ++i) {
        props.Set(prop::kSupportedDepths, depths[i], i);
    }
    // One instance renders a frame at a time, instances do so side by side.
    props.Set(prop::kThreadSafety, value::kInstanceSafe);
    props.Set(prop::kHostFrameThreading, 0);
    // Every effect looks at its whole picture, so tiles would each cost a frame.
    props.Set(prop::kSupportsTiles, 0);
    props.Set(prop::kSupportsMultiResolution, 1);
    props.Set(prop::kTemporalClipAccess, 0);
    props.Set(prop::kFieldRenderTwice, 0);
    if (plan.IsPictureInPicture() && GetSuites().interact.load() && GetSuites().draw.load()) {
        props.Set(prop::kOverlayV2, reinterpret_cast<void*>(&OverlayEntry));
    }
    return kStatOk;
}

Status DescribeInContext(const Plan& plan, EffectHandle effect, PropertySetHandle in) {
    if (std::string_view(CProps(in).String(prop::kContext)) != plan.context) {
        return kStatErrUnsupported;
    }
    for (const char* name : plan.clips) {
        if (!DefineClip(effect, name)) {
            return kStatFailed;
        }
    }
    ParamSetHandle set = nullptr;
    if (!DefineClip(effect, clip::kOutput) ||
        GetSuites().effect.load()->getParamSet(effect, &set) != kStatOk) {
        return kStatFailed;
    }
    const ParameterSuite& params = *GetSuites().parameter.load();
    std::vector<std::string> groups;
    for (const Control& control : plan.controls) {
        PropertySetHandle handle = nullptr;
        const bool isKnown = std::find(groups.begin(), groups.end(), control.group) != groups.end();
        if (!control.group.empty() && !isKnown) {
            groups.push_back(control.group);
            if (params.define(set, paramtype::kGroup, control.group.c_str(), &handle) == kStatOk) {
                CProps group(handle);
                SetLabels(group, control.group);
            }
        }
        if (params.define(set, TypeOf(control.kind), control.name.c_str(), &handle) != kStatOk) {
            return kStatFailed;
        }
        CProps props(handle);
        SetLabels(props, control.label);
        if (!control.group.empty()) {
            props.Set(prop::kLongLabel, (control.group + ": " + control.label).c_str());
            props.Set(prop::kParent, control.group.c_str());
        }
        props.Set(prop::kHint, control.hint.c_str());
        props.Set(prop::kAnimates, control.kind == ControlKind::Seed ? 0 : 1);
        SetControl(plan, control, props);
    }
    PropertySetHandle page = nullptr;
    if (params.define(set, paramtype::kPage, "Main", &page) == kStatOk) {
        CProps props(page);
        SetLabels(props, "Main");
        for (size_t i = 0; i < plan.controls.size(); ++i) {
            props.Set(prop::kPageChild, plan.controls[i].name.c_str(), int(i));
        }
    }
    return kStatOk;
}

} // namespace kyvofx
