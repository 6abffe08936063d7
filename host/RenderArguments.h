// The options of the command line that describe a rendering.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include <CLI/CLI.hpp>

#include "host/Hosting.h"
#include "host/Render.h"

namespace kyvhost {

// An option that a function reads, whenever it comes; text that is not given is never read.
template <class Read>
CLI::Option* AddText(CLI::App* verb, const char* name, const char* type, const std::string& what,
                     Read&& read) {
    return verb
        ->add_option_function<std::string>(
            name, [read](const std::string& text) { read(text); }, what)
        ->type_name(type);
}

// Options that several verbs have; what is read goes into settings, which have to stay.
void AddSettings(CLI::App* verb, EffectSettings& settings); // pixel format, threads
void AddDisplay(CLI::App* verb, EffectSettings& settings);  // shape of the display, preview
void AddLevel(CLI::App* verb, EffectSettings& settings);

int32_t ParseLevel(std::string_view text);

class CRenderArguments {
public:
    void AddRender(CLI::App* verb);
    void AddPlay(CLI::App* verb);

    // What has been parsed, with files of effects read. Throws CUsageError and CHostError.
    RenderOptions Options(const ModuleDescriptor& module) const;

private:
    // An effect, or a file of them, with what follows it.
    struct StageText {
        std::string effect;
        std::vector<std::string> values, animations, keyframes;
        std::optional<Easing> easing;
        std::optional<double> offset;
        std::optional<uint32_t> seed;
        std::optional<std::filesystem::path> input2;

        bool IsPlain() const;
        void Apply(StageOptions& stage) const;
    };

    void AddStages(CLI::App* verb);
    void AddTimes(CLI::App* verb);
    void AddFrames(CLI::App* verb);
    void AddOutput(CLI::App* verb);
    void AddRunning(CLI::App* verb);

    // An option of the effect that was named last.
    template <class Read>
    void AddStageText(CLI::App* verb, const char* name, const char* type, const std::string& what,
                      Read&& read);

    RenderOptions m_options;
    std::vector<StageText> m_stages{1}; // the first one's name is the argument
    std::string m_effect, m_input, m_output;
};

} // namespace kyvhost
