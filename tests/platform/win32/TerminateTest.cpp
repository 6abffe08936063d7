// A thread that is ended keeps none of the locks that the process lives on.
#include <functional>
#include <vector>

#include <gtest/gtest.h>

#include <windows.h>

#include "platform/Threads.h"

namespace {

using kyv::CEvent;
using kyv::CThread;

// Stands in for a thread that lost the processor while it held the lock: to others, both stand
// still. A little later it goes on, and then waits for what never comes.
struct Holder {
    std::function<void()> take = {}, giveBack = {};
    CEvent taken = {};
    CEvent never = {};
    bool gaveBack = false;

    static uint32_t Run(void* argument) {
        auto* self = static_cast<Holder*>(argument);
        self->take();
        self->taken.Set();
        self->never.Wait(kHoldMs);
        self->giveBack();
        self->gaveBack = true;
        self->never.Wait();
        return 0;
    }

    static constexpr uint32_t kHoldMs = 300;
};

template <class Function>
Function* NtFunction(const char* name) {
    return reinterpret_cast<Function*>(
        reinterpret_cast<void*>(GetProcAddress(GetModuleHandleW(L"ntdll.dll"), name)));
}

TEST(Terminate, LeavesTheAllocatorAndTheLoaderFree) {
    ULONG_PTR cookie = 0;
    const auto lockLoader = NtFunction<LONG NTAPI(ULONG, ULONG*, ULONG_PTR*)>("LdrLockLoaderLock");
    const auto unlockLoader = NtFunction<LONG NTAPI(ULONG, ULONG_PTR)>("LdrUnlockLoaderLock");
    ASSERT_TRUE(lockLoader && unlockLoader);

    Holder allocator = {.take = [] { HeapLock(GetProcessHeap()); },
                        .giveBack = [] { HeapUnlock(GetProcessHeap()); }};
    Holder loader = {.take = [&] { lockLoader(0, nullptr, &cookie); },
                     .giveBack = [&] { unlockLoader(0, cookie); }};
    for (Holder* holder : {&allocator, &loader}) {
        CThread thread;
        ASSERT_TRUE(thread.Start(Holder::Run, holder));
        holder->taken.Wait();
        thread.Terminate();
        EXPECT_TRUE(holder->gaveBack);
        EXPECT_TRUE(thread.Wait(0));

        CThread next; // begins under the loader's lock and allocates
        ASSERT_TRUE(next.Start(
            [](void*) { return static_cast<uint32_t>(std::vector<char>(100000).size()); },
            nullptr));
        EXPECT_TRUE(next.Wait(kyv::kInfinite));
    }
}

} // namespace
