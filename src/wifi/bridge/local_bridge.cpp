#include "wifi/bridge/local_bridge.h"

#include "platform/qlibc_proc.h"
#include "utils/log.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {

int LocalBridge::CreateConfig() {
    if (config_.slaveList.empty()) {
        VORN_LOG(LOG_ERR, "No slave in [%s]", GetNameC());
        return -1;
    }
    return SetBridgeFiles(config_.slaveList.front(), BR_TYPE_OWN_ADDRESS,
                          config_.apIpAddress.ToString(), config_.apNetmask.ToString());
}

int LocalBridge::CreateGatewayInfo() {
    for (const char* family : {"v4", "v6"}) {
        if (!SetOwnGatewayInfo(family, true)) {
            VORN_LOG(LOG_ERR, "Failed to create %s gateway info of %s", family, GetNameC());
            return -1;
        }
    }
    return 0;
}

int LocalBridge::ResetGatewayInfo() {
    for (const char* family : {"v4", "v6"}) {
        if (!SetOwnGatewayInfo(family, false)) {
            VORN_LOG(LOG_ERR, "Failed to delete %s gateway info of %s", family, GetNameC());
            return -1;
        }
    }
    return 0;
}

int LocalBridge::EnableNat() {
    return StartNat("start-nat");
}

int LocalBridge::DisableNat() {
    if (QLIBCExecl("/etc/rc.network", QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN, "stop-nat", GetNameC(),
                   nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network stop-nat for[%s]", GetNameC());
        return -1;
    }
    return 0;
}

int LocalBridge::ResetBridgeIP() {
    std::string slave;
    if (utils::GetFirstExistentSlaveByBridge(GetName(), slave) != 0 || slave.empty()) {
        VORN_LOG(LOG_ERR, "Failed to execute [%s]", "brctl show");
        return -1;
    }
    const std::string bssid = utils::GetBssid(slave).substr(0, 17);
    if (bssid.empty() || QLIBCExecl("/sbin/ip", QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN, "link",
                                    "set", GetNameC(), "address", bssid.c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute [%s]", "ip link set address");
        return -1;
    }
    return 0;
}

int LocalBridge::SetTopologyFile(const BridgeConfig& config) {
    return WriteTopologySection("/usr/vorn/etc/wifi/wifi_topology_router", config,
                                BridgeConfig::Keys());
}

}  // namespace wifi
}  // namespace vornwireless
