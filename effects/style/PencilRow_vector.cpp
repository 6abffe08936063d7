// The pencil's row loops.
#include "effects/style/PencilRow.h"
#include "effects/style/StyleVector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

inline Vec AtMost255(Vec words) {
    return Sub16(words, SubSatU16(words, Splat16(255)));
}

// Graphite of a weight over what is there.
inline Vec Over(Vec ink, Vec more) {
    return Invert(Product(Invert(ink), Invert(more)));
}

} // namespace

void SmoothRow(uint8_t* dst, const uint8_t* a, const uint8_t* b, const uint8_t* c, size_t count) {
    size_t i = 0;
    for (; i + kBytes <= count; i += kBytes) {
        Store(dst + i, AverageU8(AverageU8(Load(a + i), Load(c + i)), Load(b + i)));
    }
    SmoothRow_scalar(dst + i, a + i, b + i, c + i, count - i);
}

void PencilLineRow(uint8_t* dst, const uint8_t* narrow, const uint8_t* wide, size_t count,
                   const PencilLine& line) {
    const Vec threshold = Splat16(line.threshold);
    const Vec gain = Splat16(line.gain);
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const Vec depth =
            SubSatU16(SubSatU16(LoadBytes16(wide + i), LoadBytes16(narrow + i)), threshold);
        StoreBytes16(dst + i, AtMost255(MulLow16(depth, gain)));
    }
    PencilLineRow_scalar(dst + i, narrow + i, wide + i, count - i, line);
}

void PencilInkRow(uint8_t* dst, const PencilSources& sources, size_t count,
                  const PencilTone& tone) {
    const Vec full = Splat16(255);
    const Vec rubbing = Splat16(tone.rubbing);
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const Vec dark = SubSatU16(Splat16(235), LoadBytes16(sources.luma + i));
        const Vec level = AverageU16(dark, Product(dark, dark));
        const Vec even = AverageU16(AverageU16(level, Zero()), Product(level, level));
        Vec ink = AtMost255(ShiftRight16<7>(Add16(MulLow16(even, rubbing), Splat16(64))));
        for (int k = 0; k < kHatchLayers; ++k) {
            const Vec above = SubSatU16(level, Splat16(tone.layers[k].start));
            const Vec rise = MulLow16(above, Splat16(tone.layers[k].slope));
            const Vec pressure = AtMost255(ShiftRight16<4>(rise));
            const Vec stroke = SubSatU16(LoadBytes16(sources.layers[k] + i), Sub16(full, pressure));
            ink = Over(ink, Product(stroke, Splat16(196)));
        }
        const Vec hand = LoadBytes16(sources.hand + i);
        const Vec line = Product(LoadBytes16(sources.line + i), AverageU16(hand, full));
        const Vec echo = Product(LoadBytes16(sources.echo + i), ShiftRight16<1>(Sub16(full, hand)));
        ink = Invert(Product(Product(Invert(ink), Invert(line)), Invert(echo)));
        const Vec kept = ShiftRight16<2>(MulLow16(ink, Splat16(3)));
        const Vec missed = Product(LoadBytes16(sources.valleys + i), Sub16(full, kept));
        StoreBytes16(dst + i, Product(ink, Invert(missed)));
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

void PencilPaperRow(uint8_t* dst, const uint8_t* src, const uint8_t* ink, const uint8_t* valleys,
                    size_t count) {
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        const Vec graphite = LoadBytes16(ink + i);
        const Vec shade = ShiftRight16<5>(LoadBytes16(valleys + i));
        Vec color[3];
        for (int c = 0; c < 3; ++c) {
            const Vec paper = Sub16(Splat16(kPaperColor[c]), shade);
            const Vec depth = Splat16(kPaperColor[c] - kGraphiteColor[c] + 0U);
            color[c] = SubSatU16(paper, Product(graphite, depth));
        }
        const Vec blueGreen = Or(color[0], ShiftLeft16<8>(color[1]));
        Vec first = InterleaveLow16(blueGreen, color[2]);
        Vec second = InterleaveHigh16(blueGreen, color[2]);
        BlocksInOrder(first, second);
        Store(dst + i * 4, WithAlphaOf(Load(src + i * 4), first));
        Store(dst + i * 4 + kBytes, WithAlphaOf(Load(src + i * 4 + kBytes), second));
    }
    PencilPaperRow_scalar(dst + i * 4, src + i * 4, ink + i, valleys + i, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
