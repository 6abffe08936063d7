// The callback that is the same for every effect.
#include "interface/EffectGlue.h"

namespace kyv::glue {

KyvStatus InitInstance(EffectContext* context) noexcept {
    if (!context) {
        return KYV_FAIL;
    }
    return Guard([&]() -> KyvStatus {
        if (context->notification && context->notification->table) {
            context->notification->table->Notify(context->notification);
        }
        if (!context->descriptor || !context->params) {
            return KYV_FAIL;
        }
        auto* write = static_cast<uint8_t*>(context->params);
        for (uint32_t i = 0; i < context->descriptor->paramCount; ++i) {
            const ParamDescriptor& param = context->descriptor->params[i];
            std::memcpy(write, param.defaultValue, param.valueSize);
            write += param.valueSize;
        }
        return KYV_OK;
    });
}

} // namespace kyv::glue
