// Whole image operations at each level.
#include "bench/Bench.h"

#include <memory>

#include "imageutility/ImageUtility.h"

namespace kyvbench {
namespace {

using namespace KYVImageUtility;

struct Images {
    CImageARGB argb[2] = {View<CImageARGB>(SharedFrames().source[0]),
                          View<CImageARGB>(SharedFrames().target)};
    CImageAYUV ayuv[2] = {View<CImageAYUV>(SharedFrames().source[0]),
                          View<CImageAYUV>(SharedFrames().target)};

    template <class Image>
    static Image View(std::vector<uint8_t>& bytes) {
        return Image(bytes.data(), kWidth, kHeight, kWidth * 4);
    }
};

// operate(source, target), each with the level set.
template <class Operate>
void AddOperation(const char* name, Operate operate) {
    for (const int32_t level : {0, 3, 4, 5}) {
        AddPrepared(name, "level " + std::to_string(level), [level, operate] {
            // The target may have been moved by a kernel with larger pixels.
            const auto images = std::make_shared<Images>();
            for (int i = 0; i < 2; ++i) {
                images->argb[i].SetCpuLevel(level);
                images->ayuv[i].SetCpuLevel(level);
            }
            return [images, operate] { operate(*images); };
        });
    }
}

// A part of a frame, for what is as large as a 1280 x 720 picture.
CImageARGB Small(const CImageARGB& image) {
    CImageARGB view(image.GetBuffer(), 1280, 720, 1280 * 4);
    view.SetCpuLevel(image.GetCpuLevel());
    return view;
}

void AddBlends() {
    AddOperation("image AlphaBlend",
                 [](Images& images) { images.argb[1].AlphaBlend(images.argb[0], 200); });
    AddOperation("image AddBlend",
                 [](Images& images) { images.argb[1].AddBlend(images.argb[0], 200); });
    AddOperation("image ScreenBlend",
                 [](Images& images) { images.argb[1].ScreenBlend(images.argb[0]); });
    AddOperation("image CompositeOver",
                 [](Images& images) { images.argb[1].CompositeOver(images.argb[0], 200); });
}

void AddResizing() {
    AddOperation("image Resize 720p to 1080p",
                 [](Images& images) { Small(images.argb[0]).Resize(images.argb[1], 0); });
    AddOperation("image Resize 1080p to 720p", [](Images& images) {
        CImageARGB small = Small(images.argb[1]);
        images.argb[0].Resize(small, 0);
    });
}

void AddBlurs() {
    for (const int32_t radius : {1, 10, 50, 100, 500}) {
        AddOperation(("image BoxBlur " + std::to_string(radius)).c_str(),
                     [radius](Images& images) { images.argb[0].BoxBlur(images.argb[1], radius); });
    }
}

} // namespace

void AddImageOperations() {
    AddOperation("image AYUV to ARGB",
                 [](Images& images) { images.ayuv[0].ToARGB(images.argb[1]); });
    AddOperation("image ARGB to AYUV",
                 [](Images& images) { images.argb[0].ToAYUV(images.ayuv[1]); });
    AddBlends();
    AddResizing();
    AddBlurs();
}

} // namespace kyvbench
