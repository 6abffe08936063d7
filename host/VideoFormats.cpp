// Containers and codecs.
#include "host/VideoFormats.h"

#include <algorithm>

#include "host/ExitStatus.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

// clang-format off
const std::vector<Codec>& Codecs() {
    static const std::vector<Codec> codecs = {
        {.name = "h264", .title = "H.264", .encoder = {"-c:v", "libx264", "-crf", "18"},
         .pixels = "yuv420p", .deepPixels = "yuv420p10le", .evenSides = true,
         .interlaced = {"-flags", "+ilme+ildct"}},
        {.name = "h265", .title = "H.265", .encoder = {"-c:v", "libx265", "-crf", "20",
         "-x265-params", "log-level=error"},
         .pixels = "yuv420p", .deepPixels = "yuv420p10le", .evenSides = true},
        {.name = "av1", .title = "AV1", .encoder = {"-c:v", "libsvtav1", "-crf", "26", "-preset", "8"},
         .pixels = "yuv420p", .deepPixels = "yuv420p10le", .evenSides = true},
        {.name = "vp9", .title = "VP9", .encoder = {"-c:v", "libvpx-vp9", "-crf", "24", "-b:v", "0",
         "-row-mt", "1", "-deadline", "good", "-cpu-used", "4", "-auto-alt-ref", "0"},
         .pixels = "yuv420p", .alphaPixels = "yuva420p", .deepPixels = "yuv420p10le"},
        {.name = "prores", .title = "ProRes", .encoder = {"-c:v", "prores_ks"},
         .pixels = "yuv422p10le", .alphaPixels = "yuva444p10le", .deepPixels = "yuv422p10le",
         .interlaced = {"-flags", "+ildct"}},
        {.name = "ffv1", .title = "FFV1", .encoder = {"-c:v", "ffv1", "-level", "3"},
         .pixels = "bgra", .alphaPixels = "bgra", .deepPixels = "bgra", .isYuv = false},
        {.name = "png", .title = "PNG", .encoder = {"-c:v", "png"},
         .pixels = "rgb24", .alphaPixels = "rgba", .deepPixels = "rgba", .isYuv = false},
        {.name = "gif", .title = "GIF", .encoder = {"-c:v", "gif"},
         .pixels = "pal8", .alphaPixels = "pal8", .isYuv = false},
        {.name = "apng", .title = "APNG", .encoder = {"-c:v", "apng", "-plays", "0"},
         .pixels = "rgb24", .alphaPixels = "rgba", .isYuv = false},
        {.name = "webp", .title = "WebP", .encoder = {"-c:v", "libwebp_anim", "-quality", "90", "-loop", "0"},
         .pixels = "yuv420p", .alphaPixels = "yuva420p"},
        {.name = "jpeg", .title = "JPEG", .encoder = {"-c:v", "mjpeg", "-q:v", "2"},
         .pixels = "yuvj444p", .isYuv = false},
        {.name = "tiff", .title = "TIFF", .encoder = {"-c:v", "tiff"},
         .pixels = "rgb24", .alphaPixels = "rgba", .isYuv = false},
        {.name = "bmp", .title = "BMP", .encoder = {"-c:v", "bmp"}, .pixels = "bgr24", .isYuv = false},
        {.name = "y4m", .title = "YUV4MPEG2", .encoder = {"-c:v", "wrapped_avframe"}, .pixels = "yuv444p"},
        {.name = "raw", .title = "raw BGRA", .encoder = {"-c:v", "rawvideo"},
         .pixels = "bgra", .alphaPixels = "bgra", .isYuv = false},
    };
    return codecs;
}

const std::vector<Container>& Containers() {
    static const std::vector<const char*> mp4Sounds = {"aac", "mp3", "ac3", "eac3", "alac", "opus", "flac"};
    static const std::vector<Container> containers = {
        {.endings = {"mp4", "m4v"}, .muxer = "mp4", .codecs = {"h264", "h265", "av1", "vp9"},
         .sounds = mp4Sounds, .soundCodec = "aac", .subtitles = {"mov_text"}, .textCodec = "mov_text",
         .covers = true, .chapters = true},
        {.endings = {"mov"}, .muxer = "mov", .codecs = {"h264", "h265", "prores", "png", "jpeg"},
         .alphaCodec = "prores",
         .sounds = {"aac", "mp3", "ac3", "eac3", "alac", "pcm_s16le", "pcm_s16be", "pcm_s24le",
                    "pcm_s24be", "pcm_s32le", "pcm_f32le", "pcm_u8"},
         .soundCodec = "aac", .subtitles = {"mov_text"}, .textCodec = "mov_text",
         .covers = true, .chapters = true},
        {.endings = {"mkv"}, .muxer = "matroska",
         .codecs = {"h264", "h265", "av1", "vp9", "prores", "ffv1", "png", "jpeg"}, .alphaCodec = "ffv1",
         .sounds = {"*"}, .soundCodec = "flac",
         .subtitles = {"subrip", "ass", "ssa", "webvtt", "hdmv_pgs_subtitle", "dvd_subtitle", "dvb_subtitle", "text"},
         .textCodec = "subrip", .attachments = true, .chapters = true},
        {.endings = {"webm"}, .muxer = "webm", .codecs = {"vp9", "av1"}, .alphaCodec = "vp9",
         .sounds = {"opus", "vorbis"}, .soundCodec = "libopus", .subtitles = {"webvtt"},
         .textCodec = "webvtt", .chapters = true},
        {.endings = {"nut"}, .muxer = "nut", .codecs = {"ffv1", "raw", "h264"}, .alphaCodec = "ffv1",
         .sounds = {"*"}, .soundCodec = "pcm_s16le"},
        {.endings = {"ts", "m2ts", "mts"}, .muxer = "mpegts", .codecs = {"h264", "h265"},
         .sounds = {"aac", "mp3", "mp2", "ac3", "eac3", "opus"}, .soundCodec = "aac", .titles = false},
        {.endings = {"avi"}, .muxer = "avi", .codecs = {"h264", "ffv1", "png", "jpeg"}, .alphaCodec = "ffv1",
         .sounds = {"mp3", "ac3", "aac", "pcm_s16le", "pcm_u8"}, .soundCodec = "libmp3lame", .times = Times::Constant},
        {.endings = {"gif"}, .muxer = "gif", .codecs = {"gif"}, .alphaCodec = "gif", .titles = false},
        {.endings = {"apng"}, .muxer = "apng", .codecs = {"apng"}, .alphaCodec = "apng", .titles = false},
        {.endings = {"webp"}, .muxer = "webp", .codecs = {"webp"}, .alphaCodec = "webp", .titles = false},
        {.endings = {"y4m"}, .muxer = "yuv4mpegpipe", .codecs = {"y4m"}, .titles = false, .times = Times::Constant},
        {.endings = {"raw"}, .muxer = "rawvideo", .codecs = {"raw"}, .alphaCodec = "raw", .titles = false, .times = Times::Constant},
        // Numbered files; a single picture of these formats goes another way.
        {.endings = {"png"}, .muxer = "image2", .codecs = {"png"}, .alphaCodec = "png", .titles = false},
        {.endings = {"jpg", "jpeg"}, .muxer = "image2", .codecs = {"jpeg"}, .titles = false},
        {.endings = {"tif", "tiff"}, .muxer = "image2", .codecs = {"tiff"}, .alphaCodec = "tiff", .titles = false},
        {.endings = {"bmp"}, .muxer = "image2", .codecs = {"bmp"}, .titles = false},
    };
    return containers;
}
// clang-format on

} // namespace

const Container* FindContainerByName(std::string_view name) {
    for (const Container& container : Containers()) {
        if (Holds(container.endings, name)) {
            return &container;
        }
    }
    return nullptr;
}

const Container* FindContainer(const std::filesystem::path& file) {
    const std::string extension = Lower(TextOf(file.extension()));
    return extension.empty() ? nullptr : FindContainerByName(extension.substr(1));
}

const Codec& FindCodec(std::string_view name) {
    for (const Codec& codec : Codecs()) {
        if (codec.name == name) {
            return codec;
        }
    }
    throw CUsageError("--codec: " + Quoted(name) + " is not one of " + Join(CodecNames(), ", "));
}

std::vector<std::string> CodecNames() {
    std::vector<std::string> names;
    for (const Codec& codec : Codecs()) {
        names.emplace_back(codec.name);
    }
    return names;
}

std::string VideoEndings() {
    std::vector<std::string> endings;
    for (const Container& container : Containers()) {
        if (std::string_view(container.muxer) != "image2") {
            endings.push_back("." + std::string(container.endings.front()));
        }
    }
    return Join(endings, ", ");
}

bool Holds(const std::vector<const char*>& list, std::string_view codec) {
    return std::any_of(list.begin(), list.end(),
                       [&](std::string_view item) { return item == "*" || item == codec; });
}

} // namespace kyvhost
