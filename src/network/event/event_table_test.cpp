#include "network/event/event_table.h"

#include <gtest/gtest.h>

#include "network/event/hello_event.h"
#include "network/module/test_module.h"
#include "support/log_capture.h"

namespace vornnetwork::network::module {
namespace {

using event::EVENT_HELLO;
using event::EVENT_RESERVED_2;

const EventHandler::Handler kHello = static_cast<EventHandler::Handler>(&TestModule::OnHelloEvent);

TEST(EventTableTest, OneHandlerPerModuleAndEventInRegistrationOrder) {
    vorn::test::LogCapture log;
    EventTable table;
    EXPECT_EQ(table.Add(static_cast<event::EVENT_TYPE>(3), EventHandler(MODULE_ROUTE, kHello)), -1);
    EXPECT_TRUE(log.Contains("event [3] is invalid"));
    EXPECT_EQ(table.Add(EVENT_HELLO, EventHandler(static_cast<MODULE_TYPE>(6), kHello)), -1);
    EXPECT_EQ(table.Add(EVENT_HELLO, EventHandler(MODULE_ROUTE, nullptr)), -1);
    EXPECT_EQ(log.Matching("invalid handler").size(), 2u);

    ASSERT_EQ(table.Add(EVENT_HELLO, EventHandler(MODULE_TEST, kHello)), 0);
    ASSERT_EQ(table.Add(EVENT_RESERVED_2, EventHandler(MODULE_NETLINK, kHello)), 0);
    ASSERT_EQ(table.Add(EVENT_RESERVED_2, EventHandler(MODULE_DEVICE_LIST, kHello)), 0);
    EXPECT_EQ(table.Add(EVENT_RESERVED_2, EventHandler(MODULE_NETLINK, kHello)), -1);
    EXPECT_TRUE(log.Contains("The module [5] has been registered."));
    EXPECT_EQ(table.ToStr(), "event[1]/ modules[1, ]event[2]/ modules[5, 4, ]");

    // Removing the last handler drops the entry; the walk survives erasing under it.
    EXPECT_EQ(table.Remove(EVENT_HELLO, MODULE_ROUTE), 0);
    EXPECT_TRUE(table.RemoveModule(MODULE_TEST));
    EXPECT_FALSE(table.IsEventExist(EVENT_HELLO));
    EXPECT_EQ(table.Remove(EVENT_RESERVED_2, MODULE_NETLINK), 0);
    ASSERT_EQ(table.ListHandlers(EVENT_RESERVED_2).size(), 1u);
    EXPECT_TRUE(table.ListHandlers(EVENT_RESERVED_2)[0] ==
                EventHandler(MODULE_DEVICE_LIST, kHello));

    event::HelloEvent empty("");
    EXPECT_EQ(empty.Process(), -1);
    EXPECT_TRUE(log.Contains("The event [event:[1]/ msg:[]\n] is not valid."));
}

}  // namespace
}  // namespace vornnetwork::network::module
