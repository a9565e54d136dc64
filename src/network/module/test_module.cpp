#include "network/module/test_module.h"

#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {

TestModule::TestModule() : BaseModule(MODULE_TEST) {
    VORN_LOG(LOG_ERR, "Constructor of Test Module");
}

TestModule::~TestModule() {
    VORN_LOG(LOG_ERR, "Destructor of Test Module");
}

int TestModule::ProcessRequest(const Json::Value& request, Json::Value& answer) {
    (void)request;
    (void)answer;
    VORN_LOG(LOG_ERR, "ProcessRequest of Test Module");
    return 0;
}

int TestModule::InitialModule() {
    VORN_LOG(LOG_ERR, "Initial Test Module");
    return 0;
}

int TestModule::TerminateModule() {
    VORN_LOG(LOG_ERR, "Terminate Test Module");
    return 0;
}

int TestModule::StartModule() {
    VORN_LOG(LOG_ERR, "Start Test Module");
    return 0;
}

int TestModule::HookEvents() const {
    if (HookEvent(event::EVENT_HELLO,
                  static_cast<EventHandler::Handler>(&TestModule::OnHelloEvent)) != 0) {
        VORN_LOG(LOG_ERR, "Failed to hook hello event by test module");
        return -1;
    }
    VORN_LOG(LOG_ERR, "Success to hook hello event by test module");
    return 0;
}

int TestModule::OnHelloEvent(const event::BaseEvent* event) {
    if (event == nullptr) {
        VORN_LOG(LOG_ERR, "Null event pointer");
        return -1;
    }
    VORN_LOG(LOG_ERR, "TestModule process hello event [%s]", event->ToStr().c_str());
    return 0;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
