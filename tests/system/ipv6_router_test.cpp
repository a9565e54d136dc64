// The native IPv6 router with the real ISC dhclient against dhcpd -6 delegating a prefix from a
// peer namespace, announced to a real vornnetd on a private bus.
#include <gmock/gmock.h>
#include <signal.h>
#include <sys/mount.h>
#include <unistd.h>

#include <fstream>
#include <memory>

#include "ipv6/router/dhcp_pd.h"
#include "ipv6/router/router6_factory.h"
#include "ipv6/router/router6_prefix.h"
#include "platform/vorn_ipv6.h"
#include "support/peer_namespace.h"
#include "support/waiting.h"
#include "utils/dbus_client.h"

namespace vorn {
namespace test {
namespace {

using network::ipv6::router::DHCPPD;
using network::ipv6::router::Router6Factory;
using network::ipv6::router::Router6Prefix;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

constexpr char kScript[] = "/sbin/dhclient-script";
constexpr char kDhcpdConf[] =
    "default-lease-time 600;\nmax-lease-time 7200;\n"
    "subnet6 2001:db8:ffff::/64 { prefix6 2001:db8:0:100:: 2001:db8:0:100:: /56; }\n";

class Router6SystemTest : public PeerNamespaceTest {
  protected:
    void SetUpPeers() override {
        AddPeer("r6-isp", "wan0", 11, "isp0", 17);
        Ip("-n r6-isp addr add 2001:db8:ffff::1/64 dev isp0");
        dir_ = MakeTempDir("r6-");
        // The client's script only records: Debian's own would rewrite the host's resolver file.
        std::ofstream(dir_ + "/script")
            << "#!/bin/sh\necho \"$reason $new_ip6_prefix\" >>" << dir_ << "/script.log\n";
        std::ofstream(dir_ + "/dhcpd.conf") << kDhcpdConf;
        std::ofstream(dir_ + "/dhcpd.leases");
        ASSERT_EQ(chmod((dir_ + "/script").c_str(), 0755), 0);
        ASSERT_EQ(mount((dir_ + "/script").c_str(), kScript, nullptr, MS_BIND, nullptr), 0);
        const std::string dhclient = root_->Path("/usr/sbin/dhclient");
        ASSERT_EQ(unlink(dhclient.c_str()), 0);
        ASSERT_EQ(symlink("/usr/sbin/dhclient", dhclient.c_str()), 0);
        Start({"/usr/sbin/dhcpd", "-6", "-f", "-cf", dir_ + "/dhcpd.conf", "-lf",
               dir_ + "/dhcpd.leases", "-pf", dir_ + "/dhcpd.pid", "isp0"},
              "r6-isp");
        bus_ = std::make_unique<PrivateBus>();
        ASSERT_TRUE(bus_->Started());
        ASSERT_TRUE(Start({VORN_BINARY_DIR "/daemons/vornnetd", "--foreground"})
                        .WaitForBusName("com.tessarin.net", std::chrono::seconds(30)));
    }

    void TearDown() override {
        if (clientPid_ > 0 && !HasEnded(clientPid_)) {
            kill(clientPid_, SIGKILL);
        }
        const bool mounted = !dir_.empty();
        PeerNamespaceTest::TearDown();
        bus_.reset();
        if (mounted) {
            EXPECT_EQ(umount(kScript), 0);
            Shell("rm -rf " + dir_);
        }
    }

    std::string Read(const std::string& path) const {
        std::ifstream in(path);
        return std::string(std::istreambuf_iterator<char>(in), {});
    }

    std::string dir_;
    std::unique_ptr<PrivateBus> bus_;
    int clientPid_ = 0;
};

TEST_F(Router6SystemTest, DhclientGetsTheDelegatedPrefixAndStopsWithoutReleasingIt) {
    Json::Value request;
    request["wan"] = "wan0";
    request["is_default_gateway"] = true;
    const auto router = Router6Factory::newRouterV6Instance("native", request);
    ASSERT_TRUE(router != nullptr);
    ASSERT_TRUE(router->Create());
    const auto& client = dynamic_cast<const DHCPPD&>(*router);
    const std::string lease = root_->Path(client.LeaseFile());
    const std::string bound = "BOUND6 2001:db8:0:100::/56";
    ASSERT_TRUE(WaitFor([&] {
        return Read(dir_ + "/script.log").find(bound) != std::string::npos;
    })) << Read(dir_ + "/script.log");
    clientPid_ = std::atoi(Read(root_->Path(client.PidFile())).c_str());
    char duid[64];
    ASSERT_EQ(GenDUID("wan0", VORN_DUID_LL, duid, sizeof(duid)), 0);
    // dhclient rewrote the file, keeping the identity it was given.
    EXPECT_THAT(Read(lease), StartsWith("default-duid \"" + std::string(duid) + "\";\nlease6 {"));
    EXPECT_THAT(Read(lease), HasSubstr("iaprefix 2001:db8:0:100::/56 {"));
    EXPECT_EQ(vornwireless::utils::GetGatewayPriority("wan0", "GTYPE_V6"), 0);
    EXPECT_EQ(Read(root_->Path("/proc/sys/net/ipv6/conf/all/forwarding")), "1\n");

    Router6Prefix prefixes;
    ASSERT_TRUE(prefixes.Allocate("lan0", "wan0"));
    EXPECT_EQ(prefixes.AllocatedTo("lan0", prefixes.List().at(0)), "2001:db8:0:100::/64");

    ASSERT_GT(clientPid_, 0);
    EXPECT_TRUE(router->Destroy());
    EXPECT_TRUE(WaitFor([&] { return HasEnded(clientPid_); }));
    EXPECT_THAT(Read(dir_ + "/script.log"), Not(HasSubstr("RELEASE6")));
    EXPECT_THAT(Read(dir_ + "/dhcpd.leases"), HasSubstr("binding state active"));
    EXPECT_FALSE(root_->Exists("/etc/sysconfig/networking/ipv6-wan0"));
}

}  // namespace
}  // namespace test
}  // namespace vorn
