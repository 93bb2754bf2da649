// The tick source of the control's timers on Qt's event loop: each timer is a QTimer.
#pragma once

#include "qzivi/support/timers.h"

#include <QObject>

#include <map>

class QTimer;

namespace qzivi {

class QtTickSource : public QObject, public ITickSource {
public:
    std::uint32_t SetTimer(std::uint32_t milliseconds) override;
    void KillTimer(std::uint32_t id) override;

    // Makes the Qt loop the tick source of this process, once; later calls do nothing.
    static void Install();

private:
    std::map<std::uint32_t, QTimer*> m_oTimers;
    std::uint32_t m_lNextId = 1;
};

} // namespace qzivi
