// The external image decoder, played by a component that the test registers in its own process.
//
// Its objects are bare tables of slots, filled by number, so that a wrong slot in the caller's view
// of them shows.
#include <array>
#include <cstring>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include <windows.h>

#include <objbase.h>

#include "imageutility/Bitmap.h"
#include "tests/support/PictureFiles.h"

namespace {

using KYVImageUtility::CImageARGB;

// What the component is to do, and what was asked of it.
struct Script {
    bool canCreate = true;
    bool hasOptions = true;
    HRESULT open = S_OK;
    HRESULT getPixels = S_OK;
    int32_t width = 3;
    int32_t height = 2;

    std::vector<std::string> calls;
    std::wstring path;
    int32_t option = 0;
    int32_t decodeOption = 0;
    int32_t pitch = 0;
    int references = 0; // of both interfaces
};

Script* g_script = nullptr;

struct Object {
    void** table;
};

bool Is(const IID* iid, const wchar_t* text) {
    IID expected;
    return IIDFromString(text, &expected) == S_OK && std::memcmp(iid, &expected, sizeof *iid) == 0;
}

extern "C" {

HRESULT UnexpectedSlot(Object*) {
    g_script->calls.emplace_back("a slot that means nothing to us");
    return E_NOTIMPL;
}

HRESULT QueryDecoder(Object* self, const IID* iid, void** object);

uint32_t AddReference(Object*) {
    return static_cast<uint32_t>(++g_script->references);
}

uint32_t RemoveReference(Object*) {
    return static_cast<uint32_t>(--g_script->references);
}

HRESULT SetOption(Object*, int32_t option, int32_t* value) {
    g_script->calls.emplace_back("option");
    g_script->option = option;
    g_script->decodeOption = *value;
    *value += 1;
    return S_OK;
}

HRESULT Open(Object*, const wchar_t* path) {
    g_script->calls.emplace_back("open");
    g_script->path = path;
    return g_script->open;
}

int32_t Height(Object*) {
    return g_script->height;
}

int32_t Width(Object*) {
    return g_script->width;
}

HRESULT GetPixels(Object*, uint8_t* buffer, int32_t width, int32_t height, int32_t pitch) {
    g_script->calls.emplace_back("pixels");
    g_script->pitch = pitch;
    for (int32_t i = 0; i < pitch * height; ++i) {
        buffer[i] = static_cast<uint8_t>(i);
    }
    EXPECT_EQ(width, g_script->width);
    return g_script->getPixels;
}

} // extern "C"

template <class Function>
void* Slot(Function* function) {
    return reinterpret_cast<void*>(function);
}

void* g_unused = Slot(UnexpectedSlot);

std::array<void*, 13> g_decoderTable = {
    Slot(QueryDecoder), Slot(AddReference), Slot(RemoveReference), g_unused,    Slot(Open),
    g_unused,           g_unused,           Slot(Height),          Slot(Width), g_unused,
    g_unused,           g_unused,           Slot(GetPixels)};
std::array<void*, 5> g_optionsTable = {Slot(QueryDecoder), Slot(AddReference),
                                       Slot(RemoveReference), g_unused, Slot(SetOption)};
Object g_decoder = {g_decoderTable.data()};
Object g_options = {g_optionsTable.data()};

HRESULT QueryDecoder(Object*, const IID* iid, void** object) {
    *object = nullptr;
    if (Is(iid, L"{FF7C86C0-5936-11DD-AE16-0800200C9A66}")) {
        *object = &g_decoder;
    } else if (Is(iid, L"{6D8AEAC6-ACA4-4379-9E03-D45CAD91A779}") && g_script->hasOptions) {
        *object = &g_options;
    } else {
        return E_NOINTERFACE;
    }
    ++g_script->references;
    return S_OK;
}

class CFactory final : public IClassFactory {
public:
    STDMETHODIMP QueryInterface(REFIID iid, void** object) override {
        const bool known = iid == IID_IUnknown || iid == IID_IClassFactory;
        *object = known ? this : nullptr;
        return known ? S_OK : E_NOINTERFACE;
    }
    STDMETHODIMP_(ULONG) AddRef() override { return 1; }
    STDMETHODIMP_(ULONG) Release() override { return 1; }
    STDMETHODIMP CreateInstance(IUnknown*, REFIID iid, void** object) override {
        *object = nullptr;
        return g_script->canCreate ? QueryDecoder(&g_decoder, &iid, object) : E_OUTOFMEMORY;
    }
    STDMETHODIMP LockServer(BOOL) override { return S_OK; }
};

class ExternalDecoder : public testing::Test {
protected:
    ExternalDecoder() {
        g_script = &m_script;
        EXPECT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_MULTITHREADED)));
        uint8_t pixels[] = {1, 2, 3, 4, 5, 6, 7, 8};
        const CImageARGB image(pixels, 2, 1, 8);
        EXPECT_EQ(SaveImageFile(image, Path().c_str()), 0U);
        m_image.SetDecodeOption(41);
    }

    ~ExternalDecoder() override {
        if (m_nRegistration != 0) {
            CoRevokeClassObject(m_nRegistration);
        }
        CoUninitialize();
        EXPECT_EQ(m_script.references, 0);
        g_script = nullptr;
    }

    void Register() {
        CLSID id;
        ASSERT_EQ(CLSIDFromString(L"{F660FBC0-5936-11DD-AE16-0800200C9A66}", &id), S_OK);
        ASSERT_EQ(CoRegisterClassObject(id, &m_factory, CLSCTX_INPROC_SERVER, REGCLS_MULTIPLEUSE,
                                        &m_nRegistration),
                  S_OK);
    }

    std::wstring Path() const { return m_folder.Wide("picture.png"); }

    void Load() { LoadImageFile(m_image, Path().c_str()); }

    void ExpectPictureOfGdiPlus() {
        ASSERT_EQ(m_image.GetWidth(), 2);
        ASSERT_EQ(m_image.GetHeight(), 1);
        EXPECT_EQ(m_image.GetBuffer()[7], 8);
        EXPECT_EQ(m_image.GetDecodeOption(), 41);
    }

    Script m_script;
    CFactory m_factory;
    DWORD m_nRegistration = 0;
    kyvtest::CTempFolder m_folder;
    CImageARGB m_image;
};

using Calls = std::vector<std::string>;

TEST_F(ExternalDecoder, ComesBeforeGdiPlus) {
    Register();
    Load();
    EXPECT_EQ(m_script.calls, (Calls{"option", "open", "pixels"}));
    EXPECT_EQ(m_script.option, 2);
    EXPECT_EQ(m_script.decodeOption, 41);
    EXPECT_EQ(m_script.path, Path());
    EXPECT_EQ(m_script.pitch, 12);
    ASSERT_EQ(m_image.GetWidth(), 3);
    ASSERT_EQ(m_image.GetHeight(), 2);
    for (int i = 0; i < 24; ++i) {
        EXPECT_EQ(m_image.GetBuffer()[i], i);
    }
    EXPECT_EQ(m_image.GetDecodeOption(), 42); // as the component changed it
}

TEST_F(ExternalDecoder, NeedsNoOptionsInterface) {
    m_script.hasOptions = false;
    Register();
    LoadImageFile(m_image, m_folder.Narrow("picture.png").c_str());
    EXPECT_EQ(m_script.calls, (Calls{"open", "pixels"}));
    EXPECT_EQ(m_script.path, Path());
    EXPECT_EQ(m_image.GetWidth(), 3);
    EXPECT_EQ(m_image.GetDecodeOption(), 41);
}

TEST_F(ExternalDecoder, HasTheLastWordWhenItFails) {
    Register();
    const auto expectNothing = [&] {
        Load();
        EXPECT_EQ(m_image.GetBuffer(), nullptr);
        EXPECT_EQ(m_image.GetWidth(), 0);
    };
    m_script.open = E_FAIL;
    expectNothing();
    m_script.open = S_OK;
    m_script.getPixels = E_FAIL;
    expectNothing();
    m_script.getPixels = S_OK;
    for (const auto& [width, height] :
         {std::pair(0, 2), {3, 0}, {-3, 2}, {3, -2}, {0x7FFFFFFF, 0x7FFFFFFF}}) {
        m_script.width = width;
        m_script.height = height;
        expectNothing();
    }
}

TEST_F(ExternalDecoder, GdiPlusServesWhereThereIsNone) {
    Load();
    EXPECT_EQ(m_script.calls, Calls());
    ExpectPictureOfGdiPlus();
}

TEST_F(ExternalDecoder, GdiPlusServesWhereItCannotBeCreated) {
    m_script.canCreate = false;
    Register();
    Load();
    EXPECT_EQ(m_script.calls, Calls());
    ExpectPictureOfGdiPlus();
}

TEST_F(ExternalDecoder, GdiPlusServesWhereComIsNotInitialised) {
    CoUninitialize();
    Load();
    ExpectPictureOfGdiPlus();
    ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_MULTITHREADED)));
}

} // namespace
