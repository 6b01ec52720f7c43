#pragma once

#include <QBasicTimer>
#include <QObject>

#include <functional>

/// Asks the platform for one unread message after another while its replies count more than one.
///
/// A reply's handler never asks, as each message would add its frames to the stack: the outermost caller asks
/// in a loop. After a batch of 50 the event loop runs, so that a platform whose count never falls blocks
/// nothing else. To spare such a platform, after 1,000 follow-ups of one backlog it is asked at most 50 times
/// in any second. A backlog ends when the count has fallen to 1 or below.
class FollowUps : public QObject
{
    Q_OBJECT

public:
    /// `ask` sends one follow-up and returns when its reply has been counted.
    FollowUps(std::function<void()> ask, QObject* parent);

    /// Sends a request of another kind, then a batch of follow-ups if its reply calls for one. If a batch is
    /// already scheduled, only sends the request: a second batch would delay other events.
    void after(const std::function<void()>& request);

    /// Takes the count of unread messages of a reply. A reply that was not requested by after() or a batch is
    /// followed up at once.
    void count(int unread);

protected:
    void timerEvent(QTimerEvent* event) override;

private:
    void askBatch();

    std::function<void()> m_ask;
    bool m_isAsking = false;
    bool m_isDue = false;
    int m_asked = 0; ///< in the present backlog
    // Schedules the next batch. A queued call would overtake timers, and a forced log-out is one.
    QBasicTimer m_pause;
};
