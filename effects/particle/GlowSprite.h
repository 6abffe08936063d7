// The spot of light that stands for a spark.
#pragma once

#include <cstdint>

#include "imageutility/ImageUtility.h"

namespace kyv {

// Makes a white square image whose alpha is a hot core in a soft glow that ends half a pixel
// outside the image. Throws std::bad_alloc.
void DrawGlow(KYVImageUtility::CImageARGB& image, int32_t size);

} // namespace kyv
