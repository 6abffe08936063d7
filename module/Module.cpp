// The module's descriptor and what happens to it when the library is loaded.
#include "module/Module.h"

#include <iterator>

#include "module/EffectTable.h"
#include "platform/LibraryEntry.h"
#include "platform/Status.h"

namespace kyv {

// The host's names for the statuses and ours are the same numbers.
static_assert(KYV_OK == kOk && KYV_FAIL == kFail && KYV_ABORTED == kAborted);
static_assert(KYV_NULL_POINTER == kNullPointer && KYV_OUT_OF_MEMORY == kOutOfMemory);
static_assert(KYV_INVALID_ARGUMENT == kInvalidArgument && KYV_WAIT_TIMEOUT == kWaitTimeout);

constinit ModuleDescriptor g_module = {
    .formatNumber = kKyvFormatNumber,
    .reserved04 = 0,
    .nameKey = "IDS_Module_Name",
    .descKey = "IDS_Module_Desc",
    .author = "Module Author",
    .vendor = "Module Vendor",
    .ModuleHandle = nullptr,
    .ResourceLibrary = nullptr,
    .effectCount = std::size(kEffects),
    .reserved3c = 0,
    .effects = kEffects,
};

void OnLibraryAttach(LibraryHandle self) {
    g_module.ModuleHandle = self;
}

} // namespace kyv
