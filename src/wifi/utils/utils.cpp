#include "wifi/utils/utils.h"

#include <net/if_arp.h>
#include <strings.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <vector>

#include "network/module/arpscanner.h"
#include "platform/qlib_crypt.h"
#include "platform/qlibc_container.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "platform/vorn_ipv6.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "utils/process.h"
#include "wifi/settings/enum_map.h"

namespace vornwireless {
namespace wifi {
namespace utils {
namespace {

constexpr const char* kSettingsFile = "/etc/vorninfo.conf";
constexpr const char* kFactoryFile = "/etc.defaults/vorninfo.conf";
constexpr const char* kTopologyKey = "net_topology";
constexpr const char* kSupportKey = "support_net_topology";
constexpr const char* kRltModuleDir = "/usr/vorn/lib/modules/";
constexpr const char* kArpTable = "/proc/net/arp";
constexpr int kValueSize = 256;
constexpr std::string::size_type kMaxIndexDigits = 4;
constexpr std::size_t kMaxModeLines = 16;
constexpr std::size_t kModeLineBytes = 256;

// "" when the key is absent or the file unreadable.
std::string FactoryValue(const char* key) {
    char value[kValueSize] = {};
    if (QLIBCFileGetKeyValue(kFactoryFile, key, value, sizeof(value), 0) != 1) {
        return "";
    }
    return value;
}

bool IsBuiltInWlan(const std::string& ifname) {
    const std::string builtIn = FactoryValue("builtin_wlan_mac");
    if (builtIn.empty() || !vornwireless::utils::IsValidInterfaceName(ifname)) {
        return false;
    }
    const std::string mac = GetBssid(ifname);
    return !mac.empty() && strcasecmp(mac.c_str(), builtIn.c_str()) == 0;
}

int IndexAfter(const std::string& prefix, const std::string& name) {
    if (name.compare(0, prefix.size(), prefix) != 0) {
        return -1;
    }
    const std::string digits = name.substr(prefix.size());
    if (digits.empty() || digits.size() > kMaxIndexDigits ||
        digits.find_first_not_of("0123456789") != std::string::npos) {
        return -1;
    }
    return std::atoi(digits.c_str());
}

// A "yes"/"no" key of the settings file, written "key=\"value\"".
int SetSettingsFlag(const char* key, bool yes) {
    QLIBSZHASH* pairs = QLIBCSzHashAlloc(1);
    const bool ok = pairs != nullptr && QLIBCSzHashSetValue(pairs, key, yes ? "yes" : "no") == 0 &&
                    QLIBCFileSetKeys(kSettingsFile, pairs, nullptr, QLIBC_FILE_QUOTE_VALUES) == 0;
    QLIBCSzHashFree(pairs);
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to set key [%s] in file [%s]", key, kSettingsFile);
        return -1;
    }
    return 0;
}

bool IsSettingYes(const char* key) {
    return QLIBCFileCheckKeyValue(kSettingsFile, key, "yes", 0) == 1;
}

bool IsPlainWord(const std::string& text) {
    return !text.empty() && text.size() <= 64 &&
           text.find_first_not_of(
               "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_.-") ==
               std::string::npos;
}

bool IsModuleFile(const std::string& module) {
    return IsPlainWord(module) && module.size() > 3 &&
           module.compare(module.size() - 3, 3, ".ko") == 0;
}

}  // namespace

std::string GetBssid(const std::string& ifname) {
    if (!vornwireless::utils::IsValidInterfaceName(ifname)) {
        VORN_LOG(LOG_ERR, "Bad interface name [%s]", ifname.c_str());
        return "";
    }
    const std::string path = "/sys/class/net/" + ifname + "/address";
    std::ifstream in(vorn::platform::RootPath(path));
    std::string mac;
    if (!in || !std::getline(in, mac)) {
        VORN_LOG(LOG_ERR, "Failed to open [%s]", path.c_str());
        return "";
    }
    return mac.substr(0, mac.find_last_not_of(" \t\r") + 1);
}

std::string GetModelName() {
    return FactoryValue("model");
}

bool IsKiteAModel() {
    return GetModelName() == "kite-a";
}

bool IsKiteBModel() {
    return GetModelName() == "kite-b";
}

bool IsKiteModel() {
    return IsKiteAModel() || IsKiteBModel();
}

bool IsKiteBuiltInWlan(const std::string& ifname) {
    return IsKiteModel() && IsBuiltInWlan(ifname);
}

bool IsKiteABuiltInWlan(const std::string& ifname) {
    return IsKiteAModel() && IsBuiltInWlan(ifname);
}

bool IsKiteBBuiltInWlan(const std::string& ifname) {
    return IsKiteBModel() && IsBuiltInWlan(ifname);
}

std::string GetKiteBWlanMacAddress() {
    return IsKiteBModel() ? FactoryValue("builtin_wlan_mac") : "";
}

namespace {

// The letters cfg80211 radios leave out of iwconfig's "IEEE 802.11", from their bands in
// "iw phy PHY info": band 1 is 2.4 GHz (b, g), band 2 is 5 GHz (a); HT rates add n.
std::string BandLetters(const std::string& ifname) {
    const std::string phy = GetPhyName(ifname);
    std::vector<std::string> lines;
    if (phy.empty() ||
        vorn::platform::ReadShellCommandLines(
            "/usr/sbin/iw phy '" + phy + "' info | grep -E '^.Band [0-9]+:|HT20'", lines) != 0) {
        return "";
    }
    return ParseBandLetters(lines);
}

}  // namespace

std::string ParseBandLetters(const std::vector<std::string>& lines) {
    std::string letters;
    for (const auto& line : lines) {
        if (line.rfind("\tBand 1:", 0) == 0) {
            letters += "bg";
        } else if (line.rfind("\tBand 2:", 0) == 0) {
            letters += "a";
        } else if (line.find("HT20") != std::string::npos &&
                   letters.find('n') == std::string::npos) {
            letters += "n";
        }
    }
    return letters;
}

std::string GetPhyName(const std::string& ifname) {
    std::string phy;
    if (vornwireless::utils::IsValidInterfaceName(ifname)) {
        std::ifstream(vorn::platform::RootPath("/sys/class/net/" + ifname + "/phy80211/name")) >>
            phy;
    }
    // The name goes onto iw's command line.
    return vornwireless::utils::IsValidInterfaceName(phy) ? phy : "";
}

int GetSupportedMode(const std::string& ifname, std::string& modes) {
    modes.clear();
    if (!vornwireless::utils::IsValidInterfaceName(ifname)) {
        return -1;
    }
    std::vector<std::string> lines;
    const std::string command =
        "/sbin/iwconfig '" + ifname + "'| grep 'IEEE 802.11'| cut -d' ' -f7";
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxModeLines, kModeLineBytes) != 0) {
        return -1;
    }
    for (const auto& line : lines) {
        modes += line;
    }
    if (modes == "802.11") {
        modes += BandLetters(ifname);
    }
    return 0;
}

bool IsGuestNetworkSupport(const std::string& ifname) {
    return ifname == "wlan0" && IsKiteModel();
}

int GetWirelessIndex(const std::string& name) {
    return IndexAfter("wlan", name);
}

int GetGuestBridgeIndex(const std::string& name) {
    return IndexAfter("gbr", name);
}

int EncryptPlainText(const std::string& plain, std::string& cipher) {
    std::vector<char> buffer(QLIB_CRYPT_CIPHER_SIZE(plain.size()));
    if (QLIBCryptSzEncrypt(plain.c_str(), buffer.data(), static_cast<int>(buffer.size())) != 0) {
        return -1;
    }
    cipher = buffer.data();
    return 0;
}

int DecryptCipherText(const std::string& cipher, std::string& plain) {
    plain.clear();
    if (cipher.empty()) {
        return 0;
    }
    std::vector<char> buffer(cipher.size() + 1);
    if (QLIBCryptSzDecrypt(cipher.c_str(), buffer.data(), static_cast<int>(buffer.size())) != 0) {
        return -1;
    }
    plain = buffer.data();
    return 0;
}

WIFI_TOPOLOGY ReadTopology() {
    char value[kValueSize] = {};
    const int found = QLIBCFileGetKeyValue(kSettingsFile, kTopologyKey, value, sizeof(value), 0);
    if (found < 0) {
        VORN_LOG(LOG_ERR, "Failed to Get Key [%s] from config [%s]", kTopologyKey, kSettingsFile);
        return WIFI_TOPOLOGY_ERROR;
    }
    if (found == 0) {
        return WriteTopology(WIFI_TOPOLOGY_CLIENT) == 0 ? WIFI_TOPOLOGY_CLIENT
                                                        : WIFI_TOPOLOGY_ERROR;
    }
    return EnumMap<WIFI_TOPOLOGY>::StringToEnum(value);
}

int WriteTopology(WIFI_TOPOLOGY topology) {
    const std::string text = EnumMap<WIFI_TOPOLOGY>::EnumToString(topology);
    QLIBSZHASH* pairs = QLIBCSzHashAlloc(1);
    const bool ok = pairs != nullptr &&
                    QLIBCSzHashSetValue(pairs, kTopologyKey, text.c_str()) == 0 &&
                    QLIBCFileSetKeys(kSettingsFile, pairs, nullptr, QLIBC_FILE_QUOTE_VALUES) == 0;
    QLIBCSzHashFree(pairs);
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to write value [%s] to key [%s] for config [%s]", text.c_str(),
                 kTopologyKey, kSettingsFile);
        return -1;
    }
    return 0;
}

int GetTopologyString(std::string& out) {
    if (!vornwireless::utils::IsProcessAlive("vornwifid")) {
        out = "none";
        return 0;
    }
    const WIFI_TOPOLOGY topology = ReadTopology();
    if (topology == WIFI_TOPOLOGY_ERROR) {
        VORN_LOG(LOG_ERR, "Failed to read current topology");
        return -1;
    }
    out = EnumMap<WIFI_TOPOLOGY>::EnumToString(topology);
    return 0;
}

int SetSupportNetTopology(bool support) {
    return SetSettingsFlag(kSupportKey, support);
}

int SetHasWifiDongle(bool has) {
    return SetSettingsFlag("has_wifi_dongle", has);
}

bool IsSupportTopology() {
    return IsSettingYes(kSupportKey);
}

bool HasWifiDongle() {
    return IsSettingYes("has_wifi_dongle");
}

std::string GetBridgeName(WIFI_TOPOLOGY topology) {
    switch (topology) {
        case WIFI_TOPOLOGY_BRIDGE:
            return "br0";
        case WIFI_TOPOLOGY_ROUTER:
            return "lbr0";
        default:
            return "";
    }
}

int GetFirstExistentSlaveByBridge(const std::string& bridge, std::string& out) {
    out.clear();
    if (!vornwireless::utils::IsValidInterfaceName(bridge)) {
        VORN_LOG(LOG_ERR, "Wrong Parameter.");
        return -1;
    }
    // Whole-name match: "br0" must not pick up the lines of lbr0 or gbr0.
    const std::string command =
        "/usr/vorn/sbin/brctl show | awk -v b='" + bridge + "' '$1 == b {print $4}'";
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, 1, kValueSize) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute command");
        return -1;
    }
    if (!lines.empty()) {
        out = lines.front();
    }
    return 0;
}

bool IsSectionExist(const std::string& file, const std::string& section) {
    if (!IsPlainWord(section)) {
        VORN_LOG(LOG_ERR, "Wrong Parameter.");
        return false;
    }
    if (QLIBCFileExist(file.c_str()) != 1) {
        VORN_LOG(LOG_ERR, "File %s doesn't exist", file.c_str());
        return false;
    }
    QLIBSZLIST* sections = nullptr;
    bool found = false;
    if (QLIBCFileEnumSection(file.c_str(), &sections) > 0) {
        for (int i = 0; i < QLIBCSzListCount(sections) && !found; ++i) {
            found = strcasecmp(QLIBCSzListGet(sections, i), section.c_str()) == 0;
        }
    }
    QLIBCSzListFree(sections);
    return found;
}

int GetSignalStrength(const std::string& ifname) {
    if (!vornwireless::utils::IsValidInterfaceName(ifname)) {
        return -1;
    }
    std::string line;
    const std::string command = "/sbin/iwconfig '" + ifname + "' | grep 'Link Quality'";
    if (vorn::platform::ReadShellCommandLine(command, line, kValueSize) != 0) {
        return -1;
    }
    return ParseLinkQuality(line);
}

int ParseLinkQuality(const std::string& line) {
    const std::string::size_type at = line.find("Link Quality=");
    int quality = 0, scale = 0;
    if (at == std::string::npos) {
        return -1;
    }
    const int parsed = std::sscanf(line.c_str() + at, "Link Quality=%d/%d", &quality, &scale);
    // A driver's figures are not trusted to stay within their scale.
    if (parsed == 2 && scale > 0) {
        return static_cast<int>(
            std::clamp<std::int64_t>(std::int64_t{quality} * 100 / scale, 0, 100));
    }
    return parsed >= 1 ? std::clamp(quality, 0, 100) : -1;
}

int InsertRLTKernelModule(const std::string& module) {
    if (!IsModuleFile(module)) {
        return -1;
    }
    const std::string path = kRltModuleDir + module;
    return QLIBCExecl("/sbin/insmod", QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN,
                      vorn::platform::RootPath(path).c_str(), nullptr);
}

int RemoveRLTKernelModule(const std::string& module) {
    if (!IsModuleFile(module)) {
        return -1;
    }
    const std::string name = module.substr(0, module.size() - 3);
    return QLIBCExecl("/sbin/rmmod", QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN, name.c_str(), nullptr);
}

bool IsNetActivate(const std::string& ifname) {
    return VORNNetIfIsUp(ifname.c_str()) == 1;
}

int GetArpInfoByMAC(const vornwireless::utils::MacAddress& mac,
                    vornwireless::utils::IPAddress& ip) {
    std::string text;
    if (!vorn::platform::ReadTextFile(vorn::platform::RootPath(kArpTable), text)) {
        VORN_LOG(LOG_ERR, "Failed to read [%s]", kArpTable);
        return -1;
    }
    // "IP address  HW type  Flags  HW address  Mask  Device"
    for (const std::string& line : vorn::platform::SplitLines(text)) {
        std::istringstream words(line);
        std::string address, type, flags, hardware;
        if (!(words >> address >> type >> flags >> hardware) ||
            strcasecmp(hardware.c_str(), mac.ToCString()) != 0 ||
            (std::strtoul(flags.c_str(), nullptr, 16) & ATF_COM) == 0) {
            continue;
        }
        ip = vornwireless::utils::IPAddress(address);
        if (!ip.IsEmpty()) {
            return 0;
        }
    }
    return -1;
}

int GetDHCPInfoByMAC(const vornwireless::utils::MacAddress& mac, std::string& hostname) {
    hostname.clear();
    return vornnetwork::network::module::ArpScanner::Inst()->GetDHCPInfoByMAC(mac.ToString(),
                                                                              hostname);
}

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless
