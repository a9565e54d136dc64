#include "wifi/settings/enum.h"

#include <initializer_list>
#include <utility>

#include "utils/log.h"
#include "wifi/settings/enum_map.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kEnumHeader = "libvornwireless/include/wifi/enum";
constexpr int kEnumLookupLine = 286;

template <typename E>
bool Fill(std::map<std::string, E>& table, std::initializer_list<std::pair<const char*, E>> rows) {
    for (const auto& row : rows) {
        table[row.first] = row.second;
    }
    return true;
}

}  // namespace

void LogEnumKeyNotFound(const std::string& key) {
    vorn::log::Write(LOG_ERR, kEnumHeader, kEnumLookupLine, "Failed to find key(%s)", key.c_str());
}

bool CreateMap(std::map<std::string, WIFI_MODE>& table) {
    return Fill(table, {{"error", WIFI_MODE_ERROR},
                        {"a", WIFI_MODE_A},
                        {"b", WIFI_MODE_B},
                        {"g", WIFI_MODE_G},
                        {"n", WIFI_MODE_N},
                        {"an", WIFI_MODE_AN},
                        {"bn", WIFI_MODE_BN},
                        {"gn", WIFI_MODE_GN},
                        {"bg", WIFI_MODE_BG},
                        {"bgn", WIFI_MODE_BGN},
                        {"ac", WIFI_MODE_AC},
                        {"an+ac", WIFI_MODE_AN_AC}});
}

bool CreateMap(std::map<std::string, WIFI_ENCRYPTION>& table) {
    return Fill(table, {{"error", WIFI_ENCRYPTION_ERROR},
                        {"NONE", WIFI_ENCRYPTION_NONE},
                        {"TKIP", WIFI_ENCRYPTION_TKIP},
                        {"AES", WIFI_ENCRYPTION_AES},
                        {"TKIP_AES", WIFI_ENCRYPTION_TKIP_AES}});
}

bool CreateMap(std::map<std::string, WIFI_SECURITY>& table) {
    return Fill(table, {{"error", WIFI_SECURITY_ERROR},
                        {"disabled", WIFI_SECURITY_DISABLED},
                        {"WEP", WIFI_SECURITY_WEP},
                        {"PERSONAL_WPA", WIFI_SECURITY_PERSONAL_WPA},
                        {"PERSONAL_WPA2", WIFI_SECURITY_PERSONAL_WPA2},
                        {"PERSONAL_WPA_MIXED", WIFI_SECURITY_PERSONAL_WPA_MIXED},
                        {"ENTERPRISE_WPA", WIFI_SECURITY_ENTERPRISE_WPA},
                        {"ENTERPRISE_WPA2", WIFI_SECURITY_ENTERPRISE_WPA2},
                        {"ENTERPRISE_WPA_MIXED", WIFI_SECURITY_ENTERPRISE_WPA_MIXED}});
}

bool CreateMap(std::map<std::string, WIFI_MAC_FILTER_POLICY>& table) {
    return Fill(table, {{"error", WIFI_MAC_FILTER_POLICY_ERROR},
                        {"deny", WIFI_MAC_FILTER_POLICY_DENY},
                        {"allow", WIFI_MAC_FILTER_POLICY_ALLOW}});
}

bool CreateMap(std::map<std::string, WIFI_POWER>& table) {
    return Fill(table, {{"error", WIFI_POWER_ERROR},
                        {"low", WIFI_POWER_LOW},
                        {"medium", WIFI_POWER_MEDIUM},
                        {"high", WIFI_POWER_HIGH}});
}

bool CreateMap(std::map<std::string, WIFI_BANDWIDTH>& table) {
    return Fill(table, {{"error", WIFI_BANDWIDTH_ERROR},
                        {"20MHZ", WIFI_BANDWIDTH_20MHZ},
                        {"20_40MHZ", WIFI_BANDWIDTH_20_40MHZ},
                        {"20_40_80MHZ", WIFI_BANDWIDTH_20_40_80MHZ}});
}

bool CreateMap(std::map<std::string, WIFI_TOPOLOGY>& table) {
    return Fill(table, {{"error", WIFI_TOPOLOGY_ERROR},
                        {"bridge", WIFI_TOPOLOGY_BRIDGE},
                        {"router", WIFI_TOPOLOGY_ROUTER},
                        {"client", WIFI_TOPOLOGY_CLIENT},
                        {"repeater", WIFI_TOPOLOGY_REPEATER}});
}

bool CreateMap(std::map<std::string, WIFI_DRIVER>& table) {
    return Fill(table, {{"error", WIFI_DRIVER_ERROR}, {"nl80211", WIFI_DRIVER_NL80211}});
}

bool CreateMap(std::map<std::string, WIFI_STATUS>& table) {
    return Fill(table, {{"error", WIFI_STATUS_ERROR},
                        {"Enabled", WIFI_STATUS_ENABLED},
                        {"IPConflict", WIFI_STATUS_IPCONFLICT},
                        {"IPFailed", WIFI_STATUS_IPFAILED},
                        {"Disabled", WIFI_STATUS_DISABLED},
                        {"Enabling", WIFI_STATUS_ENABLING},
                        {"AutoEnabling", WIFI_STATUS_AUTOENABLING}});
}

bool CreateMap(std::map<std::string, WIFI_FEATURE>& table) {
    return Fill(table, {{"error", WIFI_FEATURE_ERROR},
                        {"mac_filter", WIFI_FEATURE_MAC_FILTER},
                        {"guest_network", WIFI_FEATURE_GUEST_NETWORK},
                        {"parental_control", WIFI_FEATURE_PARENTAL_CONTROL},
                        {"connection_list", WIFI_FEATURE_CONNECTION_LIST}});
}

// The scan listing may carry short or generic mode words; all of them must parse.
bool CreateMap(std::map<std::string, WIFI_OPMODE>& table) {
    return Fill(table, {{"error", WIFI_OPMODE_ERROR},
                        {"Auto", WIFI_OPMODE_AUTO},
                        {"Ad-Hoc", WIFI_OPMODE_AD_HOC},
                        {"Ad", WIFI_OPMODE_AD_HOC},
                        {"Adhoc", WIFI_OPMODE_AD_HOC},
                        {"Managed", WIFI_OPMODE_MANAGED},
                        {"In", WIFI_OPMODE_MANAGED},
                        {"Infra", WIFI_OPMODE_MANAGED},
                        {"Any", WIFI_OPMODE_MANAGED},
                        {"Master", WIFI_OPMODE_MASTER},
                        {"Repeater", WIFI_OPMODE_REPEATER},
                        {"Secondary", WIFI_OPMODE_SECONDARY},
                        {"Monitor", WIFI_OPMODE_MONITOR}});
}

}  // namespace wifi
}  // namespace vornwireless
