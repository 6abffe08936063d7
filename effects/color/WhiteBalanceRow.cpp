// White balance of a row: the definition and the table of forms.
#include "effects/color/WhiteBalanceRow.h"

namespace kyv {

void WhiteBalanceRow_scalar(uint8_t* dst, const uint8_t* src, size_t count, const uint32_t* blue,
                            const uint32_t* green, const uint32_t* red) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        dst[0] = static_cast<uint8_t>(blue[src[0]]);
        dst[1] = static_cast<uint8_t>(green[src[1]]);
        dst[2] = static_cast<uint8_t>(red[src[2]]);
        dst[3] = src[3];
    }
}

constinit const KernelTable<WhiteBalanceRow> kWhiteBalanceRow = {
    .scalar = WhiteBalanceRow_scalar,
};

} // namespace kyv
