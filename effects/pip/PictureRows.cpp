// The picture row by row.
#include "effects/pip/PictureRows.h"

#include <algorithm>

namespace kyv {

CPictureRows::CPictureRows(int32_t width, const PixelBox& box, const PictureKey& key, bool ayuv,
                           int32_t cpuLevel, CRowSink& sink)
    : m_width(static_cast<size_t>(width)), m_box(box), m_bKeyed(key.enabled),
      m_key(key, ayuv, cpuLevel), m_sink(sink), m_rows(2 * m_width), m_nNext(box.top) {}

uint8_t* CPictureRows::Row(int32_t y) {
    // The row above this one is complete, but it may still be looked at.
    while (m_nNext < std::min(y - 1, m_box.bottom)) {
        FinishRow();
    }
    return reinterpret_cast<uint8_t*>(Slot(y));
}

void CPictureRows::Finish() {
    while (m_nNext < m_box.bottom) {
        FinishRow();
    }
}

void CPictureRows::FinishRow() {
    const int32_t y = m_nNext++;
    const auto count = static_cast<size_t>(m_box.Width());
    uint8_t* row = Pixels(y);
    if (m_bKeyed) {
        m_key.KeyRow(row, y + 1 < m_box.bottom ? Pixels(y + 1) : nullptr, count);
    }
    m_sink.Take(y, row);
    std::fill_n(Slot(y) + m_box.left, count, 0);
}

} // namespace kyv
