#include "network/event/base_event.h"

#include "network/module/module_manager.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace event {

bool BaseEvent::IsValidEvent(EVENT_TYPE type) {
    return static_cast<unsigned int>(type) - 1u <= 1u;
}

std::string BaseEvent::ToStr() const {
    return "event:[" + std::to_string(type_) + "]";
}

int BaseEvent::Process() {
    if (notified_ && processed_) {
        return 0;
    }
    if (!IsValid()) {
        VORN_LOG(LOG_ERR, "The event [%s] is not valid.", ToStr().c_str());
        return -1;
    }
    const int notified = NotifyModuleManager();
    if (notified != 0) {
        VORN_LOG(LOG_ERR, "Failed to notify event [%d] to manager", type_);
    }
    const int processed = PostProcess();
    return (notified != 0 || processed != 0) ? -1 : 0;
}

int BaseEvent::NotifyModuleManager() {
    if (notified_) {
        return 0;
    }
    if (module::ModuleManager::GetInstance()->NotifyEvent(this) != 0) {
        VORN_LOG(LOG_ERR, "Failed to notify event[%d] to manager", type_);
        return -1;
    }
    notified_ = true;
    return 0;
}

int BaseEvent::PostProcess() {
    if (processed_) {
        return 0;
    }
    const int result = ProcessEvent();
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to process event [%s]", ToStr().c_str());
        return result;
    }
    processed_ = true;
    return 0;
}

}  // namespace event
}  // namespace network
}  // namespace vornnetwork
