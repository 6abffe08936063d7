// Picture files and picture resources on Windows.
#include "platform/ImageFile.h"

#include <cstdlib>
#include <cwchar>
#include <memory>
#include <new>

#include "platform/win32/ExternalDecoder.h"
#include "platform/win32/GdiPlusBitmap.h"

namespace kyv {
namespace {

struct FreeBlock {
    void operator()(void* block) const { std::free(block); }
};

const wchar_t* MimeType(ImageFormat format) {
    switch (format) {
    case ImageFormat::Bmp:
        return L"image/bmp";
    case ImageFormat::Jpeg:
        return L"image/jpeg";
    case ImageFormat::Png:
        return L"image/png";
    case ImageFormat::Tiff:
        return L"image/tiff";
    }
    return L"";
}

// The index of the encoder in GDI+'s list, or -1.
int FindEncoder(const wchar_t* mimeType, CLSID& encoder) {
    UINT count = 0;
    UINT bytes = 0;
    if (Gdiplus::GetImageEncodersSize(&count, &bytes) != Gdiplus::Ok || bytes == 0) {
        return -1;
    }
    const std::unique_ptr<void, FreeBlock> block(std::malloc(bytes));
    auto* const codecs = static_cast<Gdiplus::ImageCodecInfo*>(block.get());
    if (!codecs || Gdiplus::GetImageEncoders(count, bytes, codecs) != Gdiplus::Ok) {
        return -1;
    }
    for (UINT i = 0; i < count; ++i) {
        if (std::wcscmp(codecs[i].MimeType, mimeType) == 0) {
            encoder = codecs[i].Clsid;
            return static_cast<int>(i);
        }
    }
    return -1;
}

// COM is the host's to initialise; where it has not, there is no component.
ExternalDecoder* CreateExternalDecoder() {
    void* decoder = nullptr;
    const HRESULT result = CoCreateInstance(kExternalDecoderClass, nullptr, CLSCTX_INPROC_SERVER,
                                            kExternalDecoderInterface, &decoder);
    return SUCCEEDED(result) ? static_cast<ExternalDecoder*>(decoder) : nullptr;
}

bool DecodeWith(ExternalDecoder* decoder, const wchar_t* path, int32_t& decodeOption,
                CPixelTarget& target) {
    const ExternalDecoderTable& table = *decoder->table;
    void* object = nullptr;
    if (SUCCEEDED(table.QueryInterface(decoder, &kExternalDecoderOptionsInterface, &object)) &&
        object) {
        auto* const options = static_cast<ExternalDecoderOptions*>(object);
        options->table->SetOption(options, kExternalDecoderOption, &decodeOption);
        options->table->Release(options);
    }
    if (FAILED(table.Open(decoder, path))) {
        return false;
    }
    const int32_t width = table.GetWidth(decoder);
    const int32_t height = table.GetHeight(decoder);
    uint8_t* const pixels = width > 0 && height > 0 ? target.Create(width, height) : nullptr;
    return pixels && SUCCEEDED(table.GetPixels(decoder, pixels, width, height, width * 4));
}

} // namespace

bool HasResource(LibraryHandle module, const char* type, uint16_t id) {
    return type && FindResourceA(static_cast<HMODULE>(module), MAKEINTRESOURCEA(id), type);
}

bool DecodeResource(LibraryHandle module, const char* type, uint16_t id, CPixelTarget& target) {
    const CGdiPlusSession session;
    if (!session.IsStarted() || !type) {
        return false;
    }
    CGdiPlusBitmapMemory bitmap;
    bitmap.LoadResource(static_cast<HMODULE>(module), type, id);
    return bitmap.CopyTo(target);
}

bool DecodeMemory(const uint8_t* file, size_t size, CPixelTarget& target) {
    const CGdiPlusSession session;
    if (!session.IsStarted() || !file) {
        return false;
    }
    CGdiPlusBitmapMemory bitmap;
    bitmap.Load(file, size);
    return bitmap.CopyTo(target);
}

bool DecodeFile(const char* path, int32_t& decodeOption, CPixelTarget& target) {
    const int units = path ? MultiByteToWideChar(CP_ACP, 0, path, -1, nullptr, 0) : 0;
    if (units <= 0) {
        return false;
    }
    const std::unique_ptr<wchar_t[]> wide(new (std::nothrow) wchar_t[static_cast<size_t>(units)]);
    return wide && MultiByteToWideChar(CP_ACP, 0, path, -1, wide.get(), units) > 0 &&
           DecodeFile(wide.get(), decodeOption, target);
}

bool DecodeFile(const wchar_t* path, int32_t& decodeOption, CPixelTarget& target) {
    if (!path || std::wcslen(path) >= kMaxPathUnits) {
        return false;
    }
    // A component that exists has the last word, even when it cannot open the file.
    if (ExternalDecoder* const decoder = CreateExternalDecoder()) {
        const bool decoded = DecodeWith(decoder, path, decodeOption, target);
        decoder->table->Release(decoder);
        return decoded;
    }
    const CGdiPlusSession session;
    if (!session.IsStarted()) {
        return false;
    }
    CGdiPlusBitmap bitmap;
    bitmap.LoadFile(path);
    return bitmap.CopyTo(target);
}

Status EncodeFile(const wchar_t* path, ImageFormat format, const PixelRows& source) {
    const CGdiPlusSession session;
    if (!session.IsStarted()) {
        return kFail;
    }
    const std::unique_ptr<CGdiPlusBitmap> bitmap(new (std::nothrow) CGdiPlusBitmap);
    if (!bitmap) {
        return kOutOfMemory;
    }
    bitmap->Wrap(source);
    CLSID encoder;
    if (FindEncoder(MimeType(format), encoder) < 0 || !bitmap->Save(path, encoder)) {
        return kFail;
    }
    return kOk;
}

namespace {

struct ReleaseStream {
    void operator()(IStream* stream) const { stream->Release(); }
};

bool ReadAll(IStream* stream, std::vector<uint8_t>& file) {
    STATSTG status = {};
    ULONG count = 0;
    if (FAILED(stream->Stat(&status, STATFLAG_NONAME)) || status.cbSize.HighPart != 0 ||
        FAILED(stream->Seek({}, STREAM_SEEK_SET, nullptr))) {
        return false;
    }
    file.resize(status.cbSize.LowPart);
    return SUCCEEDED(stream->Read(file.data(), status.cbSize.LowPart, &count)) &&
           count == file.size();
}

} // namespace

Status EncodeMemory(ImageFormat format, const PixelRows& source, int quality,
                    std::vector<uint8_t>& file) {
    const CGdiPlusSession session;
    IStream* made = nullptr;
    if (!session.IsStarted() || CreateStreamOnHGlobal(nullptr, TRUE, &made) != S_OK) {
        return kFail;
    }
    const std::unique_ptr<IStream, ReleaseStream> stream(made);
    CGdiPlusBitmap bitmap;
    bitmap.Wrap(source);
    CLSID encoder;
    ULONG value = static_cast<ULONG>(quality);
    Gdiplus::EncoderParameters parameters = {};
    parameters.Count = 1;
    parameters.Parameter[0] = {Gdiplus::EncoderQuality, 1, Gdiplus::EncoderParameterValueTypeLong,
                               &value};
    if (FindEncoder(MimeType(format), encoder) < 0 ||
        !bitmap.Save(stream.get(), encoder, format == ImageFormat::Jpeg ? &parameters : nullptr)) {
        return kFail;
    }
    try {
        return ReadAll(stream.get(), file) ? kOk : kFail;
    } catch (const std::bad_alloc&) {
        return kOutOfMemory;
    }
}

} // namespace kyv
