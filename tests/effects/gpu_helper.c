/* A GPU helper library for tests, written as a helper's maker would: in C, with the header alone.
   It renders by flipping every bit of the treated pixels, and notes what it was asked for. */
#include "tests/effects/gpu_helper.h"

#include <string.h>

static GpuHelperLog g_log;

static uint32_t Render(GpuRenderCall* call, void* self, const void* input, void* output,
                       const GpuFrame* frame, const void* settings) {
    call->count++;
    call->self = self;
    call->input = input;
    call->output = output;
    call->frame = *frame;
    memset(&call->settings, 0, sizeof call->settings);
    memcpy(&call->settings, settings, frame->settingsBytes);
    if (g_log.result != 0) {
        return g_log.result;
    }
    for (uint32_t y = 0; y < frame->height; ++y) {
        const uint32_t* from =
            (const uint32_t*)((const uint8_t*)input + (size_t)y * frame->pitchBytes);
        uint32_t* to = (uint32_t*)((uint8_t*)output + (size_t)y * frame->pitchBytes);
        for (uint32_t x = 0; x < frame->width; ++x) {
            to[x] = ~from[x];
        }
    }
    return 0;
}

static uint32_t RenderCudart(void* self, const void* input, void* output, const GpuFrame* frame,
                             const void* settings) {
    return Render(&g_log.cudart, self, input, output, frame, settings);
}

static const GpuCudartTable g_cudartTable = {.Render = RenderCudart};
static GpuCudartWrapper g_cudart = {&g_cudartTable};

void* GetCudartWrapper(uint32_t zero) {
    g_log.gotCudart++;
    g_log.arguments |= zero;
    return g_log.withholdCudart ? NULL : &g_cudart;
}

void ReleaseCudartWrapper(void* wrapper) {
    g_log.releasedCudart++;
    g_log.strangers += wrapper != &g_cudart;
}

#ifndef GPU_HELPER_WITHOUT_BROOK
static uint32_t RenderBrook(void* self, const void* input, void* output, const GpuFrame* frame,
                            const void* settings) {
    return Render(&g_log.brook, self, input, output, frame, settings);
}

static const GpuBrookTable g_brookTable = {.Render = RenderBrook};
static GpuBrookWrapper g_brook = {&g_brookTable};

void* GetBrookWrapper(uint32_t zero) {
    g_log.gotBrook++;
    g_log.arguments |= zero;
    return &g_brook;
}

void ReleaseBrookWrapper(void* wrapper) {
    g_log.releasedBrook++;
    g_log.strangers += wrapper != &g_brook;
}
#endif

GpuHelperLog* GetHelperLog(void) {
    return &g_log;
}
