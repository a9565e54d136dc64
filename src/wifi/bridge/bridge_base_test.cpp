#include "wifi/bridge/bridge_base.h"

#include <gmock/gmock.h>

#include <cstdio>
#include <map>

#include "support/sim_root.h"
#include "wifi/utils/bridge_config_json.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::HasSubstr;

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class BridgeTest : public vorn::test::RootTest {
  protected:
    void TearDown() override { BridgeBase::ClearBridgeList(); }

    BridgeBase& Load(WIFI_TOPOLOGY topology, const char* name) {
        EXPECT_EQ(BridgeBase::SwitchTopology(topology), 0);
        BridgeBase* bridge = BridgeBase::GetBridge(name);
        EXPECT_NE(bridge, nullptr);
        root_.ClearCalls();
        return *bridge;
    }

    static BridgeConfig Config(const std::map<std::string, std::string>& changes,
                               const BridgeBase& bridge) {
        Json::Value json = utils::GetJsonValue(&bridge);
        for (const auto& change : changes) {
            json[change.first] = change.second;
        }
        BridgeConfig config;
        EXPECT_EQ(utils::GetConfig(json, config), 0);
        return config;
    }
};

TEST_F(BridgeTest, TopologyFilesLoadByModel) {
    EXPECT_EQ(BridgeBase::CreateBridge("lbr0x")->GetName(), "lbr0x");
    EXPECT_EQ(BridgeBase::CreateBridge("xbr0"), nullptr);
    root_.WriteFile("/usr/vorn/etc/wifi/wifi_topology_router",
                    root_.ReadFile("/usr/vorn/etc.defaults/wifi/wifi_topology_router_kite") +
                        "[eth9]\nslave_list=eth9\n[lbr01]\nap_ip_address=10.0.0.1\n");
    BridgeBase& guest = Load(WIFI_TOPOLOGY_ROUTER, "gbr0");
    EXPECT_EQ(BridgeBase::GetList().size(), 2u);
    EXPECT_TRUE(log_.Contains("Failed to create bridge [eth9]"));
    EXPECT_TRUE(log_.Contains("Refused bridge config: the netmask is not a mask of the address"));
    // Guest values count on Kite models only.
    EXPECT_TRUE(guest.GetConfig().apIpAddress.IsEmpty());
    root_.WriteFile("/etc.defaults/vorninfo.conf", "model=\"kite-a\"\n");
    EXPECT_EQ(Load(WIFI_TOPOLOGY_ROUTER, "gbr0").GetConfig().apIpAddress.ToString(),
              "192.168.200.1");
    EXPECT_EQ(BridgeBase::GetTopology(), WIFI_TOPOLOGY_ROUTER);
    // hostapd, not brctl, puts a mac80211 radio into its bridge; the bridge is made for it.
    root_.WriteFile("/sys/class/net/wlan0/phy80211/name", "phy0\n");
    root_.ClearCalls();
    EXPECT_EQ(BridgeBase::AddSlave("wlan0"), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/usr/vorn/sbin/brctl addbr lbr0"));

    EXPECT_EQ(BridgeBase::SwitchTopology(WIFI_TOPOLOGY_CLIENT), 0);
    EXPECT_THAT(BridgeBase::GetList(), IsEmpty());
    Load(WIFI_TOPOLOGY_BRIDGE, "br0");
    root_.WriteFile("/usr/vorn/etc/wifi/wifi_topology_router", "");
    std::remove(root_.Path("/usr/vorn/etc/wifi/wifi_topology_router").c_str());
    EXPECT_EQ(BridgeBase::SwitchTopology(WIFI_TOPOLOGY_ROUTER), -1);
    EXPECT_EQ(BridgeBase::GetList().size(), 1u);
    EXPECT_EQ(BridgeBase::GetTopology(), WIFI_TOPOLOGY_BRIDGE);
}

TEST_F(BridgeTest, ApplyReloadsWhatChangedAndWritesDhcpFiles) {
    root_.WriteFile("/etc/iproute2/config/resolv4.conf", "nameserver 9.9.9.9\nnameserver bad\n");
    root_.WriteFile("/etc/iproute2/config/resolv6.conf", "nameserver 2001:db8::53\n");
    BridgeBase& lbr0 = Load(WIFI_TOPOLOGY_ROUTER, "lbr0");
    const std::string before = root_.ReadFile("/usr/vorn/etc/wifi/wifi_topology_router");

    ASSERT_EQ(lbr0.Apply(lbr0.GetConfig()), 0);
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_EQ(root_.ReadFile("/usr/vorn/etc/wifi/wifi_topology_router_cv"), before);

    ASSERT_EQ(lbr0.Apply(Config({{"ap_netmask", "255.255.0.0"}}, lbr0)), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/etc/rc.network stop-nat lbr0",
                                           "/sbin/ifconfig lbr0 192.168.100.1 netmask 255.255.0.0",
                                           "/etc/rc.network start-nat lbr0",
                                           "/etc/rc.network nat-restart-dhcp lbr0",
                                           "/etc/rc.network nat-start-dhcp lbr0"));
    EXPECT_EQ(root_.ReadFile("/etc/dhcpd/dhcpd-lbr0-lbr00.conf"),
              "interface=lbr0\n"
              "dhcp-range=set:lbr00,192.168.100.2,192.168.100.254,255.255.0.0,86400\n"
              "dhcp-option=tag:lbr00,option:router,192.168.100.1\n"
              "dhcp-option=tag:lbr00,option:dns-server,192.168.100.1,9.9.9.9\n");
    EXPECT_EQ(root_.ReadFile("/etc/dhcpd/dhcpd-lbr0-lbr00.info"), "enable=\"yes\"\n");

    root_.ClearCalls();
    ASSERT_EQ(lbr0.Apply(Config({{"ap_ipv6_prefix", ""},
                                 {"ipv6_pdns", "2001:db8::1"},
                                 {"dhcpv6_type", "stateful"},
                                 {"dhcpv6_range_begin", "2001:db8::100"},
                                 {"dhcpv6_range_end", "2001:db8::1ff"}},
                                lbr0)),
              0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/etc/rc.network nat-restart-dhcp lbr0",
                                           "/etc/rc.network nat-start-dhcp lbr0"));
    EXPECT_EQ(root_.ReadFile("/etc/dhcpd/dhcpd-lbr0-lbr0v60.conf"),
              "interface=lbr0\n"
              "dhcp-range=set:lbr0v60,2001:db8::100,2001:db8::1ff,64,86400\n"
              "dhcp-option=tag:lbr0v60,option6:dns-server,[2001:db8::1],[2001:db8::53]\n"
              "enable-ra\n");
    EXPECT_EQ(root_.ReadFile("/etc/dhcpd/dhcpd-lbr0-lbr0v60.info"), "enable=\"no\"\n");
    EXPECT_THAT(root_.ReadFile("/usr/vorn/etc/wifi/wifi_topology_router_cv"),
                HasSubstr("dhcpv6_type=stateful"));

    // Refused configurations change nothing and run nothing.
    root_.ClearCalls();
    const std::string files = root_.ReadFile("/usr/vorn/etc/wifi/wifi_topology_router");
    BridgeConfig refused;
    Json::Value json = utils::GetJsonValue(&lbr0);
    for (const auto& bad : std::vector<std::pair<const char*, Json::Value>>{
             {"ap_ip_address", "192.168.100.1,dhcp-script=/x"},
             {"ap_netmask", "255.0.255.0"},
             {"dhcp_range_begin", "192.168.101.2"},
             {"dhcp_range_end", "192.168.100.1"},
             {"ap_ipv6_prefix", "2001:db8::\n"},
             {"ipv6_sdns", "[::1]"},
             {"dhcpv6_type", "ra-names"},
             {"slave_list", Json::Value(Json::arrayValue).append("wlan0;reboot")}}) {
        Json::Value changed = json;
        changed[bad.first] = bad.second;
        EXPECT_EQ(utils::GetConfig(changed, refused), -1) << bad.first;
    }
    BridgeConfig injected = lbr0.GetConfig();
    injected.ipv6Pdns = "::1,dhcp-script=/x";
    EXPECT_EQ(lbr0.Apply(injected), -1);
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_EQ(root_.ReadFile("/usr/vorn/etc/wifi/wifi_topology_router"), files);
    EXPECT_EQ(lbr0.GetConfig().ipv6Pdns, "2001:db8::1");

    BridgeConfig next = lbr0.GetConfig();
    next.apNetmask = "255.255.255.0";
    ASSERT_EQ(lbr0.GetNextConfig(next), 0);
    const Json::Value proposal = utils::GetJsonValue(&lbr0);
    EXPECT_EQ(proposal["ap_ip_address"], "192.168.101.1");
    EXPECT_EQ(proposal["dhcp_range_begin"], "192.168.101.1");
    EXPECT_EQ(proposal["dhcp_range_end"], "192.168.101.254");
    EXPECT_EQ(proposal["bridge_type"], "local_bridge");
}

TEST_F(BridgeTest, PlainBridgeSuspendsAndResumesTheSlaveDhcp) {
    BridgeBase& br0 = Load(WIFI_TOPOLOGY_BRIDGE, "br0");
    const std::string info = "/etc/dhcpd/dhcpd-eth0-eth00.info";
    root_.WriteFile(info, "enable=\"yes\"\n");
    ASSERT_EQ(br0.EnableDhcp(), 0);
    EXPECT_EQ(root_.ReadFile(info), "enable=\"no\"\nenable_bak=\"yes\"\n");
    ASSERT_EQ(br0.DisableDhcp(), 0);
    EXPECT_EQ(root_.ReadFile(info), "enable=\"yes\"\n");
    ASSERT_EQ(br0.DisableDhcp(), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/etc/rc.network nat-restart-dhcp eth0",
                                           "/etc/rc.network nat-start-dhcp eth0"));
    // Callers never change the plain bridge's own settings.
    ASSERT_EQ(br0.Apply(Config({{"ap_ip_address", "10.0.0.1"}, {"ap_netmask", "255.0.0.0"}}, br0)),
              0);
    EXPECT_TRUE(br0.GetConfig().apIpAddress.IsEmpty());
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
