#include "utils/ip_address.h"

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

#include "support/log_capture.h"

namespace vornwireless::utils {
namespace {

std::string Text(const IPAddress& address) {
    return address.ToString();
}

TEST(IPAddressTest, KeepsValidTextVerbatimAndRefusesTails) {
    EXPECT_EQ(Text(IPAddress("192.168.001.1")), "192.168.001.1");
    EXPECT_NE(IPAddress("192.168.1.1"), IPAddress("192.168.001.1"));
    EXPECT_EQ(Text(IPAddress("10.1")), "10.1");
    // inet_aton alone would accept these and keep the tail in the text.
    EXPECT_TRUE(IPAddress("1.2.3.4; reboot").IsEmpty());
    EXPECT_TRUE(IPAddress(std::string("1.2.3.4\0x", 9)).IsEmpty());
    std::istringstream words("10.0.0.1 bogus");
    IPAddress first;
    IPAddress second("1.1.1.1");
    words >> first >> second;
    EXPECT_STREQ(first.ToCString(), "10.0.0.1");
    EXPECT_TRUE(second.IsEmpty());

    // IPv6 and invalid texts leave the IPv4 field as it was.
    const IPAddress mask("255.255.255.0");
    IPAddress ip("192.168.1.77");
    ip = "fe80::1";
    EXPECT_EQ(Text(ip), "fe80::1");
    EXPECT_EQ(Text(GetNetwork(ip, mask)), "192.168.1.0");
    ip = "abc";
    EXPECT_TRUE(ip.IsEmpty());
    EXPECT_EQ(Text(GetNetwork(ip, mask)), "192.168.1.0");
}

TEST(IPAddressTest, NetworkArithmeticDoesNotDependOnHostByteOrder) {
    const IPAddress mask("255.255.255.0");
    EXPECT_EQ(Text(GetIpAddressBegin(IPAddress("192.168.1.0"), mask)), "192.168.1.1");
    EXPECT_EQ(Text(GetIpAddressEnd(IPAddress("192.168.1.0"), mask)), "192.168.1.254");
    // Carries cross octets in host order, not in memory order.
    EXPECT_EQ(Text(GetIpAddressBegin(IPAddress("10.0.0.255"), mask)), "10.0.1.0");
    EXPECT_EQ(Text(GetIpAddressEnd(IPAddress("10.0.0.0"), IPAddress("255.255.240.0"))),
              "10.0.15.254");
    const IPAddress next = GetNextNetwork(IPAddress("192.168.1.77"), mask);
    EXPECT_EQ(Text(next), "192.168.2.0");
    EXPECT_EQ(GetNetwork(next, mask), next);  // the binary form is set as well
    EXPECT_EQ(Text(GetNextNetwork(IPAddress("10.255.255.1"), IPAddress("255.0.0.0"))), "11.0.0.0");
    EXPECT_EQ(Text(GetNextNetwork(IPAddress("255.255.255.255"), mask)), "0.0.0.0");
    EXPECT_TRUE(GetNextNetwork(IPAddress("10.1"), mask).IsEmpty());
    EXPECT_TRUE(GetNextNetwork(IPAddress("fe80::1"), mask).IsEmpty());

    const std::string v6 = "2001:db8:1:2:3:4:5:6";
    EXPECT_EQ(IPAddress::GetIPv6NetworkPart(v6, 60), "2001:db8:1::");
    EXPECT_EQ(IPAddress::GetIPv6NetworkPart(v6, 0), "::");
    EXPECT_EQ(IPAddress::GetIPv6NetworkPart(v6, 500), v6);
    vorn::test::LogCapture log;
    EXPECT_THROW(IPAddress::GetIPv6NetworkPart("10.0.0.1", 64), std::logic_error);
    EXPECT_TRUE(log.Contains("ip_address.cpp:"));
    EXPECT_TRUE(log.Contains(" Unable to convert 10.0.0.1 to binary form"));
}

TEST(IPAddressTest, ListsTheAddressesOfAnInterface) {
    EXPECT_EQ(IPAddress::GetIPv4Address("lo"), IPAddress::InterfaceAddresses({{"127.0.0.1", 8}}));
    EXPECT_EQ(IPAddress::GetIPv4Network("lo"), IPAddress::InterfaceAddresses({{"127.0.0.0", 8}}));
    EXPECT_TRUE(IPAddress::GetIPv4Address("no-such-if0").empty());
    // Whether lo has IPv6 depends on the host; the two listings must agree either way.
    const auto addresses = IPAddress::GetIPv6Address("lo");
    const auto networks = IPAddress::GetIPv6Network("lo");
    ASSERT_EQ(addresses.size(), networks.size());
    for (size_t i = 0; i < addresses.size(); ++i) {
        EXPECT_EQ(networks[i].first,
                  IPAddress::GetIPv6NetworkPart(addresses[i].first, addresses[i].second));
    }
}

}  // namespace
}  // namespace vornwireless::utils
