// The module's one static descriptor.
#pragma once

#include "interface/HostInterface.h"

namespace kyv {

// Its two handles are the only part of all records that ever changes: ModuleHandle when the
// library is attached, ResourceLibrary in the two exports.
extern ModuleDescriptor g_module;

} // namespace kyv
