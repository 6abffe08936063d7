// The picture decoders of the Linux half and what kyvhost makes of a file, fed with anything.
#include <algorithm>
#include <cstdlib>
#include <vector>

#include "host/ExitStatus.h"
#include "host/Picture.h"
#include "host/PictureFile.h"
#include "platform/posix/ImageCodecs.h"

namespace {

using namespace kyv;

// A header may state sizes that are plausible and still only cost time here.
constexpr int64_t kMaxPixels = 1 << 20;

class CPixels final : public CPixelTarget {
public:
    uint8_t* Create(int32_t w, int32_t h) noexcept override {
        if (width != 0 || w <= 0 || h <= 0) {
            std::abort(); // asked twice, or for nothing
        }
        width = w;
        height = h;
        if (int64_t{w} * h > kMaxPixels) {
            return nullptr;
        }
        pixels.resize(size_t{4} * static_cast<size_t>(w) * static_cast<size_t>(h));
        return pixels.data();
    }

    int32_t width = 0;
    int32_t height = 0;
    Bytes pixels;
};

// What was decoded must survive being written and read again.
void CheckRoundTrip(const CPixels& picture, bool (*encode)(const PixelRows&, Bytes&),
                    bool (*decode)(ByteView, CPixelTarget&)) {
    Bytes file;
    CPixels again;
    if (!encode({picture.pixels.data(), picture.width, picture.height, picture.width * 4}, file) ||
        !decode({file.data(), file.size()}, again) || again.pixels != picture.pixels) {
        std::abort();
    }
}

bool Decode(ByteView file) {
    CPixels picture;
    if (!DecodeImage(file, picture)) {
        return false;
    }
    if (picture.pixels.empty()) {
        std::abort();
    }
    if (picture.pixels.size() <= 1 << 14) {
        CheckRoundTrip(picture, EncodePng, DecodePng);
        CheckRoundTrip(picture, EncodeTiff, DecodeTiff);
    }
    return true;
}

uint32_t Big(const uint8_t* bytes) {
    return uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8 | bytes[3];
}

// Makes the checksums of a PNG right, which no mutation would hit upon.
void RepairPng(Bytes& file) {
    for (size_t at = 8; file.size() - at >= 12;) {
        const size_t size = Big(&file[at]);
        if (size > file.size() - at - 12) {
            return;
        }
        uint32_t crc = 0xFFFFFFFF;
        for (size_t i = at + 4; i < at + 8 + size; ++i) {
            crc ^= file[i];
            for (int bit = 0; bit < 8; ++bit) {
                crc = crc >> 1 ^ (crc & 1 ? 0xEDB88320 : 0);
            }
        }
        at += 12 + size;
        for (size_t i = 1; i <= 4; ++i, crc >>= 8) {
            file[at - i] = static_cast<uint8_t>(~crc);
        }
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const bool decoded = Decode({data, size});
    if (size > 8 && data[0] == 0x89) {
        Bytes repaired(data, data + size);
        RepairPng(repaired);
        Decode({repaired.data(), repaired.size()});
    }
    // As a file of kyvhost's, which is turned upright or refused with words for the user.
    const int orientation = kyvhost::Orientation({data, size});
    if (orientation < 1 || orientation > 8) {
        std::abort();
    }
    if (decoded) {
        try {
            const kyvhost::Picture picture = kyvhost::DecodePicture({data, size}, "input");
            if (picture.pixels.size() != size_t{4} * picture.width * picture.height) {
                std::abort();
            }
        } catch (const kyvhost::CHostError&) {
        }
    }
    // As a resource, which has no file header.
    if (size > 14 && data[0] == 'B') {
        CPixels bitmap;
        DecodeDib({data + 14, size - 14}, bitmap);
    }
    return 0;
}
