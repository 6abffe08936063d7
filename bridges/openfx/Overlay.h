// The quad of the picture-in-picture over the host's viewer, with corners to drag. Offered where
// the host has the suites to draw with; corners are dragged here only where the host has no handles
// of its own for points.
#pragma once

#include "bridges/openfx/OpenFx.h"

namespace kyvofx {

// The entry point of the interact. Throws nothing.
Status OverlayEntry(const char* action, const void* handle, PropertySetHandle in,
                    PropertySetHandle out);

} // namespace kyvofx
