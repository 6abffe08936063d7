// Embedded resources.
#include "platform/posix/Resource.h"

#include <strings.h>

extern "C" {
extern const kyv::EmbeddedResource kyv_embedded_resources[];
extern const kyv::EmbeddedResource kyv_embedded_resources_end[];
}

namespace kyv {

ByteView FindResource(LibraryHandle module, const char* type, uint16_t id) {
    if (type && module && module == OwnLibrary()) {
        for (const EmbeddedResource* entry = kyv_embedded_resources;
             entry != kyv_embedded_resources_end; ++entry) {
            if (entry->id == id && strcasecmp(entry->type, type) == 0) {
                return {entry->begin, static_cast<size_t>(entry->end - entry->begin)};
            }
        }
    }
    return {nullptr, 0};
}

} // namespace kyv
