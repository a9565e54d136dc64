#ifndef VORN_WIFI_UTILS_STATION_UTILS_H
#define VORN_WIFI_UTILS_STATION_UTILS_H

#include <json/json.h>

#include <map>
#include <string>
#include <vector>

#include "wifi/settings/adapter_config.h"
#include "wifi/utils/utils.h"

// Station and connection utilities: the JSON forms the wifi service answers with.
namespace vornwireless {
namespace wifi {
namespace utils {

// The wireless interfaces present ("wlan" entries of "/sys/class/net"); 0 when none or the
// directory cannot be listed.
int GetAdapterNum();

// The "key=value" lines of "wpa_cli -i IF status" into status; false (logged) for a bad name
// or a command that cannot run.
bool ReadSupplicantStatus(const std::string& ifname, std::map<std::string, std::string>& status);
// Those lines into status: a later key replaces an earlier one.
void ParseSupplicantStatus(const std::vector<std::string>& lines,
                           std::map<std::string, std::string>& status);

// A known or scanned network in the JSON form of a configuration's "stations" entries, with the
// scan's "signal".
Json::Value StationInfoToJson(const AdapterConfig::StationInfo& station);

// The stations connected to an access point as a JSON array of {"macAddr", "ipAddr",
// "hostname", "connected_time"}. 0.
int ParseConnectionList(const std::vector<ConnectionInfo>& connections, Json::Value& list);

// The network the station client of config.name has joined, as wpa_cli reports it: the stored
// station of that BSSID (or ESSID) without its password, with "bssid", "ip" and "signal" as they
// are now. -1 when the client is not associated or wpa_cli cannot be asked.
int GetConnectedAPInfo(const AdapterConfig& config, Json::Value& info);

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless

#endif
