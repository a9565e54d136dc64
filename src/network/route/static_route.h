#ifndef VORN_NETWORK_ROUTE_STATIC_ROUTE_H
#define VORN_NETWORK_ROUTE_STATIC_ROUTE_H

#include <json/json.h>

#include <string>

#include "network/route/policy_route.h"
#include "utils/ip_address.h"

namespace vornnetwork {
namespace network {

struct StaticRouteRule {
    IP_TYPE type = IP_TYPE_V4;
    vornwireless::utils::IPAddress ip;    // destination
    vornwireless::utils::IPAddress mask;  // IPv4
    vornwireless::utils::IPAddress gateway;
    std::string ifname;
    std::string prefix_length;  // IPv6
    bool enable = false;
};

// The user's static routes: kept in "static-table" (id 2, rule priority 2), stored per family
// in "/etc/iproute2/config/static-table-rule" and "static-table-rule-v6", sections in
// installation order.
//
// JSON of one route: {"ip": "10.1.0.0", "mask": "255.255.255.0" (IPv4) or "prefix_length": "64"
// (IPv6), "gateway": "10.0.0.1", "ifname": "eth0", "enable": true}.
// SetRules takes and GetRules gives {"rules": [route, ...]}; GetRules adds to each route
// "active": "Enabled" when it is installed in the kernel table, else "Disabled".
// GetRouteTables gives {"tables": [{"name": "main", "routes": [...]}, ...]} for "main",
// "static-table" and the enabled interface tables of the family; GetTableInfo gives one of them,
// {"name": T, "routes": [{"destination", "gateway", "ifname", "metric", "class",
// "gateway_class"}, ...]} with "class" the interface's class in the gateway list ("unknown" when
// it has none) and "gateway_class" the class of the entry offering that gateway ("-" when none).
class StaticRoute {
  public:
    // Reads one JSON route of the family, validating every value. 0 or -1.
    static int RuleFromJson(IP_TYPE type, const Json::Value& json, StaticRouteRule& rule);

    int AddRule(const StaticRouteRule& rule);
    int DeleteRule(const StaticRouteRule& rule);
    bool CheckRuleExist(const StaticRouteRule& rule);
    // Installs and removes the route at once: the kernel's acceptance is the test. json["ip"]
    // becomes the network address of the destination (host bits cleared).
    int TestRuleVaild(const StaticRouteRule& rule, Json::Value& json);
    int SetRules(IP_TYPE type, const Json::Value& json);
    int GetRules(IP_TYPE type, Json::Value& json);
    int RefreshRules();
    int GetRouteTables(IP_TYPE type, Json::Value& json);
    int GetTableInfo(IP_TYPE type, const std::string& table, Json::Value& json);
};

}  // namespace network
}  // namespace vornnetwork

#endif
