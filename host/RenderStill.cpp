// One moment as a picture.
#include <algorithm>

#include "host/AyuvFrame.h"
#include "host/ExitStatus.h"
#include "host/RenderJob.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

bool HasTransparency(const Picture& picture) {
    for (size_t i = 3; i < picture.pixels.size(); i += 4) {
        if (picture.pixels[i] != 255) {
            return true;
        }
    }
    return false;
}

// A picture in a format that only ffmpeg writes.
void WriteThroughFfmpeg(RenderJob& job, const Picture& picture, const std::filesystem::path& file) {
    VideoFormat format;
    format.container = OutputContainer(job.options);
    format.codec = &FindCodec(format.container->codecs.front());
    format.width = picture.width;
    format.height = picture.height;
    format.rate = {1, 1};
    format.alpha = HasTransparency(picture);
    format.options = job.options.encoderOptions;
    for (const std::string& loss : Losses(format)) {
        job.notes.Say(loss);
    }
    CVideoWriter writer(job.options.tools, file, format);
    writer.Write(picture.pixels.data(), 0);
    writer.Finish();
}

} // namespace

void RenderStill(RenderJob& job, const std::filesystem::path& file) {
    const RenderOptions& options = job.options;
    const Source& first = job.sources.front();
    double duration = options.duration.value_or(0);
    if (!options.duration) {
        duration = !first.isPicture && first.video.frameCount > 0 ? first.video.seconds
                                                                  : kStillClipSeconds;
    }
    const double time = options.time.value_or(duration / 2);
    if (time > duration) {
        throw CUsageError("--time: " + SecondsText(time) + " is out of range: the clip lasts " +
                          SecondsText(duration) +
                          (options.duration ? "" : "; --duration sets another length"));
    }
    std::vector<Frame> frames;
    std::vector<const uint8_t*> inputs;
    for (const Source& source : job.sources) {
        if (!source.isPicture && source.video.bits > 8) {
            job.notes.Say("effects work with 8 bits a component; the video has " +
                          std::to_string(source.video.bits));
        }
        Picture picture = job.PictureAt(source, time, job.inputSize);
        frames.push_back(std::move(picture.pixels));
        job.Form().Apply(frames.back(), picture.width);
    }
    inputs.reserve(frames.size());
    for (const Frame& frame : frames) {
        inputs.push_back(frame.data());
    }
    Moment moment;
    moment.position = UnitsOf(time);
    moment.frame = time;
    job.stack.SetClip(UnitsOf(duration), {duration, 1});
    job.stack.Begin(job.shape, FieldOrder::Progressive);
    const FrameShape& shape = job.shape;
    Picture result = {shape.frameWidth, shape.height, std::vector<uint8_t>(shape.Bytes())};
    job.stack.Render(inputs, moment, result.pixels.data());
    if (job.Form().ayuv) {
        AyuvToBgra(result.pixels.data(), shape.Pixels());
    }
    if (!IsPictureName(options.output)) {
        WriteThroughFfmpeg(job, result, file);
        return;
    }
    if (!KeepsAlpha(options.output) && HasTransparency(result)) {
        job.notes.Say("alpha is left out: " + TextOf(options.output.extension()) +
                      " has none; .png and .tif keep it");
    }
    WritePicture(result, file, options.output);
}

} // namespace kyvhost
