// Stacks of effects and their files.
#include <algorithm>
#include <fstream>
#include <iterator>

#include <gmock/gmock.h>

#include "tests/host/HostRun.h"

namespace kyvtest {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;

class EffectFileTest : public HostTest {
protected:
    EffectFileTest() { Write("in.png", 40, Ramp(40, 30)); }

    // Renders in.png; what was said in place of a picture when it does not work.
    std::vector<uint32_t> Render(const std::string& effect,
                                 const std::vector<std::string>& options = {},
                                 const std::string& in = "in.png") {
        std::vector<std::string> arguments = {"render", effect, Path(in), Path("out.png"), "-y"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const HostResult result = RunHost(arguments);
        EXPECT_EQ(result.status, 0) << result.error;
        return Read("out.png");
    }

    std::string File(const std::string& name, const std::string& text) {
        std::ofstream(Path(name), std::ios::binary) << text;
        return Path(name);
    }

    std::string TextIn(const std::string& name) {
        std::ifstream stream(Path(name), std::ios::binary);
        return std::string(std::istreambuf_iterator<char>(stream), {});
    }
};

TEST_F(EffectFileTest, AStackIsOneEffectAfterTheOther) {
    Write("b.png", 40, std::vector<uint32_t>(40 * 30, 0xFF2060A0));
    const std::vector<uint32_t> warm = Render("color-temperature", {"--set", "P1=-0.5"});
    std::filesystem::copy_file(Path("out.png"), Path("warm.png"));
    const std::vector<uint32_t> bubbles = Render("bubble", {"--set", "P3=1"}, "warm.png");
    std::filesystem::copy_file(Path("out.png"), Path("bubbles.png"));
    const std::vector<uint32_t> wanted =
        Render("alpha-transition", {"--input2", Path("b.png"), "--set", "P1=0.5"}, "bubbles.png");
    EXPECT_NE(warm, bubbles);
    EXPECT_NE(bubbles, wanted);
    // An option belongs to the effect that was named last.
    EXPECT_EQ(Render("color-temperature",
                     {"--set", "P1=-0.5", "--then", "bubble", "--set", "P3=1", "--then",
                      "alpha-transition", "--input2", Path("b.png"), "--set", "P1=0.5"}),
              wanted);
}

TEST_F(EffectFileTest, WhatIsSavedRendersTheSame) {
    Write("b.png", 40, std::vector<uint32_t>(40 * 30, 0xFF2060A0));
    const std::vector<std::string> options = {"--animate", "density=0.2:1:in-out",
                                              "--offset",  "3s",
                                              "--seed",    "7",
                                              "--then",    "light-ray",
                                              "--set",     "P2=0.5,0.25",
                                              "--then",    "white-balance",
                                              "--key",     "P1@0s=#FFFFFF",
                                              "--key",     "P1@50%=#80A0FF",
                                              "--then",    "alpha-transition",
                                              "--input2",  Path("b.png"),
                                              "--set",     "P1=0.3",
                                              "--set",     "P4=on"};
    std::vector<std::string> saving = options;
    saving.insert(saving.end(), {"--save", Path("look.json")});
    const std::vector<uint32_t> wanted = Render("bubble", saving);
    EXPECT_EQ(Render("bubble", options), wanted);
    EXPECT_EQ(TextIn("look.json"), R"({
  "kyv": 1,
  "effects": [
    {
      "effect": "bubble",
      "values": {
        "P3": [
          {
            "time": "0%",
            "value": 0.2,
            "easing": "in-out"
          },
          {
            "time": "100%",
            "value": 1,
            "easing": "in-out"
          }
        ]
      },
      "offset": 3.0,
      "seed": 7
    },
    {
      "effect": "light-ray",
      "values": {
        "P2": [
          0.5,
          0.25
        ]
      }
    },
    {
      "effect": "white-balance",
      "values": {
        "P1": [
          {
            "time": "0s",
            "value": "#FFFFFF"
          },
          {
            "time": "50%",
            "value": "#80A0FF"
          }
        ]
      }
    },
    {
      "effect": "alpha-transition",
      "values": {
        "P1": 0.3,
        "P4": true
      },
      "input2": "b.png"
    }
  ]
}
)");
    EXPECT_EQ(Render(Path("look.json"), {"--save", Path("again.json")}), wanted);
    EXPECT_EQ(TextIn("again.json"), TextIn("look.json"));
    // A preset of one effect takes further values, and stands in a stack.
    File("soft.json", R"({"kyv": 1, "name": "Soft", "effects": [
        {"effect": "dreamy", "values": {"P1": 5}}]})");
    EXPECT_EQ(Render(Path("soft.json"), {"--set", "P1=12"}), Render("dreamy", {"--set", "P1=12"}));
    EXPECT_EQ(
        Render("color-temperature", {"--set", "P1=0.4", "--then", Path("soft.json")}),
        Render("color-temperature", {"--set", "P1=0.4", "--then", "dreamy", "--set", "P1=5"}));
}

TEST_F(EffectFileTest, ErrorsNameLineAndKey) {
    const std::string head = "{\"kyv\": 1, \"effects\": [\n";
    const std::pair<std::string, std::string> kCases[] = {
        {"{\n\"kyv\": 1,\n\"effects\": [}", "line 3: syntax error while parsing value"},
        {"", "line 1: syntax error"},
        {"[]", "line 1: \"the file\" is a list, not an object"},
        {"{\"kyv\": 1\n}", "line 1: \"effects\" is missing"},
        {"{\"kyv\":\n2, \"effects\": []}", "line 1: \"kyv\" is 2; this program reads version 1"},
        {"{\"kyv\": 1, \"effects\": []}", "line 1: \"effects\" is empty"},
        {"{\"kyv\": 1,\n\"kyv\": 1}", "line 2: \"kyv\" is there twice"},
        {head + "{\"efect\": \"dreamy\"}]}",
         "line 2: \"efect\" is not known here; the nearest is effect"},
        {head + "{\n\"effect\": \"dreemy\"}]}", "line 3: "},
        {head + "{\"effect\": 7}]}", "line 2: \"effect\" is a number, not a text"},
        {head + "{\"effect\": \"dreamy\", \"values\": {\n\n\"P1\": 5,\n\"P77\": 1}}]}", "line 5: "},
        {head + "{\"effect\": \"dreamy\", \"values\": {\n\"P1\": \"much\"}}]}",
         "line 3: P1: \"much\" is not"},
        {head + "{\"effect\": \"dreamy\", \"values\": {\n\"P1\": [\n{\"time\": 0, \"value\": 5},\n"
                "{\"time\": \"half\", \"value\": 6}]}}]}",
         "line 5: \"time\": \"half\" is not a time"},
        {head + "{\"effect\": \"dreamy\", \"values\": {\n\"P1\": [\n{\"time\": 0, \"value\": 5,\n"
                "\"easing\": \"fast\"}]}}]}",
         "line 5: no easing \"fast\""},
        {head + "{\"effect\": \"dreamy\", \"seed\": -1}]}", "line 2: \"seed\" is no whole number"},
        {head + std::string(40, '['), "line 2: this is nested too deep"},
    };
    for (const auto& [text, error] : kCases) {
        File("bad.json", text);
        const HostResult result =
            RunHost({"render", Path("bad.json"), Path("in.png"), Path("out.png")});
        EXPECT_EQ(result.status, 2) << text;
        EXPECT_THAT(result.error, AllOf(StartsWith("kyvhost: "), HasSubstr("bad.json, " + error)));
        EXPECT_EQ(std::count(result.error.begin(), result.error.end(), '\n'), 1) << result.error;
    }
    const std::string two =
        File("two.json", head + R"({"effect": "dreamy"}, {"effect": "bubble"}]})");
    EXPECT_THAT(RunHost({"render", two, Path("in.png"), Path("out.png"), "--set", "P1=5"}).error,
                HasSubstr("holds 2 effects"));
    EXPECT_THAT(Files(), testing::Not(testing::Contains("out.png")));
}

} // namespace
} // namespace kyvtest
