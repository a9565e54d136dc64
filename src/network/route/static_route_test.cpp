#include "network/route/static_route.h"

#include <gmock/gmock.h>

#include <string>

#include "support/sim_root.h"
#include "utils/json_text.h"

namespace vornnetwork::network {
namespace {

using ::testing::IsEmpty;

const char kRuleFile[] = "/etc/iproute2/config/static-table-rule";
const char kRuleFileV6[] = "/etc/iproute2/config/static-table-rule-v6";

using vorn::test::Parse;

using StaticRouteTest = vorn::test::RootTest;

TEST_F(StaticRouteTest, SetRulesInstallsEnabledRoutesAndStoresAllInOrder) {
    StaticRoute routes;
    std::string list;
    for (int i = 0; i < 11; ++i) {
        list += std::string(i == 0 ? "" : ",") + "{\"ip\":\"10." + std::to_string(i) +
                ".0.0\",\"mask\":\"255.255.0.0\",\"gateway\":\"192.168.1.1\",\"ifname\":\"eth0\","
                "\"enable\":" +
                (i == 1 ? "false" : "true") + "}";
    }
    ASSERT_EQ(routes.SetRules(IP_TYPE_V4, Parse("{\"rules\":[" + list + "]}")), 0);
    const std::vector<std::string> calls = root_.Calls();
    ASSERT_EQ(calls.size(), 11u);  // a flush, then every enabled route
    EXPECT_EQ(calls[2],
              "/sbin/ip -4 route add to 10.2.0.0/16 via 192.168.1.1 dev eth0 table static-table");
    const std::string head =
        "[route_0000]\n\tenable=yes\n\tgateway=192.168.1.1\n\tifname=eth0\n\tip=10.0.0.0\n"
        "\tmask=255.255.0.0\n[route_0001]\n\tenable=no\n\tgateway=192.168.1.1\n\tifname=eth0\n";
    EXPECT_EQ(root_.ReadFile(kRuleFile).substr(0, head.size()), head);

    // Read back in the order given, the disabled route listed but not active.
    root_.Scenario("ip",
                   "when route show table static-table\n"
                   "print 10.0.0.0/16 via 192.168.1.1 dev eth0\n"
                   "print 10.10.0.0/16 via 192.168.1.1 dev eth0\n");
    Json::Value stored;
    ASSERT_EQ(routes.GetRules(IP_TYPE_V4, stored), 0);
    ASSERT_EQ(stored["rules"].size(), 11u);
    EXPECT_EQ(stored["rules"][1]["enable"], false);
    for (unsigned i : {0u, 1u, 2u, 10u}) {
        EXPECT_EQ(stored["rules"][i]["active"], i % 10 == 0 ? "Enabled" : "Disabled") << i;
    }

    ASSERT_EQ(routes.SetRules(IP_TYPE_V6, Parse("{\"rules\":[{\"ip\":\"2001:db8:5::9\","
                                                "\"prefix_length\":\"64\",\"gateway\":\"fe80::1\","
                                                "\"ifname\":\"eth1\",\"enable\":true}]}")),
              0);
    EXPECT_EQ(root_.ReadFile(kRuleFileV6),
              "[route_0000]\n\tenable=yes\n\tgateway=fe80::1\n\tifname=eth1\n\tip=2001:db8:5::9\n"
              "\tprefix_length=64\n");
}

TEST_F(StaticRouteTest, BadRequestsChangeNeitherTableNorFile) {
    StaticRoute routes;
    root_.WriteFile(kRuleFile, "[route_0000]\n\tenable=no\n");
    const auto rules = [](const std::string& mask, const std::string& more) {
        return Parse(R"({"rules":[{"ip":"10.0.0.0","gateway":"10.0.0.1","mask":")" + mask + '"' +
                     more + "}]}");
    };
    EXPECT_EQ(routes.SetRules(IP_TYPE_V4, Parse("[]")), -1);
    EXPECT_EQ(routes.SetRules(IP_TYPE_V4, rules("255.0.0.0", "")), -1);
    EXPECT_EQ(routes.SetRules(IP_TYPE_V4, rules("255.0.255.0", R"(,"ifname":"eth0")")), -1);
    EXPECT_EQ(routes.SetRules(IP_TYPE_V4, rules("255.0.0.0", R"(,"ifname":"eth0 `reboot`")")), -1);
    EXPECT_EQ(routes.SetRules(IP_TYPE_V4, rules("255.0.0.0", R"(,"ifname":"eth0","enable":"yes")")),
              -1);
    EXPECT_EQ(routes.SetRules(IP_TYPE_V6, Parse("{\"rules\":[{\"ip\":\"2001:db8::\","
                                                "\"prefix_length\":\"129\",\"gateway\":\"fe80::1\","
                                                "\"ifname\":\"eth0\"}]}")),
              -1);
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_EQ(root_.ReadFile(kRuleFile), "[route_0000]\n\tenable=no\n");

    // A flush refused while the table still holds routes stops before the file is written.
    root_.Scenario("ip",
                   "when -4 route flush *\nexit 2\n"
                   "when -4 route show table static-table\nprint 10.0.0.0/8 dev eth0\n");
    EXPECT_EQ(routes.SetRules(IP_TYPE_V4, Parse("{\"rules\":[]}")), -1);
    EXPECT_TRUE(
        log_.Contains("Failed to execute command[/sbin/ip -4 route flush table static-table]"));
    EXPECT_EQ(root_.ReadFile(kRuleFile), "[route_0000]\n\tenable=no\n");
}

TEST_F(StaticRouteTest, TableInfoReadsDestinationGatewayDeviceAndMetric) {
    root_.Scenario("ip",
                   "when route show table main\n"
                   "print default via 10.0.0.1 dev eth0 metric 5\n"
                   "print 10.0.0.0/24 dev eth0 proto kernel scope link src 10.0.0.2\n"
                   "print 10.9.0.0/16 via 10.0.0.7 dev \"eth0 metric 7\n");
    StaticRoute routes;
    Json::Value info;
    ASSERT_EQ(routes.GetTableInfo(IP_TYPE_V4, "main", info), 0);
    EXPECT_EQ(info["name"], "main");
    ASSERT_EQ(info["routes"].size(), 3u);
    EXPECT_EQ(vornwireless::utils::CompactJson(info["routes"][0]),
              R"({"class":"unknown","destination":"0.0.0.0","gateway":"10.0.0.1",)"
              R"("gateway_class":"-","ifname":"eth0","metric":"5"})");
    EXPECT_EQ(info["routes"][1]["metric"], "0");
    // A line a shell would misread is never handed to one.
    EXPECT_EQ(info["routes"][2]["metric"], "0");
    EXPECT_EQ(routes.GetTableInfo(IP_TYPE_V4, "main;reboot", info), -1);
}

}  // namespace
}  // namespace vornnetwork::network
