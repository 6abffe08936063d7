// An instance of the module's effect behind frei0r's calls: values, time, the lock and what happens
// when something fails.
#pragma once

#include <cstdint>
#include <mutex>
#include <vector>

#include "bridges/frei0r/Bridge.h"
#include "hosting/Instance.h"

namespace kyvfrei0r {

class CEffectPlugin : public CPluginInstance {
public:
    // The effect must be the one that the table was made from. Calls InitInstance. Throws
    // std::bad_alloc, and CCallError when the effect refuses.
    CEffectPlugin(const PluginTable& table, const EffectDescriptor& effect, uint32_t width,
                  uint32_t height);

    void SetParam(int index, const void* value) noexcept final;
    void GetParam(int index, void* value) noexcept final;
    void Update(double time, const void* input0, const void* input1, void* output,
                const void* caller) noexcept final;

protected:
    // The frame for the current values and time; neither input is the output.
    virtual KyvStatus Render(const void* input0, const void* input1, void* output);

    // The plug-in's own parameters, which the effect does not have.
    virtual void SetOwn(const ParamTable& param, const void* value);
    virtual void GetOwn(const ParamTable& param, void* value) const;

    size_t Pixels() const;
    size_t Bytes() const { return Pixels() * 4; }
    kyvhosting::CInstance& Instance() { return m_instance; }
    const kyvhosting::CInstance& Instance() const { return m_instance; }

private:
    bool SetValue(const ParamTable& param, const void* value);
    void SetTime(double time, const void* caller);
    KyvStatus RenderChecked(const void* input0, const void* input1, void* output);
    void Complain(const char* what, KyvStatus status);

    const PluginTable& m_table;
    std::mutex m_mutex;
    kyvhosting::CInstance m_instance;
    double m_clipLength = 0; // seconds
    bool m_bBegun = false;
    bool m_bComplained = false;
    const void* m_pCaller = nullptr; // whose unit of time is known
    double m_unitsPerTime = 0;       // of 100 ns
    std::vector<uint32_t> m_copy;    // of an input that is the output as well
};

} // namespace kyvfrei0r
