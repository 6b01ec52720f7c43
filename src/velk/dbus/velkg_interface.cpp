#include "velkg_interface.h"

velkgInterface::velkgInterface(const QString& service, const QString& path, const QDBusConnection& connection,
                               QObject* parent)
    : QDBusAbstractInterface(service, path, staticInterfaceName(), connection, parent)
{ }

QDBusPendingReply<int> velkgInterface::GetDomainStatus()
{
    return asyncCallWithArgumentList(QStringLiteral("GetDomainStatus"), {});
}

QDBusPendingReply<QString> velkgInterface::GetMachineID()
{
    return asyncCallWithArgumentList(QStringLiteral("GetMachineID"), {});
}

QDBusPendingReply<int> velkgInterface::GetNetStatus()
{
    return asyncCallWithArgumentList(QStringLiteral("GetNetStatus"), {});
}

QDBusPendingReply<int> velkgInterface::GetPolicyPullTime()
{
    return asyncCallWithArgumentList(QStringLiteral("GetPolicyPullTime"), {});
}

QDBusPendingReply<QString> velkgInterface::GetServerIP()
{
    return asyncCallWithArgumentList(QStringLiteral("GetServerIP"), {});
}

QDBusPendingReply<QString> velkgInterface::GetServerPort()
{
    return asyncCallWithArgumentList(QStringLiteral("GetServerPort"), {});
}

QDBusPendingReply<> velkgInterface::SendUserStatus(int type, const QString& userName)
{
    return m_unreadCalls.send(*this, QStringLiteral("SendUserStatus"), {QVariant(type), QVariant(userName)});
}

QDBusPendingReply<> velkgInterface::UpdateUserInfo(const QString& name, int id)
{
    return m_unreadCalls.send(*this, QStringLiteral("UpdateUserInfo"), {QVariant(name), QVariant(id)});
}

QDBusPendingReply<int> velkgInterface::onDomainConfig(const QString& type)
{
    return asyncCallWithArgumentList(QStringLiteral("onDomainConfig"), {QVariant(type)});
}

QDBusPendingReply<> velkgInterface::onPolicyFinished(int taskID, int jobID, int code, const QString& ack)
{
    return m_unreadCalls.send(*this, QStringLiteral("onPolicyFinished"),
                              {QVariant(taskID), QVariant(jobID), QVariant(code), QVariant(ack)});
}

QDBusPendingReply<> velkgInterface::onUploadFinished(const QString& url, const QString& data)
{
    return m_unreadCalls.send(*this, QStringLiteral("onUploadFinished"), {QVariant(url), QVariant(data)});
}

QDBusPendingReply<> velkgInterface::sendAppOpenState(int type, const QString& appName)
{
    return m_unreadCalls.send(*this, QStringLiteral("sendAppOpenState"), {QVariant(type), QVariant(appName)});
}
