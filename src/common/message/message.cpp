#include "message.h"

namespace velk::module::message {

namespace {

/// The fields of all hardware parts other than network devices.
template <typename Part> QJsonObject partToJson(const Part& part)
{
    return {{QStringLiteral("sn"), part.sn}, {QStringLiteral("model"), part.model}};
}

template <typename Part> QJsonObject partWithCapacityToJson(const Part& part)
{
    QJsonObject object = partToJson(part);
    object.insert(QStringLiteral("cap"), part.cap);
    return object;
}

} // namespace

QJsonObject to_json(const Message& value)
{
    return {{QStringLiteral("id"), value.id},
            {QStringLiteral("type"), value.type},
            {QStringLiteral("payload"), value.payload}};
}

QJsonObject to_json(const TaskBody& value)
{
    return {{QStringLiteral("type"), value.type},
            {QStringLiteral("script"), value.script},
            {QStringLiteral("program"), value.program},
            {QStringLiteral("env"), QJsonArray::fromStringList(value.env)},
            {QStringLiteral("args"), QJsonArray::fromStringList(value.args)}};
}

QJsonObject to_json(const NetworkDevicePlayload& value)
{
    return {{QStringLiteral("mac"), value.mac},
            {QStringLiteral("ip_address"), value.ip_address},
            {QStringLiteral("model"), value.model}};
}

QJsonObject to_json(const CPUPlayload& value)
{
    return partToJson(value);
}

QJsonObject to_json(const DiskPlayload& value)
{
    return partWithCapacityToJson(value);
}

QJsonObject to_json(const MemoryPlayload& value)
{
    return partWithCapacityToJson(value);
}

QJsonObject to_json(const MainboardPlayload& value)
{
    return partToJson(value);
}

QJsonObject to_json(const GraphiscPlayload& value)
{
    return partToJson(value);
}

QJsonObject to_json(const SystemInfoPlayload& value)
{
    return {{QStringLiteral("name"), value.name},
            {QStringLiteral("developer_mode"), value.developer_mode},
            {QStringLiteral("active_state"), value.active_state},
            {QStringLiteral("machine_id"), value.machine_id},
            {QStringLiteral("sn"), value.sn},
            {QStringLiteral("old_machine_id"), value.old_machine_id},
            {QStringLiteral("arch"), value.arch},
            {QStringLiteral("os"), value.os},
            {QStringLiteral("version"), value.version},
            {QStringLiteral("client_version"), value.client_version},
            {QStringLiteral("host_name"), value.host_name},
            {QStringLiteral("product_name"), value.product_name},
            {QStringLiteral("platform"), value.platform},
            {QStringLiteral("need_upgrade"), value.need_upgrade},
            {QStringLiteral("mainboard"), value.mainboard},
            {QStringLiteral("network_device_list"), value.network_device_list},
            {QStringLiteral("cpu_list"), value.cpu_list},
            {QStringLiteral("memory_list"), value.memory_list},
            {QStringLiteral("disk_list"), value.disk_list},
            {QStringLiteral("graphisc_list"), value.graphisc_list}};
}

} // namespace velk::module::message
