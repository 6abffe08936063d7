// Our declarations of the interface against the system's header, where it is installed.
#include <gtest/gtest.h>

#if KYV_HAS_FREI0R_HEADER

#include <cstddef>
#include <type_traits>

#include <frei0r.h>

#include "tests/bridges/Frei0rHost.h"

namespace {

#define EXPECT_SAME_TYPE(...) EXPECT_TRUE((std::is_same_v<__VA_ARGS__>))

#define EXPECT_SAME_FIELD(ours, ourField, theirs, theirField)                                      \
    EXPECT_EQ(offsetof(ours, ourField), offsetof(theirs, theirField));                             \
    EXPECT_SAME_TYPE(decltype(ours::ourField), decltype(theirs::theirField))

TEST(Frei0rHeaderTest, RecordsAreTheSystems) {
    EXPECT_EQ(sizeof(Frei0rPluginInfo), sizeof(f0r_plugin_info_t));
    EXPECT_SAME_FIELD(Frei0rPluginInfo, name, f0r_plugin_info_t, name);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, author, f0r_plugin_info_t, author);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, pluginType, f0r_plugin_info_t, plugin_type);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, colorModel, f0r_plugin_info_t, color_model);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, frei0rVersion, f0r_plugin_info_t, frei0r_version);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, majorVersion, f0r_plugin_info_t, major_version);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, minorVersion, f0r_plugin_info_t, minor_version);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, paramCount, f0r_plugin_info_t, num_params);
    EXPECT_SAME_FIELD(Frei0rPluginInfo, explanation, f0r_plugin_info_t, explanation);
    EXPECT_EQ(sizeof(Frei0rParamInfo), sizeof(f0r_param_info_t));
    EXPECT_SAME_FIELD(Frei0rParamInfo, name, f0r_param_info_t, name);
    EXPECT_SAME_FIELD(Frei0rParamInfo, type, f0r_param_info_t, type);
    EXPECT_SAME_FIELD(Frei0rParamInfo, explanation, f0r_param_info_t, explanation);
    EXPECT_EQ(sizeof(Frei0rColor), sizeof(f0r_param_color_t));
    EXPECT_SAME_FIELD(Frei0rColor, r, f0r_param_color_t, r);
    EXPECT_SAME_FIELD(Frei0rColor, g, f0r_param_color_t, g);
    EXPECT_SAME_FIELD(Frei0rColor, b, f0r_param_color_t, b);
    EXPECT_SAME_TYPE(f0r_param_bool, double);
    EXPECT_SAME_TYPE(f0r_param_double, double);
}

TEST(Frei0rHeaderTest, NumbersAreTheSystems) {
    EXPECT_EQ(int{kFrei0rMajorVersion}, FREI0R_MAJOR_VERSION);
    EXPECT_EQ(int{Frei0rPlugin_Filter}, F0R_PLUGIN_TYPE_FILTER);
    EXPECT_EQ(int{Frei0rPlugin_Mixer2}, F0R_PLUGIN_TYPE_MIXER2);
    EXPECT_EQ(int{Frei0rColorModel_Bgra8888}, F0R_COLOR_MODEL_BGRA8888);
    EXPECT_EQ(int{Frei0rParam_Bool}, F0R_PARAM_BOOL);
    EXPECT_EQ(int{Frei0rParam_Double}, F0R_PARAM_DOUBLE);
    EXPECT_EQ(int{Frei0rParam_Color}, F0R_PARAM_COLOR);
}

// As the tests' host calls them; the two records go by other names.
TEST(Frei0rHeaderTest, FunctionsAreTheSystems) {
    using Host = kyvtest::CFrei0rPlugin;
    EXPECT_SAME_TYPE(decltype(&f0r_init), decltype(Host::init));
    EXPECT_SAME_TYPE(decltype(&f0r_deinit), decltype(Host::deinit));
    EXPECT_SAME_TYPE(decltype(&f0r_get_plugin_info), void (*)(f0r_plugin_info_t*));
    EXPECT_SAME_TYPE(decltype(&f0r_get_param_info), void (*)(f0r_param_info_t*, int));
    EXPECT_SAME_TYPE(decltype(&f0r_construct), decltype(Host::construct));
    EXPECT_SAME_TYPE(decltype(&f0r_destruct), decltype(Host::destruct));
    EXPECT_SAME_TYPE(decltype(&f0r_set_param_value), decltype(Host::setParam));
    EXPECT_SAME_TYPE(decltype(&f0r_get_param_value), decltype(Host::getParam));
    EXPECT_SAME_TYPE(decltype(&f0r_update), decltype(Host::update));
    EXPECT_SAME_TYPE(decltype(&f0r_update2), decltype(Host::update2));
}

} // namespace

#else

TEST(Frei0rHeaderTest, RecordsAreTheSystems) {
    GTEST_SKIP() << "frei0r.h is not installed (the package frei0r-plugins-dev)";
}

#endif
