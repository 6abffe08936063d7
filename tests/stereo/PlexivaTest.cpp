// The stereo helper, loaded and called as an effect does: by its exports and by slot number.
#include <filesystem>
#include <limits>

#include <gtest/gtest.h>

#include "platform/Library.h"
#include "stereo/Plexiva.h"

namespace {

constexpr PlexivaStatus kNullPointer = 0x80004003;
constexpr PlexivaStatus kInvalid = 0x80070057;

class Plexiva : public testing::Test {
protected:
    Plexiva() : m_library(kyv::OpenLibrary(std::filesystem::path(KYV_STEREO_FILE).native())) {
        m_get = reinterpret_cast<void* (*)()>(kyv::FindSymbol(m_library, "GetPlexiva"));
        m_release = reinterpret_cast<void (*)(void*)>(kyv::FindSymbol(m_library, "ReleasePlexiva"));
        m_object = m_get();
    }

    ~Plexiva() override {
        m_release(m_object);
        kyv::CloseLibrary(m_library);
    }

    static void* Slot(void* object, int slot) { return (*static_cast<void***>(object))[slot]; }

    static PlexivaStatus Configure(void* object, const int32_t* view) {
        const auto call =
            reinterpret_cast<PlexivaStatus (*)(void*, const int32_t*, int32_t, int32_t)>(
                Slot(object, 1));
        return call(object, view, 16, 9);
    }

    static PlexivaStatus Configure(void* object, int32_t width) {
        const int32_t view[] = {20, 16, 9, width, 480, 4 * 4000};
        return Configure(object, view);
    }

    static PlexivaStatus GetParallax(void* object, float depth, float* shift) {
        return reinterpret_cast<PlexivaStatus (*)(void*, float, float*)>(Slot(object, 4))(
            object, depth, shift);
    }

    static float Shift(void* object, float depth) {
        float shift = std::numeric_limits<float>::quiet_NaN();
        EXPECT_EQ(GetParallax(object, depth, &shift), 0U);
        return shift;
    }

    kyv::LibraryHandle m_library;
    void* (*m_get)();
    void (*m_release)(void*);
    void* m_object;
};

// A view of 2000 pixels: 1 % of it is 20, 1.5 % is 30.
TEST_F(Plexiva, ShiftsAViewInProportionToDepthAndWidth) {
    ASSERT_EQ(Configure(m_object, 2000), 0U);
    EXPECT_FLOAT_EQ(Shift(m_object, 1.0F), 20.0F); // behind the screen
    EXPECT_FLOAT_EQ(Shift(m_object, 0.25F), 5.0F);
    EXPECT_EQ(Shift(m_object, 0.0F), 0.0F);
    EXPECT_FLOAT_EQ(Shift(m_object, -0.5F), -15.0F); // in front
    EXPECT_FLOAT_EQ(Shift(m_object, -1.0F), -30.0F);
    ASSERT_EQ(Configure(m_object, 50), 0U);
    EXPECT_FLOAT_EQ(Shift(m_object, 0.5F), 0.25F); // fractions of a pixel are kept
}

TEST_F(Plexiva, BoundsDepthsOutsideItsRange) {
    constexpr float kInfinity = std::numeric_limits<float>::infinity();
    ASSERT_EQ(Configure(m_object, 2000), 0U);
    EXPECT_EQ(Shift(m_object, 1.5F), Shift(m_object, 1.0F));
    EXPECT_EQ(Shift(m_object, kInfinity), Shift(m_object, 1.0F));
    EXPECT_EQ(Shift(m_object, -1e30F), Shift(m_object, -1.0F));
    EXPECT_EQ(Shift(m_object, -kInfinity), Shift(m_object, -1.0F));
    EXPECT_EQ(Shift(m_object, std::numeric_limits<float>::quiet_NaN()), 0.0F);
}

TEST_F(Plexiva, RefusesWhatMakesNoSenseAndKeepsTheView) {
    EXPECT_EQ(Shift(m_object, 1.0F), 0.0F); // no view yet
    ASSERT_EQ(Configure(m_object, 1000), 0U);
    EXPECT_EQ(Configure(m_object, 0), kInvalid);
    EXPECT_EQ(Configure(m_object, -1000), kInvalid);
    const int32_t shortRecord[] = {16, 16, 9, 3000, 0, 0};
    EXPECT_EQ(Configure(m_object, shortRecord), kInvalid);
    EXPECT_EQ(Configure(m_object, nullptr), kNullPointer);
    EXPECT_EQ(GetParallax(m_object, 1.0F, nullptr), kNullPointer);
    float shift = 7.0F;
    const auto withoutSelf =
        reinterpret_cast<PlexivaStatus (*)(void*, float, float*)>(Slot(m_object, 4));
    EXPECT_EQ(withoutSelf(nullptr, 1.0F, &shift), kNullPointer);
    EXPECT_EQ(shift, 7.0F);
    EXPECT_FLOAT_EQ(Shift(m_object, 1.0F), 10.0F);
}

TEST_F(Plexiva, ObjectsDoNotShareAView) {
    void* const other = m_get();
    ASSERT_NE(other, nullptr);
    ASSERT_EQ(Configure(m_object, 1000), 0U);
    ASSERT_EQ(Configure(other, 3000), 0U);
    EXPECT_FLOAT_EQ(Shift(m_object, 1.0F), 10.0F);
    EXPECT_FLOAT_EQ(Shift(other, 1.0F), 30.0F);
    m_release(other);
    m_release(nullptr);
}

} // namespace
