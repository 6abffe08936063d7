// kyvhost in the user's language, which Linux takes from the environment.
#include <gmock/gmock.h>

#include "tests/host/HostRun.h"
#include "tests/support/TestHost.h"

namespace kyvtest {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;

// The module and two languages in a folder of their own: the search takes a dot in any folder's
// name for the end of the module's, and the build may lie anywhere.
class LanguageTest : public HostTest {
protected:
    LanguageTest() {
        fs::copy_file(ModuleFile(), Path("plug.so"));
        fs::copy_file(KYV_GERMAN_FILE, Path("plug_DEU.DLL"));
        fs::copy_file(KYV_ENGLISH_FILE, Path("plug_ENU.DLL"));
    }

    HostResult RunIn(const std::string& locale, std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(),
                         {"LC_ALL=" + locale, HostFile(), "--module", Path("plug.so")});
        return RunProgram("env", arguments);
    }
};

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
            const HostResult result = RunIn("de_DE.UTF-8", {"render", effect, "-y", Path("in.png"),
                                                            Path("out.png"), "--set", value});
            EXPECT_EQ(result.status, 0) << result.error;
        }
    }
}

} // namespace
} // namespace kyvtest
