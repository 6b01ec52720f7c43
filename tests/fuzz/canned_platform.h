#pragma once

#include <QByteArray>
#include <QList>
#include <QPair>
#include <QString>

/// In place of the HTTPS client: what the platform replies, without a network.
struct CannedReply
{
    int status = 0;
    QString body;
    QList<QPair<QByteArray, QByteArray>> headers;
};

/// The reply to the next request; those after it get no response.
void setNextReply(const CannedReply& reply);
