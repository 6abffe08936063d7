/* The public header serves C, alone and twice. */
#include "module/HostInterface.h"

KyvStatus UseHeader(EffectContext* context);

KyvStatus UseHeader(EffectContext* context) {
    return context->descriptor->callbacks.InitInstance(context);
}
