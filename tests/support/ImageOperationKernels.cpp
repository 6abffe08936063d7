// The catalogue's entries of the image operations.
#include <algorithm>
#include <cstring>

#include "imageutility/ResizeSteps.h"
#include "imageutility/kernels/AddBlend.h"
#include "imageutility/kernels/AlphaBlend.h"
#include "imageutility/kernels/Bilinear.h"
#include "imageutility/kernels/BoxBlur.h"
#include "imageutility/kernels/CompositeOver.h"
#include "imageutility/kernels/Contrast.h"
#include "imageutility/kernels/FillMasked.h"
#include "imageutility/kernels/ScreenBlend.h"
#include "tests/support/KernelRows.h"

namespace kyvtest {
namespace {

// For row(dst, src, count, opacity), with opacities of every kind.
constexpr auto kBlend = [](uint32_t seed) {
    const uint8_t opacities[] = {254, 255, static_cast<uint8_t>(seed * 31), 0};
    return [opacity = opacities[seed % 4]](auto form, uint8_t* dst, const uint8_t* const* src,
                                           size_t count) { form(dst, src[0], count, opacity); };
};

// The same, every other seed onto opaque pixels, for which there is a way of its own.
constexpr auto kBlendOver = [](uint32_t seed) {
    return [blend = kBlend(seed / 2), isOpaque = seed % 2 == 1](
               auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        for (size_t i = 0; isOpaque && i < count; ++i) {
            dst[i * 4 + 3] = 255;
        }
        blend(form, dst, src, count);
    };
};

KernelEntry BlendEntry(const char* table) {
    return {.table = table, .readsDst = true, .inPlace = true};
}

void AddBlends(std::vector<KernelEntry>& list) {
    list.push_back(Rows(kyv::kAlphaBlend, BlendEntry("kAlphaBlend"), kBlend));
    list.push_back(Rows(kyv::kAddBlend, BlendEntry("kAddBlend"), kBlend));
    list.push_back(Rows(kyv::kAddBlendWithAlpha, BlendEntry("kAddBlendWithAlpha"), kBlend));
    list.push_back(Rows(kyv::kCompositeOver, BlendEntry("kCompositeOver"), kBlendOver));
    KernelEntry screen = BlendEntry("kScreenBlend");
    screen.inputBits = {8, 8};
    list.push_back(Rows(kyv::kScreenBlend, screen, kUnary));
}

void AddFills(std::vector<KernelEntry>& list) {
    list.push_back(Rows(
        kyv::kContrast,
        {.table = "kContrast", .readsDst = true, .sourceBytes = {}, .inputBits = {8}},
        [](uint32_t seed) {
            const int32_t factors[] = {static_cast<int32_t>(seed * 977 % 8193), 0, 8192, 4097};
            return [factor = factors[seed % 4]](auto form, uint8_t* pixels, const uint8_t* const*,
                                                size_t count) { form(pixels, count, factor); };
        }));
    list.push_back(Rows(kyv::kFillMasked,
                        {.table = "kFillMasked", .readsDst = true, .sourceBytes = {}},
                        [](uint32_t seed) {
                            const uint32_t keep = seed % 2 ? 0xFF000000 : 0x00FFFFFF;
                            return [keep, value = seed * 0x9E3779B9 & ~keep](
                                       auto form, uint8_t* pixels, const uint8_t* const*,
                                       size_t count) { form(pixels, count, keep, value); };
                        }));
}

// From rows that are enlarged, about the same, reduced a little and by far.
Size RowToResize(Size dst, uint32_t seed) {
    const int32_t widths[] = {dst.width * 7 + 3, dst.width * 2 / 3, dst.width, dst.width * 3 / 2};
    return {std::max(widths[seed % 4], 2), dst.height};
}

void ResizeRows(kyv::BilinearRow form, const KernelBuffers& buffers) {
    const KernelBuffers::Source& source = buffers.sources[0];
    const int32_t width = buffers.size.width;
    if (width == 0) {
        return;
    }
    std::vector<uint32_t> steps(static_cast<size_t>(width) + 1);
    std::vector<int32_t> left(static_cast<size_t>(width));
    std::vector<uint8_t> weights(left.size() * 2);
    KYVImageUtility::BuildResizeSteps(steps.data(), source.size.width, width);
    KYVImageUtility::ExpandResizeSteps(left.data(), weights.data(), steps.data(), width);
    std::vector<uint8_t> shuffles(left.size() * 8);
    const size_t shuffled = KYVImageUtility::BuildResizeShuffles(shuffles.data(), left.data(),
                                                                 width, source.size.width);
    const kyv::BilinearColumns columns = {left.data(), weights.data(), shuffles.data(), shuffled};
    for (int32_t y = 0; y < buffers.size.height; ++y) {
        form(buffers.dst + y * buffers.dstPitch, source.pixels + y * source.pitch, left.size(),
             columns);
    }
}

void AddResizing(std::vector<KernelEntry>& list) {
    list.push_back(Blocks(kyv::kBilinear, {.table = "kBilinear", .sourceSize = RowToResize},
                          [](uint32_t) { return ResizeRows; }));
    list.push_back(Rows(
        kyv::kLerp, {.table = "kLerp", .inPlace = true, .sourceBytes = {4, 4}}, [](uint32_t seed) {
            return [fraction = seed * 5 % 128](auto form, uint8_t* dst, const uint8_t* const* src,
                                               size_t count) {
                form(dst, src[0], src[1], count, fraction);
            };
        }));
}

// --- Box blur

// Sums as if all rows of the windows were equal to the one that leaves.
template <class Sum, class Function>
void BlurRows(Function form, const KernelBuffers& buffers, int32_t radius, int32_t rows) {
    const int32_t width = buffers.size.width;
    const size_t border = static_cast<size_t>(radius) + 1;
    std::vector<Sum> sums((static_cast<size_t>(width) + 2 * border) * 4);
    std::vector<int32_t> columns(static_cast<size_t>(width));
    std::vector<float> reciprocals(columns.size());
    for (int32_t x = 0; x < width; ++x) {
        const auto i = static_cast<size_t>(x);
        columns[i] = std::min(x + radius, width - 1) - std::max(x - radius, 0) + 1;
        reciprocals[i] = 1.0F / static_cast<float>(columns[i]);
    }
    for (int32_t y = 0; y < buffers.size.height; ++y) {
        const uint8_t* enter = buffers.sources[0].pixels + y * buffers.sources[0].pitch;
        const uint8_t* leave = buffers.sources[1].pixels + y * buffers.sources[1].pitch;
        for (size_t i = 0; i < columns.size() * 4; ++i) {
            sums[border * 4 + i] = static_cast<Sum>(leave[i] * rows);
        }
        form(buffers.dst + y * buffers.dstPitch, sums.data() + border * 4, enter, leave,
             columns.size(), kyv::BoxWindows{radius, rows, columns.data(), reciprocals.data()});
    }
}

template <class Sum, class Function>
KernelEntry BlurEntry(const kyv::KernelTable<Function>& table, const char* name,
                      std::vector<int32_t> radii) {
    return Blocks(table, {.table = name, .sourceBytes = {4, 4}}, [radii](uint32_t seed) {
        const int32_t radius = radii[seed % radii.size()];
        const auto rows = static_cast<int32_t>(seed * 7919 % (2U * radius + 1)) + 1;
        return [radius, rows](Function form, const KernelBuffers& buffers) {
            BlurRows<Sum>(form, buffers, radius, rows);
        };
    });
}

template <class Sum, class Function>
KernelEntry ColumnsEntry(const kyv::KernelTable<Function>& table, const char* name) {
    constexpr int kBytes = 4 * sizeof(Sum);
    return Rows(table, {.table = name, .dstBytes = kBytes, .readsDst = true, .sourceBytes = {4, 4}},
                [](uint32_t) {
                    return
                        [](Function form, uint8_t* dst, const uint8_t* const* src, size_t count) {
                            // Sums are aligned in memory; the buffers need not be.
                            std::vector<Sum> sums(count * 4 + 1);
                            std::memcpy(sums.data(), dst, count * kBytes);
                            form(sums.data(), src[0], src[1], count);
                            std::memcpy(dst, sums.data(), count * kBytes);
                        };
                });
}

void AddBlur(std::vector<KernelEntry>& list) {
    list.push_back(ColumnsEntry<uint16_t>(kyv::kBoxColumns16, "kBoxColumns16"));
    list.push_back(ColumnsEntry<uint32_t>(kyv::kBoxColumns32, "kBoxColumns32"));
    list.push_back(
        BlurEntry<uint16_t>(kyv::kBoxBlur16, "kBoxBlur16", {1, 2, 5, 31, kyv::kBoxRadiusMax16}));
    list.push_back(BlurEntry<uint32_t>(kyv::kBoxBlur32, "kBoxBlur32",
                                       {1, 2, 5, 31, 127, 400, kyv::kBoxRadiusMax}));
}

} // namespace

void AddImageOperations(std::vector<KernelEntry>& list) {
    AddBlends(list);
    AddFills(list);
    AddResizing(list);
    AddBlur(list);
}

} // namespace kyvtest
