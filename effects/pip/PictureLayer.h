// The picture: drawn through the quad's map and keyed. Drawing reads the foreground, any row of it.
#pragma once

#include <cstdint>

#include "effects/pip/Coverage.h"
#include "effects/pip/FreeformPiP.h"
#include "effects/pip/RowLayer.h"

namespace kyv {

struct PictureKey {
    bool enabled;
    uint32_t color; // 0x00RRGGBB
    uint8_t tolerance;
};

struct PictureSettings {
    PictureKey key;
    int32_t blur; // pixels
    bool ayuv;
    PixelBox box;        // where pixels may be drawn
    int32_t lead;        // how far below the row that is blended others may be asked for
    CCoverage* coverage; // is given the rows as they are, before the blur; may be null
};

class CPictureLayer final : public CRowLayer {
public:
    // A frame follows. The content is where the picture can be, with the neighbours that the key
    // looks at; empty for a quad outside the frame. Throws std::bad_alloc.
    void Begin(CFreeformPiP& pip, const KYVImageUtility::CImageARGB& foreground,
               const PictureSettings& settings);

private:
    void Make(int32_t y) override;
    void Draw(int32_t y);

    CFreeformPiP* m_pPip = nullptr;
    PictureSettings m_settings = {};
    uint32_t m_clear = 0;
    int32_t m_nDrawn = 0; // the next row to draw
};

} // namespace kyv
