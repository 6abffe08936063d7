// The host's suites, and property sets as values with fallbacks.
#pragma once

#include <atomic>

#include "bridges/openfx/OpenFx.h"

namespace kyvofx {

// What the host offers. The first three are mandatory; the others may be null.
struct Suites {
    std::atomic<const PropertySuite*> property = nullptr;
    std::atomic<const ParameterSuite*> parameter = nullptr;
    std::atomic<const ImageEffectSuite*> effect = nullptr;
    std::atomic<const MessageSuite*> message = nullptr;
    std::atomic<const InteractSuite*> interact = nullptr;
    std::atomic<const DrawSuite*> draw = nullptr;
};

const Suites& GetSuites();

// Hosts call this before anything else, for each plug-in, and some of them several times. Null is
// ignored; no suite may be asked for yet.
void SetHost(Host* host);

// Whether the mandatory suites are there. May be called any number of times, after another SetHost
// too.
bool FetchSuites();

// A property set. Reading a property that is missing, of another type or of a null set gives the
// fallback; whether writing succeeded is told.
class CProps {
public:
    explicit CProps(PropertySetHandle set) : m_set(set) {}

    bool Set(const char* name, int value, int index = 0);
    bool Set(const char* name, double value, int index = 0);
    bool Set(const char* name, const char* value, int index = 0);
    bool Set(const char* name, void* value);

    int Int(const char* name, int fallback, int index = 0) const;
    double Double(const char* name, double fallback, int index = 0) const;
    const char* String(const char* name) const; // "" for none
    void* Pointer(const char* name) const;
    bool Ints(const char* name, int count, int* values) const; // all or none

private:
    PropertySetHandle m_set;
};

// Properties of an effect, described or alive.
CProps PropsOf(EffectHandle effect);

} // namespace kyvofx
