// What shapes cover, as runs of columns in every row of a frame.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace kyv {

// A rectangle of pixels; the right column and the bottom row are not part of it.
struct PixelBox {
    int32_t left;
    int32_t top;
    int32_t right;
    int32_t bottom;

    bool IsEmpty() const { return left >= right || top >= bottom; }
    int32_t Width() const { return right - left; }
    int32_t Height() const { return bottom - top; }
    PixelBox Grown(int32_t by) const { return {left - by, top - by, right + by, bottom + by}; }
    PixelBox Moved(int32_t dx, int32_t dy) const {
        return {left + dx, top + dy, right + dx, bottom + dy};
    }
    // Empty where the two do not meet.
    PixelBox CutTo(const PixelBox& other) const {
        return {std::max(left, other.left), std::max(top, other.top), std::min(right, other.right),
                std::min(bottom, other.bottom)};
    }
    // The smallest box about both; an empty one adds nothing.
    PixelBox About(const PixelBox& other) const {
        return IsEmpty() ? other
               : other.IsEmpty()
                   ? *this
                   : PixelBox{std::min(left, other.left), std::min(top, other.top),
                              std::max(right, other.right), std::max(bottom, other.bottom)};
    }
    bool operator==(const PixelBox&) const = default;
};

// Columns from first to before end.
struct Run {
    int32_t first;
    int32_t end;

    bool operator==(const Run&) const = default;
};

// Left to right, with at least a column between any two.
using Runs = std::vector<Run>;

// All columns of either list, and those of the first that are not in the second. The result
// replaces what `out` held; it must be neither of the lists.
void Unite(std::span<const Run> a, std::span<const Run> b, Runs& out);
void Subtract(std::span<const Run> a, std::span<const Run> b, Runs& out);

// What covers each row of a frame. Memory is kept from one Begin to the next.
class CSpanRows {
public:
    void Begin(int32_t rows);
    // Columns first to last of row y, both inside; 0 <= y < rows. In any order, and overlapping as
    // they like.
    void Add(int32_t y, int32_t first, int32_t last);
    // False when the row, 0 <= y < rows, has just these.
    bool Replace(int32_t y, const Runs& runs);

    // Empty for a row outside the frame.
    std::span<const Run> Row(int32_t y) const;
    // About all runs that were added; empty without any.
    const PixelBox& Bounds() const { return m_bounds; }

private:
    std::vector<Runs> m_rows;
    PixelBox m_bounds = {};
};

// About what may be covered in every row: one run, or two with a hole between them that is worth
// leaving out. For windows of rows it is told by blocks of rows, at once and never too little.
class CRowExtents {
public:
    void Begin(int32_t rows);
    // Rows are given in order, each once.
    void Add(int32_t y, std::span<const Run> runs);

    // take(first, end) for the columns within `cut` that the pixels of the rows y - radius to
    // y + radius reach, radius columns to either side. Two runs lie more than radius columns apart.
    template <class Take>
    void ForWindow(int32_t y, int32_t radius, Run cut, Take&& take) const {
        constexpr int32_t kWorthLeaving = 64; // columns
        const Extent window = Window(y - radius, y + radius);
        Run runs[2] = {{window.hull.first - radius, window.hull.end + radius}, {0, 0}};
        if (window.hole.end - window.hole.first >= 3 * radius + kWorthLeaving) {
            runs[1] = {window.hole.end - radius, runs[0].end};
            runs[0].end = window.hole.first + radius;
        }
        for (const Run& run : runs) {
            const int32_t first = std::max(run.first, cut.first);
            const int32_t end = std::min(run.end, cut.end);
            if (first < end) {
                take(first, end);
            }
        }
    }

private:
    static constexpr int32_t kBlockRows = 8;
    static constexpr int32_t kFar = 1 << 28;

    struct Extent {
        Run hull = {kFar, -kFar};
        Run hole = {-kFar, kFar};

        void Include(const Extent& other);
    };

    Extent Window(int32_t from, int32_t to) const;

    std::vector<Extent> m_blocks;
};

} // namespace kyv
