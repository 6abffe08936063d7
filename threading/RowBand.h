// A frame's rows in bands, one job a band.
#pragma once

#include <cstdint>

#include "threading/ThreadPool.h"

namespace kyv {

struct RowBand {
    void* owner; // the render state that all bands share
    int32_t firstRow;
    int32_t endRow; // exclusive
};
static_assert(sizeof(RowBand) == 16);

// Band index of count, 0 <= index < count, of a frame of that many rows: from index * rows / count
// to (index * rows + rows) / count, so that the bands tile the frame.
RowBand BandOfRows(void* owner, int32_t index, int32_t count, int32_t rows);

// Splits the rows into one band for every thread that the host grants, at most one a row, and runs
// the function once for each on the pool with a RowBand as its argument. Returns when all are
// done; what they return or throw is ignored. A band that the pool cannot take runs on the calling
// thread.
void RunRowBands(CThreadPool& pool, uint32_t threads, int32_t rows, JobFunction function,
                 void* owner);

} // namespace kyv
