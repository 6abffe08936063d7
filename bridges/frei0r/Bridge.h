// A plug-in's life behind the frei0r functions. Nothing here throws.
//
// What is promised to hosts: the tables are answered without a module; constructing an instance
// allocates no more than its parameters (the effect prepares itself at the first update); every
// instance has a lock, so that bands of one frame may be updated from several threads; a value that
// is not finite counts as the default, others are clamped; a time that no clip has counts as 0.
#pragma once

#include <memory>

#include "bridges/frei0r/Frei0r.h"
#include "bridges/frei0r/Tables.h"

namespace kyvfrei0r {

class CPluginInstance {
public:
    virtual ~CPluginInstance() = default;

    // value leads to a double or a Frei0rColor, by the parameter's type. An index without a
    // parameter and a null value do nothing.
    virtual void SetParam(int index, const void* value) noexcept = 0;
    virtual void GetParam(int index, void* value) noexcept = 0;

    // time is in the unit of whoever calls: milliseconds from libavfilter, seconds otherwise;
    // KYV_FREI0R_TIME=ms or =s in the environment overrules this. caller is an address in the
    // calling function. Filters have no second input. The frames have the instance's size; output
    // may be one of the inputs. When the effect fails, the output is the first input.
    virtual void Update(double time, const void* input0, const void* input1, void* output,
                        const void* caller) noexcept = 0;
};

// Null when the size is none, there is not enough memory, or the module is missing or another one,
// which is told in one line on standard error.
std::unique_ptr<CPluginInstance> Construct(const PluginTable& table, unsigned width,
                                           unsigned height) noexcept;

void FillPluginInfo(const PluginTable& table, Frei0rPluginInfo* info) noexcept;
void FillParamInfo(const PluginTable& table, Frei0rParamInfo* info, int index) noexcept;

} // namespace kyvfrei0r
