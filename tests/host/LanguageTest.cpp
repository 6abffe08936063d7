// kyvhost in the user's language, which Linux takes from the environment.
#include <gmock/gmock.h>

#include "tests/host/HostRun.h"

namespace kyvtest {
namespace {

using testing::HasSubstr;

HostResult RunIn(const std::string& locale, std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), {"LC_ALL=" + locale, HostFile()});
    return RunProgram("env", arguments);
}

using LanguageTest = HostTest;

TEST_F(LanguageTest, NamesAreTranslatedAndCommandsAreNot) {
    const std::string german = RunIn("de_DE.UTF-8", {"info", "bubble"}).output;
    EXPECT_THAT(german, HasSubstr("Seifenblasen (bubble)"));
    EXPECT_THAT(german, HasSubstr("Blasendichte"));
    EXPECT_THAT(RunIn("en_US.UTF-8", {"info", "bubble"}).output, HasSubstr("Bubble density"));
    // A language without a library: the words of the keys.
    EXPECT_THAT(RunIn("ja_JP.UTF-8", {"info", "bubble"}).output, HasSubstr("Bubble min size"));

    Write("in.png", 2, {0xFF000000, 0xFFFFFFFF});
    for (const char* effect : {"bubble", "Seifenblasen"}) {
        for (const char* value : {"P3=1", "Blasendichte=1", "density=1"}) {
            const HostResult result = RunIn(
                "de_DE.UTF-8", {"render", effect, Path("in.png"), Path("out.png"), "--set", value});
            EXPECT_EQ(result.status, 0) << result.error;
        }
    }
}

} // namespace
} // namespace kyvtest
