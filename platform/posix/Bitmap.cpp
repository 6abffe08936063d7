// Device-independent bitmaps on Linux: pixels already resolved to 32 bits.
#include "platform/Bitmap.h"

#include <cstring>
#include <memory>
#include <new>

#include "platform/posix/ImageCodecs.h"
#include "platform/posix/Resource.h"

namespace kyv {
namespace {

// What a handle leads to.
class CBitmap final : public CPixelTarget {
public:
    uint8_t* Create(int32_t width, int32_t height) noexcept override {
        m_pPixels.reset(new (std::nothrow) uint8_t[size_t{4} * width * height]);
        m_nWidth = width;
        m_nHeight = height;
        return m_pPixels.get();
    }

    int32_t Width() const { return m_nWidth; }
    int32_t Height() const { return m_nHeight; }
    size_t RowBytes() const { return size_t{4} * m_nWidth; }
    const uint8_t* Row(int32_t y) const { return m_pPixels.get() + RowBytes() * y; }

private:
    std::unique_ptr<uint8_t[]> m_pPixels;
    int32_t m_nWidth = 0;
    int32_t m_nHeight = 0;
};

} // namespace

BitmapHandle LoadResourceBitmap(LibraryHandle module, uint16_t id) {
    const ByteView dib = FindResource(module, "BITMAP", id);
    std::unique_ptr<CBitmap> bitmap(new (std::nothrow) CBitmap);
    return bitmap && DecodeDib(dib, *bitmap) ? bitmap.release() : nullptr;
}

void DeleteBitmap(BitmapHandle bitmap) {
    delete static_cast<CBitmap*>(bitmap);
}

bool CopyBitmap(BitmapHandle bitmap, CPixelTarget& target) {
    if (!bitmap) {
        return false;
    }
    const auto& source = *static_cast<const CBitmap*>(bitmap);
    uint8_t* pixels = target.Create(source.Width(), source.Height());
    return pixels && GetBitmapBits32(bitmap, RowOrder::TopDown, &pixels) != 0;
}

uint32_t GetBitmapBits32(BitmapHandle bitmap, RowOrder rowOrder, uint8_t** pixels) {
    if (!bitmap) {
        return 0;
    }
    const auto& source = *static_cast<const CBitmap*>(bitmap);
    if (pixels && *pixels) {
        for (int32_t y = 0; y < source.Height(); ++y) {
            const int32_t row = rowOrder == RowOrder::TopDown ? y : source.Height() - 1 - y;
            std::memcpy(*pixels + source.RowBytes() * y, source.Row(row), source.RowBytes());
        }
    }
    return static_cast<uint32_t>(source.RowBytes() * source.Height());
}

} // namespace kyv
