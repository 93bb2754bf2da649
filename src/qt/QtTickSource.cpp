#include "qzivi/qt/QtTickSource.h"

#include <QTimer>

namespace qzivi {

std::uint32_t QtTickSource::SetTimer(std::uint32_t milliseconds) {
    const std::uint32_t id = m_lNextId++;
    auto* timer = new QTimer(this);
    timer->setTimerType(Qt::PreciseTimer);
    connect(timer, &QTimer::timeout, this, [id] { MTimer::Callback(id); });
    timer->start(static_cast<int>(milliseconds));
    m_oTimers.emplace(id, timer);
    return id;
}

void QtTickSource::KillTimer(std::uint32_t id) {
    const auto found = m_oTimers.find(id);
    if (found == m_oTimers.end()) return;
    found->second->stop();
    found->second->deleteLater(); // it may be ticking right now
    m_oTimers.erase(found);
}

void QtTickSource::Install() {
    static QtTickSource* source = [] {
        auto* s = new QtTickSource;
        SetTickSource(s);
        return s;
    }();
    (void)source;
}

} // namespace qzivi
