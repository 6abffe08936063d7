// The command line's surroundings on Windows.
#include "platform/Console.h"

#include <filesystem>

#include <windows.h>

#include <shellapi.h>

namespace kyv {
namespace {

std::function<void()>& InterruptAction() {
    static std::function<void()> action;
    return action;
}

// The system calls this on a thread of its own.
BOOL WINAPI HandleControl(DWORD) {
    InterruptAction()();
    return TRUE;
}

} // namespace

std::vector<std::string> CommandLineArguments(int, char**) {
    // The narrow arguments are in the code page of the day and have lost what it lacks.
    SetConsoleOutputCP(CP_UTF8);
    int count = 0;
    wchar_t** wide = CommandLineToArgvW(GetCommandLineW(), &count);
    std::vector<std::string> arguments;
    for (int i = 1; i < count; ++i) {
        const std::u8string text = std::filesystem::path(wide[i]).u8string();
        arguments.emplace_back(text.begin(), text.end());
    }
    LocalFree(wide);
    return arguments;
}

bool ErrorIsTerminal() {
    DWORD mode = 0;
    return GetConsoleMode(GetStdHandle(STD_ERROR_HANDLE), &mode) != 0;
}

void OnInterrupt(std::function<void()> action) {
    InterruptAction() = std::move(action);
    SetConsoleCtrlHandler(HandleControl, TRUE);
}

size_t ReadStandardInput(void* buffer, size_t size) {
    DWORD count = 0;
    const bool read =
        ReadFile(GetStdHandle(STD_INPUT_HANDLE), buffer, static_cast<DWORD>(size), &count, nullptr);
    return read ? count : 0;
}

void FailAtFileSizeLimit() {} // writing fails by itself here

} // namespace kyv
