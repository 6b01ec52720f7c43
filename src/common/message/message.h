#pragma once

#include <QJsonArray>
#include <QJsonObject>
#include <QString>
#include <QStringList>

/// The messages that a terminal uploads, as plain records, and their JSON forms, which contracts/json/
/// describes (upload-*.schema.json).
///
/// "Playload", "Graphisc" and "graphisc_list" are spelled as intended: the platform knows them so.
namespace velk::module::message {

/// The envelope of a message.
struct Message
{
    qint32 id = 0;
    qint32 type = 0;
    QJsonObject payload;
};

/// A program or script to be run.
struct TaskBody
{
    qint32 type = 0;
    QString script;
    QString program;
    QStringList env;
    QStringList args;
};

struct NetworkDevicePlayload
{
    QString mac;
    QString model;
    QString ip_address;
};

struct CPUPlayload
{
    QString sn;
    QString model;
};

struct DiskPlayload
{
    QString sn;
    QString model;
    qint64 cap = 0; ///< capacity; receivers that read numbers as doubles know it exactly up to 2^53
};

struct MemoryPlayload
{
    QString sn;
    QString model;
    qint64 cap = 0; ///< capacity, as that of a disk
};

struct MainboardPlayload
{
    QString sn;
    QString model;
};

struct GraphiscPlayload
{
    QString sn;
    QString model;
};

/// The terminal as a whole. Its parts are held in their JSON forms: each is the to_json of the part's record.
struct SystemInfoPlayload
{
    qint32 active_state = 0;
    qint32 developer_mode = 0;
    QString name;
    QString machine_id;
    QString sn;
    QString old_machine_id;
    QString os;
    QString arch;
    QString version;
    QString client_version;
    QString host_name;
    QString product_name;
    QString platform;
    bool need_upgrade = false;
    QJsonObject mainboard;
    QJsonArray cpu_list;
    QJsonArray disk_list;
    QJsonArray memory_list;
    QJsonArray graphisc_list;
    QJsonArray network_device_list;
};

/// The JSON form of a record. All keys are always there; empty texts and lists are written as such.
QJsonObject to_json(const Message& value);
QJsonObject to_json(const TaskBody& value);
QJsonObject to_json(const NetworkDevicePlayload& value);
QJsonObject to_json(const CPUPlayload& value);
QJsonObject to_json(const DiskPlayload& value);
QJsonObject to_json(const MemoryPlayload& value);
QJsonObject to_json(const MainboardPlayload& value);
QJsonObject to_json(const GraphiscPlayload& value);
QJsonObject to_json(const SystemInfoPlayload& value);

} // namespace velk::module::message
