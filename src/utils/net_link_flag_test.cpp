#include "utils/net_link_flag.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>

#include "support/sim_root.h"

namespace vornwireless::utils {
namespace {

using NetLinkFlagTest = vorn::test::RootTest;

const char* const kFlag = "/tmp/.net_link_is_processing";

TEST_F(NetLinkFlagTest, FlagHoldsOnlyWhileItsProcessLives) {
    EXPECT_FALSE(IsNetLinkProcessing());
    SetNetLinkIsProcessing();
    EXPECT_EQ(root_.ReadFile(kFlag), std::to_string(getpid()) + "\n");
    EXPECT_TRUE(IsNetLinkProcessing());

    const pid_t ended = fork();
    if (ended == 0) {
        _exit(0);
    }
    ASSERT_EQ(waitpid(ended, nullptr, 0), ended);
    root_.WriteFile(kFlag, std::to_string(ended) + "\n");
    EXPECT_FALSE(IsNetLinkProcessing());
    root_.WriteFile(kFlag, "\n");
    EXPECT_FALSE(IsNetLinkProcessing());

    UnsetNetLinkIsProcessing();
    EXPECT_FALSE(root_.Exists(kFlag));
    EXPECT_TRUE(log_.Lines().empty());
    UnsetNetLinkIsProcessing();
    EXPECT_TRUE(log_.Contains(" Failed to unlike pid file: /tmp/.net_link_is_processing"));

    std::filesystem::remove_all(root_.Path("/tmp"));
    SetNetLinkIsProcessing();
    EXPECT_TRUE(log_.Contains(" Failed to write pid file: /tmp/.net_link_is_processing"));
}

}  // namespace
}  // namespace vornwireless::utils
