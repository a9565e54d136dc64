// The IPv6 module against a real router: radvd advertises from a peer namespace over a veth pair;
// the route module installs the default route with the real ip of the live root.
#include "network/module/ipv6_module.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <fstream>

#include "network/module/module_manager.h"
#include "network/module/route_module.h"
#include "support/peer_namespace.h"
#include "support/waiting.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using vorn::test::Shell;
using vorn::test::WaitFor;

class IPv6ModuleSystemTest : public vorn::test::PeerNamespaceTest {
  protected:
    void SetUpPeers() override {
        // The kernel here takes no default route of its own from the advertisements.
        std::ofstream("/proc/sys/net/ipv6/conf/default/accept_ra") << "0\n";
        AddPeer("r", "h0", 11, "r0", 17);
        Ip("netns exec r sh -c 'echo 1 > /proc/sys/net/ipv6/conf/all/forwarding'");
        root_->WriteFile("/etc/sysconfig/network-scripts/ifcfg-h0",
                         "DEVICE=h0\nIPV6INIT=yes\nIPV6_AUTOCONF=yes\nIPV6ROUTER=no\n");
        ASSERT_TRUE(WaitFor([&] {
            const std::string address =
                Shell("/sbin/ip -n r -6 -o addr show dev r0 scope link | awk '{print $4}'");
            router_ = address.substr(0, address.find('/'));
            return router_.compare(0, 5, "fe80:") == 0;
        }));
        ModuleManager* manager = ModuleManager::GetInstance();
        manager->RemoveModule(MODULE_ROUTE);
        ASSERT_TRUE(manager->AddModule({MODULE_ROUTE, true, &RouteModule::Create}));
        ASSERT_EQ(manager->GetModule(MODULE_ROUTE)->Initialize(), 0);
        ASSERT_EQ(module_.Initialize(), 0);
        ASSERT_EQ(module_.Start(), 0);
        root_->ClearCalls();
    }

    // The listener goes before the route module it sends to.
    void TearDown() override {
        module_.Terminate();
        ModuleManager::GetInstance()->RemoveModule(MODULE_ROUTE);
        PeerNamespaceTest::TearDown();
    }

    // Managed and other-configuration flags on, the first adverts within a fraction of a second.
    void StartRadvd(const std::string& prefix) {
        if (radvd_ != nullptr) {
            radvd_->Signal(SIGTERM);
            radvd_->WaitForExit(std::chrono::seconds(10));
        }
        const std::string conf = root_->Dir() + "/radvd.conf";
        std::ofstream(conf) << "interface r0 { AdvSendAdvert on; AdvManagedFlag on; "
                               "AdvOtherConfigFlag on; MinRtrAdvInterval 3; MaxRtrAdvInterval 4; "
                               "prefix "
                            << prefix << " { AdvOnLink on; AdvAutonomous on; }; };\n";
        // The host's radvd: the root's own is a simulator.
        radvd_ = &Start({"/usr/sbin/radvd", "-n", "-m", "stderr", "-C", conf, "-p",
                         root_->Dir() + "/radvd.pid"},
                        "r");
    }

    int Restarts() const {
        const std::vector<std::string> calls = root_->Calls();
        return static_cast<int>(
            std::count(calls.begin(), calls.end(), "/etc/rc.network ipv6-restart h0"));
    }
    std::string DefaultRoutes() const { return Shell("/sbin/ip -6 route show default"); }

    vorn::test::DaemonProcess* radvd_ = nullptr;
    std::string router_;
    IPv6Module module_;
};

TEST_F(IPv6ModuleSystemTest, AdvertisedRouterBecomesTheDefaultRouteOncePerChange) {
    StartRadvd("2001:db8:1::/64");
    ASSERT_TRUE(WaitFor([&] { return Restarts() == 1; })) << radvd_->Stderr();
    EXPECT_THAT(DefaultRoutes(), HasSubstr("default via " + router_ + " dev h0 "));
    EXPECT_THAT(root_->ReadFile("/etc/sysconfig/network-scripts/ifcfg-h0"),
                AllOf(HasSubstr("IPV6_AUTOCONF=no\n"), HasSubstr("DHCPV6C=yes\n")));
    EXPECT_THAT(root_->ReadFile("/etc/iproute2/config/gateway_v6_priority"),
                AllOf(HasSubstr("gateway=" + router_), HasSubstr("ifname=h0")));
    EXPECT_EQ(module_.GetContexts()["h0"].prefix, "2001:db8:1::");

    // A repeated advertisement registers nothing: the route taken away here stays away.
    Ip("-6 route del default");
    const auto handled = module_.AdvertisementsHandled();
    ASSERT_TRUE(WaitFor([&] { return module_.AdvertisementsHandled() > handled; }));
    EXPECT_EQ(DefaultRoutes(), "");
    EXPECT_EQ(Restarts(), 1);

    StartRadvd("2001:db8:2::/64");
    ASSERT_TRUE(WaitFor([&] { return Restarts() == 2; })) << radvd_->Stderr();
    EXPECT_THAT(DefaultRoutes(), HasSubstr("default via " + router_ + " dev h0 "));
    EXPECT_EQ(module_.GetContexts()["h0"].prefix, "2001:db8:2::");
}

}  // namespace
}  // namespace module
}  // namespace network
}  // namespace vornnetwork
