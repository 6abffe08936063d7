// Status codes, as they cross the host boundary and as the classes inside report them.
#pragma once

#include <cstdint>

namespace kyv {

using Status = uint32_t;

inline constexpr Status kOk = 0;
inline constexpr Status kNullPointer = 0x80004003;
inline constexpr Status kAborted = 0x80004004;
inline constexpr Status kFail = 0x80004005;
inline constexpr Status kOutOfMemory = 0x8007000E;
inline constexpr Status kInvalidArgument = 0x80070057;
inline constexpr Status kWaitTimeout = 0xE0000102;

} // namespace kyv
