// The IPv6 module against a real router: radvd advertises from a peer namespace over a veth pair;
// the route module installs the default route with the real ip of the live root.
#include "network/module/ipv6_module.h"

#include <gmock/gmock.h>
#include <sys/mount.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "network/module/module_manager.h"
#include "network/module/route_module.h"
#include "platform/shell_command.h"
#include "support/log_capture.h"
#include "support/net_namespace.h"
#include "support/private_bus.h"
#include "support/sim_root.h"
#include "support/waiting.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using vorn::test::Shell;
using vorn::test::WaitFor;

using ::testing::AllOf;
using ::testing::HasSubstr;
using vorn::test::DaemonProcess;
using vorn::test::SimRoot;

// The host's programs: the root's own radvd is a simulator.
constexpr char kHostIp[] = "/usr/sbin/ip";
constexpr char kHostRadvd[] = "/usr/sbin/radvd";
constexpr char kRestart[] = "/etc/rc.network ipv6-restart h0";

class IPv6ModuleSystemTest : public ::testing::Test {
  protected:
    void SetUp() override {
        VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
        // "ip netns" keeps its namespaces under /run: a private one leaves nothing on the host.
        ASSERT_EQ(mount("tmpfs", "/run", "tmpfs", 0, nullptr), 0);
        root_ = std::make_unique<SimRoot>(SimRoot::Kind::kLive);
        ASSERT_EQ(
            mount(root_->Path("/etc/iproute2").c_str(), "/etc/iproute2", nullptr, MS_BIND, nullptr),
            0);
        // The kernel here takes no default route of its own from the advertisements.
        std::ofstream("/proc/sys/net/ipv6/conf/default/accept_ra") << "0\n";
        Ip("netns add r");
        Ip("netns exec r sh -c 'echo 0 > /proc/sys/net/ipv6/conf/default/accept_dad; "
           "echo 1 > /proc/sys/net/ipv6/conf/all/forwarding'");
        Ip("link add h0 index 11 type veth peer name r0 netns r index 17");
        Ip("-n r link set r0 up");
        Ip("link set h0 up");
        root_->WriteFile("/etc/sysconfig/network-scripts/ifcfg-h0",
                         "DEVICE=h0\nIPV6INIT=yes\nIPV6_AUTOCONF=yes\nIPV6ROUTER=no\n");
        // The router's link-local address comes once the link has its carrier.
        ASSERT_TRUE(WaitFor([&] {
            const std::string address = Shell(
                "/sbin/ip -n r -6 -o addr show dev r0 scope link | "
                "awk '{print $4}'");
            routerAddress_ = address.substr(0, address.find('/'));
            return routerAddress_.compare(0, 5, "fe80:") == 0;
        }));

        ModuleManager* manager = ModuleManager::GetInstance();
        manager->RemoveModule(MODULE_ROUTE);
        ASSERT_TRUE(manager->AddModule({MODULE_ROUTE, true, &RouteModule::Create}));
        ASSERT_EQ(manager->GetModule(MODULE_ROUTE)->Initialize(), 0);
        ASSERT_EQ(module_.Initialize(), 0);
        ASSERT_EQ(module_.Start(), 0);
        root_->ClearCalls();
    }

    // The listener goes before the route module it sends to; the next test's namespace starts as
    // a copy of this one's mounts.
    void TearDown() override {
        module_.Terminate();
        if (root_ == nullptr) {
            return;
        }
        radvd_.reset();
        ModuleManager::GetInstance()->RemoveModule(MODULE_ROUTE);
        Shell("/sbin/ip netns del r");
        EXPECT_EQ(umount("/etc/iproute2"), 0);
        root_.reset();
        EXPECT_EQ(umount2("/run", MNT_DETACH), 0);
    }

    void Ip(const std::string& arguments) const {
        ASSERT_EQ(Shell("/sbin/ip " + arguments + " && echo done"), "done\n") << arguments;
    }

    // Managed and other-configuration flags on, the first adverts within a fraction of a second.
    void StartRadvd(const std::string& prefix) {
        radvd_.reset();
        const std::string conf = root_->Dir() + "/radvd.conf";
        std::ofstream(conf) << "interface r0 { AdvSendAdvert on; AdvManagedFlag on; "
                               "AdvOtherConfigFlag on; MinRtrAdvInterval 3; MaxRtrAdvInterval 4; "
                               "prefix "
                            << prefix << " { AdvOnLink on; AdvAutonomous on; }; };\n";
        radvd_ = std::make_unique<DaemonProcess>(
            std::vector<std::string>{kHostIp, "netns", "exec", "r", kHostRadvd, "-n", "-m",
                                     "stderr", "-C", conf, "-p", root_->Dir() + "/radvd.pid"});
        ASSERT_TRUE(radvd_->Started());
    }

    int Restarts() const {
        const std::vector<std::string> calls = root_->Calls();
        return static_cast<int>(std::count(calls.begin(), calls.end(), kRestart));
    }
    std::string DefaultRoutes() const { return Shell("/sbin/ip -6 route show default"); }

    // What went on, for a failure message.
    std::string Story() const {
        std::string story = radvd_ != nullptr ? radvd_->Stderr() : "";
        for (const std::string& line : log_.Lines()) {
            story += line + "\n";
        }
        return story;
    }

    vorn::test::LogCapture log_;
    std::unique_ptr<SimRoot> root_;
    std::unique_ptr<DaemonProcess> radvd_;
    std::string routerAddress_;
    IPv6Module module_;
};

TEST_F(IPv6ModuleSystemTest, AdvertisedRouterBecomesTheDefaultRouteOncePerChange) {
    StartRadvd("2001:db8:1::/64");
    ASSERT_TRUE(WaitFor([&] { return Restarts() == 1; })) << Story();
    EXPECT_THAT(DefaultRoutes(), HasSubstr("default via " + routerAddress_ + " dev h0 "));
    EXPECT_THAT(root_->ReadFile("/etc/sysconfig/network-scripts/ifcfg-h0"),
                AllOf(HasSubstr("IPV6_AUTOCONF=no\n"), HasSubstr("DHCPV6C=yes\n")));
    EXPECT_THAT(root_->ReadFile("/etc/iproute2/config/gateway_v6_priority"),
                AllOf(HasSubstr("gateway=" + routerAddress_), HasSubstr("ifname=h0")));
    EXPECT_EQ(module_.GetContexts()["h0"].prefix, "2001:db8:1::");

    // A repeated advertisement registers nothing: the route taken away here stays away.
    Ip("-6 route del default");
    const auto handled = module_.AdvertisementsHandled();
    ASSERT_TRUE(WaitFor([&] { return module_.AdvertisementsHandled() > handled; }));
    EXPECT_EQ(DefaultRoutes(), "");
    EXPECT_EQ(Restarts(), 1);

    StartRadvd("2001:db8:2::/64");
    ASSERT_TRUE(WaitFor([&] { return Restarts() == 2; })) << Story();
    EXPECT_THAT(DefaultRoutes(), HasSubstr("default via " + routerAddress_ + " dev h0 "));
    EXPECT_EQ(module_.GetContexts()["h0"].prefix, "2001:db8:2::");
}

}  // namespace
}  // namespace module
}  // namespace network
}  // namespace vornnetwork
