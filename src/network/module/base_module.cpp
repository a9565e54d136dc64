#include "network/module/base_module.h"

#include "network/module/module_manager.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {

int BaseModule::ProcessRequest(const Json::Value& request, Json::Value& answer) {
    (void)request;
    (void)answer;
    return 0;
}

std::string BaseModule::ToStr() const {
    return "module:" + std::to_string(type_);
}

bool BaseModule::IsValidModule(MODULE_TYPE type) {
    return static_cast<unsigned int>(type) - 1u <= 4u;
}

int BaseModule::Initialize() {
    if (status_ == MODULE_STATUS_INITIALIZED) {
        return 0;
    }
    int result = HookEvents();
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to hook event of module [%d]", type_);
        Terminate();
        return result;
    }
    result = InitialModule();
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to init module [%d]", type_);
        Terminate();
        return result;
    }
    status_ = MODULE_STATUS_INITIALIZED;
    return 0;
}

int BaseModule::Start() {
    if (status_ != MODULE_STATUS_INITIALIZED) {
        VORN_LOG(LOG_ERR, "Module [%d] is not initialized", type_);
        return -1;
    }
    const int result = StartModule();
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to start module [%d]", type_);
        return result;
    }
    status_ = MODULE_STATUS_STARTED;
    return 0;
}

int BaseModule::Terminate() {
    const int result = TerminateModule();
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to terminate module [%d]", type_);
        return result;
    }
    status_ = MODULE_STATUS_TERMINATED;
    return 0;
}

int BaseModule::HookEvent(event::EVENT_TYPE event, EventHandler::Handler handler) const {
    const int result = ModuleManager::GetInstance()->HookEvent(event, type_, handler);
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to hook event [%d] of module [%d]", event, type_);
    }
    return result;
}

int BaseModule::UnHookEvent(event::EVENT_TYPE event) const {
    const int result = ModuleManager::GetInstance()->UnHookEvent(event, type_);
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to unhook event [%d] of module [%d]", event, type_);
    }
    return result;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
