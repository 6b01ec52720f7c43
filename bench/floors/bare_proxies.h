#pragma once

#include <QDBusAbstractInterface>
#include <QString>

/// The daemon's proxy with no more than a floor needs: one signal, and calls whose replies are dropped.
class BareDaemon : public QDBusAbstractInterface
{
    Q_OBJECT

public:
    BareDaemon();

    /// Reports the session as the agent does.
    void announce();

Q_SIGNALS:
    void pushPolicyMsg(const QString& appID, const QString& payload);
};

/// The session policy service's proxy.
class BarePolicyService : public QDBusAbstractInterface
{
    Q_OBJECT

public:
    BarePolicyService();
};

/// Does nothing: callgrind ends its count of a start's instructions at this symbol.
extern "C" void startEnds();
