// The test host.
#include "tests/support/TestHost.h"

#include <cstdlib>
#include <filesystem>
#include <random>

#include <gtest/gtest.h>

#include "platform/Library.h"

namespace kyvtest {

std::string ModuleFile() {
    return KYV_MODULE_FILE;
}

const ModuleDescriptor& Module() {
    static const ModuleDescriptor* const module = [] {
        const kyv::LibraryHandle library =
            kyv::OpenLibrary(std::filesystem::path(ModuleFile()).native());
        const auto init =
            reinterpret_cast<KyvInitModuleFunction>(kyv::FindSymbol(library, KYV_INIT_MODULE_NAME));
        ModuleDescriptor* descriptor = nullptr;
        if (!init || init(&descriptor) != KYV_OK) {
            ADD_FAILURE() << "cannot load " << ModuleFile();
            std::abort();
        }
        return descriptor;
    }();
    return *module;
}

const EffectDescriptor& Effect(const char* identifier) {
    for (uint32_t i = 0; i < Module().effectCount; ++i) {
        if (std::strcmp(Module().effects[i].identifier, identifier) == 0) {
            return Module().effects[i];
        }
    }
    ADD_FAILURE() << "no effect " << identifier;
    std::abort();
}

CTestInstance::CTestInstance(const EffectDescriptor& effect, uint32_t width, uint32_t height)
    : m_data(new uint64_t[(effect.instanceDataSize + 7) / 8]()) {
    size_t paramBytes = 0;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        paramBytes += effect.params[i].valueSize;
    }
    m_params.resize(paramBytes);
    m_context.descriptor = &effect;
    m_context.instanceData = m_data.get();
    m_context.params = m_params.data();
    m_context.width = width;
    m_context.height = height;
    m_context.threadCount = 1;
    EXPECT_EQ(Call(effect.callbacks.InitInstance), KYV_OK);
}

CTestInstance::~CTestInstance() {
    EXPECT_EQ(Call(Descriptor().callbacks.DestroyInstance), KYV_OK);
}

KyvStatus CTestInstance::SetInput(uint32_t index, const void* frame) {
    m_context.frame = const_cast<void*>(frame);
    return Descriptor().callbacks.SetInputFrame(index, &m_context);
}

KyvStatus CTestInstance::Process(void* output) {
    m_context.frame = output;
    return Call(Descriptor().callbacks.ProcessFrame);
}

KyvStatus CTestInstance::Render(void* output, const void* input0, const void* input1) {
    KyvStatus status = SetInput(0, input0);
    if (status == KYV_OK && Descriptor().properties.inputCount == 2) {
        status = SetInput(1, input1);
    }
    return status == KYV_OK ? Process(output) : status;
}

void CTestInstance::SetBytes(const char* key, const void* value, size_t size) {
    size_t offset = 0;
    for (uint32_t i = 0; i < Descriptor().paramCount; ++i) {
        const ParamDescriptor& param = Descriptor().params[i];
        if (std::strcmp(param.key, key) == 0) {
            ASSERT_EQ(param.valueSize, size) << key;
            std::memcpy(m_params.data() + offset, value, size);
            return;
        }
        offset += param.valueSize;
    }
    FAIL() << "no parameter " << key;
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
