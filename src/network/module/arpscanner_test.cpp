#include "network/module/arpscanner.h"

#include <gmock/gmock.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <string>
#include <thread>
#include <vector>

#include "platform/shell_command.h"
#include "support/sim_root.h"

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using vornnetwork::network::module::ArpScanner;

const char kArpTable[] =
    "when -a\n"
    "print ? (192.168.1.10) at aa:bb:cc:00:00:01 [ether] on br0\n"
    "print laptop (192.168.1.11) at aa:bb:cc:00:00:02 [ether] on br0\n"
    "print ? (10.0.0.1) at aa:bb:cc:00:00:03 [ether] on eth0\n"
    "print ? (192.168.1.12) at aa:bb:cc:00:00:04 [ether] on lbr0\n"
    "print ? (192.168.1.13) at <incomplete> on br0\n";

class ArpScannerTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        root_.Scenario("nmblookup",
                       "when -A 192.168.1.12\n"
                       "print Looking up status of 192.168.1.12\n"
                       "print \tWORKGROUP       <00> - <GROUP> B <ACTIVE>\n"
                       "print \tPRINTER01       <00> -         B <ACTIVE>\n"
                       "print \tPRINTER01       <20> -         B <ACTIVE>\n");
        root_.WriteFile("/etc/dhcpd/dhcpd.conf.leases",
                        "1700000000 aa:bb:cc:00:00:01 192.168.1.10 nas-box 01:aa\n"
                        "1700000000 aa:bb:cc:00:00:04 192.168.1.12 * *\n");
        scanner_->EraseList();
    }
    void TearDown() override { WaitForScan(); }

    void SetTopology(const char* topology) {
        root_.WriteFile("/etc/vorninfo.conf", std::string("net_topology=\"") + topology + "\"\n");
    }
    static void WaitForScan() {
        for (int i = 0; i < 1000 && ArpScanner::IsScanning(); ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
        ASSERT_FALSE(ArpScanner::IsScanning());
    }
    Json::Value Client(unsigned index) { return scanner_->GetClientList()["ClientList"][index]; }

    ArpScanner* scanner_ = ArpScanner::Inst();
};

TEST_F(ArpScannerTest, HostileLinesAreSkippedBeforeAnyCommand) {
    SetTopology("bridge");
    ASSERT_EQ(scanner_->GetArpTable(), 0);  // sets the topology; the table is empty
    root_.ClearCalls();
    for (const char* line : {"? (192.168.1.20) at $(reboot) [ether] on br0",
                             "? (192.168.1.999) at aa:bb:cc:00:00:22 [ether] on br0",
                             "? (192.168.1.23) at aa:bb:cc:00:00:23 [ether] on br0;reboot"}) {
        EXPECT_EQ(scanner_->AppendClientList(line), -1) << line;
    }
    EXPECT_EQ(scanner_->AppendClientList("? (10.0.0.1) at $(reboot) [ether] on eth0"), 0);
    EXPECT_EQ(scanner_->AppendClientList(""), 0);
    std::string name = "kept";
    EXPECT_EQ(scanner_->GetNmbInfoByIP("1.2.3.4 ; reboot", name), -1);
    EXPECT_EQ(name, "kept");
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_TRUE(scanner_->GetClientList()["ClientList"].empty());

    root_.Scenario("arp", "when -a\nprint " + std::string(5000, 'x') +
                              " (192.168.1.30) at aa:bb:cc:00:00:30 [ether] on br0\n"
                              "print ? (192.168.1.31) at aa:bb:cc:00:00:31 [ether] on br0\n");
    ASSERT_EQ(scanner_->GetArpTable(), 0);
    ASSERT_EQ(scanner_->GetClientList()["ClientList"].size(), 1u);
    EXPECT_EQ(Client(0)["ipAddr"], "192.168.1.31");

    ASSERT_EQ(unlink(root_.Path("/etc/dhcpd/dhcpd.conf.leases").c_str()), 0);
    EXPECT_EQ(scanner_->GetDHCPInfoByMAC("aa:bb:cc:00:00:31", name), -1);
    EXPECT_TRUE(log_.Contains("Failed to open dhcp leases file"));
}

TEST_F(ArpScannerTest, LargeTablesAreReadWholeAndACutIsLogged) {
    SetTopology("router");
    std::string table = "when -a\n";
    char line[96];
    for (int i = 0; i < 1100; ++i) {
        std::snprintf(line, sizeof(line),
                      "print h%d (10.1.%d.%d) at aa:bb:cc:00:%02x:%02x [ether] on br0\n", i,
                      i / 256, i % 256, i / 256, i % 256);
        table += line;
    }
    root_.Scenario("arp", table);
    ASSERT_EQ(scanner_->GetArpTable(), 0);
    EXPECT_EQ(scanner_->GetClientList()["ClientList"].size(), 1100u);
    EXPECT_TRUE(log_.Matching("cut at").empty());

    std::vector<std::string> lines;
    ASSERT_EQ(vorn::platform::ReadShellCommandLines("/usr/bin/printf '%s\\n' a b c d", lines, 3),
              0);
    EXPECT_THAT(lines, ElementsAre("a", "b", "c"));
    EXPECT_TRUE(log_.Contains("Output of [/usr/bin/printf '%s\\n' a b c d] cut at 3 lines"));
}

TEST_F(ArpScannerTest, GetDataAnswersTheLastFinishedScanWhileTheNextRuns) {
    SetTopology("router");
    root_.Scenario("arp", kArpTable);
    scanner_->GetData();
    WaitForScan();
    EXPECT_EQ(root_.Calls().front(), "/sbin/arp -a");
    // Each call starts the next scan, which empties the working list at once: callers who ask
    // now and then must still see the clients.
    EXPECT_EQ(scanner_->GetData()["ClientList"].size(), 3u);
    WaitForScan();
    root_.Scenario("arp", "when -a\nprint ? (192.168.1.10) at aa:bb:cc:00:00:01 [ether] on br0\n");
    EXPECT_EQ(scanner_->GetData()["ClientList"].size(), 3u);
    WaitForScan();
    const Json::Value clients = scanner_->GetData()["ClientList"];
    ASSERT_EQ(clients.size(), 1u);
    EXPECT_EQ(clients[0]["macAddr"], "aa:bb:cc:00:00:01");
}

}  // namespace
