#include "wifi/adapter/adapter_agent_hostapd.h"

#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdlib>

#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "utils/decimal.h"
#include "utils/file.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/settings/adapter_config_check.h"
#include "wifi/settings/enum_map.h"

namespace vornwireless {
namespace wifi {
namespace {

using vornwireless::utils::MacAddress;

constexpr const char* kHostapdDir = "/etc/hostapd";
constexpr const char* kMacList = "/etc/hostapd/hostapd-mac.list";
constexpr const char* kControlDir = "/var/run/hostapd";
constexpr const char* kNetworkScript = "/etc/rc.network";
constexpr const char* kHostapdCli = "/usr/bin/hostapd_cli";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
constexpr int kQuietFlags = kExecFlags | QLIBC_EXEC_NO_STDERR;
// "20.0 dBm" is read as "20.": three characters and the end of the buffer.
constexpr std::size_t kPowerBytes = 4;
// Far above any radio's; what iw could not mean ("9e9") never reaches SetTXPower's int.
constexpr double kMaxPowerDbm = 100;
// 256 stations of about 30 lines each.
constexpr std::size_t kMaxStationLines = 8192;
constexpr std::size_t kStationLineBytes = 1024;
constexpr int kFirstUpperChannel = 6;
constexpr std::size_t kHexPskLength = 64;

// "key=value" lines, each ended by a line end.
class ConfText {
  public:
    ConfText& operator()(const std::string& key, const std::string& value) {
        text_ += key + "=" + value + "\n";
        return *this;
    }
    ConfText& operator()(const std::string& key, int value) {
        return (*this)(key, std::to_string(value));
    }
    const std::string& Text() const { return text_; }

  private:
    std::string text_;
};

bool IsPersonal(WIFI_SECURITY security) {
    return security == WIFI_SECURITY_PERSONAL_WPA || security == WIFI_SECURITY_PERSONAL_WPA2 ||
           security == WIFI_SECURITY_PERSONAL_WPA_MIXED;
}

bool IsEnterprise(WIFI_SECURITY security) {
    return security == WIFI_SECURITY_ENTERPRISE_WPA || security == WIFI_SECURITY_ENTERPRISE_WPA2 ||
           security == WIFI_SECURITY_ENTERPRISE_WPA_MIXED;
}

bool IsHexWepKey(const std::string& key) {
    return key.size() == 10 || key.size() == 26;
}

// hostapd takes a hex WEP key as it stands: anything but hex digits fails the whole file.
bool IsWepKeyWritable(WIFI_SECURITY security, const std::string& key) {
    return security != WIFI_SECURITY_WEP || !IsHexWepKey(key) || IsHexText(key);
}

// Every text reaches a file that hostapd reads line by line, up to the line end.
bool IsWritable(const AdapterConfig& config) {
    if (CheckAccessPointConfig(config) != 0) {
        return false;
    }
    if (!IsWepKeyWritable(config.security, config.password) ||
        !IsWepKeyWritable(config.guest_security, config.guest_password)) {
        VORN_LOG(LOG_ERR, "Refused config: a WEP key of 10 or 26 characters is not hex");
        return false;
    }
    return true;
}

bool IsFilterPolicy(WIFI_MAC_FILTER_POLICY policy) {
    return policy == WIFI_MAC_FILTER_POLICY_DENY || policy == WIFI_MAC_FILTER_POLICY_ALLOW;
}

bool HasEnabledRule(const AdapterConfig& config) {
    return std::any_of(config.mac_filter_rules.begin(), config.mac_filter_rules.end(),
                       [](const AdapterConfig::MacFilterRule& rule) { return rule.enable; });
}

std::string EnableLine(bool enabled) {
    return ConfText()("enable", enabled ? "yes" : "no").Text();
}

// The band of a mode that names one, and whether 802.11n comes with it; false for the mixed and
// ac modes, which write no mode lines.
bool GetBand(WIFI_MODE mode, WIFI_MODE& band, bool& ht) {
    switch (mode) {
        case WIFI_MODE_A:
        case WIFI_MODE_B:
        case WIFI_MODE_G:
            band = mode;
            ht = false;
            return true;
        case WIFI_MODE_N:
        case WIFI_MODE_GN:
            band = WIFI_MODE_G;
            ht = true;
            return true;
        case WIFI_MODE_AN:
            band = WIFI_MODE_A;
            ht = true;
            return true;
        case WIFI_MODE_BN:
            band = WIFI_MODE_B;
            ht = true;
            return true;
        default:
            return false;
    }
}

// Only the n modes write this line, so the secondary channel follows the 2.4 GHz rule for
// every mode, "an" included.
std::string HtCapabilities(const AdapterConfig& config) {
    if (config.bandwidth != WIFI_BANDWIDTH_20_40MHZ) {
        return "[SHORT-GI-20][DELAYED-BA]";
    }
    return std::string("[SHORT-GI-20][DELAYED-BA][SHORT-GI-40][MAX-AMSDU-7935]") +
           (config.channel < kFirstUpperChannel ? "[HT40+]" : "[HT40-]");
}

void AddModeLines(const AdapterConfig& config, ConfText& conf) {
    WIFI_MODE band = WIFI_MODE_ERROR;
    bool ht = false;
    if (!GetBand(config.mode, band, ht)) {
        return;
    }
    conf("hw_mode", EnumMap<WIFI_MODE>::EnumToString(band));
    if (!ht) {
        return;
    }
    conf("ieee80211n", 1)("ht_capab", HtCapabilities(config));
    if (config.mode == WIFI_MODE_N && config.security != WIFI_SECURITY_WEP &&
        config.encryption != WIFI_ENCRYPTION_TKIP) {
        conf("require_ht", 1);
    }
}

int WpaVersion(WIFI_SECURITY security) {
    if (security == WIFI_SECURITY_PERSONAL_WPA_MIXED ||
        security == WIFI_SECURITY_ENTERPRISE_WPA_MIXED) {
        return 3;
    }
    if (security == WIFI_SECURITY_PERSONAL_WPA2 || security == WIFI_SECURITY_ENTERPRISE_WPA2) {
        return 2;
    }
    return 1;
}

void AddCipherLines(WIFI_ENCRYPTION encryption, ConfText& conf) {
    const char* cipher = nullptr;
    switch (encryption) {
        case WIFI_ENCRYPTION_AES:
            cipher = "CCMP";
            break;
        case WIFI_ENCRYPTION_TKIP_AES:
            cipher = "TKIP CCMP";
            break;
        case WIFI_ENCRYPTION_TKIP:
            cipher = "TKIP";
            break;
        default:
            return;
    }
    conf("wpa_pairwise", cipher)("rsn_pairwise", cipher);
}

// 5 or 13 characters are an ASCII key, 10 or 26 a hex key; any other length writes no key.
void AddWepKey(const std::string& key, ConfText& conf) {
    if (key.size() == 5 || key.size() == 13) {
        conf("wep_key0", "\"" + key + "\"");
    } else if (IsHexWepKey(key)) {
        conf("wep_key0", key);
    }
}

// hostapd takes a passphrase of 8 to 63 characters; 64 hex digits are the key itself.
void AddPersonalLines(WIFI_SECURITY security, WIFI_ENCRYPTION encryption,
                      const std::string& password, ConfText& conf) {
    const bool psk = password.size() == kHexPskLength && IsHexText(password);
    conf("auth_algs", 1)("wpa", WpaVersion(security))("wpa_key_mgmt", "WPA-PSK");
    conf(psk ? "wpa_psk" : "wpa_passphrase", password);
    AddCipherLines(encryption, conf);
}

void AddSecurityLines(const AdapterConfig& config, ConfText& conf) {
    if (config.security == WIFI_SECURITY_DISABLED) {
        conf("eap_server", 1)("auth_algs", 1);
    } else if (config.security == WIFI_SECURITY_WEP) {
        // hostapd reads the word as key 0.
        conf("eap_server", 1)("auth_algs", 3)("wep_default_key", "wep_default_key");
        AddWepKey(config.password, conf);
    } else if (IsPersonal(config.security)) {
        conf("eap_server", 1);
        AddPersonalLines(config.security, config.encryption, config.password, conf);
    } else if (IsEnterprise(config.security)) {
        conf("eap_server", 0)("auth_algs", 1)("wpa", WpaVersion(config.security));
        conf("wpa_key_mgmt", "WPA-EAP");
        AddCipherLines(config.encryption, conf);
        conf("ieee8021x", 1)("auth_server_addr", config.auth_server_ip.ToString());
        conf("auth_server_port", config.auth_server_Port);
        conf("auth_server_shared_secret", config.auth_server_shared_secret);
    }
}

void AddGuestSecurityLines(const AdapterConfig& config, ConfText& conf) {
    if (config.guest_security == WIFI_SECURITY_WEP) {
        conf("auth_algs", 3)("wep_default_key", 0);
        AddWepKey(config.guest_password, conf);
    } else if (IsPersonal(config.guest_security)) {
        AddPersonalLines(config.guest_security, config.guest_encryption, config.guest_password,
                         conf);
    }
}

void AddMacFilterLines(WIFI_MAC_FILTER_POLICY policy, ConfText& conf) {
    if (policy == WIFI_MAC_FILTER_POLICY_DENY) {
        conf("macaddr_acl", 0)("deny_mac_file", kMacList);
    } else {
        conf("macaddr_acl", 1)("accept_mac_file", kMacList);
    }
}

std::string HostConf(const std::string& ifname, const AdapterConfig& config) {
    ConfText conf;
    conf("interface", ifname)("driver", EnumMap<WIFI_DRIVER>::EnumToString(WIFI_DRIVER_NL80211));
    conf("ssid", config.ssid)("ignore_broadcast_ssid", config.display_ssid ? 0 : 1);
    conf("macaddr_acl", 0)("wpa_psk_file", "/etc/hostapd.psk")("wps_state", 2);
    conf("ap_setup_locked", 1)("ctrl_interface", kControlDir);
    conf("config_methods", "label display push_button keypad");
    conf("max_num_sta", config.max_num_client);
    conf("bridge", utils::GetBridgeName(Adapter::GetTopology()));
    conf("channel", config.channel)("wmm_enabled", config.wmm_enabled ? 1 : 0);
    AddModeLines(config, conf);
    AddSecurityLines(config, conf);
    if (HasEnabledRule(config)) {
        AddMacFilterLines(config.mac_filter_policy, conf);
    }
    return conf.Text();
}

std::string GuestConf(const std::string& ifname, const AdapterConfig& config) {
    ConfText conf;
    conf("bss", "g" + ifname)("bssid", config.guest_bssid.ToString());
    conf("ssid", config.guest_ssid)("ignore_broadcast_ssid", config.guest_display_ssid ? 0 : 1);
    conf("ctrl_interface", kControlDir)("max_num_sta", config.guest_max_num_client);
    conf("bridge", "gbr" + std::to_string(utils::GetWirelessIndex(ifname)));
    if (!config.guest_allow_access_guest) {
        conf("ap_isolate", 1);
    }
    AddGuestSecurityLines(config, conf);
    if (HasEnabledRule(config)) {
        AddMacFilterLines(config.mac_filter_policy, conf);
    }
    return conf.Text();
}

std::string ConfigFile(const std::string& ifname, const char* suffix) {
    return std::string(kHostapdDir) + "/hostapd-" + ifname + suffix;
}

bool WriteFile(const std::string& logical, const std::string& content) {
    return vorn::platform::WriteFileAtomically(vorn::platform::RootPath(logical), content);
}

// The radio's maximum power in dBm on the channel (the first listed for the automatic channel),
// or 0 when iw lists none.
double ReadMaxPower(int channel) {
    const std::string select = channel != 0 ? "grep \"\\[" + std::to_string(channel) + "\\]\""
                                            : std::string("awk 'NR==1'");
    const std::string command =
        "iw phy0 info | grep \"dBm)$\" | " + select + " | cut -d\"(\" -f2 | cut -d\"d\" -f1";
    std::string text;
    if (vorn::platform::ReadShellCommandLine(command, text, kPowerBytes) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command.c_str());
        return 0;
    }
    return AdapterAgentHostapd::ParseMaxPower(text);
}

}  // namespace

int AdapterAgentHostapd::GenerateMacFilterConfig(const AdapterConfig& config) {
    std::string list;
    int count = 0;
    for (const auto& rule : config.mac_filter_rules) {
        if (!rule.enable) {
            continue;
        }
        if (!rule.mac.IsFormalized()) {
            VORN_LOG(LOG_ERR, "Refused config: mac_filter_rules.mac is not a MAC address");
            return -1;
        }
        list += rule.mac.ToString() + "\n";
        ++count;
    }
    unlink(vorn::platform::RootPath(kMacList).c_str());
    if (count > 0 && !WriteFile(kMacList, list)) {
        return -1;
    }
    return count;
}

int AdapterAgentHostapd::GenerateHostapdConfig(const AdapterConfig& config) {
    if (!IsNameValid() || !IsWritable(config)) {
        VORN_LOG(LOG_ERR, "Refused hostapd config for [%s]", GetName().c_str());
        return -1;
    }
    if (HasEnabledRule(config) && !IsFilterPolicy(config.mac_filter_policy)) {
        VORN_LOG(LOG_ERR, "Refused config: mac_filter_policy [%d] with enabled rules",
                 static_cast<int>(config.mac_filter_policy));
        return -1;
    }
    const std::string& name = GetName();
    if (vornwireless::utils::CheckAndMakeDir(kHostapdDir, 0755) != 0 ||
        !WriteFile(ConfigFile(name, ".info"), EnableLine(config.enabled)) ||
        GenerateMacFilterConfig(config) < 0 ||
        !WriteFile(ConfigFile(name, "-host.conf"), HostConf(name, config)) ||
        !WriteFile(ConfigFile(name, "-guest.info"), EnableLine(config.guest_enabled)) ||
        !WriteFile(ConfigFile(name, "-guest.conf"), GuestConf(name, config))) {
        return -1;
    }
    return 0;
}

int AdapterAgentHostapd::EnableAP(const AdapterConfig& config) {
    if (GenerateHostapdConfig(config) != 0) {
        VORN_LOG(LOG_ERR, "Faild to generate hostapd conf");
    } else if (config.enabled && HasRadioSwitch() && SwitchRadio("unblock") != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute rfkill unblock");
    } else if (QLIBCExecl(kNetworkScript, kExecFlags, "start-ap", GetName().c_str(), nullptr) !=
               0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network start-ap for[%s]", GetName().c_str());
    } else {
        return 0;
    }
    BlockRadioWhenUnused();
    return -1;
}

int AdapterAgentHostapd::DisableAP(const AdapterConfig&) {
    if (!IsNameValid()) {
        return -1;
    }
    if (QLIBCExecl(kNetworkScript, kExecFlags, "stop-ap", GetName().c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network stop-ap for[%s]", GetName().c_str());
        return -1;
    }
    return BlockRadioWhenUnused();
}

int AdapterAgentHostapd::SetTXPower(const AdapterConfig& config) {
    if (!IsNameValid()) {
        return -1;
    }
    const double maxPower = ReadMaxPower(config.channel);
    if (maxPower <= 0) {
        VORN_LOG(LOG_ERR, "No maximum tx power for channel %d of [%s], tx power left as it is",
                 config.channel, GetName().c_str());
        return -1;
    }
    const int level = static_cast<int>(config.tx_power);
    const int power = static_cast<int>(std::ceil(std::ceil(maxPower) * level / 10));
    const std::string command = "iwconfig " + GetName() + " txpower " + std::to_string(power);
    if (QLIBCSystem(command.c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set txpower using [%s]", command.c_str());
        return -1;
    }
    return 0;
}

int AdapterAgentHostapd::LoadStationConnData(std::vector<utils::ConnectionInfo>& connections) {
    if (!IsNameValid()) {
        return -1;
    }
    const std::string command = "hostapd_cli -i" + GetName() + " all_sta";
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxStationLines,
                                              kStationLineBytes) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command.c_str());
        return -1;
    }
    AddConnections(ParseStations(lines), connections);
    return 0;
}

double AdapterAgentHostapd::ParseMaxPower(const std::string& text) {
    char* end = nullptr;
    const double power = std::strtod(text.c_str(), &end);
    return end != text.c_str() && power > 0 && power <= kMaxPowerDbm ? power : 0;
}

std::vector<utils::ConnectionInfo> AdapterAgentHostapd::ParseStations(
    const std::vector<std::string>& lines) {
    const std::string timeKey = "connected_time=";
    std::vector<utils::ConnectionInfo> stations;
    for (const std::string& line : lines) {
        if (MacAddress::IsFormalized(line)) {
            stations.emplace_back();
            stations.back().mac = MacAddress(line);
        } else if (!stations.empty() && line.compare(0, timeKey.size(), timeKey) == 0) {
            vornwireless::utils::ParseDecimal(line.substr(timeKey.size()),
                                              stations.back().connected_time);
        }
    }
    return stations;
}

int AdapterAgentHostapd::EnableWPSWithPBC() {
    if (!IsNameValid()) {
        return -1;
    }
    if (QLIBCExecl(kHostapdCli, kQuietFlags, "-i", GetName().c_str(), "wps_pbc", nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute %s wps_pbc (%s)", kHostapdCli, GetName().c_str());
        return -1;
    }
    return 0;
}

int AdapterAgentHostapd::EnableWPSWithPinCode(const std::string& pin) {
    if (!IsWpsPin(pin)) {
        VORN_LOG(LOG_ERR, "Refused WPS PIN: 4 or 8 digits expected");
        return -1;
    }
    if (!IsNameValid()) {
        return -1;
    }
    // Waited for by its own pid: the daemon's handling of SIGCHLD is never changed.
    if (QLIBCExecl(kHostapdCli, kQuietFlags, "-i", GetName().c_str(), "wps_pin", "any", pin.c_str(),
                   "120", nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute %s wps_pin %s (%s)", kHostapdCli, "any",
                 GetName().c_str());
        return -1;
    }
    return 0;
}

WIFI_STATUS AdapterAgentHostapd::GetStatus(const AdapterConfig&) const {
    return utils::IsNetActivate(GetName()) ? WIFI_STATUS_ENABLED : WIFI_STATUS_DISABLED;
}

}  // namespace wifi
}  // namespace vornwireless
