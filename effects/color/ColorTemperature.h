// Colour temperature: shifts the picture between cool and warm and between green and magenta.
#pragma once

#include "effects/color/ColorTemperatureRow.h"
#include "interface/HostInterface.h"

namespace kyv {

struct ColorTemperature {
    enum Param : uint32_t {
        Temperature, // float  -1 warm .. 1 cool: as with a higher temperature, 1 adds blue
        Comparison,  // int    0 off, other values leave the left half unprocessed; 2 shows the
                     //        centre half of the picture twice, before and after (hosts set it
                     //        although the parameter is declared a boolean)
        Tint,        // float  -1 green .. 1 magenta
        ParamCount,
    };

    struct Instance {
        void* input;
        void* output;
        ColorTables temperature;
        float temperatureDegree; // the value the tables were built for
        uint32_t* comparison;    // owned: a frame with the picture's centre half twice
        uint32_t comparisonPixels;
        ColorTables tint;
        float tintDegree;
    };
    static_assert(sizeof(Instance) == 6184);

    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
