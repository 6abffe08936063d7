// The optional helper that knows how far apart the two views of a stereo picture show an object.
#pragma once

#include <cstdint>

#include "platform/Library.h"

namespace kyv {

// Which view of a stereo frame is being drawn.
enum class StereoMode : int32_t {
    Mono = 0,
    LeftView = 1, // of a side-by-side frame
    RightView = 2,
    HalfWidth = 3, // a view of half the width
};

// What the helper is told of a view. Images have 4 bytes a pixel.
struct StereoViewInfo {
    int32_t byteCount = 20; // of the fields that follow
    int32_t displayAspectWidth = 16;
    int32_t displayAspectHeight = 9;
    int32_t imageWidth = 1920;
    int32_t imageHeight = 1080;
    int32_t imagePitchBytes = 7680;
};
static_assert(sizeof(StereoViewInfo) == 24);

struct StereoObject;

// The object's operations, in slot order; the others are never called. What they return is ignored.
struct StereoObjectTable {
    void (*reserved0)();
    // slot 1; called when a target is bound in a stereo mode, with the display's size as in view
    uint32_t (*Configure)(StereoObject* self, const StereoViewInfo* view, int32_t displayWidth,
                          int32_t displayHeight);
    void (*reserved2)();
    void (*reserved3)();
    // slot 4; writes the horizontal shift in pixels, which moves the left view to the left and the
    // right view to the right
    uint32_t (*GetParallax)(StereoObject* self, float depth, float* shift);
};

struct StereoObject {
    const StereoObjectTable* table;
};

// The helper as long as this object lives: "Plexiva.dll", or "libPlexiva.so". Without the library,
// one of its exports or its object every call does nothing and the parallax is 0.
class CStereoLibrary {
public:
    CStereoLibrary();
    explicit CStereoLibrary(const NativeString& file);
    ~CStereoLibrary();

    CStereoLibrary(const CStereoLibrary&) = delete;
    CStereoLibrary& operator=(const CStereoLibrary&) = delete;

    void Configure(const StereoViewInfo& view);
    // depth -1..1
    float GetParallax(float depth) const;

private:
    LibraryHandle m_pLibrary;
    StereoObject* m_pObject = nullptr;
};

} // namespace kyv
