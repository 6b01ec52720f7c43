/// Floor of the platform's messages: a start with the one child that it must run, and a request for the
/// password tips; then GET, notification and PUT for each unread message; a poll every three minutes.
///
/// usage: bench_drain HOST:PORT

#include <QCoreApplication>
#include <QDBusConnection>
#include <QDBusConnectionInterface>
#include <QDBusMessage>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTimer>

#include <chrono>

#include "bare_client.h"
#include "bare_proxies.h"
#include "package_tools.h"

namespace {

class Reader
{
public:
    explicit Reader(const QByteArray& base)
        : m_listUrl(base + "notification/v2/list?uid=u&is_not_read=1&limit=1&offset=0&order=create_at&desc=1")
        , m_readUrl(base + "notification/v2/read")
        , m_tipsUrl(base + "uim/v3/client/password/tips")
    { }

    void readTips()
    {
        if (m_client.get(m_tipsUrl, R"({"username":"u"})") > 1) {
            readAll();
        }
    }

    void poll()
    {
        if (isTrue(QStringLiteral("com.norix.ScreenSaver"), QStringLiteral("/com/norix/ScreenSaver"),
                   QStringLiteral("isRunning"))
            || isTrue(QStringLiteral("com.norix.SessionManager"), QStringLiteral("/com/norix/SessionManager"),
                      QStringLiteral("Locked"))) {
            return;
        }
        readAll();
    }

private:
    static bool isTrue(const QString& service, const QString& path, const QString& property)
    {
        auto bus = QDBusConnection::sessionBus();
        if (!bus.interface()->isServiceRegistered(service)) {
            return false;
        }
        auto call = QDBusMessage::createMethodCall(
            service, path, QStringLiteral("org.freedesktop.DBus.Properties"), QStringLiteral("Get"));
        call.setArguments({service, property});
        return bus.call(call).arguments().value(0).toBool();
    }

    void readAll()
    {
        int unread = 0;
        do {
            unread = m_client.get(m_listUrl);
            const QJsonArray messages = QJsonDocument::fromJson(m_client.body()).array();
            for (const auto& message : messages) {
                take(message.toObject());
            }
        } while (unread > 1);
    }

    void take(const QJsonObject& message)
    {
        const QByteArray uuid = message[QLatin1String("uuid")].toString().toUtf8();
        m_client.put(m_readUrl, R"({"uuid":")" + uuid + R"("})");

        const QString service = QStringLiteral("com.norix.kpx.Notification");
        auto call = QDBusMessage::createMethodCall(service, QStringLiteral("/com/norix/kpx/Notification"),
                                                   service, QStringLiteral("Notify"));
        const QString title = message[QLatin1String("title")].toString();
        const QString content = message[QLatin1String("content")].toString();
        const QStringList actions{QStringLiteral("_open"), QStringLiteral("查看")};
        const QVariantMap hints{{QStringLiteral("x-norix-action-_open"), title}};
        call.setArguments({title, 0U, QStringLiteral("velkw"), title, content, actions, hints, 0});
        QDBusConnection::sessionBus().call(call);
    }

    BareClient m_client;
    QByteArray m_listUrl;
    QByteArray m_readUrl;
    QByteArray m_tipsUrl;
};

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    BareDaemon daemon;
    const BarePolicyService policyService;
    askArchitecture();
    daemon.announce();

    Reader reader("https://" + QByteArray(argc > 1 ? argv[1] : "") + '/');
    QTimer timer;
    QObject::connect(&timer, &QTimer::timeout, [&reader] { reader.poll(); });
    // A wake-up by a signal of the daemon's lets the timer look at a clock that was moved.
    QObject::connect(&daemon, &BareDaemon::pushPolicyMsg, &timer, &QTimer::isActive);
    timer.start(std::chrono::minutes(3));
    reader.readTips();
    startEnds();
    return QCoreApplication::exec();
}
