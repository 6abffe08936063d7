// Blending one image over another of the same size.
#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "imageutility/kernels/AddBlend.h"
#include "imageutility/kernels/AlphaBlend.h"
#include "imageutility/kernels/CompositeOver.h"
#include "imageutility/kernels/ScreenBlend.h"

namespace KYVImageUtility {

void CImageARGB::AlphaBlend(const CImageARGB& source, uint8_t opacity) {
    WalkRowPairs(FormFor(kyv::kAlphaBlend, *this), *this, source, opacity);
}

void CImageARGB::AddBlend(const CImageARGB& source, uint8_t opacity) {
    // Levels 1 and 2 add the alpha like a colour, every other level keeps it. Intended: those two
    // stand for processors whose form worked on all four bytes of a pixel at once.
    const int32_t level = GetCpuLevel();
    const bool addsAlpha = level == 1 || level == 2;
    WalkRowPairs(FormFor(addsAlpha ? kyv::kAddBlendWithAlpha : kyv::kAddBlend, *this), *this,
                 source, opacity);
}

void CImageARGB::ScreenBlend(const CImageARGB& source) {
    WalkRowPairs(FormFor(kyv::kScreenBlend, *this), *this, source);
}

void CImageARGB::CompositeOver(const CImageARGB& source, uint8_t opacity) {
    WalkRowPairs(FormFor(kyv::kCompositeOver, *this), *this, source, opacity);
}

} // namespace KYVImageUtility
