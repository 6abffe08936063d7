// Reads an instance's parameter values, which lie packed in table order without padding.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "interface/HostInterface.h"

namespace kyv {

// Copies the value at a place of the table. It is read only when its declared size is the one asked
// for; otherwise, beyond the last parameter or without a buffer, it reads as zero.
void ReadParam(const EffectContext& context, uint32_t index, void* value, size_t size);

// The values of one effect, by the names that its Param enumeration gives them.
template <class Param>
class CParamReader {
public:
    explicit CParamReader(const EffectContext& context) : m_context(context) {}

    float Float(Param param) const { return Value<float>(param); }
    int32_t Int(Param param) const { return Value<int32_t>(param); }
    uint32_t Color(Param param) const { return Value<uint32_t>(param); } // red in the lowest byte
    uint8_t Byte(Param param) const { return Value<uint8_t>(param); }

    // A rectangle or a position.
    template <size_t kCount>
    std::array<float, kCount> Floats(Param param) const {
        return Value<std::array<float, kCount>>(param);
    }

private:
    template <class T>
    T Value(Param param) const {
        T value;
        ReadParam(m_context, param, &value, sizeof value);
        return value;
    }

    const EffectContext& m_context;
};

} // namespace kyv
