// A small OpenFX host for tests, over the C interface alone: property sets, parameters with
// animation, clips with images of any layout. What a host may do differently is an option.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "bridges/openfx/OpenFx.h"
#include "platform/Library.h"

namespace kyvtest {

using Frame = std::vector<uint32_t>; // top down, 0xAARRGGBB

struct OfxProps {
    using Value = std::variant<int, double, std::string, void*>;
    std::map<std::string, std::vector<Value>> values;

    kyvofx::PropertySetHandle Handle() { return reinterpret_cast<kyvofx::PropertySetHandle>(this); }
    void Set(const std::string& name, std::vector<Value> list) { values[name] = std::move(list); }
    // 0, 0, "" and null for what is missing.
    int Int(const std::string& name, size_t index = 0) const;
    double Double(const std::string& name, size_t index = 0) const;
    std::string String(const std::string& name, size_t index = 0) const;
    void* Pointer(const std::string& name) const;
    size_t Count(const std::string& name) const;
};

struct OfxParam {
    std::string type, name;
    OfxProps props;
    std::vector<double> values;                                // of all times
    std::function<std::vector<double>(double time)> animation; // or these
};

// How an image lies in memory.
struct OfxLayout {
    const char* depth = kyvofx::value::kByte;
    int padding = 0;        // bytes behind each row
    bool isTopDown = false; // rows run downwards in memory: negative row bytes
    bool isPremultiplied = false;
};

struct OfxImage {
    OfxProps props;
    std::vector<uint8_t> memory; // 0xCD but for the pixels

    // bounds in pixels; the frame is of their size.
    OfxImage(const Frame& frame, kyvofx::RectI bounds, const OfxLayout& layout);
    // The pixels, rounded to 8 bits; straight as they are.
    Frame Pixels() const;
    bool IsGapUntouched() const;

private:
    uint8_t* Pixel(int x, int y);
    kyvofx::RectI m_bounds;
    ptrdiff_t m_rowBytes;
    size_t m_channelBytes;
    size_t m_first;
};

struct OfxClip {
    std::string name;
    OfxProps props;
    std::shared_ptr<OfxImage> image; // null: not connected
    kyvofx::RectD region = {};       // canonical
    int held = 0;
};

struct OfxEffect {
    OfxProps props;
    std::map<std::string, OfxParam> params;
    std::vector<std::string> order; // of definition
    std::map<std::string, OfxClip> clips;
    int abortAfter = -1; // questions that are answered with no; -1: all
    int messages = 0;

    kyvofx::EffectHandle Handle() { return reinterpret_cast<kyvofx::EffectHandle>(this); }
};

struct OfxHostOptions {
    bool hasMessages = true;
    bool hasInteract = true;
    bool knowsCoordinateSystem = true;
    bool failsReadingParams = false;
};

// The bundle, loaded once for the program. The host's suites obey Options().
OfxHostOptions& OfxOptions();
kyvofx::Host* OfxTestHost();
const std::vector<kyvofx::Plugin*>& OfxPlugins();
std::string OfxBundleFolder();

// A plug-in by its identifier's end, described and instantiated: "dreamy".
class COfxInstance {
public:
    explicit COfxInstance(const std::string& name);
    ~COfxInstance();
    COfxInstance(const COfxInstance&) = delete;
    COfxInstance& operator=(const COfxInstance&) = delete;

    OfxEffect& Effect() { return m_effect; }
    const OfxEffect& Descriptor() const { return m_descriptor; }
    std::string Context() const {
        return m_descriptor.props.String("OfxImageEffectPropSupportedContexts");
    }
    std::vector<std::string> Sources() const; // without the output
    void Set(const std::string& param, std::vector<double> values);

    // Connects a clip; the region is that of the image at the scale.
    void Connect(const std::string& clip, const Frame& frame, kyvofx::RectI bounds,
                 const OfxLayout& layout = {}, double scale = 1);
    kyvofx::Status Act(const char* action, OfxProps* in = nullptr, OfxProps* out = nullptr);
    OfxProps RenderArguments(double time, kyvofx::RectI window, double scale = 1);

private:
    kyvofx::Plugin* m_plugin;
    OfxEffect m_descriptor, m_effect;
};

// Describes into the effect: the plug-in and its only context.
kyvofx::Status OfxDescribe(kyvofx::Plugin& plugin, OfxEffect& effect);

// What the overlay has drawn since it was cleared.
std::vector<std::vector<kyvofx::PointD>>& OfxDrawn();
struct OfxInteract {
    OfxProps props;
    int redraws = 0;
};

} // namespace kyvtest
