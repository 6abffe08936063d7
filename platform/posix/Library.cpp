// Loadable libraries on Linux.
#include "platform/Library.h"

#include <array>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include <dlfcn.h>
#include <fcntl.h>
#include <link.h>
#include <sys/stat.h>
#include <unistd.h>

namespace kyv {
namespace {

struct LanguageName {
    std::string_view locale; // language_COUNTRY, or a language alone as its default country
    const char* abbreviation;
};

// The names that Windows gives to its locales. The entry without a country serves every country
// that is not listed.
constexpr LanguageName kLanguageNames[] = {
    {"ar", "ARA"},    {"bg", "BGR"},    {"ca", "CAT"},    {"cs", "CSY"},    {"da", "DAN"},
    {"de", "DEU"},    {"de_AT", "DEA"}, {"de_CH", "DES"}, {"de_LI", "DEC"}, {"de_LU", "DEL"},
    {"el", "ELL"},    {"en", "ENU"},    {"en_AU", "ENA"}, {"en_CA", "ENC"}, {"en_GB", "ENG"},
    {"en_IE", "ENI"}, {"en_NZ", "ENZ"}, {"en_ZA", "ENS"}, {"es", "ESN"},    {"es_AR", "ESS"},
    {"es_CL", "ESL"}, {"es_CO", "ESO"}, {"es_MX", "ESM"}, {"et", "ETI"},    {"eu", "EUQ"},
    {"fa", "FAR"},    {"fi", "FIN"},    {"fr", "FRA"},    {"fr_BE", "FRB"}, {"fr_CA", "FRC"},
    {"fr_CH", "FRS"}, {"fr_LU", "FRL"}, {"gl", "GLC"},    {"he", "HEB"},    {"hi", "HIN"},
    {"hr", "HRV"},    {"hu", "HUN"},    {"id", "IND"},    {"is", "ISL"},    {"it", "ITA"},
    {"it_CH", "ITS"}, {"ja", "JPN"},    {"ko", "KOR"},    {"lt", "LTH"},    {"lv", "LVI"},
    {"ms", "MSL"},    {"nb", "NOR"},    {"nl", "NLD"},    {"nl_BE", "NLB"}, {"nn", "NON"},
    {"no", "NOR"},    {"pl", "PLK"},    {"pt", "PTG"},    {"pt_BR", "PTB"}, {"ro", "ROM"},
    {"ru", "RUS"},    {"sk", "SKY"},    {"sl", "SLV"},    {"sv", "SVE"},    {"sv_FI", "SVF"},
    {"th", "THA"},    {"tr", "TRK"},    {"uk", "UKR"},    {"vi", "VIT"},    {"zh", "CHS"},
    {"zh_HK", "ZHH"}, {"zh_MO", "ZHM"}, {"zh_SG", "ZHI"}, {"zh_TW", "CHT"},
};

const char* Lookup(std::string_view locale) {
    for (const LanguageName& entry : kLanguageNames) {
        if (entry.locale == locale) {
            return entry.abbreviation;
        }
    }
    return nullptr;
}

std::string_view UserLocale() {
    for (const char* variable : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
        const char* value = std::getenv(variable);
        if (value && *value) {
            return value;
        }
    }
    return {};
}

} // namespace

namespace {

// The handle of the library that this code is linked into, which stays counted as it was.
void* OpenSelf(int flags) {
    Dl_info info;
    link_map* map = nullptr;
    if (!dladdr1(kLanguageNames, &info, reinterpret_cast<void**>(&map), RTLD_DL_LINKMAP)) {
        return nullptr;
    }
    // It is loaded already, so this only yields the handle; closing it again leaves the count as
    // it was. The program comes first in the list and is opened without a name.
    void* const self = dlopen(map->l_prev ? map->l_name : nullptr, RTLD_LAZY | RTLD_NOLOAD | flags);
    if (self) {
        dlclose(self);
    }
    return self;
}

} // namespace

LibraryHandle OwnLibrary() {
    return OpenSelf(0);
}

void KeepOwnLibrary() {
    OpenSelf(RTLD_NODELETE);
}

namespace {

// The byte after the first units of a path.
size_t EndOfUnits(const NativeString& path, size_t units) {
    size_t end = 0;
    for (; units > 0 && end < path.size(); --units) {
        const auto lead = static_cast<uint8_t>(path[end++]);
        for (int rest = lead >= 0xF0   ? 3
                        : lead >= 0xE0 ? 2
                        : lead >= 0xC0 ? 1
                                       : 0;
             rest > 0 && end < path.size() && (static_cast<uint8_t>(path[end]) & 0xC0) == 0x80;
             --rest) {
            ++end;
        }
    }
    return end;
}

NativeString AbsoluteName(LibraryHandle library) {
    const link_map* map = nullptr;
    if (!library || dlinfo(library, RTLD_DI_LINKMAP, &map) != 0 || !map->l_name) {
        return {};
    }
    std::error_code error;
    return std::filesystem::absolute(map->l_name, error).lexically_normal().native();
}

// The loader keeps a name as it was given, and the host may leave the folder that it holds for.
// This is made while the library is being loaded.
const NativeString g_ownName = []() noexcept -> NativeString {
    try {
        return AbsoluteName(OwnLibrary());
    } catch (...) {
        return {}; // no memory; asked for again when it is needed
    }
}();

} // namespace

size_t CountPathUnits(const NativeString& path) {
    size_t units = 0;
    for (size_t end = 0; end < path.size(); ++units) {
        end += EndOfUnits(path.substr(end, 4), 1);
    }
    return units;
}

NativeString LibraryFileName(LibraryHandle library) {
    NativeString path =
        library == OwnLibrary() && !g_ownName.empty() ? g_ownName : AbsoluteName(library);
    path.resize(EndOfUnits(path, kMaxPathUnits - 1));
    return path;
}

NativeString FileNameOfCode(const void* address) {
    Dl_info info;
    return address && dladdr(address, &info) && info.dli_fname ? info.dli_fname : "";
}

NativeString AbbreviatedLanguageName() {
    std::string_view locale = UserLocale();
    locale = locale.substr(0, locale.find_first_of(".@")); // codeset and modifier
    const char* name = Lookup(locale);
    if (!name) {
        name = Lookup(locale.substr(0, locale.find('_')));
    }
    return name ? name : "ENU";
}

bool FileExists(const NativeString& path) {
    struct stat attributes;
    return stat(path.c_str(), &attributes) == 0;
}

NativeString SharedLibraryName(const char* name) {
    return "lib" + std::string(name) + ".so";
}

namespace {

// The loader maps what a library's headers name and reads it, and a page beyond the file's end ends
// the process. So a file that lost its end, on a full disk say, is found out before. What is no
// library at all is left to the loader, and so is a bare name, which it searches for.
bool LacksItsEnd(const NativeString& path) {
    const int file = path.find('/') == NativeString::npos ? -1 : open(path.c_str(), O_RDONLY);
    if (file < 0) {
        return false;
    }
    struct stat attributes;
    ElfW(Ehdr) header;
    bool lacks = false;
    if (fstat(file, &attributes) == 0 && S_ISREG(attributes.st_mode) &&
        pread(file, &header, sizeof header, 0) == sizeof header &&
        std::memcmp(header.e_ident, ELFMAG, SELFMAG) == 0) {
        const auto size = static_cast<uint64_t>(attributes.st_size);
        for (uint32_t i = 0; i < header.e_phnum && !lacks; ++i) {
            ElfW(Phdr) part;
            const auto at = static_cast<off_t>(header.e_phoff + i * sizeof part);
            lacks = pread(file, &part, sizeof part, at) != sizeof part || part.p_offset > size ||
                    part.p_filesz > size - part.p_offset;
        }
    }
    close(file);
    return lacks;
}

} // namespace

LibraryHandle OpenLibrary(const NativeString& path) {
    return LacksItsEnd(path) ? nullptr : dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
}

void CloseLibrary(LibraryHandle library) {
    if (library) {
        dlclose(library);
    }
}

void* FindSymbol(LibraryHandle library, const char* name) {
    return library ? dlsym(library, name) : nullptr;
}

} // namespace kyv
