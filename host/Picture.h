// Still pictures: PNG and JPEG in, PNG out.
#pragma once

#include <cstdint>
#include <filesystem>
#include <vector>

namespace kyvhost {

// Rows top down without padding, B, G, R, A in memory, straight alpha.
struct Picture {
    uint32_t width = 0;
    uint32_t height = 0;
    std::vector<uint8_t> pixels;
};

// Whether the file's first bytes or, failing that, its name say PNG or JPEG. Throws CHostError
// when there is no such file or it cannot be opened.
bool IsPictureFile(const std::filesystem::path& file);

// A JPEG is turned upright as its camera says. Throws CHostError with InputUnreadable for what is
// missing, broken or cut off.
Picture ReadPicture(const std::filesystem::path& file);

// Throws CHostError with RenderingFailed, which names the file as shown.
void WritePng(const Picture& picture, const std::filesystem::path& file,
              const std::filesystem::path& shown);

Picture Resized(const Picture& picture, uint32_t width, uint32_t height);

} // namespace kyvhost
