// The module inside other programs' plug-ins.
#include "hosting/Plugin.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include "hosting/Error.h"
#include "hosting/Text.h"
#include "platform/Library.h"

namespace kyvhosting {
namespace {

namespace fs = std::filesystem;

fs::path FindFile(const std::vector<fs::path>& folders) {
    if (const char* const named = std::getenv("KYV_DSP_MODULE")) {
        return PathOf(named);
    }
    const fs::path own = fs::path(kyv::LibraryFileName(kyv::OwnLibrary())).parent_path();
    std::vector<fs::path> places;
    places.reserve(folders.size());
    for (const fs::path& folder : folders) {
        places.push_back(own / folder);
    }
    fs::path file = FindModuleFile(places);
    if (file.empty()) {
        throw CModuleError("no " KYV_MODULE_NAME " beside the plug-in in " + TextOf(own) +
                           " or in the folder above; put it there, or name it in KYV_DSP_MODULE");
    }
    return file;
}

} // namespace

const CModule& PluginsModule(const std::vector<fs::path>& folders) {
    static const CModule* const module = [&] {
        kyv::KeepOwnLibrary();
        return new CModule(FindFile(folders));
    }();
    return *module;
}

bool IsPossibleFrame(int64_t width, int64_t height) {
    constexpr int64_t kMaxSide = 1 << 16;
    constexpr int64_t kMaxPixels = 1 << 28;
    return width > 0 && height > 0 && width <= kMaxSide && height <= kMaxSide &&
           width * height <= kMaxPixels;
}

int64_t TimeUnits(double units) {
    constexpr double kLongestSeconds = 1e7;
    const bool isTime = units >= 0 && units <= kLongestSeconds * kUnitsPerSecond;
    // A multiple of a frame's time comes out of floating point slightly below or above itself: the
    // hundredth of a unit keeps 1.001 s from becoming 1.0009999 s, a millisecond earlier.
    return isTime ? static_cast<int64_t>(units + 0.01) : 0;
}

bool LosesAlpha(const EffectDescriptor& effect) {
    return std::string_view(effect.identifier) == "Kyv_Dsp_Pfx_WaterRipple";
}

void KeepAlpha(const void* from, void* to, size_t pixels) {
    constexpr size_t kBlock = 1024;
    const auto* source = static_cast<const uint8_t*>(from);
    auto* target = static_cast<uint8_t*>(to);
    for (size_t first = 0; first < pixels; first += kBlock) {
        const size_t end = std::min(first + kBlock, pixels);
        uint32_t all = 0xFF000000;
        for (size_t i = first; i < end; ++i) {
            uint32_t pixel;
            std::memcpy(&pixel, source + 4 * i, sizeof pixel);
            all &= pixel;
        }
        for (size_t i = first; all != 0xFF000000 && i < end; ++i) {
            uint32_t color, alpha;
            std::memcpy(&color, target + 4 * i, sizeof color);
            std::memcpy(&alpha, source + 4 * i, sizeof alpha);
            color = (color & 0x00FFFFFF) | (alpha & 0xFF000000);
            std::memcpy(target + 4 * i, &color, sizeof color);
        }
    }
}

} // namespace kyvhosting
