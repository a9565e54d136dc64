#include "wifi/adapter/adapter_agent_client_rlt.h"

#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "utils/file.h"
#include "utils/log.h"
#include "wifi/settings/adapter_config_check.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

using StationInfo = AdapterConfig::StationInfo;

constexpr const char* kProfileDir = "/usr/vorn/etc/rlt_wifi";
constexpr const char* kStationFile = "/usr/vorn/etc/rlt_wifi/rlt_wifi_sta.conf";
constexpr const char* kIfconfig = "/sbin/ifconfig";
constexpr const char* kIwpriv = "/sbin/iwpriv";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
constexpr int kJoinPolls = 15;
constexpr std::size_t kStatusBytes = 128;

bool Refuse(const char* what) {
    VORN_LOG(LOG_ERR, "Refused %s for the rlt station file", what);
    return false;
}

// The driver reads a line up to its end and splits every value at ";".
bool IsValue(const std::string& text) {
    return text.find_first_of(std::string(";\r\n\0", 4)) == std::string::npos;
}

// Key1Type 1 is a key of 5 or 13 characters, 0 one of 10 or 26 hex digits.
bool AddWepLines(const std::string& key, std::string& text) {
    if (key.size() == 5 || key.size() == 13) {
        text += "ApCliKey1Type=1\nApCliKey1Str=" + key + "\n";
    } else if ((key.size() == 10 || key.size() == 26) && IsHexText(key)) {
        text += "ApCliKey1Type=0\nApCliKey1Str=" + key + "\n";
    } else {
        return Refuse("WEP key");
    }
    return true;
}

bool AddPskLine(const std::string& password, std::string& text) {
    if (!IsPassphrase(password)) {
        return Refuse("password");
    }
    text += "ApCliWPAPSK=" + password + "\n";
    return true;
}

// Mixed WPA joins as WPA2 with AES, the strongest both ends share.
bool AddSecurityLines(const StationInfo& station, std::string& text) {
    const char* cipher = station.encryption == WIFI_ENCRYPTION_TKIP ? "TKIP" : "AES";
    switch (station.security) {
        case WIFI_SECURITY_DISABLED:
            text += "ApCliAuthMode=OPEN\nApCliEncrypType=NONE\n";
            return true;
        case WIFI_SECURITY_WEP:
            text += "ApCliAuthMode=SHARED\nApCliEncrypType=WEP\nApCliDefaultKeyID=1\n";
            return AddWepLines(station.password, text);
        case WIFI_SECURITY_PERSONAL_WPA:
            text += std::string("ApCliAuthMode=WPAPSK\nApCliEncrypType=") + cipher + "\n";
            return AddPskLine(station.password, text);
        case WIFI_SECURITY_PERSONAL_WPA2:
            text += std::string("ApCliAuthMode=WPA2PSK\nApCliEncrypType=") + cipher + "\n";
            return AddPskLine(station.password, text);
        case WIFI_SECURITY_PERSONAL_WPA_MIXED:
            text += "ApCliAuthMode=WPA2PSK\nApCliEncrypType=AES\n";
            return AddPskLine(station.password, text);
        default:
            return Refuse("security");
    }
}

}  // namespace

int AdapterAgentClientRLT::StationConfigText(const StationInfo& station, std::string& text) {
    if (station.essid.empty() || station.essid.size() > kMaxSsidBytes) {
        Refuse("essid");
        return -1;
    }
    if (!IsValue(station.essid) || !IsValue(station.password)) {
        Refuse("text holding \";\" or a line end");
        return -1;
    }
    std::string built = "Default\nApCliEnable=1\nApCliSsid=" + station.essid + "\n";
    built += "ApCliBssid=" + (station.bssid.IsFormalized() ? station.bssid.ToString() : "") + "\n";
    if (!AddSecurityLines(station, built)) {
        return -1;
    }
    text = built;
    return 0;
}

bool AdapterAgentClientRLT::IsJoined() const {
    const std::string command = std::string(kIwpriv) + " " + GetName() + " connStatus";
    std::string line;
    return IsNameValid() &&
           vorn::platform::ReadShellCommandLine(command, line, kStatusBytes) == 0 &&
           line.find("Connected") != std::string::npos &&
           line.find("Disconnected") == std::string::npos;
}

int AdapterAgentClientRLT::DoConnecting() {
    if (!IsNameValid()) {
        return -1;
    }
    std::string text;
    if (StationConfigText(Station(), text) != 0 ||
        vornwireless::utils::CheckAndMakeDir(kProfileDir, 0755) != 0 ||
        !vorn::platform::WriteFileAtomically(vorn::platform::RootPath(kStationFile), text)) {
        VORN_LOG(LOG_ERR, "Failed to write rlt station config to file");
        return -1;
    }
    // The driver reads the station file when it loads.
    if (utils::RemoveRLTKernelModule() != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove module");
    }
    if (utils::InsertRLTKernelModule() != 0 ||
        QLIBCExecl(kIfconfig, kExecFlags, GetName().c_str(), "up", nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to bring up [%s]", GetName().c_str());
        return -1;
    }
    bool joined = false;
    for (int poll = 0; poll < kJoinPolls && !joined; ++poll) {
        Pause();
        joined = IsJoined();
    }
    if (!joined) {
        VORN_LOG(LOG_ERR, "Time out to connect AP [%s]", GetName().c_str());
        DoDisconnect();
        return -1;
    }
    if (SetupAddress() != 0) {
        VORN_LOG(LOG_ERR, "Failed on post processing");
        return -1;
    }
    return 0;
}

int AdapterAgentClientRLT::DoDisconnect() {
    if (!IsNameValid()) {
        return -1;
    }
    const int left =
        QLIBCExecl(kIwpriv, kExecFlags, GetName().c_str(), "set", "ApCliEnable=0", nullptr);
    const int stopped = StopDhcpClient();
    const int down = QLIBCExecl(kIfconfig, kExecFlags, GetName().c_str(), "down", nullptr);
    if (left != 0 || stopped != 0 || down != 0) {
        VORN_LOG(LOG_ERR, "Failed to disconnect [%s]", GetName().c_str());
        return -1;
    }
    return 0;
}

int AdapterAgentClientRLT::ClientRecover(const AdapterConfig& config) {
    return IsJoined() ? 0 : ClientEnable(config);
}

int AdapterAgentClientRLT::AdHocEnable(const AdapterConfig&) {
    VORN_LOG(LOG_ERR, "No ad-hoc network on the rlt radio [%s]", GetName().c_str());
    return -1;
}

WIFI_STATUS AdapterAgentClientRLT::GetStatus(const AdapterConfig& config) const {
    if (!config.client_enabled) {
        return WIFI_STATUS_DISABLED;
    }
    if (IsJoined()) {
        return IpStatus();
    }
    return utils::IsNetActivate(GetName()) ? WIFI_STATUS_ENABLING : WIFI_STATUS_DISABLED;
}

}  // namespace wifi
}  // namespace vornwireless
