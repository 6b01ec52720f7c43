#include "pryg_adapter.h"

prygAdapter::prygAdapter(QObject* parent)
    : QDBusAbstractAdaptor(parent)
{
    setAutoRelaySignals(true);
}

void prygAdapter::PullAndExeSysPolicy()
{
    QMetaObject::invokeMethod(parent(), "PullAndExeSysPolicy");
}

void prygAdapter::onPolicyMsg(const QString& payload)
{
    QMetaObject::invokeMethod(parent(), "onPolicyMsg", Q_ARG(QString, payload));
}
