// Bilinear reading through map entries.
#include "effects/pip/QuadSampleRow.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// Offsets are worked out a block ahead of the pixels: the reads of a slanted quad follow no pattern
// that the processor would see, so they are announced to it.
constexpr size_t kRun = 64;

// What reading a picture needs, the same for every pixel.
struct Reader {
    const uint8_t* pixels;
    ptrdiff_t pitch;
    Vec pitches;
    Vec limit; // the last column and row, which have no neighbour, below 1024
};

// True in words whose place has a right or lower neighbour.
inline Vec Inside(const Reader& reader, Vec entries) {
    return GreaterS16(reader.limit, ShiftRight16<6>(entries));
}

// Byte offsets of a run's pixels, count of them, a multiple of kPixels. False when one of them has
// no right or lower neighbour in the picture.
inline bool FindOffsets(int32_t* offsets, const uint32_t* map, size_t count, const Reader& reader) {
    Vec inside = Splat8(255);
    for (size_t i = 0; i < count; i += kPixels) {
        const Vec entries = Load(map + i);
        const Vec x = And(ShiftRight32<4>(entries), Splat32(1023 << 2));
        inside = And(inside, Inside(reader, entries));
        Store(offsets + i, Add32(MulLow32(ShiftRight32<22>(entries), reader.pitches), x));
    }
    if (!AllSet(inside)) {
        return false;
    }
    for (size_t i = 0; i < count; i += 8) {
        Prefetch(reader.pixels + offsets[i]);
        Prefetch(reader.pixels + offsets[i] + reader.pitch);
    }
    return true;
}

// Between the pixels of two pairs a block, 16 bits a channel. With byte products they come 128 too
// small: with the fraction f in 1/128 the sum is (128 - f) * left + f * right, and pixels are
// signed for it, since the weight is the factor that reaches 128. Otherwise the fraction is below
// 2^15, so that the high half of a product is the difference's part, rounded down.
inline Vec Across(const uint8_t* base, const int32_t* offsets, Vec weights) {
    if constexpr (kHasMulAddBytes) {
        const Vec pairs = FromBlocks([&](size_t block) {
            return LoadHalves(base + offsets[4 * block], base + offsets[4 * block + 1]);
        });
        const Vec mixed = ShuffleBytes(
            pairs, RepeatBytes({0, 4, 1, 5, 2, 6, 3, 7, 8, 12, 9, 13, 10, 14, 11, 15}));
        return ShiftRightS16<7>(MulAddBytes(weights, Xor(mixed, Splat8(0x80))));
    } else {
        const Vec pairs = FromBlocks([&](size_t block) {
            return LoadInTurns32(base + offsets[4 * block], base + offsets[4 * block + 1]);
        });
        const Vec left = WidenLow8(pairs);
        return Add16(left, MulHighS16(weights, Sub16(WidenHigh8(pairs), left)));
    }
}

// Two pixels of each block.
inline Vec Interpolate(const Reader& reader, const int32_t* offsets, Vec weights, Vec fv) {
    const Vec top = Across(reader.pixels, offsets, weights);
    const Vec bottom = Across(reader.pixels + reader.pitch, offsets, weights);
    const Vec sum = Add16(top, MulHighS16(fv, Sub16(bottom, top)));
    return kHasMulAddBytes ? Add16(sum, Splat16(128)) : sum;
}

inline void Draw(uint8_t* dst, Vec entries, const int32_t* offsets, const Reader& reader) {
    // In both words of a pixel: u's fraction, and half of v's in 1/65536.
    const Vec fraction = And(entries, Splat16(63));
    const Vec f = MixWords(fraction, ShiftLeft32<16>(fraction));
    const Vec fv = ShiftLeft16<9>(MixWords(ShiftRight32<16>(fraction), fraction));
    // As bytes 128 - f and f, or half of it in 1/65536.
    const Vec weights =
        kHasMulAddBytes ? Add16(Sub16(ShiftLeft16<8>(f), f), Splat16(128)) : ShiftLeft16<9>(f);
    const Vec low = Interpolate(reader, offsets, DoubleLow32(weights), DoubleLow32(fv));
    const Vec high = Interpolate(reader, offsets + 2, DoubleHigh32(weights), DoubleHigh32(fv));
    Store(dst, Or(PackU16(low, high), Splat32(0xFF000000)));
}

} // namespace

void QuadSampleRow(uint8_t* dst, const uint32_t* map, size_t count, const SamplePicture& picture) {
    // Offsets have 32 bits.
    if (picture.pitch <= -(1 << 21) || picture.pitch >= 1 << 21) {
        QuadSampleRow_scalar(dst, map, count, picture);
        return;
    }
    // Entries reach no further than column and row 1023.
    const int right = picture.width - 1 < 1024 ? picture.width - 1 : 1024;
    const int lower = picture.height - 1 < 1024 ? picture.height - 1 : 1024;
    const Reader reader = {picture.pixels, picture.pitch,
                           Splat32(static_cast<uint32_t>(picture.pitch)),
                           PairOfWords(right, lower)};

    int32_t offsets[2][kRun];
    const size_t whole = count / kPixels * kPixels;
    size_t size = whole < kRun ? whole : kRun;
    bool inside = FindOffsets(offsets[0], map, size, reader);
    size_t turn = 0;
    for (size_t i = 0; i < whole; ++turn) {
        const size_t next = i + size;
        const size_t nextSize = whole - next < kRun ? whole - next : kRun;
        const bool nextInside = FindOffsets(offsets[~turn & 1], map + next, nextSize, reader);
        for (size_t k = 0; k < size; k += kPixels) {
            const Vec entries = Load(map + i + k);
            if (inside || AllSet(Inside(reader, entries))) {
                Draw(dst + (i + k) * 4, entries, offsets[turn & 1] + k, reader);
            } else {
                QuadSampleRow_scalar(dst + (i + k) * 4, map + i + k, kPixels, picture);
            }
        }
        i = next;
        size = nextSize;
        inside = nextInside;
    }
    QuadSampleRow_scalar(dst + whole * 4, map + whole, count - whole, picture);
}

} // namespace kyv::KYV_VECTOR_SET
