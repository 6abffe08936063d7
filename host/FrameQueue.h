// Frames, and their way from thread to thread.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

namespace kyvhost {

using Frame = std::vector<uint8_t>;      // B, G, R, A or V, U, Y, A; rows without padding
using FramePtr = std::shared_ptr<Frame>; // several renderings may read one input

// Gives frames, and takes them back when their last user lets go, so that memory is touched anew as
// seldom as can be. Frames keep the pool alive.
class CFramePool : public std::enable_shared_from_this<CFramePool> {
public:
    static std::shared_ptr<CFramePool> Make() { return std::make_shared<CFramePool>(); }

    // A frame of unknown content and size.
    FramePtr Take() {
        std::unique_ptr<Frame> frame;
        {
            const std::lock_guard lock(m_mutex);
            if (!m_free.empty()) {
                frame = std::move(m_free.back());
                m_free.pop_back();
            }
        }
        if (!frame) {
            frame = std::make_unique<Frame>();
        }
        return FramePtr(frame.release(), [pool = shared_from_this()](Frame* done) {
            std::unique_ptr<Frame> back(done);
            const std::lock_guard lock(pool->m_mutex);
            pool->m_free.push_back(std::move(back));
        });
    }

private:
    std::mutex m_mutex;
    std::vector<std::unique_ptr<Frame>> m_free;
};

// First in, first out. Push waits while the queue is full.
template <class T>
class CQueue {
public:
    explicit CQueue(size_t most) : m_nMost(most) {}

    // False when the queue has been closed: the item is dropped.
    bool Push(T&& item) {
        std::unique_lock lock(m_mutex);
        m_changed.wait(lock, [this] { return m_bClosed || m_items.size() < m_nMost; });
        if (m_bClosed) {
            return false;
        }
        m_items.push_back(std::move(item));
        m_changed.notify_all();
        return true;
    }

    // Waits for an item. None once the queue is closed and empty.
    std::optional<T> Pop() {
        std::unique_lock lock(m_mutex);
        m_changed.wait(lock, [this] { return m_bClosed || !m_items.empty(); });
        if (m_items.empty()) {
            return std::nullopt;
        }
        std::optional<T> item = std::move(m_items.front());
        m_items.pop_front();
        m_changed.notify_all();
        return item;
    }

    void Close() {
        const std::lock_guard lock(m_mutex);
        m_bClosed = true;
        m_changed.notify_all();
    }

private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::deque<T> m_items;
    size_t m_nMost;
    bool m_bClosed = false;
};

} // namespace kyvhost
