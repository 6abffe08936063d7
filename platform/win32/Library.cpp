// Loadable libraries on Windows.
#include "platform/Library.h"

#include <windows.h>

// The first byte of the image that this file is linked into; its address is the handle. The
// linker chose the name.
extern "C" IMAGE_DOS_HEADER __ImageBase; // NOLINT(bugprone-reserved-identifier)

namespace kyv {

LibraryHandle OwnLibrary() {
    return &__ImageBase;
}

void KeepOwnLibrary() {
    HMODULE self = nullptr;
    GetModuleHandleExW(GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_PIN,
                       reinterpret_cast<LPCWSTR>(&__ImageBase), &self);
}

size_t CountPathUnits(const NativeString& path) {
    return path.size();
}

NativeString LibraryFileName(LibraryHandle library) {
    wchar_t path[kMaxPathUnits];
    const DWORD length =
        GetModuleFileNameW(static_cast<HMODULE>(library), path, DWORD{kMaxPathUnits});
    return NativeString(path, length < kMaxPathUnits ? length : kMaxPathUnits - 1);
}

NativeString FileNameOfCode(const void* address) {
    HMODULE library = nullptr;
    const DWORD flags =
        GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT;
    if (!address || !GetModuleHandleExW(flags, static_cast<LPCWSTR>(address), &library)) {
        return {};
    }
    return LibraryFileName(library);
}

NativeString AbbreviatedLanguageName() {
    wchar_t name[8];
    const int length = GetLocaleInfoW(LOCALE_USER_DEFAULT, LOCALE_SABBREVLANGNAME, name, 8);
    return length > 0 ? NativeString(name) : NativeString(L"ENU");
}

bool FileExists(const NativeString& path) {
    return GetFileAttributesW(path.c_str()) != INVALID_FILE_ATTRIBUTES;
}

NativeString SharedLibraryName(const char* name) {
    return std::filesystem::path(std::string(name) + ".dll").native();
}

LibraryHandle OpenLibrary(const NativeString& path) {
    return LoadLibraryW(path.c_str());
}

void CloseLibrary(LibraryHandle library) {
    FreeLibrary(static_cast<HMODULE>(library));
}

void* FindSymbol(LibraryHandle library, const char* name) {
    return reinterpret_cast<void*>(GetProcAddress(static_cast<HMODULE>(library), name));
}

} // namespace kyv
