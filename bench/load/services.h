#pragma once

#include <systemd/sd-bus.h>

#include <set>
#include <string>

/// The number of items that the desktop's services report.
struct DesktopSize
{
    int launcherItems = 0; ///< 0: there is no launcher
    int dockEntries = 0;
};

/// Answers the agent's calls to logind, the dock, the launcher, the notifications, the screen saver and the
/// session manager. An entry of the dock has no window at first; all are docked.
class Services
{
public:
    explicit Services(DesktopSize size)
        : m_size(size)
    { }

    /// Answers a call; returns false if no service has its member.
    bool answer(sd_bus_message* call) const;

    static std::string entryPath(int number);
    /// An item of the launcher: its package, and its desktop file.
    static std::string itemName(int number);
    static std::string itemFile(int number);

    /// Opens or closes the window of an entry; returns whether it has one now.
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
