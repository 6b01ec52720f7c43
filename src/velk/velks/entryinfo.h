#pragma once

#include <QObject>

#include "entry.h"

class QDBusObjectPath;

namespace velk::module::software {

/// The codes of sendAppOpenState.
enum AppState {
    AppOpened = 1,
    AppClosed = 2,
};

/// One entry of the dock: follows its name and the number of its windows. An unreachable entry has no
/// identifier, no name and no windows.
class EntryInfo : public QObject
{
    Q_OBJECT

public:
    explicit EntryInfo(const QDBusObjectPath& path);

    QString entryId() const;
    QString appName() const;
    int winSize() const;

    /// Asks the dock now.
    bool isDocked() const;

Q_SIGNALS:
    /// More windows (1) or fewer (2) than before; once per change, however large.
    void windowSizeChanged(int type, const QString& appName);

public Q_SLOTS:
    void onWinInfoChanged(const QMap<uint, WindowInfo>& infos);
    void onNameChanged(const QString& name);

private:
    __Entry m_entry;
    QString m_entryId;
    QString m_appName;
    qint32 m_winSize = 0;
};

} // namespace velk::module::software
