#include "service_status.h"

#include <systemd/sd-daemon.h>

void showServiceStatus(const char* line)
{
    constexpr int kKeepVariables = 0; // later calls need them too
    sd_notifyf(kKeepVariables, "STATUS=%s", line);
}
