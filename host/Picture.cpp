// Still pictures.
#include "host/Picture.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <memory>
#include <system_error>

#include <stb/stb_image.h>
#include <stb/stb_image_resize.h>
#include <stb/stb_image_write.h>

#include "hosting/ExitStatus.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

constexpr uint8_t kPngStart[] = {0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n'};
constexpr uint8_t kJpegStart[] = {0xFF, 0xD8, 0xFF};

[[noreturn]] void Unreadable(const fs::path& file, const std::string& why) {
    throw CHostError(ExitStatus::InputUnreadable, TextOf(file) + ": " + why);
}

// The whole file, or its first bytes.
std::vector<uint8_t> ReadFile(const fs::path& file, size_t most = static_cast<size_t>(-1)) {
    std::error_code error;
    if (!fs::exists(file, error)) {
        Unreadable(file, "there is no such file");
    }
    if (fs::is_directory(file, error)) {
        Unreadable(file, "this is a folder, not a picture or video");
    }
    std::ifstream stream(file, std::ios::binary);
    if (!stream) {
        Unreadable(file, "the file cannot be opened");
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

template <size_t N>
bool StartsWith(const std::vector<uint8_t>& bytes, const uint8_t (&start)[N]) {
    return bytes.size() >= N && std::memcmp(bytes.data(), start, N) == 0;
}

// The decoder is content with a scan that breaks off and with chunks whose end is missing; a
// picture with a grey lower half is not what a user wants to be given in silence.
bool IsComplete(const std::vector<uint8_t>& bytes) {
    if (StartsWith(bytes, kPngStart)) {
        constexpr uint8_t kEnd[] = {'I', 'E', 'N', 'D'};
        return std::search(bytes.begin(), bytes.end(), std::begin(kEnd), std::end(kEnd)) !=
               bytes.end();
    }
    constexpr uint8_t kEnd[] = {0xFF, 0xD9};
    const auto tail = std::find_end(bytes.begin(), bytes.end(), std::begin(kEnd), std::end(kEnd));
    // Behind an end marker long before the end comes an appended preview or a cut-off main scan
    // behind an embedded thumbnail; only the latter leaves a scan's start after it.
    constexpr uint8_t kScan[] = {0xFF, 0xDA};
    return tail != bytes.end() &&
           std::search(tail, bytes.end(), std::begin(kScan), std::end(kScan)) == bytes.end();
}

// The orientation 1..8 that a camera has noted in a JPEG, 1 when there is none.
int Orientation(const std::vector<uint8_t>& bytes) {
    if (!StartsWith(bytes, kJpegStart)) {
        return 1;
    }
    const auto at = [&](size_t i) { return i < bytes.size() ? size_t{bytes[i]} : size_t{0}; };
    for (size_t i = 2; at(i) == 0xFF && at(i + 1) != 0xDA;) {
        const size_t length = at(i + 2) << 8 | at(i + 3);
        const size_t tiff = i + 10; // behind the marker, the length and "Exif\0\0"
        if (at(i + 1) == 0xE1 && tiff < bytes.size() &&
            std::memcmp(&bytes[i + 4], "Exif", 5) == 0) {
            const bool little = at(tiff) == 'I';
            const auto number = [&](size_t offset, size_t size) {
                size_t value = 0;
                for (size_t k = 0; k < size; ++k) {
                    value = value << 8 | at(little ? offset + size - 1 - k : offset + k);
                }
                return value;
            };
            const size_t directory = tiff + number(tiff + 4, 4);
            const size_t entries = number(directory, 2);
            for (size_t k = 0; k < entries && directory + k * 12 < bytes.size(); ++k) {
                const size_t entry = directory + 2 + k * 12;
                if (number(entry, 2) == 0x112) {
                    const size_t value = number(entry + 8, 2);
                    return value >= 1 && value <= 8 ? static_cast<int>(value) : 1;
                }
            }
            return 1;
        }
        i += 2 + std::max<size_t>(length, 2);
    }
    return 1;
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

// RGBA to BGRA or back.
void SwapRedBlue(std::vector<uint8_t>& pixels) {
    for (size_t i = 0; i < pixels.size(); i += 4) {
        std::swap(pixels[i], pixels[i + 2]);
    }
}

} // namespace

bool IsPictureFile(const fs::path& file) {
    const std::vector<uint8_t> start = ReadFile(file, sizeof kPngStart);
    if (StartsWith(start, kPngStart) || StartsWith(start, kJpegStart)) {
        return true;
    }
    const std::string extension = Lower(TextOf(file.extension()));
    return extension == ".png" || extension == ".jpg" || extension == ".jpeg";
}

Picture ReadPicture(const fs::path& file) {
    const std::vector<uint8_t> bytes = ReadFile(file);
    if (!StartsWith(bytes, kPngStart) && !StartsWith(bytes, kJpegStart)) {
        Unreadable(file, bytes.empty() ? "the file is empty" : "this is no PNG or JPEG picture");
    }
    int width = 0, height = 0, channels = 0;
    const std::unique_ptr<stbi_uc, decltype(&stbi_image_free)> pixels(
        bytes.size() <= INT32_MAX
            ? stbi_load_from_memory(bytes.data(), static_cast<int>(bytes.size()), &width, &height,
                                    &channels, 4)
            : nullptr,
        &stbi_image_free);
    if (!pixels) {
        const char* reason = stbi_failure_reason();
        Unreadable(file, std::string("the picture is broken or cut off (") +
                             (reason ? reason : "too large") + ")");
    }
    if (!IsComplete(bytes)) {
        Unreadable(file, "the picture is cut off: its end is missing");
    }
    Picture picture;
    picture.width = static_cast<uint32_t>(width);
    picture.height = static_cast<uint32_t>(height);
    picture.pixels.assign(pixels.get(), pixels.get() + size_t{picture.width} * picture.height * 4);
    SwapRedBlue(picture.pixels);
    const int orientation = Orientation(bytes);
    return orientation == 1 ? picture : Upright(picture, orientation);
}

void WritePng(const Picture& picture, const fs::path& file, const fs::path& shown) {
    std::vector<uint8_t> pixels = picture.pixels;
    SwapRedBlue(pixels);
    errno = 0;
    std::ofstream stream(file, std::ios::binary | std::ios::trunc);
    const auto write = [](void* context, void* data, int size) {
        static_cast<std::ofstream*>(context)->write(static_cast<const char*>(data), size);
    };
    const int done = stbi_write_png_to_func(write, &stream, static_cast<int>(picture.width),
                                            static_cast<int>(picture.height), 4, pixels.data(),
                                            static_cast<int>(picture.width * 4));
    stream.close();
    if (!done || !stream) {
        const std::string why = errno ? ": " + std::generic_category().message(errno) : "";
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
