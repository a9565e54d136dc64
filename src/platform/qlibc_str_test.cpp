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

}  // namespace
