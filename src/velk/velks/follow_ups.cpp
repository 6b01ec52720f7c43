#include "follow_ups.h"

#include <QScopedValueRollback>

#include <utility>

namespace {

// Follow-ups before the event loop has its turn.
constexpr int kAtOnce = 50;

// A backlog of so many is drained at full speed. Then comes a second's pause after each time; one less at a
// time, as a poll may fall into the pause.
constexpr int kAtFullSpeed = 1000;
constexpr int kAtOnceWhenSlow = kAtOnce - 1;
constexpr int kSlowPause = 1000; // ms

} // namespace

FollowUps::FollowUps(std::function<void()> ask, QObject* parent)
    : QObject(parent)
    , m_ask(std::move(ask))
{ }

void FollowUps::after(const std::function<void()>& request)
{
    {
        const QScopedValueRollback<bool> asking(m_isAsking, true);
        request();
    }
    askInARow();
}

void FollowUps::count(int unread)
{
    if (unread <= 1) {
        m_asked = 0;
        return;
    }
    m_isDue = true;
    askInARow();
}

void FollowUps::timerEvent(QTimerEvent* /*event*/)
{
    m_pause.stop();
    askInARow();
}

void FollowUps::askInARow()
{
    if (m_isAsking || m_pause.isActive()) {
        return;
    }
    const QScopedValueRollback<bool> asking(m_isAsking, true);
    const int most = m_asked < kAtFullSpeed ? kAtOnce : kAtOnceWhenSlow;
    for (int asked = 0; m_isDue && asked < most; ++asked) {
        m_isDue = false;
        ++m_asked;
        m_ask();
    }
    if (m_isDue) {
        m_pause.start(m_asked < kAtFullSpeed ? 0 : kSlowPause, Qt::PreciseTimer, this);
    }
}
