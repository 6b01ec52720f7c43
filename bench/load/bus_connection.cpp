#include "bus_connection.h"

#include <cstdlib>
#include <iostream>
#include <system_error>
#include <utility>

namespace {

sd_bus* opened(int (*open)(sd_bus**))
{
    sd_bus* bus = nullptr;
    require(open(&bus), "connect");
    return bus;
}

} // namespace

BusConnection::BusConnection(int (*open)(sd_bus**), const std::vector<std::string>& names, Handler handler)
    : m_bus(opened(open), sd_bus_unref)
    , m_handler(std::move(handler))
{
    require(sd_bus_add_filter(m_bus.get(), nullptr, onMessage, this), "add a filter");
    for (const auto& name : names) {
        require(sd_bus_request_name(m_bus.get(), name.c_str(), 0), name.c_str());
    }
}

void BusConnection::process()
{
    while (require(sd_bus_process(m_bus.get(), nullptr), "process") > 0) { }
}

int BusConnection::onMessage(sd_bus_message* message, void* connection, sd_bus_error* /*error*/)
{
    const bool isCall = sd_bus_message_is_method_call(message, nullptr, nullptr) > 0;
    return isCall && static_cast<BusConnection*>(connection)->m_handler(message) ? 1 : 0;
}

int require(int result, const char* what)
{
    if (result < 0) {
        std::cerr << "desktop: cannot " << what << ": " << std::generic_category().message(-result) << '\n';
        std::exit(EXIT_FAILURE);
    }
    return result;
}
