#include "support/peer_namespace.h"

#include <sys/mount.h>

#include <fstream>

#include "support/net_namespace.h"
#include "support/waiting.h"

namespace vorn {
namespace test {
namespace {

constexpr char kHostIp[] = "/sbin/ip";
constexpr char kNoDad[] = "/proc/sys/net/ipv6/conf/default/accept_dad";

}  // namespace

void PeerNamespaceTest::SetUp() {
    EnterNamespace();
    if (!IsSkipped() && !HasFatalFailure()) {
        SetUpPeers();
    }
}

void PeerNamespaceTest::EnterNamespace() {
    VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
    // "ip netns" keeps its namespaces under /run: a private one leaves nothing on the host.
    ASSERT_EQ(mount("tmpfs", "/run", "tmpfs", 0, nullptr), 0);
    root_ = std::make_unique<SimRoot>(SimRoot::Kind::kLive);
    ASSERT_EQ(
        mount(root_->Path("/etc/iproute2").c_str(), "/etc/iproute2", nullptr, MS_BIND, nullptr), 0);
    std::ofstream(kNoDad) << "0\n";
}

// The next test's namespace starts as a copy of this one's mounts.
void PeerNamespaceTest::TearDown() {
    programs_.clear();
    if (root_ == nullptr) {
        return;
    }
    for (const std::string& peer : peers_) {
        RunProgram({kHostIp, "netns", "del", peer}, std::chrono::seconds(10));
    }
    if (HasFailure()) {
        for (const std::string& line : log_.Lines()) {
            std::printf("log: %s\n", line.c_str());
        }
    }
    EXPECT_EQ(umount("/etc/iproute2"), 0);
    root_.reset();
    EXPECT_EQ(umount2("/run", MNT_DETACH), 0);
}

void PeerNamespaceTest::AddPeer(const std::string& peer, const std::string& near, int nearIndex,
                                const std::string& far, int farIndex) {
    Ip("netns add " + peer);
    peers_.push_back(peer);
    Ip("netns exec " + peer + " sh -c 'echo 0 >" + kNoDad + "'");
    Ip("link add " + near + " index " + std::to_string(nearIndex) + " type veth peer name " + far +
       " netns " + peer + " index " + std::to_string(farIndex));
    Ip("-n " + peer + " link set lo up");
    Ip("-n " + peer + " link set " + far + " up");
    Ip("link set " + near + " up");
    ASSERT_TRUE(WaitFor([&] { return Carrier(near) == "1"; })) << near;
}

std::string PeerNamespaceTest::Carrier(const std::string& ifname) {
    std::string value;
    std::ifstream("/sys/class/net/" + ifname + "/carrier") >> value;
    return value;
}

void PeerNamespaceTest::Ip(const std::string& arguments) const {
    ASSERT_EQ(Shell(std::string(kHostIp) + " " + arguments + " && echo done"), "done\n")
        << arguments;
}

DaemonProcess& PeerNamespaceTest::Start(std::vector<std::string> argv, const std::string& peer) {
    if (!peer.empty()) {
        argv.insert(argv.begin(), {kHostIp, "netns", "exec", peer});
    }
    programs_.push_back(std::make_unique<DaemonProcess>(argv));
    EXPECT_TRUE(programs_.back()->Started()) << argv[0];
    return *programs_.back();
}

}  // namespace test
}  // namespace vorn
