// The worker pool's rules, one by one, and all together under load.
#include <algorithm>
#include <atomic>
#include <chrono>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "threading/RowBand.h"
#include "threading/ThreadPool.h"

namespace kyv {

// What a pool keeps to itself.
struct ThreadPoolPeek {
    CThreadPool& pool;

    size_t Idle() const { return Count(pool.m_idle); }
    size_t Busy() const { return Count(pool.m_busy); }
    size_t Exited() const { return Count(pool.m_exited); }
    size_t Queued() const { return Count(pool.m_queued); }
    uint32_t Threads() const { return pool.m_nThreads; }
    uint32_t Limit() const { return pool.m_nMaxThreads; }
    void RefuseThreads() const { pool.m_nMaxThreads = 0; }
    ThreadPoolWorker* FirstBusy() const { return &pool.m_busy.front(); }
    ThreadPoolWorker* FirstIdle() const { return &pool.m_idle.front(); }
    ThreadPoolJob& NewestQueued() const { return *pool.m_queued.front(); }

    // A job on the stack is held by the list, a running one by its worker as well.
    bool HasWaiter(uint32_t id) const {
        const CAutoLock lock(pool.m_lock);
        const auto waitedFor = [id](const auto& jobs, long holders) {
            return std::any_of(jobs.begin(), jobs.end(), [=](const auto& job) {
                return job->id == id && job.use_count() > holders;
            });
        };
        return waitedFor(pool.m_queued, 1) || waitedFor(pool.m_running, 2);
    }

    bool LockIsFree() const {
        bool free = false;
        std::thread([&] {
            free = pool.m_lock.TryLock();
            if (free) {
                pool.m_lock.Unlock();
            }
        }).join();
        return free;
    }

private:
    template <class List>
    size_t Count(const List& list) const {
        const CAutoLock lock(pool.m_lock);
        return list.size();
    }
};

} // namespace kyv

namespace {

using namespace kyv;
using testing::ElementsAre;

// A job that says when it has begun, and ends when it is let go, with the result given.
struct Gate {
    CEvent begun;
    CEvent open;
    uint32_t result = 0;
    uint32_t id = 0;

    static uint32_t Run(void* argument) {
        auto* self = static_cast<Gate*>(argument);
        self->begun.Set();
        self->open.Wait();
        return self->result;
    }
    void Start(CThreadPool& pool, int32_t priority = 0) {
        ASSERT_EQ(pool.QueueJob(Run, this, &id, priority), kOk);
        begun.Wait();
    }
    void Finish(CThreadPool& pool) {
        uint32_t got = ~result;
        open.Set();
        ASSERT_EQ(pool.WaitJob(id, kInfinite, &got), kOk);
        ASSERT_EQ(got, result);
    }
};

uint32_t Nothing(void*) {
    return 0;
}

void RunOneJob(CThreadPool& pool, JobFunction function = Nothing, void* argument = nullptr) {
    uint32_t id, result;
    ASSERT_EQ(pool.QueueJob(function, argument, &id), kOk);
    ASSERT_EQ(pool.WaitJob(id, kInfinite, &result), kOk);
}

TEST(ThreadPool, RunsTheNewestQueuedJobFirst) {
    struct Entry {
        std::vector<char>* log;
        char name;
        static uint32_t Run(void* argument) {
            auto* self = static_cast<Entry*>(argument);
            self->log->push_back(self->name);
            return 0;
        }
    };
    std::vector<char> log;
    Entry second = {&log, 'B'}, third = {&log, 'C'};
    uint32_t secondId, thirdId, result;

    CThreadPool pool;
    pool.SetMaxThreads(1);
    Gate first;
    first.Start(pool);
    log.push_back('A');
    EXPECT_EQ(pool.QueueJob(Entry::Run, &second, &secondId), kOk);
    EXPECT_EQ(pool.QueueJob(Entry::Run, &third, &thirdId), kOk);
    first.Finish(pool);
    EXPECT_EQ(pool.WaitJob(secondId, kInfinite, &result), kOk);
    EXPECT_EQ(pool.WaitJob(thirdId, kInfinite, &result), kOk);
    EXPECT_THAT(log, ElementsAre('A', 'C', 'B'));
}

TEST(ThreadPool, StartsAThreadOnlyWhenNoneIsIdleAndTheLimitAllows) {
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    EXPECT_EQ(peek.Limit(), ProcessorCount());
    EXPECT_EQ(peek.Threads(), 0U);
    for (int i = 0; i < 3; ++i) {
        RunOneJob(pool);
        EXPECT_EQ(peek.Threads(), 1U);
        EXPECT_EQ(peek.Idle(), 1U); // before the waiter was woken
    }
    pool.SetMaxThreads(2);
    Gate first, second;
    first.Start(pool);
    second.Start(pool);
    uint32_t queued, result;
    EXPECT_EQ(pool.QueueJob(Nothing, nullptr, &queued), kOk);
    EXPECT_EQ(peek.Threads(), 2U);
    EXPECT_EQ(pool.WaitJob(queued, 0, &result), kWaitTimeout);
    first.Finish(pool);
    EXPECT_EQ(pool.WaitJob(queued, kInfinite, &result), kOk);
    second.Finish(pool);
    EXPECT_EQ(peek.Idle(), 2U);
    EXPECT_EQ(peek.Busy(), 0U);
}

TEST(ThreadPool, WaitJobHandsOutEachResultOnce) {
    CThreadPool pool;
    Gate job;
    job.result = 0x12345678;
    job.Start(pool);
    EXPECT_EQ(job.id, 0U);
    uint32_t result = 5;
    EXPECT_EQ(pool.WaitJob(job.id, 1, &result), kWaitTimeout);
    EXPECT_EQ(pool.WaitJob(job.id + 1, kInfinite, &result), kFail);
    EXPECT_EQ(result, 5U);
    EXPECT_EQ(pool.WaitJob(job.id, kInfinite, nullptr), kNullPointer);
    job.Finish(pool);
    EXPECT_EQ(pool.WaitJob(job.id, kInfinite, &result), kFail);

    uint32_t id = 77;
    EXPECT_EQ(pool.QueueJob(nullptr, nullptr, &id), kInvalidArgument);
    EXPECT_EQ(pool.QueueJob(Nothing, nullptr, nullptr), kInvalidArgument);
    EXPECT_EQ(id, 77U);
    const auto fail = [](void*) -> uint32_t { throw std::runtime_error("job"); };
    EXPECT_EQ(pool.QueueJob(fail, nullptr, &id), kOk);
    EXPECT_EQ(id, 1U); // what was refused took no number
    EXPECT_EQ(pool.WaitJob(id, kInfinite, &result), kOk);
    EXPECT_EQ(result, kFail);
}

TEST(ThreadPool, JobWithoutFunctionReportsTheStatusOfTheOneBefore) {
    CThreadPool pool;
    pool.SetMaxThreads(1);
    Gate first;
    first.result = 42;
    first.Start(pool);
    uint32_t id, result;
    EXPECT_EQ(pool.QueueJob(Nothing, nullptr, &id), kOk);
    ThreadPoolPeek{pool}.NewestQueued().function = nullptr;
    first.Finish(pool);
    EXPECT_EQ(pool.WaitJob(id, kInfinite, &result), kOk);
    EXPECT_EQ(result, 42U);
}

TEST(ThreadPool, WorkerTakesOnThePriorityOfItsJob) {
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    for (const int32_t priority : {0, -1, 0}) { // a new worker's, and an idle one's twice
        Gate job;
        job.Start(pool, priority);
        EXPECT_EQ(peek.FirstBusy()->thread.GetPriority(), priority);
        job.Finish(pool);
    }
    EXPECT_EQ(peek.Threads(), 1U);

    pool.SetMaxThreads(1);
    Gate first, stacked;
    first.Start(pool);
    EXPECT_EQ(pool.QueueJob(Gate::Run, &stacked, &stacked.id, -2), kOk);
    first.Finish(pool);
    stacked.begun.Wait();
    EXPECT_EQ(peek.FirstBusy()->thread.GetPriority(), -2);
    stacked.Finish(pool);
}

TEST(ThreadPool, SetMaxThreadsLiftsAndLowersTheLimit) {
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    EXPECT_EQ(pool.SetMaxThreads(0), kOk);
    std::vector<Gate> jobs(ProcessorCount() + 4);
    for (Gate& job : jobs) {
        job.Start(pool); // comes back only because each has a thread of its own
    }
    const auto all = static_cast<uint32_t>(jobs.size());
    EXPECT_EQ(peek.Threads(), all);
    jobs[0].Finish(pool);
    jobs[1].Finish(pool);

    // Two are idle and leave; of the busy ones all but two leave after their job.
    EXPECT_EQ(pool.SetMaxThreads(2), kOk);
    EXPECT_EQ(peek.Threads(), 2U);
    EXPECT_EQ(peek.Idle(), 0U);
    for (uint32_t i = 2; i < all; ++i) {
        jobs[i].Finish(pool);
    }
    EXPECT_EQ(peek.Idle(), 2U);
    while (peek.Exited() + peek.Idle() < all) {
        SleepMs(1); // the two that were idle leave without a sign
    }
    EXPECT_EQ(pool.SetMaxThreads(4), kOk);
    EXPECT_EQ(peek.Threads(), 2U);
    EXPECT_EQ(peek.Limit(), 4U);
    EXPECT_EQ(pool.ReleaseIdleThreads(), kOk);
    EXPECT_EQ(peek.Threads(), 0U);
    EXPECT_EQ(peek.Exited(), 0U);
    RunOneJob(pool);
    EXPECT_EQ(peek.Threads(), 1U);
}

// A worker that is inside a job and yet idle, as HandOffJob leaves it, takes too long to end.
TEST(ThreadPool, ReleaseIdleThreadsTerminatesOneThatDoesNotEnd) {
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    Gate stuck;
    stuck.Start(pool);
    EXPECT_EQ(pool.HandOffJob(peek.FirstBusy(), 9), kOk);
    uint32_t result;
    EXPECT_EQ(pool.WaitJob(stuck.id, kInfinite, &result), kOk);
    EXPECT_EQ(result, 9U);
    EXPECT_EQ(peek.Idle(), 1U);
    EXPECT_EQ(pool.ReleaseIdleThreads(), kOk);
    EXPECT_EQ(peek.Threads(), 0U);
    EXPECT_EQ(peek.Idle() + peek.Busy() + peek.Exited(), 0U);
    RunOneJob(pool);
}

TEST(ThreadPool, HandOffJobFinishesTheJobAndGivesTheWorkerTheNext) {
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    EXPECT_EQ(pool.HandOffJob(nullptr, 0), kNullPointer);
    pool.SetMaxThreads(1);
    Gate first;
    first.Start(pool);
    uint32_t next, result;
    EXPECT_EQ(pool.QueueJob(Nothing, nullptr, &next, -1), kOk);
    EXPECT_EQ(pool.HandOffJob(peek.FirstBusy(), 3), kOk);
    EXPECT_EQ(peek.FirstBusy()->thread.GetPriority(), -1);
    EXPECT_EQ(pool.WaitJob(first.id, kInfinite, &result), kOk);
    EXPECT_EQ(result, 3U);

    EXPECT_EQ(pool.WaitJob(next, 0, &result), kWaitTimeout); // nobody has run it
}

TEST(ThreadPool, HandOffJobOfAWorkerThatIsNotBusyKeepsTheLock) {
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    RunOneJob(pool);
    EXPECT_TRUE(peek.LockIsFree());
    EXPECT_EQ(pool.HandOffJob(peek.FirstIdle(), 0), kFail);
    EXPECT_FALSE(peek.LockIsFree());
    EXPECT_EQ(pool.SetMaxThreads(1), kOk); // this thread goes on, and may destroy the pool
}

TEST(ThreadPool, RetireWorkerPutsAsideWhatIsBusyOrIdle) {
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    EXPECT_EQ(pool.RetireWorker(nullptr), kNullPointer);
    RunOneJob(pool);
    ThreadPoolWorker* worker = peek.FirstIdle();
    EXPECT_EQ(pool.RetireWorker(worker), kOk);
    EXPECT_EQ(peek.Exited(), 1U);
    EXPECT_EQ(peek.Idle(), 0U);
    EXPECT_EQ(pool.RetireWorker(worker), kFail);
    EXPECT_EQ(peek.Exited(), 1U);
    EXPECT_EQ(pool.ReleaseIdleThreads(), kOk);
    EXPECT_EQ(peek.Exited(), 0U);
}

TEST(ThreadPool, WorkerRetiredInItsJobNeitherReportsNorGivesBackTheLock) {
    Gate job;
    CThreadPool pool;
    const ThreadPoolPeek peek{pool};
    job.Start(pool);
    EXPECT_EQ(pool.RetireWorker(peek.FirstBusy()), kOk);
    EXPECT_TRUE(peek.LockIsFree());
    job.open.Set();
    while (peek.LockIsFree()) {
        SleepMs(1);
    }
}

// Waits for the job on a thread of its own, as a caller that destruction surprises.
struct Waiter {
    Waiter(CThreadPool& pool, uint32_t id)
        : thread([this, &pool, id] { status = pool.WaitJob(id, kInfinite, &result); }) {}
    void Join() { thread.join(); }

    Status status = kOk;
    uint32_t result = 0;
    std::thread thread;
};

TEST(ThreadPool, DestructionCancelsJobsAndEndsThreadsInsideThem) {
    Gate stuck;
    auto pool = std::make_unique<CThreadPool>();
    pool->SetMaxThreads(1);
    stuck.Start(*pool);
    uint32_t queued;
    EXPECT_EQ(pool->QueueJob(Nothing, nullptr, &queued), kOk);
    const ThreadPoolPeek peek{*pool};
    Waiter first(*pool, stuck.id), second(*pool, queued);
    while (!peek.HasWaiter(stuck.id) || !peek.HasWaiter(queued)) {
        SleepMs(1); // one that comes too late would use a dead pool
    }
    pool.reset();
    first.Join();
    second.Join();
    EXPECT_EQ(first.status, kAborted);
    EXPECT_EQ(first.result, kAborted);
    EXPECT_EQ(second.status, kAborted);
}

TEST(ThreadPool, DestructionGivesEveryUncollectedJob100Ms) {
    auto pool = std::make_unique<CThreadPool>();
    uint32_t ids[3];
    for (uint32_t& id : ids) {
        EXPECT_EQ(pool->QueueJob(Nothing, nullptr, &id), kOk);
    }
    uint32_t result;
    EXPECT_EQ(pool->WaitJob(ids[0], kInfinite, &result), kOk);
    const ThreadPoolPeek peek{*pool};
    while (peek.Queued() + peek.Busy() > 0) {
        SleepMs(1); // the other two are done then, and not collected
    }
    const auto start = std::chrono::steady_clock::now();
    pool.reset();
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(200));
}

// A thread that ends by itself destroys its own variables; a terminated one does not everywhere.
TEST(ThreadPool, DestructionLetsIdleThreadsEndByThemselves) {
    static std::atomic<int> ended = 0;
    struct Mark {
        ~Mark() { ++ended; }
    };
    {
        CThreadPool pool;
        RunOneJob(pool, [](void*) -> uint32_t {
            thread_local Mark mark;
            return reinterpret_cast<uintptr_t>(&mark) == 0;
        });
        EXPECT_EQ(ended, 0);
    }
    EXPECT_EQ(ended, 1);
}

// One that is not told to leave costs its second every time, however fast the machine; one that is
// told may be late on a busy one, but hardly three times.
TEST(ThreadPool, DestructionDoesNotWaitForIdleThreadsToBeLate) {
    using std::chrono::steady_clock;
    constexpr size_t kThreads = 6;
    steady_clock::duration fastest = steady_clock::duration::max();
    for (int attempt = 0; attempt < 3 && fastest > std::chrono::seconds(kThreads) / 2; ++attempt) {
        auto pool = std::make_unique<CThreadPool>();
        pool->SetMaxThreads(kThreads);
        std::vector<Gate> jobs(kThreads);
        for (Gate& job : jobs) {
            job.Start(*pool);
        }
        for (Gate& job : jobs) {
            job.Finish(*pool);
        }
        ASSERT_EQ(ThreadPoolPeek{*pool}.Idle(), kThreads);
        const auto start = steady_clock::now();
        pool.reset();
        fastest = std::min(fastest, steady_clock::now() - start);
    }
    EXPECT_LT(fastest, std::chrono::seconds(kThreads) / 2);
}

// Whatever the job was doing, the process goes on: the allocator's locks are free, threads start.
class TerminatedJob : public testing::TestWithParam<int> {};

std::atomic<bool> g_begun;

uint32_t Spin(void*) {
    static std::atomic<uint32_t> counter;
    for (g_begun = true;;) {
        ++counter;
        SleepMs(0);
    }
}

uint32_t Allocate(void*) {
    for (g_begun = true;;) {
        std::vector<std::unique_ptr<char[]>> blocks;
        for (size_t i = 0; i < 64; ++i) {
            blocks.emplace_back(new char[i * 37 + 1]);
        }
    }
}

uint32_t WaitForever(void*) {
    static CEvent never;
    for (g_begun = true;;) {
        never.Wait();
    }
}

INSTANTIATE_TEST_SUITE_P(EveryPlace, TerminatedJob, testing::Range(0, 3));

TEST_P(TerminatedJob, LeavesTheProcessUsable) {
    constexpr JobFunction kJobs[] = {Spin, WaitForever, Allocate};
    if (KYV_OWN_ALLOCATOR && kJobs[GetParam()] == Allocate) {
        GTEST_SKIP() << "the sanitizer's allocator is part of the program and counts as its code";
    }
    for (int round = 0; round < 3; ++round) {
        g_begun = false;
        auto pool = std::make_unique<CThreadPool>();
        uint32_t id;
        ASSERT_EQ(pool->QueueJob(kJobs[GetParam()], nullptr, &id), kOk);
        while (!g_begun) {
            SleepMs(1);
        }
        pool.reset();
        CThreadPool next;
        for (int i = 0; i < 100; ++i) {
            std::vector<char> block(static_cast<size_t>(i) * 1000);
            RunOneJob(next);
        }
    }
}

// Several owners on one pool while its limit moves and its idle threads are released: every job
// runs once and its own result comes back.
TEST(ThreadPool, RunsEveryJobOfManyOwnersOnceUnderLoad) {
    constexpr uint32_t kOwners = 4;
    constexpr uint32_t kBatch = 8;
    constexpr uint32_t kBatches = KYV_STRESS_JOBS / (kOwners * kBatch) + 1;
    struct Item {
        std::atomic<uint32_t> runs = 0;
        uint32_t value = 0;
        static uint32_t Run(void* argument) {
            auto* self = static_cast<Item*>(argument);
            ++self->runs;
            return self->value * 3;
        }
    };
    CThreadPool pool;
    std::atomic<uint32_t> wrong = 0;
    std::atomic<uint32_t> working = kOwners;
    std::vector<std::thread> owners;
    for (uint32_t owner = 0; owner < kOwners; ++owner) {
        owners.emplace_back([&, owner] {
            for (uint32_t batch = 0; batch < kBatches; ++batch) {
                Item items[kBatch];
                uint32_t ids[kBatch];
                for (uint32_t i = 0; i < kBatch; ++i) {
                    items[i].value = (owner * kBatches + batch) * kBatch + i;
                    wrong += pool.QueueJob(Item::Run, &items[i], &ids[i]) != kOk;
                }
                for (uint32_t i = 0; i < kBatch; ++i) {
                    uint32_t result = 0;
                    wrong += pool.WaitJob(ids[i], kInfinite, &result) != kOk ||
                             result != items[i].value * 3 || items[i].runs != 1;
                }
            }
            --working;
        });
    }
    for (uint32_t round = 0; working > 0; ++round) {
        pool.SetMaxThreads(1 + round % 5);
        if (round % 4 == 0) {
            pool.ReleaseIdleThreads();
        }
        SleepMs(1);
    }
    for (std::thread& owner : owners) {
        owner.join();
    }
    EXPECT_EQ(wrong, 0U);
    const ThreadPoolPeek peek{pool};
    EXPECT_EQ(pool.ReleaseIdleThreads(), kOk);
    while (peek.Busy() > 0) {
        SleepMs(1);
    }
    EXPECT_EQ(pool.ReleaseIdleThreads(), kOk);
    EXPECT_EQ(peek.Threads(), 0U);
    EXPECT_EQ(peek.Exited(), 0U);
}

// Were it to leave by what a band throws, other bands might still be at work on what it frees.
TEST(ThreadPool, BandsThatThePoolRefusesMayThrow) {
    CThreadPool pool;
    ThreadPoolPeek{pool}.RefuseThreads();
    int bands = 0;
    const JobFunction count = [](void* argument) -> uint32_t {
        ++*static_cast<int*>(static_cast<const RowBand*>(argument)->owner);
        throw std::runtime_error("a band");
    };
    EXPECT_NO_THROW(RunRowBands(pool, 3, 9, count, &bands));
    EXPECT_EQ(bands, 3);
}

} // namespace
