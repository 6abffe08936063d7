// The command line.
#include "host/CommandLine.h"

#include <charconv>
#include <cmath>
#include <cstdio>
#include <functional>
#include <iostream>
#include <map>
#include <new>
#include <optional>

#include <CLI/CLI.hpp>

#include "host/Bench.h"
#include "host/Catalogue.h"
#include "host/Gallery.h"
#include "host/Hosting.h"
#include "host/RenderArguments.h"
#include "hosting/Error.h"
#include "hosting/Module.h"
#include "hosting/Names.h"
#include "hosting/Suggest.h"
#include "hosting/Text.h"
#include "platform/Process.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

constexpr const char* kFooter =
    R"(Effects are named by short name, identifier or number, parameters by key or name.

Exit status:
    0  done
    1  rendering failed, or the result cannot be written
    2  wrong use: an option, an effect, a parameter or a value
    3  an input is missing or cannot be read
    4  the module cannot be used
  130  interrupted; nothing is left behind)";

// What was printed counts only when it has arrived.
void FlushOutput() {
    std::cout.flush(); // help
    if (std::fflush(stdout) != 0 || std::ferror(stdout) || !std::cout) {
        throw CHostError(ExitStatus::RenderingFailed, "the standard output cannot be written");
    }
}

// Where the module lies when the user names none: beside the program, else where the build tree
// and an installation have it.
fs::path DefaultModuleFile() {
    const fs::path folder = kyv::ExecutableFile().parent_path();
    fs::path file = FindModuleFile({folder, folder / "../module", folder / "../lib"});
    if (file.empty()) {
        throw CModuleError("no " KYV_MODULE_NAME " beside " + TextOf(folder / "kyvhost") +
                           "; name the module with --module FILE");
    }
    return file;
}

class CCommandLine {
public:
    CCommandLine() : m_app("Renders the video effects of a KYV DSP module.", "kyvhost") {
        m_app.footer(kFooter);
        m_app.require_subcommand(1);
        m_app.set_version_flag("--version", "kyvhost " KYV_VERSION);
        m_app
            .add_option("--module", m_module,
                        "the module's file; default: " KYV_MODULE_NAME " beside kyvhost")
            ->type_name("FILE");
        m_app.fallthrough();
        m_app.allow_windows_style_options(false); // "/home/me/photo.png" is a file everywhere
        AddList();
        AddInfo();
        AddRender();
        AddPlay();
        AddBench();
        AddGallery();
    }

    void Run(const std::vector<std::string>& arguments) {
        try {
            m_app.parse(std::vector<std::string>(arguments.rbegin(), arguments.rend()));
        } catch (const CLI::Success& wanted) { // help or version
            m_app.exit(wanted);
            FlushOutput();
            return;
        } catch (const CLI::ParseError& error) {
            if (!m_app.remaining(true).empty()) {
                RefuseExtra();
            }
            throw CUsageError(
                WithHint(Verb() ? error.what()
                                : "a verb is missing: list, info, render, play, bench or gallery"));
        }
        m_action();
        FlushOutput();
    }

private:
    using Action = void (CCommandLine::*)();

    CLI::App* AddVerb(const char* name, const char* description, Action action) {
        CLI::App* const verb = m_app.add_subcommand(name, description);
        verb->callback([this, action] { m_action = [this, action] { (this->*action)(); }; });
        return verb;
    }

    void AddEffect(CLI::App* verb) {
        verb->add_option("EFFECT", m_effect, "the effect; \"kyvhost list\" shows all")
            ->required()
            ->type_name("");
    }

    void AddJson(CLI::App* verb) { verb->add_flag("--json", m_bJson, "JSON instead of a table"); }

    void AddOverwrite(CLI::App* verb) {
        verb->add_flag("--overwrite,-y", m_bOverwrite, "replace a result that exists");
    }

    void AddList() { AddJson(AddVerb("list", "Lists the effects.", &CCommandLine::List)); }

    void AddInfo() {
        CLI::App* const verb =
            AddVerb("info", "Shows an effect and its parameters.", &CCommandLine::Info);
        AddEffect(verb);
        AddJson(verb);
    }

    void AddRender() {
        m_render.AddRender(AddVerb("render", "Renders a picture or a video through effects.",
                                   &CCommandLine::RenderFile));
    }

    void AddPlay() {
        m_play.AddPlay(AddVerb("play", "Shows a clip through effects in a window, with sound.",
                               &CCommandLine::PlayFile));
    }

    void AddBench() {
        CLI::App* const verb = AddVerb("bench",
                                       "Measures an effect's time for a frame beside a "
                                       "memcpy of the frame.",
                                       &CCommandLine::BenchEffect);
        AddEffect(verb);
        verb->add_option("--set", m_sets, "a parameter's value; repeatable")
            ->type_name("NAME=VALUE")
            ->allow_extra_args(false);
        AddSettings(verb, m_bench.settings);
        AddDisplay(verb, m_bench.settings);
        AddText(verb, "--seed", "N", "random seed that the host hands out",
                [this](const std::string& text) {
                    m_bench.stage.seed = ParseWhole<uint32_t>("--seed", text, 0, UINT32_MAX);
                });
        AddText(verb, "--level", "0..5", "one level only; default: 0, 3 and 5",
                [this](const std::string& text) { m_bench.levels = {ParseLevel(text)}; });
        AddText(verb, "--size", "WxH", "of the frame; default: 1920x1080",
                [this](const std::string& text) { m_bench.size = ParseSize("--size", text); });
        AddText(verb, "--frames", "N", "frames a level; default: about two seconds of them",
                [this](const std::string& text) {
                    m_bench.rounds = ParseWhole<int>("--frames", text, 1, 1'000'000);
                });
        AddJson(verb);
    }

    void AddGallery() {
        CLI::App* const verb =
            AddVerb("gallery", "Renders every effect on two pictures into one contact sheet.",
                    &CCommandLine::MakeGallery);
        verb->add_option("OUTPUT", m_output, "a .png, .jpg, .tif or .bmp picture")
            ->required()
            ->type_name("");
        verb->add_option("INPUT", m_input, "a picture")->required()->type_name("");
        verb->add_option("INPUT2", m_input2, "another one, for effects with two inputs")
            ->required()
            ->type_name("");
        AddOverwrite(verb);
        AddSettings(verb, m_gallery.settings);
        AddLevel(verb, m_gallery.settings);
        AddText(verb, "--columns", "N", "pictures a row; default: 5",
                [this](const std::string& text) {
                    m_gallery.columns = ParseWhole<uint32_t>("--columns", text, 1, 16);
                });
        AddText(verb, "--width", "N", "pixels of one picture; default: 400",
                [this](const std::string& text) {
                    m_gallery.tileWidth = ParseWhole<uint32_t>("--width", text, 64, 1920);
                });
    }

    CModule Load() const {
        return CModule(m_module ? ParsePath("--module", *m_module) : DefaultModuleFile());
    }

    void List() {
        const CModule module = Load();
        std::fputs((m_bJson ? ListJson : ListText)(module.Descriptor()).c_str(), stdout);
    }

    void Info() {
        const CModule module = Load();
        const EffectDescriptor& effect = FindEffect(module.Descriptor(), m_effect, kAllEffects);
        std::fputs((m_bJson ? InfoJson : InfoText)(effect).c_str(), stdout);
    }

    void RenderFile() {
        const CModule module = Load();
        Render(module.Descriptor(), m_render.Options(module.Descriptor()));
    }

    void PlayFile() {
        const CModule module = Load();
        Play(module.Descriptor(), m_play.Options(module.Descriptor()));
    }

    void BenchEffect() {
        m_bench.stage.effect = m_effect;
        for (const std::string& set : m_sets) {
            AddValue(m_bench.stage, set);
        }
        m_bench.json = m_bJson;
        const CModule module = Load();
        Bench(module.Descriptor(), m_bench);
    }

    void MakeGallery() {
        m_gallery.input = ParsePath("INPUT", m_input);
        m_gallery.input2 = ParsePath("INPUT2", m_input2);
        m_gallery.output = ParsePath("OUTPUT", m_output);
        m_gallery.overwrite = m_bOverwrite;
        const CModule module = Load();
        Gallery(module.Descriptor(), m_gallery);
    }

    const CLI::App* Verb() const {
        const auto verbs = m_app.get_subcommands();
        return verbs.empty() ? nullptr : verbs.front();
    }

    std::string WithHint(const std::string& text) const {
        const CLI::App* const verb = Verb();
        return text + " (kyvhost " + (verb ? verb->get_name() + " " : "") + "--help)";
    }

    // What is left over is a mistyped verb or option, or one argument too many.
    [[noreturn]] void RefuseExtra() const {
        const CLI::App* const verb = Verb();
        const std::string extra = m_app.remaining(true).front();
        std::vector<std::string> names;
        if (!verb) {
            for (const CLI::App* candidate : m_app.get_subcommands({})) {
                names.push_back(candidate->get_name());
            }
            const std::string nearest = Nearest(extra, names);
            throw CUsageError("no verb " + Quoted(extra) +
                              (nearest.empty() ? "; name one of " + Join(names, ", ")
                                               : "; the nearest is " + nearest));
        }
        if (!extra.starts_with('-')) {
            throw CUsageError(WithHint(Quoted(extra) + " is one argument too many"));
        }
        for (const CLI::Option* option : verb->get_options()) {
            if (option->nonpositional()) {
                names.push_back("--" + option->get_lnames().front());
            }
        }
        names.emplace_back("--module");
        const std::string option = extra.substr(0, extra.find('='));
        const std::string nearest = Nearest(option, names);
        throw CUsageError(WithHint("no option " + Quoted(option) +
                                   (nearest.empty() ? "" : "; the nearest is " + nearest)));
    }

    CLI::App m_app;
    std::function<void()> m_action = [] {};
    std::optional<std::string> m_module;
    std::string m_effect, m_input, m_input2, m_output;
    std::vector<std::string> m_sets;
    bool m_bJson = false;
    bool m_bOverwrite = false;
    CRenderArguments m_render, m_play;
    BenchOptions m_bench;
    GalleryOptions m_gallery;
};

ExitStatus Complain(ExitStatus status, const std::string& text) {
    std::fprintf(stderr, "kyvhost: %s\n", text.c_str());
    return status;
}

} // namespace

ExitStatus RunCommandLine(const std::vector<std::string>& arguments) {
    try {
        CCommandLine().Run(arguments);
        return ExitStatus::Done;
    } catch (const CHostError& error) {
        return Complain(error.Status(), error.what());
    } catch (const CUsageError& error) {
        return Complain(ExitStatus::WrongUse, error.what());
    } catch (const CModuleError& error) {
        return Complain(ExitStatus::ModuleNotUsable, error.what());
    } catch (const std::bad_alloc&) {
        return Complain(ExitStatus::RenderingFailed, "there is not enough memory");
    } catch (const std::exception& error) {
        return Complain(ExitStatus::RenderingFailed, error.what());
    }
}

} // namespace kyvhost
