#include "platform/vorn_net.h"

#include <gmock/gmock.h>

#include <cstring>

#include "platform/qlibc_error.h"
#include "support/sim_root.h"

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

using VornNetTest = vorn::test::RootTest;

const std::string kIfcfg = "/etc/sysconfig/network-scripts/ifcfg-";
const std::string kShow = "/sbin/ip -4 route show table main";

TEST_F(VornNetTest, IfcfgRecordsReadApplyBackAndRefuseMalformedOnes) {
    EXPECT_EQ(BlVORNLnxIsDHCP("eth0"), 1);
    EXPECT_EQ(BlVORNLnxIsDHCP("../network-scripts/ifcfg-eth0"), 0);
    VORN_NET_IF_CONFIG info;
    ASSERT_EQ(VORNNetIFGetInfo("eth0", 0, &info), 0);
    EXPECT_EQ(info.dhcp, 1);
    EXPECT_STREQ(info.ipv4, "");

    root_.WriteFile(kIfcfg + "eth1",
                    "DEVICE=eth1\nBOOTPROTO=none\nIPADDR=192.168.1.5\n"
                    "NETMASK=255.255.255.0\nGATEWAY=192.168.1.1\nONBOOT=yes\n");
    ASSERT_EQ(VORNNetIFGetInfo("eth1", 0, &info), 0);
    EXPECT_STREQ(info.name, "eth1");
    EXPECT_EQ(info.dhcp, 0);
    EXPECT_STREQ(info.gateway, "192.168.1.1");
    std::strcpy(info.ipv4, "192.168.1.6");
    info.gateway[0] = '\0';
    ASSERT_EQ(VORNNetSetCard1(&info, 0), 0);
    EXPECT_EQ(root_.ReadFile(kIfcfg + "eth1"),
              "DEVICE=eth1\nBOOTPROTO=none\nIPADDR=192.168.1.6\n"
              "NETMASK=255.255.255.0\nONBOOT=yes\n");
    info.dhcp = 1;
    ASSERT_EQ(VORNNetSetCard1(&info, 0), 0);
    EXPECT_THAT(root_.ReadFile(kIfcfg + "eth1"), ::testing::HasSubstr("BOOTPROTO=dhcp\n"));
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/etc/rc.network restart-if eth1", "/etc/rc.network restart-if eth1"));

    root_.ClearCalls();
    EXPECT_EQ(VORNNetIFGetInfo("eth9", 0, &info), -1);  // no file
    EXPECT_EQ(VORNNetIFGetInfo("eth0;x", 0, &info), -1);
    root_.WriteFile(kIfcfg + "eth1", "DEVICE=eth1\nIPADDR=10.0.0.300\n");
    EXPECT_EQ(VORNNetIFGetInfo("eth1", 0, &info), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_FORMAT);
    root_.WriteFile(kIfcfg + "eth1", "DEVICE=eth1 x\n");
    EXPECT_EQ(VORNNetIFGetInfo("eth1", 0, &info), -1);

    std::memset(&info, 0, sizeof(info));
    std::strcpy(info.name, "eth1");
    std::strcpy(info.ipv4, "1.2.3.4;x");
    EXPECT_EQ(VORNNetSetCard1(&info, 0), -1);
    std::memset(info.ipv4, 0, sizeof(info.ipv4));
    std::memset(info.name, 'e', sizeof(info.name));  // no terminating NUL
    EXPECT_EQ(VORNNetSetCard1(&info, 0), -1);
    EXPECT_EQ(VORNNetSetCard1(nullptr, 0), -1);
    EXPECT_EQ(root_.ReadFile(kIfcfg + "eth1"), "DEVICE=eth1 x\n");
    EXPECT_THAT(root_.Calls(), IsEmpty());
}

TEST_F(VornNetTest, DefaultGatewayRefusesWhatDoesNotFitOrParse) {
    char gateway[20] = "stale";
    EXPECT_EQ(VORNNetDefaultGatewayGetConf(gateway, sizeof(gateway)), 0);  // no file
    EXPECT_STREQ(gateway, "");
    root_.Scenario("ip",
                   "when -4 route show table main\nprint 10.0.0.0/24 dev eth0\n"
                   "print default via 10.0.0.1 dev eth0 metric 10\n"
                   "print default via 10.0.0.9 dev wlan0 metric 20\n");
    EXPECT_EQ(VORNNetDefaultGatewayGet(gateway, sizeof(gateway)), 0);
    EXPECT_STREQ(gateway, "10.0.0.1");
    EXPECT_EQ(VORNNetDefaultGatewayGet(gateway, 8), -1);  // does not fit
    EXPECT_EQ(VORNNetDefaultGatewaySet("10.0.0.254 dev eth1"), -1);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow, kShow));
    root_.Scenario("ip", "when -4 route show table main\nprint default via 10.0.0.1\nexit 2\n");
    EXPECT_EQ(VORNNetDefaultGatewayGet(gateway, sizeof(gateway)), -1);
    EXPECT_EQ(VORNNetDefaultGatewaySetConf("10.0.0.1\nX=y"), -1);
    root_.WriteFile("/etc/sysconfig/network", "GATEWAY=gw.example\n");
    EXPECT_EQ(VORNNetDefaultGatewayGetConf(gateway, sizeof(gateway)), -1);
    EXPECT_EQ(root_.ReadFile("/etc/sysconfig/network"), "GATEWAY=gw.example\n");
}

TEST_F(VornNetTest, EventLogLinesStayOneLineEach) {
    EXPECT_EQ(VORNLogSet1(2, 1, 0x11801311u, "10.0.0.1", "10.0.0.2", nullptr), 0);
    EXPECT_EQ(VORNLogSet1(2, 1, 0xBu, "forged\n2000-01-01\tline", nullptr), 0);
    const std::string date = "[0-9]{4}-[0-9]{2}-[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2}";
    EXPECT_THAT(root_.ReadFile("/var/log/vorn_event.log"),
                ::testing::MatchesRegex(date + "\t2\t1\t0x11801311\t10.0.0.1\t10.0.0.2\n" + date +
                                        "\t2\t1\t0x0000000B\tforged 2000-01-01 line\n"));
}

TEST_F(VornNetTest, PPPoERelayFollowsEachInterfaceFileAndSkipsBadNames) {
    root_.WriteFile(kIfcfg + "eth0", "DEVICE=eth0\nPPPOE_RELAY=\"yes\"\n");
    root_.WriteFile(kIfcfg + "eth1", "DEVICE=eth1\nPPPOE_RELAY=no\n");
    root_.WriteFile(kIfcfg + "eth2", "DEVICE=eth2\n");
    root_.WriteFile(kIfcfg + "x;reboot", "PPPOE_RELAY=yes\n");
    root_.Scenario("rc.network", "when start-pppoe-relay *\nexit 1\n");
    EXPECT_EQ(VORNNetApplyPPPoERelayConfigAll(), -1);
    EXPECT_THAT(root_.Calls(), ElementsAre("/etc/rc.network start-pppoe-relay eth0",
                                           "/etc/rc.network stop-pppoe-relay eth1"));
    root_.Scenario("rc.network", "");
    EXPECT_EQ(VORNNetApplyPPPoERelayConfigAll(), 0);
}

}  // namespace
