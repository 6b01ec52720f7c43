#include "entryinfo.h"

#include <QDBusConnection>
#include <QDBusObjectPath>
#include <QDebug>

#include "services.h"

namespace velk::module::software {

EntryInfo::EntryInfo(const QDBusObjectPath& path)
    : m_entry(service::kDock, path.path(), QDBusConnection::sessionBus())
{
    if (!m_entry.isValid()) {
        qWarning() << "entry is invalid, path:" << path.path();
        return;
    }
    m_entryId = m_entry.id();
    m_appName = m_entry.name();
    m_winSize = m_entry.windowInfos().size();
    connect(&m_entry, &__Entry::WindowInfosChanged, this, &EntryInfo::onWinInfoChanged);
    connect(&m_entry, &__Entry::NameChanged, this, &EntryInfo::onNameChanged);
}

QString EntryInfo::entryId() const
{
    return m_entryId;
}

QString EntryInfo::appName() const
{
    return m_appName;
}

int EntryInfo::winSize() const
{
    return m_winSize;
}

bool EntryInfo::isDocked() const
{
    return m_entry.isDocked();
}

void EntryInfo::onWinInfoChanged(const QMap<uint, WindowInfo>& infos)
{
    const int size = infos.size();
    if (size != m_winSize) {
        Q_EMIT windowSizeChanged(size > m_winSize ? AppOpened : AppClosed, m_appName);
    }
    m_winSize = size;
}

void EntryInfo::onNameChanged(const QString& name)
{
    if (!name.isEmpty()) {
        m_appName = name;
    }
}

} // namespace velk::module::software
