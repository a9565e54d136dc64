// vornwifid as a process on a private session bus, over a fresh simulated root (router topology,
// wlan0 in the fake sysfs) with vornnetd beside it for the bridges' gateway records; needs no root.
#include <gio/gio.h>
#include <gmock/gmock.h>
#include <signal.h>

#include <filesystem>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "dbus/wifi_client.h"
#include "support/gio_call.h"
#include "support/log_capture.h"
#include "support/private_bus.h"
#include "support/sim_root.h"
#include "utils/json_text.h"

namespace vorn {
namespace test {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsSupersetOf;
using vornwireless::utils::CompactJson;
using Timeout = DaemonProcess::Timeout;

constexpr char kVornwifid[] = VORN_BINARY_DIR "/daemons/vornwifid";
constexpr char kVornnetd[] = VORN_BINARY_DIR "/daemons/vornnetd";
constexpr char kService[] = "com.tessarin.wifi";
constexpr Timeout kStartTimeout{60000};
constexpr Timeout kCallTimeout{30000};
constexpr Timeout kExitTimeout{20000};

using Answer = ServiceAnswer;

Answer Call(const char* method, GVariant* parameters) {
    return CallService(kService, method, parameters, kCallTimeout);
}

Answer Call(const char* method) {
    return Call(method, g_variant_new("()"));
}
Answer Call(const char* method, const std::string& a) {
    return Call(method, g_variant_new("(s)", a.c_str()));
}
Answer Call(const char* method, const std::string& a, const std::string& b) {
    return Call(method, g_variant_new("(ss)", a.c_str(), b.c_str()));
}

Json::Value Parsed(const Answer& answer) {
    return Parse(answer.text);
}

class VornwifidTest : public ::testing::Test {
  protected:
    void SetUp() override {
        ASSERT_TRUE(bus_.Started());
        ASSERT_TRUE(netd_.WaitForBusName("com.tessarin.net", kStartTimeout)) << netd_.Stderr();
        root_.PrepareRadio();
    }
    void Start() {
        wifid_ =
            std::make_unique<DaemonProcess>(std::vector<std::string>{kVornwifid, "--foreground"});
        ASSERT_TRUE(wifid_->WaitForBusName(kService, kStartTimeout)) << wifid_->Stderr();
    }
    void ExpectServing() {
        EXPECT_THAT(Call("GetAdapterList").text, HasSubstr("wlan0"));
        EXPECT_TRUE(wifid_->Running()) << wifid_->Stderr();
    }

    LogCapture log_;
    PrivateBus bus_;
    SimRoot root_;
    DaemonProcess netd_{{kVornnetd, "--foreground"}};
    std::unique_ptr<DaemonProcess> wifid_;
};

TEST_F(VornwifidTest, ServesEveryMethodThroughTheBusAndTheClient) {
    root_.RecordHook("topology_change", "$PLUGIN_ACTION $OLD_TOPOLOGY $NEW_TOPOLOGY");
    ASSERT_NO_FATAL_FAILURE(Start());
    vornwireless::dbus::WifiClient client;
    EXPECT_TRUE(client.IsServerReady());

    // What the daemon found at start: the router topology's bridge and the radio.
    Json::Value value;
    ASSERT_EQ(client.GetAdapterList(value), 0);
    EXPECT_EQ(CompactJson(value), R"(["wlan0"])");
    Json::Value config;
    ASSERT_EQ(client.GetAdapterConfig("wlan0", config), 0);
    EXPECT_EQ(config["name"].asString(), "wlan0");
    ASSERT_EQ(client.GetAdapterCapability("wlan0", value), 0);
    EXPECT_TRUE(value["topology"].isArray()) << value;
    ASSERT_EQ(client.GetAdapterStatus("wlan0", value), 0);
    EXPECT_TRUE(value["status"].isString());
    ASSERT_EQ(client.GetBridgeList(value), 0);
    ASSERT_EQ(value.size(), 1u) << value;
    EXPECT_EQ(value[0]["ifname"].asString(), "lbr0");
    Json::Value bridge;
    ASSERT_EQ(client.GetBridgeConfig("lbr0", bridge), 0);
    EXPECT_EQ(bridge, value[0]);
    EXPECT_EQ(client.GetConnectionList("wlan0", value), 0);
    EXPECT_TRUE(value.isArray());

    // An error reply is a failure even when its first number reads 0.
    EXPECT_EQ(client.GetAdapterConfig("wlan0x", value), -1);
    EXPECT_EQ(client.GetAdapterStatus("wlan7", value), -7);
    EXPECT_EQ(client.EnableAdapter("nowhere"), -1);

    // Changes reach the access point's files and the bridge.
    config["ssid"] = "Vorn Test";
    EXPECT_EQ(client.ApplyAdapter("wlan0", config), 0) << wifid_->Stderr();
    EXPECT_THAT(root_.ReadFile("/etc/hostapd/hostapd-wlan0-host.conf"),
                HasSubstr("ssid=Vorn Test"));
    EXPECT_EQ(client.ApplyBridge("lbr0", bridge), 0);
    EXPECT_EQ(client.DisableAdapter("wlan0"), 0);
    EXPECT_EQ(client.EnableAdapter("wlan0"), 0);
    EXPECT_EQ(client.ExecSchedule("wlan0"), -1);  // no schedule enabled
    EXPECT_TRUE(log_.Contains("Failed to execute schedule(wlan0) (0)"));
    EXPECT_EQ(client.EnableWPSWithPBC("wlan0"), 0);
    EXPECT_EQ(client.EnableWPSWithPinCode("wlan0", "12345670"), 0);
    EXPECT_EQ(client.SwitchAdapterTopology("wlan0", "router"), 0);
    EXPECT_EQ(client.RefreshWlanSlaveList(), 0);
    EXPECT_EQ(client.SwitchWifiOnOff(), 0);
    EXPECT_EQ(client.SwitchWifiOnOff(), 0);
    // An access point scans for nothing.
    ASSERT_EQ(client.ScanNetworks("wlan0", value), 0);
    EXPECT_EQ(CompactJson(value), "[]");
    // Nor is it joined to one.
    EXPECT_EQ(Call("GetConnectedAPInfo", "wlan0").text,
              "Failed to load connected AP info for interface(wlan0)");

    // The whole appliance's topology, with the hooks before and after; a switch that fails
    // half-way (lbr0's IPv6 cannot be turned off) still runs the after-stage.
    const std::string lbr0Ipv6 = "/proc/sys/net/ipv6/conf/lbr0/disable_ipv6";
    std::filesystem::remove_all(root_.Path("/proc/sys/net/ipv6/conf/lbr0"));
    EXPECT_EQ(Call("SwitchTopology", "bridge").text, "Failed to switch topology(bridge)");
    EXPECT_THAT(root_.HookRuns("topology_change"),
                ElementsAre("4 router bridge", "5 router bridge"));
    root_.WriteFile(lbr0Ipv6, "0\n");
    EXPECT_EQ(client.SwitchTopology("bridge"), 0) << wifid_->Stderr();
    EXPECT_THAT(
        root_.HookRuns("topology_change"),
        ElementsAre("4 router bridge", "5 router bridge", "4 router bridge", "5 router bridge"));
    ASSERT_EQ(client.GetBridgeList(value), 0);
    EXPECT_EQ(value[0]["ifname"].asString(), "br0") << value;

    // The adapter list emptied, refilled from sysfs (the one 10 s loop is never reached here).
    EXPECT_EQ(client.ForceRemoveAllAdapters(), 0);
    ASSERT_EQ(client.GetAdapterList(value), 0);
    EXPECT_EQ(CompactJson(value), "[]");
    EXPECT_EQ(client.RefreshAdapterList(), 0);
    EXPECT_EQ(client.RemoveAdapter("wlan0"), 0);
    EXPECT_EQ(client.AddAdapter("wlan0"), 0);
    EXPECT_EQ(client.ResetToDefault(), 0);
    ExpectServing();
}

TEST_F(VornwifidTest, BadInputGetsItsErrorAndChangesNothing) {
    ASSERT_NO_FATAL_FAILURE(Start());
    const Json::Value config = Parsed(Call("GetAdapterConfig", "wlan0"));
    const Json::Value bridge = Parsed(Call("GetBridgeConfig", "lbr0"));
    const auto before = root_.Files();

    // One method of each way a handler finds its adapter or bridge; bad input to every method:
    // the abuse test.
    const std::map<std::string, std::string> unknownAdapter = {
        {"GetAdapterConfig", "Adapter is not found(wlan9)"},
        {"ExecSchedule", "Adapter is not found(wlan9)"},
        {"ScanNetworks", "Failed to get adapter for interface(wlan9)"},
        {"GetBridgeConfig", "Bridge is not found(wlan9)"},
        {"RemoveAdapter", "Failed to remove adapter(wlan9)"},
        {"AddAdapter", "Failed to add adapter(wlan9)"},
    };
    for (const auto& [method, error] : unknownAdapter) {
        EXPECT_EQ(Call(method.c_str(), "wlan9").text, error) << method;
    }
    EXPECT_EQ(Call("ApplyAdapter", "wlan9", "{}").text, "Adapter is not found(wlan9)");
    EXPECT_EQ(Call("ApplyBridge", "wlan9", "{}").text, "Bridge is not found(wlan9)");
    EXPECT_EQ(Call("EnableWPSWithPinCode", "wlan9", "1234").text,
              "Failed to get adapter for interface(wlan9)");
    EXPECT_EQ(Call("SwitchTopology", "mesh\nrouter").text,
              "Failed to switch topology(mesh\nrouter)");
    EXPECT_EQ(Call("SwitchAdapterTopology", "wlan0", "error").text,
              "Failed to switch topology(wlan0)");
    EXPECT_EQ(Call("EnableWPSWithPinCode", "wlan0", "12;reboot").text,
              "Failed to enable wps pin code (wlan0)(12;reboot)");

    // Configurations that are not JSON, have the wrong types, or would break a line of the
    // access point's file.
    Json::Value wrongTypes = config;
    wrongTypes["channel"] = "six";
    wrongTypes["enabled"] = "yes";
    Json::Value newline = config;
    newline["ssid"] = "Vorn\nctrl_interface=/tmp";
    Json::Value badBridge = bridge;
    badBridge["dhcp_enabled"] = "yes";
    badBridge["slave_list"] = Json::Value(7);
    const std::vector<std::string> adapterInputs = {"not json", "{}", CompactJson(wrongTypes),
                                                    CompactJson(newline)};
    for (const std::string& input : adapterInputs) {
        EXPECT_EQ(Call("ApplyAdapter", "wlan0", input).text, "Failed to get config(wlan0)")
            << input.substr(0, 60);
    }
    for (const std::string& input : {std::string("not json"), CompactJson(badBridge)}) {
        EXPECT_EQ(Call("ApplyBridge", "lbr0", input).text, "Failed to get config(lbr0)")
            << input.substr(0, 60);
    }
    ExpectServing();
    EXPECT_EQ(root_.Files(), before);
}

TEST_F(VornwifidTest, StartsCleanCatchesUpTheScheduleAndStopsOnSigterm) {
    // A radio that is on, with a week's table that says off at every hour.
    ASSERT_NO_FATAL_FAILURE(Start());
    Json::Value config = Parsed(Call("GetAdapterConfig", "wlan0"));
    config["enabled"] = true;
    config["schedule_enabled"] = true;
    config["schedule"] = std::string(168, '0');
    ASSERT_EQ(vornwireless::dbus::WifiClient().ApplyAdapter("wlan0", config), 0);
    EXPECT_EQ(Parsed(Call("GetAdapterConfig", "wlan0")), config);  // no stale reply
    ASSERT_TRUE(wifid_->Signal(SIGTERM));
    EXPECT_EQ(wifid_->WaitForExit(kExitTimeout), 0) << wifid_->Stderr();
    EXPECT_THAT(wifid_->Stderr(), AllOf(HasSubstr("Stopping on signal"), HasSubstr("Stopped")));
    EXPECT_FALSE(root_.Exists("/var/run/vornwifid.pid"));
    EXPECT_FALSE(vornwireless::dbus::WifiClient().IsServerReady());

    // What an interrupted topology switch leaves: its lock and a frozen event daemon.
    root_.WriteFile("/tmp/topology.lock", "");
    DaemonProcess evmond({"sleep", "300"});
    ASSERT_TRUE(evmond.Signal(SIGSTOP));
    root_.WriteFile("/var/run/evmond.pid", std::to_string(evmond.Pid()) + "\n");
    ASSERT_NO_FATAL_FAILURE(Start());
    EXPECT_FALSE(root_.Exists("/tmp/topology.lock"));
    EXPECT_NE(ProcessState(evmond.Pid()), 'T');
    EXPECT_FALSE(Parsed(Call("GetAdapterConfig", "wlan0"))["enabled"].asBool());

    DaemonProcess second({kVornwifid, "--foreground"});
    EXPECT_EQ(second.WaitForExit(kExitTimeout), 1);
    EXPECT_THAT(second.Stderr(), HasSubstr("another vornwifid is running"));
    EXPECT_EQ(root_.ReadFile("/var/run/vornwifid.pid"), std::to_string(wifid_->Pid()) + "\n");
    ExpectServing();
}

TEST_F(VornwifidTest, KiteBBuiltInRadioComesUpThroughItsDriverProfile) {
    root_.WriteFile("/etc.defaults/vorninfo.conf",
                    "model=\"kite-b\"\nbuiltin_wlan_mac=\"02:76:6f:72:6e:02\"\n");
    ASSERT_NO_FATAL_FAILURE(Start());
    Json::Value config = Parsed(Call("GetAdapterConfig", "wlan0"));
    config["enabled"] = true;
    config["ssid"] = "Kite";
    config["mode"] = "bgn";
    root_.ClearCalls();
    const Answer applied = Call("ApplyAdapter", "wlan0", CompactJson(config));
    EXPECT_TRUE(applied.ok) << applied.text << wifid_->Stderr();
    const std::string profile = root_.ReadFile("/usr/vorn/etc/rlt_wifi/rlt_wifi.conf");
    EXPECT_THAT(profile, AllOf(HasSubstr("\nSSID1=Kite\n"), HasSubstr("\nWirelessMode=9\n")));
    EXPECT_THAT(root_.Calls(), IsSupersetOf({"/sbin/rmmod rlt_wifi", "/sbin/ifconfig wlan0 up",
                                             "/sbin/iwpriv wlan0 set WscConfMode=7"}))
        << wifid_->Stderr();
    EXPECT_EQ(Parsed(Call("GetAdapterStatus", "wlan0"))["status"], "Enabled");

    // The driver splits its values at ";": refused, and the profile stays.
    config["ssid"] = "Kite;2";
    EXPECT_FALSE(Call("ApplyAdapter", "wlan0", CompactJson(config)).ok);
    EXPECT_EQ(root_.ReadFile("/usr/vorn/etc/rlt_wifi/rlt_wifi.conf"), profile);
    ExpectServing();
}

}  // namespace
}  // namespace test
}  // namespace vorn
