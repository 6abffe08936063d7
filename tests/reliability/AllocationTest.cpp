// Every allocation refused in turn: a callback fails or gives the right bytes, nothing leaks, and
// the next call that gets its memory is right.
#include <array>
#include <atomic>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <new>
#include <random>
#include <utility>

#include <gtest/gtest.h>

#include "imageutility/Bitmap.h"
#include "tests/platform/ImportHooks.h"
#include "tests/support/Scenes.h"

namespace {

using namespace kyvtest;

enum class Kind {
    Gives,     // memory; 0 when there is none
    Throws,    // the same, but for the exception
    Moves,     // memory to another place
    TakesBack, // never refused
    Makes,     // something else that needs memory
};

struct Refusable {
    const char* name;
    Kind kind;
    uintptr_t refusal; // what it returns then
};

constexpr uintptr_t kGdiPlusOutOfMemory = 3;

// Of all targets; what a target does not import is not there.
constexpr Refusable kRefusables[] = {
    {"malloc", Kind::Gives, 0},
    {"calloc", Kind::Gives, 0},
    {"realloc", Kind::Moves, 0},
    {"free", Kind::TakesBack, 0},
#if KYV_OWN_ALLOCATOR
    // A sanitizer's operators do not come to malloc; what is live it counts itself.
    {"_Znwm", Kind::Throws, 0},
    {"_Znam", Kind::Throws, 0},
#endif
    {"mmap", Kind::Gives, ~uintptr_t{0}},
    {"munmap", Kind::TakesBack, 0},
    {"pthread_create", Kind::Makes, 11},
    {"VirtualAlloc", Kind::Gives, 0},
    {"VirtualFree", Kind::TakesBack, 0},
    {"GlobalAlloc", Kind::Gives, 0},
    {"GlobalFree", Kind::TakesBack, 0},
    {"CreateEventW", Kind::Makes, 0},
    {"CreateThread", Kind::Makes, 0},
    {"CreateStreamOnHGlobal", Kind::Makes, 0x8007000E},
    {"GdiplusStartup", Kind::Makes, kGdiPlusOutOfMemory},
    {"GdipCreateBitmapFromStream", Kind::Makes, kGdiPlusOutOfMemory},
    {"GdipCreateBitmapFromFile", Kind::Makes, kGdiPlusOutOfMemory},
    {"GdipCreateBitmapFromScan0", Kind::Makes, kGdiPlusOutOfMemory},
    {"GdipSaveImageToFile", Kind::Makes, kGdiPlusOutOfMemory},
    {"GdipBitmapLockBits", Kind::Makes, kGdiPlusOutOfMemory},
    {"LoadBitmapA", Kind::Makes, 0},
    {"CreateDCA", Kind::Makes, 0},
    {"GetDIBits", Kind::Makes, 0},
};

// Which requests are refused: one, or that and all that follow.
struct Refusal {
    uint32_t first; // from 1; 0 is none
    bool all;
};

std::atomic<bool> g_armed = false;
std::atomic<uint32_t> g_requests = 0;
std::atomic<int64_t> g_live = 0; // allocations that have not been given back
Refusal g_refusal = {};

bool IsRefused() {
    if (!g_armed) {
        return false;
    }
    const uint32_t request = ++g_requests;
    return g_refusal.all ? request >= g_refusal.first : request == g_refusal.first;
}

// All of them take numbers and addresses, at most eight, so one signature serves: what a function
// has no use for it does not look at.
using Any = uintptr_t;
using Function = Any (*)(Any, Any, Any, Any, Any, Any, Any, Any);

template <size_t kIndex>
struct Hook {
    static inline Function s_original = nullptr;

    static Any Call(Any a, Any b, Any c, Any d, Any e, Any f, Any g, Any h) {
        constexpr Refusable what = kRefusables[kIndex];
        if constexpr (what.kind == Kind::TakesBack) {
            g_live -= a != 0;
            return s_original(a, b, c, d, e, f, g, h);
        }
        if (IsRefused()) {
            if constexpr (what.kind == Kind::Throws) {
                throw std::bad_alloc();
            }
            return what.refusal;
        }
        const Any result = s_original(a, b, c, d, e, f, g, h);
        if constexpr (what.kind != Kind::Makes) {
            g_live += result != what.refusal && !(what.kind == Kind::Moves && a != 0);
        }
        return result;
    }

    static bool Install() {
        s_original = reinterpret_cast<Function>(
            ReplaceImport(kRefusables[kIndex].name, reinterpret_cast<void*>(Call)));
        return s_original != nullptr;
    }
};

// The number of functions that are imported at all.
int InstallHooks() {
    Module();
    return []<size_t... kIndex>(std::index_sequence<kIndex...>) {
        return (0 + ... + Hook<kIndex>::Install());
    }
    (std::make_index_sequence<std::size(kRefusables)>());
}

// Runs a call with requests refused; true when there were as many as to reach the first.
template <class Call>
bool RunRefused(const Refusal& refusal, Call&& call) {
    g_refusal = refusal;
    g_requests = 0;
    g_armed = true;
    call();
    g_armed = false;
    return g_requests >= refusal.first;
}

void Repeat(const std::function<bool(const Refusal&)>& attempt, bool libraryLoses = false) {
    static const int installed = InstallHooks();
    ASSERT_GE(installed, 4);
    for (const bool all : {false, true}) {
        if (all && !KYV_THROWS_WITHOUT_MEMORY) {
            break;
        }
        for (Refusal refusal = {1, all};; ++refusal.first) {
            bool reached = false;
            int64_t lost = 0;
            // What is made once for the whole process is not made again.
            for (int round = 0; round < 3 && (round == 0 || lost != 0); ++round) {
                const int64_t before = g_live;
                reached = attempt(refusal);
                if (testing::Test::HasFatalFailure()) {
                    return;
                }
                lost = g_live - before;
            }
            if (!KYV_OWN_ALLOCATOR && !libraryLoses) {
                ASSERT_EQ(lost, 0) << "leaked; request " << refusal.first;
            }
            if (!reached) {
                break;
            }
        }
    }
}

class Allocation : public testing::TestWithParam<const EffectDescriptor*> {};

INSTANTIATE_TEST_SUITE_P(AllEffects, Allocation, testing::ValuesIn(AllEffects()),
                         [](const auto& entry) { return EffectName(*entry.param); });

enum Phase { kBegin, kFirst, kSecond };
constexpr const char* kPhaseNames[] = {"BeginProcessing", "first frame", "second frame"};

// Two frames of one instance, and what they are when memory is there.
class CTwoFrames {
public:
    CTwoFrames(const EffectDescriptor& effect, uint32_t seed)
        : m_scenes{RandomScene(effect, seed), RandomScene(effect, seed + 1000)} {
        for (Scene& scene : m_scenes) {
            scene.context.width += 2; // what is too small to be scaled needs less memory
            scene.context.height += 2;
            scene.context.fieldSelector = 0;
        }
        // Everything but size, format and layout may change from frame to frame.
        const auto copy = [&](auto field) {
            m_scenes[1].context.*field = m_scenes[0].context.*field;
        };
        copy(&EffectContext::width);
        copy(&EffectContext::height);
        copy(&EffectContext::pixelFormat);
        copy(&EffectContext::stereoLayout);
        copy(&EffectContext::displayAspectX);
        copy(&EffectContext::displayAspectY);
        m_inputs[0] = m_scenes[0].Input(0);
        m_inputs[1] = m_scenes[0].Input(1);
        m_output.resize(m_scenes[0].FramePixels());
        for (int frame = 0; frame < 2; ++frame) {
            CSceneInstance instance(m_scenes[0]);
            EXPECT_EQ(instance.Begin(), KYV_OK);
            for (int i = 0; i <= frame; ++i) {
                EXPECT_EQ(Render(instance, i), KYV_OK);
            }
            m_expected[frame] = m_output;
        }
    }

    const Scene& First() const { return m_scenes[0]; }

    // Null, or what went wrong when memory is refused in the phase; reached tells whether it was.
    const char* Play(Phase phase, const Refusal& refusal, bool& reached) {
        CSceneInstance instance(m_scenes[0]);
        KyvStatus status = KYV_OK;
        if (phase == kBegin) {
            reached = RunRefused(refusal, [&] { status = instance.Begin(); });
            if (status != KYV_OK && status != KYV_FAIL) {
                return "unknown status";
            }
            if (status == KYV_FAIL && instance.Begin() != KYV_OK) {
                return "BeginProcessing does not recover";
            }
        } else if (instance.Begin() != KYV_OK) {
            return "BeginProcessing";
        }
        for (int frame = 0; frame < 2; ++frame) {
            if (phase == frame + kFirst) {
                reached = RunRefused(refusal, [&] { status = Render(instance, frame); });
                if (status != KYV_OK && status != KYV_FAIL) {
                    return "unknown status";
                }
                if (status == KYV_OK && m_output != m_expected[frame]) {
                    return "success with other bytes";
                }
            }
            if (Render(instance, frame) != KYV_OK) {
                return "ProcessFrame does not recover";
            }
            if (m_output != m_expected[frame]) {
                return "other bytes after the failure";
            }
        }
        return nullptr;
    }

private:
    KyvStatus Render(CSceneInstance& instance, int frame) {
        instance.Apply(m_scenes[frame]);
        std::fill(m_output.begin(), m_output.end(), 0xA5A5A5A5);
        return instance.Render(m_output.data(), m_inputs[0].data(), m_inputs[1].data());
    }

    Scene m_scenes[2];
    Frame m_inputs[2], m_output, m_expected[2];
};

TEST_P(Allocation, RefusedAtEveryPlaceGivesFailureOrTheRightBytes) {
    for (const uint32_t seed : Seeds(2, 60)) {
        CTwoFrames frames(*GetParam(), seed);
        for (const Phase phase : {kBegin, kFirst, kSecond}) {
            Repeat([&](const Refusal& refusal) {
                bool reached = false;
                const char* const wrong = frames.Play(phase, refusal, reached);
                if (wrong) {
                    ADD_FAILURE() << wrong << ": " << kPhaseNames[phase] << ", request "
                                  << refusal.first << (refusal.all ? " and all that follow" : "")
                                  << "; " << frames.First();
                }
                return reached && !wrong;
            });
        }
    }
}

// A picture that cannot be loaded leaves the image as it was, and one that cannot be saved no file
// that looks whole.
TEST(Allocation, RefusedWhilePicturesAreLoadedAndSaved) {
    namespace fs = std::filesystem;
    using KYVImageUtility::CImageARGB;
    const fs::path folder =
        fs::temp_directory_path() / ("kyvdsp" + std::to_string(std::random_device()()));
    fs::create_directories(folder);
    CImageARGB picture(37, 21);
    const Frame pixels = RandomFrame(37 * 21, 1);
    std::memcpy(picture.GetBuffer(), pixels.data(), pixels.size() * 4);
    picture.SetAlpha(255);
    const auto bytesOf = [](const fs::path& path) {
        std::ifstream file(path, std::ios::binary);
        return std::string(std::istreambuf_iterator<char>(file), {});
    };
    for (const char* name : {"a.png", "a.jpg", "a.bmp", "a.tif"}) {
        SCOPED_TRACE(name);
        const fs::path path = folder / name;
        const std::wstring wide = path.wstring();
        ASSERT_EQ(SaveImageFile(picture, wide.c_str()), kyv::kOk);
        const std::string whole = bytesOf(path);
        CImageARGB loaded;
        LoadImageFile(loaded, wide.c_str());
        ASSERT_TRUE(loaded.IsSameSize(picture));
        // libtiff loses the state of its compressor when the table of its fields cannot grow.
        const bool libtiff = path.extension() == ".tif";
        Repeat(
            [&](const Refusal& refusal) {
                fs::remove(path);
                kyv::Status status = kyv::kOk;
                const bool reached =
                    RunRefused(refusal, [&] { status = SaveImageFile(picture, wide.c_str()); });
                EXPECT_TRUE(status == kyv::kOk ? bytesOf(path) == whole : bytesOf(path) != whole)
                    << "request " << refusal.first << ", status " << std::hex << status
                    << ", file of " << std::dec << bytesOf(path).size();
                return reached;
            },
            libtiff);
        ASSERT_EQ(SaveImageFile(picture, wide.c_str()), kyv::kOk);
        if (libtiff) {
            continue; // it reads a directory without a look whether it got the memory for it
        }
        Repeat([&](const Refusal& refusal) {
            CImageARGB image;
            const bool reached = RunRefused(refusal, [&] { LoadImageFile(image, wide.c_str()); });
            EXPECT_TRUE(!image.GetBuffer() || (image.IsSameSize(loaded) &&
                                               std::memcmp(image.GetBuffer(), loaded.GetBuffer(),
                                                           pixels.size() * 4) == 0))
                << refusal.first;
            return reached;
        });
    }
    fs::remove_all(folder);
}

} // namespace
