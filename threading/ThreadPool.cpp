// The pool. List nodes are only ever moved, so nothing that workers do under the lock can fail.
#include "threading/ThreadPool.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace kyv {
namespace {

constexpr uint32_t kCancelled = 0x8FFFFFFF; // the result of a job that destruction took away
constexpr uint32_t kCancelGraceMs = 100;
constexpr uint32_t kExitGraceMs = 1000;

template <class List>
void MoveFront(List& to, List& from) {
    to.splice(to.begin(), from, from.begin());
}

// Moves the worker to the head of the other list if it is on the first.
bool MoveWorker(std::list<ThreadPoolWorker>& to, std::list<ThreadPoolWorker>& from,
                const ThreadPoolWorker& worker) {
    const auto found = std::find_if(from.begin(), from.end(),
                                    [&](const auto& other) { return &other == &worker; });
    if (found == from.end()) {
        return false;
    }
    to.splice(to.begin(), from, found);
    return true;
}

auto FindJob(std::list<std::shared_ptr<ThreadPoolJob>>& jobs, uint32_t id) {
    return std::find_if(jobs.begin(), jobs.end(), [&](const auto& job) { return job->id == id; });
}

void Finish(ThreadPoolJob& job, uint32_t result) {
    job.result = result;
    job.done.Set();
}

uint32_t Run(const ThreadPoolJob& job) {
    try {
        return job.function(job.argument);
    } catch (...) {
        return kFail;
    }
}

} // namespace

CThreadPool::CThreadPool() : m_nMaxThreads(ProcessorCount()) {}

CThreadPool::~CThreadPool() {
    m_bShuttingDown = true;
    if (ThreadPoolWorker* keeper = m_pLockKeeper) {
        keeper->wake.Set(); // it gives the lock back on its way out
    }
    m_lock.Lock();
    for (const auto& job : m_running) {
        Finish(*job, kCancelled);
        SleepMs(kCancelGraceMs);
    }
    m_running.clear();
    for (const auto& job : m_queued) {
        Finish(*job, kCancelled);
    }
    m_queued.clear();
    for (ThreadPoolWorker& worker : m_busy) {
        worker.thread.Terminate();
    }
    m_busy.clear();
    StopWorkers(m_idle);
    StopWorkers(m_exited);
    for (uint32_t hold = 0; hold <= m_nLeftLocked; ++hold) {
        m_lock.Unlock();
    }
}

// With the shutting-down flag set. Exited threads have ended already, unless they were retired.
void CThreadPool::StopWorkers(WorkerList& workers) {
    for (ThreadPoolWorker& worker : workers) {
        worker.wake.Set();
        if (!worker.thread.Wait(kExitGraceMs)) {
            worker.thread.Terminate();
        }
    }
    workers.clear();
}

Status CThreadPool::QueueJob(JobFunction function, void* argument, uint32_t* id,
                             int32_t priority) noexcept {
    if (!function || !id) {
        return kInvalidArgument;
    }
    try {
        JobList created;
        created.push_front(std::make_shared<ThreadPoolJob>());
        ThreadPoolJob& job = *created.front();
        job.function = function;
        job.argument = argument;
        job.priority = priority;

        const CAutoLock lock(m_lock);
        job.id = m_nNextJobId++;
        *id = job.id;
        if (!m_idle.empty()) {
            MoveFront(m_busy, m_idle);
        } else if (m_nThreads >= m_nMaxThreads || !AddWorker()) {
            if (m_nThreads == 0) {
                return kOutOfMemory; // nobody would ever run it
            }
            MoveFront(m_queued, created);
            return kOk;
        }
        GiveJob(m_busy.front(), created);
        m_busy.front().wake.Set();
        return kOk;
    } catch (...) {
        return kOutOfMemory;
    }
}

// Puts a new worker at the head of the busy list.
bool CThreadPool::AddWorker() {
    try {
        WorkerList created;
        ThreadPoolWorker& worker = created.emplace_front();
        worker.pool = this;
        if (!worker.thread.Start(WorkerThreadProc, &worker)) {
            return false;
        }
        ++m_nThreads;
        MoveFront(m_busy, created);
        return true;
    } catch (...) {
        return false;
    }
}

// Makes the head of a list the worker's job.
void CThreadPool::GiveJob(ThreadPoolWorker& worker, JobList& from) {
    worker.job = from.front();
    MoveFront(m_running, from);
    worker.thread.SetPriority(worker.job->priority);
}

Status CThreadPool::WaitJob(uint32_t id, uint32_t timeoutMs, uint32_t* result) noexcept {
    if (!result) {
        return kNullPointer;
    }
    std::shared_ptr<ThreadPoolJob> job;
    {
        const CAutoLock lock(m_lock);
        if (const auto running = FindJob(m_running, id); running != m_running.end()) {
            job = *running;
        } else if (const auto queued = FindJob(m_queued, id); queued != m_queued.end()) {
            job = *queued;
        } else {
            return kFail;
        }
    }
    if (!job->done.Wait(timeoutMs)) {
        return kWaitTimeout;
    }
    *result = job->result;
    if (*result == kCancelled) {
        *result = kAborted; // the pool may be gone already
        return kAborted;
    }
    const CAutoLock lock(m_lock);
    m_running.remove(job);
    return kOk;
}

// The worker ends by itself; nobody gives it a job any more.
void CThreadPool::TellToQuit(ThreadPoolWorker& worker) {
    worker.job = nullptr;
    worker.quit = true;
    worker.thread.SetPriority(0);
    worker.wake.Set();
}

Status CThreadPool::SetMaxThreads(uint32_t limit) noexcept {
    if (limit == 0) {
        limit = std::numeric_limits<uint32_t>::max();
    }
    const CAutoLock lock(m_lock);
    while (m_nThreads > limit && !m_idle.empty()) {
        MoveFront(m_busy, m_idle);
        TellToQuit(m_busy.front());
        --m_nThreads;
    }
    for (ThreadPoolWorker& worker : m_busy) {
        // One that is leaving already was counted when it was told to.
        if (m_nThreads > limit && !worker.quit.exchange(true)) {
            --m_nThreads;
        }
    }
    m_nMaxThreads = limit;
    return kOk;
}

Status CThreadPool::ReleaseIdleThreads() noexcept {
    const CAutoLock lock(m_lock);
    WorkerList leaving; // the one that is waited for; no other call can reach it
    while (!m_idle.empty()) {
        MoveFront(leaving, m_idle);
        ThreadPoolWorker& worker = leaving.front();
        TellToQuit(worker);
        m_lock.Unlock();
        const bool ended = worker.thread.Wait(kExitGraceMs);
        m_lock.Lock();
        if (!ended) {
            worker.thread.Terminate();
        }
        leaving.clear();
        --m_nThreads;
        // While it was leaving it still counted, so a job may have been put on the stack with no
        // thread left to take it.
        if (!m_queued.empty() && m_nThreads < m_nMaxThreads && AddWorker()) {
            GiveJob(m_busy.front(), m_queued);
            m_busy.front().wake.Set();
        }
    }
    // A worker that was retired alive is told to quit as well, but not terminated: it may be in the
    // middle of a job, and stays for the next time.
    WorkerList exited;
    exited.swap(m_exited);
    while (!exited.empty()) {
        MoveFront(leaving, exited);
        ThreadPoolWorker& worker = leaving.front();
        worker.quit = true;
        worker.wake.Set();
        m_lock.Unlock();
        const bool ended = worker.thread.Wait(kExitGraceMs);
        m_lock.Lock();
        if (!ended) {
            MoveFront(m_exited, leaving);
        }
        leaving.clear();
    }
    return kOk;
}

bool CThreadPool::Retire(const ThreadPoolWorker& worker) {
    return MoveWorker(m_exited, m_busy, worker) || MoveWorker(m_exited, m_idle, worker);
}

Status CThreadPool::RetireWorker(ThreadPoolWorker* worker) noexcept {
    if (!worker) {
        return kNullPointer;
    }
    const CAutoLock lock(m_lock);
    return Retire(*worker) ? kOk : kFail;
}

Status CThreadPool::HandOffJob(ThreadPoolWorker* worker, uint32_t result) noexcept {
    if (!worker) {
        return kNullPointer;
    }
    m_lock.Lock();
    const std::shared_ptr<ThreadPoolJob> previous = worker->job;
    if (!m_queued.empty()) {
        GiveJob(*worker, m_queued);
        worker->wake.Set();
    } else if (MoveWorker(m_idle, m_busy, *worker)) {
        worker->job = nullptr;
    } else {
        ++m_nLeftLocked;
        return kFail;
    }
    if (previous) {
        Finish(*previous, result);
    }
    m_lock.Unlock();
    return kOk;
}

uint32_t CThreadPool::WorkerThreadProc(void* argument) noexcept {
    if (!argument) {
        return kNullPointer;
    }
    ThreadPoolWorker& self = *static_cast<ThreadPoolWorker*>(argument);
    CThreadPool& pool = *self.pool;
    uint32_t status = kFail; // a job without a function reports the status of the one before
    uint32_t keptLocks = 0;
    for (;;) {
        self.state = WorkerState::Waiting;
        self.wake.Wait();
        if (pool.m_bShuttingDown) {
            for (; keptLocks > 0; --keptLocks) {
                pool.m_lock.Unlock();
            }
            self.state = WorkerState::Finished;
            return kOk;
        }
        self.state = WorkerState::Running;
        if (self.job && self.job->function) {
            status = Run(*self.job);
        }
        // Under the lock, or a worker told to quit just now would become idle and be counted out
        // twice.
        pool.m_lock.Lock();
        if (self.quit) {
            pool.Retire(self); // finds nothing when ReleaseIdleThreads has taken the worker
            pool.m_lock.Unlock();
            if (self.job) {
                Finish(*self.job, status);
            }
            self.state = WorkerState::Finished;
            return kOk;
        }
        std::shared_ptr<ThreadPoolJob> finished = std::move(self.job);
        if (!pool.m_queued.empty()) {
            pool.GiveJob(self, pool.m_queued);
            self.wake.Set();
        } else if (!MoveWorker(pool.m_idle, pool.m_busy, self)) {
            // Retired in the middle of the job: the job stays unreported and the lock taken.
            ++keptLocks;
            pool.m_pLockKeeper = &self;
            if (pool.m_bShuttingDown) {
                self.wake.Set(); // destruction may have looked for a keeper just before
            }
            continue;
        }
        if (finished) {
            Finish(*finished, status);
            finished.reset(); // not the last one: while the lock is taken nobody collects it
        }
        pool.m_lock.Unlock();
    }
}

} // namespace kyv
