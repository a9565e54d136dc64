#include <gmock/gmock.h>

#include <vector>

#include "ipv6/router/6in4.h"
#include "ipv6/router/dhcp_pd.h"
#include "ipv6/router/router6_factory.h"
#include "ipv6/router/router6_prefix.h"
#include "platform/vorn_ipv6.h"
#include "support/private_bus.h"
#include "support/sim_root.h"
#include "utils/dbus_client.h"

namespace vorn::network::ipv6::router {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr char kSettings[] = "/etc/sysconfig/networking/ipv6-";

using vorn::test::Parse;

class Router6Test : public test::RootTest {
  protected:
    void SetUp() override {
        root_.WriteFile("/sys/class/net/ppp0/type", "512\n");
        root_.WriteFile("/proc/sys/net/ipv6/conf/ppp0/disable_ipv6", "1\n");
    }

    // The recorded calls of program that name text; the route module's own ones are left out.
    std::vector<std::string> CallsWith(const std::string& program, const std::string& text) const {
        std::vector<std::string> calls;
        for (const std::string& call : root_.Calls()) {
            if (call.rfind(program, 0) == 0 && call.find(text) != std::string::npos &&
                call.find(" route ") == std::string::npos) {
                calls.push_back(call);
            }
        }
        return calls;
    }

    Router6Attr tunnel_{"6in4",           "pppoe", "2001:db8:1::/48", "192.0.2.2", "198.51.100.1",
                        "2001:db8::2/64", false};
};

TEST_F(Router6Test, SettingsKeepTheirFileAndJsonFormsUnderThePppoeName) {
    EXPECT_TRUE(Router6Factory::newRouterV6Instance("off", Json::Value()) == nullptr);
    EXPECT_THAT(log_.Lines(), IsEmpty());
    tunnel_.AddLan("br0", "2001:db8:1::/64");
    tunnel_.AddLan("eth1", "");
    EXPECT_EQ(tunnel_.GetConfigName(), std::string(kSettings) + "ppp0");
    ASSERT_EQ(tunnel_.SaveConfig(), 0);
    Router6Attr loaded("pppoe", true);
    ASSERT_EQ(loaded.LoadConfig(), 0);
    EXPECT_EQ(loaded, tunnel_);  // no route module: not the default gateway

    EXPECT_EQ(tunnel_.ToJson(), Parse(R"({"type": "6in4", "is_default_gateway": false,
        "config": {"wan": "pppoe", "prefix": "2001:db8:1::/48", "remote_addr_v4": "198.51.100.1",
                   "local_addr_v6": "2001:db8::2/64"}})"));
    tunnel_.remote_addr_v4.clear();
    EXPECT_EQ(tunnel_.ToJson()["config"]["remote_addr_v4"], "192.0.2.2");
    EXPECT_EQ(Router6Attr().ToJson(), Parse(R"({"type": "native", "is_default_gateway": false})"));

    Json::Value request;
    ASSERT_TRUE(Router6Factory::Make6to4Request(Parse(R"({"wan": "eth0"})"), "10.1.2.3", request));
    EXPECT_EQ(request, Parse(R"({"wan": "eth0", "is_default_gateway": false,
        "prefix": "2002:0a01:0203::/48", "local_addr_v6": "2002:0a01:0203::1/16",
        "remote_addr_v4": "192.88.99.1"})"));
    const auto loopback = Router6Factory::new6to4Attr(Parse(R"({"wan": "lo"})"));
    ASSERT_TRUE(loopback != nullptr);
    EXPECT_EQ(loopback->ToJson()["config"]["prefix"], "2002:7f00:0001::/48");
    EXPECT_EQ(loopback->type + " " + loopback->local_addr_v4, "6to4 127.0.0.1");
}

TEST_F(Router6Test, UntrustedSettingsAreRefusedBeforeAnythingRuns) {
    // On lo, which has an IPv4 address everywhere, only the bad field can refuse a request.
    const std::string good = R"("wan": "lo", "prefix": "2001:db8::/48",
        "remote_addr_v4": "198.51.100.1", "local_addr_v6": "2001:db8::2/64")";
    EXPECT_TRUE(Router6Factory::new6in4Attr(Parse("{" + good + "}")) != nullptr);
    for (const char* bad :
         {R"("wan": "lo;reboot")", R"("wan": 7)", R"("prefix": "2001:db8::/129")",
          R"("prefix": "2001:db8::")", R"("remote_addr_v4": "10.1")",
          R"("remote_addr_v4": "10.0.0.1\u0000")", R"("local_addr_v6": "2001:db8::2\n/64")",
          R"("is_default_gateway": "yes")"}) {
        // The later of two equal keys wins.
        EXPECT_TRUE(Router6Factory::new6in4Attr(Parse("{" + good + ", " + bad + "}")) == nullptr)
            << bad;
    }
    EXPECT_FALSE(IsValidWan("eth0.100.1001", "6in4"));  // "6in4-" + name is too long
    EXPECT_TRUE(IsValidWan("eth0.100.1001", "native"));
    root_.WriteFile(std::string(kSettings) + "eth0",
                    "[conf]\n\ttype=6in4\n\twan=eth0\n\tprefix=2001:db8::/48\n[addr]\n"
                    "\tlocal_addr_v4=300.1.1.1\n\tremote_addr_v4=198.51.100.1\n"
                    "\tlocal_addr_v6=2001:db8::2/64\n[lan]\n");
    EXPECT_TRUE(Router6Factory::newRouterV6Instance(std::string("eth0")) == nullptr);
    EXPECT_TRUE(log_.Contains("Invalid local v4 address (300.1.1.1)"));
    root_.WriteFile(std::string(kSettings) + "eth0",
                    "[conf]\n\ttype=native\n\twan=eth0\n[addr]\n[lan]\n\t../br0=\n");
    EXPECT_TRUE(Router6Factory::newRouterV6Instance(std::string("eth0")) == nullptr);
    EXPECT_TRUE(log_.Contains("Invalid lan interface [../br0]"));
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_EQ(root_.ReadFile("/proc/sys/net/ipv6/conf/all/forwarding"), "0\n");
    EXPECT_TRUE(Tunnel6in4(Router6Attr()).SetSysConfig(true));  // no WAN: nothing to mark
}

TEST_F(Router6Test, RoutersRunTheirProgramsAndTakeTheirGatewayPlace) {
    test::PrivateBus bus;
    test::DaemonProcess vornnetd({VORN_BINARY_DIR "/daemons/vornnetd", "--foreground"});
    ASSERT_TRUE(vornnetd.WaitForBusName("com.tessarin.net", std::chrono::seconds(30)));
    ASSERT_TRUE(vornwireless::utils::SetGatewayInfo("eth0", "GTYPE_V6", "fe80::1", "NULL",
                                                    "ethernet", 0, false));
    const std::string device = "6in4-ppp0";
    for (bool isDefault : {false, true}) {
        tunnel_.is_default_gateway = isDefault;
        Tunnel6in4 router(tunnel_);
        ASSERT_TRUE(router.ValidateAttr());
        ASSERT_TRUE(router.Create());
        Router6Attr loaded("pppoe", !isDefault);
        ASSERT_EQ(loaded.LoadConfig(), 0);
        EXPECT_EQ(loaded.is_default_gateway, isDefault);
        EXPECT_EQ(vornwireless::utils::GetGatewayPriority(device, "GTYPE_V6"), isDefault ? 0 : 1);
    }
    EXPECT_EQ(root_.ReadFile("/proc/sys/net/ipv6/conf/ppp0/disable_ipv6"), "0\n");
    EXPECT_THAT(root_.ReadFile("/etc/sysconfig/network-scripts/ifcfg-ppp0"),
                ::testing::HasSubstr("IPV6ROUTER=yes"));
    EXPECT_TRUE(Tunnel6in4(tunnel_).Destroy());
    EXPECT_EQ(vornwireless::utils::GetGatewayPriority(device, "GTYPE_V6"), -1);
    EXPECT_FALSE(root_.Exists(std::string(kSettings) + "ppp0"));
    const std::string tunnelAdd =
        "/sbin/ip tunnel add " + device + " mode sit remote 198.51.100.1 local 192.0.2.2 ttl 255";
    const std::string up = "/sbin/ip link set " + device + " up";
    const std::string address = "/sbin/ip addr add 2001:db8::2/64 dev " + device;
    EXPECT_THAT(CallsWith("/sbin/ip ", device),
                ElementsAre(tunnelAdd, up, address, tunnelAdd, up, address,
                            "/sbin/ip tunnel del " + device));

    DHCPPD client(Router6Attr("eth0", true));
    ASSERT_TRUE(client.ValidateAttr());
    ASSERT_TRUE(client.Create());
    EXPECT_EQ(root_.ReadFile(client.LeaseFile()),
              "default-duid \"\\000\\003\\000\\001\\002vorn\\001\";\n");
    EXPECT_TRUE(client.Destroy());
    const std::string words = " -lf " + root_.Path(client.LeaseFile()) + " -pf " +
                              root_.Path("/tmp/dhclient6-eth0.pid") + " -P -nw eth0";
    EXPECT_THAT(CallsWith("/usr/sbin/dhclient", " eth0"),
                ElementsAre("/usr/sbin/dhclient -6" + words, "/usr/sbin/dhclient -6 -x" + words));
    char duid[64];
    ASSERT_EQ(GenDUID("eth0", VORN_DUID_LLT, duid, sizeof(duid)), 0);
    EXPECT_THAT(duid, ::testing::MatchesRegex(R"(\\000\\001\\000\\001.{4,16}\\002vorn\\001)"));
}

TEST_F(Router6Test, TwoLansShareTheTwo64sOfADelegatedPrefix) {
    EXPECT_THAT(Router6Prefix::EnumPrefix64("2001:db8:0:100::", 56),
                ElementsAre("2001:db8:0:100::", "2001:db8:0:101::"));
    EXPECT_THAT(Router6Prefix::EnumPrefix64("2001:db8:0:100::", 64),
                ElementsAre("2001:db8:0:100::"));
    EXPECT_THAT(Router6Prefix::EnumPrefix64("2001:db8:0:100::", 65), IsEmpty());
    EXPECT_EQ(Router6Prefix::NormalizePrefix("2001:0db8:0:0100:0::/56"), "2001:db8:0:100::/56");
    tunnel_.wan = "eth0";
    tunnel_.prefix = "2001:db8:0:100::/56";
    ASSERT_EQ(tunnel_.SaveConfig(), 0);
    Router6Prefix prefixes;
    ASSERT_TRUE(prefixes.Allocate("br0", "eth0"));
    ASSERT_TRUE(prefixes.Allocate("br1", "eth0"));
    EXPECT_FALSE(prefixes.Allocate("br2", "eth0"));
    EXPECT_TRUE(prefixes.Deallocate("br0", "eth0"));
    EXPECT_FALSE(prefixes.Deallocate("br0", "eth0"));
    ASSERT_TRUE(prefixes.Allocate("br2", "eth0"));
    Router6Prefix reloaded;
    ASSERT_EQ(reloaded.List().size(), 1u);
    EXPECT_EQ(reloaded.List()[0].lan, Router6Attr::LanList({{"br1", "2001:db8:0:101::/64"},
                                                            {"br2", "2001:db8:0:100::/64"}}));
}

}  // namespace
}  // namespace vorn::network::ipv6::router
