// Device-independent bitmaps: those of GDI on Windows, objects of our own on Linux.
#pragma once

#include <cstdint>

#include "platform/ImageFile.h"
#include "platform/Library.h"

namespace kyv {

// An HBITMAP on Windows. Null means none.
using BitmapHandle = void*;

// How GetBitmapBits32 lays out the rows.
enum class RowOrder : int32_t { TopDown = 1, BottomUp = 2 };

// A bitmap resource of a module, to be given back with DeleteBitmap. Null when there is none.
BitmapHandle LoadResourceBitmap(LibraryHandle module, uint16_t id);

// Null is allowed and does nothing.
void DeleteBitmap(BitmapHandle bitmap);

// Copies a bitmap's pixels, top down. False when the handle is no bitmap.
bool CopyBitmap(BitmapHandle bitmap, CPixelTarget& target);

// Returns width * height * 4, the bytes of a bitmap's pixels, or 0 when the handle is no bitmap.
// When pixels is given, that many bytes are written to *pixels. Colours of a palette are resolved
// and leave the fourth byte of every pixel 0; so do bitmaps of 16 and 24 bits a pixel.
uint32_t GetBitmapBits32(BitmapHandle bitmap, RowOrder rowOrder, uint8_t** pixels);

} // namespace kyv
