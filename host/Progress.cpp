// Progress on standard error.
#include "host/Progress.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "platform/Console.h"

namespace kyvhost {
namespace {

using namespace std::chrono_literals;

constexpr auto kTerminalStep = 100ms;
constexpr auto kLineStep = 5s;
constexpr int kBarWidth = 30;

std::string Decimal(double number) {
    char text[32];
    std::snprintf(text, sizeof text, "%.1f", number);
    return text;
}

} // namespace

std::string ClockText(double seconds) {
    const auto whole = static_cast<long long>(std::ceil(std::clamp(seconds, 0.0, 1e9)));
    char text[32];
    if (whole >= 3600) {
        std::snprintf(text, sizeof text, "%lld:%02lld:%02lld", whole / 3600, whole / 60 % 60,
                      whole % 60);
    } else {
        std::snprintf(text, sizeof text, "%lld:%02lld", whole / 60, whole % 60);
    }
    return text;
}

CProgress::CProgress(int64_t total, bool quiet)
    : m_nTotal(total), m_bQuiet(quiet), m_bTerminal(kyv::ErrorIsTerminal()) {
    m_next = m_start + (m_bTerminal ? Clock::duration(kTerminalStep) : kLineStep);
}

CProgress::~CProgress() {
    CloseLine();
}

void CProgress::CloseLine() {
    if (s_bLineOpen.exchange(false)) {
        std::fputc('\n', stderr);
    }
}

double CProgress::Seconds() const {
    return std::max(std::chrono::duration<double>(Clock::now() - m_start).count(), 1e-6);
}

std::string CProgress::Line(int64_t done) const {
    const double rate = static_cast<double>(done) / Seconds();
    std::string line;
    if (m_nTotal > 0) {
        // The total is an estimate; more frames may come than it says.
        const int64_t total = std::max(m_nTotal, done);
        const auto filled = static_cast<int>(done * kBarWidth / total);
        line += "[" + std::string(filled, '#') + std::string(kBarWidth - filled, '.') + "] ";
        line += std::to_string(done * 100 / total) + "% " + std::to_string(done) + "/" +
                std::to_string(total);
    } else {
        line += std::to_string(done);
    }
    line += " frames, " + Decimal(rate) + " frames/s";
    if (m_nTotal > done && done > 0) {
        line += ", " + ClockText(static_cast<double>(m_nTotal - done) / rate) + " left";
    }
    return line;
}

void CProgress::Update(int64_t done) {
    if (m_bQuiet || Clock::now() < m_next) {
        return;
    }
    m_next = Clock::now() + (m_bTerminal ? Clock::duration(kTerminalStep) : kLineStep);
    if (m_bTerminal) {
        std::fprintf(stderr, "\r%s\033[K", Line(done).c_str());
        s_bLineOpen = true;
    } else {
        std::fprintf(stderr, "%s\n", Line(done).c_str());
    }
}

void CProgress::Finish(int64_t done) {
    if (m_bQuiet) {
        return;
    }
    std::fprintf(stderr, "%s%lld frames in %s s, %s frames/s%s\n", s_bLineOpen ? "\r" : "",
                 static_cast<long long>(done), Decimal(Seconds()).c_str(),
                 Decimal(static_cast<double>(done) / Seconds()).c_str(),
                 s_bLineOpen ? "\033[K" : "");
    s_bLineOpen = false;
}

} // namespace kyvhost
