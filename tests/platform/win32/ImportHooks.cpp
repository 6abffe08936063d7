// Imports of PE images: the entries of their import tables.
#include "tests/platform/ImportHooks.h"

#include <cstdint>
#include <cstring>

#include <windows.h>

#include "tests/support/TestHost.h"

namespace kyvtest {
namespace {

void ReplaceIn(HMODULE image, const char* name, void* replacement, void*& original) {
    auto* const base = reinterpret_cast<uint8_t*>(image);
    const auto* dos = reinterpret_cast<const IMAGE_DOS_HEADER*>(base);
    const auto* headers = reinterpret_cast<const IMAGE_NT_HEADERS*>(base + dos->e_lfanew);
    const IMAGE_DATA_DIRECTORY& directory =
        headers->OptionalHeader.DataDirectory[IMAGE_DIRECTORY_ENTRY_IMPORT];
    for (auto* library =
             reinterpret_cast<const IMAGE_IMPORT_DESCRIPTOR*>(base + directory.VirtualAddress);
         directory.Size != 0 && library->Name != 0; ++library) {
        const auto* wanted =
            reinterpret_cast<const IMAGE_THUNK_DATA*>(base + library->OriginalFirstThunk);
        auto* slot = reinterpret_cast<void**>(base + library->FirstThunk);
        for (; wanted->u1.AddressOfData != 0; ++wanted, ++slot) {
            if (IMAGE_SNAP_BY_ORDINAL(wanted->u1.Ordinal)) {
                continue;
            }
            const auto* import =
                reinterpret_cast<const IMAGE_IMPORT_BY_NAME*>(base + wanted->u1.AddressOfData);
            DWORD before = 0;
            if (std::strcmp(reinterpret_cast<const char*>(import->Name), name) == 0 &&
                VirtualProtect(slot, sizeof *slot, PAGE_READWRITE, &before)) {
                original = *slot;
                *slot = replacement;
                VirtualProtect(slot, sizeof *slot, before, &before);
            }
        }
    }
}

} // namespace

void* ReplaceImport(const char* name, void* replacement) {
    void* original = nullptr;
    ReplaceIn(GetModuleHandleW(nullptr), name, replacement, original);
    ReplaceIn(static_cast<HMODULE>(Module().ModuleHandle), name, replacement, original);
    return original;
}

} // namespace kyvtest
