// dnsmasq serving from the files DhcpdConfig writes, to a busybox udhcpc client in a peer
// namespace behind a bridge; then the ARP scanner names that client from the lease file.
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <sstream>

#include "network/dhcp/dhcpd_config.h"
#include "network/module/arpscanner.h"
#include "platform/qlibc_file.h"
#include "support/peer_namespace.h"
#include "support/waiting.h"

namespace vornnetwork {
namespace network {
namespace dhcp {
namespace {

using ::testing::HasSubstr;
using vorn::test::RunProgram;
using vorn::test::Shell;
using vorn::test::WaitFor;

constexpr const char* kClientMac = "02:00:00:00:77:02";
constexpr const char* kLeaseFile = "/etc/dhcpd/dhcpd.conf.leases";

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

class DhcpServerSystemTest : public vorn::test::PeerNamespaceTest {
  protected:
    void SetUpPeers() override {
        Ip("link add br0 index 11 address 02:00:00:00:77:01 type bridge");
        AddPeer("client", "v0", 12, "c0", 21);
        Ip("link set v0 master br0");
        Ip("addr add 192.168.77.1/24 dev br0");
        Ip("-6 addr add 2001:db8:77::1/64 dev br0");
        Ip("link set br0 up");
        Ip("-n client link set c0 address " + std::string(kClientMac));
    }

    // dnsmasq in the foreground on the written files.
    vorn::test::DaemonProcess& StartDnsmasq(const std::vector<std::string>& confFiles) {
        std::string wrapper = "bind-interfaces\nno-resolv\ndhcp-authoritative\n";
        for (const std::string& file : confFiles) {
            wrapper += "conf-file=" + root_->Path(file) + "\n";
        }
        root_->WriteFile("/etc/dnsmasq.conf", wrapper);
        return Start({"/usr/sbin/dnsmasq", "-k", "--log-facility=-", "--log-dhcp",
                      "--conf-file=" + root_->Path("/etc/dnsmasq.conf"),
                      "--dhcp-leasefile=" + root_->Path(kLeaseFile),
                      "--pid-file=" + root_->Path("/etc/dnsmasq.pid")});
    }

    // A lease through busybox udhcpc in the client namespace, with a script of our own that puts
    // the address on c0 and records what the server sent.
    std::string RequestLease() {
        const std::string script = root_->Path("/etc/udhcpc.script");
        root_->WriteFile("/etc/udhcpc.script",
                         "#!/bin/sh\n"
                         "[ \"$1\" = bound ] || exit 0\n"
                         "/usr/sbin/ip addr add \"$ip/$mask\" dev \"$interface\"\n"
                         "echo \"ip=$ip router=$router domain=$domain dns=$dns wpad=$wpad\" > " +
                             root_->Path("/etc/udhcpc.out") + "\n");
        chmod(script.c_str(), 0755);
        std::string output;
        EXPECT_EQ(RunProgram({"/sbin/ip", "netns", "exec", "client", "/usr/bin/busybox", "udhcpc",
                              "-f", "-q", "-n", "-i", "c0", "-x", "hostname:client-b", "-O", "wpad",
                              "-s", script},
                             std::chrono::seconds(30), &output, &output),
                  0)
            << output;
        return root_->ReadFile("/etc/udhcpc.out");
    }
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

        std::string output;
        EXPECT_EQ(RunProgram({"/usr/sbin/dnsmasq", "--test", "--conf-file=" + root_->Path(file)},
                             std::chrono::seconds(10), &output, &output),
                  0)
            << file << "\n"
            << root_->ReadFile(file);
        EXPECT_THAT(output, HasSubstr("syntax check OK")) << file;
    }
    ASSERT_EQ(DhcpdConfig::getSubnetCnt("br0", SERVICE_TYPE_ALL), 4);
    ASSERT_TRUE(DhcpdConfig::isEnabled("br0", SERVICE_TYPE_WPAD));

    const vorn::test::DaemonProcess& dnsmasq = StartDnsmasq(files);
    const std::string sent = RequestLease();
    ASSERT_TRUE(WaitFor([&] {
        return root_->ReadFile(kLeaseFile).find(kClientMac) != std::string::npos;
    })) << dnsmasq.Stderr();

    std::istringstream lease(root_->ReadFile(kLeaseFile));
    std::string expiry, mac, ip, host;
    lease >> expiry >> mac >> ip >> host;
    EXPECT_EQ(mac, kClientMac);
    EXPECT_THAT(ip, ::testing::MatchesRegex("192\\.168\\.77\\.1([0-4][0-9]|50)"));
    EXPECT_EQ(host, "client-b");
    EXPECT_EQ(sent, "ip=" + ip +
                        " router=192.168.77.1 domain=lan.test dns=192.168.77.1 192.168.77.2 "
                        "wpad=http://wpad/p.dat\n");

    // The scanner reads "/sbin/arp -a" through the root: the real one, on a router.
    ASSERT_EQ(unlink(root_->Path("/sbin/arp").c_str()), 0);
    ASSERT_EQ(symlink("/usr/sbin/arp", root_->Path("/sbin/arp").c_str()), 0);
    ASSERT_EQ(QLIBCFileSetKeyValue("/etc/vorninfo.conf", "net_topology", "router"), 0);
    // Traffic to the client puts it in br0's ARP table.
    Shell("/bin/bash -c 'echo x > /dev/udp/" + ip + "/9'");
    ASSERT_TRUE(WaitFor([&] {
        std::string table;
        RunProgram({"/usr/sbin/arp", "-an"}, std::chrono::seconds(10), &table);
        return table.find(kClientMac) != std::string::npos;
    }));

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
