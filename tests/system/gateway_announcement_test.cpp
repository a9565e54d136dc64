// The wireless half's gateway announcements, as the route module receives them through the real
// service on a private bus.
#include <gtest/gtest.h>

#include <mutex>
#include <thread>
#include <vector>

#include "dbus/net_server.h"
#include "network/module/module_manager.h"
#include "support/private_bus.h"
#include "support/sim_root.h"
#include "utils/dbus_client.h"

namespace {

using vornnetwork::network::module::BaseModule;
using vornnetwork::network::module::MODULE_ROUTE;
using vornnetwork::network::module::ModuleManager;

// Stands in for the route module: keeps every request, answers a priority when it has one.
class RecordingRouteModule : public BaseModule {
  public:
    RecordingRouteModule() : BaseModule(MODULE_ROUTE) {}
    int InitialModule() override { return 0; }
    int StartModule() override { return 0; }
    int TerminateModule() override { return 0; }
    int ProcessRequest(const Json::Value& request, Json::Value& answer) override {
        std::lock_guard<std::mutex> lock(mutex);
        requests.push_back(request);
        answer = Json::Value(Json::objectValue);
        if (request["ifname"].asString() == "eth0") {
            answer["priority"] = 4;
        }
        return 0;
    }

    static BaseModule* Create() { return instance = new RecordingRouteModule(); }
    Json::Value Request(size_t index) {
        std::lock_guard<std::mutex> lock(mutex);
        return index < requests.size() ? requests[index] : Json::Value();
    }

    static RecordingRouteModule* instance;
    std::mutex mutex;
    std::vector<Json::Value> requests;
};
RecordingRouteModule* RecordingRouteModule::instance = nullptr;

using vorn::test::Parse;

TEST(GatewayAnnouncementTest, TheRouteModuleGetsExactlyTheAnnouncedKeys) {
    vorn::test::PrivateBus bus;
    ASSERT_TRUE(bus.Started());
    ModuleManager* manager = ModuleManager::GetInstance();
    ASSERT_TRUE(manager->AddModule({MODULE_ROUTE, true, &RecordingRouteModule::Create}));
    {
        vornnetwork::dbus::NetServer server;
        ASSERT_TRUE(server.IsInitialized());
        std::thread loop([&server] { server.StartLoop(); });

        using namespace vornwireless::utils;
        EXPECT_TRUE(
            SetGatewayInfo("eth0", "GTYPE_V4", "10.0.0.1", "10.0.0.53", "ethernet", 0, true));
        EXPECT_TRUE(DelGatewayInfo("wlan0", "GTYPE_V6", false));
        EXPECT_EQ(GetGatewayPriority("eth0", "GTYPE_V4"), 4);
        EXPECT_EQ(GetGatewayPriority("br0", "GTYPE_V4"), 0);
        EXPECT_TRUE(RefreshGateway("GTYPE_V6"));
        EXPECT_TRUE(SetSlaveGatewayInfo("eth0", "GTYPE_V4", true));
        EXPECT_TRUE(CopyGatewayInfo("GTYPE_V6", "eth0", "br0", false));

        RecordingRouteModule& module = *RecordingRouteModule::instance;
        EXPECT_EQ(
            module.Request(0),
            Parse(R"({"method":"ADD_GATEWAY_DATA","type":"GTYPE_V4","priority":0,"ifname":"eth0",)"
                  R"("gateway":"10.0.0.1","dns":"10.0.0.53","class":"ethernet","refresh":true})"));
        EXPECT_EQ(module.Request(1), Parse(R"({"method":"DEL_GATEWAY_DATA","type":"GTYPE_V6",)"
                                           R"("ifname":"wlan0","refresh":false})"));
        EXPECT_EQ(module.Request(2), Parse(R"({"method":"GET_GATEWAY_DATA_BY_INTERFACE",)"
                                           R"("type":"GTYPE_V4","ifname":"eth0"})"));
        EXPECT_EQ(module.Request(4), Parse(R"({"method":"REFRESH_GATEWAY","type":"GTYPE_V6"})"));
        EXPECT_EQ(module.Request(5), Parse(R"({"method":"SET_SLAVE_DATA","type":"GTYPE_V4",)"
                                           R"("ifname":"eth0","slave":true})"));
        EXPECT_EQ(module.Request(6),
                  Parse(R"({"method":"COPY_GATEWAY_DATA","type":"GTYPE_V6",)"
                        R"("interface_source":"eth0","interface_destination":"br0",)"
                        R"("interface_source_delete":false})"));

        server.QuitLoop();
        loop.join();
    }
    manager->RemoveModule(MODULE_ROUTE);
}

}  // namespace
