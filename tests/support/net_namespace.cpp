#include "support/net_namespace.h"

#include <sched.h>
#include <spawn.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

extern char** environ;

namespace vorn {
namespace test {
namespace {

bool Fail(std::string* why, const std::string& step) {
    *why = step + ": " + std::strerror(errno);
    return false;
}

// The host's own ip, never one of a simulated root that may sit on PATH.
const char* HostIp() {
    for (const char* path : {"/usr/sbin/ip", "/sbin/ip", "/usr/bin/ip", "/bin/ip"}) {
        if (access(path, X_OK) == 0) {
            return path;
        }
    }
    return nullptr;
}

bool BringLoopbackUp(std::string* why) {
    const char* ip = HostIp();
    if (ip == nullptr) {
        *why = "no ip program on this host (Debian package iproute2)";
        return false;
    }
    std::string words[] = {ip, "link", "set", "lo", "up"};
    char* argv[] = {&words[0][0], &words[1][0], &words[2][0], &words[3][0], &words[4][0], nullptr};
    pid_t pid = 0;
    const int error = posix_spawn(&pid, ip, nullptr, nullptr, argv, environ);
    if (error != 0) {
        *why = std::string("cannot run ") + ip + ": " + std::strerror(error);
        return false;
    }
    int status = 0;
    pid_t done = 0;
    do {
        done = waitpid(pid, &status, 0);
    } while (done < 0 && errno == EINTR);
    if (done < 0) {
        return Fail(why, "waiting for ip");
    }
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        *why = std::string(ip) + " link set lo up failed in the private namespace";
        return false;
    }
    return true;
}

}  // namespace

bool EnterPrivateNetworkNamespace(std::string* why, bool* notPermitted) {
    std::string ignored;
    why = why != nullptr ? why : &ignored;
    bool refused = false;
    notPermitted = notPermitted != nullptr ? notPermitted : &refused;
    *notPermitted = false;

    if (geteuid() != 0) {
        *notPermitted = true;
        *why = "needs root for private network namespaces (running as uid " +
               std::to_string(geteuid()) + ")";
        return false;
    }
    if (unshare(CLONE_NEWNET | CLONE_NEWNS) != 0) {
        *notPermitted = true;
        return Fail(why, "unshare(CLONE_NEWNET | CLONE_NEWNS) refused");
    }
    // Nothing mounted from here on may reach the host.
    if (mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) {
        return Fail(why, "making / private");
    }
    if (mount("sysfs", "/sys", "sysfs", 0, nullptr) != 0) {
        return Fail(why, "mounting sysfs on /sys");
    }
    return BringLoopbackUp(why);
}

}  // namespace test
}  // namespace vorn
