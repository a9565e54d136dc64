#include "network/module/wifiscanner.h"

#include <gmock/gmock.h>

#include <climits>
#include <string>

#include "support/sim_root.h"

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using vornnetwork::network::module::WifiScanner;

class WifiScannerTest : public vorn::test::RootTest {
  protected:
    void SetUp() override { scanner_->EraseList(); }

    WifiScanner* scanner_ = WifiScanner::Inst();
};

TEST_F(WifiScannerTest, StationsOfEveryWlanWithCountersAndSignal) {
    root_.Scenario("hostapd_cli",
                   "when interface\n"
                   "print Selected interface 'wlan0'\n"
                   "print Available interfaces:\n"
                   "print wlan0\n"
                   "print wlan1\n"
                   "print wlan2;reboot\n"
                   "print eth0\n"
                   "when -i wlan0 all_sta\n"
                   "print 00:11:22:33:44:55\n"
                   "print flags=[AUTH][ASSOC][AUTHORIZED]\n"
                   "print rx_bytes=100\n"
                   "print 66:77:88:99:AA:BB extra\n"
                   "when -i wlan1 all_sta\n"
                   "print $(reboot)\n");
    root_.Scenario("iw",
                   "when dev wlan0 station get 00:11:22:33:44:55\n"
                   "print Station 00:11:22:33:44:55 (on wlan0)\n"
                   "print \trx bytes:\t18816\n"
                   "print \ttx bytes:\t5386\n"
                   "print \tsignal:  \t-29 [-31, -34] dBm\n"
                   "print \tsignal avg:\t-36 [-31, -35] dBm\n"
                   "print \tsignal avg:\t-80 dBm\n"
                   "print \trx bytes:\t1\n"
                   "when dev wlan0 station get 66:77:88:99:AA:BB\n"
                   "print \tsignal avg:\tloud dBm\n");

    const Json::Value clients = scanner_->GetData()["ClientList"];
    ASSERT_EQ(clients.size(), 2u);
    EXPECT_EQ(clients[0]["macAddr"], "00:11:22:33:44:55");
    EXPECT_EQ(clients[0]["transferTX"], "5386");
    EXPECT_EQ(clients[0]["signalstrength"], 98);
    EXPECT_EQ(clients[1]["macAddr"], "66:77:88:99:AA:BB");
    EXPECT_FALSE(clients[1].isMember("signalstrength"));
    EXPECT_TRUE(scanner_->GetClientList()["ClientList"].empty());
    EXPECT_THAT(root_.Calls(), ElementsAre("/usr/bin/hostapd_cli interface",
                                           "/usr/bin/hostapd_cli -i wlan0 all_sta",
                                           "/usr/sbin/iw dev wlan0 station get 00:11:22:33:44:55",
                                           "/usr/sbin/iw dev wlan0 station get 66:77:88:99:AA:BB",
                                           "/usr/bin/hostapd_cli -i wlan1 all_sta"));
    EXPECT_TRUE(log_.Contains("wifiscanner.cpp:"));
    EXPECT_TRUE(log_.Contains("Failed to get connection list for [wlan2;reboot]"));

    root_.ClearCalls();
    root_.WriteFile("/etc/vorninfo.conf", "net_topology=\"client\"\n");
    EXPECT_TRUE(scanner_->GetData()["ClientList"].empty());
    EXPECT_THAT(root_.Calls(), IsEmpty());
}

TEST_F(WifiScannerTest, IwIsAskedOnlyAboutValidStations) {
    Json::Value station(Json::objectValue);
    station["netif"] = "wlan0";
    EXPECT_EQ(scanner_->GetIwDevInfo(station), -1);
    station["macAddr"] = "00:11:22:33:44:55;reboot";
    EXPECT_EQ(scanner_->GetIwDevInfo(station), -1);
    EXPECT_EQ(scanner_->GetStationByIfName("$(reboot)"), -1);
    // A station whose counters cannot be read is still listed.
    EXPECT_EQ(scanner_->AppendClientList("00:11:22:33:44:55", "wlan0 x"), 0);
    EXPECT_TRUE(log_.Contains("failed to iw dev for wifi data"));
    EXPECT_EQ(scanner_->GetClientList()["ClientList"].size(), 1u);
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_EQ(WifiScanner::ConvertDbmToPercent(-35), 100);
    EXPECT_EQ(WifiScanner::ConvertDbmToPercent(INT_MIN), 0);
    // The pattern must see the whole word, not the text before a NUL.
    EXPECT_THAT(WifiScanner::ParseStations({std::string("00:11:22:33:44:55\0;x", 20)}), IsEmpty());
}

}  // namespace
