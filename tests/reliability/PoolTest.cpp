// The worker pool under owners that do all they may, in any order and number.
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <stdexcept>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "tests/platform/ProcessUse.h"
#include "tests/support/Scenes.h"
#include "threading/ThreadPool.h"

namespace {

using namespace kyv;
using kyvtest::Random;

constexpr uint32_t kForever = 0xFFFFFFFF;

struct Job {
    std::atomic<uint32_t> runs = 0;
    uint32_t kind = 0;
    uint32_t expected = 0;
    uint32_t id = 0;
};

uint32_t Work(void* argument) {
    Job& job = *static_cast<Job*>(argument);
    ++job.runs;
    switch (job.kind) {
    case 0:
        std::this_thread::sleep_for(std::chrono::microseconds(100));
        break;
    case 1:
        throw std::runtime_error("a job may");
    default:
        break;
    }
    return job.expected;
}

uint32_t Nothing(void*) {
    return 0;
}

// Until its thread is ended.
uint32_t Stay(void*) {
    for (;;) {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
}

// Queues, waits and changes limits at random. Every job runs once and gives its own result. In the
// end everything is collected, or the pool is destroyed with jobs in all states: running for ever,
// waiting for a thread, finished.
void LiveOnce(Random& random) {
    std::vector<Job> jobs(400);
    std::vector<Job*> open;
    CThreadPool pool; // goes before its jobs do
    const auto collect = [&](size_t which, uint32_t timeoutMs) {
        Job& job = *open[which];
        uint32_t result = ~job.expected;
        const Status status = pool.WaitJob(job.id, timeoutMs, &result);
        if (status == kWaitTimeout && timeoutMs != kForever) {
            return;
        }
        ASSERT_EQ(status, kOk);
        ASSERT_EQ(result, job.expected);
        ASSERT_EQ(job.runs, 1U);
        ASSERT_EQ(pool.WaitJob(job.id, 0, &result), kFail) << "collected twice";
        open.erase(open.begin() + static_cast<ptrdiff_t>(which));
    };
    for (Job& job : jobs) {
        job.kind = static_cast<uint32_t>(random() % 64);
        job.expected =
            job.kind == 1 ? static_cast<uint32_t>(kFail) : static_cast<uint32_t>(random());
        ASSERT_EQ(pool.QueueJob(Work, &job, &job.id), kOk);
        open.push_back(&job);
        switch (random() % 16) {
        case 0:
            ASSERT_EQ(pool.SetMaxThreads(static_cast<uint32_t>(random() % 6)), kOk);
            break;
        case 1:
        case 2:
        case 3:
            collect(random() % open.size(), static_cast<uint32_t>(random() % 2));
            break;
        case 4:
            while (!open.empty() && !testing::Test::HasFatalFailure()) {
                collect(random() % open.size(), kForever);
            }
            break;
        default:
            break;
        }
        if (random() % 512 == 0) {
            ASSERT_EQ(pool.ReleaseIdleThreads(), kOk);
        }
        if (testing::Test::HasFatalFailure()) {
            return;
        }
    }
    while (!open.empty() && !testing::Test::HasFatalFailure()) {
        collect(random() % open.size(), kForever);
    }
    if (random() % 16 == 0) {
        ASSERT_EQ(pool.SetMaxThreads(2), kOk);
        for (uint32_t i = 0; i < 3; ++i) {
            uint32_t id;
            ASSERT_EQ(pool.QueueJob(i == 0 ? Nothing : Stay, nullptr, &id), kOk);
        }
    }
}

TEST(Pool, ServesAnyOwnerAndGivesItsThreadsBack) {
    Random first(0);
    LiveOnce(first); // a sanitizer starts a thread of its own with the first
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
    const int64_t before = kyvtest::GetProcessUse().threads;
    // In a long run 5 million jobs.
    for (const uint32_t seed : kyvtest::Seeds(KYV_POOL_LIVES, 12500)) {
        Random random(seed);
        LiveOnce(random);
        ASSERT_FALSE(HasFatalFailure()) << "run " << seed;
        ASSERT_TRUE(kyvtest::ThreadsComeDownTo(before)) << "run " << seed;
    }
}

} // namespace
