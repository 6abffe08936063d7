// Status codes as people look them up.
#pragma once

#include <cstdint>
#include <cstdio>
#include <string>

namespace kyvhosting {

// 0x80004005
inline std::string Hex(uint32_t status) {
    char text[16];
    std::snprintf(text, sizeof text, "0x%08X", static_cast<unsigned>(status));
    return text;
}

} // namespace kyvhosting
