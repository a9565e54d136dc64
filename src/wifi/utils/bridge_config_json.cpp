#include "wifi/utils/bridge_config_json.h"

#include <algorithm>

#include "utils/config.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"

namespace vornwireless {
namespace wifi {
namespace utils {
namespace {

const char* BridgeType(const std::string& name) {
    if (BridgeBase::IsLocalBridge(name)) {
        return "local_bridge";
    }
    return BridgeBase::IsGuestBridge(name) ? "guest_bridge" : "bridge";
}

bool JsonToFields(const Json::Value& json, BridgeConfig::Fields& fields) {
    if (!json.isObject()) {
        return false;
    }
    for (const std::string& key : BridgeConfig::Keys()) {
        const Json::Value& value = json[key];
        if (value.isNull()) {
            continue;
        }
        if (key == "dhcp_enabled") {
            if (!value.isBool()) {
                return false;
            }
            fields[key] = value.asBool() ? "yes" : "no";
        } else if (key == "slave_list") {
            if (!value.isArray()) {
                return false;
            }
            for (const auto& slave : value) {
                // A blank would split one name into two.
                if (!slave.isString() || slave.asString().find(' ') != std::string::npos) {
                    return false;
                }
                fields[key] += (fields[key].empty() ? "" : " ") + slave.asString();
            }
        } else if (value.isString()) {
            fields[key] = value.asString();
        } else {
            return false;
        }
    }
    return true;
}

}  // namespace

Json::Value GetJsonValue(const BridgeBase* bridge) {
    const BridgeConfig config = bridge->GetConfig();
    Json::Value json(Json::objectValue);
    json["slave_list"] = Json::Value(Json::arrayValue);
    for (const auto& slave : config.slaveList) {
        json["slave_list"].append(slave);
    }
    const bool enabled =
        std::any_of(config.slaveList.begin(), config.slaveList.end(), [](const std::string& s) {
            const Adapter* adapter = Adapter::GetAdapter(s);
            return adapter != nullptr && adapter->GetStatus() == WIFI_STATUS_ENABLED;
        });
    json["status"] = enabled ? "enabled" : "disabled";
    json["ifname"] = bridge->GetName();
    json["bridge_type"] = BridgeType(bridge->GetName());
    json["ap_ip_address"] = config.apIpAddress.ToString();
    json["ap_netmask"] = config.apNetmask.ToString();
    json["dhcp_enabled"] = config.dhcpEnabled;
    json["dhcp_range_begin"] = config.dhcpRangeBegin.ToString();
    json["dhcp_range_end"] = config.dhcpRangeEnd.ToString();
    json["nat"] = true;
    json["ap_ipv6_prefix"] = config.ipv6Prefix;
    json["ipv6_pdns"] = config.ipv6Pdns;
    json["ipv6_sdns"] = config.ipv6Sdns;
    json["dhcpv6_type"] = config.dhcpv6Type;
    json["dhcpv6_range_begin"] = config.dhcpv6RangeBegin;
    json["dhcpv6_range_end"] = config.dhcpv6RangeEnd;
    return json;
}

int GetConfig(const Json::Value& json, BridgeConfig& config) {
    BridgeConfig::Fields fields;
    if (!JsonToFields(json, fields)) {
        VORN_LOG(LOG_ERR, "Failed to parse config");
        return -1;
    }
    return BridgeConfig::FromFields(fields, config);
}

int GetConfig(const std::string& file, const std::string& section, BridgeConfig& config) {
    vornwireless::utils::ConfigSection sections(file);
    if (sections.Read() != 0 || !sections.Find(section) ||
        BridgeConfig::FromFields(sections.GetKeyValues().at(section), config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to parse config");
        return -1;
    }
    return 0;
}

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless
