// One entry a table.
#include "tests/support/KernelCatalog.h"

#include <algorithm>
#include <array>
#include <memory>
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

// Tables as the effects make them: lines with a cap, some of them a little irregular; one time in
// four anything at all.
void FillGains(kyv::ColorTables& tables, std::mt19937& random, uint32_t seed) {
    for (auto& table : tables.channel) {
        const uint32_t gain = random() % (seed % 8 == 5 ? 0x500000 : 0x1C000);
        for (uint32_t i = 0; i < 256; ++i) {
            table[i] = std::min((i * gain) >> 16, 255U);
        }
        for (uint32_t n = seed % 3; n > 0; --n) {
            uint32_t& entry = table[random() % 256];
            entry -= entry > 0;
        }
        if (seed % 4 == 0) {
            std::generate(std::begin(table), std::end(table), [&] { return random() % 256; });
        }
    }
}

// A table that rises from 0, or from any start when the knee is 0, by one line to the knee and by
// another to the end; one time in four anything at all.
uint32_t FillKnee(uint32_t (&table)[256], std::mt19937& random, uint32_t seed) {
    const uint32_t knee = seed % 5 == 0 ? random() % 2 * 255 : random() % 256;
    // The second line is the flatter one.
    const uint32_t value = knee == 255 ? random() % 256 : knee + random() % (256 - knee);
    for (uint32_t i = 0; i < 256; ++i) {
        table[i] = seed % 4 == 0 ? random() % 256
                   : i < knee    ? i * value / knee
                   : knee == 255 ? value
                                 : value + (i - knee) * (255 - value) / (255 - knee);
    }
    return knee;
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
            const auto tables = std::make_shared<std::array<kyv::ColorTables, 2>>();
            FillGains((*tables)[0], random, seed);
            FillGains((*tables)[1], random, seed);
            const kyv::GainCurves first((*tables)[0]);
            const kyv::GainCurves second((*tables)[1]);
            return
                [tables, first, second](auto form, uint8_t* dst, const uint8_t* const* src,
                                        size_t count) { form(dst, src[0], count, first, second); };
        }));
    list.push_back(
        Rows(kyv::kWhiteBalanceRow,
             {.table = "kWhiteBalanceRow", .inPlace = true, .inputBits = {24}}, [](uint32_t seed) {
                 std::mt19937 random(seed);
                 const auto tables = std::make_shared<kyv::ColorTables>();
                 uint32_t knee[3];
                 for (int channel = 0; channel < 3; ++channel) {
                     knee[channel] = FillKnee(tables->channel[channel], random, seed);
                 }
                 const kyv::KneeCurves curves({tables->channel[0], knee[0]},
                                              {tables->channel[1], knee[1]},
                                              {tables->channel[2], knee[2]});
                 return [tables, curves](auto form, uint8_t* dst, const uint8_t* const* src,
                                         size_t count) { form(dst, src[0], count, curves); };
             }));
    AddImageOperations(list);
    AddParticles(list);
    AddStyle(list);
    AddPip(list);
    AddTransitions(list);
    return list;
}

} // namespace

const std::vector<KernelEntry>& KernelCatalog() {
    static const std::vector<KernelEntry> catalog = MakeCatalog();
    return catalog;
}

const char* NameOf(InstructionSet set) {
    switch (set) {
    case InstructionSet::Neon:
        return "neon";
    case InstructionSet::Avx512:
        return "avx512";
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
