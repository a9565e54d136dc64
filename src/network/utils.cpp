#include "network/utils.h"

#include <cstdio>

#include "platform/shell_command.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {

bool IsEthernetLinkDetected(const std::string& ifname) {
    // The name goes into a shell command line.
    if (!vornwireless::utils::IsValidInterfaceName(ifname)) {
        VORN_LOG(LOG_ERR, "Invalid interface name [%s]", ifname.c_str());
        return false;
    }
    char command[1024];
    std::snprintf(command, sizeof(command),
                  "/usr/vorn/bin/ethtool %s |  grep \"Link detected\" | cut -d \":\" -f2 | cut -d "
                  "\" \" -f2",
                  ifname.c_str());
    std::string line;
    if (vorn::platform::ReadShellCommandLine(command, line, sizeof(command)) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command);
        return false;
    }
    return line.compare(0, 2, "no") != 0;
}

}  // namespace network
}  // namespace vornnetwork
