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

} // namespace

void AddImageOperations() {
    AddOperation("image AYUV to ARGB",
                 [](Images& images) { images.ayuv[0].ToARGB(images.argb[1]); });
    AddOperation("image ARGB to AYUV",
                 [](Images& images) { images.argb[0].ToAYUV(images.ayuv[1]); });
}

} // namespace kyvbench
