// How far a rendering is, on standard error: a bar on a terminal, a line now and then elsewhere.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <string>

namespace kyvhost {

// "1:05", "2:03:04"
std::string ClockText(double seconds);

class CProgress {
public:
    // total 0: unknown. quiet: nothing is shown.
    CProgress(int64_t total, bool quiet);
    ~CProgress(); // leaves the cursor on a line of its own

    CProgress(const CProgress&) = delete;
    CProgress& operator=(const CProgress&) = delete;

    void Update(int64_t done);

    // The last line: frames, time and rate.
    void Finish(int64_t done);

    // Ends the line where a bar stands on a terminal. From any thread; once for each bar.
    static void CloseLine();

private:
    using Clock = std::chrono::steady_clock;

    double Seconds() const;
    std::string Line(int64_t done) const;

    int64_t m_nTotal;
    bool m_bQuiet;
    bool m_bTerminal;
    Clock::time_point m_start = Clock::now();
    Clock::time_point m_next;

    static inline std::atomic<bool> s_bLineOpen = false; // there is one terminal
};

} // namespace kyvhost
