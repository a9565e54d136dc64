#include "utils/dbus_client.h"

#include <gmock/gmock.h>

#include "support/log_capture.h"
#include "support/waiting.h"

namespace vornwireless::utils {
namespace {

TEST(GatewayAnnouncementTest, FailuresOnADeadBusReturnFalseOrMinusOneWithTheirMessage) {
    const vorn::test::SavedVariable saved("DBUS_SESSION_BUS_ADDRESS");
    setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nonexistent/vorn-dead-bus", 1);
    vorn::test::LogCapture log;
    EXPECT_FALSE(SetGatewayInfo("eth0", "GTYPE_V4", "10.0.0.1", "10.0.0.1", "ethernet", 0, true));
    EXPECT_FALSE(DelGatewayInfo("wlan0", "GTYPE_V4", false));
    EXPECT_EQ(GetGatewayPriority("br0", "GTYPE_V6"), -1);
    EXPECT_FALSE(RefreshGateway("GTYPE_V6"));
    for (const std::string message :
         {"Failed to AddGatewayData on \\[eth0\\]", "Failed to DelGatewayData on \\[wlan0\\]",
          "Failed to GetGatewayDataByInterface \\[br0\\]",
          "Failed to refresh gateway of type \\[GTYPE_V6\\]"}) {
        EXPECT_THAT(
            log.Lines(),
            ::testing::Contains(::testing::MatchesRegex("dbus_client\\.cpp:[0-9]+ " + message)));
    }
}

}  // namespace
}  // namespace vornwireless::utils
