// A second program on Windows.
#include "tests/platform/LeaveBehind.h"

#include <windows.h>

#include "platform/Process.h"

namespace kyvtest {

void LeaveBehind() {
    STARTUPINFOW startup = {};
    startup.cb = sizeof startup;
    PROCESS_INFORMATION info = {};
    wchar_t line[] = L"lingerer stay";
    if (CreateProcessW(kyv::ExecutableFile().c_str(), line, nullptr, nullptr, TRUE, 0, nullptr,
                       nullptr, &startup, &info)) {
        CloseHandle(info.hThread);
        CloseHandle(info.hProcess);
    }
}

} // namespace kyvtest
