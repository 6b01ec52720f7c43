#include "handleevent.h"

#include <QDBusConnection>
#include <QDBusError>
#include <QDBusMessage>
#include <QDebug>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTimer>
#include <QVariantMap>

#include "constants.h"
#include "httpclientapi.h"
#include "log_text.h"
#include "services.h"

namespace {

constexpr int kPasswordNoticeDelay = 60000; // ms

const QString kOpenAction = QStringLiteral("_open");

/// Calls the desktop's notification service and waits for the notification's id. The title is also the
/// application name.
QDBusMessage notify(const QString& title, const QString& body, const QStringList& actions,
                    const QVariantMap& hints, int timeout)
{
    const QString& service = velk::service::kNotifications;
    auto call = QDBusMessage::createMethodCall(service, QStringLiteral("/com/norix/kpx/Notification"),
                                               service, QStringLiteral("Notify"));
    constexpr uint replacesNothing = 0;
    call.setArguments(
        {title, replacesNothing, QStringLiteral("velkw"), title, body, actions, hints, timeout});
    return QDBusConnection::sessionBus().call(call);
}

void notifyPlainly(const QString& title, const QString& body, int timeout)
{
    const QDBusError error(notify(title, body, {}, {}, timeout));
    if (error.isValid()) {
        qWarning() << "--@@@@--" << error;
    }
}

bool isPasswordExpiring(int status, const QJsonObject& reply)
{
    return status == 200 && reply.value(QLatin1String("code")).toInt(-1) == 0
        && reply.value(QLatin1String("data")).toObject().value(QLatin1String("result")).toBool(false);
}

} // namespace

HandleEvent* HandleEvent::GetInstance()
{
    static HandleEvent instance;
    return &instance;
}

void HandleEvent::initHttpApi()
{
    if (m_http != nullptr) {
        return;
    }
    m_http = new HttpClientApi(nullptr, false);
    m_http->setSSLConfig(velk::kServerCertPath, velk::kPublicKeyPath, velk::kPrivateKeyPath);
}

void HandleEvent::getPlatformMsg(const QString& url)
{
    requestPlatform("getPlatformMsg", url, QString());
}

HandleEvent::PlatformReply HandleEvent::requestPlatform(const char* operation, const QString& url,
                                                        const QString& content)
{
    QString body;
    const int status = m_http->getRequest(body, url, content, true);
    const auto headers = m_http->getRawHeader();
    qInfo().noquote() << operation << "----nCode:" << status << ":" << quoted(body) << ":" << headers.size();
    Q_EMIT recvPlatformMsg(status, body, headers);
    return {status, body};
}

void HandleEvent::respondPlatformMsg(const QString& url, QString body)
{
    QString ignoredReply;
    m_http->putRequest(ignoredReply, url, body, true);
}

void HandleEvent::getPasswdExpiredTime(const QString& url, const QString& userName)
{
    qInfo() << "url " << url;
    const QJsonObject content{{QStringLiteral("username"), userName}};
    const auto reply =
        requestPlatform("getPasswdExpiredTime", url, QString::fromUtf8(QJsonDocument(content).toJson()));

    QJsonParseError error{};
    const auto document = QJsonDocument::fromJson(reply.body.toUtf8(), &error);
    if (error.error != QJsonParseError::NoError) {
        return;
    }
    // Logged for every parsed reply, expiring or not, and again at the end: log readers rely on both lines.
    qInfo() << "用户密码快过期了！！";
    if (isPasswordExpiring(reply.status, document.object())) {
        remindOfPassword(document.object());
    }
    qInfo() << "用户密码快过期了！！";
}

void HandleEvent::remindOfPassword(const QJsonObject& reply)
{
    QTimer::singleShot(kPasswordNoticeDelay, this, [this, reply] {
        qInfo() << "用户密码快过期了！！";
        const QString notice =
            reply.value(QLatin1String("data")).toObject().value(QLatin1String("msg")).toString();
        sendMessage(kReminderTitle, notice, -1);
    });
}

void HandleEvent::sendMessage(const QString& title, const QString& body, int timeout)
{
    notifyPlainly(title, body, timeout);
}

void HandleEvent::sendMessage(const QString& type, const QString& title, const QString& body,
                              const QString& sender, const QString& time, uint timeout)
{
    qInfo() << "----HandleEvent::sendMessage----" << type << title;
    const bool isReboot = type == QLatin1String("reboot");
    // The values are joined as they are, including their commas: the notification service passes the text on
    // unparsed.
    const QString action =
        isReboot ? type : QStringList{type, title, body, sender, time}.join(QLatin1Char(','));
    const QString label = isReboot ? QStringLiteral("重启") : QStringLiteral("查看");

    // The timeout is signed on the wire, where the unsigned -1 becomes -1.
    const QDBusMessage reply =
        notify(title, body, {kOpenAction, label}, {{QStringLiteral("x-norix-action-_open"), action}},
               static_cast<int>(timeout));
    qInfo() << "----HandleEvent::sendMessage----" << reply.arguments().value(0).toUInt() << action;
    qInfo() << "--@@@@--" << QDBusError(reply);
}

void HandleEvent::sendChangePasswdMessage()
{
    notifyPlainly(kReminderTitle, QStringLiteral("管理员调整密码规则，避免影响登录，请及时修改密码"), 0);
}
