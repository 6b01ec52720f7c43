#include "services.h"

#include <unistd.h>

#include <cstdlib>
#include <set>

#include "bus_connection.h"

namespace {

const std::string kEntries = "/com/norix/kpx/daemon/Dock/entries/e";

const std::set<std::string> kReports{"UpdateUserInfo",   "SendUserStatus", "onUploadFinished",
                                     "sendAppOpenState", "onPolicyMsg",    "Terminate"};

std::string plainUserName()
{
    const char* user = std::getenv("USER");
    std::string name = user != nullptr ? user : "";
    const auto at = name.find('@');
    return at == std::string::npos ? name : name.erase(at, 1);
}

/// A reply that is sent when it goes out of scope.
class ScopedReply
{
public:
    explicit ScopedReply(sd_bus_message* call)
    {
        require(sd_bus_message_new_method_return(call, &m_message), "answer");
    }
    ScopedReply(const ScopedReply&) = delete;
    ScopedReply& operator=(const ScopedReply&) = delete;
    ScopedReply(ScopedReply&&) = delete;
    ScopedReply& operator=(ScopedReply&&) = delete;
    ~ScopedReply()
    {
        sd_bus_send(nullptr, m_message, nullptr);
        sd_bus_message_unref(m_message);
    }

    [[nodiscard]] sd_bus_message* message() const { return m_message; }

private:
    sd_bus_message* m_message = nullptr;
};

} // namespace

std::string Services::entryPath(int number)
{
    return kEntries + std::to_string(number);
}

std::string Services::itemName(int number)
{
    return "package-" + std::to_string(number);
}

std::string Services::itemFile(int number)
{
    return "/usr/share/applications/" + itemName(number) + ".desktop";
}

bool Services::toggleWindow(int number)
{
    const std::string path = entryPath(number);
    const bool opens = m_entriesWithWindow.erase(path) == 0;
    if (opens) {
        m_entriesWithWindow.insert(path);
    }
    return opens;
}

bool Services::answer(sd_bus_message* call) const
{
    const std::string member = sd_bus_message_get_member(call);
    if (kReports.count(member) > 0) {
        sd_bus_reply_method_return(call, nullptr);
    } else if (member == "Get") {
        answerGet(call);
    } else if (member == "Notify") {
        sd_bus_reply_method_return(call, "u", 1U);
    } else if (member == "GetMachineID") {
        sd_bus_reply_method_return(call, "s", "bench-machine");
    } else if (member == "GetAllItemInfos") {
        answerItems(call);
    } else {
        return false;
    }
    return true;
}

void Services::answerGet(sd_bus_message* call) const
{
    const char* interface = nullptr;
    const char* name = nullptr;
    require(sd_bus_message_read(call, "ss", &interface, &name), "read a property's name");
    const std::string path = sd_bus_message_get_path(call);
    const std::string property = name;
    const ScopedReply answer(call);
    auto* reply = answer.message();
    if (path.compare(0, kEntries.size(), kEntries) == 0) {
        appendEntryProperty(reply, path, property);
    } else if (property == "Entries") {
        appendEntries(reply);
    } else if (property == "Name") {
        sd_bus_message_append(reply, "v", "s", plainUserName().c_str());
    } else if (property == "UID") {
        sd_bus_message_append(reply, "v", "u", getuid());
    } else {
        sd_bus_message_append(reply, "v", "b", 0); // isRunning, Locked
    }
}

void Services::appendEntryProperty(sd_bus_message* reply, const std::string& path,
                                   const std::string& property) const
{
    const std::string number = path.substr(kEntries.size());
    if (property == "IsDocked") {
        sd_bus_message_append(reply, "v", "b", 1);
    } else if (property == "WindowInfos" && m_entriesWithWindow.count(path) > 0) {
        sd_bus_message_append(reply, "v", "a{uv}", 1U, 1U, "s", "window");
    } else if (property == "WindowInfos") {
        sd_bus_message_append(reply, "v", "a{uv}", 0U);
    } else {
        sd_bus_message_append(reply, "v", "s", ("app" + number).c_str()); // Id, Name
    }
}

void Services::appendEntries(sd_bus_message* reply) const
{
    sd_bus_message_open_container(reply, 'v', "ao");
    sd_bus_message_open_container(reply, 'a', "o");
    for (int number = 0; number < m_size.dockEntries; ++number) {
        sd_bus_message_append(reply, "o", entryPath(number).c_str());
    }
    sd_bus_message_close_container(reply);
    sd_bus_message_close_container(reply);
}

void Services::answerItems(sd_bus_message* call) const
{
    const ScopedReply answer(call);
    auto* reply = answer.message();
    sd_bus_message_open_container(reply, 'a', "(ssssxx)");
    for (int number = 0; number < m_size.launcherItems; ++number) {
        sd_bus_message_append(reply, "(ssssxx)", itemFile(number).c_str(), itemName(number).c_str(), "", "",
                              int64_t{0}, int64_t{0});
    }
    sd_bus_message_close_container(reply);
}
