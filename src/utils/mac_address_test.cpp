#include "utils/mac_address.h"

#include <gtest/gtest.h>

#include <sstream>

#include "support/log_capture.h"

namespace vornwireless::utils {
namespace {

TEST(MacAddressTest, FormalizesBareHexKeepsCaseLogsWhatItCannotFormalizeAndWrapsAdding) {
    vorn::test::LogCapture log;
    EXPECT_EQ(MacAddress("001122AABBCC").ToString(), "00:11:22:AA:BB:CC");
    EXPECT_EQ(MacAddress("00:11:22:aa:bb:cc").ToString(), "00:11:22:aa:bb:cc");
    EXPECT_FALSE(MacAddress("AA:BB:CC:DD:EE:FF") == MacAddress("aa:bb:cc:dd:ee:ff"));
    EXPECT_TRUE(log.Lines().empty());

    const MacAddress dashed("00-11-22-33-44-55");
    EXPECT_EQ(dashed.ToString(), "00-11-22-33-44-55");
    EXPECT_FALSE(dashed.IsFormalized());
    EXPECT_EQ(log.Matching("mac_address.cpp:").size(), 1u);
    EXPECT_TRUE(log.Contains(" Bad mac addr length (17)"));

    MacAddress notHex;
    std::istringstream("00112233445G") >> notHex;
    EXPECT_EQ(notHex.ToString(), "00112233445G");
    EXPECT_TRUE(log.Contains(" Bad mac addr [00112233445G]"));
    EXPECT_EQ(notHex.Formalize(), -1);

    // Adding wraps the last octet modulo 255, without carry.
    EXPECT_EQ((MacAddress("00:11:22:33:44:fe") + 1).ToString(), "00:11:22:33:44:00");
    EXPECT_EQ((MacAddress("AA:BB:CC:DD:EE:09") + 1).ToString(), "aa:bb:cc:dd:ee:0a");
    EXPECT_EQ((MacAddress("00:11:22:33:44:00") + -1).ToString(), "00:11:22:33:44:fe");
}

}  // namespace
}  // namespace vornwireless::utils
