// Box blur. A vector of sums holds kBlocks columns or pixels in order, 32 bits a channel.
#include "imageutility/kernels/BoxBlur.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

constexpr size_t kStep = 2 * kBlocks; // columns that a vector of words holds

// kStep columns.
struct Columns {
    Vec near, far;
};

inline Vec LoadSums(const uint16_t* sums) {
    return LoadWords32(sums);
}

inline Vec LoadSums(const uint32_t* sums) {
    return Load(sums);
}

inline Columns Widen(Vec words) {
    return {ExtendLowS16(words), ExtendHighS16(words)};
}

// What kStep columns have more than others.
inline Columns Difference(const uint16_t* sums, const uint16_t* others) {
    return Widen(Sub16(Load(sums), Load(others)));
}

inline Columns Difference(const uint32_t* sums, const uint32_t* others) {
    return {Sub32(Load(sums), Load(others)), Sub32(Load(sums + kPixels), Load(others + kPixels))};
}

// Moves the sums of kStep columns down and gives their difference from those at gone.
inline Columns Slide(uint16_t* sums, const uint8_t* enter, const uint8_t* leave,
                     const uint16_t* gone) {
    const Vec sum = Sub16(Add16(Load(sums), LoadBytes16(enter)), LoadBytes16(leave));
    Store(sums, sum);
    return Widen(Sub16(sum, Load(gone)));
}

inline Columns Slide(uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                     const uint32_t* gone) {
    const Columns change = Widen(Sub16(LoadBytes16(enter), LoadBytes16(leave)));
    const Vec near = Add32(Load(sums), change.near);
    const Vec far = Add32(Load(sums + kPixels), change.far);
    Store(sums, near);
    Store(sums + kPixels, far);
    return {Sub32(near, Load(gone)), Sub32(far, Load(gone + kPixels))};
}

inline void SlideRest(uint16_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    BoxColumns16_scalar(sums, enter, leave, count);
}

inline void SlideRest(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    BoxColumns32_scalar(sums, enter, leave, count);
}

template <class Sum>
void SlideColumns(Sum* sums, const uint8_t* enter, const uint8_t* leave, size_t begin, size_t end) {
    size_t i = begin;
    for (; i + kStep <= end; i += kStep) {
        Slide(sums + i * 4, enter + i * 4, leave + i * 4, sums + i * 4);
    }
    SlideRest(sums + i * 4, enter + i * 4, leave + i * 4, end - i);
}

// How kBlocks pixels' sums become averages, from pixel i on. The header tells why they are exact.
struct SmallArea {
    explicit SmallArea(int32_t area) : reciprocal(SplatF32(1.0F / static_cast<float>(area))) {}

    Vec Divide(Vec sums, size_t) const {
        return TruncateF32(MulF32(AddF32(F32FromS32(sums), SplatF32(0.5F)), reciprocal));
    }

    Floats reciprocal;
};

// With a reciprocal of 32 digits in place of a float.
struct LargeArea {
    explicit LargeArea(int32_t area) {
        const AreaReciprocal reciprocal = ReciprocalOf(area);
        factor = Splat32(reciprocal.factor);
        shift = reciprocal.shift;
    }

    Vec Divide(Vec sums, size_t) const { return ShiftRightBy32(MulHighU32(sums, factor), shift); }

    Vec factor;
    int shift;
};

inline Vec DivideByScale(Vec sums, Vec areas, Floats scales) {
    const Vec q = TruncateF32(MulF32(F32FromS32(sums), scales));
    const Vec rest = Sub32(sums, MulLow32(q, areas));
    // One more, unless the area is above the remainder.
    return Add32(q, Add32(GreaterS32(areas, rest), Splat32(1)));
}

// Windows that end at a border: each pixel has its own area.
struct VaryingArea {
    explicit VaryingArea(const BoxWindows& boxes)
        : windows(boxes), rows(Splat32(static_cast<uint32_t>(boxes.rows))),
          rowScale(SplatF32(RowScale(boxes.rows))) {}

    Vec Divide(Vec sums, size_t i) const {
        const Vec areas = MulLow32(SpreadOverBlocks32(windows.columns + i), rows);
        const Floats scales = AsFloats(SpreadOverBlocks32(windows.reciprocals + i));
        return DivideByScale(sums, areas, MulF32(scales, rowScale));
    }

    const BoxWindows& windows;
    Vec rows;
    Floats rowScale;
};

// A window that moves to the right, and its sum.
template <class Sum>
struct Sliding {
    Sliding(Sum* sums, int32_t radius) {
        const auto reach = static_cast<ptrdiff_t>(radius) * 4;
        enter = sums + reach;
        leave = sums - reach - 4;
        // Of the window that lies one pixel further left, whose first column is outside.
        Vec columns = Zero();
        const Sum* p = sums - reach;
        for (; p + kPixels <= enter; p += kPixels) {
            columns = Add32(columns, LoadSums(p));
        }
        total = SumOfBlocks32(columns);
        for (; p < enter; p += 4) {
            total = AddBlocks32(total, LoadColumn(p));
        }
    }

    // The sum of the next window.
    Block Next() {
        total = AddBlocks32(total, SubBlocks32(LoadColumn(enter), LoadColumn(leave)));
        enter += 4;
        leave += 4;
        return total;
    }

    static Block LoadColumn(const uint16_t* sums) { return LoadBlockWords32(sums); }
    static Block LoadColumn(const uint32_t* sums) { return LoadBlock(sums); }

    Sum* enter;
    const Sum* leave;
    Block total;
};

// kPixels averages from kBlocks changes of the window's sum each.
template <class Sum, class Area>
inline void StoreAverages(uint8_t* dst, Sliding<Sum>& sliding, Columns first, Columns second,
                          size_t i, const Area& area) {
    const Vec a = area.Divide(RunningSums32(sliding.total, first.near), i);
    const Vec b = area.Divide(RunningSums32(sliding.total, first.far), i + kBlocks);
    const Vec c = area.Divide(RunningSums32(sliding.total, second.near), i + 2 * kBlocks);
    const Vec d = area.Divide(RunningSums32(sliding.total, second.far), i + 3 * kBlocks);
    Store(dst + i * 4, InOrder32(PackU16(PackS32(a, b), PackS32(c, d))));
}

// Pixels from begin on, kPixels at a time; returns where it stopped.
template <class Sum, class Area>
size_t Average(uint8_t* dst, Sliding<Sum>& sliding, size_t begin, size_t end, const Area& area) {
    size_t i = begin;
    for (; i + kPixels <= end; i += kPixels) {
        const Columns first = Difference(sliding.enter, sliding.leave);
        const Columns second = Difference(sliding.enter + 4 * kStep, sliding.leave + 4 * kStep);
        sliding.enter += 4 * kPixels;
        sliding.leave += 4 * kPixels;
        StoreAverages(dst, sliding, first, second, i, area);
    }
    return i;
}

// The same, and the columns that enter the windows move down on the way, while they are at hand.
template <class Sum, class Area>
size_t SlideAndAverage(uint8_t* dst, Sliding<Sum>& sliding, const uint8_t* enter,
                       const uint8_t* leave, size_t begin, size_t end, const Area& area) {
    size_t i = begin;
    for (; i + kPixels <= end; i += kPixels) {
        const size_t at = i * 4;
        const Columns first = Slide(sliding.enter, enter + at, leave + at, sliding.leave);
        const Columns second = Slide(sliding.enter + 4 * kStep, enter + at + 4 * kStep,
                                     leave + at + 4 * kStep, sliding.leave + 4 * kStep);
        sliding.enter += 4 * kPixels;
        sliding.leave += 4 * kPixels;
        StoreAverages(dst, sliding, first, second, i, area);
    }
    return i;
}

// Windows at a border, or what is left of the whole ones.
template <class Sum>
void AverageEdge(uint8_t* dst, Sliding<Sum>& sliding, size_t begin, size_t end,
                 const BoxWindows& windows) {
    for (size_t i = Average(dst, sliding, begin, end, VaryingArea(windows)); i < end; ++i) {
        const int32_t area = windows.columns[i] * windows.rows;
        StorePixel32(dst + i * 4,
                     DivideByScale(Repeat(sliding.Next()), Splat32(static_cast<uint32_t>(area)),
                                   SplatF32(windows.reciprocals[i] * RowScale(windows.rows))));
    }
}

// With a smaller radius a sum would be read again before its store has left the processor's buffer,
// which costs more than reading all sums twice.
constexpr size_t kNarrow = 2 * kPixels;

template <class Sum>
void Blur(uint8_t* dst, Sum* sums, const uint8_t* enter, const uint8_t* leave, size_t count,
          const BoxWindows& windows) {
    const auto radius = static_cast<size_t>(windows.radius);
    const size_t left = radius < count ? radius : count;
    const size_t right = left + radius < count ? count - radius : left;
    const bool isNarrow = radius < kNarrow;
    // What the windows at the left border reach; the whole ones move the rest.
    size_t moved = isNarrow || left == right ? count : left + radius;
    SlideColumns(sums, enter, leave, 0, moved);
    Sliding<Sum> sliding(sums, windows.radius);
    AverageEdge(dst, sliding, 0, left, windows);
    size_t done = left;
    const auto averageWhole = [&](const auto& area) {
        if (isNarrow) {
            done = Average(dst, sliding, left, right, area);
        } else {
            done = SlideAndAverage(dst, sliding, enter + radius * 4, leave + radius * 4, left,
                                   right, area);
            moved = done + radius;
        }
    };
    if (left < right) {
        const int32_t area = windows.columns[left] * windows.rows;
        if (area <= kSmallArea) {
            averageWhole(SmallArea(area));
        } else {
            averageWhole(LargeArea(area));
        }
    }
    SlideColumns(sums, enter, leave, moved, count);
    AverageEdge(dst, sliding, done, count, windows);
}

} // namespace

void BoxColumns16(uint16_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    SlideColumns(sums, enter, leave, 0, count);
}

void BoxColumns32(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    SlideColumns(sums, enter, leave, 0, count);
}

void BoxBlur16(uint8_t* dst, uint16_t* sums, const uint8_t* enter, const uint8_t* leave,
               size_t count, const BoxWindows& windows) {
    Blur(dst, sums, enter, leave, count, windows);
}

void BoxBlur32(uint8_t* dst, uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
               size_t count, const BoxWindows& windows) {
    Blur(dst, sums, enter, leave, count, windows);
}

} // namespace kyv::KYV_VECTOR_SET
