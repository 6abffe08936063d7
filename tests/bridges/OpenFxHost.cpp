// An OpenFX host.
#include "tests/bridges/OpenFxHost.h"

#include <algorithm>
#include <atomic>
#include <cmath>
#include <cstdarg>
#include <cstdlib>
#include <cstring>

#include <gtest/gtest.h>

namespace kyvtest {
namespace {

using namespace kyvofx;

constexpr Status kMissing = 3; // a property or a name that there is not

OfxProps& PropsAt(PropertySetHandle handle) {
    return *reinterpret_cast<OfxProps*>(handle);
}
OfxEffect& EffectAt(EffectHandle handle) {
    return *reinterpret_cast<OfxEffect*>(handle);
}
OfxParam& ParamAt(ParamHandle handle) {
    return *reinterpret_cast<OfxParam*>(handle);
}
OfxClip& ClipAt(ClipHandle handle) {
    return *reinterpret_cast<OfxClip*>(handle);
}

template <class T>
Status SetOne(PropertySetHandle set, const char* name, int index, T value) {
    if (!OfxOptions().knowsCoordinateSystem && std::strcmp(name, prop::kCoordinateSystem) == 0) {
        return kMissing;
    }
    if (!set || index < 0) {
        return kStatErrBadIndex;
    }
    auto& list = PropsAt(set).values[name];
    list.resize(std::max(list.size(), static_cast<size_t>(index) + 1));
    list[static_cast<size_t>(index)] = value;
    return kStatOk;
}

template <class T>
Status GetOne(PropertySetHandle set, const char* name, int index, T* value) {
    if (!set) {
        return kStatErrBadHandle;
    }
    const auto found = PropsAt(set).values.find(name);
    if (found == PropsAt(set).values.end()) {
        return kMissing;
    }
    if (index < 0 || static_cast<size_t>(index) >= found->second.size()) {
        return kStatErrBadIndex;
    }
    auto& item = found->second[static_cast<size_t>(index)];
    if constexpr (std::is_same_v<T, char*>) {
        auto* const text = std::get_if<std::string>(&item);
        *value = text ? text->data() : *value;
        return text ? kStatOk : kStatErrValue;
    } else {
        const T* const number = std::get_if<T>(&item);
        *value = number ? *number : *value;
        return number ? kStatOk : kStatErrValue;
    }
}

template <class T>
Status GetAll(PropertySetHandle set, const char* name, int count, T* values) {
    for (int i = 0; i < count; ++i) {
        if (const Status status = GetOne(set, name, i, values + i); status != kStatOk) {
            return status;
        }
    }
    return kStatOk;
}

Status SetText(PropertySetHandle set, const char* name, int index, const char* value) {
    return SetOne(set, name, index, std::string(value));
}

const PropertySuite kPropertySuite = {
    .setPointer = SetOne<void*>,
    .setString = SetText,
    .setDouble = SetOne<double>,
    .setInt = SetOne<int>,
    .setPointerN = nullptr,
    .setStringN = nullptr,
    .setDoubleN = nullptr,
    .setIntN = nullptr,
    .getPointer = GetOne<void*>,
    .getString = GetOne<char*>,
    .getDouble = GetOne<double>,
    .getInt = GetOne<int>,
    .getPointerN = GetAll<void*>,
    .getStringN = GetAll<char*>,
    .getDoubleN = GetAll<double>,
    .getIntN = GetAll<int>,
    .reset = nullptr,
    .getDimension = nullptr,
};

Status DefineParam(ParamSetHandle set, const char* type, const char* name,
                   PropertySetHandle* props) {
    OfxEffect& effect = *reinterpret_cast<OfxEffect*>(set);
    OfxParam& param = effect.params[name];
    param.type = type;
    param.name = name;
    effect.order.emplace_back(name);
    *props = param.props.Handle();
    return kStatOk;
}

Status GetParam(ParamSetHandle set, const char* name, ParamHandle* param,
                PropertySetHandle* props) {
    OfxEffect& effect = *reinterpret_cast<OfxEffect*>(set);
    const auto found = effect.params.find(name);
    if (found == effect.params.end()) {
        return kMissing;
    }
    *param = reinterpret_cast<ParamHandle>(&found->second);
    if (props) {
        *props = found->second.props.Handle();
    }
    return kStatOk;
}

Status GetParamProps(ParamHandle param, PropertySetHandle* props) {
    *props = ParamAt(param).props.Handle();
    return kStatOk;
}

bool IsOfDoubles(const OfxParam& param) {
    return param.type == paramtype::kDouble || param.type == paramtype::kRgb ||
           param.type == paramtype::kDouble2D;
}

Status GetValueAtTime(ParamHandle handle, double time, ...) {
    if (OfxOptions().failsReadingParams) {
        return kStatFailed;
    }
    const OfxParam& param = ParamAt(handle);
    const std::vector<double> values = param.animation ? param.animation(time) : param.values;
    va_list list;
    va_start(list, time);
    for (const double value : values) {
        if (IsOfDoubles(param)) {
            *va_arg(list, double*) = value;
        } else {
            *va_arg(list, int*) = static_cast<int>(value);
        }
    }
    va_end(list);
    return kStatOk;
}

Status SetValue(ParamHandle handle, ...) {
    va_list list;
    va_start(list, handle);
    for (double& value : ParamAt(handle).values) {
        value = va_arg(list, double); // only points are set by plug-ins here
    }
    va_end(list);
    return kStatOk;
}

const ParameterSuite kParameterSuite = {
    .define = DefineParam,
    .getHandle = GetParam,
    .setGetPropertySet = nullptr,
    .getPropertySet = GetParamProps,
    .getValue = nullptr,
    .getValueAtTime = GetValueAtTime,
    .getDerivative = nullptr,
    .getIntegral = nullptr,
    .setValue = SetValue,
    .setValueAtTime = nullptr,
    .getNumKeys = nullptr,
    .getKeyTime = nullptr,
    .getKeyIndex = nullptr,
    .deleteKey = nullptr,
    .deleteAllKeys = nullptr,
    .copy = nullptr,
    .editBegin = nullptr,
    .editEnd = nullptr,
};

Status GetEffectProps(EffectHandle effect, PropertySetHandle* props) {
    *props = EffectAt(effect).props.Handle();
    return kStatOk;
}

Status GetParamSet(EffectHandle effect, ParamSetHandle* params) {
    *params = reinterpret_cast<ParamSetHandle>(effect);
    return kStatOk;
}

Status DefineClip(EffectHandle effect, const char* name, PropertySetHandle* props) {
    OfxClip& clip = EffectAt(effect).clips[name];
    clip.name = name;
    *props = clip.props.Handle();
    return kStatOk;
}

Status GetClip(EffectHandle effect, const char* name, ClipHandle* clip, PropertySetHandle* props) {
    const auto found = EffectAt(effect).clips.find(name);
    if (found == EffectAt(effect).clips.end()) {
        return kMissing;
    }
    *clip = reinterpret_cast<ClipHandle>(&found->second);
    if (props) {
        *props = found->second.props.Handle();
    }
    return kStatOk;
}

Status GetClipProps(ClipHandle clip, PropertySetHandle* props) {
    *props = ClipAt(clip).props.Handle();
    return kStatOk;
}

std::atomic<int> g_heldImages = 0;

Status GetImage(ClipHandle handle, double, const RectD*, PropertySetHandle* image) {
    OfxClip& clip = ClipAt(handle);
    if (!clip.image) {
        return kStatFailed;
    }
    ++g_heldImages;
    *image = clip.image->props.Handle();
    return kStatOk;
}

Status ReleaseImage(PropertySetHandle) {
    --g_heldImages;
    return kStatOk;
}

Status GetRegion(ClipHandle handle, double, RectD* bounds) {
    *bounds = ClipAt(handle).region;
    return ClipAt(handle).image ? kStatOk : kStatFailed;
}

int Abort(EffectHandle handle) {
    OfxEffect& effect = EffectAt(handle);
    return effect.abortAfter >= 0 && effect.abortAfter-- == 0 ? (effect.abortAfter = 0, 1) : 0;
}

const ImageEffectSuite kEffectSuite = {
    .getPropertySet = GetEffectProps,
    .getParamSet = GetParamSet,
    .clipDefine = DefineClip,
    .clipGetHandle = GetClip,
    .clipGetPropertySet = GetClipProps,
    .clipGetImage = GetImage,
    .clipReleaseImage = ReleaseImage,
    .clipGetRegionOfDefinition = GetRegion,
    .abort = Abort,
    .imageMemoryAlloc = nullptr,
    .imageMemoryFree = nullptr,
    .imageMemoryLock = nullptr,
    .imageMemoryUnlock = nullptr,
};

Status Message(void* handle, const char*, const char*, const char*, ...) {
    ++static_cast<OfxEffect*>(handle)->messages;
    return kStatOk;
}

const MessageSuite kMessageSuite = {.message = Message};

OfxInteract& InteractAt(InteractHandle handle) {
    return *reinterpret_cast<OfxInteract*>(handle);
}

Status Redraw(InteractHandle handle) {
    ++InteractAt(handle).redraws;
    return kStatOk;
}

Status GetInteractProps(InteractHandle handle, PropertySetHandle* props) {
    *props = InteractAt(handle).props.Handle();
    return kStatOk;
}

const InteractSuite kInteractSuite = {
    .swapBuffers = Redraw, .redraw = Redraw, .getPropertySet = GetInteractProps};

Status Draw(DrawContextHandle, int, const PointD* points, int count) {
    OfxDrawn().emplace_back(points, points + count);
    return kStatOk;
}

const DrawSuite kDrawSuite = {
    .getColor = [](DrawContextHandle, int, ColorF*) -> Status { return kStatOk; },
    .setColor = [](DrawContextHandle, const ColorF*) -> Status { return kStatOk; },
    .setLineWidth = [](DrawContextHandle, float) -> Status { return kStatOk; },
    .setLineStipple = nullptr,
    .draw = Draw,
    .drawText = nullptr,
};

const void* FetchSuite(PropertySetHandle, const char* name, int version) {
    const std::string wanted = name;
    if (version != 1) {
        return nullptr;
    }
    if (wanted == suite::kProperty) {
        return &kPropertySuite;
    }
    if (wanted == suite::kParameter) {
        return &kParameterSuite;
    }
    if (wanted == suite::kImageEffect) {
        return &kEffectSuite;
    }
    if (wanted == suite::kMessage) {
        return OfxOptions().hasMessages ? &kMessageSuite : nullptr;
    }
    if (wanted == suite::kInteract) {
        return OfxOptions().hasInteract ? &kInteractSuite : nullptr;
    }
    return wanted == suite::kDraw && OfxOptions().hasInteract ? &kDrawSuite : nullptr;
}

template <class T>
T* Find(kyv::LibraryHandle library, const char* name) {
    auto* const function = reinterpret_cast<T*>(kyv::FindSymbol(library, name));
    if (!function) {
        ADD_FAILURE() << "the bundle has no " << name;
        std::abort();
    }
    return function;
}

template <class T>
T ValueOf(const OfxProps& props, const std::string& name, size_t index) {
    const auto found = props.values.find(name);
    if (found == props.values.end() || index >= found->second.size()) {
        return T();
    }
    const T* const value = std::get_if<T>(&found->second[index]);
    return value ? *value : T();
}

size_t ChannelBytes(const std::string& depth) {
    return depth == value::kByte ? 1 : depth == value::kShort ? 2 : 4;
}

} // namespace

int OfxProps::Int(const std::string& name, size_t index) const {
    return ValueOf<int>(*this, name, index);
}
double OfxProps::Double(const std::string& name, size_t index) const {
    return ValueOf<double>(*this, name, index);
}
std::string OfxProps::String(const std::string& name, size_t index) const {
    return ValueOf<std::string>(*this, name, index);
}
void* OfxProps::Pointer(const std::string& name) const {
    return ValueOf<void*>(*this, name, 0);
}
size_t OfxProps::Count(const std::string& name) const {
    const auto found = values.find(name);
    return found == values.end() ? 0 : found->second.size();
}

OfxImage::OfxImage(const Frame& frame, RectI bounds, const OfxLayout& layout)
    : m_bounds(bounds), m_channelBytes(ChannelBytes(layout.depth)) {
    const auto width = static_cast<size_t>(bounds.x2 - bounds.x1);
    const auto height = static_cast<size_t>(bounds.y2 - bounds.y1);
    constexpr size_t kGuard = 64;
    const size_t row = width * 4 * m_channelBytes + static_cast<size_t>(layout.padding);
    memory.assign(row * height + 2 * kGuard, 0xCD);
    m_rowBytes = static_cast<ptrdiff_t>(row) * (layout.isTopDown ? -1 : 1);
    m_first = kGuard + (layout.isTopDown ? row * (height - 1) : 0);
    for (size_t y = 0; y < height; ++y) {
        for (size_t x = 0; x < width; ++x) {
            const uint32_t pixel = frame[(height - 1 - y) * width + x];
            uint8_t* const at = Pixel(static_cast<int>(x), static_cast<int>(y));
            const uint32_t parts[4] = {pixel >> 16 & 255, pixel >> 8 & 255, pixel & 255,
                                       pixel >> 24};
            for (size_t i = 0; i < 4; ++i) {
                const float part = static_cast<float>(parts[i]) / 255.0F;
                const auto wide = static_cast<uint16_t>(parts[i] * 257);
                const auto byte = static_cast<uint8_t>(parts[i]);
                const void* const from = m_channelBytes == 1   ? static_cast<const void*>(&byte)
                                         : m_channelBytes == 2 ? static_cast<const void*>(&wide)
                                                               : &part;
                std::memcpy(at + i * m_channelBytes, from, m_channelBytes);
            }
        }
    }
    props.Set(prop::kData, {static_cast<void*>(memory.data() + m_first)});
    props.Set(prop::kBounds, {bounds.x1, bounds.y1, bounds.x2, bounds.y2});
    props.Set(prop::kImageRegion, {bounds.x1, bounds.y1, bounds.x2, bounds.y2});
    props.Set(prop::kRowBytes, {static_cast<int>(m_rowBytes)});
    props.Set(prop::kDepth, {std::string(layout.depth)});
    props.Set(prop::kComponents, {std::string(value::kRgba)});
    props.Set(prop::kPixelAspect, {1.0});
    if (layout.isPremultiplied) {
        props.Set(prop::kPremultiplication, {std::string(value::kPremultiplied)});
    }
}

uint8_t* OfxImage::Pixel(int x, int y) {
    return memory.data() + static_cast<ptrdiff_t>(m_first) + y * m_rowBytes +
           x * static_cast<ptrdiff_t>(4 * m_channelBytes);
}

Frame OfxImage::Pixels() const {
    auto& self = const_cast<OfxImage&>(*this);
    const int width = m_bounds.x2 - m_bounds.x1, height = m_bounds.y2 - m_bounds.y1;
    Frame frame;
    for (int y = height - 1; y >= 0; --y) {
        for (int x = 0; x < width; ++x) {
            const uint8_t* const at = self.Pixel(x, y);
            uint32_t parts[4];
            for (size_t i = 0; i < 4; ++i) {
                float part = 0;
                uint16_t wide = 0;
                if (m_channelBytes == 1) {
                    parts[i] = at[i];
                } else if (m_channelBytes == 2) {
                    std::memcpy(&wide, at + 2 * i, 2);
                    parts[i] = (wide + 128U) / 257;
                } else {
                    std::memcpy(&part, at + 4 * i, 4);
                    parts[i] = static_cast<uint32_t>(std::lround(part * 255));
                }
            }
            frame.push_back(parts[2] | parts[1] << 8 | parts[0] << 16 | parts[3] << 24);
        }
    }
    return frame;
}

bool OfxImage::IsGapUntouched() const {
    auto& self = const_cast<OfxImage&>(*this);
    std::vector<bool> isPixel(memory.size());
    const int width = m_bounds.x2 - m_bounds.x1, height = m_bounds.y2 - m_bounds.y1;
    for (int y = 0; y < height; ++y) {
        const auto first = static_cast<size_t>(self.Pixel(0, y) - memory.data());
        std::fill_n(isPixel.begin() + static_cast<ptrdiff_t>(first),
                    static_cast<size_t>(width) * 4 * m_channelBytes, true);
    }
    for (size_t i = 0; i < memory.size(); ++i) {
        if (!isPixel[i] && memory[i] != 0xCD) {
            return false;
        }
    }
    return true;
}

OfxHostOptions& OfxOptions() {
    static OfxHostOptions options;
    return options;
}

Host* OfxTestHost() {
    static Host host = {nullptr, FetchSuite};
    return &host;
}

std::vector<std::vector<PointD>>& OfxDrawn() {
    static std::vector<std::vector<PointD>> drawn;
    return drawn;
}

std::string OfxBundleFolder() {
    return KYV_OPENFX_FOLDER;
}

const std::vector<Plugin*>& OfxPlugins() {
    static const std::vector<Plugin*> plugins = [] {
        const kyv::LibraryHandle library =
            kyv::OpenLibrary(std::filesystem::path(KYV_OPENFX_FOLDER "/KyvDsp.ofx").native());
        EXPECT_NE(library, nullptr);
        std::vector<Plugin*> all;
        auto* const plugin = Find<Plugin*(int)>(library, "OfxGetPlugin");
        const int count = Find<int()>(library, "OfxGetNumberOfPlugins")();
        Find<int(const Host*)>(library, "OfxSetHost")(OfxTestHost());
        EXPECT_EQ(plugin(-1), nullptr);
        EXPECT_EQ(plugin(count), nullptr);
        for (int i = 0; i < count; ++i) {
            all.push_back(plugin(i));
            all.back()->setHost(OfxTestHost());
            EXPECT_EQ(all.back()->mainEntry(action::kLoad, nullptr, nullptr, nullptr), kStatOk);
        }
        return all;
    }();
    return plugins;
}

Status OfxDescribe(Plugin& plugin, OfxEffect& effect) {
    const Status status = plugin.mainEntry(action::kDescribe, effect.Handle(), nullptr, nullptr);
    if (status != kStatOk) {
        return status;
    }
    OfxProps in;
    in.Set(prop::kContext, {effect.props.String(prop::kSupportedContexts)});
    return plugin.mainEntry(action::kDescribeInContext, effect.Handle(), in.Handle(), nullptr);
}

COfxInstance::COfxInstance(const std::string& name) : m_plugin(nullptr) {
    for (Plugin* const plugin : OfxPlugins()) {
        if (plugin->identifier == "kyv.dsp." + name) {
            m_plugin = plugin;
        }
    }
    if (!m_plugin) {
        ADD_FAILURE() << "no plug-in " << name;
        std::abort();
    }
    EXPECT_EQ(OfxDescribe(*m_plugin, m_descriptor), kStatOk);
    m_effect = m_descriptor;
    m_effect.props.Set(prop::kEffectDuration, {100.0});
    m_effect.props.Set(prop::kFrameRate, {25.0});
    for (auto& [key, clip] : m_effect.clips) {
        clip.props.Set(prop::kConnected, {0});
    }
    for (auto& [key, param] : m_effect.params) {
        for (const OfxProps::Value& initial : param.props.values[prop::kDefault]) {
            const int* const whole = std::get_if<int>(&initial);
            param.values.push_back(whole ? *whole : std::get<double>(initial));
        }
    }
    EXPECT_EQ(Act(action::kCreateInstance), kStatOk);
}

COfxInstance::~COfxInstance() {
    EXPECT_EQ(Act(action::kDestroyInstance), kStatOk);
    EXPECT_EQ(g_heldImages, 0);
}

std::vector<std::string> COfxInstance::Sources() const {
    const std::string context = Context();
    if (context == context::kTransition) {
        return {clip::kFrom, clip::kTo};
    }
    return context == context::kFilter ? std::vector<std::string>{clip::kSource}
                                       : std::vector<std::string>{clip::kSource, "Picture"};
}

void COfxInstance::Set(const std::string& param, std::vector<double> values) {
    const auto found = m_effect.params.find(param);
    if (found == m_effect.params.end()) {
        ADD_FAILURE() << "no parameter " << param;
        return;
    }
    EXPECT_EQ(found->second.values.size(), values.size()) << param;
    found->second.values = std::move(values);
}

void COfxInstance::Connect(const std::string& name, const Frame& frame, RectI bounds,
                           const OfxLayout& layout, double scale) {
    OfxClip& clip = m_effect.clips[name];
    clip.image = std::make_shared<OfxImage>(frame, bounds, layout);
    clip.region = {bounds.x1 / scale, bounds.y1 / scale, bounds.x2 / scale, bounds.y2 / scale};
    clip.props.Set(prop::kConnected, {1});
    clip.props.Set(prop::kFrameRate, {25.0});
    clip.props.Set(prop::kFrameRange, {0.0, 99.0});
}

Status COfxInstance::Act(const char* action, OfxProps* in, OfxProps* out) {
    return m_plugin->mainEntry(action, m_effect.Handle(), in ? in->Handle() : nullptr,
                               out ? out->Handle() : nullptr);
}

OfxProps COfxInstance::RenderArguments(double time, RectI window, double scale) {
    OfxProps in;
    in.Set(prop::kTime, {time});
    in.Set(prop::kRenderScale, {scale, scale});
    in.Set(prop::kRenderWindow, {window.x1, window.y1, window.x2, window.y2});
    in.Set(prop::kField, {std::string("OfxFieldNone")});
    return in;
}

} // namespace kyvtest
