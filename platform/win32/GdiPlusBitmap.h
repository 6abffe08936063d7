// GDI+ for the span of one call: its start-up, and the bitmaps that must not outlive it.
#pragma once

#include <cstdint>

#include <windows.h>

#include <objidl.h>

#include <gdiplus.h>

#include "platform/ImageFile.h"

namespace kyv {

// Starts GDI+ and shuts it down again. Bitmaps must be gone before it is.
class CGdiPlusSession {
public:
    CGdiPlusSession();
    ~CGdiPlusSession();

    CGdiPlusSession(const CGdiPlusSession&) = delete;
    CGdiPlusSession& operator=(const CGdiPlusSession&) = delete;

    bool IsStarted() const { return m_bStarted; }

private:
    ULONG_PTR m_nToken = 0;
    bool m_bStarted;
};

// Owns one GDI+ bitmap, or none.
class CGdiPlusBitmap {
public:
    CGdiPlusBitmap() = default;
    virtual ~CGdiPlusBitmap();

    CGdiPlusBitmap(const CGdiPlusBitmap&) = delete;
    CGdiPlusBitmap& operator=(const CGdiPlusBitmap&) = delete;

    void LoadFile(const wchar_t* path);

    // A bitmap on the caller's pixels, which must outlive it. Nothing is copied.
    void Wrap(const PixelRows& pixels);

    // Creates the target at the bitmap's size and lets GDI+ write straight into it. False, with
    // nothing created, when there is no bitmap.
    bool CopyTo(CPixelTarget& target) const;

    // False when there is no bitmap or GDI+ cannot write the file.
    bool Save(const wchar_t* path, const CLSID& encoder) const;

    // The same into a stream; parameters may be null.
    bool Save(IStream* stream, const CLSID& encoder,
              const Gdiplus::EncoderParameters* parameters) const;

protected:
    void Release();

    Gdiplus::GpBitmap* m_pBitmap = nullptr;
};

// A bitmap decoded from memory, with the memory block behind its stream: GDI+ may read the stream
// as late as when the pixels are asked for.
class CGdiPlusBitmapMemory : public CGdiPlusBitmap {
public:
    CGdiPlusBitmapMemory() = default;
    ~CGdiPlusBitmapMemory() override;

    // Copies the bytes.
    void Load(const void* bytes, size_t size);

    void LoadResource(HMODULE module, const char* type, uint16_t id);

private:
    void ReleaseBlock();

    HGLOBAL m_hBlock = nullptr;
};

} // namespace kyv
