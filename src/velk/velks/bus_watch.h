#pragma once

#include <QObject>
#include <QString>

class QDBusConnection;

/// Ends the program, with one line and a status other than 0, when a bus is lost or was never there. QtDBus
/// does not connect again: a program that lives on hears nothing any more, while its service manager would
/// start a fresh one.
///
/// It ends when the event loop gets to it, so whatever runs at that moment is carried out first.
class BusWatch : public QObject
{
    Q_OBJECT

public:
    /// `kind` is what the line calls the bus.
    BusWatch(QDBusConnection bus, const QString& kind);

private Q_SLOTS:
    void endProgram();

private:
    QString m_kind;
    bool m_hasTold = false;
};
