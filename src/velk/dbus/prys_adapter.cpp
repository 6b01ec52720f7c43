#include "prys_adapter.h"

prysAdapter::prysAdapter(QObject* parent)
    : QDBusAbstractAdaptor(parent)
{
    setAutoRelaySignals(true);
}

void prysAdapter::onPolicyMsg(const QString& payload)
{
    QMetaObject::invokeMethod(parent(), "onPolicyMsg", Q_ARG(QString, payload));
}
