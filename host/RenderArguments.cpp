// The options of a rendering.
#include "host/RenderArguments.h"

#include <cmath>
#include <cstdio>
#include <iterator>
#include <utility>

#include "host/Arguments.h"
#include "host/EffectFile.h"
#include "host/ExitStatus.h"
#include "host/VideoFormats.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

constexpr const char* kFooter =
    R"(Examples:
  kyvhost render color-temperature photo.jpg warm.png --set P1=-0.5
  kyvhost render bubble clip.mp4 bubbles.mp4 --set density=0.8 --then dreamy --set P1=12
  kyvhost render alpha-transition a.mp4 both.mp4 --input2 b.mp4 --animate P1=0:1:in-out
  kyvhost render dreamy clip.mp4 soft.mp4 --key P1@0s=0 --key P1@2s=20:out --save look.json
  kyvhost render look.json other.mp4 soft2.mp4

Values: numbers, on or off, a choice's label, #RRGGBB, x,y and left,top,right,bottom.
Times: 5s, 500ms, 2.5 or 1:30; those of keyframes also 50%, a part of the clip.)";

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

double ParseNumber(std::string_view what, std::string_view text, double least, double most) {
    double number = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    char range[64];
    std::snprintf(range, sizeof range, "%g to %g", least, most);
    if (error != std::errc() || stop != end || std::isnan(number)) {
        throw CUsageError(std::string(what) + ": " + Quoted(text) + " is not a number, " + range);
    }
    if (number < least || number > most) {
        throw CUsageError(std::string(what) + ": " + std::string(text) +
                          " is out of range: " + range);
    }
    return number;
}

} // namespace

int32_t ParseLevel(std::string_view text) {
    return ParseWhole<int32_t>("--level", text, 0, 5);
}

void AddSettings(CLI::App* verb, EffectSettings& settings) {
    AddText(verb, "--format", "argb|ayuv", "pixel format of the effect's frames; default: argb",
            [&settings](const std::string& text) {
                settings.ayuv = ParseWord("--format", text, {"argb", "ayuv"}) == 1;
            });
    AddText(verb, "--threads", "N", "threads granted to the effect; default: 1",
            [&settings](const std::string& text) {
                settings.threads = ParseWhole<uint32_t>("--threads", text, 1, 1024);
            });
}

void AddDisplay(CLI::App* verb, EffectSettings& settings) {
    AddText(
        verb, "--aspect", "W:H", "shape of the display; default: the frame's own",
        [&settings](const std::string& text) { settings.aspect = ParseAspect("--aspect", text); });
    AddText(verb, "--effect-preview", "0..1", "show the moment that effects have for previews",
            [&settings](const std::string& text) {
                settings.preview = static_cast<float>(ParseNumber("--effect-preview", text, 0, 1));
            });
}

void AddLevel(CLI::App* verb, EffectSettings& settings) {
    AddText(verb, "--level", "0..5",
            "instruction sets: below 3 none, 3 SSE2 or NEON, 4 and 5 the best; default: 5",
            [&settings](const std::string& text) { settings.level = ParseLevel(text); });
    verb->add_flag_callback(
        "--narrow-map", [&settings] { settings.wideMap = false; },
        "of an inner picture reach only the first 1024 columns and rows, as hosts do that know no "
        "better");
}

bool CRenderArguments::StageText::IsPlain() const {
    return values.empty() && animations.empty() && keyframes.empty() && !easing && !offset &&
           !seed && !input2;
}

void CRenderArguments::StageText::Apply(StageOptions& stage) const {
    const Easing usual = easing.value_or(Easing::Linear);
    for (const std::string& value : values) {
        AddValue(stage, value);
    }
    for (const std::string& animation : animations) {
        AddAnimation(stage, animation, usual);
    }
    for (const std::string& keyframe : keyframes) {
        AddKeyframe(stage, keyframe, usual);
    }
    stage.easing = easing.value_or(stage.easing);
    stage.offset = offset.value_or(stage.offset);
    stage.seed = seed.value_or(stage.seed);
    stage.input2 = input2 ? input2 : stage.input2;
}

RenderOptions CRenderArguments::Options(const ModuleDescriptor& module) const {
    RenderOptions options = m_options;
    options.input = ParsePath("INPUT", m_input);
    options.output = ParsePath("OUTPUT", m_output);
    for (size_t i = 0; i < m_stages.size(); ++i) {
        const StageText& text = m_stages[i];
        const std::string& name = i == 0 ? m_effect : text.effect;
        std::vector<StageOptions> stages(1);
        if (IsEffectFileName(name)) {
            stages = ReadEffectFile(module, PathOf(name));
        } else {
            stages.front().effect = name;
        }
        if (stages.size() > 1 && !text.IsPlain()) {
            throw CUsageError(name + " holds " + std::to_string(stages.size()) +
                              " effects; --set and the like are for one: write them into the file");
        }
        text.Apply(stages.front());
        std::move(stages.begin(), stages.end(), std::back_inserter(options.stages));
    }
    return options;
}

template <class Read>
void CRenderArguments::AddStageText(CLI::App* verb, const char* name, const char* type,
                                    const std::string& what, Read&& read) {
    AddText(verb, name, type, what,
            [this, read](const std::string& text) { read(m_stages.back(), text); })
        ->take_all()
        ->trigger_on_parse() // at once, while the effect that it belongs to is the last one
        ->allow_extra_args(false);
}

void CRenderArguments::AddRender(CLI::App* verb) {
    verb->footer(kFooter);
    AddStages(verb);
    verb->add_option("OUTPUT", m_output,
                     "a .png, .jpg, .tif or .bmp picture, a video (" + VideoEndings() +
                         "), numbered pictures, or - for standard output")
        ->required()
        ->type_name("");
    AddText(verb, "--time", "TIME", "the moment to show in a picture; default: the middle",
            [this](const std::string& text) { m_options.time = ParseTime("--time", text); });
    AddTimes(verb);
    AddText(verb, "--overlap", "TIME",
            "play the first video, the effect for so long, then the rest of the second",
            [this](const std::string& text) { m_options.overlap = ParseTime("--overlap", text); });
    AddFrames(verb);
    AddOutput(verb);
    AddRunning(verb);
}

void CRenderArguments::AddPlay(CLI::App* verb) {
    AddStages(verb);
    AddText(verb, "--at", "TIME", "where in the clip to begin to look; default: its start",
            [this](const std::string& text) { m_options.from = ParseTime("--at", text); });
    AddText(verb, "--scale", "0.05..1",
            "of the picture's sides; default: 1, or less where the machine does not keep pace",
            [this](const std::string& text) {
                m_options.scale = ParseNumber("--scale", text, 0.05, 1);
            });
    AddTimes(verb);
    AddFrames(verb);
    AddRunning(verb);
    m_output = "-";
}

void CRenderArguments::AddStages(CLI::App* verb) {
    verb->add_option("EFFECT", m_effect,
                     "the effect; \"kyvhost list\" shows all; or a file of effects (.json)")
        ->required()
        ->type_name("");
    verb->add_option(
            "INPUT", m_input,
            "a picture, a video that ffmpeg reads, numbered pictures (shot-%04d.png), or - for "
            "standard input: y4m, NUT, or raw BGRA with --size and --rate")
        ->required()
        ->type_name("");
    AddText(verb, "--then", "EFFECT",
            "a further effect, or file of effects, on what comes out of the one before; the "
            "options of effects that follow (--set to --seed) are for it; repeatable",
            [this](const std::string& text) { m_stages.emplace_back().effect = text; })
        ->take_all()
        ->trigger_on_parse()
        ->allow_extra_args(false);
    AddStageText(verb, "--set", "NAME=VALUE", "a parameter's value; repeatable",
                 [](StageText& stage, const std::string& text) { stage.values.push_back(text); });
    AddStageText(
        verb, "--animate", "NAME=FROM:TO[:EASING]",
        "a parameter that changes over the clip; repeatable",
        [](StageText& stage, const std::string& text) { stage.animations.push_back(text); });
    AddStageText(
        verb, "--key", "NAME@TIME=VALUE[:EASING]",
        "a parameter's value at a moment of the clip, and how it goes on to the next; repeatable",
        [](StageText& stage, const std::string& text) { stage.keyframes.push_back(text); });
    AddStageText(verb, "--easing", "NAME",
                 "of animations: linear, in, out, in-out or hold; default: linear",
                 [](StageText& stage, const std::string& text) {
                     stage.easing = ParseEasing(std::string_view(text));
                 });
    AddStageText(
        verb, "--input2", "FILE",
        "the second input of a transition, or the inner picture; takes the first one's size",
        [](StageText& stage, const std::string& text) {
            stage.input2 = ParsePath("--input2", text);
        });
    AddStageText(verb, "--offset", "TIME", "where in its animation the effect begins; default: 0",
                 [](StageText& stage, const std::string& text) {
                     stage.offset = ParseTime("--offset", text);
                 });
    AddStageText(verb, "--seed", "N", "random seed that the host hands out",
                 [](StageText& stage, const std::string& text) {
                     stage.seed = ParseWhole<uint32_t>("--seed", text, 0, UINT32_MAX);
                 });
}

void CRenderArguments::AddTimes(CLI::App* verb) {
    AddText(verb, "--start", "TIME", "where in the videos to begin",
            [this](const std::string& text) { m_options.start = ParseTime("--start", text); });
    AddText(verb, "--duration", "TIME",
            "length of the clip; default: the shortest video's, or 10s for pictures",
            [this](const std::string& text) {
                m_options.duration = ParseTime("--duration", text);
                if (*m_options.duration == 0) {
                    throw CUsageError("--duration: " + text + " is out of range: it is above 0");
                }
            });
    AddText(verb, "--rate", "FPS", "frame rate; default: the video's, or 30 for pictures",
            [this](const std::string& text) { m_options.rate = ParseRate("--rate", text); });
}

void CRenderArguments::AddFrames(CLI::App* verb) {
    AddSettings(verb, m_options.settings);
    AddDisplay(verb, m_options.settings);
    AddLevel(verb, m_options.settings);
    AddText(verb, "--stereo", "sbs|split",
            "two views side by side: both of the input (sbs), or an input that holds two already "
            "(split)",
            [this](const std::string& text) {
                m_options.stereo = ParseWord("--stereo", text, {"sbs", "split"}) == 0
                                       ? Stereo::SideBySide
                                       : Stereo::Split;
            });
    AddText(verb, "--field", "auto|frame|first|second|both",
            "auto renders frames of two fields field by field; frame renders all as they are; the "
            "others only these rows; default: auto",
            [this](const std::string& text) {
                const size_t field =
                    ParseWord("--field", text, {"auto", "frame", "first", "second", "both"});
                m_options.fields = field == 0 ? FieldUse::AsVideo : FieldUse::Frames;
                m_options.settings.firstField = field == 2 || field == 4;
                m_options.settings.secondField = field >= 3;
            });
    AddText(verb, "--size", "WxH", "of raw BGRA frames that come over a pipe, with --rate",
            [this](const std::string& text) { m_options.size = ParseSize("--size", text); });
    AddText(verb, "--pick", "X,Y[,RADIUS]",
            "a grey spot of the input, whose mean becomes the reference colour of white-balance",
            [this](const std::string& text) { m_options.pick = ParsePick("--pick", text); });
}

void CRenderArguments::AddOutput(CLI::App* verb) {
    AddText(verb, "--codec", "NAME",
            "of a video: " + Join(CodecNames(), ", ") +
                "; default: what suits the file, with alpha where the input has it",
            [this](const std::string& text) { m_options.codec = FindCodec(text).name; });
    AddText(verb, "--output-format", "ENDING",
            "of standard output, or where the name does not tell: nut, y4m, raw, mkv, ...; "
            "default: nut",
            [this](const std::string& text) { m_options.outputFormat = text; });
    AddText(verb, "--encoder-options", "TEXT",
            "handed to ffmpeg behind our own, such as \"-crf 14 -preset slow\"; repeatable",
            [this](const std::string& text) {
                const std::vector<std::string> words = SplitWords("--encoder-options", text);
                m_options.encoderOptions.insert(m_options.encoderOptions.end(), words.begin(),
                                                words.end());
            })
        ->take_all()
        ->trigger_on_parse()
        ->allow_extra_args(false);
    verb->add_flag("--preview", m_options.proxy,
                   "a quick small clip to look at: at most 360 rows, coded in haste");
    AddText(verb, "--save", "FILE",
            "write the effects with their values and keyframes into a file as well (.json)",
            [this](const std::string& text) {
                m_options.save = ParsePath("--save", text);
                if (!IsEffectFileName(text)) {
                    throw CUsageError("--save: " + Quoted(text) + " has no ending .json");
                }
            });
    verb->add_flag("--overwrite,-y", m_options.overwrite, "replace a result that exists");
    verb->add_flag("--strict", m_options.strict, "what cannot be kept is an error");
}

void CRenderArguments::AddRunning(CLI::App* verb) {
    AddText(verb, "--jobs", "N",
            "frames that are rendered at a time, each with memory of its own; default: as many as "
            "the processor has cores",
            [this](const std::string& text) {
                m_options.jobs = ParseWhole<uint32_t>("--jobs", text, 1, 256);
            });
    AddText(verb, "--ffmpeg", "FILE", "the program ffmpeg; ffprobe lies beside it",
            [this](const std::string& text) {
                m_options.tools.ffmpeg = TextOf(ParsePath("--ffmpeg", text));
            });
    verb->add_flag("--quiet,-q", m_options.quiet, "no progress, no notes");
}

} // namespace kyvhost
