// A host's start and end, again and again: load, initialise, read everything, unload.
#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "interface/HostInterface.h"
#include "platform/Library.h"
#include "tests/platform/ProcessUse.h"
#include "tests/support/TestHost.h"

namespace {

namespace fs = std::filesystem;
using namespace kyv;
using namespace kyvtest;

enum class Language { Present, Absent, Damaged };

// Everything that a host reads once a descriptor is there; a sum, so that nothing is left out.
size_t ReadEverything(const ModuleDescriptor& module) {
    size_t sum = 0;
    const auto bytes = [&](const void* at, size_t count) {
        for (size_t i = 0; at && i < count; ++i) {
            sum = sum * 31 + static_cast<const uint8_t*>(at)[i];
        }
    };
    for (uint32_t i = 0; i < module.effectCount; ++i) {
        const EffectDescriptor& effect = module.effects[i];
        bytes(effect.identifier, std::char_traits<char>::length(effect.identifier));
        for (uint32_t p = 0; p < effect.paramCount; ++p) {
            const ParamDescriptor& param = effect.params[p];
            bytes(param.minimum, param.valueSize);
            bytes(param.maximum, param.valueSize);
            bytes(param.defaultValue, param.valueSize);
        }
    }
    return sum;
}

class Load : public testing::TestWithParam<Language> {
protected:
    Load() {
        m_folder = fs::temp_directory_path() / ("kyvdsp" + std::to_string(std::random_device()()));
        fs::create_directories(m_folder);
        fs::copy_file(ModuleFile(), m_folder / "plug.bin");
        fs::path language = m_folder / "plug";
        language += fs::path("_").native() + AbbreviatedLanguageName() + fs::path(".DLL").native();
        if (GetParam() != Language::Absent) {
            fs::copy_file(KYV_LANGUAGE_FILE, language);
        }
        if (GetParam() == Language::Damaged) {
            fs::resize_file(language, fs::file_size(language) / 3);
        }
    }

    ~Load() override {
        std::error_code ignored;
        fs::remove_all(m_folder, ignored);
    }

    // The sum over the records, or 0 when a step failed.
    size_t OnceThrough() const {
        const LibraryHandle library = OpenLibrary((m_folder / "plug.bin").native());
        const auto init =
            reinterpret_cast<KyvInitModuleFunction>(FindSymbol(library, KYV_INIT_MODULE_NAME));
        const auto deInit =
            reinterpret_cast<KyvDeInitModuleFunction>(FindSymbol(library, KYV_DEINIT_MODULE_NAME));
        ModuleDescriptor* module = nullptr;
        size_t sum = 0;
        if (init && deInit && init(&module) == KYV_OK) {
            const bool own = module->ResourceLibrary == module->ModuleHandle;
            sum = own == (GetParam() != Language::Present) ? ReadEverything(*module) : 0;
            if (deInit() != KYV_OK) {
                sum = 0;
            }
        }
        CloseLibrary(library);
        return sum;
    }

    // What the system and the language's runtime keep when they load any library and let it go as
    // often: on Windows, or with Wine, 4 KiB each time.
    static int64_t BytesKeptByOthers() {
        const int64_t before = GetProcessUse().memoryBytes;
        for (int i = 0; i < KYV_LOADS; ++i) {
            CloseLibrary(OpenLibrary(fs::path(KYV_PLAIN_FILE).native()));
        }
        return std::max<int64_t>(GetProcessUse().memoryBytes - before, 0);
    }

    fs::path m_folder;
};

TEST_P(Load, TimeAfterTimeLeavesNothing) {
    const size_t expected = OnceThrough();
    ASSERT_NE(expected, 0U);
    for (int i = 0; i < 20; ++i) {
        ASSERT_EQ(OnceThrough(), expected);
    }
    const int64_t others = BytesKeptByOthers();
    RecordProperty("othersKeepBytes", std::to_string(others));
    const ProcessUse before = GetProcessUse();
    std::vector<int64_t> microseconds(KYV_LOADS);
    for (int64_t& took : microseconds) {
        const auto start = std::chrono::steady_clock::now();
        ASSERT_EQ(OnceThrough(), expected);
        took = std::chrono::duration_cast<std::chrono::microseconds>(
                   std::chrono::steady_clock::now() - start)
                   .count();
    }
    const ProcessUse after = GetProcessUse();
    EXPECT_LE(after.threads, before.threads);
    EXPECT_LE(after.handles, before.handles + 8); // the system's own come and go
    if (!KYV_OWN_ALLOCATOR) {
        EXPECT_LE(after.memoryBytes, before.memoryBytes + others + after.noiseBytes);
    }
    // Nothing is judged by it here; machines are busy.
    std::sort(microseconds.begin(), microseconds.end());
    RecordProperty("medianMicroseconds", std::to_string(microseconds[KYV_LOADS / 2]));
}

std::string NameOf(const testing::TestParamInfo<Language>& entry) {
    constexpr const char* kNames[] = {"Present", "Absent", "Damaged"};
    return kNames[static_cast<int>(entry.param)];
}

INSTANTIATE_TEST_SUITE_P(Languages, Load,
                         testing::Values(Language::Present, Language::Absent, Language::Damaged),
                         NameOf);

} // namespace
