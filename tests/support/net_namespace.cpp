#include "support/net_namespace.h"

#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "support/private_bus.h"

namespace vorn {
namespace test {

bool EnterPrivateNetworkNamespace(std::string* why, bool* notPermitted) {
    std::string ignored;
    why = why != nullptr ? why : &ignored;
    bool refused = false;
    notPermitted = notPermitted != nullptr ? notPermitted : &refused;
    *notPermitted = geteuid() != 0 || unshare(CLONE_NEWNET | CLONE_NEWNS) != 0;
    if (*notPermitted) {
        *why = geteuid() != 0 ? "needs root for private network namespaces"
                              : std::string("unshare refused: ") + std::strerror(errno);
        return false;
    }
    // Nothing mounted from here on may reach the host.
    if (mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
        mount("sysfs", "/sys", "sysfs", 0, nullptr) != 0) {
        *why = std::string("making / private or mounting /sys: ") + std::strerror(errno);
        return false;
    }
    // The host's own ip, never one of a simulated root that may sit on PATH.
    if (RunProgram({"/sbin/ip", "link", "set", "lo", "up"}, std::chrono::seconds(10)) != 0) {
        *why = "/sbin/ip link set lo up failed in the private namespace";
        return false;
    }
    return true;
}

}  // namespace test
}  // namespace vorn
