#include "platform/qlib_net.h"

#include <arpa/inet.h>
#include <dirent.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <exception>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "platform/qlibc_error.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "utils/interface_name.h"

namespace {

using vorn::platform::RootPath;
using vornwireless::utils::IsValidInterfaceName;

const char kNetClass[] = "/sys/class/net";
const char kRcNetwork[] = "/etc/rc.network";
const char kSettingsFile[] = "/etc/vorninfo.conf";

struct Topology {
    const char* name;
    int code;
};
constexpr Topology kTopologies[] = {{"router", 3}, {"bridge", 2}, {"client", 1}, {"repeater", 4}};

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

bool IsValidName(const char* ifname) {
    return ifname != nullptr && IsValidInterfaceName(ifname);
}

// Interface directories of /sys/class/net in name order; files there (bonding_masters) and
// names unfit for a command line are left out.
bool ListInterfaces(std::vector<std::string>& names) {
    const std::string real = RootPath(kNetClass);
    DIR* dir = opendir(real.c_str());
    if (dir == nullptr) {
        return false;
    }
    while (const dirent* entry = readdir(dir)) {
        const std::string name = entry->d_name;
        struct stat info;
        if (IsValidInterfaceName(name) && name != "." && name != ".." &&
            stat((real + "/" + name).c_str(), &info) == 0 && S_ISDIR(info.st_mode)) {
            names.push_back(name);
        }
    }
    closedir(dir);
    std::sort(names.begin(), names.end());
    return true;
}

int LinkState(const std::string& ifname) {
    std::ifstream in(RootPath(std::string(kNetClass) + "/" + ifname + "/operstate"));
    char state[16] = {};
    in.getline(state, sizeof(state));
    return std::strcmp(state, "up") == 0 ? QLIB_NET_LINK_UP : QLIB_NET_LINK_DOWN;
}

// The address of an "ip -o" line: "2: eth0    inet 10.0.0.2/24 brd ... scope global eth0".
std::string ParseInetAddress(const std::string& line) {
    std::istringstream words(line);
    std::string word;
    while (words >> word) {
        if (word == "inet" && words >> word) {
            const std::string address = word.substr(0, word.find('/'));
            in_addr parsed;
            return inet_pton(AF_INET, address.c_str(), &parsed) == 1 ? address : "";
        }
    }
    return "";
}

std::string FirstIPv4Address(const std::string& ifname) {
    std::string line;
    vorn::platform::ReadShellCommandLine(
        "/sbin/ip -4 -o addr show dev " + vorn::platform::ShellQuote(ifname), line);
    return ParseInetAddress(line);
}

void CopyText(char* field, size_t size, const std::string& text) {
    std::strncpy(field, text.c_str(), size - 1);
    field[size - 1] = '\0';
}

int RunRcNetwork(const char* command, const char* ifname) {
    return QLIBCExecl(kRcNetwork, QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT,
                      command, ifname, nullptr);
}

int LinkEvent(const char* command, const char* ifname) {
    if (!IsValidName(ifname)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    return RunRcNetwork(command, ifname);
}

}  // namespace

extern "C" {

int QLIBNetGetInterfaceInfo(QLIB_NET_IF_INFO* array, int max, int flags) {
    if (array == nullptr || max < 0) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        std::vector<std::string> names;
        if (!ListInterfaces(names)) {
            return Fail(QLIBC_ERR_NOT_FOUND);
        }
        const int count = std::min(max, static_cast<int>(names.size()));
        for (int i = 0; i < count; ++i) {
            QLIB_NET_IF_INFO& record = array[i];
            std::memset(&record, 0, sizeof(record));
            CopyText(record.name, sizeof(record.name), names[i]);
            if (flags & QLIB_NET_INFO_LINK) {
                record.link = LinkState(names[i]);
            }
            if (flags & QLIB_NET_INFO_IPV4) {
                CopyText(record.ipv4, sizeof(record.ipv4), FirstIPv4Address(names[i]));
            }
        }
        return count;
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int QLIBNetBridgeIfIsSlave(const char* ifname) {
    if (!IsValidName(ifname)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string port = RootPath(std::string(kNetClass) + "/" + ifname + "/brport");
    return access(port.c_str(), F_OK) == 0 ? 1 : 0;
}

int QLIBNetIfLinkUpEvent(const char* ifname) {
    return LinkEvent("link-up", ifname);
}

int QLIBNetIfLinkDownEvent(const char* ifname) {
    return LinkEvent("link-down", ifname);
}

int NetRoutetableHandler(int action, const char* ifname) {
    if (action != 0 && action != 1) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    return LinkEvent(action == 0 ? "route-table-up" : "route-table-down", ifname);
}

int QLIBNetTopologyGet(int /*flags*/) {
    char value[32] = {};
    const int found = QLIBCFileGetKeyValue(kSettingsFile, "net_topology", value, sizeof(value), 0);
    if (found == 0) {
        return Fail(QLIBC_ERR_NOT_FOUND);
    }
    if (found > 0) {
        for (const Topology& topology : kTopologies) {
            if (std::strcmp(value, topology.name) == 0) {
                return topology.code;
            }
        }
        QLIBCErrSet(QLIBC_ERR_FORMAT);
    }
    return -1;
}

}  // extern "C"
