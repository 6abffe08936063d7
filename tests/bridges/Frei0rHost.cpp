// A frei0r host.
#include "tests/bridges/Frei0rHost.h"

#include <cstdlib>
#include <filesystem>

#include <gtest/gtest.h>

#include "hosting/Text.h"

namespace kyvtest {

const std::vector<std::string>& PluginNames() {
    static const std::vector<std::string> names = kyvhosting::Split(KYV_FREI0R_PLUGINS, '|');
    return names;
}

CFrei0rPlugin::CFrei0rPlugin(const std::string& name)
    : m_library(kyv::OpenLibrary(
          (std::filesystem::path(KYV_FREI0R_FOLDER) / (name + KYV_FREI0R_SUFFIX)).native())) {
    const auto find = [&](auto& function, const char* symbol) {
        function = reinterpret_cast<std::remove_reference_t<decltype(function)>>(
            kyv::FindSymbol(m_library, symbol));
        if (!function) {
            ADD_FAILURE() << name << " has no " << symbol;
            std::abort();
        }
    };
    void (*info)(Frei0rPluginInfo*) = nullptr;
    find(info, "f0r_get_plugin_info");
    find(init, "f0r_init");
    find(deinit, "f0r_deinit");
    find(paramInfo, "f0r_get_param_info");
    find(construct, "f0r_construct");
    find(destruct, "f0r_destruct");
    find(setParam, "f0r_set_param_value");
    find(getParam, "f0r_get_param_value");
    find(update, "f0r_update");
    find(update2, "f0r_update2");
    info(&m_info);
}

Frei0rParamInfo CFrei0rPlugin::Param(int index) const {
    Frei0rParamInfo info = {nullptr, -1, nullptr};
    paramInfo(&info, index);
    return info;
}

int CFrei0rPlugin::IndexOf(const std::string& param) const {
    for (int i = 0; i < m_info.paramCount; ++i) {
        if (param == Param(i).name) {
            return i;
        }
    }
    ADD_FAILURE() << m_info.name << " has no " << param;
    return -1;
}

double CFrei0rInstance::Get(int index) const {
    double value = -77;
    m_plugin.getParam(m_instance, &value, index);
    return value;
}

Frei0rColor CFrei0rInstance::Color(int index) const {
    Frei0rColor color = {-77, -77, -77};
    m_plugin.getParam(m_instance, &color, index);
    return color;
}

Frame CFrei0rInstance::Update(double time, const Frame& input0, const Frame& input1) const {
    Frame output(m_pixels, 0xCDCDCDCD);
    if (m_plugin.IsMixer()) {
        m_plugin.update2(m_instance, time, input0.data(), input1.data(), nullptr, output.data());
    } else {
        m_plugin.update(m_instance, time, input0.data(), output.data());
    }
    return output;
}

} // namespace kyvtest
