#include "wifi/bridge/bridge.h"

#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "utils/dbus_client.h"
#include "utils/file.h"
#include "utils/log.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kIfcfgPrefix = "/etc/sysconfig/network-scripts/ifcfg-";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;

int ReadAddress(const std::string& ifname, std::string& ipv4, std::string& netmask) {
    const std::string file = kIfcfgPrefix + ifname;
    char value[20] = {};
    for (auto key : {std::make_pair("IPADDR", &ipv4), std::make_pair("NETMASK", &netmask)}) {
        if (QLIBCFileGetKeyValue(file.c_str(), key.first, value, sizeof(value), 0) < 0) {
            VORN_LOG(LOG_ERR, "Failed to get key [%s] of file [%s]", key.first, file.c_str());
            return -1;
        }
        *key.second = value;
    }
    return 0;
}

int SetDhcpInfo(const std::string& file, const char* enable, bool dropBackup) {
    QLIBSZHASH* set = QLIBCSzHashAlloc(2);
    QLIBSZHASH* remove = QLIBCSzHashAlloc(1);
    bool ok = set != nullptr && remove != nullptr &&
              QLIBCSzHashSetValue(set, "enable", enable) == 0 &&
              QLIBCSzHashSetValue(dropBackup ? remove : set, "enable_bak", "yes") == 0 &&
              QLIBCFileSetKeys(file.c_str(), set, remove, QLIBC_FILE_QUOTE_VALUES) == 0;
    QLIBCSzHashFree(set);
    QLIBCSzHashFree(remove);
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to set key [enable] in [%s]", file.c_str());
    }
    return ok ? 0 : -1;
}

}  // namespace

std::string Bridge::PrimarySlave() const {
    if (config_.slaveList.empty()) {
        VORN_LOG(LOG_ERR, "No slave in [%s]", GetNameC());
        return "";
    }
    return config_.slaveList.front();
}

int Bridge::CreateConfig() {
    const std::string slave = PrimarySlave();
    std::string ipv4, netmask;
    if (slave.empty() || ReadAddress(slave, ipv4, netmask) != 0 ||
        SetBridgeFiles(slave, BR_TYPE_TAKE_OVER, ipv4, netmask) != 0) {
        return -1;
    }
    if (vornwireless::utils::CopyIfcfgIPv6Attrs(slave, GetName()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to copy ipv6 attrs from %s to %s", slave.c_str(), GetNameC());
        return -1;
    }
    return 0;
}

int Bridge::DisableTopology() {
    const std::string slave = PrimarySlave();
    std::string ipv4, netmask;
    if (slave.empty() || ReadAddress(GetName(), ipv4, netmask) != 0) {
        return -1;
    }
    BRIDGE_INFO info;
    if (ConvertToBridgeInfo(info, GetName(), "", BR_TYPE_REMOVE) != 0 ||
        VORNNetSetBridgeConfig(&info) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set Bridge file for [%s]", GetNameC());
        return -1;
    }
    if (vornwireless::utils::CopyIfcfgIPv6Attrs(GetName(), slave) != 0) {
        VORN_LOG(LOG_ERR, "Failed to copy ipv6 attrs from %s to %s", GetNameC(), slave.c_str());
        return -1;
    }
    // Else eth0 would stay a slave in the route module and its gateway never be used again.
    if (ResetGatewayInfo() != 0) {
        VORN_LOG(LOG_ERR, "Failed to reset data");
        return -1;
    }
    return 0;
}

// The bridge stands in for its slave: the slave's records move to the bridge's name at the
// same place, and the slave's own stay behind marked as a slave, so no default route uses it.
int Bridge::CreateGatewayInfo() {
    const std::string slave = PrimarySlave();
    if (slave.empty()) {
        return -1;
    }
    for (const char* family : {"v4", "v6"}) {
        const std::string type = GatewayType(family);
        if (!vornwireless::utils::CopyGatewayInfo(type, slave, GetName(), false)) {
            VORN_LOG(LOG_ERR, "Failed to copy %s gateway info from [%s] to [%s]", family,
                     slave.c_str(), GetNameC());
            return -1;
        }
        if (!vornwireless::utils::SetSlaveGatewayInfo(slave, type, true)) {
            VORN_LOG(LOG_ERR, "Failed to set slave data for [%s] to %s gateway list.",
                     slave.c_str(), family);
            return -1;
        }
    }
    return 0;
}

// The bridge's records (and what the route module learnt on it) go back to the slave's name.
int Bridge::ResetGatewayInfo() {
    const std::string slave = PrimarySlave();
    if (slave.empty()) {
        return -1;
    }
    for (const char* family : {"v4", "v6"}) {
        if (!vornwireless::utils::CopyGatewayInfo(GatewayType(family), GetName(), slave, true)) {
            VORN_LOG(LOG_ERR, "Failed to copy %s gateway info from [%s] to [%s]", family,
                     GetNameC(), slave.c_str());
            return -1;
        }
    }
    return 0;
}

int Bridge::EnableDhcp() {
    const std::string slave = PrimarySlave();
    if (slave.empty() || QLIBCExecl("/bin/mkdir", kExecFlags, "-p",
                                    vorn::platform::RootPath("/etc/dhcpd").c_str(), nullptr) != 0) {
        return -1;
    }
    const std::string info = DhcpFile(slave, slave + "0", ".info");
    if (QLIBCFileCheckKeyValue(info.c_str(), "enable", "yes", 0) != 1) {
        return 0;
    }
    if (SetDhcpInfo(info, "no", false) != 0 ||
        QLIBCExecl("/etc/rc.network", kExecFlags, "nat-restart-dhcp", slave.c_str(), nullptr) !=
            0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network nat-restart-dhcp for[%s]",
                 slave.c_str());
        return -1;
    }
    return 0;
}

int Bridge::DisableDhcp() {
    const std::string slave = PrimarySlave();
    if (slave.empty() || QLIBCExecl("/bin/mkdir", kExecFlags, "-p",
                                    vorn::platform::RootPath("/etc/dhcpd").c_str(), nullptr) != 0) {
        return -1;
    }
    const std::string info = DhcpFile(slave, slave + "0", ".info");
    if (QLIBCFileCheckKeyValue(info.c_str(), "enable_bak", "yes", 0) != 1) {
        return 0;
    }
    if (SetDhcpInfo(info, "yes", true) != 0 ||
        QLIBCExecl("/etc/rc.network", kExecFlags, "nat-start-dhcp", slave.c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network nat-start-dhcp for[%s]",
                 slave.c_str());
        return -1;
    }
    return 0;
}

int Bridge::MoveSecurityFiles(const std::string& from, const std::string& to) const {
    for (const char* dir : {"/etc/firewall/", "/etc/fw_security/", "/etc/tc/"}) {
        const std::string source = dir + from + ".conf";
        const std::string target = dir + to + ".conf";
        if (QLIBCFileExist(source.c_str()) == 1 &&
            QLIBCSysRename(source.c_str(), target.c_str()) != 0) {
            VORN_LOG(LOG_ERR, "Failed to rename file[%s] to file[%s]", source.c_str(),
                     target.c_str());
        }
    }
    return 0;
}

int Bridge::EnableSecurityConf() {
    const std::string slave = PrimarySlave();
    return slave.empty() ? -1 : MoveSecurityFiles(slave, GetName());
}

int Bridge::DisableSecurityConf() {
    const std::string slave = PrimarySlave();
    return slave.empty() ? -1 : MoveSecurityFiles(GetName(), slave);
}

}  // namespace wifi
}  // namespace vornwireless
