// Scaling whole images: bilinear, row pick and four-tap.
#include <algorithm>
#include <cstring>

#include "imageutility/CubicWeights.h"
#include "imageutility/ImageUtility.h"
#include "imageutility/ResizeSteps.h"
#include "imageutility/RowWalk.h"
#include "imageutility/kernels/Bilinear.h"
#include "imageutility/kernels/ColorMath.h"
#include "platform/PageMemory.h"

namespace KYVImageUtility {
namespace {

// --- Bilinear

struct BilinearScratch {
    explicit BilinearScratch(uint8_t* data, int32_t width, int32_t height) : layout(data) {
        const auto columns = static_cast<size_t>(width);
        columnSteps = layout.Take<uint32_t>(columns + 1);
        rowSteps = layout.Take<uint32_t>(static_cast<size_t>(height) + 1);
        left = layout.Take<int32_t>(columns);
        weights = layout.Take<uint8_t>(columns * 2);
        shuffles = layout.Take<uint8_t>(columns * 8);
        rows[0] = layout.Take<uint8_t>(columns * 4);
        rows[1] = layout.Take<uint8_t>(columns * 4);
    }

    kyv::CScratchLayout layout;
    uint32_t* columnSteps;
    uint32_t* rowSteps;
    int32_t* left;
    uint8_t* weights;
    uint8_t* shuffles;
    uint8_t* rows[2]; // source rows at the destination's width
};

// Source rows at the destination's width. Rows are asked for from top to bottom and no two that
// are needed together share a slot, so each is made once.
class CBilinearRows {
public:
    CBilinearRows(const CImageARGB& source, const BilinearScratch& scratch,
                  const kyv::BilinearColumns& columns, int32_t count)
        : m_source(source), m_scratch(scratch), m_columns(columns),
          m_count(static_cast<size_t>(count)), m_form(FormFor(kyv::kBilinear, source)) {}

    const uint8_t* Get(int32_t y) {
        const int slot = y & 1;
        if (m_nRow[slot] != y) {
            m_nRow[slot] = y;
            m_form(m_scratch.rows[slot], m_source.Row(y), m_count, m_columns);
        }
        return m_scratch.rows[slot];
    }

private:
    const CImageARGB& m_source;
    const BilinearScratch& m_scratch;
    const kyv::BilinearColumns& m_columns;
    size_t m_count;
    kyv::BilinearRow m_form;
    int32_t m_nRow[2] = {-1, -1};
};

void ResizeBilinear(const CImageARGB& source, const CImageARGB& destination) {
    const int32_t width = destination.GetWidth();
    const int32_t height = destination.GetHeight();
    const kyv::CPageBlock block(BilinearScratch(nullptr, width, height).layout.GetBytes());
    const BilinearScratch scratch(block.GetData(), width, height);
    BuildResizeSteps(scratch.columnSteps, source.GetWidth(), width);
    BuildResizeSteps(scratch.rowSteps, source.GetHeight(), height);
    // Added up once, so that the row loops need not.
    ExpandResizeSteps(scratch.left, scratch.weights, scratch.columnSteps, width);
    const kyv::BilinearColumns columns = {
        .left = scratch.left,
        .weights = scratch.weights,
        .shuffles = scratch.shuffles,
        .shuffled = BuildResizeShuffles(scratch.shuffles, scratch.left, width, source.GetWidth())};
    CBilinearRows rows(source, scratch, columns, width);
    const kyv::LerpRow lerp = FormFor(kyv::kLerp, source);
    const auto count = static_cast<size_t>(width);
    int32_t upper = 0;
    for (int32_t y = 0; y < height; ++y) {
        const ResizeStep step = UnpackStep(scratch.rowSteps[y]);
        upper += static_cast<int32_t>(step.lower);
        const uint8_t* first = rows.Get(upper);
        const uint8_t* second = step.fraction == 0 ? first : rows.Get(upper + 1);
        lerp(destination.Row(y), first, second, count, step.fraction);
    }
}

// --- Row pick

bool ResizeRowPick(const CImageARGB& source, const CImageARGB& destination) {
    const int32_t height = destination.GetHeight();
    if (source.GetWidth() != destination.GetWidth()) {
        return false;
    }
    kyv::CScratchLayout size;
    size.Take<uint32_t>(static_cast<size_t>(height) + 1);
    const kyv::CPageBlock block(size.GetBytes());
    auto* steps = reinterpret_cast<uint32_t*>(block.GetData());
    BuildResizeSteps(steps, source.GetHeight(), height);
    const size_t rowBytes = static_cast<size_t>(destination.GetWidth()) * 4;
    const int64_t padding = destination.GetPitch() - static_cast<int64_t>(rowBytes);
    int32_t row = 0;
    for (int32_t y = 0; y < height; ++y) {
        row += static_cast<int32_t>(UnpackStep(steps[y]).nearest);
        std::memcpy(destination.Row(y), source.Row(row), rowBytes);
        if (padding > 0) {
            std::memset(destination.Row(y) + rowBytes, 0, static_cast<size_t>(padding));
        }
    }
    return true;
}

// --- Four-tap

struct CubicScratch {
    explicit CubicScratch(uint8_t* data, int32_t width) : layout(data) {
        for (int32_t*& row : rows) {
            row = layout.Take<int32_t>(static_cast<size_t>(width) * 4);
        }
    }

    kyv::CScratchLayout layout;
    int32_t* rows[4]; // source rows at the destination's width, channels in 1/2048
};

// Steps of 1/32 source pixel for each destination pixel, rounded.
int64_t CubicRatio(int32_t source, int32_t destination) {
    return (int64_t{source} * kCubicPhases + destination / 2) / destination;
}

struct CubicPosition {
    CubicPosition(int64_t steps, int32_t length)
        : weights(kCubicWeights[static_cast<size_t>(steps % kCubicPhases)]) {
        // The ratio's rounding can lead beyond the end, and the outer taps lie there anyway: the
        // border pixels are repeated.
        for (size_t i = 0; i < 4; ++i) {
            const int64_t tap = steps / kCubicPhases + static_cast<int64_t>(i) - 1;
            taps[i] = static_cast<int32_t>(std::clamp<int64_t>(tap, 0, length - 1));
        }
    }

    int32_t taps[4];
    const CubicTaps& weights;
};

void CubicRow(int32_t* dst, const uint8_t* src, int32_t width, int32_t sourceWidth) {
    const int64_t ratio = CubicRatio(sourceWidth, width);
    for (int32_t x = 0; x < width; ++x, dst += 4) {
        const CubicPosition position(x * ratio, sourceWidth);
        for (int c = 0; c < 4; ++c) {
            int32_t sum = 0;
            for (size_t i = 0; i < 4; ++i) {
                sum += src[static_cast<ptrdiff_t>(position.taps[i]) * 4 + c] * position.weights[i];
            }
            dst[c] = sum;
        }
    }
}

void ResizeCubic(const CImageARGB& source, const CImageARGB& destination) {
    const int32_t width = destination.GetWidth();
    const kyv::CPageBlock block(CubicScratch(nullptr, width).layout.GetBytes());
    const CubicScratch scratch(block.GetData(), width);
    const int64_t ratio = CubicRatio(source.GetHeight(), destination.GetHeight());
    int32_t cached[4] = {-1, -1, -1, -1};
    const auto channels = static_cast<ptrdiff_t>(width) * 4;
    constexpr int32_t kHalf = 1 << (2 * kCubicShift - 1);
    for (int32_t y = 0; y < destination.GetHeight(); ++y) {
        const CubicPosition position(y * ratio, source.GetHeight());
        const int32_t* rows[4];
        for (size_t i = 0; i < 4; ++i) {
            // Four rows that follow each other never share a slot.
            const int32_t row = position.taps[i];
            const int slot = row & 3;
            if (cached[slot] != row) {
                cached[slot] = row;
                CubicRow(scratch.rows[slot], source.Row(row), width, source.GetWidth());
            }
            rows[i] = scratch.rows[slot];
        }
        uint8_t* out = destination.Row(y);
        for (ptrdiff_t i = 0; i < channels; ++i) {
            const int32_t sum = rows[0][i] * position.weights[0] +
                                rows[1][i] * position.weights[1] +
                                rows[2][i] * position.weights[2] + rows[3][i] * position.weights[3];
            out[i] = kyv::ClampByte((sum + kHalf) >> (2 * kCubicShift));
        }
    }
}

bool HasTwoByTwo(const CImageARGB& image) {
    return image.GetBuffer() && image.GetWidth() >= 2 && image.GetHeight() >= 2;
}

} // namespace

bool CImageARGB::TryResize(CImageARGB& destination, int32_t mode) const {
    if (!HasTwoByTwo(*this) || !HasTwoByTwo(destination)) {
        return false;
    }
    switch (mode) {
    case ResizeMode_Bilinear:
        ResizeBilinear(*this, destination);
        return true;
    case ResizeMode_RowPick:
        return ResizeRowPick(*this, destination);
    case ResizeMode_Cubic:
        ResizeCubic(*this, destination);
        return true;
    default:
        return false;
    }
}

void CImageARGB::Resize(CImageARGB& destination, int32_t mode) const {
    TryResize(destination, mode);
}

} // namespace KYVImageUtility
