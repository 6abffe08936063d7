// Box blur with SSE2.
#include "imageutility/kernels/BoxBlur.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// One column, 32 bits a channel.
inline __m128i LoadColumn(const uint16_t* sums) {
    return _mm_unpacklo_epi16(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(sums)),
                              _mm_setzero_si128());
}

inline __m128i LoadColumn(const uint32_t* sums) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(sums));
}

// How a pixel's sums become averages. The header tells why they are exact.
struct SmallArea {
    explicit SmallArea(int32_t area) : reciprocal(_mm_set1_ps(1.0F / static_cast<float>(area))) {}

    __m128i Divide(__m128i sums, size_t) const {
        const __m128 s = _mm_add_ps(_mm_cvtepi32_ps(sums), _mm_set1_ps(0.5F));
        return _mm_cvttps_epi32(_mm_mul_ps(s, reciprocal));
    }

    __m128 reciprocal;
};

struct LargeArea {
    LargeArea(const BoxWindows& windows, size_t i)
        : areas(_mm_set1_epi32(windows.columns[i] * windows.rows)),
          scales(_mm_set1_ps(windows.reciprocals[i] * RowScale(windows.rows))) {}

    __m128i Divide(__m128i sums, size_t) const {
        const __m128i q = _mm_cvttps_epi32(_mm_mul_ps(_mm_cvtepi32_ps(sums), scales));
        // The low 32 bits of the product, for a q that fits in a word: one product with each half
        // of the area.
        const __m128i twice = _mm_or_si128(q, _mm_slli_epi32(q, 16));
        const __m128i product = _mm_add_epi32(_mm_mullo_epi16(twice, areas),
                                              _mm_slli_epi32(_mm_mulhi_epu16(twice, areas), 16));
        const __m128i rest = _mm_sub_epi32(sums, product);
        // One more, unless the area is above the remainder.
        return _mm_add_epi32(q, _mm_add_epi32(_mm_cmpgt_epi32(areas, rest), _mm_set1_epi32(1)));
    }

    __m128i areas;
    __m128 scales;
};

// Windows that end at a border: each pixel has its own area.
struct VaryingArea {
    __m128i Divide(__m128i sums, size_t i) const { return LargeArea(windows, i).Divide(sums, i); }

    const BoxWindows& windows;
};

// A window that moves to the right, and its sum.
template <class Sum>
struct Sliding {
    Sliding(const Sum* sums, int32_t radius) {
        const auto reach = static_cast<ptrdiff_t>(radius) * 4;
        enter = sums + reach;
        leave = sums - reach - 4;
        // Of the window that lies one pixel further left, whose first column is outside.
        total = _mm_setzero_si128();
        for (const Sum* p = sums - reach; p < sums + reach; p += 4) {
            total = _mm_add_epi32(total, LoadColumn(p));
        }
    }

    __m128i Next() {
        total = _mm_add_epi32(total, _mm_sub_epi32(LoadColumn(enter), LoadColumn(leave)));
        enter += 4;
        leave += 4;
        return total;
    }

    const Sum* enter;
    const Sum* leave;
    __m128i total;
};

template <class Sum, class Area>
void AverageSpan(uint8_t* dst, Sliding<Sum>& sliding, size_t begin, size_t end, const Area& area) {
    size_t i = begin;
    for (; i + 4 <= end; i += 4) {
        const __m128i a = area.Divide(sliding.Next(), i);
        const __m128i b = area.Divide(sliding.Next(), i + 1);
        const __m128i c = area.Divide(sliding.Next(), i + 2);
        const __m128i d = area.Divide(sliding.Next(), i + 3);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4),
                         _mm_packus_epi16(_mm_packs_epi32(a, b), _mm_packs_epi32(c, d)));
    }
    for (; i < end; ++i) {
        const __m128i words = _mm_packs_epi32(area.Divide(sliding.Next(), i), _mm_setzero_si128());
        _mm_storeu_si32(dst + i * 4, _mm_packus_epi16(words, words));
    }
}

template <class Sum>
void Average(uint8_t* dst, const Sum* sums, size_t count, const BoxWindows& windows) {
    const auto radius = static_cast<size_t>(windows.radius);
    const size_t left = radius < count ? radius : count;
    const size_t right = left + radius < count ? count - radius : left;
    Sliding<Sum> sliding(sums, windows.radius);
    AverageSpan(dst, sliding, 0, left, VaryingArea{windows});
    if (left < right) {
        const int32_t area = windows.columns[left] * windows.rows;
        if (area <= kSmallArea) {
            AverageSpan(dst, sliding, left, right, SmallArea(area));
        } else {
            AverageSpan(dst, sliding, left, right, LargeArea(windows, left));
        }
    }
    AverageSpan(dst, sliding, right, count, VaryingArea{windows});
}

// The change of two columns, in signed words.
inline __m128i Change(const uint8_t* enter, const uint8_t* leave) {
    const __m128i zero = _mm_setzero_si128();
    const __m128i in = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(enter));
    const __m128i out = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(leave));
    return _mm_sub_epi16(_mm_unpacklo_epi8(in, zero), _mm_unpacklo_epi8(out, zero));
}

} // namespace

void BoxColumns16_sse2(uint16_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    size_t i = 0;
    for (; i + 2 <= count; i += 2) {
        auto* out = reinterpret_cast<__m128i*>(sums + i * 4);
        _mm_storeu_si128(out,
                         _mm_add_epi16(_mm_loadu_si128(out), Change(enter + i * 4, leave + i * 4)));
    }
    BoxColumns16_scalar(sums + i * 4, enter + i * 4, leave + i * 4, count - i);
}

void BoxColumns32_sse2(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    size_t i = 0;
    for (; i + 2 <= count; i += 2) {
        const __m128i change = Change(enter + i * 4, leave + i * 4);
        const __m128i signs = _mm_srai_epi16(change, 15);
        auto* out = reinterpret_cast<__m128i*>(sums + i * 4);
        _mm_storeu_si128(out,
                         _mm_add_epi32(_mm_loadu_si128(out), _mm_unpacklo_epi16(change, signs)));
        _mm_storeu_si128(
            out + 1, _mm_add_epi32(_mm_loadu_si128(out + 1), _mm_unpackhi_epi16(change, signs)));
    }
    BoxColumns32_scalar(sums + i * 4, enter + i * 4, leave + i * 4, count - i);
}

void BoxBlur16_sse2(uint8_t* dst, uint16_t* sums, const uint8_t* enter, const uint8_t* leave,
                    size_t count, const BoxWindows& windows) {
    BoxColumns16_sse2(sums, enter, leave, count);
    Average(dst, sums, count, windows);
}

void BoxBlur32_sse2(uint8_t* dst, uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                    size_t count, const BoxWindows& windows) {
    BoxColumns32_sse2(sums, enter, leave, count);
    Average(dst, sums, count, windows);
}

} // namespace kyv
