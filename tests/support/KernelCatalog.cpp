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
#include "tests/support/KernelRows.h"

namespace kyvtest {
namespace {

using kyv::InstructionSet;

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
    AddImageOperations(list);
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
