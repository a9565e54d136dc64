#include "platform/vorn_net.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <strings.h>
#include <unistd.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <exception>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include "platform/qlibc_container.h"
#include "platform/qlibc_error.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace {

using vornwireless::utils::IsValidInterfaceName;

const char kIfcfgDir[] = "/etc/sysconfig/network-scripts";
const char kIfcfgPrefix[] = "/etc/sysconfig/network-scripts/ifcfg-";
const char kNetworkFile[] = "/etc/sysconfig/network";
const char kEventLog[] = "/var/log/vorn_event.log";
const char kResolvConf[] = "/etc/resolv.conf";
const char* const kResolverSources[] = {"/etc/iproute2/config/resolv4.conf",
                                        "/etc/iproute2/config/resolv6.conf"};
const char kIp[] = "/sbin/ip";
const char kHostDiscovery[] = "/usr/vorn/bin/fhost";
const char kHostListFile[] = "/tmp/vorncv.list.tmp";
// The program writes here first, so that readers of the list never see half of it.
const char kHostListPart[] = "/tmp/vorncv.list.tmp.part";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
// Bounds on what is read of a routing table and written per event.
constexpr size_t kMaxRouteLines = 1024;
constexpr size_t kMaxRouteLineLength = 1024;
constexpr int kMaxEventTexts = 16;
constexpr int kMaxInterfaceFiles = 256;
constexpr size_t kMaxEventTextLength = 256;

struct HashDeleter {
    void operator()(QLIBSZHASH* hash) const { QLIBCSzHashFree(hash); }
};
struct ListDeleter {
    void operator()(QLIBSZLIST* list) const { QLIBCSzListFree(list); }
};
using Hash = std::unique_ptr<QLIBSZHASH, HashDeleter>;
using List = std::unique_ptr<QLIBSZLIST, ListDeleter>;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

std::string IfcfgPath(const std::string& ifname) {
    return kIfcfgPrefix + ifname;
}

bool IsIPv4(const std::string& text) {
    in_addr parsed;
    return inet_pton(AF_INET, text.c_str(), &parsed) == 1;
}

// A fixed text field of a record: NUL-terminated within its size.
bool FieldText(const char* field, size_t size, std::string& text) {
    const size_t length = strnlen(field, size);
    if (length == size) {
        return false;
    }
    text.assign(field, length);
    return true;
}

bool CopyToField(char* field, size_t size, const std::string& text) {
    if (text.size() >= size) {
        return false;
    }
    std::memcpy(field, text.c_str(), text.size() + 1);
    return true;
}

int CopyResult(char* buffer, int size, const std::string& text) {
    return CopyToField(buffer, static_cast<size_t>(size), text) ? 0 : Fail(QLIBC_ERR_FORMAT);
}

bool IsDhcpValue(const char* bootproto) {
    return bootproto != nullptr && strcasecmp(bootproto, "dhcp") == 0;
}

// Reads the listed keys of a key=value file; null when the file cannot be read.
Hash ReadKeys(const std::string& file, std::initializer_list<const char*> keys) {
    List filter(QLIBCSzListAlloc(static_cast<int>(keys.size())));
    if (filter == nullptr) {
        return nullptr;
    }
    for (const char* key : keys) {
        QLIBCSzListAdd(filter.get(), key);
    }
    QLIBSZHASH* hash = nullptr;
    if (QLIBCFileGetKeys(file.c_str(), filter.get(), &hash, "=") < 0) {
        QLIBCSzHashFree(hash);
        return nullptr;
    }
    return Hash(hash != nullptr ? hash : QLIBCSzHashAlloc(1));
}

// An IPv4 value of an ifcfg record: absent is "", anything else must be a dotted quad that fits.
bool ReadAddressKey(const QLIBSZHASH* hash, const char* key, char* field, size_t size) {
    const char* value = QLIBCSzHashGetValue(hash, key);
    if (value == nullptr || value[0] == '\0') {
        return true;
    }
    return IsIPv4(value) && CopyToField(field, size, value);
}

// The gateway of the first "default via GW ..." line; "" when there is none.
std::string DefaultGateway(const std::vector<std::string>& routes) {
    for (const std::string& route : routes) {
        std::istringstream words(route);
        std::string first;
        std::string second;
        std::string gateway;
        if (words >> first >> second >> gateway && first == "default" && second == "via") {
            return IsIPv4(gateway) ? gateway : "";
        }
    }
    return "";
}

std::string EventTime() {
    const std::time_t now = std::time(nullptr);
    std::tm local{};
    char text[32] = {};
    if (localtime_r(&now, &local) != nullptr) {
        std::strftime(text, sizeof(text), "%Y-%m-%d %H:%M:%S", &local);
    }
    return text;
}

// One field of an event line: tabs and line ends would break the line apart.
std::string EventText(const char* text) {
    std::string field(text, strnlen(text, kMaxEventTextLength));
    for (char& c : field) {
        if (c == '\t' || c == '\n' || c == '\r') {
            c = ' ';
        }
    }
    return field;
}

bool AppendLine(const std::string& path, const std::string& line) {
    const int fd = open(vorn::platform::RootPath(path).c_str(),
                        O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0644);
    if (fd < 0) {
        return false;
    }
    // One write, so lines of concurrent writers do not interleave.
    const ssize_t written = write(fd, line.data(), line.size());
    close(fd);
    return written == static_cast<ssize_t>(line.size());
}

// Appends the lines of a resolver source not already in lines; a missing source adds nothing.
bool AddResolverLines(const char* source, std::vector<std::string>& lines) {
    std::string text;
    if (!vorn::platform::ReadTextFile(vorn::platform::RootPath(source), text)) {
        return QLIBCErrGet() == QLIBC_ERR_NOT_FOUND;
    }
    for (const std::string& line : vorn::platform::SplitLines(text)) {
        if (!line.empty() && std::find(lines.begin(), lines.end(), line) == lines.end()) {
            lines.push_back(line);
        }
    }
    return true;
}

// Starts or stops the PPPoE relay of one interface as its ifcfg file says. False on failure.
bool ApplyPPPoERelay(const std::string& ifname) {
    char value[16] = {};
    const int found =
        QLIBCFileGetKeyValue(IfcfgPath(ifname).c_str(), "PPPOE_RELAY", value, sizeof(value), 0);
    if (found < 0) {
        VORN_LOG(LOG_ERR, "Failed to read PPPOE_RELAY of [%s]", ifname.c_str());
        return false;
    }
    if (found == 0) {
        return true;
    }
    const char* action = strcmp(value, "yes") == 0 ? "start-pppoe-relay" : "stop-pppoe-relay";
    if (QLIBCExecl("/etc/rc.network", kExecFlags, action, ifname.c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to %s [%s]", action, ifname.c_str());
        return false;
    }
    return true;
}

}  // namespace

extern "C" {

int BlVORNLnxIsDHCP(const char* ifname) {
    if (ifname == nullptr || !IsValidInterfaceName(ifname)) {
        QLIBCErrSet(QLIBC_ERR_INVALID_ARG);
        return 0;
    }
    return QLIBCFileCheckKeyValue(IfcfgPath(ifname).c_str(), "BOOTPROTO", "dhcp",
                                  QLIBC_FILE_IGNORE_CASE) == 1
               ? 1
               : 0;
}

int VORNNetIFGetInfo(const char* ifname, int flags, VORN_NET_IF_CONFIG* info) {
    (void)flags;
    if (ifname == nullptr || info == nullptr || !IsValidInterfaceName(ifname)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        const Hash keys =
            ReadKeys(IfcfgPath(ifname), {"DEVICE", "BOOTPROTO", "IPADDR", "NETMASK", "GATEWAY"});
        if (keys == nullptr) {
            return -1;
        }
        VORN_NET_IF_CONFIG record;
        std::memset(&record, 0, sizeof(record));
        const char* device = QLIBCSzHashGetValue(keys.get(), "DEVICE");
        const std::string name = device != nullptr ? device : ifname;
        record.dhcp = IsDhcpValue(QLIBCSzHashGetValue(keys.get(), "BOOTPROTO")) ? 1 : 0;
        if (!IsValidInterfaceName(name) || !CopyToField(record.name, sizeof(record.name), name) ||
            !ReadAddressKey(keys.get(), "IPADDR", record.ipv4, sizeof(record.ipv4)) ||
            !ReadAddressKey(keys.get(), "NETMASK", record.netmask, sizeof(record.netmask)) ||
            !ReadAddressKey(keys.get(), "GATEWAY", record.gateway, sizeof(record.gateway))) {
            return Fail(QLIBC_ERR_FORMAT);
        }
        *info = record;
        return 0;
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNNetSetCard1(const VORN_NET_IF_CONFIG* info, int flags) {
    (void)flags;
    if (info == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        std::string name;
        std::string address[3];
        if (!FieldText(info->name, sizeof(info->name), name) || !IsValidInterfaceName(name) ||
            !FieldText(info->ipv4, sizeof(info->ipv4), address[0]) ||
            !FieldText(info->netmask, sizeof(info->netmask), address[1]) ||
            !FieldText(info->gateway, sizeof(info->gateway), address[2])) {
            return Fail(QLIBC_ERR_INVALID_ARG);
        }
        const Hash set(QLIBCSzHashAlloc(6));
        const Hash remove(QLIBCSzHashAlloc(3));
        if (set == nullptr || remove == nullptr) {
            return Fail(QLIBC_ERR_NO_MEMORY);
        }
        QLIBCSzHashSetValue(set.get(), "DEVICE", name.c_str());
        // An equivalent BOOTPROTO ("none" against "static") is left as the file has it.
        if (BlVORNLnxIsDHCP(name.c_str()) != info->dhcp) {
            QLIBCSzHashSetValue(set.get(), "BOOTPROTO", info->dhcp ? "dhcp" : "static");
        }
        const char* const keys[] = {"IPADDR", "NETMASK", "GATEWAY"};
        for (int i = 0; i < 3; ++i) {
            if (address[i].empty()) {
                QLIBCSzHashSetValue(remove.get(), keys[i], "");
            } else if (IsIPv4(address[i])) {
                QLIBCSzHashSetValue(set.get(), keys[i], address[i].c_str());
            } else {
                return Fail(QLIBC_ERR_INVALID_ARG);
            }
        }
        if (QLIBCFileSetKeys(IfcfgPath(name).c_str(), set.get(), remove.get(), 0) != 0) {
            return -1;
        }
        return QLIBCExecl("/etc/rc.network", kExecFlags, "restart-if", name.c_str(), nullptr);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNNetDefaultGatewayGet(char* buffer, int size) {
    if (buffer == nullptr || size <= 0) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        std::vector<std::string> routes;
        bool succeeded = false;
        if (vorn::platform::ReadShellCommandLines(std::string(kIp) + " -4 route show table main",
                                                  routes, kMaxRouteLines, kMaxRouteLineLength,
                                                  &succeeded) != 0 ||
            !succeeded) {
            return Fail(QLIBC_ERR_EXEC);
        }
        return CopyResult(buffer, size, DefaultGateway(routes));
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNNetDefaultGatewaySet(const char* gateway) {
    if (gateway == nullptr || gateway[0] == '\0') {
        char current[20] = {};
        if (VORNNetDefaultGatewayGet(current, sizeof(current)) != 0) {
            return -1;
        }
        if (current[0] == '\0') {
            return 0;
        }
        return QLIBCExecl(kIp, kExecFlags, "-4", "route", "del", "default", nullptr);
    }
    if (!IsIPv4(gateway)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    return QLIBCExecl(kIp, kExecFlags, "-4", "route", "replace", "default", "via", gateway,
                      nullptr);
}

int VORNNetDefaultGatewayGetConf(char* buffer, int size) {
    if (buffer == nullptr || size <= 0) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    buffer[0] = '\0';
    if (QLIBCFileExist(kNetworkFile) != 1) {
        return 0;
    }
    char value[64] = {};
    if (QLIBCFileGetKeyValue(kNetworkFile, "GATEWAY", value, sizeof(value), 0) < 0) {
        return -1;
    }
    if (value[0] != '\0' && !IsIPv4(value)) {
        return Fail(QLIBC_ERR_FORMAT);
    }
    return CopyResult(buffer, size, value);
}

int VORNNetDefaultGatewaySetConf(const char* gateway) {
    const bool unset = gateway == nullptr || gateway[0] == '\0';
    if (!unset && !IsIPv4(gateway)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const Hash change(QLIBCSzHashAlloc(1));
    if (change == nullptr ||
        QLIBCSzHashSetValue(change.get(), "GATEWAY", unset ? "" : gateway) != 0) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
    return QLIBCFileSetKeys(kNetworkFile, unset ? nullptr : change.get(),
                            unset ? change.get() : nullptr, 0);
}

int VORNNetDNSUpdate(void) {
    try {
        std::vector<std::string> lines;
        for (const char* source : kResolverSources) {
            if (!AddResolverLines(source, lines)) {
                return -1;
            }
        }
        std::string content;
        for (const std::string& line : lines) {
            content += line + "\n";
        }
        return vorn::platform::WriteFileAtomically(vorn::platform::RootPath(kResolvConf), content)
                   ? 0
                   : -1;
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNLogSet1(int level, int category, unsigned int code, ...) {
    const char* texts[kMaxEventTexts] = {};
    va_list list;
    va_start(list, code);
    for (int i = 0; i < kMaxEventTexts; ++i) {
        texts[i] = va_arg(list, const char*);
        if (texts[i] == nullptr) {
            break;
        }
    }
    va_end(list);
    try {
        char head[64];
        std::snprintf(head, sizeof(head), "\t%d\t%d\t0x%08X", level, category, code);
        std::string line = EventTime() + head;
        for (int i = 0; i < kMaxEventTexts && texts[i] != nullptr; ++i) {
            line += "\t" + EventText(texts[i]);
        }
        return AppendLine(kEventLog, line + "\n") ? 0 : Fail(QLIBC_ERR_FILE_IO);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNFHOSTDumpHost(void) {
    if (QLIBCFileExist(kHostDiscovery) != 1) {
        VORN_LOG(LOG_ERR, "No host discovery program [%s]", kHostDiscovery);
        return Fail(QLIBC_ERR_NOT_FOUND);
    }
    try {
        const std::string part = vorn::platform::RootPath(kHostListPart);
        if (QLIBCExecl(kHostDiscovery, kExecFlags, "--dump", part.c_str(), nullptr) != 0) {
            QLIBCSysUnlink(kHostListPart);
            return Fail(QLIBC_ERR_EXEC);
        }
        return QLIBCSysRename(kHostListPart, kHostListFile);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

}  // extern "C"

namespace {

bool IsYes(const QLIBSZHASH* keys, const char* key) {
    const char* value = QLIBCSzHashGetValue(keys, key);
    return value != nullptr && strcasecmp(value, "yes") == 0;
}

// dhclient's "-S": information request only, the addresses come from autoconfiguration.
bool AsksStatelessDhcp(const char* options) {
    std::istringstream words(options != nullptr ? options : "");
    std::string word;
    while (words >> word) {
        if (word == "-S") {
            return true;
        }
    }
    return false;
}

int IPv6Type(const QLIBSZHASH* keys) {
    if (!IsYes(keys, "IPV6INIT")) {
        return VORN_NET_IPV6_TYPE_OFF;
    }
    if (IsYes(keys, "IPV6FORWARDING")) {
        return VORN_NET_IPV6_TYPE_ROUTER;
    }
    const char* address = QLIBCSzHashGetValue(keys, "IPV6ADDR");
    const bool automatic = IsYes(keys, "IPV6_AUTOCONF") || IsYes(keys, "DHCPV6C");
    return address != nullptr && address[0] != '\0' && !automatic ? VORN_NET_IPV6_TYPE_STATIC
                                                                  : VORN_NET_IPV6_TYPE_AUTO;
}

int IPv6Mode(const QLIBSZHASH* keys) {
    if (!IsYes(keys, "DHCPV6C")) {
        return VORN_NET_IPV6_MODE_AUTOCONF;
    }
    return AsksStatelessDhcp(QLIBCSzHashGetValue(keys, "DHCPV6C_OPTIONS"))
               ? VORN_NET_IPV6_MODE_OTHER
               : VORN_NET_IPV6_MODE_MANAGED;
}

bool IsIPv6Mode(int mode) {
    return mode == VORN_NET_IPV6_MODE_AUTOCONF || mode == VORN_NET_IPV6_MODE_MANAGED ||
           mode == VORN_NET_IPV6_MODE_OTHER;
}

}  // namespace

extern "C" {

int VORNNetIPv6ConfGet(const char* ifname, VORN_NET_IPV6_CONFIG* config) {
    if (ifname == nullptr || config == nullptr || !IsValidInterfaceName(ifname)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        const Hash keys =
            ReadKeys(IfcfgPath(ifname), {"IPV6INIT", "IPV6FORWARDING", "IPV6ADDR", "IPV6_AUTOCONF",
                                         "DHCPV6C", "DHCPV6C_OPTIONS"});
        if (keys == nullptr) {
            return -1;
        }
        config->type = IPv6Type(keys.get());
        config->mode = IPv6Mode(keys.get());
        return 0;
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNNetIPv6ConfSet(int mode, const char* ifname, int reserved1, int reserved2, int reserved3) {
    (void)reserved1;
    (void)reserved2;
    (void)reserved3;
    if (ifname == nullptr || !IsValidInterfaceName(ifname) || !IsIPv6Mode(mode)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        const std::string file = IfcfgPath(ifname);
        if (QLIBCFileExist(file.c_str()) != 1) {
            return Fail(QLIBC_ERR_NOT_FOUND);
        }
        const Hash set(QLIBCSzHashAlloc(3));
        const Hash remove(QLIBCSzHashAlloc(1));
        if (set == nullptr || remove == nullptr) {
            return Fail(QLIBC_ERR_NO_MEMORY);
        }
        QLIBCSzHashSetValue(set.get(), "IPV6_AUTOCONF",
                            mode == VORN_NET_IPV6_MODE_MANAGED ? "no" : "yes");
        QLIBCSzHashSetValue(set.get(), "DHCPV6C",
                            mode == VORN_NET_IPV6_MODE_AUTOCONF ? "no" : "yes");
        if (mode == VORN_NET_IPV6_MODE_OTHER) {
            QLIBCSzHashSetValue(set.get(), "DHCPV6C_OPTIONS", "-S");
        } else {
            QLIBCSzHashSetValue(remove.get(), "DHCPV6C_OPTIONS", "");
        }
        if (QLIBCFileSetKeys(file.c_str(), set.get(), remove.get(), 0) != 0) {
            return -1;
        }
        return QLIBCExecl("/etc/rc.network", kExecFlags, "ipv6-restart", ifname, nullptr);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNNetApplyPPPoERelayConfigAll(void) {
    try {
        QLIBSZLIST* raw = nullptr;
        const int count = QLIBCFileEnumDir(kIfcfgDir, "ifcfg-", kMaxInterfaceFiles, &raw);
        const List files(raw);
        if (count < 0) {
            return -1;
        }
        bool applied = true;
        for (int i = 0; i < count; ++i) {
            const std::string ifname = QLIBCSzListGet(files.get(), i) + strlen("ifcfg-");
            if (!IsValidInterfaceName(ifname)) {
                VORN_LOG(LOG_WARNING, "Skipped [%s/ifcfg-%s]: not an interface name", kIfcfgDir,
                         ifname.c_str());
                continue;
            }
            applied = ApplyPPPoERelay(ifname) && applied;
        }
        return applied ? 0 : Fail(QLIBC_ERR_EXEC);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

}  // extern "C"
