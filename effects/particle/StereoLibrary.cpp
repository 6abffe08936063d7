// Loading and calling the stereo helper.
#include "effects/particle/StereoLibrary.h"

namespace kyv {
namespace {

using GetObjectFunction = StereoObject* (*)();
using ReleaseObjectFunction = void (*)(StereoObject*);

} // namespace

CStereoLibrary::CStereoLibrary() : CStereoLibrary(SharedLibraryName("Plexiva")) {}

CStereoLibrary::CStereoLibrary(const NativeString& file) : m_pLibrary(OpenLibrary(file)) {
    if (!m_pLibrary) {
        return;
    }
    const auto get = reinterpret_cast<GetObjectFunction>(FindSymbol(m_pLibrary, "GetPlexiva"));
    m_pObject = get ? get() : nullptr;
}

CStereoLibrary::~CStereoLibrary() {
    if (m_pObject) {
        const auto release =
            reinterpret_cast<ReleaseObjectFunction>(FindSymbol(m_pLibrary, "ReleasePlexiva"));
        if (release) {
            release(m_pObject);
        }
    }
    CloseLibrary(m_pLibrary);
}

void CStereoLibrary::Configure(const StereoViewInfo& view) {
    if (m_pObject) {
        m_pObject->table->Configure(m_pObject, &view, view.displayAspectWidth,
                                    view.displayAspectHeight);
    }
}

float CStereoLibrary::GetParallax(float depth) const {
    float shift = 0.0F;
    if (m_pObject) {
        m_pObject->table->GetParallax(m_pObject, depth, &shift);
    }
    return shift;
}

} // namespace kyv
