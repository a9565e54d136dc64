#include <gmock/gmock.h>

#include "platform/shell_command.h"
#include "support/net_namespace.h"
#include "support/sim_root.h"

namespace vorn {
namespace test {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;

TEST(LiveRootTest, RealIpThroughTheRootMakesLinksSeenThroughTheRoot) {
    VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
    SimRoot root(SimRoot::Kind::kLive);
    ASSERT_FALSE(root.Exists("/sys/class/net/v0"));

    std::string line;
    ASSERT_EQ(platform::ReadShellCommandLine(
                  "/sbin/ip link add v0 type veth peer name v1 && echo added", line),
              0);
    EXPECT_EQ(line, "added\n");

    EXPECT_TRUE(root.Exists("/sys/class/net/v0"));
    EXPECT_TRUE(root.Exists("/sys/class/net/v1"));
    const std::string devices = root.ReadFile("/proc/net/dev");
    EXPECT_THAT(devices, HasSubstr("v0:"));
    EXPECT_THAT(devices, HasSubstr("v1:"));
    EXPECT_THAT(root.Calls(), Contains("/sbin/ip link add v0 type veth peer name v1"));
}

}  // namespace
}  // namespace test
}  // namespace vorn
