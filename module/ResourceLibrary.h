// The language library beside the module, in which the host looks up display texts.
#pragma once

#include <optional>

#include "platform/Library.h"

namespace kyv {

// The path that the search tries first, made from the module's full path and a language name:
// everything before the path's first ".", "_", the name and ".DLL". The first dot of the whole
// path counts, so a dot in a folder's name ends the base there; a path without one is used whole.
// Empty when the result would not fit kMaxPathUnits.
NativeString LanguageLibraryPath(const NativeString& modulePath, const NativeString& language);

// The path that is tried when there is no library for the user's language.
NativeString FallbackLibraryPath(const NativeString& modulePath);

// Opens the first candidate that exists. No value when neither does; null when one exists but
// cannot be loaded (the search then ends).
std::optional<LibraryHandle> FindResourceLibrary(LibraryHandle module);

} // namespace kyv
