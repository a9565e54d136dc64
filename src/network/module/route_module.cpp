#include "network/module/route_module.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <initializer_list>
#include <new>

#include "network/route/policy_route.h"
#include "network/utils.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "platform/vorn_net.h"
#include "utils/config.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "utils/sdk_s.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using vornwireless::utils::ConfigSection;

constexpr int kExecFlags = 187;
constexpr const char* kIp = "/sbin/ip";
constexpr const char* kTouch = "/bin/touch";
constexpr const char* kDatabaseFile = "/etc/iproute2/config/gateway_database";
constexpr const char* kSettingsFile = "/etc/vorninfo.conf";
constexpr const char* kV4RouteCommand = "/sbin/ip route show table";
constexpr const char* kV6RouteCommand = "/sbin/ip -6 route show table";
constexpr const char* kStaticTable = "static";
// What VORNNetDefaultGatewayGet is given, and how much of the gateways the shortcut compares.
constexpr int kGatewayBuffer = 20;
// A list that large is a runaway client; it would also outgrow what the file reader accepts.
constexpr std::size_t kMaxEntries = 1024;
// A class is stored as given; only a runaway text is refused.
constexpr std::size_t kMaxClassLength = 256;
// More default routes than any table holds: output beyond it is not a count.
constexpr long kMaxDefaultRoutes = 1024;

// What differs between the two families' files.
struct Family {
    const char* priorityFile;
    const char* resolverFile;
    const char* gatewayKey;  // keys of the interface's section in the gateway database
    const char* dnsKey;
};

constexpr Family kFamilies[] = {
    {"/etc/iproute2/config/gateway_v4_priority", "/etc/iproute2/config/resolv4.conf", "gateway",
     "dns"},
    {"/etc/iproute2/config/gateway_v6_priority", "/etc/iproute2/config/resolv6.conf", "gateway_v6",
     "dns_v6"},
};

bool IsKnownType(GATEWAY_TYPE type) {
    return type == GTYPE_V4 || type == GTYPE_V6;
}

// Checked reads of request keys: scalars convert as jsoncpp converts them, anything else reads as
// absent; nothing throws.
std::string Text(const Json::Value& request, const char* key) {
    const Json::Value& value = request[key];
    return value.isConvertibleTo(Json::stringValue) ? value.asString() : std::string();
}

bool Flag(const Json::Value& request, const char* key) {
    const Json::Value& value = request[key];
    return value.isConvertibleTo(Json::booleanValue) && value.asBool();
}

bool ReadType(const Json::Value& request, GATEWAY_TYPE& type) {
    const std::string text = Text(request, "type");
    if (text == "GTYPE_V4") {
        type = GTYPE_V4;
    } else if (text == "GTYPE_V6") {
        type = GTYPE_V6;
    } else {
        return false;
    }
    return true;
}

// A line break or NUL would break the priority file apart.
bool IsClassText(const std::string& text) {
    return text.size() <= kMaxClassLength &&
           text.find_first_of(std::string("\n\r\0", 3)) == std::string::npos;
}

// An address of the request's family in its plain form, "NULL" (keep) or empty (clear).
bool IsAddressText(const Json::Value& request, const std::string& text) {
    if (text.empty() || text == "NULL") {
        return true;
    }
    unsigned char address[sizeof(in6_addr)];
    const bool ipv4 = inet_pton(AF_INET, text.c_str(), address) == 1;
    const bool ipv6 = inet_pton(AF_INET6, text.c_str(), address) == 1;
    GATEWAY_TYPE type = GTYPE_V4;
    if (!ReadType(request, type)) {
        return ipv4 || ipv6;
    }
    return type == GTYPE_V6 ? ipv6 : ipv4;
}

// Only what could do harm is refused: a name or address that reaches a command line and does not
// parse, a text that would break a file apart, a priority that is no number.
bool IsHarmlessKey(const Json::Value& request, const std::string& key) {
    const Json::Value& value = request[key];
    if (key == "ifname" || key == "interface_source" || key == "interface_destination") {
        return value.isString() && vornwireless::utils::IsValidInterfaceName(value.asString());
    }
    if (key == "priority") {
        return value.isConvertibleTo(Json::intValue);
    }
    if (key == "gateway" || key == "dns") {
        return value.isString() && IsAddressText(request, value.asString());
    }
    if (key == "class") {
        return value.isConvertibleTo(Json::stringValue) && IsClassText(value.asString());
    }
    return true;
}

// Why a request must be refused before anything changes; empty when it may run. Logged.
std::string RequestFault(const Json::Value& request, std::initializer_list<const char*> required) {
    std::string fault;
    if (!request.isObject()) {
        fault = "Invalid request";
    }
    for (auto key = required.begin(); fault.empty() && key != required.end(); ++key) {
        if (!request.isMember(*key)) {
            fault = std::string("Missing key [") + *key + "] in request";
        }
    }
    if (fault.empty()) {
        for (const std::string& key : request.getMemberNames()) {
            if (!IsHarmlessKey(request, key)) {
                fault = "Invalid key [" + key + "] in request";
                break;
            }
        }
    }
    if (!fault.empty()) {
        VORN_LOG(LOG_ERR, "%s", fault.c_str());
    }
    return fault;
}

bool IsWellFormed(const Json::Value& request, std::initializer_list<const char*> required) {
    return RequestFault(request, required).empty();
}

// The keys a method cannot do without.
std::initializer_list<const char*> RequiredKeys(const std::string& method) {
    static const std::initializer_list<const char*> kInterface = {"ifname"};
    static const std::initializer_list<const char*> kCopy = {"interface_source",
                                                             "interface_destination"};
    if (method == "ADD_GATEWAY_DATA" || method == "DEL_GATEWAY_DATA") {
        return kInterface;
    }
    if (method == "COPY_GATEWAY_DATA") {
        return kCopy;
    }
    return {};
}

// Overwrites field from the request's key unless the key is absent or "NULL".
template <typename Field>
void Merge(const Json::Value& request, const char* key, Field& field) {
    if (request.isMember(key) && Text(request, key) != "NULL") {
        field = Text(request, key);
    }
}

Json::Value ToJson(const GatewayInfo& entry, std::size_t index) {
    Json::Value object(Json::objectValue);
    object["priority"] = static_cast<Json::Int>(index);
    object["ifname"] = entry.ifname;
    object["gateway"] = entry.gateway.ToString();
    object["dns"] = entry.dns.ToString();
    object["slave"] = entry.slave;
    object["class"] = entry.class_;
    return object;
}

bool IsUsable(const GatewayInfo& entry) {
    if (entry.slave) {
        return false;
    }
    // A wireless interface has no cable to test.
    return entry.class_ != "ethernet" || entry.ifname.compare(0, 4, "wlan") == 0 ||
           IsEthernetLinkDetected(entry.ifname);
}

int InstallDefaultRoute(const GatewayInfo& entry, bool ipv6) {
    const char* gateway = entry.gateway.ToCString();
    const char* ifname = entry.ifname.c_str();
    if (!ipv6) {
        return QLIBCExecl(kIp, kExecFlags, "route", "add", "default", "via", gateway, "dev", ifname,
                          nullptr);
    }
    if (entry.gateway.ToString() == "::") {
        return QLIBCExecl(kIp, kExecFlags, "-6", "route", "add", "default", "dev", ifname, nullptr);
    }
    return QLIBCExecl(kIp, kExecFlags, "-6", "route", "add", "default", "via", gateway, "dev",
                      ifname, nullptr);
}

// The first line of a shell command's output; false, logged, when it cannot run.
bool ReadCommand(const char* format, const char* program, std::string& line) {
    char command[1024];
    std::snprintf(command, sizeof(command), format, program);
    if (vorn::platform::ReadShellCommandLine(command, line) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command);
        return false;
    }
    return true;
}

// The count at the start of a line, bounded; 0 for anything else.
long ReadCount(const std::string& line) {
    errno = 0;
    char* end = nullptr;
    const long count = std::strtol(line.c_str(), &end, 10);
    if (end == line.c_str() || errno != 0 || count < 0) {
        return 0;
    }
    return count < kMaxDefaultRoutes ? count : kMaxDefaultRoutes;
}

// Moves the entry at index to the front, keeping the order of the others.
void MoveToFront(RouteModule::GatewayList& list, std::size_t index) {
    GatewayInfo entry = list[index];
    list.erase(list.begin() + static_cast<std::ptrdiff_t>(index));
    list.insert(list.begin(), entry);
}

// Holds the module's mutex for one request.
class ModuleLock {
  public:
    explicit ModuleLock(BaseModule& module) : module_(module), locked_(module.Lock()) {}
    ~ModuleLock() {
        if (locked_) {
            module_.Unlock();
        }
    }
    ModuleLock(const ModuleLock&) = delete;
    ModuleLock& operator=(const ModuleLock&) = delete;

  private:
    BaseModule& module_;
    bool locked_;
};

}  // namespace

RouteModule::RouteModule() : BaseModule(MODULE_ROUTE) {}

BaseModule* RouteModule::Create() {
    return new (std::nothrow) RouteModule();
}

int RouteModule::ProcessRequest(const Json::Value& request, Json::Value& answer) {
    ModuleLock lock(*this);
    try {
        const std::string method = request.isObject() ? Text(request, "method") : std::string();
        std::string fault = RequestFault(request, RequiredKeys(method));
        if (fault.empty() && IsNewEntryBeyondLimit(method, request)) {
            fault = "Too many gateways";
            VORN_LOG(LOG_ERR, "%s", fault.c_str());
        }
        if (!fault.empty()) {
            // Operations that ran answer 0 whatever their result; a refused request never ran.
            answer = Json::Value(Json::objectValue);
            answer["error"] = fault;
            return -1;
        }
        Dispatch(method, request, answer);
    } catch (const std::exception& error) {
        VORN_LOG(LOG_ERR, "Failed to process request: %s", error.what());
    }
    return 0;
}

bool RouteModule::IsNewEntryBeyondLimit(const std::string& method, const Json::Value& request) {
    GATEWAY_TYPE type = GTYPE_V4;
    if (method != "ADD_GATEWAY_DATA" || !ReadType(request, type)) {
        return false;
    }
    const GatewayList& list = *SelectList(type);
    return list.size() >= kMaxEntries && Find(list, Text(request, "ifname")) == list.size();
}

void RouteModule::Dispatch(const std::string& method, const Json::Value& request,
                           Json::Value& answer) {
    if (method == "GET_GATEWAY_LIST_DATA") {
        GetGatewayListData(request, answer);
    } else if (method == "ADD_GATEWAY_DATA") {
        RunAndRefresh(&RouteModule::AddGatewayInfo, request);
    } else if (method == "DEL_GATEWAY_DATA") {
        RunAndRefresh(&RouteModule::DelGatewayInfo, request);
    } else if (method == "GET_GATEWAY_DATA_BY_INTERFACE") {
        GetGatewayDataByInterface(request, answer);
    } else if (method == "SET_SLAVE_DATA") {
        SetSlaveForGatewayInfo(request);
    } else if (method == "COPY_GATEWAY_DATA") {
        CopyGatewayData(request);
    } else if (method == "REFRESH_GATEWAY") {
        RefreshDefaultGateway(request);
    }
}

void RouteModule::RunAndRefresh(int (RouteModule::*operation)(const Json::Value&),
                                const Json::Value& request) {
    (this->*operation)(request);
    if (Flag(request, "refresh")) {
        RefreshDefaultGateway(request);
    }
}

int RouteModule::InitialModule() {
    ReadGatewayListFromFile(GTYPE_V4);
    ReadGatewayListFromFile(GTYPE_V6);
    PolicyRoute policy;
    policy.DisableTable(IP_TYPE_V4, kStaticTable);
    policy.DisableTable(IP_TYPE_V6, kStaticTable);
    policy.EnableTable(IP_TYPE_V4, kStaticTable, "all");
    policy.EnableTable(IP_TYPE_V6, kStaticTable, "all");
    return 0;
}

RouteModule::GatewayList* RouteModule::SelectList(GATEWAY_TYPE type) {
    if (type == GTYPE_V4) {
        return &gateways_v4_;
    }
    return type == GTYPE_V6 ? &gateways_v6_ : nullptr;
}

RouteModule::GatewayList* RouteModule::SelectList(const Json::Value& request,
                                                  const char* unknownText) {
    GATEWAY_TYPE type = GTYPE_V4;
    if (!ReadType(request, type)) {
        VORN_LOG(LOG_ERR, "%s", unknownText);
        return nullptr;
    }
    return SelectList(type);
}

RouteModule::GatewayList RouteModule::GetList(GATEWAY_TYPE type) const {
    if (!IsKnownType(type)) {
        return {};
    }
    return type == GTYPE_V4 ? gateways_v4_ : gateways_v6_;
}

std::size_t RouteModule::Find(const GatewayList& list, const std::string& ifname) {
    std::size_t index = 0;
    while (index < list.size() && list[index].ifname != ifname) {
        ++index;
    }
    return index;
}

int RouteModule::ReadGatewayListFromFile(GATEWAY_TYPE type) {
    GatewayList* list = SelectList(type);
    if (list == nullptr) {
        VORN_LOG(LOG_ERR, "Unknown type to read config");
        return -1;
    }
    const char* file = kFamilies[type].priorityFile;
    if (QLIBCFileExist(file) != 1) {
        return 0;
    }
    ConfigSection config(file);
    if (config.Read() != 0) {
        VORN_LOG(LOG_ERR, "Failed to read config [%s]", file);
        return -1;
    }
    // Section names come back in text order: "10" before "2". A re-read replaces the list.
    GatewayList fresh;
    for (auto& section : config.GetKeyValues()) {
        ConfigSection::Section& keys = section.second;
        if (!vornwireless::utils::IsValidInterfaceName(keys["ifname"])) {
            VORN_LOG(LOG_WARNING, "Skipped entry [%s] of [%s]: bad interface name",
                     section.first.c_str(), file);
            continue;
        }
        GatewayInfo entry;
        entry.ifname = keys["ifname"];
        entry.gateway = keys["gateway"];
        entry.dns = keys["dns"];
        entry.slave = keys["slave"] == "yes";
        entry.class_ = keys["class"];
        fresh.push_back(entry);
    }
    list->swap(fresh);
    return 0;
}

int RouteModule::WriteGatewayListToFile(GATEWAY_TYPE type) {
    const GatewayList* list = SelectList(type);
    if (list == nullptr) {
        VORN_LOG(LOG_ERR, "Unknown type to write config");
        return -1;
    }
    // A fresh file: written whole and swapped in, so no entry of the old list survives.
    const char* file = kFamilies[type].priorityFile;
    ConfigSection config(file);
    for (std::size_t index = 0; index < list->size(); ++index) {
        const GatewayInfo& entry = (*list)[index];
        const std::string section = std::to_string(index);
        config.AddKeyValue(section, "ifname", entry.ifname);
        config.AddKeyValue(section, "gateway", entry.gateway.ToString());
        config.AddKeyValue(section, "dns", entry.dns.ToString());
        config.AddKeyValue(section, "slave", entry.slave);
        config.AddKeyValue(section, "class", entry.class_);
    }
    if (config.Write() != 0) {
        VORN_LOG(LOG_ERR, "Failed to set file[%s]", file);
        return -1;
    }
    return WriteDnsFile(type) != 0 ? -1 : 0;
}

int RouteModule::WriteGatewayToDatabase(GATEWAY_TYPE type) {
    const GatewayList* list = SelectList(type);
    if (list == nullptr) {
        VORN_LOG(LOG_ERR, "Unknown type to write config");
        return -1;
    }
    if (QLIBCFileExist(kDatabaseFile) != 1) {
        QLIBCExecl(kTouch, kExecFlags, vorn::platform::RootPath(kDatabaseFile).c_str(), nullptr);
    }
    ConfigSection config(kDatabaseFile);
    if (config.Read() != 0) {
        VORN_LOG(LOG_ERR, "Failed to read config [%s]", kDatabaseFile);
        return -1;
    }
    const Family& family = kFamilies[type];
    for (const GatewayInfo& entry : *list) {
        config.AddKeyValue(entry.ifname, family.gatewayKey, entry.gateway.ToString());
        config.AddKeyValue(entry.ifname, family.dnsKey, entry.dns.ToString());
    }
    if (config.Write() != 0) {
        VORN_LOG(LOG_ERR, "Failed to set file[%s]", kDatabaseFile);
        return -1;
    }
    return 0;
}

int RouteModule::WriteDnsFile(GATEWAY_TYPE type) {
    const GatewayList* list = SelectList(type);
    if (list == nullptr) {
        VORN_LOG(LOG_ERR, "Unknown type to write config");
        return -1;
    }
    const char* file = kFamilies[type].resolverFile;
    std::string text;
    for (const GatewayInfo& entry : *list) {
        if (!entry.dns.IsEmpty()) {
            text += "nameserver " + entry.dns.ToString() + "\n";
        }
    }
    // Replaced whole: a daemon killed while writing leaves the previous resolver lines.
    if (!vorn::platform::WriteFileAtomically(vorn::platform::RootPath(file), text)) {
        VORN_LOG(LOG_ERR, "Failed to open file[%s]", file);
        return -1;
    }
    if (QLIBCFileCheckKeyValue(kSettingsFile, "dns_mode", "auto", QLIBC_FILE_IGNORE_CASE) == 1) {
        vornwireless::sdk_s::VORNNetDNSUpdate_S();
    }
    return 0;
}

int RouteModule::AddGatewayInfo(const Json::Value& request) {
    if (!IsWellFormed(request, {"ifname"})) {
        return -1;
    }
    const Json::Value& priorityValue = request["priority"];
    const int priority = priorityValue.isConvertibleTo(Json::intValue) ? priorityValue.asInt() : 0;
    GATEWAY_TYPE type = GTYPE_V4;
    if (!ReadType(request, type)) {
        VORN_LOG(LOG_ERR, "Unknown type to add info");
        return -1;
    }
    GatewayList& list = *SelectList(type);
    GatewayInfo entry;
    entry.ifname = Text(request, "ifname");
    const std::size_t index = Find(list, entry.ifname);
    if (index < list.size()) {
        entry = list[index];
        list.erase(list.begin() + static_cast<std::ptrdiff_t>(index));
    } else if (list.size() >= kMaxEntries) {
        VORN_LOG(LOG_ERR, "Too many gateways to add [%s]", entry.ifname.c_str());
        return -1;
    }
    Merge(request, "gateway", entry.gateway);
    Merge(request, "dns", entry.dns);
    Merge(request, "class", entry.class_);

    // -1: last; -2: where it stood (a new entry: last); beyond the end, negative ones included:
    // last.
    std::size_t position = index;
    if (priority != -2) {
        position = static_cast<std::size_t>(priority);
    }
    if (priority == -1 || position > list.size()) {
        position = list.size();
    }
    list.insert(list.begin() + static_cast<std::ptrdiff_t>(position), entry);

    const bool listWritten = WriteGatewayListToFile(type) == 0;
    const bool databaseWritten = WriteGatewayToDatabase(type) == 0;
    return listWritten && databaseWritten ? 0 : -1;
}

int RouteModule::DelGatewayInfo(const Json::Value& request) {
    if (!IsWellFormed(request, {"ifname"})) {
        return -1;
    }
    GATEWAY_TYPE type = GTYPE_V4;
    if (!ReadType(request, type)) {
        VORN_LOG(LOG_ERR, "Unknown type to delete info");
        return -1;
    }
    GatewayList& list = *SelectList(type);
    const std::size_t index = Find(list, Text(request, "ifname"));
    if (index < list.size()) {
        list.erase(list.begin() + static_cast<std::ptrdiff_t>(index));
    }
    return WriteGatewayListToFile(type);
}

int RouteModule::SetSlaveForGatewayInfo(const Json::Value& request) {
    if (!IsWellFormed(request, {"ifname"})) {
        return -1;
    }
    GATEWAY_TYPE type = GTYPE_V4;
    if (!ReadType(request, type)) {
        VORN_LOG(LOG_ERR, "Unknown type to get data");
        return -1;
    }
    GatewayList& list = *SelectList(type);
    const std::size_t index = Find(list, Text(request, "ifname"));
    if (index == list.size()) {
        return 0;
    }
    GatewayInfo entry = list[index];
    entry.slave = Flag(request, "slave");
    list.erase(list.begin() + static_cast<std::ptrdiff_t>(index));
    // A slave goes last: it is never chosen anyway.
    list.insert(entry.slave ? list.end() : list.begin() + static_cast<std::ptrdiff_t>(index),
                entry);
    return WriteGatewayListToFile(type);
}

int RouteModule::CopyGatewayData(const Json::Value& request) {
    if (!IsWellFormed(request, {"interface_source", "interface_destination"})) {
        return -1;
    }
    GATEWAY_TYPE type = GTYPE_V4;
    if (!ReadType(request, type)) {
        VORN_LOG(LOG_ERR, "Unknown type to get data");
        return -1;
    }
    GatewayList& list = *SelectList(type);
    const std::string destination = Text(request, "interface_destination");
    const std::size_t old = Find(list, destination);
    if (old < list.size()) {
        list.erase(list.begin() + static_cast<std::ptrdiff_t>(old));
    }
    const std::size_t source = Find(list, Text(request, "interface_source"));
    if (source < list.size()) {
        GatewayInfo copy = list[source];
        copy.ifname = destination;
        if (Flag(request, "interface_source_delete")) {
            list.erase(list.begin() + static_cast<std::ptrdiff_t>(source));
        }
        list.insert(list.begin() + static_cast<std::ptrdiff_t>(source), copy);
    }
    const bool listWritten = WriteGatewayListToFile(type) == 0;
    const bool databaseWritten = WriteGatewayToDatabase(type) == 0;
    return listWritten && databaseWritten ? 0 : -1;
}

int RouteModule::GetGatewayListData(const Json::Value& request, Json::Value& answer) {
    if (!IsWellFormed(request, {})) {
        return -1;
    }
    const GatewayList* list = SelectList(request, "Unknown type to get data");
    if (list == nullptr) {
        return -1;
    }
    answer = Json::Value(Json::arrayValue);
    for (std::size_t index = 0; index < list->size(); ++index) {
        answer.append(ToJson((*list)[index], index));
    }
    return 0;
}

int RouteModule::GetGatewayDataByInterface(const Json::Value& request, Json::Value& answer) {
    if (!IsWellFormed(request, {"ifname"})) {
        return -1;
    }
    const GatewayList* list = SelectList(request, "Unknown type to get data");
    if (list == nullptr) {
        return -1;
    }
    const std::size_t index = Find(*list, Text(request, "ifname"));
    if (index < list->size()) {
        answer = ToJson((*list)[index], index);
        answer["exist"] = true;
        return 0;
    }
    answer = Json::Value(Json::objectValue);
    answer["priority"] = -1;
    answer["gateway"] = "";
    answer["dns"] = "";
    answer["slave"] = false;
    answer["class"] = "unknown";
    answer["exist"] = false;
    return 0;
}

int RouteModule::RefreshDefaultGateway(const Json::Value& request) {
    if (!IsWellFormed(request, {})) {
        return -1;
    }
    const std::string type = Text(request, "type");
    if (type == "GTYPE_V4") {
        return RefreshDefaultGatewayV4();
    }
    if (type == "GTYPE_V6") {
        return RefreshDefaultGatewayV6();
    }
    if (type == "ALL") {
        return RefreshDefaultGatewayV4() == 0 ? RefreshDefaultGatewayV6() : -1;
    }
    VORN_LOG(LOG_ERR, "Unknown type to add info");
    return -1;
}

bool RouteModule::InstallFirstUsable(GatewayList& list, bool ipv6) {
    for (std::size_t index = 0; index < list.size(); ++index) {
        if (IsUsable(list[index]) && InstallDefaultRoute(list[index], ipv6) == 0) {
            MoveToFront(list, index);
            return true;
        }
    }
    return false;
}

int RouteModule::RefreshDefaultGatewayV4() {
    if (gateways_v4_.empty()) {
        return 0;
    }
    char current[kGatewayBuffer] = {};
    if (VORNNetDefaultGatewayGet(current, sizeof(current)) != 0) {
        VORN_LOG(LOG_ERR, "Get system gateway failed");
        return -1;
    }
    std::string device;
    if (!ReadCommand("%s main | grep default | cut -d\" \" -f5", kV4RouteCommand, device)) {
        return -1;
    }
    // The line keeps its line end, so this holds only for output without one.
    const GatewayInfo& first = gateways_v4_.front();
    if (std::strncmp(current, first.gateway.ToCString(), kGatewayBuffer) == 0 &&
        device == first.ifname && !first.slave) {
        return 0;
    }
    if (VORNNetDefaultGatewaySet(nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to delete default gateway");
        return -1;
    }
    if (!InstallFirstUsable(gateways_v4_, false)) {
        VORNNetDefaultGatewaySet(current);
    }
    return 0;
}

int RouteModule::RefreshDefaultGatewayV6() {
    if (gateways_v6_.empty()) {
        return 0;
    }
    std::string count;
    if (!ReadCommand("%s main | grep default | wc -l", kV6RouteCommand, count)) {
        return -1;
    }
    for (long i = ReadCount(count); i > 0; --i) {
        QLIBCExecl(kIp, kExecFlags, "-6", "route", "delete", "default", nullptr);
    }
    InstallFirstUsable(gateways_v6_, true);
    return 0;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
