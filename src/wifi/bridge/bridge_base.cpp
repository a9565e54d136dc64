#include "wifi/bridge/bridge_base.h"

#include <algorithm>
#include <cstdio>
#include <fstream>

#include "platform/qlibc_container.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "utils/config.h"
#include "utils/dbus_client.h"
#include "utils/interface_name.h"
#include "utils/ip_address.h"
#include "utils/log.h"
#include "wifi/bridge/bridge.h"
#include "wifi/bridge/guest_bridge.h"
#include "wifi/bridge/local_bridge.h"
#include "wifi/settings/enum_map.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kRcNetwork = "/etc/rc.network";
constexpr const char* kBrctl = "/usr/vorn/sbin/brctl";
constexpr const char* kDhcpDir = "/etc/dhcpd";
constexpr const char* kIfcfgPrefix = "/etc/sysconfig/network-scripts/ifcfg-";
constexpr const char* kTopologyPrefix = "/usr/vorn/etc/wifi/wifi_topology_";
constexpr const char* kDefaultsDir = "/usr/vorn/etc.defaults/wifi/";
constexpr int kLeaseSeconds = 86400;
constexpr std::size_t kRestartBufferSize = 4096;
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;

std::vector<std::string>& ModifiedIfNames() {
    static std::vector<std::string> names;
    return names;
}

bool HasPrefix(const std::string& name, const char* prefix) {
    return name.compare(0, std::char_traits<char>::length(prefix), prefix) == 0;
}

int RunScript(const char* verb, const std::string& ifname) {
    return QLIBCExecl(kRcNetwork, kExecFlags, verb, ifname.c_str(), nullptr);
}

int MakeDhcpDir() {
    if (QLIBCExecl("/bin/mkdir", kExecFlags, "-p", vorn::platform::RootPath(kDhcpDir).c_str(),
                   nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to mkdir [%s]", kDhcpDir);
        return -1;
    }
    return 0;
}

// Sets (and removes) keys of a DHCP ".info" file, values in double quotes.
int SetInfoKeys(const std::string& file, const std::vector<std::pair<const char*, bool>>& set,
                const char* remove = nullptr) {
    QLIBSZHASH* setHash = QLIBCSzHashAlloc(4);
    QLIBSZHASH* removeHash = QLIBCSzHashAlloc(1);
    bool ok = setHash != nullptr && removeHash != nullptr &&
              (remove == nullptr || QLIBCSzHashSetValue(removeHash, remove, "") == 0);
    for (const auto& pair : set) {
        ok = ok && QLIBCSzHashSetValue(setHash, pair.first, pair.second ? "yes" : "no") == 0;
    }
    ok = ok && QLIBCFileSetKeys(file.c_str(), setHash, removeHash, QLIBC_FILE_QUOTE_VALUES) == 0;
    QLIBCSzHashFree(setHash);
    QLIBCSzHashFree(removeHash);
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to set key [enable] in [%s]", file.c_str());
    }
    return ok ? 0 : -1;
}

int WriteDhcpConf(const std::string& file, const std::string& text) {
    std::ofstream out(vorn::platform::RootPath(file), std::ios::trunc);
    if (!out || !(out << text) || !out.flush()) {
        VORN_LOG(LOG_ERR, "Failed to open file [%s].", file.c_str());
        return -1;
    }
    return 0;
}

int StartDhcpServer(const std::string& bridge) {
    if (RunScript("nat-start-dhcp", bridge) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network nat-start-dhcp for[%s]",
                 bridge.c_str());
        return -1;
    }
    return 0;
}

int RestartDhcpServer(const std::string& bridge) {
    if (RunScript("nat-restart-dhcp", bridge) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network nat-restart-dhcp for[%s]",
                 bridge.c_str());
        return -1;
    }
    return 0;
}

bool IsDhcpv6Type(const std::string& type) {
    return type == "ra-only" || type == "ra-stateless" || type == "stateful";
}

void AppendDnsServers(const std::vector<std::string>& servers, const char* open, const char* close,
                      std::string& out) {
    for (const auto& server : servers) {
        out += std::string(out.empty() ? "" : ",") + open + server + close;
    }
}

std::string TopologyFile(WIFI_TOPOLOGY topology) {
    return kTopologyPrefix + EnumMap<WIFI_TOPOLOGY>::EnumToString(topology);
}

int CopyFile(const std::string& from, const std::string& to) {
    if (QLIBCExecl("/bin/cp", kExecFlags, vorn::platform::RootPath(from).c_str(),
                   vorn::platform::RootPath(to).c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "cp file [%s] to [%s]", from.c_str(), to.c_str());
        return -1;
    }
    return 0;
}

// Fills config from one section; a guest bridge's values count only on Kite models and not for
// index 1, and the plain bridge takes its slaves alone.
int SectionConfig(const std::string& name, BridgeConfig::Fields fields, BridgeConfig& config) {
    fields.erase("ipv6_pdns");
    fields.erase("ipv6_sdns");
    const bool slavesOnly = BridgeBase::IsBridge(name) ||
                            (BridgeBase::IsGuestBridge(name) &&
                             (!utils::IsKiteModel() || utils::GetGuestBridgeIndex(name) == 1));
    if (slavesOnly) {
        fields = {{"slave_list", fields["slave_list"]}};
    }
    return BridgeConfig::FromFields(fields, config);
}

}  // namespace

WIFI_TOPOLOGY BridgeBase::topology_ = WIFI_TOPOLOGY_ERROR;

std::string GatewayType(const std::string& family) {
    return family == "v4" ? "GTYPE_V4" : "GTYPE_V6";
}

bool IsWiredIf(const std::string& name) {
    return HasPrefix(name, "eth");
}

bool IsWirelessIf(const std::string& name) {
    return HasPrefix(name, "wlan");
}

bool IsGuestWirelessIf(const std::string& name) {
    return HasPrefix(name, "gwlan");
}

int ConvertToBridgeInfo(BRIDGE_INFO& info, const std::string& bridge, const std::string& slave,
                        BR_TYPE type) {
    if (type < BR_TYPE_REMOVE || type > BR_TYPE_SLAVE_ONLY ||
        bridge.size() >= sizeof(info.bridge) || slave.size() >= sizeof(info.slave)) {
        VORN_LOG(LOG_ERR, "Failed to convert bridge info");
        return -1;
    }
    info = BRIDGE_INFO{};
    std::snprintf(info.bridge, sizeof(info.bridge), "%s", bridge.c_str());
    if (type != BR_TYPE_REMOVE) {
        std::snprintf(info.slave, sizeof(info.slave), "%s", slave.c_str());
    }
    std::snprintf(info.bootproto, sizeof(info.bootproto), "static");
    info.type = type;
    return 0;
}

std::unique_ptr<BridgeBase> BridgeBase::CreateBridge(const std::string& name) {
    if (!vornwireless::utils::IsValidInterfaceName(name)) {
        VORN_LOG(LOG_ERR, "Failed to create bridge [%s]", name.c_str());
        return nullptr;
    }
    if (IsLocalBridge(name)) {
        return std::make_unique<LocalBridge>(name);
    }
    if (IsBridge(name)) {
        return std::make_unique<Bridge>(name);
    }
    if (IsGuestBridge(name)) {
        return std::make_unique<GuestBridge>(name);
    }
    VORN_LOG(LOG_ERR, "Failed to create bridge [%s]", name.c_str());
    return nullptr;
}

bool BridgeBase::IsLocalBridge(const std::string& name) {
    return HasPrefix(name, "lbr0");
}

bool BridgeBase::IsBridge(const std::string& name) {
    return HasPrefix(name, "br0");
}

bool BridgeBase::IsGuestBridge(const std::string& name) {
    return HasPrefix(name, "gbr");
}

BridgeBase::List& BridgeBase::GetList() {
    static List list;
    return list;
}

BridgeBase* BridgeBase::GetBridge(const std::string& name) {
    for (const auto& bridge : GetList()) {
        if (bridge->name_ == name) {
            return bridge.get();
        }
    }
    return nullptr;
}

BridgeBase* BridgeBase::FindBridgeFromSlave(const std::string& ifname) {
    for (const auto& bridge : GetList()) {
        const auto& slaves = bridge->config_.slaveList;
        if (std::find(slaves.begin(), slaves.end(), ifname) != slaves.end()) {
            return bridge.get();
        }
    }
    return nullptr;
}

int BridgeBase::ClearBridgeList() {
    GetList().clear();
    return 0;
}

int BridgeBase::EnableAll() {
    for (const auto& bridge : GetList()) {
        if (bridge->Enable() != 0) {
            VORN_LOG(LOG_ERR, "Failed to enable [%s]", bridge->GetNameC());
            return -1;
        }
    }
    return 0;
}

int BridgeBase::DisableAll() {
    for (const auto& bridge : GetList()) {
        if (bridge->Disable() != 0) {
            VORN_LOG(LOG_ERR, "Failed to disable [%s]", bridge->GetNameC());
            return -1;
        }
    }
    return 0;
}

int BridgeBase::RunBrctl(const char* verb, const std::string& bridge, const std::string& slave) {
    return QLIBCExecl(kBrctl, kExecFlags, verb, bridge.c_str(), slave.c_str(), nullptr);
}

// The bridge listing it; else a guest interface "gwlanN" belongs to "gbrN", any other to the
// topology's own bridge.
BridgeBase* BridgeBase::BridgeToHold(const std::string& ifname) {
    if (BridgeBase* listed = FindBridgeFromSlave(ifname)) {
        return listed;
    }
    if (IsGuestWirelessIf(ifname)) {
        return GetBridge("gbr" + ifname.substr(std::string("gwlan").size()));
    }
    for (const auto& bridge : GetList()) {
        if (!IsGuestBridge(bridge->name_)) {
            return bridge.get();
        }
    }
    return nullptr;
}

int BridgeBase::AddSlave(const std::string& ifname) {
    BridgeBase* bridge = BridgeToHold(ifname);
    if (bridge == nullptr || QLIBCFileExist(("/sys/class/net/" + ifname).c_str()) != 1) {
        VORN_LOG(LOG_ERR, "Failed to enum [%s] under [%s]", ifname.c_str(), "/sys/class/net");
        return -1;
    }
    auto& slaves = bridge->config_.slaveList;
    if (std::find(slaves.begin(), slaves.end(), ifname) == slaves.end()) {
        slaves.push_back(ifname);
    }
    const std::string& name = bridge->name_;
    if (QLIBCFileExist(("/sys/class/net/" + name + "/brif/" + ifname).c_str()) == 1) {
        return 0;
    }
    const bool made = QLIBCFileExist(("/sys/class/net/" + name).c_str()) == 1 ||
                      QLIBCExecl(kBrctl, kExecFlags, "addbr", name.c_str(), nullptr) == 0;
    // A mac80211 radio joins a bridge only in access-point mode, which hostapd sets; its
    // "bridge=" line puts the radio in.
    if (made && !utils::GetPhyName(ifname).empty()) {
        return 0;
    }
    if (!made || RunBrctl("addif", name, ifname) != 0) {
        VORN_LOG(LOG_ERR, "Failed to add [%s] into [%s]", ifname.c_str(), name.c_str());
        return -1;
    }
    return 0;
}

int BridgeBase::RemoveSlaveWlan(const std::string& ifname) {
    BridgeBase* bridge = FindBridgeFromSlave(ifname);
    if (bridge == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to find slave [%s] in config", ifname.c_str());
        return -1;
    }
    auto& slaves = bridge->config_.slaveList;
    slaves.erase(std::remove(slaves.begin(), slaves.end(), ifname), slaves.end());
    if (RunBrctl("delif", bridge->name_, ifname) != 0) {
        VORN_LOG(LOG_ERR, "Failed to add [%s] into [%s]", ifname.c_str(), bridge->GetNameC());
        return -1;
    }
    return 0;
}

// Missing interfaces are skipped: an adapter may be absent while its bridge stays.
int BridgeBase::ForEachSlave(const NamePredicate& matches, bool add) {
    for (const auto& bridge : GetList()) {
        if (!add) {
            if (bridge->RemoveSlave(matches) != 0) {
                return -1;
            }
            continue;
        }
        for (const auto& slave : bridge->config_.slaveList) {
            if (matches(slave) && QLIBCFileExist(("/sys/class/net/" + slave).c_str()) == 1 &&
                AddSlave(slave) != 0) {
                return -1;
            }
        }
    }
    return 0;
}

int BridgeBase::AddSlaveEth() {
    return ForEachSlave(IsWiredIf, true);
}

int BridgeBase::AddSlaveWlan() {
    return ForEachSlave(IsWirelessIf, true);
}

int BridgeBase::AddSlaveGwlan() {
    return ForEachSlave(IsGuestWirelessIf, true);
}

int BridgeBase::RemoveSlaveEth() {
    return ForEachSlave(IsWiredIf, false);
}

int BridgeBase::RemoveSlaveWlan() {
    return ForEachSlave(IsWirelessIf, false);
}

int BridgeBase::RemoveSlaveGwlan() {
    return ForEachSlave(IsGuestWirelessIf, false);
}

int BridgeBase::RemoveSlave(const NamePredicate& matches) {
    for (const auto& slave : config_.slaveList) {
        if (matches(slave) &&
            QLIBCFileExist(("/sys/class/net/" + name_ + "/brif/" + slave).c_str()) == 1 &&
            RunBrctl("delif", name_, slave) != 0) {
            VORN_LOG(LOG_ERR, "Failed to add [%s] into [%s]", slave.c_str(), name_.c_str());
            return -1;
        }
    }
    return 0;
}

int BridgeBase::RemoveSlave() {
    return RemoveSlave([](const std::string&) { return true; });
}

std::vector<std::string> BridgeBase::GetSlaveList() {
    std::vector<std::string> slaves;
    for (const auto& bridge : GetList()) {
        const auto& own = bridge->config_.slaveList;
        slaves.insert(slaves.end(), own.begin(), own.end());
    }
    return slaves;
}

int BridgeBase::GetWlanSlaveCount(const std::string& bridge) {
    const BridgeBase* found = GetBridge(bridge);
    if (found == nullptr) {
        return -1;
    }
    const auto& slaves = found->config_.slaveList;
    return static_cast<int>(std::count_if(slaves.begin(), slaves.end(), IsWirelessIf));
}

int BridgeBase::RefreshWlanSlaveList() {
    if (RemoveSlaveWlan() != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove Slave(wlan)");
        return -1;
    }
    if (AddSlaveWlan() != 0) {
        VORN_LOG(LOG_ERR, "Failed to add slave(wlan)");
        return -1;
    }
    return 0;
}

void BridgeBase::AddModifiedIfName(const std::string& ifname) {
    auto& names = ModifiedIfNames();
    if (std::find(names.begin(), names.end(), ifname) == names.end()) {
        names.push_back(ifname);
    }
}

void BridgeBase::ClearModifiedIfName() {
    ModifiedIfNames().clear();
}

int BridgeBase::SetDefaultConfig(const BridgeConfig& config) {
    config_ = config;
    return 0;
}

int BridgeBase::SetConfig(const BridgeConfig& config) {
    if (IsBridge(name_)) {
        return 0;
    }
    // Callers may build a configuration in code; its texts reach files and command lines too.
    BridgeConfig checked;
    if (BridgeConfig::FromFields(config.ToFields(), checked) != 0) {
        return -1;
    }
    BridgeConfig& held = config_;
    const bool address =
        held.apIpAddress != config.apIpAddress || held.apNetmask != config.apNetmask;
    const bool dhcp = held.dhcpEnabled != config.dhcpEnabled ||
                      held.dhcpRangeBegin != config.dhcpRangeBegin ||
                      held.dhcpRangeEnd != config.dhcpRangeEnd;
    const bool prefix = held.ipv6Prefix != config.ipv6Prefix;
    const bool dhcpv6 = held.ipv6Pdns != config.ipv6Pdns || held.ipv6Sdns != config.ipv6Sdns ||
                        held.dhcpv6Type != config.dhcpv6Type ||
                        held.dhcpv6RangeBegin != config.dhcpv6RangeBegin ||
                        held.dhcpv6RangeEnd != config.dhcpv6RangeEnd;
    reloadNat_ = reloadNat_ || address;
    reloadDhcp_ = reloadDhcp_ || address || dhcp;
    reloadIPv6_ = reloadIPv6_ || prefix;
    reloadDhcpv6_ = reloadDhcpv6_ || prefix || dhcpv6;
    const std::vector<std::string> slaves = held.slaveList;
    held = config;
    held.slaveList = slaves;
    return 0;
}

int BridgeBase::ResetReloadStatus() {
    reloadNat_ = reloadDhcp_ = reloadIPv6_ = reloadDhcpv6_ = false;
    return 0;
}

int BridgeBase::Reload(bool flag, int (BridgeBase::*disable)(), int (BridgeBase::*enable)(),
                       const char* disableFailed, const char* enableFailed) {
    if (!flag) {
        return 0;
    }
    if ((this->*disable)() != 0) {
        VORN_LOG(LOG_ERR, disableFailed, GetNameC());
        return -1;
    }
    if ((this->*enable)() != 0) {
        VORN_LOG(LOG_ERR, enableFailed, GetNameC());
        return -1;
    }
    return 0;
}

int BridgeBase::Apply(const BridgeConfig& config) {
    int result = -1;
    if (SetConfig(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set config");
    } else if (Reload(reloadNat_, &BridgeBase::DisableNat, &BridgeBase::EnableNat,
                      "Failed to disable nat for %s", "Failed to enable nat for %s") != 0 ||
               Reload(reloadDhcp_, &BridgeBase::DisableDhcp, &BridgeBase::EnableDhcp,
                      "Failed to disable dhcp for %s", "Failed to enable dhcp for %s") != 0 ||
               Reload(reloadIPv6_, &BridgeBase::DisableIPv6, &BridgeBase::EnableIPv6,
                      "Failed to disable IPv6", "Failed to disable IPv6") != 0 ||
               Reload(reloadDhcpv6_, &BridgeBase::DisableDhcpv6, &BridgeBase::EnableDhcpv6,
                      "Failed to disable dhcpv6 for %s", "Failed to enable dhcpv6 for %s") != 0) {
    } else if (SetTopologyFile(config_) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set topology file for %s", GetNameC());
    } else if (RestoreActualTopologyFile() != 0) {
        VORN_LOG(LOG_ERR, "Failed to restore to actual topology file.");
    } else {
        result = 0;
    }
    ResetReloadStatus();
    return result;
}

int BridgeBase::SetOnBoot(bool on) {
    const std::string file = kIfcfgPrefix + name_;
    if (QLIBCFileSetKeyValue(file.c_str(), "ONBOOT", on ? "yes" : "no") != 0) {
        VORN_LOG(LOG_ERR, "Failed to set onboot key [%s]", file.c_str());
        return -1;
    }
    return 0;
}

std::optional<std::vector<std::string>> BridgeBase::GetDnsServerList(int family) const {
    QLIBSZLIST* list = nullptr;
    const int count = VORNNetDNSServerListGet(family, &list);
    if (count < 0) {
        QLIBCSzListFree(list);
        VORN_LOG(LOG_ERR, "get dns failed");
        return std::nullopt;
    }
    if (count == 0) {
        VORN_LOG(LOG_DEBUG, "No dns list found.");
    }
    std::vector<std::string> servers;
    for (int i = 0; i < count; ++i) {
        servers.emplace_back(QLIBCSzListGet(list, i));
    }
    QLIBCSzListFree(list);
    return servers;
}

int BridgeBase::GetV4DnsServerList(std::string& out) const {
    const auto servers = GetDnsServerList(4);
    if (!servers) {
        return -1;
    }
    out = config_.apIpAddress.ToString();
    AppendDnsServers(*servers, "", "", out);
    return 0;
}

int BridgeBase::GetV6DnsServerList(std::string& out) const {
    out.clear();
    for (const std::string& server :
         {config_.ipv6Prefix.empty() ? std::string() : config_.ipv6Prefix + "1", config_.ipv6Pdns,
          config_.ipv6Sdns}) {
        if (!server.empty()) {
            out += (out.empty() ? "[" : ",[") + server + "]";
        }
    }
    const auto servers = GetDnsServerList(6);
    if (!servers) {
        return -1;
    }
    AppendDnsServers(*servers, "[", "]", out);
    return 0;
}

int BridgeBase::GetNextConfig(const BridgeConfig& config) {
    const vornwireless::utils::IPAddress network =
        vornwireless::utils::GetNextNetwork(config.apIpAddress, config.apNetmask);
    config_.apIpAddress = vornwireless::utils::GetIpAddressBegin(network, config.apNetmask);
    config_.dhcpRangeBegin = config_.apIpAddress;
    config_.apNetmask = config.apNetmask;
    config_.dhcpEnabled = true;
    config_.dhcpRangeEnd = vornwireless::utils::GetIpAddressEnd(network, config.apNetmask);
    return 0;
}

int BridgeBase::Enable() {
    if (EnableSecurityConf() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable Security configure");
    } else if (EnableNat() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable NAT");
    } else if (EnableDhcp() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable DHCP");
    } else if (EnableIPv6() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable IPv6");
    } else if (EnableDhcpv6() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable DHCPv6");
    } else {
        return 0;
    }
    return -1;
}

int BridgeBase::Disable() {
    if (DisableDhcpv6() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable DHCPv6");
    } else if (DisableIPv6() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable IPv6");
    } else if (DisableDhcp() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable DHCP");
    } else if (DisableNat() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable NAT");
    } else if (DisableSecurityConf() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable Security configure");
    } else {
        return 0;
    }
    return -1;
}

int BridgeBase::EnableTopology() {
    if (CreateConfig() != 0) {
        VORN_LOG(LOG_ERR, "Failed to create config");
        return -1;
    }
    if (CreateGatewayInfo() != 0) {
        VORN_LOG(LOG_ERR, "Failed to create gateway info");
        return -1;
    }
    return 0;
}

int BridgeBase::DisableTopology() {
    if (SetOnBoot(false) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set onboot(false)");
    } else if (RemoveSlave() != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove slave");
    } else if (ResetGatewayInfo() != 0) {
        VORN_LOG(LOG_ERR, "Failed to reset data");
    } else {
        return 0;
    }
    return -1;
}

int BridgeBase::EnableIPv6() {
    if (config_.ipv6Prefix.empty()) {
        VORN_LOG(LOG_INFO, "Empty v6 prefix %s, skip", GetNameC());
        return 0;
    }
    if (VORNLnxIPv6ProcAction(GetNameC(), 0) != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable IPv6 on [%s]", GetNameC());
        return -1;
    }
    const std::string address = config_.ipv6Prefix + "1/64";
    if (QLIBCExecl("/sbin/ip", kExecFlags, "addr", "add", address.c_str(), "dev", GetNameC(),
                   nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute ip addr add [%s] dev [%s]", address.c_str(),
                 GetNameC());
        return -1;
    }
    return 0;
}

int BridgeBase::DisableIPv6() {
    if (VORNLnxIPv6ProcAction(GetNameC(), 1) != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable IPv6 on [%s]", GetNameC());
        return -1;
    }
    return 0;
}

int BridgeBase::EnableSlaveTopology() {
    for (const auto& slave : config_.slaveList) {
        AddModifiedIfName(slave);
    }
    return 0;
}

std::string BridgeBase::DhcpFile(const std::string& bridge, const std::string& tag,
                                 const char* suffix) {
    return std::string(kDhcpDir) + "/dhcpd-" + bridge + "-" + tag + suffix;
}

int BridgeBase::EnableDhcp() {
    const std::string tag = name_ + "0";
    std::string dns;
    if (MakeDhcpDir() != 0 ||
        SetInfoKeys(DhcpFile(name_, tag, ".info"), {{"enable", config_.dhcpEnabled}}) != 0 ||
        GetV4DnsServerList(dns) != 0) {
        return -1;
    }
    const BridgeConfig& c = config_;
    const std::string text = "interface=" + name_ + "\n" + "dhcp-range=set:" + tag + "," +
                             c.dhcpRangeBegin.ToString() + "," + c.dhcpRangeEnd.ToString() + "," +
                             c.apNetmask.ToString() + "," + std::to_string(kLeaseSeconds) + "\n" +
                             "dhcp-option=tag:" + tag + ",option:router," +
                             c.apIpAddress.ToString() + "\n" + "dhcp-option=tag:" + tag +
                             ",option:dns-server," + dns + "\n";
    if (WriteDhcpConf(DhcpFile(name_, tag, ".conf"), text) != 0) {
        return -1;
    }
    return StartDhcpServer(name_);
}

int BridgeBase::DisableDhcp() {
    if (MakeDhcpDir() != 0 ||
        SetInfoKeys(DhcpFile(name_, name_ + "0", ".info"), {{"enable", false}}) != 0) {
        return -1;
    }
    return RestartDhcpServer(name_);
}

int BridgeBase::EnableDhcpv6() {
    const std::string tag = name_ + "v60";
    const BridgeConfig& c = config_;
    const bool enable = IsDhcpv6Type(c.dhcpv6Type) && !c.ipv6Prefix.empty();
    std::string dns;
    if (MakeDhcpDir() != 0 ||
        SetInfoKeys(DhcpFile(name_, tag, ".info"), {{"enable", enable}}) != 0 ||
        GetV6DnsServerList(dns) != 0) {
        return -1;
    }
    const std::string lease = std::to_string(kLeaseSeconds);
    std::string text = "interface=" + name_ + "\n";
    if (c.dhcpv6Type == "ra-only" || c.dhcpv6Type == "ra-stateless") {
        text += "dhcp-range=set:" + tag + ",::,constructor:" + name_ + "," + c.dhcpv6Type + ",64," +
                lease + "\n";
    } else if (c.dhcpv6Type == "stateful") {
        text += "dhcp-range=set:" + tag + "," + c.dhcpv6RangeBegin + "," + c.dhcpv6RangeEnd +
                ",64," + lease + "\n";
    }
    if (!dns.empty()) {
        text += "dhcp-option=tag:" + tag + ",option6:dns-server," + dns + "\n";
    }
    if (c.dhcpv6Type == "stateful") {
        text += "enable-ra\n";
    }
    if (WriteDhcpConf(DhcpFile(name_, tag, ".conf"), text) != 0) {
        return -1;
    }
    return StartDhcpServer(name_);
}

int BridgeBase::DisableDhcpv6() {
    if (MakeDhcpDir() != 0 ||
        SetInfoKeys(DhcpFile(name_, name_ + "v60", ".info"), {{"enable", false}}) != 0) {
        return -1;
    }
    return RestartDhcpServer(name_);
}

int BridgeBase::SetBridgeFiles(const std::string& slave, BR_TYPE type, const std::string& ipv4,
                               const std::string& netmask) {
    BRIDGE_INFO info;
    if (ConvertToBridgeInfo(info, name_, slave, type) != 0 || ipv4.size() >= sizeof(info.ipv4) ||
        netmask.size() >= sizeof(info.netmask)) {
        VORN_LOG(LOG_ERR, "Failed to convert bridge info.");
        return -1;
    }
    std::snprintf(info.ipv4, sizeof(info.ipv4), "%s", ipv4.c_str());
    std::snprintf(info.netmask, sizeof(info.netmask), "%s", netmask.c_str());
    if (VORNNetSetBridgeConfig(&info) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set Bridge file for [%s]", GetNameC());
        return -1;
    }
    return 0;
}

int BridgeBase::WriteTopologySection(const char* file, const BridgeConfig& config,
                                     const std::vector<std::string>& keys) const {
    BridgeConfig::Fields fields = config.ToFields();
    QLIBSZHASH* section = QLIBCSzHashAlloc(static_cast<int>(keys.size()));
    bool ok = section != nullptr;
    for (const auto& key : keys) {
        ok = ok && QLIBCSzHashSetValue(section, key.c_str(), fields[key].c_str()) == 0;
    }
    ok = ok && QLIBCFileAddSection(file, name_.c_str(), section, "%s=%s\n") == 0;
    QLIBCSzHashFree(section);
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to set topology file[%s]", file);
        return -1;
    }
    return 0;
}

int BridgeBase::StartNat(const char* verb) {
    const std::string file = kIfcfgPrefix + name_;
    const std::string address = config_.apIpAddress.ToString();
    const std::string mask = config_.apNetmask.ToString();
    if (QLIBCFileSetKeyValue(file.c_str(), "IPADDR", address.c_str()) != 0 ||
        QLIBCFileSetKeyValue(file.c_str(), "NETMASK", mask.c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set key[%s] in [%s].", "IPADDR", file.c_str());
        return -1;
    }
    if (QLIBCExecl("/sbin/ifconfig", kExecFlags, GetNameC(), address.c_str(), "netmask",
                   mask.c_str(), nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute ifconfig");
        return -1;
    }
    if (RunScript(verb, name_) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute /etc/rc.network %s for[%s]", verb, GetNameC());
        return -1;
    }
    return 0;
}

bool BridgeBase::SetOwnGatewayInfo(const char* family, bool add) const {
    const std::string type = GatewayType(family);
    return add ? vornwireless::utils::SetGatewayInfo(name_, type, "NULL", "NULL", "bridge", -1,
                                                     false)
               : vornwireless::utils::DelGatewayInfo(name_, type, false);
}

int BridgeBase::SwitchTopology(WIFI_TOPOLOGY topology) {
    const std::string file = TopologyFile(topology);
    vornwireless::utils::ConfigSection sections(file);
    if (QLIBCFileExist(file.c_str()) != 1 || sections.Read() != 0) {
        VORN_LOG(LOG_ERR, "Failed to read config [%s]", file.c_str());
        return -1;
    }
    QLIBSZLIST* names = nullptr;
    if (QLIBCFileEnumSection(file.c_str(), &names) < 0) {
        VORN_LOG(LOG_ERR, "Failed to read config [%s]", file.c_str());
        return -1;
    }
    topology_ = topology;
    ClearBridgeList();
    const vornwireless::utils::ConfigSection::Sections all = sections.GetKeyValues();
    for (int i = 0; i < QLIBCSzListCount(names); ++i) {
        const std::string name = QLIBCSzListGet(names, i);
        std::unique_ptr<BridgeBase> bridge = CreateBridge(name);
        BridgeConfig config;
        if (!bridge) {
            continue;
        }
        if (SectionConfig(name, all.at(name), config) != 0 ||
            bridge->SetDefaultConfig(config) != 0) {
            VORN_LOG(LOG_ERR, "Failed to set default config");
            continue;
        }
        bridge->ResetReloadStatus();
        GetList().push_back(std::move(bridge));
    }
    QLIBCSzListFree(names);
    return 0;
}

int BridgeBase::Initialize() {
    if (utils::SetSupportNetTopology(true) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set support_net_topology");
    }
    const WIFI_TOPOLOGY topology = utils::ReadTopology();
    if (topology == WIFI_TOPOLOGY_ERROR) {
        VORN_LOG(LOG_ERR, "Failed to read current topology");
        return -1;
    }
    if (SwitchTopology(topology) != 0) {
        VORN_LOG(LOG_ERR, "Failed to switch topology");
        return -1;
    }
    if (EnableTopologyAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable all topology");
        return -1;
    }
    if (EnableAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable all nat and dhcp");
        return -1;
    }
    return 0;
}

int BridgeBase::EnableTopologyAll() {
    if (AddSlaveEth() != 0) {
        VORN_LOG(LOG_ERR, "Failed to add slave(eth)");
        return -1;
    }
    if (AddSlaveWlan() != 0) {
        VORN_LOG(LOG_ERR, "Failed to add slave(wlan)");
        return -1;
    }
    if (AddSlaveGwlan() != 0) {
        VORN_LOG(LOG_ERR, "Failed to add slave(gwlan)");
        return -1;
    }
    for (const auto& bridge : GetList()) {
        AddModifiedIfName(bridge->name_);
        bridge->EnableSlaveTopology();
        if (bridge->EnableTopology() != 0) {
            VORN_LOG(LOG_ERR, "Failed to enable topology [%s]", bridge->GetNameC());
            return -1;
        }
    }
    int result = 0;
    if (!ModifiedIfNames().empty() && RestartTopologyAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to restart topology");
        result = -1;
    }
    ClearModifiedIfName();
    return result;
}

int BridgeBase::RestartTopologyAll() {
    // Every name is a checked interface name, so quoting keeps each one a single word.
    std::string command = std::string(kRcNetwork) + " restart-topology";
    for (const auto& name : ModifiedIfNames()) {
        if (command.size() + name.size() + 3 >= kRestartBufferSize) {
            break;
        }
        command += " '" + name + "'";
    }
    if (QLIBCSystem(command.c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to restart topology.");
        return -1;
    }
    return 0;
}

int BridgeBase::DisableTopologyAll() {
    for (const auto& bridge : GetList()) {
        if (bridge->DisableTopology() != 0) {
            VORN_LOG(LOG_ERR, "Failed to enable topology [%s]", bridge->GetNameC());
            return -1;
        }
    }
    if (RemoveSlaveEth() != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove Slave(eth)");
        return -1;
    }
    if (RemoveSlaveWlan() != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove Slave(wlan)");
        return -1;
    }
    if (RemoveSlaveGwlan() != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove Slave(gwlan)");
        return -1;
    }
    return 0;
}

int BridgeBase::RestoreActualTopologyFile() {
    const char* model = utils::IsKiteBModel() ? "_kite" : "_cv";
    for (const char* topology : {"router", "bridge"}) {
        const std::string live = std::string(kTopologyPrefix) + topology;
        if (QLIBCFileExist(live.c_str()) == 1) {
            CopyFile(live, live + model);
        }
    }
    return 0;
}

int BridgeBase::ResetToDefault() {
    for (const char* copy : {"router_cv", "bridge_cv", "router_kite", "bridge_kite"}) {
        const std::string name = std::string("wifi_topology_") + copy;
        CopyFile(kDefaultsDir + name, std::string("/usr/vorn/etc/wifi/") + name);
    }
    return RestoreActualTopologyFile();
}

}  // namespace wifi
}  // namespace vornwireless
