// The pictures that travel inside the module, each drawn by one function.
#pragma once

#include <cstdint>
#include <vector>

#include "resources/drawing/PictureFile.h"

namespace kyvart {

using kyvdraw::Sprite;

// A wipe mask of 640 x 480: palette indices from low (the place that changes first) to high.
struct WipeMask {
    std::vector<uint8_t> indices;
    std::vector<uint8_t> greys;
};
constexpr int kMaskWidth = 640, kMaskHeight = 480;

Sprite DrawBubbleBody(float hueShift = 0);
Sprite DrawMiniatureMask();
Sprite DrawLensMask();
Sprite DrawSheen();

Sprite DrawSpark();
Sprite DrawStar();
Sprite DrawLens();
Sprite DrawDrop();
Sprite DrawFlare();
Sprite DrawRings();

WipeMask DrawInkMask();
WipeMask DrawDiamondMask();

} // namespace kyvart
