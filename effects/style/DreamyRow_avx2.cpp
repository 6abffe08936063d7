// Eight pixels a step; the rest of a row goes through the scalar form.
#include "effects/style/DreamyRow.h"
#include "effects/style/StyleVector_avx2.h"

namespace kyv {
namespace {

__m256i Blend(__m256i src, __m256i soft, __m256i glow, __m256i softWeight, __m256i glowWeight,
              __m256i depth) {
    const __m256i base = Mix(src, soft, softWeight);
    const __m256i rich = Mix(base, Product(base, base), depth);
    const __m256i dim = Product(Invert(glow), Invert(glow));
    const __m256i light = Scale(Invert(Product(dim, dim)), glowWeight);
    return Invert(Product(Invert(rich), Invert(light)));
}

} // namespace

void DreamyRow_avx2(uint8_t* dst, const uint8_t* src, const uint8_t* soft, const uint8_t* glow,
                    size_t count, const DreamyMix& mix) {
    const __m256i softMix = Splat(mix.soft);
    const __m256i glowMix = Splat(mix.glow);
    const __m256i depth = Splat(mix.depth);
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256i pixels = Load(src + i * 4);
        const __m256i softened = Load(soft + i * 4);
        const __m256i held = _mm256_avg_epu8(pixels, _mm256_avg_epu8(pixels, softened));
        const Words s = Widen(pixels);
        const Words m = Widen(_mm256_max_epu8(softened, held));
        const Words g = Widen(Load(glow + i * 4));
        const Words luma = Spread(Luma(s));
        __m256i result[2];
        for (int half = 0; half < 2; ++half) {
            const __m256i l = half ? luma.high : luma.low;
            const __m256i rise = _mm256_srli_epi16(_mm256_mullo_epi16(l, Splat(3)), 2);
            const __m256i softWeight = _mm256_srli_epi16(
                _mm256_mullo_epi16(softMix, _mm256_add_epi16(Splat(64), rise)), 8);
            const __m256i gain = _mm256_srli_epi16(_mm256_mullo_epi16(l, Splat(13)), 5);
            const __m256i glowWeight = _mm256_srli_epi16(
                _mm256_mullo_epi16(glowMix, _mm256_add_epi16(Splat(152), gain)), 8);
            result[half] = Blend(half ? s.high : s.low, half ? m.high : m.low,
                                 half ? g.high : g.low, softWeight, glowWeight, depth);
        }
        Store(dst + i * 4, WithAlphaOf(pixels, Narrow(result[0], result[1])));
    }
    DreamyRow_scalar(dst + i * 4, src + i * 4, soft + i * 4, glow + i * 4, count - i, mix);
}

} // namespace kyv
