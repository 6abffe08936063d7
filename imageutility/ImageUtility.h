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

#include "platform/CpuFeatures.h"

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

    int32_t GetBytesPerPixel() const { return m_nBytesPerPixel; }

    // Sets pitch * height bytes from the buffer's start, padding included. Meant for whole images:
    // in a view that begins inside a row the last row's padding is not the view's.
    void FillBytes(uint8_t value);

    // The ceiling for vector code: below 3 scalar, 3 SSE2, from 4 SSSE3 and above. Returns 0.
    int32_t SetCpuLevel(int32_t level);
    int32_t GetCpuLevel() const { return m_cpuLevel.level; }
    // As it was resolved before: the level of a callback, or that of another image.
    void TakeCpuLevel(const kyv::ResolvedLevel& level) { m_cpuLevel = level; }
    void TakeCpuLevel(const CImageBase& other) { m_cpuLevel = other.m_cpuLevel; }
    const kyv::ResolvedLevel& GetResolvedLevel() const { return m_cpuLevel; }
    kyv::InstructionSet GetInstructionSet() const { return m_cpuLevel.set; }

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
    kyv::ResolvedLevel m_cpuLevel;
};

enum ResizeMode : int32_t {
    ResizeMode_Bilinear = 0, // with 7 bits of fraction; every effect uses this one
    ResizeMode_RowPick = 1,  // equal widths only, each row a copy of the nearest. What the
                             // destination's pitch has beyond its width is set to 0, in the last
                             // row too, so not for views.
    ResizeMode_Cubic = 2,    // four taps each way: passes through the samples, rounded and clamped
};

enum SpriteMode : int32_t {
    SpriteMode_AlphaBlend = 0,
    SpriteMode_AddBlend = 1,
    SpriteMode_CompositeOver = 7,
    SpriteMode_CompositeOpaque = 8, // CompositeOver, and then the rectangle's alpha is 255
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

    // Hue, saturation and lightness as bytes; 170 is the hue of greys.
    void ToHSL(CImageByte& hue, CImageByte& saturation, CImageByte& lightness) const;
    // Sets B, G and R; alpha is kept.
    void FromHSL(const CImageByte& hue, const CImageByte& saturation, const CImageByte& lightness);

    // Scales the whole image into the whole destination, whose memory must be another. Both must
    // be at least 2 x 2. Alpha is scaled like a colour. The mode is a ResizeMode; any other number
    // does nothing. Throws std::bad_alloc, with nothing written.
    void Resize(CImageARGB& destination, int32_t mode) const;
    // The same; false when nothing was written, for callers that go on with the result.
    bool TryResize(CImageARGB& destination, int32_t mode) const;

    // The blends work on this image and a source of the same size, which may be this image itself.
    // w is source alpha times opacity, ((opacity + 1) * alpha) >> 8, that is 0..255. They treat B,
    // G and R alike, so views of AYUV pixels can be blended and scaled as well.

    // (s * w + d * (256 - w)) >> 8; alpha is kept. White over black at full weight is 254.
    void AlphaBlend(const CImageARGB& source, uint8_t opacity);
    // min(255, d + ((s * w) >> 8)). Levels 1 and 2 add alpha the same way; all others keep it.
    void AddBlend(const CImageARGB& source, uint8_t opacity);
    // 255 - (((255 - s) * (255 - d)) >> 8); alpha is kept. Two blacks give 1.
    void ScreenBlend(const CImageARGB& source);
    // Straight-alpha "over". Where w is 255 or this image is clear the source's colour is taken
    // and the alpha becomes w; where w is 0 the pixel stays.
    void CompositeOver(const CImageARGB& source, uint8_t opacity);

    // Scales the sprite into the rectangle and blends it there; positions and sizes in pixels are
    // truncated. The mode is a SpriteMode; any other number paints the rectangle opaque red, as a
    // sign of a mode that does not exist.
    // At an edge only the part of the sprite inside is drawn, if it is more than 2 pixels each way
    // in the sprite and in this image. A sprite or a rectangle of less than 2 pixels cannot be
    // scaled and is not drawn, whatever the mode but an unknown one, which needs no picture; and
    // nothing is drawn at a position that is not a number. This image's level rules throughout.
    // Throws std::bad_alloc, with nothing drawn.
    void DrawSprite(const CImageARGB& sprite, int32_t mode, float x, float y, float w, float h,
                    uint8_t opacity);

    // The bilinear B, G and R at a position in 1/65536 pixel, which the caller keeps inside:
    // 0 <= x >> 16 < width and 0 <= y >> 16 < height; nothing is checked but the buffer. In the
    // last column the right neighbour is the pixel itself, in the last row both lower ones are.
    void SampleBilinear(int32_t x, int32_t y, uint8_t* bgr) const;

    // Copies the alpha of a 4-byte image, or one channel (0 B, 1 G, 2 R, 3 alpha) from or to a byte
    // image. Sizes may differ: the destination's is meant, and a smaller source gives what it has.
    void CopyAlphaFrom(const CImageBase& source);
    void SetChannel(const CImageByte& source, int32_t channel);
    void GetChannel(CImageByte& destination, int32_t channel) const;

    // Sets the colour of every pixel and keeps alpha, or the other way round.
    void FillColor(uint8_t r, uint8_t g, uint8_t b);
    void SetAlpha(uint8_t value);
    // Sets the colour of the pixels that differ from the key by at most the tolerance in each of
    // B, G and R; alpha is kept.
    void FillColorKeyed(uint8_t keyR, uint8_t keyG, uint8_t keyB, uint8_t tolerance, uint8_t r,
                        uint8_t g, uint8_t b);

    // The adjustments keep alpha, and change nothing when their argument is out of range or not a
    // number.

    // Scales B, G and R about 128 by 0..2; 1 changes nothing. 12 bits of fraction, rounded.
    void Contrast(float factor);
    // -1 is black, 1 is white, 0 changes nothing: moves B, G and R by that part of the room there
    // is. 12 bits of fraction, rounded.
    void AdjustLightness(float amount);
    // 0 is grey, 100 changes nothing, 200 doubles the distance from the grey of the same
    // brightness. Greys stay. Rounded and clamped.
    void AdjustSaturation(int32_t percent);
    // Takes the first byte of the other image's pixel, of any kind, off B, G and R, down to 0.
    void SubtractGray(const CImageBase& gray);

    // Each byte becomes the average of the square of 2 * radius + 1 pixels around it, as far as it
    // is inside the image: sum / pixels inside, truncated. A radius that is not less than half the
    // shorter side is reduced to (shorter side - 1) / 2; 0 copies and a negative one does nothing.
    // The destination, of the same size, may be this image itself but not overlap it otherwise.
    // The cost does not depend on the radius. Throws std::bad_alloc, with nothing written.
    void BoxBlur(CImageARGB& destination, int32_t radius) const;

    // 128 plus the luma of the neighbour in a direction less that of the opposite one, clamped.
    // 0 right, 1 right and down, 2 down and so on to 7, right and up. The border repeats itself.
    void Relief(CImageByte& destination, int32_t direction) const;
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

    // As for CImageARGB.
    void CopyAlphaFrom(const CImageBase& source);
    void BoxBlur(CImageAYUV& destination, int32_t radius) const;

    // Scales R, G, B and alpha of every pixel that is not clear by factors in 1/256. The colour is
    // not clamped on the way there and back; bytes that leave their range keep the low 8 bits.
    void TintAYUV(uint8_t r, uint8_t g, uint8_t b, uint8_t a);
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

    // Writes mark where gx^2 + gy^2 > 100 * threshold and 0 elsewhere and along the border; the
    // gradients are differences of the sums of three pixels on either side. Both images must have
    // rows without padding, and the threshold be at least 1. The destination is cleared first.
    void EdgeMask(CImageByte& destination, int32_t threshold, uint8_t mark) const;
    // Raises every value that is not below the threshold by the amount, up to 255.
    void LiftAbove(uint8_t threshold, uint8_t amount);
    // Takes the other image of the same size off this one, down to 0.
    void Subtract(const CImageByte& other);
};

} // namespace KYVImageUtility
