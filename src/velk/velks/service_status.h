#pragma once

/// Has the service manager show a line about the agent, as in `systemctl --user status velks`; an empty one
/// takes it back. Without a service manager it does nothing. The package's scripts restart no agent that has
/// one.
void showServiceStatus(const char* line);
