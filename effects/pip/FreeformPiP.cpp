// Builds the map of a quad and draws the picture through it.
#include "effects/pip/FreeformPiP.h"

#include <algorithm>
#include <atomic>

#include "effects/pip/QuadRenderers.h"
#include "effects/pip/SpanWalk.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;

// Written under CRasterLock, so that nobody becomes current while another object draws through the
// callback.
std::atomic<CFreeformPiP*> g_current = nullptr;

constexpr int32_t kTileSize = 1024; // columns and rows that entries address

void ToFloat(const RasterPoint (&points)[4], RasterPointF (&floats)[4]) {
    std::transform(points, points + 4, floats, [](RasterPoint p) {
        return RasterPointF{static_cast<float>(p.x), static_cast<float>(p.y)};
    });
}

} // namespace

CFreeformPiP::CFreeformPiP() : m_pFilter(SelectResampleFilter(4, nullptr)) {
    const CRasterLock lock;
    g_current = this;
}

CFreeformPiP::~CFreeformPiP() {
    const CRasterLock lock;
    if (g_current == this) {
        g_current = nullptr;
    }
}

CFreeformPiP* CFreeformPiP::Current() {
    return g_current;
}

void CFreeformPiP::SetSize(int32_t sourceWidth, int32_t sourceHeight, int32_t destWidth,
                           int32_t destHeight) {
    if (sourceWidth != m_nSourceWidth || sourceHeight != m_nSourceHeight ||
        destWidth != m_nDestWidth || destHeight != m_nDestHeight) {
        m_bDirty = true;
    }
    m_nSourceWidth = sourceWidth;
    m_nSourceHeight = sourceHeight;
    m_nDestWidth = destWidth;
    m_nDestHeight = destHeight;
    m_bSizeSet = sourceWidth > 0 && sourceHeight > 0 && destWidth > 0 && destHeight > 0;
}

// True when a point has changed.
bool CFreeformPiP::StorePoints(const RasterPoint* points, int32_t count, RasterPoint (&stored)[4]) {
    bool changed = false;
    for (int32_t i = 0; i < count; ++i) {
        const RasterPoint point = {std::clamp(points[i].x, -kFarthestPoint, kFarthestPoint),
                                   std::clamp(points[i].y, -kFarthestPoint, kFarthestPoint)};
        changed = changed || point.x != stored[i].x || point.y != stored[i].y;
        stored[i] = point;
    }
    return changed;
}

int32_t CFreeformPiP::SetSourcePoints(const RasterPoint* points, int32_t count) {
    if (!points || count < 0 || count > kPointLimit) {
        return 0;
    }
    m_bDirty = StorePoints(points, count, m_sourcePoints) || m_bDirty;
    return 1;
}

int32_t CFreeformPiP::SetDestPoints(const RasterPoint* points, int32_t count) {
    if (!points || count < 0 || count > kPointLimit) {
        return 0;
    }
    m_bDirty = StorePoints(points, count, m_destPoints) || m_bDirty;
    return 1;
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

// False without a size or when the source, unless it is null for none, has no pixels or another
// size.
bool CFreeformPiP::Prepare(const CImageARGB* source, InstructionSet set) {
    if (!m_bSizeSet || (source && (!source->GetBuffer() || source->GetWidth() != m_nSourceWidth ||
                                   source->GetHeight() != m_nSourceHeight))) {
        return false;
    }
    m_renderer = source ? Renderer::Picture : Renderer::Checkerboard;
    m_picture = {};
    if (source) {
        m_picture = {source->GetBuffer(), source->GetPitch(), m_nSourceWidth, m_nSourceHeight};
    }
    m_pMapRow = kQuadMapRow.For(set);
    m_pSampleRow = kQuadSampleRow.For(set);
    if (m_bDirty) {
        Allocate();
        RasterPointF quad[4], corners[4];
        ToFloat(m_destPoints, quad);
        ToFloat(m_sourcePoints, corners);
        m_model.Set(quad, corners);
        m_spans.Begin(m_nDestHeight);
        CWindowWalk({0, 0, m_nDestWidth - 1, m_nDestHeight - 1})
            .ClampQuad(m_destPoints, [&](int32_t y, int32_t first, int32_t last) {
                m_spans.Add(y, first, last);
            });
        m_spans.Finish();
        m_tiles.clear();
        m_tileStarts.resize(static_cast<size_t>(m_nDestHeight));
    }
    return true;
}

void CFreeformPiP::SetWide(bool wide) {
    m_bDirty = m_bDirty || wide != m_bWide;
    m_bWide = wide;
}

bool CFreeformPiP::IsWide() const {
    return m_bWide && (m_nSourceWidth > kTileSize || m_nSourceHeight > kTileSize) &&
           (m_nMapMode == MapMode_Nearest || m_nMapMode == MapMode_Bilinear);
}

// The operations are those of the map with the picture at 1/1024 of its size, which a double holds
// as exactly, so that tile and entry fit together to the last bit.
uint32_t CFreeformPiP::TileOf(int32_t x, int32_t y) const {
    constexpr double kPart = 1.0 / kTileSize;
    uint32_t entry = 0;
    if (m_nQuadModel == QuadModel_InverseBilinear) {
        QuadMapRowPlan plan = m_model.PlanRow(y);
        plan.originU *= kPart;
        plan.originV *= kPart;
        plan.rangeU *= kPart;
        plan.rangeV *= kPart;
        entry = MapEntry(plan, x);
    } else if (const QuadPoint point = m_model.WachspressPoint(x, y); point.inside) {
        entry = MapEntry(point.u * kPart, point.v * kPart);
    }
    return entry >> 6 & 0x03FF03FF;
}

// Of a block that begins and ends in one tile all pixels are in it when their entries lie between
// those at its ends, or a few pixels of the picture beyond: such a pixel in another tile would be
// nearly 1024 away. Of other blocks every pixel is asked.
void CFreeformPiP::BuildTiles(const Run& run, int32_t y) {
    constexpr int32_t kBlock = 32;
    constexpr uint32_t kSlack = 4 * 64; // of entries
    constexpr uint32_t kHighest = 0xFFFF - kSlack;
    const uint32_t* map =
        m_pSourceMap.get() + static_cast<size_t>(y) * static_cast<size_t>(m_nDestWidth);
    const size_t rowStart = m_tiles.size();
    const auto add = [&](int32_t end, uint32_t tile) {
        if (m_tiles.size() > rowStart && m_tiles.back().tile == tile) {
            m_tiles.back().end = end;
        } else {
            m_tiles.push_back({end, tile});
        }
    };
    uint32_t tile = TileOf(run.first, y);
    add(run.first + 1, tile);
    for (int32_t x = run.first; x + 1 < run.end;) {
        const int32_t last = std::min(x + kBlock, run.end - 1);
        const uint32_t lastTile = TileOf(last, y);
        const auto [lowU, highU] = std::minmax({map[x] & 0xFFFF, map[last] & 0xFFFF});
        const auto [lowV, highV] = std::minmax({map[x] >> 16, map[last] >> 16});
        bool between = tile == lastTile && lowU >= kSlack && lowV >= kSlack && highU <= kHighest &&
                       highV <= kHighest;
        for (int32_t i = x + 1; i < last; ++i) {
            const uint32_t u = map[i] & 0xFFFF;
            const uint32_t v = map[i] >> 16;
            between = between && u + kSlack >= lowU && u <= highU + kSlack && v + kSlack >= lowV &&
                      v <= highV + kSlack;
        }
        for (int32_t i = x + 1; !between && i < last; ++i) {
            add(i + 1, TileOf(i, y));
        }
        add(last + 1, lastTile);
        tile = lastTile;
        x = last;
    }
}

bool CFreeformPiP::BeginRows(const CImageARGB& source) {
    return Prepare(&source, source.GetInstructionSet());
}

void CFreeformPiP::DrawRow(int32_t y, uint8_t* row) {
    const bool wide = IsWide();
    if (wide && m_bDirty) {
        m_tileStarts[static_cast<size_t>(y)] = static_cast<uint32_t>(m_tiles.size());
    }
    for (const Run& run : m_spans.Row(y)) {
        const auto count = static_cast<size_t>(run.end - run.first);
        if (m_bDirty) {
            BuildSpan(run.first, y, count);
            if (wide) {
                BuildTiles(run, y);
            }
        }
        if (!wide) {
            RenderSpan(row, run.first, y, count);
        }
    }
    if (wide) {
        RenderTiles(row, y);
    }
}

void CFreeformPiP::RenderTiles(uint8_t* row, int32_t y) {
    const SamplePicture whole = m_picture;
    size_t next = m_tileStarts[static_cast<size_t>(y)];
    for (const Run& run : m_spans.Row(y)) {
        for (int32_t x = run.first; x < run.end;) {
            const TileRun& tile = m_tiles[next++];
            const auto left = static_cast<int32_t>(tile.tile & 0xFFFF) * kTileSize;
            const auto top = static_cast<int32_t>(tile.tile >> 16) * kTileSize;
            m_picture = {whole.pixels + top * whole.pitch + ptrdiff_t{4} * left, whole.pitch,
                         whole.width - left, whole.height - top};
            // Area coordinates go half a pixel beyond the picture.
            if (m_picture.width > 0 && m_picture.height > 0) {
                RenderSpan(row, x, y, static_cast<size_t>(tile.end - x));
            }
            x = tile.end;
        }
    }
    m_picture = whole;
}

int32_t CFreeformPiP::Render(const CImageARGB& source, CImageARGB& destination) {
    return Prepare(&source, source.GetInstructionSet()) ? DrawOn(destination) : 0;
}

int32_t CFreeformPiP::RenderCheckerboard(CImageARGB& destination) {
    if (m_nMapMode != MapMode_Nearest && m_nMapMode != MapMode_Bilinear) {
        return 0;
    }
    return Prepare(nullptr, destination.GetInstructionSet()) ? DrawOn(destination) : 0;
}

// The callback stays installed after a drawing, and pixels that somebody else emits then find
// nothing to draw on.
int32_t CFreeformPiP::DrawOn(CImageARGB& destination) {
    if (!destination.GetBuffer() || destination.GetWidth() != m_nDestWidth ||
        destination.GetHeight() != m_nDestHeight) {
        return 0;
    }
    if (IsWide()) { // whose tiles are told by rows
        for (int32_t y = 0; y < m_nDestHeight; ++y) {
            DrawRow(y, destination.Row(y));
        }
        m_bDirty = false;
        return 1;
    }
    static const auto withCurrent = [](const RasterPixel& pixel, auto&& draw) {
        CFreeformPiP* const pip = Current();
        if (pip && pip->m_pDestination) {
            draw(*pip, std::clamp(pixel.x, 0, pip->m_nDestWidth - 1),
                 std::clamp(pixel.y, 0, pip->m_nDestHeight - 1));
        }
    };
    const RasterWindow window = {0, 0, m_nDestWidth - 1, m_nDestHeight - 1};
    const CRasterLock lock;
    g_current = this;
    m_pDestination = &destination;
    struct Reset {
        CImageARGB*& pointer;
        ~Reset() { pointer = nullptr; }
    } const reset = {m_pDestination};
    if (m_bDirty) {
        CRasterizer::SetPixelCallback([](const RasterPixel* pixel) {
            withCurrent(*pixel,
                        [](CFreeformPiP& pip, int32_t x, int32_t y) { pip.BuildSpan(x, y, 1); });
        });
        CRasterizer::FillQuadWithin(window, m_destPoints);
        m_bDirty = false;
    }
    CRasterizer::SetPixelCallback([](const RasterPixel* pixel) {
        withCurrent(*pixel, [](CFreeformPiP& pip, int32_t x, int32_t y) {
            pip.RenderSpan(pip.m_pDestination->Row(y), x, y, 1);
        });
    });
    CRasterizer::FillQuadWithin(window, m_destPoints);
    return 1;
}

size_t CFreeformPiP::EntriesPerPixel() const {
    return m_nMapMode == MapMode_GridNearest || m_nMapMode == MapMode_GridBilinear ? kGridSamples
                                                                                   : 1;
}

// Room for the mode's map; what it holds is rebuilt in any case.
void CFreeformPiP::Allocate() {
    const auto pixels = static_cast<size_t>(m_nDestWidth) * static_cast<size_t>(m_nDestHeight);
    if (m_nMapMode == MapMode_Filtered) {
        m_records.clear();
        m_records.resize(pixels * 2);
        m_pSourceMap.reset();
        m_mapEntries = 0;
        return;
    }
    m_records.clear();
    m_records.shrink_to_fit();
    const size_t entries = pixels * EntriesPerPixel();
    if (entries != m_mapEntries) {
        m_pSourceMap.reset();
        m_mapEntries = 0;
        // Pages that no quad touches are never touched here either.
        m_pSourceMap.reset(new uint32_t[entries]);
        m_mapEntries = entries;
    }
}

void CFreeformPiP::BuildSpan(int32_t x, int32_t y, size_t count) {
    if (m_nMapMode == MapMode_Filtered) {
        BuildFiltered(x, y, count);
        return;
    }
    const auto first =
        static_cast<size_t>(y) * static_cast<size_t>(m_nDestWidth) + static_cast<size_t>(x);
    uint32_t* map = m_pSourceMap.get() + first * EntriesPerPixel();
    const bool bilinear = m_nQuadModel == QuadModel_InverseBilinear;
    if (EntriesPerPixel() == 1) {
        if (bilinear) {
            m_pMapRow(map, x, count, m_model.PlanRow(y));
            return;
        }
        for (size_t i = 0; i < count; ++i) {
            map[i] = m_model.WachspressEntry(x + static_cast<double>(i), y);
        }
        return;
    }
    // A regular grid about the pixel, a third of a pixel apart.
    constexpr double kOffsets[] = {-1.0 / 3.0, 0.0, 1.0 / 3.0};
    for (size_t i = 0; i < count; ++i) {
        for (const double dy : kOffsets) {
            for (const double dx : kOffsets) {
                const double px = x + static_cast<double>(i) + dx;
                *map++ = bilinear ? m_model.InverseBilinearEntry(px, y + dy)
                                  : m_model.WachspressEntry(px, y + dy);
            }
        }
    }
}

void CFreeformPiP::BuildFiltered(int32_t x, int32_t y, size_t count) {
    const auto first =
        static_cast<size_t>(y) * static_cast<size_t>(m_nDestWidth) + static_cast<size_t>(x);
    for (size_t i = 0; i < count; ++i) {
        const double px = x + static_cast<double>(i);
        const QuadPoint point = m_nQuadModel == QuadModel_InverseBilinear
                                    ? m_model.InverseBilinearPoint(px, y)
                                    : m_model.WachspressPoint(px, y);
        ContributionRecord* records = m_records.data() + (first + i) * 2;
        records[0].reset();
        records[1].reset();
        if (point.inside) {
            records[0] = MakeContribution(*m_pFilter, static_cast<float>(point.u), point.scaleU,
                                          m_nSourceWidth);
            records[1] = MakeContribution(*m_pFilter, static_cast<float>(point.v), point.scaleV,
                                          m_nSourceHeight);
        }
    }
}

void CFreeformPiP::RenderSpan(uint8_t* row, int32_t x, int32_t y, size_t count) {
    uint8_t* dst = row + ptrdiff_t{4} * x;
    const auto first =
        static_cast<size_t>(y) * static_cast<size_t>(m_nDestWidth) + static_cast<size_t>(x);
    if (m_renderer == Renderer::Picture && m_nMapMode == MapMode_Filtered) {
        RenderFiltered(dst, m_records.data() + first * 2, count, m_picture);
        return;
    }
    const uint32_t* map = m_pSourceMap.get() + first * EntriesPerPixel();
    if (m_renderer == Renderer::Checkerboard) {
        RenderChecker(dst, map, count);
        return;
    }
    switch (m_nMapMode) {
    case MapMode_Nearest:
        RenderNearest(dst, map, count, m_picture);
        break;
    case MapMode_GridNearest:
        RenderGridNearest(dst, map, count, m_picture);
        break;
    case MapMode_GridBilinear:
        RenderGridBilinear(dst, map, count, m_picture);
        break;
    case MapMode_Bilinear:
        m_pSampleRow(dst, map, count, m_picture);
        break;
    default:
        break;
    }
}

} // namespace kyv
