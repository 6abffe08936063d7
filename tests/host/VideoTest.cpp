// Videos through kyvhost and ffmpeg.
#include <bit>
#include <cstring>
#include <fstream>

#include <gmock/gmock.h>

#include "host/VideoReader.h"
#include "tests/host/HostRun.h"

namespace kyvtest {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

constexpr uint32_t kWidth = 66, kHeight = 38;
constexpr size_t kFrames = 9;

class VideoTest : public HostTest {
protected:
    // Nine frames of 30000/1001 a second without loss, and a tone of 0.3 s.
    std::string MakeClip(const std::string& name, size_t frames = kFrames,
                         const std::string& rate = "30000/1001") {
        const std::string size = std::to_string(kWidth) + "x" + std::to_string(kHeight);
        const HostResult made = RunProgram(
            "ffmpeg", {"-v", "error", "-f", "lavfi", "-i", "testsrc2=s=" + size + ":r=" + rate,
                       "-f", "lavfi", "-i", "sine=440:d=0.3", "-frames:v", std::to_string(frames),
                       "-c:v", "ffv1", "-pix_fmt", "bgra", "-c:a", "pcm_s16le", Path(name)});
        EXPECT_EQ(made.status, 0) << made.error;
        return Path(name);
    }

    static void Render(const std::vector<std::string>& arguments) {
        const HostResult result = RunHost(arguments);
        EXPECT_EQ(result.status, 0) << result.error;
    }

    // What ffmpeg itself reads: a checksum for every frame or for the whole sound.
    std::string Checksums(const std::string& name, const char* stream, const char* format) {
        return RunProgram("ffmpeg", {"-v", "error", "-i", Path(name), "-map", stream, "-pix_fmt",
                                     "bgra", "-f", format, "-"})
            .output;
    }

    std::string Probe(const std::string& name, const char* entries) {
        return RunProgram("ffprobe", {"-v", "error", "-count_frames", "-show_entries", entries,
                                      "-of", "csv=p=0", Path(name)})
            .output;
    }

    double SoundSeconds(const std::string& name) {
        const std::string samples = RunProgram("ffmpeg", {"-v", "error", "-i", Path(name), "-map",
                                                          "0:a", "-ac", "1", "-f", "s16be", "-"})
                                        .output;
        return static_cast<double>(samples.size()) / 2 / 44100;
    }

    // All frames, as words.
    std::vector<std::vector<uint32_t>> Frames(const std::string& name) {
        const kyvhost::VideoTools tools;
        const kyvhost::MediaInput input = kyvhost::OpenMedia(Path(name), {});
        const kyvhost::VideoInfo info = kyvhost::ProbeVideo(tools, input);
        kyvhost::CVideoReader reader(tools, input, info, {info.width, info.height, 0, {}});
        std::vector<std::vector<uint32_t>> frames;
        std::vector<uint32_t> frame(size_t{info.width} * info.height);
        double seconds = 0;
        while (reader.Read(reinterpret_cast<uint8_t*>(frame.data()), seconds)) {
            frames.push_back(frame);
        }
        return frames;
    }
};

TEST_F(VideoTest, NothingIsLostOnTheWay) {
    MakeClip("in.mkv");
    // At its default the colour temperature copies.
    Render({"render", "color-temperature", Path("in.mkv"), Path("out.mkv"), "--codec", "ffv1"});
    const std::string pictures = Checksums("in.mkv", "0:v", "framemd5");
    EXPECT_THAT(pictures, HasSubstr("66x38"));
    EXPECT_EQ(Checksums("out.mkv", "0:v", "framemd5"), pictures);
    const std::string sound = Checksums("in.mkv", "0:a", "md5");
    EXPECT_THAT(sound, HasSubstr("MD5="));
    EXPECT_EQ(Checksums("out.mkv", "0:a", "md5"), sound);
    EXPECT_THAT(Files(), ElementsAre("in.mkv", "out.mkv"));
}

TEST_F(VideoTest, H264KeepsFramesRateAndSound) {
    MakeClip("in.mkv");
    Render({"render", "color-temperature", Path("in.mkv"), Path("out.mp4"), "--format", "ayuv"});
    EXPECT_EQ(Probe("out.mp4", "stream=codec_name,width,height,r_frame_rate,channels"),
              "h264,66,38,30000/1001\naac,1,0/0\n");
    EXPECT_NEAR(SoundSeconds("out.mp4"), SoundSeconds("in.mkv"), 0.03);
    // The codec's loss is small: a frame is recognised.
    const auto source = Frames("in.mkv"), result = Frames("out.mp4");
    ASSERT_EQ(result.size(), kFrames);
    double sum = 0;
    for (size_t i = 0; i < source[8].size(); ++i) {
        sum += std::abs(double(source[8][i] >> 8 & 0xFF) - double(result[8][i] >> 8 & 0xFF));
    }
    EXPECT_LT(sum / double(source[8].size()), 8);
}

TEST_F(VideoTest, EveryFrameHasItsTimeAndItsValue) {
    MakeClip("in.mkv");
    Render({"render", "probe", Path("in.mkv"), Path("out.mkv"), "--codec", "ffv1", "--animate",
            "P2=0:1", "--module", ProbeModule()});
    const auto source = Frames("in.mkv"), result = Frames("out.mkv");
    ASSERT_EQ(result.size(), kFrames);
    for (size_t i = 0; i < kFrames; ++i) {
        // 1001 / 30000 s are 333666 2/3 units.
        EXPECT_EQ(result[i][6], i * 1001 * 1000 / 3);
        EXPECT_EQ(result[i][8], 3003000U);
        EXPECT_EQ(std::bit_cast<float>(result[i][15]), float(i) / 8);
        EXPECT_TRUE(
            std::equal(result[i].begin() + kWidth, result[i].end(), source[i].begin() + kWidth));
    }
}

TEST_F(VideoTest, APartOfAClipCarriesItsSound) {
    MakeClip("in.mkv");
    // From the fourth frame on, which is shown at 0.1001 s, for four frames.
    Render({"render", "probe", Path("in.mkv"), Path("out.mkv"), "--codec", "ffv1", "--start", "0.1",
            "--duration", "0.1334", "--module", ProbeModule()});
    const auto source = Frames("in.mkv"), result = Frames("out.mkv");
    ASSERT_EQ(result.size(), 4U);
    for (size_t i = 0; i < 4; ++i) {
        EXPECT_EQ(result[i][6], i * 1001 * 1000 / 3);
        EXPECT_TRUE(
            std::equal(result[i].begin() + kWidth, result[i].end(), source[i + 3].begin() + kWidth))
            << i;
    }
    EXPECT_NEAR(SoundSeconds("out.mkv"), 0.1334, 0.03);
}

TEST_F(VideoTest, TwoClipsLastAsLongAsTheShorterOne) {
    MakeClip("a.mkv");
    MakeClip("b.mkv", 4, "15");
    Render({"render", "probe-pair", Path("a.mkv"), Path("out.mkv"), "--input2", Path("b.mkv"),
            "--codec", "ffv1", "--module", ProbeModule()});
    const auto second = Frames("b.mkv"), result = Frames("out.mkv");
    // Four frames of 15 a second are eight of 30000/1001.
    ASSERT_EQ(result.size(), 8U);
    const size_t last = size_t{kWidth} * (kHeight - 1);
    EXPECT_TRUE(std::equal(result[6].begin() + last, result[6].end(), second[3].begin() + last));
}

TEST_F(VideoTest, AnOverlapJoinsTwoClips) {
    MakeClip("a.mkv");
    MakeClip("b.mkv");
    // Nine frames each, four of them in common: five of the first, four of both, five of the
    // second.
    Render({"render", "probe-pair", Path("a.mkv"), Path("out.mkv"), "--input2", Path("b.mkv"),
            "--codec", "ffv1", "--overlap", "0.1334", "--animate", "P2=0:1", "--module",
            ProbeModule()});
    const auto clip = Frames("a.mkv"), result = Frames("out.mkv");
    ASSERT_EQ(result.size(), 14U);
    const size_t last = size_t{kWidth} * (kHeight - 1);
    for (size_t i = 0; i < 14; ++i) {
        if (i < 5 || i >= 9) {
            EXPECT_EQ(result[i], clip[i < 5 ? i : i - 5]) << i;
            continue;
        }
        EXPECT_EQ(result[i][6], (i - 5) * 1001 * 1000 / 3);
        EXPECT_EQ(result[i][8], 1334666U); // 4 * 1001 / 30000 s
        EXPECT_EQ(std::bit_cast<float>(result[i][15]), float(double(i - 5) / 3));
        EXPECT_TRUE(std::equal(result[i].begin() + kWidth, result[i].begin() + last,
                               clip[i].begin() + kWidth));
        EXPECT_TRUE(
            std::equal(result[i].begin() + last, result[i].end(), clip[i - 5].begin() + last));
    }
    EXPECT_NEAR(SoundSeconds("out.mkv"), 14 * 1.001 / 30, 0.03);
    for (const char* overlap : {"0", "0.4"}) {
        EXPECT_EQ(RunHost({"render", "probe-pair", Path("a.mkv"), Path("out.mkv"), "--input2",
                           Path("b.mkv"), "--overlap", overlap, "--module", ProbeModule()})
                      .status,
                  2);
    }
}

TEST_F(VideoTest, PicturesBecomeAClipAndAClipGivesAPicture) {
    Write("in.png", kWidth, Ramp(kWidth, kHeight));
    Render({"render", "probe", Path("in.png"), Path("clip.mkv"), "--codec", "ffv1", "--duration",
            "0.48", "--rate", "25", "--module", ProbeModule()});
    EXPECT_EQ(Probe("clip.mkv", "stream=r_frame_rate,nb_read_frames"), "25/1,12\n");
    // Frame 5 is shown from 0.2 s on.
    Render({"render", "probe", Path("clip.mkv"), Path("out.png"), "--time", "0.2", "--set",
            "P2=0.75", "--module", ProbeModule()});
    const auto clip = Frames("clip.mkv");
    const std::vector<uint32_t> picture = Read("out.png");
    ASSERT_EQ(clip.size(), 12U);
    ASSERT_EQ(picture.size(), clip[5].size());
    EXPECT_EQ(clip[5][6], 2'000'000U);
    EXPECT_EQ(picture[6], 2'000'000U);
    EXPECT_EQ(std::bit_cast<float>(picture[15]), 0.75F);
    EXPECT_TRUE(std::equal(picture.begin() + kWidth, picture.end(), clip[5].begin() + kWidth));
}

TEST_F(VideoTest, ErrorsLeaveNothing) {
    const std::string in = MakeClip("in.mkv");
    std::ofstream(Path("text.mp4")) << "no video";
    std::ofstream(Path("cut.mkv"), std::ios::binary)
        << std::string(std::istreambuf_iterator<char>(std::ifstream(in, std::ios::binary).rdbuf()),
                       {})
               .substr(0, 200);
    const std::vector<std::string> files = Files();
    const std::string out = Path("out.mkv");
    struct Case {
        std::vector<std::string> arguments;
        int status;
        const char* text;
    };
    const Case cases[] = {
        {{"text.mp4", out}, 3, "text.mp4"},
        {{"cut.mkv", out}, 3, "cut.mkv"},
#ifndef KYV_EMULATED // which does not tell that a program could not be started
        {{"in.mkv", out, "--ffmpeg", "/none/ffmpeg"}, 2, "--ffmpeg: \"/none/ffmpeg\""},
#endif
        {{"in.mkv", out, "--overlap", "1"}, 2, "and probe takes one input"},
        {{"in.mkv", Path("out.mp4"), "--codec", "ffv1"}, 2, "FFV1 does not go into .mp4"},
        {{"in.mkv", Path("out.mov"), "--codec", "nosuch"}, 2, "\"nosuch\" is not one of h264"},
        {{"in.mkv", Path("out.mp4"), "--strict"}, 1, "--strict: the sound becomes AAC"},
        {{"in.mkv", out, "--duration", "9", "--strict"}, 1, "9 s is more than there is"},
        {{"in.mkv", out, "--size", "6x6"}, 2, "--size is for raw frames"},
        {{"in.mkv", out, "--encoder-options", "-crf '1"}, 2, "a quote has no end"},
        {{"in.mkv", Path("none/%03d.png")}, 1, "none does not exist"},
        {{"none%03d.png", out}, 3, "no file has a name of this form"},
        {{"in.mkv", out, "--start", "1m"}, 2, "\"1m\""},
        {{"in.mkv", out, "--start", "1"}, 2, "lasts 0.3"},
        {{"in.mkv", out, "--time", "0"}, 2, "--start"},
        {{"in.mkv", out, "--rate", "0"}, 2, "0 is out of range: 0.001 to 1000"},
        {{"in.mkv", Path("out.png"), "--rate", "5"}, 2, "--rate"},
        {{"in.mkv", out, "--set", "P1=no_process"}, 1, "ProcessFrame at frame 0"},
    };
    for (const Case& test : cases) {
        std::vector<std::string> arguments = {
            "render", "probe", "--quiet", "--module", ProbeModule(), Path(test.arguments.front())};
        arguments.insert(arguments.end(), test.arguments.begin() + 1, test.arguments.end());
        const HostResult result = RunHost(arguments);
        EXPECT_EQ(result.status, test.status) << result.error;
        EXPECT_THAT(result.error, HasSubstr(test.text));
        EXPECT_EQ(result.error.find('\n'), result.error.size() - 1) << result.error;
        EXPECT_EQ(Files(), files);
    }
}

TEST_F(VideoTest, AnInterruptionLeavesNothing) {
    Write("in.png", 640, Ramp(640, 360));
    // Interrupts when the temporary file is there; gives up after a minute.
    const char* const script =
        "\"$1\" render bubble \"$2/in.png\" \"$2/out.mkv\" --duration 9999 --quiet &"
        "pid=$!; for i in $(seq 600); do"
        "  if ls \"$2\" | grep -q part-; then kill -TERM $pid; break; fi;"
        "  sleep 0.1;"
        "done; wait $pid";
    const std::string folder = Path("").substr(0, Path("").size() - 1);
    const HostResult result = RunProgram("sh", {"-c", script, "sh", HostFile(), folder});
    EXPECT_EQ(result.status, 130) << result.error;
    EXPECT_EQ(result.error, "kyvhost: interrupted\n");
    EXPECT_THAT(Files(), ElementsAre("in.png"));
}

} // namespace
} // namespace kyvtest
