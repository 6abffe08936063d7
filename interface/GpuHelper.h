// The interface between the style effects and a GPU helper library.
//
// A host may pass the handle of such a library in EffectContext::gpuLibrary, and an object of its
// own in EffectContext::gpuDevice. This header is all that the writer of either needs. It serves C
// (C11) and C++ alike and links to nothing.
//
// The library exports, as plain functions, any of
//
//   void* GetCudartWrapper(uint32_t zero)      called by BeginProcessing with 0; null for none
//   void* GetBrookWrapper(uint32_t zero)
//   void  ReleaseCudartWrapper(void* wrapper)  called by EndProcessing and DestroyInstance
//   void  ReleaseBrookWrapper(void* wrapper)
//
// Each release callback hands a wrapper back once more, as long as the instance lives: the pointer
// is not forgotten. So a library must take a wrapper that it was given back before, for example by
// handing out one object for as long as it is loaded, and count nothing. Two preparations without a
// release in between ask for a wrapper twice.
//
// Which object renders is up to EffectContext::gpuMode (enum GpuMode in HostInterface.h):
//
//   mode          object                      render operation
//   2 or 4        from "GetCudartWrapper"     position 20 of its table, counted from 0
//   8 or 16       from "GetBrookWrapper"      position 8
//   512 or 1024   EffectContext::gpuDevice    position 37
//
// Every other operation is the library's own. An object that is missing, was handed back, or has no
// such operation is passed over and the frame rendered on the processor.
//
// The render operation must have written the output when it returns: the host reads the frame right
// after ProcessFrame. It may be called on any thread, but not on two at once for one instance, and
// must not throw. Only the Cudart result counts: 0 is success; for any other the effect sets
// gpuMode to 1 and renders this frame and those to come on the processor.
#pragma once

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

#define KYV_GET_CUDART_NAME "GetCudartWrapper"
#define KYV_GET_BROOK_NAME "GetBrookWrapper"
#define KYV_RELEASE_CUDART_NAME "ReleaseCudartWrapper"
#define KYV_RELEASE_BROOK_NAME "ReleaseBrookWrapper"

typedef void* (*GpuGetWrapperFunction)(uint32_t zero);
typedef void (*GpuReleaseWrapperFunction)(void* wrapper);

// What to render, and with it which record the settings are.
enum GpuEffect {
    GpuEffect_Dreamy = 0,       // GpuDreamySettings
    GpuEffect_LightRay = 1,     // GpuLightRaySettings
    GpuEffect_PencilSketch = 2, // GpuPencilSketchSettings
};

// The geometry of a call. Later versions may append fields: byteCount tells how many there are.
typedef struct GpuFrame {
    uint32_t byteCount;     // 0x00  of this record, 48
    uint32_t effect;        // 0x04  enum GpuEffect
    uint32_t width;         // 0x08  pixels of the view
    uint32_t height;        // 0x0c  rows
    uint32_t pitchBytes;    // 0x10  from row to row, of input and output alike
    uint32_t pixelFormat;   // 0x14  1: V, U, Y, A in memory; any other value: B, G, R, A
    uint32_t fieldSelector; // 0x18  0 every row, 1 rows 0, 2, 4, ..., 2 rows 1, 3, 5, ...
    uint32_t gpuMode;       // 0x1c  the mode that chose this path
    void* device;           // 0x20  the host's device object as BeginProcessing found it, or null
    uint32_t settingsBytes; // 0x28  of the settings record
    uint32_t reserved2c;    // 0x2c  zero
} GpuFrame;

// The part of the frame that dreamy and pencil sketch treat, in fractions of the frame, left to
// right and top to bottom; it may lie outside. Four zeros mean the whole frame without a rim.
typedef struct GpuMask {
    float left;       // 0x00  left <= right and top <= bottom
    float top;        // 0x04
    float right;      // 0x08
    float bottom;     // 0x0c
    uint32_t ellipse; // 0x10  0: the box, 1: the ellipse inside it
    float depth;      // 0x14  width of the soft rim inside the shape: 0 to 0.4 of the shorter side
    uint32_t outside; // 0x18  1: the outside is treated in place of the inside
} GpuMask;

// Settings are within the ranges that the parameters declare, whatever the host stored.
typedef struct GpuDreamySettings {
    GpuMask mask;     // 0x00
    uint32_t degree;  // 0x1c  1 to 40
    uint32_t variant; // 0x20  0 to 3, from EffectContext::gpuVariant: which of the four renders
} GpuDreamySettings;

typedef struct GpuLightRaySettings {
    uint32_t degree; // 0x00  0 to 30; 0 leaves the picture as it is
    float x;         // 0x04  the light's place in fractions of the frame; it may lie outside
    float y;         // 0x08
} GpuLightRaySettings;

typedef struct GpuPencilSketchSettings {
    GpuMask mask;           // 0x00
    uint32_t strokeSize;    // 0x1c  1 to 10
    uint32_t edgeThreshold; // 0x20  1 to 230
    uint32_t edgeIntensity; // 0x24  20 to 100
    uint32_t texture;       // 0x28  frames with equal numbers have equal strokes and grain
} GpuPencilSketchSettings;

// Renders one frame. input and output lead to the view's first pixel and may be the same. Rows that
// the field selector leaves out, and what lies between the rows of a view, are not to be touched.
typedef uint32_t (*GpuRenderFunction)(void* self, const void* input, void* output,
                                      const GpuFrame* frame, const void* settings);

typedef void (*GpuOtherFunction)(void);

// The objects begin with a pointer to their table of operations. In C++ a class whose virtual
// function at that position has the arguments of GpuRenderFunction fits.
typedef struct GpuCudartTable {
    GpuOtherFunction others[20];
    GpuRenderFunction Render; // position 20
} GpuCudartTable;

typedef struct GpuBrookTable {
    GpuOtherFunction others[8];
    GpuRenderFunction Render; // position 8
} GpuBrookTable;

typedef struct GpuDeviceTable {
    GpuOtherFunction others[37];
    GpuRenderFunction Render; // position 37
} GpuDeviceTable;

typedef struct GpuCudartWrapper {
    const GpuCudartTable* table;
} GpuCudartWrapper;

typedef struct GpuBrookWrapper {
    const GpuBrookTable* table;
} GpuBrookWrapper;

typedef struct GpuDevice {
    const GpuDeviceTable* table;
} GpuDevice;

#ifdef __cplusplus
} // extern "C"
#endif

#ifdef __cplusplus
#define KYV_CHECK(condition) static_assert(condition, #condition)
#else
#define KYV_CHECK(condition) _Static_assert(condition, #condition)
#endif

KYV_CHECK(sizeof(GpuFrame) == 48);
KYV_CHECK(offsetof(GpuFrame, device) == 0x20);
KYV_CHECK(offsetof(GpuFrame, settingsBytes) == 0x28);
KYV_CHECK(sizeof(GpuMask) == 28);
KYV_CHECK(sizeof(GpuDreamySettings) == 36);
KYV_CHECK(sizeof(GpuLightRaySettings) == 12);
KYV_CHECK(sizeof(GpuPencilSketchSettings) == 44);
KYV_CHECK(offsetof(GpuCudartTable, Render) == 20 * sizeof(void*));
KYV_CHECK(offsetof(GpuBrookTable, Render) == 8 * sizeof(void*));
KYV_CHECK(offsetof(GpuDeviceTable, Render) == 37 * sizeof(void*));

#undef KYV_CHECK
