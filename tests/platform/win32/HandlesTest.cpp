// What loading and saving pictures takes from the system, it gives back.
#include <algorithm>
#include <array>
#include <cstdint>

#include <gtest/gtest.h>

#include <windows.h>

#include "imageutility/Bitmap.h"
#include "tests/support/PictureFiles.h"

namespace {

using KYVImageUtility::CImageARGB;

// The numbers of new handles tell how many are open: freed ones are given out again before the
// tables grow. (The functions that count them know nothing under Wine.) A few are taken at once,
// because the latest to be freed comes first, whatever has leaked.
template <class Handle, class Open, class Close>
uintptr_t HighestOfAFew(Open open, Close close, uintptr_t mask) {
    std::array<Handle, 8> handles;
    uintptr_t highest = 0;
    for (Handle& handle : handles) {
        handle = open();
        EXPECT_NE(handle, nullptr);
        highest = std::max(highest, reinterpret_cast<uintptr_t>(handle) & mask);
    }
    for (Handle handle : handles) {
        close(handle);
    }
    return highest;
}

uintptr_t HighestGdiObject() {
    return HighestOfAFew<HBITMAP>([] { return CreateBitmap(1, 1, 1, 32, nullptr); }, DeleteObject,
                                  0xFFFF); // a use count lies above
}

uintptr_t HighestHandle() {
    return HighestOfAFew<HANDLE>([] { return CreateEventW(nullptr, TRUE, FALSE, nullptr); },
                                 CloseHandle, UINTPTR_MAX) /
           4;
}

TEST(Handles, PicturesLeaveNoneBehind) {
    const kyvtest::CTempFolder folder;
    const std::wstring path = folder.Wide("a.png");
    const auto loadAndSave = [&] {
        CImageARGB image;
        LoadPngResource(image, kyv::OwnLibrary(), "PNG", 145);
        EXPECT_EQ(SaveImageFile(image, path.c_str()), 0U);
        LoadImageFile(image, path.c_str());
        LoadBitmapResource(image, kyv::OwnLibrary(), 130);
        LoadBitmapResource(image, kyv::OwnLibrary(), 2); // there is none
        EXPECT_EQ(image.GetWidth(), 64);
    };
    loadAndSave(); // what the system keeps for good, it takes the first time
    const uintptr_t object = HighestGdiObject();
    const uintptr_t handle = HighestHandle();
    constexpr int kRounds = 60;
    for (int i = 0; i < kRounds; ++i) {
        loadAndSave();
    }
    // Half, since the first to leak would fill what gaps the tables have.
    EXPECT_LT(HighestGdiObject(), object + kRounds / 2);
    EXPECT_LT(HighestHandle(), handle + kRounds / 2);
}

} // namespace
