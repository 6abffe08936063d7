// A contact sheet: every effect of the module on the same two pictures.
#pragma once

#include <filesystem>

#include "host/Render.h"

namespace kyvhost {

struct GalleryOptions {
    std::filesystem::path input, input2, output;
    EffectSettings settings;
    bool overwrite = false;
    uint32_t columns = 5;
    uint32_t tileWidth = 400; // pixels; the height follows from the first picture's shape
};

void Gallery(const ModuleDescriptor& module, const GalleryOptions& options);

} // namespace kyvhost
