// The stereo helper.
#include "stereo/Plexiva.h"

#include <cstddef>
#include <new>

namespace {

static_assert(sizeof(StereoViewInfo) == 24);
static_assert(offsetof(PlexivaTable, Configure) == 1 * sizeof(void*));
static_assert(offsetof(PlexivaTable, GetParallax) == 4 * sizeof(void*));

// Of the view's width, for one view: half of the parallax.
constexpr float kFarthestShift = 0.010F;
constexpr float kNearestShift = 0.015F;

constexpr int32_t kViewBytes = sizeof(StereoViewInfo) - sizeof(int32_t);

struct Helper : PlexivaObject {
    int32_t viewWidth;
};

PlexivaStatus Configure(PlexivaObject* self, const StereoViewInfo* view, int32_t, int32_t) {
    if (!self || !view) {
        return PLEXIVA_NULL_POINTER;
    }
    if (view->byteCount < kViewBytes || view->imageWidth <= 0) {
        return PLEXIVA_INVALID_ARGUMENT;
    }
    static_cast<Helper*>(self)->viewWidth = view->imageWidth;
    return PLEXIVA_OK;
}

PlexivaStatus GetParallax(PlexivaObject* self, float depth, float* shift) {
    if (!self || !shift) {
        return PLEXIVA_NULL_POINTER;
    }
    const auto width = static_cast<float>(static_cast<Helper*>(self)->viewWidth);
    if (depth > 0.0F) {
        *shift = (depth < 1.0F ? depth : 1.0F) * kFarthestShift * width;
    } else if (depth < 0.0F) {
        *shift = (depth > -1.0F ? depth : -1.0F) * kNearestShift * width;
    } else {
        *shift = 0.0F; // and for what is not a number
    }
    return PLEXIVA_OK;
}

constexpr PlexivaTable kTable = {
    .slot0 = nullptr,
    .Configure = Configure,
    .slot2 = nullptr,
    .slot3 = nullptr,
    .GetParallax = GetParallax,
};

} // namespace

extern "C" {

[[gnu::visibility("default")]] PlexivaObject* GetPlexiva() {
    auto* const helper = new (std::nothrow) Helper;
    if (helper) {
        helper->table = &kTable;
        helper->viewWidth = 0;
    }
    return helper;
}

[[gnu::visibility("default")]] void ReleasePlexiva(PlexivaObject* object) {
    delete static_cast<Helper*>(object);
}

} // extern "C"
