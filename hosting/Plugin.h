// What plug-ins that bring the module into other programs have in common.
#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <vector>

#include "hosting/Module.h"
#include "interface/HostInterface.h"

namespace kyvhosting {

// A ceiling: the processor decides below it. Pictures of any size are shown whole.
inline constexpr int32_t kPluginCpuLevel = int32_t{CpuLevel_Avx2} | int32_t{CpuLevelOption_WideMap};

inline constexpr double kUnitsPerSecond = 1e7; // the module counts in 100 ns

// The module that KYV_DSP_MODULE names, or the one in the first of the folders that has it.
// Relative folders count from that of the plug-in, which is the library that this code is linked
// into. It is loaded at the first call that succeeds and kept, as the plug-in itself is: hosts load
// and unload plug-ins at moments when the module may not be unloaded (from a library's own
// unloading, say), and all plug-ins of a process share the one that the system has loaded. Throws
// CModuleError.
const CModule& PluginsModule(const std::vector<std::filesystem::path>& folders);

// No frame is larger than these; the products of a frame's sides stay far from overflow.
bool IsPossibleFrame(int64_t width, int64_t height);

// The module's time for a host's, both in units of 100 ns; 0 for what is no moment of a clip: not a
// number, negative, beyond ten million seconds.
int64_t TimeUnits(double units);

// Whether an effect leaves something else than the input's in the alpha bytes, which hosts want.
bool LosesAlpha(const EffectDescriptor& effect);

// Gives the pixels of to the alpha of those of from. What such an effect leaves there is solid or
// the same already, so where the source is solid, as most videos are, nothing is written.
void KeepAlpha(const void* from, void* to, size_t pixels);

} // namespace kyvhosting
