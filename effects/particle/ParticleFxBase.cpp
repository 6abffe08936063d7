// Stepping, spawning and fades.
#include "effects/particle/ParticleFxBase.h"

#include <algorithm>

namespace kyv {
namespace {

constexpr int32_t kLongestFadeMs = 2000;

} // namespace

void CParticleFxBase::SetDuration(int32_t durationMs) {
    if (durationMs != m_nDurationMs) {
        ClearSnapshots();
    }
    m_nDurationMs = durationMs;
    m_nFadeMs = std::min(durationMs / 4, kLongestFadeMs);
}

// False beyond the clip's end. Within a fade the scale of 256 never gives more than 255. Without a
// duration both alphas stay as they were.
bool CParticleFxBase::UpdateFades(int32_t timeMs) {
    if (m_nDurationMs <= 0) {
        return true;
    }
    if (timeMs > m_nDurationMs) {
        m_nFadeOutAlpha = 0;
        return false;
    }
    const int32_t leftMs = m_nDurationMs - timeMs;
    m_nFadeOutAlpha = static_cast<uint8_t>(leftMs < m_nFadeMs ? leftMs * 256 / m_nFadeMs : 255);
    m_nFadeInAlpha = static_cast<uint8_t>(timeMs < m_nFadeMs ? timeMs * 256 / m_nFadeMs : 255);
    return true;
}

// Makes the state that the fewest steps lead from to the state after lastStep.
CParticleFxBase::Start CParticleFxBase::ChooseStart(int64_t lastStep) {
    const int64_t lifeSteps = int64_t{m_nLongestLifeMs} / kStepMs + 2;
    const int64_t fresh = std::max<int64_t>(lastStep + 1 - lifeSteps, 0);
    const int64_t live = m_nNextStep <= lastStep + 1 ? m_nNextStep : kNoLiveState;
    const auto index = static_cast<int32_t>(lastStep / kStepsPerSnapshot);
    const int64_t saved = int64_t{FindSnapshot(index)} * kStepsPerSnapshot;
    if (live >= std::max(saved, fresh)) {
        return {live, true};
    }
    if (saved >= fresh) {
        RestoreSnapshot(index, kStepsPerSnapshot);
        return {saved, true};
    }
    ResetParticles();
    m_clock = ClockAfter(fresh - 1);
    return {fresh, fresh == 0};
}

// The clock as steps from 0 would have left it; step -1 is the time before all steps.
CParticleFxBase::Clock CParticleFxBase::ClockAfter(int64_t step) const {
    const int64_t time = step * kStepMs;
    if (time <= 0) {
        return {};
    }
    const int64_t interval = m_nEmitIntervalMs;
    const int64_t emit = interval > 0 ? (time - 1) / interval * interval : 0;
    return {static_cast<int32_t>(emit), static_cast<int32_t>(time)};
}

void CParticleFxBase::RunStep(int64_t step) {
    const auto time = static_cast<int32_t>(step * kStepMs);
    const int32_t delta = time - m_clock.lastStepMs;
    m_random.Seed(StepSeed(step));
    Emit(time, delta);
    UpdateParticles(time, delta);
    RetireParticles();
    m_clock.lastStepMs = time;
}

void CParticleFxBase::AdvanceTo(int32_t timeMs) {
    const int32_t time = std::max(timeMs, 0);
    if (!UpdateFades(time)) {
        return;
    }
    const int64_t lastStep = time / kStepMs;
    const Start start = ChooseStart(lastStep);
    ForgetLiveState(); // until it is whole again, should an allocation fail
    for (int64_t step = start.step; step <= lastStep; ++step) {
        const auto index = static_cast<int32_t>(step / kStepsPerSnapshot);
        if (start.isComplete && step % kStepsPerSnapshot == 0 && FindSnapshot(index) != index) {
            SaveSnapshot(index);
        }
        RunStep(step);
    }
    m_nNextStep = lastStep + 1;
}

void CParticleFxBase::Emit(int32_t timeMs, int32_t) {
    const int64_t interval = m_nEmitIntervalMs;
    if (interval <= 0) {
        return;
    }
    if (timeMs == 0) {
        SpawnParticle(timeMs);
    }
    while (timeMs > m_clock.lastEmitMs + interval) {
        m_clock.lastEmitMs += static_cast<int32_t>(interval);
        SpawnParticle(timeMs);
    }
}

void CParticleFxBase::RenderIfVisible() {
    if (IsVisible()) {
        RenderParticles();
    }
}

} // namespace kyv
