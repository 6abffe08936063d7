// Whole effects, driven through the callbacks of the built module as a host drives them.
#include "bench/Bench.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>

#include "module/HostInterface.h"
#include "platform/Library.h"

namespace kyvbench {
namespace {

// A parameter that differs from its default.
struct Setting {
    template <class T>
    Setting(const char* name, T value) : key(name), bytes(sizeof value) {
        std::memcpy(bytes.data(), &value, sizeof value);
    }

    std::string key;
    std::vector<uint8_t> bytes;
};

struct EffectCase {
    const char* name;
    const char* identifier;
    std::vector<Setting> settings = {};
    int32_t startMs = 0; // playing begins here and goes on at 30 frames a second
};

// One line a case.
const EffectCase kCases[] = {
    {"colour temperature", "Kyv_Dsp_Co_Temperature", {{"P1", 0.4F}, {"P3", -0.3F}}},
    {"white balance", "Kyv_Dsp_Co_WhiteBalance", {{"P1", 0xA0C0FFU}}},
};

constexpr int64_t kFrameTime = 10'000'000 / 30; // 100 ns units

const ModuleDescriptor& LoadModule() {
    static const ModuleDescriptor* const module = [] {
        const kyv::LibraryHandle library =
            kyv::OpenLibrary(std::filesystem::path(KYV_MODULE_FILE).native());
        const auto init =
            reinterpret_cast<KyvInitModuleFunction>(kyv::FindSymbol(library, KYV_INIT_MODULE_NAME));
        ModuleDescriptor* descriptor = nullptr;
        if (!init || init(&descriptor) != KYV_OK) {
            std::fprintf(stderr, "kyv_bench: cannot load %s\n", KYV_MODULE_FILE);
            std::exit(1);
        }
        return descriptor;
    }();
    return *module;
}

const EffectDescriptor* FindEffect(const std::string& identifier) {
    const ModuleDescriptor& module = LoadModule();
    const auto* end = module.effects + module.effectCount;
    const auto* found = std::find_if(module.effects, end, [&](const EffectDescriptor& effect) {
        return effect.identifier == identifier;
    });
    return found == end ? nullptr : found;
}

// An instance that plays on with every frame.
class CPlayer {
public:
    CPlayer(const EffectDescriptor& effect, const EffectCase& what, uint32_t format, int32_t level)
        : m_effect(effect), m_data((effect.instanceDataSize + 7) / 8) {
        size_t size = 0;
        for (uint32_t i = 0; i < effect.paramCount; ++i) {
            size += effect.params[i].valueSize;
        }
        m_params.resize(size);
        m_context.descriptor = &effect;
        m_context.instanceData = m_data.data();
        m_context.params = m_params.data();
        m_context.width = kWidth;
        m_context.height = kHeight;
        m_context.pixelFormat = format;
        m_context.cpuLevel = level;
        m_context.threadCount = 1;
        m_context.position = int64_t{what.startMs} * 10'000;
        m_context.duration = int64_t{60} * 10'000'000;
        m_ready = effect.callbacks.InitInstance(&m_context) == KYV_OK;
        for (const Setting& setting : what.settings) {
            m_ready = m_ready && Set(setting);
        }
        m_ready = m_ready && effect.callbacks.BeginProcessing(&m_context) == KYV_OK && Play();
    }

    ~CPlayer() {
        m_effect.callbacks.EndProcessing(&m_context);
        m_effect.callbacks.DestroyInstance(&m_context);
    }

    CPlayer(const CPlayer&) = delete;
    CPlayer& operator=(const CPlayer&) = delete;

    // False when the effect refused a setting or its first frame.
    bool IsReady() const { return m_ready; }

    bool Play() {
        Frames& frames = SharedFrames();
        for (uint32_t i = 0; i < m_effect.properties.inputCount; ++i) {
            m_context.frame = frames.source[i].data();
            m_effect.callbacks.SetInputFrame(i, &m_context);
        }
        m_context.frame = frames.target.data();
        const KyvStatus status = m_effect.callbacks.ProcessFrame(&m_context);
        m_context.position += kFrameTime;
        return status == KYV_OK;
    }

private:
    bool Set(const Setting& setting) {
        uint8_t* value = m_params.data();
        for (uint32_t i = 0; i < m_effect.paramCount; ++i) {
            const ParamDescriptor& param = m_effect.params[i];
            if (param.key == setting.key) {
                std::copy(setting.bytes.begin(), setting.bytes.end(), value);
                return param.valueSize == setting.bytes.size();
            }
            value += param.valueSize;
        }
        return false;
    }

    const EffectDescriptor& m_effect;
    EffectContext m_context = {};
    std::vector<uint64_t> m_data;
    std::vector<uint8_t> m_params;
    bool m_ready;
};

} // namespace

void AddEffects() {
    for (const EffectCase& what : kCases) {
        for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
            for (const int32_t level : {0, 3, 4, 5}) {
                AddPrepared(std::string("effect ") + what.name +
                                (format == PixelFormat_Ayuv ? " AYUV" : " ARGB"),
                            "level " + std::to_string(level),
                            [&what, format, level]() -> std::function<void()> {
                                const EffectDescriptor* effect = FindEffect(what.identifier);
                                if (!effect) {
                                    return {};
                                }
                                const auto player =
                                    std::make_shared<CPlayer>(*effect, what, format, level);
                                if (!player->IsReady()) {
                                    return {};
                                }
                                return [player] { player->Play(); };
                            });
            }
        }
    }
}

} // namespace kyvbench
