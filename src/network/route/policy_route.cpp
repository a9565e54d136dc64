#include "network/route/policy_route.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <sstream>

#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/qlibc_str.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "utils/config.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace {

using vornwireless::utils::ConfigSection;
using vornwireless::utils::IsValidInterfaceName;

const char kConfigDir[] = "/etc/iproute2/config/";
const char kMultiTableConfig[] = "/etc/iproute2/config/multi_table_config";
const char kRtTables[] = "/etc/iproute2/rt_tables";
const char kIp[] = "/sbin/ip";
const char kTouch[] = "/bin/touch";
const char kTableSuffix[] = "-table";
const char kStaticTable[] = "static-table";
constexpr int kStaticTableId = 2;
constexpr int kExecFlags = 187;
// "-4" route add to D via G dev I table T: the longest command these files make.
constexpr size_t kMaxIpWords = 12;
constexpr size_t kMaxSources = 64;
constexpr long kMaxTableId = 0x7fffffff;

bool IsValidType(IP_TYPE type) {
    return type == IP_TYPE_V4 || type == IP_TYPE_V6;
}

bool IsDecimal(const std::string& text, size_t maxDigits) {
    if (text.empty() || text.size() > maxDigits) {
        return false;
    }
    for (char c : text) {
        if (c < '0' || c > '9') {
            return false;
        }
    }
    return true;
}

// A table id read from multi_table_config, or -1.
long TableId(const std::string& text) {
    if (!IsDecimal(text, 10)) {
        return -1;
    }
    const long id = std::strtol(text.c_str(), nullptr, 10);
    return id <= kMaxTableId ? id : -1;
}

// "eth0-table" whose owner is a valid interface name (or "static").
bool IsValidTableName(const std::string& table) {
    const size_t suffix = sizeof(kTableSuffix) - 1;
    return table.size() > suffix &&
           table.compare(table.size() - suffix, suffix, kTableSuffix) == 0 &&
           IsValidInterfaceName(table.substr(0, table.size() - suffix));
}

// A section name that reads back from a rule file and names nothing else.
bool IsValidRuleName(const std::string& name) {
    if (name.empty() || name.size() > 64) {
        return false;
    }
    for (char c : name) {
        const bool safe = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                          (c >= '0' && c <= '9') || c == '-' || c == '_' || c == '.';
        if (!safe) {
            return false;
        }
    }
    return true;
}

// "all", an address or a network (address/length) of the family.
bool IsValidSource(IP_TYPE type, const std::string& source) {
    if (source == "all") {
        return true;
    }
    const size_t slash = source.find('/');
    if (slash == std::string::npos) {
        return IsAddressOfType(type, source);
    }
    return IsAddressOfType(type, source.substr(0, slash)) &&
           IsPrefixLengthOfType(type, source.substr(slash + 1));
}

std::vector<std::string> SplitSources(const std::string& list) {
    std::vector<std::string> sources;
    std::istringstream in(list);
    std::string source;
    while (std::getline(in, source, ',')) {
        if (!source.empty()) {
            sources.push_back(source);
        }
    }
    return sources;
}

// The listed sources followed by the added ones not yet listed: enabling again lists nothing twice.
std::string WithSources(const std::string& listed, const std::string& added) {
    std::string list = listed;
    std::vector<std::string> known = SplitSources(listed);
    for (const std::string& source : SplitSources(added)) {
        if (std::find(known.begin(), known.end(), source) == known.end()) {
            list += (list.empty() ? "" : ",") + source;
            known.push_back(source);
        }
    }
    return list;
}

const char* EnableKey(IP_TYPE type) {
    return type == IP_TYPE_V4 ? "enable" : "enable_v6";
}

const char* SourceKey(IP_TYPE type) {
    return type == IP_TYPE_V4 ? "source" : "source_v6";
}

std::string Value(const ConfigSection::Section& section, const char* key) {
    const auto found = section.find(key);
    return found != section.end() ? found->second : "";
}

int TouchWhenMissing(const std::string& file) {
    if (QLIBCFileExist(file.c_str()) == 1) {
        return 0;
    }
    return QLIBCExecl(kTouch, kExecFlags, vorn::platform::RootPath(file).c_str(),
                      static_cast<char*>(nullptr));
}

int ReadConfig(ConfigSection& config) {
    if (config.Read() != 0) {
        VORN_LOG(LOG_ERR, "Failed to read config [%s]", config.GetNameCString());
        return -1;
    }
    return 0;
}

int WriteConfig(ConfigSection& config) {
    if (config.Write() != 0) {
        VORN_LOG(LOG_ERR, "Failed to set topology file[%s]", config.GetNameCString());
        return -1;
    }
    return 0;
}

// The id and the valid sources of a table's family, for its lookup rules. A source that is not an
// address (a hand-edited file) is skipped, so that the others can still be set and removed.
int ReadLookupRule(IP_TYPE type, const std::string& table, std::string& id,
                   std::vector<std::string>& sources) {
    if (QLIBCFileExist(kMultiTableConfig) != 1) {
        VORN_LOG(LOG_ERR, "File [%s] doesn't exist.", kMultiTableConfig);
        return -1;
    }
    ConfigSection config(kMultiTableConfig);
    if (ReadConfig(config) != 0) {
        return -1;
    }
    if (!config.Find(table)) {
        VORN_LOG(LOG_ERR, "Can't find [%s] in file [%s].", table.c_str(), kMultiTableConfig);
        return -1;
    }
    const ConfigSection::Section section = config.GetKeyValues()[table];
    id = Value(section, "id");
    if (TableId(id) < 0) {
        VORN_LOG(LOG_ERR, "Invalid table [%s] in [%s]", table.c_str(), kMultiTableConfig);
        return -1;
    }
    sources.clear();
    for (const std::string& source : SplitSources(Value(section, SourceKey(type)))) {
        if (IsValidSource(type, source)) {
            sources.push_back(source);
        } else {
            VORN_LOG(LOG_WARNING, "Invalid source [%s] of [%s]", source.c_str(), table.c_str());
        }
    }
    return 0;
}

// The table a rule file fills: the file name without its "-rule" ending, so that the rules of
// "static" land in "static-table" whatever device they name.
std::string TableOfRuleFile(IP_TYPE type, const std::string& ruleFile) {
    const std::string base = ruleFile.substr(ruleFile.rfind('/') + 1);
    const std::string ending = type == IP_TYPE_V4 ? "-rule" : "-rule-v6";
    if (base.size() <= ending.size() ||
        base.compare(base.size() - ending.size(), ending.size(), ending) != 0) {
        return "";
    }
    return base.substr(0, base.size() - ending.size());
}

// The route of one rule file section: the ip words after "add"; false when a value is invalid.
bool RouteWords(IP_TYPE type, const ConfigSection::Section& section, const std::string& table,
                std::vector<std::string>& words) {
    const std::string ifname = Value(section, "ifname");
    const std::string ip = Value(section, "ip");
    const std::string gateway = Value(section, "gateway");
    if (!IsValidInterfaceName(ifname) || !IsAddressOfType(type, gateway)) {
        return false;
    }
    std::string destination = "default";
    if (!ip.empty()) {
        if (type == IP_TYPE_V4) {
            if (GetSubnetFormat(ip, Value(section, "mask"), destination) != 0) {
                return false;
            }
        } else {
            const std::string length = Value(section, "prefix_length");
            if (!IsAddressOfType(type, ip) || !IsPrefixLengthOfType(type, length)) {
                return false;
            }
            destination = ip + "/" + length;
        }
    }
    words = {"route", "add"};
    if (destination != "default") {
        words.push_back("to");
    }
    words.insert(words.end(), {destination, "via", gateway, "dev", ifname, "table", table});
    return true;
}

// rt_tables lists exactly the tables enabled for either family; whatever it held before goes.
int WriteRtTables(const ConfigSection& config) {
    FILE* file = std::fopen(vorn::platform::RootPath(kRtTables).c_str(), "we");
    if (file == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to open file[%s]", kRtTables);
        return -1;
    }
    for (const auto& section : config.GetKeyValues()) {
        const long id = TableId(Value(section.second, "id"));
        const bool enabled =
            Value(section.second, "enable") == "yes" || Value(section.second, "enable_v6") == "yes";
        if (enabled && id >= 0 && IsValidTableName(section.first)) {
            std::fprintf(file, "%ld %s\n", id, section.first.c_str());
        }
    }
    if (std::fclose(file) != 0) {
        VORN_LOG(LOG_ERR, "Failed to open file[%s]", kRtTables);
        return -1;
    }
    return 0;
}

}  // namespace

bool IsAddressOfType(IP_TYPE type, const std::string& text) {
    unsigned char buffer[sizeof(in6_addr)];
    if (!IsValidType(type) || text.empty() || text.size() >= INET6_ADDRSTRLEN) {
        return false;
    }
    return inet_pton(type == IP_TYPE_V4 ? AF_INET : AF_INET6, text.c_str(), buffer) == 1;
}

bool IsPrefixLengthOfType(IP_TYPE type, const std::string& text) {
    if (!IsValidType(type) || !IsDecimal(text, 3)) {
        return false;
    }
    return std::atoi(text.c_str()) <= (type == IP_TYPE_V4 ? 32 : 128);
}

std::string RuleFilePath(IP_TYPE type, const std::string& ifname) {
    return kConfigDir + ifname + kTableSuffix + (type == IP_TYPE_V4 ? "-rule" : "-rule-v6");
}

int RunIpCommand(IP_TYPE type, const std::vector<std::string>& words, std::string& command) {
    if (!IsValidType(type)) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    const char* family = type == IP_TYPE_V4 ? "-4" : "-6";
    command = std::string(kIp) + " " + family;
    const char* argv[kMaxIpWords + 1] = {};
    argv[0] = family;
    if (words.size() + 1 > kMaxIpWords) {
        return -1;
    }
    for (size_t i = 0; i < words.size(); ++i) {
        argv[i + 1] = words[i].c_str();
        command += " " + words[i];
    }
    // Unused places are null and end the argument list early.
    return QLIBCExecl(kIp, kExecFlags, argv[0], argv[1], argv[2], argv[3], argv[4], argv[5],
                      argv[6], argv[7], argv[8], argv[9], argv[10], argv[11],
                      static_cast<char*>(nullptr));
}

int FlushRouteTable(IP_TYPE type, const std::string& table, const char* logFormat) {
    std::string command;
    if (RunIpCommand(type, {"route", "flush", "table", table}, command) == 0) {
        return 0;
    }
    std::vector<std::string> shown;
    const std::string show = std::string(kIp) + (type == IP_TYPE_V4 ? " -4" : " -6") +
                             " route show table " + table + " 2>&1";
    if (vorn::platform::ReadShellCommandLines(show, shown, 2) == 0 &&
        (shown.empty() || shown[0].find("table does not exist") != std::string::npos)) {
        return 0;
    }
    VORN_LOG(LOG_ERR, logFormat, command.c_str());
    return -1;
}

int GetSubnetFormat(const std::string& ip, const std::string& mask, std::string& out) {
    const std::string ipMask = ip + "/" + mask;
    char subnet[INET_ADDRSTRLEN + 4] = {};
    if (ErrQLIBIpMaskToSubnet(ipMask.c_str(), subnet, sizeof(subnet)) != 0) {
        VORN_LOG(LOG_ERR, "Failed to translate to ip/mask format to a subnet format.");
        return -1;
    }
    out = subnet;
    return 0;
}

PolicyRoute::PolicyRoute() {
    InitMaxID();
}

int PolicyRoute::InitMaxID() {
    if (QLIBCFileExist(kMultiTableConfig) != 1) {
        max_id_ = kStaticTableId;
        return 0;
    }
    try {
        ConfigSection config(kMultiTableConfig);
        if (ReadConfig(config) != 0) {
            return -1;
        }
        long highest = 0;
        for (const auto& section : config.GetKeyValues()) {
            const long id = TableId(Value(section.second, "id"));
            highest = id > highest ? id : highest;
        }
        max_id_ = static_cast<int>(highest);
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

int PolicyRoute::AddRule(const PolicyRouteRule& rule) {
    if (!IsValidType(rule.type)) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    const bool v4 = rule.type == IP_TYPE_V4;
    const bool destinationValid =
        rule.ip.IsEmpty() || (IsAddressOfType(rule.type, rule.ip) &&
                              (v4 ? IsAddressOfType(rule.type, rule.mask)
                                  : IsPrefixLengthOfType(rule.type, rule.prefix_length)));
    if (!IsValidInterfaceName(rule.ifname) || !IsValidRuleName(rule.name) || !destinationValid ||
        !IsAddressOfType(rule.type, rule.gateway)) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    try {
        ConfigSection config(RuleFilePath(rule.type, rule.ifname));
        if (TouchWhenMissing(config.GetNameString()) != 0 || ReadConfig(config) != 0) {
            VORN_LOG(LOG_ERR, "Failed to read config [%s]", config.GetNameCString());
            return -1;
        }
        config.DeleteSection(rule.name);
        config.AddKeyValue(rule.name, "ifname", rule.ifname);
        config.AddKeyValue(rule.name, "ip", rule.ip.ToString());
        if (v4) {
            config.AddKeyValue(rule.name, "mask", rule.mask.ToString());
        } else {
            config.AddKeyValue(rule.name, "prefix_length", rule.prefix_length);
        }
        config.AddKeyValue(rule.name, "gateway", rule.gateway.ToString());
        return WriteConfig(config);
    } catch (const std::exception&) {
        return -1;
    }
}

int PolicyRoute::DeleteRule(IP_TYPE type, const std::string& ifname, const std::string& name) {
    if (!IsValidType(type)) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    if (!IsValidInterfaceName(ifname) || !IsValidRuleName(name)) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    try {
        ConfigSection config(RuleFilePath(type, ifname));
        if (ReadConfig(config) != 0) {
            return -1;
        }
        config.DeleteSection(name);
        return WriteConfig(config);
    } catch (const std::exception&) {
        return -1;
    }
}

bool PolicyRoute::IsRulesEmpty(const std::string& file) {
    try {
        ConfigSection config(file);
        if (ReadConfig(config) != 0) {
            return true;
        }
        return config.Empty();
    } catch (const std::exception&) {
        return true;
    }
}

int PolicyRoute::EnableTable(IP_TYPE type, const std::string& ifname, const std::string& source) {
    if (ifname.empty() || source.empty()) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    if (!IsValidType(type)) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    const std::vector<std::string> sources = SplitSources(source);
    bool sourcesValid = !sources.empty() && sources.size() <= kMaxSources;
    for (const std::string& each : sources) {
        sourcesValid = sourcesValid && IsValidSource(type, each);
    }
    if (!IsValidInterfaceName(ifname) || !sourcesValid) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    const std::string table = ifname + kTableSuffix;
    const std::string ruleFile = RuleFilePath(type, ifname);
    if (table != kStaticTable && IsRulesEmpty(ruleFile)) {
        return 0;
    }
    if (ConfigWrite(type, table, source, true) != 0 || SetTableLookupRule(type, table) != 0 ||
        SetTableRouteRule(type, ruleFile) != 0) {
        return -1;
    }
    return 0;
}

int PolicyRoute::DisableTable(IP_TYPE type, const std::string& ifname) {
    if (!IsValidInterfaceName(ifname)) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    const std::string table = ifname + kTableSuffix;
    // Flushing needs the table's name in rt_tables, so it comes before the config drops it; a
    // table that was never enabled fails to flush but is still recorded as disabled.
    const int routes = FlushTableRule(type, table);
    const int rules = FlushTableLookupRule(type, table);
    const int config = ConfigWrite(type, table, "", false);
    return routes == 0 && rules == 0 && config == 0 ? 0 : -1;
}

int PolicyRoute::GetEnableTables(Json::Value& json) {
    json = Json::Value(Json::objectValue);
    Json::Value& tables = json["tables"] = Json::Value(Json::arrayValue);
    if (QLIBCFileExist(kMultiTableConfig) != 1) {
        return 0;
    }
    try {
        ConfigSection config(kMultiTableConfig);
        if (ReadConfig(config) != 0) {
            return -1;
        }
        for (const auto& section : config.GetKeyValues()) {
            const bool v4 = Value(section.second, "enable") == "yes";
            const bool v6 = Value(section.second, "enable_v6") == "yes";
            const long id = TableId(Value(section.second, "id"));
            if ((!v4 && !v6) || !IsValidTableName(section.first) || id < 0) {
                continue;
            }
            Json::Value table(Json::objectValue);
            table["name"] = section.first;
            table["id"] = static_cast<Json::Int>(id);
            table["ifname"] =
                section.first.substr(0, section.first.size() - sizeof(kTableSuffix) + 1);
            table["enable"] = v4;
            table["enable_v6"] = v6;
            for (IP_TYPE type : {IP_TYPE_V4, IP_TYPE_V6}) {
                Json::Value& list = table[SourceKey(type)] = Json::Value(Json::arrayValue);
                for (const std::string& source :
                     SplitSources(Value(section.second, SourceKey(type)))) {
                    if (IsValidSource(type, source)) {
                        list.append(source);
                    }
                }
            }
            tables.append(table);
        }
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

int PolicyRoute::FlushTableRule(IP_TYPE type, const std::string& table) {
    if (!IsValidTableName(table)) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    return FlushRouteTable(type, table, "Failed to execute command [%s]");
}

int PolicyRoute::FlushTableLookupRule(IP_TYPE type, const std::string& table) {
    try {
        std::string id;
        std::vector<std::string> sources;
        if (ReadLookupRule(type, table, id, sources) != 0) {
            return -1;
        }
        for (const std::string& source : sources) {
            std::string command;
            // A rule already gone is what is wanted.
            RunIpCommand(type, {"rule", "delete", "from", source, "lookup", table}, command);
        }
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

int PolicyRoute::SetTableLookupRule(IP_TYPE type, const std::string& table) {
    try {
        std::string id;
        std::vector<std::string> sources;
        if (ReadLookupRule(type, table, id, sources) != 0) {
            return -1;
        }
        for (const std::string& source : sources) {
            std::string command;
            // Deleted first so that enabling again leaves one rule per source.
            RunIpCommand(type, {"rule", "delete", "from", source, "lookup", table}, command);
            if (RunIpCommand(type, {"rule", "add", "from", source, "lookup", table, "priority", id},
                             command) != 0) {
                VORN_LOG(LOG_ERR, "Failed to execute command [%s]", command.c_str());
                return -1;
            }
        }
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

int PolicyRoute::SetTableRouteRule(IP_TYPE type, const std::string& ruleFile) {
    const std::string table = TableOfRuleFile(type, ruleFile);
    if (!IsValidType(type) || !IsValidTableName(table)) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    // No file yet means no routes (the static table before its first route).
    if (QLIBCFileExist(ruleFile.c_str()) != 1) {
        return 0;
    }
    try {
        ConfigSection config(ruleFile);
        if (ReadConfig(config) != 0) {
            return -1;
        }
        for (const auto& section : config.GetKeyValues()) {
            // Static routes carry "enable"; a disabled one stays out of the table.
            const auto enable = section.second.find("enable");
            if (enable != section.second.end() && enable->second != "yes") {
                continue;
            }
            std::vector<std::string> words;
            if (!RouteWords(type, section.second, table, words)) {
                VORN_LOG(LOG_ERR, "Invalid rule [%s] in [%s]", section.first.c_str(),
                         ruleFile.c_str());
                return -1;
            }
            std::string command;
            if (RunIpCommand(type, words, command) == 0) {
                continue;
            }
            if (words[2] == "default") {
                VORN_LOG(LOG_DEBUG, "Failed to execute command [%s]", command.c_str());
            } else {
                VORN_LOG(LOG_ERR, "Failed to execute command [%s]", command.c_str());
                return -1;
            }
        }
        return 0;
    } catch (const std::exception&) {
        return -1;
    }
}

int PolicyRoute::ConfigWrite(IP_TYPE type, const std::string& table, const std::string& source,
                             bool enable) {
    if (!IsValidType(type)) {
        VORN_LOG(LOG_ERR, "unknown type for IP format");
        return -1;
    }
    if (!IsValidTableName(table)) {
        VORN_LOG(LOG_ERR, "Bad parameter.");
        return -1;
    }
    try {
        ConfigSection config(kMultiTableConfig);
        if (TouchWhenMissing(kMultiTableConfig) != 0 || ReadConfig(config) != 0) {
            return -1;
        }
        std::string sources;
        if (config.Find(table)) {
            sources = config.GetKeyValue(table, SourceKey(type));
        } else {
            config.AddKeyValue(table, "id", table == kStaticTable ? kStaticTableId : ++max_id_);
        }
        if (enable) {
            sources = WithSources(sources, source);
            if (SplitSources(sources).size() > kMaxSources) {
                VORN_LOG(LOG_ERR, "Too many sources for [%s]", table.c_str());
                return -1;
            }
        } else {
            sources.clear();
        }
        config.AddKeyValue(table, EnableKey(type), enable);
        config.AddKeyValue(table, SourceKey(type), sources);
        if (WriteConfig(config) != 0) {
            return -1;
        }
        return WriteRtTables(config);
    } catch (const std::exception&) {
        return -1;
    }
}

}  // namespace network
}  // namespace vornnetwork
