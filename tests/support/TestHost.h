// A host for tests: loads the built module as a user's host would and drives effects through the
// public header alone. What hosts have in common is hosting/; here are the tests' guards.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "hosting/Instance.h"

namespace kyvtest {

// The shared library under test, loaded and initialised once for the whole program.
const ModuleDescriptor& Module();

// The path of the library under test.
std::string ModuleFile();

const EffectDescriptor& Effect(const char* identifier);

using Frame = std::vector<uint32_t>; // pixels as words: 0xAARRGGBB or 0xAAYYUUVV

// An instance that fails the test where one of a lenient host would go on. The frames' guards are
// the caller's affair.
class CTestInstance : public kyvhosting::CInstance {
public:
    // Calls InitInstance. Width and height are those of one view.
    CTestInstance(const EffectDescriptor& effect, uint32_t width, uint32_t height);
    ~CTestInstance(); // DestroyInstance alone, which must release all that was prepared

    // Stores a value under its key, such as "P1"; its size must be the declared one.
    template <class T>
    void Set(const char* key, T value) {
        SetOrFail(key, &value, sizeof value);
    }

private:
    void SetOrFail(const char* key, const void* value, size_t size);
};

// Deterministic bytes.
Frame RandomFrame(size_t pixels, uint32_t seed);

} // namespace kyvtest
