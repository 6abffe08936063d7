// A module whose output tells what the host handed over. Both effects copy their first input and
// then write the context's fields into the first row of the view, one word a pixel.
//
// "probe" has one input; "probe_pair" has two and shows the second one in its last row.
#include <string.h>

#include "interface/HostInterface.h"

enum { kModeFine, kModeFailsToBegin, kModeFailsToProcess, kModeCount };

typedef struct Instance {
    const uint32_t* inputs[2];
} Instance;

#pragma pack(push, 1)
typedef struct Params {
    int32_t mode;
    float amount;
    uint8_t byte;
    uint32_t color;
} Params;
#pragma pack(pop)

static const Params kMinimum = {0, 0, 10, 0};
static const Params kMaximum = {kModeCount - 1, 1, 20, 0};
static const Params kDefault = {kModeFine, 0.25f, 12, 0x563412};

#define PARAM(index, name, kind, field)                                                            \
    {                                                                                              \
        .key = index, .nameKey = name, .minimum = &kMinimum.field, .maximum = &kMaximum.field,     \
        .defaultValue = &kDefault.field, .type = kind, .valueSize = sizeof kDefault.field          \
    }
static const ParamDescriptor kParams[] = {
    PARAM("P1", "IDS_Vi_Param_Mode_Name;fine;no_begin;no_process", ParamType_Choice, mode),
    PARAM("P2", "IDS_Vi_Param_FirstAmount_Name", ParamType_Float, amount),
    PARAM("P3", "IDS_Vi_Param_Byte_Name", ParamType_Byte, byte),
    PARAM("P4", "IDS_Vi_Param_Color_Name", ParamType_Color, color),
};

// What a new instance holds differs from the record on purpose: a host is to show the former.
static KyvStatus Init(EffectContext* context) KYV_NOEXCEPT {
    memcpy(context->params, &kDefault, sizeof kDefault);
    ((Params*)context->params)->byte = 13;
    return KYV_OK;
}

static KyvStatus Done(EffectContext* context) KYV_NOEXCEPT {
    (void)context;
    return KYV_OK;
}

static KyvStatus SetInput(uint32_t index, EffectContext* context) KYV_NOEXCEPT {
    ((Instance*)context->instanceData)->inputs[index] = context->frame;
    return KYV_OK;
}

static KyvStatus Begin(EffectContext* context) KYV_NOEXCEPT {
    const Params* params = context->params;
    return params->mode == kModeFailsToBegin ? KYV_OUT_OF_MEMORY : KYV_OK;
}

static KyvStatus Process(EffectContext* context) KYV_NOEXCEPT {
    const Instance* instance = context->instanceData;
    const Params* params = context->params;
    if (params->mode == kModeFailsToProcess)
        return KYV_FAIL;

    const size_t pitch = (size_t)context->width * (context->stereoLayout ? 2 : 1);
    const size_t start = context->stereoLayout == StereoLayout_RightHalf ? context->width : 0;
    uint32_t* output = (uint32_t*)context->frame + start;
    for (uint32_t y = 0; y < context->height; ++y)
        memcpy(output + y * pitch, instance->inputs[0] + start + y * pitch, context->width * 4);
    if (context->descriptor->properties.inputCount == 2) {
        const size_t last = (context->height - 1) * pitch;
        memcpy(output + last, instance->inputs[1] + start + last, context->width * 4);
    }

    uint32_t words[18] = {context->pixelFormat,
                          context->stereoLayout,
                          context->width,
                          context->height,
                          context->displayAspectX,
                          context->displayAspectY,
                          (uint32_t)context->position,
                          (uint32_t)(context->position >> 32),
                          (uint32_t)context->duration,
                          (uint32_t)(context->duration >> 32),
                          context->preview,
                          0,
                          context->threadCount,
                          (uint32_t)context->cpuLevel,
                          context->randomSeed,
                          0,
                          params->byte,
                          params->color};
    memcpy(&words[11], &context->previewFraction, 4);
    memcpy(&words[15], &params->amount, 4);
    memcpy(output, words, context->width < 18 ? context->width * 4 : sizeof words);
    return KYV_OK;
}

static ModuleDescriptor g_module;

#define EFFECT(id, key, count)                                                                     \
    {                                                                                              \
        .identifier = id, .nameKey = key, .properties = {.inputCount = count}, .paramCount = 4,    \
        .params = kParams, .module = &g_module, .instanceDataSize = sizeof(Instance),              \
        .callbacks = {                                                                             \
            .InitInstance = Init,                                                                  \
            .DestroyInstance = Done,                                                               \
            .SetInputFrame = SetInput,                                                             \
            .ProcessFrame = Process,                                                               \
            .BeginProcessing = Begin,                                                              \
            .EndProcessing = Done                                                                  \
        }                                                                                          \
    }
static const EffectDescriptor kEffects[] = {
    EFFECT("probe", "IDS_DSP_Vi_Probe_Name", 1),
    EFFECT("probe_pair", "IDS_DSP_Vi_ProbePair_Name", 2),
};

#ifndef PROBE_FORMAT
#define PROBE_FORMAT kKyvFormatNumber
#endif

KyvStatus KYV_DSP_InitModule(ModuleDescriptor** descriptor) KYV_NOEXCEPT;
KyvStatus KYV_DSP_DeInitModule(void) KYV_NOEXCEPT;

KyvStatus KYV_DSP_InitModule(ModuleDescriptor** descriptor) KYV_NOEXCEPT {
    g_module.formatNumber = PROBE_FORMAT;
    g_module.effectCount = 2;
    g_module.effects = kEffects;
    *descriptor = &g_module;
    return KYV_OK;
}

KyvStatus KYV_DSP_DeInitModule(void) KYV_NOEXCEPT {
    return KYV_OK;
}
