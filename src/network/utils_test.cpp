#include "network/utils.h"

#include <gmock/gmock.h>

#include "support/sim_root.h"

namespace vornnetwork {
namespace network {
namespace {

using ::testing::ElementsAre;

using IsEthernetLinkDetectedTest = vorn::test::RootTest;

TEST_F(IsEthernetLinkDetectedTest, OnlyAClearNoMeansUnplugged) {
    root_.Scenario("ethtool",
                   "when eth0\nprint Settings for eth0:\nprint \tLink detected: yes\n"
                   "when eth1\nprint Settings for eth1:\nprint \tLink detected: no\n");
    EXPECT_TRUE(IsEthernetLinkDetected("eth0"));
    EXPECT_FALSE(IsEthernetLinkDetected("eth1"));
    EXPECT_TRUE(IsEthernetLinkDetected("eth9"));  // no such interface: no output

    EXPECT_FALSE(IsEthernetLinkDetected("eth0;touch /tmp/x"));
    EXPECT_TRUE(log_.Contains("utils.cpp:"));
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/usr/vorn/bin/ethtool eth0", "/usr/vorn/bin/ethtool eth1",
                            "/usr/vorn/bin/ethtool eth9"));
}

}  // namespace
}  // namespace network
}  // namespace vornnetwork
