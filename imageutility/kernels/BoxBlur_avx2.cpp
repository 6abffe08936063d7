// Box blur with AVX2.
#include "imageutility/kernels/BoxBlur.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Two columns, 32 bits a channel.
inline __m256i LoadPair(const uint16_t* sums) {
    return _mm256_cvtepu16_epi32(_mm_loadu_si128(reinterpret_cast<const __m128i*>(sums)));
}

inline __m256i LoadPair(const uint32_t* sums) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(sums));
}

// Four pixels, 16 bits a channel.
inline __m256i LoadWords(const uint8_t* bytes) {
    return _mm256_cvtepu8_epi16(_mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes)));
}

struct TwoPairs {
    __m256i first, second;
};

inline TwoPairs Widen(__m256i words) {
    return {_mm256_cvtepi16_epi32(_mm256_castsi256_si128(words)),
            _mm256_cvtepi16_epi32(_mm256_extracti128_si256(words, 1))};
}

inline __m256i LoadFour(const uint16_t* sums) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(sums));
}

// What four columns have more than four others, 32 bits a channel.
inline TwoPairs Difference(const uint16_t* sums, const uint16_t* others) {
    return Widen(_mm256_sub_epi16(LoadFour(sums), LoadFour(others)));
}

inline TwoPairs Difference(const uint32_t* sums, const uint32_t* others) {
    return {_mm256_sub_epi32(LoadPair(sums), LoadPair(others)),
            _mm256_sub_epi32(LoadPair(sums + 8), LoadPair(others + 8))};
}

// Moves the sums of four columns down and gives their difference from those at gone.
inline TwoPairs SlideFour(uint16_t* sums, const uint8_t* enter, const uint8_t* leave,
                          const uint16_t* gone) {
    auto* out = reinterpret_cast<__m256i*>(sums);
    const __m256i sum = _mm256_sub_epi16(
        _mm256_add_epi16(_mm256_loadu_si256(out), LoadWords(enter)), LoadWords(leave));
    _mm256_storeu_si256(out, sum);
    return Widen(_mm256_sub_epi16(sum, _mm256_loadu_si256(reinterpret_cast<const __m256i*>(gone))));
}

inline TwoPairs SlideFour(uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                          const uint32_t* gone) {
    const TwoPairs change = Widen(_mm256_sub_epi16(LoadWords(enter), LoadWords(leave)));
    const __m256i first = _mm256_add_epi32(LoadPair(sums), change.first);
    const __m256i second = _mm256_add_epi32(LoadPair(sums + 8), change.second);
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(sums), first);
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(sums + 8), second);
    return {_mm256_sub_epi32(first, LoadPair(gone)), _mm256_sub_epi32(second, LoadPair(gone + 8))};
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
    for (; i + 4 <= end; i += 4) {
        SlideFour(sums + i * 4, enter + i * 4, leave + i * 4, sums + i * 4);
    }
    SlideRest(sums + i * 4, enter + i * 4, leave + i * 4, end - i);
}

// How two pixels' sums become averages, from pixel i on. The header tells why they are exact.
struct SmallArea {
    explicit SmallArea(int32_t area)
        : reciprocal(_mm256_set1_ps(1.0F / static_cast<float>(area))) {}

    __m256i Divide(__m256i sums, size_t) const {
        const __m256 s = _mm256_add_ps(_mm256_cvtepi32_ps(sums), _mm256_set1_ps(0.5F));
        return _mm256_cvttps_epi32(_mm256_mul_ps(s, reciprocal));
    }

    __m256 reciprocal;
};

// With a reciprocal of 32 digits in place of a float.
struct LargeArea {
    explicit LargeArea(int32_t area) {
        const AreaReciprocal reciprocal = ReciprocalOf(area);
        factor = _mm256_set1_epi32(static_cast<int>(reciprocal.factor));
        shift = _mm_cvtsi32_si128(reciprocal.shift);
    }

    __m256i Divide(__m256i sums, size_t) const {
        const __m256i even = _mm256_mul_epu32(sums, factor);
        const __m256i odd = _mm256_mul_epu32(_mm256_srli_epi64(sums, 32), factor);
        constexpr int kOddLanes = 0xAA;
        return _mm256_srl_epi32(_mm256_blend_epi32(_mm256_srli_epi64(even, 32), odd, kOddLanes),
                                shift);
    }

    __m256i factor;
    __m128i shift;
};

inline __m256i DivideByScale(__m256i sums, __m256i areas, __m256 scales) {
    const __m256i q = _mm256_cvttps_epi32(_mm256_mul_ps(_mm256_cvtepi32_ps(sums), scales));
    const __m256i rest = _mm256_sub_epi32(sums, _mm256_mullo_epi32(q, areas));
    // One more, unless the area is above the remainder.
    return _mm256_add_epi32(
        q, _mm256_add_epi32(_mm256_cmpgt_epi32(areas, rest), _mm256_set1_epi32(1)));
}

// Windows that end at a border: each pixel has its own area.
struct VaryingArea {
    explicit VaryingArea(const BoxWindows& boxes)
        : windows(boxes), rows(_mm256_set1_epi32(boxes.rows)),
          rowScale(_mm256_set1_ps(RowScale(boxes.rows))) {}

    __m256i Divide(__m256i sums, size_t i) const {
        const __m256i spread = _mm256_setr_epi32(0, 0, 0, 0, 1, 1, 1, 1);
        const auto* columns = reinterpret_cast<const __m128i*>(windows.columns + i);
        const auto* reciprocals = reinterpret_cast<const __m128i*>(windows.reciprocals + i);
        const __m256i areas =
            _mm256_permutevar8x32_epi32(_mm256_castsi128_si256(_mm_loadl_epi64(columns)), spread);
        const __m256i scales = _mm256_permutevar8x32_epi32(
            _mm256_castsi128_si256(_mm_loadl_epi64(reciprocals)), spread);
        return DivideByScale(sums, _mm256_mullo_epi32(areas, rows),
                             _mm256_mul_ps(_mm256_castsi256_ps(scales), rowScale));
    }

    const BoxWindows& windows;
    __m256i rows;
    __m256 rowScale;
};

// A window that moves to the right, and its sum.
template <class Sum>
struct Sliding {
    Sliding(Sum* sums, int32_t radius) {
        const auto reach = static_cast<ptrdiff_t>(radius) * 4;
        enter = sums + reach;
        leave = sums - reach - 4;
        // Of the window that lies one pixel further left, whose first column is outside.
        __m256i pairs = _mm256_setzero_si256();
        for (const Sum* p = sums - reach; p < sums + reach; p += 8) {
            pairs = _mm256_add_epi32(pairs, LoadPair(p));
        }
        total = _mm_add_epi32(_mm256_castsi256_si128(pairs), _mm256_extracti128_si256(pairs, 1));
    }

    // The sums of the next two windows, from how they change.
    __m256i Add(__m256i change) {
        const __m128i first = _mm_add_epi32(total, _mm256_castsi256_si128(change));
        total = _mm_add_epi32(first, _mm256_extracti128_si256(change, 1));
        return _mm256_inserti128_si256(_mm256_castsi128_si256(first), total, 1);
    }

    // The sum of the next window, in the low half.
    __m256i Next() {
        total = _mm_add_epi32(total, _mm_sub_epi32(LoadOne(enter), LoadOne(leave)));
        enter += 4;
        leave += 4;
        return _mm256_castsi128_si256(total);
    }

    static __m128i LoadOne(const uint16_t* sums) {
        return _mm_cvtepu16_epi32(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(sums)));
    }

    static __m128i LoadOne(const uint32_t* sums) {
        return _mm_loadu_si128(reinterpret_cast<const __m128i*>(sums));
    }

    Sum* enter;
    const Sum* leave;
    __m128i total;
};

// Eight averages from their pairs.
inline void StoreBytes(uint8_t* dst, __m256i a, __m256i b, __m256i c, __m256i d) {
    const __m256i bytes = _mm256_packus_epi16(_mm256_packs_epi32(a, b), _mm256_packs_epi32(c, d));
    _mm256_storeu_si256(
        reinterpret_cast<__m256i*>(dst),
        _mm256_permutevar8x32_epi32(bytes, _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7)));
}

// Pixels from begin on, eight at a time; returns where it stopped.
template <class Sum, class Area>
size_t Average(uint8_t* dst, Sliding<Sum>& sliding, size_t begin, size_t end, const Area& area) {
    size_t i = begin;
    for (; i + 8 <= end; i += 8) {
        const TwoPairs near = Difference(sliding.enter, sliding.leave);
        const TwoPairs far = Difference(sliding.enter + 16, sliding.leave + 16);
        sliding.enter += 32;
        sliding.leave += 32;
        const __m256i a = area.Divide(sliding.Add(near.first), i);
        const __m256i b = area.Divide(sliding.Add(near.second), i + 2);
        const __m256i c = area.Divide(sliding.Add(far.first), i + 4);
        const __m256i d = area.Divide(sliding.Add(far.second), i + 6);
        StoreBytes(dst + i * 4, a, b, c, d);
    }
    return i;
}

// The same, and the columns that enter the windows move down on the way, while they are at hand.
template <class Sum, class Area>
size_t SlideAndAverage(uint8_t* dst, Sliding<Sum>& sliding, const uint8_t* enter,
                       const uint8_t* leave, size_t begin, size_t end, const Area& area) {
    size_t i = begin;
    for (; i + 8 <= end; i += 8) {
        const TwoPairs near = SlideFour(sliding.enter, enter + i * 4, leave + i * 4, sliding.leave);
        const TwoPairs far = SlideFour(sliding.enter + 16, enter + i * 4 + 16, leave + i * 4 + 16,
                                       sliding.leave + 16);
        sliding.enter += 32;
        sliding.leave += 32;
        const __m256i a = area.Divide(sliding.Add(near.first), i);
        const __m256i b = area.Divide(sliding.Add(near.second), i);
        const __m256i c = area.Divide(sliding.Add(far.first), i);
        const __m256i d = area.Divide(sliding.Add(far.second), i);
        StoreBytes(dst + i * 4, a, b, c, d);
    }
    return i;
}

// Windows at a border, or what is left of the whole ones.
template <class Sum>
void AverageEdge(uint8_t* dst, Sliding<Sum>& sliding, size_t begin, size_t end,
                 const BoxWindows& windows) {
    for (size_t i = Average(dst, sliding, begin, end, VaryingArea(windows)); i < end; ++i) {
        const int32_t area = windows.columns[i] * windows.rows;
        const __m256i q =
            DivideByScale(sliding.Next(), _mm256_set1_epi32(area),
                          _mm256_set1_ps(windows.reciprocals[i] * RowScale(windows.rows)));
        const __m128i words = _mm_packs_epi32(_mm256_castsi256_si128(q), _mm_setzero_si128());
        _mm_storeu_si32(dst + i * 4, _mm_packus_epi16(words, words));
    }
}

// With a smaller radius a sum would be read again before its store has left the processor's buffer,
// which costs more than reading all sums twice.
constexpr size_t kNarrow = 16;

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

void BoxColumns16_avx2(uint16_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    SlideColumns(sums, enter, leave, 0, count);
}

void BoxColumns32_avx2(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    SlideColumns(sums, enter, leave, 0, count);
}

void BoxBlur16_avx2(uint8_t* dst, uint16_t* sums, const uint8_t* enter, const uint8_t* leave,
                    size_t count, const BoxWindows& windows) {
    Blur(dst, sums, enter, leave, count, windows);
}

void BoxBlur32_avx2(uint8_t* dst, uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                    size_t count, const BoxWindows& windows) {
    Blur(dst, sums, enter, leave, count, windows);
}

} // namespace kyv
