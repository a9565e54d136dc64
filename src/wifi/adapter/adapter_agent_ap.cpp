#include "wifi/adapter/adapter_agent_ap.h"

#include <sys/stat.h>

#include <algorithm>
#include <cctype>
#include <fstream>
#include <sstream>

#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/text_file.h"
#include "platform/vorn_schedule.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/bridge/bridge_base.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kGuestScript = "/usr/vorn/etc/iptables_guest_net.sh";
constexpr const char* kTool = "/usr/vorn/bin/vornwireless";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
constexpr const char* kLocalBridge = "lbr0";
constexpr std::string::size_type kMacLength = 17;

int RunGuestScript(const char* action, const char* what, const std::string& ifname) {
    return QLIBCExecl(kGuestScript, kExecFlags, action, what,
                      ifname.empty() ? nullptr : ifname.c_str(), nullptr);
}

// A fresh file renamed over the path, so a file or link planted there is replaced, never written
// through.
bool CopyTool(const std::string& target) {
    std::ifstream in(vorn::platform::RootPath(kTool), std::ios::binary);
    std::ostringstream content;
    content << in.rdbuf();
    const std::string real = vorn::platform::RootPath(target);
    return in.is_open() && !content.str().empty() &&
           vorn::platform::WriteFileAtomically(real, content.str()) &&
           chmod(real.c_str(), 0755) == 0;
}

}  // namespace

int AdapterAgentAP::Enable(const AdapterConfig& config) {
    if (EnableAP(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable AP for [%s]", GetName().c_str());
        return -1;
    }
    AfterEnableAP(config);
    if (EnableRuleGuest(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to Enable guest access rule");
        return -1;
    }
    if (SetSchedule(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set schedule for [%s]", GetName().c_str());
        return -1;
    }
    return 0;
}

int AdapterAgentAP::Disable(const AdapterConfig& config) {
    if (RemoveSchedule(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove schedule for [%s]", GetName().c_str());
        return -1;
    }
    if (DisableRuleGuest(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed tO Disable guest access rule");
        return -1;
    }
    if (DisableAP(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to Disable AP for [%s]", GetName().c_str());
        return -1;
    }
    return 0;
}

int AdapterAgentAP::ReloadRouter(const AdapterConfig& config, RELOAD_STATUS status) {
    if (status.restart) {
        DisableAP(config);
        EnableAP(config);
        RepairLocalBridge(config);
        status.restart = false;
    }
    return AdapterAgentAP::Reload(config, status);
}

int AdapterAgentAP::RepairLocalBridge(const AdapterConfig& config) {
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

void AdapterAgentAP::AddConnections(std::vector<utils::ConnectionInfo> stations,
                                    std::vector<utils::ConnectionInfo>& connections) {
    // Only the router topology runs the DHCP server whose leases name the stations.
    const bool leases = Adapter::IsTopology(WIFI_TOPOLOGY_ROUTER);
    for (utils::ConnectionInfo& station : stations) {
        if (utils::GetArpInfoByMAC(station.mac, station.ip) != 0) {
            VORN_LOG(LOG_ERR, "Failed to get ip and hostname for mac [%s], skip it",
                     station.mac.ToCString());
            continue;
        }
        if (leases) {
            utils::GetDHCPInfoByMAC(station.mac, station.hostname);
        }
        connections.push_back(station);
    }
}

// The daemons' command tools join their words into one command split at blanks.
bool AdapterAgentAP::IsWpsPin(const std::string& pin) {
    return (pin.size() == 4 || pin.size() == 8) && std::all_of(pin.begin(), pin.end(), [](char c) {
               return std::isdigit(static_cast<unsigned char>(c)) != 0;
           });
}

int AdapterAgentAP::Reload(const AdapterConfig& config, RELOAD_STATUS status) {
    if (status.restart) {
        DisableAP(config);
        EnableAP(config);
    }
    if (status.tx_power) {
        SetTXPower(config);
    }
    if (status.guest_rule) {
        DisableRuleGuest(config);
        EnableRuleGuest(config);
    }
    if (status.schedule || status.guest_schedule) {
        SetSchedule(config);
    }
    return 0;
}

int AdapterAgentAP::EnableRuleGuest(const AdapterConfig& config) {
    if (!config.guest_support || !config.enabled || !config.guest_enabled) {
        return 0;
    }
    if (!vornwireless::utils::CheckInterfaceName(config.name)) {
        return -1;
    }
    if (RunGuestScript("ins", "mod", "") != 0) {
        VORN_LOG(LOG_ERR, "Failed to insmod guest net access module");
        return -1;
    }
    if (RunGuestScript("ins", "all", config.name) != 0) {
        VORN_LOG(LOG_ERR, "Failed to start guest net access rule");
        return -1;
    }
    return 0;
}

int AdapterAgentAP::DisableRuleGuest(const AdapterConfig& config) {
    if (!config.guest_support) {
        return 0;
    }
    if (!vornwireless::utils::CheckInterfaceName(config.name)) {
        return -1;
    }
    if (RunGuestScript("del", "all", config.name) != 0) {
        VORN_LOG(LOG_ERR, "Failed to stop guest net access rule");
        return -1;
    }
    if (RunGuestScript("del", "mod", "") != 0) {
        VORN_LOG(LOG_ERR, "Failed to remod guest net access module");
        return -1;
    }
    return 0;
}

std::string AdapterAgentAP::ScheduleTool(const std::string& ifname) {
    return "/tmp/vornwireless." + ifname;
}

std::string AdapterAgentAP::ScheduleCommand(const std::string& ifname) {
    return ScheduleTool(ifname) + " --exec-schedule " + ifname;
}

int AdapterAgentAP::SetSchedule(const AdapterConfig& config) {
    if (!config.schedule_enabled && !(config.guest_support && config.guest_schedule_enabled)) {
        return RemoveSchedule(config);
    }
    if (!vornwireless::utils::CheckInterfaceName(config.name)) {
        return -1;
    }
    if (VORNScheduleSet(ScheduleCommand(config.name).c_str(), 127, 0, 23, 0) != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable wifi scheduler\n");
        return -1;
    }
    if (!CopyTool(ScheduleTool(config.name))) {
        VORN_LOG(LOG_ERR, "Failed to copy %s to /tmp/", kTool);
        return -1;
    }
    return 0;
}

int AdapterAgentAP::RemoveSchedule(const AdapterConfig& config) {
    if (!vornwireless::utils::CheckInterfaceName(config.name)) {
        return -1;
    }
    if (VORNScheduleRemove(ScheduleCommand(config.name).c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable wifi scheduler\n");
        return -1;
    }
    if (QLIBCExecl("/bin/rm", kExecFlags, "-f",
                   vorn::platform::RootPath(ScheduleTool(config.name)).c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove %s", "/tmp/vornwireless");
        return -1;
    }
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
