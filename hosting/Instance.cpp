// An effect instance.
#include "hosting/Instance.h"

#include <algorithm>
#include <cstring>

#include "hosting/Error.h"
#include "hosting/Hex.h"

namespace kyvhosting {
namespace {

// InitInstance wants to tell the host that it runs. There is nothing to do about it here.
void IgnoreNotification(HostNotification*) {}

const HostNotificationTable kNotificationTable = {IgnoreNotification};
HostNotification g_notification = {&kNotificationTable};

} // namespace

CInstance::CInstance(const EffectDescriptor& effect)
    : m_data(new uint64_t[(effect.instanceDataSize + 7) / 8]()) {
    size_t size = 0;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        m_offsets.push_back(size);
        size += effect.params[i].valueSize;
    }
    m_params.resize(std::max<size_t>(size, 1)); // never an empty buffer
    m_context.descriptor = &effect;
    m_context.notification = &g_notification;
    m_context.instanceData = m_data.get();
    m_context.params = m_params.data();
    m_context.threadCount = 1;
}

CInstance::~CInstance() {
    if (m_bBegun) {
        End();
    }
    if (m_bInitialised) {
        Destroy();
    }
}

KyvStatus CInstance::Init() {
    const KyvStatus status = Effect().callbacks.InitInstance(&m_context);
    m_bInitialised = m_bInitialised || status == KYV_OK;
    return status;
}

// What a failed call has allocated is given back by EndProcessing too.
KyvStatus CInstance::Begin() {
    m_bBegun = true;
    return Effect().callbacks.BeginProcessing(&m_context);
}

KyvStatus CInstance::SetInput(uint32_t index, const void* frame) {
    m_context.frame = const_cast<void*>(frame); // inputs are only read
    return Effect().callbacks.SetInputFrame(index, &m_context);
}

KyvStatus CInstance::Process(void* output) {
    m_context.frame = output;
    return Effect().callbacks.ProcessFrame(&m_context);
}

KyvStatus CInstance::End() {
    m_bBegun = false;
    return Effect().callbacks.EndProcessing(&m_context);
}

KyvStatus CInstance::Destroy() {
    m_bInitialised = false;
    m_bBegun = false; // it does EndProcessing's work too
    return Effect().callbacks.DestroyInstance(&m_context);
}

KyvStatus CInstance::Render(void* output, const void* input0, const void* input1) {
    KyvStatus status = SetInput(0, input0);
    if (status == KYV_OK && Effect().properties.inputCount > 1) {
        status = SetInput(1, input1);
    }
    return status == KYV_OK ? Process(output) : status;
}

std::optional<uint32_t> CInstance::IndexOf(std::string_view key) const {
    for (uint32_t i = 0; i < Effect().paramCount; ++i) {
        if (key == Effect().params[i].key) {
            return i;
        }
    }
    return std::nullopt;
}

bool CInstance::SetBytes(std::string_view key, const void* value, size_t size) {
    const std::optional<uint32_t> index = IndexOf(key);
    if (!index || Effect().params[*index].valueSize != size) {
        return false;
    }
    std::memcpy(Value(*index), value, size);
    return true;
}

void Require(KyvStatus status, const EffectDescriptor& effect, const std::string& call) {
    if (status != KYV_OK) {
        throw CCallError(std::string(effect.identifier) + ": " + call + " failed with status " +
                             Hex(status),
                         status);
    }
}

} // namespace kyvhosting
