// The free-form picture-in-picture: draws the second input into a quad of the first, with a colour
// key, a border and a shadow.
//
// A position is a part of the frame's size. Sizes in pixels are meant for a frame of 320 x 240.
// Types are Up, Dn, L, R, UL, UR, LL, LR: where the second colour of a gradient lies.
//
//   "P0" to "P7"  float  x and y of the corners A, B, C, D, clockwise from the upper left
//   "P8"          bool   colour key: enable
//   "P9", "P10"   colour, byte  the key, and the tolerance in each of red, green and blue
//   "P11"         byte   nothing
//   "P12", "P13"  bool, byte    picture: enable, alpha
//   "P14"         int    picture: blur radius, 0 to 10
//   "P15"         bool   shadow: enable
//   "P16", "P17"  colour shadow: the two colours
//   "P18"         choice shadow: type
//   "P19", "P20"  byte, int     shadow: alpha, and blur radius 0 to 10
//   "P21", "P22"  float  shadow: offset, in parts of the frame's size
//   "P23", "P24"  bool, int     border: enable, and size 0 to 10
//   "P25", "P26"  colour border: the two colours
//   "P27"         choice border: type
//   "P28", "P29"  byte, int     border: alpha, and blur radius 0 to 5
//
// Values out of range are safe: what is not a number counts as 0, positions are kept within 2^24
// pixels, and negative sizes and radii count as 0.
#pragma once

#include <cstdint>

#include "interface/HostInterface.h"

namespace kyv {

class CFreeformPiP;
class CPipWork;

struct Freeform {
    struct Instance {
        void* background;
        void* foreground;
        CFreeformPiP* pip;
        CPipWork* work;
    };
    static_assert(sizeof(Instance) == 32);

    static constexpr uint32_t kInputCount = 2;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
