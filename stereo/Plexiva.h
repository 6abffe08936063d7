// The stereo helper: how far apart the two views of a stereo picture show an object at a depth.
//
// A library of its own, Plexiva.dll or libPlexiva.so, which particle effects load when it is there.
// Usable from C and C++.
//
// The model. A depth of 0 lies in the plane of the screen, 1 behind it at the far end of what is
// comfortable to look at, -1 in front of it at the near end. The parallax, the right view's place
// minus the left view's, grows in proportion to the depth, and its ends are shares of the width of
// the view:
//
//   depth  1   +2 %   On screens up to 3.2 m wide this stays below the 65 mm between the eyes, so
//                     that they need not diverge.
//   depth -1   -3 %   Eyes converge with more ease. On a screen 1.3 m wide, seen from 2 m, the
//                     object stands 1.25 m away: 0.3 dioptres nearer than the screen, where half a
//                     dioptre is still comfortable.
//
// GetParallax gives the half of it that belongs to one view: its shift moves the left view's object
// to the left and the right view's to the right. A share of the width is the same on every display,
// whatever the shape of its pixels.
//
// An object keeps one view. Different objects may be used on different threads at once.
#pragma once

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

// 0 success, 0x80004003 a null pointer, 0x80070057 a value that makes no sense.
typedef uint32_t PlexivaStatus;

#define PLEXIVA_OK ((PlexivaStatus)0)
#define PLEXIVA_NULL_POINTER ((PlexivaStatus)0x80004003u)
#define PLEXIVA_INVALID_ARGUMENT ((PlexivaStatus)0x80070057u)

// One view of a stereo picture: of a side-by-side frame, the half.
typedef struct StereoViewInfo {
    int32_t byteCount;           // 0x00: of the fields that follow, 20 or more
    int32_t displayAspectWidth;  // 0x04: the display's size or aspect, such as 16 to 9
    int32_t displayAspectHeight; // 0x08
    int32_t imageWidth;          // 0x0c: pixels
    int32_t imageHeight;         // 0x10: pixels
    int32_t imagePitch;          // 0x14: bytes from row to row
} StereoViewInfo;

typedef struct PlexivaObject PlexivaObject;

// The operations by slot. Slots 0, 2 and 3 are null.
typedef struct PlexivaTable {
    void* slot0;
    // Slot 1: sets the view. The width must be positive; otherwise, or with a null pointer or a
    // byteCount below 20, the earlier view stays. The display's size is not needed.
    PlexivaStatus (*Configure)(PlexivaObject* self, const StereoViewInfo* view,
                               int32_t displayWidth, int32_t displayHeight);
    void* slot2;
    void* slot3;
    // Slot 4: writes the shift of one view, in pixels of the view and fractions of them. Depths
    // beyond -1 and 1 count as those; what is not a number counts as 0. The shift is 0 before a
    // view is set.
    PlexivaStatus (*GetParallax)(PlexivaObject* self, float depth, float* shift);
} PlexivaTable;

struct PlexivaObject {
    const PlexivaTable* table;
};

// A new object, to be given back with ReleasePlexiva, or null when memory runs out.
PlexivaObject* GetPlexiva(void);

// Null is allowed.
void ReleasePlexiva(PlexivaObject* object);

typedef PlexivaObject* (*GetPlexivaFunction)(void);
typedef void (*ReleasePlexivaFunction)(PlexivaObject*);

#ifdef __cplusplus
}
#endif
