// GDI bitmaps.
#include "platform/Bitmap.h"

#include <cstdlib>
#include <cstring>

#include <windows.h>

namespace kyv {

BitmapHandle LoadResourceBitmap(LibraryHandle module, uint16_t id) {
    return LoadBitmapA(static_cast<HMODULE>(module), MAKEINTRESOURCEA(id));
}

void DeleteBitmap(BitmapHandle bitmap) {
    if (bitmap) {
        DeleteObject(bitmap);
    }
}

bool CopyBitmap(BitmapHandle bitmap, CPixelTarget& target) {
    BITMAP description = {};
    static_assert(sizeof description == 32);
    if (!bitmap || GetObjectA(bitmap, sizeof description, &description) == 0 ||
        description.bmWidth <= 0 || description.bmHeight <= 0) {
        return false;
    }
    uint8_t* pixels = target.Create(description.bmWidth, description.bmHeight);
    if (!pixels) {
        return false;
    }
    // What GDI fails to fill must not show what the heap held before.
    std::memset(pixels, 0,
                size_t{4} * static_cast<uint32_t>(description.bmWidth) *
                    static_cast<uint32_t>(description.bmHeight));
    const HDC screen = GetDC(nullptr);
    const HDC memory = CreateCompatibleDC(screen);
    const HGDIOBJ previous = SelectObject(memory, bitmap);
    const uint32_t bytes = GetBitmapBits32(bitmap, RowOrder::TopDown, &pixels);
    SelectObject(memory, previous);
    DeleteDC(memory);
    ReleaseDC(nullptr, screen);
    return bytes != 0;
}

uint32_t GetBitmapBits32(BitmapHandle bitmap, RowOrder rowOrder, uint8_t** pixels) {
    const HDC display = CreateDCA("DISPLAY", nullptr, nullptr, nullptr);
    if (!display) {
        return 0;
    }
    // Room for the colour masks that GDI may append to the header it reports.
    struct {
        BITMAPINFOHEADER header;
        RGBQUAD colors[256];
    } info = {};
    const auto Query = [&](uint32_t rows, void* bits) {
        return GetDIBits(display, static_cast<HBITMAP>(bitmap), 0, rows, bits,
                         reinterpret_cast<BITMAPINFO*>(&info), DIB_RGB_COLORS);
    };
    uint32_t bytes = 0;
    info.header.biSize = sizeof info.header;
    info.header.biBitCount = 0;
    if (Query(0, nullptr) != 0) {
        const LONG width = info.header.biWidth;
        const LONG height = std::abs(info.header.biHeight);
        bytes = static_cast<uint32_t>(width) * static_cast<uint32_t>(height) * 4;
        if (pixels && *pixels) {
            info = {};
            info.header.biSize = sizeof info.header;
            info.header.biWidth = width;
            info.header.biHeight = rowOrder == RowOrder::TopDown ? -height : height;
            info.header.biPlanes = 1;
            info.header.biBitCount = 32;
            info.header.biCompression = BI_RGB;
            if (Query(static_cast<uint32_t>(height), *pixels) == 0) {
                bytes = 0;
            }
        }
    }
    DeleteDC(display);
    return bytes;
}

} // namespace kyv
