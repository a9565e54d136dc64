#include "network/route/policy_route.h"

#include <gmock/gmock.h>

#include <string>

#include "support/sim_root.h"

namespace vornnetwork::network {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

const char kMulti[] = "/etc/iproute2/config/multi_table_config";
const char kRtTables[] = "/etc/iproute2/rt_tables";

class PolicyRouteTest : public vorn::test::RootTest {
  protected:
    PolicyRouteRule Rule(IP_TYPE type, const std::string& ifname, const std::string& name,
                         const std::string& ip, const std::string& maskOrLength,
                         const std::string& gateway) {
        PolicyRouteRule rule;
        rule.type = type;
        rule.ifname = ifname;
        rule.name = name;
        rule.ip = ip;
        if (type == IP_TYPE_V4) {
            rule.mask = maskOrLength;
        } else {
            rule.prefix_length = maskOrLength;
        }
        rule.gateway = gateway;
        return rule;
    }
};

TEST_F(PolicyRouteTest, EnableWritesFilesAndRunsDeleteBeforeEachAdd) {
    PolicyRoute route;
    EXPECT_EQ(route.GetMaxID(), 2);
    ASSERT_EQ(
        route.AddRule(Rule(IP_TYPE_V4, "eth0", "lan", "192.168.5.77", "255.255.255.0", "10.0.0.1")),
        0);
    ASSERT_EQ(route.AddRule(Rule(IP_TYPE_V4, "eth0", "multi-gateway", "", "", "10.0.0.1")), 0);
    EXPECT_EQ(root_.ReadFile("/etc/iproute2/config/eth0-table-rule"),
              "[lan]\n\tgateway=10.0.0.1\n\tifname=eth0\n\tip=192.168.5.77\n\tmask=255.255.255.0\n"
              "[multi-gateway]\n\tgateway=10.0.0.1\n\tifname=eth0\n\tip=\n\tmask=\n");
    root_.Scenario("ip", "when -4 route add default *\nexit 2\n");

    ASSERT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", "10.0.0.2,10.0.1.0/24"), 0);
    EXPECT_EQ(root_.ReadFile(kMulti),
              "[eth0-table]\n\tenable=yes\n\tid=3\n\tsource=10.0.0.2,10.0.1.0/24\n");
    EXPECT_EQ(root_.ReadFile(kRtTables), "3 eth0-table\n");
    EXPECT_THAT(
        root_.Calls(),
        ElementsAre(
            "/sbin/ip -4 rule delete from 10.0.0.2 lookup eth0-table",
            "/sbin/ip -4 rule add from 10.0.0.2 lookup eth0-table priority 3",
            "/sbin/ip -4 rule delete from 10.0.1.0/24 lookup eth0-table",
            "/sbin/ip -4 rule add from 10.0.1.0/24 lookup eth0-table priority 3",
            "/sbin/ip -4 route add to 192.168.5.0/24 via 10.0.0.1 dev eth0 table eth0-table",
            "/sbin/ip -4 route add default via 10.0.0.1 dev eth0 table eth0-table"));
    // The refused default route is logged (at debug priority) but does not fail the enable.
    EXPECT_THAT(log_.Matching("Failed to execute command"),
                ElementsAre(::testing::HasSubstr("[/sbin/ip -4 route add default via")));

    // The static table is id 2 and is enabled without rules; a new table follows the highest.
    root_.ClearCalls();
    ASSERT_EQ(route.EnableTable(IP_TYPE_V6, "static", "all"), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/sbin/ip -6 rule delete from all lookup static-table",
                            "/sbin/ip -6 rule add from all lookup static-table priority 2"));
    ASSERT_EQ(route.AddRule(Rule(IP_TYPE_V6, "eth1", "r", "2001:db8:9::", "48", "fe80::1")), 0);
    ASSERT_EQ(route.EnableTable(IP_TYPE_V6, "eth1", "2001:db8::/64"), 0);
    EXPECT_EQ(root_.ReadFile(kRtTables), "3 eth0-table\n4 eth1-table\n2 static-table\n");
    EXPECT_EQ(root_.Calls().back(),
              "/sbin/ip -6 route add to 2001:db8:9::/48 via fe80::1 dev eth1 table eth1-table");
    EXPECT_EQ(PolicyRoute().GetMaxID(), 4);
}

TEST_F(PolicyRouteTest, DisableKeepsTheIdAndEnableAgainReusesIt) {
    PolicyRoute route;
    ASSERT_EQ(route.AddRule(Rule(IP_TYPE_V4, "eth0", "lan", "10.1.0.0", "255.255.0.0", "10.0.0.1")),
              0);
    ASSERT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", "10.0.0.2"), 0);
    // Enabling again lists each source once.
    ASSERT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", "10.0.0.5,10.0.0.2"), 0);
    ASSERT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", "10.0.0.5"), 0);
    EXPECT_EQ(root_.ReadFile(kMulti),
              "[eth0-table]\n\tenable=yes\n\tid=3\n\tsource=10.0.0.2,10.0.0.5\n");
    root_.ClearCalls();

    ASSERT_EQ(route.DisableTable(IP_TYPE_V4, "eth0"), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/sbin/ip -4 route flush table eth0-table",
                            "/sbin/ip -4 rule delete from 10.0.0.2 lookup eth0-table",
                            "/sbin/ip -4 rule delete from 10.0.0.5 lookup eth0-table"));
    EXPECT_EQ(root_.ReadFile(kMulti), "[eth0-table]\n\tenable=no\n\tid=3\n\tsource=\n");
    EXPECT_EQ(root_.ReadFile(kRtTables), "");

    // No table outgrows 64 sources; one that did by hand, with a bad source among them, still
    // loses every lookup rule it can name.
    std::string forty;
    std::string other;
    for (int i = 0; i < 40; ++i) {
        forty += (i > 0 ? "," : "") + std::string("10.0.1.") + std::to_string(i);
        other += (i > 0 ? "," : "") + std::string("10.0.2.") + std::to_string(i);
    }
    ASSERT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", forty), 0);
    const std::string enabled = root_.ReadFile(kMulti);
    EXPECT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", other), -1);
    EXPECT_TRUE(log_.Contains("Too many sources for [eth0-table]"));
    EXPECT_EQ(root_.ReadFile(kMulti), enabled);
    root_.WriteFile(kMulti, "[eth0-table]\n\tenable=yes\n\tid=3\n\tsource=" + forty + "," + other +
                                ",x;reboot\n");
    root_.ClearCalls();
    EXPECT_EQ(route.DisableTable(IP_TYPE_V4, "eth0"), 0);
    EXPECT_EQ(root_.Calls().size(), 81u);
    EXPECT_EQ(root_.Calls().back(), "/sbin/ip -4 rule delete from 10.0.2.39 lookup eth0-table");
    EXPECT_EQ(root_.ReadFile(kMulti), "[eth0-table]\n\tenable=no\n\tid=3\n\tsource=\n");

    ASSERT_EQ(PolicyRoute().EnableTable(IP_TYPE_V4, "eth0", "10.0.0.3"), 0);
    EXPECT_EQ(root_.ReadFile(kRtTables), "3 eth0-table\n");

    // Deleting the last rule makes the next enable a no-op.
    ASSERT_EQ(route.DeleteRule(IP_TYPE_V4, "eth0", "lan"), 0);
    EXPECT_TRUE(route.IsRulesEmpty(RuleFilePath(IP_TYPE_V4, "eth0")));
    root_.ClearCalls();
    const std::string before = root_.ReadFile(kMulti);
    EXPECT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", "10.0.0.4"), 0);
    EXPECT_THAT(root_.Calls(), IsEmpty());
    EXPECT_EQ(root_.ReadFile(kMulti), before);
}

TEST_F(PolicyRouteTest, UntrustedValuesNeverReachACommandOrAFile) {
    PolicyRoute route;
    EXPECT_EQ(route.EnableTable(IP_TYPE_V4, "", "10.0.0.2"), -1);
    EXPECT_EQ(route.EnableTable(IP_TYPE_V4, "eth0;reboot", "10.0.0.2"), -1);
    EXPECT_EQ(route.EnableTable(IP_TYPE_V4, "static", "2001:db8::1"), -1);
    EXPECT_EQ(route.EnableTable(static_cast<IP_TYPE>(2), "static", "all"), -1);
    EXPECT_TRUE(log_.Contains("unknown type for IP format"));
    EXPECT_EQ(route.DisableTable(IP_TYPE_V4, "$(reboot)"), -1);
    EXPECT_EQ(route.AddRule(Rule(IP_TYPE_V4, "eth0", "x]", "", "", "10.0.0.1")), -1);
    EXPECT_EQ(route.AddRule(Rule(IP_TYPE_V6, "eth0", "x", "", "", "10.0.0.1")), -1);
    EXPECT_TRUE(log_.Contains("Bad parameter."));
    EXPECT_FALSE(root_.Exists(kMulti));

    // A rule file altered by hand: the bad section stops the table before any route is added.
    root_.WriteFile(RuleFilePath(IP_TYPE_V4, "eth0"),
                    "[a]\nifname=eth0\nip=10.9.0.0\nmask=255.0.255.0\ngateway=10.0.0.1\n");
    EXPECT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", "10.0.0.2"), -1);
    EXPECT_TRUE(log_.Contains("Failed to translate to ip/mask format to a subnet format."));
    EXPECT_FALSE(root_.Calls().empty());
    EXPECT_EQ(root_.Calls().back(),
              "/sbin/ip -4 rule add from 10.0.0.2 lookup eth0-table priority 3");

    // A kernel that refuses a network route fails the enable at error priority.
    root_.WriteFile(RuleFilePath(IP_TYPE_V4, "eth0"),
                    "[a]\nifname=eth0\nip=10.9.0.0\nmask=255.255.0.0\ngateway=10.0.0.1\n");
    root_.Scenario("ip", "when -4 route add to *\nexit 2\n");
    EXPECT_EQ(route.EnableTable(IP_TYPE_V4, "eth0", "10.0.0.2"), -1);
    EXPECT_TRUE(
        log_.Contains("Failed to execute command [/sbin/ip -4 route add to 10.9.0.0/16 "
                      "via 10.0.0.1 dev eth0 table eth0-table]"));

    // A lookup rule the kernel refuses.
    root_.Scenario("ip", "when -4 rule add *\nexit 2\n");
    EXPECT_EQ(route.SetTableLookupRule(IP_TYPE_V4, "eth0-table"), -1);
    EXPECT_EQ(route.SetTableLookupRule(IP_TYPE_V4, "eth9-table"), -1);
    EXPECT_TRUE(log_.Contains("Can't find [eth9-table] in file [" + std::string(kMulti) + "]."));
}

}  // namespace
}  // namespace vornnetwork::network
