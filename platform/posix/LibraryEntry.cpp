// The Linux counterpart of a library entry routine.
#include "platform/LibraryEntry.h"

namespace {

// Runs when the shared object has been loaded, in place of a load notification.
__attribute__((constructor)) void AttachLibrary() {
    kyv::OnLibraryAttach(kyv::OwnLibrary());
}

} // namespace
