#include "wifi/adapter/adapter_agent_rlt.h"

#include <signal.h>

#include <sstream>

#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "utils/file.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/bridge/bridge_base.h"
#include "wifi/settings/adapter_config_check.h"

namespace vornwireless {
namespace wifi {
namespace {

using vornwireless::utils::MacAddress;

constexpr const char* kProfileDir = "/usr/vorn/etc/rlt_wifi";
constexpr const char* kProfile = "/usr/vorn/etc/rlt_wifi/rlt_wifi.conf";
constexpr const char* kIfconfig = "/sbin/ifconfig";
constexpr const char* kIwpriv = "/sbin/iwpriv";
constexpr const char* kAuthDaemon = "/usr/vorn/sbin/rt2860apd";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
constexpr std::size_t kMaxTableLines = 512;
constexpr std::size_t kTableLineBytes = 256;
constexpr std::string::size_type kMacLength = 17;

bool IsWpa(WIFI_SECURITY security) {
    return security == WIFI_SECURITY_PERSONAL_WPA || security == WIFI_SECURITY_PERSONAL_WPA2 ||
           security == WIFI_SECURITY_ENTERPRISE_WPA || security == WIFI_SECURITY_ENTERPRISE_WPA2;
}

bool IsEnterprise(WIFI_SECURITY security) {
    return security == WIFI_SECURITY_ENTERPRISE_WPA || security == WIFI_SECURITY_ENTERPRISE_WPA2;
}

// What the authentication lines read of one network.
struct Network {
    WIFI_SECURITY security;
    WIFI_ENCRYPTION encryption;
    const std::string& password;
};

// One value per network: the main one alone, or "main;guest;" with the guest network.
std::string PerNetwork(bool guest, const std::string& main, const std::string& guestValue) {
    return guest ? main + ";" + guestValue + ";" : main;
}

std::string Flag(bool on) {
    return on ? "1" : "0";
}

int WirelessMode(WIFI_MODE mode) {
    switch (mode) {
        case WIFI_MODE_A:
            return 2;
        case WIFI_MODE_B:
            return 1;
        case WIFI_MODE_G:
            return 4;
        case WIFI_MODE_N:
            return 6;
        case WIFI_MODE_AN:
            return 8;
        case WIFI_MODE_GN:
            return 7;
        case WIFI_MODE_BG:
            return 0;
        case WIFI_MODE_BGN:
            return 9;
        case WIFI_MODE_AN_AC:
            return 15;
        default:
            VORN_LOG(LOG_ERR, "Bad mode (%d)", static_cast<int>(mode));
            return -1;
    }
}

std::string AuthMode(WIFI_SECURITY security) {
    switch (security) {
        case WIFI_SECURITY_DISABLED:
            return "OPEN";
        case WIFI_SECURITY_WEP:
            return "SHARED";
        case WIFI_SECURITY_PERSONAL_WPA:
            return "WPAPSK";
        case WIFI_SECURITY_PERSONAL_WPA2:
            return "WPA2PSK";
        case WIFI_SECURITY_ENTERPRISE_WPA:
            return "WPA";
        case WIFI_SECURITY_ENTERPRISE_WPA2:
            return "WPA2";
        default:
            VORN_LOG(LOG_ERR, "Bad auth(%d)", static_cast<int>(security));
            return "error";
    }
}

std::string EncrypType(WIFI_SECURITY security, WIFI_ENCRYPTION encryption, WIFI_ENCRYPTION logged) {
    if (security == WIFI_SECURITY_DISABLED) {
        return "NONE";
    }
    if (security == WIFI_SECURITY_WEP) {
        return "WEP";
    }
    switch (encryption) {
        case WIFI_ENCRYPTION_TKIP:
            return "TKIP";
        case WIFI_ENCRYPTION_AES:
            return "AES";
        case WIFI_ENCRYPTION_TKIP_AES:
            return "TKIPAES";
        default:
            VORN_LOG(LOG_ERR, "Bad encryption(%d)", static_cast<int>(logged));
            return "error";
    }
}

std::string DefaultKeyId(WIFI_SECURITY security) {
    if (IsWpa(security)) {
        return "2";
    }
    if (security == WIFI_SECURITY_DISABLED || security == WIFI_SECURITY_WEP) {
        return "1";
    }
    VORN_LOG(LOG_ERR, "Bad auth(%d)", static_cast<int>(security));
    return "0";
}

std::string Key1(WIFI_SECURITY security, const std::string& password) {
    return security == WIFI_SECURITY_WEP ? password : "";
}

std::string WpaPsk(WIFI_SECURITY security, WIFI_ENCRYPTION encryption,
                   const std::string& password) {
    if (!IsWpa(security)) {
        return "";
    }
    const bool known = encryption == WIFI_ENCRYPTION_TKIP || encryption == WIFI_ENCRYPTION_AES ||
                       encryption == WIFI_ENCRYPTION_TKIP_AES;
    return known ? password : "error";
}

// The driver splits every value at ";", and reads the file line by line.
bool IsWritable(const AdapterConfig& config) {
    return CheckAccessPointConfig(config) == 0 && CheckRLTConfig(config) == 0;
}

std::string GuestInterface(const std::string& ifname) {
    return "g" + ifname;
}

int RunIfconfig(const std::string& ifname, const char* state) {
    return QLIBCExecl(kIfconfig, kExecFlags, ifname.c_str(), state, nullptr);
}

// The MACs that start the lines of the driver's station table.
std::vector<utils::ConnectionInfo> ParseMacTable(const std::vector<std::string>& lines) {
    std::vector<utils::ConnectionInfo> stations;
    for (const std::string& line : lines) {
        const MacAddress mac(line.substr(0, kMacLength));
        if (line.size() >= kMacLength && mac.IsFormalized()) {
            stations.emplace_back();
            stations.back().mac = mac;
        }
    }
    return stations;
}

}  // namespace

int AdapterAgentRLT::SetAuth(const AdapterConfig& config, std::ostream& out) {
    if (!out) {
        VORN_LOG(LOG_ERR, "conf not opened");
        return -1;
    }
    const Network main{config.security, config.encryption, config.password};
    const Network guest{config.guest_security, config.guest_encryption, config.guest_password};
    // The guest network's value is made, and its errors logged, only while it is on.
    const auto line = [&](const char* key, auto value) {
        out << key
            << PerNetwork(config.guest_enabled, value(main),
                          config.guest_enabled ? value(guest) : "")
            << "\n";
    };
    line("AuthMode=", [](const Network& n) { return AuthMode(n.security); });
    // A "Bad encryption" line names the main network's encryption for both.
    line("EncrypType=", [&config](const Network& n) {
        return EncrypType(n.security, n.encryption, config.encryption);
    });
    line("DefaultKeyID=", [](const Network& n) { return DefaultKeyId(n.security); });
    line("Key1=", [](const Network& n) { return Key1(n.security, n.password); });
    line("WPAPSK=", [](const Network& n) { return WpaPsk(n.security, n.encryption, n.password); });
    SetAuthDetail(config, out);
    return 0;
}

int AdapterAgentRLT::SetAuthDetail(const AdapterConfig& config, std::ostream& out) {
    if (config.security >= WIFI_SECURITY_DISABLED &&
        config.security <= WIFI_SECURITY_PERSONAL_WPA2) {
        return 0;
    }
    if (!IsEnterprise(config.security)) {
        VORN_LOG(LOG_ERR, "Bad auth(%d)", static_cast<int>(config.security));
        return -1;
    }
    out << "RADIUS_Server=" << config.auth_server_ip.ToString() << "\n";
    out << "RADIUS_Port=" << config.auth_server_Port << "\n";
    out << "RADIUS_Key=" << config.auth_server_shared_secret << "\n";
    out << "own_ip_addr=" << GetWanIPAddress().ToString() << "\n";
    out << "IEEE8021X=1;0;\n";
    out << "EAPifname=" << utils::GetBridgeName(Adapter::GetTopology()) << "\n";
    out << "PreAuthifname=" << GetWanIfName() << "\n";
    return 0;
}

int AdapterAgentRLT::GenerateRLTConfig(const AdapterConfig& config) {
    if (!IsNameValid() || !IsWritable(config)) {
        VORN_LOG(LOG_ERR, "Refused rlt conf for [%s]", GetName().c_str());
        return -1;
    }
    const bool guest = config.guest_enabled;
    std::ostringstream out;
    out << "Default\n";
    out << "CountryRegion=" << config.CountryRegion << "\n";
    out << "CountryRegionABand=" << config.CountryRegionABand << "\n";
    out << "CountryCode=" << config.CountryCode << "\n";
    out << "BssidNum=" << (guest ? 2 : 1) << "\n";
    out << "SSID1=" << config.ssid << "\n";
    if (guest) {
        out << "SSID2=" << config.guest_ssid << "\n";
    }
    out << "WirelessMode=" << WirelessMode(config.mode) << "\n";
    out << "Channel=" << config.channel << "\n";
    out << "MaxStaNum=" << config.max_num_client << "\n";
    out << "WmmCapable=" << Flag(config.wmm_enabled) << "\n";
    out << "HT_BW=" << Flag(config.bandwidth != WIFI_BANDWIDTH_20MHZ) << "\n";
    out << "VHT_BW=" << Flag(config.bandwidth == WIFI_BANDWIDTH_20_40_80MHZ) << "\n";
    out << "TxPower=" << static_cast<int>(config.tx_power) * 10 << "\n";
    out << "HideSSID="
        << PerNetwork(guest, Flag(!config.display_ssid), Flag(!config.guest_display_ssid)) << "\n";
    if (SetAuth(config, out) != 0) {
        VORN_LOG(LOG_ERR, "Failed to write conf");
        return -1;
    }
    out << "NoForwarding=0;" << Flag(!config.guest_allow_access_guest) << ";\n";
    if (vornwireless::utils::CheckAndMakeDir(kProfileDir, 0755) != 0 ||
        !vorn::platform::WriteFileAtomically(vorn::platform::RootPath(kProfile), out.str())) {
        VORN_LOG(LOG_ERR, "Failed to open file [%s]", kProfile);
        return -1;
    }
    return 0;
}

int AdapterAgentRLT::ReloadKernelModule() {
    if (utils::RemoveRLTKernelModule() != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove module");
    }
    if (utils::InsertRLTKernelModule() != 0) {
        VORN_LOG(LOG_ERR, "Failed to load rlt_wifi");
        return -1;
    }
    return 0;
}

int AdapterAgentRLT::SetDriver(const std::string& ifname, const std::string& setting) const {
    return QLIBCExecl(kIwpriv, kExecFlags, ifname.c_str(), "set", setting.c_str(), nullptr);
}

int AdapterAgentRLT::EnableAP(const AdapterConfig& config) {
    if (GenerateRLTConfig(config) != 0) {
        VORN_LOG(LOG_ERR, "Faild to generate rlt conf");
        return -1;
    }
    if (!config.enabled) {
        apEnabled_ = false;
        return 0;
    }
    const std::string& name = GetName();
    if (ReloadKernelModule() != 0) {
        VORN_LOG(LOG_ERR, "Failed to reload [%s]", name.c_str());
        return -1;
    }
    const int up = RunIfconfig(name, "up");
    if (up < 0) {
        VORN_LOG(LOG_ERR, "Failed to up [%s][%d]", name.c_str(), up);
        return up;
    }
    // The radio is up from here on: a later failure is logged, and the caller sees success.
    if (IsEnterprise(config.security) && QLIBCExecl(kAuthDaemon, kExecFlags, nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to start rt2860apd");
        return up;
    }
    if (BridgeBase::AddSlave(name) != 0) {
        VORN_LOG(LOG_ERR, "Failed to add [%s] to bridge", name.c_str());
        return up;
    }
    if (config.guest_enabled && EnableAPGuest(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable guest network");
        return up;
    }
    if (SetDriver(name, "WscConfMode=7") != 0) {
        VORN_LOG(LOG_ERR, "Failed to set WscConfMode (%s)", name.c_str());
        return up;
    }
    if (GenerateMacFilterConfig(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set mac filter (%s)", name.c_str());
        return up;
    }
    apEnabled_ = true;
    return 0;
}

int AdapterAgentRLT::DisableAP(const AdapterConfig& config) {
    if (!apEnabled_) {
        return 0;
    }
    const std::string& name = GetName();
    if (guestEnabled_ && DisableAPGuest(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable guest network");
        return -1;
    }
    if (BridgeBase::RemoveSlaveWlan(name) != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove [%s]", name.c_str());
        return -1;
    }
    if (QLIBCProcKillByName("rt2860apd", SIGTERM) < 0) {
        VORN_LOG(LOG_ERR, "Failed to kill rt2860apd");
    }
    if (RunIfconfig(name, "down") != 0) {
        VORN_LOG(LOG_ERR, "Failed to down [%s]", name.c_str());
        return -1;
    }
    apEnabled_ = false;
    return 0;
}

// The driver brings the guest network up as a second interface, "g" + the radio's name, which
// joins the guest bridge.
int AdapterAgentRLT::EnableAPGuest(const AdapterConfig&) {
    const std::string guest = GuestInterface(GetName());
    if (RunIfconfig(guest, "up") != 0 || BridgeBase::AddSlave(guest) != 0) {
        VORN_LOG(LOG_ERR, "Failed to bring up [%s]", guest.c_str());
        return -1;
    }
    guestEnabled_ = true;
    return 0;
}

int AdapterAgentRLT::DisableAPGuest(const AdapterConfig&) {
    const std::string guest = GuestInterface(GetName());
    if (BridgeBase::RemoveSlaveWlan(guest) != 0 || RunIfconfig(guest, "down") != 0) {
        VORN_LOG(LOG_ERR, "Failed to take down [%s]", guest.c_str());
        return -1;
    }
    guestEnabled_ = false;
    return 0;
}

int AdapterAgentRLT::SetTXPower(const AdapterConfig& config) {
    if (!IsNameValid()) {
        return -1;
    }
    const std::string setting = "TxPower=" + std::to_string(static_cast<int>(config.tx_power) * 10);
    if (SetDriver(GetName(), setting) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set %s (%s)", setting.c_str(), GetName().c_str());
        return -1;
    }
    return 0;
}

// AccessPolicy0: 0 no list, 1 only the listed stations, 2 all but them.
int AdapterAgentRLT::GenerateMacFilterConfig(const AdapterConfig& config) {
    std::string list;
    for (const auto& rule : config.mac_filter_rules) {
        if (!rule.enable) {
            continue;
        }
        if (!rule.mac.IsFormalized()) {
            VORN_LOG(LOG_ERR, "Refused config: mac_filter_rules.mac is not a MAC address");
            return -1;
        }
        list += (list.empty() ? "" : ";") + rule.mac.ToString();
    }
    int policy = 0;
    if (!list.empty()) {
        policy = config.mac_filter_policy == WIFI_MAC_FILTER_POLICY_ALLOW ? 1 : 2;
    }
    const std::string& name = GetName();
    if (SetDriver(name, "ACLClearAll=1") != 0 ||
        (!list.empty() && SetDriver(name, "ACLAddEntry=" + list) != 0) ||
        SetDriver(name, "AccessPolicy=" + std::to_string(policy)) != 0) {
        return -1;
    }
    return 0;
}

int AdapterAgentRLT::LoadStationConnData(std::vector<utils::ConnectionInfo>& connections) {
    if (!IsNameValid()) {
        return -1;
    }
    const std::string command = "iwpriv " + GetName() + " get_mac_table";
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxTableLines, kTableLineBytes) !=
        0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command.c_str());
        return -1;
    }
    AddConnections(ParseMacTable(lines), connections);
    return 0;
}

int AdapterAgentRLT::EnableWPSWithPBC() {
    if (!IsNameValid() || SetDriver(GetName(), "WscMode=2") != 0 ||
        SetDriver(GetName(), "WscGetConf=1") != 0) {
        VORN_LOG(LOG_ERR, "Failed to start WPS PBC (%s)", GetName().c_str());
        return -1;
    }
    return 0;
}

int AdapterAgentRLT::EnableWPSWithPinCode(const std::string& pin) {
    if (!IsWpsPin(pin)) {
        VORN_LOG(LOG_ERR, "Refused WPS PIN: 4 or 8 digits expected");
        return -1;
    }
    if (!IsNameValid() || SetDriver(GetName(), "WscMode=1") != 0 ||
        SetDriver(GetName(), "WscPinCode=" + pin) != 0 ||
        SetDriver(GetName(), "WscGetConf=1") != 0) {
        VORN_LOG(LOG_ERR, "Failed to start WPS PIN (%s)", GetName().c_str());
        return -1;
    }
    return 0;
}

WIFI_STATUS AdapterAgentRLT::GetStatus(const AdapterConfig&) const {
    return utils::IsNetActivate(GetName()) ? WIFI_STATUS_ENABLED : WIFI_STATUS_DISABLED;
}

vornwireless::utils::IPAddress AdapterAgentRLT::GetWanIPAddress() const {
    using vornwireless::utils::IPAddress;
    const auto addresses = IPAddress::GetIPv4Address(GetWanIfName());
    return IPAddress(addresses.empty() ? "" : addresses.front().first);
}

}  // namespace wifi
}  // namespace vornwireless
