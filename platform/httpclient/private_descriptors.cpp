#include "private_descriptors.h"

#include <dirent.h>
#include <fcntl.h>

#include <cstdlib>

namespace {

std::set<int> openDescriptors()
{
    std::set<int> descriptors;
    DIR* const folder = opendir("/proc/self/fd");
    if (folder == nullptr) {
        return descriptors;
    }
    while (const auto* entry = readdir(folder)) { // NOLINT(concurrency-mt-unsafe): safe on its own stream
        // "." and ".." parse as 0, which is never new.
        descriptors.insert(static_cast<int>(std::strtol(entry->d_name, nullptr, 10)));
    }
    descriptors.erase(dirfd(folder));
    closedir(folder);
    return descriptors;
}

} // namespace

PrivateDescriptors::PrivateDescriptors()
    : m_before(openDescriptors())
{ }

PrivateDescriptors::~PrivateDescriptors()
{
    for (const int descriptor : openDescriptors()) {
        if (m_before.count(descriptor) == 0) {
            fcntl(descriptor, F_SETFD, FD_CLOEXEC);
        }
    }
}
