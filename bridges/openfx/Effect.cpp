// An effect behind OpenFX's actions.
#include "bridges/openfx/Effect.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <new>
#include <string>
#include <string_view>

#include "bridges/openfx/Describe.h"
#include "hosting/Error.h"
#include "hosting/Hex.h"
#include "hosting/Plugin.h"
#include "hosting/Values.h"

namespace kyvofx {
namespace {

bool IsPossible(const RectI& area) {
    return kyvhosting::IsPossibleFrame(Width(area), Height(area));
}

double PositiveOr(double number, double fallback) {
    return number > 0 && std::isfinite(number) ? number : fallback;
}

// Pixel coordinates are canonical ones times the scale, in x divided by the pixels' aspect.
struct Grid {
    double scaleX = 1, scaleY = 1;

    Grid(const CProps& in, double pixelAspect) {
        scaleX = PositiveOr(in.Double(prop::kRenderScale, 1, 0), 1) / pixelAspect;
        scaleY = PositiveOr(in.Double(prop::kRenderScale, 1, 1), 1);
    }

    RectD ToCanonical(const RectI& area) const {
        return {area.x1 / scaleX, area.y1 / scaleY, area.x2 / scaleX, area.y2 / scaleY};
    }
};

double AspectOf(const CProps& props) {
    return PositiveOr(props.Double(prop::kPixelAspect, 1), 1);
}

CProps PropsOfClip(ClipHandle clip) {
    PropertySetHandle set = nullptr;
    const bool isRead =
        clip && GetSuites().effect.load()->clipGetPropertySet(clip, &set) == kStatOk;
    return CProps(isRead ? set : nullptr);
}

// What the host has fetched goes back to it.
class CHeldImage {
public:
    CHeldImage(ClipHandle clip, double time) {
        PropertySetHandle set = nullptr;
        if (clip && GetSuites().effect.load()->clipGetImage(clip, time, nullptr, &set) == kStatOk) {
            m_set = set;
        }
    }
    ~CHeldImage() {
        if (m_set) {
            GetSuites().effect.load()->clipReleaseImage(m_set);
        }
    }
    CHeldImage(const CHeldImage&) = delete;
    CHeldImage& operator=(const CHeldImage&) = delete;

    explicit operator bool() const { return m_set != nullptr; }
    CProps Props() const { return CProps(m_set); }

private:
    PropertySetHandle m_set = nullptr;
};

// The image's region in its pixels; its bounds where the host tells none.
RectI RegionOf(const CProps& props, const RectI& bounds) {
    RectI region;
    return props.Ints(prop::kImageRegion, 4, &region.x1) && !IsEmpty(region) ? region : bounds;
}

} // namespace

CEffect::CEffect(const Plan& plan, EffectHandle handle)
    : m_plan(plan), m_handle(handle), m_instance(*plan.effect) {
    m_instance.Context().cpuLevel = kyvhosting::kPluginCpuLevel;
    m_instance.Context().width = m_instance.Context().height = 1;
    kyvhosting::Require(m_instance.Init(), *plan.effect, "InitInstance");
    const Suites& suites = GetSuites();
    ParamSetHandle set = nullptr;
    suites.effect.load()->getParamSet(handle, &set);
    for (const Control& control : plan.controls) {
        ParamHandle param = nullptr;
        if (!set || suites.parameter.load()->getHandle(set, control.name.c_str(), &param,
                                                       nullptr) != kStatOk) {
            param = nullptr; // the module's default counts
        }
        m_params.push_back(param);
    }
    const auto clipOf = [&](const char* name) {
        ClipHandle clip = nullptr;
        const bool isRead =
            suites.effect.load()->clipGetHandle(handle, name, &clip, nullptr) == kStatOk;
        return isRead ? clip : nullptr;
    };
    for (const char* name : plan.clips) {
        m_clips.push_back(clipOf(name));
    }
    m_output = clipOf(clip::kOutput);
}

bool CEffect::IsConnected(ClipHandle clip) const {
    return clip && PropsOfClip(clip).Int(prop::kConnected, 1) != 0;
}

std::optional<RectD> CEffect::RegionOf(ClipHandle clip, double time) const {
    RectD region = {};
    if (!IsConnected(clip) ||
        GetSuites().effect.load()->clipGetRegionOfDefinition(clip, time, &region) != kStatOk ||
        !(region.x1 < region.x2) || !(region.y1 < region.y2)) {
        return std::nullopt;
    }
    return region;
}

// Hosts before 1.2 keep points as fractions of the project.
PointD CEffect::ToCanonical(PointD value) const {
    if (PointsAreCanonical()) {
        return value;
    }
    const CProps props = PropsOf(m_handle);
    return {props.Double(prop::kProjectOffset, 0, 0) +
                value.x * props.Double(prop::kProjectSize, 1, 0),
            props.Double(prop::kProjectOffset, 0, 1) +
                value.y * props.Double(prop::kProjectSize, 1, 1)};
}

double CEffect::ReadDouble(ParamHandle param, double time, double fallback) const {
    double number = fallback;
    const bool isRead =
        param && GetSuites().parameter.load()->getValueAtTime(param, time, &number) == kStatOk;
    return isRead ? number : fallback;
}

void CEffect::ReadControl(const Control& control, ParamHandle param, double time,
                          const RectD& frame, kyvhosting::CInstance& instance) const {
    const auto read = [&](auto*... numbers) {
        return GetSuites().parameter.load()->getValueAtTime(param, time, numbers...) == kStatOk;
    };
    const ParamDescriptor& record = instance.Effect().params[control.index];
    uint8_t* const value = instance.Value(control.index);
    switch (control.kind) {
    case ControlKind::Double:
    case ControlKind::Percentage:
        if (double number = 0; read(&number)) {
            kyvhosting::SetComponent(record, value, control.component, number);
        }
        break;
    case ControlKind::Rgb:
        if (double parts[3] = {}; read(parts, parts + 1, parts + 2)) {
            for (size_t i = 0; i < 3; ++i) {
                kyvhosting::SetComponent(record, value, i, parts[i] * 255);
            }
        }
        break;
    case ControlKind::Point:
        if (PointD point = {}; read(&point.x, &point.y)) {
            point = ToCanonical(point);
            const ParamDescriptor& yRecord = instance.Effect().params[control.yIndex];
            kyvhosting::SetComponent(record, value, control.component,
                                     (point.x - frame.x1) / (frame.x2 - frame.x1));
            kyvhosting::SetComponent(yRecord, instance.Value(control.yIndex), control.yComponent,
                                     (frame.y2 - point.y) / (frame.y2 - frame.y1));
        }
        break;
    case ControlKind::Seed:
        if (int number = 0; read(&number)) {
            instance.Context().randomSeed = static_cast<uint32_t>(number);
        }
        break;
    default:
        if (int number = 0; read(&number)) {
            kyvhosting::SetComponent(record, value, 0, number);
        }
        break;
    }
}

// The module's values for a time; frame is the canonical rectangle that its fractions are of.
void CEffect::ReadValues(double time, const RectD& frame, kyvhosting::CInstance& instance) const {
    for (size_t i = 0; i < m_params.size(); ++i) {
        if (m_params[i]) {
            ReadControl(m_plan.controls[i], m_params[i], time, frame, instance);
        }
    }
    // All sides 0 stand for no mask. Its two points are then at one place, which is the frame's
    // corner no longer where the picture is not as large as the project.
    for (uint32_t i = 0; i < instance.Effect().paramCount; ++i) {
        float sides[4];
        if (instance.Effect().params[i].type == ParamType_MaskRect) {
            std::memcpy(sides, instance.Value(i), sizeof sides);
            if (sides[0] == sides[2] && sides[1] == sides[3]) {
                std::memset(instance.Value(i), 0, sizeof sides);
            }
        }
    }
}

// Position and duration from the frames of the first clip; the effect's own duration where the clip
// has no range. Without a rate a frame counts as a 25th of a second.
void CEffect::SetTime(double time) {
    const CProps clip = PropsOfClip(m_clips.front());
    const double own = PositiveOr(PropsOf(m_handle).Double(prop::kFrameRate, 25), 25);
    const double rate = PositiveOr(clip.Double(prop::kFrameRate, 0), own);
    double first = clip.Double(prop::kFrameRange, 0, 0);
    double frames = clip.Double(prop::kFrameRange, -1, 1) - first + 1;
    if (!(frames > 0) || !std::isfinite(first)) {
        first = 0;
        frames = PropsOf(m_handle).Double(prop::kEffectDuration, 0);
    }
    const auto units = [rate](double count) {
        return kyvhosting::TimeUnits(count / rate * kyvhosting::kUnitsPerSecond);
    };
    m_instance.Context().position = units(time - first);
    m_instance.Context().duration = units(frames);
}

bool CEffect::IsAborted() const {
    return GetSuites().effect.load()->abort(m_handle) != 0;
}

Status CEffect::Complain(KyvStatus status) {
    const MessageSuite* const messages = GetSuites().message;
    if (messages && !m_bComplained) {
        m_bComplained = true; // a line a frame would bury the host
        const std::string text =
            m_plan.label + ": rendering failed with status " + kyvhosting::Hex(status);
        messages->message(m_handle, value::kMessageError, "", "%s", text.c_str());
    }
    return kStatFailed;
}

bool CEffect::Fetch(size_t clip, double time, const RectI& area, Frame& frame) const {
    const CHeldImage held(IsConnected(m_clips[clip]) ? m_clips[clip] : nullptr, time);
    const std::optional<Image> image = held ? ImageOf(held.Props()) : std::nullopt;
    // The second picture fills the frame whatever its size and place.
    const bool isPicture = m_plan.IsPictureInPicture() && clip == 1;
    const RectI own = image && isPicture ? kyvofx::RegionOf(held.Props(), image->bounds) : area;
    if (!image || !IsPossible(own)) {
        frame.assign(static_cast<size_t>(Width(area) * Height(area)), 0);
        return false;
    }
    ReadImage(*image, own, frame);
    if (Width(own) != Width(area) || Height(own) != Height(area)) {
        frame = Scaled(frame, static_cast<size_t>(Width(own)), static_cast<size_t>(Height(own)),
                       static_cast<size_t>(Width(area)), static_cast<size_t>(Height(area)));
    }
    return true;
}

Status CEffect::RenderImage(double time, const CProps& in, const Image& output, const RectI& area) {
    RectI window = output.bounds;
    in.Ints(prop::kRenderWindow, 4, &window.x1);
    const std::string_view field = in.String(prop::kField);
    const Rows rows = field == value::kFieldLower   ? Rows::Even
                      : field == value::kFieldUpper ? Rows::Odd
                                                    : Rows::All;
    const bool hasFirst = Fetch(0, time, area, m_inputs[0]);
    const bool hasSecond = m_clips.size() > 1 && Fetch(1, time, area, m_inputs[1]);
    if (IsAborted()) {
        return kStatOk;
    }
    if (!hasFirst && !(m_plan.IsTransition() && hasSecond)) {
        WriteImage(m_inputs[0], area, output, window, rows); // transparent black
        return kStatOk;
    }
    const Frame* shown = nullptr;
    if (m_plan.IsPictureInPicture() && !hasSecond) {
        shown = &m_inputs[0];
    } else if (m_plan.IsTransition()) {
        // With no smoothness the brightest parts of the mask would keep the first input to the end.
        const double percentage = Percentage(time);
        shown = percentage <= 0 ? &m_inputs[0] : percentage >= 1 ? &m_inputs[1] : nullptr;
    }
    if (!shown) {
        if (!m_bBegun) {
            m_bBegun = true; // what a failed call has allocated is given back as well
            if (const KyvStatus status = m_instance.Begin(); status != KYV_OK) {
                return Complain(status);
            }
        }
        m_result.resize(m_inputs[0].size());
        // The whole frame for a field as well, of which its rows are taken: the module's own fields
        // leave out what an effect does not do for them.
        const KyvStatus status =
            m_instance.Render(m_result.data(), m_inputs[0].data(), m_inputs[1].data());
        if (status != KYV_OK) {
            return Complain(status);
        }
        if (kyvhosting::LosesAlpha(*m_plan.effect)) {
            kyvhosting::KeepAlpha(m_inputs[0].data(), m_result.data(), m_result.size());
        }
        shown = &m_result;
    }
    if (!IsAborted()) {
        WriteImage(*shown, area, output, window, rows);
    }
    return kStatOk;
}

Status CEffect::Render(PropertySetHandle inHandle) {
    const std::lock_guard lock(m_mutex);
    const CProps in(inHandle);
    const double time = in.Double(prop::kTime, 0);
    if (IsAborted()) {
        return kStatOk;
    }
    const CHeldImage held(m_output, time);
    const std::optional<Image> output = held ? ImageOf(held.Props()) : std::nullopt;
    if (!output) {
        return held ? kStatErrImageFormat : kStatFailed;
    }
    const RectI area = kyvofx::RegionOf(held.Props(), output->bounds);
    if (!IsPossible(area)) {
        return kStatErrUnsupported;
    }
    EffectContext& context = m_instance.Context();
    const double aspect = AspectOf(held.Props());
    const auto width = static_cast<uint32_t>(Width(area));
    const auto height = static_cast<uint32_t>(Height(area));
    const uint32_t seed = context.randomSeed;
    ReadValues(time, Grid(in, aspect).ToCanonical(area), m_instance);
    if (width != context.width || height != context.height || seed != context.randomSeed) {
        m_instance.End();
        m_bBegun = false;
    }
    context.width = width;
    context.height = height;
    constexpr double kAspectUnits = 1000;
    context.displayAspectX = aspect == 1 ? 0 : static_cast<uint32_t>(width * aspect * kAspectUnits);
    context.displayAspectY = aspect == 1 ? 0 : static_cast<uint32_t>(height * kAspectUnits);
    SetTime(time);
    return RenderImage(time, in, *output, area);
}

double CEffect::Percentage(double time) const {
    for (size_t i = 0; i < m_params.size(); ++i) {
        if (m_plan.controls[i].kind == ControlKind::Percentage) {
            return ReadDouble(m_params[i], time, 0.5);
        }
    }
    return 0.5;
}

Status CEffect::IsIdentity(PropertySetHandle in, PropertySetHandle out) {
    const std::lock_guard lock(m_mutex);
    const double time = CProps(in).Double(prop::kTime, 0);
    size_t clip = 0;
    bool isSame = false;
    if (m_plan.IsTransition()) {
        const double percentage = Percentage(time);
        clip = percentage >= 1;
        isSame = percentage <= 0 || percentage >= 1;
    } else if (m_plan.effect->properties.family == EffectFamily_Color) {
        // The corrections' defaults change nothing.
        kyvhosting::CInstance values(*m_plan.effect);
        isSame = values.Init() == KYV_OK;
        const std::vector<uint8_t> neutral = values.Params();
        ReadValues(time, {0, 0, 1, 1}, values);
        isSame = isSame && values.Params() == neutral;
    } else if (m_plan.IsPictureInPicture()) {
        isSame = !IsConnected(m_clips[1]);
    }
    if (!isSame || !IsConnected(m_clips[clip])) {
        return kStatReplyDefault;
    }
    CProps props(out);
    props.Set(prop::kName, m_plan.clips[clip]);
    props.Set(prop::kTime, time);
    return kStatOk;
}

// A filter and the picture-in-picture are as large as their first clip, a transition as both.
Status CEffect::GetRegionOfDefinition(PropertySetHandle in, PropertySetHandle out) {
    const double time = CProps(in).Double(prop::kTime, 0);
    std::optional<RectD> region = RegionOf(m_clips[0], time);
    if (m_plan.IsTransition()) {
        const std::optional<RectD> second = RegionOf(m_clips[1], time);
        if (region && second) {
            region = RectD{std::min(region->x1, second->x1), std::min(region->y1, second->y1),
                           std::max(region->x2, second->x2), std::max(region->y2, second->y2)};
        }
        region = region ? region : second;
    }
    if (!region) {
        return kStatReplyDefault;
    }
    const double numbers[4] = {region->x1, region->y1, region->x2, region->y2};
    CProps props(out);
    for (int i = 0; i < 4; ++i) {
        props.Set(prop::kRegionOfDefinition, numbers[i], i);
    }
    return kStatOk;
}

// All of every clip: effects look at the whole picture.
Status CEffect::GetRegionsOfInterest(PropertySetHandle in, PropertySetHandle out) {
    const double time = CProps(in).Double(prop::kTime, 0);
    CProps props(out);
    bool isSet = false;
    for (size_t clip = 0; clip < m_clips.size(); ++clip) {
        if (const std::optional<RectD> region = RegionOf(m_clips[clip], time)) {
            const std::string name = std::string(prop::kRegionOfInterest) + m_plan.clips[clip];
            const double numbers[4] = {region->x1, region->y1, region->x2, region->y2};
            for (int i = 0; i < 4; ++i) {
                props.Set(name.c_str(), numbers[i], i);
            }
            isSet = true;
        }
    }
    return isSet ? kStatOk : kStatReplyDefault;
}

// Particles move and strokes may change while no control does.
Status CEffect::GetClipPreferences(PropertySetHandle out) {
    const bool varies = m_plan.IsParticle() || m_plan.controls.back().kind == ControlKind::Seed;
    CProps(out).Set(prop::kFrameVarying, varies ? 1 : 0);
    return kStatOk;
}

Status CEffect::Purge() {
    const std::lock_guard lock(m_mutex);
    m_instance.End();
    m_bBegun = false;
    for (Frame* frame : {&m_inputs[0], &m_inputs[1], &m_result}) {
        Frame().swap(*frame);
    }
    return kStatOk;
}

std::optional<PointD> CEffect::Corner(size_t corner, double time) {
    const std::lock_guard lock(m_mutex);
    PointD point = {};
    const bool isRead = m_plan.IsPictureInPicture() && corner < 4 && m_params[corner] &&
                        GetSuites().parameter.load()->getValueAtTime(m_params[corner], time,
                                                                     &point.x, &point.y) == kStatOk;
    return isRead ? std::optional(ToCanonical(point)) : std::nullopt;
}

void CEffect::SetCorner(size_t corner, PointD at) {
    if (!PointsAreCanonical()) {
        const CProps props = PropsOf(m_handle);
        const double width = props.Double(prop::kProjectSize, 1, 0);
        const double height = props.Double(prop::kProjectSize, 1, 1);
        at.x = (at.x - props.Double(prop::kProjectOffset, 0, 0)) / (width > 0 ? width : 1);
        at.y = (at.y - props.Double(prop::kProjectOffset, 0, 1)) / (height > 0 ? height : 1);
    }
    // Without the lock: the host may ask for a render from within.
    GetSuites().parameter.load()->setValue(m_params[corner], at.x, at.y);
}

bool CEffect::HostDrawsHandles() {
    PropertySetHandle set = nullptr;
    const bool isRead =
        m_params[0] && GetSuites().parameter.load()->getPropertySet(m_params[0], &set) == kStatOk;
    return isRead && CProps(set).Int(prop::kHasHostHandle, 0) != 0;
}

} // namespace kyvofx
