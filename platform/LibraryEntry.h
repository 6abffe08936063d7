// The link between the system's load notification and the module.
#pragma once

#include "platform/Library.h"

namespace kyv {

// Called once when the shared library has been loaded, before any export. Implemented by the
// module; the routine that calls it belongs to the platform.
void OnLibraryAttach(LibraryHandle self);

} // namespace kyv
