#include "filecontent.h"
#include "files.h"
#include "fuzzing.h"
#include "information_files.h"

using velk::base::FileContent;
using velk::base::UserInfo;

namespace {

bool operator==(const UserInfo& left, const UserInfo& right)
{
    return left.isDomain == right.isDomain && left.serverHost == right.serverHost
        && left.serverPort == right.serverPort && left.domainHost == right.domainHost
        && left.domainPort == right.domainPort && left.terminalName == right.terminalName;
}

} // namespace

/// What the daemon, or another program in its place, leaves in the information files.
void tryInput(const QByteArray& input)
{
    writeBytes(kUserInfo, input);
    writeBytes(kMachineId, input);
    bool ok = false;
    QString host;
    QString port;
    FileContent::getHostAndPort(host, port);
    FileContent::getTerminalAlias(&ok);
    FileContent::instace()->getMachineID(&ok, true);
    FileContent::saveDomain(!FileContent::isDomain(&ok));

    const UserInfo info = FileContent::getUserInfo(&ok);
    require(FileContent::saveUserInfo(info), "what was read can be saved");
    require(FileContent::getUserInfo(&ok) == info && ok, "what was saved is read again");
}
