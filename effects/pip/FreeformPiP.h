// Draws a picture into a quad of the frame.
//
// A map holds the position in the picture of every pixel of the quad. It is kept from frame to
// frame and rebuilt only when something it depends on has changed; drawing reads the picture
// through it. Entries are 10.6 fixed point in 16 bits, so of a larger picture only the first 1024
// columns and rows are reached, and what lies beyond wraps round to them.
//
// A wide map is told in addition which 1024 columns and rows those are, for runs of pixels.
//
// Drawing goes row by row, by whole spans of pixels. All that the process shares is which object is
// the current one; drawing does not look at it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "effects/pip/QuadMapRow.h"
#include "effects/pip/QuadModel.h"
#include "effects/pip/QuadSampleRow.h"
#include "effects/pip/Rasterizer.h"
#include "effects/pip/ResampleFilter.h"
#include "effects/pip/SpanRows.h"
#include "imageutility/ImageUtility.h"

namespace kyv {

class CFreeformPiP {
public:
    enum : int32_t {
        QuadModel_Wachspress = 0, // any value but 1
        QuadModel_InverseBilinear = 1,

        MapMode_Nearest = 0,
        MapMode_GridNearest = 1, // 3 x 3 samples a pixel
        MapMode_Bilinear = 2,
        MapMode_GridBilinear = 3,
        MapMode_Filtered = 4,
    };

    // Becomes the current object. Inverse bilinear, bilinear, Lanczos3.
    CFreeformPiP();
    // An object that is current leaves none behind.
    virtual ~CFreeformPiP();

    CFreeformPiP(const CFreeformPiP&) = delete;
    CFreeformPiP& operator=(const CFreeformPiP&) = delete;

    // In pixels, all at least 1, or there is no size and Render does nothing.
    void SetSize(int32_t sourceWidth, int32_t sourceHeight, int32_t destWidth, int32_t destHeight);

    // The first `count` corners of the picture or of the quad in the frame, which correspond in
    // order; limited to +-kFarthestPoint. 1, or 0 with nothing changed for more than 4, fewer than
    // 0 or a null pointer. Points that equal the present ones keep the map.
    int32_t SetSourcePoints(const RasterPoint* points, int32_t count);
    int32_t SetDestPoints(const RasterPoint* points, int32_t count);

    // These always have the map rebuilt. A filter index outside 0 to 4 keeps the present filter; an
    // unknown mode draws nothing.
    void SetQuadModel(int32_t model);
    void SetMapMode(int32_t mode);
    void SetFilterIndex(int32_t index);
    // A map for pictures of any size, in modes 0 and 2. Without it entries address 1024 columns and
    // rows.
    void SetWide(bool wide);
    // Stored, and nothing more.
    void SetOption(int32_t option) { m_nOption = option; }
    int32_t GetOption() const { return m_nOption; }

    // Draws the picture's quad. The map is that of the position moved to the nearest one in the
    // frame, and so are the pixels drawn: a quad that lies outside marks the frame's edge. Whoever
    // wants nothing of such a quad does not call. Returns 0, with nothing drawn, without a size or
    // when an image has no pixels or another size, else 1. Throws std::bad_alloc. The images must
    // not overlap.
    int32_t Render(const KYVImageUtility::CImageARGB& source,
                   KYVImageUtility::CImageARGB& destination);

    // The same row by row at the source's level: BeginRows, false where Render returns 0, then
    // DrawRow once for every row that has pixels, with the first pixel of the frame's row, then
    // EndRows. Without EndRows the map counts as not built.
    bool BeginRows(const KYVImageUtility::CImageARGB& source);
    void DrawRow(int32_t y, uint8_t* row);
    void EndRows() { m_bDirty = false; }
    // The pixels of the quad, after BeginRows.
    const CSpanRows& Spans() const { return m_spans; }

    // The quad as a checkerboard, to show the map. Needs a map of one entry a pixel, so it returns
    // 0 in modes 1, 3 and 4.
    int32_t RenderCheckerboard(KYVImageUtility::CImageARGB& destination);

    // The map must be rebuilt before the next drawing.
    bool IsDirty() const { return m_bDirty; }
    // Entries by row of the frame, nine a pixel in modes 1 and 3; valid inside the quad after a
    // drawing, null before the first. Mode 4 keeps none.
    const uint32_t* SourceMap() const { return m_pSourceMap.get(); }

    // The last object that was constructed or has rendered a whole image; null when that is gone.
    static CFreeformPiP* Current();

private:
    // A run of pixels whose entries address the same 1024 columns and rows of the picture.
    struct TileRun {
        Run run;
        uint32_t tile; // column in the low 16 bits, row in the high ones, in tiles
    };

    int32_t StorePoints(const RasterPoint* points, int32_t count, RasterPoint (&stored)[4]);
    bool IsDestination(const KYVImageUtility::CImageARGB& image) const;
    int32_t DrawOn(KYVImageUtility::CImageARGB& destination);
    void Prepare(InstructionSet set);
    void Allocate();
    size_t EntriesPerPixel() const;
    size_t PixelIndex(int32_t x, int32_t y) const;
    void FindTiles(const Run& run, int32_t y, std::vector<TileRun>& tiles);
    void BuildEntries(uint32_t* map, const Run& run, int32_t y, double scale) const;
    QuadPoint PointAt(double x, double y) const;
    void BuildRun(const Run& run, int32_t y);
    void BuildFiltered(const Run& run, int32_t y);
    void RenderRun(uint8_t* dst, const Run& run, int32_t y, const SamplePicture& picture) const;

    static constexpr int32_t kPointLimit = 4;

    int32_t m_nSourceWidth = 0;
    int32_t m_nSourceHeight = 0;
    int32_t m_nDestWidth = 0;
    int32_t m_nDestHeight = 0;
    RasterPoint m_destPoints[kPointLimit] = {};
    RasterPoint m_sourcePoints[kPointLimit] = {};
    bool m_bDirty = true;
    int32_t m_nQuadModel = QuadModel_InverseBilinear;
    int32_t m_nMapMode = MapMode_Bilinear;
    int32_t m_nOption = 0;
    bool m_bWide = false;
    const ResampleFilter* m_pFilter;
    CQuadModel m_model;
    std::unique_ptr<uint32_t[]> m_pSourceMap;
    size_t m_mapEntries = 0;
    std::vector<ContributionRecord> m_records; // mode 4: horizontal and vertical, by pixel
    CSpanRows m_spans;
    std::vector<std::vector<TileRun>> m_tiles; // by row of the frame
    std::vector<uint32_t> m_tileRow;           // entries whose whole part is a tile

    // While drawing: what to read, null for a checkerboard, and with which forms.
    SamplePicture m_picture = {};
    QuadMapRow m_pMapRow = nullptr;
    QuadSampleRow m_pSampleRow = nullptr;
};

} // namespace kyv
