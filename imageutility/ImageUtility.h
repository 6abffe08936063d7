// The image classes. An image is a rectangle of pixels that it owns, or a view on memory that
// somebody else owns: a host frame, another image.
//
// Rows run top to bottom; pixel (x, y) lies y * pitch + x * bytesPerPixel bytes after the buffer's
// first byte. The class alone tells what the bytes of a pixel mean:
//
//   CImageARGB  B, G, R, A   0xAARRGGBB as a word; straight alpha, full range
//   CImageAYUV  V, U, Y, A   0xAAYYUUVV as a word; BT.601 studio range: Y 16..235, U, V 16..240
//   CImageByte  one value    masks and grey planes
//
// Operations that read pixels check first that all buffers are non-null and, where two images take
// part, that they are the same size; when a check fails they write nothing. Every operation walks
// each image by its own pitch. Where an operation has vector forms, the instruction-set level of
// the image it is called on chooses (SetCpuLevel), and every level gives the same bytes.
//
// Images have no locks: distinct images, and views that do not overlap, may be used on different
// threads at once.
#pragma once

#include <cstddef>
#include <cstdint>

namespace KYVImageUtility {

class CImageBase {
public:
    // Empty: a null buffer, no size.
    CImageBase();

    // A view of pixels that stay the caller's. Nothing is copied or checked.
    CImageBase(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch,
               int32_t bytesPerPixel);

    // Allocates pitch * height bytes, uninitialised. When that fails, or is more than a signed
    // 32-bit number holds, the buffer is null and *result, if given, 0x8007000E; otherwise 0.
    CImageBase(int32_t width, int32_t height, int32_t pitch, int32_t bytesPerPixel,
               uint32_t* result = nullptr);

    // A copy of an owner owns a deep copy; a copy of a view is another view of the same memory.
    // The decode option and the instruction-set level start afresh. Failure as above.
    CImageBase(const CImageBase& other, uint32_t* result = nullptr);

    CImageBase& operator=(const CImageBase&) = delete;

    // Frees the buffer if owned.
    virtual ~CImageBase();

    int32_t GetWidth() const { return m_nWidth; }
    int32_t GetHeight() const { return m_nHeight; }
    int32_t GetPitch() const { return m_nPitch; }
    int32_t GetPixelCount() const;
    uint8_t* GetBuffer() const { return m_pBuffer; }

    // The offset is formed in signed 32-bit arithmetic and not checked. Null for an empty image.
    uint8_t* GetPixelAddress(uint32_t x, uint32_t y) const;

    // Width and height alone are compared.
    bool IsSameSize(const CImageBase& other) const;

    // Sets pitch * height bytes from the buffer's start, padding included. Meant for whole images:
    // in a view that begins inside a row the last row's padding is not the view's.
    void FillBytes(uint8_t value);

    // The ceiling for vector code: below 3 scalar, 3 SSE2, from 4 SSSE3 and above. Returns 0.
    int32_t SetCpuLevel(int32_t level);
    int32_t GetCpuLevel() const { return m_nCpuLevel; }

    // A number handed to the image-file decoder.
    void SetDecodeOption(int32_t option) { m_nDecodeOption = option; }
    int32_t GetDecodeOption() const { return m_nDecodeOption; }

    // The first byte of row y, for 0 <= y < height; like GetPixelAddress, but it reaches all of an
    // image beyond 2 GB.
    uint8_t* Row(int32_t y) const { return m_pBuffer + static_cast<ptrdiff_t>(y) * m_nPitch; }

protected:
    // The pitch of rows without padding; -1, which no allocation accepts, when 32 bits are too few.
    static int32_t PackedPitch(int32_t width, int32_t bytesPerPixel);

    void CreateBuffer(int32_t width, int32_t height, int32_t bytesPerPixel);
    void AttachBuffer(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch,
                      int32_t bytesPerPixel);
    void CopyRowsFrom(const CImageBase& source);
    void SwapBuffers(CImageBase& other);
    int32_t MakeView(CImageBase& view, int32_t x, int32_t y, int32_t w, int32_t h) const;

private:
    void Allocate(uint32_t* result);
    void Release();

    uint8_t* m_pBuffer;
    int32_t m_nWidth;
    int32_t m_nHeight;
    int32_t m_nPitch;
    int32_t m_nBytesPerPixel;
    int32_t m_bOwnsBuffer;
    int32_t m_nDecodeOption;
    int32_t m_nCpuLevel;
};

class CImageARGB;
class CImageAYUV;
class CImageByte;

// The derived classes share these members, each with its own bytes per pixel:
//
//   Create       frees what the image owned and allocates width * height pixels without row
//                padding, uninitialised. Throws std::bad_alloc, leaving an empty image.
//   Attach       frees what the image owned and becomes a view.
//   CopyFrom     copies the pixels of an image of the same size; padding is not touched.
//   GetSubImage  makes the destination a view of the part of (x, y, w, h) that lies inside, and
//                returns 1. A rectangle that misses the image gives a view of the whole and 0; an
//                empty image returns 0 and leaves the destination alone. What the destination
//                owned is not freed and its level stays: pass a default-constructed image.

class CImageARGB : public CImageBase {
public:
    CImageARGB() = default;
    CImageARGB(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch);
    CImageARGB(int32_t width, int32_t height);
    CImageARGB(const CImageARGB& other) = default;

    void Create(int32_t width, int32_t height);
    void Attach(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch);
    void CopyFrom(const CImageARGB& source);
    int32_t GetSubImage(CImageARGB& view, int32_t x, int32_t y, int32_t w, int32_t h) const;

    // Exchanges pixels and their ownership; each image keeps its decode option and level.
    void Swap(CImageARGB& other);

    // BT.601 studio range, rounded; alpha is copied.
    void ToAYUV(CImageAYUV& destination) const;

    // Replaces B, G and R by the luma, 16..235; alpha is kept.
    void ToGray();
    void ToGray(CImageByte& destination) const;

    // Hue, saturation and lightness as bytes; 43690 / 256 = 170 is the hue of greys.
    void ToHSL(CImageByte& hue, CImageByte& saturation, CImageByte& lightness) const;
    // Sets B, G and R; alpha is kept.
    void FromHSL(const CImageByte& hue, const CImageByte& saturation, const CImageByte& lightness);
};

class CImageAYUV : public CImageBase {
public:
    CImageAYUV() = default;
    CImageAYUV(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch);
    CImageAYUV(int32_t width, int32_t height);
    CImageAYUV(const CImageAYUV& other) = default;

    void Create(int32_t width, int32_t height);
    void Attach(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch);
    void CopyFrom(const CImageAYUV& source);
    int32_t GetSubImage(CImageAYUV& view, int32_t x, int32_t y, int32_t w, int32_t h) const;

    // Clamped to 0..255; alpha is copied.
    void ToARGB(CImageARGB& destination) const;
};

class CImageByte : public CImageBase {
public:
    CImageByte() = default;
    CImageByte(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch);
    CImageByte(int32_t width, int32_t height);
    CImageByte(const CImageByte& other) = default;

    void Create(int32_t width, int32_t height);
    void CopyFrom(const CImageByte& source);
    int32_t GetSubImage(CImageByte& view, int32_t x, int32_t y, int32_t w, int32_t h) const;
};

} // namespace KYVImageUtility
