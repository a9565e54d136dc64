#ifndef VORN_NETWORK_ROUTE_POLICY_ROUTE_H
#define VORN_NETWORK_ROUTE_POLICY_ROUTE_H

#include <json/json.h>

#include <string>
#include <vector>

#include "utils/ip_address.h"

namespace vornnetwork {
namespace network {

enum IP_TYPE { IP_TYPE_V4 = 0, IP_TYPE_V6 = 1 };

// One route of an interface's own table, stored as a section of the interface's rule file.
struct PolicyRouteRule {
    IP_TYPE type = IP_TYPE_V4;
    vornwireless::utils::IPAddress ip;    // destination; empty for the default route
    vornwireless::utils::IPAddress mask;  // IPv4
    vornwireless::utils::IPAddress gateway;
    std::string prefix_length;  // IPv6
    std::string ifname;
    std::string name;  // section name in the rule file
};

// Per-interface routing tables ("<ifname>-table") selected by one policy rule per source address.
// State lives in "/etc/iproute2/config/multi_table_config" (sections per table: "id", "enable",
// "source", "enable_v6", "source_v6"), the rule files "/etc/iproute2/config/<ifname>-table-rule"
// and "-table-rule-v6", and "/etc/iproute2/rt_tables" (regenerated from multi_table_config).
// Every name and address read from a request or a file is validated before it reaches a command.
class PolicyRoute {
  public:
    PolicyRoute();  // InitMaxID()

    // Highest table id in use: the largest "id" in multi_table_config, 2 when the file is absent.
    int InitMaxID();
    int GetMaxID() const { return max_id_; }

    int AddRule(const PolicyRouteRule& rule);
    int DeleteRule(IP_TYPE type, const std::string& ifname, const std::string& name);
    // file is the logical path of a rule file.
    bool IsRulesEmpty(const std::string& file);

    // source: addresses or networks of the family separated by ",", or "all".
    int EnableTable(IP_TYPE type, const std::string& ifname, const std::string& source);
    int DisableTable(IP_TYPE type, const std::string& ifname);

    // {"tables": [{"name": "eth0-table", "id": 3, "ifname": "eth0",
    //              "enable": true, "source": ["10.0.0.0/24"],
    //              "enable_v6": false, "source_v6": []}, ...]}
    // Only tables enabled for at least one family are listed, in name order.
    int GetEnableTables(Json::Value& json);

    int FlushTableRule(IP_TYPE type, const std::string& table);
    int FlushTableLookupRule(IP_TYPE type, const std::string& table);
    int SetTableLookupRule(IP_TYPE type, const std::string& table);
    // ruleFile is the logical path of a rule file.
    int SetTableRouteRule(IP_TYPE type, const std::string& ruleFile);
    int ConfigWrite(IP_TYPE type, const std::string& table, const std::string& source, bool enable);

  private:
    int max_id_ = 2;
};

// "192.168.1.77", "255.255.255.0" -> "192.168.1.0/24". 0 or -1.
int GetSubnetFormat(const std::string& ip, const std::string& mask, std::string& out);

// Shared with the static routes.

// "/sbin/ip" "-4"|"-6" followed by words, run without a shell; command receives the whole command
// line for logs. 0, or -1 when it failed (an unknown type is logged here).
int RunIpCommand(IP_TYPE type, const std::vector<std::string>& words, std::string& command);
// "route" "flush" "table" table. The kernel refuses to flush a table that never held a route;
// that table is empty, which is what a flush is for. 0 or -1 (logged with logFormat, which takes
// the command line).
int FlushRouteTable(IP_TYPE type, const std::string& table, const char* logFormat);
// A strict address text of the family (dotted quad for IPv4).
bool IsAddressOfType(IP_TYPE type, const std::string& text);
// A decimal prefix length valid for the family.
bool IsPrefixLengthOfType(IP_TYPE type, const std::string& text);
// The logical rule file of a table owner and family ("eth0" -> ".../eth0-table-rule-v6").
std::string RuleFilePath(IP_TYPE type, const std::string& ifname);

}  // namespace network
}  // namespace vornnetwork

#endif
