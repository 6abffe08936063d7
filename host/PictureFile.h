// What a picture file says about itself besides its pixels.
#pragma once

#include <cstdint>
#include <span>

namespace kyvhost {

enum class PictureKind { None, Png, Jpeg, Tiff, Bmp };

// By the first bytes.
PictureKind KindOf(std::span<const uint8_t> bytes);

// Whether a PNG moves, as far as its first bytes tell.
bool IsAnimatedPng(std::span<const uint8_t> bytes);

// Whether a PNG or JPEG goes on to its end. Decoders differ in what they make of a file that was
// cut off; a picture with a grey lower half is not what a user wants to be given in silence.
bool IsComplete(std::span<const uint8_t> bytes);

// The orientation 1..8 that a camera has noted in a JPEG or TIFF, 1 when there is none.
int Orientation(std::span<const uint8_t> bytes);

} // namespace kyvhost
