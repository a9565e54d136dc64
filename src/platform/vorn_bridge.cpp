#include "platform/vorn_bridge.h"

#include <arpa/inet.h>
#include <dirent.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <fstream>
#include <string>
#include <vector>

#include "platform/qlibc_error.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/text_file.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace {

using vornwireless::utils::IsValidInterfaceName;

const char kScriptsDir[] = "/etc/sysconfig/network-scripts";
const char kBrctl[] = "/usr/vorn/sbin/brctl";
const char kIp[] = "/sbin/ip";
const char kRcNetwork[] = "/etc/rc.network";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

std::string IfcfgPath(const std::string& ifname) {
    return std::string(kScriptsDir) + "/ifcfg-" + ifname;
}

bool Field(const char* field, size_t size, std::string& out) {
    const size_t length = strnlen(field, size);
    out.assign(field, length);
    return length < size;
}

// Prefix length of a contiguous dotted-quad mask, or -1.
int PrefixLength(const std::string& mask) {
    in_addr binary{};
    if (inet_pton(AF_INET, mask.c_str(), &binary) != 1) {
        return -1;
    }
    const uint32_t bits = ntohl(binary.s_addr);
    if (((~bits + 1) & ~bits) != 0) {
        return -1;
    }
    return __builtin_popcount(bits);
}

bool IsIPv4(const std::string& text) {
    in_addr binary{};
    return inet_pton(AF_INET, text.c_str(), &binary) == 1;
}

int SetKeys(const std::string& file, const std::vector<std::pair<const char*, std::string>>& set,
            const std::vector<const char*>& remove) {
    QLIBSZHASH* setHash = QLIBCSzHashAlloc(static_cast<int>(set.size()) + 1);
    QLIBSZHASH* removeHash = QLIBCSzHashAlloc(static_cast<int>(remove.size()) + 1);
    bool ok = setHash != nullptr && removeHash != nullptr;
    for (const auto& pair : set) {
        ok = ok && QLIBCSzHashSetValue(setHash, pair.first, pair.second.c_str()) == 0;
    }
    for (const char* key : remove) {
        ok = ok && QLIBCSzHashSetValue(removeHash, key, "") == 0;
    }
    ok = ok && QLIBCFileSetKeys(file.c_str(), setHash, removeHash, 0) == 0;
    QLIBCSzHashFree(setHash);
    QLIBCSzHashFree(removeHash);
    return ok ? 0 : -1;
}

bool Exists(const std::string& ifname) {
    return QLIBCFileExist(("/sys/class/net/" + ifname).c_str()) == 1;
}

int Run(const char* program, std::vector<const char*> words) {
    words.resize(6, nullptr);
    return QLIBCExecl(program, kExecFlags, words[0], words[1], words[2], words[3], words[4],
                      words[5], nullptr);
}

// The ifcfg files whose BRIDGE key names bridge.
std::vector<std::string> SlaveFilesOf(const std::string& bridge) {
    std::vector<std::string> files;
    DIR* dir = opendir(vorn::platform::RootPath(kScriptsDir).c_str());
    if (dir == nullptr) {
        return files;
    }
    while (const dirent* entry = readdir(dir)) {
        const std::string name = entry->d_name;
        if (name.compare(0, 6, "ifcfg-") != 0) {
            continue;
        }
        const std::string path = std::string(kScriptsDir) + "/" + name;
        if (QLIBCFileCheckKeyValue(path.c_str(), "BRIDGE", bridge.c_str(), 0) == 1) {
            files.push_back(path);
        }
    }
    closedir(dir);
    return files;
}

int RemoveBridge(const std::string& bridge) {
    for (const auto& file : SlaveFilesOf(bridge)) {
        if (SetKeys(file, {}, {"BRIDGE"}) != 0) {
            return -1;
        }
    }
    if (SetKeys(IfcfgPath(bridge), {{"ONBOOT", "no"}}, {}) != 0) {
        return -1;
    }
    if (!Exists(bridge)) {
        return 0;
    }
    if (Run(kIp, {"link", "set", bridge.c_str(), "down"}) != 0 ||
        Run(kBrctl, {"delbr", bridge.c_str()}) != 0) {
        return Fail(QLIBC_ERR_EXEC);
    }
    return 0;
}

int MakeBridge(const BRIDGE_INFO& info, const std::string& bridge, const std::string& slave) {
    std::string bootproto, ipv4, netmask;
    if (!Field(info.bootproto, sizeof(info.bootproto), bootproto) ||
        !Field(info.ipv4, sizeof(info.ipv4), ipv4) ||
        !Field(info.netmask, sizeof(info.netmask), netmask) || !IsValidInterfaceName(slave) ||
        !IsIPv4(ipv4) || PrefixLength(netmask) < 0 ||
        bootproto.find_first_not_of("abcdefghijklmnopqrstuvwxyz") != std::string::npos) {
        VORN_LOG(LOG_ERR, "Bad bridge info for [%s]", bridge.c_str());
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    if (SetKeys(IfcfgPath(bridge),
                {{"DEVICE", bridge},
                 {"TYPE", "Bridge"},
                 {"BOOTPROTO", bootproto.empty() ? "static" : bootproto},
                 {"IPADDR", ipv4},
                 {"NETMASK", netmask},
                 {"ONBOOT", "yes"}},
                {}) != 0 ||
        SetKeys(IfcfgPath(slave), {{"BRIDGE", bridge}}, {}) != 0) {
        return -1;
    }
    const std::string address = ipv4 + "/" + std::to_string(PrefixLength(netmask));
    if ((!Exists(bridge) && Run(kBrctl, {"addbr", bridge.c_str()}) != 0) ||
        (info.type == BR_TYPE_TAKE_OVER && Exists(slave) &&
         Run(kIp, {"addr", "flush", "dev", slave.c_str()}) != 0) ||
        Run(kIp, {"addr", "replace", address.c_str(), "dev", bridge.c_str()}) != 0 ||
        Run(kIp, {"link", "set", bridge.c_str(), "up"}) != 0) {
        return Fail(QLIBC_ERR_EXEC);
    }
    return 0;
}

bool IsWord(const char* text) {
    if (text == nullptr || *text == '\0' || strlen(text) > 32) {
        return false;
    }
    return std::all_of(text, text + strlen(text), [](char c) {
        return std::isalnum(static_cast<unsigned char>(c)) || c == '-' || c == '_';
    });
}

}  // namespace

extern "C" {

int VORNNetSetBridgeConfig(const BRIDGE_INFO* info) {
    std::string bridge, slave;
    if (info == nullptr || !Field(info->bridge, sizeof(info->bridge), bridge) ||
        !Field(info->slave, sizeof(info->slave), slave) || !IsValidInterfaceName(bridge)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    switch (info->type) {
        case BR_TYPE_REMOVE:
            return RemoveBridge(bridge);
        case BR_TYPE_TAKE_OVER:
        case BR_TYPE_OWN_ADDRESS:
        case BR_TYPE_SLAVE_ONLY:
            return MakeBridge(*info, bridge, slave);
    }
    return Fail(QLIBC_ERR_INVALID_ARG);
}

int VORNLnxIPv6ProcAction(const char* ifname, int action) {
    if (ifname == nullptr || !IsValidInterfaceName(ifname) || (action != 0 && action != 1)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string path = std::string("/proc/sys/net/ipv6/conf/") + ifname + "/disable_ipv6";
    std::ofstream out(vorn::platform::RootPath(path));
    if (!(out << action << "\n") || !out.flush()) {
        VORN_LOG(LOG_ERR, "Failed to write [%s]", path.c_str());
        return Fail(QLIBC_ERR_FILE_IO);
    }
    return 0;
}

int VORNNetDNSServerListGet(int family, QLIBSZLIST** list) {
    if (list == nullptr || (family != 4 && family != 6)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string source =
        std::string("/etc/iproute2/config/resolv") + (family == 4 ? "4" : "6") + ".conf";
    std::string text;
    if (!vorn::platform::ReadTextFile(vorn::platform::RootPath(source), text)) {
        return QLIBCErrGet() == QLIBC_ERR_NOT_FOUND ? 0 : -1;
    }
    if (*list == nullptr && (*list = QLIBCSzListAlloc(4)) == nullptr) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
    std::vector<std::string> servers;
    for (const std::string& line : vorn::platform::SplitLines(text)) {
        char address[64] = {};
        unsigned char binary[sizeof(in6_addr)];
        if (sscanf(line.c_str(), " nameserver %63s", address) == 1 &&
            inet_pton(family == 4 ? AF_INET : AF_INET6, address, binary) == 1 &&
            std::find(servers.begin(), servers.end(), address) == servers.end()) {
            servers.push_back(address);
            if (QLIBCSzListAdd(*list, address) != 0) {
                return -1;
            }
        }
    }
    return static_cast<int>(servers.size());
}

int QLIBNetService(const char* service, const char* action) {
    if (!IsWord(service) || !IsWord(action)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string verb = std::string(action) + "-" + service;
    return Run(kRcNetwork, {verb.c_str()}) == 0 ? 0 : Fail(QLIBC_ERR_EXEC);
}

int VORNFwRuleHup(void) {
    return Run(kRcNetwork, {"firewall-reload"}) == 0 ? 0 : Fail(QLIBC_ERR_EXEC);
}

int VORNFwTcRuleHup(void) {
    return Run(kRcNetwork, {"tc-reload"}) == 0 ? 0 : Fail(QLIBC_ERR_EXEC);
}

}  // extern "C"
