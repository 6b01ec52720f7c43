#include "service_status.h"

#include <systemd/sd-daemon.h>

void showServiceStatus(const char* line)
{
    constexpr int kKeepVariables = 0; // the next line needs them as well
    sd_notifyf(kKeepVariables, "STATUS=%s", line);
}
