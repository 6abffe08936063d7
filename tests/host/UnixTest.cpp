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

} // namespace
} // namespace kyvtest
