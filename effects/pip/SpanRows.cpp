// Runs of columns: collecting and combining them.
#include "effects/pip/SpanRows.h"

namespace kyv {
void Unite(std::span<const Run> a, std::span<const Run> b, Runs& out) {
    out.clear();
    for (size_t i = 0, j = 0; i < a.size() || j < b.size();) {
        const bool takeA = j == b.size() || (i < a.size() && a[i].first <= b[j].first);
        const Run run = takeA ? a[i++] : b[j++];
        if (!out.empty() && run.first <= out.back().end) {
            out.back().end = std::max(out.back().end, run.end);
        } else {
            out.push_back(run);
        }
    }
}

void Subtract(std::span<const Run> a, std::span<const Run> b, Runs& out) {
    out.clear();
    size_t j = 0;
    for (Run run : a) {
        while (j < b.size() && b[j].end <= run.first) {
            ++j;
        }
        // One that reaches beyond this run may reach into the next.
        for (size_t k = j; k < b.size() && b[k].first < run.end; ++k) {
            if (b[k].first > run.first) {
                out.push_back({run.first, b[k].first});
            }
            run.first = b[k].end;
        }
        if (run.first < run.end) {
            out.push_back(run);
        }
    }
}

void CSpanRows::Begin(int32_t rows) {
    m_rows.resize(static_cast<size_t>(rows));
    for (Runs& row : m_rows) {
        row.clear();
    }
    m_bounds = {};
}

void CSpanRows::Add(int32_t y, int32_t first, int32_t last) {
    Runs& row = m_rows[static_cast<size_t>(y)];
    Run run = {first, last + 1};
    const auto from = std::lower_bound(row.begin(), row.end(), first,
                                       [](const Run& a, int32_t column) { return a.end < column; });
    auto to = from;
    for (; to != row.end() && to->first <= run.end; ++to) {
        run = {std::min(run.first, to->first), std::max(run.end, to->end)};
    }
    if (from == to) {
        row.insert(from, run);
    } else {
        *from = run;
        row.erase(from + 1, to);
    }
    m_bounds = m_bounds.About({first, y, last + 1, y + 1});
}

bool CSpanRows::Replace(int32_t y, const Runs& runs) {
    Runs& row = m_rows[static_cast<size_t>(y)];
    if (row == runs) {
        return false;
    }
    row = runs;
    return true;
}

std::span<const Run> CSpanRows::Row(int32_t y) const {
    const bool inside = y >= 0 && static_cast<size_t>(y) < m_rows.size();
    return inside ? std::span<const Run>(m_rows[static_cast<size_t>(y)]) : std::span<const Run>();
}

void CRowExtents::Extent::Include(const Extent& other) {
    hull = {std::min(hull.first, other.hull.first), std::max(hull.end, other.hull.end)};
    hole = {std::max(hole.first, other.hole.first), std::min(hole.end, other.hole.end)};
}

void CRowExtents::Begin(int32_t rows) {
    m_blocks.assign(static_cast<size_t>(rows + kBlockRows - 1) / kBlockRows, Extent());
}

void CRowExtents::Add(int32_t y, std::span<const Run> runs) {
    if (runs.empty()) {
        return;
    }
    Run hole = {0, 0};
    for (size_t i = 1; i < runs.size(); ++i) {
        if (runs[i].first - runs[i - 1].end > hole.end - hole.first) {
            hole = {runs[i - 1].end, runs[i].first};
        }
    }
    Extent& block = m_blocks[static_cast<size_t>(y / kBlockRows)];
    block.Include({{runs.front().first, runs.back().end}, hole});
}

CRowExtents::Extent CRowExtents::Window(int32_t from, int32_t to) const {
    Extent window;
    const auto last = std::min(static_cast<size_t>(to / kBlockRows) + 1, m_blocks.size());
    for (auto i = static_cast<size_t>(std::max(from, 0) / kBlockRows); i < last; ++i) {
        window.Include(m_blocks[i]);
    }
    // Without any pixels the hull has no columns, whatever it is cut to.
    return window.hull.first < window.hull.end ? window : Extent{{kFar, -kFar}, {0, 0}};
}

} // namespace kyv
