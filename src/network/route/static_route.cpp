#include "network/route/static_route.h"

#include <arpa/inet.h>

#include <cstdio>
#include <exception>
#include <sstream>
#include <vector>

#include "dbus/net_client.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_str.h"
#include "platform/shell_command.h"
#include "utils/config.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace {

using vornwireless::utils::ConfigSection;
using vornwireless::utils::IPAddress;
using vornwireless::utils::IsValidInterfaceName;

const char kStaticTable[] = "static-table";
const char kStaticOwner[] = "static";
// Bounds what one request may store and what is read back of a routing table.
constexpr Json::ArrayIndex kMaxRules = 1000;
constexpr size_t kMaxRouteLines = 1024;

std::string RuleFile(IP_TYPE type) {
    return RuleFilePath(type, kStaticOwner);
}

std::string ShowCommand(IP_TYPE type, const std::string& table) {
    return std::string(type == IP_TYPE_V4 ? "/sbin/ip route show table "
                                          : "/sbin/ip -6 route show table ") +
           table;
}

// The destination on the command line: the subnet form for IPv4, network/length for IPv6.
int Destination(const StaticRouteRule& rule, std::string& out) {
    if (rule.type == IP_TYPE_V4) {
        return GetSubnetFormat(rule.ip, rule.mask, out);
    }
    try {
        out = IPAddress::GetIPv6NetworkPart(rule.ip, std::stoi(rule.prefix_length)) + "/" +
              rule.prefix_length;
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

// How "ip route show" prints a destination: no length for a host, "default" for everything.
std::string KernelDestination(IP_TYPE type, const std::string& destination) {
    const std::string all = type == IP_TYPE_V4 ? "0.0.0.0/0" : "::/0";
    const std::string host = type == IP_TYPE_V4 ? "/32" : "/128";
    if (destination == all) {
        return "default";
    }
    if (destination.size() > host.size() &&
        destination.compare(destination.size() - host.size(), host.size(), host) == 0) {
        return destination.substr(0, destination.size() - host.size());
    }
    return destination;
}

int RunRoute(const StaticRouteRule& rule, const char* action) {
    std::string destination;
    if (Destination(rule, destination) != 0) {
        return -1;
    }
    std::string command;
    if (RunIpCommand(rule.type,
                     {"route", action, "to", destination, "via", rule.gateway.ToString(), "dev",
                      rule.ifname, "table", kStaticTable},
                     command) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute command[%s]", command.c_str());
        return -1;
    }
    return 0;
}

int FlushStaticTable(IP_TYPE type) {
    return FlushRouteTable(type, kStaticTable, "Failed to execute command[%s]");
}

const char* LengthKey(IP_TYPE type) {
    return type == IP_TYPE_V4 ? "mask" : "prefix_length";
}

Json::Value SectionToJson(IP_TYPE type, const ConfigSection::Section& section) {
    Json::Value json(Json::objectValue);
    for (const char* key : {"ip", LengthKey(type), "gateway", "ifname"}) {
        const auto found = section.find(key);
        json[key] = found != section.end() ? found->second : "";
    }
    const auto enable = section.find("enable");
    json["enable"] = enable != section.end() && enable->second == "yes";
    return json;
}

bool IsSafeForShell(const std::string& line) {
    for (char c : line) {
        const bool safe = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                          (c >= '0' && c <= '9') || c == ' ' || c == '.' || c == ':' || c == '/' ||
                          c == '-' || c == '_' || c == '@' || c == '+';
        if (!safe) {
            return false;
        }
    }
    return true;
}

// The metric of a route line, cut out the way the appliance always has; a line without one has
// metric 0.
std::string Metric(const std::string& line) {
    if (line.find("metric") == std::string::npos || !IsSafeForShell(line)) {
        return "0";
    }
    char command[1280];
    std::snprintf(command, sizeof(command),
                  "/bin/echo \"%s\" | sed 's/.*metric//g' | cut -d \" \" -f2", line.c_str());
    std::string metric;
    if (vorn::platform::ReadShellCommandLine(command, metric) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command);
        return "0";
    }
    while (!metric.empty() && (metric.back() == '\n' || metric.back() == ' ')) {
        metric.pop_back();
    }
    return metric;
}

// The value after word in a route line, "" when absent.
std::string WordAfter(const std::vector<std::string>& words, const char* word) {
    for (size_t i = 0; i + 1 < words.size(); ++i) {
        if (words[i] == word) {
            return words[i + 1];
        }
    }
    return "";
}

std::string ClassOf(const Json::Value& gateways, const char* key, const std::string& value,
                    const char* unknown) {
    for (const Json::Value& entry : gateways) {
        if (!value.empty() && entry[key].isString() && entry[key].asString() == value &&
            entry["class"].isString()) {
            return entry["class"].asString();
        }
    }
    return unknown;
}

Json::Value GatewayList(IP_TYPE type) {
    Json::Value request(Json::objectValue);
    request["type"] = type == IP_TYPE_V4 ? "GTYPE_V4" : "GTYPE_V6";
    Json::Value data;
    if (vornnetwork::dbus::NetClient().GetGatewayListData(request, data) != 0 || !data.isArray()) {
        VORN_LOG(LOG_ERR, "Failed to get interface data from gateway list");
        return Json::Value(Json::arrayValue);
    }
    return data;
}

bool IsShownTable(const std::string& table) {
    const std::string suffix = "-table";
    return table == "main" ||
           (table.size() > suffix.size() &&
            table.compare(table.size() - suffix.size(), suffix.size(), suffix) == 0 &&
            IsValidInterfaceName(table.substr(0, table.size() - suffix.size())));
}

int TableInfo(IP_TYPE type, const std::string& table, const Json::Value& gateways,
              Json::Value& json) {
    const std::string command = ShowCommand(type, table);
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxRouteLines) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command.c_str());
        return -1;
    }
    json = Json::Value(Json::objectValue);
    json["name"] = table;
    Json::Value& routes = json["routes"] = Json::Value(Json::arrayValue);
    for (const std::string& line : lines) {
        std::istringstream in(line);
        std::vector<std::string> words;
        for (std::string word; in >> word;) {
            words.push_back(word);
        }
        if (words.empty()) {
            continue;
        }
        Json::Value route(Json::objectValue);
        route["destination"] =
            words[0] == "default" ? (type == IP_TYPE_V4 ? "0.0.0.0" : "::") : words[0];
        const std::string gateway = WordAfter(words, "via");
        const std::string ifname = WordAfter(words, "dev");
        route["gateway"] = gateway;
        route["ifname"] = ifname;
        route["metric"] = Metric(line);
        route["class"] = ClassOf(gateways, "ifname", ifname, "unknown");
        route["gateway_class"] = ClassOf(gateways, "gateway", gateway, "-");
        routes.append(route);
    }
    return 0;
}

}  // namespace

int StaticRoute::RuleFromJson(IP_TYPE type, const Json::Value& json, StaticRouteRule& rule) {
    if (type != IP_TYPE_V4 && type != IP_TYPE_V6) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    const char* lengthKey = LengthKey(type);
    const bool shaped = json.isObject() && json["ip"].isString() && json[lengthKey].isString() &&
                        json["gateway"].isString() && json["ifname"].isString() &&
                        (json["enable"].isNull() || json["enable"].isBool());
    if (!shaped) {
        VORN_LOG(LOG_ERR, "Bad static route [%s]", json.toStyledString().c_str());
        return -1;
    }
    StaticRouteRule parsed;
    parsed.type = type;
    parsed.ip = json["ip"].asString();
    parsed.gateway = json["gateway"].asString();
    parsed.ifname = json["ifname"].asString();
    parsed.enable = json["enable"].asBool();
    const std::string length = json[lengthKey].asString();
    std::string destination;
    bool valid = IsAddressOfType(type, parsed.ip) && IsAddressOfType(type, parsed.gateway) &&
                 IsValidInterfaceName(parsed.ifname);
    if (type == IP_TYPE_V4) {
        parsed.mask = length;
        valid = valid && IsAddressOfType(type, length);
    } else {
        parsed.prefix_length = length;
        valid = valid && IsPrefixLengthOfType(type, length);
    }
    if (!valid || Destination(parsed, destination) != 0) {
        VORN_LOG(LOG_ERR, "Bad static route [%s via %s dev %s]", parsed.ip.ToCString(),
                 parsed.gateway.ToCString(), parsed.ifname.c_str());
        return -1;
    }
    rule = parsed;
    return 0;
}

int StaticRoute::AddRule(const StaticRouteRule& rule) {
    return RunRoute(rule, "add");
}

int StaticRoute::DeleteRule(const StaticRouteRule& rule) {
    return RunRoute(rule, "del");
}

bool StaticRoute::CheckRuleExist(const StaticRouteRule& rule) {
    std::string destination;
    if (Destination(rule, destination) != 0) {
        return false;
    }
    const std::string command = ShowCommand(rule.type, kStaticTable);
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxRouteLines) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command.c_str());
        return false;
    }
    const std::string wanted = KernelDestination(rule.type, destination) + " via " +
                               rule.gateway.ToString() + " dev " + rule.ifname;
    for (const std::string& line : lines) {
        if (line.find(wanted) != std::string::npos) {
            return true;
        }
    }
    return false;
}

int StaticRoute::TestRuleVaild(const StaticRouteRule& rule, Json::Value& json) {
    if (AddRule(rule) != 0 || DeleteRule(rule) != 0) {
        return -1;
    }
    std::string destination;
    if (Destination(rule, destination) != 0) {
        return -1;
    }
    char network[64] = {};
    int length = 0;
    if (destination.size() >= 64 ||
        std::sscanf(destination.c_str(), "%[^/]/%d", network, &length) != 2) {
        return -1;
    }
    json["ip"] = network;
    return 0;
}

int StaticRoute::SetRules(IP_TYPE type, const Json::Value& json) {
    const Json::Value& list = json.isObject() ? json["rules"] : Json::Value::nullSingleton();
    if (!list.isArray() || list.size() > kMaxRules) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    try {
        // Everything is checked before the table or the file changes.
        std::vector<StaticRouteRule> rules(list.size());
        for (Json::ArrayIndex i = 0; i < list.size(); ++i) {
            if (RuleFromJson(type, list[i], rules[i]) != 0) {
                return -1;
            }
        }
        if (FlushStaticTable(type) != 0) {
            return -1;
        }
        int result = 0;
        ConfigSection config(RuleFile(type));
        for (size_t i = 0; i < rules.size(); ++i) {
            const StaticRouteRule& rule = rules[i];
            if (rule.enable && AddRule(rule) != 0) {
                result = -1;
            }
            // Zero-padded so that the file's (name) order is the order given.
            char name[sizeof("route_4294967295")];
            std::snprintf(name, sizeof(name), "route_%04u", static_cast<unsigned>(i));
            config.AddKeyValue(name, "ip", rule.ip.ToString());
            config.AddKeyValue(name, LengthKey(type),
                               type == IP_TYPE_V4 ? rule.mask.ToString() : rule.prefix_length);
            config.AddKeyValue(name, "gateway", rule.gateway.ToString());
            config.AddKeyValue(name, "ifname", rule.ifname);
            config.AddKeyValue(name, "enable", rule.enable);
        }
        if (config.Write() != 0) {
            VORN_LOG(LOG_ERR, "Failed to set topology file[%s]", config.GetNameCString());
            return -1;
        }
        return result;
    } catch (const std::exception&) {
        return -1;
    }
}

int StaticRoute::GetRules(IP_TYPE type, Json::Value& json) {
    if (type != IP_TYPE_V4 && type != IP_TYPE_V6) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    json = Json::Value(Json::objectValue);
    Json::Value& list = json["rules"] = Json::Value(Json::arrayValue);
    const std::string file = RuleFile(type);
    if (QLIBCFileExist(file.c_str()) != 1) {
        return 0;
    }
    try {
        ConfigSection config(file);
        if (config.Read() != 0) {
            VORN_LOG(LOG_ERR, "Failed to read config [%s]", file.c_str());
            return -1;
        }
        for (const auto& section : config.GetKeyValues()) {
            Json::Value route = SectionToJson(type, section.second);
            StaticRouteRule rule;
            if (list.size() >= kMaxRules || RuleFromJson(type, route, rule) != 0) {
                continue;
            }
            route["active"] = CheckRuleExist(rule) ? "Enabled" : "Disabled";
            list.append(route);
        }
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

int StaticRoute::RefreshRules() {
    int result = 0;
    for (IP_TYPE type : {IP_TYPE_V4, IP_TYPE_V6}) {
        Json::Value stored;
        if (FlushStaticTable(type) != 0 || GetRules(type, stored) != 0) {
            result = -1;
            continue;
        }
        for (const Json::Value& route : stored["rules"]) {
            StaticRouteRule rule;
            if (RuleFromJson(type, route, rule) != 0 || (rule.enable && AddRule(rule) != 0)) {
                result = -1;
            }
        }
    }
    return result;
}

int StaticRoute::GetRouteTables(IP_TYPE type, Json::Value& json) {
    if (type != IP_TYPE_V4 && type != IP_TYPE_V6) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    try {
        std::vector<std::string> names = {"main", kStaticTable};
        Json::Value enabled;
        if (PolicyRoute().GetEnableTables(enabled) != 0) {
            return -1;
        }
        for (const Json::Value& table : enabled["tables"]) {
            const std::string name = table["name"].asString();
            if (table[type == IP_TYPE_V4 ? "enable" : "enable_v6"].asBool() &&
                name != kStaticTable) {
                names.push_back(name);
            }
        }
        const Json::Value gateways = GatewayList(type);
        json = Json::Value(Json::objectValue);
        Json::Value& tables = json["tables"] = Json::Value(Json::arrayValue);
        for (const std::string& name : names) {
            Json::Value info;
            if (TableInfo(type, name, gateways, info) != 0) {
                return -1;
            }
            tables.append(info);
        }
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

int StaticRoute::GetTableInfo(IP_TYPE type, const std::string& table, Json::Value& json) {
    if (type != IP_TYPE_V4 && type != IP_TYPE_V6) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    if (!IsShownTable(table)) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    try {
        return TableInfo(type, table, GatewayList(type), json);
    } catch (const std::exception&) {
        return -1;
    }
}

}  // namespace network
}  // namespace vornnetwork
