// Other functions in the place of what is imported, for tests that refuse what the module asks for.
#pragma once

namespace kyvtest {

// Has every import of a name lead to the replacement: those of this program and of the libraries
// that are loaded now, but for the C library's own. Returns the function itself, and null when
// nobody imports it.
void* ReplaceImport(const char* name, void* replacement);

} // namespace kyvtest
