#include "platform/qlib_net.h"

#include <gmock/gmock.h>

#include "platform/qlibc_error.h"
#include "support/sim_root.h"

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

using QlibNetTest = vorn::test::RootTest;

TEST_F(QlibNetTest, ListsInterfacesInNameOrderWithLinkAndFirstAddress) {
    root_.WriteFile("/sys/class/net/wlan0/operstate", "dormant\n");
    root_.WriteFile("/sys/class/net/bonding_masters", "\n");
    root_.WriteFile("/sys/class/net/bad;name/operstate", "up\n");
    root_.WriteFile("/sys/class/net/br0/operstate", "up\n");
    root_.Scenario("ip",
                   "when -4 -o addr show dev eth0\nprint 2: eth0    inet 10.0.0.2/24 brd "
                   "10.0.0.255 scope global eth0\\       valid_lft forever\n"
                   "print 2: eth0    inet 10.0.0.3/24 scope global secondary eth0\n"
                   "when -4 -o addr show dev wlan0\n"
                   "print 3: wlan0    inet 300.1.1.1/24 scope global wlan0\n");
    QLIB_NET_IF_INFO records[4];
    ASSERT_EQ(QLIBNetGetInterfaceInfo(records, 4, QLIB_NET_INFO_LINK | QLIB_NET_INFO_IPV4), 3);
    std::string seen;
    for (int i = 0; i < 3; ++i) {
        seen += std::string(records[i].name) + " " + records[i].ipv4 + " " +
                (records[i].link == QLIB_NET_LINK_UP ? "up;" : "down;");
    }
    EXPECT_EQ(seen, "br0  up;eth0 10.0.0.2 up;wlan0  down;");  // wlan0's address is malformed
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/sbin/ip -4 -o addr show dev br0", "/sbin/ip -4 -o addr show dev eth0",
                            "/sbin/ip -4 -o addr show dev wlan0"));
    // Only what is asked for, and never more than max.
    root_.ClearCalls();
    ASSERT_EQ(QLIBNetGetInterfaceInfo(records, 1, QLIB_NET_INFO_LINK), 1);
    EXPECT_STREQ(records[0].name, "br0");
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_EQ(QLIBNetGetInterfaceInfo(nullptr, 1, 0), -1);
}

TEST_F(QlibNetTest, LinkHandlersRunRcNetworkAndRefuseBadNames) {
    EXPECT_EQ(QLIBNetIfLinkUpEvent("eth0"), 0);
    EXPECT_EQ(QLIBNetIfLinkDownEvent("wlan0"), 0);
    EXPECT_EQ(NetRoutetableHandler(0, "eth0"), 0);
    EXPECT_EQ(NetRoutetableHandler(1, "eth0"), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/etc/rc.network link-up eth0", "/etc/rc.network link-down wlan0",
                            "/etc/rc.network route-table-up eth0",
                            "/etc/rc.network route-table-down eth0"));
    root_.ClearCalls();
    for (const char* bad : {"", "eth0;reboot", "../eth0", "a-name-of-16-chr", "two words"}) {
        QLIBCErrSet(QLIBC_ERR_NONE);
        EXPECT_EQ(QLIBNetIfLinkUpEvent(bad), -1) << bad;
        EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_INVALID_ARG) << bad;
        EXPECT_EQ(QLIBNetIfLinkDownEvent(bad), -1) << bad;
        EXPECT_EQ(NetRoutetableHandler(0, bad), -1) << bad;
        EXPECT_EQ(QLIBNetBridgeIfIsSlave(bad), -1) << bad;
    }
    EXPECT_EQ(QLIBNetIfLinkUpEvent(nullptr), -1);
    EXPECT_EQ(NetRoutetableHandler(2, "eth0"), -1);
    EXPECT_THAT(root_.Calls(), IsEmpty());
    root_.Scenario("rc.network", "when link-up *\nexit 1\n");
    EXPECT_EQ(QLIBNetIfLinkUpEvent("eth0"), -1);
    // Every topology the wifi half writes has its code.
    for (const auto& [word, code] : {std::make_pair("client", 1), std::make_pair("bridge", 2),
                                     std::make_pair("router", 3), std::make_pair("repeater", 4)}) {
        root_.WriteFile("/etc/vorninfo.conf", std::string("net_topology=\"") + word + "\"\n");
        EXPECT_EQ(QLIBNetTopologyGet(0), code) << word;
    }
    for (const auto& [settings, error] : {std::make_pair("net_topology=mesh\n", QLIBC_ERR_FORMAT),
                                          std::make_pair("", QLIBC_ERR_NOT_FOUND)}) {
        root_.WriteFile("/etc/vorninfo.conf", settings);
        EXPECT_EQ(QLIBNetTopologyGet(0), -1);
        EXPECT_EQ(QLIBCErrGet(), error);
    }
}

}  // namespace
