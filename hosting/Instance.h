// One instance of an effect, with everything that a host owns: the context, the instance data and
// the parameter buffer.
//
// The calls hand on the callbacks' statuses as they are and throw nothing; Require turns a status
// into an exception where that suits better. Two calls of one instance must not run at the same
// time; the caller has the lock.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "interface/HostInterface.h"

namespace kyvhosting {

class CInstance {
public:
    // Fills the context in as far as it follows from the effect and leaves the rest zero: one
    // thread, the scalar level, an ARGB frame. Calls nothing.
    explicit CInstance(const EffectDescriptor& effect);

    // EndProcessing when begun and not ended, DestroyInstance when initialised and not destroyed.
    ~CInstance();

    CInstance(const CInstance&) = delete;
    CInstance& operator=(const CInstance&) = delete;

    const EffectDescriptor& Effect() const { return *m_context.descriptor; }

    // The context, for the size of a view, time, level, threads and everything else. Its pointers
    // to descriptor, instance data and parameters are the instance's.
    EffectContext& Context() { return m_context; }
    const EffectContext& Context() const { return m_context; }

    // The callbacks. Init writes the defaults to the parameter buffer.
    KyvStatus Init();
    KyvStatus Begin();
    KyvStatus SetInput(uint32_t index, const void* frame);
    KyvStatus Process(void* output);
    KyvStatus End();
    KyvStatus Destroy();

    // SetInput for each of the effect's inputs and Process, up to the first that fails. The frames
    // hold what the context says; input1 is for effects with two.
    KyvStatus Render(void* output, const void* input0, const void* input1 = nullptr);

    // The current value of a parameter: valueSize bytes in the buffer, not aligned.
    const uint8_t* Value(uint32_t index) const { return m_params.data() + m_offsets[index]; }
    uint8_t* Value(uint32_t index) { return m_params.data() + m_offsets[index]; }

    // The whole buffer: the values in table order without gaps.
    std::vector<uint8_t>& Params() { return m_params; }

    // The index of a key such as "P1"; nothing when there is none.
    std::optional<uint32_t> IndexOf(std::string_view key) const;

    // Stores a value under its key. False, and nothing is stored, when there is no such key or
    // the value's size is not the declared one.
    template <class T>
    bool Set(std::string_view key, const T& value) {
        return SetBytes(key, &value, sizeof value);
    }
    bool SetBytes(std::string_view key, const void* value, size_t size);

private:
    EffectContext m_context = {};
    std::unique_ptr<uint64_t[]> m_data; // aligned as an allocator aligns
    std::vector<size_t> m_offsets;      // of each parameter in the buffer
    std::vector<uint8_t> m_params;
    bool m_bInitialised = false;
    bool m_bBegun = false;
};

// Throws CCallError "IDENTIFIER: CALL failed with status 0x..." for any status but success.
void Require(KyvStatus status, const EffectDescriptor& effect, const std::string& call);

} // namespace kyvhosting
