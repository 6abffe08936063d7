// Still pictures in memory and in files: PNG, JPEG, TIFF and BMP, through the module's own codecs.
#pragma once

#include <cstdint>
#include <filesystem>
#include <span>
#include <string>
#include <vector>

namespace kyvhost {

// Rows top down without padding, B, G, R, A in memory, straight alpha.
struct Picture {
    uint32_t width = 0;
    uint32_t height = 0;
    std::vector<uint8_t> pixels;
};

// Whether the first bytes of a file are those of a picture that DecodePicture knows.
constexpr size_t kPictureStartBytes = 4096;
bool IsPictureStart(std::span<const uint8_t> bytes);

// Whether the file's first bytes or, failing that, its name say so. Throws CHostError when there is
// no such file or it cannot be opened.
bool IsPictureFile(const std::filesystem::path& file);

// The whole of a file in memory. name is for messages. A JPEG or TIFF is turned upright as its
// camera says. Throws CHostError with InputUnreadable for what is broken or cut off.
Picture DecodePicture(std::span<const uint8_t> bytes, const std::string& name);

// The same for a file by its name.
Picture ReadPicture(const std::filesystem::path& file);

// Whether the name's extension is one that WritePicture knows: .png .jpg .jpeg .tif .tiff .bmp
bool IsPictureName(const std::filesystem::path& file);

// Whether the format of that name keeps alpha.
bool KeepsAlpha(const std::filesystem::path& file);

// Writes the format that the name's extension says. Throws CHostError with RenderingFailed, which
// names the file as shown.
void WritePicture(const Picture& picture, const std::filesystem::path& file,
                  const std::filesystem::path& shown);

Picture Resized(const Picture& picture, uint32_t width, uint32_t height);

} // namespace kyvhost
