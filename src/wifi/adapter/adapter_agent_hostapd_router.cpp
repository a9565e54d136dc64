#include "wifi/adapter/adapter_agent_hostapd_router.h"

#include "platform/qlibc_proc.h"
#include "utils/log.h"
#include "wifi/bridge/bridge_base.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kLocalBridge = "lbr0";
constexpr std::string::size_type kMacLength = 17;

}  // namespace

int AdapterAgentHostapdRouter::Reload(const AdapterConfig& config, RELOAD_STATUS status) {
    if (status.restart) {
        DisableAP(config);
        EnableAP(config);
        RepairLocalBridge(config);
        status.restart = false;
    }
    return AdapterAgentHostapd::Reload(config, status);
}

int AdapterAgentHostapdRouter::RepairLocalBridge(const AdapterConfig& config) {
    const std::string bridgeMac = utils::GetBssid(kLocalBridge);
    std::string member;
    utils::GetFirstExistentSlaveByBridge(kLocalBridge, member);
    if (config.enabled && member.empty()) {
        if (bridgeMac.compare(0, kMacLength, config.bssid.ToString()) == 0) {
            return 0;
        }
        // The MAC reaches a command line.
        if (!config.bssid.IsFormalized() ||
            QLIBCExecl("/sbin/ip", QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN, "link", "set",
                       kLocalBridge, "address", config.bssid.ToCString(), nullptr) != 0) {
            VORN_LOG(LOG_ERR, "Failed to execute [ip]");
            return -1;
        }
        return 0;
    }
    BridgeBase* bridge = BridgeBase::GetBridge(kLocalBridge);
    if (bridge == nullptr) {
        VORN_LOG(LOG_ERR, "The bridge [%s] is not exist", kLocalBridge);
        return -1;
    }
    if (bridge->ResetBridgeIP() != 0) {
        VORN_LOG(LOG_ERR, "Failed to reset lbr0 ip");
        return -1;
    }
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
