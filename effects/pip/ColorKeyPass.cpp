// The colour key over rows.
#include "effects/pip/ColorKeyPass.h"

#include "platform/CpuFeatures.h"

namespace kyv {

CColorKeyPass::CColorKeyPass(const PictureKey& key, bool ayuv, int32_t cpuLevel)
    : m_key(key), m_bAyuv(ayuv), m_pKeyRow(kColorKeyRow.For(Resolve(cpuLevel))),
      m_pToArgb(kToARGB.For(Resolve(cpuLevel))), m_pToAyuv(kToAYUV.For(Resolve(cpuLevel))) {}

void CColorKeyPass::KeyRow(uint8_t* row, uint8_t* below, size_t count) {
    if (m_bAyuv && m_bFirst) {
        m_pToArgb(row, row, count);
    }
    m_bFirst = false;
    if (m_bAyuv && below) {
        m_pToArgb(below, below, count);
    }
    m_pKeyRow(row, below ? below : row, count, m_key.color, m_key.tolerance);
    if (m_bAyuv) {
        m_pToAyuv(row, row, count);
    }
}

} // namespace kyv
