// AYUV frames, made from BGRA and turned back, in place.
//
// A pixel is B, G, R, A or V, U, Y, A in memory. BT.601 studio range: Y 16..235, U and V 16..240
// about 128. Each component is rounded to the nearest; what lies outside 0..255 on the way back is
// clamped. Alpha stays.
#pragma once

#include <cstddef>
#include <cstdint>

namespace kyvhost {

void BgraToAyuv(uint8_t* frame, size_t pixels);
void AyuvToBgra(uint8_t* frame, size_t pixels);

} // namespace kyvhost
