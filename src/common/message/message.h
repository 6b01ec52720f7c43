#pragma once

#include <QJsonArray>
#include <QJsonObject>
#include <QString>
#include <QStringList>

/// The messages that a terminal uploads, as plain records, and their JSON forms, which
/// contracts/json/upload-*.schema.json describe.
///
/// Keep the spellings "Playload", "Graphisc" and "graphisc_list": the platform uses them.
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
    qint64 cap = 0; ///< capacity; receivers that read numbers as doubles get it exactly up to 2^53
};

struct MemoryPlayload
{
    QString sn;
    QString model;
    qint64 cap = 0; ///< capacity, as for a disk
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

/// The whole terminal. Its parts are held as JSON, each made by the part's to_json.
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

/// The JSON form of a record, always with all keys; empty texts and lists are included.
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
