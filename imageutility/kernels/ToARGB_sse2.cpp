// AYUV to ARGB with SSE2, eight pixels a step.
#include "imageutility/kernels/ToARGB.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m128i Factors(int low, int high) {
    return _mm_set1_epi32(static_cast<int>((static_cast<unsigned>(high) << 16) |
                                           (static_cast<unsigned>(low) & 0xFFFF)));
}

struct Channels {
    __m128i b, g, r, a; // 32 bits each, not clamped
};

inline Channels Convert(__m128i vuya) {
    const __m128i vy = _mm_and_si128(vuya, _mm_set1_epi32(0x00FF00FF));
    // The offsets of Y, U and V and the rounding half together are multiples of 64, and ride on a
    // word of 64 beside U where they can.
    const __m128i uc = _mm_or_si128(_mm_and_si128(_mm_srli_epi32(vuya, 8), _mm_set1_epi32(0xFF)),
                                    _mm_set1_epi32(64 << 16));
    const __m128i r =
        _mm_add_epi32(_mm_madd_epi16(vy, Factors(6537, 4768)), _mm_set1_epi32(64 * -14234));
    const __m128i g = _mm_add_epi32(_mm_madd_epi16(vy, Factors(-3330, 4768)),
                                    _mm_madd_epi16(uc, Factors(-1602, 8704)));
    const __m128i b = _mm_add_epi32(_mm_madd_epi16(vy, Factors(0, 4768)),
                                    _mm_madd_epi16(uc, Factors(8266, -17692)));
    return {_mm_srai_epi32(b, 12), _mm_srai_epi32(g, 12), _mm_srai_epi32(r, 12),
            _mm_srli_epi32(vuya, 24)};
}

} // namespace

void ToARGB_sse2(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const auto* from = reinterpret_cast<const __m128i*>(src + i * 4);
        const Channels p = Convert(_mm_loadu_si128(from));
        const Channels q = Convert(_mm_loadu_si128(from + 1));
        // Packing clamps: eight B and eight R, eight G and eight A.
        const __m128i br = _mm_packus_epi16(_mm_packs_epi32(p.b, q.b), _mm_packs_epi32(p.r, q.r));
        const __m128i ga = _mm_packus_epi16(_mm_packs_epi32(p.g, q.g), _mm_packs_epi32(p.a, q.a));
        const __m128i bg = _mm_unpacklo_epi8(br, ga);
        const __m128i ra = _mm_unpackhi_epi8(br, ga);
        auto* to = reinterpret_cast<__m128i*>(dst + i * 4);
        _mm_storeu_si128(to, _mm_unpacklo_epi16(bg, ra));
        _mm_storeu_si128(to + 1, _mm_unpackhi_epi16(bg, ra));
    }
    ToARGB_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv
