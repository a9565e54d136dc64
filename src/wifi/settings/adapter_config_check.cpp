#include "wifi/settings/adapter_config_check.h"

#include <algorithm>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr std::size_t kMinPassphrase = 8;
constexpr std::size_t kMaxPassphrase = 63;
constexpr std::size_t kHexKeyLength = 64;

bool IsOneLine(const std::string& text) {
    return text.find_first_of(std::string("\n\r\0", 3)) == std::string::npos;
}

bool IsPersonalWpa(WIFI_SECURITY security) {
    return security == WIFI_SECURITY_PERSONAL_WPA || security == WIFI_SECURITY_PERSONAL_WPA2 ||
           security == WIFI_SECURITY_PERSONAL_WPA_MIXED;
}

// Collects the first refusal; later checks only run while none has been found.
class Checker {
  public:
    void Text(const char* field, const std::string& text) {
        Require(IsOneLine(text), field, "holds a line break, carriage return or NUL");
    }
    void Ssid(const char* field, const std::string& text) {
        Text(field, text);
        Require(text.size() <= kMaxSsidBytes, field, "is longer than 32 bytes");
    }
    void Mac(const char* field, const vornwireless::utils::MacAddress& mac) {
        Require(mac.IsFormalized(), field, "is not a MAC address");
    }
    void Passphrase(const char* field, const std::string& text, bool used) {
        Text(field, text);
        Require(!used || IsPassphrase(text), field, "is not a WPA passphrase");
    }
    void Require(bool ok, const char* field, const char* why) {
        if (ok_ && !ok) {
            VORN_LOG(LOG_ERR, "Refused config: %s %s", field, why);
            ok_ = false;
        }
    }
    bool Ok() const { return ok_; }

  private:
    bool ok_ = true;
};

void CheckStation(Checker& check, const AdapterConfig::StationInfo& station) {
    check.Ssid("stations.essid", station.essid);
    check.Mac("stations.bssid", station.bssid);
    check.Text("stations.user", station.user);
    check.Passphrase("stations.password", station.password, IsPersonalWpa(station.security));
}

}  // namespace

bool IsHexText(const std::string& text) {
    return std::all_of(text.begin(), text.end(),
                       [](char c) { return std::isxdigit(static_cast<unsigned char>(c)) != 0; });
}

bool IsPassphrase(const std::string& text) {
    if (text.size() == kHexKeyLength) {
        return IsHexText(text);
    }
    return text.size() >= kMinPassphrase && text.size() <= kMaxPassphrase &&
           std::all_of(text.begin(), text.end(), [](char c) { return c >= ' ' && c <= '~'; });
}

int CheckStationInfo(const AdapterConfig::StationInfo& station) {
    Checker check;
    CheckStation(check, station);
    return check.Ok() ? 0 : -1;
}

int CheckAdapterConfig(const AdapterConfig& config) {
    Checker check;
    check.Require(vornwireless::utils::IsValidInterfaceName(config.name), "name",
                  "is not an interface name");
    check.Mac("bssid", config.bssid);
    check.Ssid("ssid", config.ssid);
    check.Text("CountryCode", config.CountryCode);
    check.Passphrase("password", config.password, config.enabled && IsPersonalWpa(config.security));
    check.Text("auth_server_shared_secret", config.auth_server_shared_secret);
    check.Ssid("guest_ssid", config.guest_ssid);
    check.Mac("guest_bssid", config.guest_bssid);
    check.Passphrase("guest_password", config.guest_password,
                     config.guest_enabled && IsPersonalWpa(config.guest_security));
    for (const auto& rule : config.mac_filter_rules) {
        check.Mac("mac_filter_rules.mac", rule.mac);
        check.Text("mac_filter_rules.desc", rule.desc);
    }
    std::set<std::string> bssids;
    for (const auto& station : config.stations) {
        CheckStation(check, station);
        check.Require(bssids.insert(station.bssid.ToString()).second, "stations.bssid",
                      "is repeated");
    }
    return check.Ok() ? 0 : -1;
}

int CheckAccessPointConfig(const AdapterConfig& config) {
    AdapterConfig accessPoint = config;
    accessPoint.stations.clear();
    return CheckAdapterConfig(accessPoint);
}

int CheckRLTConfig(const AdapterConfig& config) {
    std::vector<std::pair<const char*, const std::string*>> texts = {
        {"ssid", &config.ssid},
        {"password", &config.password},
        {"guest_ssid", &config.guest_ssid},
        {"guest_password", &config.guest_password},
        {"CountryCode", &config.CountryCode},
        {"auth_server_shared_secret", &config.auth_server_shared_secret}};
    for (const auto& station : config.stations) {
        texts.emplace_back("stationList.essid", &station.essid);
        texts.emplace_back("stationList.password", &station.password);
    }
    for (const auto& text : texts) {
        if (text.second->find(';') != std::string::npos) {
            VORN_LOG(LOG_ERR, "Refused config: %s holds \";\"", text.first);
            return -1;
        }
    }
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
