#include "entry.h"

#include <QDBusArgument>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QDBusVariant>

#include "entry_signals.h"

namespace {

const QString kName = QStringLiteral("Name");
const QString kWindowInfos = QStringLiteral("WindowInfos");

/// A text as it is; other types are not converted.
QString textOf(const QVariant& value)
{
    return value.type() == QVariant::String ? value.toString() : QString();
}

/// The windows of a map from their identifiers to values of any type; empty for anything else.
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
        argument.asVariant(); // goes past the value
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
    , m_signals(EntrySignals::of(connection, service))
{
    // Listened to before anything is read, so that no change falls between.
    m_signals->add(path, this);
    const QVariant id = m_object.read(QStringLiteral("Id"));
    if (id.isValid()) {
        m_id = textOf(id);
    }
}

__Entry::~__Entry()
{
    m_signals->remove(m_object.path, this);
}

bool __Entry::isValid() const
{
    return m_id.has_value();
}

QString __Entry::id() const
{
    return m_id.value_or(QString());
}

QString __Entry::name() const
{
    m_knownName = textOf(m_object.read(kName));
    m_signals->catchUp();
    return *m_knownName;
}

bool __Entry::isDocked() const
{
    return m_object.read(QStringLiteral("IsDocked")).toBool();
}

WindowInfoMap __Entry::windowInfos() const
{
    const auto infos = windowInfosOf(m_object.read(kWindowInfos)).value_or(WindowInfoMap());
    m_knownWindows = infos.keys();
    m_signals->catchUp();
    return infos;
}

void __Entry::onPropertiesChanged(const QVariantMap& changed, const QStringList& invalidated)
{
    for (auto property = changed.cbegin(); property != changed.cend(); ++property) {
        announce(property.key(), property.value());
    }
    for (const QString& property : {kName, kWindowInfos}) {
        if (invalidated.contains(property)) {
            readAgain(property);
        }
    }
}

void __Entry::onOwnSignal(const QDBusMessage& signal)
{
    const QString suffix = QStringLiteral("Changed");
    if (signal.member().endsWith(suffix)) {
        announce(signal.member().chopped(suffix.size()), signal.arguments().value(0));
    }
}

void __Entry::announce(const QString& property, const QVariant& value)
{
    if (!m_signals->isCatchingUp()) {
        tellOf(property, value);
    } else if (property == kName || property == kWindowInfos) {
        readAgain(property);
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
            tellOf(property, reply.value().variant());
        }
        if (m_reads.take(property)) {
            readAgain(property);
        }
    });
}

void __Entry::tellOf(const QString& property, const QVariant& value)
{
    if (property == kName && value.type() == QVariant::String) {
        tellOfName(value.toString());
    } else if (property == kWindowInfos) {
        if (const auto infos = windowInfosOf(value)) {
            tellOfWindowInfos(*infos);
        }
    }
}

void __Entry::tellOfName(const QString& name)
{
    if (m_knownName != name) {
        m_knownName = name;
        Q_EMIT NameChanged(name);
    }
}

void __Entry::tellOfWindowInfos(const WindowInfoMap& infos)
{
    if (m_knownWindows != infos.keys()) {
        m_knownWindows = infos.keys();
        Q_EMIT WindowInfosChanged(infos);
    }
}
