#include "wifi/bridge/guest_bridge.h"

#include "platform/qlibc_proc.h"
#include "utils/log.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {

int GuestBridge::CreateConfig() {
    const int index = utils::GetGuestBridgeIndex(GetName());
    if (index < 0) {
        VORN_LOG(LOG_ERR, "No slave in [%s]", GetNameC());
        return -1;
    }
    return SetBridgeFiles("gwlan" + std::to_string(index), BR_TYPE_OWN_ADDRESS,
                          config_.apIpAddress.ToString(), config_.apNetmask.ToString());
}

int GuestBridge::CreateGatewayInfo() {
    if (!SetOwnGatewayInfo("v4", true) || !SetOwnGatewayInfo("v6", true)) {
        VORN_LOG(LOG_ERR, "Failed to create gateway info.");
        return -1;
    }
    return 0;
}

int GuestBridge::ResetGatewayInfo() {
    if (!SetOwnGatewayInfo("v4", false) || !SetOwnGatewayInfo("v6", false)) {
        VORN_LOG(LOG_ERR, "Failed to delete gateway info");
        return -1;
    }
    return 0;
}

int GuestBridge::EnableNat() {
    return StartNat("start-guest-nat-rule");
}

int GuestBridge::DisableNat() {
    if (QLIBCExecl("/etc/rc.network", QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN, "stop-guest-nat-rule",
                   GetNameC(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network stop-nat for[%s]", GetNameC());
        return -1;
    }
    return 0;
}

int GuestBridge::SetTopologyFile(const BridgeConfig& config) {
    const std::vector<std::string> keys = {"ap_ip_address",    "ap_netmask",     "dhcp_enabled",
                                           "dhcp_range_begin", "dhcp_range_end", "slave_list"};
    for (const char* file :
         {"/usr/vorn/etc/wifi/wifi_topology_router", "/usr/vorn/etc/wifi/wifi_topology_bridge"}) {
        if (WriteTopologySection(file, config, keys) != 0) {
            return -1;
        }
    }
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
