#include "utils/gateway.h"

#include <gmock/gmock.h>

#include <string>

#include "support/sim_root.h"

namespace vornwireless {
namespace utils {
namespace {

using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::IsEmpty;

const std::string kShow = "/sbin/ip -4 route show table main";
const std::string kNetwork = "/etc/sysconfig/network";
const std::string kEvents = "/var/log/vorn_event.log";

class GatewayTest : public vorn::test::RootTest {
  protected:
    void Running(const std::string& gw) {
        root_.Scenario("ip", "when -4 route show table main\nprint 10.0.0.0/24 dev eth0\n" +
                                 (gw.empty() ? "" : "print default via " + gw + " dev eth0\n"));
    }
    void Configured(const std::string& gw) { root_.WriteFile(kNetwork, "GATEWAY=" + gw + "\n"); }

    Gateway gateway_;
};

TEST_F(GatewayTest, SetChangesRunningAndConfiguredGatewayAndRecordsWhatChanged) {
    Running("10.0.0.1");
    Configured("10.0.0.1");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.1")), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow));
    EXPECT_FALSE(root_.Exists(kEvents));

    root_.ClearCalls();
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.2")), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre(kShow, "/sbin/ip -4 route replace default via 10.0.0.2"));
    EXPECT_EQ(root_.ReadFile(kNetwork), "GATEWAY=10.0.0.2\n");
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t2\t1\t0x11801311\t10.0.0.1\t10.0.0.2\n"));

    // The simulated table still runs 10.0.0.1, now the gateway that is removed.
    root_.ClearCalls();
    EXPECT_EQ(gateway_.Set(IPAddress()), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow, kShow, "/sbin/ip -4 route del default"));
    EXPECT_EQ(root_.ReadFile(kNetwork), "");
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t0x11801310\t10.0.0.1\n"));

    Running("");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.5")), 0);
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t0x1180130F\t10.0.0.5\n"));
    // Only the configuration differed: the change is told against it.
    Running("10.0.0.5");
    Configured("10.0.0.6");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.5")), 0);
    EXPECT_THAT(root_.ReadFile(kEvents), EndsWith("\t0x11801311\t10.0.0.6\t10.0.0.5\n"));
    EXPECT_TRUE(log_.Lines().empty());
}

TEST_F(GatewayTest, BackupFallsBackToTheConfiguredGatewayAndRestoreSetsIt) {
    EXPECT_EQ(gateway_.Restore(), -1);
    EXPECT_THAT(root_.Calls(), IsEmpty());

    EXPECT_EQ(gateway_.Backup(), -1);
    EXPECT_TRUE(log_.Contains("Failed to backup gateway"));

    Configured("10.0.0.7");
    EXPECT_EQ(gateway_.Backup(), 0);
    Running("10.0.0.9");
    root_.ClearCalls();
    EXPECT_EQ(gateway_.Restore(), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre(kShow, "/sbin/ip -4 route replace default via 10.0.0.7"));

    // The running gateway wins over the configured one.
    Configured("10.0.0.8");
    EXPECT_EQ(gateway_.Backup(), 0);
    root_.ClearCalls();
    EXPECT_EQ(gateway_.Restore(), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre(kShow, "/sbin/ip -4 route replace default via 10.0.0.9"));
}

TEST_F(GatewayTest, PlatformFailuresStopSetWithTheirMessages) {
    root_.Scenario("ip", "when -4 route show table main\nexit 2\n");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.2")), -1);
    EXPECT_TRUE(log_.Contains("gateway.cpp:"));
    EXPECT_TRUE(log_.Contains(" get gateway failed [0x0B00]"));
    EXPECT_TRUE(log_.Contains(" Failed to get gateway"));

    log_.Clear();
    Configured("10.0.0.1");
    root_.Scenario("ip",
                   "when -4 route show table main\nprint default via 10.0.0.1\n"
                   "when -4 route replace *\nexit 2\n");
    EXPECT_EQ(gateway_.Set(IPAddress("10.0.0.2")), -1);
    EXPECT_TRUE(log_.Contains(" set gateway failed"));
    // Nothing is rolled back: the configuration was already stored.
    EXPECT_EQ(root_.ReadFile(kNetwork), "GATEWAY=10.0.0.2\n");
    EXPECT_FALSE(root_.Exists(kEvents));

    // An IPv6 text is an address, but not one for the IPv4 default route.
    root_.ClearCalls();
    EXPECT_EQ(gateway_.Set(IPAddress("2001:db8::1")), -1);
    EXPECT_TRUE(log_.Contains(" set gateway conf failed"));
    EXPECT_THAT(root_.Calls(), ElementsAre(kShow));
}

}  // namespace
}  // namespace utils
}  // namespace vornwireless
