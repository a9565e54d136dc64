#ifndef VORN_WIFI_UTILS_ADAPTER_CONFIG_JSON_H
#define VORN_WIFI_UTILS_ADAPTER_CONFIG_JSON_H

#include <json/json.h>

#include "wifi/settings/adapter_config.h"

// The JSON form of AdapterConfig that the wifi service carries (docs/wifi.md): the keys of the
// setting files, with "name", "clientenabled", and the arrays "mac_filter_rules" and "stations".
namespace vornwireless {
namespace wifi {
namespace utils {

Json::Value GetJsonValue(const AdapterConfig& config);

// Builds a configuration from JSON. Every key must be present with its type (booleans, numbers,
// strings for the rest) and every value valid (CheckAdapterConfig); otherwise logs, leaves config
// alone and returns -1.
int GetConfig(const Json::Value& json, AdapterConfig& config);

// One network in the JSON form of a configuration's "stations" entries, checked as GetConfig
// checks it; -1 (logged, station left alone) otherwise.
int ConnectionJsonToStationInfo(const Json::Value& json, AdapterConfig::StationInfo& station);

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless

#endif
