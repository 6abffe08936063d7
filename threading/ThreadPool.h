// Worker threads for the pieces of one frame.
//
// The owner queues jobs and waits for each; up to SetMaxThreads threads, one a processor unless
// told otherwise, run them. Threads are started only when a job finds no idle one. While all are
// busy, jobs wait on a stack: the one queued last runs first.
#pragma once

#include <atomic>
#include <cstdint>
#include <list>
#include <memory>

#include "platform/Status.h"
#include "platform/Threads.h"

namespace kyv {

class CThreadPool;

// Gets the argument that the job was queued with; its status, 0 for success, becomes the job's
// result. It runs without the pool's lock. What it throws becomes the status kFail.
using JobFunction = uint32_t (*)(void* argument);

// A job is on one of the pool's lists until WaitJob collects it. A waiter and the worker that holds
// the job share it, so that neither destruction nor a slow wake-up leaves them with a dead one.
struct ThreadPoolJob {
    uint32_t id;
    CEvent done;
    std::atomic<uint32_t> result = 0; // set just before the event
    JobFunction function;
    void* argument;
    int32_t priority;
};

enum class WorkerState : uint32_t {
    Finished = 0,
    Waiting = 1, // for the wake event
    Running = 2,
};

struct ThreadPoolWorker {
    CThreadPool* pool;
    CThread thread;
    CEvent wake;
    std::atomic<WorkerState> state = WorkerState::Finished;
    std::shared_ptr<ThreadPoolJob> job; // or null
    std::atomic<bool> quit = false;     // leave after the current job
};

// The owner's thread queues and waits; any thread may. All operations but the destructor return a
// status, and none throws.
class CThreadPool {
public:
    // Starts no thread.
    CThreadPool();

    // Ends every thread, in the middle of its job if need be, and cancels every job: those that
    // wait for one get kAborted. Jobs that were given to a worker and not collected cost 100 ms
    // each, for their waiters to notice; a thread that is idle has 1000 ms to end by itself. No
    // other call may be under way except a WaitJob that is waiting.
    ~CThreadPool();

    CThreadPool(const CThreadPool&) = delete;
    CThreadPool& operator=(const CThreadPool&) = delete;

    // Gives the job to an idle worker, or to a new one while there are fewer than the limit, or
    // leaves it on the stack. *id names it for WaitJob, which must be called once for every job.
    // The worker takes on the priority, a Win32 thread priority (0 is normal), for this job.
    // kInvalidArgument for a null function or id; kOutOfMemory, and nothing queued, when there is
    // no memory or no thread to be had. A new thread that fails is no error while others exist.
    Status QueueJob(JobFunction function, void* argument, uint32_t* id,
                    int32_t priority = 0) noexcept;

    // Waits for a job, hands out its result and forgets it. kNullPointer for a null result; kFail
    // for an id that was never queued or has been collected; kWaitTimeout, and the job stays;
    // kAborted, in *result too, when the pool was destroyed meanwhile.
    Status WaitJob(uint32_t id, uint32_t timeoutMs, uint32_t* result) noexcept;

    // 0 lifts the limit. Threads beyond a lowered limit leave, idle ones first, busy ones after
    // their job.
    Status SetMaxThreads(uint32_t limit) noexcept;

    // Ends the idle threads, waiting up to 1000 ms for each and terminating one that takes longer,
    // and frees what is left of those that ended before.
    Status ReleaseIdleThreads() noexcept;

    // Moves a worker to the exited ones, to be freed with them. kNullPointer for null; kFail for
    // one that is neither busy nor idle. Beware: a worker that is retired in the middle of a job,
    // and not told to quit, neither reports this job nor gives back the pool's lock after it. From
    // then on the pool can only be destroyed.
    Status RetireWorker(ThreadPoolWorker* worker) noexcept;

    // Finishes a worker's job with a result and gives it the next one from the stack, or makes it
    // idle. kNullPointer for null. When there is no job left and the worker is not busy: kFail,
    // and the calling thread keeps the pool's lock, so that it alone can use and destroy the pool.
    Status HandOffJob(ThreadPoolWorker* worker, uint32_t result) noexcept;

private:
    friend struct ThreadPoolPeek; // of the tests

    using JobList = std::list<std::shared_ptr<ThreadPoolJob>>;
    using WorkerList = std::list<ThreadPoolWorker>;

    static uint32_t WorkerThreadProc(void* argument) noexcept;

    bool AddWorker();
    void GiveJob(ThreadPoolWorker& worker, JobList& from);
    bool Retire(const ThreadPoolWorker& worker);
    static void TellToQuit(ThreadPoolWorker& worker);
    static void StopWorkers(WorkerList& workers);

    CLock m_lock; // guards what follows; the flags that are read without it are atomic
    std::atomic<bool> m_bShuttingDown = false;
    WorkerList m_idle;
    WorkerList m_busy;
    WorkerList m_exited; // the thread has left its loop, or was retired
    JobList m_running;   // given to a worker and not collected, finished or not
    JobList m_queued;
    uint32_t m_nNextJobId = 0;
    uint32_t m_nThreads = 0; // created and not yet retired
    uint32_t m_nMaxThreads;
    uint32_t m_nLeftLocked = 0; // holds of the lock that HandOffJob has left to its caller
    std::atomic<ThreadPoolWorker*> m_pLockKeeper = nullptr; // sleeps with the lock; RetireWorker
};

} // namespace kyv
