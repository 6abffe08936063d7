// Still pictures.
#include "host/Picture.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <new>
#include <system_error>

#include <stb/stb_image_resize.h>

#include "host/ExitStatus.h"
#include "host/PictureFile.h"
#include "hosting/Text.h"
#include "platform/ImageFile.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

// Of JPEG files: hardly to be told from the picture by eye.
constexpr int kJpegQuality = 92;

[[noreturn]] void Unreadable(const std::string& name, const std::string& why) {
    throw CHostError(ExitStatus::InputUnreadable, name + ": " + why);
}

// The whole file, or its first bytes.
std::vector<uint8_t> ReadFile(const fs::path& file, size_t most = static_cast<size_t>(-1)) {
    std::error_code error;
    if (!fs::exists(file, error)) {
        Unreadable(TextOf(file), "there is no such file");
    }
    if (fs::is_directory(file, error)) {
        Unreadable(TextOf(file), "this is a folder, not a picture or video");
    }
    std::ifstream stream(file, std::ios::binary);
    if (!stream) {
        Unreadable(TextOf(file), "the file cannot be opened");
    }
    std::vector<uint8_t> bytes;
    if (const uintmax_t size = fs::file_size(file, error); !error) {
        bytes.resize(static_cast<size_t>(std::min<uintmax_t>(size, most)));
        stream.read(reinterpret_cast<char*>(bytes.data()),
                    static_cast<std::streamsize>(bytes.size()));
        bytes.resize(static_cast<size_t>(stream.gcount()));
    }
    return bytes;
}

class CPictureTarget final : public kyv::CPixelTarget {
public:
    uint8_t* Create(int32_t width, int32_t height) noexcept override {
        try {
            picture.width = static_cast<uint32_t>(width);
            picture.height = static_cast<uint32_t>(height);
            picture.pixels.resize(size_t{picture.width} * picture.height * 4);
            return picture.pixels.data();
        } catch (const std::exception&) {
            noMemory = true;
            return nullptr;
        }
    }

    Picture picture;
    bool noMemory = false;
};

PictureKind KindOfName(const fs::path& file) {
    const std::string extension = Lower(TextOf(file.extension()));
    if (extension == ".png") {
        return PictureKind::Png;
    }
    if (extension == ".jpg" || extension == ".jpeg") {
        return PictureKind::Jpeg;
    }
    if (extension == ".tif" || extension == ".tiff") {
        return PictureKind::Tiff;
    }
    return extension == ".bmp" ? PictureKind::Bmp : PictureKind::None;
}

kyv::ImageFormat FormatOf(PictureKind kind) {
    switch (kind) {
    case PictureKind::Jpeg:
        return kyv::ImageFormat::Jpeg;
    case PictureKind::Tiff:
        return kyv::ImageFormat::Tiff;
    case PictureKind::Bmp:
        return kyv::ImageFormat::Bmp;
    default:
        return kyv::ImageFormat::Png;
    }
}

// Turns and mirrors to what orientation 1 shows.
Picture Upright(const Picture& picture, int orientation) {
    const bool swapped = orientation >= 5;
    const bool flipX = orientation == 2 || orientation == 3 || orientation == 7 || orientation == 8;
    const bool flipY = orientation == 3 || orientation == 4 || orientation == 6 || orientation == 7;
    Picture upright;
    upright.width = swapped ? picture.height : picture.width;
    upright.height = swapped ? picture.width : picture.height;
    upright.pixels.resize(picture.pixels.size());
    uint8_t* to = upright.pixels.data();
    for (uint32_t y = 0; y < upright.height; ++y) {
        for (uint32_t x = 0; x < upright.width; ++x, to += 4) {
            uint32_t column = swapped ? y : x;
            uint32_t row = swapped ? x : y;
            column = flipX ? picture.width - 1 - column : column;
            row = flipY ? picture.height - 1 - row : row;
            std::memcpy(to, &picture.pixels[(size_t{row} * picture.width + column) * 4], 4);
        }
    }
    return upright;
}

} // namespace

bool IsPictureStart(std::span<const uint8_t> bytes) {
    return KindOf(bytes) != PictureKind::None;
}

bool IsPictureFile(const fs::path& file) {
    const std::vector<uint8_t> start = ReadFile(file, kPictureStartBytes);
    // A name decides for what no decoder knows, so that the message is about pictures.
    return IsPictureStart(start) || (IsPictureName(file) && !IsAnimatedPng(start));
}

Picture DecodePicture(std::span<const uint8_t> bytes, const std::string& name) {
    if (!IsPictureStart(bytes)) {
        Unreadable(name, bytes.empty() ? "the file is empty"
                                       : "this is no PNG, JPEG, TIFF or BMP picture");
    }
    if (!IsComplete(bytes)) {
        Unreadable(name, "the picture is cut off: its end is missing");
    }
    CPictureTarget target;
    if (!kyv::DecodeMemory(bytes.data(), bytes.size(), target)) {
        if (target.noMemory) {
            throw std::bad_alloc();
        }
        Unreadable(name, "the picture is broken, cut off or of a kind that is not read");
    }
    const int orientation = Orientation(bytes);
    return orientation == 1 ? std::move(target.picture) : Upright(target.picture, orientation);
}

Picture ReadPicture(const fs::path& file) {
    return DecodePicture(ReadFile(file), TextOf(file));
}

bool IsPictureName(const fs::path& file) {
    return KindOfName(file) != PictureKind::None;
}

bool KeepsAlpha(const fs::path& file) {
    const PictureKind kind = KindOfName(file);
    return kind == PictureKind::Png || kind == PictureKind::Tiff;
}

void WritePicture(const Picture& picture, const fs::path& file, const fs::path& shown) {
    const auto width = static_cast<int32_t>(picture.width);
    std::vector<uint8_t> bytes;
    const kyv::Status status = kyv::EncodeMemory(
        FormatOf(KindOfName(shown)),
        {picture.pixels.data(), width, static_cast<int32_t>(picture.height), width * 4},
        kJpegQuality, bytes);
    if (status == kyv::kOutOfMemory) {
        throw std::bad_alloc();
    }
    errno = 0;
    std::ofstream stream(file, std::ios::binary | std::ios::trunc);
    stream.write(reinterpret_cast<const char*>(bytes.data()),
                 static_cast<std::streamsize>(bytes.size()));
    stream.close();
    if (status != kyv::kOk || !stream) {
        const std::string why = status != kyv::kOk ? ": its format does not take this size"
                                : errno            ? ": " + std::generic_category().message(errno)
                                                   : "";
        throw CHostError(ExitStatus::RenderingFailed, TextOf(shown) + " cannot be written" + why);
    }
}

Picture Resized(const Picture& picture, uint32_t width, uint32_t height) {
    Picture resized = {width, height, std::vector<uint8_t>(size_t{width} * height * 4)};
    if (!stbir_resize_uint8_generic(picture.pixels.data(), static_cast<int>(picture.width),
                                    static_cast<int>(picture.height), 0, resized.pixels.data(),
                                    static_cast<int>(width), static_cast<int>(height), 0, 4, 3, 0,
                                    STBIR_EDGE_CLAMP, STBIR_FILTER_DEFAULT, STBIR_COLORSPACE_LINEAR,
                                    nullptr)) {
        throw std::bad_alloc();
    }
    return resized;
}

} // namespace kyvhost
