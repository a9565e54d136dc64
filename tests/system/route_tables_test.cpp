// Policy tables, their rules and the static routes as the real kernel holds them.
#include <gmock/gmock.h>
#include <sys/mount.h>

#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "network/route/policy_route.h"
#include "network/route/static_route.h"
#include "platform/shell_command.h"
#include "support/net_namespace.h"
#include "support/sim_root.h"
#include "support/waiting.h"
#include "utils/json_text.h"

namespace vornnetwork {
namespace network {
namespace {

using vorn::test::Shell;

using ::testing::HasSubstr;
using ::testing::Not;

// The real ip reads table names from /etc/iproute2: show it the root's.
class BindMount {
  public:
    BindMount(const std::string& from, const std::string& to) : to_(to) {
        mounted_ = mount(from.c_str(), to.c_str(), nullptr, MS_BIND, nullptr) == 0;
    }
    ~BindMount() {
        if (mounted_) {
            umount(to_.c_str());
        }
    }
    BindMount(const BindMount&) = delete;
    BindMount& operator=(const BindMount&) = delete;
    bool Mounted() const { return mounted_; }

  private:
    std::string to_;
    bool mounted_ = false;
};

size_t Count(const std::string& text, const std::string& part) {
    size_t count = 0;
    for (size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
        ++count;
    }
    return count;
}

Json::Value Parse(const std::string& text) {
    Json::Value value;
    EXPECT_TRUE(vornwireless::utils::ParseJson(text, value)) << text;
    return value;
}

class RouteTablesTest : public ::testing::Test {
  protected:
    void SetUp() override {
        VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
        root_.reset(new vorn::test::SimRoot(vorn::test::SimRoot::Kind::kLive));
        mount_.reset(new BindMount(root_->Path("/etc/iproute2"), "/etc/iproute2"));
        ASSERT_TRUE(mount_->Mounted());
        Shell("/sbin/ip link add v0 type veth peer name v1");
        Shell("/sbin/ip addr add 10.0.0.2/24 dev v0");
        Shell("/sbin/ip -6 addr add 2001:db8:1::2/64 dev v0 nodad");
        Shell("/sbin/ip link set v1 up");
        Shell("/sbin/ip link set v0 up");
        ASSERT_THAT(Shell("/sbin/ip -4 route show dev v0"), HasSubstr("10.0.0.0/24"));
    }
    void TearDown() override {
        if (HasFailure()) {
            for (const std::string& line : log_.Lines()) {
                std::printf("log: %s\n", line.c_str());
            }
        }
        mount_.reset();
        root_.reset();
    }

    vorn::test::LogCapture log_;
    std::unique_ptr<vorn::test::SimRoot> root_;
    std::unique_ptr<BindMount> mount_;
};

TEST_F(RouteTablesTest, PolicyTableAndRulesComeAndGo) {
    PolicyRoute policy;
    PolicyRouteRule rule;
    rule.ifname = "v0";
    rule.name = "lan";
    rule.ip = "10.5.7.7";
    rule.mask = "255.255.0.0";
    rule.gateway = "10.0.0.1";
    ASSERT_EQ(policy.AddRule(rule), 0);
    rule.name = "multi-gateway";
    rule.ip = "";
    rule.mask = "";
    ASSERT_EQ(policy.AddRule(rule), 0);

    ASSERT_EQ(policy.EnableTable(IP_TYPE_V4, "v0", "10.0.0.2"), 0);
    // Enabling again adds the lookup rule once more; the routes are there already ("File exists").
    EXPECT_EQ(policy.EnableTable(IP_TYPE_V4, "v0", "10.0.0.2"), -1);
    const std::string rules = Shell("/sbin/ip -4 rule show");
    EXPECT_EQ(Count(rules, "from 10.0.0.2 lookup v0-table"), 1u) << rules;
    EXPECT_THAT(rules, HasSubstr("3:\tfrom 10.0.0.2 lookup v0-table"));
    const std::string table = Shell("/sbin/ip -4 route show table v0-table");
    EXPECT_THAT(table, HasSubstr("default via 10.0.0.1 dev v0"));
    EXPECT_THAT(table, HasSubstr("10.5.0.0/16 via 10.0.0.1 dev v0"));
    EXPECT_THAT(Shell("/sbin/ip -4 route get 10.5.1.1 from 10.0.0.2"), HasSubstr("table v0-table"));

    ASSERT_EQ(policy.DisableTable(IP_TYPE_V4, "v0"), 0);
    EXPECT_THAT(Shell("/sbin/ip -4 rule show"), Not(HasSubstr("10.0.0.2")));
    EXPECT_EQ(Shell("/sbin/ip -4 route show table 3"), "");
    EXPECT_THAT(Shell("/sbin/ip -4 route show table v0-table"), HasSubstr("\"v0-table\" is wrong"));
}

TEST_F(RouteTablesTest, StaticRoutesLandInTheStaticTableAndRefusedOnesDoNot) {
    PolicyRoute policy;
    ASSERT_EQ(policy.EnableTable(IP_TYPE_V4, "static", "all"), 0);
    ASSERT_EQ(policy.EnableTable(IP_TYPE_V6, "static", "all"), 0);
    EXPECT_THAT(Shell("/sbin/ip -4 rule show"), HasSubstr("2:\tfrom all lookup static-table"));

    StaticRoute routes;
    ASSERT_EQ(routes.SetRules(
                  IP_TYPE_V4,
                  Parse("{\"rules\":[{\"ip\":\"10.7.0.0\",\"mask\":\"255.255.0.0\",\"gateway\":"
                        "\"10.0.0.1\",\"ifname\":\"v0\",\"enable\":true},{\"ip\":\"10.8.0.0\","
                        "\"mask\":\"255.255.0.0\",\"gateway\":\"10.0.0.1\",\"ifname\":\"v0\","
                        "\"enable\":false}]}")),
              0);
    ASSERT_EQ(routes.SetRules(IP_TYPE_V6,
                              Parse("{\"rules\":[{\"ip\":\"2001:db8:5::\",\"prefix_length\":\"64\","
                                    "\"gateway\":\"2001:db8:1::1\",\"ifname\":\"v0\","
                                    "\"enable\":true}]}")),
              0);
    const std::string before = Shell("/sbin/ip -4 route show table static-table");
    EXPECT_EQ(before, "10.7.0.0/16 via 10.0.0.1 dev v0 \n");
    EXPECT_THAT(Shell("/sbin/ip -6 route show table static-table"),
                HasSubstr("2001:db8:5::/64 via 2001:db8:1::1 dev v0"));

    Json::Value stored;
    ASSERT_EQ(routes.GetRules(IP_TYPE_V4, stored), 0);
    EXPECT_EQ(stored["rules"][0]["active"], "Enabled");
    EXPECT_EQ(stored["rules"][1]["active"], "Disabled");
    ASSERT_EQ(routes.GetRules(IP_TYPE_V6, stored), 0);
    EXPECT_EQ(stored["rules"][0]["active"], "Enabled");

    // A gateway off every link is refused by the kernel and leaves the table as it was.
    StaticRouteRule refused;
    ASSERT_EQ(StaticRoute::RuleFromJson(IP_TYPE_V4,
                                        Parse("{\"ip\":\"10.9.1.1\",\"mask\":\"255.255.255.0\","
                                              "\"gateway\":\"192.168.77.1\",\"ifname\":\"v0\"}"),
                                        refused),
              0);
    Json::Value answer;
    EXPECT_EQ(routes.TestRuleVaild(refused, answer), -1);
    EXPECT_EQ(Shell("/sbin/ip -4 route show table static-table"), before);
    StaticRouteRule accepted = refused;
    accepted.gateway = "10.0.0.1";
    ASSERT_EQ(routes.TestRuleVaild(accepted, answer), 0);
    EXPECT_EQ(answer["ip"], "10.9.1.0");
    EXPECT_EQ(Shell("/sbin/ip -4 route show table static-table"), before);

    Json::Value tables;
    ASSERT_EQ(routes.GetRouteTables(IP_TYPE_V4, tables), 0);
    ASSERT_EQ(tables["tables"].size(), 2u);
    EXPECT_EQ(tables["tables"][1]["name"], "static-table");
    EXPECT_EQ(tables["tables"][1]["routes"][0]["destination"], "10.7.0.0/16");
    EXPECT_EQ(tables["tables"][1]["routes"][0]["ifname"], "v0");

    // Emptied by an empty list, and refilled from the files.
    ASSERT_EQ(routes.SetRules(IP_TYPE_V6, Parse("{\"rules\":[]}")), 0);
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
