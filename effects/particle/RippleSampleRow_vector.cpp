// Reading a bent row.
#include "effects/particle/RippleSampleRow.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

struct Places {
    Vec whole;
    Vec fraction; // in both halves of each 32 bits
};

inline Places Move(Floats pixel, Floats offset, Floats last) {
    const Floats moved = MaxF32(MinF32(AddF32(pixel, offset), last), SplatF32(0.0F));
    const Vec whole = TruncateF32(moved);
    const Floats rest = SubF32(moved, F32FromS32(whole));
    return {whole, TwiceLow16(TruncateF32(MulF32(rest, SplatF32(65536.0F))))};
}

// a + floor((b - a) * fraction / 65536) in 16 bits. The multiplication takes the fraction as
// signed; where that made it negative, 65536 too little, one difference is added.
inline Vec Between(Vec a, Vec b, Vec fraction) {
    const Vec difference = Sub16(b, a);
    const Vec missing = And(difference, ShiftRightS16<15>(fraction));
    return Add16(Add16(a, missing), MulHighS16(difference, fraction));
}

// Two neighbours of each of two places a block, interpolated: two pixels of 16 bits a channel.
inline Vec Across(const uint8_t* const* place, ptrdiff_t shift, Vec fraction) {
    const Vec sorted = FromBlocks([&](size_t block) {
        return LoadInTurns32(place[4 * block] + shift, place[4 * block + 1] + shift);
    });
    return Between(WidenLow8(sorted), WidenHigh8(sorted), fraction);
}

} // namespace

void RippleSampleRow(uint8_t* dst, const RipplePicture& picture, int32_t x, int32_t y,
                     const float* offsets, size_t count) {
    const Floats lastX = SplatF32(static_cast<float>(picture.width - 1));
    const Floats lastY = SplatF32(static_cast<float>(picture.height - 1));
    const Floats row = SplatF32(static_cast<float>(y));
    const ptrdiff_t pitch = picture.pitchBytes;
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Floats offset = LoadF32(offsets + i);
        const Vec column =
            Add32(Splat32(static_cast<uint32_t>(x + static_cast<int32_t>(i))), Ascending32());
        const Places across = Move(F32FromS32(column), offset, lastX);
        const Places down = Move(row, offset, lastY);
        int32_t columns[kPixels];
        int32_t rows[kPixels];
        Store(columns, across.whole);
        Store(rows, down.whole);
        const uint8_t* place[kPixels];
        for (size_t j = 0; j < kPixels; ++j) {
            place[j] = picture.pixels + rows[j] * pitch + ptrdiff_t{columns[j]} * 4;
        }
        // The first two pixels of each block, then the last two.
        const Vec fx0 = DoubleLow32(across.fraction);
        const Vec fx1 = DoubleHigh32(across.fraction);
        const Vec first =
            Between(Across(place, 0, fx0), Across(place, pitch, fx0), DoubleLow32(down.fraction));
        const Vec second = Between(Across(place + 2, 0, fx1), Across(place + 2, pitch, fx1),
                                   DoubleHigh32(down.fraction));
        Store(dst + i * 4, Or(PackU16(first, second), Splat32(0xFF000000)));
    }
    RippleSampleRow_scalar(dst + i * 4, picture, x + static_cast<int32_t>(i), y, offsets + i,
                           count - i);
}

} // namespace kyv::KYV_VECTOR_SET
