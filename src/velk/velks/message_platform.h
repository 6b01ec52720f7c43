#pragma once

#include <QByteArray>
#include <QList>
#include <QObject>
#include <QPair>
#include <QString>
#include <QVector>

#include <functional>

class MessageTransfer;
class QTimer;

// Bounds of the intervals between polls, in milliseconds; each interval is drawn at random.
constexpr int kShortestPollInterval = 60000;
constexpr int kLongestFirstPollInterval = 120000;
constexpr int kLongestPollInterval = 180000;

/// The parameters of one list request.
struct NotifyMessageOption
{
    QString uid;
    bool is_not_read = false;
    int limit = 10;
    int offset = 0;
    QString order = QStringLiteral("create_at");
    QString desc = QStringLiteral("1");
};

/// One message of the platform; it is unread exactly when read_at is empty.
struct NotifyMessage
{
    QString uuid;
    QString uid;
    QString send_uid;
    QString title;
    QString content;
    QString created_at;
    QString read_at;
};

/// One reply to a list request; the counts are 0 where the platform gives none.
struct NotifyMessageResponse
{
    int total = 0;
    int offset = 0;
    int limit = 0;
    QVector<NotifyMessage> messages;
};

using list_message_callback = std::function<void(bool, const NotifyMessageResponse&)>;

/// Shows a domain user the platform's unread messages: polls while the session is active, shows each message
/// as a notification and marks it read. Idle for local users, and where the daemon's information file lacks
/// host or port. Requests block; see HandleEvent.
class MessagePlatform : public QObject
{
    Q_OBJECT

public:
    MessagePlatform(QObject* parent, QString userName, MessageTransfer* transfer);

    bool isLdapUser();
    bool loadCfg();
    void initHttpApi();
    void initPlatformMessage();

    /// A poll interval in milliseconds, from min up to but not including max (min if both are equal). It
    /// depends only on the second of the day.
    int generateRandnum(const int& max, const int& min);

    void unreadMessages(const QString& uid, const int& page, const int& limit);

    /// Both request a list and return 0 once the list and its follow-ups have been handled. Results arrive
    /// through OnRecvMsg only; the callback is never called.
    int getNotifyMessageList(const QString& uid, bool isNotRead, int page, int limit,
                             list_message_callback callback);
    int getNotifyMessageList(const NotifyMessageOption& option, list_message_callback callback);

    /// Marks one message read on the platform.
    void messageRespond(const QString& uuid);

public Q_SLOTS:
    void onUnReadMessages();

    /// Handles any reply of the platform, and requests the next message while the reply counts more than one.
    void OnRecvMsg(const int& statusCode, const QString& body,
                   const QList<QPair<QByteArray, QByteArray>>& rawHeaders);

private:
    void show(const NotifyMessage& message);
    void requestList(const NotifyMessageOption& option);

    // Other code is compiled against exactly these members in this order: add none and remove none. Anything
    // else lives in a child object.
    QTimer* m_timer = nullptr; ///< without a parent, kept until the process ends
    QString m_userName;
    QString m_appPath;
    QVector<NotifyMessage> m_messages; ///< never filled
    QString m_host;
    QString m_port;
    QString m_requestUrl;
    QString m_listUrl;
    QString m_readUrl;
    MessageTransfer* m_transfer;
};
