// Frames handed from thread to thread.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <mutex>
#include <optional>
#include <vector>

namespace kyvhost {

using Frame = std::vector<uint8_t>; // B, G, R, A or V, U, Y, A; rows without padding

// First in, first out. The frames in circulation are few and fixed, so nothing bounds the length.
class CFrameQueue {
public:
    void Push(Frame&& frame) {
        const std::lock_guard lock(m_mutex);
        m_frames.push_back(std::move(frame));
        m_changed.notify_one();
    }

    // Waits for a frame. None once the queue is closed and empty.
    std::optional<Frame> Pop() {
        std::unique_lock lock(m_mutex);
        m_changed.wait(lock, [this] { return m_bClosed || !m_frames.empty(); });
        if (m_frames.empty()) {
            return std::nullopt;
        }
        std::optional<Frame> frame = std::move(m_frames.front());
        m_frames.pop_front();
        return frame;
    }

    void Close() {
        const std::lock_guard lock(m_mutex);
        m_bClosed = true;
        m_changed.notify_all();
    }

private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::deque<Frame> m_frames;
    bool m_bClosed = false;
};

} // namespace kyvhost
