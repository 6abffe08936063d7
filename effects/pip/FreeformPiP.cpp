// Builds the map of a quad and draws the picture through it.
#include "effects/pip/FreeformPiP.h"

#include <algorithm>
#include <atomic>

#include "effects/pip/QuadRenderers.h"
#include "effects/pip/SpanWalk.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;

std::atomic<CFreeformPiP*> g_current = nullptr;

constexpr int32_t kTileSize = 1024; // columns and rows that entries address
constexpr uint32_t kTileBits = 0x03FF03FF;

void ToFloat(const RasterPoint (&points)[4], RasterPointF (&floats)[4]) {
    std::transform(points, points + 4, floats, [](RasterPoint p) {
        return RasterPointF{static_cast<float>(p.x), static_cast<float>(p.y)};
    });
}

} // namespace

CFreeformPiP::CFreeformPiP() : m_pFilter(SelectResampleFilter(4, nullptr)) {
    g_current = this;
}

CFreeformPiP::~CFreeformPiP() {
    CFreeformPiP* self = this;
    g_current.compare_exchange_strong(self, nullptr);
}

CFreeformPiP* CFreeformPiP::Current() {
    return g_current;
}

void CFreeformPiP::SetSize(int32_t sourceWidth, int32_t sourceHeight, int32_t destWidth,
                           int32_t destHeight) {
    m_bDirty = m_bDirty || sourceWidth != m_nSourceWidth || sourceHeight != m_nSourceHeight ||
               destWidth != m_nDestWidth || destHeight != m_nDestHeight;
    m_nSourceWidth = sourceWidth;
    m_nSourceHeight = sourceHeight;
    m_nDestWidth = destWidth;
    m_nDestHeight = destHeight;
}

int32_t CFreeformPiP::StorePoints(const RasterPoint* points, int32_t count,
                                  RasterPoint (&stored)[4]) {
    if (!points || count < 0 || count > kPointLimit) {
        return 0;
    }
    for (int32_t i = 0; i < count; ++i) {
        const RasterPoint point = {std::clamp(points[i].x, -kFarthestPoint, kFarthestPoint),
                                   std::clamp(points[i].y, -kFarthestPoint, kFarthestPoint)};
        m_bDirty = m_bDirty || point != stored[i];
        stored[i] = point;
    }
    return 1;
}

int32_t CFreeformPiP::SetSourcePoints(const RasterPoint* points, int32_t count) {
    return StorePoints(points, count, m_sourcePoints);
}

int32_t CFreeformPiP::SetDestPoints(const RasterPoint* points, int32_t count) {
    return StorePoints(points, count, m_destPoints);
}

void CFreeformPiP::SetQuadModel(int32_t model) {
    m_nQuadModel = model;
    m_bDirty = true;
}

void CFreeformPiP::SetMapMode(int32_t mode) {
    m_nMapMode = mode;
    m_bDirty = true;
}

void CFreeformPiP::SetFilterIndex(int32_t index) {
    m_pFilter = SelectResampleFilter(index, m_pFilter);
    m_bDirty = true;
}

void CFreeformPiP::SetWide(bool wide) {
    m_bDirty = m_bDirty || wide != m_bWide;
    m_bWide = wide;
}

int32_t CFreeformPiP::Render(const CImageARGB& source, CImageARGB& destination) {
    return IsDestination(destination) && BeginRows(source) ? DrawOn(destination) : 0;
}

int32_t CFreeformPiP::RenderCheckerboard(CImageARGB& destination) {
    if (m_nSourceWidth <= 0 || m_nSourceHeight <= 0 || !IsDestination(destination) ||
        (m_nMapMode != MapMode_Nearest && m_nMapMode != MapMode_Bilinear)) {
        return 0;
    }
    m_picture = {nullptr, 0, m_nSourceWidth, m_nSourceHeight};
    Prepare(destination.GetInstructionSet());
    return DrawOn(destination);
}

bool CFreeformPiP::IsDestination(const CImageARGB& image) const {
    return image.GetBuffer() && image.GetWidth() == m_nDestWidth &&
           image.GetHeight() == m_nDestHeight;
}

int32_t CFreeformPiP::DrawOn(CImageARGB& destination) {
    g_current = this;
    for (int32_t y = 0; y < m_nDestHeight; ++y) {
        DrawRow(y, destination.Row(y));
    }
    EndRows();
    return 1;
}

bool CFreeformPiP::BeginRows(const CImageARGB& source) {
    if (!source.GetBuffer() || source.GetWidth() != m_nSourceWidth ||
        source.GetHeight() != m_nSourceHeight || m_nDestWidth <= 0 || m_nDestHeight <= 0) {
        return false;
    }
    m_picture = {source.GetBuffer(), source.GetPitch(), m_nSourceWidth, m_nSourceHeight};
    Prepare(source.GetInstructionSet());
    return true;
}

void CFreeformPiP::Prepare(InstructionSet set) {
    m_pMapRow = kQuadMapRow.For(set);
    m_pSampleRow = kQuadSampleRow.For(set);
    if (!m_bDirty) {
        return;
    }
    Allocate();
    RasterPointF quad[4], corners[4];
    ToFloat(m_destPoints, quad);
    ToFloat(m_sourcePoints, corners);
    m_model.Set(quad, corners);
    m_spans.Begin(m_nDestHeight);
    CWindowWalk({0, 0, m_nDestWidth, m_nDestHeight})
        .ClampQuad(m_destPoints,
                   [&](int32_t y, int32_t first, int32_t last) { m_spans.Add(y, first, last); });
}

size_t CFreeformPiP::EntriesPerPixel() const {
    return m_nMapMode == MapMode_GridNearest || m_nMapMode == MapMode_GridBilinear ? kGridSamples
                                                                                   : 1;
}

size_t CFreeformPiP::PixelIndex(int32_t x, int32_t y) const {
    return static_cast<size_t>(y) * static_cast<size_t>(m_nDestWidth) + static_cast<size_t>(x);
}

// Room for the mode's map; what it holds is rebuilt in any case.
void CFreeformPiP::Allocate() {
    const bool filtered = m_nMapMode == MapMode_Filtered;
    const size_t pixels = PixelIndex(0, m_nDestHeight);
    m_records.clear();
    m_records.resize(filtered ? pixels * 2 : 0);
    m_records.shrink_to_fit();
    const size_t entries = filtered ? 0 : pixels * EntriesPerPixel();
    if (entries != m_mapEntries) {
        m_pSourceMap.reset();
        m_mapEntries = 0;
        // Pages that no quad touches are never touched here either.
        m_pSourceMap.reset(entries ? new uint32_t[entries] : nullptr);
        m_mapEntries = entries;
    }
    m_tiles.resize(static_cast<size_t>(m_nDestHeight));
    for (std::vector<TileRun>& row : m_tiles) {
        row.clear();
    }
}

void CFreeformPiP::DrawRow(int32_t y, uint8_t* row) {
    std::vector<TileRun>& tiles = m_tiles[static_cast<size_t>(y)];
    if (m_bDirty) {
        for (const Run& run : m_spans.Row(y)) {
            BuildRun(run, y);
            FindTiles(run, y, tiles);
        }
    }
    for (const TileRun& tile : tiles) {
        SamplePicture picture = m_picture;
        const auto left = static_cast<int32_t>(tile.tile & 0xFFFF) * kTileSize;
        const auto top = static_cast<int32_t>(tile.tile >> 16) * kTileSize;
        if (picture.pixels) {
            picture.pixels += top * picture.pitch + ptrdiff_t{4} * left;
        }
        picture.width -= left;
        picture.height -= top;
        // Area coordinates go half a pixel beyond the picture.
        if (picture.width > 0 && picture.height > 0) {
            RenderRun(row + ptrdiff_t{4} * tile.run.first, tile.run, y, picture);
        }
    }
}

// The tile of a position is the whole part of its entry with the picture at 1/1024 of its size. The
// operations are those of the map, and a double holds the part as exactly as the whole, so that
// tile and entry fit together to the last bit.
void CFreeformPiP::FindTiles(const Run& run, int32_t y, std::vector<TileRun>& tiles) {
    const bool singles = m_nMapMode == MapMode_Nearest || m_nMapMode == MapMode_Bilinear;
    if (!m_bWide || !singles || std::max(m_nSourceWidth, m_nSourceHeight) <= kTileSize) {
        tiles.push_back({run, 0});
        return;
    }
    m_tileRow.resize(static_cast<size_t>(m_nDestWidth));
    const auto end = m_tileRow.begin() + (run.end - run.first);
    BuildEntries(m_tileRow.data(), run, y, 1.0 / kTileSize);
    int32_t x = run.first;
    for (auto entry = m_tileRow.begin(); entry != end;) {
        const uint32_t tile = *entry >> 6 & kTileBits;
        const auto next = std::find_if(
            entry, end, [&](uint32_t other) { return (other >> 6 & kTileBits) != tile; });
        const auto count = static_cast<int32_t>(next - entry);
        tiles.push_back({{x, x + count}, tile});
        x += count;
        entry = next;
    }
}

// One entry a pixel, with the picture at `scale` times its size.
void CFreeformPiP::BuildEntries(uint32_t* map, const Run& run, int32_t y, double scale) const {
    if (m_nQuadModel == QuadModel_InverseBilinear) {
        m_pMapRow(map, run.first, static_cast<size_t>(run.end - run.first),
                  m_model.PlanRow(y, scale));
        return;
    }
    for (int32_t x = run.first; x < run.end; ++x) {
        const QuadPoint point = m_model.WachspressPoint(x, y);
        *map++ = MapEntry(point.u * scale, point.v * scale);
    }
}

QuadPoint CFreeformPiP::PointAt(double x, double y) const {
    return m_nQuadModel == QuadModel_InverseBilinear ? m_model.InverseBilinearPoint(x, y)
                                                     : m_model.WachspressPoint(x, y);
}

void CFreeformPiP::BuildRun(const Run& run, int32_t y) {
    if (m_nMapMode == MapMode_Filtered) {
        BuildFiltered(run, y);
        return;
    }
    uint32_t* map = m_pSourceMap.get() + PixelIndex(run.first, y) * EntriesPerPixel();
    if (EntriesPerPixel() == 1) {
        BuildEntries(map, run, y, 1.0);
        return;
    }
    // A regular grid about the pixel, a third of a pixel apart.
    constexpr double kOffsets[] = {-1.0 / 3.0, 0.0, 1.0 / 3.0};
    for (int32_t x = run.first; x < run.end; ++x) {
        for (const double dy : kOffsets) {
            for (const double dx : kOffsets) {
                const QuadPoint point = PointAt(x + dx, y + dy);
                *map++ = MapEntry(point.u, point.v);
            }
        }
    }
}

void CFreeformPiP::BuildFiltered(const Run& run, int32_t y) {
    ContributionRecord* records = m_records.data() + PixelIndex(run.first, y) * 2;
    for (int32_t x = run.first; x < run.end; ++x, records += 2) {
        const QuadPoint point = PointAt(x, y);
        if (point.inside) {
            records[0] = MakeContribution(*m_pFilter, static_cast<float>(point.u), point.scaleU,
                                          m_nSourceWidth);
            records[1] = MakeContribution(*m_pFilter, static_cast<float>(point.v), point.scaleV,
                                          m_nSourceHeight);
        }
    }
}

void CFreeformPiP::RenderRun(uint8_t* dst, const Run& run, int32_t y,
                             const SamplePicture& picture) const {
    const auto count = static_cast<size_t>(run.end - run.first);
    const size_t first = PixelIndex(run.first, y);
    if (m_nMapMode == MapMode_Filtered) { // which has no map
        RenderFiltered(dst, m_records.data() + first * 2, count, picture);
        return;
    }
    const uint32_t* map = m_pSourceMap.get() + first * EntriesPerPixel();
    if (!picture.pixels) {
        RenderChecker(dst, map, count);
        return;
    }
    switch (m_nMapMode) {
    case MapMode_Nearest:
        RenderNearest(dst, map, count, picture);
        break;
    case MapMode_GridNearest:
        RenderGridNearest(dst, map, count, picture);
        break;
    case MapMode_Bilinear:
        m_pSampleRow(dst, map, count, picture);
        break;
    case MapMode_GridBilinear:
        RenderGridBilinear(dst, map, count, picture);
        break;
    default:
        break;
    }
}

} // namespace kyv
