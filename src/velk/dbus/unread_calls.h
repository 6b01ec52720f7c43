#pragma once

#include <QDBusPendingCall>
#include <QQueue>

class QDBusAbstractInterface;

/// Sends calls that return nothing, which callers mostly drop the replies of.
///
/// A bus refuses further calls of a program that has too many unanswered (128 on a system bus), and each one
/// costs memory until it is answered or times out. So only the first calls that a slow service leaves
/// unanswered ask for a reply, and none that carries a long text; the others are sent without, and their
/// pending call counts as finished at once: no call is lost, however many there are and whatever their size.
class UnreadCalls
{
public:
    QDBusPendingCall send(QDBusAbstractInterface& proxy, const QString& method,
                          const QVariantList& arguments);

private:
    QQueue<QDBusPendingCall> m_unanswered; ///< oldest first; those answered meanwhile go with the next call
};
