// The frei0r 1.2 plug-in interface as far as these plug-ins speak it, declared by ourselves: it is
// a dozen C functions and five small records whose layout every host agrees on, the system's own
// header is under the GPL, and a cross compiler would not see it. A test holds the two together.
#pragma once

#include <cstddef>
#include <cstdint>

extern "C" {

enum { kFrei0rMajorVersion = 1 };

enum Frei0rPluginType { Frei0rPlugin_Filter = 0, Frei0rPlugin_Mixer2 = 2 };

// Bytes B, G, R, A in memory, rows top down without gaps.
enum Frei0rColorModel { Frei0rColorModel_Bgra8888 = 0 };

enum Frei0rParamType {
    Frei0rParam_Bool = 0,   // a double; 0.5 and more is on
    Frei0rParam_Double = 1, // by custom 0 to 1
    Frei0rParam_Color = 2,  // Frei0rColor
};

struct Frei0rPluginInfo {
    const char* name;
    const char* author;
    int pluginType;
    int colorModel;
    int frei0rVersion;
    int majorVersion;
    int minorVersion;
    int paramCount;
    const char* explanation;
};

struct Frei0rParamInfo {
    const char* name;
    int type;
    const char* explanation;
};

struct Frei0rColor {
    float r, g, b; // 0 to 1
};

} // extern "C"

static_assert(sizeof(Frei0rPluginInfo) == 48 && offsetof(Frei0rPluginInfo, explanation) == 40);
static_assert(sizeof(Frei0rParamInfo) == 24 && offsetof(Frei0rParamInfo, explanation) == 16);
static_assert(sizeof(Frei0rColor) == 12);
