#pragma once

#include <QDBusAbstractInterface>
#include <QString>

/// The daemon's proxy with no more than a floor needs: one signal, and calls whose replies are dropped.
class BareDaemon : public QDBusAbstractInterface
{
    Q_OBJECT

public:
    BareDaemon();

    /// Announces the session as the agent does.
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

/// Does nothing: its symbol is where the count of a start's instructions ends.
extern "C" void startEnds();
