#include "dbus/dbus_client.h"

#include <gmock/gmock.h>

#include <climits>
#include <cstdlib>

#include "support/log_capture.h"
#include "support/waiting.h"

namespace vornwireless::dbus {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;

TEST(DBusClientTest, ErrorNumberIsTheFirstRunOfDigitsOrOne) {
    EXPECT_EQ(DBusClient::ErrorNumber("Failed to refresh adapter list (12)"), 12);
    EXPECT_EQ(DBusClient::ErrorNumber("Adapter is not found(wlan0)"), 0);
    EXPECT_EQ(DBusClient::ErrorNumber(nullptr), 1);
    EXPECT_EQ(DBusClient::ErrorNumber("x99999999999999999999999y"), INT_MAX);
}

// Every client here talks to a bus that is not there. GIO shares one session connection per
// process while anyone holds it, so this holds only while no other test keeps a client alive.
class DeadBusTest : public ::testing::Test {
  protected:
    DeadBusTest() { setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nonexistent/vorn-test/bus", 1); }

    vorn::test::SavedVariable address_{"DBUS_SESSION_BUS_ADDRESS"};
    vorn::test::LogCapture log_;
};

TEST_F(DeadBusTest, UnreachableBusFailsEveryCallAndMisuseIsRefused) {
    DBusClient client("com.tessarin.net", "/", "com.tessarin.net", DBUS_BUS_SESSION);
    EXPECT_THAT(log_.Lines(), ElementsAre(HasSubstr("Failed to get bus connection")));
    log_.Clear();
    EXPECT_EQ(client.NewMessage(nullptr), -1);
    EXPECT_THAT(log_.Lines(), ElementsAre(HasSubstr("Method name is null")));

    EXPECT_EQ(client.Append("text"), -1);
    EXPECT_EQ(client.Append(true), -1);
    EXPECT_THAT(log_.Matching("Message is null"), ::testing::SizeIs(2));

    EXPECT_EQ(client.NewMessage("GetGatewayListData"), -1);
    EXPECT_EQ(client.SendMessage(true, 1000), -1);
    std::string text = "untouched";
    std::vector<std::string> names{"untouched"};
    EXPECT_EQ(client.GetReply(text), -1);
    EXPECT_EQ(client.GetReply(names), -1);
    EXPECT_EQ(text, "untouched");
    EXPECT_THAT(names, ElementsAre("untouched"));
    EXPECT_FALSE(client.IsServerReady());
}

}  // namespace
}  // namespace vornwireless::dbus
