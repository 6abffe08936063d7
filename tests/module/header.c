/* The public headers serve C, alone and together. */
#include "module/HostInterface.h"
#include "module/LanguageLibrary.h"

KyvStatus UseHeader(EffectContext* context);

KyvStatus UseHeader(EffectContext* context) {
    return context->descriptor->callbacks.InitInstance(context);
}
