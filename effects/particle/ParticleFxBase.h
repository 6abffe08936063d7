// A particle animation that looks the same at a position however the host gets there.
//
// Time is in milliseconds. The simulation runs in steps of 33 ms from 0, and each step seeds the
// random generator from its own number, so its draws do not depend on how it was reached. The state
// before every hundredth step is kept, for going back.
#pragma once

#include <cstdint>
#include <iterator>
#include <map>
#include <utility>
#include <vector>

#include "effects/particle/ParticleRandom.h"

namespace kyv {

class CParticleFxBase {
public:
    CParticleFxBase(const CParticleFxBase&) = delete;
    CParticleFxBase& operator=(const CParticleFxBase&) = delete;

    // The operations of an animation; AdvanceTo calls those that move it.

    // Spawns what is due in the step at timeMs: one particle at 0, then one an interval.
    virtual void Emit(int32_t timeMs, int32_t deltaMs); // slot 0
    virtual void SpawnParticle(int32_t timeMs) = 0;     // slot 1
    // Moves every live particle. deltaMs is 0 in the first step and 33 in all others.
    virtual void UpdateParticles(int32_t timeMs, int32_t deltaMs) = 0; // slot 2
    // Removes the particles that are dead or have left.
    virtual void RetireParticles() = 0; // slot 3
    // Draws the live particles; the state stays as it is.
    virtual void RenderParticles() = 0;           // slot 4
    virtual void ResetParticles() = 0;            // slot 5
    virtual void SaveSnapshot(int32_t index) = 0; // slot 6
    // Replaces the live state by the last snapshot that is not beyond index and returns its index;
    // -1, with the state unchanged, when there is none.
    virtual int32_t RestoreSnapshot(int32_t index, int32_t stepsPerSnapshot) = 0; // slot 7
    virtual ~CParticleFxBase() = default;                                         // slot 8
    // Forgets everything that was simulated: a parameter has changed.
    virtual void ClearSnapshots() = 0; // slot 9
    // What RestoreSnapshot would return.
    virtual int32_t FindSnapshot(int32_t index) const = 0; // slot 10

    // The clip's length; 0 or less means no fades. Another length than before is another animation,
    // since births may depend on it.
    void SetDuration(int32_t durationMs);

    // Brings the simulation to a time; a negative one counts as 0. Sets the fades. Beyond the clip
    // nothing is simulated and nothing will be visible.
    //
    // A particle's life depends on nothing but its birth, so a far position needs no more than the
    // steps of one longest life before it, and a seek costs the least of: going on from the present
    // state, from a snapshot, or from that far back.
    void AdvanceTo(int32_t timeMs);

    bool IsVisible() const { return m_nFadeOutAlpha != 0; }
    void RenderIfVisible();

    // 0 or less stops the spawning of Emit.
    void SetEmitInterval(int32_t intervalMs) { m_nEmitIntervalMs = intervalMs; }
    // Negative means no limit.
    void SetMaxParticles(int32_t count) { m_nMaxParticles = count; }

    uint8_t GetFadeInAlpha() const { return m_nFadeInAlpha; }
    uint8_t GetFadeOutAlpha() const { return m_nFadeOutAlpha; }

protected:
    // Until when the state has been simulated and births have been made.
    struct Clock {
        int32_t lastEmitMs;
        int32_t lastStepMs;
    };

    static constexpr int32_t kStepMs = 33;
    static constexpr int32_t kStepsPerSnapshot = 100;

    CParticleFxBase() = default;

    // The age at which the last particle is gone for certain, so that what was born before can be
    // left out. Drawing random numbers in UpdateParticles for one particle must not depend on
    // which others live.
    void SetLongestLife(int32_t lifeMs) { m_nLongestLifeMs = lifeMs; }

    void ForgetLiveState() { m_nNextStep = kNoLiveState; }

    bool HasRoom(size_t liveCount) const {
        return m_nMaxParticles < 0 || liveCount < static_cast<size_t>(m_nMaxParticles);
    }

    CParticleRandom m_random;
    Clock m_clock = {};
    int32_t m_nMaxParticles = -1;
    int32_t m_nDurationMs = 0;
    int32_t m_nFadeMs = 0; // length of either fade
    uint8_t m_nFadeInAlpha = 255;
    uint8_t m_nFadeOutAlpha = 255;

private:
    static constexpr int64_t kNoLiveState = -1;

    struct Start {
        int64_t step;    // the next one to simulate
        bool isComplete; // no particle is missing before that step
    };

    bool UpdateFades(int32_t timeMs);
    Start ChooseStart(int64_t lastStep);
    Clock ClockAfter(int64_t step) const;
    void RunStep(int64_t step);

    int32_t m_nEmitIntervalMs = 0;
    int32_t m_nLongestLifeMs = INT32_MAX;
    int64_t m_nNextStep = kNoLiveState; // what the live state is ready for
};

// The live list of an animation, oldest first, and its snapshots.
template <class Record>
class CParticleFx : public CParticleFxBase {
public:
    void ResetParticles() override { m_particles.clear(); }

    void SaveSnapshot(int32_t index) override {
        Snapshot snapshot = {m_particles, m_clock};
        // Counted once nothing more can fail.
        const auto [place, isNew] = m_snapshots.try_emplace(index);
        m_nSnapshotBytes -= isNew ? 0 : place->second.Bytes();
        place->second = std::move(snapshot);
        m_nSnapshotBytes += place->second.Bytes();
        // What is farthest from here is missed least.
        while (m_nSnapshotBytes > kSnapshotBudget && m_snapshots.size() > 1) {
            const auto first = m_snapshots.begin();
            const auto last = std::prev(m_snapshots.end());
            const auto victim = index - first->first >= last->first - index ? first : last;
            m_nSnapshotBytes -= victim->second.Bytes();
            m_snapshots.erase(victim);
        }
    }

    int32_t RestoreSnapshot(int32_t index, int32_t) override {
        const int32_t found = FindSnapshot(index);
        if (found >= 0) {
            const Snapshot& snapshot = m_snapshots.at(found);
            m_particles = snapshot.particles;
            m_clock = snapshot.clock;
        }
        return found;
    }

    void ClearSnapshots() override {
        m_snapshots.clear();
        m_nSnapshotBytes = 0;
        ForgetLiveState();
    }

    int32_t FindSnapshot(int32_t index) const override {
        const auto after = m_snapshots.upper_bound(index);
        return after == m_snapshots.begin() ? -1 : std::prev(after)->first;
    }

    const std::vector<Record>& GetParticles() const { return m_particles; }

protected:
    std::vector<Record> m_particles;

private:
    // Hours of bubbles. Fireworks fill it, and lose little by what is dropped: nothing there lives
    // much longer than the time between two snapshots.
    static constexpr size_t kSnapshotBudget = size_t{16} << 20;

    struct Snapshot {
        std::vector<Record> particles;
        Clock clock;

        size_t Bytes() const { return sizeof *this + particles.capacity() * sizeof(Record); }
    };

    std::map<int32_t, Snapshot> m_snapshots;
    size_t m_nSnapshotBytes = 0;
};

} // namespace kyv
