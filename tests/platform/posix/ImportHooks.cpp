// Imports of ELF objects: the entries of their relocation tables.
#include "tests/platform/ImportHooks.h"

#include <cstdint>
#include <cstring>

#include <dlfcn.h>
#include <link.h>
#include <sys/mman.h>
#include <unistd.h>

namespace kyvtest {
namespace {

#if defined(__aarch64__)
constexpr auto kJumpSlot = R_AARCH64_JUMP_SLOT;
constexpr auto kDataSlot = R_AARCH64_GLOB_DAT;
#else
constexpr auto kJumpSlot = R_X86_64_JUMP_SLOT;
constexpr auto kDataSlot = R_X86_64_GLOB_DAT;
#endif

struct Search {
    const char* name;
    void* replacement;
    int found;
};

void Replace(void** slot, void* value) {
    const auto page = static_cast<uintptr_t>(sysconf(_SC_PAGESIZE));
    const uintptr_t begin = reinterpret_cast<uintptr_t>(slot) & ~(page - 1);
    if (mprotect(reinterpret_cast<void*>(begin), page, PROT_READ | PROT_WRITE) == 0) {
        *slot = value;
    }
}

bool IsLeftAlone(const char* file) {
    const char* slash = std::strrchr(file, '/');
    const char* base = slash ? slash + 1 : file;
    return std::strncmp(base, "libc.", 5) == 0 || std::strncmp(base, "ld-", 3) == 0 ||
           std::strncmp(base, "linux-vdso", 10) == 0;
}

int ReplaceIn(dl_phdr_info* info, size_t, void* argument) {
    Search& search = *static_cast<Search*>(argument);
    if (IsLeftAlone(info->dlpi_name)) {
        return 0;
    }
    const ElfW(Dyn)* dynamic = nullptr;
    for (int i = 0; i < info->dlpi_phnum; ++i) {
        if (info->dlpi_phdr[i].p_type == PT_DYNAMIC) {
            dynamic =
                reinterpret_cast<const ElfW(Dyn)*>(info->dlpi_addr + info->dlpi_phdr[i].p_vaddr);
        }
    }
    const ElfW(Sym)* symbols = nullptr;
    const char* strings = nullptr;
    const ElfW(Rela) * tables[2] = {};
    size_t sizes[2] = {};
    for (; dynamic && dynamic->d_tag != DT_NULL; ++dynamic) {
        const auto value = dynamic->d_un.d_ptr;
        switch (dynamic->d_tag) {
        case DT_SYMTAB:
            symbols = reinterpret_cast<const ElfW(Sym)*>(value);
            break;
        case DT_STRTAB:
            strings = reinterpret_cast<const char*>(value);
            break;
        case DT_RELA:
            tables[0] = reinterpret_cast<const ElfW(Rela)*>(value);
            break;
        case DT_RELASZ:
            sizes[0] = value;
            break;
        case DT_JMPREL:
            tables[1] = reinterpret_cast<const ElfW(Rela)*>(value);
            break;
        case DT_PLTRELSZ:
            sizes[1] = value;
            break;
        default:
            break;
        }
    }
    for (int table = 0; symbols && strings && table < 2; ++table) {
        for (size_t i = 0; tables[table] && i < sizes[table] / sizeof(ElfW(Rela)); ++i) {
            const ElfW(Rela)& entry = tables[table][i];
            const auto type = ELF64_R_TYPE(entry.r_info);
            const ElfW(Sym)& symbol = symbols[ELF64_R_SYM(entry.r_info)];
            if ((type == kJumpSlot || type == kDataSlot) &&
                std::strcmp(strings + symbol.st_name, search.name) == 0) {
                Replace(reinterpret_cast<void**>(info->dlpi_addr + entry.r_offset),
                        search.replacement);
                ++search.found;
            }
        }
    }
    return 0;
}

} // namespace

void* ReplaceImport(const char* name, void* replacement) {
    void* const original = dlsym(RTLD_DEFAULT, name);
    Search search = {name, replacement, 0};
    dl_iterate_phdr(ReplaceIn, &search);
    return search.found > 0 ? original : nullptr;
}

} // namespace kyvtest
