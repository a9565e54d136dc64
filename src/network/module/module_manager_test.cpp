#include "network/module/module_manager.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "network/event/hello_event.h"
#include "network/module/test_module.h"
#include "support/log_capture.h"

namespace vornnetwork::network::module {
namespace {

// A module whose steps answer as the test says and leave a trace of their order.
class ScriptedModule : public BaseModule {
  public:
    explicit ScriptedModule(MODULE_TYPE type) : BaseModule(type) {}
    int InitialModule() override { return Record("init", initResult); }
    int StartModule() override { return Record("start", 0); }
    int TerminateModule() override { return Record("terminate", 0); }
    int ProcessRequest(const Json::Value& request, Json::Value& answer) override {
        answer["echo"] = request["method"];
        return requestResult;
    }
    int OnEvent(const event::BaseEvent*) { return Record("event", eventResult); }

    int initResult = 0;
    int requestResult = 0;
    int eventResult = 0;
    static std::vector<std::string> trace;

  private:
    int Record(const char* step, int result) {
        trace.push_back(std::to_string(GetType()) + ":" + step);
        return result;
    }
};
std::vector<std::string> ScriptedModule::trace;

ScriptedModule* scripted[6];
template <MODULE_TYPE Type>
BaseModule* CreateScripted() {
    return scripted[Type] = new ScriptedModule(Type);
}
BaseModule* CreateNothing() {
    return nullptr;
}

const EventHandler::Handler kOnEvent = static_cast<EventHandler::Handler>(&ScriptedModule::OnEvent);

class ModuleManagerTest : public ::testing::Test {
  protected:
    void SetUp() override { ScriptedModule::trace.clear(); }
    void TearDown() override {
        for (MODULE_TYPE type :
             {MODULE_TEST, MODULE_IPV6, MODULE_ROUTE, MODULE_DEVICE_LIST, MODULE_NETLINK}) {
            manager_->UnHookEvent(event::EVENT_HELLO, type);
            manager_->RemoveModule(type);
        }
    }
    ModuleManager* manager_ = ModuleManager::GetInstance();
    vorn::test::LogCapture log_;
};

TEST_F(ModuleManagerTest, LifecycleRunsInTypeOrderAndNeverStopsEarly) {
    ASSERT_TRUE(manager_->AddModule({MODULE_NETLINK, true, &CreateScripted<MODULE_NETLINK>}));
    ASSERT_TRUE(manager_->AddModule({MODULE_ROUTE, true, &CreateScripted<MODULE_ROUTE>}));
    ASSERT_TRUE(manager_->AddModule({MODULE_IPV6, true, &CreateScripted<MODULE_IPV6>}));
    EXPECT_TRUE(manager_->AddModule({MODULE_TEST, false, &CreateNothing}));
    EXPECT_FALSE(manager_->AddModule({MODULE_DEVICE_LIST, true, &CreateNothing}));
    EXPECT_TRUE(log_.Contains("Failed to create module [4]"));
    EXPECT_TRUE(manager_->AddModule({MODULE_ROUTE, true, &CreateNothing}));

    scripted[MODULE_ROUTE]->initResult = -7;
    EXPECT_FALSE(manager_->InitModules());
    EXPECT_EQ(ScriptedModule::trace,
              (std::vector<std::string>{"2:init", "3:init", "3:terminate", "5:init"}));

    // A module left in status 1 cannot start; started modules cannot start twice.
    ScriptedModule::trace.clear();
    EXPECT_FALSE(manager_->Start());
    EXPECT_EQ(ScriptedModule::trace, (std::vector<std::string>{"2:start", "5:start"}));
    EXPECT_TRUE(log_.Contains("Module [3] is not initialized"));
    EXPECT_EQ(scripted[MODULE_IPV6]->Start(), -1);
}

TEST_F(ModuleManagerTest, RequestsAndEventsReachTheirModules) {
    ASSERT_TRUE(manager_->AddModule({MODULE_ROUTE, true, &CreateScripted<MODULE_ROUTE>}));
    ASSERT_TRUE(
        manager_->AddModule({MODULE_DEVICE_LIST, true, &CreateScripted<MODULE_DEVICE_LIST>}));
    Json::Value request;
    request["method"] = "GET";
    Json::Value answer;
    EXPECT_EQ(manager_->ProcessRequest(MODULE_ROUTE, request, answer), 0);
    EXPECT_EQ(answer["echo"].asString(), "GET");
    scripted[MODULE_ROUTE]->requestResult = -1;
    EXPECT_EQ(manager_->ProcessRequest(MODULE_ROUTE, request, answer), -1);
    EXPECT_EQ(manager_->ProcessRequest(MODULE_TEST, request, answer), -1);

    // The first handler fails; the second still runs; delivery counts one failure.
    ASSERT_EQ(scripted[MODULE_ROUTE]->HookEvent(event::EVENT_HELLO, kOnEvent), 0);
    ASSERT_EQ(scripted[MODULE_DEVICE_LIST]->HookEvent(event::EVENT_HELLO, kOnEvent), 0);
    scripted[MODULE_ROUTE]->eventResult = 9;
    event::HelloEvent hello("hi");
    EXPECT_EQ(manager_->NotifyEvent(&hello), 1);
    EXPECT_EQ(ScriptedModule::trace, (std::vector<std::string>{"3:event", "4:event"}));
    EXPECT_TRUE(log_.Contains("Failed to handler event [1] by module [3] and ret=[9]"));
    EXPECT_EQ(manager_->NotifyEvent(nullptr), -1);

    // A failed delivery does not stop the event's own processing, and a later Process delivers
    // again without processing again.
    ScriptedModule::trace.clear();
    EXPECT_EQ(hello.Process(), -1);
    EXPECT_TRUE(hello.IsProcessed());
    scripted[MODULE_ROUTE]->eventResult = 0;
    EXPECT_EQ(hello.Process(), 0);
    EXPECT_EQ(hello.Process(), 0);
    EXPECT_EQ(ScriptedModule::trace.size(), 4u);
    EXPECT_EQ(log_.Matching("process by hello event").size(), 1u);

    // A handler whose module is gone counts as a failure.
    EXPECT_FALSE(manager_->RemoveModule(MODULE_DEVICE_LIST));
    event::HelloEvent again("again");
    EXPECT_EQ(manager_->NotifyEvent(&again), 1);
    EXPECT_TRUE(log_.Contains("NULL pointer for module [4]"));
}

TEST_F(ModuleManagerTest, TestModuleHooksHelloOnInitialize) {
    EXPECT_TRUE(manager_->AddModule({MODULE_TEST, true, &TestModule::Create}));
    ASSERT_TRUE(manager_->InitModules());
    EXPECT_TRUE(log_.Contains("Success to hook hello event by test module"));
    event::HelloEvent hello("hi");
    EXPECT_EQ(hello.Process(), 0);
    EXPECT_TRUE(log_.Contains("TestModule process hello event [event:[1]/ msg:[hi]\n]"));
    EXPECT_FALSE(manager_->RemoveModule(MODULE_TEST));
    EXPECT_TRUE(log_.Contains("Destructor of Test Module"));
}

}  // namespace
}  // namespace vornnetwork::network::module
