#include "service_checks.h"

#include <QDBusArgument>
#include <QDBusConnection>
#include <QDBusError>
#include <QDBusMessage>
#include <QDBusObjectPath>
#include <QDBusVariant>

#include "remote_object.h"
#include "services.h"

namespace velk::check {

namespace {

constexpr int kPatienceMs = 2000; // for an answer that takes a service no work

/// A call that changes nothing; no object if the service need not be called.
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
         QStringLiteral("the user's name is unknown, and policies cannot log the user out"),
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

/// Why this user cannot use a service that is on the bus; empty if it answers.
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

/// The user's session requests the reboot at the exit from the domain; the login manager may refuse it.
Findings checkReboot(const QDBusConnection& bus)
{
    const QDBusMessage reply = ask(bus, service::kLoginManager,
                                   {QStringLiteral("/org/freedesktop/login1"),
                                    QStringLiteral("org.freedesktop.login1.Manager"),
                                    QStringLiteral("CanReboot"),
                                    {}});
    const bool isDenied = QDBusError(reply).type() == QDBusError::AccessDenied; // without a policy kit
    if (reply.type() != QDBusMessage::ReplyMessage && !isDenied) {
        return {}; // checkService() has reported a login manager that does not answer
    }
    const QString answer = isDenied ? reply.errorMessage() : reply.arguments().value(0).toString();
    const QString subject = QStringLiteral("reboot");
    if (answer == QLatin1String("yes")) {
        return {{Grade::Good, subject, QStringLiteral("is permitted to this user now")}};
    }
    return {{Grade::Warning, subject,
             QStringLiteral("would be refused now (%1): the domain exit would not reboot; "
                            "docs/terminal.md of the package gives causes and remedies")
                 .arg(answer)}};
}

/// The login manager's answer about a property of the user or of a session.
QDBusMessage askLoginManager(const QDBusConnection& bus, const QString& object, const QString& kind,
                             const QString& name)
{
    const QString interface = QStringLiteral("org.freedesktop.login1.") + kind;
    return ask(bus, service::kLoginManager, property(object, interface, name));
}

/// Invalid if there was no answer.
QVariant value(const QDBusMessage& answer)
{
    return answer.arguments().value(0).value<QDBusVariant>().variant();
}

/// The login manager's type, class and activity of one session.
Finding judgeSession(const QString& type, const QString& sessionClass, bool isActive)
{
    const QString subject = QStringLiteral("session");
    const bool isGraphical = type == QLatin1String("x11") || type == QLatin1String("wayland");
    if (!isGraphical || !sessionClass.startsWith(QLatin1String("user"))) {
        return {Grade::Bad, subject,
                QStringLiteral("this user has no graphical one: nobody sees a warning, and a policy may end "
                               "another session; systemctl --user stop velks ends an agent that is left "
                               "without its session")};
    }
    return {Grade::Good, subject,
            QStringLiteral("is graphical (%1)").arg(type)
                + (isActive ? QString() : QStringLiteral(", in the background"))};
}

/// The session that the login manager prefers among those of the user, which a policy ends.
Findings checkSession(const QDBusConnection& bus)
{
    const QDBusMessage answer = askLoginManager(bus, QStringLiteral("/org/freedesktop/login1/user/self"),
                                                QStringLiteral("User"), QStringLiteral("Display"));
    if (QDBusError(answer).type() == QDBusError::UnknownObject) { // of a user without any session
        return {judgeSession({}, {}, false)};
    }
    const QVariant display = value(answer);
    if (display.userType() != qMetaTypeId<QDBusArgument>()) {
        return {}; // checkService() has reported a login manager that does not answer
    }
    QString name;
    QDBusObjectPath object;
    const auto content = display.value<QDBusArgument>();
    content.beginStructure();
    content >> name >> object;
    content.endStructure();
    if (name.isEmpty()) {
        return {judgeSession({}, {}, false)};
    }
    const auto ofSession = [&](const QString& property) {
        return value(askLoginManager(bus, object.path(), QStringLiteral("Session"), property));
    };
    return {judgeSession(ofSession(QStringLiteral("Type")).toString(),
                         ofSession(QStringLiteral("Class")).toString(),
                         ofSession(QStringLiteral("Active")).toBool())};
}

} // namespace

Findings checkServices()
{
    const QDBusConnection system = QDBusConnection::systemBus();
    Findings findings = checkBus(system, QStringLiteral("system"), systemServices());
    findings += checkSession(system);
    findings += checkReboot(system);
    findings += checkBus(QDBusConnection::sessionBus(), QStringLiteral("session"), sessionServices());
    return findings;
}

} // namespace velk::check
