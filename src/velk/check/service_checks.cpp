#include "service_checks.h"

#include <QDBusConnection>
#include <QDBusError>
#include <QDBusMessage>

#include "remote_object.h"
#include "services.h"

namespace velk::check {

namespace {

constexpr int kPatienceMs = 2000; // for an answer that a service has at hand

/// A call that changes nothing; no object if the service need not be asked.
struct Question
{
    QString object;
    QString interface;
    QString member;
    QVariantList arguments;
};

struct Service
{
    QString name;
    Grade whenUseless;
    QString purpose; ///< what does not work without it
    Question question;
};

Question property(const QString& object, const QString& interface, const QString& name)
{
    return {
        object, QStringLiteral("org.freedesktop.DBus.Properties"), QStringLiteral("Get"), {interface, name}};
}

QList<Service> systemServices()
{
    return {
        {service::kDaemon,
         Grade::Bad,
         QStringLiteral("no policy arrives, nothing is reported"),
         {QStringLiteral("/com/norix/velk/velkg"), service::kDaemon, QStringLiteral("GetMachineID"), {}}},
        {service::kLoginManager, Grade::Bad,
         QStringLiteral("the user's name is not known, nobody can be logged out"),
         property(QStringLiteral("/org/freedesktop/login1/user/self"),
                  QStringLiteral("org.freedesktop.login1.User"), QStringLiteral("Name"))},
        {service::kIdentityService, Grade::Warning,
         QStringLiteral("leaving the domain does not switch it off"),
         property(QStringLiteral("/com/norix/velk/iam"), service::kIdentityService,
                  QStringLiteral("Enable"))},
    };
}

QList<Service> sessionServices()
{
    return {
        {service::kPolicyService, Grade::Warning, QStringLiteral("forwarded policies are lost"), {}},
        {service::kNotifications, Grade::Bad, QStringLiteral("the user sees no warning and no message"), {}},
        {service::kScreenSaver,
         Grade::Warning,
         QStringLiteral("the session never counts as behind the screen saver"),
         {}},
        {service::kSessionManager, Grade::Warning, QStringLiteral("the session never counts as locked"), {}},
        {service::kDock, Grade::Warning, QStringLiteral("opened applications are not reported"), {}},
        {service::kLauncher, Grade::Warning, QStringLiteral("software is not reported"), {}},
    };
}

QDBusMessage ask(const QDBusConnection& bus, const QString& name, const Question& question)
{
    QDBusMessage call =
        QDBusMessage::createMethodCall(name, question.object, question.interface, question.member);
    call.setArguments(question.arguments);
    call.setAutoStartService(false);
    return bus.call(call, QDBus::Block, kPatienceMs);
}

/// Why a service that is on the bus is of no use to this user; empty if it answers.
QString troubleWith(const QDBusConnection& bus, const Service& service)
{
    if (service.question.object.isEmpty()) {
        return {};
    }
    const QDBusMessage reply = ask(bus, service.name, service.question);
    if (reply.type() != QDBusMessage::ErrorMessage) {
        return {};
    }
    if (QDBusError(reply).type() == QDBusError::AccessDenied) {
        return QStringLiteral("may not be called by this user; the bus lacks a policy such as "
                              "com.norix.velk.conf among the package's examples");
    }
    return QStringLiteral("does not answer (%1)").arg(reply.errorMessage());
}

Finding checkService(const QDBusConnection& bus, const Service& service)
{
    const QString subject = QStringLiteral("service");
    const QString trouble =
        isOnBus(bus, service.name) ? troubleWith(bus, service) : QStringLiteral("is not there");
    if (trouble.isEmpty()) {
        return {Grade::Good, subject, service.name + QStringLiteral(" is there")};
    }
    return {service.whenUseless, subject,
            QStringLiteral("%1 %2: %3").arg(service.name, trouble, service.purpose)};
}

Findings checkBus(const QDBusConnection& bus, const QString& kind, const QList<Service>& services)
{
    if (!bus.isConnected()) {
        const QString help = qEnvironmentVariableIsSet("XDG_RUNTIME_DIR")
            ? QString()
            : QStringLiteral("; under su or sudo set XDG_RUNTIME_DIR=/run/user/UID");
        return {{Grade::Bad, kind + QStringLiteral(" bus"),
                 QStringLiteral("cannot be reached: ") + bus.lastError().message() + help}};
    }
    Findings findings;
    for (const Service& service : services) {
        findings.append(checkService(bus, service));
    }
    return findings;
}

/// The reboot at the exit from the domain is the user's own call, which the login manager may refuse.
Findings checkReboot(const QDBusConnection& bus)
{
    const QDBusMessage reply = ask(bus, service::kLoginManager,
                                   {QStringLiteral("/org/freedesktop/login1"),
                                    QStringLiteral("org.freedesktop.login1.Manager"),
                                    QStringLiteral("CanReboot"),
                                    {}});
    if (reply.type() != QDBusMessage::ReplyMessage) {
        return {}; // a login manager that does not answer has its line already
    }
    const QString answer = reply.arguments().value(0).toString();
    const QString subject = QStringLiteral("reboot");
    if (answer == QLatin1String("yes")) {
        return {{Grade::Good, subject, QStringLiteral("is permitted to this user now")}};
    }
    return {{Grade::Warning, subject,
             QStringLiteral("would be refused now (%1): leaving the domain would not end with it; "
                            "docs/terminal.md of the package says why and what helps")
                 .arg(answer)}};
}

} // namespace

Findings checkServices()
{
    const QDBusConnection system = QDBusConnection::systemBus();
    Findings findings = checkBus(system, QStringLiteral("system"), systemServices());
    findings += checkReboot(system);
    findings += checkBus(QDBusConnection::sessionBus(), QStringLiteral("session"), sessionServices());
    return findings;
}

} // namespace velk::check
