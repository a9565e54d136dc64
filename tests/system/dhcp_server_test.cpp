// dnsmasq serving from the files DhcpdConfig writes, to a busybox udhcpc client in a peer
// namespace behind a bridge; then the ARP scanner names that client from the lease file.
#include <gmock/gmock.h>
#include <signal.h>
#include <spawn.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <functional>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "network/dhcp/dhcpd_config.h"
#include "network/module/arpscanner.h"
#include "platform/qlibc_file.h"
#include "support/net_namespace.h"
#include "support/sim_root.h"
#include "support/waiting.h"

extern char** environ;

namespace vornnetwork {
namespace network {
namespace dhcp {
namespace {

using vorn::test::WaitFor;

using ::testing::HasSubstr;
using vorn::test::SimRoot;

constexpr const char* kClientMac = "02:00:00:00:77:02";
constexpr const char* kLeaseFile = "/etc/dhcpd/dhcpd.conf.leases";

// Output and exit status of a host command line (never moved under the root).
std::string Shell(const std::string& command, int* status = nullptr) {
    std::string text;
    FILE* pipe = popen((command + " 2>&1").c_str(), "r");
    if (pipe == nullptr) {
        return text;
    }
    char buffer[512];
    while (std::fgets(buffer, sizeof(buffer), pipe) != nullptr) {
        text += buffer;
    }
    const int result = pclose(pipe);
    if (status != nullptr) {
        *status = WIFEXITED(result) ? WEXITSTATUS(result) : -1;
    }
    return text;
}

template <size_t N>
void Set(char (&field)[N], const char* value) {
    std::snprintf(field, N, "%s", value);
}

DHCPD_CONF Service(SERVICE_TYPE type, const char* start, const char* end, const char* netmask) {
    DHCPD_CONF conf{};
    conf.type = type;
    conf.lease = 3600;
    Set(conf.ifname, "br0");
    Set(conf.start, start);
    Set(conf.end, end);
    Set(conf.netmask, netmask);
    return conf;
}

std::vector<DHCPD_CONF> Services() {
    DHCPD_CONF v4 = Service(SERVICE_TYPE_IPV4, "192.168.77.100", "192.168.77.150", "255.255.255.0");
    Set(v4.router, "192.168.77.1");
    Set(v4.domain, "lan.test");
    Set(v4.dns1, "192.168.77.1");
    Set(v4.dns2, "192.168.77.2");
    DHCPD_CONF v6 = Service(SERVICE_TYPE_IPV6, "2001:db8:77::100", "2001:db8:77::1ff", "64");
    Set(v6.domain, "lan.test");
    Set(v6.dns1, "2001:db8:77::1");
    Set(v6.dns2, "2001:db8:77::2");
    // Another subnet than br0's: dnsmasq keeps it but never answers from it here.
    DHCPD_CONF pxe = Service(SERVICE_TYPE_PXE, "10.77.0.100", "10.77.0.110", "255.255.255.0");
    Set(pxe.boot, "pxelinux.0");
    DHCPD_CONF wpad = Service(SERVICE_TYPE_WPAD, "", "", "");
    Set(wpad.router, "http://wpad/p.dat");
    return {v4, v6, pxe, wpad};
}

class DhcpServerSystemTest : public ::testing::Test {
  protected:
    void SetUp() override {
        VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
        // "ip netns" keeps its namespaces under /run: a private one leaves nothing on the host.
        ASSERT_EQ(mount("tmpfs", "/run", "tmpfs", 0, nullptr), 0);
        root_ = std::make_unique<SimRoot>(SimRoot::Kind::kLive);
        Ip("link add br0 index 11 address 02:00:00:00:77:01 type bridge");
        Ip("netns add client");
        Ip("link add v0 index 12 type veth peer name c0 netns client index 21");
        Ip("link set v0 master br0");
        Ip("addr add 192.168.77.1/24 dev br0");
        Ip("-6 addr add 2001:db8:77::1/64 dev br0 nodad");
        Ip("link set v0 up");
        Ip("link set br0 up");
        Ip("-n client link set c0 address " + std::string(kClientMac));
        Ip("-n client link set c0 up");
    }

    void TearDown() override {
        if (root_ == nullptr) {
            return;
        }
        if (dnsmasq_ > 0) {
            kill(dnsmasq_, SIGTERM);
            waitpid(dnsmasq_, nullptr, 0);
        }
        Shell("/usr/sbin/ip netns del client");
        root_.reset();
        EXPECT_EQ(umount2("/run", MNT_DETACH), 0);
    }

    void Ip(const std::string& arguments) const {
        int status = -1;
        const std::string output = Shell("/usr/sbin/ip " + arguments, &status);
        ASSERT_EQ(status, 0) << arguments << ": " << output;
    }

    // dnsmasq in the foreground on the written files, its log kept beside them.
    void StartDnsmasq(const std::vector<std::string>& confFiles) {
        std::string wrapper = "bind-interfaces\nno-resolv\ndhcp-authoritative\n";
        for (const std::string& file : confFiles) {
            wrapper += "conf-file=" + root_->Path(file) + "\n";
        }
        root_->WriteFile("/etc/dnsmasq.conf", wrapper);
        const std::string command =
            "exec /usr/sbin/dnsmasq -k --log-facility=- --log-dhcp --conf-file=" +
            root_->Path("/etc/dnsmasq.conf") + " --dhcp-leasefile=" + root_->Path(kLeaseFile) +
            " --pid-file=" + root_->Path("/etc/dnsmasq.pid") + " >" +
            root_->Path("/etc/dnsmasq.log") + " 2>&1";
        std::string words[] = {"/bin/sh", "-c", command};
        char* argv[] = {&words[0][0], &words[1][0], &words[2][0], nullptr};
        ASSERT_EQ(posix_spawn(&dnsmasq_, argv[0], nullptr, nullptr, argv, environ), 0);
    }

    // A lease through busybox udhcpc in the client namespace, with a script of our own that puts
    // the address on c0 and records what the server sent.
    void RequestLease() {
        const std::string script = root_->Path("/etc/udhcpc.script");
        root_->WriteFile("/etc/udhcpc.script",
                         "#!/bin/sh\n"
                         "[ \"$1\" = bound ] || exit 0\n"
                         "/usr/sbin/ip addr add \"$ip/$mask\" dev \"$interface\"\n"
                         "echo \"ip=$ip router=$router domain=$domain dns=$dns wpad=$wpad\" > " +
                             root_->Path("/etc/udhcpc.out") + "\n");
        ASSERT_EQ(chmod(script.c_str(), 0755), 0);
        int status = -1;
        const std::string output = Shell(
            "/usr/sbin/ip netns exec client /usr/bin/timeout 30 /usr/bin/busybox udhcpc -f -q -n "
            "-i c0 -x hostname:client-b -O wpad -s " +
                script,
            &status);
        ASSERT_EQ(status, 0) << output << root_->ReadFile("/etc/dnsmasq.log");
    }

    std::unique_ptr<SimRoot> root_;
    pid_t dnsmasq_ = -1;
};

TEST_F(DhcpServerSystemTest, DnsmasqServesTheWrittenFilesAndTheArpScannerNamesTheClient) {
    ASSERT_EQ(DhcpdConfig::saveConf(Services(), "br0", SERVICE_TYPE_ALL), 4);
    std::vector<std::string> files;
    for (SERVICE_TYPE type : DhcpdConfig::kServiceTypes) {
        QLIBSZHASH* info = QLIBCSzHashAlloc(2);
        QLIBCSzHashSetValue(info, "enable", "yes");
        EXPECT_EQ(DhcpdConfig::saveInfo(info, "br0", type), 0);
        QLIBCSzHashFree(info);
        std::string file;
        ASSERT_EQ(DhcpdConfig::getFileName(file, "br0", type, true), 0);
        files.push_back(file);

        int status = -1;
        const std::string output =
            Shell("/usr/sbin/dnsmasq --test --conf-file=" + root_->Path(file), &status);
        EXPECT_EQ(status, 0) << file << "\n" << root_->ReadFile(file);
        EXPECT_THAT(output, HasSubstr("syntax check OK")) << file;
    }
    ASSERT_EQ(DhcpdConfig::getSubnetCnt("br0", SERVICE_TYPE_ALL), 4);
    ASSERT_TRUE(DhcpdConfig::isEnabled("br0", SERVICE_TYPE_WPAD));

    StartDnsmasq(files);
    RequestLease();
    ASSERT_TRUE(WaitFor([&] {
        return root_->ReadFile(kLeaseFile).find(kClientMac) != std::string::npos;
    })) << root_->ReadFile("/etc/dnsmasq.log");

    std::istringstream lease(root_->ReadFile(kLeaseFile));
    std::string expiry, mac, ip, host;
    lease >> expiry >> mac >> ip >> host;
    EXPECT_EQ(mac, kClientMac);
    EXPECT_THAT(ip, ::testing::MatchesRegex("192\\.168\\.77\\.1([0-4][0-9]|50)"));
    EXPECT_EQ(host, "client-b");
    EXPECT_EQ(root_->ReadFile("/etc/udhcpc.out"),
              "ip=" + ip +
                  " router=192.168.77.1 domain=lan.test dns=192.168.77.1 192.168.77.2 "
                  "wpad=http://wpad/p.dat\n");

    // The scanner reads "/sbin/arp -a" through the root: the real one, on a router.
    ASSERT_EQ(unlink(root_->Path("/sbin/arp").c_str()), 0);
    ASSERT_EQ(symlink("/usr/sbin/arp", root_->Path("/sbin/arp").c_str()), 0);
    ASSERT_EQ(QLIBCFileSetKeyValue("/etc/vorninfo.conf", "net_topology", "router"), 0);
    // Traffic to the client puts it in br0's ARP table.
    Shell("/bin/bash -c 'echo x > /dev/udp/" + ip + "/9'");
    ASSERT_TRUE(
        WaitFor([&] { return Shell("/usr/sbin/arp -an").find(kClientMac) != std::string::npos; }));

    module::ArpScanner* scanner = module::ArpScanner::Inst();
    scanner->EraseList();
    ASSERT_EQ(scanner->GetArpTable(), 0);
    Json::Value client;
    ASSERT_TRUE(scanner->GetObject(kClientMac, client)) << scanner->GetClientList();
    EXPECT_EQ(client["friendlyName"], "client-b");
    EXPECT_EQ(client["ipAddr"], ip);
    EXPECT_EQ(client["netif"], "br0");
}

}  // namespace
}  // namespace dhcp
}  // namespace network
}  // namespace vornnetwork
