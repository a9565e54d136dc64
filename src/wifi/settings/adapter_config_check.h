#ifndef VORN_WIFI_SETTINGS_ADAPTER_CONFIG_CHECK_H
#define VORN_WIFI_SETTINGS_ADAPTER_CONFIG_CHECK_H

#include <cstddef>
#include <string>

#include "wifi/settings/adapter_config.h"

namespace vornwireless {
namespace wifi {

// The longest SSID 802.11 allows, in bytes.
constexpr std::size_t kMaxSsidBytes = 32;

// Hex digits only (the empty text too).
bool IsHexText(const std::string& text);
// A WPA passphrase: 8 to 63 printable ASCII characters, or the key itself as 64 hex digits.
bool IsPassphrase(const std::string& text);

// Whether a configuration from outside may reach the generated files (section files, hostapd,
// wpa_supplicant). Refused, with a log line naming the field: a text holding a line break, a
// carriage return or a NUL byte; an SSID over 32 bytes; a MAC not in canonical form; a repeated
// station BSSID (stations are stored by it); a personal-WPA passphrase that is not 8 to 63
// printable characters or 64 hex digits, checked where it is used (the main network when
// enabled, the guest network when enabled, every station). 0 or -1.
int CheckAdapterConfig(const AdapterConfig& config);
// The same checks without the station client's networks, which reach no access-point file.
int CheckAccessPointConfig(const AdapterConfig& config);
// The same checks for one station client network.
int CheckStationInfo(const AdapterConfig::StationInfo& station);
// What the RLT radio's driver files add: it splits every value at ";", so no SSID, password,
// country code or RADIUS secret (of either network or any station) may hold one. 0, or -1
// logged with the field.
int CheckRLTConfig(const AdapterConfig& config);

}  // namespace wifi
}  // namespace vornwireless

#endif
