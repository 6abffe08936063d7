// Rendering side by side.
#include "host/RenderPool.h"

#include <utility>

namespace kyvhost {

CRenderPool::CRenderPool(std::vector<std::unique_ptr<CStack>> stacks, size_t frameBytes)
    : m_stacks(std::move(stacks)), m_frameBytes(frameBytes) {
    for (const auto& stack : m_stacks) {
        m_queues.push_back(std::make_unique<CQueue<Task>>(size_t{4}));
        m_threads.emplace_back([&queue = *m_queues.back(), &own = *stack] {
            while (std::optional<Task> task = queue.Pop()) {
                (*task)(own);
            }
        });
    }
}

CRenderPool::~CRenderPool() {
    for (const auto& queue : m_queues) {
        queue->Close();
    }
    for (std::thread& thread : m_threads) {
        thread.join();
    }
}

void CRenderPool::Queue(Task task) {
    m_results.push_back(task.get_future());
    m_queues[m_nNext]->Push(std::move(task));
    m_nNext = (m_nNext + 1) % m_queues.size();
}

void CRenderPool::Add(std::vector<FramePtr> inputs, const Moment& moment) {
    Queue(Task([this, inputs = std::move(inputs), moment](CStack& stack) {
        std::vector<const uint8_t*> frames;
        for (const FramePtr& input : inputs) {
            frames.push_back(input->data());
        }
        FramePtr output = m_pPool->Take();
        output->resize(m_frameBytes);
        stack.Render(frames, moment, output->data());
        return output;
    }));
}

void CRenderPool::AddCopy(FramePtr input) {
    Queue(Task([this, input = std::move(input)](CStack&) {
        FramePtr output = m_pPool->Take();
        *output = *input;
        return output;
    }));
}

FramePtr CRenderPool::Take() {
    std::future<FramePtr> result = std::move(m_results.front());
    m_results.pop_front();
    return result.get();
}

} // namespace kyvhost
