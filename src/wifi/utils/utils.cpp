#include "wifi/utils/utils.h"

#include <strings.h>

#include <cstdlib>
#include <fstream>
#include <vector>

#include "platform/qlib_crypt.h"
#include "platform/qlibc_container.h"
#include "platform/qlibc_file.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/settings/enum_map.h"

namespace vornwireless {
namespace wifi {
namespace utils {
namespace {

constexpr const char* kSettingsFile = "/etc/vorninfo.conf";
constexpr const char* kFactoryFile = "/etc.defaults/vorninfo.conf";
constexpr const char* kTopologyKey = "net_topology";
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

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless
