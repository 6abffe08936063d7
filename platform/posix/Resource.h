// The resources inside this shared object, or program: a table that the build generates from the
// list of resources.
#pragma once

#include <cstddef>
#include <cstdint>

#include "platform/Library.h"
#include "platform/posix/ImageCodecs.h"

namespace kyv {

// As the generated assembly lays it out.
struct EmbeddedResource {
    const char* type; // "PNG", "BITMAP"
    const uint8_t* begin;
    const uint8_t* end;
    uint16_t id;
    uint16_t language; // as on Windows: 1033 for English (United States)
    uint32_t reserved;
};

static_assert(offsetof(EmbeddedResource, begin) == 8 && offsetof(EmbeddedResource, end) == 16);
static_assert(offsetof(EmbeddedResource, id) == 24 && offsetof(EmbeddedResource, language) == 26);
static_assert(sizeof(EmbeddedResource) == 32);

// The bytes of a resource, empty when the module is not ours or has no such resource. The case of
// the type's letters is ignored, and so is the language.
ByteView FindResource(LibraryHandle module, const char* type, uint16_t id);

} // namespace kyv
