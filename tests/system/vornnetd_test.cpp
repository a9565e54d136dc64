// vornnetd as a process on a private session bus, over a fresh simulated root; needs no root.
#include <gio/gio.h>
#include <gmock/gmock.h>
#include <signal.h>

#include <cstdio>
#include <string>
#include <vector>

#include "dbus/net_client.h"
#include "support/gio_call.h"
#include "support/log_capture.h"
#include "support/private_bus.h"
#include "support/sim_root.h"
#include "support/waiting.h"

namespace vorn {
namespace test {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::MatchesRegex;
using ::testing::UnorderedElementsAreArray;
using Timeout = DaemonProcess::Timeout;

constexpr char kVornnetd[] = VORN_BINARY_DIR "/daemons/vornnetd";
constexpr char kTool[] = VORN_BINARY_DIR "/tools/vornnetdtool";
constexpr char kService[] = "com.tessarin.net";
constexpr Timeout kStartTimeout{30000};
constexpr Timeout kCallTimeout{20000};
constexpr Timeout kExitTimeout{20000};

// One method of the service, an argument, the error it answers to that argument (null: success)
// and, for methods taking plain text, the error it answers to text that names nothing (null:
// success). No call here asks for a UPnP search: outside a private network namespace that would
// reach this machine's own network.
struct Method {
    const char* name;
    const char* in;
    const char* out;  // "" for a method without result
    bool json;        // the argument is a JSON object
    const char* argument;
    const char* error;
    const char* garbage;
};

const Method kMethods[] = {
    {"GetDeviceListData", "type", "data", false, "wifi", nullptr, "failed to get upnp data"},
    {"SetDeviceListData", "data", "", true, R"({"macAddr":"00:11:22:33:44:55","type":"nas"})",
     "failed to set device type", nullptr},
    {"DelDeviceListData", "mac", "", false, "00:11:22:33:44:55", "failed to set delete data",
     "failed to set delete data"},
    {"GetGatewayListData", "info", "data", true, R"({"type":"GTYPE_V4"})", nullptr, nullptr},
    {"AddGatewayData", "info", "", true,
     R"({"type":"GTYPE_V4","ifname":"eth0","priority":0,"gateway":"10.0.0.1"})", nullptr, nullptr},
    {"DelGatewayData", "info", "", true, R"({"type":"GTYPE_V4","ifname":"eth0"})", nullptr,
     nullptr},
    {"GetGatewayDataByInterface", "info", "data", true, R"({"type":"GTYPE_V4","ifname":"eth0"})",
     nullptr, nullptr},
    {"SetSlaveData", "info", "", true, R"({"type":"GTYPE_V4","ifname":"eth0","slave":true})",
     nullptr, nullptr},
    {"CopyGatewayData", "info", "", true,
     R"({"type":"GTYPE_V4","interface_source":"eth0","interface_destination":"bond0"})", nullptr,
     nullptr},
    {"RefreshGateway", "type", "", true, R"({"type":"ALL"})", nullptr, nullptr},
    {"ResetIPv6Module", "info", "", false, "eth0", nullptr, nullptr},
};

using Answer = ServiceAnswer;

Answer CallService(const char* method, GVariant* parameters) {
    return vorn::test::CallService(kService, method, parameters, kCallTimeout);
}

Answer CallService(const char* method, const std::string& argument) {
    return CallService(method, g_variant_new("(s)", argument.c_str()));
}

// Names and signatures of introspected arguments.
std::string Arguments(GDBusArgInfo** arguments) {
    std::string text;
    for (; arguments != nullptr && *arguments != nullptr; ++arguments) {
        text += std::string((*arguments)->name) + ":" + (*arguments)->signature + " ";
    }
    return text;
}

class VornnetdTest : public ::testing::Test {
  protected:
    void SetUp() override {
        ASSERT_TRUE(bus_.Started());
        ASSERT_TRUE(daemon_.WaitForBusName(kService, kStartTimeout)) << daemon_.Stderr();
    }

    // The daemon is up and serving: a call gets its module's answer.
    void ExpectServing() {
        EXPECT_TRUE(CallService("GetDeviceListData", std::string("wifi")).ok);
        EXPECT_TRUE(CallService("GetGatewayListData", R"({"type":"GTYPE_V4"})").ok);
        EXPECT_TRUE(daemon_.Running()) << daemon_.Stderr();
    }
    // The tool's exit status, its standard output in out_ and its error in err_.
    int Tool(const std::vector<std::string>& arguments) {
        std::vector<std::string> argv{kTool};
        argv.insert(argv.end(), arguments.begin(), arguments.end());
        return RunProgram(argv, kCallTimeout, &out_, &err_);
    }

    LogCapture log_;
    PrivateBus bus_;
    SimRoot root_;
    DaemonProcess daemon_{{kVornnetd, "--foreground"}};
    std::string out_;
    std::string err_;
};

TEST_F(VornnetdTest, ServesEveryMethodToTheClientTheToolAndIntrospection) {
    vornnetwork::dbus::NetClient client;
    EXPECT_TRUE(client.IsServerReady());
    Json::Value data;
    EXPECT_EQ(client.GetDeviceListData("nonsense", data), -1);
    EXPECT_TRUE(log_.Contains("Failed to send message: failed to get upnp data (-1)"));
    for (const Method& method : kMethods) {
        const Answer answer = CallService(method.name, method.argument);
        EXPECT_EQ(answer.ok, method.error == nullptr) << method.name << ": " << answer.text;
        if (method.error != nullptr) {
            EXPECT_EQ(answer.text, method.error) << method.name;
        }
    }

    // Gateways reach the route module: stored, listed, refreshed into the routing table.
    root_.ClearCalls();
    Json::Value info = Parse(
        R"({"type":"GTYPE_V4","ifname":"bond0","priority":0,"gateway":"10.0.0.1","dns":"10.0.0.53"})");
    EXPECT_EQ(client.AddGatewayData(info), 0);
    EXPECT_TRUE(CallService("RefreshGateway", R"({"type":"ALL"})").ok);
    EXPECT_THAT(root_.Calls(), Contains("/sbin/ip route add default via 10.0.0.1 dev bond0"));
    EXPECT_EQ(Tool({"--get-gateway-list", "v4"}), 0);
    EXPECT_THAT(out_, AllOf(HasSubstr(R"("ifname" : "bond0")"), HasSubstr("10.0.0.53")));

    // A LAN of a thousand clients: the answer runs far past a request's bound.
    std::string clients;
    for (int i = 0; i < 1000; ++i) {
        char line[80];
        std::snprintf(line, sizeof(line), "1,240,nas-%d,10.0.%d.%d,aa:bb:cc:00:%02x:%02x\n", i,
                      i / 256, i % 256, i / 256, i % 256);
        clients += line;
    }
    root_.WriteFile("/tmp/linkyard_cvscanner_list.tmp", clients);
    ASSERT_EQ(client.GetDeviceListData("cv", data), 0);
    EXPECT_EQ(data["ClientList"].size(), 1000u);
    EXPECT_EQ(Tool({"--get-device-list", "cv"}), 0) << err_;
    EXPECT_GT(out_.size(), 200000u);

    // Failures answer through the tool's exit status: 2 for a bad command, 1 for a refusal.
    EXPECT_EQ(Tool({"--frobnicate", "x"}), 2);
    EXPECT_THAT(err_, HasSubstr("unknown command"));
    EXPECT_EQ(Tool({"--add-gateway", "not json"}), 2);
    EXPECT_THAT(err_, HasSubstr("'not json' is not a JSON object"));
    EXPECT_EQ(Tool({"--get-device-list", "nonsense"}), 1);
    EXPECT_EQ(out_, "");
    EXPECT_THAT(err_, HasSubstr("--get-device-list failed (-1)"));

    std::string xml;
    ASSERT_EQ(RunProgram({"gdbus", "introspect", "--session", "--dest", kService, "--object-path",
                          "/", "--xml"},
                         kCallTimeout, &xml),
              0);
    GDBusNodeInfo* node = g_dbus_node_info_new_for_xml(xml.c_str(), nullptr);
    ASSERT_NE(node, nullptr) << xml;
    const GDBusInterfaceInfo* interface = g_dbus_node_info_lookup_interface(node, kService);
    ASSERT_NE(interface, nullptr) << xml;
    std::vector<std::string> shown;
    std::vector<std::string> expected;
    for (GDBusMethodInfo** method = interface->methods; *method != nullptr; ++method) {
        shown.push_back(std::string((*method)->name) + "(" + Arguments((*method)->in_args) + ")" +
                        Arguments((*method)->out_args));
    }
    for (const Method& method : kMethods) {
        expected.push_back(std::string(method.name) + "(" + method.in + ":s )" +
                           (*method.out != '\0' ? std::string(method.out) + ":s " : ""));
    }
    EXPECT_THAT(shown, UnorderedElementsAreArray(expected));
    g_dbus_node_info_unref(node);
}

TEST_F(VornnetdTest, BadInputGetsAnErrorAndChangesNothing) {
    ExpectServing();
    const auto before = root_.Files();
    // Deep nesting, huge texts and other types for every method: the abuse test. Here each
    // unparsable argument gets the error its method answers.
    for (const char* input : {"not json", R"({"type":)", "[1]", "null"}) {
        for (const Method& method : kMethods) {
            const Answer answer = CallService(method.name, input);
            const char* error = method.json ? "" : method.garbage;
            EXPECT_EQ(answer.ok, error == nullptr) << method.name << " " << input;
            if (method.json) {
                EXPECT_EQ(answer.text, std::string("Method invoked for ") + method.name +
                                           " returned FALSE but did not set error")
                    << method.name << " " << input;
            } else if (error != nullptr) {
                EXPECT_EQ(answer.text, error) << method.name << " " << input;
            }
        }
        ExpectServing();
    }

    // Well-formed objects whose keys have the wrong types: the route module says which one.
    const std::string wrongTypes =
        R"({"type":7,"ifname":["eth0"],"priority":"high","gateway":{},"method":false})";
    for (const Method& method : kMethods) {
        const Answer answer = CallService(method.name, wrongTypes);
        const char* error = method.json ? method.error : method.garbage;
        EXPECT_EQ(answer.ok, method.json ? false : error == nullptr) << method.name;
        if (error != nullptr) {
            EXPECT_EQ(answer.text, error) << method.name;
        } else if (method.json) {
            EXPECT_THAT(answer.text,
                        MatchesRegex("failed to .*: (Invalid|Missing) key .* in request"))
                << method.name;
        }
    }

    EXPECT_EQ(CallService("AddGatewayData", g_variant_new("(i)", 7)).errorName,
              "org.freedesktop.DBus.Error.InvalidArgs");
    EXPECT_EQ(CallService("AddGatewayData", g_variant_new("(ss)", "{}", "{}")).errorName,
              "org.freedesktop.DBus.Error.InvalidArgs");
    EXPECT_EQ(CallService("NoSuchMethod", std::string("{}")).errorName,
              "org.freedesktop.DBus.Error.UnknownMethod");
    ExpectServing();
    EXPECT_EQ(root_.Files(), before);
}

TEST_F(VornnetdTest, OneDaemonPerRootAndBusAndSigtermStopsIt) {
    DaemonProcess second({kVornnetd, "--foreground"});
    const int code = second.WaitForExit(kExitTimeout);
    EXPECT_GT(code, 0);
    EXPECT_LT(code, 128) << "crashed";
    EXPECT_THAT(second.Stderr(), HasSubstr("cannot take /var/run/vornnetd.pid: another vornnetd "
                                           "is running"));
    EXPECT_EQ(root_.ReadFile("/var/run/vornnetd.pid"), std::to_string(daemon_.Pid()) + "\n");
    ExpectServing();
    {
        SimRoot otherRoot;
        SavedVariable address("DBUS_SESSION_BUS_ADDRESS");
        setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nonexistent/vorn-test/bus", 1);
        DaemonProcess busless({kVornnetd, "--foreground"});
        const int buslessCode = busless.WaitForExit(kExitTimeout);
        EXPECT_GT(buslessCode, 0);
        EXPECT_LT(buslessCode, 128) << "crashed";
        EXPECT_THAT(busless.Stderr(),
                    HasSubstr("cannot serve com.tessarin.net on the session bus"));
        EXPECT_FALSE(otherRoot.Exists("/var/run/vornnetd.pid"));
    }

    EXPECT_EQ(Tool({"--ready"}), 0);
    EXPECT_EQ(out_, "ready\n");
    ASSERT_TRUE(daemon_.Signal(SIGTERM));
    EXPECT_EQ(daemon_.WaitForExit(kExitTimeout), 0) << daemon_.Stderr();
    EXPECT_THAT(daemon_.Stderr(), AllOf(HasSubstr("Stopping on signal"), HasSubstr("Stopped")));
    EXPECT_FALSE(root_.Exists("/var/run/vornnetd.pid"));
    EXPECT_FALSE(vornnetwork::dbus::NetClient().IsServerReady());
    EXPECT_EQ(Tool({"--ready"}), 1);
    EXPECT_EQ(out_, "not ready\n");
}

}  // namespace
}  // namespace test
}  // namespace vorn
