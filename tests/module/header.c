/* The public headers serve C, alone and together. */
#include "interface/HostInterface.h"
#include "interface/LanguageLibrary.h"

KyvStatus UseHeader(EffectContext* context);

KyvStatus UseHeader(EffectContext* context) {
    return context->descriptor->callbacks.InitInstance(context);
}
