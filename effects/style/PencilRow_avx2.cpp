// Sixteen or thirty-two bytes a step; the rest of a row goes through the scalar form.
#include "effects/style/PencilRow.h"
#include "effects/style/StyleVector_avx2.h"

namespace kyv {
namespace {

constexpr size_t kWords = 16;

__m256i AtMost255(__m256i words) {
    return _mm256_sub_epi16(words, _mm256_subs_epu16(words, Splat(255)));
}

// Graphite of a weight over what is there.
__m256i Over(__m256i ink, __m256i more) {
    return Invert(Product(Invert(ink), Invert(more)));
}

} // namespace

void SmoothRow_avx2(uint8_t* dst, const uint8_t* a, const uint8_t* b, const uint8_t* c,
                    size_t count) {
    size_t i = 0;
    for (; i + 2 * kWords <= count; i += 2 * kWords) {
        Store(dst + i, _mm256_avg_epu8(_mm256_avg_epu8(Load(a + i), Load(c + i)), Load(b + i)));
    }
    SmoothRow_scalar(dst + i, a + i, b + i, c + i, count - i);
}

void PencilLineRow_avx2(uint8_t* dst, const uint8_t* narrow, const uint8_t* wide, size_t count,
                        const PencilLine& line) {
    const __m256i threshold = Splat(line.threshold);
    const __m256i gain = Splat(line.gain);
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const __m256i depth = _mm256_subs_epu16(
            _mm256_subs_epu16(LoadWide(wide + i), LoadWide(narrow + i)), threshold);
        StoreNarrow(dst + i, AtMost255(_mm256_mullo_epi16(depth, gain)));
    }
    PencilLineRow_scalar(dst + i, narrow + i, wide + i, count - i, line);
}

void PencilInkRow_avx2(uint8_t* dst, const PencilSources& sources, size_t count,
                       const PencilTone& tone) {
    const __m256i full = Splat(255);
    const __m256i zero = _mm256_setzero_si256();
    const __m256i rubbing = Splat(tone.rubbing);
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const __m256i dark = _mm256_subs_epu16(Splat(235), LoadWide(sources.luma + i));
        const __m256i level = _mm256_avg_epu16(dark, Product(dark, dark));
        const __m256i even = _mm256_avg_epu16(_mm256_avg_epu16(level, zero), Product(level, level));
        __m256i ink = AtMost255(
            _mm256_srli_epi16(_mm256_add_epi16(_mm256_mullo_epi16(even, rubbing), Splat(64)), 7));
        for (int k = 0; k < kHatchLayers; ++k) {
            const __m256i above = _mm256_subs_epu16(level, Splat(tone.layers[k].start));
            const __m256i rise = _mm256_mullo_epi16(above, Splat(tone.layers[k].slope));
            const __m256i pressure = AtMost255(_mm256_srli_epi16(rise, 4));
            const __m256i stroke = _mm256_subs_epu16(LoadWide(sources.layers[k] + i),
                                                     _mm256_sub_epi16(full, pressure));
            ink = Over(ink, Product(stroke, Splat(196)));
        }
        const __m256i hand = LoadWide(sources.hand + i);
        const __m256i line = Product(LoadWide(sources.line + i), _mm256_avg_epu16(hand, full));
        const __m256i echo =
            Product(LoadWide(sources.echo + i), _mm256_srli_epi16(_mm256_sub_epi16(full, hand), 1));
        ink = Invert(Product(Product(Invert(ink), Invert(line)), Invert(echo)));
        const __m256i kept = _mm256_srli_epi16(_mm256_mullo_epi16(ink, Splat(3)), 2);
        const __m256i missed = Product(LoadWide(sources.valleys + i), _mm256_sub_epi16(full, kept));
        StoreNarrow(dst + i, Product(ink, Invert(missed)));
    }
    PencilSources rest = sources;
    rest.luma += i;
    rest.line += i;
    rest.echo += i;
    rest.valleys += i;
    rest.hand += i;
    for (const uint8_t*& layer : rest.layers) {
        layer += i;
    }
    PencilInkRow_scalar(dst + i, rest, count - i, tone);
}

void PencilPaperRow_avx2(uint8_t* dst, const uint8_t* src, const uint8_t* ink,
                         const uint8_t* valleys, size_t count) {
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const __m256i graphite = LoadWide(ink + i);
        const __m256i shade = _mm256_srli_epi16(LoadWide(valleys + i), 5);
        __m256i color[3];
        for (int c = 0; c < 3; ++c) {
            const __m256i paper = _mm256_sub_epi16(Splat(kPaperColor[c]), shade);
            const __m256i depth = Splat(kPaperColor[c] - kGraphiteColor[c] + 0U);
            color[c] = _mm256_subs_epu16(paper, Product(graphite, depth));
        }
        const __m256i blueGreen = _mm256_or_si256(color[0], _mm256_slli_epi16(color[1], 8));
        const __m256i low = _mm256_unpacklo_epi16(blueGreen, color[2]);  // pixels 0..3, 8..11
        const __m256i high = _mm256_unpackhi_epi16(blueGreen, color[2]); // pixels 4..7, 12..15
        const __m256i first = _mm256_permute2x128_si256(low, high, 0x20);
        const __m256i second = _mm256_permute2x128_si256(low, high, 0x31);
        Store(dst + i * 4, WithAlphaOf(Load(src + i * 4), first));
        Store(dst + i * 4 + 32, WithAlphaOf(Load(src + i * 4 + 32), second));
    }
    PencilPaperRow_scalar(dst + i * 4, src + i * 4, ink + i, valleys + i, count - i);
}

} // namespace kyv
