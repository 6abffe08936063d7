// Box blur with AVX2.
#include "imageutility/kernels/BoxBlur.h"

#include <immintrin.h>

namespace kyv {
namespace {

inline __m256i LoadWords(const uint8_t* bytes) {
    return _mm256_cvtepu8_epi16(_mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes)));
}

inline void AddWords(uint32_t* sums, __m128i words) {
    auto* out = reinterpret_cast<__m256i*>(sums);
    _mm256_storeu_si256(out,
                        _mm256_add_epi32(_mm256_loadu_si256(out), _mm256_cvtepi16_epi32(words)));
}

inline __m256i LoadSums(const uint32_t* sums) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(sums));
}

// How the sums of pixels i and i + 1 become averages. See the header for why they are exact.
struct SmallArea {
    explicit SmallArea(int32_t area) : factor(_mm256_set1_ps(1.0F / static_cast<float>(area))) {}

    __m256i Divide(__m256i sums, size_t) const {
        const __m256 s = _mm256_add_ps(_mm256_cvtepi32_ps(sums), _mm256_set1_ps(0.5F));
        return _mm256_cvttps_epi32(_mm256_mul_ps(s, factor));
    }

    __m256 factor;
};

inline __m256i DivideByScale(__m256i sums, __m256i areas, __m256 scales) {
    const __m256i q = _mm256_cvttps_epi32(_mm256_mul_ps(_mm256_cvtepi32_ps(sums), scales));
    const __m256i rest = _mm256_sub_epi32(sums, _mm256_mullo_epi32(q, areas));
    // One more unless the area is above the remainder.
    return _mm256_add_epi32(
        q, _mm256_add_epi32(_mm256_cmpgt_epi32(areas, rest), _mm256_set1_epi32(1)));
}

struct LargeArea {
    explicit LargeArea(int32_t area)
        : areas(_mm256_set1_epi32(area)), scales(_mm256_set1_ps(AverageScale(area))) {}

    __m256i Divide(__m256i sums, size_t) const { return DivideByScale(sums, areas, scales); }

    __m256i areas;
    __m256 scales;
};

// Windows that end at a border: each has its own area.
struct VaryingArea {
    __m256i Divide(__m256i sums, size_t i) const {
        const __m256i spread = _mm256_setr_epi32(0, 0, 0, 0, 1, 1, 1, 1);
        const auto* area = reinterpret_cast<const __m128i*>(windows.areas + i);
        const auto* scale = reinterpret_cast<const __m128i*>(windows.scales + i);
        const __m256i areas = _mm256_castsi128_si256(_mm_loadl_epi64(area));
        const __m256i scales = _mm256_castsi128_si256(_mm_loadl_epi64(scale));
        return DivideByScale(sums, _mm256_permutevar8x32_epi32(areas, spread),
                             _mm256_castsi256_ps(_mm256_permutevar8x32_epi32(scales, spread)));
    }

    const BoxWindows& windows;
};

// Windows that move to the right; their sum follows them.
struct Sliding {
    // The sums of two windows, one pixel apart.
    __m256i NextPair() {
        const __m256i change = _mm256_sub_epi32(LoadSums(enter), LoadSums(leave));
        enter += 8;
        leave += 8;
        const __m128i first = _mm_add_epi32(total, _mm256_castsi256_si128(change));
        total = _mm_add_epi32(first, _mm256_extracti128_si256(change, 1));
        return _mm256_inserti128_si256(_mm256_castsi128_si256(first), total, 1);
    }

    const uint32_t* enter;
    const uint32_t* leave;
    __m128i total;
};

// Pixels from begin on, eight at a time; returns where it stopped.
template <class Area>
size_t AverageSpan(uint8_t* dst, Sliding& sliding, size_t begin, size_t end, const Area& area) {
    size_t i = begin;
    for (; i + 8 <= end; i += 8) {
        const __m256i a = area.Divide(sliding.NextPair(), i);
        const __m256i b = area.Divide(sliding.NextPair(), i + 2);
        const __m256i c = area.Divide(sliding.NextPair(), i + 4);
        const __m256i d = area.Divide(sliding.NextPair(), i + 6);
        const __m256i bytes =
            _mm256_packus_epi16(_mm256_packus_epi32(a, b), _mm256_packus_epi32(c, d));
        _mm256_storeu_si256(
            reinterpret_cast<__m256i*>(dst + i * 4),
            _mm256_permutevar8x32_epi32(bytes, _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7)));
    }
    return i;
}

// The rest of a span, a pixel at a time.
void AverageRest(uint8_t* dst, Sliding& sliding, size_t begin, size_t end,
                 const BoxWindows& windows) {
    for (size_t i = begin; i < end; ++i) {
        const auto* enter = reinterpret_cast<const __m128i*>(sliding.enter);
        const auto* leave = reinterpret_cast<const __m128i*>(sliding.leave);
        sliding.total = _mm_add_epi32(
            sliding.total, _mm_sub_epi32(_mm_loadu_si128(enter), _mm_loadu_si128(leave)));
        sliding.enter += 4;
        sliding.leave += 4;
        const __m256i q =
            DivideByScale(_mm256_castsi128_si256(sliding.total),
                          _mm256_set1_epi32(windows.areas[i]), _mm256_set1_ps(windows.scales[i]));
        const __m128i words = _mm_packs_epi32(_mm256_castsi256_si128(q), _mm_setzero_si128());
        _mm_storeu_si32(dst + i * 4, _mm_packus_epi16(words, words));
    }
}

} // namespace

void BoxColumns_avx2(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count) {
    size_t i = 0;
    const __m256i zero = _mm256_setzero_si256();
    for (; i + 4 <= count; i += 4) {
        const __m256i change = _mm256_sub_epi16(enter ? LoadWords(enter + i * 4) : zero,
                                                leave ? LoadWords(leave + i * 4) : zero);
        AddWords(sums + i * 4, _mm256_castsi256_si128(change));
        AddWords(sums + i * 4 + 8, _mm256_extracti128_si256(change, 1));
    }
    BoxColumns_scalar(sums + i * 4, enter ? enter + i * 4 : nullptr,
                      leave ? leave + i * 4 : nullptr, count - i);
}

void BoxAverage_avx2(uint8_t* dst, const uint32_t* sums, size_t count, const BoxWindows& windows) {
    const auto radius = static_cast<size_t>(windows.radius);
    const auto reach = static_cast<ptrdiff_t>(windows.radius) * 4;
    Sliding sliding = {sums + reach, sums - reach - 4, _mm_setzero_si128()};
    for (ptrdiff_t i = -reach; i < reach; i += 4) {
        sliding.total = _mm_add_epi32(sliding.total,
                                      _mm_loadu_si128(reinterpret_cast<const __m128i*>(sums + i)));
    }
    const size_t left = radius < count ? radius : count;
    const size_t right = left + radius < count ? count - radius : left;
    AverageRest(dst, sliding, AverageSpan(dst, sliding, 0, left, VaryingArea{windows}), left,
                windows);
    size_t done = left;
    if (right > left) {
        const int32_t area = windows.areas[left];
        done = area <= kSmallArea ? AverageSpan(dst, sliding, left, right, SmallArea(area))
                                  : AverageSpan(dst, sliding, left, right, LargeArea(area));
    }
    AverageRest(dst, sliding, AverageSpan(dst, sliding, done, count, VaryingArea{windows}), count,
                windows);
}

} // namespace kyv
