// Text on pictures.
#pragma once

#include <cstdint>
#include <string_view>

#include "host/Picture.h"

namespace kyvhost {

// The width in pixels of UTF-8 text whose capitals and descenders span about size pixels.
double TextWidth(std::string_view text, double size);

// Draws from x on, with the baseline at y, in 0xRRGGBB. What lies outside the picture is left out.
void DrawText(Picture& picture, double x, double y, double size, uint32_t color,
              std::string_view text);

} // namespace kyvhost
