/* What the tests' GPU helper library was asked for, and how it is to answer. */
#pragma once

#include "interface/GpuHelper.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct GpuRenderCall {
    uint32_t count;
    void* self;
    const void* input;
    void* output;
    GpuFrame frame;
    union {
        GpuDreamySettings dreamy;
        GpuLightRaySettings lightRay;
        GpuPencilSketchSettings pencil;
    } settings;
} GpuRenderCall;

typedef struct GpuHelperLog {
    uint32_t gotCudart, releasedCudart, gotBrook, releasedBrook;
    uint32_t arguments; /* of the getters, joined by or */
    uint32_t strangers; /* releases of what was never handed out */
    GpuRenderCall cudart, brook;
    uint32_t result;         /* of the renders; anything but 0 leaves the output alone */
    uint32_t withholdCudart; /* the getter returns null */
} GpuHelperLog;

typedef GpuHelperLog* (*GetHelperLogFunction)(void);

#ifdef __cplusplus
}
#endif
