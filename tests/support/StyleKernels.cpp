// The catalogue's entries of the style effects.
#include <algorithm>
#include <random>
#include <vector>

#include "effects/style/DreamyRow.h"
#include "effects/style/HighlightRow.h"
#include "effects/style/MaskMixRow.h"
#include "effects/style/PencilRow.h"
#include "effects/style/RayRow.h"
#include "effects/style/ShrinkRow.h"
#include "tests/support/KernelRows.h"

namespace kyvtest {
namespace {

// Sums of rows lie in memory as words, aligned as they are.
std::vector<uint16_t> WordsOf(const uint8_t* bytes, size_t count, uint16_t limit) {
    std::vector<uint16_t> words(count);
    std::copy_n(bytes, count * 2, reinterpret_cast<uint8_t*>(words.data())); // count may be 0
    for (uint16_t& word : words) {
        word = static_cast<uint16_t>(word % (limit + 1U));
    }
    return words;
}

auto BindAdd(uint32_t) {
    return [](kyv::AddRow form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        std::vector<uint16_t> sums = WordsOf(dst, count, 65280 - 255);
        form(sums.data(), src[0], count);
        std::copy_n(reinterpret_cast<const uint8_t*>(sums.data()), count * 2, dst);
    };
}

int32_t ShrinkBits(uint32_t seed) {
    return static_cast<int32_t>(seed % (kyv::kMostShrinkBits + 1));
}

auto BindAverage(uint32_t seed) {
    return [bits = ShrinkBits(seed)](kyv::AverageRow form, const KernelBuffers& buffers) {
        const auto count = static_cast<size_t>(buffers.size.width);
        const auto limit = static_cast<uint16_t>(255 << bits);
        for (int32_t y = 0; y < buffers.size.height; ++y) {
            const auto sums = WordsOf(buffers.sources[0].pixels + y * buffers.sources[0].pitch,
                                      count << bits << 2, limit);
            form(buffers.dst + y * buffers.dstPitch, sums.data(), count, bits);
        }
    };
}

auto BindHighlight(uint32_t seed) {
    std::mt19937 random(seed);
    const kyv::Highlight highlight = {static_cast<uint8_t>(random() % 255),
                                      static_cast<uint16_t>(1 + random() % 256)};
    return [highlight](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        form(dst, src[0], count, highlight);
    };
}

auto BindVeil(uint32_t seed) {
    std::mt19937 random(seed);
    const auto share = [&](uint32_t least) {
        return static_cast<uint16_t>(seed % 4 == 0 ? 256 : least + random() % (257 - least));
    };
    const kyv::DreamyMix mix = {.soft = share(1), .glow = share(0), .depth = share(0)};
    return [mix](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        form(dst, src[0], src[1], count, mix);
    };
}

// Words of light in the buffers, which need not be aligned.
std::vector<uint16_t> LightOf(const uint8_t* bytes, size_t count) {
    return WordsOf(bytes, count, 65535);
}

auto BindRayShade(uint32_t) {
    return [](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        const auto shadows = LightOf(src[1], count);
        std::vector<uint16_t> result(count * 4);
        form(result.data(), src[0], shadows.data(), count);
        std::copy_n(reinterpret_cast<const uint8_t*>(result.data()), count * 8, dst);
    };
}

auto BindRayLerp(uint32_t seed) {
    const uint16_t fraction = seed % 4 == 0   ? 0
                              : seed % 4 == 1 ? 65535
                                              : std::mt19937(seed)() & 65535;
    return [fraction](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        const auto upper = LightOf(src[0], count);
        const auto lower = LightOf(src[1], count);
        std::vector<uint16_t> result(count);
        form(result.data(), upper.data(), lower.data(), count, fraction);
        std::copy_n(reinterpret_cast<const uint8_t*>(result.data()), count * 2, dst);
    };
}

auto BindRayStep(uint32_t seed) {
    return [seed](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        const auto own = LightOf(src[0], count * 4);
        auto row = LightOf(src[1], count * 4);
        row.resize((count + 1) * 4, 65535); // there are always two neighbours
        std::mt19937 random(seed);
        std::vector<int32_t> left(count);
        std::vector<uint16_t> fractions(count);
        for (size_t i = 0; i < count; ++i) {
            left[i] = static_cast<int32_t>(random() % count);
            fractions[i] = static_cast<uint16_t>(random());
        }
        const auto brought = static_cast<uint16_t>(random());
        std::vector<uint16_t> result(count * 4);
        form(result.data(), own.data(), row.data(), count, {left.data(), fractions.data()},
             {static_cast<uint16_t>(65535 - brought), brought});
        std::copy_n(reinterpret_cast<const uint8_t*>(result.data()), count * 8, dst);
    };
}

auto BindLine(uint32_t seed) {
    const kyv::PencilLine line = {static_cast<uint8_t>(seed % 3 == 0 ? 0 : seed * 7),
                                  static_cast<uint8_t>(seed * 31)};
    return [line](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        form(dst, src[0], src[1], count, line);
    };
}

auto BindInk(uint32_t seed) {
    std::mt19937 random(seed);
    kyv::PencilTone tone = {};
    for (kyv::HatchTone& layer : tone.layers) {
        layer = {static_cast<uint8_t>(random()), static_cast<uint8_t>(random())};
    }
    tone.rubbing = static_cast<uint8_t>(random());
    return [tone](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        form(dst, {src[0], src[1], src[2], {src[3], src[4], src[5], src[6]}, src[7], src[8]}, count,
             tone);
    };
}

} // namespace

void AddStyle(std::vector<KernelEntry>& list) {
    list.push_back(Rows(kyv::kAddRow,
                        {.table = "kAddRow", .dstBytes = 2, .readsDst = true, .sourceBytes = {1}},
                        BindAdd));
    list.push_back(Blocks(kyv::kAverageRow,
                          {.table = "kAverageRow",
                           .sourceBytes = {8},
                           .sourceSize =
                               [](Size dst, uint32_t seed) {
                                   return Size{dst.width << ShrinkBits(seed), dst.height};
                               }},
                          BindAverage));
    list.push_back(Rows(kyv::kHighlightRow,
                        {.table = "kHighlightRow", .inPlace = true, .inputBits = {24}},
                        BindHighlight));
    list.push_back(Rows(kyv::kDreamyVeilRow,
                        {.table = "kDreamyVeilRow", .inPlace = true, .sourceBytes = {4, 4}},
                        BindVeil));
    list.push_back(Rows(kyv::kDreamyRow,
                        {.table = "kDreamyRow", .inPlace = true, .sourceBytes = {4, 4}},
                        [](uint32_t) {
                            return [](auto form, uint8_t* dst, const uint8_t* const* src,
                                      size_t count) { form(dst, src[0], src[1], count); };
                        }));
    list.push_back(Rows(kyv::kMaskMixRow,
                        {.table = "kMaskMixRow", .inPlace = true, .sourceBytes = {4, 4, 1}},
                        [](uint32_t) {
                            return [](auto form, uint8_t* dst, const uint8_t* const* src,
                                      size_t count) { form(dst, src[0], src[1], src[2], count); };
                        }));
    list.push_back(Rows(kyv::kRayShadeRow,
                        {.table = "kRayShadeRow", .dstBytes = 8, .sourceBytes = {4, 2}},
                        BindRayShade));
    list.push_back(Rows(kyv::kRayLerpRow,
                        {.table = "kRayLerpRow", .dstBytes = 2, .sourceBytes = {2, 2}},
                        BindRayLerp));
    list.push_back(Rows(kyv::kRayStepRow,
                        {.table = "kRayStepRow", .dstBytes = 8, .sourceBytes = {8, 8}},
                        BindRayStep));
    list.push_back(Rows(kyv::kRayAddRow,
                        {.table = "kRayAddRow", .inPlace = true, .sourceBytes = {4, 4}},
                        [](uint32_t) {
                            return [](auto form, uint8_t* dst, const uint8_t* const* src,
                                      size_t count) { form(dst, src[0], src[1], count); };
                        }));
    list.push_back(Rows(kyv::kSmoothRow,
                        {.table = "kSmoothRow",
                         .dstBytes = 1,
                         .inPlace = true,
                         .sourceBytes = {1, 1, 1},
                         .inputBits = {8, 8, 8}},
                        [](uint32_t) {
                            return [](auto form, uint8_t* dst, const uint8_t* const* src,
                                      size_t count) { form(dst, src[0], src[1], src[2], count); };
                        }));
    list.push_back(Rows(kyv::kPencilLineRow,
                        {.table = "kPencilLineRow",
                         .dstBytes = 1,
                         .inPlace = true,
                         .sourceBytes = {1, 1},
                         .inputBits = {8, 8}},
                        BindLine));
    list.push_back(
        Rows(kyv::kPencilInkRow,
             {.table = "kPencilInkRow", .dstBytes = 1, .sourceBytes = {1, 1, 1, 1, 1, 1, 1, 1, 1}},
             BindInk));
    list.push_back(Rows(kyv::kPencilPaperRow,
                        {.table = "kPencilPaperRow", .inPlace = true, .sourceBytes = {4, 1, 1}},
                        [](uint32_t) {
                            return [](auto form, uint8_t* dst, const uint8_t* const* src,
                                      size_t count) { form(dst, src[0], src[1], src[2], count); };
                        }));
}

} // namespace kyvtest
