#pragma once

/// Sets the line that `systemctl --user status velks` shows for the agent; an empty one removes it. Does
/// nothing without a service manager. While a line is set, the package's scripts do not restart the agent.
void showServiceStatus(const char* line);
