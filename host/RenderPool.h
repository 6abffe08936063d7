// Frames rendered side by side, each thread with instances of its own, and given back in order.
#pragma once

#include <deque>
#include <functional>
#include <future>
#include <memory>
#include <thread>
#include <vector>

#include "host/FrameQueue.h"
#include "host/Stack.h"

namespace kyvhost {

// What a frame shows is a matter of its inputs, its moment and the parameters alone, so that it is
// the same on every instance.
class CRenderPool {
public:
    // The stacks have begun; there is a thread for each.
    CRenderPool(std::vector<std::unique_ptr<CStack>> stacks, size_t frameBytes);
    ~CRenderPool();

    CRenderPool(const CRenderPool&) = delete;
    CRenderPool& operator=(const CRenderPool&) = delete;

    // A frame to be rendered. Waits while a thread's queue is full.
    void Add(std::vector<FramePtr> inputs, const Moment& moment);

    // A frame that is one of its inputs, in its turn.
    void AddCopy(FramePtr input);

    // Whether as many frames are on their way as memory is meant for.
    bool IsFull() const { return m_results.size() >= 2 * m_threads.size(); }
    bool IsEmpty() const { return m_results.empty(); }

    // The oldest frame, waited for. Throws what its rendering threw.
    FramePtr Take();

private:
    using Task = std::packaged_task<FramePtr(CStack&)>;

    void Queue(Task task);

    std::vector<std::unique_ptr<CStack>> m_stacks;
    size_t m_frameBytes;
    std::shared_ptr<CFramePool> m_pPool = CFramePool::Make();
    std::deque<std::future<FramePtr>> m_results;
    std::vector<std::unique_ptr<CQueue<Task>>> m_queues;
    std::vector<std::thread> m_threads;
    size_t m_nNext = 0; // whose turn it is: moments then never go back on an instance
};

} // namespace kyvhost
