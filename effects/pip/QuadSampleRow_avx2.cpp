// Bilinear reading through map entries with AVX2, eight pixels a step.
#include "effects/pip/QuadSampleRow.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Offsets are worked out a block ahead of the pixels: the reads of a slanted quad follow no pattern
// that the processor would see, so they are announced to it.
constexpr size_t kBlock = 64;

inline __m256i LoadEntries(const uint32_t* map) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(map));
}

// Byte offsets of a block's pixels, count of them, a multiple of 8. False when one of them has no
// right or lower neighbour in the picture; limit is the last column and row, which have none.
inline bool FindOffsets(uint32_t* offsets, const uint32_t* map, size_t count,
                        const SamplePicture& picture, __m256i limit, __m256i pitch) {
    __m256i inside = _mm256_set1_epi8(-1);
    for (size_t i = 0; i < count; i += 8) {
        const __m256i whole = _mm256_srli_epi16(LoadEntries(map + i), 6);
        const __m256i x = _mm256_and_si256(whole, _mm256_set1_epi32(0xFFFF));
        const __m256i y = _mm256_srli_epi32(whole, 16);
        inside = _mm256_and_si256(inside, _mm256_cmpgt_epi16(limit, whole));
        _mm256_store_si256(reinterpret_cast<__m256i*>(offsets + i),
                           _mm256_add_epi32(_mm256_mullo_epi32(y, pitch), _mm256_slli_epi32(x, 2)));
    }
    if (_mm256_movemask_epi8(inside) != -1) {
        return false;
    }
    for (size_t i = 0; i < count; i += 8) {
        const uint8_t* upper = picture.pixels + offsets[i];
        _mm_prefetch(reinterpret_cast<const char*>(upper), _MM_HINT_T0);
        _mm_prefetch(reinterpret_cast<const char*>(upper + picture.pitch), _MM_HINT_T0);
    }
    return true;
}

// Pixels and their right neighbours at four offsets.
inline __m256i LoadPairs(const uint8_t* base, const uint32_t* offsets) {
    const auto pair = [&](int k) { return reinterpret_cast<const double*>(base + offsets[k]); };
    const __m128d low = _mm_loadh_pd(_mm_load_sd(pair(0)), pair(1));
    const __m128d high = _mm_loadh_pd(_mm_load_sd(pair(2)), pair(3));
    return _mm256_castpd_si256(_mm256_insertf128_pd(_mm256_castpd128_pd256(low), high, 1));
}

// Between the pixels of four pairs, 16 bits a channel, less 128. With the fraction f in 1/128 the
// sum is (128 - f) * left + f * right; pixels are signed for it, since the weight is the factor
// that reaches 128.
inline __m256i Across(__m256i pairs, __m256i weights) {
    const __m256i mixed =
        _mm256_shuffle_epi8(pairs, _mm256_broadcastsi128_si256(_mm_setr_epi8(
                                       0, 4, 1, 5, 2, 6, 3, 7, 8, 12, 9, 13, 10, 14, 11, 15)));
    const __m256i centred = _mm256_xor_si256(mixed, _mm256_set1_epi8(static_cast<char>(0x80)));
    return _mm256_srai_epi16(_mm256_maddubs_epi16(weights, centred), 7);
}

inline __m256i FourPixels(const SamplePicture& picture, const uint32_t* offsets, __m256i weights,
                          __m256i fv) {
    const __m256i top = Across(LoadPairs(picture.pixels, offsets), weights);
    const __m256i bottom = Across(LoadPairs(picture.pixels + picture.pitch, offsets), weights);
    const __m256i centred =
        _mm256_add_epi16(top, _mm256_mulhi_epi16(fv, _mm256_sub_epi16(bottom, top)));
    return _mm256_add_epi16(centred, _mm256_set1_epi16(128));
}

inline void DrawBlock(uint8_t* dst, const uint32_t* map, size_t count, const uint32_t* offsets,
                      const SamplePicture& picture) {
    const __m256i lowPixels = _mm256_setr_epi32(0, 0, 1, 1, 2, 2, 3, 3);
    const __m256i highPixels = _mm256_setr_epi32(4, 4, 5, 5, 6, 6, 7, 7);
    for (size_t i = 0; i < count; i += 8) {
        // Both words of a pixel: the weights 128 - f and f as bytes, and half of v's fraction.
        const __m256i fraction = _mm256_and_si256(LoadEntries(map + i), _mm256_set1_epi16(63));
        const __m256i f = _mm256_blend_epi16(fraction, _mm256_slli_epi32(fraction, 16), 0xAA);
        const __m256i weights =
            _mm256_add_epi16(_mm256_sub_epi16(_mm256_slli_epi16(f, 8), f), _mm256_set1_epi16(128));
        const __m256i fv = _mm256_slli_epi16(
            _mm256_blend_epi16(_mm256_srli_epi32(fraction, 16), fraction, 0xAA), 9);

        const __m256i low =
            FourPixels(picture, offsets + i, _mm256_permutevar8x32_epi32(weights, lowPixels),
                       _mm256_permutevar8x32_epi32(fv, lowPixels));
        const __m256i high =
            FourPixels(picture, offsets + i + 4, _mm256_permutevar8x32_epi32(weights, highPixels),
                       _mm256_permutevar8x32_epi32(fv, highPixels));
        const __m256i pixels =
            _mm256_permute4x64_epi64(_mm256_packus_epi16(low, high), _MM_SHUFFLE(3, 1, 2, 0));
        _mm256_storeu_si256(
            reinterpret_cast<__m256i*>(dst + i * 4),
            _mm256_or_si256(pixels, _mm256_set1_epi32(static_cast<int>(0xFF000000))));
    }
}

} // namespace

void QuadSampleRow_avx2(uint8_t* dst, const uint32_t* map, size_t count,
                        const SamplePicture& picture) {
    // Offsets have 32 bits.
    if (picture.pitch < 0 || picture.pitch >= 1 << 21) {
        QuadSampleRow_sse2(dst, map, count, picture);
        return;
    }
    // Entries reach no further than column and row 1023.
    const int right = picture.width - 1 < 1024 ? picture.width - 1 : 1024;
    const int lower = picture.height - 1 < 1024 ? picture.height - 1 : 1024;
    const __m256i limit = _mm256_set1_epi32(static_cast<int>(
        static_cast<unsigned>(lower) << 16 | (static_cast<unsigned>(right) & 0xFFFF)));
    const __m256i pitch = _mm256_set1_epi32(static_cast<int>(picture.pitch));

    alignas(32) uint32_t offsets[2][kBlock];
    const size_t whole = count & ~size_t{7};
    size_t size = whole < kBlock ? whole : kBlock;
    bool inside = FindOffsets(offsets[0], map, size, picture, limit, pitch);
    size_t turn = 0;
    for (size_t i = 0; i < whole; ++turn) {
        const size_t next = i + size;
        const size_t nextSize = whole - next < kBlock ? whole - next : kBlock;
        const bool nextInside =
            FindOffsets(offsets[~turn & 1], map + next, nextSize, picture, limit, pitch);
        if (inside) {
            DrawBlock(dst + i * 4, map + i, size, offsets[turn & 1], picture);
        } else {
            QuadSampleRow_sse2(dst + i * 4, map + i, size, picture);
        }
        i = next;
        size = nextSize;
        inside = nextInside;
    }
    QuadSampleRow_scalar(dst + whole * 4, map + whole, count - whole, picture);
}

} // namespace kyv
