#include "platform/qlibc_str.h"

#include <gtest/gtest.h>

#include <string>

namespace {

TEST(QlibcStrTest, SplitsDottedAddressesTrimsAndSeparates) {
    unsigned int parts[4] = {};
    EXPECT_EQ(cQLIBISepIP("192.168.001.77", parts, 4), 4);
    EXPECT_EQ(
        std::to_string(parts[0]) + "." + std::to_string(parts[2]) + "." + std::to_string(parts[3]),
        "192.1.77");
    EXPECT_EQ(cQLIBISepIP("10.1", parts, 4), 2);
    EXPECT_EQ(cQLIBISepIP("1.2.3.4.5", parts, 4), 5);
    for (const char* bad :
         {"", "1..2.3", "256.1.1.1", "1.2.3.4x", "1.2.3.0004", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(cQLIBISepIP(bad, parts, 4), -1) << bad;
    }

    char text[] = " \t a b \n";
    EXPECT_STREQ(QLIBCStrTrimSpace(text), "a b");
    char blank[] = "   ";
    EXPECT_STREQ(QLIBCStrTrimSpace(blank), "");
    char list[] = "a,,b;c";
    char* cursor = list;
    std::string seen;
    while (char* token = QLIBCStrSep(&cursor, ",;")) {
        seen += std::string("[") + token + "]";
    }
    EXPECT_EQ(seen, "[a][][b][c]");
    EXPECT_EQ(cursor, nullptr);
}

TEST(QlibcStrTest, IpMaskBecomesNetworkAndPrefixLength) {
    char out[19] = {};
    ASSERT_EQ(ErrQLIBIpMaskToSubnet("172.16.200.9/255.255.240.0", out, sizeof(out)), 0);
    EXPECT_STREQ(out, "172.16.192.0/20");
    ASSERT_EQ(ErrQLIBIpMaskToSubnet("255.255.255.255/255.255.255.254", out, sizeof(out)), 0);
    EXPECT_STREQ(out, "255.255.255.254/31");
    for (const char* bad : {"10.0.0.1/255.255.0.255", "10.0.0.1/0.0.0.255", "10.0.0.1", "10.0.0.1/",
                            "10.0.0.1/24", "10.0.1/255.0.0.0", "/255.0.0.0"}) {
        EXPECT_EQ(ErrQLIBIpMaskToSubnet(bad, out, sizeof(out)), -1) << bad;
    }
    // "10.0.0.0/8" and its NUL fit exactly in 11 bytes, not in 10.
    EXPECT_EQ(ErrQLIBIpMaskToSubnet("10.0.0.1/255.0.0.0", out, 10), -1);
    ASSERT_EQ(ErrQLIBIpMaskToSubnet("10.0.0.1/255.0.0.0", out, 11), 0);
    EXPECT_STREQ(out, "10.0.0.0/8");
}

}  // namespace
