// The Windows entry routine of the module.
#include "platform/LibraryEntry.h"

#include <windows.h>

extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
    if (reason == DLL_PROCESS_ATTACH) {
        kyv::OnLibraryAttach(instance);
        DisableThreadLibraryCalls(instance);
    }
    return TRUE; // loading is never refused
}
