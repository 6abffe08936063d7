// A library that does nothing, with the same runtime as the module's: what loading it costs is the
// system's and the runtime's.
#include <cstdlib>
#include <string>

namespace {

const std::string g_text = std::getenv("PATH") ? "there is a search path" : "there is none";

} // namespace

extern "C" size_t Plain() {
    return g_text.size();
}
