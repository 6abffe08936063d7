// What a plug-in tells about itself, as constant data: the build reads it out of the module's
// records and its English texts (Generate.cpp). Hosts ask for it before anything else, for every
// plug-in that they find, and store the names in projects: so it needs no module at run time and
// is the same in every language.
#pragma once

#include <cstdint>

namespace kyvfrei0r {

// How a host's value becomes one of the effect's.
enum class Mapping {
    Unit,              // 0 to 1 over the parameter's range, whole numbers and choices included
    Plain,             // the number as it is: rectangles and positions, fractions of the frame
    Switch,            // bool
    Color,             // three floats
    ClipLength,        // 0 to 1 for up to an hour; not the effect's but the context's
    BackgroundColor,   // the corner pin's own
    BackgroundOpacity, // as well, 0 to 1
};

struct ParamTable {
    const char* name;
    const char* explanation;
    Mapping mapping;
    uint32_t index;     // of the effect's parameter
    uint32_t component; // of its value
    bool ownDefault;    // initial replaces the module's default
    double initial;     // as the host sees it
};

struct PluginTable {
    const char* file;   // "kyv_bubble"
    const char* effect; // identifier
    const char* name;
    const char* explanation;
    bool isMixer;
    bool isCornerPin; // the effect's first input is a background of the plug-in's own
    int wipe;         // index of the effect's parameter that is 0 at the first input and 1 at the
                      // second; -1: none
    uint32_t paramSizes; // of the effect's parameters: their number in the upper, the sum of their
                         // bytes in the lower half, to notice another module
    const ParamTable* params;
    int paramCount;
};

} // namespace kyvfrei0r
