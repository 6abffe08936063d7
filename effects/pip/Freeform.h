// The free-form picture-in-picture: draws the second input into a quad of the first, with a colour
// key, a border and a shadow.
//
// A position is a part of the frame's size. Sizes in pixels are meant for a frame of 320 x 240.
// Types are Up, Dn, L, R, UL, UR, LL, LR: where the second colour of a gradient lies.
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
    enum Param : uint32_t {
        PointAX, // float   the corners, clockwise from the upper left
        PointAY,
        PointBX,
        PointBY,
        PointCX,
        PointCY,
        PointDX,
        PointDY,
        KeyEnable,     // bool
        KeyColor,      // colour
        KeyTolerance,  // byte    in each of red, green and blue
        KeyAlpha,      // byte    nothing
        PictureEnable, // bool
        PictureAlpha,  // byte
        PictureBlur,   // int     radius, 0..10
        ShadowEnable,  // bool
        ShadowColor1,  // colour
        ShadowColor2,  // colour
        ShadowType,    // choice
        ShadowAlpha,   // byte
        ShadowBlur,    // int     radius, 0..10
        ShadowOffsetX, // float
        ShadowOffsetY, // float
        BorderEnable,  // bool
        BorderSize,    // int     0..10
        BorderColor1,  // colour
        BorderColor2,  // colour
        BorderType,    // choice
        BorderAlpha,   // byte
        BorderBlur,    // int     radius, 0..5
        ParamCount,
    };

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
