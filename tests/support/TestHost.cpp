// The test host.
#include "tests/support/TestHost.h"

#include <cstdlib>
#include <random>

#include <gtest/gtest.h>

#include "hosting/Module.h"
#include "hosting/Names.h"

namespace kyvtest {

std::string ModuleFile() {
    return KYV_MODULE_FILE;
}

const ModuleDescriptor& Module() {
    // Never unloaded: what a test keeps until the program ends may still call it.
    static const auto& module = *new kyvhosting::CModule(ModuleFile());
    return module.Descriptor();
}

const EffectDescriptor& Effect(const char* identifier) {
    const EffectDescriptor* effect = kyvhosting::EffectOf(Module(), identifier);
    if (!effect) {
        ADD_FAILURE() << "no effect " << identifier;
        std::abort();
    }
    return *effect;
}

CTestInstance::CTestInstance(const EffectDescriptor& effect, uint32_t width, uint32_t height)
    : CInstance(effect) {
    Context().width = width;
    Context().height = height;
    EXPECT_EQ(Init(), KYV_OK);
}

CTestInstance::~CTestInstance() {
    EXPECT_EQ(Destroy(), KYV_OK);
}

void CTestInstance::SetOrFail(const char* key, const void* value, size_t size) {
    EXPECT_TRUE(SetBytes(key, value, size)) << key << " is no parameter of " << size << " bytes";
}

Frame RandomFrame(size_t pixels, uint32_t seed) {
    std::mt19937 random(seed);
    Frame frame(pixels);
    for (uint32_t& pixel : frame) {
        pixel = random();
    }
    return frame;
}

} // namespace kyvtest
