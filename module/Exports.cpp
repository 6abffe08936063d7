// The two functions that the library exports.
#include "interface/HostInterface.h"
#include "module/Module.h"
#include "module/ResourceLibrary.h"

using kyv::g_module;

extern "C" {

// A library that an earlier call loaded stays in use when this search finds none, and is not
// released when it finds one: the load count belongs to whoever called twice.
[[gnu::visibility("default")]] KyvStatus
KYV_DSP_InitModule(ModuleDescriptor** descriptor) noexcept {
    if (!descriptor) {
        return KYV_FAIL;
    }
    *descriptor = &g_module;
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
    if (g_module.ResourceLibrary != g_module.ModuleHandle) {
        kyv::CloseLibrary(g_module.ResourceLibrary);
    }
    g_module.ResourceLibrary = nullptr;
    return KYV_OK;
}

} // extern "C"
