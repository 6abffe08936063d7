// GDI+ bitmaps.
#include "platform/win32/GdiPlusBitmap.h"

#include <cstring>

#include "platform/win32/PictureSize.h"

namespace kyv {
namespace {

namespace Gdip = Gdiplus::DllExports;

constexpr Gdiplus::PixelFormat kFormat = PixelFormat32bppARGB;

} // namespace

CGdiPlusSession::CGdiPlusSession() {
    const Gdiplus::GdiplusStartupInput input; // version 1, no callback, the usual thread
    m_bStarted = Gdiplus::GdiplusStartup(&m_nToken, &input, nullptr) == Gdiplus::Ok;
}

CGdiPlusSession::~CGdiPlusSession() {
    if (m_bStarted) {
        Gdiplus::GdiplusShutdown(m_nToken);
    }
}

CGdiPlusBitmap::~CGdiPlusBitmap() {
    Release();
}

void CGdiPlusBitmap::Release() {
    if (m_pBitmap) {
        Gdip::GdipDisposeImage(m_pBitmap);
        m_pBitmap = nullptr;
    }
}

void CGdiPlusBitmap::LoadFile(const wchar_t* path) {
    Release();
    CFileSource file(path);
    if (HasSaneSize(file) && Gdip::GdipCreateBitmapFromFile(path, &m_pBitmap) != Gdiplus::Ok) {
        Release();
    }
}

void CGdiPlusBitmap::Wrap(const PixelRows& pixels) {
    Release();
    if (Gdip::GdipCreateBitmapFromScan0(pixels.width, pixels.height, pixels.pitch, kFormat,
                                        const_cast<uint8_t*>(pixels.pixels),
                                        &m_pBitmap) != Gdiplus::Ok) {
        Release();
    }
}

bool CGdiPlusBitmap::CopyTo(CPixelTarget& target) const {
    UINT width = 0;
    UINT height = 0;
    if (!m_pBitmap || Gdip::GdipGetImageWidth(m_pBitmap, &width) != Gdiplus::Ok ||
        Gdip::GdipGetImageHeight(m_pBitmap, &height) != Gdiplus::Ok || width == 0 || height == 0) {
        return false;
    }
    uint8_t* const pixels =
        target.Create(static_cast<int32_t>(width), static_cast<int32_t>(height));
    if (!pixels) {
        return false;
    }
    const Gdiplus::Rect all(0, 0, static_cast<INT>(width), static_cast<INT>(height));
    Gdiplus::BitmapData data = {};
    data.Width = width;
    data.Height = height;
    data.Stride = static_cast<INT>(width) * 4;
    data.PixelFormat = kFormat;
    data.Scan0 = pixels;
    const Gdiplus::Status locked = Gdip::GdipBitmapLockBits(
        m_pBitmap, &all, Gdiplus::ImageLockModeRead | Gdiplus::ImageLockModeUserInputBuf, kFormat,
        &data);
    if (locked == Gdiplus::Ok) {
        Gdip::GdipBitmapUnlockBits(m_pBitmap, &data);
    } else if (locked == Gdiplus::OutOfMemory) {
        return false; // nothing is wrong with the picture
    } else {
        // The image keeps its new size, but not what the heap held before.
        std::memset(pixels, 0, size_t{width} * 4 * height);
    }
    return true;
}

bool CGdiPlusBitmap::Save(const wchar_t* path, const CLSID& encoder) const {
    return m_pBitmap &&
           Gdip::GdipSaveImageToFile(m_pBitmap, path, &encoder, nullptr) == Gdiplus::Ok;
}

bool CGdiPlusBitmap::Save(IStream* stream, const CLSID& encoder,
                          const Gdiplus::EncoderParameters* parameters) const {
    return m_pBitmap &&
           Gdip::GdipSaveImageToStream(m_pBitmap, stream, &encoder, parameters) == Gdiplus::Ok;
}

CGdiPlusBitmapMemory::~CGdiPlusBitmapMemory() {
    Release();
    ReleaseBlock();
}

void CGdiPlusBitmapMemory::ReleaseBlock() {
    if (m_hBlock) {
        GlobalUnlock(m_hBlock);
        GlobalFree(m_hBlock);
        m_hBlock = nullptr;
    }
}

void CGdiPlusBitmapMemory::LoadResource(HMODULE module, const char* type, uint16_t id) {
    const HRSRC resource = FindResourceA(module, MAKEINTRESOURCEA(id), type);
    const DWORD size = resource ? SizeofResource(module, resource) : 0;
    const HGLOBAL loaded = size ? ::LoadResource(module, resource) : nullptr;
    const void* const bytes = loaded ? LockResource(loaded) : nullptr;
    Load(bytes, bytes ? size : 0);
}

void CGdiPlusBitmapMemory::Load(const void* bytes, size_t size) {
    Release();
    ReleaseBlock();
    CMemorySource source(bytes, size);
    m_hBlock = HasSaneSize(source) ? GlobalAlloc(GMEM_MOVEABLE, size) : nullptr;
    if (!m_hBlock) {
        return;
    }
    void* const block = GlobalLock(m_hBlock);
    IStream* stream = nullptr;
    if (block) {
        std::memcpy(block, bytes, size);
        if (CreateStreamOnHGlobal(m_hBlock, FALSE, &stream) == S_OK) {
            if (Gdip::GdipCreateBitmapFromStream(stream, &m_pBitmap) != Gdiplus::Ok) {
                Release();
            }
            stream->Release();
        }
    }
    if (!m_pBitmap) {
        ReleaseBlock();
    }
}

} // namespace kyv
