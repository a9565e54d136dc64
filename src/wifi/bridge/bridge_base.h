#ifndef VORN_WIFI_BRIDGE_BRIDGE_BASE_H
#define VORN_WIFI_BRIDGE_BRIDGE_BASE_H

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/vorn_bridge.h"
#include "wifi/bridge/bridge_config.h"
#include "wifi/settings/enum.h"

namespace vornwireless {
namespace wifi {

// A Linux bridge the wifi daemon owns, with its configuration and the reload bookkeeping of
// Apply. The process keeps one list of them, built from the current topology file.
class BridgeBase {
  public:
    using List = std::vector<std::unique_ptr<BridgeBase>>;
    using NamePredicate = std::function<bool(const std::string&)>;

    explicit BridgeBase(const std::string& name) : name_(name) {}
    virtual ~BridgeBase() = default;
    BridgeBase(const BridgeBase&) = delete;
    BridgeBase& operator=(const BridgeBase&) = delete;

    // "lbr0..." a LocalBridge, "br0..." a Bridge, "gbr..." a GuestBridge, else null (logged).
    static std::unique_ptr<BridgeBase> CreateBridge(const std::string& name);
    static bool IsLocalBridge(const std::string& name);
    static bool IsBridge(const std::string& name);
    static bool IsGuestBridge(const std::string& name);

    static List& GetList();
    static BridgeBase* GetBridge(const std::string& name);
    static BridgeBase* FindBridgeFromSlave(const std::string& ifname);
    static int ClearBridgeList();
    static int EnableAll();
    static int DisableAll();

    // Kernel membership of the listed slaves that exist under "/sys/class/net" ("brctl addif",
    // "brctl delif"); a bridge missing in the kernel is made first ("brctl addbr"). AddSlave
    // also lists the interface in the bridge that should hold it, RemoveSlaveWlan(IF) unlists it.
    static int AddSlave(const std::string& ifname);
    static int RemoveSlaveWlan(const std::string& ifname);
    static int AddSlaveEth();
    static int AddSlaveWlan();
    static int AddSlaveGwlan();
    static int RemoveSlaveEth();
    static int RemoveSlaveWlan();
    static int RemoveSlaveGwlan();

    // The slaves of all bridges; the wireless slaves of one (-1 for an unknown bridge); the
    // wireless slaves taken out of their bridges and put back.
    static std::vector<std::string> GetSlaveList();
    static int GetWlanSlaveCount(const std::string& bridge);
    static int RefreshWlanSlaveList();

    static void AddModifiedIfName(const std::string& ifname);
    static void ClearModifiedIfName();

    // Topology: the bridges of the current topology's file, and their start and stop.
    static WIFI_TOPOLOGY GetTopology() { return topology_; }
    static int Initialize();
    static int SwitchTopology(WIFI_TOPOLOGY topology);
    static int EnableTopologyAll();
    static int DisableTopologyAll();
    static int RestartTopologyAll();
    static int RestoreActualTopologyFile();
    static int ResetToDefault();

    const std::string& GetName() const { return name_; }
    const char* GetNameC() const { return name_.c_str(); }
    BridgeConfig GetConfig() const { return config_; }
    // Replaces the configuration without touching the system.
    int SetDefaultConfig(const BridgeConfig& config);
    int SetConfig(const BridgeConfig& config);
    int Apply(const BridgeConfig& config);
    int ResetReloadStatus();
    int SetOnBoot(bool on);
    // The DHCP servers' DNS lists: own address first, then the appliance's servers, joined by ","
    // with none at the end (dnsmasq refuses a trailing one).
    int GetV4DnsServerList(std::string& out) const;
    int GetV6DnsServerList(std::string& out) const;
    // The appliance's resolvers of one family (4 or 6); none when they cannot be read (logged).
    std::optional<std::vector<std::string>> GetDnsServerList(int family) const;

    virtual int CreateConfig() { return 0; }
    virtual int RemoveSlave();
    virtual int GetNextConfig(const BridgeConfig& config);
    virtual int Enable();
    virtual int Disable();
    virtual int EnableTopology();
    virtual int DisableTopology();
    virtual int EnableIPv6();
    virtual int DisableIPv6();
    virtual int EnableSlaveTopology();
    virtual int CreateGatewayInfo() { return 0; }
    virtual int ResetGatewayInfo() { return 0; }
    virtual int EnableNat() = 0;
    virtual int DisableNat() = 0;
    virtual int EnableDhcp() = 0;
    virtual int DisableDhcp() = 0;
    virtual int EnableDhcpv6() = 0;
    virtual int DisableDhcpv6() = 0;
    virtual int EnableSecurityConf() = 0;
    virtual int DisableSecurityConf() = 0;
    virtual int ResetBridgeIP() = 0;
    virtual int SetTopologyFile(const BridgeConfig& config) = 0;

    // The DHCP server files of a bridge: "/etc/dhcpd/dhcpd-B-T.conf" and ".info".
    static std::string DhcpFile(const std::string& bridge, const std::string& tag,
                                const char* suffix);

  protected:
    // Removes this bridge's slaves matching the predicate from the kernel bridge.
    int RemoveSlave(const NamePredicate& matches);
    // Writes the bridge's and the slave's ifcfg files through the platform.
    int SetBridgeFiles(const std::string& slave, BR_TYPE type, const std::string& ipv4,
                       const std::string& netmask);
    // Writes section name_ of a topology file with the given keys of the configuration.
    int WriteTopologySection(const char* file, const BridgeConfig& config,
                             const std::vector<std::string>& keys) const;
    // Sets IPADDR/NETMASK, applies them with ifconfig and runs the script's NAT verb.
    int StartNat(const char* verb);
    // Adds (or deletes) this bridge's own record, which offers no gateway, to the route module's
    // list of family "v4" or "v6".
    bool SetOwnGatewayInfo(const char* family, bool add) const;

    BridgeConfig config_;

  private:
    static BridgeBase* BridgeToHold(const std::string& ifname);
    // Disable, then enable, when flag is set; each failure logged through its format ("%s": the
    // bridge name, or none).
    int Reload(bool flag, int (BridgeBase::*disable)(), int (BridgeBase::*enable)(),
               const char* disableFailed, const char* enableFailed);
    static int ForEachSlave(const NamePredicate& matches, bool add);
    static int RunBrctl(const char* verb, const std::string& bridge, const std::string& slave);

    std::string name_;
    bool reloadNat_ = false;
    bool reloadDhcp_ = false;
    bool reloadIPv6_ = false;
    bool reloadDhcpv6_ = false;

    static WIFI_TOPOLOGY topology_;
};

// Fills the platform record: the bridge name always, the slave for types 2-4. 0 or -1 (logged).
int ConvertToBridgeInfo(BRIDGE_INFO& info, const std::string& bridge, const std::string& slave,
                        BR_TYPE type);

// The route module's list name of family "v4" or "v6".
std::string GatewayType(const std::string& family);

bool IsWiredIf(const std::string& name);
bool IsWirelessIf(const std::string& name);
bool IsGuestWirelessIf(const std::string& name);

}  // namespace wifi
}  // namespace vornwireless

#endif
