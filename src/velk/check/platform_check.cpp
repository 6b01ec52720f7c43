#include "platform_check.h"

#include <QJsonDocument>

#include "captured_log.h"
#include "constants.h"
#include "filecontent.h"
#include "handleevent.h"
#include "session_user.h"

namespace velk::check {

namespace {

struct Answer
{
    int status = 0;
    QString body;
};

Answer ask(const QString& url)
{
    auto* gateway = HandleEvent::GetInstance();
    gateway->initHttpApi();
    Answer answer;
    const auto take = [&answer](int status, const QString& body) { answer = {status, body}; };
    const auto connection = QObject::connect(gateway, &HandleEvent::recvPlatformMsg, gateway, take);
    gateway->getPlatformMsg(url);
    QObject::disconnect(connection);
    return answer;
}

} // namespace

Finding checkPlatform(const SessionUser& user)
{
    const QString subject = QStringLiteral("platform");
    QString host;
    QString port;
    velk::base::FileContent::getHostAndPort(host, port);
    if (host.isEmpty() || port.isEmpty()) {
        return {Grade::Bad, subject, QStringLiteral("cannot be reached: its address is unknown")};
    }

    const QString url = kUrlHead.arg(host, port)
        + QStringLiteral("notification/v2/list?uid=%1&is_not_read=1&limit=1")
              .arg(platformUserName(user.loginName));
    const Answer answer = ask(url);
    if (answer.status == 0) {
        return {Grade::Bad, subject, QStringLiteral("does not answer: ") + CapturedLog::lastWarning()};
    }
    const QList<int> refusals{400, 401, 403, 495,
                              496}; // web servers answer 400, 495 or 496 to a bad certificate
    if (refusals.contains(answer.status)) {
        return {Grade::Bad, subject,
                QStringLiteral(
                    "answers, but does not accept this terminal's certificate or this user (HTTP status %1)")
                    .arg(answer.status)};
    }
    if (answer.status != 200) {
        return {Grade::Bad, subject,
                QStringLiteral("answers with HTTP status %1 instead of messages").arg(answer.status)};
    }
    if (!QJsonDocument::fromJson(answer.body.toUtf8()).isArray()) {
        return {Grade::Bad, subject, QStringLiteral("answers with something other than messages")};
    }
    return {Grade::Good, subject, QStringLiteral("answers and accepts this terminal")};
}

} // namespace velk::check
