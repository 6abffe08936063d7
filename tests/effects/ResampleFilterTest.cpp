// Resampling kernels and contribution records.
#include <cmath>
#include <cstring>
#include <limits>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "effects/pip/ResampleFilter.h"

namespace {

using namespace kyv;
using testing::ElementsAre;
using testing::FloatEq;
using testing::FloatNear;

const ResampleFilter& Filter(int32_t index) {
    return *SelectResampleFilter(index, nullptr);
}

TEST(ResampleFilter, KernelsAndTheirOddities) {
    constexpr float kSupport[] = {0.5F, 0.5F, 1.0F, 2.0F, 3.0F};
    for (int32_t i = 0; i < 5; ++i) {
        EXPECT_EQ(Filter(i).GetSupport(), kSupport[i]);
    }
    EXPECT_EQ(SelectResampleFilter(5, &Filter(3)), &Filter(3));
    EXPECT_EQ(SelectResampleFilter(-1, &Filter(2)), &Filter(2));

    const ResampleFilter& point = Filter(0);
    EXPECT_EQ(point.Evaluate(0.0F), 0.0F);
    EXPECT_EQ(point.Evaluate(-0.75F), 0.75F);
    EXPECT_EQ(point.Evaluate(1.0F), 0.0F);
    const ResampleFilter& box = Filter(1);
    EXPECT_EQ(box.Evaluate(-0.5F), 0.0F);
    EXPECT_EQ(box.Evaluate(0.5F), 1.0F);
    EXPECT_EQ(box.Evaluate(0.50001F), 0.0F);
    const ResampleFilter& triangle = Filter(2);
    EXPECT_EQ(triangle.Evaluate(-0.25F), 0.75F);
    EXPECT_EQ(triangle.Evaluate(1.0F), 0.0F);
}

TEST(ResampleFilter, MitchellIsTwoCubics) {
    const ResampleFilter& mitchell = Filter(3);
    EXPECT_EQ(mitchell.Evaluate(0.0F), 8.0F / 9.0F);
    EXPECT_THAT(mitchell.Evaluate(-1.0F), FloatNear(1.0F / 18.0F, 1e-6F));
    // 7/6 * 1/8 - 2 * 1/4 + 8/9, and -7/18 * 27/8 + 2 * 9/4 - 10/3 * 3/2 + 16/9.
    EXPECT_THAT(mitchell.Evaluate(0.5F), FloatNear(0.5347222F, 1e-6F));
    EXPECT_THAT(mitchell.Evaluate(1.5F), FloatNear(-0.0347222F, 1e-6F));
    EXPECT_EQ(mitchell.Evaluate(2.0F), 0.0F);
    // Seven floats follow the object header.
    const float kept[] = {8.0F / 9.0F,   -2.0F, 7.0F / 6.0F,  16.0F / 9.0F,
                          -10.0F / 3.0F, 2.0F,  -7.0F / 18.0F};
    EXPECT_EQ(
        std::memcmp(reinterpret_cast<const char*>(&mitchell) + sizeof(void*), kept, sizeof kept),
        0);
}

TEST(ResampleFilter, LanczosFollowsTheSine) {
    const ResampleFilter& lanczos = Filter(4);
    EXPECT_EQ(lanczos.Evaluate(0.0F), 1.0F);
    EXPECT_EQ(lanczos.Evaluate(3.0F), 0.0F);
    EXPECT_EQ(lanczos.Evaluate(std::numeric_limits<float>::quiet_NaN()), 0.0F);
    for (int i = 1; i < 3000; ++i) {
        const float t = static_cast<float>(i) / 1000.0F;
        const float angle = 3.1415927F * t;
        const float wide = angle / 3.0F;
        const float expected = static_cast<float>(std::sin(static_cast<double>(angle))) / angle *
                               static_cast<float>(std::sin(static_cast<double>(wide))) / wide;
        EXPECT_EQ(lanczos.Evaluate(i % 2 ? t : -t), expected) << t;
    }
}

std::vector<float> Record(int32_t filter, float position, float scale, int32_t size) {
    const ContributionRecord record = MakeContribution(Filter(filter), position, scale, size);
    return {record.get(), record.get() + 2 + static_cast<int>(record[1])};
}

TEST(Contribution, SpansAndWeights) {
    // Triangle at 2.25: pixels 2 and 3 with 3/4 and 1/4. At half scale it reaches 0.25 to 4.25:
    // distances 1.25, 0.25, 0.75, 1.75 of 2.
    EXPECT_THAT(Record(2, 2.25F, 1.0F, 10), ElementsAre(2, 2, 0.75F, 0.25F));
    EXPECT_THAT(Record(2, 2.25F, 0.5F, 10),
                ElementsAre(1, 4, FloatEq(0.375F / 2), FloatEq(0.875F / 2), FloatEq(0.625F / 2),
                            FloatEq(0.125F / 2)));
    // Cut at the picture's edges, and made to sum to 1 again.
    EXPECT_THAT(Record(2, -0.5F, 1.0F, 10), ElementsAre(0, 1, 1));
    EXPECT_THAT(Record(2, 9.25F, 0.5F, 10),
                ElementsAre(8, 2, FloatEq(0.375F / 1.25F), FloatEq(0.875F / 1.25F)));
}

TEST(Contribution, WithoutWeightTheNearestPixelCounts) {
    const float nan = std::numeric_limits<float>::quiet_NaN();
    const float infinity = std::numeric_limits<float>::infinity();
    EXPECT_THAT(Record(0, 4.0F, 1.0F, 10), ElementsAre(4, 1, 1)); // its own weight is 0
    EXPECT_THAT(Record(1, 3.5F, 1.0F, 10), ElementsAre(3, 2, 0, 1));
    EXPECT_THAT(Record(2, -7.0F, 1.0F, 10), ElementsAre(0, 1, 1));
    EXPECT_THAT(Record(4, 1e30F, 1.0F, 10), ElementsAre(9, 1, 1));
    EXPECT_THAT(Record(4, nan, 1.0F, 10), ElementsAre(0, 1, 1));
    EXPECT_THAT(Record(4, infinity, nan, 10), ElementsAre(9, 1, 1));
    EXPECT_THAT(Record(4, 3.2F, 0.0F, 10), ElementsAre(3, 1, 1));
}

} // namespace
