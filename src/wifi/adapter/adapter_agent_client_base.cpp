#include "wifi/adapter/adapter_agent_client_base.h"

#include <dirent.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstring>
#include <random>
#include <sstream>
#include <thread>
#include <vector>

#include "platform/qlib_net.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "platform/vorn_net.h"
#include "utils/dbus_client.h"
#include "utils/decimal.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/settings/adapter_config_check.h"
#include "wifi/settings/enum_map.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kTopologyLock = "/tmp/topology.lock";
constexpr const char* kRestartPidFile = "/tmp/restart_services_pid";
constexpr const char* kNoRestartMarker = "/tmp/do_not_restart_services";
constexpr const char* kSettingsFile = "/etc/vorninfo.conf";
constexpr const char* kNetTool = "/usr/vorn/sbin/vornnetdtool";
// iputils and busybox arping alike: in duplicate address detection mode the exit status is 0
// only when no host answered.
constexpr const char* kArping = "/usr/bin/arping";
constexpr const char* kGatewayType = "GTYPE_V4";
constexpr const char* kAdHocNetwork = "10.42.43.";
constexpr const char* kAdHocNetmask = "255.255.255.0";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
constexpr int kQuietFlags = kExecFlags | QLIBC_EXEC_NO_STDERR;
// A topology switch takes well under two minutes; a restart that waits longer is dropped, since
// the switch restarts the services itself.
constexpr int kLockWaitPolls = 120;
constexpr int kAdHocTries = 5;
constexpr int kMaxInterfaces = 64;

std::chrono::milliseconds pollInterval{1000};

bool IsSet(const char* key, const char* file) {
    char value[16] = {};
    return QLIBCFileGetKeyValue(file, key, value, sizeof(value), 0) == 1 &&
           std::strcmp(value, "yes") == 0;
}

// The worker must not keep the daemon's bus connection or locked pid file open once the
// daemon itself is gone.
void CloseInheritedFiles() {
    DIR* dir = opendir("/proc/self/fd");
    if (dir == nullptr) {
        return;
    }
    std::vector<int> open;
    while (const dirent* entry = readdir(dir)) {
        int fd = -1;
        if (vornwireless::utils::ParseDecimal(entry->d_name, fd) && fd > STDERR_FILENO &&
            fd != dirfd(dir)) {
            open.push_back(fd);
        }
    }
    closedir(dir);
    for (const int fd : open) {
        close(fd);
    }
}

// The restart itself, in the child: waits out a topology switch, then restarts.
int WaitAndRestartServices() {
    CloseInheritedFiles();
    if (QLIBCFileExist(kTopologyLock) == 1) {
        VORN_LOG(LOG_ERR, "service restart locked by other wait...");
        for (int poll = 0; poll < kLockWaitPolls && QLIBCFileExist(kTopologyLock) == 1; ++poll) {
            std::this_thread::sleep_for(pollInterval);
        }
        if (QLIBCFileExist(kTopologyLock) == 1) {
            VORN_LOG(LOG_ERR, "service restart still locked, left to the topology switch");
            QLIBCSysUnlink(kRestartPidFile);
            return 1;
        }
    }
    VORN_LOG(LOG_INFO, "lock service restart");
    const int result = Adapter::RestartService();
    QLIBCSysUnlink(kNoRestartMarker);
    VORN_LOG(LOG_INFO, "unlock service restart");
    QLIBCSysUnlink(kRestartPidFile);
    return result == 0 ? 0 : 1;
}

std::string InterfaceAddress(const std::string& ifname) {
    QLIB_NET_IF_INFO info[kMaxInterfaces] = {};
    const int count = QLIBNetGetInterfaceInfo(info, kMaxInterfaces, QLIB_NET_INFO_IPV4);
    for (int i = 0; i < count; ++i) {
        if (ifname == info[i].name) {
            return info[i].ipv4;
        }
    }
    return "";
}

bool CopyField(const std::string& text, char* field, std::size_t size) {
    if (text.size() >= size) {
        return false;
    }
    std::memcpy(field, text.c_str(), text.size() + 1);
    return true;
}

constexpr const char* kIfconfig = "/sbin/ifconfig";
using StationInfo = AdapterConfig::StationInfo;
constexpr std::size_t kMaxScanLines = 512;
constexpr std::size_t kScanLineBytes = 256;
constexpr int kMaxChannel = 200;
constexpr int kMaxSignal = 100;

bool FromHex(const std::string& hex, std::string& bytes) {
    if (hex.size() % 2 != 0 || !IsHexText(hex)) {
        return false;
    }
    bytes.clear();
    for (std::size_t i = 0; i < hex.size(); i += 2) {
        bytes += static_cast<char>(std::stoi(hex.substr(i, 2), nullptr, 16));
    }
    return true;
}

// Printable words only: a scan word may reach a log line.
bool IsWord(const std::string& word) {
    return std::all_of(word.begin(), word.end(),
                       [](char c) { return std::isgraph(static_cast<unsigned char>(c)) != 0; });
}

bool ParseScanLine(const std::string& line, StationInfo& station) {
    std::istringstream in(line);
    std::string words[7];
    for (std::string& word : words) {
        if (!(in >> word) || !IsWord(word)) {
            return false;
        }
    }
    std::string extra;
    if (in >> extra) {
        return false;
    }
    station.bssid = vornwireless::utils::MacAddress(words[0]);
    if (!station.bssid.IsFormalized() ||
        !vornwireless::utils::ParseDecimal(words[1], station.channel) || station.channel < 0 ||
        station.channel > kMaxChannel ||
        !vornwireless::utils::ParseDecimal(words[2], station.signal) || station.signal < 0 ||
        station.signal > kMaxSignal || !FromHex(words[6], station.essid) || station.essid.empty() ||
        station.essid.size() > kMaxSsidBytes) {
        return false;
    }
    station.opmode = EnumMap<WIFI_OPMODE>::StringToEnum(words[3]);
    station.hwmode = EnumMap<WIFI_MODE>::StringToEnum(words[4]);
    if (station.opmode == WIFI_OPMODE_ERROR || station.hwmode == WIFI_MODE_ERROR) {
        return false;
    }
    if (AdapterAgentClientBase::ParseSecurityEncryption(words[5], station.security,
                                                        station.encryption) != 0) {
        VORN_LOG(LOG_ERR, "Failed on parsing security and encryption from string [%s]",
                 words[5].c_str());
        return false;
    }
    station.is_dhcp = true;
    return true;
}

}  // namespace

void AdapterAgentClientBase::SetPollInterval(std::chrono::milliseconds interval) {
    pollInterval = interval;
}

void AdapterAgentClientBase::Pause() {
    std::this_thread::sleep_for(pollInterval);
}

void AdapterAgentClientBase::SetStation(const AdapterConfig::StationInfo& station) {
    station_ = station;
    adhoc_ = station.opmode == WIFI_OPMODE_AD_HOC;
}

int AdapterAgentClientBase::Enable(const AdapterConfig& config) {
    if (!config.client_enabled) {
        return Disable(config);
    }
    if (GetClientConfig(config) != 0) {
        return -1;
    }
    return adhoc_ ? AdHocEnable(config) : ClientEnable(config);
}

int AdapterAgentClientBase::Recover(const AdapterConfig& config) {
    if (!config.client_enabled) {
        return 0;
    }
    if (GetClientConfig(config) != 0) {
        return -1;
    }
    return adhoc_ ? AdHocRecover(config) : ClientRecover(config);
}

int AdapterAgentClientBase::Disable(const AdapterConfig& config) {
    return adhoc_ ? AdHocDisable(config) : ClientDisable(config);
}

int AdapterAgentClientBase::Reload(const AdapterConfig& config, RELOAD_STATUS) {
    if (adhoc_) {
        return Recover(config);
    }
    return config.client_enabled ? Enable(config) : Disable(config);
}

int AdapterAgentClientBase::LoadStationConnData(std::vector<utils::ConnectionInfo>&) {
    return 0;
}

int AdapterAgentClientBase::EnableWPSWithPBC() {
    VORN_LOG(LOG_ERR, "No WPS in client topology [%s]", GetName().c_str());
    return -1;
}

int AdapterAgentClientBase::EnableWPSWithPinCode(const std::string&) {
    return EnableWPSWithPBC();
}

int AdapterAgentClientBase::ClientEnable(const AdapterConfig&) {
    if (DoDisconnect() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disconnect [%s] before connecting", GetName().c_str());
    }
    if (DoConnecting() != 0) {
        VORN_LOG(LOG_ERR, "Failed to connect [%s]", GetName().c_str());
        return -1;
    }
    return RestartServices();
}

int AdapterAgentClientBase::RestartServices() {
    if (QLIBCProcAlive(QLIBCReadPidFile(kRestartPidFile)) == 1) {
        VORN_LOG(LOG_ERR, "service restart pid still exist, skip doing service restart");
        return 0;
    }
    // Double fork: the worker is nobody's child to reap, and its id is in the pid file before
    // this call returns, so a second call at once sees it.
    const pid_t middle = fork();
    if (middle < 0) {
        VORN_LOG(LOG_ERR, "Failed to fork process [%d]", errno);
        return -1;
    }
    if (middle == 0) {
        const pid_t worker = fork();
        if (worker == 0) {
            _exit(WaitAndRestartServices());
        }
        const bool written = worker > 0 && vorn::platform::WriteFileAtomically(
                                               vorn::platform::RootPath(kRestartPidFile),
                                               std::to_string(worker) + "\n");
        _exit(written ? 0 : 1);
    }
    int status = 0;
    if (waitpid(middle, &status, 0) != middle || !WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        VORN_LOG(LOG_ERR, "Failed to fork process [%d]", errno);
        return -1;
    }
    return 0;
}

int AdapterAgentClientBase::SetupAddress() {
    const int result = station_.is_dhcp
                           ? UseDhcp()
                           : UseAddress(station_.ip.ToString(), station_.netmask.ToString(),
                                        station_.gateway.ToString());
    if (result == 0 || !adhoc_) {
        return result;
    }
    VORN_LOG(LOG_ERR, "IP setting for adhoc failed, random generate one to use");
    return UseRandomAdHocAddress();
}

int AdapterAgentClientBase::UseAddress(const std::string& ip, const std::string& netmask,
                                       const std::string& gateway) {
    if (vornwireless::utils::IPAddress(ip).IsEmpty()) {
        VORN_LOG(LOG_ERR, "No static IP to set on [%s]", GetName().c_str());
        ipStatus_ = WIFI_STATUS_IPFAILED;
        return -1;
    }
    if (!IsAddressFree(ip)) {
        VORN_LOG(LOG_ERR, "IP [%s] is used by other host, conflict", ip.c_str());
        ipStatus_ = WIFI_STATUS_IPCONFLICT;
        return -1;
    }
    VORN_NET_IF_CONFIG card = {};
    if (!CopyField(GetName(), card.name, sizeof(card.name)) ||
        !CopyField(ip, card.ipv4, sizeof(card.ipv4)) ||
        !CopyField(netmask, card.netmask, sizeof(card.netmask)) ||
        !CopyField(gateway, card.gateway, sizeof(card.gateway)) || VORNNetSetCard1(&card, 0) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set IP [%s] on [%s]", ip.c_str(), GetName().c_str());
        ipStatus_ = WIFI_STATUS_IPFAILED;
        return -1;
    }
    ipStatus_ = WIFI_STATUS_ENABLED;
    return 0;
}

// The DHCP client of the platform's interface script leaves the address on the interface.
int AdapterAgentClientBase::UseDhcp() {
    VORN_NET_IF_CONFIG card = {};
    card.dhcp = 1;
    if (!CopyField(GetName(), card.name, sizeof(card.name)) || VORNNetSetCard1(&card, 0) != 0 ||
        InterfaceAddress(GetName()).empty()) {
        VORN_LOG(LOG_ERR, "Failed to get IP from DHCP");
        ipStatus_ = WIFI_STATUS_IPFAILED;
        return -1;
    }
    ipStatus_ = WIFI_STATUS_ENABLED;
    return 0;
}

int AdapterAgentClientBase::UseRandomAdHocAddress() {
    std::mt19937 random{std::random_device{}()};
    std::uniform_int_distribution<int> host(2, 254);
    int result = -1;
    for (int attempt = 0; attempt < kAdHocTries && result != 0; ++attempt) {
        result = UseAddress(kAdHocNetwork + std::to_string(host(random)), kAdHocNetmask, "");
    }
    return result;
}

// An answer, or an arping that cannot tell, both keep the address unused.
bool AdapterAgentClientBase::IsAddressFree(const std::string& ip) const {
    return IsNameValid() && QLIBCExecl(kArping, kQuietFlags, "-D", "-q", "-c", "2", "-w", "3", "-I",
                                       GetName().c_str(), ip.c_str(), nullptr) == 0;
}

int AdapterAgentClientBase::RemoveGateway() const {
    int result = 0;
    if (!vornwireless::utils::DelGatewayInfo(GetName(), kGatewayType, false)) {
        VORN_LOG(LOG_ERR, "Failed to delete GatewayInfo for [%s]", GetName().c_str());
        result = -1;
    }
    if (!vornwireless::utils::RefreshGateway(kGatewayType)) {
        VORN_LOG(LOG_ERR, "Failed to refresh default gateway");
        result = -1;
    }
    if (!IsSet("multi_gateway", kSettingsFile)) {
        return result;
    }
    if (!IsNameValid() ||
        QLIBCExecl(kNetTool, kExecFlags, "--del-policy-route-rule", "-4", "multi-gateway",
                   GetName().c_str(), nullptr) != 0 ||
        QLIBCExecl(kNetTool, kExecFlags, "--disable-route-table", "-4", GetName().c_str(),
                   nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to delete multiple gateway rule for [%s]", GetName().c_str());
        result = -1;
    }
    return result;
}

int AdapterAgentClientBase::ParseSecurityEncryption(const std::string& word,
                                                    WIFI_SECURITY& security,
                                                    WIFI_ENCRYPTION& encryption) {
    const auto has = [&word](const char* part) { return word.find(part) != std::string::npos; };
    const bool wpa1 = has("WPA1");
    const bool wpa2 = has("WPA2");
    const auto byVersion = [&](WIFI_SECURITY mixed, WIFI_SECURITY one, WIFI_SECURITY two) {
        return wpa1 && wpa2 ? mixed : wpa1 ? one : wpa2 ? two : WIFI_SECURITY_ERROR;
    };
    if (has("NONE")) {
        security = WIFI_SECURITY_DISABLED;
    } else if (has("WEP")) {
        security = WIFI_SECURITY_WEP;
    } else if (has("PSK")) {
        security = byVersion(WIFI_SECURITY_PERSONAL_WPA_MIXED, WIFI_SECURITY_PERSONAL_WPA,
                             WIFI_SECURITY_PERSONAL_WPA2);
    } else if (has("EAP")) {
        security = byVersion(WIFI_SECURITY_ENTERPRISE_WPA_MIXED, WIFI_SECURITY_ENTERPRISE_WPA,
                             WIFI_SECURITY_ENTERPRISE_WPA2);
    } else {
        security = WIFI_SECURITY_ERROR;
    }
    if (security == WIFI_SECURITY_ERROR) {
        VORN_LOG(LOG_ERR, "Unknown security [%s] when scanning network", word.c_str());
        return -1;
    }
    if (has("TKIPAES")) {
        encryption = WIFI_ENCRYPTION_TKIP_AES;
    } else if (has("TKIP")) {
        encryption = WIFI_ENCRYPTION_TKIP;
    } else if (has("AES")) {
        encryption = WIFI_ENCRYPTION_AES;
    } else if (has("NONE") || has("WEP")) {
        encryption = WIFI_ENCRYPTION_NONE;
    } else {
        encryption = WIFI_ENCRYPTION_ERROR;
        return -1;
    }
    return 0;
}

std::vector<StationInfo> AdapterAgentClientBase::ParseScanList(
    const std::vector<std::string>& lines) {
    std::vector<StationInfo> stations;
    std::size_t refused = 0;
    for (const std::string& line : lines) {
        StationInfo station;
        if (ParseScanLine(line, station)) {
            stations.push_back(station);
        } else {
            ++refused;
        }
    }
    if (refused != 0) {
        VORN_LOG(LOG_INFO, "Left out %zu scan lines of unknown form", refused);
    }
    return stations;
}

int AdapterAgentClientBase::GetClientConfig(const AdapterConfig& config) {
    if (config.stations.empty()) {
        VORN_LOG(LOG_ERR, "No network to join for [%s]", GetName().c_str());
        return -1;
    }
    SetStation(config.stations.back());
    return 0;
}

int AdapterAgentClientBase::ClientDisable(const AdapterConfig&) {
    const int disconnected = DoDisconnect();
    const int removed = RemoveGateway();
    return disconnected == 0 && removed == 0 ? 0 : -1;
}

int AdapterAgentClientBase::ScanNetworks(const AdapterConfig& config,
                                         std::vector<StationInfo>& stations) {
    if (!IsNameValid()) {
        return -1;
    }
    if (!utils::IsNetActivate(GetName()) &&
        QLIBCExecl(kIfconfig, kExecFlags, GetName().c_str(), "up", nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable interface [%s]", GetName().c_str());
        return -1;
    }
    if (QuickScanNetworks(config, stations) != 0) {
        VORN_LOG(LOG_ERR, "Failed on doing network scan");
        return -1;
    }
    return 0;
}

int AdapterAgentClientBase::QuickScanNetworks(const AdapterConfig&,
                                              std::vector<StationInfo>& stations) {
    if (!IsNameValid()) {
        return -1;
    }
    const std::string command = "/sbin/iwlist " + GetName() + " scanning vorn";
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxScanLines, kScanLineBytes) != 0) {
        VORN_LOG(LOG_ERR, "Failed to popen '%s', errno=%d", command.c_str(), errno);
        return -1;
    }
    const std::vector<StationInfo> found = ParseScanList(lines);
    stations.insert(stations.end(), found.begin(), found.end());
    return 0;
}

int AdapterAgentClientBase::StopDhcpClient() const {
    const std::string iface = "IFACE=" + GetName();
    if (QLIBCExecl("/sbin/stop", kExecFlags | QLIBC_EXEC_NO_STDERR, "dhcp-client", iface.c_str(),
                   nullptr) != 0) {
        VORN_LOG(LOG_ERR, "unable to stop dhcp-client instance on %s", GetName().c_str());
        return -1;
    }
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
