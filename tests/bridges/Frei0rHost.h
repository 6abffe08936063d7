// A small frei0r host for tests: loads a plug-in as other programs do and calls it by its
// functions alone.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "bridges/frei0r/Frei0r.h"
#include "platform/Library.h"

namespace kyvtest {

using Frame = std::vector<uint32_t>;

// The names of all plug-ins that the build makes.
const std::vector<std::string>& PluginNames();

class CFrei0rPlugin {
public:
    // Loads the plug-in; f0r_init is left out, since some hosts do.
    explicit CFrei0rPlugin(const std::string& name);
    ~CFrei0rPlugin() { kyv::CloseLibrary(m_library); }

    CFrei0rPlugin(const CFrei0rPlugin&) = delete;
    CFrei0rPlugin& operator=(const CFrei0rPlugin&) = delete;

    bool IsMixer() const { return m_info.pluginType == Frei0rPlugin_Mixer2; }
    const Frei0rPluginInfo& Info() const { return m_info; }
    Frei0rParamInfo Param(int index) const;
    int IndexOf(const std::string& param) const; // a missing one fails the test

    int (*init)() = nullptr;
    void (*deinit)() = nullptr;
    void (*paramInfo)(Frei0rParamInfo*, int) = nullptr;
    void* (*construct)(unsigned, unsigned) = nullptr;
    void (*destruct)(void*) = nullptr;
    void (*setParam)(void*, void*, int) = nullptr;
    void (*getParam)(void*, void*, int) = nullptr;
    void (*update)(void*, double, const uint32_t*, uint32_t*) = nullptr;
    void (*update2)(void*, double, const uint32_t*, const uint32_t*, const uint32_t*,
                    uint32_t*) = nullptr;

private:
    kyv::LibraryHandle m_library;
    Frei0rPluginInfo m_info = {};
};

class CFrei0rInstance {
public:
    CFrei0rInstance(const CFrei0rPlugin& plugin, unsigned width, unsigned height)
        : m_plugin(plugin), m_pixels(size_t{width} * height),
          m_instance(plugin.construct(width, height)) {}
    ~CFrei0rInstance() { m_plugin.destruct(m_instance); }

    CFrei0rInstance(const CFrei0rInstance&) = delete;
    CFrei0rInstance& operator=(const CFrei0rInstance&) = delete;

    void* Handle() const { return m_instance; }
    double Get(int index) const;
    void Set(int index, double value) { m_plugin.setParam(m_instance, &value, index); }
    void Set(const std::string& param, double value) { Set(m_plugin.IndexOf(param), value); }
    Frei0rColor Color(int index) const;
    void Set(int index, Frei0rColor color) { m_plugin.setParam(m_instance, &color, index); }

    // input1 is for mixers. The output is filled with rubbish before.
    Frame Update(double time, const Frame& input0, const Frame& input1) const;

private:
    const CFrei0rPlugin& m_plugin;
    size_t m_pixels;
    void* m_instance;
};

} // namespace kyvtest
