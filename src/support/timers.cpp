#include "qzivi/support/timers.h"

#include "qzivi/support/failure.h"

#include <algorithm>
#include <thread>

namespace qzivi {

namespace {

ITickSource*& Installed() {
    static thread_local ITickSource* source = nullptr;
    return source;
}

TimerLoop& DefaultLoop() {
    static thread_local TimerLoop loop;
    return loop;
}

// The running timers of this thread, held strongly: a running timer outlives its user's reference.
std::vector<std::shared_ptr<CTimer>>& Running() {
    static thread_local std::vector<std::shared_ptr<CTimer>> running;
    return running;
}

constexpr std::int32_t kNoTimers = static_cast<std::int32_t>(0x80047925u);

} // namespace

ITickSource* SetTickSource(ITickSource* source) {
    ITickSource* previous = Installed();
    Installed() = source;
    return previous;
}

ITickSource& TickSource() {
    return Installed() != nullptr ? *Installed() : DefaultLoop();
}

// ---- CTimer ---------------------------------------------------------------------------------

CTimer::~CTimer() {
    try {
        if (m_lTimerID != 0) TickSource().KillTimer(m_lTimerID);
    } catch (...) {
    }
}

void CTimer::Enabled(bool value) {
    if (value == m_bEnabled) return;
    m_bEnabled = value;
    if (m_lInterval == 0) return;
    if (value) {
        m_lTimerID = MTimer::StartTimer(shared_from_this(), m_lInterval);
    } else if (m_lTimerID != 0) {
        MTimer::StopTimer(*this);
        m_lTimerID = 0;
    }
}

void CTimer::Interval(std::uint32_t value) {
    if (value == m_lInterval) return;
    m_lInterval = value;
    if (m_lTimerID != 0) {
        MTimer::StopTimer(*this);
        m_lTimerID = 0;
    }
    if (value != 0 && m_bEnabled) m_lTimerID = MTimer::StartTimer(shared_from_this(), value);
}

void CTimer::OneShot(std::uint32_t milliseconds) {
    m_bOneShot = true;
    m_lTimerID = MTimer::StartTimer(shared_from_this(), milliseconds);
}

void CTimer::RaiseTimer() {
    if (m_bInEvent) return; // a tick during the handler of the last one is dropped
    m_bInEvent = true;
    // Keeps this object alive through its handler, which may drop the last other reference.
    const auto self = shared_from_this();
    if (m_bOneShot) {
        MTimer::StopTimer(*this);
        m_lTimerID = 0;
    }
    struct Clear {
        bool& flag;
        ~Clear() { flag = false; }
    } clear{m_bInEvent};
    Timer();
}

// ---- MTimer ---------------------------------------------------------------------------------

std::uint32_t MTimer::StartTimer(const std::shared_ptr<CTimer>& timer, std::uint32_t milliseconds) {
    const std::uint32_t id = TickSource().SetTimer(milliseconds);
    if (id == 0) throw Failure(kNoTimers, "MTimer", "No timers available");
    timer->TimerID(id);
    Running().push_back(timer);
    return id;
}

void MTimer::StopTimer(CTimer& timer) {
    if (timer.TimerID() != 0) TickSource().KillTimer(timer.TimerID());
    auto& running = Running();
    const auto found =
        std::find_if(running.begin(), running.end(),
                     [&](const std::shared_ptr<CTimer>& t) { return t.get() == &timer; });
    if (found != running.end()) running.erase(found);
}

void MTimer::Callback(std::uint32_t id) {
    for (const auto& timer : Running())
        if (timer->TimerID() == id) {
            const auto keep = timer;
            try {
                keep->RaiseTimer();
            } catch (...) { // a failure in a handler never reaches the tick source
            }
            return;
        }
    TickSource().KillTimer(id);
}

std::size_t MTimer::RunningCount() {
    return Running().size();
}

// ---- TimerLoop ------------------------------------------------------------------------------

std::uint32_t TimerLoop::SetTimer(std::uint32_t milliseconds) {
    const std::uint32_t id = nextId_++;
    timers_[id] = {std::max<std::uint32_t>(milliseconds, 1),
                   now_ + std::max<std::uint32_t>(milliseconds, 1)};
    return id;
}

void TimerLoop::KillTimer(std::uint32_t id) {
    timers_.erase(id);
}

void TimerLoop::Fire(std::uint32_t id) {
    MTimer::Callback(id);
}

void TimerLoop::Advance(std::uint32_t milliseconds) {
    const std::uint64_t until = now_ + milliseconds;
    for (;;) {
        // The next tick due, by time and then by id; handlers may start and stop timers.
        auto next = timers_.end();
        for (auto it = timers_.begin(); it != timers_.end(); ++it)
            if (it->second.due <= until &&
                (next == timers_.end() || it->second.due < next->second.due))
                next = it;
        if (next == timers_.end()) break;
        now_ = next->second.due;
        next->second.due += next->second.period;
        MTimer::Callback(next->first);
    }
    now_ = until;
}

void TimerLoop::RunFor(std::uint32_t milliseconds) {
    const auto start = Clock::now();
    std::uint64_t done = 0;
    while (done < milliseconds) {
        std::uint64_t step = milliseconds - done;
        for (const auto& [id, entry] : timers_)
            step = std::min<std::uint64_t>(step, entry.due - now_);
        std::this_thread::sleep_until(start + std::chrono::milliseconds(done + step));
        Advance(static_cast<std::uint32_t>(step));
        done += step;
    }
}

} // namespace qzivi
