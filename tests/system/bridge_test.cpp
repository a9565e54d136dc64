// The bridges of the router and bridge topologies laid out with the real brctl and ip on veth
// slaves; dnsmasq checks every DHCP file they write (a lease served from such files is the DHCP
// server test's); the real route module, behind the network service on a private bus, gets the
// bridges' gateway records.
#include <gmock/gmock.h>
#include <sys/stat.h>

#include <thread>

#include "dbus/net_server.h"
#include "network/module/module_manager.h"
#include "network/module/route_module.h"
#include "platform/qlibc_file.h"
#include "support/peer_namespace.h"
#include "support/waiting.h"
#include "utils/dbus_client.h"
#include "wifi/adapter/adapter.h"
#include "wifi/bridge/bridge_base.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::HasSubstr;
using vorn::test::RunProgram;
using vornnetwork::network::module::MODULE_ROUTE;
using vornnetwork::network::module::ModuleManager;
using vornnetwork::network::module::RouteModule;

class BridgeSystemTest : public vorn::test::PeerNamespaceTest {
  protected:
    void SetUpPeers() override {
        AddPeer("br-lan", "wlan0", 11, "c0", 21);
        AddPeer("br-guest", "gwlan0", 12, "g0", 22);
        AddPeer("br-wan", "eth0", 13, "e0", 23);
        root_->WriteFile("/etc.defaults/vorninfo.conf", "model=\"kite-a\"\n");
        root_->WriteFile("/usr/vorn/etc/wifi/wifi_topology_router",
                         root_->ReadFile("/usr/vorn/etc.defaults/wifi/wifi_topology_router_kite"));
        root_->WriteFile("/etc/sysconfig/network-scripts/ifcfg-eth0",
                         "DEVICE=eth0\nBOOTPROTO=static\nIPADDR=10.9.0.2\nNETMASK=255.255.255.0\n");
        bus_ = std::make_unique<vorn::test::PrivateBus>();
        ASSERT_TRUE(bus_->Started());
        ModuleManager* manager = ModuleManager::GetInstance();
        ASSERT_TRUE(manager->AddModule({MODULE_ROUTE, true, &RouteModule::Create}));
        ASSERT_EQ(manager->GetModule(MODULE_ROUTE)->Initialize(), 0);
        server_ = std::make_unique<vornnetwork::dbus::NetServer>();
        ASSERT_TRUE(server_->IsInitialized());
        loop_ = std::thread([this] { server_->StartLoop(); });
    }

    void TearDown() override {
        Adapter::DeleteAdapterAll();
        BridgeBase::ClearBridgeList();
        if (loop_.joinable()) {
            server_->QuitLoop();
            loop_.join();
        }
        server_.reset();
        ModuleManager::GetInstance()->RemoveModule(MODULE_ROUTE);
        bus_.reset();
        PeerNamespaceTest::TearDown();
    }

    // The route module's IPv4 list as "name[:gateway][ slave]" words, in priority order.
    static std::string GatewaysV4() {
        Json::Value request, answer;
        request["method"] = "GET_GATEWAY_LIST_DATA";
        request["type"] = "GTYPE_V4";
        ModuleManager::GetInstance()->ProcessRequest(MODULE_ROUTE, request, answer);
        std::string words;
        for (const auto& entry : answer) {
            const std::string gateway = entry["gateway"].asString();
            words += (words.empty() ? "" : " ") + entry["ifname"].asString() +
                     (gateway.empty() ? "" : ":" + gateway) +
                     (entry["slave"].asBool() ? "(slave)" : "");
        }
        return words;
    }

    static bool IsSlave(const std::string& bridge, const std::string& slave) {
        struct stat info;
        return stat(("/sys/class/net/" + bridge + "/brif/" + slave).c_str(), &info) == 0;
    }

    std::string DnsmasqTest(const std::string& file) {
        std::string output;
        RunProgram({"/usr/sbin/dnsmasq", "--test", "--conf-file=" + root_->Path(file)},
                   std::chrono::seconds(10), &output, &output);
        return output + root_->ReadFile(file);
    }

    std::unique_ptr<vorn::test::PrivateBus> bus_;
    std::unique_ptr<vornnetwork::dbus::NetServer> server_;
    std::thread loop_;
};

TEST_F(BridgeSystemTest, RouterAndBridgeTopologiesRunWithRealBridgesAndDnsmasq) {
    ASSERT_TRUE(vornwireless::utils::SetGatewayInfo("eth0", "GTYPE_V4", "10.9.0.1", "10.9.0.1",
                                                    "ethernet", 0, false));
    ASSERT_EQ(utils::WriteTopology(WIFI_TOPOLOGY_ROUTER), 0);
    Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
    Adapter::SetDriverSettleTime(std::chrono::milliseconds(0));
    ASSERT_EQ(BridgeBase::Initialize(), 0) << ::testing::PrintToString(log_.Lines());
    EXPECT_EQ(GatewaysV4(), "eth0:10.9.0.1 lbr0 gbr0");
    EXPECT_TRUE(IsSlave("lbr0", "wlan0"));
    EXPECT_TRUE(IsSlave("gbr0", "gwlan0"));
    EXPECT_FALSE(IsSlave("lbr0", "eth0"));
    EXPECT_THAT(vorn::test::Shell("/sbin/ip -4 -o addr show dev lbr0"),
                HasSubstr("192.168.100.1/24"));
    std::string first;
    ASSERT_EQ(utils::GetFirstExistentSlaveByBridge("gbr0", first), 0);
    EXPECT_EQ(first, "gwlan0");

    BridgeBase* lbr0 = BridgeBase::GetBridge("lbr0");
    BridgeConfig stateful = lbr0->GetConfig();
    stateful.ipv6Prefix = "2001:db8:100::";
    stateful.ipv6Pdns = "2001:db8::53";
    stateful.dhcpv6Type = "stateful";
    stateful.dhcpv6RangeBegin = "2001:db8:100::100";
    stateful.dhcpv6RangeEnd = "2001:db8:100::1ff";
    ASSERT_EQ(lbr0->Apply(stateful), 0);
    EXPECT_THAT(vorn::test::Shell("/sbin/ip -6 -o addr show dev lbr0"),
                HasSubstr("2001:db8:100::1/64"));
    for (const char* file :
         {"/etc/dhcpd/dhcpd-lbr0-lbr00.conf", "/etc/dhcpd/dhcpd-lbr0-lbr0v60.conf",
          "/etc/dhcpd/dhcpd-gbr0-gbr00.conf", "/etc/dhcpd/dhcpd-gbr0-gbr0v60.conf"}) {
        EXPECT_THAT(DnsmasqTest(file), HasSubstr("syntax check OK")) << file;
    }

    // The whole switch to the bridge topology: the ports leave lbr0, br0 takes eth0 and its
    // address.
    ASSERT_EQ(Adapter::SwitchNetTopology(WIFI_TOPOLOGY_BRIDGE), 0)
        << ::testing::PrintToString(log_.Lines());
    EXPECT_FALSE(IsSlave("lbr0", "wlan0"));
    EXPECT_TRUE(IsSlave("br0", "eth0"));
    EXPECT_TRUE(IsSlave("br0", "wlan0"));
    EXPECT_THAT(vorn::test::Shell("/sbin/ip -4 -o addr show dev br0"), HasSubstr("10.9.0.2/24"));
    ASSERT_EQ(utils::GetFirstExistentSlaveByBridge("br0", first), 0);
    EXPECT_EQ(first, "eth0");
    EXPECT_THAT(DnsmasqTest("/etc/dhcpd/dhcpd-br0-br0v60.conf"), HasSubstr("syntax check OK"));
    EXPECT_EQ(GatewaysV4(), "br0:10.9.0.1 eth0:10.9.0.1(slave)");

    // Back: eth0 gets its place and its gateway again.
    ASSERT_EQ(BridgeBase::DisableAll(), 0);
    ASSERT_EQ(BridgeBase::DisableTopologyAll(), 0);
    EXPECT_EQ(GatewaysV4(), "eth0:10.9.0.1");
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
