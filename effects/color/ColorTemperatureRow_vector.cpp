// Colour temperature.
#include "effects/color/ColorTemperatureRow.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// The curves of one stage in registers.
struct Stage {
    Vec whole;
    Vec fraction;
    Vec exception[GainCurves::kMaxExceptions];
    uint32_t exceptionCount;
};

inline Stage LoadStage(const GainCurves& curves) {
    Stage stage = {
        PixelWords(curves.whole), PixelWords(curves.fraction), {}, curves.exceptionCount};
    for (uint32_t i = 0; i < curves.exceptionCount; ++i) {
        stage.exception[i] = PixelWords(curves.exception[i]);
    }
    return stage;
}

// Words through the curves.
inline Vec Apply(const Stage& stage, Vec words) {
    Vec result = Add16(MulLow16(words, stage.whole), MulHighU16(words, stage.fraction));
    result = MinS16(result, Splat16(255));
    for (uint32_t i = 0; i < stage.exceptionCount; ++i) {
        result = Add16(result, Equal16(words, stage.exception[i])); // the mask is -1
    }
    return result;
}

// (corrected * w + kept * (55 - w)) / 55; 19066 / 2^20 divides exactly up to 55 * 255.
inline Vec Blend(Vec corrected, Vec kept, Vec w) {
    const Vec sum = Add16(MulLow16(corrected, w), MulLow16(kept, Sub16(Splat16(55), w)));
    return ShiftRight16<4>(MulHighU16(sum, Splat16(19066)));
}

inline Vec ApplyToHighlights(const Stage& stage, Vec words, Vec w) {
    return Blend(Apply(stage, words), words, w);
}

// 4096 times the luma of every pixel. The constant rides on a word of 64 beside green.
inline Vec Luma(Vec bgra) {
    const Vec br = And(bgra, Splat32(0x00FF00FF));
    const Vec gc = MixWords(ShiftRight16<8>(bgra), Splat16(64));
    return Add32(MulAddPairs16(br, PairOfWords(401, 1053)),
                 MulAddPairs16(gc, PairOfWords(2064, 1056)));
}

} // namespace

void ColorTemperatureRow(uint8_t* dst, const uint8_t* src, size_t count, const GainCurves& first,
                         const GainCurves& second) {
    size_t i = 0;
    if (first.exact && second.exact) {
        const Stage one = LoadStage(first);
        const Stage two = LoadStage(second);
        for (; i + kPixels <= count; i += kPixels) {
            const Vec bgra = Load(src + i * 4);
            const Vec luma = Luma(bgra);
            Vec low = WidenLow8(bgra);
            Vec high = WidenHigh8(bgra);
            if (!AnySet(GreaterS32(luma, Splat32((200 << 12) - 1)))) {
                low = Apply(two, Apply(one, low));
                high = Apply(two, Apply(one, high));
            } else {
                // The weight of the correction, 55 for all but highlights; then once a channel.
                const Vec left = Sub32(Splat32(255), ShiftRight32<12>(luma));
                const Vec w = TwiceLow16(MinS16(left, Splat32(55)));
                const Vec lowW = DoubleLow32(w);
                const Vec highW = DoubleHigh32(w);
                low = ApplyToHighlights(two, ApplyToHighlights(one, low, lowW), lowW);
                high = ApplyToHighlights(two, ApplyToHighlights(one, high, highW), highW);
            }
            Store(dst + i * 4, PackU16(low, high));
        }
    }
    ColorTemperatureRow_scalar(dst + i * 4, src + i * 4, count - i, first, second);
}

} // namespace kyv::KYV_VECTOR_SET
