// Eight or sixteen bytes a step; the rest of a row goes through the scalar form.
#include "effects/style/PencilRow.h"
#include "effects/style/StyleVector_sse2.h"

namespace kyv {
namespace {

constexpr size_t kWords = 8;

__m128i AtMost255(__m128i words) {
    return _mm_sub_epi16(words, _mm_subs_epu16(words, Splat(255)));
}

// Graphite of a weight over what is there.
__m128i Over(__m128i ink, __m128i more) {
    return Invert(Product(Invert(ink), Invert(more)));
}

} // namespace

void SmoothRow_sse2(uint8_t* dst, const uint8_t* a, const uint8_t* b, const uint8_t* c,
                    size_t count) {
    size_t i = 0;
    for (; i + 2 * kWords <= count; i += 2 * kWords) {
        Store(dst + i, _mm_avg_epu8(_mm_avg_epu8(Load(a + i), Load(c + i)), Load(b + i)));
    }
    SmoothRow_scalar(dst + i, a + i, b + i, c + i, count - i);
}

void PencilLineRow_sse2(uint8_t* dst, const uint8_t* narrow, const uint8_t* wide, size_t count,
                        const PencilLine& line) {
    const __m128i threshold = Splat(line.threshold);
    const __m128i gain = Splat(line.gain);
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const __m128i depth =
            _mm_subs_epu16(_mm_subs_epu16(LoadWide(wide + i), LoadWide(narrow + i)), threshold);
        StoreNarrow(dst + i, AtMost255(_mm_mullo_epi16(depth, gain)));
    }
    PencilLineRow_scalar(dst + i, narrow + i, wide + i, count - i, line);
}

void PencilInkRow_sse2(uint8_t* dst, const PencilSources& sources, size_t count,
                       const PencilTone& tone) {
    const __m128i full = Splat(255);
    const __m128i zero = _mm_setzero_si128();
    const __m128i rubbing = Splat(tone.rubbing);
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const __m128i dark = _mm_subs_epu16(Splat(235), LoadWide(sources.luma + i));
        const __m128i level = _mm_avg_epu16(dark, Product(dark, dark));
        const __m128i even = _mm_avg_epu16(_mm_avg_epu16(level, zero), Product(level, level));
        __m128i ink =
            AtMost255(_mm_srli_epi16(_mm_add_epi16(_mm_mullo_epi16(even, rubbing), Splat(64)), 7));
        for (int k = 0; k < kHatchLayers; ++k) {
            const __m128i above = _mm_subs_epu16(level, Splat(tone.layers[k].start));
            const __m128i rise = _mm_mullo_epi16(above, Splat(tone.layers[k].slope));
            const __m128i pressure = AtMost255(_mm_srli_epi16(rise, 4));
            const __m128i stroke =
                _mm_subs_epu16(LoadWide(sources.layers[k] + i), _mm_sub_epi16(full, pressure));
            ink = Over(ink, Product(stroke, Splat(196)));
        }
        const __m128i hand = LoadWide(sources.hand + i);
        const __m128i line = Product(LoadWide(sources.line + i), _mm_avg_epu16(hand, full));
        const __m128i echo =
            Product(LoadWide(sources.echo + i), _mm_srli_epi16(_mm_sub_epi16(full, hand), 1));
        ink = Invert(Product(Product(Invert(ink), Invert(line)), Invert(echo)));
        const __m128i kept = _mm_srli_epi16(_mm_mullo_epi16(ink, Splat(3)), 2);
        const __m128i missed = Product(LoadWide(sources.valleys + i), _mm_sub_epi16(full, kept));
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

void PencilPaperRow_sse2(uint8_t* dst, const uint8_t* src, const uint8_t* ink,
                         const uint8_t* valleys, size_t count) {
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const __m128i graphite = LoadWide(ink + i);
        const __m128i shade = _mm_srli_epi16(LoadWide(valleys + i), 5);
        __m128i color[3];
        for (int c = 0; c < 3; ++c) {
            const __m128i paper = _mm_sub_epi16(Splat(kPaperColor[c]), shade);
            const __m128i depth = Splat(kPaperColor[c] - kGraphiteColor[c] + 0U);
            color[c] = _mm_subs_epu16(paper, Product(graphite, depth));
        }
        const __m128i blueGreen = _mm_or_si128(color[0], _mm_slli_epi16(color[1], 8));
        const __m128i low = _mm_unpacklo_epi16(blueGreen, color[2]);
        const __m128i high = _mm_unpackhi_epi16(blueGreen, color[2]);
        Store(dst + i * 4, WithAlphaOf(Load(src + i * 4), low));
        Store(dst + i * 4 + 16, WithAlphaOf(Load(src + i * 4 + 16), high));
    }
    PencilPaperRow_scalar(dst + i * 4, src + i * 4, ink + i, valleys + i, count - i);
}

} // namespace kyv
