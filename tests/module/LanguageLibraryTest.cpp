// The exports and the search for the language library, with copies of the built module in folders
// of the test's own. Any loadable library serves as a language library here; a second copy of the
// module is at hand.
#include <filesystem>
#include <fstream>
#include <random>

#include <gtest/gtest.h>

#include "interface/HostInterface.h"
#include "module/ResourceLibrary.h"
#include "platform/Library.h"
#include "tests/support/TestHost.h"

namespace {

namespace fs = std::filesystem;
using namespace kyv;

fs::path FromAscii(std::string_view text) {
    return fs::path(text);
}

TEST(LanguageLibraryPath, IsCutAtTheFirstDotOfTheWholePath) {
    const auto path = [](const char* module) {
        return fs::path(LanguageLibraryPath(FromAscii(module).native(), FromAscii("ENU").native()))
            .string();
    };
    EXPECT_EQ(path("D:\\fx\\plug.dll"), "D:\\fx\\plug_ENU.DLL");
    EXPECT_EQ(path("C:\\a.b\\fx.dll"), "C:\\a_ENU.DLL");
    EXPECT_EQ(path("/opt/fx/libplug.so.1"), "/opt/fx/libplug_ENU.DLL");
    EXPECT_EQ(path("/opt/fx/plug"), "/opt/fx/plug_ENU.DLL"); // no dot at all
    // 260 units with the terminating zero are the limit; 251 + "_ENU.DLL" just fits.
    EXPECT_EQ(path(std::string(251, 'x').c_str()).size(), 259U);
    EXPECT_EQ(path(std::string(252, 'x').c_str()), "");
    // Characters count, however many bytes one has.
    const auto fits = [](size_t count) {
        const fs::path module(std::u16string(count, u'\u00E9'));
        return !LanguageLibraryPath(module.native(), FromAscii("ENU").native()).empty();
    };
    EXPECT_TRUE(fits(251));
    EXPECT_FALSE(fits(252));
}

TEST(LanguageLibraryPath, FallbackIsNotNamedRes) {
    const std::u16string expected = u"D:\\fx\\plug_\u4552\u0053\uCCCD\u3E4C.DLL";
    EXPECT_EQ(fs::path(FallbackLibraryPath(FromAscii("D:\\fx\\plug.dll").native())).u16string(),
              expected);
}

// A folder that is removed again, and a copy of the module in it.
class LanguageLibrary : public testing::Test {
protected:
    LanguageLibrary() {
        m_root = fs::temp_directory_path() / ("kyvdsp" + std::to_string(std::random_device()()));
        fs::create_directories(m_root);
    }

    ~LanguageLibrary() override {
        if (m_library) {
            CloseLibrary(m_library);
        }
        std::error_code ignored;
        fs::remove_all(m_root, ignored);
    }

    void Load(const fs::path& relative) {
        const fs::path path = m_root / relative;
        fs::create_directories(path.parent_path());
        fs::copy_file(kyvtest::ModuleFile(), path);
        m_library = OpenLibrary(path.native());
        ASSERT_NE(m_library, nullptr);
        m_init =
            reinterpret_cast<KyvInitModuleFunction>(FindSymbol(m_library, KYV_INIT_MODULE_NAME));
        m_deInit = reinterpret_cast<KyvDeInitModuleFunction>(
            FindSymbol(m_library, KYV_DEINIT_MODULE_NAME));
        ASSERT_TRUE(m_init && m_deInit);
    }

    // Puts a loadable library at the place that the search looks at for a base such as "plug".
    void AddLanguage(const fs::path& base) {
        fs::path name = m_root / base;
        name += fs::path("_").native() + AbbreviatedLanguageName() + fs::path(".DLL").native();
        fs::copy_file(kyvtest::ModuleFile(), name);
    }

    fs::path m_root;
    LibraryHandle m_library = nullptr;
    KyvInitModuleFunction m_init = nullptr;
    KyvDeInitModuleFunction m_deInit = nullptr;
};

TEST_F(LanguageLibrary, NullArgumentFailsAndChangesNothing) {
    Load("plug.bin");
    ModuleDescriptor* module = nullptr;
    ASSERT_EQ(m_init(&module), 0U);
    ASSERT_EQ(m_deInit(), 0U);
    EXPECT_EQ(m_init(nullptr), 0x80004005U);
    EXPECT_EQ(module->ResourceLibrary, nullptr);
}

TEST_F(LanguageLibrary, WithoutOneTheModuleServesItself) {
    Load("plug.bin");
    fs::copy_file(kyvtest::ModuleFile(), m_root / "plug_RES.DLL"); // never used
    ModuleDescriptor* module = nullptr;
    ASSERT_EQ(m_init(&module), 0U);
    EXPECT_EQ(module->ModuleHandle, m_library);
    EXPECT_EQ(module->ResourceLibrary, m_library);
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(m_deInit(), 0U);
        EXPECT_EQ(module->ResourceLibrary, nullptr);
        EXPECT_EQ(module->ModuleHandle, m_library);
    }
    // The handle was not released with the library: the module is still there.
    EXPECT_EQ(m_init(&module), 0U);
    EXPECT_EQ(module->ResourceLibrary, m_library);
    EXPECT_EQ(m_deInit(), 0U);
}

TEST_F(LanguageLibrary, BesideTheModuleIsFoundAndReleased) {
    AddLanguage("plug");
    Load("plug.bin");
    ModuleDescriptor* module = nullptr;
    for (int i = 0; i < 2; ++i) {
        ASSERT_EQ(m_init(&module), 0U);
        EXPECT_NE(module->ResourceLibrary, nullptr);
        EXPECT_NE(module->ResourceLibrary, m_library);
        EXPECT_NE(FindSymbol(module->ResourceLibrary, KYV_INIT_MODULE_NAME), nullptr);
        ASSERT_EQ(m_deInit(), 0U);
        EXPECT_EQ(module->ResourceLibrary, nullptr);
    }
}

TEST_F(LanguageLibrary, DotInAFolderNameMovesTheSearch) {
    AddLanguage("a"); // for a.b/plug.bin
    Load(fs::path("a.b") / "plug.bin");
    ModuleDescriptor* module = nullptr;
    ASSERT_EQ(m_init(&module), 0U);
    EXPECT_NE(module->ResourceLibrary, m_library);
    EXPECT_EQ(m_deInit(), 0U);
}

TEST_F(LanguageLibrary, IsFoundWhenTheHostHasLeftTheFolderItLoadedFrom) {
    AddLanguage("plug");
    const fs::path before = fs::current_path();
    fs::current_path(m_root);
    fs::copy_file(kyvtest::ModuleFile(), "plug.bin");
    m_library = OpenLibrary((fs::path(".") / "plug.bin").native());
    fs::current_path(before);
    ASSERT_NE(m_library, nullptr);
    m_init = reinterpret_cast<KyvInitModuleFunction>(FindSymbol(m_library, KYV_INIT_MODULE_NAME));
    m_deInit =
        reinterpret_cast<KyvDeInitModuleFunction>(FindSymbol(m_library, KYV_DEINIT_MODULE_NAME));
    ModuleDescriptor* module = nullptr;
    ASSERT_EQ(m_init(&module), 0U);
    EXPECT_NE(module->ResourceLibrary, m_library);
    EXPECT_EQ(m_deInit(), 0U);
}

TEST_F(LanguageLibrary, OneThatCannotBeLoadedFallsBackToTheModule) {
    AddLanguage("plug");
    Load("plug.bin");
    for (const auto& entry : fs::directory_iterator(m_root)) {
        if (entry.path().extension() == ".DLL") {
            std::ofstream(entry.path(), std::ios::trunc) << "not a library";
        }
    }
    ModuleDescriptor* module = nullptr;
    ASSERT_EQ(m_init(&module), 0U);
    EXPECT_EQ(module->ResourceLibrary, m_library);
    EXPECT_EQ(m_deInit(), 0U);
}

TEST_F(LanguageLibrary, StaysInUseWhenALaterSearchFindsNone) {
    AddLanguage("plug");
    Load("plug.bin");
    ModuleDescriptor* module = nullptr;
    ASSERT_EQ(m_init(&module), 0U);
    const KyvModuleHandle language = module->ResourceLibrary;
    ASSERT_NE(language, m_library);
    std::error_code locked; // a loaded library cannot be removed on Windows; then this holds anyway
    for (const auto& entry : fs::directory_iterator(m_root)) {
        if (entry.path().extension() == ".DLL") {
            fs::remove(entry.path(), locked);
        }
    }
    ASSERT_EQ(m_init(&module), 0U);
    EXPECT_EQ(module->ResourceLibrary, language);
    EXPECT_EQ(m_deInit(), 0U);
}

} // namespace
