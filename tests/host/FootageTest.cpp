// Real footage through kyvhost: what a file holds besides its frames is kept or spoken of, and
// frames come and go through pipes.
#include <algorithm>
#include <cstring>
#include <fstream>
#include <sstream>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "tests/host/HostRun.h"

namespace kyvtest {
namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::Not;

class FootageTest : public HostTest {
protected:
    // Runs ffmpeg, whose arguments are words with spaces between; the last is a file's name.
    std::string Make(const std::string& words, const std::string& name) {
        std::vector<std::string> arguments = {"-v", "error", "-y"};
        std::istringstream stream(words);
        for (std::string word; stream >> word;) {
            arguments.push_back(word);
        }
        arguments.push_back(Path(name));
        const HostResult made = RunProgram("ffmpeg", arguments);
        EXPECT_EQ(made.status, 0) << made.error;
        return Path(name);
    }

    // Through an effect that changes nothing at its default. What was said.
    std::string Pass(const std::string& in, const std::string& out,
                     const std::vector<std::string>& options = {}) {
        std::vector<std::string> arguments = {"render", "color-temperature", Path(in), Path(out)};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const HostResult result = RunHost(arguments);
        EXPECT_EQ(result.status, 0) << result.error;
        return result.error;
    }

    json Probe(const std::string& name) {
        return json::parse(RunProgram("ffprobe", {"-v", "error", "-of", "json", "-show_streams",
                                                  "-show_format", "-show_chapters", Path(name)})
                               .output,
                           nullptr, false);
    }

    // When every frame is shown, a line each; what is told besides stands behind commas.
    std::string Times(const std::string& name) {
        std::istringstream told(
            RunProgram("ffprobe", {"-v", "error", "-select_streams", "v", "-show_entries",
                                   "frame=pts_time", "-of", "csv=p=0", Path(name)})
                .output);
        std::string times;
        for (std::string line; std::getline(told, line);) {
            if (!line.empty()) {
                times += line.substr(0, line.find(',')) + "\n";
            }
        }
        return times;
    }

    // The raw frames that another program reads.
    std::string Frames(const std::string& name, const std::vector<std::string>& options = {}) {
        std::vector<std::string> arguments = {"-v", "error"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        arguments.insert(arguments.end(),
                         {"-i", Path(name), "-map", "0:v:0", "-fps_mode", "passthrough", "-f",
                          "rawvideo", "-pix_fmt", "bgra", "-"});
        return RunProgram("ffmpeg", arguments).output;
    }
};

const char* const kVarying = "-f lavfi -i testsrc=s=64x36:r=30:d=2,select=not(mod(n\\,7))"
                             "+not(mod(n\\,3)) -fps_mode vfr -c:v ";

TEST_F(FootageTest, EveryFrameKeepsItsTime) {
    Make(std::string(kVarying) + "libx264 -enc_time_base 1/90000", "vfr.mp4");
    Make(std::string(kVarying) + "ffv1", "vfr.mkv");
    // The picture begins half a second after the sound.
    Make("-f lavfi -i sine=d=2 -itsoffset 0.5 -f lavfi -i testsrc=s=64x36:r=30:d=1 -fps_mode "
         "passthrough -map 0 -map 1 -c:v libx264 -c:a aac",
         "late.mp4");
    for (const char* name : {"vfr.mp4", "vfr.mkv", "late.mp4"}) {
        const std::string out = std::string("out-") + name;
        EXPECT_THAT(Pass(name, out), Not(HasSubstr("note")));
        EXPECT_EQ(Times(out), Times(name)) << name;
        EXPECT_GE(Times(name).size(), 100U);
    }
    // The effect is told the same times: the 5th frame is the 13th of 30 a second, at 0.4 s.
    const HostResult probed =
        RunHostWith(ProbeModule(), {"render", "probe", Path("vfr.mkv"), Path("p.mkv"), "--codec",
                                    "ffv1", "--offset", "2s"});
    EXPECT_EQ(probed.status, 0) << probed.error;
    const std::string frames = Frames("p.mkv");
    ASSERT_GE(frames.size(), size_t{64 * 36 * 4 * 6});
    uint32_t position = 0;
    std::memcpy(&position, &frames[size_t{64 * 36 * 4 * 5} + 6 * 4], 4);
    EXPECT_EQ(position, 24'000'000U);
}

TEST_F(FootageTest, FramesWithoutTimesAreAnError) {
    Make("-f lavfi -i testsrc=s=64x36:r=25:d=0.2 -c:v ffv1", "in.mkv");
    std::ofstream(Path("ffmpeg")) << "#!/bin/sh\nhead -c 9216 /dev/zero\n"; // one frame, no line
    std::ofstream(Path("ffprobe")) << "#!/bin/sh\nexec ffprobe \"$@\"\n";
    for (const char* name : {"ffmpeg", "ffprobe"}) {
        std::filesystem::permissions(Path(name), std::filesystem::perms::owner_all);
    }
    const HostResult result = RunHost({"render", "color-temperature", Path("in.mkv"),
                                       Path("out.png"), "--ffmpeg", Path("ffmpeg")});
    EXPECT_EQ(result.status, 3);
    EXPECT_THAT(result.error, HasSubstr("has not told the time of frame 0"));
}

TEST_F(FootageTest, AlphaStaysWhereTheFileCanHoldIt) {
    const std::string picture = "-f lavfi -i testsrc=s=64x36:r=25:d=0.2,format=rgba,"
                                "colorchannelmixer=aa=0.5 -c:v ";
    Make(picture + "prores_ks -pix_fmt yuva444p10le", "in.mov");
    Make(picture + "libvpx-vp9 -pix_fmt yuva420p -auto-alt-ref 0", "in.webm");
    const auto alpha = [this](const std::string& name, const std::vector<std::string>& options) {
        const std::string frames = Frames(name, options);
        return frames.size() < 400 ? -1 : static_cast<uint8_t>(frames[64 * 4 * 3 + 3]);
    };
    for (const char* out : {"out.mov", "out.mkv", "out.apng"}) {
        EXPECT_THAT(Pass("in.mov", out), Not(HasSubstr("alpha"))) << out;
        EXPECT_NEAR(alpha(out, {}), 128, 2) << out;
    }
    Pass("in.webm", "out.webm");
    EXPECT_NEAR(alpha("out.webm", {"-c:v", "libvpx-vp9"}), 128, 3);
    EXPECT_THAT(Pass("in.mov", "out.mp4"), HasSubstr("alpha is left out: H.264 has none"));
}

TEST_F(FootageTest, ColoursKeepTheirLabels) {
    Make("-f lavfi -i testsrc=s=64x36:r=25:d=0.2,format=yuv420p10le -c:v libx265 -x265-params "
         "log-level=error -color_primaries bt2020 -color_trc smpte2084 -colorspace bt2020nc",
         "hdr.mkv");
    for (const char* codec : {"h264", "h265", "vp9", "prores", "ffv1"}) {
        const std::string said = Pass("hdr.mkv", "out.mkv", {"--codec", codec, "-y"});
        EXPECT_THAT(said, HasSubstr("8 bits a component; the video has 10"));
        const json stream = Probe("out.mkv")["streams"][0];
        EXPECT_EQ(stream.value("color_transfer", ""), "smpte2084") << codec;
        EXPECT_EQ(stream.value("color_primaries", ""), "bt2020") << codec;
    }
}

TEST_F(FootageTest, FieldsAreRenderedEachOnItsOwn) {
    // Rows of the first field are white, those of the second black. One picture of both would be
    // grey to whoever looks around.
    Make("-f lavfi -i color=black:s=64x36:r=25:d=0.2,format=gray,geq=lum='255*(1-mod(Y\\,2))',"
         "format=bgra -vf setfield=tff -c:v ffv1",
         "tff.mkv");
    Pass("tff.mkv", "plain.mkv", {"--codec", "ffv1"});
    EXPECT_EQ(Frames("plain.mkv"), Frames("tff.mkv"));
    EXPECT_EQ(Probe("plain.mkv")["streams"][0].value("field_order", ""), "tb");

    // The stream says "tt" here, which is a guess; its frames know better.
    Make("-f lavfi -i testsrc=s=64x36:r=25:d=0.2 -vf setfield=bff -c:v libx264 -flags +ilme+ildct",
         "bff.ts");
    Pass("bff.ts", "bff.mkv", {"--codec", "ffv1"});
    EXPECT_EQ(Probe("bff.mkv")["streams"][0].value("field_order", ""), "bt");

    const HostResult blurred = RunHost({"render", "dreamy", Path("tff.mkv"), Path("blurred.mkv"),
                                        "--codec", "ffv1", "--set", "P1=10"});
    EXPECT_EQ(blurred.status, 0) << blurred.error;
    const std::string frames = Frames("blurred.mkv");
    ASSERT_GE(frames.size(), size_t{64 * 36 * 4});
    for (size_t y = 0; y < 36; ++y) {
        const int level = static_cast<uint8_t>(frames[(y * 64 + 32) * 4 + 1]);
        EXPECT_TRUE(y % 2 == 0 ? level > 230 : level < 25) << y << ": " << level;
    }
}

TEST_F(FootageTest, WhatGoesWithThePicturesIsKeptOrSaid) {
    std::ofstream(Path("s.srt")) << "1\n00:00:00,100 --> 00:00:00,900\nHello\n";
    std::ofstream(Path("m.txt"))
        << ";FFMETADATA1\ntitle=Film\n[CHAPTER]\nTIMEBASE=1/1000\nSTART=0\n"
           "END=500\ntitle=One\n[CHAPTER]\nTIMEBASE=1/1000\nSTART=500\n"
           "END=1000\ntitle=Two\n";
    Make("-f lavfi -i testsrc=s=64x36:r=25:d=1 -f lavfi -i sine=d=1 -i " + Path("s.srt") + " -i " +
             Path("m.txt") +
             " -map 0 -map 1 -map 1 -map 2 -map_metadata 3 -map_chapters 3 -c:v "
             "libx264 -c:a pcm_s16le -c:s subrip -metadata:s:a:1 language=deu",
         "in.mkv");
    const auto kinds = [this](const std::string& name) {
        const json probe = Probe(name);
        std::string text;
        for (const json& stream : probe["streams"]) {
            text += stream.value("codec_name", "data") + " ";
        }
        return text;
    };
    EXPECT_THAT(Pass("in.mkv", "out.mkv"), Not(HasSubstr("note")));
    EXPECT_EQ(kinds("out.mkv"), "h264 pcm_s16le pcm_s16le subrip ");
    EXPECT_EQ(Probe("out.mkv")["chapters"].size(), 2U);
    EXPECT_EQ(Probe("out.mkv")["format"]["tags"]["title"], "Film");
    EXPECT_EQ(Probe("out.mkv")["streams"][2]["tags"]["language"], "deu");

    EXPECT_THAT(Pass("in.mkv", "out.mp4"), HasSubstr("the sound becomes AAC; .mp4"));
    EXPECT_THAT(kinds("out.mp4"), HasSubstr("h264 aac aac mov_text"));
    EXPECT_EQ(Probe("out.mp4")["chapters"].size(), 2U);

    const std::string said = Pass("in.mkv", "out.gif");
    EXPECT_THAT(said, HasSubstr("a sound (pcm_s16le), is left out: it does not go into .gif"));
    EXPECT_THAT(said, HasSubstr("a subtitle track (subrip), is left out"));
    EXPECT_THAT(said, HasSubstr("the chapters are left out"));
    EXPECT_THAT(said, HasSubstr("the title is left out: .gif has none"));
}

TEST_F(FootageTest, OddSizesStayWhereTheCodecCan) {
    Make("-f lavfi -i testsrc=s=65x37:r=25:d=0.2 -c:v ffv1 -pix_fmt bgra", "in.mkv");
    for (const char* name : {"out.webm", "out.mkv", "out.mov"}) {
        const std::string said = Pass("in.mkv", name,
                                      {"--codec", name[4] == 'w'   ? "vp9"
                                                  : name[5] == 'k' ? "ffv1"
                                                                   : "prores"});
        EXPECT_THAT(said, Not(HasSubstr("note"))) << name;
        EXPECT_EQ(Probe(name)["streams"][0]["width"], 65) << name;
        EXPECT_EQ(Probe(name)["streams"][0]["height"], 37) << name;
    }
    EXPECT_THAT(Pass("in.mkv", "out.mp4"), HasSubstr("65 x 37 and becomes 66 x 38"));
}

TEST_F(FootageTest, FramesGoThroughPipes) {
    Make("-f lavfi -i testsrc=s=64x36:r=25:d=0.4,format=bgra -c:v ffv1", "a.mkv");
    Make("-f lavfi -i testsrc2=s=64x36:r=25:d=0.4,format=bgra -c:v ffv1", "b.mkv");
    const std::string wanted = Frames("a.mkv");
    const auto shell = [this](const std::string& script) {
        return RunProgram("bash",
                          {"-c", "set -o pipefail; cd \"$1\"; " + script, HostFile(), Path("")});
    };
    const std::string read = "ffmpeg -v error -i a.mkv ";
    const std::string host = "\"$0\" render color-temperature --quiet ";
    for (const std::string& script : {read + "-c:v rawvideo -f nut - | " + host +
                                          "- - | ffmpeg -v error -i - -f rawvideo "
                                          "-pix_fmt bgra -",
                                      read + "-f rawvideo -pix_fmt bgra - | " + host +
                                          "- - --size 64x36 --rate 25 --output-format raw",
                                      host + "a.mkv - --output-format raw",
                                      host + "<(" + read +
                                          "-c copy -f nut -) c.mkv "
                                          "--codec ffv1 && ffmpeg -v error -i c.mkv -f "
                                          "rawvideo -pix_fmt bgra -"}) {
        const HostResult result = shell(script);
        EXPECT_EQ(result.status, 0) << result.error;
        EXPECT_EQ(result.output.size(), wanted.size()) << script;
        EXPECT_TRUE(result.output == wanted) << script;
    }
    // Two inputs, one of them in another form; the form that others read best; a picture.
    const HostResult two =
        shell(read + "-f yuv4mpegpipe -pix_fmt yuv444p - | \"$0\" render alpha-transition --quiet "
                     "- - --input2 b.mkv --output-format y4m | ffmpeg -v error -i - -f framecrc -");
    EXPECT_EQ(two.status, 0) << two.error;
    EXPECT_EQ(std::count(two.output.begin(), two.output.end(), '\n'), 10 + 6) << two.output;
    Write("in.png", 8, Ramp(8, 4));
    EXPECT_EQ(shell(host + "- out.png <in.png").status, 0);
    EXPECT_EQ(Read("out.png"), Ramp(8, 4));
    EXPECT_EQ(shell(host + "- out.mkv </dev/null").status, 3);
}

TEST_F(FootageTest, SequencesAndFormatsOfPictures) {
    Make("-f lavfi -i testsrc=s=64x36:r=25:d=0.2 -start_number 7", "in-%03d.png");
    Pass("in-%03d.png", "clip.mkv", {"--codec", "ffv1", "--rate", "25"});
    EXPECT_EQ(Frames("clip.mkv"), Frames("in-%03d.png", {"-start_number", "7"}));
    Pass("clip.mkv", "out%d.tif");
    EXPECT_EQ(Frames("out%d.tif"), Frames("clip.mkv"));
    EXPECT_EQ(RunHost({"render", "11", Path("clip.mkv"), Path("out%d.tif")}).status, 2);
    std::filesystem::remove(Path("in-009.png"));
    EXPECT_THAT(Pass("in-%03d.png", "gap.mkv"), HasSubstr("ends at number 8; the 2 files"));

    for (const char* name : {"out.gif", "out.apng", "out.webp"}) {
        Pass("clip.mkv", name);
        Pass("in-007.png", std::string("one-") + name); // a picture makes one picture
        EXPECT_EQ(Frames(std::string("one-") + name).size(), size_t{64 * 36 * 4}) << name;
    }
    EXPECT_EQ(Frames("out.gif").size(), size_t{64 * 36 * 4 * 5});
    EXPECT_EQ(Frames("out.apng"), Frames("clip.mkv"));
    Pass("one-out.webp", "webp.png"); // which the module's own codecs do not read
    EXPECT_EQ(Read("webp.png").size(), 64U * 36);
}

TEST_F(FootageTest, PlayingGoesOnFromAnyMoment) {
    Make("-f lavfi -i testsrc=s=64x36:r=25:d=2 -f lavfi -i sine=d=2 -c:v ffv1 -c:a pcm_s16le",
         "in.mkv");
    // A player that keeps what it is shown; one that a user closes at once; the real one.
    for (const char* name : {"ffmpeg", "ffprobe", "ffplay"}) {
        std::ofstream(Path(name)) << "#!/bin/sh\n"
                                  << (std::string(name) == "ffplay"
                                          ? "case $KYV_PLAYER in keep) exec cat >\"$0.nut\" ;; "
                                            "close) exit 0 ;; fail) echo no window >&2; exit 1 "
                                            ";; *) exec ffplay \"$@\" ;; esac\n"
                                          : std::string("exec ") + name + " \"$@\"\n");
        std::filesystem::permissions(Path(name), std::filesystem::perms::owner_all);
    }
    const auto play = [this](const std::string& player, const std::string& scale = "1") {
        return RunProgram("env", {"SDL_VIDEODRIVER=dummy", "SDL_AUDIODRIVER=dummy",
                                  "KYV_PLAYER=" + player, HostFile(), "play", "bubble",
                                  Path("in.mkv"), "--at", "1.2s", "--animate", "P3=0.2:1",
                                  "--offset", "3s", "--scale", scale, "--ffmpeg", Path("ffmpeg")});
    };
    const HostResult kept = play("keep");
    EXPECT_EQ(kept.status, 0) << kept.error;
    RunHost({"render", "bubble", Path("in.mkv"), Path("whole.mkv"), "--codec", "ffv1", "--animate",
             "P3=0.2:1", "--offset", "3s"});
    const std::string whole = Frames("whole.mkv"), shown = Frames("ffplay.nut");
    ASSERT_EQ(whole.size(), size_t{64 * 36 * 4 * 50});
    EXPECT_EQ(shown.size(), size_t{64 * 36 * 4 * 20}); // of 50 frames those from the 30th on
    EXPECT_TRUE(whole.ends_with(shown));
    EXPECT_THAT(Times("ffplay.nut"), testing::StartsWith("0.000000\n0.04"));
    const json probe = Probe("ffplay.nut");
    ASSERT_EQ(probe["streams"].size(), 2U);
    const std::string sound =
        RunProgram("ffmpeg", {"-v", "error", "-i", Path("ffplay.nut"), "-f", "s16le", "-"}).output;
    EXPECT_NEAR(static_cast<double>(sound.size()) / 2 / 44100, 0.8, 0.05);

    EXPECT_EQ(play("keep", "0.5").status, 0); // 32 x 16, multiples of four
    EXPECT_EQ(Frames("ffplay.nut").size(), size_t{32 * 16 * 4 * 20});
    EXPECT_EQ(play("close").status, 0); // is no failure
    const HostResult failed = play("fail");
    EXPECT_EQ(failed.status, 1);
    EXPECT_THAT(failed.error, HasSubstr("ffplay stopped: no window"));
    const HostResult real = play("");
    EXPECT_EQ(real.status, 0) << real.error;
}

TEST_F(FootageTest, PreviewsAreSmallAndKeepTheirTimes) {
    Make(std::string("-f lavfi -i testsrc=s=1280x722:r=25:d=0.2 -c:v ffv1"), "in.mkv");
    Pass("in.mkv", "out.mp4", {"--preview"});
    const json stream = Probe("out.mp4")["streams"][0];
    EXPECT_EQ(stream["height"], 360);
    EXPECT_EQ(stream["width"], 636); // 1280 * 360 / 722, a multiple of four
    EXPECT_EQ(Times("out.mp4"), Times("in.mkv"));
}

TEST_F(FootageTest, JobsChangeNoByte) {
    Make("-f lavfi -i testsrc2=s=96x54:r=25:d=1 -c:v ffv1", "a.mkv");
    Make("-f lavfi -i testsrc=s=96x54:r=25:d=1 -c:v ffv1", "b.mkv");
    const json list = json::parse(RunHost({"list", "--json"}).output, nullptr, false);
    ASSERT_FALSE(list["effects"].empty());
    for (const json& effect : list["effects"]) {
        const std::string name = effect["shortName"];
        std::string first;
        for (const char* jobs : {"1", "3"}) {
            std::vector<std::string> arguments = {
                "render", name,       Path("a.mkv"), Path("out.raw"), "-y", "--jobs",
                jobs,     "--offset", "4s",          "--quiet"};
            if (effect["inputs"] == 2) {
                arguments.insert(arguments.end(), {"--input2", Path("b.mkv")});
            }
            if (name.ends_with("bubble")) { // a parameter that changes starts the animation anew
                arguments.insert(arguments.end(), {"--animate", "P3=0.2:1"});
            }
            const HostResult result = RunHost(arguments);
            EXPECT_EQ(result.status, 0) << result.error;
            std::ifstream stream(Path("out.raw"), std::ios::binary);
            const std::string bytes(std::istreambuf_iterator<char>(stream), {});
            EXPECT_EQ(bytes.size(), size_t{96 * 54 * 4 * 25}) << name;
            first = first.empty() ? bytes : first;
            EXPECT_TRUE(bytes == first) << name << " with " << jobs << " jobs";
        }
    }
}

} // namespace
} // namespace kyvtest
