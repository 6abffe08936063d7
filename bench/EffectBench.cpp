// Whole effects, driven through the callbacks of the built module as a host drives them.
#include "bench/Bench.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>

#include "hosting/Instance.h"
#include "hosting/Module.h"
#include "hosting/Names.h"

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
    int32_t startMs = 0;                 // playing begins here and goes on at 30 frames a second
    std::vector<Setting> alternate = {}; // every other frame has these
    uint32_t threads = 1;
};

// The picture-in-picture over the whole frame or half of it, without anything else.
std::vector<Setting> PictureOnly(float left, float top, float right, float bottom) {
    return {{"P0", left}, {"P1", top},    {"P2", right}, {"P3", top}, {"P4", right}, {"P5", bottom},
            {"P6", left}, {"P7", bottom}, {"P8", 0},     {"P15", 0},  {"P23", 0}};
}

// A slanted quad of about half the frame, with key, border, shadow, gradients and blurs.
std::vector<Setting> PictureWithAll() {
    return {{"P0", 0.1F},         {"P1", 0.2F},  {"P2", 0.85F},      {"P3", 0.1F},
            {"P4", 0.9F},         {"P5", 0.85F}, {"P6", 0.15F},      {"P7", 0.75F},
            {"P10", uint8_t{40}}, {"P14", 1},    {"P17", 0x800000U}, {"P20", 4},
            {"P26", 0x00FFFFU},   {"P29", 1}};
}

std::vector<Setting> Slanted() {
    std::vector<Setting> settings = PictureOnly(0.05F, 0.05F, 0.95F, 0.95F);
    settings[3] = {"P3", 0.0F};
    settings[6] = {"P6", 0.0F};
    return settings;
}

// One line a case.
const EffectCase kCases[] = {
    {"colour temperature", "Kyv_Dsp_Co_Temperature", {{"P1", 0.4F}, {"P3", -0.3F}}},
    {"white balance", "Kyv_Dsp_Co_WhiteBalance", {{"P1", 0xA0C0FFU}}},
    {"pip full", "Kyv_Dsp_Pi_Freeform", PictureOnly(0.0F, 0.0F, 1.0F, 1.0F)},
    {"pip full moving",
     "Kyv_Dsp_Pi_Freeform",
     PictureOnly(0.0F, 0.0F, 1.0F, 1.0F),
     0,
     {{"P0", 0.001F}}},
    {"pip slanted", "Kyv_Dsp_Pi_Freeform", Slanted()},
    {"pip slanted moving", "Kyv_Dsp_Pi_Freeform", Slanted(), 0, {{"P0", 0.06F}}},
    {"pip half", "Kyv_Dsp_Pi_Freeform", PictureOnly(0.25F, 0.25F, 0.75F, 0.75F)},
    {"pip half moving",
     "Kyv_Dsp_Pi_Freeform",
     PictureOnly(0.25F, 0.25F, 0.75F, 0.75F),
     0,
     {{"P0", 0.26F}}},
    {"pip defaults", "Kyv_Dsp_Pi_Freeform"},
    {"pip defaults moving", "Kyv_Dsp_Pi_Freeform", {{"P0", 0.25F}}, 0, {{"P0", 0.26F}}},
    {"pip all", "Kyv_Dsp_Pi_Freeform", PictureWithAll()},
    {"pip all moving", "Kyv_Dsp_Pi_Freeform", PictureWithAll(), 0, {{"P0", 0.11F}}},
    {"alpha transition", "DSP_TR_AlphaTransition", {{"P1", 0.5F}}},
    {"alpha transition x2", "DSP_TR_AlphaTransition", {{"P1", 0.5F}}, 0, {}, 2},
    {"test alpha transition", "DSP_TR_TestAlpha", {{"P1", 0.5F}}},
    {"dreamy", "Kyv_Dsp_Vi_Dreamy", {{"P1", uint8_t{12}}}},
    {"pencil sketch", "Dsp_Vi_PencilSketch2"},
    {"light ray", "Kyv_Dsp_Vi_LightRay", {{"P2", std::array{0.6F, 0.2F}}}},
    {"bubble", "Kyv_Dsp_Pfx_Bubble", {}, 20000},
    {"refractive bubble", "Kyv_Dsp_Pfx_RefractiveBubble", {}, 20000},
    {"fireworks", "Kyv_Dsp_Pfx_Fireworks", {}, 20000},
    {"fireworks, dense", "Kyv_Dsp_Pfx_Fireworks", {{"P1", 1.0F}, {"P2", 1.0F}}, 20000},
    {"water ripple", "Kyv_Dsp_Pfx_WaterRipple", {}, 20000},
    // Every frame is a first visit: a changed parameter forgets what was simulated.
    {"bubble, cold seek", "Kyv_Dsp_Pfx_Bubble", {{"P1", 0.2F}}, 60000, {{"P1", 0.25F}}},
    {"fireworks, cold seek", "Kyv_Dsp_Pfx_Fireworks", {{"P1", 0.5F}}, 60000, {{"P1", 0.45F}}},
    {"water ripple, cold seek", "Kyv_Dsp_Pfx_WaterRipple", {{"P1", 0.5F}}, 60000, {{"P1", 0.45F}}},
    {"light ray x2", "Kyv_Dsp_Vi_LightRay", {{"P2", std::array{0.6F, 0.2F}}}, 0, {}, 2},
};

constexpr int64_t kFrameTime = 10'000'000 / 30; // 100 ns units

const EffectDescriptor* FindEffect(const char* identifier) {
    static const kyvhosting::CModule module(KYV_MODULE_FILE);
    return kyvhosting::EffectOf(module.Descriptor(), identifier);
}

// An instance that plays on with every frame.
class CPlayer {
public:
    CPlayer(const EffectDescriptor& effect, const EffectCase& what, uint32_t format, int32_t level)
        : m_settings(what.settings), m_alternate(what.alternate), m_instance(effect) {
        EffectContext& context = m_instance.Context();
        context.width = kWidth;
        context.height = kHeight;
        context.pixelFormat = format;
        context.cpuLevel = level;
        context.threadCount = what.threads;
        context.position = int64_t{what.startMs} * 10'000;
        context.duration = int64_t{3600} * 10'000'000; // never played to its end
        m_ready = m_instance.Init() == KYV_OK && Set(m_settings) && Set(m_alternate) &&
                  m_instance.Begin() == KYV_OK && Play();
    }

    // False when the effect refused a setting or its first frame.
    bool IsReady() const { return m_ready; }

    bool Play() {
        Set(m_frame++ % 2 ? m_alternate : m_settings);
        Frames& frames = SharedFrames();
        const KyvStatus status = m_instance.Render(frames.target.data(), frames.source[0].data(),
                                                   frames.source[1].data());
        m_instance.Context().position += kFrameTime;
        return status == KYV_OK;
    }

private:
    bool Set(const std::vector<Setting>& settings) {
        return std::all_of(settings.begin(), settings.end(), [this](const Setting& setting) {
            return m_instance.SetBytes(setting.key, setting.bytes.data(), setting.bytes.size());
        });
    }

    const std::vector<Setting>& m_settings;
    const std::vector<Setting>& m_alternate;
    kyvhosting::CInstance m_instance;
    uint32_t m_frame = 0;
    bool m_ready;
};

} // namespace

void AddEffects() {
    for (const EffectCase& what : kCases) {
        for (const uint32_t format : {PixelFormat_Argb, PixelFormat_Ayuv}) {
            for (const int32_t level : {0, 3, 4, 5}) {
                AddPrepared(
                    std::string("effect ") + what.name +
                        (format == PixelFormat_Ayuv ? " AYUV" : " ARGB"),
                    "level " + std::to_string(level),
                    [&what, format, level]() -> std::function<void()> {
                        const EffectDescriptor* effect = FindEffect(what.identifier);
                        if (!effect) {
                            return {};
                        }
                        const auto player = std::make_shared<CPlayer>(*effect, what, format, level);
                        if (!player->IsReady()) {
                            return {};
                        }
                        return [player] { player->Play(); };
                    },
                    what.threads > 1 ? Clock::Wall : Clock::Thread);
            }
        }
    }
}

} // namespace kyvbench
