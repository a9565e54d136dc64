#include "utils/gateway.h"

#include <gmock/gmock.h>

#include "support/sim_root.h"

namespace vornwireless::utils {
namespace {

using ::testing::ElementsAre;
using ::testing::EndsWith;

const std::string kShow = "/sbin/ip -4 route show table main";
const std::string kReplace = "/sbin/ip -4 route replace default via ";
const std::string kNetwork = "/etc/sysconfig/network";
const std::string kEvents = "/var/log/vorn_event.log";

class GatewayTest : public vorn::test::RootTest {
  protected:
    // The running (ip route) and the configured gateway; "" for none.
    void Gateways(const std::string& running, const std::string& configured) {
        root_.Scenario("ip", "when -4 route show table main\nprint 10.0.0.0/24 dev eth0\n" +
                                 (running.empty() ? "" : "print default via " + running + "\n"));
        root_.WriteFile(kNetwork, configured.empty() ? "" : "GATEWAY=" + configured + "\n");
        root_.ClearCalls();
    }

    Gateway gateway_;
};

TEST_F(GatewayTest, SetChangesBothGatewaysRecordsWhatChangedAndStopsOnFailures) {
    Gateways("10.0.0.1", "10.0.0.1");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.1")), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow));
    EXPECT_FALSE(root_.Exists(kEvents));
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.2")), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow, kShow, kReplace + "10.0.0.2"));
    EXPECT_EQ(root_.ReadFile(kNetwork), "GATEWAY=10.0.0.2\n");
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t2\t1\t0x11801311\t10.0.0.1\t10.0.0.2\n"));
    // The simulated table still runs 10.0.0.1, now the gateway that is removed.
    root_.ClearCalls();
    EXPECT_EQ(gateway_.Set(IPAddress()), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow, kShow, "/sbin/ip -4 route del default"));
    EXPECT_EQ(root_.ReadFile(kNetwork), "");
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t0x11801310\t10.0.0.1\n"));
    Gateways("", "");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.5")), 0);
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t0x1180130F\t10.0.0.5\n"));
    // Only the configuration differed: the change is told against it.
    Gateways("10.0.0.5", "10.0.0.6");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.5")), 0);
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t0x11801311\t10.0.0.6\t10.0.0.5\n"));
    EXPECT_TRUE(log_.Lines().empty());

    // Platform failures stop Set with their messages.
    root_.WriteFile(kEvents, "");
    root_.Scenario("ip", "when -4 route show table main\nexit 2\n");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.2")), -1);
    EXPECT_TRUE(log_.Contains("gateway.cpp:"));
    EXPECT_TRUE(log_.Contains(" get gateway failed [0x0B00]"));
    Gateways("10.0.0.1", "10.0.0.1");
    root_.Scenario("ip",
                   "when -4 route show table main\nprint default via 10.0.0.1\n"
                   "when -4 route replace *\nexit 2\n");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.2")), -1);
    EXPECT_TRUE(log_.Contains(" set gateway failed"));
    // Nothing is rolled back: the configuration was already stored.
    EXPECT_EQ(root_.ReadFile(kNetwork), "GATEWAY=10.0.0.2\n");
    EXPECT_EQ(root_.ReadFile(kEvents), "");
    // An IPv6 text is an address, but not one for the IPv4 default route.
    root_.ClearCalls();
    EXPECT_EQ(gateway_.Set(IPAddress("2001:db8::1")), -1);
    EXPECT_TRUE(log_.Contains(" set gateway conf failed"));
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow));
}

TEST_F(GatewayTest, BackupPrefersTheRunningGatewayAndRestoreSetsIt) {
    EXPECT_EQ(gateway_.Restore(), -1);
    EXPECT_TRUE(root_.Calls().empty());
    Gateways("", "");
    EXPECT_EQ(gateway_.Backup(), -1);
    EXPECT_TRUE(log_.Contains("Failed to backup gateway"));
    Gateways("", "10.0.0.7");
    EXPECT_EQ(gateway_.Backup(), 0);
    Gateways("10.0.0.9", "10.0.0.9");
    EXPECT_EQ(gateway_.Restore(), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow, kReplace + "10.0.0.7"));
    Gateways("10.0.0.9", "10.0.0.8");
    EXPECT_EQ(gateway_.Backup(), 0);
    Gateways("10.0.0.1", "");
    EXPECT_EQ(gateway_.Restore(), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow, kReplace + "10.0.0.9"));
}

}  // namespace
}  // namespace vornwireless::utils
