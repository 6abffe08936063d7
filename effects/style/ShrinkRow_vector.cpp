// Shrinking.
#include "effects/style/ShrinkRow.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {

void AddRow(uint16_t* sums, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + kBytes <= count; i += kBytes) {
        for (size_t k = i; k < i + kBytes; k += kWords) {
            Store(sums + k, Add16(Load(sums + k), LoadBytes16(src + k)));
        }
    }
    AddRow_scalar(sums + i, src + i, count - i);
}

void AverageRow(uint8_t* dst, const uint16_t* sums, size_t count, int32_t bits) {
    size_t i = 0;
    if (bits > 0) {
        const Vec half = Splat32(1U << (2 * bits - 1));
        const size_t side = size_t{1} << bits;
        for (; i + kPixels <= count; i += kPixels) {
            // Pixels k, k + 4, k + 8 ... of the result, in doublewords.
            const auto average = [&](size_t k) {
                Vec sum = Zero(); // two neighbours a block; at most 65280
                for (size_t n = 0; n < side; n += 2) {
                    sum = Add16(sum, FromBlocks([&](size_t block) {
                                    return LoadBlock(sums + ((i + block * 4 + k) * side + n) * 4);
                                }));
                }
                const Vec wide = Add32(InterleaveLow16(sum, Zero()), InterleaveHigh16(sum, Zero()));
                return ShiftRightBy32(Add32(wide, half), 2 * bits);
            };
            Store(dst + i * 4,
                  PackU16(PackS32(average(0), average(1)), PackS32(average(2), average(3))));
        }
    }
    AverageRow_scalar(dst + i * 4, sums + (i << bits) * 4, count - i, bits);
}

} // namespace kyv::KYV_VECTOR_SET
