// Timers without a window: CTimer raises Timer on ticks that a tick source delivers on the user
// interface thread. MTimer keeps the running timers. Headless programs and tests use the std-only
// TimerLoop below; the Qt layer plugs in a source built on QTimer.
#pragma once

#include "qzivi/support/event.h"
#include "qzivi/support/scoped_hook.h"

#include <chrono>
#include <cstdint>
#include <map>
#include <memory>
#include <vector>

namespace qzivi {

// What ticks: a periodic system timer by id, as SetTimer and KillTimer are.
class ITickSource {
public:
    virtual ~ITickSource() = default;
    // The id of a new periodic timer, 0 if none can be had. Each tick calls MTimer::Callback(id).
    virtual std::uint32_t SetTimer(std::uint32_t milliseconds) = 0;
    virtual void KillTimer(std::uint32_t id) = 0;
};

// The source the timers use; the std loop of this thread unless another is set. Returns the one
// it replaces.
ITickSource* SetTickSource(ITickSource* source);
ITickSource& TickSource();
// The tick source for the lifetime of a scope: the Qt layer's QTimer source, a test's loop.
using TickSourceScope = ScopedHook<ITickSource*, &SetTickSource>;

class CTimer : public std::enable_shared_from_this<CTimer> {
public:
    static std::shared_ptr<CTimer> Create() { return std::shared_ptr<CTimer>(new CTimer); }
    ~CTimer();
    CTimer(const CTimer&) = delete;
    CTimer& operator=(const CTimer&) = delete;

    std::uint32_t TimerID() const { return m_lTimerID; }
    void TimerID(std::uint32_t id) { m_lTimerID = id; } // for MTimer
    bool Enabled() const { return m_bEnabled; }
    void Enabled(bool value);
    std::uint32_t Interval() const { return m_lInterval; }
    void Interval(std::uint32_t value);
    // One tick after `milliseconds`; Enabled and Interval play no part.
    void OneShot(std::uint32_t milliseconds);
    void RaiseTimer(); // for MTimer

    Event<> Timer;

private:
    CTimer() = default;

    std::uint32_t m_lTimerID = 0;
    std::uint32_t m_lInterval = 0;
    bool m_bEnabled = false;
    bool m_bOneShot = false;
    bool m_bInEvent = false;
};

namespace MTimer {
// Raises the number 0x80047925, "No timers available", when the source has none left.
std::uint32_t StartTimer(const std::shared_ptr<CTimer>& timer, std::uint32_t milliseconds);
void StopTimer(CTimer& timer);
// A tick of the system timer `id`. An id no timer has is killed, so that it stops firing.
void Callback(std::uint32_t id);
// The running timers, for tests.
std::size_t RunningCount();
} // namespace MTimer

// The std-only tick source: a clock of its own, advanced by the program. Ticks fire one at a
// time, in time order, on the thread that advances it.
class TimerLoop : public ITickSource {
public:
    using Clock = std::chrono::steady_clock;

    std::uint32_t SetTimer(std::uint32_t milliseconds) override;
    void KillTimer(std::uint32_t id) override;

    // Moves the clock on by `milliseconds`, firing every tick that falls due on the way.
    void Advance(std::uint32_t milliseconds);
    // Runs in real time for `milliseconds`, sleeping between ticks.
    void RunFor(std::uint32_t milliseconds);
    // Fires a tick for `id` now, as a stray system timer would.
    void Fire(std::uint32_t id);
    std::size_t Count() const { return timers_.size(); }
    std::uint64_t Now() const { return now_; }

private:
    struct Entry {
        std::uint32_t period;
        std::uint64_t due;
    };
    std::map<std::uint32_t, Entry> timers_;
    std::uint32_t nextId_ = 1;
    std::uint64_t now_ = 0; // milliseconds
};

} // namespace qzivi
