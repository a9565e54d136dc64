// Every form of supplicant file the station agent writes goes through the real wpa_supplicant's
// parser (the configuration fuzz target checks each line's key, which that parser would not). A
// neighbour's essid written in hex reads back as the same bytes.
#include <gmock/gmock.h>
#include <unistd.h>

#include "support/private_bus.h"
#include "support/sim_root.h"
#include "wifi/adapter/adapter_agent_client.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using StationInfo = AdapterConfig::StationInfo;

constexpr const char* kSupplicant = "/usr/sbin/wpa_supplicant";
constexpr const char* kParseFailure = "Failed to read or parse configuration";

StationInfo Network(WIFI_SECURITY security, WIFI_ENCRYPTION encryption,
                    const std::string& password) {
    StationInfo station;
    station.essid = "Vorn Test";
    station.bssid = vornwireless::utils::MacAddress("02:00:00:00:00:01");
    station.opmode = WIFI_OPMODE_MANAGED;
    station.security = security;
    station.encryption = encryption;
    station.user = "ann@example.org";
    station.password = password;
    return station;
}

class WpaSupplicantConfigSystemTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        if (geteuid() != 0) {
            GTEST_SKIP() << "needs root for a private network namespace";
        }
        if (access(kSupplicant, X_OK) != 0) {
            GTEST_SKIP() << "wpa_supplicant is not installed (package wpasupplicant)";
        }
    }

    // What the real supplicant says about a file: it parses it, then finds no radio.
    std::string Parse(const std::string& text) const {
        root_.WriteFile("/tmp/wpa.conf", text);
        std::string out, err;
        vorn::test::RunProgram(
            {"/usr/bin/unshare", "-n", "/usr/bin/timeout", "10", kSupplicant, "-dd", "-i",
             "nonexist0", "-D", "nl80211", "-c", root_.Path("/tmp/wpa.conf")},
            std::chrono::seconds(20), &out, &err);
        return out + err;
    }

    std::string ExpectAccepted(const StationInfo& station) const {
        std::string text;
        EXPECT_EQ(AdapterAgentClient::WpaSupplicantConfigText(station, text), 0)
            << station.password;
        const std::string said = Parse(text);
        EXPECT_THAT(said, HasSubstr("Reading configuration file")) << text;
        EXPECT_THAT(said, Not(HasSubstr(kParseFailure))) << text << said;
        return said;
    }
};

TEST_F(WpaSupplicantConfigSystemTest, EveryFileFormTheAgentWritesParses) {
    // The check itself tells a broken file apart.
    EXPECT_THAT(Parse("network={\n\tssid=\"a\"\n\twep_key0=xyzxyzxyzx\n}\n"),
                HasSubstr(kParseFailure));

    StationInfo open = Network(WIFI_SECURITY_DISABLED, WIFI_ENCRYPTION_NONE, "");
    open.opmode = WIFI_OPMODE_AD_HOC;
    open.bssid = vornwireless::utils::MacAddress("00:00:00:00:00:00");
    ExpectAccepted(open);
    for (const char* key :
         {"abcde", "a\\b c", "abcdefghijklm", "0123456789", "0123456789abcdefABCDEF0123"}) {
        ExpectAccepted(Network(WIFI_SECURITY_WEP, WIFI_ENCRYPTION_NONE, key));
    }
    const std::vector<std::pair<WIFI_SECURITY, WIFI_ENCRYPTION>> wpa = {
        {WIFI_SECURITY_PERSONAL_WPA, WIFI_ENCRYPTION_TKIP},
        {WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES},
        {WIFI_SECURITY_PERSONAL_WPA_MIXED, WIFI_ENCRYPTION_TKIP_AES},
        {WIFI_SECURITY_ENTERPRISE_WPA, WIFI_ENCRYPTION_TKIP},
        {WIFI_SECURITY_ENTERPRISE_WPA2, WIFI_ENCRYPTION_AES},
        {WIFI_SECURITY_ENTERPRISE_WPA_MIXED, WIFI_ENCRYPTION_TKIP_AES}};
    for (const auto& mode : wpa) {
        ExpectAccepted(Network(mode.first, mode.second, "s3cret \\ pass"));
    }
    ExpectAccepted(Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, std::string(64, 'f')));

    // A neighbour's essid: quote, line break, backslash and a byte beyond ASCII.
    StationInfo hostile = Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, "secret99");
    hostile.essid = "x\"\n\\\xe9";
    const std::string said = ExpectAccepted(hostile);
    EXPECT_THAT(said, HasSubstr("ssid - hexdump_ascii(len=5):"));
    EXPECT_THAT(said, HasSubstr("78 22 0a 5c e9"));
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
