#include "utils/dbus_client.h"

#include <gmock/gmock.h>

#include <cstdlib>
#include <string>

#include "support/log_capture.h"

namespace vornwireless {
namespace utils {
namespace {

using ::testing::Contains;
using ::testing::MatchesRegex;

// No daemon behind a dead bus address: every announcement fails with its own line.
class GatewayAnnouncementTest : public ::testing::Test {
  protected:
    GatewayAnnouncementTest() {
        const char* saved = std::getenv(kVariable);
        hadAddress_ = saved != nullptr;
        savedAddress_ = hadAddress_ ? saved : "";
        setenv(kVariable, "unix:path=/nonexistent/vorn-dead-bus", 1);
    }
    ~GatewayAnnouncementTest() override {
        if (hadAddress_) {
            setenv(kVariable, savedAddress_.c_str(), 1);
        } else {
            unsetenv(kVariable);
        }
    }
    void ExpectLine(const std::string& message) {
        EXPECT_THAT(log_.Lines(), Contains(MatchesRegex("dbus_client\\.cpp:[0-9]+ " + message)));
    }

    static constexpr const char* kVariable = "DBUS_SESSION_BUS_ADDRESS";
    vorn::test::LogCapture log_;
    std::string savedAddress_;
    bool hadAddress_ = false;
};

TEST_F(GatewayAnnouncementTest, FailuresReturnFalseOrMinusOneWithTheirMessage) {
    EXPECT_FALSE(SetGatewayInfo("eth0", "GTYPE_V4", "10.0.0.1", "10.0.0.1", "ethernet", 0, true));
    ExpectLine("Failed to AddGatewayData on \\[eth0\\]");
    EXPECT_FALSE(DelGatewayInfo("wlan0", "GTYPE_V4", false));
    ExpectLine("Failed to DelGatewayData on \\[wlan0\\]");
    EXPECT_EQ(GetGatewayPriority("br0", "GTYPE_V6"), -1);
    ExpectLine("Failed to GetGatewayDataByInterface \\[br0\\]");
    EXPECT_FALSE(RefreshGateway("GTYPE_V6"));
    ExpectLine("Failed to refresh gateway of type \\[GTYPE_V6\\]");
}

}  // namespace
}  // namespace utils
}  // namespace vornwireless
