#include "message_transfer.h"

#include <QDBusConnection>
#include <QDateTime>
#include <QDebug>
#include <QTimer>

#include <unistd.h>

#include "appopenspy.h"
#include "constants.h"
#include "domain_exit.h"
#include "filecontent.h"
#include "handleevent.h"
#include "launcher_guard.h"
#include "libvelkkpx.h"
#include "log_text.h"
#include "prys_interface.h"
#include "service_status.h"
#include "services.h"
#include "session_state.h"
#include "session_user.h"
#include "software_report.h"
#include "terminal_address.h"
#include "velkg_interface.h"

using velk::module::software::AppOpenSpy;

namespace {

constexpr int kActionDelay = 60000; // ms between a warning and its forced action
constexpr int kStatePeriod = 300000; // ms between two reports of the session's state

UserStatus statusOf(MessageTransfer::Screen_State state)
{
    switch (state) {
    case MessageTransfer::ScreenSaverRunning:
        return UserBehindScreenSaver;
    case MessageTransfer::ScreenLocked:
        return UserLocked;
    case MessageTransfer::ScreenActive:
        break;
    }
    return UserActive;
}

} // namespace

MessageTransfer::MessageTransfer(QObject* parent)
    : QObject(parent)
    , m_machineId(velk::base::FileContent::instace()->getMachineID())
{
    m_velkgInterface = new velkgInterface(velk::service::kDaemon, QStringLiteral("/com/norix/velk/velkg"),
                                          QDBusConnection::systemBus(), this);
    m_prysInterface = new prysInterface(velk::service::kPolicyService, QStringLiteral("/com/norix/velk/prys"),
                                        QDBusConnection::sessionBus(), this);
    connectDaemon();
    startSoftwareReports();

    readLoginUser();
    // The replies to reports are never read: a daemon that is absent now emits pushOnlineMsg when it appears.
    m_velkgInterface->UpdateUserInfo(m_userName, m_uid);
    startTimers();
    m_velkgInterface->SendUserStatus(UserActive, m_userName);

    // Connected directly: each application opened or closed is one call.
    connect(AppOpenSpy::instance(), &AppOpenSpy::appStateChange, m_velkgInterface,
            &velkgInterface::sendAppOpenState);
}

void MessageTransfer::connectDaemon()
{
    connect(m_velkgInterface, &velkgInterface::pushPolicyMsg, this, &MessageTransfer::onPolicyMsg);
    connect(
        m_velkgInterface, &velkgInterface::pushOnlineMsg, m_velkgInterface, [this] { reportAgain(); },
        Qt::DirectConnection);
}

void MessageTransfer::startSoftwareReports()
{
    m_launcherGuard = new LauncherGuard(this);
    connect(m_launcherGuard, &LauncherGuard::softwareChanged, this, &MessageTransfer::onSoftwareChanged);
    uploadSoftware(QString(), {});
    connect(m_launcherGuard, &LauncherGuard::softwareInited, this, [this] {
        qDebug() << "software inited";
        uploadSoftware(QString(), {});
    });
}

void MessageTransfer::startTimers()
{
    m_actionTimer = new QTimer(this);
    // A coarse timer may fire half a second early; the user was promised a minute.
    m_actionTimer->setTimerType(Qt::PreciseTimer);
    connect(m_actionTimer, &QTimer::timeout, this, &MessageTransfer::onTimeout);
    m_stateTimer = new QTimer(this);
    m_stateTimer->start(kStatePeriod);
    connect(m_stateTimer, &QTimer::timeout, this, &MessageTransfer::getUserState);
}

void MessageTransfer::readLoginUser()
{
    const LoginUser user = loginUser();
    m_userName = user.name;
    m_uid = user.uid;
}

void MessageTransfer::reportAgain()
{
    m_velkgInterface->UpdateUserInfo(m_userName, m_uid);
    qDebug() << "velkg restart sendonline  " << m_userName << m_uid;
    getUserState();
}

void MessageTransfer::onPolicyMsg(const QString& /*appID*/, const QString& payload)
{
    qInfo().noquote() << "onPolicyMsg"
                      << "---------payload:" << quoted(payload);
    std::optional<QJsonObject> message = parsePolicyMessage(payload);
    if (!message) {
        return;
    }
    const int code = message->value(QLatin1String("type")).toInt(0);
    const SessionPolicy policy = sessionPolicy(code);
    if (!isMeantForThisSession(policy.audience, *message)) {
        return;
    }

    switch (policy.action) {
    case SessionPolicy::Action::Forward:
        m_prysInterface->onPolicyMsg(payload);
        break;
    case SessionPolicy::Action::LeaveDomain:
        leaveDomain(policy.text, code);
        break;
    case SessionPolicy::Action::WarnThenLogOut:
        startTime(policy.text, code);
        break;
    case SessionPolicy::Action::Notify:
        notifySend(policy.text, 0);
        break;
    case SessionPolicy::Action::RequestPasswordChange:
        HandleEvent::GetInstance()->sendChangePasswdMessage();
        break;
    }
}

bool MessageTransfer::isMeantForThisSession(SessionPolicy::Audience audience, QJsonObject& message)
{
    switch (audience) {
    case SessionPolicy::Audience::EverySession:
        return true;
    case SessionPolicy::Audience::DomainUsers:
        return isLdapUser();
    case SessionPolicy::Audience::AddressedDomainUser:
        return isLdapUser() && isExecPolicyByUID(message);
    }
    return false;
}

void MessageTransfer::leaveDomain(const QString& warning, int code)
{
    rebootTime(warning, code);
    runRestoreScript();
    restoreConfiguration();
    m_velkgInterface->onDomainConfig(QStringLiteral("remove"));
    switchIdentityServiceOff();
}

void MessageTransfer::restoreConfiguration()
{
    restoreDesktop();
}

void MessageTransfer::onSoftwareChanged(QString action, QStringList info)
{
    uploadSoftware(action, info);
}

void MessageTransfer::uploadSoftware(QString type, QStringList info)
{
    const int change = softwareChange(type);
    qDebug() << type << info;
    if (change != 0) {
        uploadSoftwareChange(change, info);
    }

    const QList<SoftwareInfo> list = m_launcherGuard->getSoftwareList();
    if (!list.isEmpty()) {
        m_velkgInterface->onUploadFinished(velk::kUploadInfoUrl, inventoryReport(m_machineId, list));
    }
}

void MessageTransfer::uploadSoftwareChange(int change, const QStringList& info)
{
    SoftwareChange report;
    report.change = change;
    report.ipAddress = terminalAddress();
    report.hardwareAddress = terminalHardwareAddress();
    // Read for each report, whereas the inventory carries the identifier read at start-up. Keep the two
    // sources: the platform compares the identifiers.
    QDBusPendingReply<QString> machineId = m_velkgInterface->GetMachineID();
    machineId.waitForFinished();
    report.machineId = machineId.isError() ? QString() : machineId.value();
    report.name = info.value(0);
    report.version = info.value(1);
    report.terminalName = velk::base::FileContent::getTerminalAlias(nullptr);
    report.time = QDateTime::currentDateTime();

    const QString text = softwareChangeReport(report);
    qInfo().noquote() << "uploadSoftware"
                      << "---------" << quoted(text);
    m_velkgInterface->onUploadFinished(velk::kUploadInfoLogUrl, text);
}

void MessageTransfer::onTimeout()
{
    m_actionTimer->stop();
    showServiceStatus("");
    Libvelkkpx desktop;
    switch (sessionPolicy(m_pendingAction).action) {
    case SessionPolicy::Action::LeaveDomain:
        desktop.Reboot();
        break;
    case SessionPolicy::Action::WarnThenLogOut:
        desktop.Logout();
        break;
    default:
        break;
    }
}

void MessageTransfer::getUserState()
{
    // Read the name again: it may have changed since start-up.
    const QString name = loginUserName();
    m_velkgInterface->SendUserStatus(statusOf(getScreenState()), name);
}

MessageTransfer::Screen_State MessageTransfer::getScreenState()
{
    const bool running = isScreenSaverRunning();
    const bool locked = isScreenLocked();
    if (running) {
        return ScreenSaverRunning;
    }
    return locked ? ScreenLocked : ScreenActive;
}

bool MessageTransfer::isLdapUser()
{
    return isDomainUser();
}

bool MessageTransfer::isExecPolicyByUID(QJsonObject& obj)
{
    if (!obj.contains(QLatin1String("payload"))) {
        return false;
    }
    const qint32 sendUid =
        obj.value(QLatin1String("payload")).toObject().value(QLatin1String("uid")).toInt(0);
    const auto localUid = static_cast<qint32>(getuid());
    const bool flag = sendUid == localUid;
    qDebug() << "sendUID :" << sendUid << ", localUID:" << localUid << ",flag :" << flag;
    return flag;
}

void MessageTransfer::notifySend(const QString& msg, int timeout)
{
    HandleEvent::GetInstance()->sendMessage(kReminderTitle, msg, timeout);
}

void MessageTransfer::startTime(QString msg, int code)
{
    notifySend(msg, -1);
    startCountdown(code);
}

void MessageTransfer::rebootTime(QString msg, int code)
{
    constexpr uint defaultTimeout = static_cast<uint>(-1);
    HandleEvent::GetInstance()->sendMessage(QStringLiteral("reboot"), kReminderTitle, msg, QString(),
                                            QString(), defaultTimeout);
    startCountdown(code);
}

void MessageTransfer::startCountdown(int code)
{
    if (!m_actionTimer->isActive()) {
        showServiceStatus("within a minute the session is ended by a policy");
    }
    m_actionTimer->start(kActionDelay);
    m_pendingAction = code;
}
