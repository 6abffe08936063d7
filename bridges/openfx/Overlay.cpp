// The overlay.
#include "bridges/openfx/Overlay.h"

#include <algorithm>
#include <cmath>
#include <string_view>

#include "bridges/openfx/Effect.h"
#include "bridges/openfx/Suites.h"

namespace kyvofx {
namespace {

constexpr size_t kCorners = 4;
constexpr double kReach = 8; // pixels of the screen round a corner

// The interact points to the mark of the corner that is dragged.
char g_marks[kCorners];

struct View {
    CEffect* effect;
    double time;
    PointD pixel; // of the screen, in canonical coordinates

    explicit View(const CProps& in) : effect(nullptr), time(in.Double(prop::kTime, 0)) {
        const CProps props = PropsOf(static_cast<EffectHandle>(in.Pointer(prop::kEffectInstance)));
        effect = static_cast<CEffect*>(props.Pointer(prop::kInstanceData));
        const auto size = [&](int axis) {
            const double length = in.Double(prop::kPixelScale, 1, axis);
            return length > 0 && std::isfinite(length) ? length : 1;
        };
        pixel = {size(0), size(1)};
    }
};

CProps PropsOfInteract(const void* handle) {
    const InteractSuite* const suite = GetSuites().interact;
    PropertySetHandle set = nullptr;
    const bool isRead =
        suite && suite->getPropertySet(static_cast<InteractHandle>(const_cast<void*>(handle)),
                                       &set) == kStatOk;
    return CProps(isRead ? set : nullptr);
}

Status Draw(const View& view, const CProps& in) {
    const DrawSuite* const draw = GetSuites().draw;
    const auto context = static_cast<DrawContextHandle>(in.Pointer(prop::kDrawContext));
    if (!draw || !context) {
        return kStatReplyDefault;
    }
    PointD corners[kCorners];
    for (size_t i = 0; i < kCorners; ++i) {
        const std::optional<PointD> corner = view.effect->Corner(i, view.time);
        if (!corner) {
            return kStatReplyDefault;
        }
        corners[i] = *corner;
    }
    constexpr int kActiveColor = 1; // as the host has it for what can be moved
    ColorF color = {1, 1, 1, 1};
    draw->getColor(context, kActiveColor, &color);
    draw->setColor(context, &color);
    draw->setLineWidth(context, 1);
    draw->draw(context, kDrawPrimitive_LineLoop, corners, kCorners);
    constexpr double kHalfSquare = 4;
    for (const PointD& corner : corners) {
        const double x = kHalfSquare * view.pixel.x, y = kHalfSquare * view.pixel.y;
        const PointD square[2] = {{corner.x - x, corner.y - y}, {corner.x + x, corner.y + y}};
        draw->draw(context, kDrawPrimitive_Rectangle, square, 2);
    }
    return kStatOk;
}

PointD PenOf(const CProps& in) {
    return {in.Double(prop::kPenPosition, NAN, 0), in.Double(prop::kPenPosition, NAN, 1)};
}

// The nearest corner within reach.
Status PenDown(const View& view, const CProps& in, CProps& interact) {
    if (view.effect->HostDrawsHandles()) {
        return kStatReplyDefault;
    }
    const PointD pen = PenOf(in);
    double nearest = kReach;
    char* dragged = nullptr;
    for (size_t i = 0; i < kCorners; ++i) {
        if (const std::optional<PointD> corner = view.effect->Corner(i, view.time)) {
            const double distance =
                std::hypot((corner->x - pen.x) / view.pixel.x, (corner->y - pen.y) / view.pixel.y);
            if (distance <= nearest) {
                nearest = distance;
                dragged = &g_marks[i];
            }
        }
    }
    interact.Set(prop::kInstanceData, static_cast<void*>(dragged));
    return dragged ? kStatOk : kStatReplyDefault;
}

Status Act(std::string_view name, const void* handle, const CProps& in) {
    if (name == action::kDescribe || name == action::kCreateInstance ||
        name == action::kDestroyInstance) {
        return kStatOk;
    }
    const View view(in);
    if (!view.effect) {
        return kStatReplyDefault;
    }
    if (name == action::kInteractDraw) {
        return Draw(view, in);
    }
    CProps interact = PropsOfInteract(handle);
    if (name == action::kInteractPenDown) {
        return PenDown(view, in, interact);
    }
    const auto* const dragged = static_cast<const char*>(interact.Pointer(prop::kInstanceData));
    const bool isUp = name == action::kInteractPenUp;
    if (!dragged || (!isUp && name != action::kInteractPenMotion)) {
        return kStatReplyDefault;
    }
    const PointD pen = PenOf(in);
    if (std::isfinite(pen.x) && std::isfinite(pen.y)) {
        view.effect->SetCorner(static_cast<size_t>(dragged - g_marks), pen);
    }
    if (isUp) {
        interact.Set(prop::kInstanceData, static_cast<void*>(nullptr));
    }
    GetSuites().interact.load()->redraw(static_cast<InteractHandle>(const_cast<void*>(handle)));
    return kStatOk;
}

} // namespace

Status OverlayEntry(const char* action, const void* handle, PropertySetHandle in,
                    PropertySetHandle) {
    try {
        return action ? Act(action, handle, CProps(in)) : kStatErrValue;
    } catch (...) {
        return kStatFailed;
    }
}

} // namespace kyvofx
