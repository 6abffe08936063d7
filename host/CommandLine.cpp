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
#include "host/Render.h"
#include "host/VideoFormats.h"
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

constexpr const char* kRenderFooter =
    R"(Examples:
  kyvhost render color-temperature photo.jpg warm.png --set P1=-0.5
  kyvhost render bubble clip.mp4 bubbles.mp4 --set density=0.8
  kyvhost render alpha-transition a.mp4 both.mp4 --input2 b.mp4 --animate P1=0:1:in-out

Values: numbers, on or off, a choice's label, #RRGGBB, x,y and left,top,right,bottom.
Times: 5s, 500ms, 2.5 or 1:30.)";

// A whole number from least to most.
template <class T>
T ParseWhole(std::string_view what, std::string_view text, T least, T most) {
    T number = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    const std::string range = std::to_string(least) + " to " + std::to_string(most);
    if (!IsWholeNumber(text)) {
        throw CUsageError(std::string(what) + ": " + Quoted(text) + " is not a whole number, " +
                          range);
    }
    if (error != std::errc() || stop != end || number < least || number > most) {
        throw CUsageError(std::string(what) + ": " + std::string(text) +
                          " is out of range: " + range);
    }
    return number;
}

// One of a few words; the value is the place in the list.
size_t ParseWord(std::string_view what, std::string_view text,
                 const std::vector<std::string>& words) {
    for (size_t i = 0; i < words.size(); ++i) {
        if (words[i] == text) {
            return i;
        }
    }
    throw CUsageError(std::string(what) + ": " + Quoted(text) + " is not one of " +
                      Join(words, ", "));
}

// "10,20" or "10,20,5"
Pick ParsePick(std::string_view what, const std::string& text) {
    const std::vector<std::string> parts = Split(text, ',');
    if (parts.size() != 2 && parts.size() != 3) {
        throw CUsageError(std::string(what) + ": " + Quoted(text) +
                          " is not a spot, such as 640,360 or 640,360,12");
    }
    Pick pick;
    pick.x = ParseWhole<uint32_t>(what, parts[0], 0, 32767);
    pick.y = ParseWhole<uint32_t>(what, parts[1], 0, 32767);
    if (parts.size() == 3) {
        pick.radius = ParseWhole<uint32_t>(what, parts[2], 0, 1000);
    }
    return pick;
}

int32_t ParseLevel(std::string_view text) {
    return ParseWhole<int32_t>("--level", text, 0, 5);
}

// What was printed counts only when it has arrived.
void FlushOutput() {
    std::cout.flush(); // help
    if (std::fflush(stdout) != 0 || std::ferror(stdout) || !std::cout) {
        throw CHostError(ExitStatus::RenderingFailed, "the standard output cannot be written");
    }
}

fs::path ParsePath(std::string_view what, std::string_view text) {
    if (text.empty()) {
        throw CUsageError(std::string(what) + " is empty: name a file");
    }
    return PathOf(text);
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
            throw CUsageError(WithHint(
                Verb() ? error.what() : "a verb is missing: list, info, render, bench or gallery"));
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

    // An option that a function reads; text that is not given is never read.
    template <class Read>
    CLI::Option* AddText(CLI::App* verb, const char* name, const char* type,
                         const std::string& what, Read&& read) {
        return verb
            ->add_option_function<std::string>(
                name, [read](const std::string& text) { read(text); }, what)
            ->type_name(type);
    }

    void AddEffect(CLI::App* verb) {
        verb->add_option("EFFECT", m_effect, "the effect; \"kyvhost list\" shows all")
            ->required()
            ->type_name("");
    }

    void AddSettings(CLI::App* verb) {
        EffectSettings& settings = m_stage.settings;
        verb->add_option("--set", settings.sets, "a parameter's value; repeatable")
            ->type_name("NAME=VALUE")
            ->allow_extra_args(false);
        AddCommonSettings(verb);
        AddText(verb, "--seed", "N", "random seed that the host hands out",
                [&settings](const std::string& text) {
                    settings.seed = ParseWhole<uint32_t>("--seed", text, 0, UINT32_MAX);
                });
        AddText(verb, "--aspect", "W:H", "shape of the display; default: the frame's own",
                [&settings](const std::string& text) {
                    settings.aspect = ParseAspect("--aspect", text);
                });
        AddText(verb, "--preview", "0..1", "show the moment that effects have for previews",
                [&settings](const std::string& text) {
                    double fraction = -1;
                    const char* const end = text.data() + text.size();
                    const auto [stop, error] = std::from_chars(text.data(), end, fraction);
                    if (error != std::errc() || stop != end || std::isnan(fraction)) {
                        throw CUsageError("--preview: " + Quoted(text) +
                                          " is not a number, 0 to 1");
                    }
                    if (fraction < 0 || fraction > 1) {
                        throw CUsageError("--preview: " + text + " is out of range: 0 to 1");
                    }
                    settings.preview = static_cast<float>(fraction);
                });
    }

    void AddCommonSettings(CLI::App* verb) {
        EffectSettings& settings = m_stage.settings;
        AddText(verb, "--format", "argb|ayuv", "pixel format of the effect's frames; default: argb",
                [&settings](const std::string& text) {
                    settings.ayuv = ParseWord("--format", text, {"argb", "ayuv"}) == 1;
                });
        AddText(verb, "--threads", "N", "threads granted to the effect; default: 1",
                [&settings](const std::string& text) {
                    settings.threads = ParseWhole<uint32_t>("--threads", text, 1, 1024);
                });
    }

    void AddLevel(CLI::App* verb) {
        AddText(verb, "--level", "0..5",
                "instruction sets: below 3 none, 3 SSE2, 4 and 5 the best there is; default: 5",
                [this](const std::string& text) { m_stage.settings.level = ParseLevel(text); });
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
        CLI::App* const verb = AddVerb("render", "Renders a picture or a video through an effect.",
                                       &CCommandLine::RenderFile);
        verb->footer(kRenderFooter);
        AddEffect(verb);
        verb->add_option(
                "INPUT", m_input,
                "a picture, a video that ffmpeg reads, numbered pictures (shot-%04d.png), or - for "
                "standard input: y4m, NUT, or raw BGRA with --size and --rate")
            ->required()
            ->type_name("");
        verb->add_option("OUTPUT", m_output,
                         "a .png, .jpg, .tif or .bmp picture, a video (" + VideoEndings() +
                             "), numbered pictures, or - for standard output")
            ->required()
            ->type_name("");
        AddText(
            verb, "--input2", "FILE",
            "the second input of a transition, or the inner picture; takes the first one's size",
            [this](const std::string& text) { m_stage.input2 = ParsePath("--input2", text); });
        AddSettings(verb);
        AddLevel(verb);
        verb->add_option("--animate", m_stage.animations,
                         "a parameter that changes over the clip; repeatable")
            ->type_name("NAME=FROM:TO[:EASING]")
            ->allow_extra_args(false);
        AddText(verb, "--easing", "NAME",
                "of animations: linear, in, out or in-out; default: linear",
                [this](const std::string& text) { m_stage.easing = ParseEasing(text); });
        AddText(verb, "--time", "TIME", "the moment to show in a picture; default: the middle",
                [this](const std::string& text) { m_render.time = ParseTime("--time", text); });
        AddText(verb, "--start", "TIME", "where in the videos to begin",
                [this](const std::string& text) { m_render.start = ParseTime("--start", text); });
        AddText(verb, "--duration", "TIME",
                "length of the clip; default: the shortest video's, or 10s for pictures",
                [this](const std::string& text) {
                    m_render.duration = ParseTime("--duration", text);
                    if (*m_render.duration == 0) {
                        throw CUsageError("--duration: " + text +
                                          " is out of range: it is above 0");
                    }
                });
        AddText(
            verb, "--overlap", "TIME",
            "play the first video, the effect for so long, then the rest of the second",
            [this](const std::string& text) { m_render.overlap = ParseTime("--overlap", text); });
        AddText(verb, "--rate", "FPS", "frame rate; default: the video's, or 30 for pictures",
                [this](const std::string& text) { m_render.rate = ParseRate("--rate", text); });
        AddText(verb, "--stereo", "sbs|split",
                "two views side by side: both of the input (sbs), or an input that holds two "
                "already (split)",
                [this](const std::string& text) {
                    m_render.stereo = ParseWord("--stereo", text, {"sbs", "split"}) == 0
                                          ? Stereo::SideBySide
                                          : Stereo::Split;
                });
        AddText(verb, "--field", "auto|frame|first|second|both",
                "auto renders frames of two fields field by field; frame renders all as they are; "
                "the others only these rows; default: auto",
                [this](const std::string& text) {
                    const size_t field =
                        ParseWord("--field", text, {"auto", "frame", "first", "second", "both"});
                    m_render.fields = field == 0 ? FieldUse::AsVideo : FieldUse::Frames;
                    m_stage.settings.firstField = field == 2 || field == 4;
                    m_stage.settings.secondField = field >= 3;
                });
        AddText(verb, "--codec", "NAME",
                "of a video: " + Join(CodecNames(), ", ") +
                    "; default: what suits the file, with alpha where the input has it",
                [this](const std::string& text) { m_render.codec = FindCodec(text).name; });
        AddText(verb, "--output-format", "ENDING",
                "of standard output, or where the name does not tell: nut, y4m, raw, mkv, ...; "
                "default: nut",
                [this](const std::string& text) { m_render.outputFormat = text; });
        AddText(verb, "--encoder-options", "TEXT",
                "handed to ffmpeg behind our own, such as \"-crf 14 -preset slow\"; repeatable",
                [this](const std::string& text) {
                    const std::vector<std::string> words = SplitWords("--encoder-options", text);
                    m_render.encoderOptions.insert(m_render.encoderOptions.end(), words.begin(),
                                                   words.end());
                })
            ->take_all()
            ->allow_extra_args(false);
        AddText(verb, "--size", "WxH", "of raw BGRA frames that come over a pipe, with --rate",
                [this](const std::string& text) { m_render.size = ParseSize("--size", text); });
        AddText(
            verb, "--pick", "X,Y[,RADIUS]",
            "a grey spot of the input, whose mean becomes the reference colour of white-balance",
            [this](const std::string& text) { m_render.pick = ParsePick("--pick", text); });
        AddText(verb, "--offset", "TIME", "where in its animation the effect begins; default: 0",
                [this](const std::string& text) { m_render.offset = ParseTime("--offset", text); });
        AddText(verb, "--jobs", "N",
                "frames that are rendered at a time, each with memory of its own; default: as many "
                "as the processor has cores",
                [this](const std::string& text) {
                    m_render.jobs = ParseWhole<uint32_t>("--jobs", text, 1, 256);
                });
        verb->add_flag("--strict", m_render.strict, "what cannot be kept is an error");
        AddText(verb, "--ffmpeg", "FILE", "the program ffmpeg; ffprobe lies beside it",
                [this](const std::string& text) {
                    m_render.tools.ffmpeg = TextOf(ParsePath("--ffmpeg", text));
                });
        AddOverwrite(verb);
        verb->add_flag("--quiet,-q", m_render.quiet, "no progress, no notes");
    }

    void AddBench() {
        CLI::App* const verb = AddVerb("bench",
                                       "Measures an effect's time for a frame beside a "
                                       "memcpy of the frame.",
                                       &CCommandLine::BenchEffect);
        AddEffect(verb);
        AddSettings(verb);
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
        AddCommonSettings(verb);
        AddLevel(verb);
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
        m_stage.effect = m_effect;
        m_render.stages = {m_stage};
        m_render.input = ParsePath("INPUT", m_input);
        m_render.output = ParsePath("OUTPUT", m_output);
        m_render.overwrite = m_bOverwrite;
        const CModule module = Load();
        Render(module.Descriptor(), m_render);
    }

    void BenchEffect() {
        m_bench.effect = m_effect;
        m_bench.settings = m_stage.settings;
        m_bench.json = m_bJson;
        const CModule module = Load();
        Bench(module.Descriptor(), m_bench);
    }

    void MakeGallery() {
        m_gallery.input = ParsePath("INPUT", m_input);
        m_gallery.input2 = ParsePath("INPUT2", m_input2);
        m_gallery.output = ParsePath("OUTPUT", m_output);
        m_gallery.settings = m_stage.settings;
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
    bool m_bJson = false;
    bool m_bOverwrite = false;
    RenderOptions m_render;
    StageOptions m_stage;
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
