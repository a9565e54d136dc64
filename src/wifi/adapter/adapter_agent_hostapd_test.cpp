#include "wifi/adapter/adapter_agent_hostapd.h"

#include <gmock/gmock.h>

#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"
#include "wifi/adapter/adapter_agent_hostapd_router.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr const char* kHost = "/etc/hostapd/hostapd-wlan0-host.conf";
constexpr const char* kGuest = "/etc/hostapd/hostapd-wlan0-guest.conf";
constexpr const char* kMacList = "/etc/hostapd/hostapd-mac.list";

class HostapdTest : public vorn::test::RootTest {
  protected:
    void SetUp() override { Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER); }
    void TearDown() override { Adapter::DeleteAdapterAll(); }

    static AdapterConfig Config() {
        AdapterConfig c;
        c.name = "wlan0";
        c.bssid = vornwireless::utils::MacAddress("02:76:6f:72:6e:02");
        c.driver = WIFI_DRIVER_NL80211;
        c.enabled = c.display_ssid = c.wmm_enabled = true;
        c.ssid = "Cindervault";
        c.mode = WIFI_MODE_N;
        c.bandwidth = WIFI_BANDWIDTH_20_40MHZ;
        c.channel = 11;
        c.tx_power = WIFI_POWER_MEDIUM;
        c.max_num_client = c.guest_max_num_client = 256;
        c.security = c.guest_security = WIFI_SECURITY_PERSONAL_WPA2;
        c.encryption = c.guest_encryption = WIFI_ENCRYPTION_AES;
        c.password = "secret123";
        c.guest_ssid = "CindervaultGuest";
        c.guest_bssid = c.bssid + 1;
        c.guest_password = "guest1234";
        c.guest_display_ssid = c.guest_enabled = true;
        c.mac_filter_policy = WIFI_MAC_FILTER_POLICY_ALLOW;
        c.mac_filter_rules = {{true, vornwireless::utils::MacAddress("02:00:00:00:00:01"), "a"},
                              {false, vornwireless::utils::MacAddress("02:00:00:00:00:02"), "b"}};
        return c;
    }

    std::string Host(const AdapterConfig& config) {
        EXPECT_EQ(agent_.GenerateHostapdConfig(config), 0);
        return root_.ReadFile(kHost);
    }

    AdapterAgentHostapdRouter agent_{"wlan0"};
};

TEST_F(HostapdTest, FilesByteForByteAndTheLinesOfEachMode) {
    AdapterConfig config = Config();
    EXPECT_EQ(Host(config),
              "interface=wlan0\ndriver=nl80211\nssid=Cindervault\nignore_broadcast_ssid=0\n"
              "macaddr_acl=0\nwpa_psk_file=/etc/hostapd.psk\nwps_state=2\nap_setup_locked=1\n"
              "ctrl_interface=/var/run/hostapd\nconfig_methods=label display push_button keypad\n"
              "max_num_sta=256\nbridge=lbr0\nchannel=11\nwmm_enabled=1\nhw_mode=g\nieee80211n=1\n"
              "ht_capab=[SHORT-GI-20][DELAYED-BA][SHORT-GI-40][MAX-AMSDU-7935][HT40-]\n"
              "require_ht=1\neap_server=1\nauth_algs=1\nwpa=2\nwpa_key_mgmt=WPA-PSK\n"
              "wpa_passphrase=secret123\nwpa_pairwise=CCMP\nrsn_pairwise=CCMP\nmacaddr_acl=1\n"
              "accept_mac_file=/etc/hostapd/hostapd-mac.list\n");
    EXPECT_EQ(root_.ReadFile("/etc/hostapd/hostapd-wlan0.info"), "enable=yes\n");
    EXPECT_EQ(root_.ReadFile("/etc/hostapd/hostapd-wlan0-guest.info"), "enable=yes\n");
    EXPECT_EQ(root_.ReadFile(kMacList), "02:00:00:00:00:01\n");
    EXPECT_EQ(root_.ReadFile(kGuest),
              "bss=gwlan0\nbssid=02:76:6f:72:6e:03\nssid=CindervaultGuest\n"
              "ignore_broadcast_ssid=0\nctrl_interface=/var/run/hostapd\nmax_num_sta=256\n"
              "bridge=gbr0\nap_isolate=1\nauth_algs=1\nwpa=2\nwpa_key_mgmt=WPA-PSK\n"
              "wpa_passphrase=guest1234\nwpa_pairwise=CCMP\nrsn_pairwise=CCMP\nmacaddr_acl=1\n"
              "accept_mac_file=/etc/hostapd/hostapd-mac.list\n");

    config.encryption = WIFI_ENCRYPTION_TKIP;
    EXPECT_THAT(Host(config),
                AllOf(Not(HasSubstr("require_ht")), HasSubstr("wpa_pairwise=TKIP\n")));
    config.mode = WIFI_MODE_BGN;
    EXPECT_THAT(Host(config), AllOf(Not(HasSubstr("hw_mode")), Not(HasSubstr("ieee80211n"))));
    // The 5 GHz secondary-channel table is never reached: channel 36 takes the 2.4 GHz rule.
    config.mode = WIFI_MODE_AN;
    config.channel = 36;
    EXPECT_THAT(Host(config), AllOf(HasSubstr("hw_mode=a\nieee80211n=1\n"),
                                    HasSubstr("[MAX-AMSDU-7935][HT40-]\neap_server")));
    config.bandwidth = WIFI_BANDWIDTH_20MHZ;
    EXPECT_THAT(Host(config), HasSubstr("ht_capab=[SHORT-GI-20][DELAYED-BA]\n"));

    // WEP keys: 13 characters quoted, 26 bare, 8 none; no enabled rule, no list file.
    config.security = config.guest_security = WIFI_SECURITY_WEP;
    config.mac_filter_rules[0].enable = false;
    config.password = "abcdefghijklm";
    config.guest_password = "0123456789abcdef0123456789";
    EXPECT_THAT(Host(config), AllOf(HasSubstr("auth_algs=3\nwep_default_key=wep_default_key\n"
                                              "wep_key0=\"abcdefghijklm\"\n"),
                                    Not(HasSubstr("mac_file"))));
    EXPECT_EQ(Host(config).find("macaddr_acl"), Host(config).rfind("macaddr_acl"));
    EXPECT_FALSE(root_.Exists(kMacList));
    EXPECT_THAT(root_.ReadFile(kGuest),
                HasSubstr("wep_default_key=0\nwep_key0=0123456789abcdef0123456789\n"));
    config.password = "abcdefgh";
    EXPECT_THAT(Host(config), Not(HasSubstr("wep_key0")));

    // A 64-digit hex key is the PSK itself; hostapd refuses it as a passphrase.
    config.security = WIFI_SECURITY_PERSONAL_WPA_MIXED;
    config.password = std::string(64, 'a');
    EXPECT_THAT(Host(config), HasSubstr("wpa=3\nwpa_key_mgmt=WPA-PSK\nwpa_psk=" + config.password));
}

TEST_F(HostapdTest, RefusedConfigurationsChangeNoFile) {
    AdapterConfig good = Config();
    ASSERT_EQ(agent_.GenerateHostapdConfig(good), 0);
    const std::string host = root_.ReadFile(kHost);
    const std::string guest = root_.ReadFile(kGuest);
    std::vector<AdapterConfig> bad(4, good);
    bad[0].ssid = "Cinder\nwpa=0";
    bad[1].guest_password = std::string("guest123\r", 9);
    bad[2].security = WIFI_SECURITY_WEP;
    bad[2].password = "0123456789abcdef012345678z";  // a hex key's length, not hex
    bad[3].mac_filter_policy = WIFI_MAC_FILTER_POLICY_ERROR;
    bad[3].enabled = false;
    for (const AdapterConfig& config : bad) {
        EXPECT_EQ(agent_.GenerateHostapdConfig(config), -1);
        EXPECT_EQ(root_.ReadFile(kHost), host);
        EXPECT_EQ(root_.ReadFile(kGuest), guest);
        EXPECT_EQ(root_.ReadFile("/etc/hostapd/hostapd-wlan0.info"), "enable=yes\n");
        EXPECT_TRUE(root_.Exists(kMacList));
    }
    EXPECT_TRUE(log_.Contains("Refused config: ssid holds a line break"));
    EXPECT_TRUE(log_.Contains("Refused config: a WEP key of 10 or 26 characters is not hex"));
    EXPECT_TRUE(log_.Contains("Refused config: mac_filter_policy [0] with enabled rules"));
}

TEST_F(HostapdTest, TxPowerIsTheLevelsShareOfTheChannelsMaximum) {
    root_.Scenario("iw",
                   "when phy0 info\n"
                   "print \t\t\t* 2412 MHz [1] (20.0 dBm)\n"
                   "print \t\t\t* 2462 MHz [11] (17.0 dBm)\n"
                   "print \t\t\t* 2467 MHz [12] (disabled)\n");
    AdapterConfig config = Config();
    config.channel = 0;
    EXPECT_EQ(agent_.SetTXPower(config), 0);
    config.channel = 11;
    config.tx_power = WIFI_POWER_LOW;
    EXPECT_EQ(agent_.SetTXPower(config), 0);
    EXPECT_THAT(root_.Calls(), AllOf(Contains("/sbin/iwconfig wlan0 txpower 12"),
                                     Contains("/sbin/iwconfig wlan0 txpower 4")));
    root_.ClearCalls();
    config.channel = 12;
    EXPECT_EQ(agent_.SetTXPower(config), -1);
    EXPECT_THAT(root_.Calls(), ElementsAre("/usr/sbin/iw phy0 info"));
    EXPECT_TRUE(log_.Contains("No maximum tx power for channel 12 of [wlan0]"));
    // No radio's maximum: once overflowed the int of the txpower command.
    EXPECT_EQ(AdapterAgentHostapd::ParseMaxPower("9e9"), 0);
}

TEST_F(HostapdTest, StationsFromHostileOutputWithAddressAndHostName) {
    root_.Scenario("hostapd_cli",
                   "when -iwlan0 all_sta\n"
                   "print 02:00:00:00:00:01\n"
                   "print flags=[AUTH][ASSOC][AUTHORIZED]\n"
                   "print connected_time=42\n"
                   "print " +
                       std::string(1023, 'x') +
                       "02:00:00:00:00:09\n"
                       "print zz:zz:zz:zz:zz:zz\n"
                       "print 02:00:00:00:00:02\n"
                       "print 02:00:00:00:00:03\n"
                       "print connected_time=12x\n");
    root_.WriteFile(
        "/proc/net/arp",
        "IP address       HW type     Flags       HW address            Mask     "
        "Device\n"
        "192.168.100.101  0x1         0x2         02:00:00:00:00:01     *        lbr0\n"
        "192.168.100.102  0x1         0x0         02:00:00:00:00:02     *        lbr0\n"
        "192.168.100.103  0x1         0x2         02:00:00:00:00:03     *        lbr0\n"
        "192.168.100.109  0x1         0x2         02:00:00:00:00:09     *        lbr0\n");
    root_.WriteFile("/etc/dhcpd/dhcpd.conf.leases",
                    "1900000000 02:00:00:00:00:01 192.168.100.101 laptop *\n"
                    "1900000000 02:00:00:00:00:03 192.168.100.103 * *\n");
    std::vector<utils::ConnectionInfo> stations;
    ASSERT_EQ(agent_.LoadStationConnData(stations), 0);
    ASSERT_EQ(stations.size(), 2u);
    EXPECT_EQ(stations[0].mac.ToString() + " " + stations[0].ip.ToString() + " " +
                  stations[0].hostname + " " + std::to_string(stations[0].connected_time),
              "02:00:00:00:00:01 192.168.100.101 laptop 42");
    EXPECT_EQ(stations[1].mac.ToString() + " " + stations[1].ip.ToString() + " [" +
                  stations[1].hostname + "] " + std::to_string(stations[1].connected_time),
              "02:00:00:00:00:03 192.168.100.103 [] 0");
    EXPECT_TRUE(
        log_.Contains("Failed to get ip and hostname for mac [02:00:00:00:00:02], skip it"));
    EXPECT_TRUE(log_.Matching("Bad mac addr").empty());  // lines that are no address are no error
}

// The access point coming up and WPS are proved with real hostapd in the VM tier; here the PIN's
// words.
TEST_F(HostapdTest, WpsPinIsCheckedAndPassedAsItsOwnWord) {
    root_.Scenario("iwconfig", "when wlan0\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
    ASSERT_EQ(Adapter::AddAdapter("wlan0"), 0);
    Adapter* adapter = Adapter::GetAdapter("wlan0");
    ASSERT_NE(adapter, nullptr);
    root_.ClearCalls();
    EXPECT_EQ(adapter->EnableWPSWithPinCode("12345670"), 0);
    EXPECT_EQ(adapter->EnableWPSWithPinCode("1234 5670"), -1);
    EXPECT_EQ(adapter->EnableWPSWithPinCode("123"), -1);
    root_.Scenario("hostapd_cli", "when *\nexit 1\n");
    EXPECT_EQ(adapter->EnableWPSWithPBC(), -1);
    EXPECT_THAT(root_.Calls(), ElementsAre("/usr/bin/hostapd_cli -i wlan0 wps_pin any 12345670 120",
                                           "/usr/bin/hostapd_cli -i wlan0 wps_pbc"));
    EXPECT_TRUE(log_.Contains("Failed to execute /usr/bin/hostapd_cli wps_pbc (wlan0)"));
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
