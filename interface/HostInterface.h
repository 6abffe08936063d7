// The binary interface between KYV DSP and a host video editor.
//
// This one header is all that a host needs. It serves C (C11) and C++ alike, includes nothing of
// the module and links to nothing: load the library at run time and look up the two exports.
//
//   1. Load KyvDsp.dll or libKyvDsp.so and call KYV_DSP_InitModule; it hands out the static
//      ModuleDescriptor.
//   2. Walk its effects. Each EffectDescriptor lists its parameters (ParamDescriptor) and carries
//      the callbacks that drive an instance.
//   3. For each instance allocate an EffectContext, a zero-filled block of instanceDataSize bytes
//      and a parameter buffer (the sum of all valueSize fields), and fill in the context.
//   4. Call InitInstance once, BeginProcessing before the first frame, then for every frame
//      SetInputFrame for each input and ProcessFrame, at last EndProcessing and DestroyInstance.
//   5. Call KYV_DSP_DeInitModule before unloading the library.
//
// Ownership: descriptors, keys and values belong to the module and stay valid while it is loaded.
// The context, the instance data, the parameter buffer and every frame belong to the host; the
// module keeps what it allocates in the instance data and gives it back in EndProcessing and
// DestroyInstance.
//
// Threads: the two exports may be called from any thread. The callbacks take no lock. Two callbacks
// of one instance must not run at the same time; different instances may run on different threads.
// Callbacks never throw. They compute in the default floating-point environment, whatever the
// host's is, and leave the host's as it was.
//
// Frames: 32 bits a pixel, rows top down and contiguous, no padding. In memory a pixel is B, G, R,
// A (ARGB frames, straight alpha, full range) or V, U, Y, A (AYUV frames, BT.601 studio range: Y
// 16..235, U and V 16..240 about 128). A side-by-side stereo frame holds two views of `width`
// pixels in rows of 2 * width.
//
// All records are little-endian with 8-byte pointers and natural alignment; every offset is
// asserted at the end of this file. Display texts are keys: the host looks them up in
// ModuleDescriptor::ResourceLibrary (LanguageLibrary.h).
#pragma once

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
#define KYV_NOEXCEPT noexcept
extern "C" {
#else
#define KYV_NOEXCEPT
#endif

// 0 is success; every failure has the top bit set, as in the platform's result codes.
typedef uint32_t KyvStatus;

enum {
    kKyvFormatNumber = 11, // ModuleDescriptor::formatNumber of this interface
};

// The statuses that exports and callbacks return; there are no others.
#define KYV_OK ((KyvStatus)0x00000000u)
// A null context, a missing frame, size or resource, or an allocation that failed.
#define KYV_FAIL ((KyvStatus)0x80004005u)

// Codes of the same convention that stay inside the module, where the worker pool reports them. No
// export and no callback returns one; programs round the module may use them as they like.
#define KYV_NULL_POINTER ((KyvStatus)0x80004003u)     // a required pointer was null
#define KYV_ABORTED ((KyvStatus)0x80004004u)          // a job was cancelled
#define KYV_OUT_OF_MEMORY ((KyvStatus)0x8007000Eu)    // no memory, or no thread to be had
#define KYV_INVALID_ARGUMENT ((KyvStatus)0x80070057u) // an argument was not acceptable
#define KYV_WAIT_TIMEOUT ((KyvStatus)0xE0000102u)     // a wait ran out of time

// An HMODULE on Windows, a dlopen handle on Linux.
typedef void* KyvModuleHandle;

typedef struct ModuleDescriptor ModuleDescriptor;
typedef struct EffectDescriptor EffectDescriptor;
typedef struct ParamDescriptor ParamDescriptor;
typedef struct EffectContext EffectContext;
typedef struct HostNotification HostNotification;

// ---------------------------------------------------------------------------------- parameters

// ParamDescriptor::type, the kind of value in the parameter buffer.
enum ParamType {
    ParamType_Byte = 1,      // 1 byte, unsigned
    ParamType_Choice = 3,    // 4 bytes, signed: index into a choice list, or a small count
    ParamType_Int = 4,       // 4 bytes, signed
    ParamType_Float = 5,     // 4 bytes, IEEE single
    ParamType_Color = 7,     // 4 bytes: red in the lowest byte, then green, then blue, then zero
    ParamType_Bool = 8,      // 0 or 1, in 4 bytes (in 1 byte for the transitions' "Border")
    ParamType_MaskRect = 13, // 16 bytes: four floats, left, top, right, bottom
    ParamType_Position = 15, // 8 bytes: two floats, x and y
};

// ParamDescriptor::control, the editing control that suits the parameter.
enum ParamControl {
    ParamControl_Slider = 2,
    ParamControl_ColorButton = 4, // border and shadow colours
    ParamControl_ColorPicker = 5, // colour key, transition colour, white reference
    ParamControl_CheckBox = 6,
    ParamControl_ChoiceList = 9, // the labels follow the name key, separated by ";"
    ParamControl_MaskRect = 10,
    ParamControl_Position = 11,
    ParamControl_DepthSlider = 12, // signed three-dimensional depth, -1 to 1
};

// One parameter of an effect. The value pointers each lead to a static value of valueSize bytes.
struct ParamDescriptor {
    const char* key;          // 0x00  "P0", "P1", ...
    const char* nameKey;      // 0x08  a choice list appends its labels: "KEY;first;second"
    const char* descKey;      // 0x10  a key, the text "none", or null
    const void* minimum;      // 0x18
    const void* maximum;      // 0x20  equal to minimum where the type itself is the range
    const void* defaultValue; // 0x28  what InitInstance writes
    const void* value4;       // 0x30  host-interpreted, as are 5 and 6
    const void* value5;       // 0x38
    const void* value6;       // 0x40
    uint64_t reserved48;      // 0x48  zero
    uint32_t reserved50;      // 0x50  zero
    uint32_t type;            // 0x54  enum ParamType
    uint32_t control;         // 0x58  enum ParamControl
    uint32_t valueSize;       // 0x5c  bytes of one value: 1, 4, 8 or 16
    uint32_t flag;            // 0x60  0 or 1, host-interpreted
    uint32_t reserved64;      // 0x64  zero
    uint64_t reserved68;      // 0x68  zero
    uint32_t group;           // 0x70  group number, host-interpreted
    uint32_t reserved74;      // 0x74  zero
};

// ------------------------------------------------------------------------------------ callbacks

// All return KYV_FAIL for a null context. InitInstance notifies the host object and then writes
// every default, packed in table order, to the parameter buffer. BeginProcessing allocates what
// the instance needs for the frame size, format and layout in the context. ProcessFrame renders
// from the recorded inputs into the frame at context->frame. EndProcessing and DestroyInstance
// release the same things and may be called any number of times, in any order.
typedef KyvStatus (*EffectCallback)(EffectContext* context) KYV_NOEXCEPT;

// Records context->frame as an input. Effects with one input ignore the index; effects with two
// take index 0 as the first input and every other index as the second.
typedef KyvStatus (*SetInputFrameCallback)(uint32_t index, EffectContext* context) KYV_NOEXCEPT;

typedef struct EffectCallbacks {
    EffectCallback InitInstance;         // 0x00
    EffectCallback DestroyInstance;      // 0x08
    SetInputFrameCallback SetInputFrame; // 0x10
    EffectCallback ProcessFrame;         // 0x18
    EffectCallback reserved20;           // 0x20  always null
    EffectCallback BeginProcessing;      // 0x28
    EffectCallback EndProcessing;        // 0x30
    EffectCallback reserved38;           // 0x38  always null
    EffectCallback reserved40;           // 0x40  always null
} EffectCallbacks;

// ---------------------------------------------------------------------------------- descriptors

// EffectProperties::family.
enum EffectFamily {
    EffectFamily_ParticleOrStyle = 10,
    EffectFamily_Transition = 20,
    EffectFamily_PictureInPicture = 40,
    EffectFamily_Color = 50,
};

// EffectProperties::familyVariant, which tells families with the same number apart.
enum EffectFamilyVariant {
    EffectFamilyVariant_Style = 1,
    EffectFamilyVariant_Particle = 4,
    EffectFamilyVariant_Transition = 58,
    EffectFamilyVariant_PictureInPicture = 150,
    EffectFamilyVariant_Color = 200,
};

// EffectProperties::familyClass.
enum EffectFamilyClass {
    EffectFamilyClass_Changed = 2,  // style and colour: the picture itself is changed
    EffectFamilyClass_Composed = 3, // particle, picture-in-picture, transition: something is added
};

// Bits of EffectProperties::capabilities.
enum EffectCapability {
    EffectCapability_Frames = 0x001,     // renders frames in memory: every effect
    EffectCapability_GpuHelper = 0x414,  // can render through the host's GPU helper library
    EffectCapability_WorkerPool = 0x100, // the light ray
};

// Declarations for the host; no callback reads them. Fields without a settled meaning keep their
// offset as a name.
typedef struct EffectProperties {
    uint32_t family;        // 0x00  enum EffectFamily
    uint32_t familyVariant; // 0x04  enum EffectFamilyVariant
    uint32_t property30;    // 0x08  named by its offset in the effect record, as are those below
    uint32_t property34;    // 0x0c
    uint32_t inputCount;    // 0x10  input frames: 1 or 2
    uint32_t property3c;    // 0x14
    uint32_t isFilter;      // 0x18  0 for the transitions, 1 for all others
    uint32_t property44;    // 0x1c
    uint32_t property48;    // 0x20
    uint32_t isTransition;  // 0x24  1 for the transitions, 0 for all others
    uint32_t capabilities;  // 0x28  EffectCapability bits
    uint32_t property54;    // 0x2c
    uint32_t property58;    // 0x30
    uint32_t property5c;    // 0x34
    uint32_t property60;    // 0x38
    uint32_t property64;    // 0x3c
    uint32_t familyClass;   // 0x40  enum EffectFamilyClass
} EffectProperties;

struct EffectDescriptor {
    const char* identifier;         // 0x00  unique; what a host stores in its projects
    const char* nameKey;            // 0x08
    const char* descKey;            // 0x10
    const char* author;             // 0x18
    const char* vendor;             // 0x20
    EffectProperties properties;    // 0x28
    uint32_t paramCount;            // 0x6c
    const ParamDescriptor* params;  // 0x70  paramCount records
    const ModuleDescriptor* module; // 0x78  back to the module
    uint32_t instanceDataSize;      // 0x80  bytes of EffectContext::instanceData
    uint32_t reserved84;            // 0x84
    EffectCallbacks callbacks;      // 0x88
    const char* subclass;           // 0xd0  the host's category of the effect
};

struct ModuleDescriptor {
    uint32_t formatNumber;           // 0x00  kKyvFormatNumber
    uint32_t reserved04;             // 0x04
    const char* nameKey;             // 0x08
    const char* descKey;             // 0x10
    const char* author;              // 0x18
    const char* vendor;              // 0x20
    KyvModuleHandle ModuleHandle;    // 0x28  this library, set when it is loaded
    KyvModuleHandle ResourceLibrary; // 0x30  the language library, or ModuleHandle when there is
                                     //       none; null outside InitModule .. DeInitModule
    uint32_t effectCount;            // 0x38
    uint32_t reserved3c;             // 0x3c
    const EffectDescriptor* effects; // 0x40  effectCount records
};

// -------------------------------------------------------------------------------------- context

// EffectContext::pixelFormat. Any value but 1 means ARGB.
enum PixelFormat {
    PixelFormat_Argb = 0, // B, G, R, A in memory
    PixelFormat_Ayuv = 1, // V, U, Y, A in memory
};

// EffectContext::fieldSelector: which rows a call treats.
enum FieldSelector {
    FieldSelector_Frame = 0,  // every row
    FieldSelector_First = 1,  // rows 0, 2, 4, ...
    FieldSelector_Second = 2, // rows 1, 3, 5, ...
};

// EffectContext::stereoLayout. For a side-by-side frame call the left view first.
enum StereoLayout {
    StereoLayout_Mono = 0,
    StereoLayout_LeftHalf = 1,
    StereoLayout_RightHalf = 2,
};

// EffectContext::gpuMode. Any other value renders on the processor.
enum GpuMode {
    GpuMode_Processor = 1,
    GpuMode_CudartA = 2, // through the object from "GetCudartWrapper"
    GpuMode_CudartB = 4,
    GpuMode_BrookA = 8, // through the object from "GetBrookWrapper"
    GpuMode_BrookB = 16,
    GpuMode_DeviceA = 512, // through EffectContext::gpuDevice
    GpuMode_DeviceB = 1024,
};

// EffectContext::cpuLevel: a ceiling for the instruction sets in use. The processor decides
// within it, and every level gives the same bytes, with one exception: at levels 1 and 2 what the
// fireworks add to an ARGB frame is added to its alpha as well.
enum CpuLevel {
    CpuLevel_Scalar = 0,
    CpuLevel_Mmx = 1, // 1 and 2
    CpuLevel_Sse2 = 3,
    CpuLevel_Ssse3 = 4, // 4 and above: SSSE3, and AVX2 where the processor has it
    CpuLevel_Avx2 = 5,
};

// What the upper 16 bits of EffectContext::cpuLevel ask for when they hold exactly one of these;
// the level is then in the lower 16 bits. With any other upper bits the whole number is a level.
enum CpuLevelOption {
    // The picture-in-picture shows pictures of more than 1024 columns or rows as they are. Without
    // this only the first 1024 of each are reached, and what lies beyond repeats them.
    CpuLevelOption_WideMap = 0x4B590000,
};

// The host's own object. InitInstance calls the first operation of its function table and ignores
// the result. In C++ an abstract class whose first virtual function takes no argument fits.
typedef struct HostNotificationTable {
    void (*Notify)(HostNotification* self); // slot 0
} HostNotificationTable;

struct HostNotification {
    const HostNotificationTable* table;
};

// One per instance, owned and filled in by the host. Times are in units of 100 ns. The module
// writes only requestA, requestB, gpuMode (when a GPU render fails) and what the pointers lead to.
struct EffectContext {
    uint64_t reserved00;                // 0x00
    const EffectDescriptor* descriptor; // 0x08
    HostNotification* notification;     // 0x10  notified by InitInstance; may be null
    uint64_t reserved18;                // 0x18
    void* instanceData;                 // 0x20  instanceDataSize bytes, zero-filled by the host
    void* frame;                        // 0x28  input in SetInputFrame, output in ProcessFrame
    uint32_t pixelFormat;               // 0x30  enum PixelFormat
    uint32_t reserved34;                // 0x34
    uint32_t fieldSelector;             // 0x38  enum FieldSelector
    uint32_t gpuMode;                   // 0x3c  enum GpuMode; the style effects
    uint32_t reserved40;                // 0x40
    uint32_t stereoLayout;              // 0x44  enum StereoLayout
    uint64_t reserved48;                // 0x48
    KyvModuleHandle gpuLibrary;         // 0x50  GPU helper library, or null
    uint64_t reserved58[2];             // 0x58
    void* gpuDevice;                    // 0x68  handed to the GPU helper
    uint32_t reserved70;                // 0x70
    uint32_t width;                     // 0x74  pixels of one view
    uint32_t height;                    // 0x78  rows
    uint32_t reserved7c[5];             // 0x7c
    void* params;                       // 0x90  current values, packed in table order
    uint64_t reserved98[3];             // 0x98
    uint32_t displayAspectX;            // 0xb0  0: the width
    uint32_t displayAspectY;            // 0xb4  0: the height
    int64_t position;                   // 0xb8  100 ns units
    int64_t duration;                   // 0xc0  100 ns units
    uint32_t preview;                   // 0xc8  non-zero: take the moment previewFraction names
    float previewFraction;              // 0xcc  0 to 1
    uint32_t threadCount;               // 0xd0  threads granted to the instance
    uint32_t reservedD4[3];             // 0xd4
    uint32_t requestA;                  // 0xe0  set to 1 by some effects' BeginProcessing
    uint32_t reservedE4[7];             // 0xe4
    uint32_t gpuVariant;                // 0x100 0 to 3: which of the dreamy's Cudart renders
    int32_t cpuLevel;                   // 0x104 enum CpuLevel
    uint32_t reserved108;               // 0x108
    uint32_t randomSeed;                // 0x10c read by the pencil sketch's BeginProcessing
    uint32_t requestB;                  // 0x110 set to 1 by some effects' BeginProcessing
    uint32_t reserved114;               // 0x114
};

// -------------------------------------------------------------------------------------- exports

// Hands out the static descriptor and locates the language library. KYV_FAIL for a null argument.
typedef KyvStatus (*KyvInitModuleFunction)(ModuleDescriptor** descriptor) KYV_NOEXCEPT;
// Releases the language library. Always KYV_OK.
typedef KyvStatus (*KyvDeInitModuleFunction)(void) KYV_NOEXCEPT;

#define KYV_INIT_MODULE_NAME "KYV_DSP_InitModule"
#define KYV_DEINIT_MODULE_NAME "KYV_DSP_DeInitModule"

#ifdef __cplusplus
} // extern "C"
#endif

// ------------------------------------------------------------------------------------ the layout

#ifdef __cplusplus
#define KYV_CHECK(condition) static_assert(condition, #condition)
#else
#define KYV_CHECK(condition) _Static_assert(condition, #condition)
#endif
#define KYV_AT(record, field, offset) KYV_CHECK(offsetof(record, field) == (offset))

KYV_CHECK(sizeof(void*) == 8);

KYV_CHECK(sizeof(ParamDescriptor) == 120);
KYV_AT(ParamDescriptor, key, 0x00);
KYV_AT(ParamDescriptor, nameKey, 0x08);
KYV_AT(ParamDescriptor, descKey, 0x10);
KYV_AT(ParamDescriptor, minimum, 0x18);
KYV_AT(ParamDescriptor, maximum, 0x20);
KYV_AT(ParamDescriptor, defaultValue, 0x28);
KYV_AT(ParamDescriptor, value4, 0x30);
KYV_AT(ParamDescriptor, value5, 0x38);
KYV_AT(ParamDescriptor, value6, 0x40);
KYV_AT(ParamDescriptor, reserved48, 0x48);
KYV_AT(ParamDescriptor, reserved50, 0x50);
KYV_AT(ParamDescriptor, type, 0x54);
KYV_AT(ParamDescriptor, control, 0x58);
KYV_AT(ParamDescriptor, valueSize, 0x5c);
KYV_AT(ParamDescriptor, flag, 0x60);
KYV_AT(ParamDescriptor, reserved64, 0x64);
KYV_AT(ParamDescriptor, reserved68, 0x68);
KYV_AT(ParamDescriptor, group, 0x70);
KYV_AT(ParamDescriptor, reserved74, 0x74);

KYV_CHECK(sizeof(EffectCallbacks) == 0x48);
KYV_AT(EffectCallbacks, DestroyInstance, 0x08);
KYV_AT(EffectCallbacks, SetInputFrame, 0x10);
KYV_AT(EffectCallbacks, ProcessFrame, 0x18);
KYV_AT(EffectCallbacks, reserved20, 0x20);
KYV_AT(EffectCallbacks, BeginProcessing, 0x28);
KYV_AT(EffectCallbacks, EndProcessing, 0x30);
KYV_AT(EffectCallbacks, reserved38, 0x38);
KYV_AT(EffectCallbacks, reserved40, 0x40);

KYV_CHECK(sizeof(EffectProperties) == 17 * 4);
KYV_CHECK(sizeof(EffectDescriptor) == 216);
KYV_AT(EffectDescriptor, identifier, 0x00);
KYV_AT(EffectDescriptor, nameKey, 0x08);
KYV_AT(EffectDescriptor, descKey, 0x10);
KYV_AT(EffectDescriptor, author, 0x18);
KYV_AT(EffectDescriptor, vendor, 0x20);
KYV_AT(EffectDescriptor, properties, 0x28);
KYV_AT(EffectDescriptor, properties.inputCount, 0x38);
KYV_AT(EffectDescriptor, properties.isFilter, 0x40);
KYV_AT(EffectDescriptor, properties.isTransition, 0x4c);
KYV_AT(EffectDescriptor, properties.capabilities, 0x50);
KYV_AT(EffectDescriptor, properties.familyClass, 0x68);
KYV_AT(EffectDescriptor, paramCount, 0x6c);
KYV_AT(EffectDescriptor, params, 0x70);
KYV_AT(EffectDescriptor, module, 0x78);
KYV_AT(EffectDescriptor, instanceDataSize, 0x80);
KYV_AT(EffectDescriptor, callbacks, 0x88);
KYV_AT(EffectDescriptor, subclass, 0xd0);

KYV_CHECK(sizeof(ModuleDescriptor) == 72);
KYV_AT(ModuleDescriptor, formatNumber, 0x00);
KYV_AT(ModuleDescriptor, nameKey, 0x08);
KYV_AT(ModuleDescriptor, descKey, 0x10);
KYV_AT(ModuleDescriptor, author, 0x18);
KYV_AT(ModuleDescriptor, vendor, 0x20);
KYV_AT(ModuleDescriptor, ModuleHandle, 0x28);
KYV_AT(ModuleDescriptor, ResourceLibrary, 0x30);
KYV_AT(ModuleDescriptor, effectCount, 0x38);
KYV_AT(ModuleDescriptor, effects, 0x40);

KYV_CHECK(sizeof(EffectContext) == 0x118);
KYV_AT(EffectContext, descriptor, 0x08);
KYV_AT(EffectContext, notification, 0x10);
KYV_AT(EffectContext, instanceData, 0x20);
KYV_AT(EffectContext, frame, 0x28);
KYV_AT(EffectContext, pixelFormat, 0x30);
KYV_AT(EffectContext, fieldSelector, 0x38);
KYV_AT(EffectContext, gpuMode, 0x3c);
KYV_AT(EffectContext, stereoLayout, 0x44);
KYV_AT(EffectContext, gpuLibrary, 0x50);
KYV_AT(EffectContext, gpuDevice, 0x68);
KYV_AT(EffectContext, width, 0x74);
KYV_AT(EffectContext, height, 0x78);
KYV_AT(EffectContext, params, 0x90);
KYV_AT(EffectContext, displayAspectX, 0xb0);
KYV_AT(EffectContext, displayAspectY, 0xb4);
KYV_AT(EffectContext, position, 0xb8);
KYV_AT(EffectContext, duration, 0xc0);
KYV_AT(EffectContext, preview, 0xc8);
KYV_AT(EffectContext, previewFraction, 0xcc);
KYV_AT(EffectContext, threadCount, 0xd0);
KYV_AT(EffectContext, requestA, 0xe0);
KYV_AT(EffectContext, gpuVariant, 0x100);
KYV_AT(EffectContext, cpuLevel, 0x104);
KYV_AT(EffectContext, randomSeed, 0x10c);
KYV_AT(EffectContext, requestB, 0x110);

#undef KYV_AT
#undef KYV_CHECK
