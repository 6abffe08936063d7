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

// Shapes of one frame: first all Adds, in any order and overlapping as they like, then Finish.
// Memory is kept from one Begin to the next.
class CSpanRows {
public:
    void Begin(int32_t rows);
    // Columns first to last of row y, both inside; 0 <= y < rows.
    void Add(int32_t y, int32_t first, int32_t last) { m_added.push_back({y, {first, last + 1}}); }
    void Finish();

    // Empty for a row outside the frame.
    std::span<const Run> Row(int32_t y) const;
    // About all runs; empty without any.
    const PixelBox& Bounds() const { return m_bounds; }

private:
    struct Added {
        int32_t y;
        Run run;
    };

    std::vector<Added> m_added;
    std::vector<uint32_t> m_starts; // of each row in m_runs, with the end of the last
    Runs m_runs;
    PixelBox m_bounds = {};
};

} // namespace kyv
