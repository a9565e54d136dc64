// The simulated appliance brings wlan0 up as an access point in router topology; every form of
// file the hostapd agent writes, joined by the platform's network script, goes through the real
// hostapd's parser. That parser would not notice an injected line; the configuration fuzz target
// checks every line's key.
#include <gmock/gmock.h>
#include <unistd.h>

#include "support/private_bus.h"
#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"
#include "wifi/adapter/adapter_agent_hostapd_bridge.h"
#include "wifi/settings/enum_map.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr const char* kHostapd = "/usr/sbin/hostapd";

class HostapdConfigSystemTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        if (geteuid() != 0) {
            GTEST_SKIP() << "needs root for private network and mount namespaces";
        }
        if (access(kHostapd, X_OK) != 0) {
            GTEST_SKIP() << "hostapd is not installed (package hostapd)";
        }
        Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
        root_.Scenario("iwconfig", "when wlan0\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
    }
    void TearDown() override { Adapter::DeleteAdapterAll(); }

    // What the real hostapd says about the files, joined and started by the platform's network
    // script: it parses them, then finds no radio. The MAC lists are read at parse time, from the
    // root's folder mounted at their path.
    std::string Parse() const {
        vorn::test::RunProgram(
            {"/usr/bin/unshare", "-n", "-m", "/bin/sh", "-c",
             "/bin/mount --bind \"$0\" /etc/hostapd && exec \"$1\" start-ap wlan0",
             root_.Path("/etc/hostapd"), VORN_SOURCE_DIR "/src/platform/rc.network"},
            std::chrono::seconds(20));
        return root_.ReadFile("/run/vorn/rc.network/hostapd-wlan0.log");
    }

    void ExpectAccepted(const std::string& what) const {
        const std::string said = Parse();
        EXPECT_THAT(said, Not(HasSubstr("Failed to set up interface with")))
            << what << "\n"
            << root_.ReadFile("/var/run/hostapd-wlan0.conf");
        EXPECT_THAT(said, HasSubstr("nl80211")) << what;
    }
};

TEST_F(HostapdConfigSystemTest, EveryFileFormTheAgentWritesParses) {
    ASSERT_EQ(Adapter::AddAdapter("wlan0"), 0);
    EXPECT_THAT(root_.Calls(), Contains("/etc/rc.network start-ap wlan0"));
    ExpectAccepted("wlan0 brought up with its first-start settings");

    AdapterConfig config = Adapter::GetAdapter("wlan0")->GetConfig();
    AdapterAgentHostapdBridge agent("wlan0");
    const auto generate = [&](const std::string& what) {
        ASSERT_EQ(agent.GenerateHostapdConfig(config), 0) << what;
        ExpectAccepted(what);
    };
    config.ssid = "Caf\xc3\xa9 #1 ssid=x";
    config.guest_enabled = true;
    config.guest_bssid = config.bssid + 1;
    config.auth_server_ip = vornwireless::utils::IPAddress("192.0.2.10");
    config.auth_server_Port = 1812;
    config.auth_server_shared_secret = "radius secret #=";
    for (int s = WIFI_SECURITY_DISABLED; s <= WIFI_SECURITY_ENTERPRISE_WPA_MIXED; ++s) {
        for (int e = WIFI_ENCRYPTION_NONE; e <= WIFI_ENCRYPTION_TKIP_AES; ++e) {
            config.security = config.guest_security = static_cast<WIFI_SECURITY>(s);
            config.encryption = config.guest_encryption = static_cast<WIFI_ENCRYPTION>(e);
            config.password = config.guest_password = "passphrase 8+";
            generate(EnumMap<WIFI_SECURITY>::EnumToString(config.security) + " " +
                     EnumMap<WIFI_ENCRYPTION>::EnumToString(config.encryption));
        }
    }
    config.security = config.guest_security = WIFI_SECURITY_WEP;
    for (const char* key :
         {"ab\"de", "abcdefghij#lm", "0123456789", "0123456789abcdef0123456789", "abcdefgh"}) {
        config.password = config.guest_password = key;
        generate(std::string("WEP key ") + key);
    }
    config.security = WIFI_SECURITY_PERSONAL_WPA2;
    config.password = std::string(64, 'f');
    config.guest_allow_access_guest = true;
    for (int m = WIFI_MODE_A; m <= WIFI_MODE_AN_AC; ++m) {
        for (int channel : {0, 6, 36}) {
            config.mode = static_cast<WIFI_MODE>(m);
            config.channel = channel;
            config.bandwidth = channel == 6 ? WIFI_BANDWIDTH_20MHZ : WIFI_BANDWIDTH_20_40MHZ;
            generate("mode " + EnumMap<WIFI_MODE>::EnumToString(config.mode) + " channel " +
                     std::to_string(channel));
        }
    }
    config.mac_filter_rules = {{true, vornwireless::utils::MacAddress("02:00:00:00:00:01"), "a"},
                               {false, vornwireless::utils::MacAddress("02:00:00:00:00:02"), ""},
                               {true, vornwireless::utils::MacAddress("02:00:00:00:00:03"), "c"}};
    for (auto policy : {WIFI_MAC_FILTER_POLICY_ALLOW, WIFI_MAC_FILTER_POLICY_DENY}) {
        config.mac_filter_policy = policy;
        generate("MAC filter " + EnumMap<WIFI_MAC_FILTER_POLICY>::EnumToString(policy));
    }
    EXPECT_EQ(root_.ReadFile("/etc/hostapd/hostapd-mac.list"),
              "02:00:00:00:00:01\n02:00:00:00:00:03\n");
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
