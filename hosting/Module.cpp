// Loading the module.
#include "hosting/Module.h"

#include <memory>

#include "hosting/Error.h"
#include "hosting/Hex.h"
#include "hosting/Text.h"
#include "platform/Library.h"

namespace kyvhosting {
namespace {

namespace fs = std::filesystem;

[[noreturn]] void Fail(const std::string& text) {
    throw CModuleError(text);
}

template <class Function>
Function FindExport(KyvModuleHandle library, const char* name, const fs::path& file) {
    const auto function = reinterpret_cast<Function>(kyv::FindSymbol(library, name));
    if (!function) {
        Fail(TextOf(file) + " is not a KYV DSP module: it does not export " + name);
    }
    return function;
}

} // namespace

fs::path FindModuleFile(const std::vector<fs::path>& folders) {
    for (const fs::path& folder : folders) {
        const fs::path file = folder / KYV_MODULE_NAME;
        std::error_code error;
        if (fs::exists(file, error)) {
            return file.lexically_normal();
        }
    }
    return {};
}

CModule::CModule(const fs::path& file) : m_file(fs::absolute(file).lexically_normal()) {
    std::error_code error;
    if (!fs::is_regular_file(m_file, error)) {
        Fail("no module " + TextOf(file) +
             (fs::exists(m_file, error) ? ": not a file" : ": there is no such file"));
    }
    using Library = std::unique_ptr<void, decltype(&kyv::CloseLibrary)>;
    Library library(kyv::OpenLibrary(m_file.native()), &kyv::CloseLibrary);
    if (!library) {
        Fail(TextOf(file) + " cannot be loaded: it is no library for this system, or a library "
                            "that it needs is missing");
    }
    const auto init = FindExport<KyvInitModuleFunction>(library.get(), KYV_INIT_MODULE_NAME, file);
    m_pDeInit = FindExport<KyvDeInitModuleFunction>(library.get(), KYV_DEINIT_MODULE_NAME, file);
    const KyvStatus status = init(&m_pDescriptor);
    if (status != KYV_OK || !m_pDescriptor) {
        Fail(TextOf(file) + " refuses to start: " KYV_INIT_MODULE_NAME " gives " + Hex(status));
    }
    try {
        Check();
    } catch (...) {
        m_pDeInit();
        throw;
    }
    m_library = library.release();
}

CModule::~CModule() {
    m_pDeInit();
    kyv::CloseLibrary(m_library);
}

void CModule::Check() const {
    if (m_pDescriptor->formatNumber != kKyvFormatNumber) {
        Fail(TextOf(m_file) + " has interface format " +
             std::to_string(m_pDescriptor->formatNumber) + "; this host needs " +
             std::to_string(kKyvFormatNumber));
    }
    for (uint32_t i = 0; i < m_pDescriptor->effectCount; ++i) {
        const EffectDescriptor& effect = m_pDescriptor->effects[i];
        const EffectCallbacks& calls = effect.callbacks;
        if (!effect.identifier || !effect.nameKey || (effect.paramCount && !effect.params) ||
            !calls.InitInstance || !calls.DestroyInstance || !calls.SetInputFrame ||
            !calls.ProcessFrame || !calls.BeginProcessing || !calls.EndProcessing) {
            Fail(TextOf(m_file) + " is broken: the record of effect " + std::to_string(i) +
                 " lacks a name or a callback");
        }
        for (uint32_t j = 0; j < effect.paramCount; ++j) {
            if (!effect.params[j].key || !effect.params[j].nameKey) {
                Fail(TextOf(m_file) + " is broken: parameter " + std::to_string(j) + " of effect " +
                     std::to_string(i) + " has no name");
            }
        }
    }
}

} // namespace kyvhosting
