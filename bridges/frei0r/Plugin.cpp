// The frei0r functions of one plug-in. The build compiles this file once for each, with the table
// that belongs to it.
#include "bridges/frei0r/Bridge.h"

#include KYV_FREI0R_TABLE

using kyvfrei0r::CPluginInstance;
using kyvfrei0r::kTable;

extern "C" {

#define KYV_EXPORT [[gnu::visibility("default")]]

// Hosts call these once, several times or never, before or after anything else: nothing depends
// on them, so there is nothing to count.
KYV_EXPORT int f0r_init() noexcept {
    return 1;
}

KYV_EXPORT void f0r_deinit() noexcept {}

KYV_EXPORT void f0r_get_plugin_info(Frei0rPluginInfo* info) noexcept {
    kyvfrei0r::FillPluginInfo(kTable, info);
}

KYV_EXPORT void f0r_get_param_info(Frei0rParamInfo* info, int index) noexcept {
    kyvfrei0r::FillParamInfo(kTable, info, index);
}

KYV_EXPORT void* f0r_construct(unsigned width, unsigned height) noexcept {
    return kyvfrei0r::Construct(kTable, width, height).release();
}

KYV_EXPORT void f0r_destruct(void* instance) noexcept {
    delete static_cast<CPluginInstance*>(instance);
}

KYV_EXPORT void f0r_set_param_value(void* instance, void* value, int index) noexcept {
    if (instance) {
        static_cast<CPluginInstance*>(instance)->SetParam(index, value);
    }
}

KYV_EXPORT void f0r_get_param_value(void* instance, void* value, int index) noexcept {
    if (instance) {
        static_cast<CPluginInstance*>(instance)->GetParam(index, value);
    }
}

// The addresses are taken here: a function further down would see one of ours.
KYV_EXPORT void f0r_update(void* instance, double time, const uint32_t* input,
                           uint32_t* output) noexcept {
    if (instance) {
        static_cast<CPluginInstance*>(instance)->Update(time, input, nullptr, output,
                                                        __builtin_return_address(0));
    }
}

KYV_EXPORT void f0r_update2(void* instance, double time, const uint32_t* input0,
                            const uint32_t* input1, const uint32_t*, uint32_t* output) noexcept {
    if (instance) {
        static_cast<CPluginInstance*>(instance)->Update(time, input0, input1, output,
                                                        __builtin_return_address(0));
    }
}

} // extern "C"
