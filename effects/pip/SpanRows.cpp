// Runs of columns: collecting and combining them.
#include "effects/pip/SpanRows.h"

namespace kyv {
namespace {

// Appends a run that begins no further left than those before it; from `floor` on they are of the
// same row.
void Append(Runs& runs, size_t floor, Run run) {
    if (runs.size() > floor && run.first <= runs.back().end) {
        runs.back().end = std::max(runs.back().end, run.end);
    } else {
        runs.push_back(run);
    }
}

} // namespace

void Unite(std::span<const Run> a, std::span<const Run> b, Runs& out) {
    out.clear();
    for (size_t i = 0, j = 0; i < a.size() || j < b.size();) {
        const bool takeA = j == b.size() || (i < a.size() && a[i].first <= b[j].first);
        Append(out, 0, takeA ? a[i++] : b[j++]);
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
    m_added.clear();
    m_runs.clear();
    m_starts.assign(static_cast<size_t>(rows) + 1, 0);
    m_bounds = {};
}

void CSpanRows::Finish() {
    // By row first, in the order of addition, then within each row.
    for (const Added& added : m_added) {
        ++m_starts[static_cast<size_t>(added.y)];
    }
    uint32_t end = 0;
    for (uint32_t& start : m_starts) {
        end += start;
        start = end;
    }
    m_runs.resize(m_added.size());
    for (const Added& added : m_added) {
        m_runs[--m_starts[static_cast<size_t>(added.y)]] = added.run;
    }
    size_t kept = 0;
    for (size_t y = 0; y + 1 < m_starts.size(); ++y) {
        const auto first = m_runs.begin() + m_starts[y];
        const auto last = m_runs.begin() + m_starts[y + 1];
        std::sort(first, last, [](const Run& a, const Run& b) { return a.first < b.first; });
        const size_t row = kept;
        for (auto run = first; run != last; ++run) {
            if (kept > row && run->first <= m_runs[kept - 1].end) {
                m_runs[kept - 1].end = std::max(m_runs[kept - 1].end, run->end);
            } else {
                m_runs[kept++] = *run;
            }
        }
        m_starts[y] = static_cast<uint32_t>(row);
        if (kept > row) {
            const auto top = static_cast<int32_t>(y);
            m_bounds = m_bounds.About({m_runs[row].first, top, m_runs[kept - 1].end, top + 1});
        }
    }
    m_starts.back() = static_cast<uint32_t>(kept);
    m_runs.resize(kept);
}

std::span<const Run> CSpanRows::Row(int32_t y) const {
    if (y < 0 || static_cast<size_t>(y) + 1 >= m_starts.size()) {
        return {};
    }
    const size_t row = static_cast<size_t>(y);
    return {m_runs.data() + m_starts[row], m_starts[row + 1] - m_starts[row]};
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
