#include "network/module/arpscanner.h"

#include <arpa/inet.h>

#include <cerrno>
#include <cstring>
#include <exception>
#include <sstream>
#include <vector>

#include "platform/qlib_net.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "utils/mac_address.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

constexpr const char* kArpCommand = "/sbin/arp -a";
// The largest neighbour table the appliance keeps.
constexpr std::size_t kMaxArpLines = 4096;
constexpr const char* kLeaseFile = "/etc/dhcpd/dhcpd.conf.leases";
constexpr const char* kNmbLookup = "/usr/vorn/bin/nmblookup -A ";
constexpr const char* kNmbFilter =
    " | /bin/grep ACTIVE | /bin/grep -v GROUP | /usr/bin/awk {'print $1'} | /usr/bin/uniq";
constexpr int kRouterTopology = 3;
constexpr int kLocalNetworkTopology = 1;  // codes above it serve a local network
constexpr const char* kBridgeMark = "br";
constexpr const char* kUnknownName = "?";
constexpr const char* kNoLeaseName = "*";  // how dnsmasq marks a lease without a host name

bool IsIPv4(const std::string& text) {
    in_addr parsed;
    // inet_pton would stop at a NUL and pass whatever follows it.
    return text.find('\0') == std::string::npos && inet_pton(AF_INET, text.c_str(), &parsed) == 1;
}

bool IsColonMac(const std::string& text) {
    const vornwireless::utils::MacAddress mac(text);
    return mac.IsFormalized() && mac.ToString() == text;
}

std::string WithoutParentheses(const std::string& text) {
    if (text.size() < 2 || text.front() != '(' || text.back() != ')') {
        return text;
    }
    return text.substr(1, text.size() - 2);
}

}  // namespace

std::atomic<bool> ArpScanner::scanning_(false);

ArpScanner* ArpScanner::Inst() {
    static ArpScanner* const instance = new ArpScanner();
    return instance;
}

Json::Value ArpScanner::GetData() {
    UpdateArpTabe();
    return GetFinishedList();
}

void ArpScanner::UpdateArpTabe() {
    if (scanning_.exchange(true)) {
        return;
    }
    EraseList();
    if (pthread_create(&thread, nullptr, WaitProcessFinish, nullptr) != 0) {
        VORN_LOG(LOG_ERR, "failed to create thread");
        scanning_ = false;
    }
}

void* ArpScanner::WaitProcessFinish(void*) {
    try {
        if (Inst()->GetArpTable() < 0) {
            VORN_LOG(LOG_ERR, "Error on get arp table");
        }
    } catch (const std::exception&) {
        VORN_LOG(LOG_ERR, "Error on get arp table");
    }
    Inst()->PublishScan();
    pthread_detach(pthread_self());
    scanning_ = false;
    return nullptr;
}

int ArpScanner::GetArpTable() {
    topology = QLIBNetTopologyGet(0);
    if (topology <= kLocalNetworkTopology) {
        return 0;
    }
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(kArpCommand, lines, kMaxArpLines) != 0) {
        const int error = errno;
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s], error(%d):(%s)", kArpCommand, error,
                 std::strerror(error));
        return -1;
    }
    for (const std::string& line : lines) {
        AppendClientList(line);
    }
    return 0;
}

int ArpScanner::ParseArpLine(const std::string& line, ArpEntry& entry) {
    std::istringstream words(line);
    std::string at, hardwareType, on;
    words >> entry.name >> entry.ip >> at >> entry.mac >> hardwareType >> on >> entry.ifname;
    if (entry.ifname.find(kBridgeMark) == std::string::npos) {
        return 0;
    }
    entry.ip = WithoutParentheses(entry.ip);
    if (!IsIPv4(entry.ip) || !IsColonMac(entry.mac) ||
        !vornwireless::utils::IsValidInterfaceName(entry.ifname)) {
        VORN_LOG(LOG_WARNING, "Skip arp entry with a bad address or interface [%s]", line.c_str());
        return -1;
    }
    return 1;
}

int ArpScanner::AppendClientList(const std::string& line) {
    ArpEntry entry;
    const int parsed = ParseArpLine(line, entry);
    if (parsed <= 0) {
        return parsed;
    }
    std::string& name = entry.name;
    if (topology == kRouterTopology) {
        GetDHCPInfoByMAC(entry.mac, name);
    }
    if (name == kUnknownName || name.empty()) {
        GetNmbInfoByIP(entry.ip, name);
    }
    Json::Value obj(Json::objectValue);
    if (name != kUnknownName && !name.empty()) {
        obj["friendlyName"] = name;
    }
    obj["netif"] = entry.ifname;
    obj["ipAddr"] = entry.ip;
    obj["macAddr"] = entry.mac;
    if (!UpdateKeysByMac(entry.mac, obj, true)) {
        VORN_LOG(LOG_ERR, "failed to update key for arp data");
        return -1;
    }
    return 0;
}

int ArpScanner::GetDHCPInfoByMAC(const std::string& mac, std::string& name) {
    std::string text;
    if (!vorn::platform::ReadTextFile(vorn::platform::RootPath(kLeaseFile), text)) {
        VORN_LOG(LOG_ERR, "Failed to open dhcp leases file");
        return -1;
    }
    FindLeaseName(vorn::platform::SplitLines(text), mac, name);
    return 0;
}

void ArpScanner::FindLeaseName(const std::vector<std::string>& leases, const std::string& mac,
                               std::string& name) {
    if (mac.empty()) {
        return;
    }
    for (const std::string& line : leases) {
        if (line.find(mac) != std::string::npos) {
            // "expiry mac ip name ...": the name is the fourth word.
            std::istringstream words(line);
            std::string skipped;
            name.clear();
            words >> skipped >> skipped >> skipped >> name;
            if (name == kNoLeaseName) {
                name.clear();
            }
            return;
        }
    }
}

int ArpScanner::GetNmbInfoByIP(const std::string& ip, std::string& name) {
    if (!IsIPv4(ip)) {
        VORN_LOG(LOG_ERR, "Refuse to look up a bad address [%s]", ip.c_str());
        return -1;
    }
    const std::string command = kNmbLookup + ip + kNmbFilter;
    std::string line;
    if (vorn::platform::ReadShellCommandLine(command, line) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command.c_str());
        return -1;
    }
    if (!line.empty()) {
        name = line.substr(0, line.size() - 1);
    }
    return 0;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
