// The two functions that the library exports.
#include <mutex>

#include "interface/HostInterface.h"
#include "module/Module.h"
#include "module/ResourceLibrary.h"

using kyv::g_module;

namespace {

// Several hosts may share a process, plug-ins of one program say, and start at the same time.
std::mutex g_mutex;

} // namespace

extern "C" {

// A library that an earlier call loaded stays in use when this search finds none, and is not
// released when it finds one: the load count belongs to whoever called twice.
[[gnu::visibility("default")]] KyvStatus
KYV_DSP_InitModule(ModuleDescriptor** descriptor) noexcept {
    if (!descriptor) {
        return KYV_FAIL;
    }
    *descriptor = &g_module;
    const std::lock_guard lock(g_mutex);
    try {
        if (const auto found = kyv::FindResourceLibrary(g_module.ModuleHandle)) {
            g_module.ResourceLibrary = *found;
        }
    } catch (...) {
        // Out of memory for a path: go on without a language library.
    }
    if (!g_module.ResourceLibrary) {
        g_module.ResourceLibrary = g_module.ModuleHandle;
    }
    return KYV_OK;
}

[[gnu::visibility("default")]] KyvStatus KYV_DSP_DeInitModule(void) noexcept {
    const std::lock_guard lock(g_mutex);
    if (g_module.ResourceLibrary != g_module.ModuleHandle) {
        kyv::CloseLibrary(g_module.ResourceLibrary);
    }
    g_module.ResourceLibrary = nullptr;
    return KYV_OK;
}

} // extern "C"
