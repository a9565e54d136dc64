#ifndef VORN_WIFI_UTILS_BRIDGE_CONFIG_JSON_H
#define VORN_WIFI_UTILS_BRIDGE_CONFIG_JSON_H

#include <json/json.h>

#include <string>

#include "wifi/bridge/bridge_base.h"

// The JSON form of a bridge and the reading of one bridge section of a topology file.
namespace vornwireless {
namespace wifi {
namespace utils {

// "slave_list", "status", "ifname", "bridge_type", the IPv4 keys, "nat", the IPv6 keys.
Json::Value GetJsonValue(const BridgeBase* bridge);

// A configuration from the wifi service's JSON (the keys of the topology file, "dhcp_enabled" a
// boolean, "slave_list" an array of strings). Checked as BridgeConfig::FromFields; -1 (logged,
// config unchanged) for a wrong type or a refused value.
int GetConfig(const Json::Value& json, BridgeConfig& config);

// One section (named section) of a topology file. 0, or -1 ("Failed to parse config").
int GetConfig(const std::string& file, const std::string& section, BridgeConfig& config);

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless

#endif
