// Walks the declared sizes to a parameter's place in the buffer.
#include "interface/ParamReader.h"

#include <cstring>

namespace kyv {

CParamReader::CParamReader(const EffectContext& context)
    : m_pDescriptor(context.descriptor), m_pBuffer(static_cast<const uint8_t*>(context.params)) {}

bool CParamReader::Bytes(uint32_t index, void* value, uint32_t size) const {
    std::memset(value, 0, size);
    if (!m_pDescriptor || !m_pBuffer || index >= m_pDescriptor->paramCount ||
        m_pDescriptor->params[index].valueSize != size) {
        return false;
    }
    size_t offset = 0;
    for (uint32_t i = 0; i < index; ++i) {
        offset += m_pDescriptor->params[i].valueSize;
    }
    std::memcpy(value, m_pBuffer + offset, size);
    return true;
}

float CParamReader::Float(uint32_t index) const {
    float value;
    Bytes(index, &value, sizeof value);
    return value;
}

int32_t CParamReader::Int(uint32_t index) const {
    int32_t value;
    Bytes(index, &value, sizeof value);
    return value;
}

uint32_t CParamReader::Color(uint32_t index) const {
    uint32_t value;
    Bytes(index, &value, sizeof value);
    return value;
}

uint8_t CParamReader::Byte(uint32_t index) const {
    uint8_t value;
    Bytes(index, &value, sizeof value);
    return value;
}

} // namespace kyv
