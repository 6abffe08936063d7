// The user's language on Linux comes from the environment.
#include <cstdlib>

#include <gtest/gtest.h>

#include "platform/Library.h"

namespace {

std::string NameFor(const char* lcAll, const char* lcMessages, const char* lang) {
    const auto set = [](const char* name, const char* value) {
        value ? setenv(name, value, 1) : unsetenv(name);
    };
    set("LC_ALL", lcAll);
    set("LC_MESSAGES", lcMessages);
    set("LANG", lang);
    return kyv::AbbreviatedLanguageName();
}

TEST(LanguageName, FollowsTheEnvironmentInOrder) {
    EXPECT_EQ(NameFor(nullptr, nullptr, nullptr), "ENU");
    EXPECT_EQ(NameFor(nullptr, nullptr, "de_DE.UTF-8"), "DEU");
    EXPECT_EQ(NameFor(nullptr, "fr_FR", "de_DE.UTF-8"), "FRA");
    EXPECT_EQ(NameFor("ja_JP.eucJP", "fr_FR", "de_DE.UTF-8"), "JPN");
    EXPECT_EQ(NameFor("", "", "en_US"), "ENU"); // empty counts as unset
}

TEST(LanguageName, CountriesModifiersAndUnknownOnes) {
    EXPECT_EQ(NameFor("de_AT@euro", nullptr, nullptr), "DEA");
    EXPECT_EQ(NameFor("pt_BR.UTF-8", nullptr, nullptr), "PTB");
    EXPECT_EQ(NameFor("en_GB", nullptr, nullptr), "ENG");
    EXPECT_EQ(NameFor("de_XX", nullptr, nullptr), "DEU");
    EXPECT_EQ(NameFor("C.UTF-8", nullptr, nullptr), "ENU");
    EXPECT_EQ(NameFor("POSIX", nullptr, nullptr), "ENU");
    EXPECT_EQ(NameFor("tlh_QO", nullptr, nullptr), "ENU");
}

} // namespace
