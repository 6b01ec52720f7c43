#include "entry.h"

#include <QDBusArgument>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QDBusReply>
#include <QDBusVariant>

namespace {

const QString kId = QStringLiteral("Id");
const QString kName = QStringLiteral("Name");
const QString kWindowInfos = QStringLiteral("WindowInfos");

/// Whether a read failed because the entry does not exist. All other errors come from an existing entry.
bool saysThatNothingIsThere(const QDBusError& error)
{
    switch (error.type()) {
    case QDBusError::ServiceUnknown:
    case QDBusError::UnknownObject:
    case QDBusError::UnknownInterface:
    case QDBusError::UnknownMethod: // older D-Bus libraries answer this for a missing object
    case QDBusError::Disconnected:
        return true;
    default:
        return false;
    }
}

/// A text; values of other types are not converted.
QString textOf(const QVariant& value)
{
    return value.type() == QVariant::String ? value.toString() : QString();
}

/// The windows from a map of identifiers to values of any type; empty for anything else.
std::optional<WindowInfoMap> windowInfosOf(const QVariant& value)
{
    const auto argument = value.value<QDBusArgument>();
    if (!argument.currentSignature().startsWith(QLatin1String("a{u"))) {
        return {};
    }
    WindowInfoMap infos;
    argument.beginMap();
    while (!argument.atEnd()) {
        uint window = 0;
        argument.beginMapEntry();
        argument >> window;
        argument.asVariant(); // skips the value
        argument.endMapEntry();
        infos.insert(window, {});
    }
    argument.endMap();
    return infos;
}

} // namespace

__Entry::__Entry(const QString& service, const QString& path, const QDBusConnection& connection,
                 QObject* parent)
    : QObject(parent)
    , m_object{connection, service, path, QString::fromLatin1(staticInterfaceName())}
    , m_signals(EntrySignals::of(connection, service, m_object.interface))
{
    // Subscribe before reading, so that no change is missed.
    m_signals->add(path, this);
    const QDBusReply<QDBusVariant> reply = m_object.get(kId);
    if (reply.isValid()) {
        m_id = textOf(reply.value().variant());
    } else {
        m_isValid = !saysThatNothingIsThere(reply.error());
    }
}

__Entry::~__Entry()
{
    m_signals->remove(m_object.path, this);
}

bool __Entry::isValid() const
{
    return m_isValid;
}

QString __Entry::id()
{
    if (m_isValid && !m_id) {
        const QVariant id = m_object.read(kId);
        if (id.isValid()) {
            m_id = textOf(id);
        }
    }
    return m_id.value_or(QString());
}

QString __Entry::name()
{
    m_knownName = textOf(readNow(kName));
    return *m_knownName;
}

bool __Entry::isDocked() const
{
    return m_object.read(QStringLiteral("IsDocked")).toBool();
}

WindowInfoMap __Entry::windowInfos()
{
    const auto infos = windowInfosOf(readNow(kWindowInfos)).value_or(WindowInfoMap());
    m_knownWindows = infos.keys();
    return infos;
}

/// Announcements that precede the dock's answer in this thread's queue are older than the value. Those that
/// follow it are news, even if they arrived before this thread woke up.
QVariant __Entry::readNow(const QString& property)
{
    auto* watcher = ask(property);
    ++m_queuedBefore[property];
    connect(watcher, &QDBusPendingCallWatcher::finished, this, [this, property, watcher] {
        // Counted once, even if QtDBus signals an answer twice.
        watcher->disconnect(this);
        watcher->deleteLater();
        --m_queuedBefore[property];
    });
    QDBusPendingReply<QDBusVariant> reply = *watcher;
    reply.waitForFinished();
    return reply.isError() ? QVariant() : reply.value().variant();
}

/// A call whose watcher is notified at the answer's place in the queue. A watcher that was created after the
/// answer arrived is notified at a later place, so the dock is asked again.
QDBusPendingCallWatcher* __Entry::ask(const QString& property)
{
    QDBusPendingCallWatcher* watcher = nullptr;
    do {
        delete watcher;
        watcher = new QDBusPendingCallWatcher(m_object.bus.asyncCall(m_object.readCall(property)), this);
    } while (watcher->isFinished() && !watcher->isError());
    return watcher;
}

void __Entry::onPropertiesChanged(const QDBusMessage& signal)
{
    const auto changed = qdbus_cast<QVariantMap>(signal.arguments().value(1));
    for (auto property = changed.cbegin(); property != changed.cend(); ++property) {
        receive(property.key(), property.value());
    }
    const QStringList invalidated = signal.arguments().value(2).toStringList();
    for (const QString& property : {kName, kWindowInfos}) {
        if (invalidated.contains(property) && m_queuedBefore.value(property) == 0) {
            readAgain(property);
        }
    }
}

void __Entry::onOwnSignal(const QDBusMessage& signal)
{
    const QString suffix = QStringLiteral("Changed");
    if (signal.member().endsWith(suffix)) {
        receive(signal.member().chopped(suffix.size()), signal.arguments().value(0));
    }
}

void __Entry::receive(const QString& property, const QVariant& value)
{
    if (m_queuedBefore.value(property) == 0) {
        notice(property, value);
    }
}

void __Entry::readAgain(const QString& property)
{
    if (m_reads.contains(property)) {
        m_reads[property] = true;
        return;
    }
    m_reads[property] = false;
    auto* watcher = new QDBusPendingCallWatcher(m_object.bus.asyncCall(m_object.readCall(property)), this);
    connect(watcher, &QDBusPendingCallWatcher::finished, this, [this, property, watcher] {
        watcher->deleteLater();
        const QDBusPendingReply<QDBusVariant> reply = *watcher;
        if (!reply.isError()) {
            notice(property, reply.value().variant());
        }
        if (m_reads.take(property)) {
            readAgain(property);
        }
    });
}

void __Entry::notice(const QString& property, const QVariant& value)
{
    if (property == kName && value.type() == QVariant::String) {
        noticeName(value.toString());
    } else if (property == kWindowInfos) {
        if (const auto infos = windowInfosOf(value)) {
            noticeWindowInfos(*infos);
        }
    }
}

void __Entry::noticeName(const QString& name)
{
    if (m_knownName != name) {
        m_knownName = name;
        Q_EMIT NameChanged(name);
    }
}

void __Entry::noticeWindowInfos(const WindowInfoMap& infos)
{
    if (m_knownWindows != infos.keys()) {
        m_knownWindows = infos.keys();
        Q_EMIT WindowInfosChanged(infos);
    }
}
