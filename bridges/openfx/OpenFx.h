// The part of the OpenFX 1.4 C interface that the bundle speaks, declared by ourselves under names
// of our own; the layout of the records and the texts of the names are what hosts agree on. A test
// holds them against the public headers where those are at hand.
//
// Handles belong to the host and are never looked into.
#pragma once

#include <cstddef>

namespace kyvofx {

using Status = int;
using PropertySetHandle = struct PropertySetTag*;
using EffectHandle = struct EffectTag*;
using ParamSetHandle = struct ParamSetTag*;
using ParamHandle = struct ParamTag*;
using ClipHandle = struct ClipTag*;
using ImageMemoryHandle = struct ImageMemoryTag*;
using InteractHandle = struct InteractTag*;
using DrawContextHandle = struct DrawContextTag*;

enum StatusCode : Status {
    kStatOk = 0,
    kStatFailed = 1,
    kStatErrFatal = 2,
    kStatErrMissingHostFeature = 4,
    kStatErrUnsupported = 5,
    kStatErrMemory = 8,
    kStatErrBadHandle = 9,
    kStatErrBadIndex = 10,
    kStatErrValue = 11,
    kStatReplyDefault = 14,
    kStatErrImageFormat = 1000,
};

struct RectI {
    int x1, y1, x2, y2; // y upwards; x2 and y2 lie outside
};

struct RectD {
    double x1, y1, x2, y2;
};

struct PointD {
    double x, y;
};

struct ColorF {
    float r, g, b, a;
};

struct Host {
    PropertySetHandle host;
    const void* (*fetchSuite)(PropertySetHandle host, const char* name, int version);
};

using EntryPoint = Status(const char* action, const void* handle, PropertySetHandle in,
                          PropertySetHandle out);

struct Plugin {
    const char* api;
    int apiVersion;
    const char* identifier;
    unsigned versionMajor;
    unsigned versionMinor;
    void (*setHost)(Host* host);
    EntryPoint* mainEntry;
};

struct PropertySuite {
    Status (*setPointer)(PropertySetHandle, const char* name, int index, void* value);
    Status (*setString)(PropertySetHandle, const char* name, int index, const char* value);
    Status (*setDouble)(PropertySetHandle, const char* name, int index, double value);
    Status (*setInt)(PropertySetHandle, const char* name, int index, int value);
    Status (*setPointerN)(PropertySetHandle, const char* name, int count, void* const* value);
    Status (*setStringN)(PropertySetHandle, const char* name, int count, const char* const* value);
    Status (*setDoubleN)(PropertySetHandle, const char* name, int count, const double* value);
    Status (*setIntN)(PropertySetHandle, const char* name, int count, const int* value);
    Status (*getPointer)(PropertySetHandle, const char* name, int index, void** value);
    Status (*getString)(PropertySetHandle, const char* name, int index, char** value);
    Status (*getDouble)(PropertySetHandle, const char* name, int index, double* value);
    Status (*getInt)(PropertySetHandle, const char* name, int index, int* value);
    Status (*getPointerN)(PropertySetHandle, const char* name, int count, void** value);
    Status (*getStringN)(PropertySetHandle, const char* name, int count, char** value);
    Status (*getDoubleN)(PropertySetHandle, const char* name, int count, double* value);
    Status (*getIntN)(PropertySetHandle, const char* name, int count, int* value);
    Status (*reset)(PropertySetHandle, const char* name);
    Status (*getDimension)(PropertySetHandle, const char* name, int* count);
};

struct ParameterSuite {
    Status (*define)(ParamSetHandle, const char* type, const char* name, PropertySetHandle*);
    Status (*getHandle)(ParamSetHandle, const char* name, ParamHandle*, PropertySetHandle*);
    Status (*setGetPropertySet)(ParamSetHandle, PropertySetHandle*);
    Status (*getPropertySet)(ParamHandle, PropertySetHandle*);
    // What follows are pointers to ints (integers, switches, choices) or doubles, a component each.
    Status (*getValue)(ParamHandle, ...);
    Status (*getValueAtTime)(ParamHandle, double time, ...);
    Status (*getDerivative)(ParamHandle, double time, ...);
    Status (*getIntegral)(ParamHandle, double time1, double time2, ...);
    Status (*setValue)(ParamHandle, ...); // the numbers themselves
    Status (*setValueAtTime)(ParamHandle, double time, ...);
    Status (*getNumKeys)(ParamHandle, unsigned* count);
    Status (*getKeyTime)(ParamHandle, unsigned key, double* time);
    Status (*getKeyIndex)(ParamHandle, double time, int direction, int* index);
    Status (*deleteKey)(ParamHandle, double time);
    Status (*deleteAllKeys)(ParamHandle);
    Status (*copy)(ParamHandle to, ParamHandle from, double offset, const void* frameRange);
    Status (*editBegin)(ParamSetHandle, const char* name);
    Status (*editEnd)(ParamSetHandle);
};

struct ImageEffectSuite {
    Status (*getPropertySet)(EffectHandle, PropertySetHandle*);
    Status (*getParamSet)(EffectHandle, ParamSetHandle*);
    Status (*clipDefine)(EffectHandle, const char* name, PropertySetHandle*);
    Status (*clipGetHandle)(EffectHandle, const char* name, ClipHandle*, PropertySetHandle*);
    Status (*clipGetPropertySet)(ClipHandle, PropertySetHandle*);
    Status (*clipGetImage)(ClipHandle, double time, const RectD* region, PropertySetHandle* image);
    Status (*clipReleaseImage)(PropertySetHandle image);
    Status (*clipGetRegionOfDefinition)(ClipHandle, double time, RectD* bounds);
    int (*abort)(EffectHandle);
    Status (*imageMemoryAlloc)(EffectHandle, size_t bytes, ImageMemoryHandle*);
    Status (*imageMemoryFree)(ImageMemoryHandle);
    Status (*imageMemoryLock)(ImageMemoryHandle, void** memory);
    Status (*imageMemoryUnlock)(ImageMemoryHandle);
};

struct MessageSuite {
    Status (*message)(void* handle, const char* type, const char* id, const char* format, ...);
};

struct InteractSuite {
    Status (*swapBuffers)(InteractHandle);
    Status (*redraw)(InteractHandle);
    Status (*getPropertySet)(InteractHandle, PropertySetHandle*);
};

enum DrawPrimitive { kDrawPrimitive_LineLoop = 2, kDrawPrimitive_Rectangle = 3 };

struct DrawSuite {
    Status (*getColor)(DrawContextHandle, int standardColor, ColorF* color);
    Status (*setColor)(DrawContextHandle, const ColorF* color);
    Status (*setLineWidth)(DrawContextHandle, float width);
    Status (*setLineStipple)(DrawContextHandle, int pattern);
    Status (*draw)(DrawContextHandle, int primitive, const PointD* points, int count);
    Status (*drawText)(DrawContextHandle, const char* text, const PointD* at, int alignment);
};

namespace suite {
inline constexpr char kProperty[] = "OfxPropertySuite";
inline constexpr char kParameter[] = "OfxParameterSuite";
inline constexpr char kImageEffect[] = "OfxImageEffectSuite";
inline constexpr char kMessage[] = "OfxMessageSuite";
inline constexpr char kInteract[] = "OfxInteractSuite";
inline constexpr char kDraw[] = "OfxDrawSuite";
} // namespace suite

inline constexpr char kImageEffectApi[] = "OfxImageEffectPluginAPI";

namespace action {
inline constexpr char kLoad[] = "OfxActionLoad";
inline constexpr char kUnload[] = "OfxActionUnload";
inline constexpr char kDescribe[] = "OfxActionDescribe";
inline constexpr char kDescribeInContext[] = "OfxImageEffectActionDescribeInContext";
inline constexpr char kCreateInstance[] = "OfxActionCreateInstance";
inline constexpr char kDestroyInstance[] = "OfxActionDestroyInstance";
inline constexpr char kPurgeCaches[] = "OfxActionPurgeCaches";
inline constexpr char kRender[] = "OfxImageEffectActionRender";
inline constexpr char kIsIdentity[] = "OfxImageEffectActionIsIdentity";
inline constexpr char kBeginSequence[] = "OfxImageEffectActionBeginSequenceRender";
inline constexpr char kEndSequence[] = "OfxImageEffectActionEndSequenceRender";
inline constexpr char kGetRegionOfDefinition[] = "OfxImageEffectActionGetRegionOfDefinition";
inline constexpr char kGetRegionsOfInterest[] = "OfxImageEffectActionGetRegionsOfInterest";
inline constexpr char kGetClipPreferences[] = "OfxImageEffectActionGetClipPreferences";
inline constexpr char kInteractDraw[] = "OfxInteractActionDraw";
inline constexpr char kInteractPenDown[] = "OfxInteractActionPenDown";
inline constexpr char kInteractPenMotion[] = "OfxInteractActionPenMotion";
inline constexpr char kInteractPenUp[] = "OfxInteractActionPenUp";
} // namespace action

namespace context {
inline constexpr char kFilter[] = "OfxImageEffectContextFilter";
inline constexpr char kGeneral[] = "OfxImageEffectContextGeneral";
inline constexpr char kTransition[] = "OfxImageEffectContextTransition";
} // namespace context

namespace clip {
inline constexpr char kOutput[] = "Output";
inline constexpr char kSource[] = "Source";
inline constexpr char kFrom[] = "SourceFrom";
inline constexpr char kTo[] = "SourceTo";
} // namespace clip

namespace value {
inline constexpr char kRgba[] = "OfxImageComponentRGBA";
inline constexpr char kByte[] = "OfxBitDepthByte";
inline constexpr char kShort[] = "OfxBitDepthShort";
inline constexpr char kFloat[] = "OfxBitDepthFloat";
inline constexpr char kInstanceSafe[] = "OfxImageEffectRenderInstanceSafe";
inline constexpr char kPremultiplied[] = "OfxImageAlphaPremultiplied";
inline constexpr char kFieldLower[] = "OfxFieldLower";
inline constexpr char kFieldUpper[] = "OfxFieldUpper";
inline constexpr char kFieldBoth[] = "OfxFieldBoth";
inline constexpr char kMessageError[] = "OfxMessageError";
inline constexpr char kCoordinatesNormalised[] = "OfxParamCoordinatesNormalised";
inline constexpr char kTypeXyAbsolute[] = "OfxParamDoubleTypeXYAbsolute";
// Of hosts before 1.2: the value itself is a fraction of the project.
inline constexpr char kTypeNormalisedXyAbsolute[] = "OfxParamDoubleTypeNormalisedXYAbsolute";
} // namespace value

namespace paramtype {
inline constexpr char kInteger[] = "OfxParamTypeInteger";
inline constexpr char kDouble[] = "OfxParamTypeDouble";
inline constexpr char kBoolean[] = "OfxParamTypeBoolean";
inline constexpr char kChoice[] = "OfxParamTypeChoice";
inline constexpr char kRgb[] = "OfxParamTypeRGB";
inline constexpr char kDouble2D[] = "OfxParamTypeDouble2D";
inline constexpr char kGroup[] = "OfxParamTypeGroup";
inline constexpr char kPage[] = "OfxParamTypePage";
} // namespace paramtype

namespace prop {
inline constexpr char kName[] = "OfxPropName";
inline constexpr char kLabel[] = "OfxPropLabel";
inline constexpr char kShortLabel[] = "OfxPropShortLabel";
inline constexpr char kLongLabel[] = "OfxPropLongLabel";
inline constexpr char kDescription[] = "OfxPropPluginDescription";
inline constexpr char kTime[] = "OfxPropTime";
inline constexpr char kInstanceData[] = "OfxPropInstanceData";
inline constexpr char kEffectInstance[] = "OfxPropEffectInstance";
inline constexpr char kContext[] = "OfxImageEffectPropContext";
inline constexpr char kSupportedContexts[] = "OfxImageEffectPropSupportedContexts";
inline constexpr char kSupportedDepths[] = "OfxImageEffectPropSupportedPixelDepths";
inline constexpr char kSupportedComponents[] = "OfxImageEffectPropSupportedComponents";
inline constexpr char kGrouping[] = "OfxImageEffectPluginPropGrouping";
inline constexpr char kThreadSafety[] = "OfxImageEffectPluginRenderThreadSafety";
inline constexpr char kHostFrameThreading[] = "OfxImageEffectPluginPropHostFrameThreading";
inline constexpr char kSupportsTiles[] = "OfxImageEffectPropSupportsTiles";
inline constexpr char kSupportsMultiResolution[] = "OfxImageEffectPropSupportsMultiResolution";
inline constexpr char kTemporalClipAccess[] = "OfxImageEffectPropTemporalClipAccess";
inline constexpr char kFieldRenderTwice[] = "OfxImageEffectPluginPropFieldRenderTwiceAlways";
inline constexpr char kFieldExtraction[] = "OfxImageClipPropFieldExtraction";
inline constexpr char kOverlayV2[] = "OfxImageEffectPluginPropOverlayInteractV2";
inline constexpr char kDepth[] = "OfxImageEffectPropPixelDepth";
inline constexpr char kComponents[] = "OfxImageEffectPropComponents";
inline constexpr char kPremultiplication[] = "OfxImageEffectPropPreMultiplication";
inline constexpr char kPixelAspect[] = "OfxImagePropPixelAspectRatio";
inline constexpr char kData[] = "OfxImagePropData";
inline constexpr char kBounds[] = "OfxImagePropBounds";
inline constexpr char kImageRegion[] = "OfxImagePropRegionOfDefinition";
inline constexpr char kRowBytes[] = "OfxImagePropRowBytes";
inline constexpr char kRenderWindow[] = "OfxImageEffectPropRenderWindow";
inline constexpr char kRenderScale[] = "OfxImageEffectPropRenderScale";
inline constexpr char kField[] = "OfxImageEffectPropFieldToRender";
inline constexpr char kRegionOfDefinition[] = "OfxImageEffectPropRegionOfDefinition";
inline constexpr char kRegionOfInterest[] = "OfxImageClipPropRoI_"; // and the clip's name
inline constexpr char kConnected[] = "OfxImageClipPropConnected";
inline constexpr char kFrameRate[] = "OfxImageEffectPropFrameRate";
inline constexpr char kFrameRange[] = "OfxImageEffectPropFrameRange";
inline constexpr char kEffectDuration[] = "OfxImageEffectInstancePropEffectDuration";
inline constexpr char kProjectSize[] = "OfxImageEffectPropProjectSize";
inline constexpr char kProjectOffset[] = "OfxImageEffectPropProjectOffset";
inline constexpr char kFrameVarying[] = "OfxImageEffectFrameVarying";
inline constexpr char kDefault[] = "OfxParamPropDefault";
inline constexpr char kMin[] = "OfxParamPropMin";
inline constexpr char kMax[] = "OfxParamPropMax";
inline constexpr char kDisplayMin[] = "OfxParamPropDisplayMin";
inline constexpr char kDisplayMax[] = "OfxParamPropDisplayMax";
inline constexpr char kHint[] = "OfxParamPropHint";
inline constexpr char kChoiceOption[] = "OfxParamPropChoiceOption";
inline constexpr char kAnimates[] = "OfxParamPropAnimates";
inline constexpr char kParent[] = "OfxParamPropParent";
inline constexpr char kPageChild[] = "OfxParamPropPageChild";
inline constexpr char kDoubleType[] = "OfxParamPropDoubleType";
inline constexpr char kCoordinateSystem[] = "OfxParamPropDefaultCoordinateSystem";
inline constexpr char kUseHostHandle[] = "kOfxParamPropUseHostOverlayHandle";
inline constexpr char kHasHostHandle[] = "OfxParamPropHasHostOverlayHandle";
inline constexpr char kPenPosition[] = "OfxInteractPropPenPosition";
inline constexpr char kPixelScale[] = "OfxInteractPropPixelScale";
inline constexpr char kDrawContext[] = "OfxInteractPropDrawContext";
} // namespace prop

inline constexpr char kTransitionParam[] = "Transition";

static_assert(sizeof(Plugin) == 48 && offsetof(Plugin, mainEntry) == 40);
static_assert(sizeof(PropertySuite) == 18 * 8);
static_assert(sizeof(ParameterSuite) == 18 * 8);
static_assert(sizeof(ImageEffectSuite) == 13 * 8);

} // namespace kyvofx
