// Images from resources and files.
#include "imageutility/Bitmap.h"

#include <cwchar>
#include <new>
#include <optional>

namespace KYVImageUtility {
namespace {

// Receives a picture beside the destination, which changes hands only when the picture counts.
class CImageTarget final : public kyv::CPixelTarget {
public:
    uint8_t* Create(int32_t width, int32_t height) noexcept override {
        try {
            m_image.Create(width, height);
        } catch (const std::bad_alloc&) {
            return nullptr;
        }
        return m_image.GetBuffer();
    }

    void MoveTo(CImageARGB& destination) {
        if (m_image.GetBuffer()) {
            destination.Swap(m_image);
        }
    }

private:
    CImageARGB m_image;
};

// The comparison of ASCII letters; nothing else can match.
bool EqualsIgnoringCase(const wchar_t* text, const wchar_t* lower) {
    for (; *text && *lower; ++text, ++lower) {
        const wchar_t folded = *text >= L'A' && *text <= L'Z' ? *text - L'A' + L'a' : *text;
        if (folded != *lower) {
            return false;
        }
    }
    return *text == *lower;
}

struct Extension {
    const wchar_t* name;
    kyv::ImageFormat format;
};

constexpr Extension kExtensions[] = {
    {L".bmp", kyv::ImageFormat::Bmp},   {L".jpg", kyv::ImageFormat::Jpeg},
    {L".jpeg", kyv::ImageFormat::Jpeg}, {L".png", kyv::ImageFormat::Png},
    {L".tif", kyv::ImageFormat::Tiff},  {L".tiff", kyv::ImageFormat::Tiff},
};

// From the last dot on. A dot in a folder's name is no matter: what follows it has a separator.
std::optional<kyv::ImageFormat> FormatOf(const wchar_t* path) {
    const wchar_t* const dot = std::wcsrchr(path, L'.');
    for (const Extension& extension : kExtensions) {
        if (dot && EqualsIgnoringCase(dot, extension.name)) {
            return extension.format;
        }
    }
    return std::nullopt;
}

template <class Char>
void LoadFile(CImageARGB& destination, const Char* path) {
    CImageTarget target;
    int32_t decodeOption = destination.GetDecodeOption();
    const bool decoded = kyv::DecodeFile(path, decodeOption, target);
    destination.SetDecodeOption(decodeOption);
    if (decoded) {
        target.MoveTo(destination);
    }
}

} // namespace

void LoadPngResource(CImageARGB& destination, kyv::LibraryHandle module, const char* type,
                     uint16_t id) {
    CImageTarget target;
    if (kyv::DecodeResource(module, type, id, target)) {
        target.MoveTo(destination);
    }
}

void LoadBitmapResource(CImageARGB& destination, kyv::LibraryHandle module, uint16_t id) {
    const kyv::BitmapHandle bitmap = kyv::LoadResourceBitmap(module, id);
    BitmapToImage(destination, bitmap);
    kyv::DeleteBitmap(bitmap);
}

void BitmapToImage(CImageARGB& destination, kyv::BitmapHandle bitmap) {
    CImageTarget target;
    if (kyv::CopyBitmap(bitmap, target)) {
        target.MoveTo(destination);
    }
}

uint32_t GetBitmapBits32(kyv::BitmapHandle bitmap, int32_t rowOrder, uint8_t** pixels) {
    return kyv::GetBitmapBits32(bitmap, static_cast<kyv::RowOrder>(rowOrder), pixels);
}

void LoadImageFile(CImageARGB& destination, const char* path) {
    LoadFile(destination, path);
}

void LoadImageFile(CImageARGB& destination, const wchar_t* path) {
    LoadFile(destination, path);
}

kyv::Status SaveImageFile(const CImageARGB& source, const wchar_t* path) {
    const auto format = path ? FormatOf(path) : std::nullopt;
    if (!format || !source.GetBuffer() || source.GetWidth() <= 0 || source.GetHeight() <= 0 ||
        source.GetPitch() % 4 != 0) {
        return kyv::kFail;
    }
    return kyv::EncodeFile(path, *format,
                           {.pixels = source.GetBuffer(),
                            .width = source.GetWidth(),
                            .height = source.GetHeight(),
                            .pitch = source.GetPitch()});
}

} // namespace KYVImageUtility
