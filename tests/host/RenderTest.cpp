// Pictures through kyvhost, from file to file.
#include <array>
#include <bit>
#include <cstring>
#include <fstream>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "tests/host/HostRun.h"
#include "tests/support/TestHost.h"

namespace kyvtest {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

// The words of the probe's first row.
enum Word : uint32_t {
    Word_Format,
    Word_Layout,
    Word_Width,
    Word_Height,
    Word_AspectX,
    Word_AspectY,
    Word_Position,
    Word_Duration = 8,
    Word_Preview = 10,
    Word_Fraction,
    Word_Threads,
    Word_Level,
    Word_Seed,
    Word_Amount,
    Word_Byte,
    Word_Color
};

int64_t Wide(const std::vector<uint32_t>& words, Word low) {
    return static_cast<int64_t>(words[low] | uint64_t{words[low + 1]} << 32);
}

class RenderTest : public HostTest {
protected:
    // Renders with the probe and gives the words that it wrote.
    std::vector<uint32_t> Probe(const std::vector<std::string>& options) {
        Write("in.png", 20, Ramp(20, 3));
        std::vector<std::string> arguments = {"render", "probe", "--overwrite", Path("in.png"),
                                              Path("out.png")};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const HostResult result = RunHostWith(ProbeModule(), arguments);
        EXPECT_EQ(result.status, 0) << result.error;
        std::vector<uint32_t> pixels = Read("out.png");
        pixels.resize(20 * 3 * 2);
        return pixels;
    }
};

TEST_F(RenderTest, PixelsOfTheWhiteBalance) {
    // An orange reference, red 255, green 128, blue 0, has luma 152 and turns grey. Grey 100 on
    // the reference's curves: red 100 * 152 / 255 = 59, green 100 * 152 / 128 = 118, blue
    // (255 * 152 + 100 * 103) / 255 = 192. Alpha stays.
    Write("in.png", 2, {0x11FF8000, 0xFF646464});
    for (const char* level : {"0", "3", "5"}) {
        for (const char* name : {"P1=#FF8000", "reference point=#ff8000"}) {
            const HostResult result = RunHost({"render", "white-balance", "-y", Path("in.png"),
                                               Path("out.png"), "--set", name, "--level", level});
            EXPECT_EQ(result.status, 0) << result.error;
            EXPECT_THAT(Read("out.png"), ElementsAre(0x11989898, 0xFF3B76C0));
        }
    }
    EXPECT_THAT(Files(), ElementsAre("in.png", "out.png"));
}

TEST_F(RenderTest, WhiteIsPickedFromThePicture) {
    // Two colours about (10, 10): within a radius of 1 five pixels, of which the middle row's three
    // are 0xFF8040 and the others 0xA08040. Mean red (3 * 255 + 2 * 160) / 5 = 217.
    std::vector<uint32_t> pixels(20 * 20, 0xFFA08040);
    std::fill_n(pixels.begin() + 10 * 20, 20, 0xFFFF8040);
    Write("in.png", 20, pixels);
    const HostResult picked =
        RunHost({"render", "11", Path("in.png"), Path("a.png"), "--pick", "10,10,1"});
    EXPECT_EQ(picked.status, 0);
    EXPECT_EQ(picked.error, "kyvhost: note: picked #D98040\n");
    EXPECT_EQ(
        RunHost({"render", "11", Path("in.png"), Path("b.png"), "--set", "P1=#D98040"}).status, 0);
    EXPECT_EQ(Read("a.png"), Read("b.png"));
    EXPECT_NE(Read("a.png"), pixels);
}

TEST_F(RenderTest, EffectsAreFoundByEveryName) {
    Write("in.png", 1, {0xFF646464});
    for (const char* name :
         {"11", "Kyv_Dsp_Co_WhiteBalance", "White Balance", "whitebalance", "white"}) {
        const HostResult result =
            RunHost({"render", name, "-y", Path("in.png"), Path("out.png"), "--set", "P1=#FF8000"});
        EXPECT_EQ(result.status, 0) << result.error;
        EXPECT_THAT(Read("out.png"), ElementsAre(0xFF3B76C0)) << name;
    }
}

TEST_F(RenderTest, TheContextHoldsWhatTheOptionsSay) {
    const std::vector<uint32_t> plain = Probe({});
    EXPECT_EQ(plain[Word_Format], 0U);
    EXPECT_EQ(plain[Word_Layout], 0U);
    EXPECT_EQ(plain[Word_Width], 20U);
    EXPECT_EQ(plain[Word_Height], 3U);
    EXPECT_EQ(plain[Word_AspectX], 0U);
    EXPECT_EQ(Wide(plain, Word_Position), 50'000'000); // the middle of ten seconds
    EXPECT_EQ(Wide(plain, Word_Duration), 100'000'000);
    EXPECT_EQ(plain[Word_Preview], 0U);
    EXPECT_EQ(plain[Word_Threads], 1U);
    EXPECT_EQ(plain[Word_Level], 5U + CpuLevelOption_WideMap);
    EXPECT_EQ(plain[Word_Byte], 13U);
    EXPECT_EQ(plain[Word_Color], 0x563412U);

    const std::vector<uint32_t> set =
        Probe({"--time",  "1:30.5",   "--duration",    "3600s",      "--effect-preview",
               "0.5",     "--aspect", "16:9",          "--threads",  "7",
               "--level", "3",        "--seed",        "4000000000", "--set",
               "P3=20",   "--set",    "color=#010203", "--set",      "amount=0.125"});
    EXPECT_EQ(Wide(set, Word_Position), 905'000'000);
    EXPECT_EQ(Wide(set, Word_Duration), 36'000'000'000);
    EXPECT_EQ(set[Word_Preview], 1U);
    EXPECT_EQ(std::bit_cast<float>(set[Word_Fraction]), 0.5F);
    EXPECT_EQ(set[Word_AspectX], 16U);
    EXPECT_EQ(set[Word_AspectY], 9U);
    EXPECT_EQ(set[Word_Threads], 7U);
    EXPECT_EQ(set[Word_Level], 3U + CpuLevelOption_WideMap);
    EXPECT_EQ(Probe({"--narrow-map", "--level", "4"})[Word_Level], 4U);
    EXPECT_EQ(set[Word_Seed], 4'000'000'000U);
    EXPECT_EQ(set[Word_Byte], 20U);
    EXPECT_EQ(set[Word_Color], 0x030201U);
    EXPECT_EQ(std::bit_cast<float>(set[Word_Amount]), 0.125F);
}

TEST_F(RenderTest, AnimationsGoAlongTheirCurve) {
    // A quarter of the way: 0.25, and cubed 0.015625.
    const auto amount = [this](const std::string& animation, const std::string& easing) {
        const std::vector<uint32_t> words =
            Probe({"--time", "1s", "--duration", "4s", "--animate", animation, "--easing", easing});
        return std::bit_cast<float>(words[Word_Amount]);
    };
    EXPECT_EQ(amount("P2=0:1", "linear"), 0.25F);
    EXPECT_EQ(amount("P2=0:1", "in"), 0.015625F);
    EXPECT_EQ(amount("P2=1:0", "in"), 0.984375F);
    EXPECT_EQ(amount("P2=0:1:in-out", "in"), 0.0625F);
    EXPECT_EQ(amount("P2=0:1:out", "in"), 1 - 0.421875F);
}

TEST_F(RenderTest, KeyframesOfEveryKindOfValue) {
    const auto words = [this](const std::string& time) {
        return Probe({"--time", time, "--duration", "8s", "--key", "P2@4s=1:hold", "--key",
                      "P2@25%=0.5:in", "--key", "P2@6s=0.25", "--key", "P3@0s=10", "--key",
                      "P3@8=20", "--key", "P4@0s=#000000", "--key", "P4@100%=#FF8000"});
    };
    const auto amount = [&](const std::string& time) {
        return std::bit_cast<float>(words(time)[Word_Amount]);
    };
    EXPECT_EQ(amount("1s"), 0.5F);    // before the first, which is at 2 s
    EXPECT_EQ(amount("3s"), 0.5625F); // half the way to 1 by an eighth
    EXPECT_EQ(amount("5.9s"), 1);
    EXPECT_EQ(amount("6s"), 0.25F);
    EXPECT_EQ(amount("8s"), 0.25F); // behind the last
    EXPECT_EQ(words("4s")[Word_Byte], 15U);
    EXPECT_EQ(words("4s")[Word_Color], 0x004080U); // 255 / 2 and 128 / 2, red in the lowest byte
    // A choice has nothing in between. Mode 1 of the probe fails to begin, 2 to process.
    const auto mode = [this](const std::string& time) {
        return RunHostWith(ProbeModule(),
                           {"render", "probe", "-y", Path("in.png"), Path("out.png"), "--time",
                            time, "--key", "P1@0s=fine", "--key", "P1@6s=no_process"})
            .status;
    };
    EXPECT_EQ(mode("5.9s"), 0);
    EXPECT_EQ(mode("6s"), 1);
}

TEST_F(RenderTest, WithoutTheWideMapItIsSaidWhatIsCut) {
    for (const uint32_t columns : {1024U, 1030U}) {
        const std::string in = Write("in.png", columns, std::vector<uint32_t>(columns, 0xFF808080));
        const std::vector<std::string> pip = {"render", "4",        in, Path("out.png"),
                                              "-y",     "--input2", in};
        const auto run = [&](std::vector<std::string> more) {
            more.insert(more.begin(), pip.begin(), pip.end());
            return RunHost(more);
        };
        EXPECT_EQ(run({"--strict"}).error, "");
        const bool cut = columns > 1024;
        EXPECT_EQ(run({"--narrow-map"}).error.find("only the first 1024") != std::string::npos,
                  cut);
        EXPECT_EQ(run({"--narrow-map", "--strict"}).status, cut ? 1 : 0);
    }
}

TEST_F(RenderTest, StereoIsTwoCallsIntoOneFrame) {
    const std::vector<uint32_t> input = Ramp(20, 3);
    const std::vector<uint32_t> both = Probe({"--stereo", "sbs"});
    for (const uint32_t x : {18U, 19U}) { // beyond the words
        EXPECT_EQ(both[x], input[x]);
        EXPECT_EQ(both[20 + x], input[x]);
        EXPECT_EQ(both[2 * 40 + x], input[2 * 20 + x]);
        EXPECT_EQ(both[2 * 40 + 20 + x], input[2 * 20 + x]);
    }
    EXPECT_EQ(both[Word_Layout], 1U);
    EXPECT_EQ(both[20 + Word_Layout], 2U);
    EXPECT_EQ(both[20 + Word_Width], 20U);

    const std::vector<uint32_t> split = Probe({"--stereo", "split"});
    EXPECT_EQ(split[Word_Layout], 1U);
    EXPECT_EQ(split[Word_Width], 10U);
    EXPECT_EQ(split[10 + Word_Layout], 2U);
    EXPECT_EQ(split[1 * 20 + 15], input[1 * 20 + 15]);
}

TEST_F(RenderTest, TheSecondInputTakesTheFirstOnesSize) {
    Write("a.png", 4, std::vector<uint32_t>(8, 0xFF102030));
    Write("b.png", 2, std::vector<uint32_t>(6, 0xFF405060));
    const HostResult result =
        RunHostWith(ProbeModule(), {"render", "probe-pair", Path("a.png"), Path("out.png"),
                                    "--input2", Path("b.png")});
    EXPECT_EQ(result.status, 0) << result.error;
    const std::vector<uint32_t> output = Read("out.png");
    ASSERT_EQ(output.size(), 8U);
    EXPECT_THAT(std::vector<uint32_t>(output.begin() + 4, output.end()),
                testing::Each(0xFF405060U));
}

TEST_F(RenderTest, AyuvFramesGoThereAndBack) {
    // White, black, red and grey return as they were; the colour temperature at 0 copies.
    Write("in.png", 2, {0xFFFFFFFF, 0x80000000, 0xFFFF0000, 0x00808080});
    const HostResult result = RunHost(
        {"render", "color-temperature", Path("in.png"), Path("out.png"), "--format", "ayuv"});
    EXPECT_EQ(result.status, 0) << result.error;
    EXPECT_THAT(Read("out.png"), ElementsAre(0xFFFFFFFF, 0x80000000, 0xFFFE0000, 0x00808080));
}

TEST_F(RenderTest, ListAndInfoSayWhatTheModuleHolds) {
    const json list = json::parse(RunHost({"list", "--json"}).output, nullptr, false);
    ASSERT_EQ(list["effects"].size(), Module().effectCount);
    const std::string table = RunHost({"list"}).output;
    for (uint32_t i = 0; i < Module().effectCount; ++i) {
        const EffectDescriptor& effect = Module().effects[i];
        EXPECT_EQ(list["effects"][i]["identifier"], effect.identifier);
        EXPECT_EQ(list["effects"][i]["inputs"], effect.properties.inputCount);
        EXPECT_THAT(table, HasSubstr(list["effects"][i]["shortName"].get<std::string>()));
        EXPECT_THAT(table, HasSubstr(effect.identifier));
    }
    EXPECT_EQ(list["effects"][0]["shortName"], "refractive-bubble");

    const json info =
        json::parse(RunHost({"info", "alpha-transition", "--json"}).output, nullptr, false);
    EXPECT_EQ(info["parameters"][0]["default"], 0.3);
    EXPECT_EQ(info["parameters"][0]["maximum"], 1.0);
    EXPECT_EQ(info["parameters"][2]["default"], "#78C819"); // 0x19C878, red in the lowest byte
    EXPECT_EQ(info["parameters"][3]["default"], "off");
    const json pip = json::parse(RunHost({"info", "4", "--json"}).output, nullptr, false);
    EXPECT_EQ(pip["parameters"].size(), 30U);
    EXPECT_EQ(pip["parameters"][18]["choices"][4], "UL");

    // The probe's new instances hold 13 where its record says 12.
    EXPECT_THAT(RunHostWith(ProbeModule(), {"info", "probe"}).output,
                testing::ContainsRegex("P3 +Byte +byte +13 +10 to 20"));
}

TEST_F(RenderTest, AnUnknownLanguageFallsBackOnTheKeys) {
    // The probe has no language library: its names are the words of its keys.
    const json info =
        json::parse(RunHostWith(ProbeModule(), {"info", "probe", "--json"}).output, nullptr, false);
    EXPECT_EQ(info["name"], "Probe");
    EXPECT_EQ(info["description"], "");
    EXPECT_EQ(info["parameters"][1]["name"], "First amount");
}

TEST_F(RenderTest, GalleryAndBenchServeEveryEffect) {
    Write("a.png", 64, Ramp(64, 36));
    Write("b.png", 32, Ramp(32, 32));
    const HostResult result = RunHost({"gallery", Path("sheet.png"), Path("a.png"), Path("b.png"),
                                       "--width", "64", "--columns", "4"});
    EXPECT_EQ(result.status, 0) << result.error;
    const kyvhost::Picture sheet = kyvhost::ReadPicture(Path("sheet.png"));
    EXPECT_GT(sheet.width, 4U * 64);
    EXPECT_GT(sheet.height, 4U * 36); // the effects and the inputs take several rows

    for (uint32_t i = 0; i < Module().effectCount; ++i) {
        const HostResult bench =
            RunHost({"bench", std::to_string(i), "--size", "64x36", "--frames", "2", "--json"});
        const json figures = json::parse(bench.output, nullptr, false);
        ASSERT_TRUE(figures.is_object()) << bench.error;
        EXPECT_GT(figures["memcpyMs"], 0);
        ASSERT_EQ(figures["levels"].size(), 3U);
        EXPECT_EQ(figures["levels"][1]["level"], 3);
        EXPECT_GT(figures["levels"][1]["ms"], 0);
    }
}

// Every wrong use ends with its status and one line that names what was wrong and what is right,
// and leaves nothing behind.
TEST_F(RenderTest, ErrorsAreOneLineWithAStatus) {
    const std::string in = Write("in.png", 3, Ramp(3, 2));
    const std::string out = Path("out.png");
    std::ofstream(Path("text.png")) << "no picture";
    std::ofstream(Path("empty.jpg"));
    {
        std::ifstream whole(in, std::ios::binary);
        std::string bytes(std::istreambuf_iterator<char>(whole), {});
        std::ofstream(Path("cut.png"), std::ios::binary) << bytes.substr(0, bytes.size() - 20);
    }
    std::filesystem::create_directory(Path("folder.png"));
    const std::string count = std::to_string(Module().effectCount);
    const std::string last = std::to_string(Module().effectCount - 1);
    // A table of Huffman codes that claims 257 of them.
    std::ofstream(Path("codes.jpg"), std::ios::binary)
        << std::string("\xFF\xD8\xFF\xC4\x01\x14\0\0\0\0\0\0\0\0\x80\x80\x01", 17)
        << std::string(8 + 257, '\0') << "\xFF\xDA\xFF\xD9";
    const std::vector<std::string> files = Files();
    const std::string probe = ProbeModule();
    struct Case {
        std::vector<std::string> arguments;
        int status;
        std::vector<std::string> texts;
    };
    const Case cases[] = {
        {{}, 2, {"verb is missing", "render"}},
        {{"rendr"}, 2, {"\"rendr\"", "nearest is render"}},
        {{"render", "11", in}, 2, {"OUTPUT", "render --help"}},
        {{"render", "11", in, out, "--levle", "3"}, 2, {"\"--levle\"", "--level"}},
        {{"render", "11", in, out, "third"}, 2, {"\"third\""}},
        {{"render", "11", in, out, "--level", "6"}, 2, {"--level: 6 is out of range: 0 to 5"}},
        {{"render", "11", in, out, "--format", "rgb"}, 2, {"\"rgb\"", "argb, ayuv"}},
        {{"render", "11", in, out, "--effect-preview", "2"}, 2, {"2 is out of range: 0 to 1"}},
        {{"render", "11", in, out, "--time", "soon"}, 2, {"--time", "\"soon\"", "5s"}},
        {{"render", "11", in, out, "--time", "9", "--duration", "5"}, 2, {"--time", "lasts 5 s"}},
        {{"render", "11", in, out, "--aspect", "16x9"}, 2, {"--aspect", "16:9"}},
        {{"render", "11", in, out, "--threads", "0"},
         2,
         {"--threads: 0 is out of range: 1 to 1024"}},
        {{"render", "11", in, out, "--start", "1"}, 2, {"--start", "video"}},
        {{"render", "11", in, out, "--stereo", "split"}, 2, {"3 pixels wide", "even"}},
        {{"render", "11", in, out, "--threads", "two"}, 2, {"\"two\" is not a whole number"}},
        {{"bench", "11", "--size", "100000x100000"}, 2, {"out of range: each number 1 to 32768"}},
        {{"render", "2", in, out, "--set", "P1=1e99"}, 2, {"1e99 is out of range: 0 to 1"}},
        {{"bench", "nosuch"}, 2, {"\"nosuch\"; kyvhost list shows all"}},
        {{"info", ""}, 2, {"\"\"; kyvhost list shows all"}},
        {{"info", "-1"}, 2, {"no effect -1", "0 to " + last}},
        {{"info", "99999999999"}, 2, {"no effect 99999999999", "0 to " + last}},
        {{"info", "tr"}, 2, {"several effects", "test-alpha-transition, alpha-transition"}},
        {{"render", "bubbel", in, out}, 2, {"\"bubbel\"", "\"bubble\""}},
        {{"render", count, in, out}, 2, {"no effect " + count, "0 to " + last}},
        {{"render", "alpha", in, out}, 2, {"test-alpha-transition, alpha-transition"}},
        {{"render", "9", in, out, "--set", "P2=231"}, 2, {"P2", "231", "1 to 230"}},
        {{"render", "9", in, out, "--set", "P2=two"}, 2, {"\"two\"", "whole number, 1 to 230"}},
        {{"render", "9", in, out, "--set", "edgy=3"}, 2, {"\"edgy\"", "\"edge\""}},
        {{"render", "9", in, out, "--set", "P9=3"}, 2, {"\"P9\"", "\"P"}},
        {{"render", "9", in, out, "--set", "P2"}, 2, {"\"P2\"", "NAME=VALUE"}},
        {{"render", "9", in, out, "--set", "P5=ring"}, 2, {"\"ring\"", "box, circle"}},
        {{"render", "11", in, out, "--set", "P1=red"}, 2, {"\"red\"", "#FFFFFF"}},
        {{"render", "2", in, out, "--set", "P1=nan"}, 2, {"\"nan\"", "0 to 1"}},
        {{"render", "10", in, out, "--set", "degree=1"}, 2, {"\"degree\"", "P1, P3"}},
        {{"render", "4", in, out, "--set", "alpha=3"}, 2, {"P11, P13, P19, P28"}},
        {{"render", "2", in, out, "--animate", "P1=0:2"}, 2, {"P1", "0 to 1"}},
        {{"render", "2", in, out, "--animate", "P1=0:1:fast"}, 2, {"\"fast\"", "in-out"}},
        {{"render", "9", in, out, "--animate", "P5=0:ring"}, 2, {"\"ring\"", "box, circle"}},
        {{"render", "2", in, out, "--key", "P1=1"}, 2, {"NAME@TIME=VALUE"}},
        {{"render", "2", in, out, "--key", "P1@1x=1"}, 2, {"\"1x\" is not a time"}},
        {{"render", "2", in, out, "--key", "P1@101%=1"}, 2, {"101%", "0% to 100%"}},
        {{"render", "2", in, out, "--key", "P1@1s=1:fast"}, 2, {"\"fast\"", "hold"}},
        {{"render", "2", in, out, "--then", "bubbel"}, 2, {"bubbel", "bubble"}},
        {{"render", "2", in, out, "--save", "look.txt"}, 2, {"look.txt", ".json"}},
        {{"render", "none.json", in, out}, 3, {"none.json cannot be read"}},
        {{"render", "6", in, out}, 2, {"two inputs", "--input2"}},
        {{"render", "11", in, out, "--input2", in}, 2, {"one input"}},
        {{"render", "11", in, Path("out.xyz")}, 2, {"out.xyz", ".png", ".mp4"}},
        {{"render", "11", in, Path("out.mp4"), "--output-format", "doc"}, 2, {"\"doc\"", ".nut"}},
        {{"render", "11", in, out, "--pick", "3,0"}, 2, {"3,0 is out of range", "3 x 2 pixels"}},
        {{"render", "11", in, out, "--pick", "1"}, 2, {"--pick", "640,360"}},
        {{"render", "bubble", in, out, "--pick", "1,1"}, 2, {"bubble has no colour"}},
        {{"render", "11", in, Path("none/out.png")}, 1, {"none", "does not exist"}},
        {{"render", "11", in, out, "--time", "11"},
         2,
         {"11 s is out of range", "lasts 10 s", "--duration"}},
        {{"render", "11", in, out, "--duration", "0"}, 2, {"--duration: 0 is out of range"}},
        {{"render", "11", "", out}, 2, {"INPUT is empty"}},
        {{"render", "11", in, ""}, 2, {"OUTPUT is empty"}},
        {{"render", "6", in, out, "--input2", ""}, 2, {"--input2 is empty"}},
        {{"gallery", out, in, ""}, 2, {"INPUT2 is empty"}},
        {{"list", "--module", ""}, 2, {"--module is empty"}},
        {{"render", "11", in, Path("out.mkv"), "--overlap", "1"},
         2,
         {"--overlap", "white-balance takes one input"}},
        {{"render", "alpha-transition", in, Path("out.mkv"), "--input2", in, "--overlap", "1"},
         2,
         {"--overlap", "in.png is a picture"}},
        {{"render", "11", in, Path("folder.png")}, 1, {"folder.png cannot be written", "folder;"}},
        {{"render", "11", in, in + "/out.png"}, 1, {"in.png/out.png cannot be written: "}},
        {{"render", "11", Path("none.png"), out}, 3, {"none.png", "no such file"}},
        {{"render", "11", Path("text.png"), out}, 3, {"text.png", "no PNG, JPEG, TIFF or BMP"}},
        {{"render", "11", Path("empty.jpg"), out}, 3, {"empty.jpg", "empty"}},
        {{"render", "11", Path("cut.png"), out}, 3, {"cut.png", "cut off"}},
        {{"render", "11", Path("codes.jpg"), out}, 3, {"codes.jpg", "broken"}},
        {{"list", "--module", Path("none.so")}, 4, {"none.so", "no such file"}},
        {{"list", "--module", in}, 4, {"in.png", "cannot be loaded"}},
        {{"list", "--module", EmptyModule()}, 4, {"KYV_DSP_InitModule"}},
        {{"list", "--module", OldModule()}, 4, {"format 10", "11"}},
        {{"render", "probe", in, out, "--module", probe, "--set", "P1=no_begin"},
         1,
         {"probe", "BeginProcessing", "0x8007000E"}},
        {{"render", "probe", in, out, "--module", probe, "--set", "P1=no_process"},
         1,
         {"probe", "ProcessFrame", "0x80004005"}},
    };
    for (const Case& test : cases) {
        const HostResult result = RunHost(test.arguments);
        const std::string line = testing::PrintToString(test.arguments);
        EXPECT_EQ(result.status, test.status) << line << result.error;
        EXPECT_EQ(result.error.find('\n'), result.error.size() - 1) << line << result.error;
        for (const std::string& text : test.texts) {
            EXPECT_THAT(result.error, HasSubstr(text)) << line;
        }
        EXPECT_EQ(Files(), files) << line;
    }
}

TEST_F(RenderTest, AFailureKeepsTheOldResult) {
    const std::string in = Write("in.png", 3, Ramp(3, 2));
    const std::string out = Write("out.png", 1, {0xFF123456});
    const auto render = [&](const std::vector<std::string>& options) {
        std::vector<std::string> arguments = {"render", "probe", in, out};
        arguments.insert(arguments.end(), options.begin(), options.end());
        return RunHostWith(ProbeModule(), arguments);
    };
    EXPECT_EQ(render({"--overwrite", "--set", "mode=no_process"}).status, 1);
    EXPECT_THAT(Read("out.png"), ElementsAre(0xFF123456));
    const HostResult refused = render({});
    EXPECT_EQ(refused.status, 2);
    EXPECT_THAT(refused.error, HasSubstr("out.png exists; --overwrite replaces it"));
    EXPECT_THAT(Read("out.png"), ElementsAre(0xFF123456));
    EXPECT_EQ(render({"-y"}).status, 0);
    EXPECT_EQ(Read("out.png").size(), 6U);
    EXPECT_THAT(Files(), ElementsAre("in.png", "out.png"));
}

TEST_F(RenderTest, AnInputIsNeverTheOutput) {
    const std::vector<uint32_t> ramp = Ramp(3, 2);
    const std::string in = Write("in.png", 3, ramp), other = Write("other.png", 3, ramp);
    const std::string aside = Path(".") + "/in.png";
    const std::vector<std::vector<std::string>> cases = {
        {"render", "11", in, in},
        {"render", "11", in, aside},
        {"render", "alpha-transition", other, in, "--input2", aside},
        {"gallery", aside, other, in},
    };
    for (std::vector<std::string> arguments : cases) {
        arguments.emplace_back("--overwrite");
        const HostResult result = RunHost(arguments);
        EXPECT_EQ(result.status, 2) << result.error;
        EXPECT_THAT(result.error, HasSubstr("name another file for the result"));
        EXPECT_EQ(Read("in.png"), ramp);
    }
    EXPECT_THAT(Files(), ElementsAre("in.png", "other.png"));
}

TEST_F(RenderTest, PicturesComeAndGoInEveryFormat) {
    const std::vector<uint32_t> ramp = Ramp(24, 16);
    Write("in.png", 24, ramp);
    for (const char* name : {"a.bmp", "a.tif", "a.tiff", "a.jpg", "a.jpeg"}) {
        const HostResult made = RunHost({"render", "11", Path("in.png"), Path(name)});
        EXPECT_EQ(made.status, 0) << made.error;
        const HostResult back = RunHost({"render", "11", Path(name), Path("out.png"), "-y"});
        EXPECT_EQ(back.status, 0) << back.error;
        const std::vector<uint32_t> pixels = Read("out.png");
        ASSERT_EQ(pixels.size(), ramp.size()) << name;
        if (name[2] != 'j') {
            EXPECT_EQ(pixels, ramp) << name;
            continue;
        }
        for (size_t i = 0; i < ramp.size(); ++i) { // green: nothing but the codec's loss
            EXPECT_NEAR(pixels[i] >> 8 & 0xFF, ramp[i] >> 8 & 0xFF, 40) << name << i;
        }
    }
}

TEST_F(RenderTest, CamerasTurnTheirPictures) {
    // A TIFF of one row, red and blue, stored turned: orientation 6 is shown as a column with the
    // first pixel on top, 8 as one with it at the bottom.
    const auto tiff = [](uint8_t orientation) {
        const std::vector<std::array<uint32_t, 3>> entries = {
            {256, 3, 2},   {257, 3, 1},           {258, 3, 8}, {259, 3, 1}, {262, 3, 2},
            {273, 4, 146}, {274, 3, orientation}, {277, 3, 3}, {278, 3, 1}, {279, 4, 6}};
        std::string bytes("II*\0\x08\0\0\0\x0A\0", 10);
        for (const auto& [tag, type, value] : entries) {
            for (const uint32_t word : {tag | type << 16, 1U, value}) {
                for (int shift = 0; shift < 32; shift += 8) {
                    bytes += static_cast<char>(word >> shift);
                }
            }
        }
        return bytes + std::string(16, '\0') + std::string("\xFF\0\0\0\0\xFF", 6);
    };
    for (const auto& [orientation, expected] :
         {std::pair{6, std::vector<uint32_t>{0xFFFF0000, 0xFF0000FF}},
          std::pair{8, std::vector<uint32_t>{0xFF0000FF, 0xFFFF0000}}}) {
        std::ofstream(Path("in.tif"), std::ios::binary) << tiff(static_cast<uint8_t>(orientation));
        EXPECT_EQ(Read("in.tif"), expected);
        EXPECT_EQ(kyvhost::ReadPicture(Path("in.tif")).width, 1U);
    }
}

TEST_F(RenderTest, HelpTellsTheStatuses) {
    const HostResult help = RunHost({"--help"});
    EXPECT_EQ(help.status, 0);
    for (const char* text : {"render", "gallery", "Exit status", "130"}) {
        EXPECT_THAT(help.output, HasSubstr(text));
    }
}

} // namespace
} // namespace kyvtest
