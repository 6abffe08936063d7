// Images from the module's resources and from picture files, and image files written.
//
// Pixels arrive as B, G, R, A with straight alpha, rows top down, in an image that owns them and
// has no row padding; its instruction-set level and decode option stay.
//
// Loading reports nothing and never throws. When a picture is missing, damaged or too big for the
// memory, the destination is left as it was, so callers test its buffer. On Windows a picture may
// be found damaged only when its pixels are asked for; the destination then has the picture's size
// and transparent black pixels.
//
// The functions keep no state and may be used on several threads, with different images.
#pragma once

#include <cstdint>

#include "imageutility/ImageUtility.h"
#include "platform/Bitmap.h"
#include "platform/Library.h"
#include "platform/Status.h"

namespace KYVImageUtility {

// A picture (PNG or any format of LoadImageFile) that a module holds under a type name, such as
// "PNG", and an id.
void LoadPngResource(CImageARGB& destination, kyv::LibraryHandle module, const char* type,
                     uint16_t id);

// A bitmap resource as 32-bit pixels. Alpha is 0 throughout unless the bitmap itself has 32 bits a
// pixel, whose fourth byte it then is.
void LoadBitmapResource(CImageARGB& destination, kyv::LibraryHandle module, uint16_t id);

// Copies a bitmap (an HBITMAP on Windows, one of platform/Bitmap.h on Linux), which stays the
// caller's.
void BitmapToImage(CImageARGB& destination, kyv::BitmapHandle bitmap);

// Returns width * height * 4, or 0 for what is no bitmap. With a pixel pointer given, writes that
// many bytes to where it points: rows top down for row order 1, bottom up for 2.
uint32_t GetBitmapBits32(kyv::BitmapHandle bitmap, int32_t rowOrder, uint8_t** pixels);

// A PNG, JPEG, TIFF or BMP file, whatever its name. A narrow path is in the ANSI code page on
// Windows, bytes on Linux. On Windows an external decoder component comes first, when the host has
// one and COM is initialised; it is given the destination's decode option.
void LoadImageFile(CImageARGB& destination, const char* path);
void LoadImageFile(CImageARGB& destination, const wchar_t* path);

// Writes the image in the format that the path's extension names, in any case: .bmp; .jpg, .jpeg;
// .png; .tif, .tiff. JPEG has no alpha, and readers of BMP files take every pixel as opaque; the
// other two keep the alpha. The rows' pitch must be a multiple of 4. Returns 0, or 0x80004005 for
// another extension, an empty image or a file that cannot be written, or 0x8007000E when memory
// runs out.
kyv::Status SaveImageFile(const CImageARGB& source, const wchar_t* path);

} // namespace KYVImageUtility
