// Bands of rows.
#include <atomic>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "threading/RowBand.h"

namespace {

using namespace kyv;
using testing::ElementsAre;
using testing::Pair;

std::vector<std::pair<int32_t, int32_t>> Bands(int32_t count, int32_t rows) {
    std::vector<std::pair<int32_t, int32_t>> bands;
    for (int32_t i = 0; i < count; ++i) {
        const RowBand band = BandOfRows(nullptr, i, count, rows);
        bands.emplace_back(band.firstRow, band.endRow);
    }
    return bands;
}

TEST(RowBand, BandsTileTheFrame) {
    EXPECT_THAT(Bands(3, 10), ElementsAre(Pair(0, 3), Pair(3, 6), Pair(6, 10)));
    EXPECT_THAT(Bands(4, 1080),
                ElementsAre(Pair(0, 270), Pair(270, 540), Pair(540, 810), Pair(810, 1080)));
    EXPECT_THAT(Bands(3, 2), ElementsAre(Pair(0, 0), Pair(0, 1), Pair(1, 2)));
}

TEST(RowBand, EveryRowIsWorkedOnOnceWhateverTheNumberOfThreads) {
    struct Rows {
        std::vector<std::atomic<int>> visits;
        std::atomic<int> bands = 0;
        static uint32_t Run(void* argument) {
            const auto* band = static_cast<const RowBand*>(argument);
            auto* self = static_cast<Rows*>(band->owner);
            ++self->bands;
            for (int32_t y = band->firstRow; y < band->endRow; ++y) {
                ++self->visits[static_cast<size_t>(y)];
            }
            return kFail; // is ignored
        }
    };
    CThreadPool pool;
    for (const auto& [threads, rows, bands] :
         std::initializer_list<std::tuple<uint32_t, int32_t, int>>{{0, 7, 1},
                                                                   {1, 7, 1},
                                                                   {2, 7, 2},
                                                                   {7, 7, 7},
                                                                   {8, 7, 7},
                                                                   {0xFFFFFFFF, 7, 7},
                                                                   {0xFFFFFFFF, 100000, 4096},
                                                                   {4, 0, 0},
                                                                   {4, -3, 0}}) {
        Rows state = {.visits = std::vector<std::atomic<int>>(rows > 0 ? rows : 0)};
        RunRowBands(pool, threads, rows, Rows::Run, &state);
        EXPECT_EQ(state.bands, bands) << threads << " on " << rows;
        for (const auto& visits : state.visits) {
            ASSERT_EQ(visits, 1);
        }
    }
}

} // namespace
