#pragma once

#include <QBasicTimer>
#include <QObject>

#include <functional>

/// Asks the platform for one unread message after the other, while its replies count more.
///
/// Never inside the handling of a reply, where each message would add its frames to the stack: the outermost
/// caller asks, in a loop. After 50 follow-ups the event loop has its turn, so that nothing waits for a
/// platform whose count never falls. Such a platform is spared, too: after 1,000 follow-ups of one row, it is
/// asked at most 50 times in any second. A row ends when the count has fallen to 1 or below.
class FollowUps : public QObject
{
    Q_OBJECT

public:
    /// `ask` sends one follow-up and returns when its reply has been counted.
    FollowUps(std::function<void()> ask, QObject* parent);

    /// Sends a request that is no follow-up, then asks for what follows from its reply. While a drain is on
    /// its way, that is left to it: a second one beside it would keep others waiting.
    void after(const std::function<void()>& request);

    /// To be called for each reply, with its count of unread messages. A reply that comes on its own is
    /// followed up at once.
    void count(int unread);

protected:
    void timerEvent(QTimerEvent* event) override;

private:
    void askInARow();

    std::function<void()> m_ask;
    bool m_isAsking = false;
    bool m_isDue = false;
    int m_asked = 0; ///< in the present row
    // Goes on from the event loop. Not a queued call: those go before timers, and a forced log-out that is
    // due is one.
    QBasicTimer m_pause;
};
