#include "network/module/route_module.h"

#include <gmock/gmock.h>

#include <string>
#include <thread>
#include <vector>

#include "network/utils.h"
#include "support/sim_root.h"
#include "utils/json_text.h"

namespace vornnetwork::network::module {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr char kV4File[] = "/etc/iproute2/config/gateway_v4_priority";
constexpr char kV6File[] = "/etc/iproute2/config/gateway_v6_priority";
constexpr char kDatabase[] = "/etc/iproute2/config/gateway_database";
constexpr char kResolv4[] = "/etc/iproute2/config/resolv4.conf";
constexpr char kResolv6[] = "/etc/iproute2/config/resolv6.conf";

std::vector<std::string> Names(const RouteModule& module, GATEWAY_TYPE type) {
    std::vector<std::string> names;
    for (const GatewayInfo& entry : module.GetList(type)) {
        names.push_back(entry.ifname);
    }
    return names;
}

class RouteModuleTest : public vorn::test::RootTest {
  protected:
    // Sends a request written as JSON text; its answer.
    Json::Value Send(const std::string& text) {
        Json::Value answer;
        EXPECT_EQ(module_.ProcessRequest(vorn::test::Parse(text), answer), 0) << text;
        return answer;
    }
    // Sends a request that must be refused; the error it says.
    std::string Refusal(const std::string& text) {
        Json::Value answer;
        EXPECT_EQ(module_.ProcessRequest(vorn::test::Parse(text), answer), -1) << text;
        return answer["error"].asString();
    }
    void Add(const char* type, const std::string& ifname, int priority,
             const std::string& more = "") {
        Send(std::string(R"({"method":"ADD_GATEWAY_DATA","type":")") + type + R"(","ifname":")" +
             ifname + R"(","priority":)" + std::to_string(priority) + more + "}");
    }
    // slave is the JSON text of the value.
    void Slave(const char* ifname, const std::string& slave) {
        Send(std::string(R"({"method":"SET_SLAVE_DATA","type":"GTYPE_V4","ifname":")") + ifname +
             R"(","slave":)" + slave + "}");
    }
    std::vector<std::string> Names(GATEWAY_TYPE type) const { return module::Names(module_, type); }
    std::string Files() const {
        std::string all;
        for (const char* file : {kV4File, kV6File, kDatabase, kResolv4, kResolv6}) {
            all += std::string(file) + ":\n" + root_.ReadFile(file);
        }
        return all;
    }

    RouteModule module_;
};

TEST_F(RouteModuleTest, PrioritiesSlavesAndCopiesPlaceEntries) {
    // 0 goes first, -1 last, -2 where the entry stands (a new one: last); beyond the end: last.
    const std::pair<const char*, int> adds[] = {{"eth1", 0}, {"eth0", 0},  {"eth2", -2},
                                                {"eth3", 3}, {"eth4", 99}, {"eth5", -7},
                                                {"eth6", 1}, {"eth0", -1}, {"eth5", 0}};
    for (const auto& [ifname, priority] : adds) {
        Add("GTYPE_V4", ifname, priority);
    }
    Add("GTYPE_V4", "eth0", -2, R"(,"gateway":"10.0.0.1")");
    Send(R"({"method":"DEL_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth6"})");
    Send(R"({"method":"DEL_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth9"})");
    EXPECT_THAT(Names(GTYPE_V4), ElementsAre("eth5", "eth1", "eth2", "eth3", "eth4", "eth0"));
    const Json::Value list = Send(R"({"method":"GET_GATEWAY_LIST_DATA","type":"GTYPE_V4"})");
    EXPECT_EQ(list[5]["priority"].asInt(), 5);
    EXPECT_EQ(list[5]["gateway"].asString(), "10.0.0.1");

    // Slaves go last; a copy takes the source's place, after the old destination entry goes.
    Slave("eth5", "true");
    Slave("eth1", "false");
    Slave("eth7", "true");  // not listed: nothing changes
    Send(R"({"method":"COPY_GATEWAY_DATA","type":"GTYPE_V4","interface_source":"eth0",)"
         R"("interface_destination":"bond0"})");
    EXPECT_THAT(Names(GTYPE_V4),
                ElementsAre("eth1", "eth2", "eth3", "eth4", "bond0", "eth0", "eth5"));
    EXPECT_EQ(module_.GetList(GTYPE_V4)[4].gateway.ToString(), "10.0.0.1");
    Send(R"({"method":"COPY_GATEWAY_DATA","type":"GTYPE_V4","interface_source":"eth5",)"
         R"("interface_destination":"bond0","interface_source_delete":true})");
    EXPECT_THAT(Names(GTYPE_V4), ElementsAre("eth1", "eth2", "eth3", "eth4", "eth0", "bond0"));
    EXPECT_TRUE(module_.GetList(GTYPE_V4)[5].slave);
}

TEST_F(RouteModuleTest, FilesAreWrittenByteForByte) {
    root_.WriteFile(kDatabase, "[br0]\n\tgateway=192.168.1.1\n\tother=kept\n");
    Add("GTYPE_V4", "eth0", 0, R"(,"gateway":"10.0.0.1","dns":"10.0.0.53","class":"ethernet")");
    // "NULL" keeps a field, empty text clears it.
    Add("GTYPE_V4", "eth0", -2, R"(,"gateway":"NULL","dns":"NULL","class":"NULL")");
    Add("GTYPE_V4", "wlan0", -1, R"(,"gateway":"10.1.0.1","dns":"10.1.0.53","class":"x")");
    Add("GTYPE_V4", "wlan0", -2, R"(,"dns":"","class":"")");
    Add("GTYPE_V6", "eth0", 0, R"(,"gateway":"fe80::1","dns":"2001:db8::53")");
    Add("GTYPE_V6", "sit0", 1, R"(,"gateway":"::","dns":"")");
    Slave("wlan0", "true");
    const char get[] =
        R"({"method":"GET_GATEWAY_DATA_BY_INTERFACE","type":"GTYPE_V4","ifname":"wlan0"})";
    EXPECT_EQ(vornwireless::utils::CompactJson(Send(get)),
              R"({"class":"","dns":"","exist":true,"gateway":"10.1.0.1",)"
              R"("ifname":"wlan0","priority":1,"slave":true})");

    EXPECT_EQ(root_.ReadFile(kV4File),
              "[0]\n\tclass=ethernet\n\tdns=10.0.0.53\n\tgateway=10.0.0.1\n\tifname=eth0\n"
              "\tslave=no\n"
              "[1]\n\tclass=\n\tdns=\n\tgateway=10.1.0.1\n\tifname=wlan0\n\tslave=yes\n");
    EXPECT_EQ(root_.ReadFile(kV6File),
              "[0]\n\tclass=unknown\n\tdns=2001:db8::53\n\tgateway=fe80::1\n\tifname=eth0\n"
              "\tslave=no\n"
              "[1]\n\tclass=unknown\n\tdns=\n\tgateway=::\n\tifname=sit0\n\tslave=no\n");
    EXPECT_EQ(root_.ReadFile(kDatabase),
              "[br0]\n\tgateway=192.168.1.1\n\tother=kept\n"
              "[eth0]\n\tdns=10.0.0.53\n\tdns_v6=2001:db8::53\n\tgateway=10.0.0.1\n"
              "\tgateway_v6=fe80::1\n"
              "[sit0]\n\tdns_v6=\n\tgateway_v6=::\n"
              "[wlan0]\n\tdns=\n\tgateway=10.1.0.1\n");
    EXPECT_EQ(root_.ReadFile(kResolv4), "nameserver 10.0.0.53\n");
    EXPECT_EQ(root_.ReadFile(kResolv6), "nameserver 2001:db8::53\n");
    // dns_mode is "auto" in the factory settings: the system resolver follows.
    EXPECT_EQ(root_.ReadFile("/etc/resolv.conf"),
              "nameserver 10.0.0.53\nnameserver 2001:db8::53\n");

    // A delete rewrites the list and the resolver file, not the database.
    Send(R"({"method":"DEL_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth0"})");
    EXPECT_EQ(root_.ReadFile(kResolv4), "");
    EXPECT_THAT(root_.ReadFile(kDatabase), HasSubstr("\tgateway=10.0.0.1\n"));
}

TEST_F(RouteModuleTest, ListsReadBackInTextOrderFromRequestsOfTwoThreads) {
    auto addMany = [this](const char* type, const std::string& prefix, int count) {
        for (int i = 0; i < count; ++i) {
            Add(type, prefix + std::to_string(i), -1);
        }
    };
    std::thread other(addMany, "GTYPE_V6", "a", 20);
    addMany("GTYPE_V6", "b", 20);
    other.join();
    addMany("GTYPE_V4", "eth", 11);
    RouteModule restarted;
    ASSERT_EQ(restarted.Initialize(), 0);
    EXPECT_THAT(module::Names(restarted, GTYPE_V4),
                ElementsAre("eth0", "eth1", "eth10", "eth2", "eth3", "eth4", "eth5", "eth6", "eth7",
                            "eth8", "eth9"));
    EXPECT_EQ(restarted.GetList(GTYPE_V6).size(), 40u);
    // Start-up re-enables the static table.
    EXPECT_THAT(root_.Calls(), testing::Contains(HasSubstr("static")));

    root_.WriteFile(kV6File, "[0]\n\tifname=eth0;reboot\n\tgateway=::\n[1]\n\tifname=eth1\n");
    EXPECT_EQ(module_.ReadGatewayListFromFile(GTYPE_V6), 0);
    EXPECT_THAT(Names(GTYPE_V6), ElementsAre("eth1"));
    EXPECT_EQ(module_.ReadGatewayListFromFile(static_cast<GATEWAY_TYPE>(2)), -1);
    EXPECT_TRUE(log_.Contains("route_module.cpp:"));
    EXPECT_TRUE(log_.Contains("Unknown type to read config"));
}

TEST_F(RouteModuleTest, OnlyHarmfulRequestsAreRefusedAndTheySayWhy) {
    Add("GTYPE_V4", "eth0", 0, R"(,"gateway":"10.0.0.1","dns":"10.0.0.53")");
    Add("GTYPE_V6", "eth0", 0, R"(,"gateway":"fe80::1")");
    const std::string files = Files();
    root_.ClearCalls();
    log_.Clear();

    const std::pair<const char*, const char*> refused[] = {
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth1","priority":"high"})",
         "Invalid key [priority] in request"},
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth1;reboot"})",
         "Invalid key [ifname] in request"},
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"abcdefghijklmnop"})",
         "Invalid key [ifname] in request"},
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","priority":0,"refresh":true})",
         "Missing key [ifname] in request"},
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth0","gateway":"10.0.1"})",
         "Invalid key [gateway] in request"},
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth0","gateway":"fe80::1"})",
         "Invalid key [gateway] in request"},
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V6","ifname":"eth0","dns":"x y"})",
         "Invalid key [dns] in request"},
        {R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth0","class":"a\nb"})",
         "Invalid key [class] in request"},
        {R"({"method":"COPY_GATEWAY_DATA","type":"GTYPE_V4","interface_source":"eth0",)"
         R"("interface_destination":"a|b","interface_source_delete":true})",
         "Invalid key [interface_destination] in request"},
        {R"({"method":"COPY_GATEWAY_DATA","type":"GTYPE_V4","interface_source":"eth0"})",
         "Missing key [interface_destination] in request"},
        {R"([1,2])", "Invalid request"},
    };
    for (const auto& [request, error] : refused) {
        EXPECT_EQ(Refusal(request), error);
        EXPECT_EQ(Files(), files) << request;
    }
    // Harmless oddities run as the operations take them: unknown types and methods are logged,
    // flags that are no booleans read as false.
    const char* const taken[] = {
        R"({"method":"ADD_GATEWAY_DATA","ifname":"eth1","priority":0,"refresh":true})",
        R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V9","ifname":"eth1","refresh":true})",
        R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth0","refresh":"yes"})",
        R"({"method":"DEL_GATEWAY_DATA","type":7,"ifname":"eth0","refresh":true})",
        R"({"method":"REFRESH_GATEWAY","type":{"a":1}})",
        R"({"method":"NO_SUCH_METHOD","type":"GTYPE_V4","ifname":"eth1"})",
    };
    for (const char* request : taken) {
        Send(request);
        EXPECT_EQ(Files(), files) << request;
    }
    EXPECT_FALSE(IsEthernetLinkDetected("eth0;touch /tmp/x"));
    EXPECT_THAT(root_.Calls(), IsEmpty());
    // Each unknown type is logged by the refresh it asked for, and by the add.
    EXPECT_EQ(log_.Matching("Unknown type to add info").size(), 6u);

    // A class is stored as given, within bounds; a number converts.
    Add("GTYPE_V4", "eth0", -2, R"(,"class":"wi\tfi \"5G\"")");
    EXPECT_EQ(module_.GetList(GTYPE_V4)[0].class_, "wi\tfi \"5G\"");
    Slave("eth0", "1");
    EXPECT_TRUE(module_.GetList(GTYPE_V4)[0].slave);

    // A list at its bound takes no new interface, but its entries can still be changed.
    std::string full;
    for (int i = 0; i < 1024; ++i) {
        full += "[" + std::to_string(i) + "]\n\tifname=e" + std::to_string(i) + "\n";
    }
    root_.WriteFile(kV4File, full);
    ASSERT_EQ(module_.ReadGatewayListFromFile(GTYPE_V4), 0);
    EXPECT_EQ(Refusal(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"eth9"})"),
              "Too many gateways");
    Add("GTYPE_V4", "e7", 0);
    EXPECT_EQ(module_.GetList(GTYPE_V4).size(), 1024u);
    EXPECT_EQ(module_.GetList(GTYPE_V4)[0].ifname, "e7");
}

}  // namespace
}  // namespace vornnetwork::network::module
