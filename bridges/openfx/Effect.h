// An instance of one of the effects behind the host's calls.
//
// The host may call the actions of one instance from several threads at once: each takes the
// instance's lock. The module prepares itself at the first frame. Nothing here throws but where it
// is said.
#pragma once

#include <mutex>
#include <optional>
#include <vector>

#include "bridges/openfx/OpenFx.h"
#include "bridges/openfx/Pixels.h"
#include "bridges/openfx/Plan.h"
#include "hosting/Instance.h"

namespace kyvofx {

class CEffect {
public:
    // Throws std::bad_alloc, and CCallError when the effect refuses.
    CEffect(const Plan& plan, EffectHandle handle);

    Status Render(PropertySetHandle in);
    Status IsIdentity(PropertySetHandle in, PropertySetHandle out);
    Status GetRegionOfDefinition(PropertySetHandle in, PropertySetHandle out);
    Status GetRegionsOfInterest(PropertySetHandle in, PropertySetHandle out);
    Status GetClipPreferences(PropertySetHandle out);

    // Gives back what the module and the frames hold; the next frame prepares anew.
    Status Purge();

    // For the overlay. A corner of the quad in canonical coordinates, by its number; nothing when
    // the effect has none.
    std::optional<PointD> Corner(size_t corner, double time);
    void SetCorner(size_t corner, PointD at);
    bool HostDrawsHandles();

private:
    void ReadValues(double time, const RectD& frame, kyvhosting::CInstance& instance) const;
    void ReadControl(const Control& control, ParamHandle param, double time, const RectD& frame,
                     kyvhosting::CInstance& instance) const;
    PointD ToCanonical(PointD value) const;
    double ReadDouble(ParamHandle param, double time, double fallback) const;
    double Percentage(double time) const;
    void SetTime(double time);
    std::optional<RectD> RegionOf(ClipHandle clip, double time) const;
    bool IsConnected(ClipHandle clip) const;
    // False when the clip gives no image.
    bool Fetch(size_t clip, double time, const RectI& area, Frame& frame) const;
    Status RenderImage(double time, const CProps& in, const Image& output, const RectI& area);
    Status Complain(KyvStatus status);
    bool IsAborted() const;

    const Plan& m_plan;
    EffectHandle m_handle;
    std::mutex m_mutex;
    kyvhosting::CInstance m_instance;
    std::vector<ParamHandle> m_params; // one for each control
    std::vector<ClipHandle> m_clips;   // one for each clip of the plan
    ClipHandle m_output = nullptr;
    bool m_bBegun = false;
    bool m_bComplained = false;
    Frame m_inputs[2], m_result;
};

} // namespace kyvofx
