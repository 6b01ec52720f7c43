#pragma once

#include <QDBusPendingCall>
#include <QList>

class QDBusAbstractInterface;

/// Sends calls that return nothing, which callers mostly drop the replies of.
///
/// A bus refuses further calls of a program that has too many unanswered (128 on a system bus), and each one
/// costs memory until it is answered or times out. So a call asks for a reply only while fewer than 64 are
/// unanswered, whichever these are, and none does that carries more than 65,536 characters; the others are
/// sent without, and their pending call counts as finished at once, without an error: no call is lost,
/// however many there are and whatever their size.
class UnreadCalls
{
public:
    QDBusPendingCall send(QDBusAbstractInterface& proxy, const QString& method,
                          const QVariantList& arguments);

private:
    QList<QDBusPendingCall> m_unanswered; ///< those answered meanwhile go with the next call
};
