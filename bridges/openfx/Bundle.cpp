// The bundle's exports: a plug-in for each of the module's effects.
#include <algorithm>
#include <array>
#include <memory>
#include <new>
#include <string_view>
#include <utility>

#include "bridges/openfx/Describe.h"
#include "bridges/openfx/Effect.h"
#include "bridges/openfx/OpenFx.h"
#include "bridges/openfx/Plan.h"
#include "bridges/openfx/Suites.h"

namespace {

using namespace kyvofx;

// The interface tells an entry point everything but whose it is, so each plug-in has one of its
// own. More effects than this are not shown.
constexpr size_t kMostPlugins = 16;

EffectHandle EffectOf(const void* handle) {
    return static_cast<EffectHandle>(const_cast<void*>(handle));
}

CEffect* InstanceOf(const void* handle) {
    return static_cast<CEffect*>(PropsOf(EffectOf(handle)).Pointer(prop::kInstanceData));
}

Status Create(const Plan& plan, const void* handle) {
    auto effect = std::make_unique<CEffect>(plan, EffectOf(handle));
    CProps props = PropsOf(EffectOf(handle));
    if (!props.Set(prop::kInstanceData, static_cast<void*>(effect.get()))) {
        return kStatFailed;
    }
    static_cast<void>(effect.release()); // the host's until it destroys the instance
    return kStatOk;
}

Status Destroy(const void* handle) {
    delete InstanceOf(handle);
    PropsOf(EffectOf(handle)).Set(prop::kInstanceData, static_cast<void*>(nullptr));
    return kStatOk;
}

Status ActOnInstance(std::string_view name, CEffect& effect, PropertySetHandle in,
                     PropertySetHandle out) {
    if (name == action::kRender) {
        return effect.Render(in);
    }
    if (name == action::kIsIdentity) {
        return effect.IsIdentity(in, out);
    }
    if (name == action::kGetRegionOfDefinition) {
        return effect.GetRegionOfDefinition(in, out);
    }
    if (name == action::kGetRegionsOfInterest) {
        return effect.GetRegionsOfInterest(in, out);
    }
    if (name == action::kGetClipPreferences) {
        return effect.GetClipPreferences(out);
    }
    return name == action::kPurgeCaches || name == action::kEndSequence ? effect.Purge()
                                                                        : kStatReplyDefault;
}

Status Act(const Plan& plan, std::string_view name, const void* handle, PropertySetHandle in,
           PropertySetHandle out) {
    if (name == action::kLoad) {
        return FetchSuites() ? kStatOk : kStatErrMissingHostFeature;
    }
    if (name == action::kUnload) {
        return kStatOk;
    }
    if (name == action::kDescribe) {
        // Once more: a host may have been set anew since.
        return FetchSuites() ? Describe(plan, EffectOf(handle)) : kStatErrMissingHostFeature;
    }
    if (!GetSuites().property.load() || !GetSuites().parameter.load() ||
        !GetSuites().effect.load()) {
        return kStatErrMissingHostFeature;
    }
    if (name == action::kDescribeInContext) {
        return DescribeInContext(plan, EffectOf(handle), in);
    }
    if (name == action::kCreateInstance) {
        return Create(plan, handle);
    }
    if (name == action::kDestroyInstance) {
        return Destroy(handle);
    }
    CEffect* const effect = InstanceOf(handle);
    return effect ? ActOnInstance(name, *effect, in, out) : kStatErrBadHandle;
}

template <size_t kIndex>
Status Entry(const char* action, const void* handle, PropertySetHandle in, PropertySetHandle out) {
    try {
        return action && kIndex < Plans().size() ? Act(Plans()[kIndex], action, handle, in, out)
                                                 : kStatErrValue;
    } catch (const std::bad_alloc&) {
        return kStatErrMemory;
    } catch (...) {
        return kStatFailed;
    }
}

template <size_t... kIndices>
std::array<Plugin, kMostPlugins> MakePlugins(std::index_sequence<kIndices...>) {
    std::array<Plugin, kMostPlugins> plugins = {Plugin{.api = kImageEffectApi,
                                                       .apiVersion = 1,
                                                       .identifier = nullptr,
                                                       .versionMajor = KYV_VERSION_MAJOR,
                                                       .versionMinor = KYV_VERSION_MINOR,
                                                       .setHost = SetHost,
                                                       .mainEntry = Entry<kIndices>}...};
    for (size_t i = 0; i < plugins.size() && i < Plans().size(); ++i) {
        plugins[i].identifier = Plans()[i].identifier.c_str();
    }
    return plugins;
}

} // namespace

extern "C" {

#define KYV_EXPORT [[gnu::visibility("default")]]

KYV_EXPORT int OfxGetNumberOfPlugins() noexcept {
    return static_cast<int>(std::min(Plans().size(), kMostPlugins));
}

KYV_EXPORT Plugin* OfxGetPlugin(int index) noexcept {
    static std::array<Plugin, kMostPlugins> plugins =
        MakePlugins(std::make_index_sequence<kMostPlugins>());
    return index >= 0 && index < OfxGetNumberOfPlugins() ? &plugins[static_cast<size_t>(index)]
                                                         : nullptr;
}

// Of hosts that tell about themselves before they ask for plug-ins.
KYV_EXPORT int OfxSetHost(const Host* host) noexcept {
    SetHost(const_cast<Host*>(host));
    return kStatOk;
}

} // extern "C"
