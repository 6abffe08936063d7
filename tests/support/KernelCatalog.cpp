// One entry a table.
#include "tests/support/KernelCatalog.h"

#include <algorithm>
#include <random>
#include <utility>

#include "effects/color/ColorTemperatureRow.h"
#include "effects/color/WhiteBalanceRow.h"
#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"
#include "imageutility/kernels/ToGray.h"

namespace kyvtest {
namespace {

using kyv::InstructionSet;
using kyv::KernelTable;

// Completes an entry whose table holds row loops. bind(seed) makes the parameters and gives a
// callable row(form, dst, sources, count), where sources are the rows' first bytes.
template <class Function, class Bind>
KernelEntry Rows(const KernelTable<Function>& table, KernelEntry entry, Bind bind) {
    entry.hasForm = [&table](InstructionSet set) { return table.Exact(set) != nullptr; };
    entry.prepare = [&table, bind](uint32_t seed) -> KernelRun {
        return [&table, row = bind(seed)](InstructionSet set, const KernelBuffers& buffers) {
            const Function form = table.Exact(set);
            const uint8_t* sources[2] = {};
            for (int32_t y = 0; y < buffers.size.height; ++y) {
                for (size_t i = 0; i < buffers.sources.size(); ++i) {
                    sources[i] = buffers.sources[i].pixels + y * buffers.sources[i].pitch;
                }
                row(form, buffers.dst + y * buffers.dstPitch, sources,
                    static_cast<size_t>(buffers.size.width));
            }
        };
    };
    return entry;
}

// For row(dst, src, count).
constexpr auto kUnary = [](uint32_t) {
    return [](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
        form(dst, src[0], count);
    };
};

// For row(pixels, count).
constexpr auto kInPlaceOnly = [](uint32_t) {
    return [](auto form, uint8_t* pixels, const uint8_t* const*, size_t count) {
        form(pixels, count);
    };
};

// Tables of a straight rise, of a curve with a kink, or of anything at all.
void FillTables(kyv::ColorTables& tables, std::mt19937& random) {
    for (auto& table : tables.channel) {
        const uint32_t gain = random() % 0x20000;
        const uint32_t kind = random() % 3;
        for (uint32_t i = 0; i < 256; ++i) {
            const uint32_t rise = std::min(i * gain >> 16, 255U);
            table[i] = kind == 0 ? random() % 256 : kind == 1 ? rise : (rise + 3 * i) / 4;
        }
    }
}

std::vector<KernelEntry> MakeCatalog() {
    std::vector<KernelEntry> list;
    list.push_back(
        Rows(kyv::kToAYUV, {.table = "kToAYUV", .inPlace = true, .inputBits = {24}}, kUnary));
    list.push_back(
        Rows(kyv::kToARGB, {.table = "kToARGB", .inPlace = true, .inputBits = {24}}, kUnary));
    list.push_back(Rows(
        kyv::kToGray, {.table = "kToGray", .readsDst = true, .sourceBytes = {}, .inputBits = {24}},
        kInPlaceOnly));
    list.push_back(Rows(kyv::kToGrayBytes,
                        {.table = "kToGrayBytes", .dstBytes = 1, .inputBits = {24}}, kUnary));
    list.push_back(Rows(
        kyv::kColorTemperatureRow,
        {.table = "kColorTemperatureRow", .inPlace = true, .inputBits = {24}}, [](uint32_t seed) {
            std::mt19937 random(seed);
            kyv::ColorTables first, second;
            FillTables(first, random);
            FillTables(second, random);
            return [first, second](auto form, uint8_t* dst, const uint8_t* const* src,
                                   size_t count) { form(dst, src[0], count, first, second); };
        }));
    list.push_back(Rows(
        kyv::kWhiteBalanceRow, {.table = "kWhiteBalanceRow", .inPlace = true, .inputBits = {24}},
        [](uint32_t seed) {
            std::mt19937 random(seed);
            kyv::ColorTables tables;
            FillTables(tables, random);
            return [tables](auto form, uint8_t* dst, const uint8_t* const* src, size_t count) {
                form(dst, src[0], count, tables.channel[0], tables.channel[1], tables.channel[2]);
            };
        }));
    return list;
}

} // namespace

const std::vector<KernelEntry>& KernelCatalog() {
    static const std::vector<KernelEntry> catalog = MakeCatalog();
    return catalog;
}

const char* NameOf(InstructionSet set) {
    switch (set) {
    case InstructionSet::Avx2:
        return "avx2";
    case InstructionSet::Ssse3:
        return "ssse3";
    case InstructionSet::Sse2:
        return "sse2";
    default:
        return "scalar";
    }
}

} // namespace kyvtest
