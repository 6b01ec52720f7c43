#pragma once

#include <QByteArray>
#include <QList>
#include <QObject>
#include <QPair>
#include <QString>

class HttpClientApi;
class QJsonObject;

/// The title of all notifications that the agent itself words.
inline const QString kReminderTitle = QStringLiteral("提醒");

/// The agent's gateway to the management platform (HTTPS) and to the desktop's notification service. Both
/// block: a request for 30 s at most, a notification for the D-Bus time limit of 25 s.
class HandleEvent : public QObject
{
    Q_OBJECT

public:
    static HandleEvent* GetInstance();

    /// Sets up the HTTPS client with the daemon's certificates; later calls do nothing. Call it before the
    /// first request.
    void initHttpApi();

    /// Requests a message; reports the reply through recvPlatformMsg before returning.
    void getPlatformMsg(const QString& url);

    /// Sends an answer to the platform and ignores the reply.
    void respondPlatformMsg(const QString& url, QString body);

    /// Asks whether the user's password is about to expire; if so, shows the platform's notice one minute
    /// later.
    void getPasswdExpiredTime(const QString& url, const QString& userName);

    /// A plain notification; timeout in milliseconds, -1 the desktop's default, 0 never.
    void sendMessage(const QString& title, const QString& body, int timeout);

    /// A notification with an action. Type "reboot" offers the reboot; any other type passes type, title,
    /// body, sender and time to the notification service, for the user to open. The timeout is that of the
    /// plain form, -1 given as its unsigned value.
    void sendMessage(const QString& type, const QString& title, const QString& body, const QString& sender,
                     const QString& time, uint timeout);

    void sendChangePasswdMessage();

Q_SIGNALS:
    void recvPlatformMsg(const int& statusCode, const QString& body,
                         const QList<QPair<QByteArray, QByteArray>>& rawHeaders);

private:
    struct PlatformReply
    {
        int status;
        QString body;
    };

    HandleEvent() = default;
    PlatformReply requestPlatform(const char* operation, const QString& url, const QString& content);
    void remindOfPassword(const QJsonObject& reply);

    HttpClientApi* m_http = nullptr; ///< kept, with its connections, until the process ends
};
