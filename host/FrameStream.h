// Raw frames with time stamps as ffmpeg reads them over a pipe: a Matroska stream without an end.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "host/Rational.h"

namespace kyvhost {

// What comes before the first frame. The frames are B, G, R, A, width * height * 4 bytes each; rate
// is what players are told.
std::vector<uint8_t> FrameStreamHeader(uint32_t width, uint32_t height, const Rational& rate);

// What comes before each frame: frameBytes bytes follow it. nanoseconds never go back.
std::vector<uint8_t> FrameHeader(int64_t nanoseconds, size_t frameBytes);

// The most bytes of a frame that the reader takes.
constexpr size_t kMostFrameBytes = (size_t{1} << 28) - 64;

} // namespace kyvhost
