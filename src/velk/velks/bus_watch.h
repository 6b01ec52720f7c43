#pragma once

#include <QObject>
#include <QString>

class QDBusConnection;

/// Ends the program with one log line and a status other than 0 when a bus is lost or was never there. QtDBus
/// does not reconnect: a program that stays alive is deaf, whereas its service manager would start a fresh
/// one.
///
/// The program ends when control returns to the event loop, so work in progress is finished first.
class BusWatch : public QObject
{
    Q_OBJECT

public:
    /// `kind` names the bus in the log line.
    BusWatch(QDBusConnection bus, const QString& kind);

private Q_SLOTS:
    void endProgram();

private:
    QString m_kind;
    bool m_isEnding = false;
};
