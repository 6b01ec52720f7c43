/// All services that the agent uses on both buses, fast enough not to be the bottleneck.
///
/// usage: bench_desktop [LAUNCHER_ITEMS [DOCK_ENTRIES]]
///
/// Commands, one a line on the standard input:
///   * policies COUNT SIZE WINDOW: push COUNT policies of SIZE bytes, at most WINDOW of them at a time
///   * windows COUNT WINDOW: change the windows of the dock's entries COUNT times, at most WINDOW at a time
///   * changes COUNT: let the launcher say COUNT times at once that its first item was updated
///   * policy CODE: push a policy of this code
///   * wake: push a policy that is no JSON
///
/// Lines on the standard output, with times of the monotonic clock in nanoseconds:
///   * ready
///   * UpdateUserInfo TIME, onUploadFinished TIME, Terminate TIME
///   * entries TIME: all entries have been read
///   * done BEGIN END LATENCY...: a command has ended; the latencies stand there where WINDOW is 1

#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <iostream>
#include <sstream>
#include <string>
#include <vector>

#include "bus_connection.h"
#include "services.h"

namespace {

const char* const kDaemon = "com.norix.velk.velkg";
const char* const kDaemonPath = "/com/norix/velk/velkg";
constexpr int kPropertiesOfEntry = 4;
constexpr int kChangingEntries = 100;
constexpr int kReportsOfChange = 2; // the change and the whole inventory

long long now()
{
    return std::chrono::duration_cast<std::chrono::nanoseconds>(
               std::chrono::steady_clock::now().time_since_epoch())
        .count();
}

/// A series of signals, each of which is answered by as many calls.
struct Series
{
    std::string kind;
    std::string payload;
    int count = 0;
    int answersOfEach = 1;
    int window = 0;
    int sent = 0;
    int answered = 0;
    long long begin = 0;
    long long lastSent = 0;
    std::vector<long long> latencies;

    [[nodiscard]] bool mayGoOn() const { return sent < count && sent - answered / answersOfEach < window; }
    [[nodiscard]] bool isOver() const { return answered == count * answersOfEach; }
};

class FastDesktop
{
public:
    explicit FastDesktop(DesktopSize size)
        : m_size(size)
        , m_services(size)
        , m_system(sd_bus_open_system, {kDaemon, "org.freedesktop.login1"},
                   [this](sd_bus_message* call) { return handle(call); })
        , m_session(sd_bus_open_user, sessionNames(size),
                    [this](sd_bus_message* call) { return handle(call); })
    { }

    void run()
    {
        std::cout << "ready" << '\n' << std::flush;
        while (m_isWanted) {
            m_system.process();
            m_session.process();
            goOn();
            wait();
        }
    }

private:
    static std::vector<std::string> sessionNames(DesktopSize size)
    {
        std::vector<std::string> names{"com.norix.velk.prys", "com.norix.kpx.Notification",
                                       "com.norix.ScreenSaver", "com.norix.SessionManager",
                                       "com.norix.kpx.daemon.Dock"};
        if (size.launcherItems > 0) {
            names.emplace_back("com.norix.kpx.daemon.Launcher");
        }
        return names;
    }

    bool handle(sd_bus_message* call)
    {
        const std::string member = sd_bus_message_get_member(call);
        if (member == "UpdateUserInfo" || member == "onUploadFinished" || member == "Terminate") {
            std::cout << member << ' ' << now() << '\n' << std::flush;
        }
        if (member == m_series.kind) {
            countAnswer();
        }
        const bool isKnown = m_services.answer(call);
        if (member == "Get" && sd_bus_message_get_path(call) == Services::entryPath(m_size.dockEntries - 1)
            && ++m_readsOfLastEntry == kPropertiesOfEntry) {
            std::cout << "entries " << now() << '\n' << std::flush;
        }
        return isKnown;
    }

    void countAnswer()
    {
        ++m_series.answered;
        if (m_series.window == 1) {
            m_series.latencies.push_back(now() - m_series.lastSent);
        }
        if (m_series.isOver()) {
            std::cout << "done " << m_series.begin << ' ' << now();
            for (const auto latency : m_series.latencies) {
                std::cout << ' ' << latency;
            }
            std::cout << '\n' << std::flush;
            m_series = {};
        }
    }

    void goOn()
    {
        while (m_series.mayGoOn()) {
            m_series.lastSent = now();
            send();
            ++m_series.sent;
        }
    }

    void send()
    {
        if (m_series.kind == "onPolicyMsg") {
            push(m_series.payload);
        } else if (m_series.kind == "onUploadFinished") {
            updateItem();
        } else {
            changeWindows(m_series.sent);
        }
    }

    void push(const std::string& payload)
    {
        require(sd_bus_emit_signal(m_system.get(), kDaemonPath, kDaemon, "pushPolicyMsg", "ss", "bench",
                                   payload.c_str()),
                "push a policy");
    }

    void updateItem()
    {
        require(sd_bus_emit_signal(m_session.get(), "/com/norix/kpx/daemon/Launcher",
                                   "com.norix.kpx.daemon.Launcher", "ItemChanged", "s(ssssxx)x", "update",
                                   Services::itemFile(0).c_str(), Services::itemName(0).c_str(), "", "",
                                   int64_t{0}, int64_t{0}, int64_t{0}),
                "update an item");
    }

    /// Each entry gets a window, then each loses it, and so on.
    void changeWindows(int number)
    {
        const int entry = number % std::min(m_size.dockEntries, kChangingEntries);
        const bool opens = m_services.toggleWindow(entry);
        sd_bus_message* signal = nullptr;
        require(sd_bus_message_new_signal(m_session.get(), &signal, Services::entryPath(entry).c_str(),
                                          "org.freedesktop.DBus.Properties", "PropertiesChanged"),
                "make a signal");
        sd_bus_message_append(signal, "s", "com.norix.kpx.daemon.Dock.Entry");
        if (opens) {
            sd_bus_message_append(signal, "a{sv}", 1U, "WindowInfos", "a{uv}", 1U, 1U, "s", "window");
        } else {
            sd_bus_message_append(signal, "a{sv}", 1U, "WindowInfos", "a{uv}", 0U);
        }
        sd_bus_message_append(signal, "as", 0U);
        require(sd_bus_send(m_session.get(), signal, nullptr), "change windows");
        sd_bus_message_unref(signal);
    }

    void wait()
    {
        std::array<pollfd, 3> files{fileOf(m_system), fileOf(m_session), pollfd{STDIN_FILENO, POLLIN, 0}};
        if (poll(files.data(), files.size(), -1) > 0 && files.back().revents != 0) {
            takeCommand();
        }
    }

    static pollfd fileOf(const BusConnection& connection)
    {
        return {sd_bus_get_fd(connection.get()), static_cast<short>(sd_bus_get_events(connection.get())), 0};
    }

    void takeCommand()
    {
        std::string line;
        m_isWanted = static_cast<bool>(std::getline(std::cin, line));
        std::istringstream words(line);
        std::string verb;
        words >> verb;
        if (verb == "wake") {
            push("wake up");
        } else if (verb == "policy") {
            std::string code;
            words >> code;
            push(R"({"type":)" + code + '}');
        } else if (verb == "policies") {
            size_t size = 0;
            m_series.kind = "onPolicyMsg";
            words >> m_series.count >> size >> m_series.window;
            m_series.payload = policyOf(size);
            m_series.begin = now();
        } else if (verb == "windows") {
            m_series.kind = "sendAppOpenState";
            words >> m_series.count >> m_series.window;
            m_series.begin = now();
        } else if (verb == "changes") {
            m_series.kind = "onUploadFinished";
            words >> m_series.count;
            m_series.answersOfEach = kReportsOfChange;
            m_series.window = m_series.count;
            m_series.begin = now();
        }
    }

    static std::string policyOf(size_t size)
    {
        const std::string head = R"({"type":2001,"payload":{"text":")";
        const std::string tail = R"("}})";
        const size_t frame = head.size() + tail.size();
        return head + std::string(size > frame ? size - frame : 0, 'x') + tail;
    }

    DesktopSize m_size;
    Services m_services;
    Series m_series;
    int m_readsOfLastEntry = 0;
    bool m_isWanted = true;
    BusConnection m_system;
    BusConnection m_session;
};

} // namespace

int main(int argc, char* argv[])
{
    DesktopSize size;
    size.launcherItems = argc > 1 ? std::stoi(argv[1]) : 0;
    size.dockEntries = argc > 2 ? std::stoi(argv[2]) : 0;
    FastDesktop(size).run();
    return 0;
}
