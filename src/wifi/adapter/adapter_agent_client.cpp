#include "wifi/adapter/adapter_agent_client.h"

#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <map>
#include <sstream>

#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "utils/decimal.h"
#include "utils/log.h"
#include "utils/process.h"
#include "wifi/adapter/adapter.h"
#include "wifi/settings/adapter_config_check.h"
#include "wifi/settings/enum_map.h"
#include "wifi/utils/station_utils.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

using StationInfo = AdapterConfig::StationInfo;

constexpr const char* kWpaCli = "/usr/sbin/wpa_cli";
constexpr const char* kWpaSupplicant = "/usr/sbin/wpa_supplicant";
constexpr const char* kSupplicantName = "wpa_supplicant";
constexpr const char* kReconnectScript = "/usr/vorn/etc/wifi/wpa_post_reconnect.sh";
constexpr const char* kIwconfig = "/sbin/iwconfig";
constexpr const char* kIfconfig = "/sbin/ifconfig";
constexpr const char* kZeroBssid = "00:00:00:00:00:00";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
constexpr int kQuietFlags = kExecFlags | QLIBC_EXEC_NO_STDERR;
constexpr int kAssociationPolls = 15;
constexpr int kTerminateAttempts = 3;
constexpr int kDownAttempts = 3;
// A few hundred networks in range at most; a line of the listing is well under 128 bytes.

bool IsPrintableAscii(unsigned char c) {
    return c >= 0x20 && c < 0x7f;
}

// What the supplicant reads between double quotes up to the last one, byte for byte.
bool IsQuotable(const std::string& text) {
    return std::all_of(text.begin(), text.end(), [](char c) {
        const auto byte = static_cast<unsigned char>(c);
        return c != '"' && byte >= 0x20 && byte != 0x7f;
    });
}

std::string Quoted(const std::string& text) {
    return "\"" + text + "\"";
}

std::string ToHex(const std::string& bytes) {
    static const char kDigits[] = "0123456789abcdef";
    std::string hex;
    for (char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        hex += kDigits[byte >> 4];
        hex += kDigits[byte & 0x0f];
    }
    return hex;
}

bool Refuse(const char* what) {
    VORN_LOG(LOG_ERR, "Refused %s for the supplicant file", what);
    return false;
}

bool AddSsid(const std::string& essid, std::string& text) {
    if (essid.empty() || essid.size() > kMaxSsidBytes) {
        return Refuse("essid length");
    }
    const bool plain = std::all_of(essid.begin(), essid.end(), [](char c) {
        return IsPrintableAscii(static_cast<unsigned char>(c)) && c != '"' && c != '\\';
    });
    text += "\tssid=" + (plain ? Quoted(essid) : ToHex(essid)) + "\n";
    return true;
}

bool AddPairwise(const StationInfo& station, const char* kind, std::string& text) {
    switch (station.encryption) {
        case WIFI_ENCRYPTION_TKIP:
            text += "\tpairwise=TKIP\n";
            return true;
        case WIFI_ENCRYPTION_AES:
            text += "\tpairwise=CCMP\n";
            return true;
        case WIFI_ENCRYPTION_TKIP_AES:
            text += "\tpairwise=TKIP CCMP\n";
            return true;
        default:
            break;
    }
    VORN_LOG(LOG_ERR, "Unknown encryption [%d] for %s security [%d]",
             static_cast<int>(station.encryption), kind, static_cast<int>(station.security));
    return false;
}

bool AddWepKey(const std::string& key, std::string& text) {
    if ((key.size() == 5 || key.size() == 13) && IsQuotable(key)) {
        text += "\twep_key0=" + Quoted(key) + "\n";
    } else if ((key.size() == 10 || key.size() == 26) && IsHexText(key)) {
        text += "\twep_key0=" + key + "\n";
    } else {
        VORN_LOG(LOG_ERR, "Wrong WEP Format.");
        return false;
    }
    text += "\twep_tx_keyidx=0\n\tauth_alg=OPEN SHARED\n";
    return true;
}

// A passphrase of 8 to 63 characters, or the key itself as 64 hex digits.
bool AddPsk(const std::string& password, std::string& text) {
    if (password.size() == 64 && IsHexText(password)) {
        text += "\tpsk=" + password + "\n";
    } else if (password.size() >= 8 && password.size() <= 63 && IsQuotable(password)) {
        text += "\tpsk=" + Quoted(password) + "\n";
    } else {
        return Refuse("password");
    }
    return true;
}

bool AddSecurityLines(const StationInfo& station, std::string& text) {
    switch (station.security) {
        case WIFI_SECURITY_DISABLED:
            text += "\tkey_mgmt=NONE\n";
            return true;
        case WIFI_SECURITY_WEP:
            text += "\tkey_mgmt=NONE\n";
            return AddWepKey(station.password, text);
        case WIFI_SECURITY_PERSONAL_WPA:
        case WIFI_SECURITY_PERSONAL_WPA2:
        case WIFI_SECURITY_PERSONAL_WPA_MIXED:
            text += "\tkey_mgmt=WPA-PSK\n";
            return AddPairwise(station, "personal", text) && AddPsk(station.password, text);
        case WIFI_SECURITY_ENTERPRISE_WPA:
        case WIFI_SECURITY_ENTERPRISE_WPA2:
        case WIFI_SECURITY_ENTERPRISE_WPA_MIXED:
            if (!IsQuotable(station.user) || !IsQuotable(station.password)) {
                return Refuse("identity or password");
            }
            text += "\tkey_mgmt=WPA-EAP\n\teap=TTLS PEAP\n";
            if (!AddPairwise(station, "enterprise", text)) {
                return false;
            }
            text += "\tidentity=" + Quoted(station.user) + "\n";
            text += "\tpassword=" + Quoted(station.password) + "\n";
            return true;
        default:
            break;
    }
    VORN_LOG(LOG_ERR, "Failed to detect authentication/encryption type");
    return false;
}

bool AddBssid(const vornwireless::utils::MacAddress& bssid, std::string& text) {
    if (bssid.ToString().empty() || bssid.ToString() == kZeroBssid) {
        return true;
    }
    if (!bssid.IsFormalized()) {
        return Refuse("bssid");
    }
    text += "\tbssid=" + bssid.ToString() + "\n";
    return true;
}

}  // namespace

std::string AdapterAgentClient::ConfigFile(const std::string& ifname) {
    return "/usr/vorn/etc/wpa_supplicant.conf." + ifname;
}

std::string AdapterAgentClient::PidFile(const std::string& ifname) {
    return "/var/run/wpa_supplicant.pid." + ifname;
}

int AdapterAgentClient::WpaSupplicantConfigText(const StationInfo& station, std::string& text) {
    std::string built = "ctrl_interface=/var/run/wpa_supplicant\nnetwork={\n";
    if (!AddSsid(station.essid, built) || !AddBssid(station.bssid, built)) {
        return -1;
    }
    built += "\tscan_ssid=1\n";
    if (station.opmode == WIFI_OPMODE_AD_HOC) {
        built += "\tmode=1\n";
    }
    if (!AddSecurityLines(station, built)) {
        return -1;
    }
    text = built + "}\n";
    return 0;
}

int AdapterAgentClient::SetWpaSupplicantConfig() const {
    std::string text;
    const std::string file = ConfigFile(GetName());
    if (WpaSupplicantConfigText(Station(), text) != 0) {
    } else if (!vorn::platform::WriteFileAtomically(vorn::platform::RootPath(file), text)) {
        VORN_LOG(LOG_ERR, "Failed to open file [%s].", file.c_str());
    } else {
        return 0;
    }
    VORN_LOG(LOG_ERR, "Failed to write wpa sup config to file");
    return -1;
}

std::string AdapterAgentClient::WpaState() const {
    std::map<std::string, std::string> status;
    return utils::ReadSupplicantStatus(GetName(), status) ? status["wpa_state"] : "";
}

bool AdapterAgentClient::WaitForAssociation() const {
    for (int poll = 0; poll < kAssociationPolls; ++poll) {
        Pause();
        if (WpaState() == "COMPLETED") {
            return true;
        }
    }
    return false;
}

// The pid file's process when it is a supplicant: a stale file may name another program.
int AdapterAgentClient::SupplicantPid() const {
    const int pid = QLIBCReadPidFile(PidFile(GetName()).c_str());
    std::vector<int> supplicants;
    if (pid <= 0 || !vornwireless::utils::FindProcesses(kSupplicantName, supplicants) ||
        std::find(supplicants.begin(), supplicants.end(), pid) == supplicants.end()) {
        return 0;
    }
    return pid;
}

int AdapterAgentClient::TerminateWpa() const {
    return QLIBCExecl(kWpaCli, kQuietFlags, "-i", GetName().c_str(), "terminate", nullptr);
}

// Asked three times; a supplicant that stays is killed, so none outlives a disconnect.
int AdapterAgentClient::DisconnectKillWpa() const {
    const std::string pidFile = PidFile(GetName());
    const int pid = SupplicantPid();
    if (pid == 0) {
        VORN_LOG(LOG_ERR, "Cannot find process wpa_supplicant with pid file (%s)", pidFile.c_str());
        QLIBCSysUnlink(pidFile.c_str());
        return 0;
    }
    for (int attempt = 1; attempt <= kTerminateAttempts && QLIBCProcAlive(pid) == 1; ++attempt) {
        TerminateWpa();
        if (SupplicantPid() != pid) {
            break;
        }
        VORN_LOG(LOG_ERR, "Process wpa (%d) still alive, wait 1 sec (%d)", pid, attempt);
        Pause();
    }
    if (SupplicantPid() == pid) {
        VORN_LOG(LOG_ERR, "Process wpa (%d) ignored terminate, killed", pid);
        kill(pid, SIGKILL);
    }
    QLIBCSysUnlink(pidFile.c_str());
    return 0;
}

int AdapterAgentClient::DoConnecting() {
    if (!IsNameValid()) {
        return -1;
    }
    const std::string& name = GetName();
    const std::string config = vorn::platform::RootPath(ConfigFile(name));
    const std::string pid = vorn::platform::RootPath(PidFile(name));
    const std::string watch = std::string("-a") + vorn::platform::RootPath(kReconnectScript);
    if (utils::GetAdapterNum() == 0) {
        VORN_LOG(LOG_ERR, "There is no wireless USB adapter plugged");
        return -1;
    }
    if (SetWpaSupplicantConfig() != 0) {
        VORN_LOG(LOG_ERR, "Failed to set WPA Supplicant Config file");
        return -1;
    }
    // A pid file left by a supplicant that died is no reason to fail: the new one replaces it.
    if (SupplicantPid() != 0 && TerminateWpa() != 0) {
        VORN_LOG(LOG_ERR, "Failed to termiante wpa process");
        return -1;
    }
    if (QLIBCExecl(kWpaSupplicant, kExecFlags, "-Dwext", "-i", name.c_str(), "-c", config.c_str(),
                   "-B", "-P", pid.c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute command [%s -Dwext -i %s -c %s -B -P %s]",
                 kWpaSupplicant, name.c_str(), config.c_str(), pid.c_str());
        return -1;
    }
    if (!WaitForAssociation()) {
        VORN_LOG(LOG_ERR, "Time out to connect AP, kill wpa_supplicant.");
        DisconnectKillWpa();
        return -1;
    }
    if (QLIBCExecl(kWpaCli, QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT, "-i", name.c_str(),
                   watch.c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to fork process [%d]", errno);
        return -1;
    }
    if (SetupAddress() != 0) {
        VORN_LOG(LOG_ERR, "Failed on post processing");
        return -1;
    }
    return 0;
}

int AdapterAgentClient::TakeInterfaceDown() const {
    const char* name = GetName().c_str();
    for (int attempt = 1; attempt <= kDownAttempts; ++attempt) {
        if (QLIBCExecl(kIwconfig, kExecFlags, name, "essid", "off", nullptr) == 0 &&
            QLIBCExecl(kIfconfig, kExecFlags, name, "0.0.0.0", nullptr) == 0) {
            return 0;
        }
        if (attempt < kDownAttempts) {
            VORN_LOG(LOG_ERR, "Failed to stop wireless interface, retry in one sec (%d)", attempt);
            Pause();
        }
    }
    VORN_LOG(LOG_ERR, "Failed to deactivate network interface [%s].", name);
    return -1;
}

int AdapterAgentClient::DoDisconnect() {
    if (!IsNameValid()) {
        return -1;
    }
    if (DisconnectKillWpa() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disconnect on kill wpa part");
        return -1;
    }
    if (StopDhcpClient() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disconnect on kill dhcp part");
        return -1;
    }
    BlockRadioWhenUnused();
    if (TakeInterfaceDown() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disconnect on down interface part");
        return -1;
    }
    return 0;
}

int AdapterAgentClient::ClientRecover(const AdapterConfig& config) {
    if (SupplicantPid() != 0 && WpaState() == "COMPLETED") {
        return 0;
    }
    return ClientEnable(config);
}

WIFI_STATUS AdapterAgentClient::GetStatus(const AdapterConfig& config) const {
    if (!config.client_enabled) {
        return WIFI_STATUS_DISABLED;
    }
    if (WpaState() == "COMPLETED") {
        return IpStatus();
    }
    return SupplicantPid() != 0 ? WIFI_STATUS_ENABLING : WIFI_STATUS_DISABLED;
}

}  // namespace wifi
}  // namespace vornwireless
