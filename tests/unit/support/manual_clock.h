#pragma once

#include <QSaveFile>

/// Moves this program's clock ahead, to so many seconds after its start. The program must run with the
/// preloaded clock of velk_add_unit_test(... MANUAL_CLOCK); timers that became due fire when the event loop
/// runs next.
inline void setClockAhead(double seconds)
{
    QSaveFile file(QString::fromLocal8Bit(qgetenv("FAKETIME_TIMESTAMP_FILE")));
    if (!file.open(QIODevice::WriteOnly)) {
        qFatal("this test has no clock that it can move");
    }
    file.write("+" + QByteArray::number(seconds, 'f', 3) + "s\n");
    file.commit();
}
