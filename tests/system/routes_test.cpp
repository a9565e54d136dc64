// Default routes, policy tables and static routes against the real kernel: two uplinks whose far
// ends sit in namespaces of their own, the real ip and ethtool of the live root.
#include <gmock/gmock.h>

#include "network/module/route_module.h"
#include "network/route/policy_route.h"
#include "network/route/static_route.h"
#include "support/peer_namespace.h"
#include "support/waiting.h"

namespace vornnetwork {
namespace network {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using vorn::test::Shell;

using vorn::test::Parse;

class RouteSystemTest : public vorn::test::PeerNamespaceTest {
  protected:
    void SetUpPeers() override {
        for (const std::string i : {"1", "2"}) {
            if (HasFatalFailure()) {
                return;
            }
            AddPeer("up" + i, "u" + i, 10 + std::stoi(i), "p" + i, 20 + std::stoi(i));
            Ip("addr add 10." + i + ".0.2/24 dev u" + i);
            Ip("-6 addr add 2001:db8:" + i + "::2/64 dev u" + i);
            Ip("-n up" + i + " addr add 10." + i + ".0.1/24 dev p" + i);
            Ip("-n up" + i + " -6 addr add 2001:db8:" + i + "::1/64 dev p" + i);
        }
    }

    // Both uplinks as IPv4 gateways of the route module, in order.
    void AddGateways() {
        ASSERT_EQ(module_.Initialize(), 0);
        for (const std::string i : {"1", "2"}) {
            Send(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","priority":-1,"ifname":"u)" + i +
                 R"(","gateway":"10.)" + i + R"(.0.1","class":"ethernet"})");
        }
    }
    void Send(const std::string& text) {
        Json::Value answer;
        EXPECT_EQ(module_.ProcessRequest(Parse(text), answer), 0) << text;
    }
    void PullCable(const std::string& i) {
        Ip("-n up" + i + " link set p" + i + " down");
        ASSERT_TRUE(vorn::test::WaitFor([&] { return Carrier("u" + i) == "0"; }));
    }

    module::RouteModule module_;
};

TEST_F(RouteSystemTest, DefaultRoutesGoThroughTheFirstUsableUplinkAndReplaceTheOldOnes) {
    AddGateways();
    Ip("-6 route add default via 2001:db8:1::1 dev u1");
    Send(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V6","ifname":"u1","priority":0,)"
         R"("gateway":"::","class":"ethernet"})");
    Send(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V6","ifname":"u2","priority":-1,)"
         R"("gateway":"2001:db8:2::1","class":"ethernet","refresh":true})");
    Send(R"({"method":"REFRESH_GATEWAY","type":"GTYPE_V4"})");
    EXPECT_EQ(Shell("/sbin/ip -4 route show default"), "default via 10.1.0.1 dev u1 \n");
    std::string routes = Shell("/sbin/ip -6 route show default");
    EXPECT_THAT(routes, HasSubstr("default dev u1 "));
    EXPECT_THAT(routes, Not(HasSubstr("via")));

    PullCable("1");
    Send(R"({"method":"REFRESH_GATEWAY","type":"ALL"})");
    EXPECT_EQ(Shell("/sbin/ip -4 route show default"), "default via 10.2.0.1 dev u2 \n");
    EXPECT_EQ(module_.GetList(module::GTYPE_V4).front().ifname, "u2");
    routes = Shell("/sbin/ip -6 route show default");
    EXPECT_THAT(routes, HasSubstr("default via 2001:db8:2::1 dev u2 "));
    EXPECT_THAT(routes, Not(HasSubstr("u1")));

    // Nothing usable: the gateway in place stays.
    Send(R"({"method":"SET_SLAVE_DATA","type":"GTYPE_V4","ifname":"u2","slave":true})");
    Send(R"({"method":"REFRESH_GATEWAY","type":"GTYPE_V4"})");
    EXPECT_EQ(Shell("/sbin/ip -4 route show default"), "default via 10.2.0.1 dev u2 \n");
    EXPECT_THAT(root_->ReadFile("/etc/iproute2/config/gateway_v4_priority"),
                HasSubstr("[1]\n\tclass=ethernet\n\tdns=\n\tgateway=10.2.0.1\n\tifname=u2\n"
                          "\tslave=yes\n"));
}

TEST_F(RouteSystemTest, PolicyTableAndRulesComeAndGo) {
    PolicyRoute policy;
    PolicyRouteRule rule;
    rule.ifname = "u1";
    rule.name = "lan";
    rule.ip = "10.5.7.7";
    rule.mask = "255.255.0.0";
    rule.gateway = "10.1.0.1";
    ASSERT_EQ(policy.AddRule(rule), 0);
    rule.name = "multi-gateway";
    rule.ip = rule.mask = "";
    ASSERT_EQ(policy.AddRule(rule), 0);

    ASSERT_EQ(policy.EnableTable(IP_TYPE_V4, "u1", "10.1.0.2"), 0);
    // Enabling again adds the lookup rule once more; the routes are there already ("File exists").
    EXPECT_EQ(policy.EnableTable(IP_TYPE_V4, "u1", "10.1.0.2"), -1);
    const std::string rules = Shell("/sbin/ip -4 rule show");
    EXPECT_THAT(rules, HasSubstr("3:\tfrom 10.1.0.2 lookup u1-table\n"));
    EXPECT_EQ(rules.find("lookup u1-table"), rules.rfind("lookup u1-table")) << rules;
    const std::string table = Shell("/sbin/ip -4 route show table u1-table");
    EXPECT_THAT(table, HasSubstr("default via 10.1.0.1 dev u1"));
    EXPECT_THAT(table, HasSubstr("10.5.0.0/16 via 10.1.0.1 dev u1"));
    EXPECT_THAT(Shell("/sbin/ip -4 route get 10.5.1.1 from 10.1.0.2"), HasSubstr("table u1-table"));

    ASSERT_EQ(policy.DisableTable(IP_TYPE_V4, "u1"), 0);
    EXPECT_THAT(Shell("/sbin/ip -4 rule show"), Not(HasSubstr("10.1.0.2")));
    EXPECT_EQ(Shell("/sbin/ip -4 route show table 3"), "");
    EXPECT_THAT(Shell("/sbin/ip -4 route show table u1-table"), HasSubstr("\"u1-table\" is wrong"));
}

TEST_F(RouteSystemTest, StaticRoutesLandInTheStaticTableAndRefusedOnesDoNot) {
    PolicyRoute policy;
    ASSERT_EQ(policy.EnableTable(IP_TYPE_V4, "static", "all"), 0);
    ASSERT_EQ(policy.EnableTable(IP_TYPE_V6, "static", "all"), 0);
    EXPECT_THAT(Shell("/sbin/ip -4 rule show"), HasSubstr("2:\tfrom all lookup static-table"));

    StaticRoute routes;
    ASSERT_EQ(
        routes.SetRules(
            IP_TYPE_V4,
            Parse(
                R"({"rules":[)"
                R"({"ip":"10.7.0.0","mask":"255.255.0.0","gateway":"10.1.0.1","ifname":"u1","enable":true},)"
                R"({"ip":"10.8.0.0","mask":"255.255.0.0","gateway":"10.1.0.1","ifname":"u1","enable":false}]})")),
        0);
    ASSERT_EQ(routes.SetRules(IP_TYPE_V6,
                              Parse(R"({"rules":[{"ip":"2001:db8:5::","prefix_length":"64",)"
                                    R"("gateway":"2001:db8:1::1","ifname":"u1","enable":true}]})")),
              0);
    const std::string before = Shell("/sbin/ip -4 route show table static-table");
    EXPECT_EQ(before, "10.7.0.0/16 via 10.1.0.1 dev u1 \n");
    EXPECT_THAT(Shell("/sbin/ip -6 route show table static-table"),
                HasSubstr("2001:db8:5::/64 via 2001:db8:1::1 dev u1"));
    Json::Value stored;
    ASSERT_EQ(routes.GetRules(IP_TYPE_V4, stored), 0);
    EXPECT_EQ(stored["rules"][0]["active"], "Enabled");
    EXPECT_EQ(stored["rules"][1]["active"], "Disabled");

    // A gateway off every link is refused by the kernel; a test route leaves the table as it was.
    StaticRouteRule refused;
    ASSERT_EQ(StaticRoute::RuleFromJson(IP_TYPE_V4,
                                        Parse(R"({"ip":"10.9.1.1","mask":"255.255.255.0",)"
                                              R"("gateway":"192.168.77.1","ifname":"u1"})"),
                                        refused),
              0);
    Json::Value answer;
    EXPECT_EQ(routes.TestRuleVaild(refused, answer), -1);
    StaticRouteRule accepted = refused;
    accepted.gateway = "10.1.0.1";
    ASSERT_EQ(routes.TestRuleVaild(accepted, answer), 0);
    EXPECT_EQ(answer["ip"], "10.9.1.0");
    EXPECT_EQ(Shell("/sbin/ip -4 route show table static-table"), before);

    Json::Value tables;
    ASSERT_EQ(routes.GetRouteTables(IP_TYPE_V4, tables), 0);
    ASSERT_EQ(tables["tables"].size(), 2u);
    EXPECT_EQ(tables["tables"][1]["name"], "static-table");
    EXPECT_EQ(tables["tables"][1]["routes"][0]["destination"], "10.7.0.0/16");
    EXPECT_EQ(tables["tables"][1]["routes"][0]["ifname"], "u1");

    // Emptied by an empty list, and refilled from the files.
    ASSERT_EQ(routes.SetRules(IP_TYPE_V6, Parse(R"({"rules":[]})")), 0);
    EXPECT_EQ(Shell("/sbin/ip -6 route show table static-table"), "");
    Shell("/sbin/ip -4 route flush table static-table");
    ASSERT_EQ(routes.RefreshRules(), 0);
    EXPECT_EQ(Shell("/sbin/ip -4 route show table static-table"), before);

    ASSERT_EQ(policy.DisableTable(IP_TYPE_V4, "static"), 0);
    EXPECT_THAT(Shell("/sbin/ip -4 rule show"), Not(HasSubstr("static-table")));
    EXPECT_EQ(Shell("/sbin/ip -4 route show table 2"), "");
}

}  // namespace
}  // namespace network
}  // namespace vornnetwork
