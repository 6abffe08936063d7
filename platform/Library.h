// Loadable libraries: this module's own file, others beside it, and the user's language.
#pragma once

#include <filesystem>
#include <string>

namespace kyv {

// An HMODULE on Windows, a dlopen handle on Linux. Null means none.
using LibraryHandle = void*;

// A path in the system's own encoding: UTF-16 on Windows, bytes on Linux.
using NativeString = std::filesystem::path::string_type;

// Room for a path or a path's candidate, with its terminating zero.
inline constexpr size_t kMaxPathUnits = 260;

// The library, or the program, that this code is linked into. The reference stays its loader's.
LibraryHandle OwnLibrary();

// Keeps that library in the process to its end, whoever unloads it.
void KeepOwnLibrary();

// How many units of a path count towards that: UTF-16 units on Windows; on Linux characters of
// UTF-8, and every byte that belongs to none.
size_t CountPathUnits(const NativeString& path);

// The full path, without "." or ".." parts, of a loaded library; at most kMaxPathUnits - 1 units,
// cut off beyond. Empty when the handle is unknown. A relative path that this library was loaded
// by holds for the working folder of that time.
NativeString LibraryFileName(LibraryHandle library);

// The file of the library or the program that holds an address of code, as the system tells it.
// Empty when the address belongs to none.
NativeString FileNameOfCode(const void* address);

// Three letters such as ENU, DEU or JPN for the user's language and country. On Linux it is taken
// from LC_ALL, LC_MESSAGES or LANG, whichever is set first; ENU when none is, or for "C".
NativeString AbbreviatedLanguageName();

// True for anything that has attributes, a folder included.
bool FileExists(const NativeString& path);

// The file name of a library: "Name.dll" on Windows, "libName.so" on Linux.
NativeString SharedLibraryName(const char* name);

// Null when the library cannot be loaded, its file cut short included. A bare file name is looked
// for where the system looks.
LibraryHandle OpenLibrary(const NativeString& path);

// Null is allowed and does nothing.
void CloseLibrary(LibraryHandle library);

// Null when the library has no such export.
void* FindSymbol(LibraryHandle library, const char* name);

} // namespace kyv
