// Walks the declared sizes to a parameter's place in the buffer.
#include "interface/ParamReader.h"

#include <cstring>

namespace kyv {

void ReadParam(const EffectContext& context, uint32_t index, void* value, size_t size) {
    std::memset(value, 0, size);
    const EffectDescriptor* descriptor = context.descriptor;
    if (!descriptor || !context.params || index >= descriptor->paramCount ||
        descriptor->params[index].valueSize != size) {
        return;
    }
    size_t offset = 0;
    for (uint32_t i = 0; i < index; ++i) {
        offset += descriptor->params[i].valueSize;
    }
    std::memcpy(value, static_cast<const uint8_t*>(context.params) + offset, size);
}

} // namespace kyv
