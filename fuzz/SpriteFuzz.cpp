// Sub-images, sprites, resizing and blurs with sizes, positions and levels of any kind. Buffers end
// with their last pixel, so that the sanitizer sees what leaves them, and all levels must agree.
#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "imageutility/ImageUtility.h"

namespace {

using namespace KYVImageUtility;

class CInput {
public:
    CInput(const uint8_t* data, size_t size) : m_pData(data), m_nSize(size) {}

    // Zeros follow the end.
    template <class T>
    T Take() {
        T value = {};
        const size_t bytes = std::min(sizeof value, m_nSize);
        if (bytes > 0) {
            std::memcpy(&value, m_pData, bytes);
        }
        m_pData += bytes;
        m_nSize -= bytes;
        return value;
    }

    // A number of any kind, or one near small sizes, where the rules change.
    int32_t TakeNumber() { return Take<uint8_t>() % 4 == 0 ? Take<int32_t>() : Take<int8_t>(); }

    float TakePosition() {
        return Take<uint8_t>() % 4 == 0 ? Take<float>() : static_cast<float>(Take<int16_t>()) / 64;
    }

private:
    const uint8_t* m_pData;
    size_t m_nSize;
};

struct Picture {
    Picture(int32_t w, int32_t h, int32_t padding, uint32_t seed)
        : width(w), height(h), pitch(w * 4 + padding),
          bytes(w > 0 && h > 0 ? static_cast<size_t>(pitch) * (h - 1) + w * 4 : 0) {
        for (uint8_t& byte : bytes) {
            seed = seed * 1664525 + 1013904223;
            byte = static_cast<uint8_t>(seed >> 24);
        }
    }

    CImageARGB View(int32_t level) {
        CImageARGB view(bytes.empty() ? nullptr : bytes.data(), width, height, pitch);
        view.SetCpuLevel(level);
        return view;
    }

    int32_t width;
    int32_t height;
    int32_t pitch;
    std::vector<uint8_t> bytes;
};

Picture TakePicture(CInput& input) {
    const int32_t width = input.Take<uint8_t>() % 80;
    const int32_t height = input.Take<uint8_t>() % 40;
    const int32_t padding = input.Take<uint8_t>() % 16;
    return Picture(width, height, padding, input.Take<uint8_t>());
}

void Expect(bool holds) {
    if (!holds) {
        std::abort();
    }
}

void CheckSubImage(CInput& input, Picture& picture) {
    const int32_t x = input.TakeNumber();
    const int32_t y = input.TakeNumber();
    const int32_t w = input.TakeNumber();
    const int32_t h = input.TakeNumber();
    CImageARGB view;
    const CImageARGB image = picture.View(0);
    const int32_t meets = image.GetSubImage(view, x, y, w, h);
    if (!image.GetBuffer()) {
        Expect(meets == 0 && !view.GetBuffer());
        return;
    }
    const ptrdiff_t offset = view.GetBuffer() - image.GetBuffer();
    const ptrdiff_t left = offset % picture.pitch / 4;
    const ptrdiff_t top = offset / picture.pitch;
    Expect(view.GetWidth() >= 0 && view.GetHeight() >= 0);
    Expect(left + view.GetWidth() <= picture.width && top + view.GetHeight() <= picture.height);
    view.FillColor(1, 2, 3);
}

// operate(image, level) at every level; all must leave the same bytes.
template <class Operate>
void CheckLevels(Picture& picture, Operate operate) {
    const Picture start = picture;
    operate(picture, 0);
    for (const int32_t level : {3, 4, 5}) {
        Picture other = start;
        operate(other, level);
        Expect(other.bytes == picture.bytes);
    }
}

void DrawSprite(CInput& input, Picture& canvas) {
    Picture sprite = TakePicture(input);
    const int32_t mode = input.TakeNumber();
    const float x = input.TakePosition();
    const float y = input.TakePosition();
    const float w = input.TakePosition();
    const float h = input.TakePosition();
    const auto opacity = input.Take<uint8_t>();
    CheckLevels(canvas, [&](Picture& picture, int32_t level) {
        picture.View(level).DrawSprite(sprite.View(0), mode, x, y, w, h, opacity);
    });
}

void Resize(CInput& input, Picture& target) {
    Picture source = TakePicture(input);
    const int32_t mode = input.TakeNumber();
    if (mode == 1 && target.pitch > target.width * 4) {
        return; // clears what lies beyond the last row, too
    }
    CheckLevels(target, [&](Picture& picture, int32_t level) {
        CImageARGB view = picture.View(0);
        source.View(level).Resize(view, mode);
    });
}

void Blur(CInput& input, Picture& target) {
    Picture source(target.width, target.height, input.Take<uint8_t>() % 16, 1);
    const int32_t radius = input.TakeNumber();
    const bool inPlace = input.Take<uint8_t>() % 2 == 0;
    CheckLevels(target, [&](Picture& picture, int32_t level) {
        CImageARGB view = picture.View(level);
        (inPlace ? view : source.View(level)).BoxBlur(view, radius);
    });
}

void Sample(CInput& input, Picture& picture) {
    if (picture.bytes.empty()) {
        return;
    }
    uint8_t bgr[3];
    picture.View(0).SampleBilinear(
        static_cast<int32_t>(input.Take<uint32_t>() % (static_cast<uint32_t>(picture.width) << 16)),
        static_cast<int32_t>(input.Take<uint32_t>() %
                             (static_cast<uint32_t>(picture.height) << 16)),
        bgr);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    CInput input(data, size);
    Picture canvas = TakePicture(input);
    switch (input.Take<uint8_t>() % 5) {
    case 0:
        CheckSubImage(input, canvas);
        break;
    case 1:
        Resize(input, canvas);
        break;
    case 2:
        Blur(input, canvas);
        break;
    case 3:
        Sample(input, canvas);
        break;
    default:
        DrawSprite(input, canvas);
        break;
    }
    return 0;
}
