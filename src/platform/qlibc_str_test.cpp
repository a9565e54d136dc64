#include "platform/qlibc_str.h"

#include <gtest/gtest.h>

#include <string>

namespace {

TEST(QlibcStrTest, SplitsDottedAddresses) {
    unsigned int parts[4] = {};
    EXPECT_EQ(cQLIBISepIP("192.168.001.77", parts, 4), 4);
    EXPECT_EQ(parts[0], 192u);
    EXPECT_EQ(parts[2], 1u);
    EXPECT_EQ(parts[3], 77u);
    EXPECT_EQ(cQLIBISepIP("10.1", parts, 4), 2);
    EXPECT_EQ(cQLIBISepIP("1.2.3.4.5", parts, 4), 5);
    for (const char* bad :
         {"", "1..2.3", "1.2.3.", "256.1.1.1", "1.2.3.4x", "a.b.c.d", "1.2.3.0004"}) {
        EXPECT_EQ(cQLIBISepIP(bad, parts, 4), -1) << bad;
    }
    EXPECT_EQ(cQLIBISepIP(nullptr, parts, 4), -1);
}

TEST(QlibcStrTest, TrimsAndSeparates) {
    char text[] = " \t a b \n";
    EXPECT_STREQ(QLIBCStrTrimSpace(text), "a b");
    char blank[] = "   ";
    EXPECT_STREQ(QLIBCStrTrimSpace(blank), "");

    char list[] = "a,,b;c";
    char* cursor = list;
    std::string seen;
    for (char* token = QLIBCStrSep(&cursor, ",;"); token != nullptr;
         token = QLIBCStrSep(&cursor, ",;")) {
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
    char exact[11] = {};
    EXPECT_EQ(ErrQLIBIpMaskToSubnet("10.0.0.1/255.0.0.0", exact, sizeof(exact) - 1), -1);
    ASSERT_EQ(ErrQLIBIpMaskToSubnet("10.0.0.1/255.0.0.0", exact, sizeof(exact)), 0);
    EXPECT_STREQ(exact, "10.0.0.0/8");
}

}  // namespace
