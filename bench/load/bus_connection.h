#pragma once

#include <systemd/sd-bus.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

/// A connection to a bus that owns some names and passes every incoming call to one function.
class BusConnection
{
public:
    /// Answers a call; returns false for an unknown one, which is then dropped.
    using Handler = std::function<bool(sd_bus_message*)>;

    /// Ends the program with a message if the bus cannot be reached or a name is taken.
    BusConnection(int (*open)(sd_bus**), const std::vector<std::string>& names, Handler handler);

    [[nodiscard]] sd_bus* get() const { return m_bus.get(); }

    /// Handles everything that has arrived and sends what can be sent without blocking.
    void process();

private:
    static int onMessage(sd_bus_message* message, void* connection, sd_bus_error* error);

    std::unique_ptr<sd_bus, decltype(&sd_bus_unref)> m_bus;
    Handler m_handler;
};

/// Ends the program if an sd-bus function has failed.
int require(int result, const char* what);
