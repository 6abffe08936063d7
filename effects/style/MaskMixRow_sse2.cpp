// Four pixels a step; the rest of a row goes through the scalar form.
#include "effects/style/MaskMixRow.h"
#include "effects/style/StyleVector_sse2.h"

namespace kyv {

void MaskMixRow_sse2(uint8_t* dst, const uint8_t* src, const uint8_t* effect,
                     const uint8_t* weights, size_t count) {
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i bytes = LoadBytes(weights + i);
        const Words weight = Spread(_mm_add_epi32(bytes, _mm_srli_epi32(bytes, 7)));
        const Words a = Widen(Load(src + i * 4));
        const Words b = Widen(Load(effect + i * 4));
        Store(dst + i * 4, Narrow(Mix(a.low, b.low, weight.low), Mix(a.high, b.high, weight.high)));
    }
    MaskMixRow_scalar(dst + i * 4, src + i * 4, effect + i * 4, weights + i, count - i);
}

} // namespace kyv
