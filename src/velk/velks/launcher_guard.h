#pragma once

#include <QList>
#include <QObject>
#include <QStringList>

#include "types.h"

class __Launcherd; // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)

/// One record of the software inventory.
struct SoftwareInfo
{
    QString packageName;
    QString name; ///< display name
    qint32 id = 0; ///< the platform's identifier, -1 for software known only from the launcher
    QString version; ///< as installed; "failed" if the package tool failed
    QString architecture;
    qint32 installedType = 0; ///< the kind of installation, 2 for software known only from the launcher
};

/// Watches the desktop's launcher and lists the installed software. If the launcher is absent at the start,
/// waits for it; if it leaves later, does not wait for it to return.
///
/// The package tools look packages up. Each run blocks for 60 s at most: 30 s to start and 30 s to end.
class LauncherGuard : public QObject
{
    Q_OBJECT

public:
    explicit LauncherGuard(QObject* parent);

    /// Every launcher item with its package, in the launcher's order; an inventory file's record of a package
    /// takes precedence over the package tools. Empty without a launcher.
    QList<SoftwareInfo> getSoftwareList();

    /// Adds the records of one inventory file; false if the file holds no JSON array.
    bool getSoftwareList(const QString& path);

    /// Empty if the launcher is absent or fails. The misspelt name is kept: callers use it.
    LauncherItemInfoList GetLauncerItems();

    /// Empty if no package owns the file.
    QString getPackageNameByDesktop(const QString& desktop);

    /// Empty for an unknown package; "failed" without a name or when the tool does not end in time.
    QString getCurVersion(const QString& packageName);

    /// "failed" when the tool does not end in time.
    QString getCurArch();

Q_SIGNALS:
    /// info is the display name and the package's version.
    void softwareChanged(QString action, QStringList info);
    /// Emitted once, when a launcher that was absent at the start has appeared.
    void softwareInited();

public Q_SLOTS:
    void onItemChanged(const QString& action, const LauncherItemInfo& info, qlonglong categoryId);

private:
    void watchLauncher(__Launcherd* launcher);
    SoftwareInfo softwareOf(const LauncherItemInfo& item, const QString& architecture);

    QList<SoftwareInfo> m_softwareList; ///< from the inventory files, while a list is built
    __Launcherd* m_launcher = nullptr;
};
