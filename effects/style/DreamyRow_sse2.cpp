// Four pixels a step; the rest of a row goes through the scalar form.
#include "effects/style/DreamyRow.h"
#include "effects/style/StyleVector_sse2.h"

namespace kyv {
namespace {

__m128i Blend(__m128i src, __m128i soft, __m128i glow, __m128i softWeight, __m128i glowWeight,
              __m128i depth) {
    const __m128i base = Mix(src, soft, softWeight);
    const __m128i rich = Mix(base, Product(base, base), depth);
    const __m128i dim = Product(Invert(glow), Invert(glow));
    const __m128i light = Scale(Invert(Product(dim, dim)), glowWeight);
    return Invert(Product(Invert(rich), Invert(light)));
}

} // namespace

void DreamyRow_sse2(uint8_t* dst, const uint8_t* src, const uint8_t* soft, const uint8_t* glow,
                    size_t count, const DreamyMix& mix) {
    const __m128i softMix = Splat(mix.soft);
    const __m128i glowMix = Splat(mix.glow);
    const __m128i depth = Splat(mix.depth);
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i pixels = Load(src + i * 4);
        const __m128i softened = Load(soft + i * 4);
        const __m128i held = _mm_avg_epu8(pixels, _mm_avg_epu8(pixels, softened));
        const Words s = Widen(pixels);
        const Words m = Widen(_mm_max_epu8(softened, held));
        const Words g = Widen(Load(glow + i * 4));
        const Words luma = Spread(Luma(s));
        __m128i result[2];
        for (int half = 0; half < 2; ++half) {
            const __m128i l = half ? luma.high : luma.low;
            const __m128i rise = _mm_srli_epi16(_mm_mullo_epi16(l, Splat(3)), 2);
            const __m128i softWeight =
                _mm_srli_epi16(_mm_mullo_epi16(softMix, _mm_add_epi16(Splat(64), rise)), 8);
            const __m128i gain = _mm_srli_epi16(_mm_mullo_epi16(l, Splat(13)), 5);
            const __m128i glowWeight =
                _mm_srli_epi16(_mm_mullo_epi16(glowMix, _mm_add_epi16(Splat(152), gain)), 8);
            result[half] = Blend(half ? s.high : s.low, half ? m.high : m.low,
                                 half ? g.high : g.low, softWeight, glowWeight, depth);
        }
        Store(dst + i * 4, WithAlphaOf(pixels, Narrow(result[0], result[1])));
    }
    DreamyRow_scalar(dst + i * 4, src + i * 4, soft + i * 4, glow + i * 4, count - i, mix);
}

} // namespace kyv
