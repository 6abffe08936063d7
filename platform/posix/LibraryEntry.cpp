// The Linux counterpart of a library entry routine.
#include "platform/LibraryEntry.h"

#include <dlfcn.h>

namespace {

// Runs when the shared object has been loaded, in place of a load notification.
__attribute__((constructor)) void AttachLibrary() {
    Dl_info info;
    if (!dladdr(reinterpret_cast<void*>(&AttachLibrary), &info)) {
        return;
    }
    // The object is loaded already, so this only yields its handle; closing it again leaves the
    // count as it was.
    void* self = dlopen(info.dli_fname, RTLD_LAZY | RTLD_NOLOAD);
    if (self) {
        dlclose(self);
    }
    kyv::OnLibraryAttach(self);
}

} // namespace
