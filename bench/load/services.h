#pragma once

#include <systemd/sd-bus.h>

#include <set>
#include <string>

/// How much the desktop's services have to tell.
struct DesktopSize
{
    int launcherItems = 0; ///< 0: there is no launcher
    int dockEntries = 0;
};

/// Answers to what a session agent asks of logind, the dock, the launcher, the notifications, the screen
/// saver and the session manager. An entry of the dock has no window at first; all are docked.
class Services
{
public:
    explicit Services(DesktopSize size)
        : m_size(size)
    { }

    /// Answers a call; false if nobody knows its member.
    bool answer(sd_bus_message* call) const;

    static std::string entryPath(int number);

    /// Gives an entry its window or takes it away; the result is whether it has one now.
    bool toggleWindow(int number);

private:
    void answerGet(sd_bus_message* call) const;
    void appendEntryProperty(sd_bus_message* reply, const std::string& path,
                             const std::string& property) const;
    void appendEntries(sd_bus_message* reply) const;
    void answerItems(sd_bus_message* call) const;

    DesktopSize m_size;
    std::set<std::string> m_entriesWithWindow; ///< by path
};
