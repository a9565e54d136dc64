#include "wifi/settings/adapter_capability.h"

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <utility>

#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/settings/adapter_capability_kite_model.h"
#include "wifi/settings/adapter_capability_rlt.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr int kMaxClients = 256;
constexpr const char* kPhyPrefix = "802.11";

template <typename T>
bool Contains(const std::vector<T>& list, T value) {
    return std::find(list.begin(), list.end(), value) != list.end();
}

// The modes a radio may report, each needing all of its letters.
const std::vector<std::pair<std::string, WIFI_MODE>>& ModeMap() {
    static const std::vector<std::pair<std::string, WIFI_MODE>> map = {
        {"a", WIFI_MODE_A},   {"b", WIFI_MODE_B},   {"g", WIFI_MODE_G},  {"n", WIFI_MODE_N},
        {"an", WIFI_MODE_AN}, {"bn", WIFI_MODE_BN}, {"gn", WIFI_MODE_GN}};
    return map;
}

bool Is5GMode(WIFI_MODE mode) {
    return mode == WIFI_MODE_A || mode == WIFI_MODE_AN || mode == WIFI_MODE_AC ||
           mode == WIFI_MODE_AN_AC;
}

bool IsInterfaceUp(const std::string& name) {
    std::ifstream in(vorn::platform::RootPath("/sys/class/net/" + name + "/operstate"));
    std::string state;
    return std::getline(in, state) && state == "up";
}

}  // namespace

AdapterCapability* AdapterCapability::Create(const std::string& name) {
    // The name reaches the probes' command lines.
    if (!vornwireless::utils::CheckInterfaceName(name)) {
        return nullptr;
    }
    if (utils::IsKiteBBuiltInWlan(name)) {
        return new AdapterCapabilityRLT(name);
    }
    if (utils::IsKiteModel()) {
        return new AdapterCapabilityKiteModel(name);
    }
    return new AdapterCapability(name);
}

int AdapterCapability::Delete(AdapterCapability* capability) {
    delete capability;
    return 0;
}

int AdapterCapability::Verify(const AdapterConfig& config) const {
    const WIFI_TOPOLOGY topology = Adapter::GetTopology();
    if (!Contains(GetTopology(), topology)) {
        VORN_LOG(LOG_ERR, "Failed to verify topology");
        return -1;
    }
    if (topology != WIFI_TOPOLOGY_CLIENT) {
        if (!Contains(GetMode(), config.mode)) {
            VORN_LOG(LOG_ERR, "Failed to verify mode");
            return -1;
        }
        if (Enable5GMode(config.mode) != 0) {
            VORN_LOG(LOG_ERR, "Failed to check and enable 5g mode for (%s)", name_.c_str());
            return -1;
        }
    }
    const std::pair<bool, const char*> checks[] = {
        {Contains(GetBandwidth(), config.bandwidth), "Failed to verify bandwidth"},
        {Contains(GetPower(), config.tx_power), "Failed to verify power"},
        {Contains(GetSecurity(), config.security), "Failed to verify security"},
        {Contains(GetEncryption(), config.encryption), "Failed to verify encryption"},
        {Contains(GetGuestNetworkSecurity(), config.guest_security),
         "Failed to verify guest security"},
        {Contains(GetGuestNetworkEncryption(), config.guest_encryption),
         "Failed to verify guest encryption"},
        {config.max_num_client <= GetMaxNumClient(), "Failed to verify max number client"},
        {config.guest_max_num_client <= GetGuestNetworkMaxNumClient(),
         "Failed to verify guest max number client"}};
    for (const auto& check : checks) {
        if (!check.first) {
            VORN_LOG(LOG_ERR, "%s", check.second);
            return -1;
        }
    }
    return 0;
}

std::vector<WIFI_TOPOLOGY> AdapterCapability::GetTopology() const {
    return {WIFI_TOPOLOGY_CLIENT, WIFI_TOPOLOGY_BRIDGE, WIFI_TOPOLOGY_ROUTER};
}

std::vector<WIFI_FEATURE> AdapterCapability::GetFeature() const {
    return {};
}

std::vector<WIFI_MODE> AdapterCapability::GetMode() const {
    std::string reported;
    if (utils::GetSupportedMode(name_, reported) != 0) {
        VORN_LOG(LOG_ERR, "Failed to get iwconfig (%s)", name_.c_str());
        return {};
    }
    const std::string::size_type phy = reported.find(kPhyPrefix);
    const std::string letters =
        phy == std::string::npos ? "" : reported.substr(phy + std::string(kPhyPrefix).size());
    std::vector<WIFI_MODE> modes;
    for (const auto& entry : ModeMap()) {
        if (!letters.empty() && entry.first.find_first_not_of(letters) == std::string::npos) {
            modes.push_back(entry.second);
        }
    }
    return modes;
}

std::vector<WIFI_BANDWIDTH> AdapterCapability::GetBandwidth() const {
    return {WIFI_BANDWIDTH_20MHZ, WIFI_BANDWIDTH_20_40MHZ};
}

std::vector<int> AdapterCapability::GetChannel() const {
    std::vector<std::string> lines;
    const std::string command = "/sbin/iwlist '" + name_ + "' active_channel";
    if (vorn::platform::ReadShellCommandLines(command, lines) != 0) {
        VORN_LOG(LOG_ERR, "Failed to scan channels(%s, %s)", name_.c_str(), command.c_str());
        return {};
    }
    std::vector<int> channels;
    for (const auto& line : lines) {
        int channel = 0;
        char rest[2] = {};
        if (std::sscanf(line.c_str(), " Channel %d : %1s", &channel, rest) == 2) {
            channels.push_back(channel);
        }
    }
    if (channels.empty()) {
        VORN_LOG(LOG_ERR, "Failed to get channel (%s)", name_.c_str());
    }
    return channels;
}

std::vector<WIFI_POWER> AdapterCapability::GetPower() const {
    return {WIFI_POWER_HIGH, WIFI_POWER_MEDIUM, WIFI_POWER_LOW};
}

int AdapterCapability::GetMaxNumClient() const {
    return kMaxClients;
}

std::vector<WIFI_SECURITY> AdapterCapability::GetSecurity() const {
    return {WIFI_SECURITY_DISABLED,           WIFI_SECURITY_WEP,
            WIFI_SECURITY_PERSONAL_WPA,       WIFI_SECURITY_PERSONAL_WPA2,
            WIFI_SECURITY_PERSONAL_WPA_MIXED, WIFI_SECURITY_ENTERPRISE_WPA,
            WIFI_SECURITY_ENTERPRISE_WPA2,    WIFI_SECURITY_ENTERPRISE_WPA_MIXED};
}

std::vector<WIFI_ENCRYPTION> AdapterCapability::GetEncryption() const {
    return {WIFI_ENCRYPTION_NONE, WIFI_ENCRYPTION_TKIP, WIFI_ENCRYPTION_AES,
            WIFI_ENCRYPTION_TKIP_AES};
}

std::vector<WIFI_MAC_FILTER_POLICY> AdapterCapability::GetMacFilterPolicy() const {
    return {WIFI_MAC_FILTER_POLICY_DENY, WIFI_MAC_FILTER_POLICY_ALLOW};
}

int AdapterCapability::GetGuestNetworkMaxNumClient() const {
    return GetMaxNumClient();
}

std::vector<WIFI_SECURITY> AdapterCapability::GetGuestNetworkSecurity() const {
    return GetSecurity();
}

std::vector<WIFI_ENCRYPTION> AdapterCapability::GetGuestNetworkEncryption() const {
    return GetEncryption();
}

int AdapterCapability::Enable5GMode(WIFI_MODE mode) const {
    if (!Is5GMode(mode)) {
        return 0;
    }
    const int quiet = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDOUT | QLIBC_EXEC_NO_STDIN;
    if (!IsInterfaceUp(name_) &&
        QLIBCExecl("/sbin/ip", quiet, "link", "set", "dev", name_.c_str(), "up", nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to interface up for (%s)", name_.c_str());
        return -1;
    }
    if (QLIBCExecl("/sbin/iwlist", quiet, name_.c_str(), "scanning", nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to iwlist scanning for (%s)", name_.c_str());
        return -1;
    }
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
