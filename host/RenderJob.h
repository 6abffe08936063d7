// A rendering with its inputs opened: what stills and clips have in common.
#pragma once

#include <filesystem>
#include <vector>

#include "host/Clip.h"
#include "host/Notes.h"
#include "host/Picture.h"
#include "host/Render.h"
#include "host/Stack.h"

namespace kyvhost {

// An input, opened as far as to know what it is.
struct Source {
    std::filesystem::path file;
    bool isPicture = false;
    Picture picture;
    MediaInput media;
    VideoInfo video;

    uint32_t Width() const { return isPicture ? picture.width : video.width; }
    uint32_t Height() const { return isPicture ? picture.height : video.height; }
};

struct RenderJob {
    RenderJob(const ModuleDescriptor& descriptor, const RenderOptions& wanted);

    // The file without the effects, at a time of its own.
    Picture PictureAt(const Source& source, double seconds, const Size& size) const;

    bool AllPictures() const;
    const Source* FirstVideo() const; // null when there is none

    FrameForm Form() const;

    // As given, and with what has been picked.
    std::vector<StageOptions> Stages() const;

    // A further stack like the first, for frames beside it.
    std::unique_ptr<CStack> NewStack() const;

    const ModuleDescriptor& module;
    const RenderOptions& options;
    CNotes notes;
    CStack stack;
    std::vector<Source> sources; // one for each of the stack's inputs
    Size inputSize = {};         // of all inputs' frames: the first one's, scaled
    FrameShape shape;
    std::optional<Assignment> picked; // a colour, from a spot of the input

private:
    Source Open(const std::filesystem::path& file) const;
    void OpenSources();
    void SetShape();
    void SayWhatIsCut();
    void SetAspect(CStack& to) const;
};

// Of a clip of pictures, when nothing says more.
constexpr double kStillClipSeconds = 10;
constexpr Rational kStillClipRate = {30, 1};

// The output's form: that of --output-format, or of the name's ending. Null for a still picture.
const Container* OutputContainer(const RenderOptions& options);

void RenderStill(RenderJob& job, const std::filesystem::path& file);
void RenderClip(RenderJob& job, const std::filesystem::path& file);
void PlayClip(RenderJob& job);

// Frames a second that the clip is rendered with, as far as a moment of it tells.
double RenderingRate(RenderJob& job);

// Seconds with what a person would write.
std::string SecondsText(double seconds);

} // namespace kyvhost
