// A host for tests: loads the built module as a user's host would and drives effects through the
// public header alone.
#pragma once

#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "interface/HostInterface.h"

namespace kyvtest {

// The shared library under test, loaded and initialised once for the whole program.
const ModuleDescriptor& Module();

// The path of the library under test.
std::string ModuleFile();

const EffectDescriptor& Effect(const char* identifier);

using Frame = std::vector<uint32_t>; // pixels as words: 0xAARRGGBB or 0xAAYYUUVV

// An instance with everything that a host owns. The frames' guards are the caller's affair.
class CTestInstance {
public:
    // Calls InitInstance. Width and height are those of one view.
    CTestInstance(const EffectDescriptor& effect, uint32_t width, uint32_t height);
    ~CTestInstance(); // calls DestroyInstance

    CTestInstance(const CTestInstance&) = delete;
    CTestInstance& operator=(const CTestInstance&) = delete;

    EffectContext& Context() { return m_context; }
    std::vector<uint8_t>& Params() { return m_params; }
    const EffectDescriptor& Descriptor() const { return *m_context.descriptor; }

    // Stores a value under its key, such as "P1"; its size must be the declared one.
    template <class T>
    void Set(const char* key, T value) {
        SetBytes(key, &value, sizeof value);
    }

    KyvStatus Begin() { return Call(Descriptor().callbacks.BeginProcessing); }
    KyvStatus End() { return Call(Descriptor().callbacks.EndProcessing); }
    KyvStatus SetInput(uint32_t index, const void* frame);
    KyvStatus Process(void* output);

    // SetInputFrame and ProcessFrame, with the frame sizes left to the caller.
    KyvStatus Render(void* output, const void* input0, const void* input1 = nullptr);

private:
    KyvStatus Call(EffectCallback callback) { return callback(&m_context); }
    void SetBytes(const char* key, const void* value, size_t size);

    EffectContext m_context = {};
    std::unique_ptr<uint64_t[]> m_data; // aligned as a host's allocator aligns
    std::vector<uint8_t> m_params;
};

// Deterministic bytes.
Frame RandomFrame(size_t pixels, uint32_t seed);

} // namespace kyvtest
