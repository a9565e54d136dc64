#include "network/dhcp/dhcpd_config.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "platform/qlibc_error.h"
#include "support/sim_root.h"

namespace vornnetwork::network::dhcp {
namespace {

using ::testing::ElementsAre;
using HashPtr = std::unique_ptr<QLIBSZHASH, decltype(&QLIBCSzHashFree)>;

template <size_t N>
void Set(char (&field)[N], const char* value) {
    std::snprintf(field, N, "%s", value);
}

DHCPD_CONF Service(SERVICE_TYPE type, const char* ifname) {
    DHCPD_CONF conf{};
    conf.type = type;
    conf.lease = 86400;
    Set(conf.ifname, ifname);
    return conf;
}

DHCPD_CONF Subnet4(const char* ifname, const char* start) {
    DHCPD_CONF conf = Service(SERVICE_TYPE_IPV4, ifname);
    Set(conf.start, start);
    Set(conf.end, "192.168.1.200");
    Set(conf.netmask, "255.255.255.0");
    return conf;
}

HashPtr Info(const char* enable) {
    HashPtr hash(QLIBCSzHashAlloc(4), QLIBCSzHashFree);
    if (enable != nullptr) {
        QLIBCSzHashSetValue(hash.get(), "enable", enable);
    }
    return hash;
}

class DhcpdConfigTest : public vorn::test::RootTest {
  protected:
    std::string Read(const std::string& name) const { return root_.ReadFile("/etc/dhcpd/" + name); }
    std::vector<std::string> Files() const {
        std::vector<std::string> names;
        for (const auto& entry : std::filesystem::directory_iterator(root_.Path("/etc/dhcpd"))) {
            names.push_back(entry.path().filename());
        }
        std::sort(names.begin(), names.end());
        return names;
    }
};

TEST_F(DhcpdConfigTest, FileNamesCutTheInterfaceAndRefuseBadTypesAndIndices) {
    std::string name;
    ASSERT_EQ(DhcpdConfig::getFileName(name, "eth0", SERVICE_TYPE_IPV4, true, 0), 0);
    EXPECT_EQ(name, "/etc/dhcpd/dhcpd-eth0-eth00.conf");
    ASSERT_EQ(DhcpdConfig::getFileName(name, "eth0.5", SERVICE_TYPE_IPV6, false, 0), 0);
    EXPECT_EQ(name, "/etc/dhcpd/dhcpd-eth0-eth0v60.info");
    ASSERT_EQ(DhcpdConfig::getFileName(name, "br0;rm", SERVICE_TYPE_PXE, true, 7), 0);
    EXPECT_EQ(name, "/etc/dhcpd/dhcpd-br0-pxe.conf");
    EXPECT_EQ(DhcpdConfig::getFileName(name, "eth0", static_cast<SERVICE_TYPE>(3), true), -1);
    QLIBCErrSet(QLIBC_ERR_NONE);
    EXPECT_EQ(DhcpdConfig::getFileName(name, "eth0", SERVICE_TYPE_IPV4, true, -1), -1);
    EXPECT_EQ(QLIBCErrGet(), 3328);
    EXPECT_EQ(DhcpdConfig::getFileName(name, "../etc", SERVICE_TYPE_IPV4, true), -1);
    EXPECT_EQ(DhcpdConfig::getSubnetCnt("eth0", 32), -1);
    EXPECT_TRUE(log_.Contains("dhcpd_config.cpp:"));
}

TEST_F(DhcpdConfigTest, FilesHoldDnsmasqLinesByteForByte) {
    DHCPD_CONF v4 = Subnet4("eth0.5", "192.168.1.100");
    Set(v4.router, "192.168.1.1");
    Set(v4.domain, "lan.example");
    Set(v4.dns1, "192.168.1.1");
    DHCPD_CONF v6 = Service(SERVICE_TYPE_IPV6, "eth0");
    Set(v6.start, "2001:db8::100");
    Set(v6.end, "2001:db8::1ff");
    Set(v6.netmask, "64");
    Set(v6.dns1, "2001:db8::1");
    Set(v6.dns2, "2001:db8::2");
    DHCPD_CONF pxe = Subnet4("eth0", "192.168.1.210");
    pxe.type = SERVICE_TYPE_PXE;
    Set(pxe.boot, "pxelinux.0");
    ASSERT_EQ(DhcpdConfig::saveConf({v4, v6, pxe}, "eth0", SERVICE_TYPE_ALL), 3);

    EXPECT_EQ(Read("dhcpd-eth0-eth00.conf"),
              "interface=eth0.5\n"
              "dhcp-range=set:eth00,192.168.1.100,192.168.1.200,255.255.255.0,86400\n"
              "dhcp-option=tag:eth00,option:router,192.168.1.1\n"
              "dhcp-option=tag:eth00,option:domain-search,lan.example\n"
              "dhcp-option=tag:eth00,option:domain-name,lan.example\n"
              "dhcp-option=tag:eth00,option:dns-server,192.168.1.1\n");
    EXPECT_EQ(Read("dhcpd-eth0-eth0v60.conf"),
              "interface=eth0\n"
              "dhcp-range=set:eth0v60,2001:db8::100,2001:db8::1ff,64,86400\n"
              "dhcp-option=tag:eth0v60,option6:dns-server,2001:db8::1,2001:db8::2\n");
    EXPECT_EQ(Read("dhcpd-eth0-pxe.conf"),
              "interface=eth0\n"
              "dhcp-range=set:eth0pxe,192.168.1.210,192.168.1.200,255.255.255.0,86400\n"
              "dhcp-boot=tag:eth0pxe,pxelinux.0\n"
              "dhcp-vendorclass=set:pxe,PXEClient\n");
}

TEST_F(DhcpdConfigTest, SavedServicesLoadBackAndFewerServicesDropTheRest) {
    DHCPD_CONF v4 = Subnet4("eth0.5", "192.168.1.100");
    Set(v4.domain, "lan.example");
    Set(v4.dns1, "192.168.1.1");
    Set(v4.dns2, "192.168.1.2");
    DHCPD_CONF wpad = Service(SERVICE_TYPE_WPAD, "eth0");
    Set(wpad.router, "http://wpad/p.dat");
    wpad.lease = 0;
    const std::vector<DHCPD_CONF> saved = {wpad, v4, Subnet4("eth0", "192.168.1.101"),
                                           Subnet4("eth0", "192.168.1.102"),
                                           Subnet4("eth1", "192.168.2.100")};
    ASSERT_EQ(DhcpdConfig::saveConf(saved, "eth0", SERVICE_TYPE_IPV4 | SERVICE_TYPE_WPAD), 4);
    HashPtr info = Info("yes");
    QLIBCSzHashSetValue(info.get(), "url", "http://wpad/p.dat");
    for (int index = 0; index < 3; ++index) {
        ASSERT_EQ(DhcpdConfig::saveInfo(info.get(), "eth0", SERVICE_TYPE_IPV4, index), 0);
    }
    ASSERT_EQ(DhcpdConfig::saveInfo(info.get(), "eth0", SERVICE_TYPE_WPAD), 0);
    EXPECT_EQ(Read("wpad-eth0.info"), "enable=\"yes\"\nurl=\"http://wpad/p.dat\"\n");

    std::vector<DHCPD_CONF> loaded;
    ASSERT_EQ(DhcpdConfig::loadConf(loaded, "eth0", SERVICE_TYPE_ALL), 4);
    ASSERT_EQ(loaded.size(), 4u);
    for (size_t i = 0; i < 3; ++i) {
        DHCPD_CONF expected = saved[i + 1];
        expected.index = static_cast<uint32_t>(i);
        EXPECT_EQ(std::memcmp(&loaded[i], &expected, sizeof(expected)), 0) << i;
    }
    EXPECT_EQ(std::memcmp(&loaded[3], &wpad, sizeof(wpad)), 0);

    HashPtr read = Info(nullptr);
    ASSERT_EQ(DhcpdConfig::loadInfo(read.get(), "eth0", SERVICE_TYPE_WPAD), 2);

    // A count stops at the first service without both files.
    ASSERT_EQ(DhcpdConfig::saveConf({v4}, "eth0", SERVICE_TYPE_ALL), 1);
    EXPECT_EQ(DhcpdConfig::getSubnetCnt("eth0", SERVICE_TYPE_ALL), 1);
    EXPECT_THAT(Files(),
                ElementsAre("dhcpd-eth0-eth00.conf", "dhcpd-eth0-eth00.info",
                            "dhcpd-eth0-eth01.info", "dhcpd-eth0-eth02.info", "wpad-eth0.info"));
}

TEST_F(DhcpdConfigTest, FailedSavesLeaveThePreviousFiles) {
    ASSERT_EQ(DhcpdConfig::saveConf({Subnet4("eth0", "192.168.1.100")}, "eth0", SERVICE_TYPE_IPV4),
              1);
    HashPtr info = Info("yes");
    ASSERT_EQ(DhcpdConfig::saveInfo(info.get(), "eth0", SERVICE_TYPE_IPV4), 0);
    const std::string conf = Read("dhcpd-eth0-eth00.conf");

    DHCPD_CONF injected = Subnet4("eth0", "192.168.1.100");
    Set(injected.domain, "lan\ndhcp-script=/tmp/x");
    QLIBCErrSet(QLIBC_ERR_NONE);
    EXPECT_EQ(DhcpdConfig::saveConf({Subnet4("eth0", "192.168.1.9"), injected}, "eth0",
                                    SERVICE_TYPE_IPV4),
              -1);
    EXPECT_EQ(QLIBCErrGet(), 3328);

    HashPtr noEnable = Info(nullptr);
    EXPECT_EQ(DhcpdConfig::saveInfo(noEnable.get(), "eth0", SERVICE_TYPE_IPV4), -1);

    // A directory in the way of the final name: the rename fails and its temporary file goes.
    root_.WriteFile("/etc/dhcpd/dhcpd-eth0-eth0v60.conf/keep", "");
    QLIBCErrSet(QLIBC_ERR_NONE);
    EXPECT_EQ(
        DhcpdConfig::saveConf({Service(SERVICE_TYPE_IPV6, "eth0")}, "eth0", SERVICE_TYPE_IPV6), -1);
    EXPECT_EQ(QLIBCErrGet(), 2304);

    EXPECT_EQ(Read("dhcpd-eth0-eth00.conf"), conf);
    EXPECT_THAT(Files(), ElementsAre("dhcpd-eth0-eth00.conf", "dhcpd-eth0-eth00.info",
                                     "dhcpd-eth0-eth0v60.conf"));
}

TEST_F(DhcpdConfigTest, MalformedConfFilesAreRefused) {
    DHCPD_CONF conf{};
    const std::string path = "/etc/dhcpd/dhcpd-eth0-eth00.conf";
    root_.WriteFile(path, "# kept\nlog-dhcp\ndhcp-option=tag:a,option:ntp-server,1.2.3.4\n");
    EXPECT_EQ(DhcpdConfig::loadConfFile(conf, path), 0);
    for (const std::string& text : std::vector<std::string>{
             "dhcp-range=set:a,1.1.1.1,1.1.1.2,255.0.0.0\n", "dhcp-range=set:a,1,2,3,-5\n",
             "dhcp-range=set:a,1,2,3,99999999999\n", "interface=averyveryverylongname\n",
             "dhcp-boot=tag:a\n", "dhcp-option=tag:a,option:router,1.1.1.1,2.2.2.2\n",
             std::string("interface=eth0\0x\n", 17)}) {
        root_.WriteFile(path, text);
        QLIBCErrSet(QLIBC_ERR_NONE);
        EXPECT_EQ(DhcpdConfig::loadConfFile(conf, path), -1) << text;
        EXPECT_NE(QLIBCErrGet(), QLIBC_ERR_NONE) << text;
    }
    EXPECT_THAT(log_.Matching("Malformed line in " + path), ::testing::SizeIs(6));
}

}  // namespace
}  // namespace vornnetwork::network::dhcp
