#pragma once

#include <QDBusPendingCall>
#include <QList>

class QDBusAbstractInterface;

/// Sends calls without a return value, whose replies most callers drop.
///
/// A bus refuses calls of a program that has too many unanswered ones (128 on a system bus), and each call
/// takes memory until it is answered or times out. So a call asks for a reply only while fewer than 64 are
/// unanswered and if it holds at most 65,536 characters. Other calls are sent without, and their pending call
/// is finished at once without an error. No call is lost, whatever the number and size.
class UnreadCalls
{
public:
    QDBusPendingCall send(QDBusAbstractInterface& proxy, const QString& method,
                          const QVariantList& arguments);

private:
    QList<QDBusPendingCall> m_unanswered; ///< and answered ones, which the next call removes
};
