#ifndef VORN_WIFI_SETTINGS_ENUM_H
#define VORN_WIFI_SETTINGS_ENUM_H

#include <map>
#include <string>

// The wireless vocabulary. Values are stored and compared numerically and the strings are
// written verbatim to files and replies, so neither may change.
namespace vornwireless {
namespace wifi {

enum WIFI_MODE {
    WIFI_MODE_ERROR = 0,
    WIFI_MODE_A = 1,
    WIFI_MODE_B = 2,
    WIFI_MODE_G = 3,
    WIFI_MODE_N = 4,
    WIFI_MODE_AN = 5,
    WIFI_MODE_BN = 6,
    WIFI_MODE_GN = 7,
    WIFI_MODE_BG = 8,
    WIFI_MODE_BGN = 9,
    WIFI_MODE_AC = 10,
    WIFI_MODE_AN_AC = 11
};

enum WIFI_ENCRYPTION {
    WIFI_ENCRYPTION_ERROR = 0,
    WIFI_ENCRYPTION_NONE = 1,
    WIFI_ENCRYPTION_TKIP = 2,
    WIFI_ENCRYPTION_AES = 3,
    WIFI_ENCRYPTION_TKIP_AES = 4
};

enum WIFI_SECURITY {
    WIFI_SECURITY_ERROR = 0,
    WIFI_SECURITY_DISABLED = 1,
    WIFI_SECURITY_WEP = 2,
    WIFI_SECURITY_PERSONAL_WPA = 3,
    WIFI_SECURITY_PERSONAL_WPA2 = 4,
    WIFI_SECURITY_PERSONAL_WPA_MIXED = 5,
    WIFI_SECURITY_ENTERPRISE_WPA = 6,
    WIFI_SECURITY_ENTERPRISE_WPA2 = 7,
    WIFI_SECURITY_ENTERPRISE_WPA_MIXED = 8
};

enum WIFI_MAC_FILTER_POLICY {
    WIFI_MAC_FILTER_POLICY_ERROR = 0,
    WIFI_MAC_FILTER_POLICY_DENY = 1,
    WIFI_MAC_FILTER_POLICY_ALLOW = 2
};

// The values are the power levels themselves.
enum WIFI_POWER {
    WIFI_POWER_ERROR = 0,
    WIFI_POWER_LOW = 2,
    WIFI_POWER_MEDIUM = 6,
    WIFI_POWER_HIGH = 10
};

enum WIFI_BANDWIDTH {
    WIFI_BANDWIDTH_ERROR = 0,
    WIFI_BANDWIDTH_20MHZ = 1,
    WIFI_BANDWIDTH_20_40MHZ = 2,
    WIFI_BANDWIDTH_20_40_80MHZ = 3
};

enum WIFI_TOPOLOGY {
    WIFI_TOPOLOGY_ERROR = 0,
    WIFI_TOPOLOGY_BRIDGE = 1,
    WIFI_TOPOLOGY_ROUTER = 2,
    WIFI_TOPOLOGY_CLIENT = 3,
    WIFI_TOPOLOGY_REPEATER = 4
};

enum WIFI_DRIVER { WIFI_DRIVER_ERROR = 0, WIFI_DRIVER_NL80211 = 1 };

enum WIFI_STATUS {
    WIFI_STATUS_ERROR = 0,
    WIFI_STATUS_ENABLED = 1,
    WIFI_STATUS_IPCONFLICT = 2,
    WIFI_STATUS_IPFAILED = 3,
    WIFI_STATUS_DISABLED = 4,
    WIFI_STATUS_ENABLING = 5,
    WIFI_STATUS_AUTOENABLING = 6
};

enum WIFI_FEATURE {
    WIFI_FEATURE_ERROR = 0,
    WIFI_FEATURE_MAC_FILTER = 1,
    WIFI_FEATURE_GUEST_NETWORK = 2,
    WIFI_FEATURE_PARENTAL_CONTROL = 3,
    WIFI_FEATURE_CONNECTION_LIST = 4
};

// The wireless-extensions operating modes.
enum WIFI_OPMODE {
    WIFI_OPMODE_ERROR = -1,
    WIFI_OPMODE_AUTO = 0,
    WIFI_OPMODE_AD_HOC = 1,
    WIFI_OPMODE_MANAGED = 2,
    WIFI_OPMODE_MASTER = 3,
    WIFI_OPMODE_REPEATER = 4,
    WIFI_OPMODE_SECONDARY = 5,
    WIFI_OPMODE_MONITOR = 6
};

// Each fills the table with every string of its enumeration, aliases included; returns true.
bool CreateMap(std::map<std::string, WIFI_MODE>& table);
bool CreateMap(std::map<std::string, WIFI_ENCRYPTION>& table);
bool CreateMap(std::map<std::string, WIFI_SECURITY>& table);
bool CreateMap(std::map<std::string, WIFI_MAC_FILTER_POLICY>& table);
bool CreateMap(std::map<std::string, WIFI_POWER>& table);
bool CreateMap(std::map<std::string, WIFI_BANDWIDTH>& table);
bool CreateMap(std::map<std::string, WIFI_TOPOLOGY>& table);
bool CreateMap(std::map<std::string, WIFI_DRIVER>& table);
bool CreateMap(std::map<std::string, WIFI_STATUS>& table);
bool CreateMap(std::map<std::string, WIFI_FEATURE>& table);
bool CreateMap(std::map<std::string, WIFI_OPMODE>& table);

}  // namespace wifi
}  // namespace vornwireless

#endif
