#include "wifi/adapter/adapter_agent_rlt.h"

#include <gmock/gmock.h>

#include <sstream>

#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr const char* kProfile = "/usr/vorn/etc/rlt_wifi/rlt_wifi.conf";

class RLTTest : public vorn::test::RootTest {
  protected:
    void SetUp() override { Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER); }

    static AdapterConfig Config() {
        AdapterConfig c;
        c.name = "wlan0";
        c.bssid = vornwireless::utils::MacAddress("02:76:6f:72:6e:02");
        c.guest_bssid = c.bssid + 1;
        c.enabled = c.display_ssid = c.wmm_enabled = true;
        c.ssid = "Cindervault";
        c.CountryRegion = 5;
        c.CountryRegionABand = 7;
        c.CountryCode = "DE";
        c.mode = WIFI_MODE_BGN;
        c.bandwidth = WIFI_BANDWIDTH_20_40MHZ;
        c.channel = 6;
        c.tx_power = WIFI_POWER_MEDIUM;
        c.max_num_client = c.guest_max_num_client = 32;
        c.security = c.guest_security = WIFI_SECURITY_PERSONAL_WPA2;
        c.encryption = c.guest_encryption = WIFI_ENCRYPTION_AES;
        c.password = "secret123";
        c.guest_ssid = "Guests";
        c.guest_password = "guest1234";
        c.guest_enabled = true;
        return c;
    }

    std::string Profile(const AdapterConfig& config) {
        EXPECT_EQ(agent_.GenerateRLTConfig(config), 0);
        return root_.ReadFile(kProfile);
    }

    AdapterAgentRLTRouter agent_{"wlan0"};
};

TEST_F(RLTTest, ProfileWithAndWithoutGuestEachModeAndEachScheme) {
    AdapterConfig config = Config();
    EXPECT_EQ(Profile(config),
              "Default\nCountryRegion=5\nCountryRegionABand=7\nCountryCode=DE\nBssidNum=2\n"
              "SSID1=Cindervault\nSSID2=Guests\nWirelessMode=9\nChannel=6\nMaxStaNum=32\n"
              "WmmCapable=1\nHT_BW=1\nVHT_BW=0\nTxPower=" +
                  std::to_string(static_cast<int>(WIFI_POWER_MEDIUM) * 10) +
                  "\nHideSSID=0;1;\nAuthMode=WPA2PSK;WPA2PSK;\nEncrypType=AES;AES;\n"
                  "DefaultKeyID=2;2;\nKey1=;;\nWPAPSK=secret123;guest1234;\nNoForwarding=0;1;\n");

    config.guest_enabled = false;
    config.security = WIFI_SECURITY_WEP;
    config.password = "abcde";
    config.bandwidth = WIFI_BANDWIDTH_20MHZ;
    config.display_ssid = false;
    config.guest_allow_access_guest = true;
    const std::string single = Profile(config);
    EXPECT_THAT(single, Not(HasSubstr("SSID2=")));
    EXPECT_THAT(single, HasSubstr("BssidNum=1\nSSID1=Cindervault\nWirelessMode=9\n"));
    EXPECT_THAT(single, HasSubstr("HT_BW=0\nVHT_BW=0\n"));
    EXPECT_THAT(single, HasSubstr("HideSSID=1\nAuthMode=SHARED\nEncrypType=WEP\nDefaultKeyID=1\n"
                                  "Key1=abcde\nWPAPSK=\nNoForwarding=0;0;\n"));

    const std::pair<WIFI_MODE, int> modes[] = {
        {WIFI_MODE_A, 2},      {WIFI_MODE_B, 1},   {WIFI_MODE_G, 4},  {WIFI_MODE_N, 6},
        {WIFI_MODE_AN, 8},     {WIFI_MODE_GN, 7},  {WIFI_MODE_BG, 0}, {WIFI_MODE_BGN, 9},
        {WIFI_MODE_AN_AC, 15}, {WIFI_MODE_BN, -1}, {WIFI_MODE_AC, -1}};
    for (const auto& mode : modes) {
        config.mode = mode.first;
        EXPECT_THAT(Profile(config),
                    HasSubstr("\nWirelessMode=" + std::to_string(mode.second) + "\n"))
            << mode.first;
    }
    EXPECT_TRUE(log_.Contains("Bad mode (6)"));
    EXPECT_TRUE(log_.Contains("Bad mode (10)"));

    // Mixed WPA is no scheme of this driver, yet the authentication lines still succeed.
    config.security = WIFI_SECURITY_PERSONAL_WPA_MIXED;
    config.encryption = WIFI_ENCRYPTION_ERROR;
    std::ostringstream auth;
    EXPECT_EQ(agent_.SetAuth(config, auth), 0);
    EXPECT_EQ(auth.str(), "AuthMode=error\nEncrypType=error\nDefaultKeyID=0\nKey1=\nWPAPSK=\n");
    EXPECT_TRUE(log_.Contains("Bad auth(5)"));
    EXPECT_TRUE(log_.Contains("Bad encryption(0)"));

    config.security = WIFI_SECURITY_ENTERPRISE_WPA2;
    config.encryption = WIFI_ENCRYPTION_TKIP_AES;
    config.auth_server_ip = vornwireless::utils::IPAddress("192.0.2.9");
    config.auth_server_Port = 1812;
    config.auth_server_shared_secret = "radius";
    EXPECT_THAT(Profile(config),
                HasSubstr("AuthMode=WPA2\nEncrypType=TKIPAES\nDefaultKeyID=2\nKey1=\n"
                          "WPAPSK=abcde\nRADIUS_Server=192.0.2.9\nRADIUS_Port=1812\n"
                          "RADIUS_Key=radius\n"));
    EXPECT_THAT(root_.ReadFile(kProfile),
                HasSubstr("\nIEEE8021X=1;0;\nEAPifname=lbr0\nPreAuthifname=eth0\n"));
    // ";" and line breaks: the configuration fuzz target and the daemon test.
}

TEST_F(RLTTest, RadioComesUpAfterTheDriverReloadAndLaterFailuresOnlyLog) {
    AdapterConfig config = Config();
    config.security = WIFI_SECURITY_ENTERPRISE_WPA2;
    config.guest_enabled = false;
    root_.Scenario("rt2860apd", "when *\nexit 1\n");
    EXPECT_EQ(agent_.EnableAP(config), 0);
    EXPECT_TRUE(log_.Contains("Failed to start rt2860apd"));
    const auto calls = root_.Calls();
    ASSERT_EQ(calls.size(), 4u);
    EXPECT_EQ(calls[0], "/sbin/rmmod rlt_wifi");
    EXPECT_THAT(calls[1], HasSubstr("/sbin/insmod "));
    EXPECT_THAT(calls[1], HasSubstr("/usr/vorn/lib/modules/rlt_wifi.ko"));
    EXPECT_EQ(calls[2], "/sbin/ifconfig wlan0 up");
    EXPECT_EQ(calls[3], "/usr/vorn/sbin/rt2860apd");
    // The flag stayed clear: nothing to take down.
    root_.ClearCalls();
    EXPECT_EQ(agent_.DisableAP(config), 0);
    EXPECT_TRUE(root_.Calls().empty());

    // A driver that does not load leaves the radio down; a disabled radio is not touched.
    root_.Scenario("insmod", "when *\nexit 1\n");
    EXPECT_EQ(agent_.EnableAP(config), -1);
    EXPECT_TRUE(log_.Contains("Failed to reload [wlan0]"));
    root_.ClearCalls();
    config.enabled = false;
    EXPECT_EQ(agent_.EnableAP(config), 0);
    EXPECT_TRUE(root_.Calls().empty());

    EXPECT_EQ(agent_.EnableWPSWithPinCode("1234 5670"), -1);
    EXPECT_EQ(agent_.EnableWPSWithPinCode("12345670"), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/sbin/iwpriv wlan0 set WscMode=1",
                                           "/sbin/iwpriv wlan0 set WscPinCode=12345670",
                                           "/sbin/iwpriv wlan0 set WscGetConf=1"));
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
