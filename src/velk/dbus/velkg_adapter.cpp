#include "velkg_adapter.h"

velkgAdapter::velkgAdapter(QObject* parent)
    : QDBusAbstractAdaptor(parent)
{
    setAutoRelaySignals(true);
}

int velkgAdapter::GetDomainStatus()
{
    int reply = 0;
    QMetaObject::invokeMethod(parent(), "GetDomainStatus", Q_RETURN_ARG(int, reply));
    return reply;
}

QString velkgAdapter::GetMachineID()
{
    QString reply;
    QMetaObject::invokeMethod(parent(), "GetMachineID", Q_RETURN_ARG(QString, reply));
    return reply;
}

int velkgAdapter::GetNetStatus()
{
    int reply = 0;
    QMetaObject::invokeMethod(parent(), "GetNetStatus", Q_RETURN_ARG(int, reply));
    return reply;
}

int velkgAdapter::GetPolicyPullTime()
{
    int reply = 0;
    QMetaObject::invokeMethod(parent(), "GetPolicyPullTime", Q_RETURN_ARG(int, reply));
    return reply;
}

QString velkgAdapter::GetServerIP()
{
    QString reply;
    QMetaObject::invokeMethod(parent(), "GetServerIP", Q_RETURN_ARG(QString, reply));
    return reply;
}

QString velkgAdapter::GetServerPort()
{
    QString reply;
    QMetaObject::invokeMethod(parent(), "GetServerPort", Q_RETURN_ARG(QString, reply));
    return reply;
}

void velkgAdapter::SendUserStatus(int type, const QString& userName)
{
    QMetaObject::invokeMethod(parent(), "SendUserStatus", Q_ARG(int, type), Q_ARG(QString, userName));
}

void velkgAdapter::UpdateUserInfo(const QString& name, int id)
{
    QMetaObject::invokeMethod(parent(), "UpdateUserInfo", Q_ARG(QString, name), Q_ARG(int, id));
}

int velkgAdapter::onDomainConfig(const QString& type)
{
    int reply = 0;
    QMetaObject::invokeMethod(parent(), "onDomainConfig", Q_RETURN_ARG(int, reply), Q_ARG(QString, type));
    return reply;
}

void velkgAdapter::onPolicyFinished(int taskID, int jobID, int code, const QString& ack)
{
    QMetaObject::invokeMethod(parent(), "onPolicyFinished", Q_ARG(int, taskID), Q_ARG(int, jobID),
                              Q_ARG(int, code), Q_ARG(QString, ack));
}

void velkgAdapter::onUploadFinished(const QString& url, const QString& data)
{
    QMetaObject::invokeMethod(parent(), "onUploadFinished", Q_ARG(QString, url), Q_ARG(QString, data));
}

void velkgAdapter::sendAppOpenState(int type, const QString& appName)
{
    QMetaObject::invokeMethod(parent(), "sendAppOpenState", Q_ARG(int, type), Q_ARG(QString, appName));
}
