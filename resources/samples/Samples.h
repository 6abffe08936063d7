// The sample pictures, each drawn by one function.
#pragma once

#include <string>

#include "resources/drawing/Canvas.h"

namespace kyvsamples {

constexpr int kWidth = 1280, kHeight = 720;

// A sailing boat before the sun over an open sea.
kyvdraw::CCanvas DrawSunset();
// A town on a river by night.
kyvdraw::CCanvas DrawNight();
// Mountains behind a lake.
kyvdraw::CCanvas DrawLandscape();
// Three wooden figures beside a colour chart.
kyvdraw::CCanvas DrawPortrait();
// A printed page: engraved lines, wedges and small type, set in the fonts of the folder.
kyvdraw::CCanvas DrawPrint(const std::string& fontFolder);

} // namespace kyvsamples
