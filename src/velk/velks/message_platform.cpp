#include "message_platform.h"

#include <QDateTime>
#include <QDebug>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTime>
#include <QTimer>

#include "constants.h"
#include "filecontent.h"
#include "follow_ups.h"
#include "handleevent.h"
#include "message_transfer.h"
#include "session_user.h"

namespace {

/// Seconds since the epoch, in the 32 bits that the platform expects.
quint32 currentSeconds()
{
    return static_cast<quint32>(QDateTime::currentSecsSinceEpoch());
}

NotifyMessage messageOf(const QJsonObject& object)
{
    NotifyMessage message;
    message.uuid = object.value(QLatin1String("uuid")).toString();
    message.uid = object.value(QLatin1String("uid")).toString();
    message.send_uid = object.value(QLatin1String("send_uid")).toString();
    message.title = object.value(QLatin1String("title")).toString();
    message.content = object.value(QLatin1String("content")).toString();
    message.created_at = object.value(QLatin1String("created_at")).toString();
    message.read_at = object.value(QLatin1String("read_at")).toString();
    return message;
}

/// The counts of a reply. Header names are compared case-sensitively, as the platform writes them.
NotifyMessageResponse responseOf(const QList<QPair<QByteArray, QByteArray>>& rawHeaders)
{
    NotifyMessageResponse response;
    for (const auto& [name, value] : rawHeaders) {
        if (name == "X-Total-Count") {
            response.total = value.toInt();
        } else if (name == "X-Total-Limit") {
            response.limit = value.toInt();
        } else if (name == "X-Total-Offset") {
            response.offset = value.toInt();
        }
    }
    return response;
}

FollowUps& followUpsOf(const MessagePlatform& platform)
{
    return *platform.findChild<FollowUps*>(QString(), Qt::FindDirectChildrenOnly);
}

} // namespace

MessagePlatform::MessagePlatform(QObject* parent, QString userName, MessageTransfer* transfer)
    : QObject(parent)
    , m_userName(userName)
    , m_transfer(transfer)
{
    new FollowUps([this] { unreadMessages(m_userName, 1, 1); }, this);
    if (!isLdapUser()) {
        qInfo() << "is not ldap user:" << m_userName;
        return;
    }
    if (!loadCfg()) {
        return;
    }
    qInfo() << "---------load cfg";
    initHttpApi();
    initPlatformMessage();

    const QString baseUrl = velk::kUrlHead.arg(m_host, m_port);
    m_listUrl = baseUrl + QStringLiteral("notification/v2/list");
    m_appPath = QStringLiteral("/usr/bin/velkm");
    qInfo() << "MessagePlatform"
            << "app path" << m_appPath;
    m_readUrl = baseUrl + QStringLiteral("notification/v2/read");

    HandleEvent::GetInstance()->getPasswdExpiredTime(velk::KPasswdExpired.arg(m_host, m_port), m_userName);
}

bool MessagePlatform::isLdapUser()
{
    return isDomainUser();
}

bool MessagePlatform::loadCfg()
{
    return velk::base::FileContent::getHostAndPort(m_host, m_port);
}

// The connected slot changes the object. NOLINTNEXTLINE(readability-make-member-function-const)
void MessagePlatform::initHttpApi()
{
    HandleEvent::GetInstance()->initHttpApi();
    connect(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg, this, &MessagePlatform::OnRecvMsg);
}

void MessagePlatform::initPlatformMessage()
{
    m_timer = new QTimer;
    connect(m_timer, &QTimer::timeout, this, &MessagePlatform::onUnReadMessages);
    m_timer->start(generateRandnum(kLongestFirstPollInterval, kShortestPollInterval));
}

int MessagePlatform::generateRandnum(const int& max, const int& min)
{
    if (max == min) {
        return min;
    }
    // Keep the old generator and its seed: fleets plan the spread of their polls with them.
    QT_WARNING_PUSH
    QT_WARNING_DISABLE_DEPRECATED
    qsrand(static_cast<uint>(QTime(0, 0).secsTo(QTime::currentTime())));
    return qrand() % (max - min) + min;
    QT_WARNING_POP
}

void MessagePlatform::onUnReadMessages()
{
    const MessageTransfer::Screen_State state = m_transfer->getScreenState();
    qInfo() << "screen state-----:" << static_cast<int>(state);
    if (state != MessageTransfer::ScreenActive) {
        return;
    }
    unreadMessages(m_userName, 1, 1);
    m_timer->stop();
    m_timer->start(generateRandnum(kLongestPollInterval, kShortestPollInterval));
}

void MessagePlatform::unreadMessages(const QString& uid, const int& page, const int& limit)
{
    getNotifyMessageList(uid, true, page, limit, {});
}

int MessagePlatform::getNotifyMessageList(const QString& uid, bool isNotRead, int page, int limit,
                                          list_message_callback callback)
{
    NotifyMessageOption option;
    option.uid = uid;
    option.is_not_read = isNotRead;
    option.limit = limit;
    option.offset = (page == 0 ? 0 : page - 1) * limit;
    return getNotifyMessageList(option, callback);
}

int MessagePlatform::getNotifyMessageList(const NotifyMessageOption& option,
                                          list_message_callback /*callback*/)
{
    followUpsOf(*this).after([this, &option] { requestList(option); });
    return 0;
}

void MessagePlatform::requestList(const NotifyMessageOption& option)
{
    // The platform expects the key "timestaps" and compares the values unencoded.
    m_requestUrl = QStringLiteral("%1?uid=%2&is_not_read=%3&limit=%4&offset=%5&order=%6&desc=%7&timestaps=%8")
                       .arg(m_listUrl, option.uid, QString::number(option.is_not_read ? 1 : 0),
                            QString::number(option.limit), QString::number(option.offset), option.order,
                            option.desc, QString::number(currentSeconds()));
    qInfo() << "Rquest[GET]: " << m_requestUrl;

    HandleEvent::GetInstance()->getPlatformMsg(m_requestUrl);
}

void MessagePlatform::OnRecvMsg(const int& /*statusCode*/, const QString& body,
                                const QList<QPair<QByteArray, QByteArray>>& rawHeaders)
{
    NotifyMessageResponse response = responseOf(rawHeaders);
    qInfo() << "OnRecvMsg";
    qInfo() << "msg----count:" << response.total;

    const QJsonArray elements = QJsonDocument::fromJson(body.toLocal8Bit()).array();
    for (const QJsonValue& element : elements) {
        response.messages.append(messageOf(element.toObject()));
        if (response.messages.constLast().read_at.isEmpty()) {
            show(response.messages.constLast());
        }
    }

    followUpsOf(*this).count(response.total);
}

void MessagePlatform::show(const NotifyMessage& message)
{
    messageRespond(message.uuid);
    HandleEvent::GetInstance()->sendMessage(m_appPath, message.title, message.content, message.send_uid,
                                            message.created_at, 0);
}

void MessagePlatform::messageRespond(const QString& uuid)
{
    const QString body = QStringLiteral(R"({"uuid":"%1"})").arg(uuid);
    // Unlike in the list request, the platform expects a signed time here.
    const QString url =
        m_readUrl + QStringLiteral("?timestaps=") + QString::number(static_cast<qint32>(currentSeconds()));
    qInfo() << "---------Qurl" << url << ":qJsonBuf:" << body;
    HandleEvent::GetInstance()->respondPlatformMsg(url, body);
}
