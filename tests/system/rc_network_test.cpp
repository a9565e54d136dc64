// The platform's network script of a standard Linux system, run for real in a private network
// namespace: a LAN and a guest bridge each with a client in a namespace of its own, dnsmasq from
// the bridges' DHCP files, NAT and guest isolation in nftables, and hostapd's joined file.
#include <gmock/gmock.h>

#include "support/peer_namespace.h"
#include "support/waiting.h"

namespace vorn {
namespace test {
namespace {

using ::testing::HasSubstr;

constexpr char kScript[] = VORN_SOURCE_DIR "/src/platform/rc.network";
constexpr char kLeases[] = "/etc/dhcpd/dhcpd.conf.leases";
constexpr char kHostapd[] = "/etc/hostapd/hostapd-wlan0";

class RcNetworkSystemTest : public PeerNamespaceTest {
  protected:
    void SetUp() override {
        PeerNamespaceTest::SetUp();
        for (const char* side : {"lan", "guest"}) {
            if (IsSkipped() || HasFatalFailure()) {
                return;
            }
            const bool lan = side == std::string("lan");
            const std::string bridge = lan ? "lbr0" : "gbr0";
            const std::string net = lan ? "192.168.100." : "192.168.200.";
            Ip("link add " + bridge + " type bridge");
            AddPeer(side, bridge + "p", lan ? 11 : 12, "c0", 21);
            Ip("link set " + bridge + "p master " + bridge);
            Ip("addr add " + net + "1/24 dev " + bridge);
            Ip("link set " + bridge + " up");
            Ip("-n " + std::string(side) + " addr add " + net + "50/24 dev c0");
            Ip("-n " + std::string(side) + " route add default via " + net + "1");
            root_->WriteFile("/etc/dhcpd/dhcpd-" + bridge + "-" + bridge + "0.conf",
                             "interface=" + bridge + "\ndhcp-range=set:" + bridge + "0," + net +
                                 "100," + net + "150,255.255.255.0,3600\n");
            Dhcp(bridge, lan);
        }
    }
    void TearDown() override {
        if (root_ != nullptr) {
            Dhcp("lbr0", false);
            Dhcp("gbr0", false);
            EXPECT_EQ(Script({"reload-network-services"}), 0) << err_;
            EXPECT_FALSE(root_->Exists("/run/vorn/rc.network/dnsmasq.pid"));
        }
        PeerNamespaceTest::TearDown();
    }

    void Dhcp(const std::string& bridge, bool on) {
        root_->WriteFile("/etc/dhcpd/dhcpd-" + bridge + "-" + bridge + "0.info",
                         on ? "enable=\"yes\"\n" : "enable=\"no\"\n");
    }
    int Script(std::vector<std::string> words) {
        words.insert(words.begin(), kScript);
        return RunProgram(words, std::chrono::seconds(30), &out_, &err_);
    }
    static bool Leases(const std::string& side) {
        return RunProgram({"/sbin/ip", "netns", "exec", side, "/usr/bin/busybox", "udhcpc", "-f",
                           "-q", "-n", "-i", "c0", "-s", "/bin/true"},
                          std::chrono::seconds(30)) == 0;
    }
    static bool Reaches(const std::string& side, const std::string& address) {
        return RunProgram({"/sbin/ip", "netns", "exec", side, "/usr/bin/busybox", "ping", "-c", "1",
                           "-W", "1", address},
                          std::chrono::seconds(10)) == 0;
    }

    std::string out_;
    std::string err_;
};

TEST_F(RcNetworkSystemTest, DhcpNatGuestIsolationAndTheAccessPointsFile) {
    // dnsmasq serves the bridges whose server is on, and only those.
    ASSERT_EQ(Script({"nat-start-dhcp", "lbr0"}), 0) << err_;
    EXPECT_TRUE(Leases("lan"));
    EXPECT_THAT(root_->ReadFile("/run/vorn/rc.network/dnsmasq.conf"),
                ::testing::Not(HasSubstr("gbr0")));
    Dhcp("gbr0", true);
    ASSERT_EQ(Script({"nat-restart-dhcp", "gbr0"}), 0) << err_;
    EXPECT_TRUE(Leases("guest"));
    EXPECT_THAT(root_->ReadFile(kLeases),
                ::testing::AllOf(HasSubstr(" 192.168.100."), HasSubstr(" 192.168.200.")));

    // NAT turns forwarding on; the guest rule then keeps guests out of the LAN, not the reverse.
    EXPECT_FALSE(Reaches("guest", "192.168.100.50"));
    ASSERT_EQ(Script({"start-nat", "lbr0"}), 0) << err_;
    EXPECT_TRUE(Reaches("guest", "192.168.100.50"));
    ASSERT_EQ(Script({"start-guest-nat-rule", "gbr0"}), 0) << err_;
    EXPECT_FALSE(Reaches("guest", "192.168.100.50"));
    EXPECT_FALSE(Reaches("guest", "192.168.100.1"));
    EXPECT_TRUE(Reaches("lan", "192.168.200.50"));
    std::string table;
    RunProgram({"/usr/sbin/nft", "list", "table", "ip", "vorn"}, std::chrono::seconds(10), &table);
    EXPECT_THAT(
        table, HasSubstr("ip saddr 192.168.100.0/24 oifname != { \"gbr0\", \"lbr0\" } masquerade"));
    ASSERT_EQ(Script({"stop-guest-nat-rule", "gbr0"}), 0) << err_;
    EXPECT_TRUE(Reaches("guest", "192.168.100.50"));

    // The access point's file is the main network and, when its switch is on, the guest's; with
    // no radio here hostapd then stops, and says why.
    root_->WriteFile(std::string(kHostapd) + ".info", "enable=yes\n");
    root_->WriteFile(std::string(kHostapd) + "-host.conf", "interface=wlan0\nssid=Main\n");
    root_->WriteFile(std::string(kHostapd) + "-guest.conf", "bss=gwlan0\nssid=Guest\n");
    for (const char* guest : {"enable=no\n", "enable=yes\n"}) {
        root_->WriteFile(std::string(kHostapd) + "-guest.info", guest);
        EXPECT_EQ(Script({"start-ap", "wlan0"}), 1);
        EXPECT_THAT(err_, HasSubstr("hostapd did not start on wlan0"));
    }
    EXPECT_EQ(root_->ReadFile("/var/run/hostapd-wlan0.conf"),
              "interface=wlan0\nssid=Main\nbss=gwlan0\nssid=Guest\n");
    root_->WriteFile(std::string(kHostapd) + ".info", "enable=no\n");
    EXPECT_EQ(Script({"start-ap", "wlan0"}), 0) << err_;

    // Words it does not take.
    EXPECT_EQ(Script({"start-mesh", "wlan0"}), 2);
    EXPECT_THAT(err_, HasSubstr("unknown verb 'start-mesh'"));
    EXPECT_EQ(Script({"start-nat", "lbr0;reboot"}), 1);
    EXPECT_THAT(err_, HasSubstr("bad interface name"));
    EXPECT_EQ(Script({"start-pppoe-relay", "eth0"}), 3);
}

}  // namespace
}  // namespace test
}  // namespace vorn
