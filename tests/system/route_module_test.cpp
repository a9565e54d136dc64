// The route module against the real kernel: two uplinks on veth pairs whose far ends sit in
// namespaces of their own, the real ip and ethtool of the live root.
#include "network/module/route_module.h"

#include <gmock/gmock.h>
#include <sys/mount.h>

#include <chrono>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "platform/shell_command.h"
#include "support/net_namespace.h"
#include "support/sim_root.h"
#include "support/waiting.h"
#include "utils/json_text.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using vorn::test::Shell;
using vorn::test::WaitFor;

using ::testing::HasSubstr;
using ::testing::Not;
using vorn::test::SimRoot;

std::string Carrier(const std::string& ifname) {
    std::string value;
    std::ifstream("/sys/class/net/" + ifname + "/carrier") >> value;
    return value;
}

class RouteModuleSystemTest : public ::testing::Test {
  protected:
    void SetUp() override {
        VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
        // "ip netns" keeps its namespaces under /run: a private one leaves nothing on the host.
        ASSERT_EQ(mount("tmpfs", "/run", "tmpfs", 0, nullptr), 0);
        root_ = std::make_unique<SimRoot>(SimRoot::Kind::kLive);
        // The real ip finds the tables the library registers.
        ASSERT_EQ(
            mount(root_->Path("/etc/iproute2").c_str(), "/etc/iproute2", nullptr, MS_BIND, nullptr),
            0);
        for (int n = 1; n <= 2; ++n) {
            const std::string i = std::to_string(n);
            Ip("netns add up" + i);
            Ip("link add u" + i + " index 1" + i + " type veth peer name p" + i + " netns up" + i +
               " index 2" + i);
            Ip("addr add 10." + i + ".0.2/24 dev u" + i);
            Ip("-6 addr add 2001:db8:" + i + "::2/64 dev u" + i + " nodad");
            Ip("-n up" + i + " addr add 10." + i + ".0.1/24 dev p" + i);
            Ip("-n up" + i + " -6 addr add 2001:db8:" + i + "::1/64 dev p" + i + " nodad");
            Ip("-n up" + i + " link set p" + i + " up");
            Ip("link set u" + i + " up");
            ASSERT_TRUE(WaitFor([&] { return Carrier("u" + i) == "1"; }));
        }
        ASSERT_EQ(module_.Initialize(), 0);
        Send(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"u1","priority":-1,)"
             R"("gateway":"10.1.0.1","class":"ethernet"})");
        Send(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","ifname":"u2","priority":-1,)"
             R"("gateway":"10.2.0.1","class":"ethernet"})");
    }

    // The next test's namespace starts as a copy of this one's mounts.
    void TearDown() override {
        if (root_ == nullptr) {
            return;
        }
        Shell("/sbin/ip netns del up1; /sbin/ip netns del up2");
        EXPECT_EQ(umount("/etc/iproute2"), 0);
        root_.reset();
        EXPECT_EQ(umount2("/run", MNT_DETACH), 0);
    }

    void Ip(const std::string& arguments) const {
        ASSERT_EQ(Shell("/sbin/ip " + arguments + " && echo done"), "done\n") << arguments;
    }
    void Send(const std::string& text) {
        Json::Value request;
        ASSERT_TRUE(vornwireless::utils::ParseJson(text, request)) << text;
        Json::Value answer;
        EXPECT_EQ(module_.ProcessRequest(request, answer), 0);
    }
    void PullCable(int n) {
        const std::string i = std::to_string(n);
        Ip("-n up" + i + " link set p" + i + " down");
        ASSERT_TRUE(WaitFor([&] { return Carrier("u" + i) == "0"; }));
    }

    std::unique_ptr<SimRoot> root_;
    RouteModule module_;
};

TEST_F(RouteModuleSystemTest, IPv4DefaultRouteGoesThroughTheFirstUsableUplink) {
    Send(R"({"method":"REFRESH_GATEWAY","type":"GTYPE_V4"})");
    EXPECT_EQ(Shell("/sbin/ip -4 route show default"), "default via 10.1.0.1 dev u1 \n");

    PullCable(1);
    Send(R"({"method":"REFRESH_GATEWAY","type":"GTYPE_V4"})");
    EXPECT_EQ(Shell("/sbin/ip -4 route show default"), "default via 10.2.0.1 dev u2 \n");
    EXPECT_EQ(module_.GetList(GTYPE_V4).front().ifname, "u2");

    // Nothing usable: the gateway in place stays.
    Send(R"({"method":"SET_SLAVE_DATA","type":"GTYPE_V4","ifname":"u2","slave":true})");
    Send(R"({"method":"REFRESH_GATEWAY","type":"GTYPE_V4"})");
    EXPECT_EQ(Shell("/sbin/ip -4 route show default"), "default via 10.2.0.1 dev u2 \n");
    EXPECT_THAT(root_->ReadFile("/etc/iproute2/config/gateway_v4_priority"),
                HasSubstr("[1]\n\tclass=ethernet\n\tdns=\n\tgateway=10.2.0.1\n\tifname=u2\n"
                          "\tslave=yes\n"));
}

TEST_F(RouteModuleSystemTest, IPv6DefaultRouteReplacesTheOldOnes) {
    Ip("-6 route add default via 2001:db8:1::1 dev u1");
    Send(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V6","ifname":"u1","priority":0,)"
         R"("gateway":"::","class":"ethernet"})");
    Send(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V6","ifname":"u2","priority":-1,)"
         R"("gateway":"2001:db8:2::1","class":"ethernet","refresh":true})");
    std::string routes = Shell("/sbin/ip -6 route show default");
    EXPECT_THAT(routes, HasSubstr("default dev u1 "));
    EXPECT_THAT(routes, Not(HasSubstr("via")));

    PullCable(1);
    Send(R"({"method":"REFRESH_GATEWAY","type":"ALL"})");
    routes = Shell("/sbin/ip -6 route show default");
    EXPECT_THAT(routes, HasSubstr("default via 2001:db8:2::1 dev u2 "));
    EXPECT_THAT(routes, Not(HasSubstr("u1")));
    EXPECT_EQ(Shell("/sbin/ip -4 route show default"), "default via 10.2.0.1 dev u2 \n");
}

}  // namespace
}  // namespace module
}  // namespace network
}  // namespace vornnetwork
