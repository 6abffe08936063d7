// The colour key over rows of a picture.
#pragma once

#include <cstddef>
#include <cstdint>

#include "effects/pip/LayerRows.h"
#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"

namespace kyv {

struct PictureKey {
    bool enabled;
    uint32_t color; // 0x00RRGGBB
    uint8_t tolerance;
};

// Keys the rows of one picture from top to bottom. Those of an AYUV picture are converted for it
// and back, zeros into what RGB makes of them.
class CColorKeyPass {
public:
    CColorKeyPass(const PictureKey& key, bool ayuv, int32_t cpuLevel);

    // The row is finished with this. The one below, null below the last, has its turn next; it is
    // looked at, and in RGB until then.
    void KeyRow(uint8_t* row, uint8_t* below, size_t count);

private:
    PictureKey m_key;
    bool m_bAyuv;
    bool m_bFirst = true;
    ColorKeyRow m_pKeyRow;
    ToARGBRow m_pToArgb;
    ToAYUVRow m_pToAyuv;
};

} // namespace kyv
