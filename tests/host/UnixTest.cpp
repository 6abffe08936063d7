// What only a Unix system has: links, and a device that takes no byte.
#include <gmock/gmock.h>

#include "tests/host/HostRun.h"

namespace kyvtest {
namespace {

using UnixTest = HostTest;

TEST_F(UnixTest, AResultGoesWhereALinkLeads) {
    const std::string in = Write("in.png", 3, Ramp(3, 2));
    std::filesystem::create_directory(Path("folder"));
    std::filesystem::create_symlink("folder/real.data", Path("link.png"));
    const HostResult result = RunHost({"render", "11", in, Path("link.png")});
    EXPECT_EQ(result.status, 0) << result.error;
    EXPECT_TRUE(std::filesystem::is_symlink(Path("link.png")));
    EXPECT_EQ(Read("folder/real.data").size(), 6U);
    std::filesystem::create_symlink("loop.png", Path("loop.png"));
    EXPECT_EQ(RunHost({"render", "11", in, Path("loop.png")}).status, 1);
    EXPECT_TRUE(std::filesystem::is_symlink(Path("loop.png")));
}

TEST_F(UnixTest, OutputThatIsLostIsAFailure) {
    for (const char* arguments :
         {"list", "info bubble --json", "--help", "bench 11 --size 8x8 --frames 1"}) {
        const HostResult result = RunProgram(
            "sh", {"-c", "exec \"$0\" " + std::string(arguments) + " >/dev/full", HostFile()});
        EXPECT_EQ(result.status, 1) << arguments;
        EXPECT_EQ(result.error, "kyvhost: the standard output cannot be written\n") << arguments;
    }
}

TEST_F(UnixTest, AnInputByAnotherNameIsStillTheInput) {
    const std::vector<uint32_t> ramp = Ramp(3, 2);
    const std::string in = Write("in.png", 3, ramp);
    std::filesystem::create_hard_link(in, Path("hard.png"));
    std::filesystem::create_symlink("in.png", Path("soft.png"));
    for (const char* name : {"hard.png", "soft.png"}) {
        for (const auto& [from, to] : {std::pair{in, Path(name)}, std::pair{Path(name), in}}) {
            const HostResult result = RunHost({"render", "11", from, to, "--overwrite"});
            EXPECT_EQ(result.status, 2) << result.error;
            EXPECT_EQ(Read("in.png"), ramp);
        }
    }
    EXPECT_THAT(Files(), testing::ElementsAre("hard.png", "in.png", "soft.png"));
}

// Files of at most 4 KiB: writing fails, and the signal that would end the program does not.
TEST_F(UnixTest, TheLimitForFilesLeavesNothingBehind) {
    Write("in.png", 16, Ramp(16, 9));
    for (const char* arguments : {"gallery out.png in.png in.png --width 200",
                                  "render bubble in.png out.mkv --codec ffv1 --duration 9"}) {
        const HostResult result = RunProgram(
            "bash", {"-c", "cd \"$1\"; ulimit -f 4; exec \"$0\" " + std::string(arguments),
                     HostFile(), Path("")});
        EXPECT_EQ(result.status, 1) << result.error;
        EXPECT_THAT(result.error, testing::HasSubstr("File too large")) << arguments;
        EXPECT_THAT(Files(), testing::ElementsAre("in.png")) << arguments;
    }
}

} // namespace
} // namespace kyvtest
