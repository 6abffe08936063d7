// The search for the language library.
#include "module/ResourceLibrary.h"

namespace kyv {

NativeString LanguageLibraryPath(const NativeString& modulePath, const NativeString& language) {
    const NativeString path = modulePath.substr(0, modulePath.find('.')) +
                              std::filesystem::path("_").native() + language +
                              std::filesystem::path(".DLL").native();
    return CountPathUnits(path) < kMaxPathUnits ? path : NativeString();
}

NativeString FallbackLibraryPath(const NativeString& modulePath) {
    // Not "RES": the suffix has always been its bytes, and those of the constant behind it, read
    // as UTF-16 units. No library is ever found under that name, and hosts rely on a _RES.DLL
    // beside the module being left alone.
    constexpr char16_t kSuffix[] = {0x4552, 0x0053, 0xCCCD, 0x3E4C, 0};
    return LanguageLibraryPath(modulePath, std::filesystem::path(kSuffix).native());
}

std::optional<LibraryHandle> FindResourceLibrary(LibraryHandle module) {
    const NativeString modulePath = LibraryFileName(module);
    if (modulePath.empty()) {
        return std::nullopt;
    }
    for (const NativeString& path : {LanguageLibraryPath(modulePath, AbbreviatedLanguageName()),
                                     FallbackLibraryPath(modulePath)}) {
        if (!path.empty() && FileExists(path)) {
            return OpenLibrary(path);
        }
    }
    return std::nullopt;
}

} // namespace kyv
