#ifndef VORN_WIFI_SETTINGS_ADAPTER_CONFIG_H
#define VORN_WIFI_SETTINGS_ADAPTER_CONFIG_H

#include <array>
#include <string>
#include <vector>

#include "utils/ip_address.h"
#include "utils/mac_address.h"
#include "wifi/settings/enum.h"

namespace vornwireless {
namespace wifi {

constexpr std::size_t kScheduleHours = 7 * 24;
// One flag per hour of the week, hour 0 of the first day first.
using Schedule = std::array<bool, kScheduleHours>;

// A password field: files keep it enciphered, JSON carries it plain.
template <typename Text>
struct Secret {
    Text& text;
};
template <typename Text>
Secret<Text> MakeSecret(Text& text) {
    return Secret<Text>{text};
}

// The complete settings of one wireless adapter.
struct AdapterConfig {
    struct MacFilterRule {
        bool enable = false;
        vornwireless::utils::MacAddress mac;
        std::string desc;
        bool operator==(const MacFilterRule& other) const;
    };

    // A known network of the station client, or a scan result (signal is filled by scans only).
    struct StationInfo {
        std::string essid;
        vornwireless::utils::MacAddress bssid;
        WIFI_OPMODE opmode = WIFI_OPMODE_ERROR;
        WIFI_SECURITY security = WIFI_SECURITY_ERROR;
        WIFI_ENCRYPTION encryption = WIFI_ENCRYPTION_ERROR;
        std::string user;
        std::string password;
        int access_time = 0;
        bool is_dhcp = false;
        vornwireless::utils::IPAddress ip;
        vornwireless::utils::IPAddress netmask;
        vornwireless::utils::IPAddress gateway;
        int channel = 0;
        int signal = 0;
        WIFI_MODE hwmode = WIFI_MODE_ERROR;
        bool operator==(const StationInfo& other) const;
    };

    std::string name;
    vornwireless::utils::MacAddress bssid;
    WIFI_DRIVER driver = WIFI_DRIVER_ERROR;
    bool enabled = false;
    std::string ssid;
    bool display_ssid = false;
    WIFI_MODE mode = WIFI_MODE_ERROR;
    WIFI_BANDWIDTH bandwidth = WIFI_BANDWIDTH_ERROR;
    int channel = 0;
    WIFI_POWER tx_power = WIFI_POWER_ERROR;
    int max_num_client = 0;
    bool wmm_enabled = false;
    bool schedule_enabled = false;
    Schedule schedule{};
    bool is_pci_interface = false;
    std::string CountryCode;
    int CountryRegion = 0;
    int CountryRegionABand = 0;
    WIFI_SECURITY security = WIFI_SECURITY_ERROR;
    WIFI_ENCRYPTION encryption = WIFI_ENCRYPTION_ERROR;
    std::string password;
    vornwireless::utils::IPAddress auth_server_ip;
    int auth_server_Port = 0;
    std::string auth_server_shared_secret;
    bool guest_support = false;
    bool guest_enabled = false;
    std::string guest_ssid;
    bool guest_display_ssid = false;
    vornwireless::utils::MacAddress guest_bssid;
    int guest_max_num_client = 0;
    WIFI_SECURITY guest_security = WIFI_SECURITY_ERROR;
    WIFI_ENCRYPTION guest_encryption = WIFI_ENCRYPTION_ERROR;
    std::string guest_password;
    bool guest_allow_access_guest = false;
    bool guest_allow_access_lan = false;
    bool guest_allow_access_http_https_only = false;
    bool guest_schedule_enabled = false;
    Schedule guest_schedule{};
    WIFI_MAC_FILTER_POLICY mac_filter_policy = WIFI_MAC_FILTER_POLICY_ERROR;
    std::vector<MacFilterRule> mac_filter_rules;
    bool client_enabled = false;
    std::vector<StationInfo> stations;

    bool operator==(const AdapterConfig& other) const;
    bool operator!=(const AdapterConfig& other) const { return !(*this == other); }
};

// The stored fields, in file order, each handed to visit(key, field). The one list serves the
// files and the JSON form; Config may be const.
template <typename Config, typename Visit>
void VisitAccessPointFields(Config& c, Visit&& visit) {
    visit("bssid", c.bssid);
    visit("driver", c.driver);
    visit("enabled", c.enabled);
    visit("ssid", c.ssid);
    visit("display_ssid", c.display_ssid);
    visit("mode", c.mode);
    visit("bandwidth", c.bandwidth);
    visit("channel", c.channel);
    visit("tx_power", c.tx_power);
    visit("max_num_client", c.max_num_client);
    visit("wmm_enabled", c.wmm_enabled);
    visit("schedule_enabled", c.schedule_enabled);
    visit("schedule", c.schedule);
    visit("is_pci_interface", c.is_pci_interface);
    visit("CountryCode", c.CountryCode);
    visit("CountryRegion", c.CountryRegion);
    visit("CountryRegionABand", c.CountryRegionABand);
    visit("security", c.security);
    visit("encryption", c.encryption);
    visit("password", MakeSecret(c.password));
    visit("auth_server_ip", c.auth_server_ip);
    visit("auth_server_Port", c.auth_server_Port);
    visit("auth_server_shared_secret", c.auth_server_shared_secret);
    visit("guest_support", c.guest_support);
    visit("guest_enabled", c.guest_enabled);
    visit("guest_ssid", c.guest_ssid);
    visit("guest_display_ssid", c.guest_display_ssid);
    visit("guest_bssid", c.guest_bssid);
    visit("guest_max_num_client", c.guest_max_num_client);
    visit("guest_security", c.guest_security);
    visit("guest_encryption", c.guest_encryption);
    visit("guest_password", MakeSecret(c.guest_password));
    visit("guest_allow_access_guest", c.guest_allow_access_guest);
    visit("guest_allow_access_lan", c.guest_allow_access_lan);
    visit("guest_allow_access_http_https_only", c.guest_allow_access_http_https_only);
    visit("guest_schedule_enabled", c.guest_schedule_enabled);
    visit("guest_schedule", c.guest_schedule);
    visit("mac_filter_policy", c.mac_filter_policy);
}

template <typename Rule, typename Visit>
void VisitMacFilterRuleFields(Rule& r, Visit&& visit) {
    visit("enable", r.enable);
    visit("desc", r.desc);
    visit("mac", r.mac);
}

// signal is not stored.
template <typename Station, typename Visit>
void VisitStationFields(Station& s, Visit&& visit) {
    visit("essid", s.essid);
    visit("bssid", s.bssid);
    visit("opmode", s.opmode);
    visit("security", s.security);
    visit("encryption", s.encryption);
    visit("user", s.user);
    visit("password", MakeSecret(s.password));
    visit("access_time", s.access_time);
    visit("is_dhcp", s.is_dhcp);
    visit("ip", s.ip);
    visit("netmask", s.netmask);
    visit("gateway", s.gateway);
    visit("channel", s.channel);
    visit("hwmode", s.hwmode);
}

}  // namespace wifi
}  // namespace vornwireless

#endif
