// The parts of the pass-through effect that need no template.
#include "effects/PassThrough.h"

#include "interface/FrameGeometry.h"

namespace kyv {

void SetRequests(EffectContext& context, uint32_t requests) {
    if (requests & kRequestA) {
        context.requestA = 1;
    }
    if (requests & kRequestB) {
        context.requestB = 1;
    }
}

KyvStatus PassFrame(const EffectContext& context, const void* input) {
    FrameGeometry geometry;
    if (!input || !context.frame || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    CopyView(geometry, context.frame, input);
    return KYV_OK;
}

} // namespace kyv
