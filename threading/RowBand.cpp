// Splitting a frame and waiting for its bands.
#include "threading/RowBand.h"

#include <algorithm>
#include <vector>

namespace kyv {
namespace {

// Far more than there are threads. Finding a job takes time in proportion to their number, which a
// frame of a million rows would feel if it had a million bands.
constexpr uint32_t kMaxBands = 4096;

} // namespace

RowBand BandOfRows(void* owner, int32_t index, int32_t count, int32_t rows) {
    const int64_t start = int64_t{index} * rows;
    return {owner, static_cast<int32_t>(start / count),
            static_cast<int32_t>((start + rows) / count)};
}

void RunRowBands(CThreadPool& pool, uint32_t threads, int32_t rows, JobFunction function,
                 void* owner) {
    if (rows <= 0) {
        return;
    }
    const uint32_t count =
        std::clamp(threads, 1U, std::min(static_cast<uint32_t>(rows), kMaxBands));
    struct Job {
        RowBand band;
        uint32_t id;
        bool queued;
    };
    std::vector<Job> jobs(count);
    for (uint32_t i = 0; i < count; ++i) {
        Job& job = jobs[i];
        job.band = BandOfRows(owner, static_cast<int32_t>(i), static_cast<int32_t>(count), rows);
        job.queued = pool.QueueJob(function, &job.band, &job.id) == kOk;
    }
    for (Job& job : jobs) {
        if (job.queued) {
            uint32_t result;
            pool.WaitJob(job.id, kInfinite, &result);
        } else {
            // The other bands may be at work on this list, so nothing leaves before they are done.
            try {
                function(&job.band);
            } catch (...) {
                continue; // as a job's failure is ignored
            }
        }
    }
}

} // namespace kyv
