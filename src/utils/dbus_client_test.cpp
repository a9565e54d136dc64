#include "utils/dbus_client.h"

#include <gmock/gmock.h>

#include <cstdlib>
#include <optional>

#include "support/log_capture.h"

namespace vornwireless::utils {
namespace {

TEST(GatewayAnnouncementTest, FailuresOnADeadBusReturnFalseOrMinusOneWithTheirMessage) {
    const char* variable = "DBUS_SESSION_BUS_ADDRESS";
    const char* saved = std::getenv(variable);
    const std::optional<std::string> previous =
        saved ? std::optional<std::string>(saved) : std::nullopt;
    setenv(variable, "unix:path=/nonexistent/vorn-dead-bus", 1);
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
    previous ? setenv(variable, previous->c_str(), 1) : unsetenv(variable);
}

}  // namespace
}  // namespace vornwireless::utils
