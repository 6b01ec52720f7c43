#pragma once

#include "httpclientapi.h"
#include "log_recorder.h"

/// What a caller of HttpClientApi sees of one request.
struct HttpOutcome
{
    int status = 0;
    QString reply = QStringLiteral("left over from before");
    QList<QPair<QByteArray, QByteArray>> headers;
    QStringList warnings;
};

using HttpRequest = int (HttpClientApi::*)(QString&, const QString&, const QString&, bool);

inline HttpOutcome outcomeOf(HttpRequest request, HttpClientApi& client, const QString& url,
                             const QString& body = {}, bool isJson = true)
{
    const LogRecorder recorder;
    HttpOutcome outcome;
    outcome.status = (client.*request)(outcome.reply, url, body, isJson);
    outcome.headers = client.getRawHeader();
    outcome.warnings = recorder.warnings();
    return outcome;
}

inline HttpOutcome get(HttpClientApi& client, const QString& url)
{
    return outcomeOf(&HttpClientApi::getRequest, client, url);
}

/// The outcome in a line, to be compared with kNoResponse.
inline QString summary(const HttpOutcome& outcome)
{
    return QStringLiteral("status %1, reply \"%2\", %3 headers, %4 warnings")
        .arg(outcome.status)
        .arg(outcome.reply.left(80))
        .arg(outcome.headers.size())
        .arg(outcome.warnings.size());
}

inline const QString kNoResponse = QStringLiteral("status 0, reply \"\", 0 headers, 1 warnings");
