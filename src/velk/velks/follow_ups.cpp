#include "follow_ups.h"

#include <QScopedValueRollback>

#include <utility>

namespace {

constexpr int kBatch = 50; // follow-ups before the event loop runs

// A backlog up to this size is read at full speed. Beyond it, a pause of one second follows each batch, which
// is one smaller, as a poll may fall into the pause.
constexpr int kAtFullSpeed = 1000;
constexpr int kSlowBatch = kBatch - 1;
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
    askBatch();
}

void FollowUps::count(int unread)
{
    if (unread <= 1) {
        m_asked = 0;
        return;
    }
    m_isDue = true;
    askBatch();
}

void FollowUps::timerEvent(QTimerEvent* /*event*/)
{
    m_pause.stop();
    askBatch();
}

void FollowUps::askBatch()
{
    if (m_isAsking || m_pause.isActive()) {
        return;
    }
    const QScopedValueRollback<bool> asking(m_isAsking, true);
    const int batch = m_asked < kAtFullSpeed ? kBatch : kSlowBatch;
    for (int asked = 0; m_isDue && asked < batch; ++asked) {
        m_isDue = false;
        ++m_asked;
        m_ask();
    }
    if (m_isDue) {
        m_pause.start(m_asked < kAtFullSpeed ? 0 : kSlowPause, Qt::PreciseTimer, this);
    }
}
