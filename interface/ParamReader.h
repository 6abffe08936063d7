// Reads an instance's parameter values, which lie packed in table order without padding.
#pragma once

#include <cstdint>

#include "interface/HostInterface.h"

namespace kyv {

// A view on the context's parameter buffer. A value is read only when its declared size is the one
// asked for; otherwise, beyond the last parameter or without a buffer it reads as zero.
class CParamReader {
public:
    explicit CParamReader(const EffectContext& context);

    float Float(uint32_t index) const;
    int32_t Int(uint32_t index) const;
    uint32_t Color(uint32_t index) const; // red in the lowest byte
    uint8_t Byte(uint32_t index) const;

    // Copies a value of any size; false, with the destination zeroed, when it is not there.
    bool Bytes(uint32_t index, void* value, uint32_t size) const;

private:
    const EffectDescriptor* m_pDescriptor;
    const uint8_t* m_pBuffer;
};

} // namespace kyv
