// The colour corrections' tables are recognised as lines, so that vector code runs at every
// setting.
#include <gtest/gtest.h>

#include "effects/color/ColorTemperature.h"
#include "effects/color/WhiteBalance.h"
#include "effects/color/WhiteBalanceRow.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;

TEST(ColorCurves, EveryDegreeOfTheColourTemperatureIsALine) {
    CTestInstance instance(Effect("Kyv_Dsp_Co_Temperature"), 1, 1);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    const auto& data =
        *static_cast<kyv::ColorTemperature::Instance*>(instance.Context().instanceData);
    uint32_t pixel = 0;
    // Steps of sliders; 1/128 has the gains just below fractions, such as 1.15 at 0.5.
    for (const int steps : {100, 128, 1000}) {
        for (int i = -steps; i <= steps; ++i) {
            const float degree = static_cast<float>(i) / static_cast<float>(steps);
            instance.Set("P1", degree);
            instance.Set("P3", degree);
            ASSERT_EQ(instance.Render(&pixel, &pixel), KYV_OK);
            EXPECT_TRUE(kyv::GainCurves(data.temperature).exact) << "temperature " << degree;
            EXPECT_TRUE(kyv::GainCurves(data.tint).exact) << "tint " << degree;
        }
    }
}

TEST(ColorCurves, EveryReferenceOfTheWhiteBalanceIsTwoLines) {
    CTestInstance instance(Effect("Kyv_Dsp_Co_WhiteBalance"), 1, 1);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    const auto& data = *static_cast<kyv::WhiteBalance::Instance*>(instance.Context().instanceData);
    uint32_t pixel = 0;
    for (uint32_t r = 0; r < 256; r += 5) {
        for (uint32_t g = 0; g < 256; g += 17) {
            for (uint32_t b = 0; b < 256; b += 15) {
                instance.Set("P1", r | g << 8 | b << 16);
                ASSERT_EQ(instance.Render(&pixel, &pixel), KYV_OK);
                EXPECT_TRUE(kyv::KneeCurves({data.blue, b}, {data.green, g}, {data.red, r}).exact)
                    << r << ", " << g << ", " << b;
            }
        }
    }
}

} // namespace
