// The catalogue's entries of the picture-in-picture.
#include <algorithm>
#include <cstring>
#include <memory>
#include <random>

#include "effects/pip/LayerRows.h"
#include "effects/pip/QuadModel.h"
#include "effects/pip/QuadSampleRow.h"
#include "tests/support/KernelRows.h"

namespace kyvtest {
namespace {

// Convex, crossing and empty quads, rectangles, quads with one pair of parallel sides, and some of
// absurd size.
kyv::CQuadModel RandomQuad(uint32_t seed) {
    std::mt19937 random(seed);
    const int range = seed % 7 == 0 ? kyv::kFarthestPoint : seed % 7 < 3 ? 12 : 90;
    const auto coordinate = [&] {
        return static_cast<float>(static_cast<int>(random() % (2U * range + 1)) - range);
    };
    kyv::RasterPointF quad[4], picture[4];
    for (kyv::RasterPointF& corner : quad) {
        corner = {coordinate(), coordinate()};
    }
    if (seed % 3 == 0) { // a parallelogram
        quad[3] = {quad[0].x + quad[2].x - quad[1].x, quad[0].y + quad[2].y - quad[1].y};
    } else if (seed % 5 == 0) { // B to C is parallel to A to D
        quad[2] = {quad[1].x + 2 * (quad[3].x - quad[0].x),
                   quad[1].y + 2 * (quad[3].y - quad[0].y)};
    }
    for (kyv::RasterPointF& corner : picture) {
        corner = {coordinate(), coordinate()};
    }
    kyv::CQuadModel model;
    model.Set(quad, picture);
    return model;
}

// Entries mostly on a smooth walk, as in a quad, and anywhere now and then.
void FillMap(std::vector<uint32_t>& map, Size size, Size picture, uint32_t seed) {
    std::mt19937 random(seed);
    const uint32_t columns = static_cast<uint32_t>(picture.width) * 64 + 1;
    map.clear();
    map.reserve(static_cast<size_t>(size.width) * static_cast<size_t>(size.height));
    for (int32_t y = 0; y < size.height; ++y) {
        uint32_t u = random() % columns;
        for (int32_t x = 0; x < size.width; ++x) {
            u += 40 + random() % 48;
            const uint32_t v = (static_cast<uint32_t>(y) * 64 + random() % 64) & 0xFFFF;
            map.push_back(random() % 400 == 0 ? static_cast<uint32_t>(random())
                                              : v << 16 | (u % columns & 0xFFFF));
        }
    }
}

void AddQuads(std::vector<KernelEntry>& list) {
    list.push_back(
        Blocks(kyv::kQuadMapRow, {.table = "kQuadMapRow", .sourceBytes = {}}, [](uint32_t seed) {
            return [model = RandomQuad(seed), left = static_cast<int>(seed % 80) -
                                                     40](auto form, const KernelBuffers& buffers) {
                std::vector<uint32_t> map(static_cast<size_t>(buffers.size.width));
                for (int32_t y = 0; y < buffers.size.height && !map.empty(); ++y) {
                    form(map.data(), left, map.size(), model.PlanRow(y));
                    std::memcpy(buffers.dst + y * buffers.dstPitch, map.data(), map.size() * 4);
                }
            };
        }));
    const auto bindSample = [](uint32_t seed) {
        // Made once for a block's size, and for a benchmark's at once, which must not time it.
        const auto map = std::make_shared<std::vector<uint32_t>>();
        if (seed == 1) {
            FillMap(*map, {1920, 1080}, {1000, 1000}, seed);
        }
        return [seed, map](auto form, const KernelBuffers& buffers) {
            const KernelBuffers::Source& source = buffers.sources[0];
            const kyv::SamplePicture picture = {source.pixels, source.pitch, source.size.width,
                                                source.size.height};
            const auto width = static_cast<size_t>(buffers.size.width);
            const auto height = static_cast<size_t>(buffers.size.height);
            if (map->size() != width * height) {
                FillMap(*map, buffers.size, source.size, seed);
            }
            for (size_t y = 0; y < height; ++y) {
                form(buffers.dst + static_cast<ptrdiff_t>(y) * buffers.dstPitch,
                     map->data() + y * width, width, picture);
            }
        };
    };
    list.push_back(Blocks(kyv::kQuadSampleRow,
                          {.table = "kQuadSampleRow",
                           .readsDst = true,
                           .sourceSize = [](Size dst, uint32_t seed) -> Size {
                               // From full reach down to pictures without neighbours.
                               if (seed == 1) {
                                   return {1000, 1000};
                               }
                               return {
                                   1 + static_cast<int32_t>(seed % 70),
                                   1 + (seed % 4 ? dst.height : static_cast<int32_t>(seed % 3))};
                           }},
                          bindSample));
}

void AddLayers(std::vector<KernelEntry>& list) {
    list.push_back(
        Rows(kyv::kColorKeyRow, {.table = "kColorKeyRow", .readsDst = true}, [](uint32_t seed) {
            const uint8_t tolerances[] = {0, 127, 255, static_cast<uint8_t>(seed)};
            const uint32_t keys[] = {seed * 2654435761U >> 8, 0xFFFFFF, 0};
            return [tolerance = tolerances[seed % 4], key = keys[seed % 3]](
                       auto form, uint8_t* pixels, const uint8_t* const* src, size_t count) {
                form(pixels, src[0], count, key, tolerance);
            };
        }));
    list.push_back(
        Rows(kyv::kGradientRow, {.table = "kGradientRow", .readsDst = true, .sourceBytes = {}},
             [](uint32_t seed) {
                 std::mt19937 random(seed);
                 std::vector<float> top(4 * 2000), rise(top.size());
                 const uint32_t range = seed % 2 ? 256 : 100000; // far outside too
                 for (size_t i = 0; i < top.size(); ++i) {
                     top[i] = static_cast<float>(random() % range) - static_cast<float>(range / 4);
                     rise[i] = static_cast<float>(random() % range) - static_cast<float>(range / 2);
                 }
                 return [top, rise, part = static_cast<float>(random() % 1000) / 999.0F](
                            auto form, uint8_t* pixels, const uint8_t* const*, size_t count) {
                     form(pixels, top.data(), rise.data(), count, part);
                 };
             }));
}

} // namespace

void AddPip(std::vector<KernelEntry>& list) {
    AddQuads(list);
    AddLayers(list);
}

} // namespace kyvtest
