/* The stereo helper's header serves C, alone and twice. */
#include "stereo/Plexiva.h"

PlexivaStatus UseStereoHeader(PlexivaObject* object, float* shift);

PlexivaStatus UseStereoHeader(PlexivaObject* object, float* shift) {
    return object->table->GetParallax(object, 0.5f, shift);
}
