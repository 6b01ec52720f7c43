#pragma once

#include <QByteArray>
#include <QList>
#include <QObject>
#include <QPair>
#include <QString>

class HttpClientApi;
class QJsonObject;

/// The title of every notification that is the agent's own.
inline const QString kReminderTitle = QStringLiteral("提醒");

/// The agent's one gateway to the management platform (HTTPS) and to the desktop's notification service.
/// Requests and notifications block until they are answered: a request for 30 s at most, a notification for
/// the D-Bus time limit of 25 s.
class HandleEvent : public QObject
{
    Q_OBJECT

public:
    static HandleEvent* GetInstance();

    /// Sets up the one HTTPS client with the daemon's certificates; later calls do nothing. Must have run
    /// before a request.
    void initHttpApi();

    /// Each request for a platform message reports its reply through recvPlatformMsg before it returns.
    void getPlatformMsg(const QString& url);

    /// Sends an answer to the platform; its reply is not looked at.
    void respondPlatformMsg(const QString& url, QString body);

    /// Asks whether the user's password is about to expire, and shows the platform's notice one minute
    /// later if so.
    void getPasswdExpiredTime(const QString& url, const QString& userName);

    /// A plain notification; timeout in milliseconds, -1 the desktop's default, 0 never.
    void sendMessage(const QString& title, const QString& body, int timeout);

    /// A notification with an action: of type "reboot" it offers the reboot, of any other type it hands
    /// type, title, body, sender and time to the notification service, to be opened by the user. The
    /// timeout is that of the plain form, -1 given as its unsigned value.
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
